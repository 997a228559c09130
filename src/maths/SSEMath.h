// Named lane types over SSE2 registers, so that the kernels read like their algorithms.
//
//   Float4  four floats: positions, depths, coordinates
//   Int4    four 32-bit integers: whole pixels, masks, indices
//   Word8   eight 16-bit integers: the channels of two pixels
//
// A mask has all bits of a lane set or clear. Pixels are 0xAARRGGBB words; widened to Word8 their channels stand as
// blue, green, red, alpha, blue, green, red, alpha.
#pragma once

#include <emmintrin.h>

#include <cstdint>

namespace SSEMath {

#define VELMARK5_LANE [[gnu::always_inline]] inline

struct Float4 {
  __m128 v;
};
struct Int4 {
  __m128i v;
};
struct Word8 {
  __m128i v;
};

// --- Float4 ---------------------------------------------------------------------------------------------------------

VELMARK5_LANE Float4 splat(float x) { return {_mm_set1_ps(x)}; }
VELMARK5_LANE Float4 floats(float a, float b, float c, float d) { return {_mm_setr_ps(a, b, c, d)}; }
VELMARK5_LANE Float4 load(const float* p) { return {_mm_load_ps(p)}; }
VELMARK5_LANE Float4 load_unaligned(const float* p) { return {_mm_loadu_ps(p)}; }
VELMARK5_LANE Float4 load_one(const float* p) { return {_mm_load_ss(p)}; }
VELMARK5_LANE void store(float* p, Float4 a) { _mm_store_ps(p, a.v); }
VELMARK5_LANE void store_unaligned(float* p, Float4 a) { _mm_storeu_ps(p, a.v); }

VELMARK5_LANE Float4 operator+(Float4 a, Float4 b) { return {_mm_add_ps(a.v, b.v)}; }
VELMARK5_LANE Float4 operator-(Float4 a, Float4 b) { return {_mm_sub_ps(a.v, b.v)}; }
VELMARK5_LANE Float4 operator*(Float4 a, Float4 b) { return {_mm_mul_ps(a.v, b.v)}; }
VELMARK5_LANE Float4& operator+=(Float4& a, Float4 b) { return a = a + b; }
// max and min take the second operand when either is not a number, as the instructions do.
VELMARK5_LANE Float4 max(Float4 a, Float4 b) { return {_mm_max_ps(a.v, b.v)}; }
VELMARK5_LANE Float4 min(Float4 a, Float4 b) { return {_mm_min_ps(a.v, b.v)}; }
VELMARK5_LANE Float4 reciprocal_estimate(Float4 a) { return {_mm_rcp_ps(a.v)}; }
VELMARK5_LANE Float4 reciprocal_root_estimate(Float4 a) { return {_mm_rsqrt_ps(a.v)}; }
VELMARK5_LANE Int4 less(Float4 a, Float4 b) { return {_mm_castps_si128(_mm_cmplt_ps(a.v, b.v))}; }
VELMARK5_LANE Int4 less_equal(Float4 a, Float4 b) { return {_mm_castps_si128(_mm_cmple_ps(a.v, b.v))}; }

// Picks lanes by number, the first for lane 0.
template <int A, int B, int C, int D>
VELMARK5_LANE Float4 shuffle(Float4 a) {
  return {_mm_shuffle_ps(a.v, a.v, _MM_SHUFFLE(D, C, B, A))};
}
// Lanes A and B of a, then C and D of b.
template <int A, int B, int C, int D>
VELMARK5_LANE Float4 shuffle(Float4 a, Float4 b) {
  return {_mm_shuffle_ps(a.v, b.v, _MM_SHUFFLE(D, C, B, A))};
}
template <int Lane>
VELMARK5_LANE Float4 broadcast(Float4 a) {
  return shuffle<Lane, Lane, Lane, Lane>(a);
}
VELMARK5_LANE float lane0(Float4 a) { return _mm_cvtss_f32(a.v); }

// --- Int4 -----------------------------------------------------------------------------------------------------------

VELMARK5_LANE Int4 splat(std::uint32_t x) { return {_mm_set1_epi32(static_cast<int>(x))}; }
VELMARK5_LANE Int4 load(const std::uint32_t* p) { return {_mm_load_si128(reinterpret_cast<const __m128i*>(p))}; }
VELMARK5_LANE Int4 load_unaligned(const std::uint32_t* p) {
  return {_mm_loadu_si128(reinterpret_cast<const __m128i*>(p))};
}
VELMARK5_LANE Int4 load_one(const std::uint32_t* p) { return {_mm_cvtsi32_si128(static_cast<int>(*p))}; }
VELMARK5_LANE void store(std::uint32_t* p, Int4 a) { _mm_store_si128(reinterpret_cast<__m128i*>(p), a.v); }
VELMARK5_LANE void store_unaligned(std::uint32_t* p, Int4 a) { _mm_storeu_si128(reinterpret_cast<__m128i*>(p), a.v); }
VELMARK5_LANE void store_one(std::uint32_t* p, Int4 a) { *p = static_cast<std::uint32_t>(_mm_cvtsi128_si32(a.v)); }

VELMARK5_LANE Int4 operator+(Int4 a, Int4 b) { return {_mm_add_epi32(a.v, b.v)}; }
VELMARK5_LANE Int4 operator-(Int4 a, Int4 b) { return {_mm_sub_epi32(a.v, b.v)}; }
VELMARK5_LANE Int4 operator&(Int4 a, Int4 b) { return {_mm_and_si128(a.v, b.v)}; }
VELMARK5_LANE Int4 operator|(Int4 a, Int4 b) { return {_mm_or_si128(a.v, b.v)}; }
VELMARK5_LANE Int4 and_not(Int4 keep, Int4 clear) { return {_mm_andnot_si128(clear.v, keep.v)}; }
VELMARK5_LANE Int4 equal(Int4 a, Int4 b) { return {_mm_cmpeq_epi32(a.v, b.v)}; }
VELMARK5_LANE Int4 select(Int4 mask, Int4 set, Int4 clear) { return (mask & set) | and_not(clear, mask); }
template <int Bits>
VELMARK5_LANE Int4 shift_left(Int4 a) {
  return {_mm_slli_epi32(a.v, Bits)};
}
// One bit for each lane's sign.
VELMARK5_LANE int lane_bits(Int4 mask) { return _mm_movemask_ps(_mm_castsi128_ps(mask.v)); }
VELMARK5_LANE Int4 truncate(Float4 a) { return {_mm_cvttps_epi32(a.v)}; }
// Of one float; what does not fit becomes the lowest integer.
VELMARK5_LANE int truncate(float a) { return _mm_cvttss_si32(_mm_set_ss(a)); }
VELMARK5_LANE Int4 add_bytes(Int4 a, Int4 b) { return {_mm_add_epi8(a.v, b.v)}; }
VELMARK5_LANE Int4 equal_bytes(Int4 a, Int4 b) { return {_mm_cmpeq_epi8(a.v, b.v)}; }
VELMARK5_LANE Int4 add_saturating_bytes(Int4 a, Int4 b) { return {_mm_adds_epu8(a.v, b.v)}; }
VELMARK5_LANE Int4 subtract_saturating_bytes(Int4 a, Int4 b) { return {_mm_subs_epu8(a.v, b.v)}; }

// --- Word8 ----------------------------------------------------------------------------------------------------------

VELMARK5_LANE Word8 splat_word(std::uint16_t x) { return {_mm_set1_epi16(static_cast<short>(x))}; }
VELMARK5_LANE Word8 operator+(Word8 a, Word8 b) { return {_mm_add_epi16(a.v, b.v)}; }
VELMARK5_LANE Word8 operator-(Word8 a, Word8 b) { return {_mm_sub_epi16(a.v, b.v)}; }
VELMARK5_LANE Word8 operator*(Word8 a, Word8 b) { return {_mm_mullo_epi16(a.v, b.v)}; }  // low halves
// The high half of each unsigned product: (p * q) >> 16.
VELMARK5_LANE Word8 mulhi(Word8 p, Word8 q) { return {_mm_mulhi_epu16(p.v, q.v)}; }
template <int Bits>
VELMARK5_LANE Word8 shift_right(Word8 a) {
  return {_mm_srli_epi16(a.v, Bits)};
}
template <int Bits>
VELMARK5_LANE Word8 shift_left(Word8 a) {
  return {_mm_slli_epi16(a.v, Bits)};
}
VELMARK5_LANE Word8 add_saturating(Word8 a, Word8 b) { return {_mm_adds_epu16(a.v, b.v)}; }

// The same register seen as the other type.
VELMARK5_LANE Word8 words(Int4 a) { return {a.v}; }
VELMARK5_LANE Int4 pixels(Word8 a) { return {a.v}; }

// The channels of pixels 0 and 1, and of 2 and 3, as bytes widened to 16 bits.
VELMARK5_LANE Word8 widen_low(Int4 pixels) { return {_mm_unpacklo_epi8(pixels.v, _mm_setzero_si128())}; }
VELMARK5_LANE Word8 widen_high(Int4 pixels) { return {_mm_unpackhi_epi8(pixels.v, _mm_setzero_si128())}; }
// The same as byte << 8.
VELMARK5_LANE Word8 widen_low_shifted(Int4 pixels) { return {_mm_unpacklo_epi8(_mm_setzero_si128(), pixels.v)}; }
VELMARK5_LANE Word8 widen_high_shifted(Int4 pixels) { return {_mm_unpackhi_epi8(_mm_setzero_si128(), pixels.v)}; }
// Back to four pixels; a channel above 255 saturates (as a signed word: above 32767 it ends at 0).
VELMARK5_LANE Int4 narrow(Word8 low, Word8 high) { return {_mm_packus_epi16(low.v, high.v)}; }

// The alpha of each of the two pixels in all its four channels.
VELMARK5_LANE Word8 broadcast_alpha(Word8 a) {
  return {_mm_shufflehi_epi16(_mm_shufflelo_epi16(a.v, _MM_SHUFFLE(3, 3, 3, 3)), _MM_SHUFFLE(3, 3, 3, 3))};
}

// --- Streaming stores -----------------------------------------------------------------------------------------------

// Past the caches, for targets that nobody reads soon. The end of a fill calls stream_end.
VELMARK5_LANE void stream(std::uint32_t* p, Int4 a) { _mm_stream_si128(reinterpret_cast<__m128i*>(p), a.v); }
VELMARK5_LANE void stream_one(std::uint32_t* p, std::uint32_t word) {
  _mm_stream_si32(reinterpret_cast<int*>(p), static_cast<int>(word));
}
VELMARK5_LANE void stream_end() { _mm_sfence(); }

}  // namespace SSEMath
