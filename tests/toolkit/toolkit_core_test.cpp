// The toolkit's life, its way back into Java, its targets, and the resources of worker threads.
#include <gtest/gtest.h>

#include "support/toolkit_fixture.h"

namespace {

using toolkit_core = toolkit_fixture;

TEST_F(toolkit_core, losing_the_canvas_stops_the_raster_stage_only) {
  make_target(20, 10);
  Java_ja_PA(env, peer, nullptr);
  EXPECT_EQ(Rasterizer_n::m_pColourBuffer, nullptr);
  EXPECT_EQ(Rasterizer_n::m_pDepthBuffer, nullptr);
  EXPECT_EQ(Rasterizer_n::m_ScreenPitch, 0);
  EXPECT_EQ(kit().width, 20);
  EXPECT_EQ(kit().height, 10);
  EXPECT_EQ(kit().colourbuffer, colour.data());
}

}  // namespace
