// What the load natives of the three fonts have in common.
#pragma once

#include <cstdint>

#include "natives/native.h"
#include "toolkit/font_glyphs.h"

namespace font_loading {

// The Java arrays of a font: glyph bitmaps as byte[][], then the metrics. Each metric array may be null.
struct arguments {
  jobjectArray glyphs;
  jintArray widths, heights, y_offsets, x_offsets;
};

// Raises when a bitmap is shorter than its width times its height, or uses an index that a palette of palette_length
// words lacks. A glyph that has no bitmap or no size is left to draw nothing.
void check(JNIEnv* env, const arguments& from, int palette_length);

inline constexpr int no_palette = 256;  // longer than every index

// Copies the metrics into the pool, in the order widths, heights, y_offsets, x_offsets.
void load_metrics(JNIEnv* env, memorymanager* pool, const arguments& from, font_metrics& metrics);

// Copies the bitmaps into the pool; a null element stays an empty handle.
void load_glyphs(JNIEnv* env, memorymanager* pool, jobjectArray from, glyph_bitmaps& glyphs);

}  // namespace font_loading
