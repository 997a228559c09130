// Sine and cosine by table. An angle is an unsigned integer with 16384 to the turn; only its low 14 bits count.
#pragma once

namespace mymath {

inline constexpr unsigned int angles = 16384;

extern float sintabf[angles];
extern float costabf[angles];

// Radians to angle units: the single-precision 16384 / (2 pi).
inline constexpr double TRIG_ANGLEREVERSEFACTOR = 2607.594482421875;

// Fills both tables. Once, before any other use.
void init();

inline float sin(unsigned int angle) { return sintabf[angle & (angles - 1)]; }
inline float cos(unsigned int angle) { return costabf[angle & (angles - 1)]; }

// The number of bits that hold the value: 0 for 0, 2 for 2 and 3, 32 when the top bit is set.
inline unsigned int bitsrequired(unsigned int value) {
  unsigned int bits = 0;
  if (value > 65535) bits += 16, value >>= 16;
  if (value > 255) bits += 8, value >>= 8;
  if (value > 15) bits += 4, value >>= 4;
  if (value >= 4) bits += 2, value >>= 2;
  constexpr unsigned int last[] = {0, 1, 2, 2};
  return bits + last[value];
}

}  // namespace mymath
