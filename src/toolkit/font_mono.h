// A font whose glyph bytes are on or off.
#pragma once

#include "toolkit/font_glyphs.h"

class font_mono {
 public:
  explicit font_mono(memorymanager* from) : pool(from), glyphs(0) {}

  // Draws the glyph with the pen at (x, y). The colour's alpha decides: 255 stores the word, 0 draws nothing, others
  // blend. Indices out of range draw nothing. solid has no effect on this font.
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
