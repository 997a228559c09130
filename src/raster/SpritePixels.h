// The arithmetic of sprites: colour operations, blends, and the runs of pixels that apply them. All of it works on
// registers of four pixels; the pixels that are left over at the end of a run go through the same code in lane 0.
//
// s is the image's pixel, d the target's, c the operand colour; formulas hold for each of the four channels, alpha
// included, and every product is truncated by itself.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <type_traits>

#include "maths/SSEMath.h"
#include "raster/Sprite.h"

namespace sprite_pixels {

using namespace SSEMath;

// --- Four pixels as two registers of 16-bit channels ----------------------------------------------------------------

// Blue and red stand in one register, green and alpha in the other, so that no byte has to cross a lane.
struct Planes {
  Word8 blue_red, green_alpha;
};

// Each channel at the bottom of its word: c.
VELMARK5_LANE Planes planes(Int4 p) { return {words(p & splat(0x00FF00FFu)), shift_right<8>(words(p))}; }
// Each channel at the top of its word: c << 8.
VELMARK5_LANE Planes planes_shifted(Int4 p) { return {shift_left<8>(words(p)), words(p & splat(0xFF00FF00u))}; }
VELMARK5_LANE Planes planes_shifted(Planes p) { return {shift_left<8>(p.blue_red), shift_left<8>(p.green_alpha)}; }

VELMARK5_LANE Planes mulhi(Planes p, Planes q) {
  return {SSEMath::mulhi(p.blue_red, q.blue_red), SSEMath::mulhi(p.green_alpha, q.green_alpha)};
}
VELMARK5_LANE Planes mulhi(Planes p, Word8 q) {
  return {SSEMath::mulhi(p.blue_red, q), SSEMath::mulhi(p.green_alpha, q)};
}
VELMARK5_LANE Planes operator+(Planes p, Planes q) { return {p.blue_red + q.blue_red, p.green_alpha + q.green_alpha}; }

// Back to pixels; every channel is at the bottom of its word.
VELMARK5_LANE Int4 packed(Planes p) { return pixels(p.blue_red) | pixels(shift_left<8>(p.green_alpha)); }
VELMARK5_LANE Int4 packed(Int4 p) { return p; }

// The alpha of each pixel in both of its words.
VELMARK5_LANE Word8 alphas(Planes p) {
  return {_mm_shufflehi_epi16(_mm_shufflelo_epi16(p.green_alpha.v, _MM_SHUFFLE(3, 3, 1, 1)), _MM_SHUFFLE(3, 3, 1, 1))};
}
VELMARK5_LANE Word8 alphas(Int4 p) { return alphas(Planes{{}, shift_right<8>(words(p))}); }

// --- Colour operations ----------------------------------------------------------------------------------------------
//
// Made once from the colour. The outcome is pixels or planes, whichever the formula leaves.

template <ColourOp_e>
struct Operation;

// (s * c) >> 8
template <>
struct Operation<ColourOp_e::modulate> {
  explicit Operation(std::uint32_t colour) : c(planes(splat(colour))) {}
  VELMARK5_LANE Planes operator()(Int4 s) const { return mulhi(planes_shifted(s), c); }

  Planes c;
};

// s
template <>
struct Operation<ColourOp_e::none> {
  explicit Operation(std::uint32_t) {}
  VELMARK5_LANE Int4 operator()(Int4 s) const { return s; }
};

// ((s * a) >> 8) + ((c * (255 - a)) >> 8) in wrapping bytes, where a is the signed top byte of the colour. From 128 on
// it is negative: the first term is then 255 for every s but 0, and the second ends at 255.
template <>
struct Operation<ColourOp_e::mix> {
  explicit Operation(std::uint32_t colour) {
    const int a = static_cast<std::int8_t>(colour >> 24);
    weight = splat_word(static_cast<std::uint16_t>(a < 0 ? 0 : a));
    full = splat(a < 0 ? 0xFFFFFFFFu : 0u);
    std::uint32_t term = 0;
    for (int shift = 0; shift < 32; shift += 8) {
      const std::uint32_t product = (colour >> shift & 0xFF) * static_cast<std::uint32_t>(255 - a) >> 8;
      term |= (product > 255 ? 255u : product) << shift;
    }
    second = splat(term);
  }
  VELMARK5_LANE Int4 operator()(Int4 s) const {
    const Int4 first = packed(mulhi(planes_shifted(s), weight)) | and_not(full, equal_bytes(s, splat(0u)));
    return add_bytes(first, second);
  }

  Word8 weight;
  Int4 full;  // all bits where a is negative
  Int4 second;
};

// min(s + c, 255)
template <>
struct Operation<ColourOp_e::add> {
  explicit Operation(std::uint32_t colour) : c(splat(colour)) {}
  VELMARK5_LANE Int4 operator()(Int4 s) const { return add_saturating_bytes(s, c); }

  Int4 c;
};

// max(s - c, 0)
template <>
struct Operation<ColourOp_e::subtract> {
  explicit Operation(std::uint32_t colour) : c(splat(colour)) {}
  VELMARK5_LANE Int4 operator()(Int4 s) const { return subtract_saturating_bytes(s, c); }

  Int4 c;
};

// --- Blends ---------------------------------------------------------------------------------------------------------

// terms(s) is what the image alone decides; the blend of that with d gives the pixel.
template <BlendMode_e>
struct Blending;

// s
template <>
struct Blending<BlendMode_e::replace> {
  static constexpr bool reads_target = false;
  template <class Source>
  VELMARK5_LANE static Int4 terms(Source s) {
    return packed(s);
  }
  VELMARK5_LANE Int4 operator()(Int4 s, Int4) const { return s; }
};

// ((a * s) >> 8) + (((256 - a) * d) >> 8), where a is the alpha of s: the sum never leaves a byte. Primitives write a
// itself as the target's alpha; here the alpha channel is blended like the others.
template <>
struct Blending<BlendMode_e::alpha> {
  static constexpr bool reads_target = true;
  // The first product, and 256 - a in both words of each pixel.
  struct Terms {
    Planes product;
    Word8 rest;
  };
  template <class Source>
  VELMARK5_LANE static Terms terms(Source s) {
    const Word8 a = alphas(s);
    return {mulhi(planes_shifted(s), a), splat_word(256) - a};
  }
  VELMARK5_LANE Int4 operator()(Terms s, Int4 d) const { return packed(s.product + mulhi(planes_shifted(d), s.rest)); }
};

// Where every alpha is 0 or 255 that blend is d or max(s - 1, 0).
VELMARK5_LANE bool only_clear_or_full(Int4 s, Int4 t) {
  const Int4 one = splat(0x01000000u);
  return lane_bits(equal(((s + one) | (t + one)) & splat(0xFE000000u), splat(0u))) == 15;
}
VELMARK5_LANE Int4 full_blended(Int4 s) { return subtract_saturating_bytes(s, splat(0x01010101u)); }

// min(d + s, 255)
template <>
struct Blending<BlendMode_e::additive> {
  static constexpr bool reads_target = true;
  template <class Source>
  VELMARK5_LANE static Int4 terms(Source s) {
    return packed(s);
  }
  VELMARK5_LANE Int4 operator()(Int4 s, Int4 d) const { return add_saturating_bytes(d, s); }
};

// --- Where pixels come from -----------------------------------------------------------------------------------------
//
// source(i) gives the four pixels from i on, source.one(i) pixel i in lane 0. Runs ask in order, once for each pixel.

// Pixels one after the other.
struct Row {
  const std::uint32_t* from;
  VELMARK5_LANE Int4 operator()(int i) const { return load_unaligned(from + i); }
  VELMARK5_LANE Int4 one(int i) const { return load_one(from + i); }
};

VELMARK5_LANE Int4 gathered(Int4 a, Int4 b, Int4 c, Int4 d) {
  return {_mm_unpacklo_epi64(_mm_unpacklo_epi32(a.v, b.v), _mm_unpacklo_epi32(c.v, d.v))};
}

// The pixels along a line through the image: u and v in 20.12 fixed point, inside the image at every pixel that is
// asked for.
struct Line {
  const std::uint32_t* from;
  std::uint32_t width;
  std::uint32_t u, v, du, dv;

  VELMARK5_LANE Int4 operator()(int i) {
    const Int4 a = one(i);
    const Int4 b = one(i);
    const Int4 c = one(i);
    return gathered(a, b, c, one(i));
  }
  VELMARK5_LANE Int4 one(int) {
    const Int4 pixel = load_one(from + ((v >> 12) * width + (u >> 12)));
    u += du;
    v += dv;
    return pixel;
  }
};

// A source behind a colour operation.
template <ColourOp_e Op, class Source>
struct Operated {
  Operation<Op> operation;
  Source source;
  VELMARK5_LANE auto operator()(int i) { return operation(source(i)); }
  VELMARK5_LANE auto one(int i) { return operation(source.one(i)); }
};
template <ColourOp_e Op, class Source>
Operated(Operation<Op>, Source) -> Operated<Op, Source>;

// --- Runs -----------------------------------------------------------------------------------------------------------

// Has the first pixels of a later row brought to the cache. Rows of a target are pages apart, where the processor does
// not look ahead by itself.
VELMARK5_LANE void fetch_ahead(const std::uint32_t* row, int n) {
  const std::uint32_t* const end = row + std::min(n, 256);
  for (; row < end; row += 16) _mm_prefetch(reinterpret_cast<const char*>(row), _MM_HINT_T0);
}

// Draws n pixels to `to`, and the same to the rows after it.
template <BlendMode_e Blend, int Rows = 1, class Source>
VELMARK5_LANE void draw_run(std::uint32_t* to, int n, Source&& source, std::ptrdiff_t pitch = 0) {
  constexpr Blending<Blend> blend;
  int i = 0;
  if constexpr (!blend.reads_target) {
    for (; i + 16 <= n; i += 16) {
      const Int4 a = blend.terms(source(i)), b = blend.terms(source(i + 4));
      const Int4 c = blend.terms(source(i + 8)), d = blend.terms(source(i + 12));
      for (int r = 0; r < Rows; ++r) {
        std::uint32_t* const row = to + r * pitch + i;
        store_unaligned(row, a);
        store_unaligned(row + 4, b);
        store_unaligned(row + 8, c);
        store_unaligned(row + 12, d);
      }
    }
  }
#pragma GCC unroll 2
  for (; i + 4 <= n; i += 4) {
    const auto s = blend.terms(source(i));
    Int4 d[Rows];
    for (int r = 0; r < Rows; ++r) d[r] = blend.reads_target ? load_unaligned(to + r * pitch + i) : Int4{};
    for (int r = 0; r < Rows; ++r) store_unaligned(to + r * pitch + i, blend(s, d[r]));
  }
  for (; i < n; ++i) {
    const auto s = blend.terms(source.one(i));
    for (int r = 0; r < Rows; ++r) {
      const Int4 d = blend.reads_target ? load_one(to + r * pitch + i) : Int4{};
      store_one(to + r * pitch + i, blend(s, d));
    }
  }
}

// The same for images that are drawn as they stand: icons have many pixels that are either clear or full.
template <BlendMode_e Blend, class Source>
VELMARK5_LANE void draw_image_run(std::uint32_t* to, int n, Source&& source) {
  if constexpr (Blend == BlendMode_e::alpha && std::is_same_v<decltype(source(0)), Int4>) {
    constexpr Blending<Blend> blend;
    int i = 0;
    for (; i + 8 <= n; i += 8) {
      const Int4 s = source(i);
      const Int4 t = source(i + 4);
      if (only_clear_or_full(s, t)) {
        const int full = lane_bits(s) + lane_bits(t);
        if (full == 0) continue;
        if (full == 30) {
          store_unaligned(to + i, full_blended(s));
          store_unaligned(to + i + 4, full_blended(t));
        } else {
          store_unaligned(to + i, select(sign_mask(s), full_blended(s), load_unaligned(to + i)));
          store_unaligned(to + i + 4, select(sign_mask(t), full_blended(t), load_unaligned(to + i + 4)));
        }
        continue;
      }
      const Int4 d = load_unaligned(to + i);
      const Int4 e = load_unaligned(to + i + 4);
      store_unaligned(to + i, blend(blend.terms(s), d));
      store_unaligned(to + i + 4, blend(blend.terms(t), e));
    }
    for (; i + 4 <= n; i += 4) store_unaligned(to + i, blend(blend.terms(source(i)), load_unaligned(to + i)));
    for (; i < n; ++i) store_one(to + i, blend(blend.terms(source.one(i)), load_one(to + i)));
  } else {
    draw_run<Blend>(to, n, source);
  }
}

// Draws where z <= depth.
template <BlendMode_e Blend, class Source>
VELMARK5_LANE void draw_run_tested(std::uint32_t* to, const float* depth, Float4 z, int n, Source&& source) {
  constexpr Blending<Blend> blend;
  int i = 0;
  for (; i + 4 <= n; i += 4) {
    const Int4 passes = less_equal(z, load_unaligned(depth + i));
    if (lane_bits(passes) == 0) continue;
    const Int4 d = load_unaligned(to + i);
    store_unaligned(to + i, select(passes, blend(blend.terms(source(i)), d), d));
  }
  for (; i < n; ++i) {
    const Int4 passes = less_equal(z, load_one(depth + i));
    const Int4 d = load_one(to + i);
    store_one(to + i, select(passes, blend(blend.terms(source.one(i)), d), d));
  }
}

}  // namespace sprite_pixels
