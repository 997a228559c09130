#include "maths/mymath.h"

#include <math.h>

namespace mymath {

float sintabf[angles];
float costabf[angles];

void init() {
  constexpr float radians_per_angle = 0x1.921fb6p-12f;  // 2 pi / 16384
  sintabf[0] = 0;
  costabf[0] = 1;
  for (unsigned int i = 1; i < angles; ++i) {
    sincosf(static_cast<float>(i) * radians_per_angle, &sintabf[i], &costabf[i]);
  }
}

}  // namespace mymath
