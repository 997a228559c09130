#include "toolkit/font_alpha.h"

void font_alpha::plotletter(short glyph, int x, int y, unsigned int colour, bool) const {
  if (toolkit::m_pInstance->colourbuffer == nullptr) return;
  plot_upright(glyphs, metrics, glyph, x, y, glyph::coverage_ink(colour));
}

void font_alpha::plotletter(short glyph, int x, int y, unsigned int colour, bool, const clippingmask* mask, int mask_x,
                            int mask_y) const {
  if (toolkit::m_pInstance->colourbuffer == nullptr) return;
  plot_upright(glyphs, metrics, glyph, x, y, glyph::coverage_ink(colour), mask, mask_x, mask_y);
}

void font_alpha::plotletter_upwards(short glyph, int x, int y, unsigned int colour, bool) const {
  if (toolkit::m_pInstance->colourbuffer == nullptr) return;
  plot_upwards(glyphs, metrics, glyph, x, y, glyph::coverage_ink(colour));
}
