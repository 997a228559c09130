// The toolkit's life, its way back into Java, the resources of worker threads, and the client's pools.
#include <gtest/gtest.h>
#include <xmmintrin.h>

#include <cerrno>
#include <cstring>
#include <thread>

#include "maths/colourutils.h"
#include "model/model.h"
#include "natives/native.h"
#include "support/toolkit_fixture.h"
#include "toolkit/clippingmask.h"
#include "toolkit/threadresource.h"
#include "util/memorymanager/memorypool.h"

namespace {

using toolkit_core = toolkit_fixture;

TEST_F(toolkit_core, starts_with_the_values_of_its_record) {
  const toolkit& t = kit();
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(&t) % 16, 0u);
  EXPECT_TRUE(native<toolkit>(peer) == &t && t.get_env() == env && t.pool == &pool());
  EXPECT_TRUE(t.sun_front == 179.0f / 256 && t.sun_back == 1.2f && t.ambient == 295.0f / 256 && t.fog_start == 255);
  EXPECT_TRUE(t.shadow_resolution == 8 && t.shadow_resolution_shift == 3 && t.thread_count == 1);
  EXPECT_TRUE(!t.quit_requested && !t.underwater && t.threads.isempty() && t.width == 0 && t.colourbuffer == nullptr);
  for (const Matrix_c* matrix : {&t.camera, &t.projection, &t.viewprojection}) {
    EXPECT_EQ(std::memcmp(matrix, &Matrix_c::IdentityRows, sizeof(Matrix_c)), 0);
  }
  EXPECT_NE(colourutils::hsl_2_rgb(127), 0u);
}

TEST_F(toolkit_core, is_made_and_destroyed_with_all_that_belongs_to_it) {
  toolkit* const before = toolkit::m_pInstance;
  const int references = java.weak_references();
  const jobject second = java.new_object("ja");
  // Denormals count as zero, and become it, on the thread that makes the toolkit; the rest of the mode stays.
  _mm_setcsr(0x7F80);  // rounding toward zero
  Java_ja_q(env, second, nullptr, 0);
  EXPECT_EQ(_mm_getcsr() & ~0x3Fu, 0xFFC0u);
  _mm_setcsr(0x9FC0);
  toolkit* const instance = toolkit::m_pInstance;
  EXPECT_NE(instance, before);
  Java_ja_ma(env, second);
  EXPECT_TRUE(java.weak_references() == references && java.nativeid(second) == 0 && toolkit::m_pInstance == instance);
  toolkit::m_pInstance = before;

  allocation_failure::fail_memalign(1, ENOMEM);
  EXPECT_EQ(raised([&] { Java_ja_q(env, second, nullptr, 0); }), no_memory);
  EXPECT_TRUE(java.nativeid(second) == 0 && toolkit::m_pInstance == before);
}

TEST_F(toolkit_core, calls_back_into_its_peer) {
  std::vector<jshort> asked;
  jboolean answer = JNI_TRUE;
  java.request_texture = [&](jshort id) {
    asked.push_back(id);
    return answer;
  };
  EXPECT_TRUE(kit().request_texture(7) && kit().request_texture(0xFFFE));
  for (const jboolean no : {2, 0}) {  // only true is true
    answer = no;
    EXPECT_FALSE(kit().request_texture(8));
  }
  EXPECT_EQ(asked, (std::vector<jshort>{7, -2, 8, 8}));

  const jobject shadow = java.new_object("aa");
  java.createshadow = [&] { return shadow; };
  EXPECT_EQ(kit().createshadow(), shadow);

  // A callback's exception stays pending; another thread calls with its own environment.
  java.garbagecollect = [&] { java.raise("java/lang/IllegalStateException", "from h"); };
  EXPECT_EQ(raised([] { kit().garbagecollect(); }), "java.lang.IllegalStateException: from h");
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
  for (const jboolean enable : {0, 1, 2}) {  // any boolean that is not false enables
    Java_ja_RA(env, peer, enable);
    EXPECT_TRUE(kit().zwrite == (enable != 0) && Rasterizer_n::m_ZWriteEnabled == (enable != 0));
  }
}

TEST_F(toolkit_core, losing_the_canvas_stops_the_raster_stage_only) {
  make_target(20, 10);
  Rasterizer_n::Viewport_s viewport = *Rasterizer_n::GetViewport();
  viewport.x = 5;
  viewport.zmin = 0.25f;
  Rasterizer_n::SetViewport(viewport);
  Java_ja_r(env, peer, 1, 2, 11, 9);
  Java_ja_PA(env, peer, nullptr);
  EXPECT_TRUE(Rasterizer_n::m_pColourBuffer == nullptr && Rasterizer_n::m_pDepthBuffer == nullptr);
  EXPECT_EQ(Rasterizer_n::m_ScreenPitch, 0);
  EXPECT_TRUE(kit().width == 20 && kit().height == 10 && kit().clip_x0 == 1 && kit().clip_y1 == 9);
  EXPECT_TRUE(kit().colourbuffer == colour.data() && kit().depthbuffer == depth.data());
  viewport = *Rasterizer_n::GetViewport();
  EXPECT_TRUE(viewport.x == 0 && viewport.y == 0 && viewport.width == 20 && viewport.height == 10);
  EXPECT_EQ(viewport.zmin, 0.25f) << "the depths stay";
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
  for (const auto of_handle : {Java_a_JA, Java_a_UA, Java_a_R}) of_handle(env, peers[1], java.nativeid(peers[1]));
  EXPECT_EQ(java.nativeid(peers[1]), 0);
  EXPECT_TRUE(resources[2]->next == resources[0] && resources[0]->prev == resources[2]);
  for (const int i : {2, 0}) Java_a_R(env, peers[i], java.nativeid(peers[i]));
  EXPECT_TRUE(kit().threads.isempty());

  allocation_failure::fail_memalign(1, ENOMEM);
  EXPECT_EQ(raised([&] { Java_a_ha(env, peers[0], 0, 0, 0, 1, 2); }), no_memory);
  EXPECT_TRUE(java.nativeid(peers[0]) == 0 && kit().threads.isempty());
}

TEST_F(toolkit_core, span_masks_copy_both_arrays_into_the_pool) {
  const jobject mask_peer = new_mask({5, -6, 7}, {1, 0, -2, 9});
  const auto& mask = *native<clippingmask>(mask_peer);
  EXPECT_TRUE(mask.width == 40 && mask.height == 30 && mask.rows() == 3);
  EXPECT_TRUE(mask.starts[0] == 5 && mask.starts[1] == -6 && mask.starts[2] == 7);
  EXPECT_TRUE(mask.lengths.count() == 4 && mask.lengths[2] == -2 && mask.lengths[3] == 9);
  EXPECT_TRUE(mask.starts.manager == &pool() && mask.lengths.manager == &pool());
  EXPECT_EQ(Java_ja_za(env, peer), 28);
  Java_wa_ma(env, mask_peer);
  EXPECT_EQ(Java_ja_za(env, peer), 0);
  Java_wa_l(env, mask_peer, 0, pool_peer, 1, 1, nullptr, nullptr);
  EXPECT_EQ(native<clippingmask>(mask_peer)->rows(), 0);
  Java_wa_ma(env, mask_peer);
}

// Masks fill the pool; it asks the client before it grows, and the client destroys every second one, but not the pool.
TEST_F(toolkit_core, a_pool_that_is_full_asks_the_client_to_destroy_objects) {
  std::vector<jobject> masks;
  const std::vector<jint> row(2500, 3);
  int asked = 0;
  java.garbagecollect = [&] {
    ++asked;
    expect_raised("java.lang.IllegalStateException: pool: it is in the middle of an allocation",
                  {[&] { Java_ba_ha(env, pool_peer); }, [&] { Java_ba_ma(env, pool_peer); }});
    for (std::size_t i = 0; i < masks.size(); i += 2) Java_wa_ma(env, masks[i]);
  };
  while (asked == 0) masks.push_back(new_mask(row, row));
  EXPECT_EQ(masks.size(), pool_size / 20000 + 1);
  const jint used = Java_ja_za(env, peer);
  EXPECT_EQ(used, static_cast<jint>(masks.size() / 2 + masks.size() % 2) * 20000);
  for (const jobject mask : masks) {
    if (const auto* shape = native<clippingmask>(mask)) {
      ASSERT_EQ(std::vector<int>(shape->starts.data(), shape->starts.data() + 2500), row);
    }
  }

  // No object, and no more memory in use, when the pool cannot grow either.
  java.garbagecollect = nullptr;
  allocation_failure::fail_realloc(true);
  const std::vector<jint> many(600000);
  jobject failed = nullptr;
  expect_raised("java.lang.OutOfMemoryError: native(MPR: 1", {[&] { failed = new_mask(many, many); }});
  EXPECT_TRUE(java.nativeid(failed) == 0 && Java_ja_za(env, peer) == used);
  for (const jobject mask : masks) Java_wa_ma(env, mask);
  EXPECT_EQ(Java_ja_za(env, peer), 0);
}

TEST_F(toolkit_core, a_pool_may_go_before_its_objects) {
  const jobject mask = new_mask({1, 2}, {3, 4});
  // Only the storage first, as a client does whose objects still live.
  const jobject spare = java.new_object("ba"), spare_mask = java.new_object("wa");
  Java_ba_sa(env, spare, 0, 1000);
  Java_wa_l(env, spare_mask, 0, spare, 0, 0, java.new_ints({1}), java.new_ints({2}));
  auto* const released = native<memorypool>(spare);
  Java_ba_ha(env, spare);
  EXPECT_EQ(java.nativeid(spare), 0);
  EXPECT_EQ(native<clippingmask>(spare_mask)->rows(), 0);
  Java_wa_ma(env, spare_mask);
  Java_ba_ma(env, spare);  // knows nothing any more
  released->~memorypool();
  ::operator delete(released);

  const int references = java.weak_references();
  Java_ba_ma(env, pool_peer);
  EXPECT_EQ(java.weak_references(), references) << "the peer's stays";
  EXPECT_TRUE(java.nativeid(pool_peer) == 0 && Java_ja_za(env, peer) == 0);
  Java_ba_ma(env, pool_peer);
  Java_ba_u(env, pool_peer);
  Java_wa_ma(env, mask);
  Java_wa_ma(env, mask);
  EXPECT_TRUE(java.nativeid(mask) == 0 && Java_ja_za(env, peer) == 0);
  expect_raised(null_pointer, {[&] { Java_ba_ha(env, pool_peer); }, [&] { new_mask({}, {}); }});
}

TEST_F(toolkit_core, wrong_calls_raise_and_change_nothing) {
  if (!contract::checked) GTEST_SKIP();
  const jobject fresh = java.new_object("ba");
  allocation_failure::fail_memalign(1, ENOMEM);
  EXPECT_EQ(raised([&] { Java_ba_sa(env, fresh, 0, 1000); }), no_memory);
  EXPECT_EQ(raised([&] { Java_ba_sa(env, fresh, 0, -1); }), bad_argument + "size: -1 is negative");
  EXPECT_EQ(raised([&] { new_mask({1, 2, 3}, {1, 2}); }), out_of_bounds + "lengths: length 2, 3 needed");
  expect_raised(null_pointer,
                {[&] { Java_wa_l(env, java.new_object("wa"), 0, nullptr, 0, 0, nullptr, nullptr); },
                 [&] { Java_ja_n(env, peer, nullptr); }, [&] { Java_ja_PA(env, peer, java.new_object("za")); },
                 [&] { Java_ja_ma(env, java.new_object("ja")); }, [&] { Java_a_R(env, java.new_object("a"), 0); },
                 [&] { Java_a_JA(env, java.new_object("a"), 0); }, [&] { Java_a_UA(env, java.new_object("a"), 0); }});
  EXPECT_EQ(kit().pool, &pool());

  // Before there is a toolkit.
  toolkit* const instance = std::exchange(toolkit::m_pInstance, nullptr);
  expect_raised(null_pointer, {[&] { Java_ba_sa(env, fresh, 0, 1000); }, [&] { Java_a_ha(env, fresh, 0, 0, 0, 0, 0); },
                               [&] { Java_ja_da(env, peer); }});
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
