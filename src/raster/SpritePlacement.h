// Where a sprite meets the target: clipping, mask spans and exact conversions, for every way of drawing.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <limits>

#include "raster/Sprite.h"

namespace sprite_render {

using i64 = std::int64_t;  // coordinates of any size add up without overflow

// The part of an image's box that is drawn, in target pixels, and how far it begins inside the box.
struct Visible {
  int x, y, width, height;
  i64 skipped_x, skipped_y;

  bool empty() const { return width < 1 || height < 1; }
};

struct Bounds {
  i64 x0, y0, x1, y1;
};

inline Visible visible_part(i64 x0, i64 y0, i64 width, i64 height, const Bounds& clip) {
  const i64 left = std::max(x0, clip.x0);
  const i64 top = std::max(y0, clip.y0);
  const i64 w = std::min(clip.x1, x0 + width) - left;
  const i64 h = std::min(clip.y1, y0 + height) - top;
  if (w < 1 || h < 1) return {};
  // What is left lies inside the target, so it fits again.
  return {static_cast<int>(left), static_cast<int>(top), static_cast<int>(w), static_cast<int>(h), left - x0, top - y0};
}

inline Bounds clip_of(const SpriteTarget_s& target) {
  return {target.clip_x0, target.clip_y0, target.clip_x1, target.clip_y1};
}

// Towards zero; what does not fit becomes the lowest integer.
inline int truncate(long double value) {
  return value > -2147483649.0L && value < 2147483648.0L ? static_cast<int>(value) : std::numeric_limits<int>::min();
}

inline std::ptrdiff_t pixel_index(int x, int y, int pitch) { return static_cast<std::ptrdiff_t>(y) * pitch + x; }

// The columns of the mask's span in target row y, cut to from..to (exclusive). Empty where the mask has no such row.
struct Span {
  i64 from, to;
};
inline Span span_of_row(const SpanMask_s& mask, int maskx, int masky, int y, Span limits) {
  const i64 row = i64{y} - masky;
  if (row < 0 || row >= mask.rows) return {0, 0};
  const i64 start = i64{maskx} + mask.starts[row];
  return {std::max(start, limits.from), std::min(start + mask.lengths[row], limits.to)};
}

}  // namespace sprite_render
