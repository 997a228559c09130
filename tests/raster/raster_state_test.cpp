// The raster stage's process-wide state.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>

#include "raster/Rasterizer.h"
#include "support/frame_record.h"
#include "support/random.h"

namespace {

using namespace Rasterizer_n;

bool is(const Vector4_s& v, float x, float y, float z, float w) { return v.x == x && v.y == y && v.z == z && v.w == w; }

TEST(raster_state, a_viewport_gives_scale_offset_and_bounds) {
  SetViewport({0, 0, 640, 480, 0, 1});
  EXPECT_TRUE(is(m_ViewportMul, 320, 240, 0.5f, 1));
  EXPECT_TRUE(is(m_ViewportAdd, 320, 240, 0.5f, 0));
  const auto lanes = [] { return std::vector<std::int16_t>(m_TriangleCuller.lanes, m_TriangleCuller.lanes + 8); };
  EXPECT_EQ(lanes(), (std::vector<std::int16_t>{640, 480, 32767, 0, 0, 0, 0, 0}));

  SetViewport({100, -7, 301, 55, 0.25f, 0.75f});
  EXPECT_TRUE(is(m_ViewportMul, 150.5f, 27.5f, 0.25f, 1));
  EXPECT_TRUE(is(m_ViewportAdd, 250.5f, 20.5f, 0.5f, 0));
  EXPECT_EQ(lanes(), (std::vector<std::int16_t>{401, 48, 24575, 8191, 100, -7, 0, 0}));
  EXPECT_TRUE(GetViewport()->x == 100 && GetViewport()->zmax == 0.75f);

  // Low halves of what does not fit; a depth that no integer holds becomes the integer 0x80000000.
  SetViewport({0x12345, 70000, 0x10000, 0x7FFFFFFF, -1, 1e9f});
  EXPECT_EQ(lanes(), (std::vector<std::int16_t>{0x2345, 70000 - 65536 - 1, 0, -32767, 0x2345, 70000 - 65536, 0, 0}));

  m_TriangleCuller = {};
  const std::vector<std::int16_t> before = (SetViewport({1, 2, 3, 4, 0.5f, 1}), lanes());
  m_TriangleCuller = {};
  RecomputeCuller();
  EXPECT_EQ(lanes(), before);
  SetViewport({});
}

TEST(raster_state, distance_fog) {
  RecomputeDistanceFogParams(0.5f, 0x80FF4001);
  EXPECT_TRUE(m_DistanceFogStart == 0.5f && m_InvDistanceFogRange == 2);
  EXPECT_TRUE(is(m_DistanceFogColour, 0x0100, 0x4000, 0xFF00, 0x8000));
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
}

TEST(raster_state, clip_rectangle_and_far_depth) {
  SetCliprect({1, -2, 3, 4});
  EXPECT_TRUE(GetCliprect()->x == 1 && GetCliprect()->y == -2 && GetCliprect()->width == 3 &&
              GetCliprect()->height == 4);
  SetCliprect({});
  EXPECT_EQ(static_cast<double>(far_depth), 3.3999999521443642e38);
}

}  // namespace
