// Natives of SseFontMono ("m").
#include "natives/font_loading.h"
#include "toolkit/font_mono.h"

using namespace natives;

VELMARK5_NATIVE(void)
Java_m_n(JNIEnv* env, jobject peer, jint, jobject pool, jobjectArray glyphs, jintArray widths, jintArray heights,
         jintArray y_offsets, jintArray x_offsets) {
  frame(env, [&] {
    memorymanager& memory = contract::object(objconvert::get_memorypool(env, pool));
    contract::not_null(glyphs);
    const font_loading::arguments from{glyphs, widths, heights, y_offsets, x_offsets};
    font_loading::check(env, from, font_loading::no_palette);
    auto font = std::make_unique<font_mono>(&memory);
    font_loading::load_metrics(env, &memory, from, font->metrics);
    font_loading::load_glyphs(env, &memory, glyphs, font->glyphs);
    objconvert::set_font_mono(env, peer, font.release());
  });
}

VELMARK5_NATIVE(void) Java_m_UA(JNIEnv* env, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid) {
  frame(env, [&] {
    current_toolkit();
    contract::object(objconvert::get_font_mono(env, peer))
        .plotletter(static_cast<short>(glyph), x, y, static_cast<unsigned int>(colour), is_true(solid));
  });
}

VELMARK5_NATIVE(void)
Java_m_MA(JNIEnv* env, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid, jobject mask,
          jint mask_x, jint mask_y) {
  frame(env, [&] {
    current_toolkit();
    const font_mono& font = contract::object(objconvert::get_font_mono(env, peer));
    font.plotletter(static_cast<short>(glyph), x, y, static_cast<unsigned int>(colour), is_true(solid),
                    objconvert::get_clippingmask(env, mask), mask_x, mask_y);
  });
}

VELMARK5_NATIVE(void) Java_m_f(JNIEnv* env, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid) {
  frame(env, [&] {
    current_toolkit();
    contract::object(objconvert::get_font_mono(env, peer))
        .plotletter_upwards(static_cast<short>(glyph), x, y, static_cast<unsigned int>(colour), is_true(solid));
  });
}

VELMARK5_NATIVE(void) Java_m_ma(JNIEnv* env, jobject peer) {
  frame(env, [&] {
    delete objconvert::get_font_mono(env, peer);
    objconvert::set_font_mono(env, peer, nullptr);
  });
}
