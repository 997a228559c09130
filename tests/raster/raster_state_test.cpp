// The raster stage's process-wide state.
#include <gtest/gtest.h>

#include <array>
#include <limits>
#include <tuple>

#include "raster/Rasterizer.h"
#include "support/random.h"

namespace {

using namespace Rasterizer_n;

using numbers = std::array<float, 4>;
numbers of(const Vector4_s& v) { return {v.x, v.y, v.z, v.w}; }

TEST(raster_state, a_viewport_gives_scale_offset_and_bounds) {
  const struct {
    Viewport_s viewport;
    numbers scale, offset;
    std::array<std::int16_t, 8> culler;
  } cases[] = {
      {{0, 0, 640, 480, 0, 1}, {320, 240, 0.5f, 1}, {320, 240, 0.5f, 0}, {640, 480, 32767}},
      {{100, -7, 301, 55, 0.25f, 0.75f},
       {150.5f, 27.5f, 0.25f, 1},
       {250.5f, 20.5f, 0.5f, 0},
       {401, 48, 24575, 8191, 100, -7}},
      // Low halves of what does not fit; a depth that no integer holds becomes the integer 0x80000000.
      {{0x12345, 70000, 0x10000, 0x7FFFFFFF, -1, 1e9f},
       {32768, 1073741824, 5e8f, 1},
       {107333, 1073811840, 5e8f, 0},
       {0x2345, 70000 - 65536 - 1, 0, -32767, 0x2345, 70000 - 65536}},
  };
  for (const auto& [viewport, scale, offset, culler] : cases) {
    SetViewport(viewport);
    EXPECT_EQ(of(m_ViewportMul), scale);
    EXPECT_EQ(of(m_ViewportAdd), offset);
    EXPECT_EQ(std::to_array(m_TriangleCuller.lanes), culler);
    m_TriangleCuller = {};
    RecomputeCuller();
    EXPECT_EQ(std::to_array(m_TriangleCuller.lanes), culler);
    EXPECT_TRUE(GetViewport()->x == viewport.x && GetViewport()->zmax == viewport.zmax);
  }
  SetViewport({});
}

TEST(raster_state, distance_fog) {
  RecomputeDistanceFogParams(0.5f, 0x80FF4001);
  EXPECT_TRUE(m_DistanceFogStart == 0.5f && m_InvDistanceFogRange == 2);
  EXPECT_EQ(of(m_DistanceFogColour), (numbers{0x0100, 0x4000, 0xFF00, 0x8000}));
  test_random random(51);
  for (int i = 0; i < 1000; ++i) {
    // The difference is exact in extended precision, and the quotient rounds once.
    const float start = random.real(-1, 1);
    RecomputeDistanceFogParams(start, random.word());
    const double range = 1.0 - static_cast<double>(start);
    ASSERT_NEAR(m_InvDistanceFogRange * range, 1.0, 0x1p-24) << start;
  }
  // Nothing guards a fog that begins at the far end.
  RecomputeDistanceFogParams(1, 0);
  EXPECT_EQ(m_InvDistanceFogRange, std::numeric_limits<float>::infinity());
  RecomputeDistanceFogParams(0, 0);
  EXPECT_EQ(static_cast<double>(far_depth), 3.3999999521443642e38);
}

}  // namespace
