// The arithmetic of sprites: colour operations, blends, and the runs of pixels that apply them. All of it works on
// registers of four pixels; the pixels that are left over at the end of a run go through the same code in lane 0.
//
// s is the image's pixel, d the target's, c the operand colour; formulas hold for each of the four channels, alpha
// included, and every product is truncated by itself.
#pragma once

#include <cstddef>
#include <cstdint>

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

template <BlendMode_e>
struct Blending;

// s
template <>
struct Blending<BlendMode_e::replace> {
  static constexpr bool reads_target = false;
  template <class Source>
  VELMARK5_LANE Int4 operator()(Source s, Int4) const {
    return packed(s);
  }
};

// ((a * s) >> 8) + (((256 - a) * d) >> 8), where a is the alpha of s: the sum never leaves a byte. Primitives write a
// itself as the target's alpha; here the alpha channel is blended like the others.
template <>
struct Blending<BlendMode_e::alpha> {
  static constexpr bool reads_target = true;
  template <class Source>
  VELMARK5_LANE Int4 operator()(Source s, Int4 d) const {
    const Word8 a = alphas(s);
    return packed(mulhi(planes_shifted(s), a) + mulhi(planes_shifted(d), splat_word(256) - a));
  }
};

// min(d + s, 255)
template <>
struct Blending<BlendMode_e::additive> {
  static constexpr bool reads_target = true;
  template <class Source>
  VELMARK5_LANE Int4 operator()(Source s, Int4 d) const {
    return add_saturating_bytes(d, packed(s));
  }
};

// --- Runs -----------------------------------------------------------------------------------------------------------

// Draws n pixels to `to`. source(i) gives the four pixels from i on, source.one(i) pixel i in lane 0; they are asked
// for in order and once each.
template <ColourOp_e Op, BlendMode_e Blend, class Source>
VELMARK5_LANE void draw_run(std::uint32_t* to, int n, const Operation<Op>& operation, Source source) {
  constexpr Blending<Blend> blend;
  int i = 0;
  for (; i + 4 <= n; i += 4) {
    const Int4 d = blend.reads_target ? load_unaligned(to + i) : Int4{};
    store_unaligned(to + i, blend(operation(source(i)), d));
  }
  for (; i < n; ++i) {
    const Int4 d = blend.reads_target ? load_one(to + i) : Int4{};
    store_one(to + i, blend(operation(source.one(i)), d));
  }
}

// The same where z <= depth.
template <ColourOp_e Op, BlendMode_e Blend, class Source>
VELMARK5_LANE void draw_run_tested(std::uint32_t* to, const float* depth, Float4 z, int n,
                                   const Operation<Op>& operation, Source source) {
  constexpr Blending<Blend> blend;
  int i = 0;
  for (; i + 4 <= n; i += 4) {
    const Int4 passes = less_equal(z, load_unaligned(depth + i));
    if (lane_bits(passes) == 0) continue;
    const Int4 d = load_unaligned(to + i);
    store_unaligned(to + i, select(passes, blend(operation(source(i)), d), d));
  }
  for (; i < n; ++i) {
    const Int4 passes = less_equal(z, load_one(depth + i));
    const Int4 d = load_one(to + i);
    store_one(to + i, select(passes, blend(operation(source.one(i)), d), d));
  }
}

// Pixels one after the other.
struct Row {
  const std::uint32_t* from;
  VELMARK5_LANE Int4 operator()(int i) const { return load_unaligned(from + i); }
  VELMARK5_LANE Int4 one(int i) const { return load_one(from + i); }
};

VELMARK5_LANE Int4 gathered(std::uint32_t a, std::uint32_t b, std::uint32_t c, std::uint32_t d) {
  return {_mm_setr_epi32(static_cast<int>(a), static_cast<int>(b), static_cast<int>(c), static_cast<int>(d))};
}

// The pixels at column[i].
struct Columns {
  const std::uint32_t* from;
  const int* column;
  VELMARK5_LANE Int4 operator()(int i) const {
    return gathered(from[column[i]], from[column[i + 1]], from[column[i + 2]], from[column[i + 3]]);
  }
  VELMARK5_LANE Int4 one(int i) const { return load_one(from + column[i]); }
};

// The pixels along a line through the image: u and v in 20.12 fixed point, inside the image at every pixel that is
// asked for.
struct Line {
  const std::uint32_t* from;
  std::uint32_t width;
  std::uint32_t u, v, du, dv;

  VELMARK5_LANE Int4 operator()(int) {
    const std::uint32_t a = next();
    const std::uint32_t b = next();
    const std::uint32_t c = next();
    return gathered(a, b, c, next());
  }
  VELMARK5_LANE Int4 one(int) { return splat(next()); }

  VELMARK5_LANE std::uint32_t next() {
    const std::uint32_t pixel = from[(v >> 12) * width + (u >> 12)];
    u += du;
    v += dv;
    return pixel;
  }
};

}  // namespace sprite_pixels
