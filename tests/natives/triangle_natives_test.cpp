// The triangles that Java draws directly: the raw smooth one, and the two of a thick line.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <ios>
#include <vector>

#include "raster/Rasterizer.h"
#include "raster/Triangle.h"
#include "reference/triangle_oracle.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

using namespace Rasterizer_n;

namespace {

constexpr oracle::TriangleModes flat{0, 0, false, 0, 0, false, false, false, true, false};

class TriangleNatives : public toolkit_fixture {
 protected:
  // What the slow renderer makes of the triangles on the colour target, which stays as it is.
  std::vector<unsigned> expected(const oracle::TriangleModes& modes, const std::vector<Triangle_s>& triangles) {
    const auto before = colour.copy();
    for (const Triangle_s& t : triangles) oracle::render_triangle(modes, t);
    auto image = colour.copy();
    std::ranges::copy(before, colour.data());
    return image;
  }

  const jobject worker = java.new_object("a");
};

Triangle_s raw(const float (&xy)[6], const unsigned (&colours)[3]) {
  Triangle_s t{};
  for (int k = 0; k < 3; ++k) {
    t.vertex[k] = {xy[2 * k], xy[2 * k + 1], 0, 1};
    for (int c = 0; c < 4; ++c) t.colour[k].channels[c] = static_cast<std::uint16_t>((colours[k] >> 8 * c & 0xFF) << 8);
  }
  return t;
}

}  // namespace

TEST_F(TriangleNatives, RawTriangleIsSmoothWithoutDepthWrite) {
  const float xy[6] = {3.5f, 2, 50, 9.25f, 11, 30};
  const unsigned colours[3] = {0xFF2040F0, 0x80FFFFFF, 0x00103050};
  const auto draw = [&] {
    Java_a_ra(env, worker, 0, xy[0], xy[1], xy[2], xy[3], xy[4], xy[5], static_cast<jint>(colours[0]),
              static_cast<jint>(colours[1]), static_cast<jint>(colours[2]));
  };
  const Triangle_s t = raw(xy, colours);
  for (const bool with_depth : {false, true}) {
    make_target(57, 33, true, with_depth);
    for (std::size_t i = 0; i < depth.elements(); i += 3) depth.data()[i] = -1;
    const auto depths = depth.copy();
    const auto image = expected({1, 0, false, 0, 0, false, false, false, true, with_depth}, {t});
    draw();
    EXPECT_EQ(colour.copy(), image);
    EXPECT_EQ(depth.copy(), depths);
    EXPECT_NE(image, std::vector<unsigned>(colour.elements()));
  }
  make_target(57, 33, false, true);
  draw();
  EXPECT_EQ(depth.copy(), std::vector<float>(depth.elements()));
  make_target(57, 33, false, false);
  draw();
}

TEST_F(TriangleNatives, ThickLineIsTwoTriangles) {
  test_random random(31);
  for (int n = 0; n < 400; ++n) {
    make_target(61, 40, true, random.one_in(2));
    for (std::size_t i = 0; i < colour.elements(); ++i) colour.data()[i] = random.word();
    if (random.one_in(2)) kit().setclipping(random.between(0, 20), random.between(0, 20), 55, 33);
    const int x0 = random.between(-10, 70), y0 = random.between(-10, 50);
    const int x1 = random.one_in(8) ? x0 : random.between(-10, 70);
    const int y1 = random.one_in(8) ? y0 : random.between(-10, 50);
    const int thickness = random.between(0, 9);
    const unsigned word = random.one_in(3) ? random.word() | 0xFF000000 : random.word();
    const int mode = random.between(0, 2);

    // The corners, from the line's direction in 16.16 fixed point turned by a right angle.
    std::vector<Triangle_s> triangles;
    oracle::TriangleModes modes = flat;
    const int dx = x1 - x0, dy = y1 - y0;
    const int length = std::max(std::abs(dx), std::abs(dy));
    if (length != 0) {
      int ax = dx * 65536 / length;
      int ay = dy * 65536 / length;
      (ax >= ay ? ax : ay) *= -1;
      const auto px = [&](int x) { return static_cast<float>(x - kit().clip_x0); };
      const auto py = [&](int y) { return static_cast<float>(y - kit().clip_y0); };
      const int hx = (ay * thickness) >> 17, hx2 = (ay * thickness + 1) >> 17;
      const int hy = (ax * thickness) >> 17, hy2 = (ax * thickness + 1) >> 17;
      const float corner[4][2] = {{px(x0 + hx), py(y0 + hy)},
                                  {px(x0 - hx2), py(y0 - hy2)},
                                  {px(x1 - hx2), py(y1 - hy2)},
                                  {px(x1 + hx), py(y1 + hy)}};
      for (const auto& order : {std::array{0, 1, 2}, std::array{0, 2, 3}}) {
        const auto* a = corner[order[0]];
        const auto* b = corner[order[1]];
        const auto* c = corner[order[2]];
        triangles.push_back(raw({a[0], a[1], b[0], b[1], c[0], c[1]}, {word, word, word}));
        triangles.back().flatcolour = word;
        triangles.back().alpha = (word >> 24) * 0x10001;
      }
      if (mode == 1 && word >> 24 != 255) modes = {1, 0, false, 0, 3, false, false, false, true, false};
    }
    const auto image = expected(modes, triangles);
    Java_a_K(env, worker, 0, x0, y0, x1, y1, static_cast<jint>(word), thickness, mode);
    SCOPED_TRACE(testing::Message() << "(" << x0 << ", " << y0 << ") to (" << x1 << ", " << y1 << ") thickness "
                                    << thickness << " mode " << mode << " colour " << std::hex << word);
    ASSERT_EQ(colour.copy(), image);
  }
}
