// Circles.
#include <algorithm>
#include <cstdint>

#include "toolkit/primitive_blend.h"
#include "toolkit/toolkit.h"

namespace {

using namespace primitive;
using std::int64_t;

// A row of a circle with a depth target: only pixels whose stored depth is greater than z.
template <class Operation>
void fill_run_in_front(std::uint32_t* p, const float* depth, std::size_t n, float z, const Operation& operation) {
  const auto one = [&] {
    if (*depth > z) plot(p, operation);
  };
  const Float4 near = splat(z);
  for (; n > 0 && !on_group_boundary(p); --n, ++p, ++depth) one();
  for (; n >= 4; n -= 4, p += 4, depth += 4) {
    const Int4 d = load(p);
    store(p, select(less(near, load_unaligned(depth)), operation(d), d));
  }
  for (; n > 0; --n, ++p, ++depth) one();
}

}  // namespace

void toolkit::circle_fill(int x, int y, int z, int radius, unsigned int colour, unsigned int mode) {
  if (colourbuffer == nullptr) return;
  with_operation(mode, colour, [&](const auto& operation) {
    // Fills from `left` up to but excluding `right`, within the clip columns.
    const auto fill = [&](int64_t row, int64_t left, int64_t right) {
      left = std::max<int64_t>(left, clip_x0);
      right = std::min<int64_t>(right, clip_x1);
      if (left >= right) return;
      const std::ptrdiff_t index = pixel_index(static_cast<int>(left), static_cast<int>(row), width);
      const auto count = static_cast<std::size_t>(right - left);
      if (depthbuffer == nullptr) {
        fill_run(colourbuffer + index, count, operation);
      } else {
        fill_run_in_front(colourbuffer + index, depthbuffer + index, count, static_cast<float>(z), operation);
      }
    };
    const int64_t r = radius < 0 ? -static_cast<int64_t>(radius) : radius;
    const int64_t rr = r * r;
    const int64_t centre_x = x;
    const int64_t centre_y = y;
    const int64_t top = std::max<int64_t>(centre_y - r, clip_y0);
    const int64_t bottom = std::min<int64_t>(centre_y + r + 1, clip_y1);
    const int64_t half = std::min(bottom, centre_y);
    int64_t row = top;

    {
      const int64_t dy = centre_y - top;
      int64_t a = dy * dy;
      int64_t b = a - dy;
      int64_t s = -2 * dy;
      int64_t j = 0;
      for (; row < half; ++row) {
        for (; rr >= a || rr >= b; ++j) {
          a += 2 * j;
          b += 2 * j;
        }
        fill(row, centre_x + 1 - j, centre_x + j);
        s += 2;
        b += s;
        a += s - 2;
      }
    }
    {
      const int64_t d = row - centre_y;
      int64_t q = d * d + rr - r;
      int64_t p = d * d + rr - d;
      int64_t t = 2 * d;
      int64_t j = r;
      for (; row < bottom; ++row) {
        for (; rr < q && rr < p; --j) {
          p -= 2 * j;
          q -= 2 * j - 2;
        }
        fill(row, centre_x - j, centre_x + j + 1);
        p += t;
        q += t;
        t += 2;
      }
    }
    stream_end();
  });
}

void toolkit::circle_outline(int, int, int, int, unsigned int, unsigned int) {}
