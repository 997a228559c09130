#include "toolkit/font_mono.h"

namespace {

// Calls draw with the ink that the colour's alpha asks for, if the target takes any.
template <class Draw>
void with_ink(unsigned int colour, Draw draw) {
  const unsigned int alpha = colour >> 24;
  if (toolkit::m_pInstance->colourbuffer == nullptr || alpha == 0) return;
  if (alpha == 255) {
    draw(glyph::opaque_ink(colour));
  } else {
    draw(glyph::blended_ink(colour));
  }
}

}  // namespace

void font_mono::plotletter(short glyph, int x, int y, unsigned int colour, bool) const {
  with_ink(colour, [&](const auto& ink) { plot_upright(glyphs, metrics, glyph, x, y, ink); });
}

void font_mono::plotletter(short glyph, int x, int y, unsigned int colour, bool, const clippingmask* mask, int mask_x,
                           int mask_y) const {
  with_ink(colour, [&](const auto& ink) { plot_upright(glyphs, metrics, glyph, x, y, ink, mask, mask_x, mask_y); });
}

void font_mono::plotletter_upwards(short glyph, int x, int y, unsigned int colour, bool) const {
  with_ink(colour, [&](const auto& ink) { plot_upwards(glyphs, metrics, glyph, x, y, ink); });
}
