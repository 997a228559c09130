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

// Per colour channel, with the glyph byte g as coverage: (d * (256 - g) >> 8) + (c * g >> 8). The alpha byte becomes 0,
// but stays as it was where g is 0. Blue and red stand in one register, green and alpha in the other.
struct coverage_ink {
  explicit coverage_ink(unsigned int word)
      : blue_red(SSEMath::shift_left<8>(SSEMath::words(SSEMath::splat(word)))),
        green(SSEMath::words(SSEMath::splat(word & 0xFF00u))) {}
  VELMARK5_LANE Int4 operator()(Int4 d, std::uint32_t bytes) const {
    using namespace SSEMath;
    const Word8 g = words(byte_pairs(bytes));
    const Word8 all = splat_word(256);
    // Of the target's alpha remain 256 parts where g is 0, else none: 256 - 256 * g, but not below 0.
    const Word8 rest = all - g;
    const Word8 rest_green = subtract_saturating(all, g * words(splat(0x01000001u)));
    // The high halves of products whose one factor has been shifted up by 8.
    const Word8 low = mulhi(shift_left<8>(words(d)), rest) + mulhi(blue_red, g);
    const Word8 high = mulhi(words(d & splat(0xFF00FF00u)), rest_green) + mulhi(green, g);
    return pixels(low) | pixels(shift_left<8>(high));
  }
  Word8 blue_red, green;
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

// --- Drawing ---------------------------------------------------------------------------------------------------------

// The first of a number of rows of glyph bytes, and how far it is from one to the next.
struct byte_rows {
  const unsigned char* first;
  std::ptrdiff_t step;
};

VELMARK5_LANE std::uint32_t four_bytes(const unsigned char* from) {
  std::uint32_t word;
  std::memcpy(&word, from, 4);
  return word;
}

// The n bytes before `end`, 1 to 3, of a row of `width`.
VELMARK5_LANE std::uint32_t few_bytes(const unsigned char* end, int n, int width) {
  if (width >= 4) return four_bytes(end - 4) >> (8 * (4 - n));
  std::uint32_t word = end[-1];
  if (n > 1) word = word << 8 | end[-2];
  if (n > 2) word = word << 8 | end[-3];
  return word;
}

// 1 to 3 pixels in the lowest lanes.
VELMARK5_LANE Int4 load_few(const unsigned int* from, int n) {
  if (n == 1) return SSEMath::load_one(from);
  const Int4 two{_mm_loadl_epi64(reinterpret_cast<const __m128i*>(from))};
  return n == 2 ? two : SSEMath::join_low(two, SSEMath::load_one(from + 2));
}
VELMARK5_LANE void store_few(unsigned int* to, int n, Int4 pixels) {
  if (n == 1) return SSEMath::store_one(to, pixels);
  _mm_storel_epi64(reinterpret_cast<__m128i*>(to), pixels.v);
  if (n == 3) SSEMath::store_one(to + 2, SSEMath::shuffle<2, 2, 2, 2>(pixels));
}

// Four pixels, of which many are holes: much of a letter's box is empty.
template <class Ink>
VELMARK5_LANE void draw_four(unsigned int* target, const Ink& ink, std::uint32_t bytes) {
  if (bytes != 0) SSEMath::store_unaligned(target, ink(SSEMath::load_unaligned(target), bytes));
}

// Rows of some groups of four and, if Odd, up to three pixels more. Groups is how many, or negative if only the width
// tells.
template <int Groups, bool Odd, class Ink>
VELMARK5_LANE void draw_groups(unsigned int* target, std::ptrdiff_t pitch, const Ink& ink, byte_rows rows, int width,
                               int count) {
  const std::ptrdiff_t even = width & -4;
  for (; count > 0; --count, target += pitch, rows.first += rows.step) {
    const auto group = [&](std::ptrdiff_t i) { draw_four(target + i, ink, four_bytes(rows.first + i)); };
    if constexpr (Groups < 0) {
      for (std::ptrdiff_t i = 0; i < even; i += 4) group(i);
    }
    if constexpr (Groups > 0) group(0);
    if constexpr (Groups > 1) group(4);
    if constexpr (Groups > 2) group(8);
    if constexpr (Groups > 3) group(12);
    if constexpr (Odd) {
      const std::uint32_t bytes = few_bytes(rows.first + width, width % 4, width);
      if (bytes != 0) store_few(target + even, width % 4, ink(load_few(target + even, width % 4), bytes));
    }
  }
}

// A block of width by count pixels from target on, whose bytes are `rows`. Widths of letters are written out.
template <class Ink>
VELMARK5_LANE void draw_rows(unsigned int* target, std::ptrdiff_t pitch, const Ink& ink, byte_rows rows, int width,
                             int count) {
#define VELMARK5_WIDTH(groups)                                                               \
  return width % 4 == 0 ? draw_groups<groups, false>(target, pitch, ink, rows, width, count) \
                        : draw_groups<groups, true>(target, pitch, ink, rows, width, count)
  switch (width / 4) {
    case 1:
      VELMARK5_WIDTH(1);
    case 2:
      VELMARK5_WIDTH(2);
    case 3:
      VELMARK5_WIDTH(3);
    case 4:
      VELMARK5_WIDTH(4);
    default:
      VELMARK5_WIDTH(-1);
  }
#undef VELMARK5_WIDTH
}

// The part of a box of w by h at (x, y) that the clip rectangle leaves, in the box's own columns and rows.
struct visible_part {
  visible_part(const toolkit& t, long long x, long long y, int w, int h) : left(0), top(0), right(w), bottom(h) {
    if (x >= t.clip_x0 && y >= t.clip_y0 && x + w <= t.clip_x1 && y + h <= t.clip_y1) return;
    left = cut(t.clip_x0 - x, w);
    top = cut(t.clip_y0 - y, h);
    right = cut(t.clip_x1 - x, w);
    bottom = cut(t.clip_y1 - y, h);
  }
  bool empty() const { return left >= right || top >= bottom; }
  int left, top, right, bottom;

 private:
  static int cut(long long edge, int size) { return static_cast<int>(std::clamp<long long>(edge, 0, size)); }
};

inline unsigned int* pixel(const toolkit& t, long long x, long long y) {
  return t.colourbuffer + static_cast<std::ptrdiff_t>(y * t.width + x);
}

// Draws the glyph with its top left at (x, y) on the toolkit's target.
template <class Ink>
void draw(const toolkit& t, long long x, long long y, const bitmap& glyph, const Ink& ink) {
  const visible_part part(t, x, y, glyph.width, glyph.height);
  if (part.empty()) return;
  const std::ptrdiff_t step = glyph.width;
  draw_rows(pixel(t, x + part.left, y + part.top), t.width, ink, {glyph.bytes + part.top * step + part.left, step},
            part.right - part.left, part.bottom - part.top);
}

// The same within the spans of a mask at (mask_x, mask_y).
template <class Ink>
void draw_masked(const toolkit& t, long long x, long long y, const bitmap& glyph, const Ink& ink,
                 const clippingmask& mask, int mask_x, int mask_y) {
  const visible_part part(t, x, y, glyph.width, glyph.height);
  if (part.empty()) return;
  // Where the mask begins, and its rows, counted in the box.
  const long long mask_left = mask_x - x;
  const long long mask_top = mask_y - y;
  const long long first = std::max<long long>(part.top, mask_top);
  const long long end = std::min<long long>(part.bottom, mask_top + mask.rows());
  const int* const starts = mask.starts.data();
  const int* const lengths = mask.lengths.data();
  const long long left = part.left - mask_left;
  const long long right = part.right - mask_left;
  const auto whole = [&](long long row) {
    const long long start = starts[row - mask_top];
    return start <= left && start + lengths[row - mask_top] >= right;
  };
  const auto draw_part = [&](long long row, long long rows, int from, int to) {
    const std::ptrdiff_t step = glyph.width;
    draw_rows(pixel(t, x + from, y + row), t.width, ink,
              {glyph.bytes + static_cast<std::ptrdiff_t>(row) * step + from, step}, to - from, static_cast<int>(rows));
  };
  for (long long row = first; row < end; ++row) {
    // Most glyphs lie well inside: rows that the mask leaves whole are drawn together.
    const long long begin = row;
    while (row < end && whole(row)) ++row;
    if (row > begin) draw_part(begin, row - begin, part.left, part.right);
    if (row < end) {
      const long long start = mask_left + starts[row - mask_top];
      const auto from = static_cast<int>(std::clamp<long long>(start, part.left, part.right));
      const auto to = static_cast<int>(std::clamp<long long>(start + lengths[row - mask_top], from, part.right));
      draw_part(row, 1, from, to);
    }
  }
}

// --- Turned glyphs ---------------------------------------------------------------------------------------------------

// A part of a glyph turned a quarter counter-clockwise: right on the screen is down in the glyph, each lower screen row
// is one glyph column further to the left. The margin takes what blocks of eight by eight write too much.
class turned_tile {
 public:
  static constexpr int columns = 64, rows = 16;  // on the screen

  // From screen column `column` and row `row` of the turned glyph on, w by h.
  [[gnu::noinline]] turned_tile(const bitmap& glyph, int column, int row, int w, int h) {
    if (glyph.width < 8 || glyph.height < 8) {
      for (int j = 0; j < h; ++j) {
        for (int i = 0; i < w; ++i) *place(i, j) = *source(glyph, column + i, row + j);
      }
      return;
    }
    for (int j = 0; j < h; j += 8) {
      // At the glyph's end the last eight, some of them once more.
      const int at_j = std::min(row + j, glyph.width - 8);
      for (int i = 0; i < w; i += 8) {
        const int at_i = std::min(column + i, glyph.height - 8);
        turn_block(source(glyph, at_i, at_j + 7), glyph.width, place(at_i - column, at_j - row));
      }
    }
  }
  byte_rows bytes() const { return {at + margin * step + margin, step}; }

 private:
  static constexpr int margin = 8;
  static constexpr std::ptrdiff_t step = columns + 2 * margin;

  unsigned char* place(int i, int j) { return at + (j + margin) * step + i + margin; }
  // The byte that turns to screen column i and row j.
  static const unsigned char* source(const bitmap& glyph, int i, int j) {
    return glyph.bytes + static_cast<std::ptrdiff_t>(i) * glyph.width + (glyph.width - 1 - j);
  }
  // Eight rows of eight bytes, `pitch` apart.
  static void turn_block(const unsigned char* from, std::ptrdiff_t pitch, unsigned char* to) {
    const auto row = [&](std::ptrdiff_t k) {
      return _mm_loadl_epi64(reinterpret_cast<const __m128i*>(from + k * pitch));
    };
    // Columns of two rows, of four, of all eight.
    const __m128i a = _mm_unpacklo_epi8(row(0), row(1)), b = _mm_unpacklo_epi8(row(2), row(3));
    const __m128i c = _mm_unpacklo_epi8(row(4), row(5)), d = _mm_unpacklo_epi8(row(6), row(7));
    const __m128i ab_left = _mm_unpacklo_epi16(a, b), ab_right = _mm_unpackhi_epi16(a, b);
    const __m128i cd_left = _mm_unpacklo_epi16(c, d), cd_right = _mm_unpackhi_epi16(c, d);
    const auto put = [&](int lower, __m128i two) {
      // Bytes lie anywhere, which the stores of doubles do not allow for.
      _mm_storel_epi64(reinterpret_cast<__m128i*>(to + lower * step), two);
      _mm_storeh_pi(reinterpret_cast<__m64*>(to + (lower - 1) * step), _mm_castsi128_ps(two));
    };
    put(7, _mm_unpacklo_epi32(ab_left, cd_left));
    put(5, _mm_unpackhi_epi32(ab_left, cd_left));
    put(3, _mm_unpacklo_epi32(ab_right, cd_right));
    put(1, _mm_unpackhi_epi32(ab_right, cd_right));
  }

  unsigned char at[(rows + 2 * margin) * step];
};

// Draws the turned glyph with its top left at (x, y).
template <class Ink>
void draw_upwards(const toolkit& t, long long x, long long y, const bitmap& glyph, const Ink& ink) {
  const visible_part part(t, x, y, glyph.height, glyph.width);
  for (int j = part.top; j < part.bottom; j += turned_tile::rows) {
    const int h = std::min(turned_tile::rows, part.bottom - j);
    for (int i = part.left; i < part.right; i += turned_tile::columns) {
      const int w = std::min(turned_tile::columns, part.right - i);
      const turned_tile tile(glyph, i, j, w, h);
      draw_rows(pixel(t, x + i, y + j), t.width, ink, tile.bytes(), w, h);
    }
  }
}

}  // namespace glyph
