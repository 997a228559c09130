// Scene state through the natives: what is stored, and what is derived from it, against plain formulas.
#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <vector>

#include "maths/Matrix.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

using Rasterizer_n::m_DistanceFogColour;
using Rasterizer_n::m_DistanceFogStart;
using Rasterizer_n::m_HeightFogColour;
using Rasterizer_n::m_ZFar;
using Rasterizer_n::m_ZNear;
using Numbers = std::vector<jfloat>;  // 16, row by row

class SceneTest : public toolkit_fixture {
 protected:
  void camera(const Numbers& m) { Java_ja_AA(env, peer, java.new_floats(m)); }
  void projection(const Numbers& m) { Java_ja_wa(env, peer, java.new_floats(m)); }

  // A view volume of 90 degrees both ways with near and far planes, y down.
  static Numbers perspective(float near, float far) {
    const float scale = (far + near) / (far - near);
    return {1, 0, 0, 0, 0, 1, 0, 0, 0, 0, scale, 1, 0, 0, -2 * far * near / (far - near), 0};
  }

  // The record and the raster state, to see that a refused call changes nothing.
  std::vector<unsigned char> record() {
    const auto* bytes = reinterpret_cast<const unsigned char*>(&kit());
    std::vector<unsigned char> all(bytes, bytes + sizeof(toolkit));
    const float raster[] = {m_ZNear, m_ZFar, m_DistanceFogStart};
    const auto* more = reinterpret_cast<const unsigned char*>(raster);
    all.insert(all.end(), more, more + sizeof raster);
    return all;
  }
};

}  // namespace

TEST_F(SceneTest, CameraAndProjectionMakeTheirProductAndItsPlanes) {
  test_random random(8);
  Numbers c(16), p(16);
  for (int i : {0, 5, 10, 15}) c[i] = p[i] = 1;
  for (int n = 0; n < 20; ++n) {
    Numbers& changed = n % 2 == 0 ? c : p;
    for (jfloat& x : changed) x = random.real(-3, 3);
    n % 2 == 0 ? camera(c) : projection(p);
    EXPECT_EQ(std::memcmp(&kit().camera, c.data(), 64), 0);
    EXPECT_EQ(std::memcmp(&kit().projection, p.data(), 64), 0);
    float product[4][4];
    for (int i = 0; i < 4; ++i) {
      for (int j = 0; j < 4; ++j) {
        const float* row = &c[4 * i];
        product[i][j] = (row[0] * p[j] + row[2] * p[8 + j]) + (row[1] * p[4 + j] + row[3] * p[12 + j]);
      }
    }
    EXPECT_EQ(std::memcmp(&kit().viewprojection, product, sizeof product), 0);
    // Planes within the precision of the reciprocal root.
    for (int plane = 0; plane < 6; ++plane) {
      double exact[4];
      for (int r = 0; r < 4; ++r) exact[r] = product[r][3] + (plane % 2 == 0 ? 1.0 : -1.0) * product[r][plane / 2];
      const double length = std::hypot(exact[0], exact[1], exact[2]);
      for (int r = 0; r < 4; ++r) {
        EXPECT_NEAR((&kit().frustum[plane].x)[r], exact[r] / length, 1e-3 * (1 + std::abs(exact[r] / length)));
      }
    }
  }
}

TEST_F(SceneTest, ProjectionTellsNearFarAndFog) {
  make_target(640, 480);
  Java_ja_GA(env, peer, 0, 1);
  projection(perspective(10, 1000));
  EXPECT_NEAR(m_ZNear, 10, 0.1);
  EXPECT_NEAR(m_ZFar, 1000, 1);

  // The depth of the point at `distance` on the view axis, in the viewport's range.
  const auto screen_depth = [&](float distance, float near, float far) {
    const Matrix_c& m = kit().projection;
    const float ndc = (distance * m.rows[2].z + m.rows[3].z) / (distance * m.rows[2].w + m.rows[3].w);
    return ndc * ((far - near) * 0.5f) + ((far - near) * 0.5f + near);
  };
  EXPECT_EQ(m_DistanceFogStart, screen_depth(m_ZFar - 255, 0, 1)) << "fog is on at first";
  Java_ja_c(env, peer, 0x04030201, 400);
  EXPECT_EQ(kit().fog_start, 400.0f);
  EXPECT_EQ(m_DistanceFogStart, screen_depth(m_ZFar - 400, 0, 1));
  EXPECT_TRUE(m_DistanceFogColour.x == 256 && m_DistanceFogColour.w == 1024);
  Java_ja_c(env, peer, 7, -5);
  EXPECT_EQ(kit().fog_start, 0.0f);
  EXPECT_EQ(m_DistanceFogStart, screen_depth(m_ZFar, 0, 1));

  // Fog beginning behind the eye: the sign of z stays, whatever the division made of it.
  Java_ja_c(env, peer, 7, 2000);
  const float w = m_ZFar - 2000, z = w * kit().projection.rows[2].z + kit().projection.rows[3].z;
  EXPECT_EQ(m_DistanceFogStart, -std::abs(z) / std::abs(w) * 0.5f + 0.5f);

  // A new viewport is followed by the next projection, not before.
  Java_ja_c(env, peer, 7, 100);
  const float before = m_DistanceFogStart;
  Java_ja_GA(env, peer, 0.25f, 0.75f);
  EXPECT_EQ(m_DistanceFogStart, before);
  projection(perspective(10, 1000));
  EXPECT_EQ(m_DistanceFogStart, screen_depth(m_ZFar - 100, 0.25f, 0.75f));
}

TEST_F(SceneTest, SunIsNormalisedAndThrowsShadows) {
  Java_ja_m(env, peer, 0x7F102030, 0.5f, 1.5f, 30, -40, 120);
  EXPECT_TRUE(kit().sun_r == 0x10 && kit().sun_g == 0x20 && kit().sun_b == 0x30);
  EXPECT_TRUE(kit().sun_front == 0.5f && kit().sun_back == 1.5f);
  EXPECT_FLOAT_EQ(kit().sun_x, 30 / 130.0f);
  EXPECT_FLOAT_EQ(kit().sun_y, -40 / 130.0f);
  EXPECT_FLOAT_EQ(kit().sun_z, 120 / 130.0f);
  EXPECT_NEAR(kit().shadow_slope_x, -192, 1);
  EXPECT_NEAR(kit().shadow_slope_z, -768, 1);
  Java_ja_m(env, peer, 0, 1, 1, 100, 1000, -101);
  EXPECT_TRUE(kit().shadow_slope_x == 25 && kit().shadow_slope_z == -25) << "truncated toward zero, both ways";
  Java_ja_IA(env, peer, 0.75f);
  EXPECT_EQ(kit().ambient, 0.75f);
  // The resolution of shadows is cut to a power of two, at least 1.
  const int resolutions[][3] = {{12, 8, 3}, {0, 1, 0}, {2, 2, 1}, {-7, 1, 0}, {16, 16, 4}, {0x7FFFFFFF, 1 << 30, 30}};
  for (const auto& [value, resolution, shift] : resolutions) {
    Java_ja_J(env, peer, value);
    EXPECT_TRUE(kit().shadow_resolution == resolution && kit().shadow_resolution_shift == shift) << value;
  }
}

TEST_F(SceneTest, PointLightsAreCutToFour) {
  std::vector<jint> lights;
  Numbers strengths;
  for (int i = 0; i < 9; ++i) {
    lights.insert(lights.end(), {10 * i, -i, 3 * i, 20 + i, 0x10203 * (i + 1)});
    strengths.push_back(i == 1 ? 7.5f : static_cast<float>(i) / 4);
  }
  for (int i = 0; i < 4; ++i) kit().pointlight_pos[i].w = static_cast<float>(i + 50);
  Java_ja_Q(env, peer, 9, java.new_ints(lights), java.new_floats(strengths));
  EXPECT_EQ(kit().pointlight_count, 4);
  for (int i = 0; i < 4; ++i) {
    const Vector4_s& at = kit().pointlight_pos[i];
    EXPECT_TRUE(at.x == static_cast<float>(10 * i) && at.y == static_cast<float>(-i) &&
                at.z == static_cast<float>(3 * i) && at.w == static_cast<float>(i + 50));
    const float strength = i == 1 ? 1.0f : static_cast<float>(i) / 4;
    EXPECT_EQ(kit().pointlight_strength[i], static_cast<float>((20 + i) * (20 + i)) * strength * 256);
    EXPECT_EQ(kit().pointlight_colour[i], 0x10203u * static_cast<unsigned>(i + 1));
  }
  // Counts below one are stored, and no array is needed.
  Java_ja_Q(env, peer, -3, nullptr, nullptr);
  EXPECT_TRUE(kit().pointlight_count == -3 && kit().pointlight_pos[1].x == 10);
}

TEST_F(SceneTest, UnderwaterModeKeepsTheFogColourOnce) {
  Java_ja_c(env, peer, 0x112233, 10);
  Java_ja_M(env, peer, 500, 0x04030201, 50, 9);
  EXPECT_TRUE(kit().underwater && kit().fog_colour == 0x04030201u);
  EXPECT_TRUE(kit().underwater_height == 500 && kit().underwater_range == 50);
  EXPECT_TRUE(kit().underwater_height_f == 500 && kit().underwater_scale == -1.0f / 50);
  EXPECT_TRUE(m_HeightFogColour.x == 256 && m_HeightFogColour.w == 1024);
  EXPECT_EQ(m_DistanceFogColour.x, 0x33 * 256.0f) << "the distance fog follows later";
  Java_ja_JA(env, peer, -20, 0x0A, 7, 9);
  EXPECT_TRUE(kit().fog_colour == 0x0A && kit().underwater_scale == -1.0f / 7 && kit().underwater_height_f == -20);
  Java_ja_O(env, peer);
  EXPECT_TRUE(!kit().underwater && kit().fog_colour == 0x112233);

  Java_ja_M(env, peer, 1, 0xAAAA, 1, 0);
  Java_ja_M(env, peer, 1, 0xBBBB, 1, 0);
  Java_ja_O(env, peer);
  EXPECT_EQ(kit().fog_colour, 0xAAAAu) << "the second start saved the water's own colour";
}

TEST_F(SceneTest, BadArraysRaiseAndChangeNothing) {
  const auto before = record();
  const auto ints = [this](std::size_t n) { return java.new_ints(std::vector<jint>(n)); };
  const auto floats = [this](std::size_t n) { return java.new_floats(Numbers(n)); };
  for (const auto native : {&Java_ja_AA, &Java_ja_wa}) {
    expect_raised(null_pointer, {[&] { native(env, peer, nullptr); }});
    expect_raised(out_of_bounds + "matrix: length 15, 16 needed", {[&] { native(env, peer, floats(15)); }});
    expect_raised(out_of_bounds + "matrix: length 17, 16 needed", {[&] { native(env, peer, floats(17)); }});
  }
  expect_raised(null_pointer, {[&] { Java_ja_Q(env, peer, 1, nullptr, floats(1)); },
                               [&] { Java_ja_Q(env, peer, 1, ints(5), nullptr); }});
  expect_raised(out_of_bounds + "lights: length 14, 15 needed",
                {[&] { Java_ja_Q(env, peer, 3, ints(14), floats(3)); }});
  expect_raised(out_of_bounds + "strengths: length 3, 4 needed",
                {[&] { Java_ja_Q(env, peer, 9, ints(20), floats(3)); }});
  EXPECT_EQ(record(), before);
}
