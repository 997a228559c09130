#include <climits>
#include <limits>

#include "raster/sprite_scene.h"

namespace {

class sprite_render : public sprite_scene {};

constexpr int pairs = 15;

// Draws `calls` random sprites with each pair of modes and compares the whole target after each.
template <class Draw>
void every_pair(sprite_render& scene, const char* name, int calls, bool with_depth, int most_pixels, Draw draw) {
  for (int pair = 0; pair < pairs; ++pair) {
    test_random random(static_cast<std::uint64_t>(pair) * 1000 + 7);
    for (int call = 0; call < calls; ++call) {
      scene.random_target(random, random.between(1, 60), random.between(1, 40), with_depth);
      scene.random_sprite(random, random.between(1, most_pixels), random.between(1, most_pixels), random.one_in(2));
      if (random.one_in(5)) scene.odd_margins(random);
      const sprite_oracle::modes modes{pair / 3, sprite_scene::random_colour(random), pair % 3};
      draw(random, modes);
      ASSERT_EQ(scene.java.take_exception(), "");
      ASSERT_TRUE(scene.same()) << name << " operation " << modes.colourop << " colour " << std::hex << modes.colour
                                << " blend " << modes.blend << " call " << std::dec << call;
    }
    scene.record(std::string("sprite_") + name + "_" + std::to_string(pair));
  }
}

jint as_int(std::uint32_t word) { return static_cast<jint>(word); }

TEST_F(sprite_render, plain_equals_the_reference) {
  every_pair(*this, "plain", 60, false, 20, [&](test_random& random, const sprite_oracle::modes& m) {
    const int x = random.between(-25, 60), y = random.between(-25, 40);
    Java_fa_Y(env, nullptr, handle(), x, y, m.colourop, as_int(m.colour), m.blend);
    sprite_oracle::draw(expected, image, m, x, y, nullptr);
  });
}

TEST_F(sprite_render, scaled_equals_the_reference) {
  every_pair(*this, "scaled", 80, false, 24, [&](test_random& random, const sprite_oracle::modes& m) {
    const int x = random.between(-70, 60), y = random.between(-70, 40);
    const int w = random.between(-2, 130), h = random.between(-2, 130);
    Java_fa_ha(env, nullptr, handle(), x, y, w, h, m.colourop, as_int(m.colour), m.blend);
    sprite_oracle::draw_scaled(expected, image, m, x, y, w, h);
  });
}

// Every pair of widths: the steps in float, and the division at the end of a row, each by its own rounding.
TEST_F(sprite_render, every_scale_equals_the_reference) {
  test_random random(9);
  for (int width = 1; width <= 48; ++width) {
    random_sprite(random, width, 1, false);
    random_target(random, 150, 1, false);
    for (int to = 1; to <= 150; ++to) {
      kit().setclipping(to % 5, 0, 150 - to % 3, 1);
      expected.clip_x0 = kit().clip_x0;
      expected.clip_x1 = kit().clip_x1;
      Java_fa_ha(env, nullptr, handle(), 0, 0, to, 1, 1, 0, 0);
      sprite_oracle::draw_scaled(expected, image, {1, 0, 0}, 0, 0, to, 1);
      ASSERT_TRUE(same()) << width << " to " << to;
    }
  }
}

// Wide targets are drawn in strips; columns must go on across them. Large images show where the steps' rounding goes.
TEST_F(sprite_render, wide_scaled_sprites_equal_the_reference) {
  for (int call = 0; call < 40; ++call) {
    test_random random(static_cast<std::uint64_t>(call) + 50);
    random_target(random, random.between(500, 1700), 3, false);
    random_sprite(random, random.between(1, 3000), random.between(1, 4), random.one_in(2));
    const int x = random.between(-900, 100), w = random.between(500, 3000), h = random.between(1, 9);
    Java_fa_ha(env, nullptr, handle(), x, -1, w, h, 1, 0, 0);
    sprite_oracle::draw_scaled(expected, image, {1, 0, 0}, x, -1, w, h);
    ASSERT_TRUE(same()) << "call " << call;
  }
  record("sprite_scaled_wide");
}

TEST_F(sprite_render, depth_tested_equals_the_reference) {
  every_pair(*this, "tested", 60, true, 24, [&](test_random& random, const sprite_oracle::modes& m) {
    const int x = random.between(-30, 60), y = random.between(-30, 40), z = random.between(-4, 4);
    const int w = random.between(0, 80), h = random.between(0, 80);
    Java_fa_G(env, nullptr, handle(), x, y, z, w, h, m.colourop, as_int(m.colour), m.blend);
    sprite_oracle::draw_depth_tested(expected, image, m, x, y, z, w, h);
  });
}

TEST_F(sprite_render, masked_equals_the_reference) {
  for (int call = 0; call < 500; ++call) {
    test_random random(static_cast<std::uint64_t>(call) + 100);
    random_target(random, random.between(1, 60), random.between(1, 40), false);
    random_sprite(random, random.between(1, 50), random.between(1, 50), random.one_in(2));
    random_mask(random, 50, 40);
    const int x = random.between(-25, 60), y = random.between(-25, 40);
    Java_fa_o(env, nullptr, handle(), x, y, mask_handle(), mask.x, mask.y);
    sprite_oracle::draw(expected, image, {1, 0, 1}, x, y, &mask);
    ASSERT_TRUE(same()) << "call " << call;
  }
  record("sprite_masked");
}

// The corners of a sprite of the image's size, turned, sheared and scaled.
void random_corners(test_random& random, float corners[6]) {
  corners[0] = random.real(-20, 70);
  corners[1] = random.real(-20, 50);
  for (int i = 2; i < 6; ++i) corners[i] = corners[i % 2] + random.real(-40, 40);
  if (random.one_in(3)) {  // axes along the target's, in whole pixels
    for (int i = 0; i < 6; ++i) corners[i] = static_cast<float>(static_cast<int>(corners[i]));
    const bool turned = random.one_in(2);
    corners[turned ? 2 : 3] = corners[turned ? 0 : 1];
    corners[turned ? 5 : 4] = corners[turned ? 1 : 0];
  }
}

TEST_F(sprite_render, parallelograms_equal_the_reference) {
  every_pair(*this, "parallelogram", 120, false, 24, [&](test_random& random, const sprite_oracle::modes& m) {
    float c[6];
    random_corners(random, c);
    Java_fa_e(env, nullptr, handle(), c[0], c[1], c[2], c[3], c[4], c[5], m.colourop, as_int(m.colour), m.blend);
    sprite_oracle::draw_parallelogram(expected, image, m, c, nullptr);
  });
}

// Any other blend than 1 replaces.
TEST_F(sprite_render, masked_parallelograms_equal_the_reference) {
  for (int call = 0; call < 600; ++call) {
    test_random random(static_cast<std::uint64_t>(call) + 300);
    random_target(random, random.between(1, 60), random.between(1, 40), false);
    random_sprite(random, random.between(1, 30), random.between(1, 30), random.one_in(2));
    random_mask(random, 50, 40);
    float c[6];
    random_corners(random, c);
    const int blend = random.between(0, 2);
    Java_fa_FA(env, nullptr, handle(), c[0], c[1], c[2], c[3], c[4], c[5], 99, mask_handle(), mask.x, mask.y, blend);
    sprite_oracle::draw_parallelogram(expected, image, {1, 0, blend == 1 ? 1 : 0}, c, &mask);
    ASSERT_TRUE(same()) << "call " << call;
  }
  record("sprite_masked_parallelogram");
}

TEST_F(sprite_render, a_parallelogram_of_the_images_size_draws_it_unchanged) {
  for (int size = 1; size < 40; ++size) {
    test_random random(static_cast<std::uint64_t>(size));
    random_target(random, 50, 50, false);
    kit().resetclipping();
    random_sprite(random, size, 41 - size, true);
    const auto x = static_cast<float>(-image.left), y = static_cast<float>(-image.top);
    Java_fa_e(env, nullptr, handle(), x, y, x + static_cast<float>(sprite->full_width()), y, x,
              y + static_cast<float>(sprite->full_height()), 1, 0, 0);
    // Half of an odd size loses half a texel, which the pixel's centre makes up for in this direction.
    for (int i = 0; i < size * (41 - size); ++i) {
      ASSERT_EQ(colour.at(i % size, i / size), image.pixels[static_cast<std::size_t>(i)]) << size << " " << i;
    }
  }
}

TEST_F(sprite_render, tiles_equal_the_reference) {
  every_pair(*this, "tiled", 60, false, 16, [&](test_random& random, const sprite_oracle::modes& m) {
    const int x = random.between(-40, 60), y = random.between(-40, 40);
    const int w = random.between(-20, 100), h = random.between(-20, 90);
    const std::vector<int> clip = {kit().clip_x0, kit().clip_y0, kit().clip_x1, kit().clip_y1};
    Java_fa_aa(env, nullptr, handle(), x, y, w, h, m.colourop, as_int(m.colour), m.blend);
    sprite_oracle::draw_tiled(expected, image, m, x, y, w, h);
    ASSERT_EQ(clip, (std::vector<int>{kit().clip_x0, kit().clip_y0, kit().clip_x1, kit().clip_y1}));
    ASSERT_EQ(Rasterizer_n::GetCliprect()->x, clip[0]);
    ASSERT_EQ(Rasterizer_n::GetCliprect()->width, clip[2] - clip[0]);
  });
}

TEST_F(sprite_render, tiles_of_no_size_and_huge_areas) {
  test_random random(8);
  random_target(random, 30, 30, false);
  random_sprite(random, 0, 0, false);
  Java_fa_aa(env, nullptr, handle(), 0, 0, 20, 20, 1, 0, 0);
  EXPECT_TRUE(same()) << "an image of no size draws nothing";
  random_sprite(random, 3, 2, false);
  Java_fa_aa(env, nullptr, handle(), -2000000001, -4, INT_MAX, INT_MAX, 1, 0, 0);
  for (int y = expected.clip_y0; y < expected.clip_y1; ++y) {
    for (int x = expected.clip_x0; x < expected.clip_x1; ++x) {
      expected.at(x, y) = image.word((y + 4) % 2 * 3 + (x + 2000000001) % 3);
    }
  }
  EXPECT_TRUE(same());
}

// All 65,536 pairs of a source byte and a weight, through every operation and blend.
TEST_F(sprite_render, arithmetic_is_exact_for_every_byte) {
  for (int pair = 0; pair < pairs; ++pair) {
    for (const std::uint32_t destination : {0x00000000u, 0x64010203u, 0x807F80FEu, 0xFFFFFFFFu}) {
      make_target(256, 1);
      expected = {256, 1, 0, 0, 256, 1, std::vector<std::uint32_t>(256, destination), {}};
      image = {};
      image.width = image.pitch = 256;
      image.height = 1;
      image.pixels.resize(256);
      sprite = std::make_unique<Sprite_c>();
      sprite->Allocate(256, 1);
      for (std::uint32_t weight = 0; weight < 256; weight += pair < 9 ? 1 : 5) {
        for (std::uint32_t s = 0; s < 256; ++s) {
          image.pixels[s] = weight << 24 | s << 16 | (255 - s) << 8 | (s * 7 & 0xFF);
          sprite->pixels[s] = image.pixels[s];
        }
        colour.fill(destination);
        std::fill(expected.colour.begin(), expected.colour.end(), destination);
        const sprite_oracle::modes m{pair / 3, weight << 24 | weight << 16 | 0xFF00 | (255 - weight), pair % 3};
        Java_fa_Y(env, nullptr, handle(), 0, 0, m.colourop, as_int(m.colour), m.blend);
        sprite_oracle::draw(expected, image, m, 0, 0, nullptr);
        ASSERT_TRUE(same()) << "pair " << pair << " weight " << weight;
      }
    }
  }
}

// Worked out by hand, so that library and reference cannot be wrong together.
TEST_F(sprite_render, known_pixels) {
  make_target(1, 1);
  image = {0, 0, 0, 0, 1, 1, 1, {0}};
  sprite = std::make_unique<Sprite_c>();
  sprite->Allocate(1, 1);
  const auto draw = [&](std::uint32_t s, std::uint32_t d, int colourop, std::uint32_t operand, int blend) {
    sprite->pixels[0] = s;
    colour.fill(d);
    Java_fa_Y(env, nullptr, handle(), 0, 0, colourop, as_int(operand), blend);
    return colour.at(0, 0);
  };
  EXPECT_EQ(draw(0xFF640001u, 0x64646464u, 1, 0, 1), 0xFE630000u) << "a full alpha costs one";
  EXPECT_EQ(draw(0x00123456u, 0x89ABCDEFu, 1, 0, 1), 0x89ABCDEFu) << "no alpha leaves the target";
  EXPECT_EQ(draw(0x80C0FF01u, 0, 0, 0xFF80FF00u, 0), 0x7F60FE00u) << "modulate";
  EXPECT_EQ(draw(0xC8C8C8C8u, 0, 3, 0xFF000001u, 0), 0xFFC8C8C9u) << "add";
  EXPECT_EQ(draw(0x10203040u, 0, 4, 0x11202F00u, 0), 0x00000140u) << "subtract";
  EXPECT_EQ(draw(0x12345678u, 0, 2, 0x00FF8001u, 0), 0x00FE7F00u) << "mix of weight 0 is the colour times 255";
  EXPECT_EQ(draw(0xFF80C001u, 0, 2, 0x40FF8000u, 0), 0x6EDE8F00u) << "mix of weight 64";
  EXPECT_EQ(draw(0x01000100u, 0, 2, 0x80000000u, 0), 0xBE00FF00u)
      << "from weight 128 on a channel that is not 0 counts as 255";
  EXPECT_EQ(draw(0xC8C8C8C8u, 0x64646400u, 1, 0, 2), 0xFFFFFFC8u) << "additive";
}

TEST_F(sprite_render, a_sprite_without_a_colour_target_draws_nothing) {
  test_random random(1);
  random_target(random, 20, 20, true);
  random_sprite(random, 8, 8, false);
  const auto draw_all = [&] {
    Java_fa_Y(env, nullptr, handle(), 0, 0, 1, 0, 0);
    Java_fa_ha(env, nullptr, handle(), 0, 0, 9, 9, 1, 0, 0);
    Java_fa_G(env, nullptr, handle(), 0, 0, -9, 9, 9, 1, 0, 0);
    Java_fa_o(env, nullptr, handle(), 0, 0, 0, 0, 0);
    Java_fa_e(env, nullptr, handle(), 0, 0, 9, 0, 0, 9, 1, 0, 0);
    Java_fa_FA(env, nullptr, handle(), 0, 0, 9, 0, 0, 9, 0, 0, 0, 0, 0);
    Java_fa_aa(env, nullptr, handle(), 0, 0, 9, 9, 1, 0, 0);
  };
  Rasterizer_n::m_pColourBuffer = nullptr;  // the raster stage's alone, as after a target of none
  draw_all();
  EXPECT_TRUE(same());
  Rasterizer_n::m_pColourBuffer = colour.data();
  kit().colourbuffer = nullptr;
  draw_all();
  EXPECT_TRUE(same());
  EXPECT_EQ(java.take_exception(), "");
}

TEST_F(sprite_render, modes_that_do_not_exist_draw_nothing) {
  test_random random(2);
  random_target(random, 20, 20, true);
  random_sprite(random, 8, 8, false);
  for (const auto& [colourop, blend] : {std::pair{5, 0}, {-1, 0}, {0, 3}, {0, -1}, {INT_MIN, INT_MAX}, {-1, 3}}) {
    Java_fa_Y(env, nullptr, handle(), 4, 4, colourop, -1, blend);
    Java_fa_ha(env, nullptr, handle(), 4, 4, 9, 9, colourop, -1, blend);
    Java_fa_G(env, nullptr, handle(), 4, 4, -9, 9, 9, colourop, -1, blend);
    Java_fa_e(env, nullptr, handle(), 0, 0, 9, 0, 0, 9, colourop, -1, blend);
    Java_fa_aa(env, nullptr, handle(), 0, 0, 9, 9, colourop, -1, blend);
  }
  EXPECT_TRUE(same());
}

TEST_F(sprite_render, zero_handles_raise) {
  make_target(4, 4);
  test_random random(3);
  random_sprite(random, 2, 2, false);
  const auto raised = [&] { return java.take_exception() == "java.lang.NullPointerException: "; };
  Java_fa_Y(env, nullptr, 0, 0, 0, 1, 0, 0);
  EXPECT_TRUE(raised());
  Java_fa_ha(env, nullptr, 0, 0, 0, 4, 4, 1, 0, 0);
  EXPECT_TRUE(raised());
  Java_fa_G(env, nullptr, 0, 0, 0, 0, 4, 4, 1, 0, 0);
  EXPECT_TRUE(raised());
  Java_fa_o(env, nullptr, handle(), 0, 0, 0, 0, 0);
  EXPECT_TRUE(raised());
  Java_fa_e(env, nullptr, 0, 0, 0, 9, 0, 0, 9, 1, 0, 0);
  EXPECT_TRUE(raised());
  Java_fa_FA(env, nullptr, handle(), 0, 0, 9, 0, 0, 9, 0, 0, 0, 0, 0);
  EXPECT_TRUE(raised());
  Java_fa_aa(env, nullptr, 0, 0, 0, 9, 9, 1, 0, 0);
  EXPECT_TRUE(raised());
}

// Numbers at the ends of their range, in every argument: nothing outside the image or the target may be touched.
TEST_F(sprite_render, extreme_numbers_do_no_harm) {
  test_random random(4);
  const auto extreme = [&] {
    static constexpr int values[] = {INT_MIN, INT_MIN + 1, -70000, -1, 0, 1, 7, 70000, INT_MAX - 1, INT_MAX};
    return values[random.between(0, static_cast<int>(std::size(values)) - 1)];
  };
  static constexpr float nan = std::numeric_limits<float>::quiet_NaN(),
                         infinity = std::numeric_limits<float>::infinity();
  static constexpr float extreme_floats[] = {nan, infinity, -infinity, 3e38f, -3e38f, 2147483648.0f, -70000, -1, -0.0f,
                                             0,   1e-30f,   0.5f,      9,     30,     70000,         1e12f};
  for (int call = 0; call < 4000; ++call) {
    if (call % 100 == 0) random_target(random, 37, 21, true);
    random_sprite(random, random.between(0, 5), random.between(0, 5), false);
    for (int* margin : {&sprite->left, &sprite->top, &sprite->right, &sprite->bottom}) {
      if (random.one_in(3)) *margin = extreme();
    }
    const int x = extreme(), y = extreme(), w = extreme(), h = extreme();
    const int op = random.between(0, 4), blend = random.between(0, 2);
    Java_fa_Y(env, nullptr, handle(), x, y, op, 1, blend);
    Java_fa_ha(env, nullptr, handle(), x, y, w, h, op, 1, blend);
    Java_fa_G(env, nullptr, handle(), x, y, extreme(), w, h, op, 1, blend);
    random_mask(random, 40, 20);
    Java_fa_o(env, nullptr, handle(), x, y, mask_handle(), extreme(), extreme());
    Java_fa_aa(env, nullptr, handle(), x, y, w, h, op, 1, blend);
    float c[6];
    for (float& value : c) value = extreme_floats[random.between(0, static_cast<int>(std::size(extreme_floats)) - 1)];
    Java_fa_e(env, nullptr, handle(), c[0], c[1], c[2], c[3], c[4], c[5], op, 1, blend);
    Java_fa_FA(env, nullptr, handle(), c[0], c[1], c[2], c[3], c[4], c[5], 0, mask_handle(), extreme(), extreme(),
               blend);
  }
  EXPECT_TRUE(colour.intact() && depth.intact());
}

}  // namespace
