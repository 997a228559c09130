// Fills the rows of a trapezoid. Each row is cut into groups of four pixels that are aligned in memory; the first and
// the last group are masked, so that a row is always whole groups. Per group: test the depth, compute four pixels,
// store.
//
// Depth and texture coordinates run in float, colours and weights in wrapping 16-bit integers. Texture coordinates run
// as u/z and v/z, linear on the screen, and are multiplied back by the pixel's depth: no division at a pixel.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

#include "maths/SSEMath.h"
#include "raster/Rasterizer.h"
#include "raster/Triangle.h"
#include "raster/span_pixels.h"

namespace Rasterizer_n {

// --- Tables ---------------------------------------------------------------------------------------------------------

inline constexpr std::uint32_t F = 0xFFFFFFFFu;  // a lane that is set

// Masks of the last group, by the pixels left (0: the span ends with the group), and of the first group, by the pixels
// of the group before the span.
alignas(16) inline constexpr std::uint32_t UnalignedMasks[2][4][4] = {
    {{F, F, F, F}, {F, 0, 0, 0}, {F, F, 0, 0}, {F, F, F, 0}},
    {{F, F, F, F}, {0, F, F, F}, {0, 0, F, F}, {0, 0, 0, F}},
};

// Masks of a first group that the span also ends in, by the pixels cut at the right.
alignas(16) inline constexpr std::uint32_t RightClippingMasks[4][4] = {
    {F, F, F, F}, {F, F, F, 0}, {F, F, 0, 0}, {F, 0, 0, 0}};

alignas(16) inline constexpr float ZeroOneTwoThree[4] = {0, 1, 2, 3};

// By the pixels of the first group before the span: their number, whether there are any, and the distance of the
// group's first two pixels from the start of the span, in all channels.
alignas(16) inline constexpr float BackToGroup[4][4] = {{0, 0, 0, 0}, {1, 1, 1, 1}, {2, 2, 2, 2}, {3, 3, 3, 3}};
alignas(16) inline constexpr std::uint32_t IsBack[4][4] = {{0, 0, 0, 0}, {F, F, F, F}, {F, F, F, F}, {F, F, F, F}};
alignas(16) inline constexpr std::int16_t PairInGroup[4][8] = {{0, 0, 0, 0, 1, 1, 1, 1},
                                                               {-1, -1, -1, -1, 0, 0, 0, 0},
                                                               {-2, -2, -2, -2, -1, -1, -1, -1},
                                                               {-3, -3, -3, -3, -2, -2, -2, -2}};

// --- Running values -------------------------------------------------------------------------------------------------

// A depth or a coordinate, a lane for each pixel of the group.
struct RunningFloat {
  SSEMath::Float4 value, step;  // the step is per pixel until many(), then per group

  VELMARK5_LANE void start(SSEMath::Float4 first, SSEMath::Float4 per_pixel) {
    value = first + per_pixel * SSEMath::load(ZeroOneTwoThree);
    step = per_pixel;
  }
  VELMARK5_LANE void many() { step = step * SSEMath::splat(4.0f); }
  VELMARK5_LANE void advance() { value += step; }
};

// Four channels, for the first two pixels of the group; the other two are one step on.
struct RunningWords {
  SSEMath::Word8 value, step, group_step;  // the steps are of two pixels, and of four, after many()

  // first: the value at the start of the span, per_pixel: the step, both in both halves.
  VELMARK5_LANE void start(SSEMath::Word8 first, SSEMath::Word8 per_pixel, unsigned int before) {
    value = first + per_pixel * SSEMath::load(PairInGroup[before]);
    step = per_pixel + per_pixel;
  }
  VELMARK5_LANE void many() { group_step = step + step; }
  VELMARK5_LANE void advance() { value = value + group_step; }
  VELMARK5_LANE SSEMath::Channels pixels() const { return {value, value + step}; }
};

// --- One row --------------------------------------------------------------------------------------------------------

// A row between its clipped ends, with the values of its first group.
struct HorizontalLine_s {
  std::uint32_t* colour_row;  // pixel 0 of the row in the targets
  float* depth_row;
  std::ptrdiff_t start, end;  // pixels; the end is exclusive
  unsigned int before;        // pixels of the first group before the start, 0 to 3
  RunningFloat z, u, v;       // depth, u/z, v/z
  RunningWords colour, fog, weight0, weight1;

  // Does the same to all values that run.
  template <SpanModes Modes>
  VELMARK5_LANE void each(auto&& action) {
    if constexpr (Modes.runs_depth()) action(z);
    if constexpr (Modes.textured()) {
      action(u);
      action(v);
    }
    if constexpr (Modes.runs_colour()) action(colour);
    if constexpr (Modes.adds_fog()) action(fog);
    if constexpr (Modes.blended()) {
      action(weight0);
      action(weight1);
    }
  }
};

// Fills the group of four at pixel x where the mask is set. Masked is false for a mask of all ones.
template <SpanModes Modes, bool Masked>
VELMARK5_LANE void fill_group(const HorizontalLine_s& line, const HalfTriangle_s& half, std::ptrdiff_t x,
                              SSEMath::Int4 mask) {
  using namespace SSEMath;

  if constexpr (Modes.depth_test) {
    const Int4 passes = less_equal(line.z.value, load(line.depth_row + x));
    mask = Masked ? mask & passes : passes;
    // A group that fails costs no more. Only the groups at the ends of plain spans go on with an empty mask: they are
    // cheaper than a branch that waits for the depth and that nobody can foresee.
    if constexpr (!Masked || Modes.textured()) {
      if (lane_bits(mask) == 0) return;
    }
  }

  // Four pixels, before they meet the target.
  std::uint32_t* const target = Modes.colour_write ? line.colour_row + x : nullptr;
  Int4 pixels{};
  Channels s{};
  if constexpr (Modes.shade == ShadeMode_e::Flat) {
    pixels = splat(half.flatcolour);
  } else if constexpr (Modes.shade == ShadeMode_e::Smooth && Modes.runs_colour()) {
    s = Modes.blend == BlendMode_e::ConstantAlpha ? line.colour.pixels() : shift_right<8>(line.colour.pixels());
  } else if constexpr (Modes.textured()) {
    const Float4 u = line.u.value * line.z.value;
    const Float4 v = line.v.value * line.z.value;
    const auto texels = [&](int k) {
      if constexpr (Modes.transform) {
        return fetch<Modes>(half.texture[k], u * splat(half.texscale[k].x) + splat(half.texoffset[k].x),
                            v * splat(half.texscale[k].y) + splat(half.texoffset[k].y));
      } else {
        return fetch<Modes>(half.texture[k], u, v);
      }
    };
    Channels colour = line.colour.pixels();
    if constexpr (Modes.light_map) colour = mulhi(colour, fetch_light(half.lightmap, half.lightmapshift, u, v));
    if constexpr (Modes.blended()) {
      const Channels i = line.weight0.pixels(), j = line.weight1.pixels(), k = ~i - j;
      const Channels sum = mulhi(texels(0).channels(), i) + mulhi(texels(1).channels(), j);
      s = mulhi(sum + mulhi(texels(2).channels(), k), colour);
    } else {
      const Texels t = texels(0);
      if constexpr (Modes.colour_key) mask = and_not(mask, t.is_key());
      s = mulhi(t.channels(), colour);
    }
    if constexpr (Modes.adds_fog()) s = add_saturating(s, shift_right<8>(line.fog.pixels()));
  }

  // Blending.
  if constexpr (Modes.colour_write && Modes.shade != ShadeMode_e::Flat) {
    if constexpr (Modes.blend == BlendMode_e::Opaque) {
      pixels = narrow(s);
    } else if constexpr (Modes.blend == BlendMode_e::PixelAlpha) {
      const Channels alpha = broadcast_alpha(s);
      mask = and_not(mask, zero_alpha(alpha));
      pixels = blend_pixel_alpha(s, alpha, load(target));
    } else if constexpr (Modes.shade == ShadeMode_e::Smooth) {
      pixels = blend_constant_alpha_smooth(s, load(target), half.alpha);
    } else {
      pixels = blend_constant_alpha(s, load(target), half.alpha);
    }
  }

  // Writing: a full group is stored as it stands, any other is merged with what is there.
  constexpr bool writes_depth = Modes.depth_write && Modes.depth_test;
  constexpr bool always_full =
      !Masked && !Modes.depth_test && !Modes.colour_key && Modes.blend != BlendMode_e::PixelAlpha;
  if (always_full || (!Masked && lane_bits(mask) == 15)) {
    if constexpr (Modes.colour_write) store(target, pixels);
    if constexpr (writes_depth) store(line.depth_row + x, line.z.value);
  } else {
    if constexpr (Modes.colour_write) store_masked(target, pixels, mask);
    if constexpr (writes_depth) store_masked(line.depth_row + x, line.z.value, mask);
  }
}

// Fills one row.
template <SpanModes Modes>
VELMARK5_LANE void RenderHLine(HorizontalLine_s& line, const HalfTriangle_s& half) {
  using namespace SSEMath;
  const auto advance = [&] { line.template each<Modes>([](auto& running) { running.advance(); }); };
  std::ptrdiff_t x = line.start - static_cast<std::ptrdiff_t>(line.before);
  const auto pixels = static_cast<std::size_t>(line.end - x);  // from the first group's start

  // Most spans of small triangles end in their first group.
  if (pixels <= 4) {
    fill_group<Modes, true>(line, half, x, load(UnalignedMasks[1][line.before]) & load(RightClippingMasks[4 - pixels]));
    return;
  }
  fill_group<Modes, true>(line, half, x, load(UnalignedMasks[1][line.before]));

  line.template each<Modes>([](auto& running) { running.many(); });
  advance();
  const std::ptrdiff_t last = x + static_cast<std::ptrdiff_t>((pixels - 1) & ~std::size_t{3});
  for (x += 4; x != last; x += 4) {
    fill_group<Modes, false>(line, half, x, splat(F));
    advance();
  }
  fill_group<Modes, true>(line, half, x, load(UnalignedMasks[0][pixels & 3]));
}

// --- The rows of a trapezoid ----------------------------------------------------------------------------------------

// The values at the left edge and the steps per pixel of what runs in words, from the words of both edges.
// skip: pixels that are clipped at the left. The first value uses the step before it is truncated.
VELMARK5_LANE void start_words(RunningWords& running, SSEMath::Word8 edges, SSEMath::Float4 reciprocal_width, int skip,
                               unsigned int before) {
  using namespace SSEMath;
  const Int4 left = integers_low(edges);
  const Float4 step = to_float(integers_high(edges) - left) * reciprocal_width;
  Word8 first = twice_low(edges);
  if (skip != 0) [[unlikely]] {
    const Float4 value = to_float(left) + step * splat(static_cast<float>(skip));
    first = unsigned_words(value, value);
  }
  running.start(first, signed_words(step, step), before);
}

template <ShadeMode_e Shade, TexAddressMode_e AddressU, TexAddressMode_e AddressV, bool TransformTexCoords, bool Fog,
          BlendMode_e Blend, bool ColourKey, bool LightMap, bool DepthWrite, bool ColourWrite, bool DepthTest>
void RenderHalfTriangle_c<Shade, AddressU, AddressV, TransformTexCoords, Fog, Blend, ColourKey, LightMap, DepthWrite,
                          ColourWrite, DepthTest>::RenderHalfTriangle(HalfTriangle_s& half) {
  using namespace SSEMath;
  constexpr SpanModes Modes = {Shade,     AddressU, AddressV,   TransformTexCoords, Fog,      Blend,
                               ColourKey, LightMap, DepthWrite, ColourWrite,        DepthTest};

  Float4 edge = load(half.edge);
  const Float4 edgestep = load(half.edgestep);
  const int rows = half.rows;
  const int first_row = half.y;
  half.y = first_row + rows;

  if constexpr (Modes.shade == ShadeMode_e::Mask) {
    // Ones into an array of bytes, not clipped.
    auto* row = reinterpret_cast<unsigned char*>(m_pColourBuffer) + std::ptrdiff_t{first_row} * m_ScreenPitch;
    for (int i = 0; i < rows; ++i, row += m_ScreenPitch) {
      const Int4 ends = truncate(edge);
      const int x0 = lane<0>(ends), x1 = lane<2>(ends);
      if (x0 < x1) std::memset(row + x0, 1, static_cast<std::size_t>(std::ptrdiff_t{x1} - x0));
      edge += edgestep;
    }
    store(half.edge, edge);
    return;
  }

  const int clip_left = m_ClipBox.left, clip_right = m_ClipBox.right;
  HorizontalLine_s line;
  const std::ptrdiff_t pitch = m_ScreenPitch, ahead = 2 * pitch;
  if constexpr (Modes.colour_write) line.colour_row = m_pColourBuffer + first_row * pitch;
  if constexpr (Modes.depth_test) line.depth_row = m_pDepthBuffer + first_row * pitch;

  Word8 colour{}, fog{};
  Float4 texcoord{}, weights{};
  if constexpr (Modes.runs_colour()) colour = load(half.colour);
  if constexpr (Modes.adds_fog()) fog = load(half.fogadd);
  if constexpr (Modes.textured()) texcoord = load(half.texcoord);
  if constexpr (Modes.blended()) weights = load(half.blendweight);

  for (int i = 0; i < rows; ++i) {
    // Ends to the nearest pixel, clipped.
    const Int4 ends = round(edge);
    const int x0 = lane<0>(ends), x1 = lane<2>(ends);
    const int start = std::max(x0, clip_left);
    const int end = std::min(x1, clip_right);
    if (start < end) {
      const int skip = wrapping_subtract(start, x0);
      const Float4 reciprocal_width = broadcast<0>(reciprocal_estimate(to_float(shuffle<2, 2, 2, 2>(ends) - ends)));

      std::uintptr_t address;
      if constexpr (Modes.colour_write) {
        address = reinterpret_cast<std::uintptr_t>(line.colour_row + start);
        prefetch_outer(line.colour_row + start);
        prefetch_outer(line.colour_row + ahead + start);
      } else {
        address = reinterpret_cast<std::uintptr_t>(line.depth_row + start);
      }
      if constexpr (Modes.depth_test) {
        prefetch_nearer(line.depth_row + start);
        prefetch_nearer(line.depth_row + ahead + start);
      }
      line.start = start;
      line.end = end;
      line.before = static_cast<unsigned int>(address / 4 % 4);

      if constexpr (Modes.depth_write || Modes.colour_write) {
        // Depth and texture coordinates side by side: x, z, u/z, v/z.
        if constexpr (Modes.runs_depth()) {
          const Float4 left = shuffle<0, 1, 0, 1>(edge, texcoord);
          const Float4 step = (shuffle<2, 3, 2, 3>(edge, texcoord) - left) * reciprocal_width;
          Float4 first = left;
          if (skip != 0) [[unlikely]] {
            // The depth in extended precision, the coordinates in float.
            const long double z =
                static_cast<long double>(lane0(broadcast<1>(step))) * skip + lane0(broadcast<1>(left));
            first = left + splat(static_cast<float>(skip)) * step;
            first = shuffle<0, 0, 2, 3>(splat(static_cast<float>(z)), first);
          }
          Float4 back = load(BackToGroup[line.before]) * step;
          // u/z at depth 0 is infinite, and 0 times that is not a number: nothing to go back is nothing.
          if constexpr (Modes.textured()) back = back & load(IsBack[line.before]);
          first = first - back;
          line.z.start(broadcast<1>(first), broadcast<1>(step));
          if constexpr (Modes.textured()) {
            line.u.start(broadcast<2>(first), broadcast<2>(step));
            line.v.start(broadcast<3>(first), broadcast<3>(step));
          }
        }
        if constexpr (Modes.runs_colour()) start_words(line.colour, colour, reciprocal_width, skip, line.before);
        if constexpr (Modes.adds_fog()) start_words(line.fog, fog, reciprocal_width, skip, line.before);
        if constexpr (Modes.blended()) {
          const Float4 step = (shuffle<2, 3, 2, 3>(weights) - weights) * reciprocal_width;
          const Float4 value = weights + step * splat(static_cast<float>(skip));
          const Word8 first = unsigned_words(value, value), per_pixel = signed_words(step, step);
          line.weight0.start(broadcast_word<0>(first), broadcast_word<0>(per_pixel), line.before);
          line.weight1.start(broadcast_word<1>(first), broadcast_word<1>(per_pixel), line.before);
        }
        RenderHLine<Modes>(line, half);
      }
    }

    // On to the next row.
    edge += edgestep;
    if constexpr (Modes.colour_write) line.colour_row += pitch;
    if constexpr (Modes.depth_test) line.depth_row += pitch;
    if constexpr (Modes.runs_colour()) colour = colour + load(half.colourstep);
    if constexpr (Modes.adds_fog()) fog = fog + load(half.fogaddstep);
    if constexpr (Modes.textured()) texcoord += load(half.texcoordstep);
    if constexpr (Modes.blended()) weights += load(half.blendweightstep);
  }

  store(half.edge, edge);
  if constexpr (Modes.runs_colour()) store(half.colour, colour);
  if constexpr (Modes.adds_fog()) store(half.fogadd, fog);
  if constexpr (Modes.textured()) store(half.texcoord, texcoord);
  if constexpr (Modes.blended()) store(half.blendweight, weights);
}

}  // namespace Rasterizer_n
