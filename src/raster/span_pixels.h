// What happens to a pixel of a triangle, for four pixels at once: fetching texels and light, blending with the target.
// Channels are unsigned 16-bit lanes; a vertex colour holds channel * 256, a texel or a target pixel holds the byte.
#pragma once

#include <cstddef>
#include <cstdint>

#include "maths/SSEMath.h"
#include "raster/Triangle.h"

namespace Rasterizer_n {

// The modes of a span, as the template argument of all that fills it.
struct SpanModes {
  ShadeMode_e shade;
  TexAddressMode_e address_u, address_v;
  bool transform, fog;
  BlendMode_e blend;
  bool colour_key, light_map, depth_write, colour_write, depth_test;

  constexpr bool textured() const { return shade == ShadeMode_e::Textured || shade == ShadeMode_e::Blended; }
  constexpr bool blended() const { return shade == ShadeMode_e::Blended; }
  // Fog is added to texels; a smooth colour has it inside.
  constexpr bool adds_fog() const { return fog && textured(); }
  constexpr bool runs_colour() const { return colour_write && (shade == ShadeMode_e::Smooth || textured()); }
  constexpr bool runs_depth() const { return depth_test || textured(); }
};

// --- Texels ---------------------------------------------------------------------------------------------------------

// The column or row of a texture coordinate, 0 to 127.
template <TexAddressMode_e Mode>
VELMARK5_LANE SSEMath::Int4 texel_address(SSEMath::Float4 coordinate) {
  using namespace SSEMath;
  if constexpr (Mode == TexAddressMode_e::Clamp) {
    return truncate(min(max(coordinate, splat(0.0f)), splat(127.0f)));
  } else {
    return truncate(coordinate) & splat(127u);
  }
}

// Four texels in two registers: those of pixels 0 and 1, and of 2 and 3, each in the low half.
struct Texels {
  SSEMath::Int4 low, high;

  VELMARK5_LANE SSEMath::Channels channels() const { return {SSEMath::widen_low(low), SSEMath::widen_low(high)}; }
  // A mask of the pixels whose texel is the key, 0.
  VELMARK5_LANE SSEMath::Int4 is_key() const {
    return SSEMath::equal(SSEMath::join_low(low, high), SSEMath::splat(0u));
  }
};

template <SpanModes Modes>
VELMARK5_LANE Texels fetch(const std::uint32_t* texture, SSEMath::Float4 u, SSEMath::Float4 v) {
  using namespace SSEMath;
  const Int4 index = texel_address<Modes.address_u>(u) | shift_left<8>(texel_address<Modes.address_v>(v));
  const Index4 i = indices(index);
  return {interleave_low(load_one(texture + i.a), load_one(texture + i.b)),
          interleave_low(load_one(texture + i.c), load_one(texture + i.d))};
}

// The light of four pixels, light * 256 in all channels, from a map of bytes at texture coordinates u and v shifted
// right. Each half of a coordinate's integer is shifted by itself, so that a negative coordinate ends at column or row
// 255, unless the shift is 0. Rows from 128 upward lie before the map's first byte.
VELMARK5_LANE SSEMath::Channels fetch_light(const std::uint8_t* map, int shift, SSEMath::Float4 u, SSEMath::Float4 v) {
  using namespace SSEMath;
  const Word8 columns_rows =
      signed_words(Int4{shift_right(Word8{truncate(u).v}, shift).v}, Int4{shift_right(Word8{truncate(v).v}, shift).v});
  const Word8 index = byte_pairs(columns_rows);
  const auto light = [&](std::int16_t i) { return static_cast<std::uint32_t>(map[i]); };
  const auto pair = [&](std::int16_t a, std::int16_t b) { return spread_pair(light(a) | light(b) << 16); };
  return {shift_left<8>(pair(word<0>(index), word<1>(index))), shift_left<8>(pair(word<2>(index), word<3>(index)))};
}

// --- Blending with the target ---------------------------------------------------------------------------------------

// (s * a + d * (256 - a)) >> 8, with a the alpha of s in all channels; products and sum wrap in 16 bits.
VELMARK5_LANE SSEMath::Int4 blend_pixel_alpha(SSEMath::Channels s, SSEMath::Channels a, SSEMath::Int4 target) {
  using namespace SSEMath;
  return narrow(shift_right<8>(s * a + widen(target) * (both(splat_word(256)) - a)));
}

// s * a + d * (256 - a), in 1/256, each product truncated by itself. alpha is a * 0x10001.
VELMARK5_LANE SSEMath::Int4 blend_constant_alpha(SSEMath::Channels s, SSEMath::Int4 target, std::uint32_t alpha) {
  using namespace SSEMath;
  const Channels a = both(shift_left<8>(Word8{splat(alpha).v}));
  const Channels rest = both(Word8{splat(0x1000100u - alpha).v});
  return narrow(mulhi(s, a) + mulhi(widen_shifted(target), rest));
}

// The same for a smooth colour, which is s * 256 already.
VELMARK5_LANE SSEMath::Int4 blend_constant_alpha_smooth(SSEMath::Channels colour, SSEMath::Int4 target,
                                                        std::uint32_t alpha) {
  using namespace SSEMath;
  const Channels a = both(Word8{splat(alpha).v});
  const Channels rest = both(Word8{splat(0x1000100u - alpha).v});
  return narrow(mulhi(colour, a) + mulhi(widen_shifted(target), rest));
}

}  // namespace Rasterizer_n
