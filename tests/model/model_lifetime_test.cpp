// What happens to models when what they need goes, or is about to go, in an order that no client should choose: nothing
// is read or written that is gone. The address sanitizer sees what these tests cannot.
#include <algorithm>
#include <functional>
#include <string>

#include "model/mesh_fixture.h"
#include "raster/Sprite.h"
#include "util/memorymanager/allocatedmemory.h"

namespace {

class ModelLifetimeTest : public mesh_fixture {
 protected:
  static constexpr int width = 96, height = 64;
  const Numbers in_front = placed(0, 0, 1, 0, 0, 300);

  // Its first draw asks for its texture.
  jobject textured_triangle() {
    Mesh mesh = triangle();
    mesh.functionmask = FM_SHARELIGHT;
    mesh.ftex = {{textures - 2}};
    const jobject object = build(mesh);
    EXPECT_EQ(java.take_exception(), "");
    return object;
  }
  void use_camera() {
    Java_ja_ba(env, peer, 3, 0);
    Java_ja_GA(env, peer, 0, 1);
    perspective(50, 1500);
  }
  static bool seen(const unsigned int* pixels) {
    return std::any_of(pixels, pixels + width * height, [](unsigned int p) { return p != 0; });
  }
  // No allocation fits while it lives.
  sharedarray<unsigned char> fill_pool(unsigned int room = 0) {
    return sharedarray<unsigned char>::allocate(pool(), pool().get_free_space() - room);
  }
};

TEST_F(ModelLifetimeTest, ToolkitsThatAreGone) {
  const jobject mesh = textured_triangle();
  Java_ja_ma(env, peer);
  if (VELMARK5_CHECKS) {
    expect_raised("java.lang.NullPointerException", {[&] { draw(mesh, in_front); }, [&] { Java_h_KA(env, mesh, 0); }});
  }

  // Another toolkit, which knows fewer textures: the model has none there. Its pool can still grow.
  Java_ja_q(env, peer, nullptr, 0);
  make_target(width, height);
  use_camera();
  const auto filler = fill_pool();
  EXPECT_EQ(raised([&] { draw(mesh, in_front); }), "");
  EXPECT_TRUE(seen(colour.data()));
  Java_h_ma(env, mesh);
}

// Callbacks may do much in the middle of a draw, but not take away what it needs.
TEST_F(ModelLifetimeTest, DrawsKeepWhatTheyUse) {
  if (!VELMARK5_CHECKS) GTEST_SKIP();
  const jobject mesh = textured_triangle(), other = textured_triangle();
  const jobject resource = java.new_object("a"), sprite = java.new_object("fa"), zbuffer = java.new_object("oa");
  Java_a_ha(env, resource, 0, 0, 0, 0, 0);
  Java_fa_UA(env, sprite, 0, width, height);
  Java_oa_g(env, zbuffer, width, height);
  Java_ja_d(env, peer, java.nativeid(sprite), java.nativeid(zbuffer));
  use_camera();

  const auto draw_by = [&](jobject scratch, jobject drawn) {
    Java_a_wa(env, scratch, java.nativeid(scratch), drawn, java.new_floats(in_front), nullptr);
  };
  const std::pair<std::string, std::function<void()>> attempts[] = {
      {"model", [&] { Java_h_ma(env, mesh); }},
      {"model", [&] { Java_h_KA(env, mesh, 0); }},
      {"model", [&] { draw_by(resource, mesh); }},
      {"resource", [&] { draw_by(resource_peer, other); }},
      {"resource", [&] { Java_a_R(env, resource_peer, java.nativeid(resource_peer)); }},
      {"pool", [&] { Java_ba_ma(env, pool_peer); }},
      {"pool", [&] { Java_ba_ha(env, pool_peer); }},
      {"target", [&] { Java_ja_PA(env, peer, nullptr); }},
      {"target", [&] { Java_ja_d(env, peer, 0, java.nativeid(zbuffer)); }},
      {"target", [&] { Java_fa_M(env, sprite, java.nativeid(sprite)); }},
      {"target", [&] { Java_oa_za(env, zbuffer, java.nativeid(zbuffer)); }},
      {"toolkit", [&] { Java_ja_ma(env, peer); }},
  };
  int callbacks = 0;
  const auto attempt_all = [&] {
    ++callbacks;
    for (const auto& [name, attempt] : attempts) {
      expect_raised("java.lang.IllegalStateException: " + name + ": it is in ", {attempt});
    }
  };
  // The draw's first light needs memory, then its face a texture.
  auto filler = fill_pool();
  java.garbagecollect = [&] { attempt_all(), filler = {}; };
  inside_request = attempt_all;
  EXPECT_EQ(raised([&] { draw(mesh, in_front); }), "");
  EXPECT_EQ(callbacks, 2);
  EXPECT_TRUE(seen(native<Sprite_c>(sprite)->pixels));

  // Afterwards all of it goes.
  inside_request = nullptr;
  draw_by(resource, other);
  for (const jobject model : {mesh, other}) Java_h_ma(env, model);
  Java_a_R(env, resource, java.nativeid(resource));
  Java_fa_M(env, sprite, java.nativeid(sprite));
  Java_oa_za(env, zbuffer, java.nativeid(zbuffer));
}

TEST_F(ModelLifetimeTest, CollectionsThatThrowLeaveNoModel) {
  Mesh mesh = triangle();
  mesh.vmask = {{1, 2, 3}}, mesh.pslist = {{0}}, mesh.facelabels = {{3}}, mesh.functionmask = FM_ANIMATE_COLOUR;
  java.garbagecollect = [&] { java.raise("java/lang/IllegalStateException", "from h"); };
  for (const unsigned int room : {0u, 50u, 100u}) {
    const auto filler = fill_pool(room);
    const int before = allocatedmemory::allocated_size;
    const jobject object = build(mesh);
    EXPECT_EQ(java.take_exception(), "java.lang.IllegalStateException: from h");
    EXPECT_EQ(java.nativeid(object), 0);
    EXPECT_EQ(allocatedmemory::allocated_size, before);
  }
}

}  // namespace
