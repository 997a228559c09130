// The 2D primitives against the scalar oracle, through their natives, and what they refuse.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <bit>
#include <chrono>
#include <climits>
#include <vector>

#include "natives/native.h"
#include "reference/primitives_oracle.h"
#include "support/frame_record.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

struct call {
  int x, y, w, h, u, v;
  std::uint32_t colour;
  unsigned int mode;

  jint ink() const { return static_cast<jint>(colour); }
  jint how() const { return static_cast<jint>(mode); }
  int radius() const { return h % 300000; }  // the oracle goes the whole way round
  float far() const { return std::bit_cast<float>(colour & 0x3FFFFFFF); }
};

std::ostream& operator<<(std::ostream& out, const call& c) {
  return out << c.x << ' ' << c.y << ' ' << c.w << ' ' << c.h << ' ' << c.u << ' ' << c.v << std::hex << " colour "
             << c.colour << std::dec << " mode " << c.mode;
}

// How each primitive is called, in the oracle (which says whether the call is legal) and in the library.
using oracle = primitives_oracle;
struct primitive {
  const char* name;
  std::function<bool(oracle&, const call&, const oracle::shape& mask)> expected;
  std::function<void(JNIEnv*, jobject peer, const call&, jobject mask)> drawn;
};
const auto no_mask = nullptr;
const primitive all[] = {
    {"rectangle", [](auto& o, auto& c, auto&) { return o.rect_fill(c.x, c.y, c.w, c.h, c.colour, c.mode); },
     [](auto e, auto p, auto& c, auto) { Java_ja_B(e, p, c.x, c.y, c.w, c.h, c.ink(), c.how()); }},
    {"row", [](auto& o, auto& c, auto&) { return o.line_h(c.x, c.y, c.w, c.colour, c.mode); },
     [](auto e, auto p, auto& c, auto) { Java_ja_XA(e, p, c.x, c.y, c.w, c.ink(), c.how()); }},
    {"column", [](auto& o, auto& c, auto&) { return o.line_v(c.x, c.y, c.h, c.colour, c.mode); },
     [](auto e, auto p, auto& c, auto) { Java_ja_G(e, p, c.x, c.y, c.h, c.ink(), c.how()); }},
    {"blended column", [](auto& o, auto& c, auto&) { return o.line_v(c.x, c.y, c.h, c.colour, 1); },
     [](auto, auto, auto& c, auto) { toolkit::m_pInstance->line_v(c.x, c.y, c.h, c.colour); }},
    {"line", [](auto& o, auto& c, auto&) { return o.line(c.x, c.y, c.w, c.h, c.colour, c.mode, no_mask, 0, 0); },
     [](auto e, auto p, auto& c, auto) { Java_ja_YA(e, p, c.x, c.y, c.w, c.h, c.ink(), c.how()); }},
    {"masked line",
     [](auto& o, auto& c, auto& m) { return o.line(c.x, c.y, c.w, c.h, c.colour, c.mode, &m, c.u, c.v); },
     [](auto e, auto p, auto& c, auto m) { Java_ja_R(e, p, c.x, c.y, c.w, c.h, c.ink(), c.how(), m, c.u, c.v); }},
    {"circle", [](auto& o, auto& c, auto&) { return o.circle_fill(c.x, c.y, 0, c.radius(), c.colour, c.mode); },
     [](auto e, auto p, auto& c, auto) { Java_ja_CA(e, p, c.x, c.y, c.radius(), c.ink(), c.how()); }},
    {"circle in depth",
     [](auto& o, auto& c, auto&) { return o.circle_fill(c.x, c.y, c.u % 3, c.radius(), c.colour, c.mode); },
     [](auto e, auto, auto& c, auto) {
       natives::frame(e, [&] { toolkit::m_pInstance->circle_fill(c.x, c.y, c.u % 3, c.radius(), c.colour, c.mode); });
     }},
    {"outline of a circle", [](auto&, auto&, auto&) { return true; },
     [](auto e, auto p, auto& c, auto) { Java_ja_b(e, p, c.x, c.y, c.radius(), c.ink(), c.how()); }},
    {"spans", [](auto& o, auto& c, auto& m) { return o.cls_masked(c.colour, m, c.x, c.y), true; },
     [](auto e, auto p, auto& c, auto m) { Java_ja_DA(e, p, c.ink(), m, c.x, c.y); }},
    {"depth rectangle", [](auto& o, auto& c, auto&) { return o.zbuffer_clear(c.x, c.y, c.w, c.h, c.far()), true; },
     [](auto, auto, auto& c, auto) { toolkit::m_pInstance->zbuffer_clear(c.x, c.y, c.w, c.h, c.far()); }},
    {"clear",
     [](auto& o, auto& c, auto&) {
       if (c.x & 1) o.rect_fill(0, 0, o.width, o.height, c.colour, 0);
       if (c.x & 2) o.zbuffer_clear(0, 0, o.width, o.height, std::bit_cast<float>(0x7F7FC99Eu));
       return true;
     },
     [](auto e, auto p, auto& c, auto) { Java_ja_ba(e, p, c.x, c.ink()); }},
    {"scroll", [](auto& o, auto& c, auto&) { return o.scroll(c.u, c.v), true; },
     [](auto e, auto p, auto& c, auto) { Java_ja_VA(e, p, c.u, c.v); }},
};

int random_coordinate(test_random& random, int size) {
  if (!random.one_in(25)) return random.between(-size / 2 - 8, size + size / 2 + 8);
  if (random.one_in(3)) return random.between(-100000, 100000);
  return random.one_in(2) ? random.between(INT_MIN, INT_MAX) : (random.one_in(2) ? INT_MIN : INT_MAX);
}

call random_call(test_random& random, int width, int height) {
  call c{};
  for (int* n : {&c.x, &c.w}) *n = random_coordinate(random, width);
  for (int* n : {&c.y, &c.h}) *n = random_coordinate(random, height);
  for (int* n : {&c.u, &c.v}) *n = random.one_in(2) ? random.between(-5, 5) : random_coordinate(random, width);
  c.colour = random.word();
  if (random.one_in(3)) c.colour |= 0xFF000000;
  if (random.one_in(10)) c.colour &= 0x00FFFFFF;
  c.mode = random.one_in(20) ? random.word() : static_cast<unsigned int>(random.between(0, 2));
  return c;
}

class primitives : public toolkit_fixture {
 public:
  // The target as the oracle sees it.
  oracle model() {
    return {kit().width,   kit().height,  colour.copy(), depth.copy(),
            kit().clip_x0, kit().clip_y0, kit().clip_x1, kit().clip_y1};
  }
  void randomise(test_random& random) {
    std::generate_n(colour.data(), colour.elements(), [&] { return random.word(); });
    std::generate_n(depth.data(), depth.elements(), [&] { return random.real(-2, 2); });
  }
};

TEST_F(primitives, draw_as_the_oracle_does) {
  test_random random(23);
  std::vector<std::pair<oracle::shape, jobject>> masks;
  for (int i = 0; i < 12; ++i) {
    std::vector<jint> starts(static_cast<std::size_t>(random.between(0, 40))), lengths(starts.size());
    for (jint& start : starts) start = random.one_in(40) ? random.between(INT_MIN, INT_MAX) : random.between(-10, 30);
    for (jint& length : lengths) length = random.one_in(40) ? random.between(INT_MIN, INT_MAX) : random.between(-5, 40);
    masks.push_back({{starts, lengths}, new_mask(starts, lengths)});
  }

  std::uint64_t frames = 0;
  for (int target = 0; target < 600; ++target) {
    make_target(random.between(1, 75), random.between(1, 50), !random.one_in(12), random.one_in(2));
    randomise(random);
    for (int i = 0; i < 60; ++i) {
      if (i % 15 == 0) Java_ja_L(env, peer);
      if (i % 5 == 0 && !random.one_in(4)) {
        Java_ja_r(env, peer, random_coordinate(random, kit().width / 2), random_coordinate(random, kit().height / 2),
                  random_coordinate(random, kit().width * 2), random_coordinate(random, kit().height * 2));
      }
      const call c = random_call(random, kit().width, kit().height);
      const primitive& p = all[random.between(0, std::size(all) - 1)];
      const auto& [mask, mask_peer] = masks[static_cast<std::size_t>(random.between(0, 11))];
      SCOPED_TRACE(testing::Message() << p.name << ' ' << c << " on " << kit().width << 'x' << kit().height << ", clip "
                                      << kit().clip_x0 << ' ' << kit().clip_y0 << ' ' << kit().clip_x1 << ' '
                                      << kit().clip_y1);
      oracle expected = model();
      const bool legal = p.expected(expected, c, mask);
      p.drawn(env, peer, c, mask_peer);
      ASSERT_EQ(java.take_exception(), legal ? "" : bad_argument);
      ASSERT_EQ(colour.copy(), expected.colour);
      ASSERT_TRUE(
          std::ranges::equal(depth.copy(), expected.depth, {}, std::bit_cast<int, float>, std::bit_cast<int, float>));
    }
    frames = frames * 31 + frame_record::hash(colour.data(), colour.elements() * 4);
    frames = frames * 31 + frame_record::hash(depth.data(), depth.elements() * 4);
  }
  const std::uint32_t halves[] = {static_cast<std::uint32_t>(frames), static_cast<std::uint32_t>(frames >> 32)};
  frame_record::add("primitives.random_calls", halves, 2);
  for (const auto& [mask, mask_peer] : masks) Java_wa_ma(env, mask_peer);
}

// Every alpha against every channel value, in the group of four and in the single pixel; and a few sums done by hand.
TEST_F(primitives, combine_every_channel_value_exactly) {
  make_target(259, 1, true, false);
  test_random random(5);
  for (unsigned int mode = 1; mode <= 2; ++mode) {
    for (std::uint32_t a = 0; a < 256; ++a) {
      std::vector<unsigned int> expected;
      const std::uint32_t c = a << 24 | (random.word() & 0xFFFFFF);
      for (int x = 0; x < 259; ++x) {
        const auto d = static_cast<std::uint32_t>(x) & 0xFF;
        colour.at(x, 0) = d << 24 | (255 - d) << 16 | d << 8 | (d ^ 0x55);
        expected.push_back(oracle::combine(colour.at(x, 0), c, mode));
      }
      kit().rect_fill(0, 0, 259, 1, c, mode);
      ASSERT_EQ(colour.copy(), expected) << "colour " << c << " mode " << mode;
    }
  }
  EXPECT_EQ(oracle::combine(0x12345678, 0xFF112233, 1), 0xFF112233u);  // full alpha: the word as given
  EXPECT_EQ(oracle::combine(0xAB345678, 0x00FFFFFF, 1), 0x00345678u);  // no alpha: the colours stay, alpha goes
  EXPECT_EQ(oracle::combine(0xFFFFFFFF, 0x80FFFFFF, 1), 0x80FEFEFEu);  // both products are cut
  EXPECT_EQ(oracle::combine(0x00C0FFEE, 0x00FFFFFF, 2), 0x00FFFFFFu);
  EXPECT_EQ(oracle::combine(0x80FF0102, 0x90FF0304, 2), 0x10FF0406u);  // alpha wraps, and red carries nothing into it
}

TEST_F(primitives, a_sub_rectangle_never_widens_the_clip) {
  make_target(30, 20, true, false);
  Java_ja_r(env, peer, 5, 5, 10, 10);
  Java_ja_o(env, peer, 0, 7, 30, 9);
  const jintArray clip = java.new_ints({9, 9, 9, 9, 9});
  Java_ja_qa(env, peer, clip);
  EXPECT_EQ(java.ints(clip), (std::vector<jint>{5, 7, 10, 9, 9}));
  EXPECT_EQ(Rasterizer_n::GetCliprect()->y, 7);
  EXPECT_EQ(Rasterizer_n::GetCliprect()->height, 2);
}

TEST_F(primitives, huge_shapes_cost_what_is_visible) {
  make_target(64, 48);
  depth.fill(1);
  const auto start = std::chrono::steady_clock::now();
  const jobject mask = new_mask({0, INT_MAX}, {INT_MAX, INT_MAX});
  const int extremes[] = {INT_MIN, INT_MIN + 1, -1 << 30, -1, 0, 20, 1 << 30, INT_MAX - 1, INT_MAX};
  for (const int a : extremes) {
    for (const int b : extremes) {
      for (const int c : extremes) {
        kit().circle_fill(a, b, 0, c, 0x01020304, 2);
        for (const primitive& p : all) p.drawn(env, peer, {a, b, c, a, b, c, 1, 0}, mask);
      }
    }
  }
  Java_wa_ma(env, mask);
  kit().circle_fill(30, 20, 0, INT_MIN, 0xFF123456, 0);
  EXPECT_EQ(std::ranges::count(colour.copy(), 0xFF123456u), 64 * 48);
  const std::chrono::duration<double> time = std::chrono::steady_clock::now() - start;
  EXPECT_LT(time.count(), 5);  // a loop over a radius would take minutes
}

// The form with a point in the world: one pixel, at its place on screen.
TEST_F(primitives, a_world_line_plots_its_first_point) {
  make_target(40, 30);
  Java_ja_GA(env, peer, 0, 1);
  Matrix_c& m = kit().viewprojection;
  const float unit = 1.0f / 1024;
  m = {{{unit, 0, 0, 0}, {0, unit, 0, 0}, {0, 0, unit, unit}, {0, 0, 0, 0}}};  // w = z / 1024
  const auto plotted = [&](int x, int y, int z) {
    colour.fill(0);
    kit().line(x, y, z, 5000, 5000, 5000, 0xFF00FF00, 0);
    const auto words = colour.copy();
    const auto at = std::ranges::find(words, 0xFF00FF00u);
    EXPECT_LE(std::ranges::count(words, 0xFF00FF00u), 1);
    return at == words.end() ? -1 : static_cast<int>(at - words.begin());
  };
  EXPECT_EQ(plotted(0, 0, 1024), 15 * 40 + 20);
  EXPECT_EQ(plotted(512, -512, 1024), 8 * 40 + 30);  // 7.5 rounds to even
  EXPECT_EQ(plotted(1023, 1023, 2048), 22 * 40 + 30);
  EXPECT_EQ(plotted(-1200, 0, 1024), -1);  // left of the screen
  EXPECT_EQ(plotted(0, 1200, 1024), -1);
  EXPECT_EQ(plotted(0, 0, -1024), -1);  // behind the eye
  EXPECT_EQ(plotted(0, 0, 0), -1);
  kit().colourbuffer = nullptr;
  kit().line(0, 0, 1024, 0, 0, 0, 1, 0);
}

TEST_F(primitives, areas_are_copied_as_they_are) {
  make_target(13, 9);
  test_random random(3);
  randomise(random);
  Java_ja_r(env, peer, 4, 4, 5, 5);  // areas know no clip
  const auto before = colour.copy();
  const jintArray area = Java_ja_E(env, peer, 3, 2, 7, 5);
  ASSERT_EQ(java.ints(area).size(), 35u);
  // Back with the rows upside down: the last row comes first, and the stride is negative.
  Java_ja_BA(env, peer, 3, 2, 7, 5, area, 28, -7);
  for (int i = 0; i < 35; ++i) {
    EXPECT_EQ(static_cast<unsigned>(java.ints(area)[i]), before[(2 + i / 7) * 13 + 3 + i % 7]);
    EXPECT_EQ(colour.at(3 + i % 7, 2 + i / 7), before[(6 - i / 7) * 13 + 3 + i % 7]);
  }
  Java_ja_BA(env, peer, 3, 2, 7, 5, area, 0, 7);
  EXPECT_EQ(colour.copy(), before);
  EXPECT_TRUE(java.ints(Java_ja_E(env, peer, 500, 0, 0, INT_MAX)).empty());
}

TEST_F(primitives, wrong_arguments_are_refused_before_anything_is_pinned) {
  make_target(13, 9);
  const jintArray pixels = java.new_ints(std::vector<jint>(40, 7));
  const auto get = [&](jint x, jint y, jint w, jint h) {
    return [=, this] { EXPECT_EQ(Java_ja_E(env, peer, x, y, w, h), nullptr); };
  };
  const auto set = [&](jint x, jint w, jint h, jint offset, jint stride) {
    return [=, this] { Java_ja_BA(env, peer, x, 0, w, h, pixels, offset, stride); };
  };
  expect_raised(bad_argument, {get(-1, 0, 3, 3), get(0, 0, 14, 1), get(10, 8, 3, 2), get(0, 0, -2, -3),
                               get(0, 0, 65536, 65536),  // the product is 0 in 32 bits
                               get(INT_MAX, INT_MAX, INT_MAX, INT_MAX), set(11, 3, 3, 0, 3)});
  expect_raised(out_of_bounds, {set(0, 5, 9, 0, 5), set(0, 5, 2, -1, 5), set(0, 5, 2, 36, 0), set(0, 5, 4, 0, INT_MAX),
                                set(0, 5, 3, 4, -3), set(0, 5, 1, INT_MAX, INT_MAX), [&] {
                                  Java_ja_qa(env, peer, java.new_ints({1, 2, 3}));
                                }});
  expect_raised(
      null_pointer,
      {[&] { Java_ja_BA(env, peer, 0, 0, 1, 1, nullptr, 0, 1); }, [&] { Java_ja_qa(env, peer, nullptr); },
       [&] { Java_ja_DA(env, peer, 1, nullptr, 0, 0); }, [&] { Java_ja_DA(env, peer, 1, java.new_object("wa"), 0, 0); },
       [&] { Java_ja_R(env, peer, 0, 0, 5, 5, 1, 0, nullptr, 0, 0); }});
  EXPECT_EQ(java.calls("GetPrimitiveArrayCritical"), 0);
  EXPECT_EQ(colour.copy(), std::vector<unsigned>(117));

  // No memory for the array, then for the view of it.
  for (const int failing : {1, 2}) {
    java.fail_array_access(failing);
    expect_raised("java.lang.OutOfMemoryError", {get(0, 0, 2, 2)});
  }
  // Without a target reading raises, writing does nothing.
  kit().colourbuffer = nullptr;
  expect_raised("java.lang.Exception: No colour buffer", {get(0, 0, 2, 2)});
  Java_ja_BA(env, peer, 0, 0, 2, 2, pixels, 0, 2);
}

}  // namespace
