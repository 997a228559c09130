// Slow sprite drawing, a pixel at a time with every mode looked at where it counts: what the fast one must equal bit
// for bit.
#pragma once

#include <cstdint>
#include <vector>

#include "reference/target.h"

namespace oracle {

struct image {
  int left = 0, top = 0, right = 0, bottom = 0;  // margins
  int width = 0, height = 0;
  std::vector<std::uint32_t> pixels;

  int full_width() const { return left + width + right; }
  int full_height() const { return top + height + bottom; }

  // The word at a linear position; positions past either end give the word at that end.
  std::uint32_t word(std::int64_t position) const;
};

struct placed_mask : shape {
  int width = 0, height = 0;
  int x = 0, y = 0;  // origin on screen
};

// colourop: 0 modulate, 1 none, 2 mix, 3 add, 4 subtract. blend: 0 replace, 1 alpha, 2 additive.
struct sprite_modes {
  int colourop = 1;
  std::uint32_t colour = 0;
  int blend = 0;
};

// mask: null for none.
void draw(target& t, const image& s, const sprite_modes& m, int x, int y, const placed_mask* mask);
// z: null, or drawn where *z <= the stored depth.
void draw_scaled(target& t, const image& s, const sprite_modes& m, int x, int y, int w, int h, const float* z);
void draw_parallelogram(target& t, const image& s, const sprite_modes& m, const float corners[6],
                        const placed_mask* mask);
void draw_tiled(target& t, const image& s, const sprite_modes& m, int x, int y, int w, int h);

}  // namespace oracle
