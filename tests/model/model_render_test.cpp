// Drawn models against the slow reference, whole targets; then what happens around a draw.
#include <algorithm>
#include <bit>
#include <cstdio>
#include <set>

#include "maths/Matrix.h"
#include "model/mesh_fixture.h"
#include "support/allocation_failure.h"
#include "support/frame_record.h"
#include "toolkit/threadresource.h"

namespace {

class ModelRenderTest : public mesh_fixture {
 protected:
  static constexpr int width = 96, height = 64;

  static Matrix_c matrix(const Numbers& numbers) {
    Matrix_c m;
    std::copy(numbers.begin(), numbers.end(), &m.rows[0].x);
    return m;
  }

  // Camera, sun, fogs and lights: near and far are 50 and 1500.
  void random_state(test_random& r) {
    const auto colour_word = [&r] { return static_cast<jint>(r.word()); };
    Java_ja_GA(env, peer, 0, 1);
    Java_ja_AA(env, peer, java.new_floats(placed(r.real(-0.1f, 0.1f), r.real(-0.1f, 0.1f), 1, r.real(-9, 9), 5, 0)));
    Java_ja_c(env, peer, colour_word(), r.one_in(3) ? 0 : r.between(1, 1700));
    perspective(50, 1500);
    Java_ja_IA(env, peer, r.real(0.3f, 1.3f));
    Java_ja_m(env, peer, colour_word(), r.real(-0.5f, 1.5f), r.real(-0.5f, 1.5f), r.real(-1, 1), r.real(-1, 1), 0.2f);
    Java_ja_O(env, peer);
    if (r.one_in(2)) Java_ja_M(env, peer, r.between(-250, 250), colour_word(), r.between(60, 900), 0);
    const int lights = r.one_in(2) ? 0 : r.between(1, 4);
    std::vector<jint> numbers;
    for (int i = 0; i < lights; ++i) {
      for (int axis : {0, 0, 400}) numbers.push_back(axis + r.between(-200, 200));
      numbers.push_back(r.between(20, 400));
      numbers.push_back(r.one_in(2) ? colour_word() & 0xFFFFFF : colour_word());
    }
    Java_ja_Q(env, peer, lights, java.new_ints(numbers), java.new_floats({r.real(0, 2), 1, 0.3f, 0.7f}));
  }

  static Numbers random_place(test_random& r) {
    const float turn = r.real(0, 6.3f), tilt = r.one_in(3) ? r.real(-0.4f, 0.4f) : 0;
    return placed(turn, tilt, r.real(0.5f, 1.5f), r.real(-300, 300), r.real(-220, 220),
                  r.one_in(5) ? r.real(-300, 1900) : r.real(200, 700));
  }

  void random_target(test_random& r, bool with_colour, bool with_depth) {
    make_target(width, height, with_colour, with_depth);
    for (std::size_t i = 0; i < colour.elements(); ++i) colour.data()[i] = r.word();
    for (std::size_t i = 0; i < depth.elements(); ++i) {
      depth.data()[i] = r.one_in(3) ? r.real(0.7f, 1) : Rasterizer_n::far_depth;
    }
  }
};

struct difference {
  int pixels = 0, depths = 0;  // that are not the same
  int most = 0;                // on any channel
  void of(const std::vector<unsigned int>& a, const std::vector<unsigned int>& b) {
    for (std::size_t i = 0; i < a.size(); ++i) {
      pixels += a[i] != b[i];
      for (int c = 0; c < 32; c += 8) {
        most = std::max(most, std::abs(static_cast<int>(a[i] >> c & 0xFF) - static_cast<int>(b[i] >> c & 0xFF)));
      }
    }
  }
};

}  // namespace

// Bit for bit: the reference adds its floats in the library's order and asks the same processor for its estimates. A
// library that adds in another order moves an edge by a pixel or a colour by a step, and this test will say so.
TEST_F(ModelRenderTest, AllVariantsDrawTheReferencesFrames) {
  test_random r(3);
  std::set<int> drawn, seen;
  int culled = 0;
  std::uint64_t hash = 0;
  for (int n = 0; n < 700; ++n) {
    SCOPED_TRACE(n);
    const Mesh mesh = random_mesh(r, true);
    const jobject object = build(mesh);
    ASSERT_EQ(java.take_exception(), "");
    oracle::Model o(mesh);
    model& m = get(object);
    const int target = r.between(1, 4);
    for (int again = 0; again < 3; ++again) {
      random_state(r);
      random_target(r, target != 1, target != 2);
      auto slow_colour = guarded_image<unsigned int>(colour.width, colour.height);
      auto slow_depth = guarded_image<float>(depth.width, depth.height);
      std::copy_n(colour.data(), colour.elements(), slow_colour.data());
      std::copy_n(depth.data(), depth.elements(), slow_depth.data());
      const auto before = colour.copy();
      const auto depth_before = depth.copy();
      if (again == 2) {
        // Normals that went are computed by the draw; some are shared with a neighbour.
        m.geometrychanged();
        m.vsharednormal = sharedarray<Vector4_s>::allocate(*m.pool, static_cast<unsigned>(m.meshvertexcount));
        o.vnormal.clear(), o.fnormal.clear(), o.vsharednormal.clear(), o.boundsvalid = false;
        for (int i = 0; i < m.meshvertexcount; ++i) {
          const Vector4_s normal = {r.real(-2, 2), r.real(-2, 2), r.real(-2, 2), static_cast<float>(r.between(0, 3))};
          o.vsharednormal.push_back(m.vsharednormal[i] = normal);
        }
      }

      const Numbers world = random_place(r);
      const jintArray result = again == 0 ? nullptr : java.new_ints(std::vector<jint>(7, -77));
      std::vector<jint> expected_result(7, -77);
      const int drawn_before = model::modelcount;
      refused.clear();
      draw(object, world, result);
      ASSERT_EQ(java.take_exception(), "");
      std::vector<int> asked;
      asked.swap(refused);

      Rasterizer_n::m_pColourBuffer = target != 1 ? slow_colour.data() : nullptr;
      Rasterizer_n::m_pDepthBuffer = target != 2 ? slow_depth.data() : nullptr;
      const int variant = o.render(matrix(world), result != nullptr ? expected_result.data() : nullptr);
      EXPECT_EQ(refused, asked) << "other textures were asked for, or in another order";
      ASSERT_EQ(model::modelcount - drawn_before, variant >= 0);
      EXPECT_EQ(m.hasalpha, o.hasalpha);
      EXPECT_TRUE(result == nullptr || java.ints(result) == expected_result);
      difference d;
      d.of(colour.copy(), slow_colour.copy());
      for (std::size_t i = 0; i < depth.elements(); ++i) {
        const bool same = std::bit_cast<int>(depth.data()[i]) == std::bit_cast<int>(slow_depth.data()[i]);
        if (!same) ++d.depths;
      }
      EXPECT_EQ(d.pixels, 0) << "most " << d.most << " variant " << variant;
      EXPECT_EQ(d.depths, 0) << " variant " << variant;
      if (variant < 0) {
        ++culled;
      } else {
        drawn.insert(variant);
        if (colour.copy() != before || depth.copy() != depth_before) seen.insert(variant);
      }
      hash = hash * 31 + frame_record::hash(colour.data(), 4 * colour.elements());
      hash = hash * 31 + frame_record::hash(depth.data(), 4 * depth.elements());
      if (HasFailure()) return;
    }
    Java_h_ma(env, object);
  }
  EXPECT_GT(culled, 50);
  // 16 with a colour target, and 8 of the depth alone: all of them left something in some frame.
  EXPECT_EQ(drawn.size(), 24u);
  EXPECT_EQ(seen, drawn);
  const unsigned int words[] = {static_cast<unsigned>(hash), static_cast<unsigned>(hash >> 32)};
  frame_record::add("models.all_variants", words, 2);
}

// A texture that is asked for in the middle of a draw: the client builds models and drops others before it answers,
// and every block moves.
TEST_F(ModelRenderTest, RequestsInsideADrawMayMoveAndCloseModels) {
  int requests = 0;
  for (int round = 0; round < 60; ++round) {
    std::vector<unsigned int> frames[2];
    for (const bool disturbed : {true, false}) {
      test_random r(static_cast<std::uint64_t>(100 + round));
      jobject other = build(random_mesh(r, true));
      const jobject object = build(random_mesh(r, true));
      random_state(r);
      random_target(r, true, true);
      if (disturbed) {
        inside_request = [&] {
          ++requests;
          if (java.nativeid(other) != 0) Java_h_ma(env, other);
          build_into(other, random_mesh(r, true));
          pool().defragment();
        };
      }
      draw(object, placed(static_cast<float>(round), 0, 1, 0, 0, 350));
      draw(object, placed(static_cast<float>(round), 0, 1, 0, 0, 350));
      inside_request = nullptr;
      EXPECT_EQ(java.take_exception(), "");
      frames[disturbed] = colour.copy();
      Java_h_ma(env, object);
      Java_h_ma(env, other);
    }
    ASSERT_EQ(frames[0], frames[1]) << round;
  }
  EXPECT_GT(requests, 100);
}

TEST_F(ModelRenderTest, SteadyFramesAllocateNothing) {
  test_random r(9);
  std::vector<jobject> meshes;
  for (int i = 0; i < 30; ++i) {
    Mesh mesh = random_mesh(r, true);
    if (mesh.ftex)
      std::replace_if(
          mesh.ftex->begin(), mesh.ftex->end(), [](int id) { return id % undelivered == 0; }, 1);
    meshes.push_back(build(mesh));
  }
  random_state(r);
  random_target(r, true, true);
  const Matrix_c world = matrix(placed(1, 0.2f, 1, 0, 0, 400));
  auto& resource = *native<threadresource>(resource_peer);
  copied_jintArray no_result(env, nullptr);
  const auto frame = [&] {
    for (jobject mesh : meshes) get(mesh).render(resource, world, no_result);
    return allocation_failure::count();
  };
  const unsigned long first = frame();
  EXPECT_GT(first, 0u);
  random_target(r, true, true);
  const unsigned long before = allocation_failure::count();
  EXPECT_EQ(frame(), before);
  for (jobject mesh : meshes) Java_h_ma(env, mesh);
}

// Memory that runs out at any allocation of a build or of a first draw: nothing is lost, and the next draw is whole.
TEST_F(ModelRenderTest, ShortPoolsLoseNothing) {
  test_random r(16);
  Mesh mesh = random_mesh(r, true);
  while (mesh.inputfacecount < 30 || !mesh.ftype || !mesh.falpha || mesh.mappingcount > 0) mesh = random_mesh(r, true);
  const auto new_target = [this] {
    test_random state(5);
    random_state(state);
    random_target(state, true, true);
  };
  const Numbers world = placed(2, 0, 1, 0, 0, 350);
  const jobject object = build(mesh);
  draw(object, world);  // fetches the textures
  new_target();
  draw(object, world);
  const auto expected = colour.copy();
  Java_h_ma(env, object);

  int builds = 0, draws = 0;
  for (unsigned int room = 0; room < 9000; room += 16) {
    SCOPED_TRACE(room);
    auto filler = sharedarray<unsigned char>::allocate(pool(), pool_size - room);
    allocation_failure::fail_realloc(true);
    build_into(object, mesh);
    const bool built = java.nativeid(object) != 0;
    if (built) draw(object, world);
    allocation_failure::fail_realloc(false);
    const std::string exception = java.take_exception();
    if (!exception.empty()) {
      EXPECT_EQ(exception.substr(0, 26), "java.lang.OutOfMemoryError");
      ++(built ? draws : builds);
    }
    filler = {};
    if (built) {
      new_target();
      draw(object, world);
      ASSERT_EQ(colour.copy(), expected);
      Java_h_ma(env, object);
    }
    ASSERT_EQ(Java_ja_za(env, peer), 0);
  }
  EXPECT_GT(builds, 20);
  EXPECT_GT(draws, 5);
}

// One triangle that faces the viewer, black and flat.
TEST_F(ModelRenderTest, Quirks) {
  Mesh mesh;
  mesh.vertexcount = mesh.meshvertexcount = 3;
  mesh.position[0] = {{-5, 100, -5}}, mesh.position[1] = {{-60, 60, 60}}, mesh.position[2] = {{0, 0, 0}};
  mesh.inputfacecount = 1;
  mesh.corner[0] = {{0}}, mesh.corner[1] = {{2}}, mesh.corner[2] = {{1}};
  mesh.fhsl = {{0}};
  mesh.ftype = {{1}};
  make_target(width, height);
  perspective(50, 1500);
  Java_ja_IA(env, peer, -50);
  const jobject object = build(mesh);
  EXPECT_EQ(Java_h_RA(env, object), 65531) << "negative bounds arrive as 16 bits";
  const auto largest = [this] {
    const auto pixels = colour.copy();
    return *std::max_element(pixels.begin(), pixels.end());
  };

  depth.fill(1);
  draw(object, placed(0, 0, 1, 0, 0, 300));
  EXPECT_EQ(largest(), 0xFF040404u) << "no light leaves less than 4";

  const jintArray result = java.new_ints({1, 2, 3, 4, 5, 6});
  draw(object, placed(0, 0, 1, 0, 0, -600), result);
  EXPECT_EQ(java.ints(result), (std::vector<jint>{1, 2, 3, 4, 5, 6})) << "a culled model leaves the array alone";

  // Wholly in the fog at one corner: gone, though the others are clear.
  make_target(width, height);
  depth.fill(1);
  Java_ja_M(env, peer, 60, 0xFFFFFF, 120, 0);
  draw(object, placed(0, 0, 1, 0, -1, 300));
  EXPECT_NE(largest(), 0u);
  make_target(width, height);
  depth.fill(1);
  draw(object, placed(0, 0, 1, 0, 0, 300));
  EXPECT_EQ(largest(), 0u);
  Java_h_ma(env, object);
}

TEST_F(ModelRenderTest, ModelsOfAPoolThatIsGone) {
  test_random r(4);
  const jobject object = build(random_mesh(r, true));
  random_target(r, true, true);
  const auto frame = colour.copy();
  Java_ba_ma(env, pool_peer);
  if (VELMARK5_CHECKS) {
    draw(object, placed(0, 0, 1, 0, 0, 400));
    EXPECT_EQ(java.take_exception(), "java.lang.IllegalStateException: model: its pool is gone");
    Java_h_N(env, object);
    EXPECT_EQ(java.take_exception(), "java.lang.IllegalStateException: model: its pool is gone");
    EXPECT_EQ(colour.copy(), frame);
  }
  Java_h_ma(env, object);
  EXPECT_EQ(java.take_exception(), "");
  EXPECT_EQ(java.nativeid(object), 0);
  EXPECT_EQ(Java_ja_za(env, peer), 0);
}
