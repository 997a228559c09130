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
  const Float4 near = splat(z);
  const auto one = [&] {
    const Int4 d = load_one(p);
    store_one(p, select(less(near, load_one(depth)), operation(d), d));
  };
  for (; n > 0 && !on_group_boundary(p); --n, ++p, ++depth) one();
  for (; n >= 4; n -= 4, p += 4, depth += 4) {
    const Int4 d = load(p);
    store(p, select(less(near, load_unaligned(depth)), operation(d), d));
  }
  for (; n > 0; --n, ++p, ++depth) one();
}

}  // namespace

// Both halves count a half width j from row to row against the square of the radius, without multiplying radii: the
// upper half from its top row down, where j grows, and the lower half from its first row, where j shrinks. The counting
// starts at the first visible row, so that a clip at the top shows in the rows below it.
//
// What a step adds to a, b, p and q depends on j alone, so they are kept without it: j * (j - 1), and j * (j + 1) in p,
// stand for the steps so far. Steps whose rows look the same in the clip rectangle can then be taken at once or left
// out, and a radius far beyond the target costs no more than the pixels that are seen.
void toolkit::circle_fill(int x, int y, int z, int radius, unsigned int colour, unsigned int mode) {
  if (colourbuffer == nullptr) return;
  with_operation(mode, colour, [&](const auto& operation) {
    const int64_t r = radius < 0 ? -static_cast<int64_t>(radius) : radius;
    const int64_t rr = r * r;
    const int64_t x0 = clip_x0 - static_cast<int64_t>(x);  // the clip columns, seen from the centre
    const int64_t x1 = clip_x1 - static_cast<int64_t>(x);
    if (x0 >= x1 || x0 >= r + 2 || x1 <= -r - 2) return;
    const int64_t top = std::max<int64_t>(y - r, clip_y0);
    const int64_t bottom = std::min<int64_t>(y + r + 1, clip_y1);
    const int64_t half = std::min<int64_t>(bottom, y);
    int64_t row = top;

    // Fills from `left` up to but excluding `right`, both seen from the centre.
    const auto fill = [&](int64_t left, int64_t right) {
      left = std::max(left, x0);
      right = std::min(right, x1);
      if (left >= right) return;
      const std::ptrdiff_t index = pixel_index(static_cast<int>(x + left), static_cast<int>(row), width);
      const auto count = static_cast<std::size_t>(right - left);
      if (depthbuffer == nullptr) {
        fill_run(colourbuffer + index, count, operation);
      } else {
        fill_run_in_front(colourbuffer + index, depthbuffer + index, count, static_cast<float>(z), operation);
      }
    };

    // Upper half. A row is in sight from j = enter on, and fills the clip columns from j = cover on.
    {
      const int64_t enter = std::max<int64_t>({x0 + 1, 2 - x1, 1});
      const int64_t cover = std::max(1 - x0, x1);
      const int64_t dy = y - top;
      int64_t a = dy * dy;
      int64_t b = a - dy;
      int64_t s = -2 * dy;
      int64_t j = 0;
      for (; row < half; ++row) {
        const int64_t limit = rr - std::min(a, b);
        if (j < enter && (enter - 1) * (enter - 2) <= limit) j = enter;
        if (j >= enter) {
          while (j < cover && j * (j - 1) <= limit) ++j;
          fill(1 - j, j);
        }
        s += 2;
        b += s;
        a += s - 2;
      }
    }
    // Lower half, the same the other way round: once a row is out of sight, all others are.
    {
      const int64_t enter = std::max<int64_t>({x0, 1 - x1, 0});
      const int64_t cover = std::max(-x0, x1 - 1);
      const int64_t d = row - y;
      int64_t q = d * d;
      int64_t p = d * d - d - r;
      int64_t t = 2 * d;
      int64_t j = r;
      const auto too_wide = [&](int64_t width_now) {
        const int64_t square = width_now * width_now;
        return rr < q - width_now + square && rr < p + width_now + square;
      };
      for (; row < bottom && j >= enter; ++row) {
        if (j > cover && too_wide(cover + 1)) j = cover;
        if (j <= cover) {
          while (j >= enter && too_wide(j)) --j;
        }
        fill(-j, j + 1);
        p += t;
        q += t;
        t += 2;
      }
    }
    stream_end();
  });
}

void toolkit::circle_outline(int, int, int, int, unsigned int, unsigned int) {}
