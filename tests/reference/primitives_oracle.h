// The 2D primitives once more, pixel by pixel in plain integers: slow, and easy to believe.
#pragma once

#include <cstdint>

#include "reference/target.h"

// Operations return false where the library must raise for an unknown mode; nothing is drawn then.
struct primitives_oracle : oracle::target {
  using shape = oracle::shape;

  static std::uint32_t combine(std::uint32_t d, std::uint32_t c, unsigned int mode);

  bool rect_fill(int x, int y, int w, int h, std::uint32_t c, unsigned int mode);
  bool line_h(int x, int y, int length, std::uint32_t c, unsigned int mode);
  bool line_v(int x, int y, int length, std::uint32_t c, unsigned int mode);
  // mask may be null; (mask_x, mask_y) places it.
  bool line(int ax, int ay, int bx, int by, std::uint32_t c, unsigned int mode, const shape* mask, int mask_x,
            int mask_y);
  bool circle_fill(int x, int y, int z, int radius, std::uint32_t c, unsigned int mode);
  void cls_masked(std::uint32_t c, const shape& mask, int x, int y);
  void zbuffer_clear(int x, int y, int w, int h, float value);
  void scroll(int dx, int dy);

 private:
  void put(std::int64_t x, std::int64_t y, std::uint32_t c, unsigned int mode);
};
