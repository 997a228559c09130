// Random sprites, targets and masks, each made twice: for the library and for the slow reference.
#pragma once

#include <algorithm>
#include <memory>

#include "raster/Sprite.h"
#include "reference/sprite_oracle.h"
#include "support/frame_record.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"
#include "toolkit/clippingmask.h"

class sprite_scene : public toolkit_fixture {
 public:
  sprite_oracle::image image;
  sprite_oracle::target expected;
  sprite_oracle::mask mask;
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

  void random_sprite(test_random& random, int width, int height, bool margins) {
    image = {};
    if (margins) {
      image.left = random.between(0, 5);
      image.top = random.between(0, 5);
      image.right = random.between(0, 5);
      image.bottom = random.between(0, 5);
    }
    image.width = image.pitch = width;
    image.height = height;
    image.pixels.resize(static_cast<std::size_t>(width) * static_cast<std::size_t>(height));
    for (auto& word : image.pixels) word = random_colour(random);
    sprite = std::make_unique<Sprite_c>();
    sprite->Allocate(static_cast<unsigned>(width), static_cast<unsigned>(height));
    std::copy(image.pixels.begin(), image.pixels.end(), sprite->pixels);
    sprite->left = image.left;
    sprite->top = image.top;
    sprite->right = image.right;
    sprite->bottom = image.bottom;
  }

  // Margins of both signs, which often cancel a whole side of the image.
  void odd_margins(test_random& random) {
    const auto draw = [&](int stored, int& before, int& after) {
      before = random.between(-stored - 4, 6);
      after = random.one_in(3) ? -stored - before : random.between(-stored - 4, 6);
    };
    draw(image.width, image.left, image.right);
    draw(image.height, image.top, image.bottom);
    sprite->left = image.left;
    sprite->top = image.top;
    sprite->right = image.right;
    sprite->bottom = image.bottom;
  }

  void random_target(test_random& random, int width, int height, bool with_depth) {
    make_target(width, height, true, with_depth);
    for (auto& word : expected.colour = colour.copy()) word = random_colour(random);
    std::copy(expected.colour.begin(), expected.colour.end(), colour.data());
    expected.depth.clear();
    if (with_depth) {
      for (auto& value : expected.depth = depth.copy()) value = static_cast<float>(random.between(-3, 3));
      std::copy(expected.depth.begin(), expected.depth.end(), depth.data());
    }
    expected.width = width;
    expected.height = height;
    kit().setclipping(random.between(-3, width / 2), random.between(-3, height / 2), random.between(1, width + 3),
                      random.between(1, height + 3));
    expected.clip_x0 = kit().clip_x0;
    expected.clip_y0 = kit().clip_y0;
    expected.clip_x1 = kit().clip_x1;
    expected.clip_y1 = kit().clip_y1;
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
    Java_wa_l(env, mask_peer, 0, pool_peer, mask.width, mask.height,
              java.new_ints({mask.starts.begin(), mask.starts.end()}),
              java.new_ints({mask.lengths.begin(), mask.lengths.end()}));
  }

  // The whole target, colour and depth, and every pixel of the sprite.
  testing::AssertionResult same() {
    for (int i = 0; i < expected.width * expected.height; ++i) {
      const auto at = static_cast<std::size_t>(i);
      if (colour.data()[i] != expected.colour[at]) {
        return testing::AssertionFailure() << "colour at (" << i % expected.width << ", " << i / expected.width
                                           << "): " << std::hex << colour.data()[i] << " for " << expected.colour[at];
      }
      if (!expected.depth.empty() && depth.data()[i] != expected.depth[at]) {
        return testing::AssertionFailure() << "depth " << i << " was written";
      }
    }
    if (!std::equal(image.pixels.begin(), image.pixels.end(), sprite->pixels)) {
      return testing::AssertionFailure() << "the sprite was written";
    }
    return testing::AssertionSuccess();
  }

  void record(const std::string& name) { frame_record::add(name.c_str(), colour.data(), colour.elements()); }

  void TearDown() override {
    Java_wa_ma(env, mask_peer);
    toolkit_fixture::TearDown();
  }
};
