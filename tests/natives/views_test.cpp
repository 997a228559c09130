// Views of Java arrays.
#include <gtest/gtest.h>

#include <algorithm>
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
};

// Writes through a view of each kind; returns whether Java sees it before and after the view goes.
template <class View, class Array>
std::pair<bool, bool> seen(fake_java& java, Array array, const auto& contents) {
  const auto before = (java.*contents)(array);
  bool early = false;
  {
    View view(java, array);
    ++view.elements[1];
    early = (java.*contents)(array) != before;
  }
  return {early, (java.*contents)(array) != before};
}

TEST_F(views, writes_reach_java_at_release_and_only_from_read_write_views) {
  const std::pair kept(false, true);
  const std::pair thrown_away(false, false);
  EXPECT_EQ(seen<copied_jintArray>(java, java.new_ints({1, 2}), &fake_java::ints), kept);
  EXPECT_EQ(seen<copied_jintArrayRO>(java, java.new_ints({1, 2}), &fake_java::ints), thrown_away);
  EXPECT_EQ(seen<copied_jshortArray>(java, java.new_shorts({1, 2}), &fake_java::shorts), kept);
  EXPECT_EQ(seen<copied_jshortArrayRO>(java, java.new_shorts({1, 2}), &fake_java::shorts), thrown_away);
  EXPECT_EQ(seen<copied_jbyteArray>(java, java.new_bytes({1, 2}), &fake_java::bytes), kept);
  EXPECT_EQ(seen<copied_jbyteArrayRO>(java, java.new_bytes({1, 2}), &fake_java::bytes), thrown_away);
  EXPECT_EQ(seen<copied_jbooleanArray>(java, java.new_booleans({1, 0}), &fake_java::booleans), kept);
  EXPECT_EQ(seen<copied_jbooleanArrayRO>(java, java.new_booleans({1, 0}), &fake_java::booleans), thrown_away);
  EXPECT_EQ(seen<copied_jfloatArray>(java, java.new_floats({1, 2}), &fake_java::floats), kept);
  EXPECT_EQ(seen<copied_jfloatArrayRO>(java, java.new_floats({1, 2}), &fake_java::floats), thrown_away);
  EXPECT_EQ(java.calls("GetPrimitiveArrayCritical"), 0);

  EXPECT_EQ(seen<pinned_jintArray>(java, java.new_ints({1, 2}), &fake_java::ints), kept);
  EXPECT_EQ(seen<pinned_jintArrayRO>(java, java.new_ints({1, 2}), &fake_java::ints), thrown_away);
  EXPECT_EQ(seen<pinned_jfloatArray>(java, java.new_floats({1, 2}), &fake_java::floats), kept);
  EXPECT_EQ(seen<pinned_jfloatArrayRO>(java, java.new_floats({1, 2}), &fake_java::floats), thrown_away);
  EXPECT_EQ(seen<pinned_jshortArrayRO>(java, java.new_shorts({1, 2}), &fake_java::shorts), thrown_away);
  EXPECT_EQ(seen<pinned_jbooleanArray>(java, java.new_booleans({1, 0}), &fake_java::booleans), kept);
  EXPECT_EQ(java.calls("GetPrimitiveArrayCritical"), 6);
}

TEST_F(views, a_null_array_is_empty_and_makes_no_call) {
  {
    const copied_jintArray copied(env, nullptr);
    const pinned_jfloatArrayRO pinned(env, nullptr);
    EXPECT_EQ(copied.elements, nullptr);
    EXPECT_EQ(copied.length(), 0);
    EXPECT_EQ(pinned.elements, nullptr);
    EXPECT_EQ(pinned.length, 0);
    EXPECT_EQ(pin_count.load(), 0);
    memorymanager pool(100);
    const auto none = copied_jintArrayRO(env, nullptr).toSharedarray<int>(&pool);
    EXPECT_EQ(none.block, nullptr);
    EXPECT_EQ(none.manager, nullptr);
  }
  EXPECT_TRUE(java.log().empty());
}

TEST_F(views, a_failure_with_pinned_arrays_leaves_none_pinned_and_is_raised_after) {
  const jintArray a = java.new_ints({1, 2, 3});
  const jfloatArray b = java.new_floats({4});
  natives::frame(env, [&] {
    const jint a_length = array_length(env, a);
    const jint b_length = array_length(env, b);
    const pinned_jintArray first(env, a, a_length);
    const pinned_jfloatArrayRO second(env, b, b_length);
    EXPECT_EQ(first.length, 3);
    EXPECT_EQ(pin_count.load(), 2);
    first.elements[2] = 9;
    throw new IllegalArgumentException("in the middle");
  });
  EXPECT_EQ(pin_count.load(), 0);
  EXPECT_EQ(java.take_exception(), "java.lang.IllegalArgumentException: in the middle");
  EXPECT_EQ(java.ints(a), (std::vector<jint>{1, 2, 9}));
  const std::vector<std::string> expected = {"GetArrayLength",
                                             "GetArrayLength",
                                             "GetPrimitiveArrayCritical",
                                             "GetPrimitiveArrayCritical",
                                             "ReleasePrimitiveArrayCritical",
                                             "ReleasePrimitiveArrayCritical",
                                             "ExceptionCheck",
                                             "FindClass",
                                             "ThrowNew"};
  EXPECT_EQ(java.log(), expected);
}

TEST_F(views, a_runtime_without_memory_keeps_its_own_error) {
  const jintArray a = java.new_ints({1});
  const jintArray b = java.new_ints({2});
  for (const int failing : {1, 2}) {
    java.fail_array_access(failing);
    natives::frame(env, [&] {
      const copied_jintArrayRO first(env, a);
      const copied_jintArrayRO second(env, b);
    });
    EXPECT_EQ(java.take_exception(), "java.lang.OutOfMemoryError");
    java.fail_array_access(failing);
    natives::frame(env, [&] {
      const pinned_jintArray first(env, a, 1);
      const pinned_jintArrayRO second(env, b, 1);
    });
    EXPECT_EQ(java.take_exception(), "java.lang.OutOfMemoryError");
    EXPECT_EQ(pin_count.load(), 0);
    EXPECT_EQ(java.arrays_out(), 0);
  }
}

TEST_F(views, copies_into_a_pool) {
  memorymanager pool(1 << 16);
  for (const int n : {0, 1, 3, 4, 9, 10, 11, 1000}) {
    std::vector<jint> values(static_cast<std::size_t>(n));
    for (int i = 0; i < n; ++i) values[static_cast<std::size_t>(i)] = i * 7 - 3;
    sharedarray<int> array;
    {
      const copied_jintArrayRO view(env, java.new_ints(values));
      array = view.toSharedarray<int>(&pool);
    }
    // An empty array that is not null gives a live block of no bytes.
    ASSERT_NE(array.block, nullptr);
    EXPECT_EQ(array.block->length, n * 4);
    EXPECT_EQ(array.manager, &pool);
    EXPECT_EQ(array.count(), n);
    EXPECT_TRUE(std::equal(values.begin(), values.end(), array.data()));
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
    for (const jint element : java.ints(array)) EXPECT_EQ(element, 6);
  };
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) threads.emplace_back(work);
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(pin_count.load(), 0);
}

}  // namespace
