// The texture cache against a simple model of its recency list, its blur against the slow one, and both through the
// natives.
#include "texture/texturecache.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <functional>
#include <list>
#include <map>
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
  static constexpr int ids = 65536;
  fake_java java;
  const jobject source = java.new_object("source");
  std::unique_ptr<TestCache> cache = std::make_unique<TestCache>(java.env(), source, ids);
  Pixels pixels = Pixels(texturecache::texture_pixels, 0xFF808080);

  void TearDown() override {
    EXPECT_EQ(java.weak_references(), 1);
    cache.reset();
    EXPECT_EQ(java.weak_references(), 0);
    java.verify();
  }

  // The client answers each request with an upload; the texture's colour word tells it apart.
  void answer_requests() {
    cache->on_request = [this](unsigned short id) {
      ++requests;
      upload(id);
      return true;
    };
  }
  void upload(unsigned short id, signed char scroll_u = 0, signed char scroll_v = 0) {
    texturemetrics fields;
    fields.average_hsl = id;
    fields.scroll_u = scroll_u;
    fields.scroll_v = scroll_v;
    cache->upload_texture(id, pixels.data(), fields);
  }
  int requests = 0;
};

}  // namespace

TEST_F(TextureCacheTest, NoTextureDoesNotReachTheClient) {
  answer_requests();
  EXPECT_EQ(cache->gettex(65535), nullptr);
  EXPECT_EQ(cache->getmetrics(65535), nullptr);
  EXPECT_EQ(requests, 0);
}

TEST_F(TextureCacheTest, AnUndeliveredTextureIsNullAndAskedForAgain) {
  cache->on_request = [this](unsigned short) { return ++requests, false; };
  EXPECT_EQ(cache->gettex(7), nullptr);
  EXPECT_EQ(cache->gettex(7), nullptr);
  EXPECT_EQ(requests, 2);
  cache->on_request = [](unsigned short) { return true; };  // says yes and uploads nothing
  EXPECT_EQ(cache->gettex(7), nullptr);
}

TEST_F(TextureCacheTest, UploadsWithoutUseShareOneSlot) {
  for (unsigned short id = 0; id < 200; ++id) upload(id);
  cache->on_request = [this](unsigned short) { return ++requests, false; };
  for (unsigned short id = 0; id < 199; ++id) EXPECT_EQ(cache->gettex(id), nullptr);
  EXPECT_EQ(requests, 199);
  ASSERT_NE(cache->gettex(199), nullptr);
  EXPECT_EQ(requests, 199);
}

// Two slots share the rows of the atlas; a slot's place in it never changes.
TEST_F(TextureCacheTest, SlotsLieInPairsSideBySide) {
  answer_requests();
  const unsigned int* const first = cache->gettex(1000)->texels;
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(first) % 64, 0u);
  for (int slot = 1; slot < 200; ++slot) {
    EXPECT_EQ(cache->gettex(static_cast<unsigned short>(1000 + slot))->texels - first,
              slot / 2 * 128 * 256 + (slot & 1) * 128);
  }
  EXPECT_EQ(cache->gettex(5000)->texels, first) << "the one used longest ago goes";
  EXPECT_EQ(requests, 201);
  cache->gettex(1000);
  EXPECT_EQ(requests, 202);
}

// Thousands of requests, uploads out of turn and services, against a list that is searched by hand.
TEST_F(TextureCacheTest, FollowsTheSimpleModel) {
  struct Slot {
    int number;
    int owner = -1;
    signed char scroll_u = 0, scroll_v = 0;
    bool pending = false;
    float offset_u = 0, offset_v = 0;
  };
  std::list<Slot> recency;
  for (int i = 0; i < 200; ++i) recency.push_back({i});
  std::map<int, int> slot_of;
  std::vector<int> scrolling;
  int expected_requests = 0;
  test_random random(3);
  const unsigned int* atlas = nullptr;

  const auto put = [&](unsigned short id) {
    const auto u = static_cast<signed char>(random.one_in(2) ? 0 : random.between(-128, 127));
    const auto v = static_cast<signed char>(random.one_in(2) ? 0 : random.between(-128, 127));
    upload(id, u, v);
    Slot& slot = recency.front();
    // An owner with id 255 is taken for none and keeps its entry.
    if (slot.owner >= 0 && slot.owner != 255) slot_of.erase(slot.owner);
    slot_of[id] = slot.number;
    slot = {slot.number, id, u, v};
  };
  const auto slot_number = [](std::ptrdiff_t offset) {
    return static_cast<int>(offset / (128 * 256) * 2 + offset % 256 / 128);
  };
  cache->on_request = [&](unsigned short id) {
    ++requests;
    if (id % 17 == 0) return false;
    put(id);
    return true;
  };
  // The first slot to be filled is number 0.
  put(255);
  atlas = cache->gettex(255)->texels;
  recency.splice(recency.end(), recency, recency.begin());
  if (recency.back().scroll_u != 0 || recency.back().scroll_v != 0) {
    recency.back().pending = true;
    scrolling.push_back(0);
  }

  for (int step = 0; step < 20000; ++step) {
    if (random.one_in(300)) {
      put(static_cast<unsigned short>(random.between(200, 500)));
    } else if (random.one_in(60)) {
      const int time = random.between(0, 0x7FFFFFFF);
      cache->service(time);
      const float t = static_cast<float>(time % 128000) / 1000.0f;
      for (int number : scrolling) {
        Slot& slot = *std::find_if(recency.begin(), recency.end(), [&](Slot& s) { return s.number == number; });
        slot.offset_u = std::fmod(static_cast<float>(slot.scroll_u) * t * 0.015625f * 128.0f, 128.0f);
        slot.offset_v = std::fmod(static_cast<float>(slot.scroll_v) * t * 0.015625f * 128.0f, 128.0f);
        slot.pending = false;
      }
      scrolling.clear();
    } else {
      const int wide = random.one_in(3) ? 1000 : 180;
      const auto id = static_cast<unsigned short>(random.one_in(50) ? 255 : random.between(0, wide));
      const bool cached = slot_of.count(id) != 0;
      expected_requests += !cached;
      const cachedtexture* record = cache->gettex(id);
      ASSERT_EQ(requests, expected_requests) << "step " << step << " id " << id;
      if (!cached && id % 17 == 0 && id != 255) {
        ASSERT_EQ(record, nullptr);
        continue;
      }
      if (slot_of.count(id) == 0) continue;  // 255 is a multiple of 17 too
      ASSERT_NE(record, nullptr);
      const auto found = std::find_if(recency.begin(), recency.end(), [&](Slot& s) { return s.number == slot_of[id]; });
      Slot& slot = *found;
      ASSERT_EQ(slot_number(record->texels - atlas), slot.number) << "step " << step << " id " << id;
      ASSERT_EQ(record->average_hsl, slot.owner);
      ASSERT_EQ(record->offset_u.x, slot.offset_u);
      ASSERT_EQ(record->offset_u.w, slot.offset_u);
      ASSERT_EQ(record->offset_v.y, slot.offset_v);
      recency.splice(recency.end(), recency, found);
      if (!slot.pending && (slot.scroll_u != 0 || slot.scroll_v != 0)) {
        slot.pending = true;
        scrolling.push_back(slot.number);
      }
    }
  }
  EXPECT_GT(expected_requests, 2000);
}

// Uploads into a slot that scrolls, many more of them in a frame than there are slots.
TEST_F(TextureCacheTest, ScrollListHoldsAnyNumberOfUploads) {
  for (int round = 0; round < 1000; ++round) {
    const auto id = static_cast<unsigned short>(round + 300);
    upload(id, 64, 0);
    ASSERT_NE(cache->gettex(id), nullptr);
  }
  cache->service(1000);
  EXPECT_EQ(cache->gettex(1299)->offset_u.x, 0.0f) << "64 is a whole width in a second";
  cache->service(500);
  EXPECT_EQ(cache->gettex(1299)->offset_u.z, 64.0f);
  cache->service(0);
  cache->service(250);
  EXPECT_EQ(cache->gettex(1299)->offset_u.z, 0.0f) << "not used since, so it stays where it was";
}

TEST_F(TextureCacheTest, MonitorIsTakenBySeveralThreadsOnly) {
  cache->monitor_enter();
  cache->monitor_exit();
  EXPECT_EQ(java.calls("MonitorEnter"), 0);
  cache->threaded = true;
  cache->monitor_enter();
  cache->monitor_exit();
  EXPECT_EQ(java.calls("MonitorEnter"), 1);
  EXPECT_EQ(java.calls("MonitorExit"), 1);
}

TEST_F(TextureCacheTest, BlurIsTheSlowOne) {
  test_random random(11);
  cache->gettex(0);
  for (int n = 0; n < 24; ++n) {
    const int hole_share = random.between(0, 3);
    for (unsigned int& word : pixels) {
      const bool hole = hole_share == 3 ? !random.one_in(20) : hole_share != 0 && random.one_in(hole_share * 2);
      word = hole ? 0 : random.one_in(8) ? random.word() & 0xFF000001 : random.word();
    }
    if (n == 0) std::fill(pixels.begin(), pixels.end(), 0xFFFFFFFFu);
    texturemetrics fields;
    fields.alpha_kind = static_cast<unsigned int>(random.between(0, 2));
    fields.wrap_u = n & 1;
    fields.wrap_v = n & 2;
    const auto id = static_cast<unsigned short>(n + 1);
    cache->upload_texture(id, pixels.data(), fields);
    const Pixels expected = oracle::blurred_texture(pixels, fields.wrap_u, fields.wrap_v, fields.alpha_kind != 1);
    const Pixels found = slot_pixels(cache->gettex(id)->texels);
    for (std::size_t i = 0; i < expected.size(); ++i) {
      ASSERT_EQ(found[i], expected[i]) << "texture " << n << " at (" << i % 128 << ", " << i / 128 << ")";
    }
  }
}

TEST_F(TextureCacheTest, HolesStayAndLendNoColour) {
  std::fill(pixels.begin(), pixels.end(), 0u);
  pixels[40 * 128 + 40] = 0xFF336699;
  texturemetrics fields;
  fields.alpha_kind = 1;
  cache->upload_texture(1, pixels.data(), fields);
  EXPECT_EQ(slot_pixels(cache->gettex(1)->texels), oracle::blurred_texture(pixels, false, false, false));
  Pixels found = slot_pixels(cache->gettex(1)->texels);
  // Its own tap alone has weight; truncation can take one from a channel, twice.
  const unsigned int lone = found[40 * 128 + 40];
  for (int c = 0; c < 32; c += 8) EXPECT_NEAR(lone >> c & 0xFF, 0xFF336699u >> c & 0xFF, 2);
  found[40 * 128 + 40] = 0;
  EXPECT_EQ(found, Pixels(found.size())) << "nothing bleeds into the holes";
}

TEST_F(TextureCacheTest, ColumnZeroWrapsOrRepeats) {
  std::fill(pixels.begin(), pixels.end(), 0xFF000000u);
  for (int y = 0; y < 128; ++y) pixels[y * 128 + 127] = 0xFF0000FF;
  for (const bool wrap : {false, true}) {
    texturemetrics fields;
    fields.wrap_u = wrap;
    cache->upload_texture(1, pixels.data(), fields);
    EXPECT_EQ((*cache->gettex(1)->texels & 0xFF) != 0, wrap);
  }
}

TEST_F(TextureCacheTest, CopyTextureKeepsThePixels) {
  test_random random(4);
  for (unsigned int& word : pixels) word = random.word();
  upload(9);
  const cachedtexture* record = cache->gettex(9);  // slot 0
  cache->copy_texture(pixels.data(), 0);
  EXPECT_EQ(slot_pixels(record->texels), pixels);
}

// --- Through the natives --------------------------------------------------------------------------------------------

namespace {

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

  void metrics(int id) {
    Java_ja_V(env, peer, static_cast<jshort>(id), -2, 2, -3, 4, 5, 2, -6, 7, -8, 9, 0, 1, 0, 1, 0, -1, 1, 0, -10);
  }
  void pixels(int id, jintArray array) {
    Java_ja_F(env, peer, static_cast<jshort>(id), array, -2, 2, -3, 4, 5, 2, -6, 7, -8, 9, 0, 1, 0, 1, 0, -1, 1, 0,
              -10);
  }
  static void expect_fields(const texturemetrics& m) {
    EXPECT_EQ(m.average_hsl, 65534);
    EXPECT_EQ(m.alpha_kind, 2u);
    EXPECT_EQ(m.lighting_kind, 253);
    EXPECT_EQ(m.attribute_a, 4);
    EXPECT_EQ(m.attribute_b, 5u);
    EXPECT_TRUE(m.attribute_c);
    EXPECT_EQ(m.grey_blend, 250);
    EXPECT_EQ(m.brighten, 7);
    EXPECT_EQ(m.scroll_u, -8);
    EXPECT_EQ(m.scroll_v, 9);
    EXPECT_FALSE(m.flat_colour);
    EXPECT_TRUE(m.do_not_draw);
    EXPECT_FALSE(m.attribute_d);
    EXPECT_TRUE(m.wrap_u);
    EXPECT_FALSE(m.wrap_v);
    EXPECT_EQ(m.attribute_e, 255);
    EXPECT_TRUE(m.attribute_f);
    EXPECT_FALSE(m.attribute_g);
    EXPECT_EQ(m.attribute_h, 0xFFFFFFF6u);
  }
};

}  // namespace

// A face asks, Java uploads from inside the call, and the scroll moves with the client's clock.
TEST_F(TextureNatives, RequestUploadsFromInside) {
  const jintArray array = java.new_ints(std::vector<jint>(16384, -1));
  jshort asked = 0;
  java.request_texture = [&](jshort id) -> jboolean {
    asked = id;
    pixels(id, array);
    return 1;
  };
  metrics(299);
  expect_fields(*kit().textures->getmetrics(299));
  const cachedtexture* record = kit().textures->gettex(299);
  ASSERT_NE(record, nullptr);
  EXPECT_EQ(asked, 299);
  expect_fields(*record);
  EXPECT_EQ(slot_pixels(record->texels), oracle::blurred_texture(Pixels(16384, 0xFFFFFFFF), true, false, true));
  EXPECT_EQ(java.ints(array), std::vector<jint>(16384, -1));
  Java_ja_Y(env, peer, 1000);
  EXPECT_EQ(record->offset_u.x, -16.0f);
  EXPECT_EQ(record->offset_v.x, 18.0f);
}

TEST_F(TextureNatives, OnlyTrueIsAnAnswer) {
  java.request_texture = [&](jshort) -> jboolean { return 2; };
  EXPECT_EQ(kit().textures->gettex(3), nullptr);
  java.request_texture = [&](jshort) -> jboolean {
    java.raise("java/lang/Error", "lost");
    return 1;
  };
  EXPECT_EQ(kit().textures->gettex(3), nullptr);
  EXPECT_EQ(java.take_exception(), "java.lang.Error: lost");
}

TEST_F(TextureNatives, BadUploadsRaiseAndChangeNothing) {
  const jintArray good = java.new_ints(std::vector<jint>(16384, 5));
  const std::vector<unsigned char> before(reinterpret_cast<const unsigned char*>(kit().textures),
                                          reinterpret_cast<const unsigned char*>(kit().textures + 1));
  const auto refused = [&](const char* exception) {
    EXPECT_EQ(java.take_exception(), exception);
    EXPECT_EQ(std::memcmp(before.data(), kit().textures, before.size()), 0);
  };
  metrics(300);
  refused("java.lang.IllegalArgumentException: id: 300 is not below the number of textures, 300");
  metrics(-1);
  refused("java.lang.IllegalArgumentException: id: 65535 is not below the number of textures, 300");
  pixels(300, good);
  refused("java.lang.IllegalArgumentException: id: 300 is not below the number of textures, 300");
  pixels(3, nullptr);
  refused("java.lang.NullPointerException: ");
  pixels(3, java.new_ints(std::vector<jint>(16383)));
  refused("java.lang.ArrayIndexOutOfBoundsException: pixels: length 16383, 16384 needed");
  pixels(3, java.new_ints(std::vector<jint>(16385)));
  refused("java.lang.ArrayIndexOutOfBoundsException: pixels: length 16385, 16384 needed");
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
