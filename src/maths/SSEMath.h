// Named lane types over SSE2 registers, so that the kernels read like their algorithms.
//
//   Float4  four floats: positions, depths, coordinates
//   Int4    four 32-bit integers: whole pixels, masks, indices
//   Word8   eight 16-bit integers: the channels of two pixels
//   Channels  two Word8: the channels of four pixels
//
// A mask has all bits of a lane set or clear. Pixels are 0xAARRGGBB words; widened to Word8 their channels stand as
// blue, green, red, alpha, blue, green, red, alpha.
#pragma once

#include <emmintrin.h>

#include <cstddef>
#include <cstdint>

namespace SSEMath {

// 32-bit sums and differences that wrap, as the hardware's do.
constexpr std::int32_t wrapping_add(std::int32_t a, std::int32_t b) {
  return static_cast<std::int32_t>(static_cast<std::uint32_t>(a) + static_cast<std::uint32_t>(b));
}
constexpr std::int32_t wrapping_subtract(std::int32_t a, std::int32_t b) {
  return static_cast<std::int32_t>(static_cast<std::uint32_t>(a) - static_cast<std::uint32_t>(b));
}

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
VELMARK5_LANE Float4 magnitude(Float4 a) { return {_mm_andnot_ps(_mm_set1_ps(-0.0f), a.v)}; }
VELMARK5_LANE Float4 reciprocal_estimate(Float4 a) { return {_mm_rcp_ps(a.v)}; }
VELMARK5_LANE Float4 reciprocal_root_estimate(Float4 a) { return {_mm_rsqrt_ps(a.v)}; }
VELMARK5_LANE Int4 less(Float4 a, Float4 b) { return {_mm_castps_si128(_mm_cmplt_ps(a.v, b.v))}; }
VELMARK5_LANE Int4 equal(Float4 a, Float4 b) { return {_mm_castps_si128(_mm_cmpeq_ps(a.v, b.v))}; }
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
// Lanes 0 and 1, or 2 and 3, of a, then the same of b.
VELMARK5_LANE Float4 low_pairs(Float4 a, Float4 b) { return {_mm_movelh_ps(a.v, b.v)}; }
VELMARK5_LANE Float4 high_pairs(Float4 a, Float4 b) { return {_mm_movehl_ps(b.v, a.v)}; }
// a0, b0, a1, b1; and a2, b2, a3, b3.
VELMARK5_LANE Float4 interleave_low(Float4 a, Float4 b) { return {_mm_unpacklo_ps(a.v, b.v)}; }
VELMARK5_LANE Float4 interleave_high(Float4 a, Float4 b) { return {_mm_unpackhi_ps(a.v, b.v)}; }
VELMARK5_LANE float lane0(Float4 a) { return _mm_cvtss_f32(a.v); }
VELMARK5_LANE Float4 select(Int4 mask, Float4 set, Float4 clear) {
  const __m128 m = _mm_castsi128_ps(mask.v);
  return {_mm_or_ps(_mm_and_ps(m, set.v), _mm_andnot_ps(m, clear.v))};
}
VELMARK5_LANE Float4 operator&(Float4 a, Int4 mask) { return {_mm_and_ps(a.v, _mm_castsi128_ps(mask.v))}; }
// Where the mask is set, the lanes of a; the others stay as they are in memory.
VELMARK5_LANE void store_masked(float* p, Float4 a, Int4 mask) { store(p, select(mask, a, load(p))); }

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
VELMARK5_LANE Int4 less(Int4 a, Int4 b) { return {_mm_cmplt_epi32(a.v, b.v)}; }  // signed
VELMARK5_LANE Int4 select(Int4 mask, Int4 set, Int4 clear) { return (mask & set) | and_not(clear, mask); }
template <int Bits>
VELMARK5_LANE Int4 shift_left(Int4 a) {
  return {_mm_slli_epi32(a.v, Bits)};
}
VELMARK5_LANE Int4 operator^(Int4 a, Int4 b) { return {_mm_xor_si128(a.v, b.v)}; }
template <int Lane>
VELMARK5_LANE Int4 broadcast_mask(Int4 a) {
  return shuffle<Lane, Lane, Lane, Lane>(a);
}
// Set in lanes 0 and 1, clear in lanes 2 and 3.
VELMARK5_LANE Int4 low_half_mask() { return {_mm_setr_epi32(-1, -1, 0, 0)}; }
// All bits of the lanes whose top bit is set.
VELMARK5_LANE Int4 sign_mask(Int4 a) { return {_mm_srai_epi32(a.v, 31)}; }
// One bit for each lane's sign.
VELMARK5_LANE int lane_bits(Int4 mask) { return _mm_movemask_ps(_mm_castsi128_ps(mask.v)); }
VELMARK5_LANE Int4 truncate(Float4 a) { return {_mm_cvttps_epi32(a.v)}; }
// Of one float; what does not fit becomes the lowest integer.
VELMARK5_LANE int truncate(float a) { return _mm_cvttss_si32(_mm_set_ss(a)); }
VELMARK5_LANE Int4 add_bytes(Int4 a, Int4 b) { return {_mm_add_epi8(a.v, b.v)}; }
VELMARK5_LANE Int4 equal_bytes(Int4 a, Int4 b) { return {_mm_cmpeq_epi8(a.v, b.v)}; }
VELMARK5_LANE Int4 round(Float4 a) { return {_mm_cvtps_epi32(a.v)}; }  // to nearest, ties to even
VELMARK5_LANE Float4 to_float(Int4 a) { return {_mm_cvtepi32_ps(a.v)}; }
template <int A, int B, int C, int D>
VELMARK5_LANE Int4 shuffle(Int4 a) {
  return {_mm_shuffle_epi32(a.v, _MM_SHUFFLE(D, C, B, A))};
}
template <int Lane>
VELMARK5_LANE std::int32_t lane(Int4 a) {
  return _mm_cvtsi128_si32(Lane == 0 ? a.v : _mm_shuffle_epi32(a.v, Lane));
}
// a0, b0, a1, b1; and the low halves of a and b.
VELMARK5_LANE Int4 interleave_low(Int4 a, Int4 b) { return {_mm_unpacklo_epi32(a.v, b.v)}; }
VELMARK5_LANE Int4 join_low(Int4 a, Int4 b) { return {_mm_unpacklo_epi64(a.v, b.v)}; }
// The four lanes as numbers; they must not be negative.
struct Index4 {
  std::size_t a, b, c, d;
};
VELMARK5_LANE Index4 indices(Int4 a) {
#ifdef __x86_64__
  const auto low = static_cast<std::uint64_t>(_mm_cvtsi128_si64(a.v));
  const auto high = static_cast<std::uint64_t>(_mm_cvtsi128_si64(_mm_unpackhi_epi64(a.v, a.v)));
  return {low & 0xFFFFFFFFu, low >> 32, high & 0xFFFFFFFFu, high >> 32};
#else
  const auto number = [](std::int32_t i) { return static_cast<std::size_t>(i); };
  return {number(lane<0>(a)), number(lane<1>(a)), number(lane<2>(a)), number(lane<3>(a))};
#endif
}
VELMARK5_LANE void store_masked(std::uint32_t* p, Int4 a, Int4 mask) { store(p, select(mask, a, load(p))); }
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
VELMARK5_LANE Word8 subtract_saturating(Word8 a, Word8 b) { return {_mm_subs_epu16(a.v, b.v)}; }

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

VELMARK5_LANE Word8 load(const std::uint16_t* p) { return {_mm_load_si128(reinterpret_cast<const __m128i*>(p))}; }
VELMARK5_LANE Word8 load(const std::int16_t* p) { return {_mm_load_si128(reinterpret_cast<const __m128i*>(p))}; }
VELMARK5_LANE void store(std::uint16_t* p, Word8 a) { _mm_store_si128(reinterpret_cast<__m128i*>(p), a.v); }
VELMARK5_LANE void store(std::int16_t* p, Word8 a) { _mm_store_si128(reinterpret_cast<__m128i*>(p), a.v); }
// Four words from memory, as the low half.
VELMARK5_LANE Word8 load_half(const std::uint16_t* p) { return {_mm_loadl_epi64(reinterpret_cast<const __m128i*>(p))}; }
VELMARK5_LANE Word8 operator~(Word8 a) { return {_mm_xor_si128(a.v, _mm_set1_epi32(-1))}; }
VELMARK5_LANE Word8 select(Int4 mask, Word8 set, Word8 clear) {
  return {_mm_or_si128(_mm_and_si128(mask.v, set.v), _mm_andnot_si128(mask.v, clear.v))};
}
// Four words twice, and the two halves exchanged.
VELMARK5_LANE Word8 twice_low(Word8 a) { return {_mm_unpacklo_epi64(a.v, a.v)}; }
VELMARK5_LANE Word8 twice_high(Word8 a) { return {_mm_unpackhi_epi64(a.v, a.v)}; }
VELMARK5_LANE Word8 join_low(Word8 a, Word8 b) { return {_mm_unpacklo_epi64(a.v, b.v)}; }
VELMARK5_LANE Word8 swap_halves(Word8 a) { return {_mm_shuffle_epi32(a.v, _MM_SHUFFLE(1, 0, 3, 2))}; }
// Logical, in every word; a count above 15 leaves 0.
VELMARK5_LANE Word8 shift_right(Word8 a, int count) { return {_mm_srl_epi16(a.v, _mm_cvtsi32_si128(count))}; }

template <int Lane>
VELMARK5_LANE std::int16_t word(Word8 a) {
  return static_cast<std::int16_t>(_mm_extract_epi16(a.v, Lane));
}
// Word 0, 1, 2 or 3 in all words.
template <int Lane>
VELMARK5_LANE Word8 broadcast_word(Word8 a) {
  return twice_low({_mm_shufflelo_epi16(a.v, _MM_SHUFFLE(Lane, Lane, Lane, Lane))});
}
// The low word of x four times, then the high word four times.
VELMARK5_LANE Word8 spread_pair(std::uint32_t x) {
  const __m128i pair = _mm_cvtsi32_si128(static_cast<int>(x));
  return {_mm_shuffle_epi32(_mm_unpacklo_epi16(pair, pair), _MM_SHUFFLE(1, 1, 0, 0))};
}
// Signed words to bytes with unsigned saturation, then pairs of them: word i + 256 * word (i + 4), for i from 0 to 3.
VELMARK5_LANE Word8 byte_pairs(Word8 a) {
  const __m128i bytes = _mm_packus_epi16(a.v, a.v);
  return {_mm_unpacklo_epi8(bytes, _mm_srli_si128(bytes, 4))};
}

// The low and the high four words as unsigned 32-bit integers.
VELMARK5_LANE Int4 integers_low(Word8 a) { return {_mm_unpacklo_epi16(a.v, _mm_setzero_si128())}; }
VELMARK5_LANE Int4 integers_high(Word8 a) { return {_mm_unpackhi_epi16(a.v, _mm_setzero_si128())}; }
// 32-bit integers to signed words, with saturation.
VELMARK5_LANE Word8 signed_words(Int4 low, Int4 high) { return {_mm_packs_epi32(low.v, high.v)}; }
// Floats to signed words: truncated, then saturated.
VELMARK5_LANE Word8 signed_words(Float4 low, Float4 high) { return signed_words(truncate(low), truncate(high)); }
// Floats to unsigned words: truncated, below 0 to 0, above 65535 to 65535. What no 32-bit integer can hold is 65535.
VELMARK5_LANE Word8 unsigned_words(Float4 low, Float4 high) {
  const Int4 bias = splat(32768u);
  return signed_words(truncate(low) - bias, truncate(high) - bias) + splat_word(32768);
}

// The alpha of each of the two pixels in all its four channels.
VELMARK5_LANE Word8 broadcast_alpha(Word8 a) {
  return {_mm_shufflehi_epi16(_mm_shufflelo_epi16(a.v, _MM_SHUFFLE(3, 3, 3, 3)), _MM_SHUFFLE(3, 3, 3, 3))};
}

// --- Channels -------------------------------------------------------------------------------------------------------

// The channels of four pixels: of 0 and 1, and of 2 and 3.
struct Channels {
  Word8 low, high;
};

VELMARK5_LANE Channels both(Word8 a) { return {a, a}; }
VELMARK5_LANE Channels operator+(Channels a, Channels b) { return {a.low + b.low, a.high + b.high}; }
VELMARK5_LANE Channels operator-(Channels a, Channels b) { return {a.low - b.low, a.high - b.high}; }
VELMARK5_LANE Channels operator*(Channels a, Channels b) { return {a.low * b.low, a.high * b.high}; }
VELMARK5_LANE Channels operator~(Channels a) { return {~a.low, ~a.high}; }
VELMARK5_LANE Channels mulhi(Channels p, Channels q) { return {mulhi(p.low, q.low), mulhi(p.high, q.high)}; }
template <int Bits>
VELMARK5_LANE Channels shift_right(Channels a) {
  return {shift_right<Bits>(a.low), shift_right<Bits>(a.high)};
}
VELMARK5_LANE Channels add_saturating(Channels a, Channels b) {
  return {add_saturating(a.low, b.low), add_saturating(a.high, b.high)};
}
VELMARK5_LANE Channels broadcast_alpha(Channels a) { return {broadcast_alpha(a.low), broadcast_alpha(a.high)}; }
VELMARK5_LANE Channels widen(Int4 pixels) { return {widen_low(pixels), widen_high(pixels)}; }
VELMARK5_LANE Channels widen_shifted(Int4 pixels) { return {widen_low_shifted(pixels), widen_high_shifted(pixels)}; }
// A mask of the pixels whose alpha is 0; alpha: broadcast.
VELMARK5_LANE Int4 zero_alpha(Channels alpha) {
  const __m128i zero = _mm_setzero_si128();
  return {_mm_packs_epi16(_mm_cmpeq_epi16(alpha.low.v, zero), _mm_cmpeq_epi16(alpha.high.v, zero))};
}
VELMARK5_LANE Int4 narrow(Channels a) { return narrow(a.low, a.high); }

// --- Prefetch -------------------------------------------------------------------------------------------------------

// The line at p into the outer caches, one level nearer, and all the way.
VELMARK5_LANE void prefetch_outer(const void* p) { _mm_prefetch(static_cast<const char*>(p), _MM_HINT_T2); }
VELMARK5_LANE void prefetch_nearer(const void* p) { _mm_prefetch(static_cast<const char*>(p), _MM_HINT_T1); }
VELMARK5_LANE void prefetch_nearest(const void* p) { _mm_prefetch(static_cast<const char*>(p), _MM_HINT_T0); }

// --- Streaming stores -----------------------------------------------------------------------------------------------

// Past the caches, for targets that nobody reads soon. The end of a fill calls stream_end.
VELMARK5_LANE void stream(std::uint32_t* p, Int4 a) { _mm_stream_si128(reinterpret_cast<__m128i*>(p), a.v); }
VELMARK5_LANE void stream_one(std::uint32_t* p, std::uint32_t word) {
  _mm_stream_si32(reinterpret_cast<int*>(p), static_cast<int>(word));
}
VELMARK5_LANE void stream_end() { _mm_sfence(); }

}  // namespace SSEMath
