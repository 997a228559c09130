// The 2D primitives once more, pixel by pixel in plain integers: slow, and easy to believe.
#pragma once

#include <cstdint>
#include <vector>

// A target with its clip rectangle (right and bottom exclusive). An image that is missing is empty. Operations return
// false where the library must raise for an unknown mode; nothing is drawn then.
struct primitives_oracle {
  struct shape {
    std::vector<int> starts;
    std::vector<int> lengths;
  };

  int width = 0;
  int height = 0;
  std::vector<std::uint32_t> colour;
  std::vector<float> depth;
  int x0 = 0, y0 = 0, x1 = 0, y1 = 0;

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
  bool in_clip(std::int64_t x, std::int64_t y) const { return x >= x0 && x < x1 && y >= y0 && y < y1; }
  void put(std::int64_t x, std::int64_t y, std::uint32_t c, unsigned int mode);
};
