// The texture cache against a simple model of its recency list, its blur against the slow one, and both through the
// natives.
#include "texture/texturecache.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <functional>
#include <list>
#include <map>
#include <set>
#include <tuple>
#include <vector>

#include "reference/texture_oracle.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

using Pixels = std::vector<unsigned int>;

class TestCache : public texturecache {
 public:
  using texturecache::texturecache;
  std::function<bool(unsigned short)> on_request = [](unsigned short) { return false; };
  bool threaded = false;

 protected:
  bool request_texture(unsigned short id) override { return on_request(id); }
  bool several_threads() const override { return threaded; }
};

Pixels slot_pixels(const unsigned int* texels) {
  Pixels pixels;
  for (int y = 0; y < texturecache::size; ++y, texels += texturecache::stride) {
    pixels.insert(pixels.end(), texels, texels + texturecache::size);
  }
  return pixels;
}

class TextureCacheTest : public testing::Test {
 protected:
  fake_java java;
  std::unique_ptr<TestCache> cache = std::make_unique<TestCache>(java.env(), java.new_object("source"), 65536);
  test_random random{3};

  void TearDown() override {
    EXPECT_EQ(java.weak_references(), 1);
    cache.reset();
    EXPECT_EQ(java.weak_references(), 0);
    java.verify();
  }

  Pixels random_pixels(int holes_of_20) {
    Pixels pixels(texturecache::texture_pixels);
    for (unsigned int& word : pixels) {
      word = random.one_in(8) ? random.word() & 0xFF000001 : random.word();
      if (random.between(1, 20) <= holes_of_20) word = 0;
    }
    return pixels;
  }
};

// Requests, uploads out of turn and services, against a list that is searched by hand. There are many more uploads to
// scrolling slots between two services than there are slots.
TEST_F(TextureCacheTest, RecencyScrollingAndPlacesFollowTheSimpleModel) {
  struct Slot {
    int number;
    int owner = -1;
    signed char scroll_u = 0, scroll_v = 0;
    bool pending = false;
    float offset_u = 0, offset_v = 0;
  };
  std::list<Slot> recency;  // the least recently used first
  for (int i = 0; i < 200; ++i) recency.push_back({i});
  const auto slot = [&](int number) {
    return std::find_if(recency.begin(), recency.end(), [number](const Slot& s) { return s.number == number; });
  };
  std::map<int, int> slot_of;
  std::set<int> scrolling;
  int requests = 0, expected_requests = 0;
  const Pixels pixels = random_pixels(10);

  const auto upload = [&](unsigned short id) {
    texturemetrics fields;
    fields.average_hsl = id;
    fields.scroll_u = static_cast<signed char>(random.one_in(2) ? 0 : random.between(-128, 127));
    fields.scroll_v = static_cast<signed char>(random.one_in(2) ? 0 : random.between(-128, 127));
    cache->upload_texture(id, pixels.data(), fields);
    Slot& first = recency.front();
    // An owner with id 255 is taken for none and keeps its entry.
    if (first.owner >= 0 && first.owner != 255) slot_of.erase(first.owner);
    slot_of[id] = first.number;
    first = {first.number, id, fields.scroll_u, fields.scroll_v};
  };
  // The client delivers most textures; some it does not have, and of some it says so wrongly.
  cache->on_request = [&](unsigned short id) {
    ++requests;
    if (id % 17 == 0) return false;
    if (id % 19 != 0) upload(id);
    return true;
  };
  const unsigned int* atlas = nullptr;
  const auto use = [&](unsigned short id) {
    expected_requests += slot_of.count(id) == 0 && id != 65535;
    const cachedtexture* const record = cache->gettex(id);
    ASSERT_EQ(requests, expected_requests) << id;
    ASSERT_EQ(record == nullptr, slot_of.count(id) == 0) << id;
    if (record == nullptr) return;
    const auto used = slot(slot_of[id]);
    // Two slots lie side by side in the atlas.
    if (atlas == nullptr) atlas = record->texels;
    ASSERT_EQ(record->texels - atlas, used->number / 2 * 128 * 256 + used->number % 2 * 128) << id;
    ASSERT_EQ(record->average_hsl, used->owner);
    ASSERT_EQ(std::tuple(record->offset_u.x, record->offset_u.w, record->offset_v.y),
              std::tuple(used->offset_u, used->offset_u, used->offset_v));
    recency.splice(recency.end(), recency, used);
    if (used->scroll_u != 0 || used->scroll_v != 0) scrolling.insert(used->number);
  };

  upload(255);
  use(255);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(atlas) % 64, 0u);
  for (int step = 0; step < 6000 && !HasFatalFailure(); ++step) {
    if (random.one_in(50)) {
      upload(static_cast<unsigned short>(random.between(200, 500)));
    } else if (random.one_in(step < 3000 ? 60 : 1500)) {
      const int time = random.between(0, 0x7FFFFFFF);
      cache->service(time);
      const float t = static_cast<float>(time % 128000) / 1000.0f;
      for (int number : scrolling) {
        Slot& s = *slot(number);
        s.offset_u = std::fmod(static_cast<float>(s.scroll_u) * t * 0.015625f * 128.0f, 128.0f);
        s.offset_v = std::fmod(static_cast<float>(s.scroll_v) * t * 0.015625f * 128.0f, 128.0f);
      }
      scrolling.clear();
    } else {
      const int special = random.between(0, 99), wide = random.one_in(3) ? 1000 : 180;
      use(static_cast<unsigned short>(special == 0 ? 65535 : special < 3 ? 255 : random.between(0, wide)));
    }
  }
  EXPECT_GT(expected_requests, 1500);
}

TEST_F(TextureCacheTest, BlurIsTheSlowOne) {
  for (int n = 0; n < 24; ++n) {
    const Pixels pixels = n == 0 ? Pixels(16384, 0xFFFFFFFF) : random_pixels(n % 4 == 3 ? 19 : n % 4 * 5);
    texturemetrics fields;
    fields.alpha_kind = static_cast<unsigned int>(random.between(0, 2));
    fields.wrap_u = n & 1;
    fields.wrap_v = n & 2;
    cache->upload_texture(1, pixels.data(), fields);
    EXPECT_EQ(slot_pixels(cache->gettex(1)->texels),
              oracle::blurred_texture(pixels, fields.wrap_u, fields.wrap_v, fields.alpha_kind != 1))
        << n;
  }
}

// One texel among holes: its own tap alone has weight, though truncation can take one from a channel, twice. Nothing
// bleeds into the holes, not even over the edge.
TEST_F(TextureCacheTest, HolesStayAndLendNoColour) {
  Pixels pixels(texturecache::texture_pixels, 0);
  pixels[40 * 128] = 0xFF336699;
  texturemetrics fields;
  fields.alpha_kind = 1;
  fields.wrap_u = true;
  cache->upload_texture(1, pixels.data(), fields);
  Pixels found = slot_pixels(cache->gettex(1)->texels);
  for (int c = 0; c < 32; c += 8) EXPECT_NEAR(found[40 * 128] >> c & 0xFF, 0xFF336699u >> c & 0xFF, 2);
  found[40 * 128] = 0;
  EXPECT_EQ(found, Pixels(found.size()));
  // Where zero is a colour like others, what is beyond the edge counts.
  fields.alpha_kind = 0;
  cache->upload_texture(1, pixels.data(), fields);
  EXPECT_NE(cache->gettex(1)->texels[40 * 256 + 127], 0u);
}

TEST_F(TextureCacheTest, CopyTextureKeepsThePixels) {
  const Pixels pixels = random_pixels(1);
  cache->upload_texture(9, Pixels(16384).data(), {});
  const cachedtexture* const record = cache->gettex(9);  // slot 0
  cache->copy_texture(pixels.data(), 0);
  EXPECT_EQ(slot_pixels(record->texels), pixels);
}

TEST_F(TextureCacheTest, MonitorIsTakenBySeveralThreadsOnly) {
  for (const int taken : {0, 1}) {
    cache->threaded = taken != 0;
    cache->monitor_enter();
    cache->monitor_exit();
    EXPECT_EQ(java.calls("MonitorEnter"), taken);
    EXPECT_EQ(java.calls("MonitorExit"), taken);
  }
}

// --- Through the natives --------------------------------------------------------------------------------------------

class TextureNatives : public toolkit_fixture {
 protected:
  static constexpr int count = 300;

  void SetUp() override {
    Java_ja_q(env, peer, java.new_object("source"), count);
    ASSERT_EQ(java.take_exception(), "");
    Java_ba_sa(env, pool_peer, 0, pool_size);
    Java_ja_n(env, peer, pool_peer);
    ASSERT_NE(kit().textures, nullptr);
  }

  void metrics(jshort id) { Java_ja_V(env, peer, id, -2, 2, -3, 4, 5, 2, -6, 7, -8, 9, 0, 1, 0, 1, 0, -1, 1, 0, -10); }
  void pixels(jshort id, jintArray array) {
    Java_ja_F(env, peer, id, array, -2, 2, -3, 4, 5, 2, -6, 7, -8, 9, 0, 1, 0, 1, 0, -1, 1, 0, -10);
  }
  static void expect_fields(const texturemetrics& m) {
    EXPECT_EQ(std::tuple(m.average_hsl, m.alpha_kind, m.lighting_kind, m.grey_blend, m.brighten, m.scroll_u, m.scroll_v,
                         m.flat_colour, m.do_not_draw, m.wrap_u, m.wrap_v),
              std::tuple(65534, 2u, 253, 250, 7, -8, 9, false, true, true, false));
    EXPECT_EQ(std::tuple(m.attribute_a, m.attribute_b, m.attribute_c, m.attribute_d, m.attribute_e, m.attribute_f,
                         m.attribute_g, m.attribute_h),
              std::tuple(4, 5u, true, false, 255, true, false, 0xFFFFFFF6u));
  }
};

// A face asks, Java uploads from inside the call, and the scroll moves with the client's clock.
TEST_F(TextureNatives, RequestUploadsFromInside) {
  const jintArray array = java.new_ints(std::vector<jint>(16384, -1));
  jshort asked = 0;
  java.request_texture = [&](jshort id) -> jboolean { return pixels(asked = id, array), 1; };
  metrics(299);
  expect_fields(*kit().textures->getmetrics(299));
  const cachedtexture* record = kit().textures->gettex(299);
  ASSERT_NE(record, nullptr);
  EXPECT_EQ(asked, 299);
  expect_fields(*record);
  EXPECT_EQ(slot_pixels(record->texels), oracle::blurred_texture(Pixels(16384, 0xFFFFFFFF), true, false, true));
  EXPECT_EQ(java.ints(array), std::vector<jint>(16384, -1));
  // 64 is a width of 128 texels in a second. What is not used between two services stays where it is.
  for (const int time : {1000, 3000}) {
    Java_ja_Y(env, peer, time);
    EXPECT_EQ(record->offset_u.x, -16.0f);
    EXPECT_EQ(record->offset_v.x, 18.0f);
  }
}

TEST_F(TextureNatives, OnlyTrueIsAnAnswer) {
  java.request_texture = [&](jshort) -> jboolean { return 2; };
  EXPECT_EQ(kit().textures->gettex(3), nullptr);
  java.request_texture = [&](jshort) -> jboolean { return java.raise("java/lang/Error", "lost"), 1; };
  EXPECT_EQ(kit().textures->gettex(3), nullptr);
  EXPECT_EQ(java.take_exception(), "java.lang.Error: lost");
}

TEST_F(TextureNatives, BadUploadsRaiseAndChangeNothing) {
  const auto array = [this](std::size_t length) { return java.new_ints(std::vector<jint>(length, 5)); };
  const auto state = [] { return std::string(reinterpret_cast<const char*>(kit().textures), sizeof(texturecache)); };
  const std::string before = state(), argument = "java.lang.IllegalArgumentException: id: ";
  const std::string bounds = "java.lang.ArrayIndexOutOfBoundsException: pixels: length ";
  expect_raised(argument + "300 is not below the number of textures, 300",
                {[&] { metrics(300); }, [&] { pixels(300, array(16384)); }});
  expect_raised(argument + "65535 is not below the number of textures, 300", {[&] { metrics(-1); }});
  expect_raised("java.lang.NullPointerException: ", {[&] { pixels(3, nullptr); }});
  expect_raised(bounds + "16383, 16384 needed", {[&] { pixels(3, array(16383)); }});
  expect_raised(bounds + "16385, 16384 needed", {[&] { pixels(3, array(16385)); }});
  EXPECT_TRUE(state() == before);
}

TEST_F(toolkit_fixture, TexturesWithoutASourceAreRefused) {
  Java_ja_Y(env, peer, 5);
  Java_ja_V(env, peer, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0);
  EXPECT_EQ(java.take_exception(), "java.lang.IllegalStateException: id: 0, but there is no texture source");
  toolkit* const before = toolkit::m_pInstance;
  Java_ja_q(env, java.new_object("ja"), java.new_object("source"), -1);
  EXPECT_EQ(java.take_exception(), "java.lang.IllegalArgumentException: texture_count: -1 is negative");
  EXPECT_EQ(toolkit::m_pInstance, before);
}

}  // namespace
