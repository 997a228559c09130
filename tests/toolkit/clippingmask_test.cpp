// Span masks: what they hold, and clearing through them.
#include "toolkit/clippingmask.h"

#include <gtest/gtest.h>

#include "support/frame_record.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"

namespace {

class clipping_masks : public toolkit_fixture {
 public:
  jobject new_mask(const std::vector<jint>& starts, const std::vector<jint>& lengths) {
    const jobject mask = java.new_object("wa");
    Java_wa_l(env, mask, -1, pool_peer, 17, -4, java.new_ints(starts), java.new_ints(lengths));
    return mask;
  }
};

TEST_F(clipping_masks, copy_both_arrays_into_the_pool) {
  const jintArray starts = java.new_ints({5, -6, 7});
  const jobject peer_of_mask = java.new_object("wa");
  Java_wa_l(env, peer_of_mask, -1, pool_peer, 17, -4, starts, java.new_ints({1, 0, -2, 9}));
  const auto& mask = *native<clippingmask>(peer_of_mask);
  EXPECT_TRUE(mask.width == 17 && mask.height == -4);
  EXPECT_EQ(mask.rows(), 3);
  EXPECT_TRUE(mask.starts[0] == 5 && mask.starts[1] == -6 && mask.starts[2] == 7);
  EXPECT_TRUE(mask.lengths.count() == 4 && mask.lengths[2] == -2 && mask.lengths[3] == 9);
  EXPECT_TRUE(mask.starts.manager == &pool() && mask.lengths.manager == &pool());
  EXPECT_EQ(java.ints(starts), (std::vector<jint>{5, -6, 7}));
  Java_wa_ma(env, peer_of_mask);

  // Null arrays: no rows, which draw nothing.
  Java_wa_l(env, peer_of_mask, 0, pool_peer, 1, 1, nullptr, nullptr);
  EXPECT_EQ(native<clippingmask>(peer_of_mask)->rows(), 0);
  make_target(8, 8);
  Java_ja_DA(env, peer, -1, peer_of_mask, 0, 0);
  EXPECT_EQ(colour.copy(), std::vector<unsigned int>(64));
  Java_wa_ma(env, peer_of_mask);
}

TEST_F(clipping_masks, clear_their_spans_within_the_clip_rectangle) {
  test_random random(24);
  for (int round = 0; round < 300; ++round) {
    const int width = random.between(1, 50);
    const int height = random.between(1, 30);
    make_target(width, height);
    const auto edge = [&](int limit) { return random.between(-3, limit + 3); };
    Java_ja_r(env, peer, edge(width / 2), edge(height / 2), edge(width), edge(height));
    std::vector<jint> starts(static_cast<std::size_t>(random.between(0, 35)));
    std::vector<jint> lengths(starts.size());
    for (jint& start : starts) start = random.between(-20, 40);
    for (jint& length : lengths) length = random.one_in(20) ? INT32_MAX : random.between(-5, 40);
    const int x = random.between(-30, 40);
    const int y = random.between(-30, 30);
    const auto word = static_cast<jint>(random.word());
    const jobject mask = new_mask(starts, lengths);
    Java_ja_DA(env, peer, word, mask, x, y);

    std::vector<unsigned int> expected(colour.elements());
    for (int py = kit().clip_y0; py < kit().clip_y1; ++py) {
      for (int px = kit().clip_x0; px < kit().clip_x1; ++px) {
        const int row = py - y;
        if (row < 0 || row >= static_cast<int>(starts.size())) continue;
        const long long column = px - (static_cast<long long>(x) + starts[static_cast<std::size_t>(row)]);
        if (column < 0 || column >= lengths[static_cast<std::size_t>(row)]) continue;
        expected[static_cast<std::size_t>(py * width + px)] = static_cast<unsigned int>(word);
      }
    }
    ASSERT_EQ(colour.copy(), expected) << "round " << round;
    if (round % 100 == 7) {
      frame_record::add(("mask_clear_" + std::to_string(round)).c_str(), colour.data(), colour.elements());
    }
    Java_wa_ma(env, mask);
  }
}

TEST_F(clipping_masks, clear_nothing_without_a_target_and_survive_far_offsets) {
  make_target(8, 8);
  const jobject mask = new_mask({0, 0}, {8, 8});
  for (const jint far : {INT32_MAX, INT32_MIN, INT32_MAX - 1}) {
    Java_ja_DA(env, peer, -1, mask, far, 0);
    Java_ja_DA(env, peer, -1, mask, 0, far);
  }
  EXPECT_EQ(colour.copy(), std::vector<unsigned int>(64));
  make_target(8, 8, false, true);
  Java_ja_DA(env, peer, -1, mask, 0, 0);
  Java_wa_ma(env, mask);
  Java_ja_DA(env, peer, -1, nullptr, 0, 0);
  EXPECT_EQ(java.take_exception(), "java.lang.NullPointerException: ");
}

}  // namespace
