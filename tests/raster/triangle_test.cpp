// Every instance of the triangle family against the slow renderer of tests/reference, whole targets bit for bit; then
// the rules that one would not guess, each by name.
#include <gtest/gtest.h>

#include <algorithm>
#include <bit>
#include <cstdio>
#include <cstring>
#include <set>
#include <string>
#include <thread>
#include <tuple>
#include <vector>

#include "raster/Rasterizer.h"
#include "raster/triangle_instances.h"
#include "reference/triangle_oracle.h"
#include "support/frame_record.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

using namespace Rasterizer_n;

namespace {

// Random frames per instance, enough for each to draw something; sanitizers make each many times as long.
#if defined(__SANITIZE_THREAD__) || defined(__SANITIZE_ADDRESS__)
constexpr int frames = 12;
#else
constexpr int frames = 24;
#endif

oracle::TriangleModes modes_of(const TriangleInstance& i) {
  return {i.shade, i.addr_u, i.transform, i.fog, i.blend, i.key, i.lightmap, i.dwrite, i.cwrite, i.dtest};
}

using Key = std::tuple<int, int, int, int, int, int, int, int, int, int>;

Key key_of(const oracle::TriangleModes& m) {
  return {m.shade,      m.address,   m.transform,   m.fog,          m.blend,
          m.colour_key, m.light_map, m.depth_write, m.colour_write, m.depth_test};
}

std::string name_of(const oracle::TriangleModes& m) {
  char text[128];
  std::snprintf(text, sizeof text, "shade %d address %d transform %d fog %d blend %d key %d lightmap %d D%d C%d T%d",
                m.shade, m.address, m.transform, m.fog, m.blend, m.colour_key, m.light_map, m.depth_write,
                m.colour_write, m.depth_test);
  return text;
}

// The instance of these modes.
void (*instance(const oracle::TriangleModes& modes))(const Triangle_s&) {
  for (const TriangleInstance& i : triangle_instances()) {
    if (key_of(modes_of(i)) == key_of(modes)) return i.render;
  }
  ADD_FAILURE() << "no instance: " << name_of(modes);
  return [](const Triangle_s&) {};
}

// Textures and a light map, with holes, extremes of alpha, and room for a light map index of either sign.
struct Materials {
  std::vector<std::uint32_t> textures[3];
  std::vector<std::uint8_t> light;

  explicit Materials(std::uint64_t seed) {
    test_random random(seed);
    for (auto& texture : textures) {
      texture.resize(128 * 256);
      for (std::uint32_t& texel : texture) {
        texel = random.word();
        switch (random.between(0, 7)) {
          case 0:
            texel = 0;
            break;
          case 1:
            texel &= 0x00FFFFFF;
            break;
          case 2:
            texel |= 0xFF000000;
            break;
          case 3:
            texel = 0x01000000;
            break;
          default:
            break;
        }
      }
    }
    light.resize(65536);
    for (std::uint8_t& b : light) b = static_cast<std::uint8_t>(random.one_in(4) ? 255 : random.word());
  }
  const std::uint8_t* light_origin() const { return light.data() + 32768; }
};

// A pair of targets, one for each renderer, with the same contents at the same alignment.
struct Targets {
  guarded_image<std::uint32_t> colour[2];
  guarded_image<float> depth[2];

  Targets(int width, int height) {
    for (auto& image : colour) image = {width, height};
    for (auto& image : depth) image = {width, height};
  }

  void fill(test_random& random) {
    for (std::size_t i = 0; i < colour[0].elements(); ++i) {
      colour[0].data()[i] = colour[1].data()[i] = random.word();
      depth[0].data()[i] = depth[1].data()[i] = random.one_in(3) ? far_depth : random.real(-0.1f, 1.3f);
    }
  }

  // Makes pair `k` the current target.
  void select(int k, const oracle::TriangleModes& modes) {
    m_pColourBuffer = modes.colour_write ? colour[k].data() : nullptr;
    m_pDepthBuffer = modes.depth_test ? depth[k].data() : nullptr;
    m_ScreenPitch = colour[k].width;
  }

  // "" when both pairs are the same, else the first difference.
  std::string difference() {
    if (!colour[0].intact() || !depth[0].intact()) return "a write outside the target";
    if (!colour[1].intact() || !depth[1].intact()) return "the slow renderer wrote outside the target";
    for (std::size_t i = 0; i < colour[0].elements(); ++i) {
      const auto bits = [i](guarded_image<float>& image) { return std::bit_cast<std::uint32_t>(image.data()[i]); };
      if (colour[0].data()[i] == colour[1].data()[i] && bits(depth[0]) == bits(depth[1])) continue;
      char text[200];
      std::snprintf(text, sizeof text, "pixel (%d, %d): colour %08X, expected %08X; depth %a, expected %a",
                    static_cast<int>(i) % colour[0].width, static_cast<int>(i) / colour[0].width, colour[0].data()[i],
                    colour[1].data()[i], static_cast<double>(depth[0].data()[i]),
                    static_cast<double>(depth[1].data()[i]));
      return text;
    }
    return "";
  }
};

// Random drawing state and triangles.
class Scene {
 public:
  Scene(std::uint64_t seed, const Materials& of) : random(seed), materials(of) {}

  // Clip rectangle, viewport and fog; pixels inside both rectangles lie inside the target.
  void state(int width, int height) {
    const auto range = [this](int size, int& from, int& extent, bool inside) {
      from = random.between(inside ? 0 : -size / 2, size / 2);
      const int to = random.between(inside ? std::min(from, size) : from, inside ? size : size + size / 2);
      extent = to - from;
    };
    Viewport_s viewport{0, 0, width, height, 0, 1};
    Cliprect_s clip{0, 0, width, height};
    const bool clip_inside = random.one_in(2);
    if (!random.one_in(3)) {
      range(width, viewport.x, viewport.width, !clip_inside);
      range(height, viewport.y, viewport.height, !clip_inside);
    }
    if (!random.one_in(3)) {
      range(width, clip.x, clip.width, clip_inside);
      range(height, clip.y, clip.height, clip_inside);
    }
    // One of the two may have stayed at the whole target while the other reaches beyond it: that is inside too.
    SetViewport(viewport);
    SetCliprect(clip);
    const float starts[] = {0.0f, 0.5f, 0.99f, 1.0f, random.real(-1.0f, 1.5f)};
    RecomputeDistanceFogParams(starts[random.between(0, 4)], random.word());
  }

  Triangle_s triangle(const oracle::TriangleModes& modes, int width, int height) {
    Triangle_s t;
    std::memset(static_cast<void*>(&t), 0xCD, sizeof t);  // what an instance must not read
    positions(t, modes, static_cast<float>(width), static_cast<float>(height));
    for (Vector4_s& v : t.vertex) v.z = depth();
    if (random.one_in(4)) t.vertex[1].z = t.vertex[2].z = t.vertex[0].z;
    if (modes.shade == 0) t.flatcolour = random.word();
    if (modes.shade >= 1) colours(t, modes);
    if (modes.shade >= 2) texturing(t, modes);
    if (modes.blend == 3) t.alpha = static_cast<std::uint32_t>(byte()) * 0x10001;
    return t;
  }

  test_random random;

 private:
  int byte() { return random.one_in(4) ? 255 : random.one_in(4) ? 0 : random.between(0, 255); }

  float depth() {
    if (random.one_in(8)) return 1.0f;
    if (random.one_in(8) && m_DistanceFogStart > 0) return m_DistanceFogStart;
    return random.real(0.01f, 1.1f);
  }

  void positions(Triangle_s& t, const oracle::TriangleModes& modes, float width, float height) {
    const auto set = [&](int k, float x, float y) {
      t.vertex[k].x = x;
      t.vertex[k].y = y;
    };
    if (modes.shade == -1) {
      // The mask is not clipped in x: coordinates stay inside, on a raster that makes no edge run away.
      for (int k = 0; k < 3; ++k) {
        set(k, static_cast<float>(random.between(0, static_cast<int>(width) * 8)) / 8,
            static_cast<float>(random.between(-80, static_cast<int>(height) * 8 + 80)) / 8);
      }
      return;
    }
    const float sizes[] = {1.5f, 4, 12, 40, 150, 2000, 300000};
    const float size = sizes[random.between(0, 6)];
    const float x = random.real(-0.2f * width, 1.2f * width);
    const float y = random.real(-0.2f * height, 1.2f * height);
    for (int k = 0; k < 3; ++k) set(k, x + random.real(-size, size), y + random.real(-size, size));

    Vector4_s* const v = t.vertex;
    const int a = random.between(0, 2);
    const int b = (a + random.between(1, 2)) % 3;
    switch (random.between(0, 11)) {
      case 0:
        v[a].y = v[b].y;
        break;  // a flat top or bottom
      case 1:
        v[a].x = v[b].x;
        break;
      case 2:
        v[0].y = v[1].y = v[2].y;
        break;
      case 3:
        v[a] = v[b];
        break;
      case 4:
        v[0] = v[1] = v[2];
        break;
      case 5:  // on a line
        v[a].x = (v[b].x + v[3 - a - b].x) / 2;
        v[a].y = (v[b].y + v[3 - a - b].y) / 2;
        break;
      case 6:  // whole or half pixels, which round to even
        for (int k = 0; k < 3; ++k) {
          const auto half = [](float c) { return static_cast<float>(static_cast<int>(c * 2)) / 2; };
          set(k, half(v[k].x), half(v[k].y));
        }
        break;
      case 7:
        v[a].y = v[b].y + random.real(-0.9f, 0.9f);
        break;  // about the same row
      default:
        break;
    }
  }

  void colours(Triangle_s& t, const oracle::TriangleModes& modes) {
    for (VertexColour_s& colour : t.colour) {
      for (std::uint16_t& c : colour.channels) {
        c = static_cast<std::uint16_t>(random.one_in(6) ? 65535 : random.one_in(6) ? random.word() : byte() * 256);
      }
    }
    if (random.one_in(6)) t.colour[1] = t.colour[2] = t.colour[0];
    if (modes.fog == 1 || modes.fog == 3) {
      for (float* h : {&t.fogfactor.x, &t.fogfactor.y, &t.fogfactor.z}) {
        *h = random.one_in(4) ? 0.0f : random.one_in(4) ? 1.0f : random.real(0, 1);
      }
      for (float* c : {&t.fogcolour.x, &t.fogcolour.y, &t.fogcolour.z, &t.fogcolour.w}) {
        const float odd[] = {90000, -5000, 1e12f};
        *c = random.one_in(40) ? odd[random.between(0, 2)] : static_cast<float>(byte()) * 256;
      }
    }
  }

  void texturing(Triangle_s& t, const oracle::TriangleModes& modes) {
    const float extents[] = {2, 127, 300, 40000};
    const float extent = extents[random.between(0, 3)];
    for (Vector4_s& uv : t.texcoord) {
      uv.x = random.real(-extent, extent);
      uv.y = random.real(-extent, extent);
    }
    const int textures = modes.shade == 3 ? 3 : 1;
    for (int k = 0; k < textures; ++k) {
      t.texture[k] = materials.textures[k].data();
      if (!modes.transform) continue;
      const float su = random.real(-3, 3), sv = random.real(0, 2);
      const float ou = random.real(-200, 200), ov = random.real(-1, 1);
      t.texscale[k] = {su, sv, su, sv};
      t.texoffset[k] = {ou, ov, ou, ov};
    }
    if (modes.light_map) {
      t.lightmapshift = random.between(0, 17);
      t.lightmap = materials.light_origin();
    }
  }

  const Materials& materials;
};

std::string describe(const Triangle_s& t) {
  std::string text;
  char line[400];
  for (int k = 0; k < 3; ++k) {
    const auto& c = t.colour[k].channels;
    std::snprintf(line, sizeof line, "  vertex %d: (%.9g, %.9g, %.9g) colour %d %d %d %d uv (%.9g, %.9g)\n", k,
                  static_cast<double>(t.vertex[k].x), static_cast<double>(t.vertex[k].y),
                  static_cast<double>(t.vertex[k].z), c[0], c[1], c[2], c[3], static_cast<double>(t.texcoord[k].x),
                  static_cast<double>(t.texcoord[k].y));
    text += line;
  }
  std::snprintf(line, sizeof line,
                "  height fog %g %g %g, alpha %08X, light map shift %d\n  viewport %d %d %d %d, clip %d %d %d %d, fog "
                "start %g, pitch %d\n",
                static_cast<double>(t.fogfactor.x), static_cast<double>(t.fogfactor.y),
                static_cast<double>(t.fogfactor.z), t.alpha, t.lightmapshift, m_Viewport.x, m_Viewport.y,
                m_Viewport.width, m_Viewport.height, m_Cliprect.x, m_Cliprect.y, m_Cliprect.width, m_Cliprect.height,
                static_cast<double>(m_DistanceFogStart), m_ScreenPitch);
  return text + line;
}

class TriangleTest : public testing::Test {
 protected:
  void SetUp() override { whole_target(64, 16); }
  void TearDown() override {
    m_pColourBuffer = nullptr;
    m_pDepthBuffer = nullptr;
    m_ScreenPitch = 0;
  }

  // One target for the tests by name: colour 0, depth 0.5.
  void whole_target(int width, int height) {
    colour = {width, height};
    depth = {width, height};
    depth.fill(0.5f);
    m_pColourBuffer = colour.data();
    m_pDepthBuffer = depth.data();
    m_ScreenPitch = width;
    SetViewport({0, 0, width, height, 0, 1});
    SetCliprect({0, 0, width, height});
    RecomputeDistanceFogParams(0, 0);
  }

  // Columns x0 to x1 - 1 from row 0 down; the right edge moves in by a pixel in thousands of rows.
  static Triangle_s wedge(float x0, float x1, float z = 0.25f) {
    Triangle_s t{};
    t.vertex[0] = {x0, 0, z, 1};
    t.vertex[1] = {x1, 0, z, 1};
    t.vertex[2] = {x0, 65536, z, 1};
    return t;
  }
  static void set_colour(Triangle_s& t, std::uint16_t channel) {
    for (auto& c : t.colour) std::fill(c.channels, c.channels + 4, channel);
  }

  guarded_image<std::uint32_t> colour;
  guarded_image<float> depth;
};

constexpr oracle::TriangleModes flat{0, 0, false, 0, 0, false, false, false, true, false};
constexpr oracle::TriangleModes smooth{1, 0, false, 0, 0, false, false, true, true, true};
constexpr oracle::TriangleModes textured{2, 1, false, 0, 0, false, false, true, true, true};

}  // namespace

// --- The family -----------------------------------------------------------------------------------------------------

TEST(TriangleInstances, AreTheListed182) {
  std::set<Key> expected;
  const auto row = [&](int shade, std::vector<int> addresses, std::vector<int> transforms, std::vector<int> fogs,
                       int blend, std::vector<int> keys, std::vector<int> lights, int depth_write,
                       std::vector<int> depth_tests = {0, 1}, int colour_write = 1) {
    for (int a : addresses)
      for (int tr : transforms)
        for (int f : fogs)
          for (int k : keys)
            for (int l : lights)
              for (int t : depth_tests) expected.insert({shade, a, tr, f, blend, k, l, depth_write, colour_write, t});
  };
  const std::vector<int> all_fogs{0, 1, 2, 3};
  row(-1, {0}, {0}, {0}, 0, {0}, {0}, 0, {0});
  row(0, {0}, {0}, {0}, 0, {0}, {0}, 0, {0});
  row(0, {0}, {0}, {0}, 0, {0}, {0}, 1, {1}, 0);
  row(1, {0}, {0}, {0}, 0, {0}, {0}, 0);
  row(1, {0}, {0}, {0}, 0, {0}, {0}, 1);
  row(1, {0}, {0}, {0}, 0, {0}, {0}, 0, {1}, 0);
  row(1, {0}, {0}, {1, 2, 3}, 0, {0}, {0}, 1);
  row(1, {0}, {0}, all_fogs, 3, {0}, {0}, 0);
  row(2, {0}, {0, 1}, all_fogs, 0, {0}, {0, 1}, 1);
  row(2, {0}, {0}, {0, 2}, 3, {0}, {0, 1}, 0);
  row(2, {0}, {1}, {0, 2}, 3, {0}, {0, 1}, 1);
  row(2, {1, 2}, {0}, all_fogs, 0, {0, 1}, {0}, 1);
  row(2, {1, 2}, {0}, all_fogs, 3, {0, 1}, {0}, 1);
  row(2, {1, 2}, {0}, {0, 2}, 2, {0}, {0}, 1);
  row(2, {1, 2}, {0}, {1, 3}, 2, {0}, {0}, 0);
  row(3, {0}, {0, 1}, all_fogs, 0, {0}, {0, 1}, 1);
  ASSERT_EQ(expected.size(), 182u);

  std::set<Key> found;
  for (const TriangleInstance& i : triangle_instances()) {
    EXPECT_EQ(i.addr_u, i.addr_v);
    found.insert(key_of(modes_of(i)));
  }
  EXPECT_EQ(triangle_instances().size(), 182u);
  EXPECT_EQ(found, expected);
}

// The library holds each instance as a function of its own, and no other.
TEST(TriangleInstances, StandInTheLibrary) {
  std::FILE* const names = popen("nm -C '" VELMARK5_LIBRARY "'", "r");
  ASSERT_NE(names, nullptr);
  std::set<std::string> functions;
  int symbols = 0;
  char line[4096];
  while (std::fgets(line, sizeof line, names) != nullptr) {
    ++symbols;
    const std::string text = line;
    const auto begin = text.find("Rasterizer_n::RenderTriangle<");
    if (begin == std::string::npos || text.find("[clone") != std::string::npos) continue;
    functions.insert(text.substr(begin, text.find(">(") - begin));
  }
  ASSERT_EQ(pclose(names), 0);
  ASSERT_GT(symbols, 500) << "the library has no symbol table to count in";
  EXPECT_EQ(functions.size(), 182u);
}

TEST_F(TriangleTest, EveryInstanceDrawsWhatTheSlowRendererDraws) {
  const Materials materials(1);
  int failures = 0;
  std::size_t changed = 0;
  std::uint64_t seed = 1000;
  for (const TriangleInstance& i : triangle_instances()) {
    const oracle::TriangleModes modes = modes_of(i);
    Scene scene(++seed, materials);
    bool instance_changed = false;
    for (int frame = 0; frame < frames; ++frame) {
      const int width = scene.random.between(20, 75);
      const int height = scene.random.between(10, 40);
      Targets targets(width, height);
      targets.fill(scene.random);
      scene.state(width, height);
      Triangle_s t;
      std::vector<std::uint32_t> before = targets.colour[0].copy();
      std::vector<float> depth_before = targets.depth[0].copy();
      for (int n = 0; n < 8; ++n) {
        // Now and then the same triangle again: equal depths pass.
        if (n == 0 || !scene.random.one_in(8)) t = scene.triangle(modes, width, height);
        targets.select(0, modes);
        i.render(t);
        targets.select(1, modes);
        oracle::render_triangle(modes, t);
        const std::string difference = targets.difference();
        if (difference.empty()) continue;
        ADD_FAILURE() << name_of(modes) << "\n" << describe(t) << "  " << difference;
        if (++failures == 8) FAIL() << "and so on";
        break;
      }
      instance_changed |= before != targets.colour[0].copy() || depth_before != targets.depth[0].copy();
    }
    changed += instance_changed;
  }
  EXPECT_EQ(changed, 181u) << "the smooth instance without any write is the only one that draws nothing";
}

// Coordinates beyond the integers, and none at all: nothing outside the clip rectangle is touched.
TEST_F(TriangleTest, AbsurdCoordinatesStayInside) {
  const Materials materials(2);
  test_random random(77);
  const float odd[] = {1e10f, -1e10f, 3e9f, -2147483648.0f, 2147483520.0f, 1e30f, -1e30f, 5, 20.5f, -3};
  for (const TriangleInstance& i : triangle_instances()) {
    const oracle::TriangleModes modes = modes_of(i);
    if (modes.shade == -1) continue;
    Scene scene(random.bits(), materials);
    Targets targets(37, 19);
    targets.fill(random);
    SetViewport({0, 0, 37, 19, 0, 1});
    SetCliprect({5, 3, 20, 10});
    for (int n = 0; n < 12; ++n) {
      Triangle_s t = scene.triangle(modes, 37, 19);
      for (Vector4_s& v : t.vertex) {
        v.x = odd[random.between(0, 9)];
        v.y = odd[random.between(0, 9)];
      }
      targets.select(0, modes);
      i.render(t);
    }
    ASSERT_TRUE(targets.colour[0].intact() && targets.depth[0].intact()) << name_of(modes);
    for (int y = 0; y < 19; ++y) {
      for (int x = 0; x < 37; ++x) {
        if (x >= 5 && x < 25 && y >= 3 && y < 13) continue;
        ASSERT_EQ(targets.colour[0].at(x, y), targets.colour[1].at(x, y)) << name_of(modes);
        ASSERT_EQ(targets.depth[0].at(x, y), targets.depth[1].at(x, y)) << name_of(modes);
      }
    }
  }
}

// All instances over one frame, for the comparison of the two word sizes.
TEST_F(TriangleTest, FrameOfAllInstances) {
  const Materials materials(3);
  whole_target(101, 64);
  Scene scene(5, materials);
  depth.fill(far_depth);
  int count = 0;
  for (const TriangleInstance& i : triangle_instances()) {
    if (i.shade == -1) continue;
    RecomputeDistanceFogParams(0.5f, scene.random.word());
    if (++count % 30 == 0) depth.fill(far_depth);
    for (int n = 0; n < 4; ++n) i.render(scene.triangle(modes_of(i), 101, 64));
  }
  frame_record::add("triangles_colour", colour.data(), colour.elements());
  frame_record::add("triangles_depth", depth.data(), depth.elements());
  EXPECT_TRUE(colour.intact() && depth.intact());
  EXPECT_GT(std::set<std::uint32_t>(colour.data(), colour.data() + colour.elements()).size(), 200u);
}

// --- Rules by name --------------------------------------------------------------------------------------------------

// All spans of up to nine pixels at each phase: neither a pixel more nor less, and the right edge is exclusive.
TEST_F(TriangleTest, SpansEndWhereTheyShouldAtEveryPhase) {
  for (int x0 = 4; x0 < 8; ++x0) {
    for (int width = 0; width < 10; ++width) {
      colour.fill(0);
      Triangle_s t = wedge(static_cast<float>(x0), static_cast<float>(x0 + width));
      t.flatcolour = 0x12345678;
      instance(flat)(t);
      for (int x = 0; x < 24; ++x) {
        EXPECT_EQ(colour.at(x, 1) != 0, x >= x0 && x < x0 + width) << "span " << x0 << " + " << width << " at " << x;
      }
    }
  }
}

TEST_F(TriangleTest, EqualDepthIsDrawnAndFartherIsNot) {
  Triangle_s t = wedge(4, 12, 0.5f);
  set_colour(t, 0x8000);
  instance(smooth)(t);
  EXPECT_EQ(colour.at(5, 2), 0x80808080u);
  set_colour(t, 0x4000);
  for (Vector4_s& v : t.vertex) v.z = 0.500001f;
  instance(smooth)(t);
  EXPECT_EQ(colour.at(5, 2), 0x80808080u);
}

// The product keeps its high half, so that white times full light is one short of white.
TEST_F(TriangleTest, FullyLitTexelDarkensByOne) {
  const std::vector<std::uint32_t> texture(128 * 256, 0xFFFFFFFF);
  Triangle_s t = wedge(4, 12);
  set_colour(t, 65535);
  t.texture[0] = texture.data();
  instance(textured)(t);
  EXPECT_EQ(colour.at(5, 2), 0xFEFEFEFEu);
}

TEST_F(TriangleTest, ColourKeyLooksAtTheWholeWord) {
  std::vector<std::uint32_t> texture(128 * 256, 0);
  oracle::TriangleModes keyed = textured;
  keyed.colour_key = true;
  Triangle_s t = wedge(4, 12);
  set_colour(t, 65535);
  t.texture[0] = texture.data();
  colour.fill(0x11111111);
  instance(keyed)(t);
  EXPECT_EQ(colour.at(5, 2), 0x11111111u);
  EXPECT_EQ(depth.at(5, 2), 0.5f) << "a hole leaves the depth";
  std::fill(texture.begin(), texture.end(), 0x01000000u);
  instance(keyed)(t);
  EXPECT_EQ(colour.at(5, 2), 0u);
  EXPECT_EQ(depth.at(5, 2), 0.25f);
}

// The alpha of an opaque texel comes to 254 of 256: two 256ths of the target stay. An alpha of 0 draws nothing.
TEST_F(TriangleTest, PixelAlphaKeepsTwo256thsOfTheTarget) {
  std::vector<std::uint32_t> texture(128 * 256, 0xFF000000);
  oracle::TriangleModes blended = textured;
  blended.blend = 2;
  Triangle_s t = wedge(4, 12);
  set_colour(t, 65535);
  t.texture[0] = texture.data();
  colour.fill(0x00FFFFFF);
  instance(blended)(t);
  EXPECT_EQ(colour.at(5, 2), 0xFC010101u);  // 254 * 254 >> 8; 255 * 2 >> 8

  std::fill(texture.begin(), texture.end(), 0x00FFFFFFu);
  depth.fill(0.5f);
  colour.fill(0x77777777);
  instance(blended)(t);
  EXPECT_EQ(colour.at(5, 2), 0x77777777u);
  EXPECT_EQ(depth.at(5, 2), 0.5f);
}

TEST_F(TriangleTest, CoordinateMinusOneWrapsOrClamps) {
  std::vector<std::uint32_t> texture(128 * 256, 0);
  texture[127 + 256 * 127] = 0xFFFFFFFF;
  texture[0] = 0x80808080;
  Triangle_s t = wedge(4, 12, 0.5f);
  set_colour(t, 65535);
  for (Vector4_s& uv : t.texcoord) uv = {-1.01f, -1.01f, 0, 0};
  t.texture[0] = texture.data();
  instance(textured)(t);
  EXPECT_EQ(colour.at(5, 2), 0xFEFEFEFEu);
  oracle::TriangleModes clamped = textured;
  clamped.address = 2;
  instance(clamped)(t);
  EXPECT_EQ(colour.at(5, 2), 0x7F7F7F7Fu);
}

// Less than one unit per pixel is nothing; what is beyond whole units is lost too.
TEST_F(TriangleTest, SlowColourStepsAreLost) {
  Triangle_s t = wedge(0, 64);
  const auto blue_at_the_end = [&](int right) {
    for (std::uint16_t& c : t.colour[1].channels) c = static_cast<std::uint16_t>(right);
    instance(smooth)(t);
    return colour.at(63, 0) & 0xFF;
  };
  set_colour(t, 0xFFFF);
  t.colour[0] = t.colour[2] = {};
  EXPECT_EQ(blue_at_the_end(63), 0u);
  EXPECT_EQ(blue_at_the_end(128 * 64 + 63), 128u * 63 >> 8);
  set_colour(t, 0x80FF);
  EXPECT_EQ(blue_at_the_end(0x80FF + 63), 0x80u) << "an exact ramp would reach 0x81";
}

// Zero times infinity is not a number, which counts as no fog.
TEST_F(TriangleTest, FogThatStartsAtTheFarEndSparesIt) {
  oracle::TriangleModes fogged = smooth;
  fogged.fog = 2;
  depth.fill(far_depth);
  RecomputeDistanceFogParams(1.0f, 0xFFFFFFFF);
  Triangle_s t = wedge(4, 12, 1.0f);
  set_colour(t, 0x4000);
  instance(fogged)(t);
  EXPECT_EQ(colour.at(5, 2), 0x40404040u);
}

TEST_F(TriangleTest, RowsTruncateTowardZero) {
  Triangle_s t{};
  t.flatcolour = 1;
  t.vertex[0] = {4, -0.5f, 0.25f, 1};
  t.vertex[1] = {12, -0.5f, 0.25f, 1};
  t.vertex[2] = {4, 3.9f, 0.25f, 1};
  instance(flat)(t);
  EXPECT_EQ(colour.at(11, 0), 1u) << "row 0 starts at the top vertices, whatever their fraction";
  EXPECT_EQ(colour.at(4, 2), 1u);
  EXPECT_EQ(colour.at(4, 3), 0u);
}

// Two vertices at one place on top, the bottom to the left: the short edge is taken as the right one and carries on, so
// that the empty triangle is filled.
TEST_F(TriangleTest, CoincidentTopsWithTheBottomToTheLeftAreFilled) {
  Triangle_s t{};
  t.flatcolour = 1;
  t.vertex[0] = {40, 0, 0.25f, 1};
  t.vertex[1] = {40, 0, 0.25f, 1};
  t.vertex[2] = {24, 8, 0.25f, 1};
  instance(flat)(t);
  EXPECT_EQ(colour.at(39, 7), 1u);
  EXPECT_EQ(colour.at(27, 7), 1u);
  EXPECT_EQ(colour.at(40, 7), 0u);
  colour.fill(0);
  t.vertex[2].x = 56;
  instance(flat)(t);
  EXPECT_EQ(std::count(colour.data(), colour.data() + colour.elements(), 1u), 0);
}

// --- Threads --------------------------------------------------------------------------------------------------------

// Bands of rows that start on 16-byte boundaries, one thread each.
TEST_F(TriangleTest, ThreadsDrawIntoBandsOfTheirOwn) {
  constexpr int threads = 4, band = 12, width = 68;
  const Materials materials(4);
  whole_target(width, threads * band);
  RecomputeDistanceFogParams(0.5f, 0xFF8040C0);
  const auto draw = [&](int k) {
    Scene scene(static_cast<std::uint64_t>(900 + k), materials);
    for (int n = 0; n < 4; ++n) {
      for (const TriangleInstance& i : triangle_instances()) {
        if (i.shade == -1) continue;
        Triangle_s t = scene.triangle(modes_of(i), width, band);
        for (Vector4_s& v : t.vertex) {
          v.y = static_cast<float>(k * band) + std::clamp(v.y, 0.0f, static_cast<float>(band));
        }
        i.render(t);
      }
    }
  };
  std::vector<std::thread> workers;
  for (int k = 0; k < threads; ++k) workers.emplace_back(draw, k);
  for (std::thread& worker : workers) worker.join();
  const std::vector<std::uint32_t> parallel = colour.copy();
  const std::vector<float> parallel_depth = depth.copy();

  colour.fill(0);
  depth.fill(0.5f);
  for (int k = 0; k < threads; ++k) draw(k);
  EXPECT_EQ(parallel, colour.copy());
  EXPECT_EQ(parallel_depth, depth.copy());
}
