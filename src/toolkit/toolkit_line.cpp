// Lines.
//
// A two-dimensional line walks pixel by pixel along its major axis and carries the minor coordinate as 16.16 fixed
// point. The arithmetic is 64-bit, so that end points far beyond the target are as good as any.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <utility>

#include "raster/Projection.h"
#include "toolkit/clippingmask.h"
#include "toolkit/primitive_blend.h"
#include "toolkit/toolkit.h"

namespace {

using std::int64_t;

// Bounds of one axis: low inclusive, high exclusive.
struct range {
  int64_t low;
  int64_t high;
};

// The part of a line that its bounds leave visible: pixels `first` to `last` of the major axis, both inclusive.
struct walk {
  int64_t first;
  int64_t last;
  int64_t minor;  // at `first`, 16.16
  int64_t step;   // of minor, per pixel
};

int64_t divide_up(int64_t a, int64_t b) { return (a + b - 1) / b; }  // for a > 0 and b > 0

walk start_walk(int64_t major, int64_t minor, int64_t major_delta, int64_t minor_delta, range major_bounds,
                range minor_bounds) {
  walk line{major, std::min(major + major_delta, major_bounds.high - 1), minor * 65536 + 0x8000, 0};
  // A line of one pixel has no slope and takes no step.
  if (major_delta != 0) {
    line.step = static_cast<int64_t>(
        std::floor(static_cast<double>(minor_delta * 65536) / static_cast<double>(major_delta) + 0.5));
  }
  if (line.first < major_bounds.low) {
    line.minor += (major_bounds.low - line.first) * line.step;
    line.first = major_bounds.low;
  }
  if (line.first > line.last) return line;

  // Leave out the pixels at either end whose minor coordinate is out of bounds. Mirrored, a falling line rises.
  const bool falls = line.step < 0;
  const int64_t rise = falls ? -line.step : line.step;
  const int64_t low = falls ? 1 - minor_bounds.high * 65536 : minor_bounds.low * 65536;
  const int64_t high = falls ? -minor_bounds.low * 65536 : minor_bounds.high * 65536 - 1;
  const int64_t at_first = falls ? -line.minor : line.minor;
  const int64_t at_last = at_first + (line.last - line.first) * rise;
  const int64_t first = line.first;
  if (at_last < low || at_first > high || low > high) {
    line.last = first - 1;
    return line;
  }
  if (at_last > high) line.last = first + (high - at_first) / rise;
  if (at_first < low) {
    const int64_t skipped = divide_up(low - at_first, rise);
    line.first += skipped;
    line.minor += skipped * line.step;
  }
  return line;
}

// Calls plot(x, y) for the pixels of the line inside columns and rows.
template <class Plot>
void walk_line(int x0, int y0, int x1, int y1, range columns, range rows, Plot&& plot) {
  int64_t x = x0;
  int64_t y = y0;
  int64_t dx = static_cast<int64_t>(x1) - x0;
  int64_t dy = static_cast<int64_t>(y1) - y0;
  if (dx + dy < 0) {
    x += dx;
    y += dy;
    dx = -dx;
    dy = -dy;
  }
  if (dx > dy) {
    walk line = start_walk(x, y, dx, dy, columns, rows);
    for (; line.first <= line.last; ++line.first, line.minor += line.step) {
      plot(static_cast<int>(line.first), static_cast<int>(line.minor >> 16));
    }
  } else {
    walk line = start_walk(y, x, dy, dx, rows, columns);
    for (; line.first <= line.last; ++line.first, line.minor += line.step) {
      plot(static_cast<int>(line.minor >> 16), static_cast<int>(line.first));
    }
  }
}

}  // namespace

void toolkit::line_h(int x, int y, int length, unsigned int colour, unsigned int mode) {
  if (colourbuffer == nullptr || y < clip_y0 || y >= clip_y1) return;
  const bool visible = primitive::clip_run(x, length, clip_x0, clip_x1);
  primitive::with_operation(mode, colour, [&](const auto& operation) {
    if (!visible) return;
    primitive::draw_run(colourbuffer + primitive::pixel_index(x, y, width), static_cast<std::size_t>(length),
                        operation);
  });
}

void toolkit::line_v(int x, int y, int length, unsigned int colour, unsigned int mode) {
  if (colourbuffer == nullptr || x < clip_x0 || x >= clip_x1) return;
  const bool visible = primitive::clip_run(y, length, clip_y0, clip_y1);
  primitive::with_operation(mode, colour, [&](const auto& operation) {
    if (!visible) return;
    unsigned int* p = colourbuffer + primitive::pixel_index(x, y, width);
    for (; length > 0; --length, p += width) primitive::plot(p, operation);
  });
}

void toolkit::line(int x0, int y0, int x1, int y1, unsigned int colour, unsigned int mode) {
  if (colourbuffer == nullptr) return;
  primitive::with_operation(mode, colour, [&](const auto& operation) {
    walk_line(x0, y0, x1, y1, {clip_x0, clip_x1}, {clip_y0, clip_y1},
              [&](int x, int y) { primitive::plot(colourbuffer + primitive::pixel_index(x, y, width), operation); });
  });
}

void toolkit::line(int x0, int y0, int x1, int y1, unsigned int colour, unsigned int mode, clippingmask& mask,
                   int mask_x, int mask_y) {
  if (colourbuffer == nullptr) return;
  const int64_t mask_top = mask_y;
  const range rows{std::max<int64_t>(mask_top, clip_y0), std::min<int64_t>(clip_y1, mask_top + mask.rows())};
  const int* starts = mask.starts.data();
  const int* lengths = mask.lengths.data();
  primitive::with_operation(mode, colour, [&](const auto& operation) {
    walk_line(x0, y0, x1, y1, {clip_x0, clip_x1}, rows, [&](int x, int y) {
      const int64_t r = y - mask_top;
      const int64_t column = x - (static_cast<int64_t>(mask_x) + starts[r]);
      if (column < 0 || column >= lengths[r]) return;
      primitive::plot(colourbuffer + primitive::pixel_index(x, y, width), operation);
    });
  });
}

void toolkit::line(int x0, int y0, int z0, int, int, int, unsigned int colour, unsigned int mode) {
  using namespace Rasterizer_n;
  const SSEMath::Word8 packed = PackForCulling<true>(
      ToScreen(Transform(viewprojection, static_cast<float>(x0), static_cast<float>(y0), static_cast<float>(z0))));
  if (CullFlags(packed) != CullFlagsVisible) return;
  const int x = static_cast<std::int16_t>(_mm_extract_epi16(packed.v, 0));
  const int y = static_cast<std::int16_t>(_mm_extract_epi16(packed.v, 1));
  line(x, y, x, y, colour, mode);
}
