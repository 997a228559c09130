// Every instance of the triangle family against the slow renderer of tests/reference, whole targets bit for bit; then
// the rules that one would not guess, each by name.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <thread>
#include <vector>

#include "raster/Occlusion.h"
#include "raster/Rasterizer.h"
#include "raster/triangle_instances.h"
#include "reference/comparison.h"
#include "reference/numbers.h"
#include "reference/triangle_oracle.h"
#include "support/random.h"

using namespace Rasterizer_n;
using oracle::TriangleModes;

namespace {

TriangleModes modes_of(const TriangleInstance& i) {
  return {i.shade, i.addr_u, i.transform, i.fog, i.blend, i.key, i.lightmap, i.dwrite, i.cwrite, i.dtest};
}

constexpr TriangleModes flat{0, 0, false, 0, 0, false, false, false, true, false};
constexpr TriangleModes smooth{1, 0, false, 0, 0, false, false, true, true, true};
constexpr TriangleModes textured{2, 1, false, 0, 0, false, false, true, true, true};

void render(const TriangleModes& modes, const Triangle_s& t) {
  const auto all = triangle_instances();
  std::find_if(all.begin(), all.end(), [&](const TriangleInstance& i) { return modes_of(i) == modes; })->render(t);
}

// A colour and a depth image to draw to.
struct Target {
  Target(int width, int height) : colour(width, height), depth(width, height) {}

  void select(const TriangleModes& modes) {
    m_pColourBuffer = modes.colour_write ? colour.data() : nullptr;
    m_pDepthBuffer = modes.depth_test ? depth.data() : nullptr;
    m_ScreenPitch = colour.width;
  }

  guarded_image<std::uint32_t> colour;
  guarded_image<float> depth;
};

// Random drawing state and triangles, with textures and a light map.
class Scene {
 public:
  explicit Scene(std::uint64_t seed) : random(seed) {
    // Texels that are holes, clear, opaque, black but no hole, and any.
    constexpr struct {
      std::uint32_t kept, set;
    } kinds[8] = {{0, 0}, {0xFFFFFF, 0}, {~0u, 0xFF000000}, {0, 0x01000000}, {~0u, 0}, {~0u, 0}, {~0u, 0}, {~0u, 0}};
    for (auto& texture : textures) {
      texture.resize(128 * 256);
      for (std::uint32_t& texel : texture) {
        const auto& kind = kinds[random.between(0, 7)];
        texel = (random.word() & kind.kept) | kind.set;
      }
    }
    // Room for an index of either sign.
    light.resize(65536);
    for (std::uint8_t& b : light) b = static_cast<std::uint8_t>(random.one_in(4) ? 255 : random.word());
  }

  // Fog, clip rectangle and viewport. One of the two lies inside the target; the other can reach beyond it.
  void state(int width, int height) {
    const auto rectangle = [&](bool inside) -> Cliprect_s {
      if (random.one_in(3)) return {0, 0, width, height};
      const auto range = [&](int size) {
        const int from = random.between(inside ? 0 : -size / 2, size / 2);
        return std::pair(from, random.between(from, inside ? size : size + size / 2) - from);
      };
      const auto [x, w] = range(width);
      const auto [y, h] = range(height);
      return {x, y, w, h};
    };
    const bool clip_inside = random.one_in(2);
    const Cliprect_s view = rectangle(!clip_inside);
    SetCliprect(rectangle(clip_inside));
    SetViewport({view.x, view.y, view.width, view.height, 0, 1});
    const float starts[] = {0.0f, 0.5f, 0.99f, 1.0f, random.real(-1.0f, 1.5f)};
    RecomputeDistanceFogParams(starts[random.between(0, 4)], random.word());
  }

  Triangle_s triangle(const TriangleModes& modes, int width, int height) {
    Triangle_s t;
    std::memset(static_cast<void*>(&t), 0xCD, sizeof t);  // what an instance must not read
    if (modes.shade == -1) {
      // The mask is not clipped in x: coordinates stay inside, on a raster that makes no edge run away.
      for (Vector4_s& v : t.vertex) {
        v.x = static_cast<float>(random.between(0, width * 8)) / 8;
        v.y = static_cast<float>(random.between(-80, height * 8 + 80)) / 8;
      }
    } else {
      positions(t.vertex, static_cast<float>(width), static_cast<float>(height));
    }
    for (Vector4_s& v : t.vertex) {
      v.z = random.one_in(8) ? 1 : random.one_in(8) ? std::max(m_DistanceFogStart, 0.01f) : random.real(0.01f, 1.1f);
    }
    if (random.one_in(4)) t.vertex[1].z = t.vertex[2].z = t.vertex[0].z;
    if (random.one_in(20)) t.vertex[random.between(0, 2)].z = 0;  // u/z and v/z are infinite
    if (modes.shade == 0) t.flatcolour = random.word();
    if (modes.shade >= 1) colours(t, modes);
    if (modes.shade >= 2) texturing(t, modes);
    if (modes.blend == 3) t.alpha = static_cast<std::uint32_t>(byte()) * 0x10001;
    return t;
  }

  test_random random;

 private:
  int byte() { return random.one_in(4) ? 255 : random.one_in(4) ? 0 : random.between(0, 255); }

  void positions(Vector4_s (&v)[3], float width, float height) {
    const float sizes[] = {1.5f, 4, 12, 40, 150, 2000, 300000};
    const float size = sizes[random.between(0, 6)];
    const float x = random.real(-0.2f * width, 1.2f * width), y = random.real(-0.2f * height, 1.2f * height);
    for (Vector4_s& p : v) p.x = x + random.real(-size, size), p.y = y + random.real(-size, size);

    const int i = random.between(0, 2), j = (i + random.between(1, 2)) % 3;
    Vector4_s &a = v[i], &b = v[j], &c = v[3 - i - j];
    const int special = random.between(0, 12);
    if (special == 0) a.y = b.y;  // a flat top or bottom
    if (special == 1) a.x = b.x;
    if (special == 2) a.y = b.y = c.y;
    if (special == 3) a = b;
    if (special == 4) a = b = c;
    if (special == 5) a.x = (b.x + c.x) / 2, a.y = (b.y + c.y) / 2;  // on a line
    if (special == 6) a.y = b.y + random.real(-0.9f, 0.9f);          // about the same row
    for (Vector4_s& p : v) {
      const auto half = [](float f) { return static_cast<float>(static_cast<int>(f * 2)) / 2; };
      if (special == 7) p.x = half(p.x), p.y = half(p.y);  // halves round to even
      const float absurd[] = {1e10f, -1e10f, 3e9f, -2147483648.0f, 2147483520.0f, INFINITY, -1e30f, 5, 20.5f, -3};
      if (special == 8) p.x = absurd[random.between(0, 9)], p.y = absurd[random.between(0, 9)];
    }
  }

  void colours(Triangle_s& t, const TriangleModes& modes) {
    for (VertexColour_s& colour : t.colour) {
      for (std::uint16_t& c : colour.channels) {
        c = static_cast<std::uint16_t>(random.one_in(6) ? 65535 : random.one_in(6) ? random.word() : byte() * 256);
      }
    }
    if (random.one_in(6)) t.colour[1] = t.colour[2] = t.colour[0];
    if (modes.fog != 1 && modes.fog != 3) return;
    for (int k = 0; k < 3; ++k) {
      oracle::lane(t.fogfactor, k) = random.one_in(4) ? 0.0f : random.one_in(4) ? 1.0f : random.real(0, 1);
    }
    for (int c = 0; c < 4; ++c) {
      const float odd[] = {90000, -5000, 1e12f};
      oracle::lane(t.fogcolour, c) = random.one_in(40) ? odd[random.between(0, 2)] : static_cast<float>(byte()) * 256;
    }
  }

  void texturing(Triangle_s& t, const TriangleModes& modes) {
    const float extents[] = {2, 127, 300, 40000};
    const float extent = extents[random.between(0, 3)];
    for (Vector4_s& uv : t.texcoord) uv.x = random.real(-extent, extent), uv.y = random.real(-extent, extent);
    for (int k = 0; k < (modes.shade == 3 ? 3 : 1); ++k) {
      t.texture[k] = textures[k].data();
      if (!modes.transform) continue;
      const float su = random.real(-3, 3), sv = random.real(0, 2);
      const float ou = random.real(-200, 200), ov = random.real(-1, 1);
      t.texscale[k] = {su, sv, su, sv};
      t.texoffset[k] = {ou, ov, ou, ov};
    }
    if (!modes.light_map) return;
    t.lightmapshift = random.between(0, 17);
    t.lightmap = light.data() + 32768;
  }

  std::vector<std::uint32_t> textures[3];
  std::vector<std::uint8_t> light;
};

// One target for the tests by name: colour 0, depth 0.5, no clipping.
class TriangleTest : public testing::Test {
 protected:
  static constexpr int width = 68, height = 48;
  Target target{width, height};

  void SetUp() override {
    select(0.5f);
    RecomputeDistanceFogParams(0, 0);
  }
  // Makes the target, all of one depth, the one that is drawn to.
  void select(float depth) {
    target.depth.fill(depth);
    target.select(smooth);
    SetViewport({0, 0, target.depth.width, target.depth.height, 0, 1});
    SetCliprect({0, 0, target.depth.width, target.depth.height});
  }
  void TearDown() override {
    m_pColourBuffer = nullptr;
    m_pDepthBuffer = nullptr;
    m_ScreenPitch = 0;
  }

  // A triangle of one depth.
  static Triangle_s triangle(float x0, float y0, float x1, float y1, float x2, float y2, float z = 0.25f) {
    Triangle_s t{};
    t.flatcolour = 1;
    t.vertex[0] = {x0, y0, z, 1};
    t.vertex[1] = {x1, y1, z, 1};
    t.vertex[2] = {x2, y2, z, 1};
    return t;
  }
  // Columns x0 to x1 - 1 from row 0 down; the right edge moves in by a pixel in thousands of rows.
  static Triangle_s wedge(float x0, float x1, float z = 0.25f) { return triangle(x0, 0, x1, 0, x0, 65536, z); }
};

TEST_F(TriangleTest, EveryInstanceDrawsWhatTheSlowRendererDraws) {
  int number = 0, drew = 0;
  std::vector<std::uint32_t> hashes;
  Scene scene(1);
  for (const TriangleInstance& i : triangle_instances()) {
    const TriangleModes modes = modes_of(i);
    bool changed = false;
    for (int frame = 0; frame < 24; ++frame) {
      Target fast(scene.random.between(20, 75), scene.random.between(10, 40));
      Target slow(fast.colour.width, fast.colour.height);
      for (std::size_t k = 0; k < fast.colour.elements(); ++k) {
        fast.colour.data()[k] = slow.colour.data()[k] = scene.random.word();
        fast.depth.data()[k] = slow.depth.data()[k] =
            scene.random.one_in(3) ? far_depth : scene.random.real(-0.1f, 1.3f);
      }
      const std::pair blank(hash_of(fast.colour), hash_of(fast.depth));
      scene.state(fast.colour.width, fast.colour.height);
      Triangle_s t;
      for (int n = 0; n < 8; ++n) {
        // Now and then the same triangle again: equal depths pass.
        if (n == 0 || !scene.random.one_in(8)) t = scene.triangle(modes, fast.colour.width, fast.colour.height);
        fast.select(modes);
        i.render(t);
        slow.select(modes);
        oracle::render_triangle(modes, t);
        SCOPED_TRACE(testing::Message() << "instance " << number << " frame " << frame << " triangle " << n);
        ASSERT_TRUE(same_image(fast.colour, slow.colour.data()));
        ASSERT_TRUE(same_image(fast.depth, slow.depth.data()));
      }
      changed |= blank != std::pair(hash_of(fast.colour), hash_of(fast.depth));
      hashes.insert(hashes.end(), {hash_of(fast.colour), hash_of(fast.depth)});
    }
    ++number;
    drew += changed;
  }
  EXPECT_EQ(drew, 181) << "the smooth instance without any write is the only one that draws nothing";
  frame_record::add("triangles", hashes.data(), hashes.size());
}

// --- Rules by name --------------------------------------------------------------------------------------------------

// Of one colour and one texel all over, but for the last texel of the texture, which is its opposite.
TEST_F(TriangleTest, PixelsWorkedOutByHand) {
  constexpr auto with = [](TriangleModes modes, auto member, auto value) { return modes.*member = value, modes; };
  constexpr TriangleModes keyed = with(textured, &TriangleModes::colour_key, true);
  constexpr TriangleModes blended = with(textured, &TriangleModes::blend, 2);
  constexpr TriangleModes clamped = with(textured, &TriangleModes::address, 2);
  constexpr TriangleModes fogged = with(with(smooth, &TriangleModes::fog, 2), &TriangleModes::depth_test, false);
  const struct {
    const char* rule;
    TriangleModes modes;
    float depth, coordinate;
    std::uint16_t light;
    std::uint32_t texel, before, after;
    bool written;
  } pixels[] = {
      {"equal depth is drawn", smooth, 0.5f, 0, 0x8000, 0, 0, 0x80808080, true},
      {"farther is not", smooth, 0.500001f, 0, 0x4000, 0, 0x80808080, 0x80808080, false},
      {"a product keeps its high half", textured, 0.25f, 0, 0xFFFF, 0xFFFFFFFF, 0, 0xFEFEFEFE, true},
      {"a hole leaves the depth too", keyed, 0.25f, 0, 0xFFFF, 0, 0x11111111, 0x11111111, false},
      {"a hole is 0 in the whole word", keyed, 0.25f, 0, 0xFFFF, 0x01000000, 0x11111111, 0, true},
      // Colour 254 * 254 >> 8, and 255 * 2 >> 8.
      {"full alpha keeps two 256ths", blended, 0.25f, 0, 0xFFFF, 0xFF000000, 0x00FFFFFF, 0xFC010101, true},
      {"no alpha draws nothing", blended, 0.25f, 0, 0xFFFF, 0x00FFFFFF, 0x77777777, 0x77777777, false},
      {"coordinate -1 wraps", textured, 0.5f, -1.01f, 0xFFFF, 0x80808080, 0, 0x7E7E7E7E, true},
      {"coordinate -1 is clamped", clamped, 0.5f, -1.01f, 0xFFFF, 0x80808080, 0, 0x7F7F7F7F, true},
      // Zero times infinity.
      {"fog from the far end on spares it", fogged, 1, 0, 0x4000, 0, 0, 0x40404040, false},
  };
  RecomputeDistanceFogParams(1, 0xFFFFFFFF);
  for (const auto& p : pixels) {
    std::vector<std::uint32_t> texture(128 * 256, p.texel);
    texture[127 + 256 * 127] = ~p.texel;
    target.colour.fill(p.before);
    target.depth.fill(0.5f);
    Triangle_s t = wedge(4, 12, p.depth);
    for (auto& c : t.colour) std::fill_n(c.channels, 4, p.light);
    for (Vector4_s& uv : t.texcoord) uv = {p.coordinate, p.coordinate, 0, 0};
    t.texture[0] = texture.data();
    render(p.modes, t);
    EXPECT_EQ(target.colour.at(5, 2), p.after) << p.rule;
    EXPECT_EQ(target.depth.at(5, 2), p.written ? p.depth : 0.5f) << p.rule;
  }
}

// Less than one unit per pixel is nothing; what is beyond whole units is lost too.
TEST_F(TriangleTest, SlowColourStepsAreLost) {
  const struct {
    std::uint16_t left, right;
    unsigned at_the_end;
  } ramps[] = {{0, 63, 0}, {0, 128 * 64 + 63, 128 * 63 >> 8}, {0x80FF, 0x80FF + 63, 0x80}};
  for (const auto& ramp : ramps) {
    Triangle_s t = wedge(0, 64);
    for (int k = 0; k < 3; ++k) std::fill_n(t.colour[k].channels, 4, k == 1 ? ramp.right : ramp.left);
    render(smooth, t);
    EXPECT_EQ(target.colour.at(63, 0) & 0xFF, ramp.at_the_end) << ramp.left << " to " << ramp.right;
  }
}

TEST_F(TriangleTest, RowsAndSpansEndWhereTheyShould) {
  const auto drawn = [&](const Triangle_s& t) {
    target.colour.fill(0);
    render(flat, t);
    std::string rows;  // each as its number, first column and length
    for (int y = 0; y < 9; ++y) {
      const unsigned* const row = &target.colour.at(0, y);
      const auto columns = std::count(row, row + width, 1u);
      if (columns == 0) continue;
      const auto first = std::find(row, row + width, 1u) - row;
      rows += std::to_string(y) + ": " + std::to_string(first) + " + " + std::to_string(columns) + "; ";
    }
    return rows;
  };
  EXPECT_EQ(drawn(triangle(4, -0.5f, 12, -0.5f, 4, 3.9f)), "0: 4 + 8; 1: 4 + 5; 2: 4 + 3; ")
      << "rows truncate toward zero, and the first has the whole top";
  EXPECT_EQ(drawn(triangle(32, 0, 32, 0, 24, 4)), "1: 30 + 2; 2: 28 + 4; 3: 26 + 6; ")
      << "of two tops at one place the short edge is taken as the right one, and carries on";
  EXPECT_EQ(drawn(triangle(32, 0, 32, 0, 40, 4)), "");
}

// --- Hidden triangles -----------------------------------------------------------------------------------------------

// Up to 40 pixels large, with slivers, whole and half coordinates, common rows and columns, and edges and depths that
// hardly change.
Triangle_s small_triangle(test_random& random, float x, float y) {
  const float sizes[] = {1, 3, 8, 16, 31, 40};
  const float size = sizes[random.between(0, 5)];
  const float depth = std::ldexp(1.0f, random.one_in(16) ? -144 : -random.between(0, 12));
  Triangle_s t{};
  for (VertexColour_s& colour : t.colour) std::fill_n(colour.channels, 4, std::uint16_t{0xFFFF});
  for (Vector4_s& v : t.vertex) {
    v = {x + random.real(0, size), y + random.real(0, size), random.one_in(3) ? depth : random.real(0, depth), 1};
  }
  const Vector4_s &a = t.vertex[0], &b = t.vertex[2];
  Vector4_s& moved = t.vertex[random.between(0, 2)];
  const auto about = [&random](float middle, float by) { return middle + random.real(-by, by); };
  if (random.one_in(4)) moved.z = about(a.z, 1e-5f * depth);
  const int special = random.between(0, 12);
  if (special <= 2) moved.x = about((a.x + b.x) / 2, 0.1f), moved.y = about((a.y + b.y) / 2, 0.1f);
  if (special == 3 || special == 4) moved.y = a.y;
  if (special == 5) moved.x = about(a.x, 0.01f), moved.y = about(a.y, 0.5f);
  if (special == 7) moved.x = about(a.x, 0.2f);
  for (Vector4_s& v : t.vertex) {
    if (special == 4 || special == 6) v.x = std::round(v.x * 2) / 2, v.y = std::round(v.y * 2) / 2;
    if (special == 8) v.y = about(std::round(v.y), 0.02f);
  }
  return t;
}

// The strictest background: just in front of the nearest vertex, and only where the triangle can have pixels, so that
// one pixel outside or one depth that falls too low shows; also with a hole of one pixel, and two pixels larger.
TEST_F(TriangleTest, HiddenTrianglesDrawNothing) {
  constexpr int columns = 65536, rows = 64;
  target = {columns, rows};
  select(far_depth);
  test_random random(3);
  int hidden[3] = {}, all = 0;
  for (int n = 0; n < 100000; ++n) {
    const float places[] = {-4, 30, 65510, random.real(0, columns)};
    const Triangle_s t = small_triangle(random, places[random.between(0, 3)], random.real(-4, 30));
    const Vector4_s* const v = t.vertex;
    const auto [left, right] = std::minmax({v[0].x, v[1].x, v[2].x});
    const auto [top, bottom] = std::minmax({v[0].y, v[1].y, v[2].y});
    const auto [nearest, farthest] = std::minmax({v[0].z, v[1].z, v[2].z});
    for (int way = 0; way < 3; ++way) {
      const int margin = way == 2 ? 2 : 0;
      const auto at = [](float f, int by, int end) { return std::clamp(static_cast<int>(f) + by, 0, end); };
      const int x0 = at(std::nearbyint(left), -margin, columns), x1 = at(std::nearbyint(right), margin, columns);
      const int y0 = at(top, -margin, rows), y1 = at(bottom, margin, rows);
      if (x0 >= x1 || y0 >= y1) continue;
      const auto fill = [&](float value) {
        for (int y = y0; y < y1; ++y) std::fill_n(&target.depth.at(x0, y), x1 - x0, value);
      };
      fill(random.one_in(4) ? std::nextafter(nearest, -1.0f) : nearest - 1.1e-5f * farthest);
      if (way == 1) target.depth.at(random.between(x0, x1 - 1), random.between(y0, y1 - 1)) = far_depth;
      const ScreenBox_s box{SSEMath::floats(left, top, nearest, 0), SSEMath::floats(right, bottom, farthest, 0)};
      const bool found = IsHidden(t);
      EXPECT_TRUE(!found || StaysInBox(t)) << "triangle " << n;
      hidden[way] += found;
      if (found || (StaysInBox(t) && IsCovered(box))) {
        render(smooth, t);
        const int end = std::min(columns, x1 + 8);
        for (int y = 0; y < rows; ++y) {
          const auto* const row = &target.colour.at(0, y);
          const auto* const drawn =
              std::find_if(row + std::max(0, x0 - 8), row + end, [](auto word) { return word != 0; });
          ASSERT_EQ(drawn, row + end) << "triangle " << n << " in row " << y;
        }
      }
      fill(far_depth);
    }
    const float area = (v[1].x - v[0].x) * (v[2].y - v[0].y) - (v[2].x - v[0].x) * (v[1].y - v[0].y);
    all += std::abs(area) > 12 && right - left < 32 && bottom - top < 32 && left > 0 && right < columns && top > 0;
  }
  EXPECT_GT(hidden[0], 0.1 * all);
  EXPECT_GT(hidden[2], 0.65 * all) << "three in four backgrounds are near enough";
}

TEST_F(TriangleTest, CoveredBoxesHaveNoHole) {
  constexpr int columns = 301, rows = 280;
  target = {columns, rows};
  select(far_depth);
  test_random random(4);
  int covered = 0, solid = 0;
  for (int n = 0; n < 2000; ++n) {
    const int sides[] = {5, 9, 70, 256};
    const int side = sides[random.between(0, 3)];
    const float left = random.real(-20, 250), top = random.real(-20, 250);
    const float right = left + random.real(0, side), bottom = top + random.real(0, side);
    const ScreenBox_s box{SSEMath::floats(left, top, 0.5f, 0), SSEMath::floats(right, bottom, 0.75f, 0)};
    const auto at = [](float f, int end) { return std::clamp(static_cast<int>(std::nearbyint(f)), 0, end); };
    const int x0 = at(left, columns), x1 = at(right, columns);
    const int y0 = at(top - 0.5f, rows), y1 = at(bottom - 0.5f, rows);
    target.depth.fill(0.4999f);
    if (x0 < x1 && y0 < y1 && random.one_in(2)) {
      target.depth.at(random.between(x0, x1 - 1), random.between(y0, y1 - 1)) = random.one_in(2) ? 0.5f : NAN;
      EXPECT_FALSE(IsCovered(box)) << n;
    } else if (x1 >= 4) {
      ++solid;
      covered += IsCovered(box);
    }
  }
  EXPECT_GT(covered, 0.7 * solid) << "the middle of others lies outside";
}

// --- Threads --------------------------------------------------------------------------------------------------------

// Bands of rows that start on 16-byte boundaries, one thread each.
TEST_F(TriangleTest, ThreadsDrawIntoBandsOfTheirOwn) {
  constexpr int threads = 4, band = height / threads;
  RecomputeDistanceFogParams(0.5f, 0xFF8040C0);
  const auto draw = [](int k) {
    Scene scene(static_cast<std::uint64_t>(900 + k));
    for (int n = 0; n < 4; ++n) {
      for (const TriangleInstance& i : triangle_instances()) {
        if (i.shade == -1) continue;
        Triangle_s t = scene.triangle(modes_of(i), width, band);
        for (Vector4_s& v : t.vertex) v.y = std::clamp<float>(v.y, 0, band) + static_cast<float>(k * band);
        i.render(t);
      }
    }
  };
  std::vector<std::thread> workers;
  for (int k = 0; k < threads; ++k) workers.emplace_back(draw, k);
  for (std::thread& worker : workers) worker.join();
  Target parallel = std::move(target);
  target = {width, height};
  SetUp();
  RecomputeDistanceFogParams(0.5f, 0xFF8040C0);
  for (int k = 0; k < threads; ++k) draw(k);
  EXPECT_TRUE(same_image(parallel.colour, target.colour.data()));
  EXPECT_TRUE(same_image(parallel.depth, target.depth.data()));
}

}  // namespace
