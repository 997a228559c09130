#include "model/model_culling.h"

#include <algorithm>
#include <cstring>

#include "raster/Occlusion.h"
#include "raster/Projection.h"

namespace culling {

namespace {

using namespace SSEMath;

constexpr int group = 4;
static_assert(threadresource::max_vertices % group == 0, "the last group is written whole");

// Four points by coordinate.
struct points {
  Float4 x, y, z;
};

// Points i to i + 3; past the end, the last point again.
VELMARK5_LANE points points_at(const Vector4_s* positions, int i, int count) {
  const Vector4_s* from = positions + i;
  Vector4_s last[group];
  if (count - i < group) {
    for (int k = 0; k < group; ++k) last[k] = positions[std::min(i + k, count - 1)];
    from = last;
  }
  const Float4 p0 = load(&from[0].x), p1 = load(&from[1].x), p2 = load(&from[2].x), p3 = load(&from[3].x);
  const Float4 xy01 = interleave_low(p0, p1), xy23 = interleave_low(p2, p3);
  return {low_pairs(xy01, xy23), high_pairs(xy01, xy23), low_pairs(interleave_high(p0, p1), interleave_high(p2, p3))};
}

// What a matrix makes of one coordinate: x * m0 + y * m1 + z * m2 + m3.
class column {
 public:
  column(float m0, float m1, float m2, float m3) : m0_(splat(m0)), m1_(splat(m1)), m2_(splat(m2)), m3_(splat(m3)) {}
  VELMARK5_LANE Float4 of(const points& p) const { return m0_ * p.x + m1_ * p.y + m2_ * p.z + m3_; }

 private:
  Float4 m0_, m1_, m2_, m3_;
};

VELMARK5_LANE Int4 past(Int4 words, Int4 bounds) { return {_mm_cmpgt_epi16(words.v, bounds.v)}; }
VELMARK5_LANE Int4 negative(Int4 words) { return {_mm_srai_epi16(words.v, 15)}; }
// Four words of p, four of q.
VELMARK5_LANE Int4 word_halves(int p, int q) {
  return {_mm_unpacklo_epi64(_mm_set1_epi16(static_cast<short>(p)), _mm_set1_epi16(static_cast<short>(q)))};
}

}  // namespace

flag_summary project(const Vector4_s* positions, int count, const Matrix_c& modelviewprojection, threadresource& out) {
  const Vector4_s(&m)[4] = modelviewprojection.rows;
  const column x_column(m[0].x, m[1].x, m[2].x, m[3].x), y_column(m[0].y, m[1].y, m[2].y, m[3].y);
  const column z_column(m[0].z, m[1].z, m[2].z, m[3].z), w_column(m[0].w, m[1].w, m[2].w, m[3].w);
  const Float4 mul = load(&Rasterizer_n::m_ViewportMul.x), add = load(&Rasterizer_n::m_ViewportAdd.x);
  const Float4 mul_x = broadcast<0>(mul), mul_y = broadcast<1>(mul), mul_z = broadcast<2>(mul);
  const Float4 add_x = broadcast<0>(add), add_y = broadcast<1>(add), add_z = broadcast<2>(add);
  const std::int16_t(&culler)[8] = Rasterizer_n::m_TriangleCuller.lanes;
  const Int4 right_bottom = word_halves(culler[0], culler[1]), far_near = word_halves(culler[2], culler[3]);
  // As Rasterizer_n::CullFlags numbers them.
  const Int4 right_bottom_bits = word_halves(1, 2), far_near_bits = word_halves(4, 8);
  const Int4 left_top_bits = word_halves(16, 32), negative_bits = word_halves(64, 128);

  Int4 any = splat(0u), all = splat(~0u);
  for (int i = 0; i < count; i += group) {
    // As Rasterizer_n::ToScreen does it for one: a depth that is negative stays so, whatever the sign of w.
    const points p = points_at(positions, i, count);
    const Float4 clip_z = z_column.of(p), w = w_column.of(p);
    const auto divided = [w](Float4 v) { return Float4{_mm_div_ps(v.v, w.v)}; };
    const Float4 sign{_mm_and_ps(clip_z.v, _mm_set1_ps(-0.0f))};
    const Float4 x = divided(x_column.of(p)) * mul_x + add_x;
    const Float4 y = divided(y_column.of(p)) * mul_y + add_y;
    const Float4 z = Float4{_mm_or_ps(divided(clip_z).v, sign.v)} * mul_z + add_z;

    const Float4 xy_low = interleave_low(x, y), xy_high = interleave_high(x, y);
    const Float4 zz_low = interleave_low(z, z), zz_high = interleave_high(z, z);
    store(&out.vertices[i].x, low_pairs(xy_low, zz_low));
    store(&out.vertices[i + 1].x, high_pairs(xy_low, zz_low));
    store(&out.vertices[i + 2].x, low_pairs(xy_high, zz_high));
    store(&out.vertices[i + 3].x, high_pairs(xy_high, zz_high));

    const Int4 xy = pixels(signed_words(x, y));
    const Float4 scaled = z * splat(32767.0f);
    const Int4 zz = pixels(signed_words(scaled, scaled));
    const Int4 halves = (past(xy, right_bottom) & right_bottom_bits) | (past(zz, far_near) & far_near_bits) |
                        (negative(xy) & left_top_bits) | (negative(zz) & negative_bits);
    const Int4 flags = halves | pixels(swap_halves(words(halves)));
    any = any | flags;
    all = all & flags;
    const int bytes = _mm_cvtsi128_si32(_mm_packus_epi16(flags.v, flags.v));
    std::memcpy(&out.vertex_flags[i], &bytes, sizeof bytes);
  }
  // Over the four words that a half holds.
  flag_summary summary{0, 255};
  std::uint16_t any_words[8], all_words[8];
  std::memcpy(any_words, &any, sizeof any_words);
  std::memcpy(all_words, &all, sizeof all_words);
  for (int k = 0; k < group; ++k) {
    summary.any |= any_words[k];
    summary.all &= all_words[k];
  }
  return summary;
}

void find_heights(const Vector4_s* positions, int count, const Matrix_c& world, threadresource& out) {
  const Vector4_s(&m)[4] = world.rows;
  const column y_column(m[0].y, m[1].y, m[2].y, m[3].y);
  const Int4 minus = splat(0x80000000u);
  for (int i = 0; i < count; i += group) {
    const Int4 y{_mm_castps_si128(y_column.of(points_at(positions, i, count)).v)};
    store_unaligned(&out.vertex_words[i], y ^ minus);
  }
}

namespace {

// The sides of a face on the screen, from its corner a.
struct sides {
  Float4 b, c;
};

VELMARK5_LANE sides sides_of(const corners& faces, int f, const threadresource& projected) {
  const Float4 a = load(&projected.vertices[faces.a[f]].x);
  return {load(&projected.vertices[faces.b[f]].x) - a, load(&projected.vertices[faces.c[f]].x) - a};
}

// Rasterizer_n::FacesViewer of faces f to f + 3, a bit for each.
VELMARK5_LANE std::uint32_t four_facing(const corners& faces, int f, const threadresource& projected) {
  const sides s0 = sides_of(faces, f, projected), s1 = sides_of(faces, f + 1, projected);
  const sides s2 = sides_of(faces, f + 2, projected), s3 = sides_of(faces, f + 3, projected);
  const Float4 b01 = interleave_low(s0.b, s1.b), b23 = interleave_low(s2.b, s3.b);
  const Float4 c01 = interleave_low(s0.c, s1.c), c23 = interleave_low(s2.c, s3.c);
  const Float4 bx = low_pairs(b01, b23), by = high_pairs(b01, b23);
  const Float4 cx = low_pairs(c01, c23), cy = high_pairs(c01, c23);
  return static_cast<std::uint32_t>(lane_bits(less(cy * bx, cx * by)));
}

VELMARK5_LANE std::uint32_t one_facing(const corners& faces, int f, const threadresource& projected) {
  const auto corner = [&](unsigned short v) -> const Vector4_s& { return projected.vertices[v]; };
  return Rasterizer_n::FacesViewer(corner(faces.a[f]), corner(faces.b[f]), corner(faces.c[f])) ? 1 : 0;
}

VELMARK5_LANE std::uint32_t one_within(const corners& faces, int f, const threadresource& projected) {
  const unsigned char* const flags = projected.vertex_flags;
  return (flags[faces.a[f]] & flags[faces.b[f]] & flags[faces.c[f]]) == Rasterizer_n::CullFlagsVisible ? 1 : 0;
}

bool within_view(flag_summary flags) {
  constexpr int wanted = Rasterizer_n::CullFlagsVisible;
  return flags.any == wanted && flags.all == wanted;
}

}  // namespace

void find_visible(const corners& faces, int count, const threadresource& projected, flag_summary flags,
                  face_set& visible) {
  const bool all_within = within_view(flags);
  for (int first = 0; first < count; first += face_set::word_bits) {
    const int here = std::min(face_set::word_bits, count - first);
    std::uint32_t bits = 0;
    int k = 0;
    for (; k + group <= here; k += group) bits |= four_facing(faces, first + k, projected) << k;
    for (; k < here; ++k) bits |= one_facing(faces, first + k, projected) << k;
    if (!all_within && bits != 0) {
      std::uint32_t within = 0;
      for (k = 0; k < here; ++k) within |= one_within(faces, first + k, projected) << k;
      bits &= within;
    }
    visible.word_of(first) = bits;
  }
}

bool is_covered(int count, const threadresource& projected, flag_summary flags) {
  if (!within_view(flags) || count == 0) return false;
  const Vector4_s* const vertices = projected.vertices;
  Float4 low = load(&vertices[0].x), high = low;
  for (int i = 1; i < count; ++i) {
    const Float4 v = load(&vertices[i].x);
    low = min(low, v), high = max(high, v);
  }
  return Rasterizer_n::IsCovered({low, high});
}

}  // namespace culling
