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

// sun_intensity of three normals at once; the last lane is that of the third again.
VELMARK5_LANE SSEMath::Int4 sun_intensities(const toolkit& t, const Vector4_s& n0, const Vector4_s& n1,
                                            const Vector4_s& n2, float contrastfactor) {
  using namespace SSEMath;
  const Float4 p = load(&n0.x), q = load(&n1.x), r = load(&n2.x);
  const Float4 xy_pq{_mm_unpacklo_ps(p.v, q.v)}, zw_pq{_mm_unpackhi_ps(p.v, q.v)};
  const Float4 x = shuffle<0, 1, 0, 0>(xy_pq, r), y = shuffle<2, 3, 1, 1>(xy_pq, r);
  const Float4 z = shuffle<0, 1, 2, 2>(zw_pq, r), w = shuffle<2, 3, 3, 3>(zw_pq, r);
  const Float4 d{_mm_div_ps((splat(t.sun_x) * x + splat(t.sun_y) * y + splat(t.sun_z) * z).v, w.v)};
  const Float4 side = select(less(splat(0.0f), d), splat(t.sun_front), splat(t.sun_back));
  return truncate((splat(t.ambient) + d * side * splat(contrastfactor)) * splat(256.0f));
}

// sunlit of the words of three corners with an intensity each, opaque.
VELMARK5_LANE SSEMath::Int4 sunlit_corners(const toolkit& t, SSEMath::Int4 rgb, SSEMath::Int4 intensity) {
  using namespace SSEMath;
  const Int4 narrowed{_mm_srai_epi32(_mm_slli_epi32(intensity.v, 16), 16)};
  if (lane_bits(equal(narrowed, intensity)) != 15) {
    // Too strong for products of 16-bit words.
    const auto alone = [&](std::int32_t word, std::int32_t strength) {
      return static_cast<int>(sunlit(t, static_cast<unsigned int>(word), 255, strength));
    };
    return {_mm_setr_epi32(alone(lane<0>(rgb), lane<0>(intensity)), alone(lane<1>(rgb), lane<1>(intensity)),
                           alone(lane<2>(rgb), lane<2>(intensity)), 0)};
  }
  const auto sun_word = static_cast<std::uint32_t>(t.sun_r) << 16 | static_cast<std::uint32_t>(t.sun_g) << 8 | t.sun_b;
  const Word8 sun = widen_low(splat(sun_word));
  const Word8 low = shift_right<8>(widen_low(rgb) * sun), high = shift_right<8>(widen_high(rgb) * sun);
  const auto product = [](__m128i channels, Int4 strength) {
    return _mm_srai_epi32(_mm_madd_epi16(channels, strength.v), 8);
  };
  const __m128i zero = _mm_setzero_si128();
  const __m128i c0 = product(_mm_unpacklo_epi16(low.v, zero), shuffle<0, 0, 0, 0>(intensity));
  const __m128i c1 = product(_mm_unpackhi_epi16(low.v, zero), shuffle<1, 1, 1, 1>(intensity));
  const __m128i c2 = product(_mm_unpacklo_epi16(high.v, zero), shuffle<2, 2, 2, 2>(intensity));
  const auto limited = [](__m128i p, __m128i q) {
    return Word8{_mm_max_epi16(_mm_min_epi16(_mm_packs_epi32(p, q), _mm_set1_epi16(252)), _mm_set1_epi16(4))};
  };
  return narrow(limited(c0, c1), limited(c2, c2)) | splat(0xFF000000u);
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
