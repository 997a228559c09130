// From model or world space to the screen, and the flags by which points and triangles are culled there.
#pragma once

#include "maths/Matrix.h"
#include "maths/SSEMath.h"
#include "raster/Rasterizer.h"

namespace Rasterizer_n {

// The point (x, y, z, 1) times the matrix, of which the lanes stand for x, y, z, w.
VELMARK5_LANE SSEMath::Float4 Transform(const Matrix_c& m, SSEMath::Float4 x, SSEMath::Float4 y, SSEMath::Float4 z) {
  using namespace SSEMath;
  return load(&m.rows[0].x) * x + load(&m.rows[1].x) * y + load(&m.rows[2].x) * z + load(&m.rows[3].x);
}
VELMARK5_LANE SSEMath::Float4 Transform(const Matrix_c& m, float x, float y, float z) {
  return Transform(m, SSEMath::splat(x), SSEMath::splat(y), SSEMath::splat(z));
}

// Screen x, screen y (pixels), screen depth, 1. A point with negative z keeps a negative depth, though w may be
// negative too.
VELMARK5_LANE SSEMath::Float4 ToScreen(SSEMath::Float4 clip) {
  using namespace SSEMath;
  const Float4 sign{_mm_and_ps(clip.v, _mm_load_ps(reinterpret_cast<const float*>(Matrix_c::ZSignMask)))};
  const Float4 divided{_mm_div_ps(clip.v, broadcast<3>(clip).v)};
  const Float4 projected{_mm_or_ps(divided.v, sign.v)};
  return projected * load(&m_ViewportMul.x) + load(&m_ViewportAdd.x);
}

// Screen x, screen y, 32767 depth, 32767 depth as 16-bit integers, saturated, twice. Truncated, or rounded to nearest.
template <bool Round>
VELMARK5_LANE SSEMath::Word8 PackForCulling(SSEMath::Float4 screen) {
  using namespace SSEMath;
  const Float4 scaled = shuffle<0, 1, 2, 2>(screen) * floats(1, 1, 32767, 32767);
  const __m128i integers = Round ? _mm_cvtps_epi32(scaled.v) : _mm_cvttps_epi32(scaled.v);
  return {_mm_packs_epi32(integers, integers)};
}

// A bit for each bound that the point lies beyond: right, bottom, far, near (past it, and so in front), then left, top,
// and twice a negative depth.
VELMARK5_LANE int CullFlags(SSEMath::Word8 packed) {
  const __m128i culler = _mm_load_si128(reinterpret_cast<const __m128i*>(m_TriangleCuller.lanes));
  const __m128i past = _mm_cmpgt_epi16(packed.v, culler);
  const __m128i before = _mm_cmpgt_epi16(_mm_setzero_si128(), packed.v);
  return _mm_movemask_epi8(_mm_packs_epi16(_mm_unpacklo_epi64(past, before), _mm_setzero_si128()));
}

// What the flags of a point, or those that all three corners of a triangle have, must be for it to be drawn.
inline constexpr int CullFlagsVisible = 1 << 3;

// True when the triangle shows its front. Ties show the back.
VELMARK5_LANE bool FacesViewer(const Vector4_s& p0, const Vector4_s& p1, const Vector4_s& p2) {
  return (p2.x - p0.x) * (p1.y - p0.y) > (p2.y - p0.y) * (p1.x - p0.x);
}

}  // namespace Rasterizer_n
