// HSL colour words (hue 6 bits, saturation 3, lightness 7, from the top) to RGB by table.
#pragma once

namespace colourutils {

extern unsigned int coltab[65536];  // 0x00RRGGBB, indexed by the HSL word

// Fills the table. Once, before any other use.
void init();

// Only the low 16 bits of the word count.
inline unsigned int hsl_2_rgb(unsigned int hsl) { return coltab[hsl & 0xFFFF]; }

}  // namespace colourutils
