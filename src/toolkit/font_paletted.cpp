#include "toolkit/font_paletted.h"

namespace {

// Calls draw with the colour as ink when solid, else with the palette, if there is one.
template <class Draw>
void with_ink(const sharedarray<unsigned int>& palette, unsigned int colour, bool solid, Draw draw) {
  if (toolkit::m_pInstance->colourbuffer == nullptr) return;
  if (solid) {
    draw(glyph::opaque_ink(colour));
  } else if (palette.count() > 0) {
    draw(glyph::palette_ink(palette.data()));
  }
}

}  // namespace

void font_paletted::plotletter(short glyph, int x, int y, unsigned int colour, bool solid) const {
  with_ink(palette, colour, solid, [&](const auto& ink) { plot_upright(glyphs, metrics, glyph, x, y, ink); });
}

void font_paletted::plotletter(short glyph, int x, int y, unsigned int colour, bool solid, const clippingmask* mask,
                               int mask_x, int mask_y) const {
  with_ink(palette, colour, solid,
           [&](const auto& ink) { plot_upright(glyphs, metrics, glyph, x, y, ink, mask, mask_x, mask_y); });
}

void font_paletted::plotletter_upwards(short glyph, int x, int y, unsigned int colour, bool solid) const {
  with_ink(palette, colour, solid, [&](const auto& ink) { plot_upwards(glyphs, metrics, glyph, x, y, ink); });
}
