// Making sprites, filling them, and asking for their sizes.
#include <cerrno>
#include <climits>

#include "raster/Sprite.h"
#include "support/allocation_failure.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

using word_list = std::vector<std::uint32_t>;

class sprite_storage : public toolkit_fixture {
 public:
  const jobject peer_of_sprite = java.new_object("fa");

  jlong handle() const { return java.nativeid(peer_of_sprite); }
  Sprite_c& sprite() const { return *native<Sprite_c>(peer_of_sprite); }
  word_list contents() const {
    return {sprite().pixels, sprite().pixels + static_cast<std::size_t>(sprite().pitch) * sprite().height};
  }
  void destroy() { Java_fa_M(env, peer_of_sprite, handle()); }

  void numbered_target(int width, int height) {
    make_target(width, height);
    for (int i = 0; i < width * height; ++i) colour.data()[i] = static_cast<unsigned>(i) * 0x01010101u;
  }

  // The call failed with this exception, and no sprite came of it.
  void expect_no_sprite(const std::string& exception) {
    const std::string raised = java.take_exception();
    EXPECT_EQ(raised.substr(0, exception.size()), exception) << raised;
    EXPECT_EQ(handle(), 0);
  }

  void TearDown() override {
    destroy();
    toolkit_fixture::TearDown();
  }
};

constexpr const char* null_pointer = "java.lang.NullPointerException: ";
constexpr const char* bad_argument = "java.lang.IllegalArgumentException: ";
constexpr const char* out_of_bounds = "java.lang.ArrayIndexOutOfBoundsException: ";

TEST_F(sprite_storage, from_an_array_with_its_stride_and_without_its_offset) {
  test_random random(1);
  for (int call = 0; call < 200; ++call) {
    const int w = random.between(0, 9), h = random.between(0, 7), stride = random.between(w, w + 4);
    std::vector<jint> source(static_cast<std::size_t>(stride * h + 2));
    for (auto& word : source) word = random.one_in(3) ? 0 : static_cast<jint>(random.word());
    const bool opaque = random.one_in(2);
    Java_fa_RA(env, peer_of_sprite, 77, java.new_ints(source), 99, stride, w, h, opaque ? 2 : 0);
    ASSERT_EQ(java.take_exception(), "");
    word_list expected;
    for (int y = 0; y < h; ++y) {
      for (int x = 0; x < w; ++x) {
        const auto word = static_cast<std::uint32_t>(source[static_cast<std::size_t>(y * stride + x)]);
        expected.push_back(opaque && word != 0 ? word | 0xFF000000u : word);
      }
    }
    ASSERT_EQ(contents(), expected);
    EXPECT_EQ(Java_fa_da(env, nullptr, handle()), w);
    EXPECT_EQ(Java_fa_GA(env, nullptr, handle()), h);
    destroy();
  }
}

TEST_F(sprite_storage, from_a_palette) {
  const auto palette = java.new_ints({0x11223344, 0x00AABBCC, -1});
  const auto indices = java.new_bytes({0, 1, 9, 2, 1, 9});
  Java_fa_EA(env, peer_of_sprite, 0, palette, indices, nullptr, 5, 3, 2, 2);
  EXPECT_EQ(contents(), (word_list{0, 0xFFAABBCC, 0xFFFFFFFF, 0xFFAABBCC}));
  destroy();
  Java_fa_EA(env, peer_of_sprite, 0, palette, indices, java.new_bytes({-56, 1, 0, 0, -1, 0}), 5, 3, 2, 2);
  EXPECT_EQ(contents(), (word_list{0xC8223344, 0x01AABBCC, 0x00FFFFFF, 0xFFAABBCC})) << "index 0 has its colour";
  destroy();
  // A palette that an index outruns; without alpha values index 0 needs none.
  Java_fa_EA(env, peer_of_sprite, 0, palette, java.new_bytes({0, 1, 2, 3}), nullptr, 0, 2, 2, 2);
  expect_no_sprite("java.lang.ArrayIndexOutOfBoundsException: palette: length 3, 4 needed");
  Java_fa_EA(env, peer_of_sprite, 0, palette, java.new_bytes({-1}), nullptr, 0, 1, 1, 1);
  expect_no_sprite("java.lang.ArrayIndexOutOfBoundsException: palette: length 3, 256 needed");
  Java_fa_EA(env, peer_of_sprite, 0, java.new_ints({}), java.new_bytes({0}), java.new_bytes({7}), 0, 1, 1, 1);
  expect_no_sprite(out_of_bounds);
  Java_fa_EA(env, peer_of_sprite, 0, java.new_ints({}), java.new_bytes({0}), nullptr, 0, 1, 1, 1);
  EXPECT_EQ(contents(), word_list{0});
}

TEST_F(sprite_storage, from_the_frame_buffer) {
  numbered_target(7, 5);
  colour.at(2, 1) = 0x00123456;
  colour.at(3, 1) = 0;
  Java_fa_K(env, peer_of_sprite, 0, 2, 1, 5, 4, JNI_TRUE);
  ASSERT_EQ(java.take_exception(), "");
  EXPECT_EQ(sprite().pixels[0], 0xFF123456u);
  EXPECT_EQ(sprite().pixels[1], 0u);
  for (int i = 2; i < 20; ++i) EXPECT_EQ(sprite().pixels[i], colour.at(2 + i % 5, 1 + i / 5) | 0xFF000000u);
  destroy();
  Java_fa_K(env, peer_of_sprite, 0, 2, 1, 5, 4, JNI_FALSE);
  for (int i = 0; i < 20; ++i) EXPECT_EQ(sprite().pixels[i], colour.at(2 + i % 5, 1 + i / 5));
}

// Rectangles, from an array (as it is) and from the frame buffer (made opaque): only the rectangle changes.
TEST_F(sprite_storage, rectangles) {
  test_random random(2);
  numbered_target(11, 9);
  Java_fa_UA(env, peer_of_sprite, 0, 10, 8);
  for (int call = 0; call < 300; ++call) {
    word_list expected = contents();
    const int x = random.between(0, 10), y = random.between(0, 8);
    const int w = random.between(0, 10 - x), h = random.between(0, 8 - y);
    if (random.one_in(2)) {
      const int stride = random.between(w, w + 3), offset = random.between(0, 5);
      std::vector<jint> source(static_cast<std::size_t>(offset + stride * h + w));
      for (auto& word : source) word = static_cast<jint>(random.word());
      Java_fa_na(env, nullptr, handle(), x, y, w, h, java.new_ints(source), offset, stride);
      for (int i = 0; i < w * h; ++i) {
        expected[static_cast<std::size_t>((y + i / w) * 10 + x + i % w)] =
            static_cast<std::uint32_t>(source[static_cast<std::size_t>(offset + i / w * stride + i % w)]);
      }
    } else {
      const int fbx = random.between(0, 11 - w), fby = random.between(0, 9 - h);
      Java_fa_ea(env, nullptr, handle(), x, y, w, h, fbx, fby);
      for (int i = 0; i < w * h; ++i) {
        const unsigned word = colour.at(fbx + i % w, fby + i / w);
        expected[static_cast<std::size_t>((y + i / w) * 10 + x + i % w)] = word == 0 ? 0 : word | 0xFF000000u;
      }
    }
    ASSERT_EQ(java.take_exception(), "");
    ASSERT_EQ(contents(), expected);
  }
}

TEST_F(sprite_storage, alpha_from_the_frame_buffer) {
  test_random random(3);
  make_target(9, 6);
  for (int channel = 0; channel < 4; ++channel) {
    for (int i = 0; i < 54; ++i)
      colour.data()[i] = random.one_in(3) ? 0 : random.word() & (random.one_in(2) ? ~0u : 0xFF);
    Java_fa_UA(env, peer_of_sprite, 0, 7, 5);
    for (int i = 0; i < 35; ++i) sprite().pixels[i] = random.word();
    word_list expected = contents();
    for (int i = 0; i < 35; ++i) {
      const unsigned word = colour.at(2 + i % 7, 1 + i / 7);
      const unsigned alpha =
          channel == 3 ? (word != 0 ? 255 : 0) : word >> (16 - 8 * channel) & 0xFF;  // red, green, blue
      auto& pixel = expected[static_cast<std::size_t>(i)];
      pixel = (pixel & 0xFFFFFF) | alpha << 24;
    }
    Java_fa_j(env, nullptr, handle(), 2, 1, channel);
    ASSERT_EQ(java.take_exception(), "");
    EXPECT_EQ(contents(), expected) << "channel " << channel;
    destroy();
  }
}

TEST_F(sprite_storage, margins_and_sizes) {
  Java_fa_UA(env, peer_of_sprite, 0, 10, 20);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(sprite().pixels) % 16, 0u);
  Java_fa_U(env, nullptr, handle(), 1, 2, 3, 4);
  EXPECT_EQ(Java_fa_WA(env, nullptr, handle()), 14);
  EXPECT_EQ(Java_fa_ba(env, nullptr, handle()), 26);
  const auto out = java.new_ints({9, 9, 9, 9, 9});
  Java_fa_F(env, nullptr, handle(), out);
  EXPECT_EQ(java.ints(out), (std::vector<jint>{1, 2, 3, 4, 9}));
  sprite().Allocate(3, 3);
  EXPECT_EQ(sprite().full_width(), 7) << "the margins stay";
  Java_fa_U(env, nullptr, handle(), INT_MAX, INT_MAX, 0, 0);
  EXPECT_EQ(Java_fa_WA(env, nullptr, handle()), INT_MIN + 2) << "sums wrap";
  Java_fa_F(env, nullptr, handle(), java.new_ints({1, 2, 3}));
  EXPECT_EQ(java.take_exception(), "java.lang.ArrayIndexOutOfBoundsException: result: length 3, 4 needed");
  destroy();
  EXPECT_EQ(handle(), 0);
  destroy();  // once more does no harm
}

TEST_F(sprite_storage, failed_creations_bind_nothing) {
  const auto pixels = java.new_ints(std::vector<jint>(12));
  const auto bytes = java.new_bytes(std::vector<jbyte>(12));
  for (const auto& [w, h] : {std::pair{-1, 4}, {4, -1}, {INT_MIN, INT_MIN}, {1 << 15, 1 << 15}, {INT_MAX, INT_MAX}}) {
    Java_fa_UA(env, peer_of_sprite, 0, w, h);
    expect_no_sprite(bad_argument);
  }
  Java_fa_RA(env, peer_of_sprite, 0, pixels, 0, 4, -3, 3, 0);
  expect_no_sprite(bad_argument);
  Java_fa_RA(env, peer_of_sprite, 0, pixels, 0, 5, 4, 3, 0);
  expect_no_sprite(out_of_bounds);
  Java_fa_RA(env, peer_of_sprite, 0, pixels, 0, -1, 4, 3, 0);
  expect_no_sprite(out_of_bounds);
  Java_fa_RA(env, peer_of_sprite, 0, pixels, 0, INT_MAX, INT_MAX, 2, 0);
  expect_no_sprite(out_of_bounds);
  Java_fa_RA(env, peer_of_sprite, 0, nullptr, 0, 0, 0, 0, 0);
  expect_no_sprite(null_pointer);
  Java_fa_EA(env, peer_of_sprite, 0, nullptr, bytes, nullptr, 0, 4, 4, 3);
  expect_no_sprite(null_pointer);
  Java_fa_EA(env, peer_of_sprite, 0, pixels, nullptr, nullptr, 0, 4, 4, 3);
  expect_no_sprite(null_pointer);
  Java_fa_EA(env, peer_of_sprite, 0, pixels, bytes, nullptr, 0, 4, 4, 4);
  expect_no_sprite(out_of_bounds);
  Java_fa_EA(env, peer_of_sprite, 0, pixels, bytes, java.new_bytes({1}), 0, 4, 4, 3);
  expect_no_sprite(out_of_bounds);
  java.fail_array_access(1);
  Java_fa_RA(env, peer_of_sprite, 0, pixels, 0, 4, 4, 3, 0);
  expect_no_sprite("java.lang.OutOfMemoryError");
  const auto without_memory = [&](auto&& create) {
    allocation_failure::fail_memalign(1, ENOMEM);
    create();
    expect_no_sprite("java.lang.RuntimeException: Cannot allocate memory");
  };
  without_memory([&] { Java_fa_UA(env, peer_of_sprite, 0, 4, 3); });
  without_memory([&] { Java_fa_RA(env, peer_of_sprite, 0, pixels, 0, 4, 4, 3, 0); });
  without_memory([&] { Java_fa_EA(env, peer_of_sprite, 0, pixels, bytes, nullptr, 0, 4, 4, 3); });
  Java_fa_K(env, peer_of_sprite, 0, 0, 0, -1, -1, 0);
  expect_no_sprite("java.lang.Exception: No colour buffer");  // looked at first
  make_target(8, 8);
  Java_fa_K(env, peer_of_sprite, 0, 1, 1, 8, 1, 0);
  expect_no_sprite(bad_argument);
  Java_fa_K(env, peer_of_sprite, 0, INT_MAX, INT_MIN, 1, 1, 0);
  expect_no_sprite(bad_argument);
}

TEST_F(sprite_storage, failed_copies_change_nothing) {
  Java_fa_UA(env, peer_of_sprite, 0, 6, 5);
  for (int i = 0; i < 30; ++i) sprite().pixels[i] = static_cast<unsigned>(i);
  const word_list before = contents();
  const auto expect_unchanged = [&](const std::string& exception) {
    const std::string raised = java.take_exception();
    EXPECT_EQ(raised.substr(0, exception.size()), exception) << raised;
    EXPECT_EQ(contents(), before);
  };
  Java_fa_ea(env, nullptr, handle(), 0, 0, 1, 1, 0, 0);
  expect_unchanged("java.lang.Exception: No colour buffer");
  Java_fa_j(env, nullptr, handle(), 0, 0, 0);
  expect_unchanged("java.lang.Exception: No colour buffer");
  numbered_target(8, 8);
  Java_fa_j(env, nullptr, handle(), 3, 0, 0);
  expect_unchanged(bad_argument);
  Java_fa_j(env, nullptr, handle(), 0, 0, 4);
  expect_unchanged("java.lang.IllegalArgumentException: channel: 4 is not 0 to 3");
  Java_fa_ea(env, nullptr, handle(), 0, 0, 6, 5, 3, 0);
  expect_unchanged(bad_argument);
  Java_fa_ea(env, nullptr, handle(), 0, 1, 6, 5, 0, 0);
  expect_unchanged(bad_argument);
  const auto pixels = java.new_ints(std::vector<jint>(30));
  Java_fa_na(env, nullptr, handle(), -1, 0, 2, 2, pixels, 0, 6);
  expect_unchanged(bad_argument);
  Java_fa_na(env, nullptr, handle(), 0, 0, 6, 5, pixels, 1, 6);
  expect_unchanged(out_of_bounds);
  Java_fa_na(env, nullptr, handle(), 0, 0, 1, 1, pixels, -1, 6);
  expect_unchanged(out_of_bounds);
  Java_fa_na(env, nullptr, handle(), 0, 0, -6, -5, pixels, 0, 6);
  expect_unchanged(bad_argument);
  Java_fa_na(env, nullptr, handle(), 0, 0, 1, 1, nullptr, 0, 6);
  expect_unchanged(null_pointer);
}

TEST_F(sprite_storage, zero_handles_raise) {
  make_target(4, 4);
  const auto pixels = java.new_ints({1, 2, 3, 4});
  const std::function<void()> calls[] = {
      [&] { Java_fa_da(env, nullptr, 0); },
      [&] { Java_fa_GA(env, nullptr, 0); },
      [&] { Java_fa_WA(env, nullptr, 0); },
      [&] { Java_fa_ba(env, nullptr, 0); },
      [&] { Java_fa_U(env, nullptr, 0, 0, 0, 0, 0); },
      [&] { Java_fa_F(env, nullptr, 0, pixels); },
      [&] { Java_fa_na(env, nullptr, 0, 0, 0, 1, 1, pixels, 0, 1); },
      [&] { Java_fa_ea(env, nullptr, 0, 0, 0, 1, 1, 0, 0); },
      [&] { Java_fa_j(env, nullptr, 0, 0, 0, 0); },
  };
  for (const auto& call : calls) {
    call();
    EXPECT_EQ(java.take_exception(), null_pointer);
  }
}

}  // namespace
