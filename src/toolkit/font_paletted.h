// A font whose glyph bytes are indices of a palette; index 0 is transparent.
#pragma once

#include "toolkit/font_glyphs.h"

class font_paletted {
 public:
  explicit font_paletted(memorymanager* from) : pool(from), glyphs(0) {}

  // Draws the glyph with the pen at (x, y): in the colour when solid, else in the palette's. Indices out of range draw
  // nothing.
  void plotletter(short glyph, int x, int y, unsigned int colour, bool solid) const;
  // The same inside a mask placed at (mask_x, mask_y); a null mask is none.
  void plotletter(short glyph, int x, int y, unsigned int colour, bool solid, const clippingmask* mask, int mask_x,
                  int mask_y) const;
  // Running up the screen; (x, y) is the top left of the turned glyph, whose offsets do not count.
  void plotletter_upwards(short glyph, int x, int y, unsigned int colour, bool solid) const;

  memorymanager* pool;
  glyph_bitmaps glyphs;
  sharedarray<unsigned int> palette;  // 0xAARRGGBB
  font_metrics metrics;
};
