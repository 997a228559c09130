// What natives do when objects go in an order that no client should choose: nothing is read or written that is gone.
// The address sanitizer sees what these tests cannot.
#include "raster/Sprite.h"
#include "support/toolkit_fixture.h"

namespace {

class lifetimes : public toolkit_fixture {
 public:
  jobject new_sprite(int w, int h) {
    const jobject sprite = java.new_object("fa");
    Java_fa_UA(env, sprite, 0, w, h);
    EXPECT_EQ(java.take_exception(), "");
    return sprite;
  }
  jobject new_depth(int w, int h) {
    const jobject image = java.new_object("oa");
    Java_oa_g(env, image, w, h);
    EXPECT_EQ(java.take_exception(), "");
    return image;
  }
};

// Spans store whole groups of four, also where an image's pixels are no multiple of four.
TEST_F(lifetimes, a_triangle_over_the_last_pixel_stays_inside_the_image) {
  const jobject resource = java.new_object("a");
  Java_a_ha(env, resource, 0, 0, 0, 0, 0);
  for (int side = 1; side < 12; ++side) {
    const jobject sprite = new_sprite(side, side), image = new_depth(side, side);
    Java_ja_d(env, peer, java.nativeid(sprite), java.nativeid(image));
    Java_ja_GA(env, peer, 0, 1);
    Java_ja_ba(env, peer, 3, 0);
    Java_a_ra(env, resource, java.nativeid(resource), -30, -30, -30, 100, 100, -30, -1, -1, -1);
    EXPECT_EQ(native<Sprite_c>(sprite)->pixels[side * side - 1], 0xFFFFFFFFu) << side;
    Java_fa_M(env, sprite, java.nativeid(sprite));
    Java_oa_za(env, image, java.nativeid(image));
  }
  Java_a_R(env, resource, java.nativeid(resource));
}

TEST_F(lifetimes, a_target_that_is_destroyed_takes_no_more_pixels) {
  const jobject sprite = new_sprite(64, 64), image = new_depth(64, 64);
  Java_ja_d(env, peer, java.nativeid(sprite), java.nativeid(image));
  Java_fa_M(env, sprite, java.nativeid(sprite));
  Java_oa_za(env, image, java.nativeid(image));
  Java_ja_B(env, peer, 0, 0, 64, 64, -1, 0);
  Java_ja_ba(env, peer, 3, -1);
  EXPECT_EQ(Rasterizer_n::m_pColourBuffer, nullptr);
  EXPECT_EQ(Rasterizer_n::m_pDepthBuffer, nullptr);
}

TEST_F(lifetimes, natives_refuse_a_toolkit_that_is_gone) {
  const jobject sprite = new_sprite(8, 8);
  Java_ja_d(env, peer, java.nativeid(sprite), 0);
  Java_ja_ma(env, peer);
  Java_ja_B(env, peer, 0, 0, 8, 8, -1, 0);
  EXPECT_EQ(java.take_exception(), "java.lang.NullPointerException: ");
  Java_fa_M(env, sprite, java.nativeid(sprite));
  EXPECT_EQ(java.take_exception(), "");
  Java_ja_q(env, peer, nullptr, 0);  // for the fixture to end
}

TEST_F(lifetimes, a_pool_is_not_given_up_by_the_collection_that_it_asks_for) {
  std::string refused;
  java.garbagecollect = [&] {
    Java_ba_ha(env, pool_peer);
    refused += java.take_exception();
    Java_ba_ma(env, pool_peer);
    refused += java.take_exception();
  };
  const jobject mask = java.new_object("wa"), other = java.new_object("wa");
  const jintArray rows = java.new_ints(std::vector<jint>(pool_size / 12));
  Java_wa_l(env, mask, 0, pool_peer, 1, 1, rows, rows);
  Java_wa_l(env, other, 0, pool_peer, 1, 1, rows, rows);
  const std::string once = "java.lang.IllegalStateException: pool: it is in the middle of an allocation";
  EXPECT_EQ(refused.substr(0, 2 * once.size()), once + once);
  EXPECT_EQ(java.take_exception(), "");
  Java_wa_ma(env, mask);
  Java_wa_ma(env, other);
}

}  // namespace
