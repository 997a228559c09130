// Rectangles, clears and masked clears.
#include <algorithm>
#include <bit>
#include <cstdint>

#include "toolkit/clippingmask.h"
#include "toolkit/primitive_blend.h"
#include "toolkit/toolkit.h"

namespace {

// Applies fill(first pixel, count) to the rows of a clipped rectangle, or once to all of it where it is the whole image
// and its rows follow each other.
template <class Word, class Fill>
void for_each_run(Word* image, int width, int height, int x, int y, int w, int h, Fill&& fill) {
  if (x == 0 && y == 0 && w == width && h == height) {
    fill(image, static_cast<std::size_t>(w) * static_cast<std::size_t>(h));
    return;
  }
  Word* row = image + primitive::pixel_index(x, y, width);
  for (; h > 0; --h, row += width) fill(row, static_cast<std::size_t>(w));
}

}  // namespace

void toolkit::cls(unsigned int colour) { rect_fill(0, 0, width, height, colour, 0); }

void toolkit::rect_fill(int x, int y, int w, int h, unsigned int colour, unsigned int mode) {
  if (colourbuffer == nullptr) return;
  const bool visible = primitive::clip_run(x, w, clip_x0, clip_x1) && primitive::clip_run(y, h, clip_y0, clip_y1);
  primitive::with_operation(mode, colour, [&](const auto& operation) {
    if (!visible) return;
    for_each_run(colourbuffer, width, height, x, y, w, h,
                 [&](unsigned int* first, std::size_t count) { primitive::fill_run(first, count, operation); });
    primitive::stream_end();
  });
}

void toolkit::zbuffer_clear(int x, int y, int w, int h, float value) {
  if (depthbuffer == nullptr) return;
  if (!primitive::clip_run(x, w, clip_x0, clip_x1) || !primitive::clip_run(y, h, clip_y0, clip_y1)) return;
  const auto word = std::bit_cast<std::uint32_t>(value);
  for_each_run(depthbuffer, width, height, x, y, w, h, [word](float* first, std::size_t count) {
    primitive::stream_run(reinterpret_cast<std::uint32_t*>(first), count, word);
  });
  primitive::stream_end();
}

void toolkit::cls_masked(unsigned int colour, clippingmask& mask, int x, int y) {
  if (colourbuffer == nullptr) return;
  // Rows are counted in the mask; their positions may lie beyond an int.
  const std::int64_t top = y;
  const std::int64_t first = std::max<std::int64_t>(0, clip_y0 - top);
  const std::int64_t last = std::min<std::int64_t>(mask.rows(), clip_y1 - top);
  const int* starts = mask.starts.data();
  const int* lengths = mask.lengths.data();
  for (std::int64_t r = first; r < last; ++r) {
    const std::int64_t start = static_cast<std::int64_t>(x) + starts[r];
    const std::int64_t left = std::max<std::int64_t>(start, clip_x0);
    const std::int64_t right = std::min<std::int64_t>(start + lengths[r], clip_x1);
    if (left >= right) continue;
    unsigned int* row = colourbuffer + primitive::pixel_index(static_cast<int>(left), static_cast<int>(top + r), width);
    primitive::stream_run(row, static_cast<std::size_t>(right - left), colour);
  }
  primitive::stream_end();
}
