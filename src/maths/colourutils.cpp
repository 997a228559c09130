#include "maths/colourutils.h"

#include <cmath>

namespace colourutils {

unsigned int coltab[65536];

namespace {

// One channel of the HSL model: t is the hue seen from that channel, in turns.
long double channel(long double p, long double q, long double t) {
  if (6 * t < 1) return p + (q - p) * 6 * t;
  if (2 * t < 1) return q;
  if (3 * t < 2) return p + (q - p) * (0.6666667f - t) * 6;
  return p;
}

unsigned int gamma_byte(long double x) {
  const float corrected = powf(static_cast<float>(x), 0.7f);
  return static_cast<unsigned int>(static_cast<int>(static_cast<long double>(corrected) * 256));
}

unsigned int convert(unsigned int word) {
  const long double h = (word >> 10) * 0.015625L + 0.0078125L;
  const long double s = (word >> 7 & 7) * 0.125L + 0.0625L;
  const long double l = (word & 127) * 0.0078125L;

  const long double q = l < 0.5L ? (1 + s) * l : l + s - s * l;
  const long double p = 2 * l - q;
  long double red = h + 0.33333334f;
  if (red > 1) red -= 1;
  long double blue = h - 0.33333334f;
  if (blue < 0) blue += 1;

  // A sum: no channel reaches 256, since the highest lightness is 127/128.
  return (gamma_byte(channel(p, q, red)) << 16) + (gamma_byte(channel(p, q, h)) << 8) + gamma_byte(channel(p, q, blue));
}

}  // namespace

void init() {
  for (unsigned int word = 0; word < 65536; ++word) coltab[word] = convert(word);
}

}  // namespace colourutils
