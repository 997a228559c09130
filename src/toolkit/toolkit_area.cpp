// Copies between the target and arrays, and scrolling.
#include <cstdint>
#include <cstring>

#include "toolkit/primitive_blend.h"
#include "toolkit/toolkit.h"

namespace {

// Moves the image of `total` words on by `offset` words; what nothing moves onto stays.
void shift(void* image, std::int64_t total, std::int64_t offset) {
  constexpr std::int64_t word = 4;
  char* bytes = static_cast<char*>(image);
  if (offset > 0 && offset < total) {
    std::memmove(bytes + offset * word, bytes, static_cast<std::size_t>((total - offset) * word));
  } else if (offset < 0 && -offset < total) {
    std::memmove(bytes, bytes - offset * word, static_cast<std::size_t>((total + offset) * word));
  }
}

}  // namespace

template <bool Colour, bool Depth>
void toolkit::scroll(int dx, int dy) {
  const std::int64_t total = static_cast<std::int64_t>(width) * height;
  const std::int64_t offset = static_cast<std::int64_t>(dy) * width + dx;
  if (Colour) shift(colourbuffer, total, offset);
  if (Depth) shift(depthbuffer, total, offset);
}

template void toolkit::scroll<true, true>(int dx, int dy);
template void toolkit::scroll<true, false>(int dx, int dy);
template void toolkit::scroll<false, true>(int dx, int dy);

void toolkit::getarea(int x, int y, int w, int h, pinned_jintArray& out) {
  if (colourbuffer == nullptr) throw new Exception("No colour buffer");
  if (w <= 0) return;
  const auto row_words = static_cast<std::size_t>(w);
  int* to = out.elements;
  for (int r = 0; r < h; ++r, to += w) {
    std::memcpy(to, colourbuffer + primitive::pixel_index(x, y + r, width), row_words * sizeof(int));
  }
}

void toolkit::setarea(int x, int y, int w, int h, const pinned_jintArrayRO& in, int offset, int stride) {
  if (colourbuffer == nullptr || h < 1 || w < 1) return;
  const auto row_words = static_cast<std::size_t>(w);
  for (int r = 0; r < h; ++r) {
    const int* from = in.elements + offset + static_cast<std::ptrdiff_t>(r) * stride;
    std::memcpy(colourbuffer + primitive::pixel_index(x, y + r, width), from, row_words * sizeof(int));
  }
}
