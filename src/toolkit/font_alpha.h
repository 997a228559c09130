// A font whose glyph bytes are coverage.
#pragma once

#include "toolkit/font_glyphs.h"

class font_alpha {
 public:
  explicit font_alpha(memorymanager* from) : pool(from), glyphs(0) {}

  // Draws the glyph with the pen at (x, y), blended by its coverage; the colour's alpha and solid have no effect.
  // Indices out of range draw nothing.
  void plotletter(short glyph, int x, int y, unsigned int colour, bool solid) const;
  // The same inside a mask placed at (mask_x, mask_y); a null mask is none.
  void plotletter(short glyph, int x, int y, unsigned int colour, bool solid, const clippingmask* mask, int mask_x,
                  int mask_y) const;
  // Running up the screen; (x, y) is the top left of the turned glyph, whose offsets do not count.
  void plotletter_upwards(short glyph, int x, int y, unsigned int colour, bool solid) const;

  memorymanager* pool;
  glyph_bitmaps glyphs;
  font_metrics metrics;
};
