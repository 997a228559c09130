// The light that falls on a corner, per frame: sun and point lights. The draw loop uses these forms, which read the
// scene once; model::light_getsunlitrgb and model::light_getpointlitrgb are the same by name.
#pragma once

#include <algorithm>
#include <cstdint>

#include "maths/SSEMath.h"
#include "maths/Vector4.h"
#include "toolkit/toolkit.h"

namespace lighting {

// ambient + d * (front or back) * contrastfactor, where d is the cosine between sun and normal, out of 256. The sum in
// a normal's w is divided out here, so summed normals need no normalising.
VELMARK5_LANE int sun_intensity(const toolkit& t, const Vector4_s& normal, float contrastfactor) {
  const float d = (t.sun_x * normal.x + t.sun_y * normal.y + t.sun_z * normal.z) / normal.w;
  const float light = t.ambient + d * (d > 0 ? t.sun_front : t.sun_back) * contrastfactor;
  return _mm_cvttss_si32(_mm_set_ss(light * 256.0f));
}

// Channels stay within 4 to 252: the range in which later blending cannot overflow.
VELMARK5_LANE unsigned int sunlit(const toolkit& t, unsigned int rgb, unsigned int alpha, int intensity) {
  const auto channel = [intensity](unsigned int byte, unsigned int sun) {
    const auto product = static_cast<int>((byte * sun >> 8) * static_cast<unsigned int>(intensity));
    return static_cast<unsigned int>(std::clamp(product >> 8, 4, 252));
  };
  return alpha << 24 | channel(rgb >> 16 & 0xFF, t.sun_r) << 16 | channel(rgb >> 8 & 0xFF, t.sun_g) << 8 |
         channel(rgb & 0xFF, t.sun_b);
}

// Adds the point lights, whose model-space positions are given: each by the cosine over the squared distance. All four
// bytes are lit alike.
VELMARK5_LANE unsigned int pointlit(const toolkit& t, const Vector4_s* lightpos, unsigned int rgb,
                                    const Vector4_s& position, const Vector4_s& normal) {
  using namespace SSEMath;
  const auto bytes = [](unsigned int word) {
    const __m128i zero = _mm_setzero_si128();
    const __m128i words = _mm_unpacklo_epi8(_mm_cvtsi32_si128(static_cast<int>(word)), zero);
    return Float4{_mm_cvtepi32_ps(_mm_unpacklo_epi16(words, zero))};
  };
  const Float4 own = bytes(rgb);
  const Float4 reflected = splat(1.5259022e-5f) * own;
  Float4 sum = own;
  for (int i = 0; i < t.pointlight_count; ++i) {
    const float dx = lightpos[i].x - position.x;
    const float dy = lightpos[i].y - position.y;
    const float dz = lightpos[i].z - position.z;
    const Float4 squared = splat(dx * dx + dy * dy + dz * dz);
    const float facing = std::max(0.0f, dx * normal.x + dy * normal.y + dz * normal.z);
    const Float4 strength =
        splat(facing * t.pointlight_strength[i]) * reciprocal_estimate(squared) * reciprocal_root_estimate(squared);
    sum += bytes(t.pointlight_colour[i]) * reflected * strength;
  }
  const __m128i rounded = _mm_cvtps_epi32(sum.v);
  const __m128i words = _mm_packs_epi32(rounded, rounded);
  return static_cast<unsigned int>(_mm_cvtsi128_si32(_mm_packus_epi16(words, words)));
}

}  // namespace lighting
