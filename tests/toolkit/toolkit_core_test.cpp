// The toolkit's life, its way back into Java, its targets, the resources of worker threads, and the client's pools.
#include <gtest/gtest.h>
#include <xmmintrin.h>

#include <cerrno>
#include <cstring>
#include <thread>

#include "maths/colourutils.h"
#include "model/model.h"
#include "natives/native.h"
#include "support/allocation_failure.h"
#include "support/toolkit_fixture.h"
#include "toolkit/clippingmask.h"
#include "toolkit/threadresource.h"
#include "util/memorymanager/memorypool.h"

namespace {

class toolkit_core : public toolkit_fixture {
 public:
  const std::string null_argument = "java.lang.NullPointerException: ";
  const std::string no_memory = "java.lang.RuntimeException: Cannot allocate memory";

  void TearDown() override {
    allocation_failure::fail_memalign(0, 0);
    allocation_failure::fail_realloc(false);
    toolkit_fixture::TearDown();
  }
  jobject new_mask(const std::vector<jint>& starts, const std::vector<jint>& lengths) {
    const jobject mask = java.new_object("wa");
    Java_wa_l(env, mask, 0, pool_peer, 0, 0, java.new_ints(starts), java.new_ints(lengths));
    return mask;
  }
};

TEST_F(toolkit_core, starts_with_the_values_of_its_record) {
  const toolkit& t = kit();
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(&t) % 16, 0u);
  EXPECT_EQ(native<toolkit>(peer), &t);
  JavaVM* vm = nullptr;
  env->GetJavaVM(&vm);
  EXPECT_EQ(t.vm, vm);
  EXPECT_EQ(t.get_env(), env);
  EXPECT_EQ(t.pool, &pool());
  EXPECT_TRUE(!t.quit_requested && !t.underwater && t.textures == nullptr && t.threads.isempty());
  EXPECT_TRUE(t.width == 0 && t.height == 0 && t.colourbuffer == nullptr && t.depthbuffer == nullptr);
  EXPECT_TRUE(t.offscreen_sprite == nullptr && t.offscreen_depth == nullptr);
  EXPECT_TRUE(t.clip_x0 == 0 && t.clip_y0 == 0 && t.clip_x1 == 0 && t.clip_y1 == 0);
  EXPECT_EQ(t.thread_count, 1);
  EXPECT_EQ(t.sun_front, 179.0f / 256);
  EXPECT_EQ(t.sun_back, 1.2f);
  EXPECT_EQ(t.ambient, 295.0f / 256);
  EXPECT_EQ(t.fog_start, 255.0f);
  EXPECT_TRUE(t.shadow_resolution == 8 && t.shadow_resolution_shift == 3);
  EXPECT_TRUE(t.sun_x == 0 && t.sun_y == 0 && t.sun_z == 0 && t.sun_r == 0 && t.sun_g == 0 && t.sun_b == 0);
  EXPECT_TRUE(t.fog_colour == 0 && t.underwater_height == 0 && t.underwater_range == 0);
  EXPECT_TRUE(t.shadow_slope_x == 0 && t.shadow_slope_z == 0 && t.pointlight_count == 0);
  for (const Matrix_c* matrix : {&t.camera, &t.projection, &t.viewprojection}) {
    EXPECT_EQ(std::memcmp(matrix, &Matrix_c::IdentityRows, sizeof(Matrix_c)), 0);
  }
  const unsigned char zeros[sizeof t.frustum] = {};
  EXPECT_EQ(std::memcmp(t.frustum, zeros, sizeof t.frustum), 0);
  EXPECT_EQ(std::memcmp(t.pointlight_pos, zeros, sizeof t.pointlight_pos), 0);
  EXPECT_EQ(std::memcmp(t.pointlight_strength, zeros, sizeof t.pointlight_strength), 0);
  EXPECT_EQ(std::memcmp(t.pointlight_colour, zeros, sizeof t.pointlight_colour), 0);
  EXPECT_NE(colourutils::hsl_2_rgb(127), 0u);
}

TEST_F(toolkit_core, is_made_and_destroyed_in_order) {
  fake_java other;
  toolkit* const before = toolkit::m_pInstance;
  const jobject second = other.new_object("ja");
  // Denormals count as zero, and become it, on the thread that makes the toolkit; the rest of the mode stays.
  _mm_setcsr(0x7F80);  // rounding toward zero
  const int references = other.weak_references();
  other.clear_log();
  Java_ja_q(other, second, nullptr, 0);
  EXPECT_EQ(_mm_getcsr() & ~0x3Fu, 0xFFC0u);
  _mm_setcsr(0x9FC0);
  const std::vector<std::string> made = {"GetJavaVM",   "NewWeakGlobalRef", "FindClass",
                                         "GetMethodID", "GetMethodID",      "GetMethodID"};
  ASSERT_GE(other.log().size(), made.size());
  EXPECT_TRUE(std::equal(made.begin(), made.end(), other.log().begin()));
  EXPECT_EQ(other.log().back(), "SetLongField");
  toolkit* const instance = toolkit::m_pInstance;
  EXPECT_NE(instance, before);
  Java_ja_ma(other, second);
  EXPECT_EQ(other.weak_references(), references);
  EXPECT_EQ(other.nativeid(second), 0);
  EXPECT_EQ(toolkit::m_pInstance, instance);
  toolkit::m_pInstance = before;

  if (contract::checked) {
    Java_ja_ma(other, second);
    EXPECT_EQ(other.take_exception(), null_argument);
  }
  allocation_failure::fail_memalign(1, ENOMEM);
  const jobject third = other.new_object("ja");
  Java_ja_q(other, third, nullptr, 0);
  EXPECT_EQ(other.take_exception(), no_memory);
  EXPECT_EQ(other.nativeid(third), 0);
  EXPECT_EQ(toolkit::m_pInstance, before);
  other.verify();
}

TEST_F(toolkit_core, calls_back_into_its_peer) {
  std::vector<jshort> asked;
  jboolean answer = JNI_TRUE;
  java.request_texture = [&](jshort id) {
    asked.push_back(id);
    return answer;
  };
  EXPECT_TRUE(kit().request_texture(7));
  EXPECT_TRUE(kit().request_texture(0xFFFE));
  answer = 2;  // only true is true
  EXPECT_FALSE(kit().request_texture(8));
  answer = JNI_FALSE;
  EXPECT_FALSE(kit().request_texture(9));
  EXPECT_EQ(asked, (std::vector<jshort>{7, -2, 8, 9}));

  const jobject shadow = java.new_object("aa");
  java.createshadow = [&] { return shadow; };
  EXPECT_EQ(kit().createshadow(), shadow);

  // A callback's exception stays pending; another thread calls with its own environment.
  java.garbagecollect = [&] { java.raise("java/lang/IllegalStateException", "from h"); };
  kit().garbagecollect();
  EXPECT_EQ(java.take_exception(), "java.lang.IllegalStateException: from h");
  java.garbagecollect = nullptr;
  std::thread([&] { kit().garbagecollect(); }).join();
}

TEST_F(toolkit_core, answers_small_questions) {
  EXPECT_EQ(Java_ja_j(env, peer), 0);
  Java_ja_N(env, peer);
  model::modelcount = 12;
  EXPECT_EQ(Java_ja_oa(env, peer), 12);
  EXPECT_EQ(Java_ja_oa(env, peer), 0);
  Java_ja_da(env, peer);
  EXPECT_TRUE(kit().quit_requested);
  Java_ja_Y(env, peer, 50);  // nothing scrolls without textures
  kit().set_zwrite(true);
  EXPECT_TRUE(kit().zwrite && Rasterizer_n::m_ZWriteEnabled);
  kit().set_zwrite(false);
  EXPECT_FALSE(kit().zwrite || Rasterizer_n::m_ZWriteEnabled);
  kit().set_zwrite(true);

  EXPECT_EQ(Java_ja_za(env, peer), 0);
  const jobject mask = new_mask({1, 2, 3}, {4, 5, 6});
  EXPECT_EQ(Java_ja_za(env, peer), 24);
  Java_wa_ma(env, mask);
  EXPECT_EQ(Java_ja_za(env, peer), 0);
}

TEST_F(toolkit_core, losing_the_canvas_stops_the_raster_stage_only) {
  make_target(20, 10);
  Rasterizer_n::Viewport_s viewport = *Rasterizer_n::GetViewport();
  viewport.x = 5;
  viewport.zmin = 0.25f;
  viewport.zmax = 0.75f;
  Rasterizer_n::SetViewport(viewport);
  Java_ja_r(env, peer, 1, 2, 11, 9);
  Java_ja_PA(env, peer, nullptr);
  EXPECT_EQ(Rasterizer_n::m_pColourBuffer, nullptr);
  EXPECT_EQ(Rasterizer_n::m_pDepthBuffer, nullptr);
  EXPECT_EQ(Rasterizer_n::m_ScreenPitch, 0);
  EXPECT_TRUE(kit().width == 20 && kit().height == 10);
  EXPECT_TRUE(kit().colourbuffer == colour.data() && kit().depthbuffer == depth.data());
  EXPECT_TRUE(kit().clip_x0 == 1 && kit().clip_y1 == 9);
  // The viewport is the whole target again, its depths as they were.
  viewport = *Rasterizer_n::GetViewport();
  EXPECT_TRUE(viewport.x == 0 && viewport.y == 0 && viewport.width == 20 && viewport.height == 10);
  EXPECT_TRUE(viewport.zmin == 0.25f && viewport.zmax == 0.75f);
}

TEST_F(toolkit_core, keeps_a_ring_of_thread_resources) {
  jobject peers[3];
  threadresource* resources[3];
  for (int i = 0; i < 3; ++i) {
    peers[i] = java.new_object("a");
    Java_a_ha(env, peers[i], -1, -1, -1, 10 + i, 20 + i);
    resources[i] = native<threadresource>(peers[i]);
    EXPECT_EQ(kit().threads.next, resources[i]);
  }
  const threadresource& r = *resources[1];
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(&r) % 16, 0u);
  EXPECT_TRUE(r.owner == &kit() && r.a == 11 && r.b == 21);
  EXPECT_TRUE(r.light_key_marker[0] == 1 && r.light_key_marker[7] == 0 && r.marker2 == 0);
  for (const Vector4_s& v : r.vertices) ASSERT_TRUE(v.x == 0 && v.y == 0 && v.z == 0 && v.w == 0);
  for (const Vector4_s& v : r.light_table2) ASSERT_TRUE(v.x == 0 && v.y == 0 && v.z == 0 && v.w == 0);
  for (const unsigned int word : r.vertex_words) ASSERT_EQ(word, 0u);
  Java_a_JA(env, peers[1], java.nativeid(peers[1]));
  Java_a_UA(env, peers[1], java.nativeid(peers[1]));

  Java_a_R(env, peers[1], java.nativeid(peers[1]));
  EXPECT_EQ(java.nativeid(peers[1]), 0);
  EXPECT_TRUE(resources[2]->next == resources[0] && resources[0]->prev == resources[2]);
  Java_a_R(env, peers[2], java.nativeid(peers[2]));
  Java_a_R(env, peers[0], java.nativeid(peers[0]));
  EXPECT_TRUE(kit().threads.isempty());

  allocation_failure::fail_memalign(1, ENOMEM);
  Java_a_ha(env, peers[0], 0, 0, 0, 1, 2);
  EXPECT_EQ(java.take_exception(), no_memory);
  EXPECT_EQ(java.nativeid(peers[0]), 0);
  EXPECT_TRUE(kit().threads.isempty());
  if (!contract::checked) return;
  for (const auto of_handle : {Java_a_R, Java_a_JA, Java_a_UA}) {
    of_handle(env, peers[0], 0);
    EXPECT_EQ(java.take_exception(), null_argument);
  }
}

TEST_F(toolkit_core, a_pool_that_is_full_asks_the_client_to_destroy_objects) {
  // Masks fill the pool; the collection destroys every second one and is asked before the pool grows.
  std::vector<jobject> masks;
  const std::vector<jint> row(2500, 3);
  int asked = 0;
  java.garbagecollect = [&] {
    ++asked;
    for (std::size_t i = 0; i < masks.size(); i += 2) Java_wa_ma(env, masks[i]);
  };
  while (asked == 0) masks.push_back(new_mask(row, row));
  EXPECT_EQ(masks.size(), pool_size / 20000 + 1);
  EXPECT_EQ(Java_ja_za(env, peer),
            static_cast<jint>(masks.size() / 2 * 20000 + 20000 * (masks.size() % 2 == 0 ? 0 : 1)));
  for (const jobject mask : masks) {
    if (const auto* shape = native<clippingmask>(mask)) {
      ASSERT_EQ(std::vector<int>(shape->starts.data(), shape->starts.data() + 2500), row);
    }
  }

  // No object, and no more memory in use, when the pool cannot grow either.
  java.garbagecollect = nullptr;
  const jint used = Java_ja_za(env, peer);
  allocation_failure::fail_realloc(true);
  const jobject failed = java.new_object("wa");
  const std::vector<jint> many(600000);
  Java_wa_l(env, failed, 0, pool_peer, 0, 0, java.new_ints(many), java.new_ints(many));
  EXPECT_EQ(java.take_exception().substr(0, 41), "java.lang.OutOfMemoryError: native(MPR: 1");
  allocation_failure::fail_realloc(false);
  EXPECT_EQ(java.nativeid(failed), 0);
  EXPECT_EQ(Java_ja_za(env, peer), used);
  for (const jobject mask : masks) Java_wa_ma(env, mask);
  EXPECT_EQ(Java_ja_za(env, peer), 0);
}

TEST_F(toolkit_core, a_pool_may_go_before_its_objects) {
  const jobject mask = new_mask({1, 2}, {3, 4});
  const jobject other = new_mask({1}, {3});
  // Only the storage first, as a client does whose objects still live.
  const jobject spare = java.new_object("ba");
  Java_ba_sa(env, spare, 0, 1000);
  const jobject spare_mask = java.new_object("wa");
  Java_wa_l(env, spare_mask, 0, spare, 0, 0, java.new_ints({1}), java.new_ints({2}));
  auto* const released = native<memorypool>(spare);
  Java_ba_ha(env, spare);
  EXPECT_EQ(java.nativeid(spare), 0);
  EXPECT_EQ(native<clippingmask>(spare_mask)->rows(), 0);
  EXPECT_EQ(native<clippingmask>(spare_mask)->starts.data(), nullptr);
  Java_wa_ma(env, spare_mask);
  Java_ba_ma(env, spare);  // knows nothing any more
  released->~memorypool();
  ::operator delete(released);

  const int references = java.weak_references();
  Java_ba_ma(env, pool_peer);
  EXPECT_EQ(java.weak_references(), references);  // the peer's stays
  EXPECT_EQ(java.nativeid(pool_peer), 0);
  EXPECT_EQ(Java_ja_za(env, peer), 0);
  Java_ba_ma(env, pool_peer);
  Java_ba_u(env, pool_peer);
  Java_wa_ma(env, mask);
  Java_wa_ma(env, mask);
  Java_wa_ma(env, other);
  EXPECT_EQ(java.nativeid(mask), 0);
  EXPECT_EQ(Java_ja_za(env, peer), 0);
  if (!contract::checked) return;
  Java_ba_ha(env, pool_peer);
  EXPECT_EQ(java.take_exception(), null_argument);
  Java_wa_l(env, mask, 0, pool_peer, 0, 0, nullptr, nullptr);
  EXPECT_EQ(java.take_exception(), null_argument);
}

TEST_F(toolkit_core, wrong_calls_raise_and_change_nothing) {
  const jobject fresh = java.new_object("ba");
  allocation_failure::fail_memalign(1, ENOMEM);
  Java_ba_sa(env, fresh, 0, 1000);
  EXPECT_EQ(java.take_exception(), no_memory);
  const jobject mask = java.new_object("wa");
  Java_wa_l(env, mask, 0, nullptr, 0, 0, nullptr, nullptr);
  EXPECT_EQ(java.take_exception(), null_argument);
  Java_ja_n(env, peer, nullptr);
  EXPECT_EQ(java.take_exception(), null_argument);
  EXPECT_EQ(kit().pool, &pool());
  if (!contract::checked) return;

  Java_ba_sa(env, fresh, 0, -1);
  EXPECT_EQ(java.take_exception(), "java.lang.IllegalArgumentException: size: -1 is negative");
  Java_wa_l(env, mask, 0, pool_peer, 0, 0, java.new_ints({1, 2, 3}), java.new_ints({1, 2}));
  EXPECT_EQ(java.take_exception(), "java.lang.ArrayIndexOutOfBoundsException: lengths: length 2, 3 needed");
  EXPECT_EQ(java.nativeid(mask), 0);
  Java_ja_PA(env, peer, java.new_object("za"));
  EXPECT_EQ(java.take_exception(), null_argument);

  // Before there is a toolkit.
  toolkit* const instance = std::exchange(toolkit::m_pInstance, nullptr);
  Java_ba_sa(env, fresh, 0, 1000);
  EXPECT_EQ(java.take_exception(), null_argument);
  Java_a_ha(env, fresh, 0, 0, 0, 0, 0);
  EXPECT_EQ(java.take_exception(), null_argument);
  Java_ja_da(env, peer);
  EXPECT_EQ(java.take_exception(), null_argument);
  toolkit::m_pInstance = instance;
  EXPECT_EQ(java.nativeid(fresh), 0);
}

#if defined(__i386__)
[[gnu::noipa]] void divide_by_three(volatile long double& out, long double number) { out = number / 3; }

TEST_F(toolkit_core, extended_precision_does_not_depend_on_the_runtime) {
  volatile long double exact, cut, inside;
  divide_by_three(exact, 1);
  const unsigned short runtimes = 0x27F;  // double precision
  asm volatile("fldcw %0" ::"m"(runtimes) : "memory");
  divide_by_three(cut, 1);
  natives::frame(env, [&] { divide_by_three(inside, 1); });
  unsigned short after = 0;
  asm volatile("fnstcw %0" : "=m"(after)::"memory");
  const unsigned short usual = 0x37F;
  asm volatile("fldcw %0" ::"m"(usual) : "memory");
  EXPECT_NE(cut, exact);
  EXPECT_EQ(inside, exact);
  EXPECT_EQ(after, runtimes);
}
#endif

}  // namespace
