// Turns a triangle into two trapezoids, above and below its middle vertex, and has their rows filled.
//
// Rows start at the truncated y of the vertices with exactly their values: there is no correction for the fraction. A
// step per row is a difference times an approximate reciprocal, and an edge without rows has a huge step whose sign
// still tells the side, so that flat tops and bottoms take no branch.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "maths/SSEMath.h"
#include "raster/Rasterizer.h"
#include "raster/RenderHalfTriangle.h"
#include "raster/Triangle.h"

namespace Rasterizer_n {

// The three edges of a triangle are named by their ends: tm top to middle, tb top to bottom (the long one), mb middle
// to bottom.

// The vertices from top to bottom, by the comparisons y1 > y0 (1), y2 > y0 (2), y2 > y1 (4).
inline constexpr std::uint8_t SortedVertices[8][3] = {{2, 1, 0}, {2, 0, 1}, {1, 0, 2}, {0, 2, 1},
                                                      {1, 2, 0}, {0, 1, 2}, {1, 0, 2}, {0, 1, 2}};

// What each row adds along the edges, of a value that runs in float.
struct FloatSteps {
  SSEMath::Float4 tm, tb, mb;
};

VELMARK5_LANE FloatSteps float_steps(SSEMath::Float4 top, SSEMath::Float4 middle, SSEMath::Float4 bottom,
                                     SSEMath::Float4 reciprocals) {
  using SSEMath::broadcast;
  return {(middle - top) * broadcast<0>(reciprocals), (bottom - top) * broadcast<1>(reciprocals),
          (bottom - middle) * broadcast<2>(reciprocals)};
}

// Four channels at the top and the middle vertex, and what each row adds along the edges.
struct WordEdges {
  SSEMath::Word8 top_middle;  // top in the low half, middle in the high half
  SSEMath::Word8 tm_tb;
  SSEMath::Word8 mb;  // in both halves
};

VELMARK5_LANE WordEdges word_edges(SSEMath::Word8 top_middle, const FloatSteps& steps) {
  using SSEMath::signed_words;
  return {top_middle, signed_words(steps.tm, steps.tb), signed_words(steps.mb, steps.mb)};
}

// The weights of textures 0 and 1 at each vertex; texture 2 has what they leave of 65535.
alignas(16) inline constexpr float VertexWeights[3][4] = {{65535, 0, 0, 0}, {0, 65535, 0, 0}, {0, 0, 0, 0}};

// Whether the left and the right x of an edge record are the same.
VELMARK5_LANE bool edges_meet(SSEMath::Float4 edge) {
  return (SSEMath::lane_bits(SSEMath::equal(edge, SSEMath::shuffle<2, 3, 0, 1>(edge))) & 1) != 0;
}

// Brings the first rows below a pixel of a target into the cache, while the setup goes on. The pixel may lie anywhere:
// addresses are integers here, and wrap.
VELMARK5_LANE void prefetch_rows(const void* target, int x, int y) {
  const auto wrapping = [](int n) { return static_cast<std::uintptr_t>(std::intptr_t{n}); };
  const std::uintptr_t row_bytes = wrapping(m_ScreenPitch) * 4;
  auto address = reinterpret_cast<std::uintptr_t>(target) + wrapping(y) * row_bytes + wrapping(x) * 4;
  for (int i = 0; i < 4; ++i, address += row_bytes) {
    SSEMath::prefetch_nearest(reinterpret_cast<const void*>(address));
  }
}

template <ShadeMode_e Shade, TexAddressMode_e AddressU, TexAddressMode_e AddressV, bool TransformTexCoords,
          FogMode_e Fog, BlendMode_e Blend, bool ColourKey, bool LightMap, bool DepthWrite, bool ColourWrite,
          bool DepthTest>
void RenderTriangle(const Triangle_s& triangle) {
  using namespace SSEMath;
  using Filler = RenderHalfTriangle_c<Shade, AddressU, AddressV, TransformTexCoords, Fog != FogMode_e::None, Blend,
                                      ColourKey, LightMap, DepthWrite, ColourWrite, DepthTest>;
  constexpr bool textured = Shade == ShadeMode_e::Textured || Shade == ShadeMode_e::Blended;
  constexpr bool coloured = (Shade == ShadeMode_e::Smooth || textured) && ColourWrite;
  constexpr bool height_fog = Fog == FogMode_e::Height || Fog == FogMode_e::Both;
  constexpr bool distance_fog = Fog == FogMode_e::Distance || Fog == FogMode_e::Both;

  // Sort the vertices by row.
  const Float4 v0 = load(&triangle.vertex[0].x), v1 = load(&triangle.vertex[1].x), v2 = load(&triangle.vertex[2].x);
  const Float4 y0011 = shuffle<1, 1, 1, 1>(v0, v1), y1122 = shuffle<1, 1, 1, 1>(v1, v2);
  const auto& sorted = SortedVertices[lane_bits(less(y0011, shuffle<0, 2, 2, 2>(y1122))) & 7];
  const std::size_t top = sorted[0], middle = sorted[1], bottom = sorted[2];
  const Float4 vertex_t = load(&triangle.vertex[top].x);
  const Float4 vertex_m = load(&triangle.vertex[middle].x);
  const Float4 vertex_b = load(&triangle.vertex[bottom].x);

  // Rows, and the reciprocals of the edges' heights: tm, tb, mb.
  const Int4 rows = truncate(shuffle<0, 2, 1, 1>(shuffle<1, 1, 1, 1>(vertex_t, vertex_m), vertex_b));
  const Int4 heights = shuffle<1, 2, 2, 2>(rows) - shuffle<0, 0, 1, 1>(rows);
  const Float4 reciprocals = reciprocal_estimate(max(to_float(heights), splat(1e-6f)));
  const int row_t = lane<0>(rows), row_m = lane<1>(rows), row_b = lane<2>(rows);

  // Clip the rows of both trapezoids. The upper one begins `skip` rows below the top vertex, the lower one `skip_lower`
  // rows below the middle vertex; whichever comes first begins at row `start`.
  const int clip_bottom = m_ClipBox.bottom;
  const int start = std::max(row_t, m_ClipBox.top);
  const int end = std::min(row_m, clip_bottom);
  const int skip = wrapping_subtract(start, row_t);
  const bool has_upper = start < end;
  const int missed = has_upper ? 0 : wrapping_subtract(end, start);
  const int start_lower = has_upper ? end : start;
  const int skip_lower = wrapping_subtract(0, missed);
  const int wanted_lower = wrapping_add(wrapping_subtract(row_b, row_m), missed);
  const int rows_lower = start_lower < clip_bottom ? std::min(clip_bottom - start_lower, wanted_lower) : 0;
  if (!has_upper && rows_lower <= 0) return;

  if constexpr (Shade != ShadeMode_e::Mask) {
    const int column = lane<0>(truncate(vertex_t));
    if constexpr (DepthTest) prefetch_rows(m_pDepthBuffer, column, start);
    if constexpr (ColourWrite) prefetch_rows(m_pColourBuffer, column, start);
  }

  HalfTriangle_s half;
  half.y = start;
  half.rows = wrapping_subtract(end, start);
  if constexpr (Shade == ShadeMode_e::Flat) half.flatcolour = triangle.flatcolour;
  if constexpr (Blend == BlendMode_e::ConstantAlpha) half.alpha = triangle.alpha;
  if constexpr (textured) half.texture[0] = triangle.texture[0];
  if constexpr (Shade == ShadeMode_e::Blended) {
    half.texture[1] = triangle.texture[1];
    half.texture[2] = triangle.texture[2];
  }
  if constexpr (LightMap) {
    half.lightmap = triangle.lightmap;
    half.lightmapshift = triangle.lightmapshift;
  }
  if constexpr (TransformTexCoords) {
    for (int k = 0; k < (Shade == ShadeMode_e::Blended ? 3 : 1); ++k) {
      half.texscale[k] = triangle.texscale[k];
      half.texoffset[k] = triangle.texoffset[k];
    }
  }

  // Positions, and with a texture u/z and v/z beside x and depth in one register.
  const Float4 depths = shuffle<0, 2, 2, 2>(shuffle<2, 2, 2, 2>(vertex_t, vertex_m), vertex_b);
  Float4 point_t = vertex_t, point_m = vertex_m, point_b = vertex_b;
  if constexpr (textured) {
    const Float4 r = reciprocal_estimate(depths);
    point_t = shuffle<0, 2, 0, 1>(vertex_t, load(&triangle.texcoord[top].x) * broadcast<0>(r));
    point_m = shuffle<0, 2, 0, 1>(vertex_m, load(&triangle.texcoord[middle].x) * broadcast<1>(r));
    point_b = shuffle<0, 2, 0, 1>(vertex_b, load(&triangle.texcoord[bottom].x) * broadcast<2>(r));
  }
  constexpr int depth_lane = textured ? 1 : 2;
  const FloatSteps steps = float_steps(point_t, point_m, point_b, reciprocals);

  // The upper trapezoid lies between tm and tb: which is left? The lower one replaces one edge by mb.
  const Int4 middle_is_right = broadcast_mask<0>(less(steps.tb, steps.tm));
  const Int4 replaced = broadcast_mask<0>(less(steps.mb, steps.tb)) ^ low_half_mask();
  const Float4 skip_rows = splat(static_cast<float>(skip)), skip_rows_lower = splat(static_cast<float>(skip_lower));

  // Each quantity starts at the top vertex at both edges. Its values for the lower trapezoid are kept: the replaced
  // edge starts at the middle vertex.
  const Float4 left = select(middle_is_right, steps.tb, steps.tm);
  const Float4 right = select(middle_is_right, steps.tm, steps.tb);
  const auto start_floats = [&](Float4 value, Float4 step, float* to, float* to_step) {
    store(to_step, step);
    store(to, value + skip_rows * step);
  };
  const auto replace_floats = [&](Float4 value, Float4 step, float* to, float* to_step) {
    store_masked(to, value + skip_rows_lower * step, replaced);
    store_masked(to_step, step, replaced);
  };
  start_floats(shuffle<0, depth_lane, 0, depth_lane>(point_t), shuffle<0, depth_lane, 0, depth_lane>(left, right),
               half.edge, half.edgestep);
  if constexpr (textured) {
    start_floats(shuffle<2, 3, 2, 3>(point_t), shuffle<2, 3, 2, 3>(left, right), half.texcoord, half.texcoordstep);
  }

  FloatSteps weight_steps;
  Float4 weight_m;
  if constexpr (Shade == ShadeMode_e::Blended) {
    const Float4 weight_t = load(VertexWeights[top]);
    weight_m = load(VertexWeights[middle]);
    weight_steps = float_steps(weight_t, weight_m, load(VertexWeights[bottom]), reciprocals);
    start_floats(shuffle<0, 1, 0, 1>(weight_t),
                 shuffle<0, 1, 0, 1>(select(middle_is_right, weight_steps.tb, weight_steps.tm),
                                     select(middle_is_right, weight_steps.tm, weight_steps.tb)),
                 half.blendweight, half.blendweightstep);
  }

  const auto start_words = [&](const WordEdges& edges, std::uint16_t* to, std::int16_t* to_step) {
    const Word8 step = select(middle_is_right, swap_halves(edges.tm_tb), edges.tm_tb);
    store(to_step, step);
    store(to, twice_low(edges.top_middle) + splat_word(static_cast<std::uint16_t>(skip)) * step);
  };
  const auto replace_words = [&](const WordEdges& edges, std::uint16_t* to, std::int16_t* to_step) {
    const Word8 value = twice_high(edges.top_middle) + splat_word(static_cast<std::uint16_t>(skip_lower)) * edges.mb;
    store(to, select(replaced, value, load(to)));
    store(to_step, select(replaced, edges.mb, load(to_step)));
  };

  // Colours. Fog takes from the colour and adds its own; both stay apart where a texture multiplies the colour alone.
  WordEdges colour, fogadd;
  if constexpr (coloured) {
    const Word8 words_t = load_half(triangle.colour[top].channels),
                words_m = load_half(triangle.colour[middle].channels),
                words_b = load_half(triangle.colour[bottom].channels);
    Float4 colour_t = to_float(integers_low(words_t)), colour_m = to_float(integers_low(words_m)),
           colour_b = to_float(integers_low(words_b));
    if constexpr (Fog == FogMode_e::None) {
      colour = word_edges(join_low(words_t, words_m), float_steps(colour_t, colour_m, colour_b, reciprocals));
    } else {
      const Float4 one = splat(1.0f);
      Float4 add_t{}, add_m{}, add_b{};
      if constexpr (height_fog) {
        const float* const factor = &triangle.fogfactor.x;
        const Float4 h_t = splat(factor[top]), h_m = splat(factor[middle]), h_b = splat(factor[bottom]);
        colour_t = colour_t * (one - h_t);
        colour_m = colour_m * (one - h_m);
        colour_b = colour_b * (one - h_b);
        const Float4 fog = load(&triangle.fogcolour.x);
        add_t = fog * h_t;
        add_m = fog * h_m;
        add_b = fog * h_b;
      }
      if constexpr (distance_fog) {
        // Not a number, as from 0 times infinity, counts as no fog.
        const Float4 d =
            min(max((depths - splat(m_DistanceFogStart)) * splat(m_InvDistanceFogRange), splat(0.0f)), one);
        const Float4 fog = load(&m_DistanceFogColour.x);
        const Float4 d_t = broadcast<0>(d), d_m = broadcast<1>(d), d_b = broadcast<2>(d);
        colour_t = colour_t * (one - d_t);
        colour_m = colour_m * (one - d_m);
        colour_b = colour_b * (one - d_b);
        add_t = add_t * (one - d_t) + fog * d_t;
        add_m = add_m * (one - d_m) + fog * d_m;
        add_b = add_b * (one - d_b) + fog * d_b;
      }
      if constexpr (textured) {
        fogadd = word_edges(unsigned_words(add_t, add_m), float_steps(add_t, add_m, add_b, reciprocals));
        start_words(fogadd, half.fogadd, half.fogaddstep);
      } else {
        colour_t = colour_t + add_t;
        colour_m = colour_m + add_m;
        colour_b = colour_b + add_b;
      }
      colour = word_edges(unsigned_words(colour_t, colour_m), float_steps(colour_t, colour_m, colour_b, reciprocals));
    }
    start_words(colour, half.colour, half.colourstep);
  }

  if (has_upper) {
    // The row of the top vertex itself has no pixels: on to the next.
    if (edges_meet(load(half.edge))) {
      half.y += 1;
      half.rows -= 1;
      store(half.edge, load(half.edge) + load(half.edgestep));
      if constexpr (coloured) store(half.colour, load(half.colour) + load(half.colourstep));
      if constexpr (coloured && textured && Fog != FogMode_e::None) {
        store(half.fogadd, load(half.fogadd) + load(half.fogaddstep));
      }
      if constexpr (textured) store(half.texcoord, load(half.texcoord) + load(half.texcoordstep));
      if constexpr (Shade == ShadeMode_e::Blended) {
        store(half.blendweight, load(half.blendweight) + load(half.blendweightstep));
      }
    }
    if (half.rows > 0) Filler::RenderHalfTriangle(half);
  }
  if (rows_lower <= 0) return;

  // The carried edge goes on with its running values.
  half.rows = rows_lower;
  replace_floats(shuffle<0, depth_lane, 0, depth_lane>(point_m), shuffle<0, depth_lane, 0, depth_lane>(steps.mb),
                 half.edge, half.edgestep);
  if constexpr (textured) {
    replace_floats(shuffle<2, 3, 2, 3>(point_m), shuffle<2, 3, 2, 3>(steps.mb), half.texcoord, half.texcoordstep);
  }
  if constexpr (Shade == ShadeMode_e::Blended) {
    replace_floats(shuffle<0, 1, 0, 1>(weight_m), shuffle<0, 1, 0, 1>(weight_steps.mb), half.blendweight,
                   half.blendweightstep);
  }
  if constexpr (coloured) replace_words(colour, half.colour, half.colourstep);
  if constexpr (coloured && textured && Fog != FogMode_e::None) replace_words(fogadd, half.fogadd, half.fogaddstep);
  Filler::RenderHalfTriangle(half);
}

}  // namespace Rasterizer_n

// Instantiates the combinations of a list from triangle_instances.h.
#define VELMARK5_INSTANTIATE_TRIANGLE(...) \
  template void Rasterizer_n::RenderTriangle<VELMARK5_TRIANGLE_MODES(__VA_ARGS__)>(const Rasterizer_n::Triangle_s&);
