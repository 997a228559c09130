// Making sprites, filling them, and asking for their sizes.
#include <cerrno>
#include <climits>

#include "raster/Sprite.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

using word_list = std::vector<std::uint32_t>;

class sprite_storage : public toolkit_fixture {
 public:
  const jobject sprite_peer = java.new_object("fa");

  jlong handle() const { return java.nativeid(sprite_peer); }
  Sprite_c& sprite() const { return *native<Sprite_c>(sprite_peer); }
  word_list contents() const {
    return {sprite().pixels, sprite().pixels + static_cast<std::size_t>(sprite().pitch) * sprite().height};
  }
  void destroy() { Java_fa_M(env, sprite_peer, handle()); }
  void make(int width, int height) {
    destroy();
    Java_fa_UA(env, sprite_peer, 0, width, height);
  }
  void TearDown() override {
    destroy();
    toolkit_fixture::TearDown();
  }
};

std::uint32_t opaque(std::uint32_t word) { return word == 0 ? 0 : word | 0xFF000000u; }

// Every way to get pixels into a sprite, from an array (as it is, or opaque) and from the frame buffer; a rectangle
// leaves what is around it.
TEST_F(sprite_storage, random_operations_follow_plain_loops) {
  test_random random(1);
  make(3, 3);
  for (int call = 0; call < 1500; ++call) {
    make_target(random.between(1, 11), random.between(1, 9));
    const auto word = [&] { return random.one_in(3) ? 0 : random.word() & (random.one_in(3) ? 0xFF : ~0u); };
    std::generate_n(colour.data(), colour.elements(), word);
    const bool creates = random.one_in(3), from_frame = random.one_in(2), solid = random.one_in(2);
    const int most_w = creates ? 11 : sprite().width, most_h = creates ? 9 : sprite().height;
    const int w = random.between(0, std::min(most_w, colour.width));
    const int h = random.between(0, std::min(most_h, colour.height));
    const int x = creates ? 0 : random.between(0, most_w - w), y = creates ? 0 : random.between(0, most_h - h);
    const int from_x = random.between(0, colour.width - w), from_y = random.between(0, colour.height - h);
    const int stride = random.between(w, w + 3), offset = creates ? 0 : random.between(0, 5);
    std::vector<jint> array(static_cast<std::size_t>(offset + stride * h + w));
    std::ranges::generate(array, word);

    word_list expected;
    const auto copied = [&](int column, int row) {
      if (from_frame) return colour.at(from_x + column, from_y + row);
      return static_cast<std::uint32_t>(array[static_cast<std::size_t>(offset + row * stride + column)]);
    };
    if (creates) {
      for (int i = 0; i < w * h; ++i) expected.push_back(solid ? opaque(copied(i % w, i / w)) : copied(i % w, i / w));
      destroy();
      if (from_frame) {
        Java_fa_K(env, sprite_peer, 0, from_x, from_y, w, h, solid);
      } else {
        Java_fa_RA(env, sprite_peer, 77, java.new_ints(array), 99, stride, w, h, solid ? 2 : 0);
      }
    } else {
      expected = contents();
      for (int i = 0; i < w * h; ++i) {
        auto& pixel = expected[static_cast<std::size_t>((y + i / w) * sprite().width + x + i % w)];
        pixel = from_frame ? opaque(copied(i % w, i / w)) : copied(i % w, i / w);
      }
      if (from_frame) {
        Java_fa_ea(env, nullptr, handle(), x, y, w, h, from_x, from_y);
      } else {
        Java_fa_na(env, nullptr, handle(), x, y, w, h, java.new_ints(array), offset, stride);
      }
    }
    ASSERT_EQ(java.take_exception(), "");
    ASSERT_EQ(contents(), expected) << "call " << call;
    EXPECT_EQ(Java_fa_da(env, nullptr, handle()), creates ? w : most_w);
    EXPECT_EQ(Java_fa_GA(env, nullptr, handle()), creates ? h : most_h);

    if (sprite().width > colour.width || sprite().height > colour.height) continue;
    const int channel = random.between(0, 3);
    for (int i = 0; i < sprite().width * sprite().height; ++i) {
      const unsigned from = colour.at(i % sprite().width, colour.height - sprite().height + i / sprite().width);
      const unsigned alpha = channel == 3 ? (from != 0 ? 255 : 0) : from >> (16 - 8 * channel) & 0xFF;
      expected[static_cast<std::size_t>(i)] = (expected[static_cast<std::size_t>(i)] & 0xFFFFFF) | alpha << 24;
    }
    Java_fa_j(env, nullptr, handle(), 0, colour.height - sprite().height, channel);
    ASSERT_EQ(contents(), expected) << "alpha of channel " << channel;
  }
}

TEST_F(sprite_storage, from_a_palette) {
  const auto palette = java.new_ints({0x11223344, 0x00AABBCC, -1});
  const auto indices = java.new_bytes({0, 1, 9, 2, 1, 9});
  Java_fa_EA(env, sprite_peer, 0, palette, indices, nullptr, 5, 3, 2, 2);
  EXPECT_EQ(contents(), (word_list{0, 0xFFAABBCC, 0xFFFFFFFF, 0xFFAABBCC}));
  destroy();
  Java_fa_EA(env, sprite_peer, 0, palette, indices, java.new_bytes({-56, 1, 0, 0, -1, 0}), 5, 3, 2, 2);
  EXPECT_EQ(contents(), (word_list{0xC8223344, 0x01AABBCC, 0x00FFFFFF, 0xFFAABBCC})) << "index 0 has its colour";
  destroy();
  // A palette that an index outruns; without alpha values index 0 needs none.
  const auto none = java.new_ints({});
  const auto one = java.new_bytes({0});
  expect_raised(out_of_bounds + "palette: length ",
                {[&] {
                   Java_fa_EA(env, sprite_peer, 0, palette, java.new_bytes({0, 1, 2, 3}), nullptr, 0, 2, 2, 2);
                 },
                 [&] { Java_fa_EA(env, sprite_peer, 0, palette, java.new_bytes({-1}), nullptr, 0, 1, 1, 1); },
                 [&] { Java_fa_EA(env, sprite_peer, 0, none, one, java.new_bytes({7}), 0, 1, 1, 1); }});
  EXPECT_EQ(handle(), 0);
  Java_fa_EA(env, sprite_peer, 0, none, one, nullptr, 0, 1, 1, 1);
  EXPECT_EQ(contents(), word_list{0});
}

TEST_F(sprite_storage, margins_and_sizes) {
  make(10, 20);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(sprite().pixels) % 16, 0u);
  Java_fa_U(env, nullptr, handle(), 1, 2, 3, 4);
  EXPECT_TRUE(Java_fa_WA(env, nullptr, handle()) == 14 && Java_fa_ba(env, nullptr, handle()) == 26);
  const auto out = java.new_ints({9, 9, 9, 9, 9});
  Java_fa_F(env, nullptr, handle(), out);
  EXPECT_EQ(java.ints(out), (std::vector<jint>{1, 2, 3, 4, 9}));
  sprite().Allocate(3, 3);
  EXPECT_EQ(sprite().full_width(), 7) << "the margins stay";
  Java_fa_U(env, nullptr, handle(), INT_MAX, INT_MAX, 0, 0);
  EXPECT_EQ(Java_fa_WA(env, nullptr, handle()), INT_MIN + 2) << "sums wrap";
  destroy();
  EXPECT_EQ(handle(), 0);
  destroy();  // once more does no harm
}

TEST_F(sprite_storage, failed_creations_bind_nothing) {
  const auto pixels = java.new_ints(std::vector<jint>(12));
  const auto bytes = java.new_bytes(std::vector<jbyte>(12));
  const auto blank = [&](int w, int h) { return [=, this] { Java_fa_UA(env, sprite_peer, 0, w, h); }; };
  const auto words = [&](jintArray array, int stride, int w, int h) {
    return [=, this] { Java_fa_RA(env, sprite_peer, 0, array, 0, stride, w, h, 0); };
  };
  const auto indexed = [&](jintArray palette, jbyteArray indices, jbyteArray alpha, int h) {
    return [=, this] { Java_fa_EA(env, sprite_peer, 0, palette, indices, alpha, 0, 4, 4, h); };
  };
  const auto frame = [&](int x, int y, int w, int h) {
    return [=, this] { Java_fa_K(env, sprite_peer, 0, x, y, w, h, 0); };
  };
  expect_raised("java.lang.Exception: No colour buffer", {frame(0, 0, -1, -1)});  // looked at first
  make_target(8, 8);
  expect_raised(bad_argument,
                {blank(-1, 4), blank(4, -1), blank(INT_MIN, INT_MIN), blank(1 << 15, 1 << 15), blank(INT_MAX, INT_MAX),
                 words(pixels, 4, -3, 3), frame(1, 1, 8, 1), frame(INT_MAX, INT_MIN, 1, 1)});
  expect_raised(out_of_bounds, {words(pixels, 5, 4, 3), words(pixels, -1, 4, 3), words(pixels, INT_MAX, INT_MAX, 2),
                                indexed(pixels, bytes, nullptr, 4), indexed(pixels, bytes, java.new_bytes({1}), 3)});
  expect_raised(null_pointer,
                {words(nullptr, 0, 0, 0), indexed(nullptr, bytes, nullptr, 3), indexed(pixels, nullptr, nullptr, 3)});
  java.fail_array_access(1);
  expect_raised("java.lang.OutOfMemoryError", {words(pixels, 4, 4, 3)});
  for (const std::function<void()>& create :
       {std::function<void()>(blank(4, 3)), {words(pixels, 4, 4, 3)}, {indexed(pixels, bytes, nullptr, 3)}}) {
    allocation_failure::fail_memalign(1, ENOMEM);
    EXPECT_EQ(raised(create), no_memory);
  }
  EXPECT_EQ(handle(), 0);
}

TEST_F(sprite_storage, failed_copies_change_nothing) {
  make(6, 5);
  for (int i = 0; i < 30; ++i) sprite().pixels[i] = static_cast<unsigned>(i);
  const word_list before = contents();
  const auto pixels = java.new_ints(std::vector<jint>(30));
  const auto from_array = [&](jlong to, int x, int w, int h, jintArray array, int offset) {
    return [=, this] { Java_fa_na(env, nullptr, to, x, 0, w, h, array, offset, 6); };
  };
  const auto from_frame = [&](jlong to, int x, int y, int w, int h, int fb_x) {
    return [=, this] { Java_fa_ea(env, nullptr, to, x, y, w, h, fb_x, 0); };
  };
  const auto alpha = [&](jlong to, int fb_x, int channel) {
    return [=, this] { Java_fa_j(env, nullptr, to, fb_x, 0, channel); };
  };
  const jlong own = handle();
  expect_raised("java.lang.Exception: No colour buffer", {from_frame(own, 0, 0, 1, 1, 0), alpha(own, 0, 0)});
  make_target(8, 8);
  expect_raised(bad_argument, {alpha(own, 3, 0), from_frame(own, 0, 0, 6, 5, 3), from_frame(own, 0, 1, 6, 5, 0),
                               from_array(own, -1, 2, 2, pixels, 0), from_array(own, 0, -6, -5, pixels, 0)});
  expect_raised(bad_argument + "channel: 4 is not 0 to 3", {alpha(own, 0, 4)});
  expect_raised(out_of_bounds, {from_array(own, 0, 6, 5, pixels, 1), from_array(own, 0, 1, 1, pixels, -1), [&] {
                                  Java_fa_F(env, nullptr, own, java.new_ints({1, 2, 3}));
                                }});
  expect_raised(null_pointer,
                {from_array(own, 0, 1, 1, nullptr, 0), from_array(0, 0, 1, 1, pixels, 0), from_frame(0, 0, 0, 1, 1, 0),
                 alpha(0, 0, 0), [&] { Java_fa_da(env, nullptr, 0); }, [&] { Java_fa_GA(env, nullptr, 0); },
                 [&] { Java_fa_WA(env, nullptr, 0); }, [&] { Java_fa_ba(env, nullptr, 0); },
                 [&] { Java_fa_U(env, nullptr, 0, 0, 0, 0, 0); }, [&] { Java_fa_F(env, nullptr, 0, pixels); }});
  EXPECT_EQ(contents(), before);
}

}  // namespace
