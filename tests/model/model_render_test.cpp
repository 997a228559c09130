// Drawn models against the slow reference, whole targets; then what happens around a draw.
#include <algorithm>
#include <set>

#include "maths/Matrix.h"
#include "model/mesh_fixture.h"
#include "reference/comparison.h"
#include "support/allocation_failure.h"
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
    const float turn = r.one_in(3) ? 0 : r.real(-0.1f, 0.1f), tilt = turn == 0 ? 0 : r.real(-0.1f, 0.1f);
    Java_ja_AA(env, peer, java.new_floats(placed(turn, tilt, 1, r.real(-9, 9), 5, 0)));
    Java_ja_c(env, peer, colour_word(), r.one_in(3) ? 0 : r.between(1, 1700));
    perspective(50, 1500);
    Java_ja_IA(env, peer, r.one_in(30) ? NAN : r.one_in(20) ? r.real(-1e6f, 1e6f) : r.real(0.3f, 1.3f));
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
    // With vertices beside the eye and, with a level camera, at no distance at all.
    if (r.one_in(8)) return placed(0, 0, 1, r.real(-300, 300), r.real(-220, 220), r.between(-100, 100));
    const float turn = r.real(0, 6.3f), tilt = r.one_in(3) ? r.real(-0.4f, 0.4f) : 0;
    return placed(turn, tilt, r.real(0.5f, 1.5f), r.real(-300, 300), r.real(-220, 220),
                  r.one_in(5) ? r.real(-300, 1900) : r.real(200, 700));
  }

  void random_target(test_random& r, bool with_colour = true, bool with_depth = true) {
    make_target(width, height, with_colour, with_depth);
    std::generate_n(colour.data(), colour.elements(), [&r] { return r.word(); });
    std::generate_n(depth.data(), depth.elements(),
                    [&r] { return r.one_in(3) ? r.real(0.7f, 1) : Rasterizer_n::far_depth; });
  }

  // Invalidates what a draw computes, and shares some normals with a neighbour.
  static void change_geometry(test_random& r, model& m, oracle::Model& o) {
    m.geometrychanged();
    m.vsharednormal = sharedarray<Vector4_s>::allocate(*m.pool, static_cast<unsigned>(m.meshvertexcount));
    o.vnormal.clear(), o.fnormal.clear(), o.vsharednormal.clear(), o.boundsvalid = false;
    for (int i = 0; i < m.meshvertexcount; ++i) {
      const Vector4_s normal = {r.real(-2, 2), r.real(-2, 2), r.real(-2, 2), static_cast<float>(r.between(0, 3))};
      o.vsharednormal.push_back(m.vsharednormal[i] = normal);
    }
  }
};

// Bit for bit: the reference adds its floats in the library's order and asks the same processor for its estimates. A
// library that adds in another order moves an edge by a pixel or a colour by a step, and this test will say so.
TEST_F(ModelRenderTest, AllVariantsDrawTheReferencesFrames) {
  test_random r(3);
  std::set<int> seen;
  int culled = 0;
  std::vector<std::uint32_t> hashes;
  for (int n = 0; n < 700; ++n) {
    SCOPED_TRACE(n);
    const Mesh mesh = random_mesh(r, drawn_mesh);
    const jobject object = build(mesh);
    ASSERT_EQ(java.take_exception(), "");
    oracle::Model o(mesh);
    model& m = get(object);
    const bool with_colour = !r.one_in(4), with_depth = !with_colour || !r.one_in(3);
    for (int again = 0; again < 3 && !HasFailure(); ++again) {
      Java_ja_Y(env, peer, r.between(0, 128000));  // textures scroll
      random_state(r);
      random_target(r, with_colour, with_depth);
      const std::uint32_t blank_colour = hash_of(colour), blank_depth = hash_of(depth);
      std::vector<unsigned int> slow_colour = colour.copy();
      std::vector<float> slow_depth = depth.copy();
      if (again == 1 && r.one_in(3)) m.hasalpha = o.hasalpha = false;
      if (again == 2) change_geometry(r, m, o);

      const Numbers world = random_place(r);
      const jintArray result = again == 0 ? nullptr : java.new_ints(std::vector<jint>(7, -77));
      std::vector<jint> expected_result(7, -77);
      const int drawn_before = model::modelcount;
      refused.clear();
      draw(object, world, result);
      ASSERT_EQ(java.take_exception(), "");
      const std::vector<int> asked = std::exchange(refused, {});

      Rasterizer_n::m_pColourBuffer = with_colour ? slow_colour.data() : nullptr;
      Rasterizer_n::m_pDepthBuffer = with_depth ? slow_depth.data() : nullptr;
      const int variant = o.render(matrix(world), result != nullptr ? expected_result.data() : nullptr);
      EXPECT_TRUE(same_image(colour, slow_colour.data())) << "colour, variant " << variant;
      EXPECT_TRUE(same_image(depth, slow_depth.data())) << "depth, variant " << variant;
      EXPECT_EQ(refused, asked) << "other textures were asked for, or in another order";
      EXPECT_EQ(model::modelcount - drawn_before, variant >= 0);
      EXPECT_EQ(m.hasalpha, o.hasalpha);
      EXPECT_TRUE(result == nullptr || java.ints(result) == expected_result);
      culled += variant < 0;
      if (hash_of(colour) != blank_colour || hash_of(depth) != blank_depth) seen.insert(variant);
      hashes.insert(hashes.end(), {hash_of(colour), hash_of(depth)});
    }
    if (HasFailure()) return;
    Java_h_ma(env, object);
  }
  EXPECT_GT(culled, 50);
  EXPECT_EQ(seen.size(), 24u) << "16 with a colour target, and 8 of the depth alone, leave something in some frame";
  frame_record::add("models.all_variants", hashes.data(), hashes.size());
}

// A texture that is asked for in the middle of a draw: the client builds models and drops others before it answers,
// and every block moves.
TEST_F(ModelRenderTest, RequestsInsideADrawMayMoveAndCloseModels) {
  int requests = 0;
  for (int round = 0; round < 60; ++round) {
    std::vector<unsigned int> frames[2];
    for (const bool disturbed : {true, false}) {
      test_random r(static_cast<std::uint64_t>(100 + round));
      const jobject other = build(random_mesh(r, drawn_mesh)), object = build(random_mesh(r, drawn_mesh));
      random_state(r);
      random_target(r);
      if (disturbed) {
        inside_request = [&] {
          ++requests;
          if (java.nativeid(other) != 0) Java_h_ma(env, other);
          build_into(other, random_mesh(r, drawn_mesh));
          pool().defragment();
        };
      }
      for (int i = 0; i < 2; ++i) draw(object, placed(static_cast<float>(round), 0, 1, 0, 0, 350));
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
    Mesh mesh = random_mesh(r, drawn_mesh);
    for (std::size_t f = 0; mesh.ftex && f < mesh.ftex->size(); ++f) {
      if ((*mesh.ftex)[f] % undelivered == 0) (*mesh.ftex)[f] = 1;
    }
    meshes.push_back(build(mesh));
  }
  random_state(r);
  const Matrix_c world = matrix(placed(1, 0.2f, 1, 0, 0, 400));
  auto& resource = *native<threadresource>(resource_peer);
  copied_jintArray no_result(env, nullptr);
  const auto allocations_of_a_frame = [&] {
    random_target(r);
    const unsigned long before = allocation_failure::count();
    for (jobject mesh : meshes) get(mesh).render(resource, world, no_result);
    return allocation_failure::count() - before;
  };
  EXPECT_GT(allocations_of_a_frame(), 0u);
  EXPECT_EQ(allocations_of_a_frame(), 0u);
  for (jobject mesh : meshes) Java_h_ma(env, mesh);
}

// Memory that runs out at any allocation of a build or of a first draw: nothing is lost, and the next draw is whole.
TEST_F(ModelRenderTest, ShortPoolsLoseNothing) {
  test_random r(16);
  Mesh mesh;
  do mesh = random_mesh(r, drawn_mesh);
  while (mesh.inputfacecount < 30 || !mesh.ftype || !mesh.falpha || mesh.mappingcount > 0);
  const Numbers world = placed(2, 0, 1, 0, 0, 350);
  const auto drawn = [&](jobject object) {
    test_random state(5);
    random_state(state);
    random_target(state);
    draw(object, world);
    return colour.copy();
  };
  const jobject object = build(mesh);
  drawn(object);  // fetches the textures
  const auto expected = drawn(object);
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
      ASSERT_EQ(drawn(object), expected);
      Java_h_ma(env, object);
    }
    ASSERT_EQ(Java_ja_za(env, peer), 0);
  }
  EXPECT_GT(builds, 20);
  EXPECT_GT(draws, 5);
}

TEST_F(ModelRenderTest, Quirks) {
  Mesh mesh = triangle();
  mesh.ftype = {{1}};
  perspective(50, 1500);
  Java_ja_IA(env, peer, -50);
  const jobject object = build(mesh);
  EXPECT_EQ(Java_h_RA(env, object), 65531) << "negative bounds arrive as 16 bits";
  const auto largest_of_a_draw = [&](float y, float z, jintArray result) {
    make_target(width, height);
    depth.fill(1);
    draw(object, placed(0, 0, 1, 0, y, z), result);
    return *std::max_element(colour.data(), colour.data() + colour.elements());
  };
  EXPECT_EQ(largest_of_a_draw(0, 300, nullptr), 0xFF040404u) << "no light leaves less than 4";
  const jintArray result = java.new_ints({1, 2, 3, 4, 5, 6});
  EXPECT_EQ(largest_of_a_draw(0, -600, result), 0u);
  EXPECT_EQ(java.ints(result), (std::vector<jint>{1, 2, 3, 4, 5, 6})) << "a culled model leaves the array alone";
  Java_ja_M(env, peer, 60, 0xFFFFFF, 120, 0);
  EXPECT_NE(largest_of_a_draw(-1, 300, nullptr), 0u);
  EXPECT_EQ(largest_of_a_draw(0, 300, nullptr), 0u) << "wholly in the fog at one corner: gone, though others are clear";
  Java_h_ma(env, object);
}

TEST_F(ModelRenderTest, ModelsOfAPoolThatIsGone) {
  test_random r(4);
  const jobject object = build(random_mesh(r, drawn_mesh));
  random_target(r);
  const auto frame = colour.copy();
  Java_ba_ma(env, pool_peer);
  if (VELMARK5_CHECKS) {
    expect_raised("java.lang.IllegalStateException: model: its pool is gone",
                  {[&] { draw(object, placed(0, 0, 1, 0, 0, 400)); }, [&] { Java_h_N(env, object); }});
    EXPECT_TRUE(same_image(colour, frame.data()));
  }
  Java_h_ma(env, object);
  EXPECT_EQ(java.take_exception(), "");
  EXPECT_EQ(java.nativeid(object), 0);
  EXPECT_EQ(Java_ja_za(env, peer), 0);
}

}  // namespace
