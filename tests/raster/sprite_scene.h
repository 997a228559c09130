// Random sprites, targets and masks, each made twice: for the library and for the slow reference.
#pragma once

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

#include "raster/Sprite.h"
#include "reference/comparison.h"
#include "reference/sprite_oracle.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"
#include "toolkit/clippingmask.h"

class sprite_scene : public toolkit_fixture {
 public:
  oracle::image image;
  oracle::target expected;
  oracle::placed_mask mask;
  std::unique_ptr<Sprite_c> sprite;
  const jobject mask_peer = java.new_object("wa");

  jlong handle() const { return static_cast<jlong>(reinterpret_cast<std::intptr_t>(sprite.get())); }
  jlong mask_handle() const { return java.nativeid(mask_peer); }

  // Channels at both ends of their range come often.
  static std::uint32_t random_colour(test_random& random) {
    std::uint32_t word = random.word();
    for (int shift = 0; shift < 32; shift += 8) {
      if (random.one_in(4)) word = (word & ~(0xFFu << shift)) | (random.one_in(2) ? 0xFFu << shift : 0);
    }
    return word;
  }

  // Both copies from `image`.
  void make_sprite() {
    sprite = std::make_unique<Sprite_c>();
    sprite->Allocate(static_cast<unsigned>(image.width), static_cast<unsigned>(image.height));
    std::copy(image.pixels.begin(), image.pixels.end(), sprite->pixels);
    sprite->left = image.left;
    sprite->top = image.top;
    sprite->right = image.right;
    sprite->bottom = image.bottom;
  }

  void random_sprite(test_random& random, int width, int height, bool margins) {
    image = {0, 0, 0, 0, width, height, {}};
    for (int* margin : {&image.left, &image.top, &image.right, &image.bottom}) {
      if (margins) *margin = random.between(0, 5);
    }
    for (int i = 0; i < width * height; ++i) image.pixels.push_back(random_colour(random));
    make_sprite();
  }

  // Margins of both signs, which often cancel a whole side of the image.
  void odd_margins(test_random& random) {
    const auto set = [&](int stored, int& before, int& after) {
      before = random.between(-stored - 4, 6);
      after = random.one_in(3) ? -stored - before : random.between(-stored - 4, 6);
    };
    set(image.width, image.left, image.right);
    set(image.height, image.top, image.bottom);
    make_sprite();
  }

  void random_target(test_random& random, int width, int height, bool with_depth) {
    make_target(width, height, true, with_depth);
    std::generate_n(colour.data(), colour.elements(), [&] { return random_colour(random); });
    std::generate_n(depth.data(), depth.elements(), [&] { return static_cast<float>(random.between(-3, 3)); });
    kit().setclipping(random.between(-3, width / 2), random.between(-3, height / 2), random.between(1, width + 3),
                      random.between(1, height + 3));
    expect_target();
  }

  // The reference's copy of the target.
  void expect_target() {
    const toolkit& k = kit();
    expected = {k.width, k.height, colour.copy(), depth.copy(), k.clip_x0, k.clip_y0, k.clip_x1, k.clip_y1};
  }

  void random_mask(test_random& random, int width, int height) {
    mask = {};
    mask.width = random.between(0, width);
    mask.height = random.between(0, height);
    const int rows = std::max(0, mask.height + random.between(-3, 3));
    for (int r = 0; r < rows; ++r) {
      mask.starts.push_back(random.between(-3, width));
      mask.lengths.push_back(random.between(-2, width));
    }
    mask.x = random.between(-5, width);
    mask.y = random.between(-5, height);
    Java_wa_ma(env, mask_peer);
    Java_wa_l(env, mask_peer, 0, pool_peer, mask.width, mask.height, java.new_ints(mask.starts),
              java.new_ints(mask.lengths));
  }

  // The whole target, colour and depth, and every pixel of the sprite.
  testing::AssertionResult same() {
    if (!std::equal(image.pixels.begin(), image.pixels.end(), sprite->pixels)) {
      return testing::AssertionFailure() << "the sprite was written";
    }
    hashes.push_back(hash_of(colour));
    const auto same_depth = same_image(depth, expected.depth.data());
    return same_depth ? same_image(colour, expected.colour.data()) : same_depth;
  }

  // All frames since the last record.
  void record(const std::string& name) {
    frame_record::add(name.c_str(), hashes.data(), hashes.size());
    hashes.clear();
  }

  std::vector<std::uint32_t> hashes;

  void TearDown() override {
    Java_wa_ma(env, mask_peer);
    toolkit_fixture::TearDown();
  }
};
