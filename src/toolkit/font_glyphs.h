// The glyph store of a font: bitmaps and metrics in a pool, one entry per glyph.
#pragma once

#include "toolkit/glyph.h"
#include "util/memorymanager/sharedarray.h"
#include "util/memorymanager/simplearray.h"

using glyph_bitmaps = simplearray<sharedarray<unsigned char>>;

// Pixels, per glyph. Any array may be missing.
struct font_metrics {
  sharedarray<int> widths;
  sharedarray<int> heights;
  sharedarray<int> y_offsets;  // added to the pen's y
  sharedarray<int> x_offsets;  // added to the pen's x
};

// The glyph's bitmap; without bytes when the index is out of range, or the bitmap or a size is missing or too short.
inline glyph::bitmap glyph_bitmap(const glyph_bitmaps& glyphs, const font_metrics& metrics, short glyph) {
  const int i = glyph;
  if (i < 0 || i >= glyphs.count || i >= metrics.widths.count() || i >= metrics.heights.count()) return {};
  const int width = metrics.widths[i];
  const int height = metrics.heights[i];
  if (width < 1 || height < 1 || glyphs[i].count() < static_cast<long long>(width) * height) return {};
  return {glyphs[i].data(), width, height};
}

// A glyph that stands upright: its bitmap, without bytes when it cannot be drawn, and the top left of its box.
struct upright_glyph {
  VELMARK5_LANE upright_glyph(const glyph_bitmaps& glyphs, const font_metrics& metrics, short glyph, int pen_x,
                              int pen_y)
      : bitmap(glyph_bitmap(glyphs, metrics, glyph)) {
    if (bitmap.bytes == nullptr) return;
    if (glyph >= metrics.x_offsets.count() || glyph >= metrics.y_offsets.count()) {
      bitmap.bytes = nullptr;
      return;
    }
    x = static_cast<long long>(pen_x) + metrics.x_offsets[glyph];
    y = static_cast<long long>(pen_y) + metrics.y_offsets[glyph];
  }
  glyph::bitmap bitmap;
  long long x = 0, y = 0;
};

// Draws the glyph upright with the pen at (x, y).
template <class Ink>
VELMARK5_LANE void plot_upright(const glyph_bitmaps& glyphs, const font_metrics& metrics, short glyph, int x, int y,
                                const Ink& ink) {
  const upright_glyph g(glyphs, metrics, glyph, x, y);
  if (g.bitmap.bytes == nullptr) return;
  glyph::draw(*toolkit::m_pInstance, g.x, g.y, g.bitmap, ink);
}

// The same through a mask; a null mask is none.
template <class Ink>
VELMARK5_LANE void plot_upright(const glyph_bitmaps& glyphs, const font_metrics& metrics, short glyph, int x, int y,
                                const Ink& ink, const clippingmask* mask, int mask_x, int mask_y) {
  if (mask == nullptr) return plot_upright(glyphs, metrics, glyph, x, y, ink);
  const upright_glyph g(glyphs, metrics, glyph, x, y);
  if (g.bitmap.bytes == nullptr) return;
  glyph::draw_masked(*toolkit::m_pInstance, g.x, g.y, g.bitmap, ink, *mask, mask_x, mask_y);
}

// Draws the glyph turned a quarter counter-clockwise; (x, y) is the top left of the turned box.
template <class Ink>
void plot_upwards(const glyph_bitmaps& glyphs, const font_metrics& metrics, short glyph, int x, int y, const Ink& ink) {
  const glyph::bitmap bitmap = glyph_bitmap(glyphs, metrics, glyph);
  if (bitmap.bytes == nullptr) return;
  glyph::draw_upwards(*toolkit::m_pInstance, x, y, bitmap, ink);
}
