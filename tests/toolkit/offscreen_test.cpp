// Images as targets, copies between them and the current target, and what happens when an image or the toolkit goes too
// early: nothing is read or written that is gone. The address sanitizer sees what these tests cannot.
#include <cerrno>
#include <climits>

#include "raster/DepthBuffer.h"
#include "raster/Sprite.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

class offscreen : public toolkit_fixture {
 public:
  const jobject sprite_peer = java.new_object("fa");
  const jobject depth_peer = java.new_object("oa");

  jlong sprite_handle() const { return java.nativeid(sprite_peer); }
  jlong depth_handle() const { return java.nativeid(depth_peer); }
  Sprite_c& sprite() const { return *native<Sprite_c>(sprite_peer); }
  DepthBuffer_c& image() const { return *native<DepthBuffer_c>(depth_peer); }

  void destroy_images() {
    Java_fa_M(env, sprite_peer, sprite_handle());
    Java_oa_za(env, depth_peer, depth_handle());
  }
  void make_images(int width, int height, int depth_width, int depth_height) {
    destroy_images();
    Java_fa_UA(env, sprite_peer, 0, width, height);
    Java_oa_g(env, depth_peer, depth_width, depth_height);
    ASSERT_EQ(java.take_exception(), "");
  }
  void draw_to_images() { Java_ja_d(env, peer, sprite_handle(), depth_handle()); }

  // Copies from the target to the images, or back, the rectangle at (x, y) to (to_x, to_y).
  void copy(bool to_target, int x, int y, int w, int h, int to_x, int to_y, int with_colour = 1, int with_depth = 1) {
    (to_target ? Java_o_BA : Java_o_AA)(env, nullptr, java.nativeid(peer), sprite_handle(), depth_handle(), x, y, w, h,
                                        to_x, to_y, static_cast<jboolean>(with_colour),
                                        static_cast<jboolean>(with_depth));
  }

  void TearDown() override {
    destroy_images();
    toolkit_fixture::TearDown();
  }
};

void expect_target(unsigned int* pixels, float* depths, int width, int height, int pitch) {
  const toolkit& t = *toolkit::m_pInstance;
  const auto& viewport = *Rasterizer_n::GetViewport();
  const auto& clip = *Rasterizer_n::GetCliprect();
  EXPECT_TRUE(t.colourbuffer == pixels && Rasterizer_n::m_pColourBuffer == pixels);
  EXPECT_TRUE(t.depthbuffer == depths && Rasterizer_n::m_pDepthBuffer == depths);
  EXPECT_EQ(Rasterizer_n::m_ScreenPitch, pitch);
  EXPECT_TRUE(t.width == width && t.height == height);
  const std::vector<int> all{0, 0, width, height};
  EXPECT_EQ((std::vector<int>{t.clip_x0, t.clip_y0, t.clip_x1, t.clip_y1}), all);
  EXPECT_EQ((std::vector<int>{viewport.x, viewport.y, viewport.width, viewport.height}), all);
  EXPECT_EQ((std::vector<int>{clip.x, clip.y, clip.width, clip.height}), all);
}

TEST_F(offscreen, every_combination_of_images_as_target) {
  make_images(12, 9, 12, 9);
  Java_ja_GA(env, peer, 0.25f, 0.75f);
  draw_to_images();
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
  Java_ja_d(env, peer, 0, 0);
  expect_target(nullptr, nullptr, 5, 7, 0);
  expect_raised(bad_argument + "depth: 5x7 does not fit the sprite's 12x9", {[&] { draw_to_images(); }});
}

TEST_F(offscreen, depth_images) {
  make_images(1, 1, 33, 7);
  EXPECT_TRUE(image().width == 33 && image().height == 7);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(image().depth) % 64, 0u);
  image().Allocate(2, 2);
  EXPECT_EQ(image().width, 2u);
  destroy_images();
  destroy_images();
  const auto make = [&](int w, int h) { return [=, this] { Java_oa_g(env, depth_peer, w, h); }; };
  expect_raised(bad_argument, {make(-1, 1), make(1, -1), make(1 << 20, 1 << 20)});
  allocation_failure::fail_memalign(1, ENOMEM);
  expect_raised(no_memory, {make(3, 3)});
  EXPECT_EQ(depth_handle(), 0);
}

// Bit copies both ways, of any mixture of buffers; only the value 1 chooses one.
TEST_F(offscreen, copies_move_just_the_rectangle) {
  using word [[gnu::may_alias]] = std::uint32_t;
  struct layer {
    bool in_target;
    void *target, *image;
    int flag;
    std::vector<std::uint32_t> expected;
  };
  test_random random(1);
  for (int call = 0; call < 600; ++call) {
    const bool with_colour = !random.one_in(5), with_depth = !random.one_in(5), to_target = random.one_in(2);
    make_target(random.between(1, 20), random.between(1, 15), with_colour, with_depth);
    const int width = random.between(1, 20), height = random.between(1, 15);
    make_images(width, height, width, height);
    const int w = random.between(0, std::min(kit().width, width));
    const int h = random.between(-1, std::min(kit().height, height)), rows = std::max(h, 0);
    const int tx = random.between(0, kit().width - w), ty = random.between(0, kit().height - rows);
    const int ix = random.between(0, width - w), iy = random.between(0, height - rows);

    layer layers[] = {{with_colour, colour.data(), sprite().pixels, random.between(0, 2), {}},
                      {with_depth, depth.data(), image().depth, random.between(0, 2), {}}};
    for (layer& l : layers) {
      if (!l.in_target) continue;
      auto *const target = static_cast<word*>(l.target), *const picture = static_cast<word*>(l.image);
      std::generate_n(target, kit().width * kit().height, [&] { return random.word(); });
      std::generate_n(picture, width * height, [&] { return random.word(); });
      l.expected = to_target ? std::vector<std::uint32_t>(target, target + kit().width * kit().height)
                             : std::vector<std::uint32_t>(picture, picture + width * height);
      for (int i = 0; l.flag == 1 && i < w * rows; ++i) {
        const int t = (ty + i / w) * kit().width + tx + i % w, m = (iy + i / w) * width + ix + i % w;
        l.expected[static_cast<std::size_t>(to_target ? t : m)] = to_target ? picture[m] : target[t];
      }
    }
    if (to_target) copy(true, ix, iy, w, h, tx, ty, layers[0].flag, layers[1].flag);
    if (!to_target) copy(false, tx, ty, w, h, ix, iy, layers[0].flag, layers[1].flag);
    ASSERT_EQ(java.take_exception(), "");
    for (const layer& l : layers) {
      const auto* const written = static_cast<const word*>(to_target ? l.target : l.image);
      ASSERT_TRUE(std::equal(l.expected.begin(), l.expected.end(), written)) << "call " << call;
    }
  }
}

// With colour, depth rows are as long as the sprite's, whatever the depth image's own width is.
TEST_F(offscreen, both_images_share_the_sprites_row_length) {
  make_target(4, 2);
  make_images(3, 2, 4, 2);
  depth.at(2, 1) = 6;
  copy(false, 2, 1, 1, 1, 1, 1);
  EXPECT_EQ(image().depth[1 * 3 + 1], 6.0f);
  image().depth[1 * 4 + 1] = 0;
  copy(false, 2, 1, 1, 1, 1, 1, 0, 1);
  EXPECT_EQ(image().depth[1 * 4 + 1], 6.0f) << "alone, the depth image has its own";
  make_images(3, 2, 2, 2);
  expect_raised(out_of_bounds + "depth: ", {[&] { copy(false, 0, 0, 3, 2, 0, 0); }});
}

TEST_F(offscreen, copies_outside_raise_and_change_nothing) {
  make_target(6, 5);
  make_images(8, 7, 8, 7);
  std::fill_n(sprite().pixels, 56, 7u);
  std::fill_n(image().depth, 56, 7.0f);
  // Legal from the target to the images, but for one number each.
  const int rectangles[][6] = {{-1, 0, 2, 2, 0, 0},
                               {0, 4, 2, 2, 0, 0},
                               {0, 0, 7, 2, 0, 0},
                               {0, 0, 2, 2, 7, 0},
                               {0, 0, 2, 2, 0, -1},
                               {0, 0, 2, INT_MAX, 0, 0},
                               {INT_MAX, 0, INT_MAX, 1, 0, 0}};
  for (const auto& [x, y, w, h, to_x, to_y] : rectangles) {
    expect_raised(bad_argument,
                  {[&] { copy(false, x, y, w, h, to_x, to_y); }, [&] { copy(true, to_x, to_y, w, h, x, y); }});
  }
  EXPECT_EQ(colour.copy(), std::vector<unsigned int>(30));
  EXPECT_EQ(depth.copy(), std::vector<float>(30));
  EXPECT_EQ(std::count(sprite().pixels, sprite().pixels + 56, 7u), 56);

  const jlong own = java.nativeid(peer), sprite_id = sprite_handle(), depth_id = depth_handle();
  expect_raised(null_pointer, {[&] { Java_o_AA(env, nullptr, 0, sprite_id, depth_id, 0, 0, 1, 1, 0, 0, 1, 1); },
                               [&] { Java_o_AA(env, nullptr, own, 0, depth_id, 0, 0, 1, 1, 0, 0, 1, 1); },
                               [&] { Java_o_BA(env, nullptr, own, sprite_id, 0, 0, 0, 1, 1, 0, 0, 1, 1); }});
  Java_o_BA(env, nullptr, own, sprite_id, 0, 0, 0, 1, 1, 0, 0, 1, 0);  // depth not asked for
}

// --- Ends ------------------------------------------------------------------------------------------------------------

// Spans store whole groups of four, also where an image's pixels are no multiple of four.
TEST_F(offscreen, a_triangle_over_the_last_pixel_stays_inside_the_image) {
  const jobject resource = java.new_object("a");
  Java_a_ha(env, resource, 0, 0, 0, 0, 0);
  Java_ja_GA(env, peer, 0, 1);
  for (int side = 1; side < 12; ++side) {
    make_images(side, side, side, side);
    draw_to_images();
    Java_ja_ba(env, peer, 3, 0);
    Java_a_ra(env, resource, java.nativeid(resource), -30, -30, -30, 100, 100, -30, -1, -1, -1);
    EXPECT_EQ(sprite().pixels[side * side - 1], 0xFFFFFFFFu) << side;
  }
  Java_a_R(env, resource, java.nativeid(resource));
}

TEST_F(offscreen, a_target_that_is_destroyed_takes_no_more_pixels) {
  make_images(64, 64, 64, 64);
  draw_to_images();
  destroy_images();
  Java_ja_B(env, peer, 0, 0, 64, 64, -1, 0);
  Java_ja_ba(env, peer, 3, -1);
  EXPECT_TRUE(Rasterizer_n::m_pColourBuffer == nullptr && Rasterizer_n::m_pDepthBuffer == nullptr);
}

TEST_F(offscreen, natives_refuse_a_toolkit_that_is_gone) {
  make_images(8, 8, 8, 8);
  draw_to_images();
  Java_ja_ma(env, peer);
  expect_raised(null_pointer, {[&] { Java_ja_B(env, peer, 0, 0, 8, 8, -1, 0); }});
  destroy_images();
  Java_ja_q(env, peer, nullptr, 0);  // for the fixture to end
}

}  // namespace
