// Slow sprite drawing, a pixel at a time with every mode looked at where it counts: what the fast one must equal bit
// for bit.
#pragma once

#include <cstdint>
#include <vector>

namespace sprite_oracle {

struct image {
  int left = 0, top = 0, right = 0, bottom = 0;  // margins
  int width = 0, height = 0, pitch = 0;
  std::vector<std::uint32_t> pixels;

  // The word at a linear position; positions past either end give the word at that end.
  std::uint32_t word(std::int64_t position) const;
};

struct target {
  int width = 0, height = 0;
  int clip_x0 = 0, clip_y0 = 0, clip_x1 = 0, clip_y1 = 0;
  std::vector<std::uint32_t> colour;
  std::vector<float> depth;  // empty: no depth test

  std::uint32_t& at(int x, int y) { return colour[static_cast<std::size_t>(y * width + x)]; }
};

struct mask {
  int width = 0, height = 0;
  std::vector<int> starts, lengths;
  int x = 0, y = 0;  // origin on screen
};

// colourop: 0 modulate, 1 none, 2 mix, 3 add, 4 subtract. blend: 0 replace, 1 alpha, 2 additive.
struct modes {
  int colourop = 1;
  std::uint32_t colour = 0;
  int blend = 0;
};

std::uint32_t combine(const modes& m, std::uint32_t source, std::uint32_t destination);

// span: null for none.
void draw(target& t, const image& s, const modes& m, int x, int y, const mask* span);
void draw_scaled(target& t, const image& s, const modes& m, int x, int y, int w, int h);
// The same where z <= the stored depth.
void draw_depth_tested(target& t, const image& s, const modes& m, int x, int y, int z, int w, int h);
void draw_parallelogram(target& t, const image& s, const modes& m, const float corners[6], const mask* span);
void draw_tiled(target& t, const image& s, const modes& m, int x, int y, int w, int h);

}  // namespace sprite_oracle
