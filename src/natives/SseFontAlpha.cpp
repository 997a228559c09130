// Natives of SseFontAlpha ("ea").
#include "natives/font_natives.h"
#include "toolkit/font_alpha.h"

using namespace natives;

VELMARK5_NATIVE(void)
Java_ea_n(JNIEnv* env, jobject peer, jint, jobject pool, jobjectArray glyphs, jintArray widths, jintArray heights,
          jintArray y_offsets, jintArray x_offsets) {
  frame(env, [&] {
    memorymanager& memory = contract::object(objconvert::get_memorypool(env, pool));
    contract::not_null(glyphs);
    const font_natives::arguments from{glyphs, widths, heights, y_offsets, x_offsets};
    font_natives::check(env, from, font_natives::no_palette);
    auto font = std::make_unique<font_alpha>(&memory);
    font_natives::load_metrics(env, &memory, from, font->metrics);
    font_natives::load_glyphs(env, &memory, glyphs, font_natives::no_palette, font->metrics, font->glyphs);
    objconvert::set_font_alpha(env, peer, font.release());
  });
}

VELMARK5_NATIVE(void) Java_ea_UA(JNIEnv* env, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid) {
  font_natives::plot(env, objconvert::get_font_alpha, peer, glyph, x, y, colour, solid);
}

VELMARK5_NATIVE(void)
Java_ea_P(JNIEnv* env, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid, jobject mask,
          jint mask_x, jint mask_y) {
  font_natives::plot_masked(env, objconvert::get_font_alpha, peer, glyph, x, y, colour, solid, mask, mask_x, mask_y);
}

VELMARK5_NATIVE(void) Java_ea_f(JNIEnv* env, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid) {
  font_natives::plot_upwards(env, objconvert::get_font_alpha, peer, glyph, x, y, colour, solid);
}

VELMARK5_NATIVE(void) Java_ea_ma(JNIEnv* env, jobject peer) {
  frame(env, [&] {
    delete objconvert::get_font_alpha(env, peer);
    objconvert::set_font_alpha(env, peer, nullptr);
  });
}
