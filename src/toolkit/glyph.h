// Drawing of one glyph bitmap, shared by the three fonts: placement, clipping, masks, and the ways in which a glyph
// byte meets a target pixel.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstring>

#include "maths/SSEMath.h"
#include "toolkit/clippingmask.h"
#include "toolkit/toolkit.h"

namespace glyph {

using SSEMath::Int4;
using SSEMath::Word8;

// width * height bytes, row-major; 0 never touches the target. Without bytes there is nothing to draw.
struct bitmap {
  const unsigned char* bytes = nullptr;
  int width = 0;
  int height = 0;
};

// --- Inks: what four glyph bytes, packed lowest first, make of four target pixels ------------------------------------

// The four bytes, each as both words of its pixel's lane.
VELMARK5_LANE Int4 byte_pairs(std::uint32_t bytes) {
  const __m128i words = _mm_unpacklo_epi8(_mm_cvtsi32_si128(static_cast<int>(bytes)), _mm_setzero_si128());
  return {_mm_unpacklo_epi16(words, words)};
}

// All bits where the glyph byte is 0.
VELMARK5_LANE Int4 holes(Int4 pairs) { return SSEMath::equal(pairs, SSEMath::splat(0u)); }

// The colour word as it stands, alpha included.
struct opaque_ink {
  explicit opaque_ink(unsigned int word) : colour(SSEMath::splat(word)) {}
  VELMARK5_LANE Int4 operator()(Int4 d, std::uint32_t bytes) const {
    return SSEMath::select(holes(byte_pairs(bytes)), d, colour);
  }
  Int4 colour;
};

// Per colour channel, with the colour's alpha a: (d * (255 - a) >> 8) + (c * a >> 8), each product truncated by itself.
// The alpha byte becomes 0. The primitives' blend uses 256 - a, and so does coverage_ink.
struct blended_ink {
  explicit blended_ink(unsigned int word)
      : source(SSEMath::shift_right<8>(SSEMath::widen_low(SSEMath::splat(word & 0xFFFFFF)) *
                                       SSEMath::splat_word(static_cast<std::uint16_t>(word >> 24)))),
        rest(SSEMath::splat_word(static_cast<std::uint16_t>(255 - (word >> 24)))) {}
  VELMARK5_LANE Int4 operator()(Int4 d, std::uint32_t bytes) const {
    const Int4 channels = d & SSEMath::splat(0xFFFFFFu);
    // The high half of (d << 8) * rest.
    const Word8 low = SSEMath::mulhi(SSEMath::widen_low_shifted(channels), rest) + source;
    const Word8 high = SSEMath::mulhi(SSEMath::widen_high_shifted(channels), rest) + source;
    return SSEMath::select(holes(byte_pairs(bytes)), d, SSEMath::narrow(low, high));
  }
  Word8 source, rest;
};

// Per colour channel, with the glyph byte g as coverage: (d * (256 - g) >> 8) + (c * g >> 8). The alpha byte becomes 0.
struct coverage_ink {
  explicit coverage_ink(unsigned int word) : colour(SSEMath::widen_low_shifted(SSEMath::splat(word & 0xFFFFFF))) {}
  VELMARK5_LANE Int4 operator()(Int4 d, std::uint32_t bytes) const {
    const Int4 g = byte_pairs(bytes);
    const Word8 low = blend(SSEMath::widen_low_shifted(d), SSEMath::words(SSEMath::shuffle<0, 0, 1, 1>(g)));
    const Word8 high = blend(SSEMath::widen_high_shifted(d), SSEMath::words(SSEMath::shuffle<2, 2, 3, 3>(g)));
    // A hole comes out of this as it was.
    return SSEMath::narrow(low, high) & (holes(g) | SSEMath::splat(0xFFFFFFu));
  }
  // The high halves of products whose one factor has been shifted up by 8.
  VELMARK5_LANE Word8 blend(Word8 d, Word8 g) const {
    return SSEMath::mulhi(d, SSEMath::splat_word(256) - g) + SSEMath::mulhi(colour, g);
  }
  Word8 colour;
};

// The palette's word; the palette covers every byte of the glyph.
struct palette_ink {
  explicit palette_ink(const unsigned int* words) : palette(words) {}
  VELMARK5_LANE Int4 operator()(Int4 d, std::uint32_t bytes) const {
    const auto word = [&](int i) { return static_cast<int>(palette[bytes >> (8 * i) & 0xFF]); };
    const Int4 colours{_mm_setr_epi32(word(0), word(1), word(2), word(3))};
    return SSEMath::select(holes(byte_pairs(bytes)), d, colours);
  }
  const unsigned int* palette;
};

// --- Rows: where the byte for a screen column comes from -------------------------------------------------------------

// Upright: the bytes of a screen row stand side by side.
struct upright_rows {
  explicit upright_rows(const bitmap& b) : bytes(b.bytes), step(b.width) {}
  const unsigned char* row(std::ptrdiff_t j) const { return bytes + j * step; }
  VELMARK5_LANE std::uint32_t four(const unsigned char* row, std::ptrdiff_t i) const {
    std::uint32_t word;
    std::memcpy(&word, row + i, 4);
    return word;
  }
  VELMARK5_LANE std::uint32_t one(const unsigned char* row, std::ptrdiff_t i) const { return row[i]; }
  const unsigned char* bytes;
  std::ptrdiff_t step;  // from row to row
};

// A quarter turn counter-clockwise: right on the screen is down in the glyph, each lower screen row is one glyph column
// further to the left.
struct upward_rows {
  explicit upward_rows(const bitmap& b) : bytes(b.bytes), stride(b.width) {}
  const unsigned char* row(std::ptrdiff_t j) const { return bytes + (stride - 1 - j); }
  VELMARK5_LANE std::uint32_t four(const unsigned char* row, std::ptrdiff_t i) const {
    return one(row, i) | one(row, i + 1) << 8 | one(row, i + 2) << 16 | one(row, i + 3) << 24;
  }
  VELMARK5_LANE std::uint32_t one(const unsigned char* row, std::ptrdiff_t i) const { return row[i * stride]; }
  const unsigned char* bytes;
  std::ptrdiff_t stride;
  static constexpr std::ptrdiff_t step = -1;  // from row to row
};

// --- Drawing ---------------------------------------------------------------------------------------------------------

// Four pixels, of which many are holes: much of a letter's box is empty.
template <class Ink>
VELMARK5_LANE void draw_four(unsigned int* target, const Ink& ink, std::uint32_t bytes) {
  if (bytes != 0) SSEMath::store_unaligned(target, ink(SSEMath::load_unaligned(target), bytes));
}

// Columns `from` up to `to` of a row of the box; target is the pixel of column 0.
template <class Ink, class Rows>
VELMARK5_LANE void draw_row(unsigned int* target, const Ink& ink, const Rows& rows, const unsigned char* bytes,
                            int from, int to) {
  std::ptrdiff_t i = from;
  for (; i + 4 <= to; i += 4) draw_four(target + i, ink, rows.four(bytes, i));
  for (; i < to; ++i) {
    SSEMath::store_one(target + i, ink(SSEMath::load_one(target + i), rows.one(bytes, i)));
  }
}

// Rows of a whole number of groups of four, few enough to be written out.
template <int Groups, class Ink, class Rows>
VELMARK5_LANE void draw_groups(unsigned int* target, std::ptrdiff_t pitch, const Ink& ink, const Rows& rows,
                               const unsigned char* bytes, int from, int count) {
  target += from;
  for (; count > 0; --count, target += pitch, bytes += rows.step) {
    draw_four(target, ink, rows.four(bytes, from));
    if constexpr (Groups > 1) draw_four(target + 4, ink, rows.four(bytes, from + 4));
    if constexpr (Groups > 2) draw_four(target + 8, ink, rows.four(bytes, from + 8));
  }
}

// The part of a box of w by h at (x, y) that the clip rectangle leaves, in the box's own columns and rows.
struct visible_part {
  visible_part(const toolkit& t, long long x, long long y, int w, int h)
      : left(cut(t.clip_x0 - x, w)),
        top(cut(t.clip_y0 - y, h)),
        right(cut(t.clip_x1 - x, w)),
        bottom(cut(t.clip_y1 - y, h)) {}
  bool empty() const { return left >= right || top >= bottom; }
  int left, top, right, bottom;

 private:
  static int cut(long long edge, int size) {
    return static_cast<int>(std::clamp<long long>(edge, 0, std::max(size, 0)));
  }
};

// The target's pixel at (x, y); only arithmetic, the place may lie outside.
inline unsigned int* pixel(const toolkit& t, long long x, long long y) {
  return t.colourbuffer + static_cast<std::ptrdiff_t>(y * t.width + x);
}

// Draws a box of w by h at (x, y), its pixels taken from `rows`, on the toolkit's target.
template <class Ink, class Rows>
void draw(const toolkit& t, long long x, long long y, int w, int h, const Ink& ink, const Rows& rows) {
  const visible_part part(t, x, y, w, h);
  if (part.empty()) return;
  // The pixel of column 0, though it need not lie in the target.
  const std::ptrdiff_t pitch = t.width;
  unsigned int* target = pixel(t, x, y + part.top);
  const unsigned char* bytes = rows.row(part.top);
  const int count = part.bottom - part.top;
  switch (part.right - part.left) {
    case 8:
      return draw_groups<2>(target, pitch, ink, rows, bytes, part.left, count);
    case 12:
      return draw_groups<3>(target, pitch, ink, rows, bytes, part.left, count);
  }
  for (int i = 0; i < count; ++i, target += pitch, bytes += rows.step) {
    draw_row(target, ink, rows, bytes, part.left, part.right);
  }
}

// The same within the spans of a mask at (mask_x, mask_y).
template <class Ink, class Rows>
void draw_masked(const toolkit& t, long long x, long long y, int w, int h, const Ink& ink, const Rows& rows,
                 const clippingmask& mask, int mask_x, int mask_y) {
  const visible_part part(t, x, y, w, h);
  if (part.empty()) return;
  // The mask's rows, and where its columns begin, counted in the box.
  const long long first = std::max<long long>(part.top, mask_y - y);
  const long long end = std::min<long long>(part.bottom, mask_y - y + mask.rows());
  const long long column = mask_x - x;
  const int* const starts = mask.starts.data();
  const int* const lengths = mask.lengths.data();
  for (long long row = first; row < end; ++row) {
    const long long mask_row = row - (mask_y - y);
    const long long start = column + starts[mask_row];
    const auto from = static_cast<int>(std::clamp<long long>(start, part.left, part.right));
    const auto to = static_cast<int>(std::clamp<long long>(start + lengths[mask_row], from, part.right));
    draw_row(pixel(t, x, y + row), ink, rows, rows.row(row), from, to);
  }
}

}  // namespace glyph
