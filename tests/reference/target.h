// What the slow references of two-dimensional drawing draw to, and through.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace oracle {

// A target with its clip rectangle (right and bottom exclusive). An image that is missing is empty.
struct target {
  int width = 0;
  int height = 0;
  std::vector<std::uint32_t> colour;
  std::vector<float> depth;
  int x0 = 0, y0 = 0, x1 = 0, y1 = 0;

  bool in_clip(std::int64_t x, std::int64_t y) const { return x >= x0 && x < x1 && y >= y0 && y < y1; }
  std::size_t index(std::int64_t x, std::int64_t y) const { return static_cast<std::size_t>(y * width + x); }
  std::uint32_t& at(std::int64_t x, std::int64_t y) { return colour[index(x, y)]; }

  // visit(x, y) for every pixel inside the clip rectangle.
  template <class Visit>
  void for_clip(Visit visit) const {
    for (int y = y0; y < y1; ++y) {
      for (int x = x0; x < x1; ++x) visit(x, y);
    }
  }
};

// A run of pixels in each row.
struct shape {
  std::vector<int> starts;
  std::vector<int> lengths;

  // x and y from the shape's origin.
  bool covers(std::int64_t x, std::int64_t y) const {
    if (y < 0 || y >= static_cast<std::int64_t>(starts.size())) return false;
    const auto row = static_cast<std::size_t>(y);
    return x >= starts[row] && x < std::int64_t{starts[row]} + lengths[row];
  }
};

}  // namespace oracle
