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

// The four bytes, one to a lane.
VELMARK5_LANE Int4 byte_lanes(std::uint32_t bytes) {
  const __m128i zero = _mm_setzero_si128();
  return {_mm_unpacklo_epi16(_mm_unpacklo_epi8(_mm_cvtsi32_si128(static_cast<int>(bytes)), zero), zero)};
}

// All bits where the glyph byte is 0.
VELMARK5_LANE Int4 holes(Int4 bytes) { return SSEMath::equal(bytes, SSEMath::splat(0u)); }

// The colour word as it stands, alpha included.
struct opaque_ink {
  explicit opaque_ink(unsigned int word) : colour(SSEMath::splat(word)) {}
  VELMARK5_LANE Int4 operator()(Int4 d, std::uint32_t bytes) const {
    return SSEMath::select(holes(byte_lanes(bytes)), d, colour);
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
    const Word8 low = SSEMath::shift_right<8>(SSEMath::widen_low(channels) * rest) + source;
    const Word8 high = SSEMath::shift_right<8>(SSEMath::widen_high(channels) * rest) + source;
    return SSEMath::select(holes(byte_lanes(bytes)), d, SSEMath::narrow(low, high));
  }
  Word8 source, rest;
};

// Per colour channel, with the glyph byte g as coverage: (d * (256 - g) >> 8) + (c * g >> 8). The alpha byte becomes 0.
struct coverage_ink {
  explicit coverage_ink(unsigned int word) : colour(SSEMath::widen_low(SSEMath::splat(word & 0xFFFFFF))) {}
  VELMARK5_LANE Int4 operator()(Int4 d, std::uint32_t bytes) const {
    const Int4 g = byte_lanes(bytes);
    const Int4 pairs{_mm_or_si128(g.v, _mm_slli_epi32(g.v, 16))};
    const Int4 channels = d & SSEMath::splat(0xFFFFFFu);
    const Word8 low = blend(SSEMath::widen_low(channels), {_mm_unpacklo_epi32(pairs.v, pairs.v)});
    const Word8 high = blend(SSEMath::widen_high(channels), {_mm_unpackhi_epi32(pairs.v, pairs.v)});
    return SSEMath::select(holes(g), d, SSEMath::narrow(low, high));
  }
  VELMARK5_LANE Word8 blend(Word8 d, Word8 g) const {
    return SSEMath::shift_right<8>(d * (SSEMath::splat_word(256) - g)) + SSEMath::shift_right<8>(colour * g);
  }
  Word8 colour;
};

// The palette's word; the palette covers every byte of the glyph.
struct palette_ink {
  explicit palette_ink(const unsigned int* words) : palette(words) {}
  VELMARK5_LANE Int4 operator()(Int4 d, std::uint32_t bytes) const {
    const auto word = [&](int i) { return static_cast<int>(palette[bytes >> (8 * i) & 0xFF]); };
    const Int4 colours{_mm_setr_epi32(word(0), word(1), word(2), word(3))};
    return SSEMath::select(holes(byte_lanes(bytes)), d, colours);
  }
  const unsigned int* palette;
};

// --- Rows: where the byte for a screen column comes from -------------------------------------------------------------

// Upright: the bytes of a screen row stand side by side.
struct upright_rows {
  explicit upright_rows(const bitmap& b) : bytes(b.bytes), stride(b.width) {}
  const unsigned char* row(int j) const { return bytes + static_cast<std::ptrdiff_t>(j) * stride; }
  VELMARK5_LANE std::uint32_t four(const unsigned char* row, int i) const {
    std::uint32_t word;
    std::memcpy(&word, row + i, 4);
    return word;
  }
  VELMARK5_LANE std::uint32_t one(const unsigned char* row, int i) const { return row[i]; }
  const unsigned char* bytes;
  std::ptrdiff_t stride;
};

// A quarter turn counter-clockwise: right on the screen is down in the glyph, each lower screen row is one glyph column
// further to the left.
struct upward_rows {
  explicit upward_rows(const bitmap& b) : bytes(b.bytes), stride(b.width) {}
  const unsigned char* row(int j) const { return bytes + (stride - 1 - j); }
  VELMARK5_LANE std::uint32_t four(const unsigned char* row, int i) const {
    return one(row, i) | one(row, i + 1) << 8 | one(row, i + 2) << 16 | one(row, i + 3) << 24;
  }
  VELMARK5_LANE std::uint32_t one(const unsigned char* row, int i) const { return row[i * stride]; }
  const unsigned char* bytes;
  std::ptrdiff_t stride;
};

// --- Drawing ---------------------------------------------------------------------------------------------------------

// Columns `from` up to `to` of a row of the box; target is the pixel of column `from`.
template <class Ink, class Rows>
VELMARK5_LANE void draw_row(unsigned int* target, const Ink& ink, const Rows& rows, int row, int from, int to) {
  const unsigned char* bytes = rows.row(row);
  for (; from + 4 <= to; from += 4, target += 4) {
    SSEMath::store_unaligned(target, ink(SSEMath::load_unaligned(target), rows.four(bytes, from)));
  }
  for (; from < to; ++from, ++target) {
    SSEMath::store_one(target, ink(SSEMath::load_one(target), rows.one(bytes, from)));
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

// Draws a box of w by h at (x, y), its pixels taken from `rows`, on the toolkit's target. With a mask only the mask's
// spans are drawn.
template <class Ink, class Rows>
void draw(const toolkit& t, long long x, long long y, int w, int h, const Ink& ink, const Rows& rows,
          const clippingmask* mask = nullptr, int mask_x = 0, int mask_y = 0) {
  const visible_part part(t, x, y, w, h);
  if (part.empty()) return;
  for (int row = part.top; row < part.bottom; ++row) {
    int from = part.left;
    int to = part.right;
    if (mask != nullptr) {
      const long long mask_row = y + row - mask_y;
      if (mask_row < 0 || mask_row >= mask->rows()) continue;
      const long long start = static_cast<long long>(mask_x) + mask->starts[static_cast<int>(mask_row)] - x;
      const long long end = start + mask->lengths[static_cast<int>(mask_row)];
      from = static_cast<int>(std::clamp<long long>(start, from, to));
      to = static_cast<int>(std::clamp<long long>(end, from, to));
    }
    const auto index = static_cast<std::ptrdiff_t>((y + row) * t.width + x + from);
    draw_row(t.colourbuffer + index, ink, rows, row, from, to);
  }
}

}  // namespace glyph
