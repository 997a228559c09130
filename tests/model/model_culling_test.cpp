// Vertices and faces four at a time: as each alone.
#include "model/model_culling.h"

#include <cstring>
#include <limits>
#include <memory>
#include <vector>

#include "raster/Projection.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

class model_culling_test : public toolkit_fixture {};

// Inside the view, at its edges, far beyond what 16 bits hold, behind the eye, and on it.
float coordinate(test_random& r) {
  if (r.one_in(60)) return 0;
  if (r.one_in(200)) return std::numeric_limits<float>::infinity();
  return r.one_in(4) ? r.real(-3e6f, 3e6f) : r.real(-60, 60);
}

TEST_F(model_culling_test, four_at_once_as_each_alone) {
  test_random r(12);
  const auto alone = std::make_unique<threadresource>(kit(), 0, 0);
  const auto grouped = std::make_unique<threadresource>(kit(), 0, 0);
  int shown = 0, hidden = 0, wholly_within = 0;
  for (int round = 0; round < 3000; ++round) {
    SCOPED_TRACE(round);
    Rasterizer_n::SetViewport({r.between(-9, 9), r.between(-9, 9), r.between(1, 200), r.between(1, 200), 0, 1});
    Matrix_c m;
    for (Vector4_s& row : m.rows) row = {r.real(-1, 1), r.real(-1, 1), r.real(-1, 1), r.real(-1, 1)};
    const bool tame = r.one_in(3);
    if (tame) m = {{{0.01f, 0, 0, 0}, {0, 0.01f, 0, 0}, {0, 0, 0.01f, 0}, {0, 0, 0, 1}}};
    const int count = r.between(1, 40);
    std::vector<Vector4_s> positions;
    for (int i = 0; i < count; ++i) {
      positions.push_back(tame ? Vector4_s{r.real(-60, 60), r.real(-60, 60), r.real(-60, 60), r.real(-1, 1)}
                               : Vector4_s{coordinate(r), coordinate(r), coordinate(r), r.real(-1, 1)});
    }
    const auto summary = culling::project(positions.data(), count, m, *grouped);
    int any = 0, all = 255;
    for (int i = 0; i < count; ++i) {
      const Vector4_s& p = positions[static_cast<std::size_t>(i)];
      const SSEMath::Float4 screen = Rasterizer_n::ToScreen(Rasterizer_n::Transform(m, p.x, p.y, p.z));
      SSEMath::store(&alone->vertices[i].x, SSEMath::shuffle<0, 1, 2, 2>(screen));
      const int flags = Rasterizer_n::CullFlags(Rasterizer_n::PackForCulling<false>(screen));
      ASSERT_EQ(grouped->vertex_flags[i], flags) << i;
      any |= flags;
      all &= flags;
      ASSERT_EQ(std::memcmp(&grouped->vertices[i], &alone->vertices[i], sizeof(Vector4_s)), 0) << i;
    }
    ASSERT_EQ(summary.any, any);
    ASSERT_EQ(summary.all, all);
    wholly_within += any == all && all == Rasterizer_n::CullFlagsVisible;

    const int faces = r.between(1, 100);
    std::vector<unsigned short> corner[3];
    for (auto& numbers : corner) {
      for (int f = 0; f < faces; ++f) numbers.push_back(static_cast<unsigned short>(r.between(0, count - 1)));
    }
    culling::face_set visible;
    culling::find_visible({corner[0].data(), corner[1].data(), corner[2].data()}, faces, *grouped, summary, visible);
    for (int f = 0; f < faces; ++f) {
      int flags = 255;
      const Vector4_s* at[3];
      for (std::size_t k = 0; k < 3; ++k) {
        const unsigned short v = corner[k][static_cast<std::size_t>(f)];
        flags &= grouped->vertex_flags[v];
        at[k] = &grouped->vertices[v];
      }
      const bool expected =
          flags == Rasterizer_n::CullFlagsVisible && Rasterizer_n::FacesViewer(*at[0], *at[1], *at[2]);
      ASSERT_EQ(visible.contains(f), expected) << f;
      ++(expected ? shown : hidden);
    }
    ASSERT_EQ(visible.word_of(faces - 1) >> ((faces - 1) % 32) >> 1, 0u) << "faces that do not exist";
  }
  EXPECT_GT(shown, 10000);
  EXPECT_GT(hidden, 10000);
  EXPECT_GT(wholly_within, 100);
}

}  // namespace
