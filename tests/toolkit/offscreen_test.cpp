// Images as targets, and copies between them and the current target.
#include <cerrno>
#include <climits>
#include <cstring>

#include "raster/DepthBuffer.h"
#include "raster/Sprite.h"
#include "support/allocation_failure.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

class offscreen : public toolkit_fixture {
 public:
  const jobject sprite_peer = java.new_object("fa");
  const jobject depth_peer = java.new_object("oa");

  jlong kit_handle() const { return java.nativeid(peer); }
  jlong sprite_handle() const { return java.nativeid(sprite_peer); }
  jlong depth_handle() const { return java.nativeid(depth_peer); }
  Sprite_c& sprite() const { return *native<Sprite_c>(sprite_peer); }
  DepthBuffer_c& image() const { return *native<DepthBuffer_c>(depth_peer); }

  void make_images(int width, int height, int depth_width, int depth_height) {
    Java_fa_M(env, sprite_peer, sprite_handle());
    Java_oa_za(env, depth_peer, depth_handle());
    Java_fa_UA(env, sprite_peer, 0, width, height);
    Java_oa_g(env, depth_peer, depth_width, depth_height);
    ASSERT_EQ(java.take_exception(), "");
  }

  void TearDown() override {
    Java_fa_M(env, sprite_peer, sprite_handle());
    Java_oa_za(env, depth_peer, depth_handle());
    toolkit_fixture::TearDown();
  }
};

void expect_target(unsigned int* pixels, float* depths, int width, int height, int pitch) {
  const toolkit& t = *toolkit::m_pInstance;
  EXPECT_EQ(t.colourbuffer, pixels);
  EXPECT_EQ(t.depthbuffer, depths);
  EXPECT_EQ(t.width, width);
  EXPECT_EQ(t.height, height);
  int clip[4];
  t.getclipping(clip);
  EXPECT_EQ(std::vector<int>(clip, clip + 4), (std::vector<int>{0, 0, width, height}));
  EXPECT_EQ(Rasterizer_n::m_pColourBuffer, pixels);
  EXPECT_EQ(Rasterizer_n::m_pDepthBuffer, depths);
  EXPECT_EQ(Rasterizer_n::m_ScreenPitch, pitch);
  const auto& viewport = *Rasterizer_n::GetViewport();
  EXPECT_EQ(std::vector<int>({viewport.x, viewport.y, viewport.width, viewport.height}),
            (std::vector<int>{0, 0, width, height}));
  const auto& cliprect = *Rasterizer_n::GetCliprect();
  EXPECT_EQ(std::vector<int>({cliprect.x, cliprect.y, cliprect.width, cliprect.height}),
            (std::vector<int>{0, 0, width, height}));
}

TEST_F(offscreen, every_combination_of_images_as_target) {
  make_images(12, 9, 12, 9);
  Java_ja_GA(env, peer, 0.25f, 0.75f);
  Java_ja_d(env, peer, sprite_handle(), depth_handle());
  expect_target(sprite().pixels, image().depth, 12, 9, 12);
  EXPECT_EQ(Rasterizer_n::GetViewport()->zmin, 0.25f) << "the depth range stays";
  Java_ja_ba(env, peer, 3, 0x55667788);
  EXPECT_EQ(sprite().pixels[107], 0x55667788u);
  EXPECT_EQ(image().depth[107], Rasterizer_n::far_depth);

  Java_ja_d(env, peer, sprite_handle(), 0);
  expect_target(sprite().pixels, nullptr, 12, 9, 12);

  make_images(12, 9, 5, 7);
  Java_ja_d(env, peer, 0, depth_handle());
  expect_target(nullptr, image().depth, 5, 7, 5);
  image().depth[34] = 1;
  Java_ja_ba(env, peer, 3, -1);  // nothing to colour; the depths are cleared
  EXPECT_EQ(image().depth[34], Rasterizer_n::far_depth);

  Java_ja_d(env, peer, 0, 0);
  expect_target(nullptr, nullptr, 5, 7, 0);

  Java_ja_d(env, peer, sprite_handle(), depth_handle());
  EXPECT_EQ(java.take_exception(), "java.lang.IllegalArgumentException: depth: 5x7 does not fit the sprite's 12x9");
}

TEST_F(offscreen, depth_images) {
  Java_oa_g(env, depth_peer, 33, 7);
  EXPECT_EQ(image().width, 33u);
  EXPECT_EQ(image().height, 7u);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(image().depth) % 64, 0u);
  image().Allocate(2, 2);
  EXPECT_EQ(image().width, 2u);
  Java_oa_za(env, depth_peer, depth_handle());
  EXPECT_EQ(depth_handle(), 0);
  Java_oa_za(env, depth_peer, 0);
  for (const auto& [w, h] : {std::pair{-1, 1}, {1, -1}, {1 << 20, 1 << 20}}) {
    Java_oa_g(env, depth_peer, w, h);
    EXPECT_EQ(java.take_exception().rfind("java.lang.IllegalArgumentException: ", 0), 0u);
    EXPECT_EQ(depth_handle(), 0);
  }
  allocation_failure::fail_memalign(1, ENOMEM);
  Java_oa_g(env, depth_peer, 3, 3);
  EXPECT_EQ(java.take_exception(), "java.lang.RuntimeException: Cannot allocate memory");
  EXPECT_EQ(depth_handle(), 0);
}

// Bit copies both ways, of any mixture of buffers; only the value 1 chooses one.
TEST_F(offscreen, copies_move_just_the_rectangle) {
  test_random random(1);
  for (int call = 0; call < 600; ++call) {
    const bool with_colour = !random.one_in(5), with_depth = !random.one_in(5);
    make_target(random.between(1, 20), random.between(1, 15), with_colour, with_depth);
    const int width = random.between(1, 20), height = random.between(1, 15);
    make_images(width, height, width, height);
    const auto fill = [&](void* block, std::size_t words) {
      for (std::size_t i = 0; i < words; ++i) static_cast<std::uint32_t*>(block)[i] = random.word();
    };
    const auto area = static_cast<std::size_t>(width * height);
    fill(colour.data(), colour.elements());
    fill(depth.data(), depth.elements());
    fill(sprite().pixels, area);
    fill(image().depth, area);

    const int w = random.between(0, std::min(kit().width, width)),
              h = random.between(-1, std::min(kit().height, height));
    const int tx = random.between(0, kit().width - w), ty = random.between(0, kit().height - std::max(h, 0));
    const int ix = random.between(0, width - w), iy = random.between(0, height - std::max(h, 0));
    const auto flag = [&] { return static_cast<jboolean>(random.between(0, 2)); };
    const jboolean colour_flag = flag(), depth_flag = flag();
    const bool to_target = random.one_in(2);

    const auto expected_copy = [&](const void* target_block, const void* image_block, bool moved) {
      std::vector<std::uint32_t> onto(to_target ? static_cast<std::size_t>(kit().width * kit().height) : area);
      std::memcpy(onto.data(), to_target ? target_block : image_block, onto.size() * 4);
      for (int i = 0; moved && i < w * std::max(h, 0); ++i) {
        const int in_target = (ty + i / w) * kit().width + tx + i % w, in_image = (iy + i / w) * width + ix + i % w;
        const auto* from = static_cast<const std::uint32_t*>(to_target ? image_block : target_block);
        onto[static_cast<std::size_t>(to_target ? in_target : in_image)] = from[to_target ? in_image : in_target];
      }
      return onto;
    };
    const auto new_colour =
        with_colour ? expected_copy(colour.data(), sprite().pixels, colour_flag == 1) : std::vector<std::uint32_t>();
    const auto new_depth =
        with_depth ? expected_copy(depth.data(), image().depth, depth_flag == 1) : std::vector<std::uint32_t>();
    if (to_target) {
      Java_o_BA(env, nullptr, kit_handle(), sprite_handle(), depth_handle(), ix, iy, w, h, tx, ty, colour_flag,
                depth_flag);
    } else {
      Java_o_AA(env, nullptr, kit_handle(), sprite_handle(), depth_handle(), tx, ty, w, h, ix, iy, colour_flag,
                depth_flag);
    }
    ASSERT_EQ(java.take_exception(), "");
    const void* const colours = to_target ? colour.data() : sprite().pixels;
    const void* const depths = to_target ? depth.data() : image().depth;
    ASSERT_EQ(new_colour.empty() ? 0 : std::memcmp(colours, new_colour.data(), new_colour.size() * 4), 0) << call;
    ASSERT_EQ(new_depth.empty() ? 0 : std::memcmp(depths, new_depth.data(), new_depth.size() * 4), 0) << call;
  }
}

// With colour, depth rows are as long as the sprite's, whatever the depth image's own width is.
TEST_F(offscreen, both_images_share_the_sprites_row_length) {
  make_target(4, 2);
  make_images(3, 2, 4, 2);
  depth.at(2, 1) = 6;
  Java_o_AA(env, nullptr, kit_handle(), sprite_handle(), depth_handle(), 2, 1, 1, 1, 1, 1, 1, 1);
  EXPECT_EQ(image().depth[1 * 3 + 1], 6.0f);
  image().depth[1 * 4 + 1] = 0;
  Java_o_AA(env, nullptr, kit_handle(), sprite_handle(), depth_handle(), 2, 1, 1, 1, 1, 1, 0, 1);
  EXPECT_EQ(image().depth[1 * 4 + 1], 6.0f) << "alone, the depth image has its own";
  make_images(3, 2, 2, 2);
  Java_o_AA(env, nullptr, kit_handle(), sprite_handle(), depth_handle(), 0, 0, 3, 2, 0, 0, 1, 1);
  EXPECT_EQ(java.take_exception().rfind("java.lang.ArrayIndexOutOfBoundsException: depth: ", 0), 0u);
}

TEST_F(offscreen, copies_outside_raise_and_change_nothing) {
  make_target(6, 5);
  make_images(8, 7, 8, 7);
  std::fill_n(sprite().pixels, 56, 7u);
  std::fill_n(image().depth, 56, 7.0f);
  struct rectangle {
    int x, y, w, h, dst_x, dst_y;
  };
  // Legal from the target to the images, but for one number each.
  for (const auto& r : {rectangle{-1, 0, 2, 2, 0, 0},
                        {0, 4, 2, 2, 0, 0},
                        {0, 0, 7, 2, 0, 0},
                        {0, 0, 2, 2, 7, 0},
                        {0, 0, 2, 2, 0, -1},
                        {0, 0, 2, INT_MAX, 0, 0},
                        {INT_MAX, 0, INT_MAX, 1, 0, 0}}) {
    Java_o_AA(env, nullptr, kit_handle(), sprite_handle(), depth_handle(), r.x, r.y, r.w, r.h, r.dst_x, r.dst_y, 1, 1);
    EXPECT_EQ(java.take_exception().rfind("java.lang.IllegalArgumentException: ", 0), 0u);
    Java_o_BA(env, nullptr, kit_handle(), sprite_handle(), depth_handle(), r.dst_x, r.dst_y, r.w, r.h, r.x, r.y, 1, 1);
    EXPECT_EQ(java.take_exception().rfind("java.lang.IllegalArgumentException: ", 0), 0u);
  }
  EXPECT_EQ(colour.copy(), std::vector<unsigned int>(30));
  EXPECT_EQ(depth.copy(), std::vector<float>(30));
  EXPECT_EQ(std::count(sprite().pixels, sprite().pixels + 56, 7u), 56);

  const auto raised = [&] { return java.take_exception() == "java.lang.NullPointerException: "; };
  Java_o_AA(env, nullptr, 0, sprite_handle(), depth_handle(), 0, 0, 1, 1, 0, 0, 1, 1);
  EXPECT_TRUE(raised());
  Java_o_AA(env, nullptr, kit_handle(), 0, depth_handle(), 0, 0, 1, 1, 0, 0, 1, 1);
  EXPECT_TRUE(raised());
  Java_o_BA(env, nullptr, kit_handle(), sprite_handle(), 0, 0, 0, 1, 1, 0, 0, 1, 1);
  EXPECT_TRUE(raised());
  Java_o_BA(env, nullptr, kit_handle(), sprite_handle(), 0, 0, 0, 1, 1, 0, 0, 1, 0);  // depth not asked for
  EXPECT_EQ(java.take_exception(), "");
}

}  // namespace
