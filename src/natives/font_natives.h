// What the natives of the three fonts have in common.
#pragma once

#include <cstdint>

#include "natives/native.h"
#include "toolkit/font_glyphs.h"

namespace font_natives {

// The Java arrays of a font: glyph bitmaps as byte[][], then the metrics. Each metric array may be null.
struct arguments {
  jobjectArray glyphs;
  jintArray widths, heights, y_offsets, x_offsets;
};

// Raises when a bitmap is shorter than its width times its height, or uses an index that a palette of palette_length
// words lacks. A glyph that has no bitmap or no size is left to draw nothing, and bytes past a bitmap may be anything.
void check(JNIEnv* env, const arguments& from, int palette_length);

inline constexpr int no_palette = 256;  // longer than every index

// Copies the metrics into the pool, in the order widths, heights, y_offsets, x_offsets.
void load_metrics(JNIEnv* env, memorymanager* pool, const arguments& from, font_metrics& metrics);

// Copies the bitmaps into the pool; a null element stays an empty handle. Indices that a palette of palette_length
// words lacks raise here too: another thread may have written to the arrays since they were checked.
void load_glyphs(JNIEnv* env, memorymanager* pool, jobjectArray from, int palette_length, const font_metrics& metrics,
                 glyph_bitmaps& glyphs);

// How a font is found from its peer.
template <class Font>
using getter = Font* (*)(JNIEnv*, jobject);

template <class Font>
const Font& resolve(JNIEnv* env, getter<Font> get, jobject peer) {
  natives::current_toolkit();
  return contract::object(get(env, peer));
}

template <class Font>
void plot(JNIEnv* env, getter<Font> get, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid) {
  natives::frame(env, [&] {
    resolve(env, get, peer)
        .plotletter(static_cast<short>(glyph), x, y, static_cast<unsigned int>(colour), natives::is_true(solid));
  });
}

template <class Font>
void plot_masked(JNIEnv* env, getter<Font> get, jobject peer, jchar glyph, jint x, jint y, jint colour, jboolean solid,
                 jobject mask, jint mask_x, jint mask_y) {
  natives::frame(env, [&] {
    const Font& font = resolve(env, get, peer);
    font.plotletter(static_cast<short>(glyph), x, y, static_cast<unsigned int>(colour), natives::is_true(solid),
                    &contract::object(objconvert::get_clippingmask(env, mask)), mask_x, mask_y);
  });
}

template <class Font>
void plot_upwards(JNIEnv* env, getter<Font> get, jobject peer, jchar glyph, jint x, jint y, jint colour,
                  jboolean solid) {
  natives::frame(env, [&] {
    resolve(env, get, peer)
        .plotletter_upwards(static_cast<short>(glyph), x, y, static_cast<unsigned int>(colour),
                            natives::is_true(solid));
  });
}

}  // namespace font_natives
