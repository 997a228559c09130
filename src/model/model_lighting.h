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

// A vector of each of a face's corners, by lane; the last lane is the third corner again.
struct corner_vectors {
  SSEMath::Float4 x, y, z, w;
};

VELMARK5_LANE corner_vectors by_lane(const Vector4_s& v0, const Vector4_s& v1, const Vector4_s& v2) {
  using namespace SSEMath;
  const Float4 p = load(&v0.x), q = load(&v1.x), r = load(&v2.x);
  const Float4 xy = interleave_low(p, q), zw = interleave_high(p, q);
  return {shuffle<0, 1, 0, 0>(xy, r), shuffle<2, 3, 1, 1>(xy, r), shuffle<0, 1, 2, 2>(zw, r),
          shuffle<2, 3, 3, 3>(zw, r)};
}

// The sun as the corners of many faces need it, read from the scene once.
class sun {
 public:
  explicit sun(const toolkit& t)
      : x_(SSEMath::splat(t.sun_x)),
        y_(SSEMath::splat(t.sun_y)),
        z_(SSEMath::splat(t.sun_z)),
        front_(SSEMath::splat(t.sun_front)),
        back_(SSEMath::splat(t.sun_back)),
        ambient_(SSEMath::splat(t.ambient)),
        colour_(SSEMath::widen_low(SSEMath::splat(static_cast<std::uint32_t>(t.sun_r) << 16 |
                                                  static_cast<std::uint32_t>(t.sun_g) << 8 | t.sun_b))),
        scene_(t) {}

  // sun_intensity of three normals at once.
  VELMARK5_LANE SSEMath::Int4 intensities(const corner_vectors& normals, SSEMath::Float4 contrastfactor) const {
    using namespace SSEMath;
    Float4 d = x_ * normals.x + y_ * normals.y + z_ * normals.z;
    // Only merged normals are sums.
    if (lane_bits(equal(normals.w, splat(1.0f))) != 15) d = {_mm_div_ps(d.v, normals.w.v)};
    const Float4 side = select(less(splat(0.0f), d), front_, back_);
    return truncate((ambient_ + d * side * contrastfactor) * splat(256.0f));
  }

  // sunlit of the words of three corners with an intensity each, opaque. Each channel fills a 16-bit word: of the first
  // two corners, and of the third in the low half.
  VELMARK5_LANE SSEMath::Channels corners(SSEMath::Int4 rgb, SSEMath::Int4 intensity) const {
    using namespace SSEMath;
    // Twice the intensity, if that fits a word.
    const __m128i high = _mm_slli_epi32(intensity.v, 17);
    if (lane_bits(equal(Int4{_mm_srai_epi32(high, 17)}, intensity)) != 15) return one_by_one(rgb, intensity);
    const __m128i twice = _mm_srai_epi32(high, 16);
    const __m128i packed = _mm_packs_epi32(twice, twice);
    const Int4 pairs{_mm_unpacklo_epi16(packed, packed)};
    // channel * sun >> 8, times 128: with the doubled intensity the high half of the product is what is left after
    // its 8 bits.
    const auto lit = [this](Word8 channels, Int4 strength) {
      const Word8 coloured = shift_left<7>(shift_right<8>(channels * colour_));
      const __m128i product = _mm_mulhi_epi16(coloured.v, strength.v);
      const __m128i limited = _mm_max_epi16(_mm_min_epi16(product, _mm_set1_epi16(252)), _mm_set1_epi16(4));
      return Word8{_mm_or_si128(_mm_slli_epi16(limited, 8), _mm_set1_epi64x(static_cast<std::int64_t>(opaque)))};
    };
    return {lit(widen_low(rgb), shuffle<0, 0, 1, 1>(pairs)), lit(widen_high(rgb), shuffle<2, 2, 2, 2>(pairs))};
  }

 private:
  static constexpr std::uint64_t opaque = 0xFF00'0000'0000'0000;

  // Intensities that are too strong for products of 16-bit words.
  SSEMath::Channels one_by_one(SSEMath::Int4 rgb, SSEMath::Int4 intensity) const {
    using namespace SSEMath;
    const auto alone = [this](std::int32_t word, std::int32_t strength) {
      return static_cast<int>(sunlit(scene_, static_cast<unsigned int>(word), 255, strength));
    };
    return widen_shifted(
        {_mm_setr_epi32(alone(lane<0>(rgb), lane<0>(intensity)), alone(lane<1>(rgb), lane<1>(intensity)),
                        alone(lane<2>(rgb), lane<2>(intensity)), 0)});
  }

  SSEMath::Float4 x_, y_, z_, front_, back_, ambient_;
  SSEMath::Word8 colour_;
  const toolkit& scene_;
};

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

// The point lights as the corners of many faces need them. lightpos: in model space, as the scene counts them.
class point_lights {
 public:
  point_lights(const toolkit& t, const Vector4_s* lightpos) : count_(t.pointlight_count) {
    using namespace SSEMath;
    for (int i = 0; i < count_; ++i) {
      const Int4 word = splat(t.pointlight_colour[i]);
      lights_[i] = {splat(lightpos[i].x), splat(lightpos[i].y), splat(lightpos[i].z), splat(t.pointlight_strength[i]),
                    to_float(integers_low(widen_low(word)))};
    }
  }

  // pointlit of three corners at once. Takes and returns channels times 256, of the first two corners and of the third.
  VELMARK5_LANE SSEMath::Channels corners(SSEMath::Channels sunlit, const corner_vectors& positions,
                                          const corner_vectors& normals) const {
    using namespace SSEMath;
    const Word8 two = shift_right<8>(sunlit.low), third = shift_right<8>(sunlit.high);
    Float4 sum0 = to_float(integers_low(two)), sum1 = to_float(integers_high(two));
    Float4 sum2 = to_float(integers_low(third));
    const Float4 scale = splat(1.5259022e-5f);
    const Float4 reflected0 = scale * sum0, reflected1 = scale * sum1, reflected2 = scale * sum2;
    for (int i = 0; i < count_; ++i) {
      const light& from = lights_[i];
      const Float4 dx = from.x - positions.x, dy = from.y - positions.y, dz = from.z - positions.z;
      const Float4 squared = dx * dx + dy * dy + dz * dz;
      const Float4 facing = max(dx * normals.x + dy * normals.y + dz * normals.z, splat(0.0f));
      const Float4 strength = facing * from.strength * reciprocal_estimate(squared) * reciprocal_root_estimate(squared);
      sum0 += from.colour * reflected0 * broadcast<0>(strength);
      sum1 += from.colour * reflected1 * broadcast<1>(strength);
      sum2 += from.colour * reflected2 * broadcast<2>(strength);
    }
    const Int4 third_channels = round(sum2);
    return widen_shifted(
        narrow({signed_words(round(sum0), round(sum1)), signed_words(third_channels, third_channels)}));
  }

 private:
  struct light {
    SSEMath::Float4 x, y, z, strength, colour;
  };
  light lights_[4];
  int count_;
};

}  // namespace lighting
