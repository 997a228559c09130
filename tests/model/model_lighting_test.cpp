// Sunlight on the corners of a face: three at once as one by one.
#include "model/model_lighting.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

class model_lighting_test : public toolkit_fixture {};

TEST_F(model_lighting_test, three_corners_at_once_are_lit_as_each_alone) {
  test_random random(77);
  for (int round = 0; round < 20000; ++round) {
    toolkit& t = kit();
    t.sun_x = random.real(-1, 1);
    t.sun_y = random.real(-1, 1);
    t.sun_z = random.real(-1, 1);
    t.sun_r = static_cast<unsigned char>(random.word());
    t.sun_g = static_cast<unsigned char>(random.word());
    t.sun_b = static_cast<unsigned char>(random.word());
    // Levels for which the products leave 16 and 32 bits, and no numbers at all.
    const float level = std::exp2(random.real(-4, random.one_in(2) ? 4 : 40));
    t.ambient = random.one_in(50) ? std::numeric_limits<float>::quiet_NaN() : random.real(-level, level);
    t.sun_front = random.real(-level, level);
    t.sun_back = random.real(-level, level);
    Vector4_s normal[3];
    for (Vector4_s& n : normal) {
      n = {random.real(-1, 1), random.real(-1, 1), random.real(-1, 1), random.one_in(9) ? 0 : random.real(0, 4)};
    }
    const float contrast = random.real(0, 3);
    alignas(16) unsigned int words[4] = {random.word(), random.word(), random.word(), 0}, lit[4];
    const lighting::sun sun(t);
    const auto intensities =
        sun.intensities(lighting::by_lane(normal[0], normal[1], normal[2]), SSEMath::splat(contrast));
    const auto channels = sun.corners(SSEMath::load(words), intensities);
    SSEMath::store(lit, SSEMath::narrow(SSEMath::shift_right<8>(channels)));
    for (int k = 0; k < 3; ++k) {
      const int alone = lighting::sun_intensity(t, normal[k], contrast);
      ASSERT_EQ(lit[k], lighting::sunlit(t, words[k], 255, alone)) << round << " corner " << k << " " << alone;
    }
  }
}

}  // namespace
