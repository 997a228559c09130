// Natives of SseFontPaletted ("ia").
#include "natives/font_natives.h"
#include "toolkit/font_paletted.h"

using namespace natives;

VELMARK5_NATIVE(void)
Java_ia_EA(JNIEnv* env, jobject peer, jint, jobject pool, jobjectArray glyphs, jintArray palette, jintArray widths,
           jintArray heights, jintArray y_offsets, jintArray x_offsets) {
  frame(env, [&] {
    memorymanager& memory = contract::object(objconvert::get_memorypool(env, pool));
    contract::not_null(glyphs);
    const font_natives::arguments from{glyphs, widths, heights, y_offsets, x_offsets};
    const int palette_length = palette != nullptr ? array_length(env, palette) : font_natives::no_palette;
    font_natives::check(env, from, palette_length);
    auto font = std::make_unique<font_paletted>(&memory);
    font->palette = copied_jintArrayRO(env, palette).toSharedarray<unsigned int>(&memory);
    font_natives::load_metrics(env, &memory, from, font->metrics);
    font_natives::load_glyphs(env, &memory, glyphs, palette_length, font->metrics, font->glyphs);
    objconvert::set_font_paletted(env, peer, font.release());
  });
}

VELMARK5_NATIVE(void) Java_ia_UA(JNIEnv* env, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid) {
  font_natives::plot(env, objconvert::get_font_paletted, peer, glyph, x, y, colour, solid);
}

VELMARK5_NATIVE(void)
Java_ia_GA(JNIEnv* env, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid, jobject mask,
           jint mask_x, jint mask_y) {
  font_natives::plot_masked(env, objconvert::get_font_paletted, peer, glyph, x, y, colour, solid, mask, mask_x, mask_y);
}

VELMARK5_NATIVE(void) Java_ia_f(JNIEnv* env, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid) {
  font_natives::plot_upwards(env, objconvert::get_font_paletted, peer, glyph, x, y, colour, solid);
}

VELMARK5_NATIVE(void) Java_ia_ma(JNIEnv* env, jobject peer) {
  frame(env, [&] {
    delete objconvert::get_font_paletted(env, peer);
    objconvert::set_font_paletted(env, peer, nullptr);
  });
}
