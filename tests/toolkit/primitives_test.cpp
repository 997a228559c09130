// The 2D primitives against the scalar oracle, their rules for wild and wrong arguments, and their natives.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <bit>
#include <chrono>
#include <climits>
#include <cstring>
#include <memory>
#include <vector>

#include "reference/primitives_oracle.h"
#include "support/frame_record.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"
#include "toolkit/clippingmask.h"

namespace {

const std::string illegal_argument = "java.lang.IllegalArgumentException: ";

class primitives : public toolkit_fixture {
 public:
  struct mask {
    primitives_oracle::shape shape;
    jobject peer;
  };

  void TearDown() override {
    for (const mask& m : masks) Java_wa_ma(env, m.peer);
    toolkit_fixture::TearDown();
  }

  mask& make_mask(const std::vector<int>& starts, const std::vector<int>& lengths) {
    masks.push_back({{starts, lengths}, java.new_object("wa")});
    Java_wa_l(env, masks.back().peer, 0, pool_peer, 0, 0, java.new_ints(starts), java.new_ints(lengths));
    return masks.back();
  }

  // The target as the oracle sees it.
  primitives_oracle model() {
    return {kit().width,   kit().height,  colour.copy(), depth.copy(),
            kit().clip_x0, kit().clip_y0, kit().clip_x1, kit().clip_y1};
  }
  testing::AssertionResult matches(const primitives_oracle& expected) {
    for (std::size_t i = 0; i < expected.colour.size(); ++i) {
      if (colour.data()[i] != expected.colour[i]) return difference("colour", i, colour.data()[i], expected.colour[i]);
    }
    for (std::size_t i = 0; i < expected.depth.size(); ++i) {
      const auto is = std::bit_cast<std::uint32_t>(depth.data()[i]);
      const auto wanted = std::bit_cast<std::uint32_t>(expected.depth[i]);
      if (is != wanted) return difference("depth", i, is, wanted);
    }
    return testing::AssertionSuccess();
  }
  void randomise(test_random& random) {
    std::generate_n(colour.data(), colour.elements(), [&] { return random.word(); });
    std::generate_n(depth.data(), depth.elements(), [&] { return random.real(-2, 2); });
  }

  // Runs an operation of the toolkit; false when it raised IllegalArgumentException with the empty message.
  template <class Operation>
  bool accepted(Operation&& operation) {
    try {
      operation();
      return true;
    } catch (Exception* failure) {
      const std::unique_ptr<Exception> owned(failure);
      EXPECT_NE(dynamic_cast<IllegalArgumentException*>(failure), nullptr);
      EXPECT_STREQ(failure->text(), "");
      return false;
    }
  }

  std::vector<mask> masks;

 private:
  testing::AssertionResult difference(const char* image, std::size_t i, std::uint32_t is, std::uint32_t wanted) {
    const auto width = static_cast<std::size_t>(kit().width);
    char text[120];
    std::snprintf(text, sizeof text, "%s (%zu, %zu): %08X, expected %08X", image, i % width, i / width, is, wanted);
    return testing::AssertionFailure() << text;
  }
};

// --- Random calls
// -----------------------------------------------------------------------------------------------------

struct call {
  enum kind { fill, horizontal, vertical, line, masked_line, circle, masked_clear, depth_clear, clear, scroll, kinds };

  int what;
  std::array<int, 6> n;  // coordinates and sizes
  std::uint32_t colour;
  unsigned int mode;
  std::size_t mask;
};

std::ostream& operator<<(std::ostream& out, const call& c) {
  out << "call " << c.what << " (";
  for (const int n : c.n) out << n << ' ';
  return out << ") colour " << std::hex << c.colour << std::dec << " mode " << c.mode << " mask " << c.mask;
}

int random_coordinate(test_random& random, int size) {
  if (!random.one_in(25)) return random.between(-size / 2 - 8, size + size / 2 + 8);
  if (random.one_in(3)) return random.between(-100000, 100000);
  return random.one_in(2) ? random.between(INT_MIN, INT_MAX) : (random.one_in(2) ? INT_MIN : INT_MAX);
}

call random_call(test_random& random, int width, int height, std::size_t masks) {
  call c{};
  c.what = random.between(0, call::kinds - 1);
  if (c.what == call::scroll && !random.one_in(3)) c.what = call::fill;
  for (std::size_t i = 0; i < c.n.size(); ++i) c.n[i] = random_coordinate(random, i % 2 == 0 ? width : height);
  if (c.what == call::circle) {
    c.n[2] = random.one_in(30) ? random.between(-300000, 300000) : random.between(-height, height);
    c.n[3] = random.one_in(3) ? 0 : random.between(-3, 3);
  }
  if (c.what == call::scroll && !random.one_in(5)) {
    c.n[0] = random.between(-9, 9);
    c.n[1] = random.between(-3, 3);
  }
  c.colour = random.word();
  if (random.one_in(3)) c.colour |= 0xFF000000;
  if (random.one_in(10)) c.colour &= 0x00FFFFFF;
  c.mode = random.one_in(20) ? random.word() : static_cast<unsigned int>(random.between(0, 2));
  c.mask = static_cast<std::size_t>(random.between(0, static_cast<int>(masks) - 1));
  return c;
}

bool by_oracle(primitives_oracle& o, const call& c, const primitives_oracle::shape& mask) {
  const auto& n = c.n;
  switch (c.what) {
    case call::fill:
      return o.rect_fill(n[0], n[1], n[2], n[3], c.colour, c.mode);
    case call::horizontal:
      return o.line_h(n[0], n[1], n[2], c.colour, c.mode);
    case call::vertical:
      return o.line_v(n[0], n[1], n[2], c.colour, c.mode);
    case call::line:
      return o.line(n[0], n[1], n[2], n[3], c.colour, c.mode, nullptr, 0, 0);
    case call::masked_line:
      return o.line(n[0], n[1], n[2], n[3], c.colour, c.mode, &mask, n[4], n[5]);
    case call::circle:
      return o.circle_fill(n[0], n[1], n[3], n[2], c.colour, c.mode);
    case call::masked_clear:
      o.cls_masked(c.colour, mask, n[0], n[1]);
      return true;
    case call::depth_clear:
      o.zbuffer_clear(n[0], n[1], n[2], n[3], std::bit_cast<float>(c.colour & 0x3FFFFFFF));
      return true;
    case call::clear:
      if (n[0] & 1) o.rect_fill(0, 0, o.width, o.height, c.colour, 0);
      if (n[0] & 2) o.zbuffer_clear(0, 0, o.width, o.height, std::bit_cast<float>(0x7F7FC99Eu));
      return true;
    default:
      o.scroll(n[0], n[1]);
      return true;
  }
}

void by_operation(toolkit& kit, const call& c, clippingmask& mask) {
  const auto& n = c.n;
  switch (c.what) {
    case call::fill:
      return kit.rect_fill(n[0], n[1], n[2], n[3], c.colour, c.mode);
    case call::horizontal:
      return kit.line_h(n[0], n[1], n[2], c.colour, c.mode);
    case call::vertical:
      return c.mode == 1 ? kit.line_v(n[0], n[1], n[2], c.colour) : kit.line_v(n[0], n[1], n[2], c.colour, c.mode);
    case call::line:
      return kit.line(n[0], n[1], n[2], n[3], c.colour, c.mode);
    case call::masked_line:
      return kit.line(n[0], n[1], n[2], n[3], c.colour, c.mode, mask, n[4], n[5]);
    case call::circle:
      return kit.circle_fill(n[0], n[1], n[3], n[2], c.colour, c.mode);
    case call::masked_clear:
      return kit.cls_masked(c.colour, mask, n[0], n[1]);
    default:
      return kit.zbuffer_clear(n[0], n[1], n[2], n[3], std::bit_cast<float>(c.colour & 0x3FFFFFFF));
  }
}

void by_native(JNIEnv* env, jobject peer, const call& c, jobject mask) {
  const auto& n = c.n;
  const auto colour = static_cast<jint>(c.colour);
  const auto mode = static_cast<jint>(c.mode);
  switch (c.what) {
    case call::fill:
      return Java_ja_B(env, peer, n[0], n[1], n[2], n[3], colour, mode);
    case call::horizontal:
      return Java_ja_XA(env, peer, n[0], n[1], n[2], colour, mode);
    case call::vertical:
      return Java_ja_G(env, peer, n[0], n[1], n[2], colour, mode);
    case call::line:
      return Java_ja_YA(env, peer, n[0], n[1], n[2], n[3], colour, mode);
    case call::masked_line:
      return Java_ja_R(env, peer, n[0], n[1], n[2], n[3], colour, mode, mask, n[4], n[5]);
    case call::circle:
      return Java_ja_CA(env, peer, n[0], n[1], n[2], colour, mode);
    case call::masked_clear:
      return Java_ja_DA(env, peer, colour, mask, n[0], n[1]);
    case call::clear:
      return Java_ja_ba(env, peer, n[0], colour);
    default:
      return Java_ja_VA(env, peer, n[0], n[1]);
  }
}

TEST_F(primitives, draw_as_the_oracle_does) {
  test_random random(23);
  for (int i = 0; i < 12; ++i) {
    std::vector<int> starts(static_cast<std::size_t>(random.between(0, 40)));
    std::vector<int> lengths(starts.size());
    for (int& start : starts) start = random.one_in(40) ? random.between(INT_MIN, INT_MAX) : random.between(-10, 30);
    for (int& length : lengths) length = random.one_in(40) ? random.between(INT_MIN, INT_MAX) : random.between(-5, 40);
    make_mask(starts, lengths);
  }

  std::uint64_t frames = 0;
  for (int target = 0; target < 600; ++target) {
    make_target(random.between(1, 75), random.between(1, 50), !random.one_in(12), random.one_in(2));
    randomise(random);
    for (int i = 0; i < 60; ++i) {
      if (i % 5 == 0) {
        if (random.one_in(4)) {
          Java_ja_L(env, peer);
        } else {
          Java_ja_r(env, peer, random_coordinate(random, kit().width / 2), random_coordinate(random, kit().height / 2),
                    random_coordinate(random, kit().width * 2), random_coordinate(random, kit().height * 2));
        }
      }
      call c = random_call(random, kit().width, kit().height, masks.size());
      const mask& m = masks[c.mask];
      const bool native_only = c.what == call::clear || c.what == call::scroll;
      const bool through_native = native_only || (c.what != call::depth_clear && random.one_in(2));
      if (through_native && c.what == call::circle) c.n[3] = 0;
      primitives_oracle expected = model();
      const bool legal = by_oracle(expected, c, m.shape);
      if (through_native) {
        by_native(env, peer, c, m.peer);
        EXPECT_EQ(java.take_exception(), legal ? "" : illegal_argument) << c;
      } else {
        EXPECT_EQ(accepted([&] { by_operation(kit(), c, *native<clippingmask>(m.peer)); }), legal) << c;
      }
      ASSERT_TRUE(matches(expected)) << c << " on " << kit().width << 'x' << kit().height << ", clip " << kit().clip_x0
                                     << ' ' << kit().clip_y0 << ' ' << kit().clip_x1 << ' ' << kit().clip_y1;
    }
    frames = frames * 31 + frame_record::hash(colour.data(), colour.elements() * 4);
    frames = frames * 31 + frame_record::hash(depth.data(), depth.elements() * 4);
  }
  const std::uint32_t halves[] = {static_cast<std::uint32_t>(frames), static_cast<std::uint32_t>(frames >> 32)};
  frame_record::add("primitives.random_calls", halves, 2);
}

// Every alpha against every channel value, in the group of four and in the single pixel.
TEST_F(primitives, combine_every_channel_value_exactly) {
  make_target(259, 1, true, false);
  test_random random(5);
  for (unsigned int mode = 1; mode <= 2; ++mode) {
    for (std::uint32_t a = 0; a < 256; ++a) {
      for (int x = 0; x < 259; ++x) {
        const auto d = static_cast<std::uint32_t>(x) & 0xFF;
        colour.at(x, 0) = d << 24 | (255 - d) << 16 | d << 8 | (d ^ 0x55);
      }
      const std::uint32_t c = a << 24 | (random.word() & 0xFFFFFF);
      const guarded_image<unsigned int>& before = colour;
      std::vector<unsigned int> expected = const_cast<guarded_image<unsigned int>&>(before).copy();
      for (unsigned int& word : expected) word = primitives_oracle::combine(word, c, mode);
      kit().rect_fill(0, 0, 259, 1, c, mode);
      ASSERT_EQ(colour.copy(), expected) << "colour " << c << " mode " << mode;
    }
  }
}

// --- Named rules
// --------------------------------------------------------------------------------------------------------

TEST_F(primitives, corners_of_the_arithmetic) {
  make_target(5, 1);
  const auto drawn = [&](std::uint32_t d, std::uint32_t c, unsigned int mode) {
    colour.at(1, 0) = d;
    kit().rect_fill(1, 0, 1, 1, c, mode);
    return colour.at(1, 0);
  };
  EXPECT_EQ(drawn(0x12345678, 0xFF112233, 1), 0xFF112233u);  // full alpha: the word as given
  EXPECT_EQ(drawn(0xAB345678, 0x00FFFFFF, 1), 0x00345678u);  // no alpha: the colours stay, alpha goes
  EXPECT_EQ(drawn(0xFFFFFFFF, 0x80FFFFFF, 1), 0x80FEFEFEu);  // both products are cut
  EXPECT_EQ(drawn(0x00C0FFEE, 0x00FFFFFF, 2), 0x00FFFFFFu);
  EXPECT_EQ(drawn(0x80FF0102, 0x90FF0304, 2), 0x10FF0406u);  // alpha wraps, and red carries nothing into it
}

TEST_F(primitives, wrong_modes_raise_where_something_could_be_drawn) {
  make_target(20, 10);
  auto& m = make_mask({0, 0}, {4, 4});
  const auto raised = [&](auto&& draw) {
    draw();
    return java.take_exception() == illegal_argument;
  };
  Java_ja_r(env, peer, 5, 2, 15, 8);
  for (const jint mode : {3, 5, -1, INT_MIN}) {
    EXPECT_TRUE(raised([&] { Java_ja_B(env, peer, 100, 100, 5, 5, -1, mode); }));
    EXPECT_TRUE(raised([&] { Java_ja_B(env, peer, 6, 3, 0, -7, -1, mode); }));
    EXPECT_TRUE(raised([&] { Java_ja_YA(env, peer, -9, -9, -5, -5, -1, mode); }));
    EXPECT_TRUE(raised([&] { Java_ja_R(env, peer, -9, -9, -5, -5, -1, mode, m.peer, 0, 0); }));
    EXPECT_TRUE(raised([&] { Java_ja_CA(env, peer, 100, 100, 2, -1, mode); }));
    EXPECT_TRUE(raised([&] { Java_ja_XA(env, peer, 100, 2, 5, -1, mode); }));  // its row is inside
    EXPECT_FALSE(raised([&] { Java_ja_XA(env, peer, 6, 8, 5, -1, mode); }));   // and here it is not
    EXPECT_TRUE(raised([&] { Java_ja_G(env, peer, 14, 100, 5, -1, mode); }));
    EXPECT_FALSE(raised([&] { Java_ja_G(env, peer, 15, 3, 5, -1, mode); }));
    EXPECT_FALSE(raised([&] { Java_ja_b(env, peer, 8, 5, 2, -1, mode); }));
  }
  // Without a colour target there is nothing to raise about, and depth is cleared all the same.
  kit().colourbuffer = nullptr;
  Java_ja_B(env, peer, 6, 3, 5, 5, -1, 7);
  Java_ja_YA(env, peer, 6, 3, 8, 8, -1, 7);
  Java_ja_CA(env, peer, 8, 5, 3, -1, 7);
  Java_ja_ba(env, peer, 3, -1);
  EXPECT_EQ(java.take_exception(), "");
  kit().colourbuffer = colour.data();
  EXPECT_EQ(std::ranges::count(colour.copy(), 0u), 200);
  EXPECT_EQ(std::ranges::count(depth.copy(), Rasterizer_n::far_depth), 60);
}

TEST_F(primitives, small_rules) {
  make_target(30, 20, true, false);
  const auto count = [&](auto&& draw) {
    colour.fill(0);
    draw();
    return std::ranges::count_if(colour.copy(), [](unsigned int word) { return word != 0; });
  };
  EXPECT_EQ(count([&] { Java_ja_YA(env, peer, 7, 3, 7, 3, -1, 0); }), 1);
  EXPECT_EQ(colour.at(7, 3), 0xFFFFFFFFu);
  EXPECT_EQ(count([&] { Java_ja_YA(env, peer, 2, 3, 22, 9, -1, 0); }), 21);
  EXPECT_TRUE(colour.at(2, 3) != 0 && colour.at(22, 9) != 0);
  for (unsigned int mode = 0; mode < 4; ++mode) {
    EXPECT_EQ(count([&] { Java_ja_b(env, peer, 9, 9, 5, -1, static_cast<jint>(mode)); }), 0);
  }
  const auto circle = count([&] { Java_ja_CA(env, peer, 9, 9, 6, -1, 0); });
  const auto drawn = colour.copy();
  EXPECT_EQ(count([&] { Java_ja_CA(env, peer, 9, 9, -6, -1, 0); }), circle);
  EXPECT_EQ(colour.copy(), drawn);
  EXPECT_EQ(count([&] { Java_ja_CA(env, peer, 9, 9, 0, -1, 0); }), 1);

  // Crossed clip bounds leave an empty rectangle; a sub-rectangle never widens.
  Java_ja_r(env, peer, 20, 0, 10, 20);
  EXPECT_EQ(count([&] { Java_ja_B(env, peer, 0, 0, 30, 20, -1, 0); }), 0);
  Java_ja_r(env, peer, 5, 5, 10, 10);
  Java_ja_o(env, peer, 0, 7, 30, 9);
  const jintArray clip = java.new_ints({9, 9, 9, 9, 9});
  Java_ja_qa(env, peer, clip);
  EXPECT_EQ(java.ints(clip), (std::vector<jint>{5, 7, 10, 9, 9}));
  EXPECT_EQ(Rasterizer_n::GetCliprect()->y, 7);
  EXPECT_EQ(Rasterizer_n::GetCliprect()->height, 2);

  // Any boolean that is not false enables.
  for (const jboolean enable : {0, 1, 2}) {
    Java_ja_RA(env, peer, enable);
    EXPECT_EQ(kit().zwrite, enable != 0);
    EXPECT_EQ(Rasterizer_n::m_ZWriteEnabled, enable != 0);
  }
}

// A circle is counted from the first visible row: cut at the top it need not be the lower part of the whole one.
TEST_F(primitives, a_clip_at_the_top_changes_the_counting_of_a_circle) {
  make_target(80, 80, true, false);
  int changed = 0;
  for (int radius = 3; radius < 35; ++radius) {
    for (int top = 40 - radius; top < 40 + radius; ++top) {
      colour.fill(0);
      kit().setclipping(0, top, 80, 80);
      primitives_oracle expected = model();
      expected.circle_fill(40, 40, 0, radius, 1, 0);
      kit().circle_fill(40, 40, 0, radius, 1, 0);
      ASSERT_TRUE(matches(expected)) << radius << " from " << top;
      const auto cut = colour.copy();
      kit().resetclipping();
      colour.fill(0);
      kit().circle_fill(40, 40, 0, radius, 1, 0);
      changed += !std::equal(cut.begin() + top * 80, cut.end(), colour.data() + top * 80);
    }
  }
  EXPECT_GT(changed, 0);
}

TEST_F(primitives, huge_shapes_cost_what_is_visible) {
  make_target(64, 48);
  depth.fill(1);
  const auto start = std::chrono::steady_clock::now();
  const int extremes[] = {INT_MIN, INT_MIN + 1, -1 << 30, -1, 0, 20, 1 << 30, INT_MAX - 1, INT_MAX};
  for (const int a : extremes) {
    for (const int b : extremes) {
      for (const int c : extremes) {
        kit().circle_fill(a, b, 0, c, 0x01020304, 2);
        kit().rect_fill(a, b, c, a, 0x40302010, 1);
        kit().line_h(a, 20, c, 1, 0);
        kit().line_v(20, b, c, 1, 0);
        for (const int d : extremes) kit().line(a, b, c, d, 1, 0);
        Java_ja_VA(env, peer, a, b);
        Java_ja_VA(env, peer, b, c);
      }
    }
  }
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

// --- Area copies and scrolling
// --------------------------------------------------------------------------------------------

TEST_F(primitives, areas_are_copied_as_they_are) {
  make_target(13, 9);
  test_random random(3);
  randomise(random);
  Java_ja_r(env, peer, 4, 4, 5, 5);  // areas know no clip
  const auto before = colour.copy();
  const jintArray area = Java_ja_E(env, peer, 3, 2, 7, 5);
  const auto words = java.ints(area);
  ASSERT_EQ(words.size(), 35u);
  for (int r = 0; r < 5; ++r) {
    for (int c = 0; c < 7; ++c) EXPECT_EQ(static_cast<unsigned>(words[r * 7 + c]), colour.at(3 + c, 2 + r));
  }
  // Back with the rows upside down: the last row comes first, and the stride is negative.
  Java_ja_BA(env, peer, 3, 2, 7, 5, area, 28, -7);
  for (int r = 0; r < 5; ++r) {
    for (int c = 0; c < 7; ++c) EXPECT_EQ(colour.at(3 + c, 2 + r), before[(6 - r) * 13 + 3 + c]);
  }
  Java_ja_BA(env, peer, 3, 2, 7, 5, area, 0, 7);
  EXPECT_EQ(colour.copy(), before);
  EXPECT_EQ(java.ints(Java_ja_E(env, peer, 0, 0, 13, 9)).size(), 117u);
  EXPECT_TRUE(java.ints(Java_ja_E(env, peer, 500, 0, 0, INT_MAX)).empty());
}

TEST_F(primitives, wrong_areas_are_refused_before_anything_is_pinned) {
  make_target(13, 9);
  test_random random(3);
  randomise(random);
  const auto before = colour.copy();
  const jintArray pixels = java.new_ints(std::vector<jint>(40, 7));
  const auto refused = [&](const char* java_class, auto&& copy) {
    copy();
    const std::string exception = java.take_exception();
    EXPECT_EQ(exception.substr(0, exception.find(':')), std::string("java.lang.") + java_class);
  };
  const auto get = [&](jint x, jint y, jint w, jint h) {
    refused("IllegalArgumentException", [&] { EXPECT_EQ(Java_ja_E(env, peer, x, y, w, h), nullptr); });
  };
  get(-1, 0, 3, 3);
  get(0, 0, 14, 1);
  get(10, 8, 3, 2);
  get(0, 0, 65536, 65536);  // the product is 0 in 32 bits
  get(INT_MAX, INT_MAX, INT_MAX, INT_MAX);
  get(0, 0, -2, -3);
  const auto set = [&](const char* java_class, jint x, jint w, jint h, jint offset, jint stride) {
    refused(java_class, [&] { Java_ja_BA(env, peer, x, 0, w, h, pixels, offset, stride); });
  };
  const char* const bounds = "ArrayIndexOutOfBoundsException";
  set("IllegalArgumentException", 11, 3, 3, 0, 3);
  set(bounds, 0, 5, 9, 0, 5);
  set(bounds, 0, 5, 2, -1, 5);
  set(bounds, 0, 5, 2, 36, 0);
  set(bounds, 0, 5, 4, 0, INT_MAX);
  set(bounds, 0, 5, 3, 4, -3);
  set(bounds, 0, 5, 1, INT_MAX, INT_MAX);
  refused("NullPointerException", [&] { Java_ja_BA(env, peer, 0, 0, 1, 1, nullptr, 0, 1); });
  refused("NullPointerException", [&] { Java_ja_qa(env, peer, nullptr); });
  refused(bounds, [&] { Java_ja_qa(env, peer, java.new_ints({1, 2, 3})); });
  refused("NullPointerException", [&] { Java_ja_DA(env, peer, 1, nullptr, 0, 0); });
  refused("NullPointerException", [&] { Java_ja_DA(env, peer, 1, java.new_object("wa"), 0, 0); });
  refused("NullPointerException", [&] { Java_ja_R(env, peer, 0, 0, 5, 5, 1, 0, nullptr, 0, 0); });
  EXPECT_EQ(java.calls("GetPrimitiveArrayCritical"), 0);
  EXPECT_EQ(colour.copy(), before);

  // No memory for the array, then for the view of it.
  for (const int failing : {1, 2}) {
    java.fail_array_access(failing);
    EXPECT_EQ(Java_ja_E(env, peer, 0, 0, 2, 2), nullptr);
    EXPECT_EQ(java.take_exception(), "java.lang.OutOfMemoryError");
  }
  // Without a target reading raises, writing does nothing.
  kit().colourbuffer = nullptr;
  EXPECT_EQ(Java_ja_E(env, peer, 0, 0, 2, 2), nullptr);
  EXPECT_EQ(java.take_exception(), "java.lang.Exception: No colour buffer");
  Java_ja_BA(env, peer, 0, 0, 2, 2, pixels, 0, 2);
  EXPECT_EQ(java.take_exception(), "");
}

TEST_F(primitives, scrolling_wraps_rows_and_keeps_the_far_end) {
  for (const bool with_depth : {false, true}) {
    make_target(11, 7, true, with_depth);
    test_random random(9);
    randomise(random);
    const auto before = colour.copy();
    Java_ja_VA(env, peer, 0, 1);
    EXPECT_TRUE(std::equal(before.begin(), before.begin() + 11, colour.data()));
    EXPECT_TRUE(std::equal(before.begin(), before.end() - 11, colour.data() + 11));
    const auto shifted = colour.copy();
    Java_ja_VA(env, peer, -3, 0);
    EXPECT_TRUE(std::equal(shifted.begin() + 3, shifted.end(), colour.data()));
    EXPECT_TRUE(std::equal(shifted.end() - 3, shifted.end(), colour.data() + 74));
  }
  make_target(11, 7, false, false);
  Java_ja_VA(env, peer, 1, 1);
}

}  // namespace
