// What all the slow references count with: the processor's own conversions and estimates, and the channels of a word.
#pragma once

#include <xmmintrin.h>

#include <algorithm>

#include "maths/Vector4.h"

namespace oracle {

// What no int holds becomes the lowest.
inline int truncate(float x) { return _mm_cvttss_si32(_mm_set_ss(x)); }
inline int round_to_nearest(float x) { return _mm_cvtss_si32(_mm_set_ss(x)); }

inline float reciprocal(float x) { return _mm_cvtss_f32(_mm_rcp_ss(_mm_set_ss(x))); }
inline float reciprocal_root(float x) { return _mm_cvtss_f32(_mm_rsqrt_ss(_mm_set_ss(x))); }

// As 16 signed bits, by saturation.
inline int signed_word(int x) { return std::clamp(x, -32768, 32767); }

inline float& lane(Vector4_s& v, int i) { return (&v.x)[i]; }
inline float lane(const Vector4_s& v, int i) { return (&v.x)[i]; }

inline unsigned int channel(unsigned int word, int c) { return word >> 8 * c & 0xFF; }

// The word with value(c) in channel c.
template <class Value>
unsigned int word_of(Value value) {
  unsigned int word = 0;
  for (int c = 0; c < 4; ++c) word |= static_cast<unsigned int>(value(c)) << 8 * c;
  return word;
}

}  // namespace oracle
