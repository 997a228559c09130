// A toolkit and a pool in a fake Java runtime, and a target to draw into.
#pragma once

#include <client_natives.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <functional>
#include <initializer_list>
#include <string>
#include <vector>

#include "natives/jniarray.h"
#include "raster/Rasterizer.h"
#include "support/allocation_failure.h"
#include "support/recording_jni.h"
#include "toolkit/toolkit.h"
#include "util/memorymanager/memorymanager.h"

// What the exceptions of refused calls read like; texts of the classes' own may follow.
inline const std::string null_pointer = "java.lang.NullPointerException: ";
inline const std::string bad_argument = "java.lang.IllegalArgumentException: ";
inline const std::string out_of_bounds = "java.lang.ArrayIndexOutOfBoundsException: ";
inline const std::string no_memory = "java.lang.RuntimeException: Cannot allocate memory";

// An image of 32-bit elements, 16-byte aligned, between guard words.
template <class T>
class guarded_image {
 public:
  guarded_image() = default;
  guarded_image(int columns, int rows) : width(columns), height(rows) {
    static_assert(sizeof(T) == 4);
    words.assign(elements() + 2 * guard + 4, guard_word);
    const auto misaligned = (reinterpret_cast<std::uintptr_t>(words.data()) & 15) / 4;
    start = guard + (4 - misaligned) % 4;
    fill(T{});
  }
  guarded_image(guarded_image&&) = default;
  guarded_image& operator=(guarded_image&&) = default;

  T* data() { return reinterpret_cast<T*>(words.data() + start); }
  T& at(int x, int y) { return data()[y * width + x]; }
  std::size_t elements() const { return static_cast<std::size_t>(width) * static_cast<std::size_t>(height); }
  void fill(T value) { std::fill_n(data(), elements(), value); }
  std::vector<T> copy() { return {data(), data() + elements()}; }

  // True while nobody wrote outside the image.
  bool intact() const {
    for (std::size_t i = 0; i < words.size(); ++i) {
      if ((i < start || i >= start + elements()) && words[i] != guard_word) return false;
    }
    return true;
  }

  int width = 0;
  int height = 0;

 private:
  static constexpr std::size_t guard = 256;
  static constexpr std::uint32_t guard_word = 0xDEC0ADDEu;
  std::vector<std::uint32_t> words;
  std::size_t start = 0;
};

class toolkit_fixture : public testing::Test {
 public:
  static constexpr jint pool_size = 1 << 20;

  fake_java java;
  JNIEnv* const env = java.env();
  const jobject peer = java.new_object("ja");
  const jobject pool_peer = java.new_object("ba");
  guarded_image<unsigned int> colour;
  guarded_image<float> depth;

  void SetUp() override {
    Java_ja_q(env, peer, nullptr, 0);
    ASSERT_EQ(java.take_exception(), "");
    Java_ba_sa(env, pool_peer, 0, pool_size);
    ASSERT_EQ(java.take_exception(), "");
    Java_ja_n(env, peer, pool_peer);
  }

  void TearDown() override {
    allocation_failure::none();
    EXPECT_TRUE(colour.intact()) << "a write outside the colour target";
    EXPECT_TRUE(depth.intact()) << "a write outside the depth target";
    EXPECT_EQ(java.take_exception(), "");
    Java_ba_ma(env, pool_peer);
    Java_ja_ma(env, peer);
    toolkit::m_pInstance = nullptr;
    Rasterizer_n::m_pColourBuffer = nullptr;
    Rasterizer_n::m_pDepthBuffer = nullptr;
    java.verify();
  }

  static toolkit& kit() { return *toolkit::m_pInstance; }
  memorymanager& pool() const { return *native<memorymanager>(pool_peer); }

  template <class T>
  T* native(jobject object) const {
    return reinterpret_cast<T*>(static_cast<std::intptr_t>(java.nativeid(object)));
  }

  // What Java sees of a call: its exception, or "".
  std::string raised(const std::function<void()>& call) {
    call();
    return java.take_exception();
  }
  // Each of the calls raises an exception that starts like this.
  void expect_raised(const std::string& exception, std::initializer_list<std::function<void()>> calls) {
    int number = 0;
    for (const auto& call : calls) {
      const std::string text = raised(call);
      EXPECT_EQ(text.substr(0, exception.size()), exception) << text << " of call " << number;
      ++number;
    }
  }

  // A span mask in the pool, 40 by 30 as far as sprites are concerned.
  jobject new_mask(const std::vector<jint>& starts, const std::vector<jint>& lengths) {
    const jobject mask = java.new_object("wa");
    Java_wa_l(env, mask, 0, pool_peer, 40, 30, java.new_ints(starts), java.new_ints(lengths));
    return mask;
  }

  // A target of this size in `colour` and `depth`, both zero, with clip rectangle and viewport over all of it.
  void make_target(int width, int height, bool with_colour = true, bool with_depth = true) {
    EXPECT_TRUE(colour.intact() && depth.intact());
    colour = with_colour ? guarded_image<unsigned int>(width, height) : guarded_image<unsigned int>();
    depth = with_depth ? guarded_image<float>(width, height) : guarded_image<float>();
    kit().width = width;
    kit().height = height;
    kit().colourbuffer = with_colour ? colour.data() : nullptr;
    kit().depthbuffer = with_depth ? depth.data() : nullptr;
    kit().resetclipping();
    kit().setup_backbuffer(kit().colourbuffer, kit().depthbuffer, 0, 0, width);
  }
};
