// Copies between the target and arrays, and scrolling.
#include <cstdint>
#include <cstring>

#include "toolkit/primitive_blend.h"
#include "toolkit/toolkit.h"

namespace {

using namespace primitive;
using std::int64_t;

// Scrolls an image of `total` words: word i becomes what word i - offset was. The others, at the end that the contents
// move away from, stay.
void shift(void* image, int64_t total, int64_t offset) {
  constexpr int64_t word = 4;
  char* bytes = static_cast<char*>(image);
  if (offset > 0 && offset < total) {
    std::memmove(bytes + offset * word, bytes, static_cast<std::size_t>((total - offset) * word));
  } else if (offset < 0 && -offset < total) {
    std::memmove(bytes, bytes - offset * word, static_cast<std::size_t>((total + offset) * word));
  }
}

// The same past the caches. Each group is read whole before it is stored, and nothing is read that was stored before,
// so any distance will do.
void shift_streaming(void* image, int64_t total, int64_t offset) {
  auto* const first = static_cast<std::uint32_t*>(image);
  const auto distance = static_cast<std::ptrdiff_t>(offset);
  if (offset > 0 && offset < total) {
    std::uint32_t* end = first + static_cast<std::ptrdiff_t>(total);
    std::uint32_t* const stop = first + distance;
    while (end > stop && !on_group_boundary(end)) --end, stream_one(end, end[-distance]);
    while (end - stop >= 4) end -= 4, stream(end, load_unaligned(end - distance));
    while (end > stop) --end, stream_one(end, end[-distance]);
  } else if (offset < 0 && -offset < total) {
    std::uint32_t* p = first;
    std::uint32_t* const stop = first + static_cast<std::ptrdiff_t>(total + offset);
    for (; p < stop && !on_group_boundary(p); ++p) stream_one(p, p[-distance]);
    for (; stop - p >= 4; p += 4) stream(p, load_unaligned(p - distance));
    for (; p < stop; ++p) stream_one(p, p[-distance]);
  }
  stream_end();
}

}  // namespace

template <bool Colour, bool Depth>
void toolkit::scroll(int dx, int dy) {
  const int64_t total = static_cast<int64_t>(width) * height;
  const int64_t offset = static_cast<int64_t>(dy) * width + dx;
  if constexpr (Colour && Depth) {
    if (colourbuffer == nullptr || depthbuffer == nullptr) return;
    shift(colourbuffer, total, offset);
    shift(depthbuffer, total, offset);
  } else if constexpr (Colour) {
    if (colourbuffer != nullptr) shift_streaming(colourbuffer, total, offset);
  } else if constexpr (Depth) {
    if (depthbuffer != nullptr) shift_streaming(depthbuffer, total, offset);
  }
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
    std::memcpy(to, colourbuffer + pixel_index(x, y + r, width), row_words * sizeof(int));
  }
}

void toolkit::setarea(int x, int y, int w, int h, const pinned_jintArrayRO& in, int offset, int stride) {
  if (colourbuffer == nullptr || h < 1 || w < 1) return;
  const auto row_words = static_cast<std::size_t>(w);
  for (int r = 0; r < h; ++r) {
    const int* from = in.elements + offset + static_cast<std::ptrdiff_t>(r) * stride;
    std::memcpy(colourbuffer + pixel_index(x, y + r, width), from, row_words * sizeof(int));
  }
}
