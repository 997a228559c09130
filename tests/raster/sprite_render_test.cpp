// Sprites through their natives against the slow reference, whole targets; then what is known by hand, and wrong calls.
#include <climits>
#include <functional>
#include <limits>

#include "raster/sprite_scene.h"

namespace {

enum way { plain, scaled, tested, tiled, parallelogram, masked, masked_parallelogram, ways };

// The arguments of all ways to draw.
struct call {
  int x = 0, y = 0, z = -9, w = 9, h = 9;
  float corners[6] = {0, 0, 9, 0, 0, 9};
  oracle::sprite_modes modes = {};
  int mask_x = 0, mask_y = 0;
};

class sprite_render : public sprite_scene {
 public:
  void draw(way how, jlong drawn, jlong by_mask, const call& n) {
    const auto& [op, operand, blend] = n.modes;
    const jint colour_word = static_cast<jint>(operand);
    const float* const c = n.corners;
    switch (how) {
      case plain:
        return Java_fa_Y(env, nullptr, drawn, n.x, n.y, op, colour_word, blend);
      case scaled:
        return Java_fa_ha(env, nullptr, drawn, n.x, n.y, n.w, n.h, op, colour_word, blend);
      case tested:
        return Java_fa_G(env, nullptr, drawn, n.x, n.y, n.z, n.w, n.h, op, colour_word, blend);
      case tiled:
        return Java_fa_aa(env, nullptr, drawn, n.x, n.y, n.w, n.h, op, colour_word, blend);
      case parallelogram:
        return Java_fa_e(env, nullptr, drawn, c[0], c[1], c[2], c[3], c[4], c[5], op, colour_word, blend);
      case masked:
        return Java_fa_o(env, nullptr, drawn, n.x, n.y, by_mask, n.mask_x, n.mask_y);
      default:
        return Java_fa_FA(env, nullptr, drawn, c[0], c[1], c[2], c[3], c[4], c[5], 99, by_mask, n.mask_x, n.mask_y,
                          blend);
    }
  }

  void draw_slowly(way how, const call& n) {
    const float z = static_cast<float>(n.z);
    switch (how) {
      case plain:
        return oracle::draw(expected, image, n.modes, n.x, n.y, nullptr);
      case scaled:
      case tested:
        return oracle::draw_scaled(expected, image, n.modes, n.x, n.y, n.w, n.h, how == tested ? &z : nullptr);
      case tiled:
        return oracle::draw_tiled(expected, image, n.modes, n.x, n.y, n.w, n.h);
      case parallelogram:
        return oracle::draw_parallelogram(expected, image, n.modes, n.corners, nullptr);
      case masked:
        return oracle::draw(expected, image, {1, 0, 1}, n.x, n.y, &mask);
      default:  // any other blend than 1 replaces
        return oracle::draw_parallelogram(expected, image, {1, 0, n.modes.blend == 1 ? 1 : 0}, n.corners, &mask);
    }
  }

  testing::AssertionResult same_after(way how, const call& n) {
    draw(how, handle(), mask_handle(), n);
    draw_slowly(how, n);
    EXPECT_EQ(java.take_exception(), "");
    return same();
  }

  call random_call(test_random& random) {
    call n;
    n.x = random.between(-30, 60), n.y = random.between(-30, 40), n.z = random.between(-4, 4);
    n.w = random.between(-20, 130), n.h = random.between(-20, 90);
    n.mask_x = mask.x, n.mask_y = mask.y;
    // Turned, sheared and scaled.
    float* const c = n.corners;
    c[0] = random.real(-20, 70), c[1] = random.real(-20, 50);
    for (int i = 2; i < 6; ++i) c[i] = c[i % 2] + random.real(-40, 40);
    if (random.one_in(3)) {  // axes along the target's, in whole pixels
      for (int i = 0; i < 6; ++i) c[i] = static_cast<float>(static_cast<int>(c[i]));
      const bool turned = random.one_in(2);
      c[turned ? 2 : 3] = c[turned ? 0 : 1];
      c[turned ? 5 : 4] = c[turned ? 1 : 0];
    }
    return n;
  }
};

TEST_F(sprite_render, every_way_with_every_pair_of_modes_equals_the_reference) {
  for (int how = 0; how < ways; ++how) {
    for (int pair = 0; pair < 15; ++pair) {
      test_random random(static_cast<std::uint64_t>(pair) * 1000 + 7);
      for (int i = 0; i < 80; ++i) {
        random_target(random, random.between(1, 60), random.between(1, 40), how == tested);
        random_sprite(random, random.between(1, 24), random.between(1, 24), random.one_in(2));
        if (random.one_in(5)) odd_margins(random);
        random_mask(random, 50, 40);
        call n = random_call(random);
        n.modes = {pair / 3, random_colour(random), pair % 3};
        ASSERT_TRUE(same_after(way(how), n)) << "way " << how << " operation " << n.modes.colourop << " colour "
                                             << n.modes.colour << " blend " << n.modes.blend << " call " << i;
        // The clip rectangle is as it was.
        const toolkit& k = kit();
        ASSERT_EQ(std::tuple(k.clip_x0, k.clip_y0, k.clip_x1, k.clip_y1),
                  std::tuple(expected.x0, expected.y0, expected.x1, expected.y1));
        ASSERT_EQ(Rasterizer_n::GetCliprect()->width, expected.x1 - expected.x0);
      }
      record("sprite_" + std::to_string(how) + "_" + std::to_string(pair));
    }
  }
}

// Every pair of widths: the steps in float, and the division at the end of a row, each by its own rounding.
TEST_F(sprite_render, every_scale_equals_the_reference) {
  test_random random(9);
  for (int width = 1; width <= 48; ++width) {
    random_sprite(random, width, 1, false);
    random_target(random, 150, 1, false);
    for (int to = 1; to <= 150; ++to) {
      kit().setclipping(to % 5, 0, 150 - to % 3, 1);
      expect_target();
      ASSERT_TRUE(same_after(scaled, {.w = to, .h = 1})) << width << " to " << to;
    }
  }
}

// Wide targets are drawn in strips; columns must go on across them. Large images show where the steps' rounding goes.
TEST_F(sprite_render, wide_scaled_sprites_equal_the_reference) {
  test_random random(50);
  for (int i = 0; i < 40; ++i) {
    random_target(random, random.between(500, 1700), 3, false);
    random_sprite(random, random.between(1, 3000), random.between(1, 4), random.one_in(2));
    const int x = random.between(-900, 100), w = random.between(500, 3000), h = random.between(1, 9);
    ASSERT_TRUE(same_after(scaled, {.x = x, .y = -1, .w = w, .h = h})) << "call " << i;
  }
  record("sprite_scaled_wide");
}

// Of 507 rows over 8500 the steps' roundings add up past the last row: that takes the image's last pixel.
TEST_F(sprite_render, steps_that_add_up_past_the_image_take_its_last_pixel) {
  test_random random(51);
  random_target(random, 8, 8500, false);
  kit().setclipping(0, 0, 8, 8500);
  expect_target();
  random_sprite(random, 5, 507, false);
  ASSERT_TRUE(same_after(scaled, {.w = 8, .h = 8500}));
}

// Half of an odd size loses half a texel, which the pixel's centre makes up for in this direction.
TEST_F(sprite_render, a_parallelogram_of_the_images_size_draws_it_unchanged) {
  for (int size = 1; size < 40; ++size) {
    test_random random(static_cast<std::uint64_t>(size));
    random_target(random, 50, 50, false);
    random_sprite(random, size, 41 - size, true);
    const auto x = static_cast<float>(-image.left), y = static_cast<float>(-image.top);
    const float right = x + static_cast<float>(image.full_width()),
                bottom = y + static_cast<float>(image.full_height());
    draw(parallelogram, handle(), 0, {.corners = {x, y, right, y, x, bottom}});
    draw_slowly(plain, {.x = -image.left, .y = -image.top});
    ASSERT_TRUE(same()) << size;
  }
}

TEST_F(sprite_render, tiles_of_no_size_and_huge_areas) {
  test_random random(8);
  random_target(random, 30, 30, false);
  random_sprite(random, 0, 0, false);
  draw(tiled, handle(), 0, {.w = 20, .h = 20});
  EXPECT_TRUE(same()) << "an image of no size draws nothing";
  random_sprite(random, 3, 2, false);
  draw(tiled, handle(), 0, {.x = -2000000001, .y = -4, .w = INT_MAX, .h = INT_MAX});
  expected.for_clip([&](int x, int y) { expected.at(x, y) = image.word((y + 4) % 2 * 3 + (x + 2000000001) % 3); });
  EXPECT_TRUE(same());
}

// All 65,536 pairs of a source byte and a weight, through every operation and blend.
TEST_F(sprite_render, arithmetic_is_exact_for_every_byte) {
  make_target(256, 1);
  for (int pair = 0; pair < 15; ++pair) {
    for (const std::uint32_t destination : {0x00000000u, 0x64010203u, 0x807F80FEu, 0xFFFFFFFFu}) {
      for (std::uint32_t weight = 0; weight < 256; weight += pair < 9 ? 1 : 5) {
        image = {0, 0, 0, 0, 256, 1, {}};
        for (std::uint32_t s = 0; s < 256; ++s) {
          image.pixels.push_back(weight << 24 | s << 16 | (255 - s) << 8 | (s * 7 & 0xFF));
        }
        make_sprite();
        colour.fill(destination);
        expect_target();
        const std::uint32_t operand = weight << 24 | weight << 16 | 0xFF00 | (255 - weight);
        ASSERT_TRUE(same_after(plain, {.modes = {pair / 3, operand, pair % 3}})) << pair << " weight " << weight;
      }
    }
  }
}

// Worked out by hand, so that library and reference cannot be wrong together.
TEST_F(sprite_render, known_pixels) {
  make_target(1, 1);
  const struct {
    const char* rule;
    std::uint32_t source, before;
    oracle::sprite_modes modes;
    std::uint32_t after;
  } pixels[] = {
      {"a full alpha costs one", 0xFF640001, 0x64646464, {1, 0, 1}, 0xFE630000},
      {"no alpha leaves the target", 0x00123456, 0x89ABCDEF, {1, 0, 1}, 0x89ABCDEF},
      {"additive", 0xC8C8C8C8, 0x64646400, {1, 0, 2}, 0xFFFFFFC8},
      {"modulate", 0x80C0FF01, 0, {0, 0xFF80FF00, 0}, 0x7F60FE00},
      {"add", 0xC8C8C8C8, 0, {3, 0xFF000001, 0}, 0xFFC8C8C9},
      {"subtract", 0x10203040, 0, {4, 0x11202F00, 0}, 0x00000140},
      {"mix of weight 0 is the colour times 255", 0x12345678, 0, {2, 0x00FF8001, 0}, 0x00FE7F00},
      {"mix of weight 64", 0xFF80C001, 0, {2, 0x40FF8000, 0}, 0x6EDE8F00},
      {"mix: from weight 128 on a channel that is not 0 is 255", 0x01000100, 0, {2, 0x80000000, 0}, 0xBE00FF00},
  };
  for (const auto& p : pixels) {
    image = {0, 0, 0, 0, 1, 1, {p.source}};
    make_sprite();
    colour.fill(p.before);
    draw(plain, handle(), 0, {.modes = p.modes});
    EXPECT_EQ(colour.at(0, 0), p.after) << p.rule;
  }
}

TEST_F(sprite_render, modes_that_do_not_exist_and_missing_targets_draw_nothing) {
  test_random random(1);
  random_target(random, 20, 20, true);
  random_sprite(random, 8, 8, false);
  for (const auto& [colourop, blend] : {std::pair{5, 0}, {-1, 0}, {0, 3}, {0, -1}, {INT_MIN, INT_MAX}, {-1, 3}}) {
    for (const way how : {plain, scaled, tested, tiled, parallelogram}) {
      draw(how, handle(), 0, {.modes = {colourop, 1, blend}});
      EXPECT_TRUE(same()) << "way " << how << " operation " << colourop << " blend " << blend;
    }
  }
  for (const bool in_the_toolkit : {false, true}) {  // or in the raster stage alone, as after a target of none
    Rasterizer_n::m_pColourBuffer = in_the_toolkit ? colour.data() : nullptr;
    kit().colourbuffer = in_the_toolkit ? nullptr : colour.data();
    for (int how = 0; how < ways; ++how) draw(way(how), handle(), 0, {});
    EXPECT_TRUE(same());
  }
  EXPECT_EQ(java.take_exception(), "");
}

TEST_F(sprite_render, zero_handles_raise) {
  make_target(4, 4);
  test_random random(3);
  random_sprite(random, 2, 2, false);
  for (int how = 0; how < ways; ++how) {
    EXPECT_EQ(raised([&] { draw(way(how), how < masked ? 0 : handle(), 0, {}); }), "java.lang.NullPointerException: ");
  }
}

// Numbers at the ends of their range, in every argument: nothing outside the image or the target may be touched.
TEST_F(sprite_render, extreme_numbers_do_no_harm) {
  test_random random(4);
  static constexpr int ints[] = {INT_MIN, INT_MIN + 1, -70000, -1, 0, 1, 7, 70000, INT_MAX - 1, INT_MAX};
  static constexpr float nan = std::numeric_limits<float>::quiet_NaN(),
                         infinity = std::numeric_limits<float>::infinity();
  static constexpr float floats[] = {nan, infinity, -infinity, 3e38f, -3e38f, 2147483648.0f, -70000, -1, -0.0f,
                                     0,   1e-30f,   0.5f,      9,     30,     70000,         1e12f};
  for (int number = 0; number < 4000; ++number) {
    if (number % 100 == 0) random_target(random, 37, 21, true);
    random_sprite(random, random.between(0, 5), random.between(0, 5), false);
    for (int* margin : {&sprite->left, &sprite->top, &sprite->right, &sprite->bottom}) {
      if (random.one_in(3)) *margin = ints[random.between(0, 9)];
    }
    random_mask(random, 40, 20);
    call n{.modes = {random.between(0, 4), 1, random.between(0, 2)}};
    for (int* value : {&n.x, &n.y, &n.z, &n.w, &n.h, &n.mask_x, &n.mask_y}) *value = ints[random.between(0, 9)];
    for (float& value : n.corners) value = floats[random.between(0, 15)];
    for (int how = 0; how < ways; ++how) draw(way(how), handle(), mask_handle(), n);
  }
  EXPECT_TRUE(colour.intact() && depth.intact());
}

}  // namespace
