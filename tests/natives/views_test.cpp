// Views of Java arrays.
#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "natives/native.h"
#include "support/recording_jni.h"

namespace {

class views : public testing::Test {
 public:
  fake_java java;
  JNIEnv* const env = java.env();
  void TearDown() override { java.verify(); }

  // Writes through views; Java sees it when the view goes, not before, or never.
  template <class... Views>
  void expect_writes_are_kept(bool kept) {
    const auto write = [&]<class View>(View*) {
      using element = std::remove_pointer_t<decltype(View::elements)>;
      const std::vector<element> before{1, 0};
      const auto array = java.new_array<decltype(View::array)>(before);
      {
        View view(env, array);
        view.elements[1] = 1;
        EXPECT_EQ(java.contents<element>(array), before);
      }
      EXPECT_EQ(java.contents<element>(array)[1], element(kept)) << typeid(View).name();
    };
    (write(static_cast<Views*>(nullptr)), ...);
  }
};

TEST_F(views, writes_reach_java_at_release_and_only_from_read_write_views) {
  expect_writes_are_kept<copied_jintArray, copied_jshortArray, copied_jbyteArray, copied_jbooleanArray,
                         copied_jfloatArray>(true);
  expect_writes_are_kept<copied_jintArrayRO, copied_jshortArrayRO, copied_jbyteArrayRO, copied_jbooleanArrayRO,
                         copied_jfloatArrayRO>(false);
  EXPECT_EQ(java.calls("GetPrimitiveArrayCritical"), 0);
  expect_writes_are_kept<pinned_jintArray, pinned_jfloatArray, pinned_jbooleanArray>(true);
  expect_writes_are_kept<pinned_jintArrayRO, pinned_jfloatArrayRO, pinned_jshortArrayRO>(false);
  EXPECT_EQ(java.calls("GetPrimitiveArrayCritical"), 6);
}

TEST_F(views, a_null_array_is_empty_and_makes_no_call) {
  const copied_jintArrayRO copied(env, nullptr);
  const pinned_jfloatArrayRO pinned(env, nullptr);
  EXPECT_TRUE(copied.elements == nullptr && copied.length() == 0);
  EXPECT_TRUE(pinned.elements == nullptr && pinned.length == 0 && pin_count == 0);
  memorymanager pool(100);
  EXPECT_EQ(copied.toSharedarray<int>(&pool).block, nullptr);
  EXPECT_TRUE(java.log().empty());
}

// The watching runtime takes offence at a call, throwing included, while an array is pinned.
TEST_F(views, a_failure_is_raised_when_no_array_is_held_any_more) {
  const jintArray a = java.new_ints({1, 2, 3});
  const jfloatArray b = java.new_floats({4});
  natives::frame(env, [&] {
    const jint a_length = array_length(env, a), b_length = array_length(env, b);
    const pinned_jintArray first(env, a, a_length);
    const pinned_jfloatArrayRO second(env, b, b_length);
    EXPECT_TRUE(first.length == 3 && pin_count == 2);
    first.elements[2] = 9;
    throw new IllegalArgumentException("in the middle");
  });
  EXPECT_EQ(java.take_exception(), "java.lang.IllegalArgumentException: in the middle");
  EXPECT_EQ(java.ints(a), (std::vector<jint>{1, 2, 9}));

  // The runtime's own failure to hand out the first or the second array is what Java sees of it.
  for (const int failing : {1, 2}) {
    java.fail_array_access(failing);
    natives::frame(env, [&] {
      const copied_jintArray first(env, a);
      const copied_jintArrayRO second(env, a);
    });
    EXPECT_EQ(java.take_exception(), "java.lang.OutOfMemoryError");
    java.fail_array_access(failing);
    natives::frame(env, [&] {
      const pinned_jintArray first(env, a, 3);
      const pinned_jintArrayRO second(env, a, 3);
    });
    EXPECT_EQ(java.take_exception(), "java.lang.OutOfMemoryError");
    EXPECT_TRUE(pin_count == 0 && java.arrays_out() == 0);
  }
}

TEST_F(views, copies_into_a_pool) {
  memorymanager pool(1 << 16);
  for (const std::size_t n : {0u, 1u, 9u, 1000u}) {
    std::vector<jint> values(n);
    for (std::size_t i = 0; i < n; ++i) values[i] = static_cast<jint>(i * 7) - 3;
    const auto array = copied_jintArrayRO(env, java.new_ints(values)).toSharedarray<int>(&pool);
    ASSERT_NE(array.block, nullptr) << "an empty array that is not null gives a live block of no bytes";
    EXPECT_EQ(array.manager, &pool);
    EXPECT_EQ(std::vector<jint>(array.data(), array.data() + array.count()), values);
  }
}

TEST_F(views, each_thread_uses_its_own_environment_and_the_count_of_pins_is_right) {
  const auto work = [&] {
    const jintArray array = java.new_ints(std::vector<jint>(50));
    for (int i = 0; i < 300; ++i) {
      natives::frame(java.env(), [&] {
        const pinned_jintArray view(java.env(), array);
        ++view.elements[i % 50];
        if (i % 3 == 0) throw new Exception("now and then");
      });
      EXPECT_EQ(java.take_exception(), i % 3 == 0 ? "java.lang.Exception: now and then" : "");
    }
    EXPECT_EQ(java.ints(array), std::vector<jint>(50, 6));
  };
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) threads.emplace_back(work);
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(pin_count.load(), 0);
}

}  // namespace
