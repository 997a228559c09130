// How failures reach Java, and how peers are bound to their objects.
#include <gtest/gtest.h>

#include <new>
#include <string>

#include "natives/native.h"
#include "support/toolkit_fixture.h"
#include "util/exception.h"

namespace {

class failures : public testing::Test {
 public:
  fake_java java;
  void TearDown() override { java.verify(); }

  // What Java sees of a native whose body throws this.
  template <class Thrown>
  std::string raised(Thrown failure) {
    natives::frame(java, [&]() -> void { throw failure; });
    return java.take_exception();
  }
  // What it sees of a body that checks its arguments.
  std::string refused(auto&& body) {
    natives::frame(java, body);
    return java.take_exception();
  }
};

TEST_F(failures, each_class_becomes_its_java_exception_with_its_text) {
  EXPECT_EQ(raised(new Exception("text")), "java.lang.Exception: text");
  EXPECT_EQ(raised(new Exception), "java.lang.Exception: ");
  EXPECT_EQ(raised(new RuntimeException("r")), "java.lang.RuntimeException: r");
  EXPECT_EQ(raised(new ClassCastException("c")), "java.lang.ClassCastException: c");
  EXPECT_EQ(raised(new OutOfMemory("native(MPA)")), "java.lang.OutOfMemoryError: native(MPA)");
  EXPECT_EQ(raised(new IllegalArgumentException("i")), "java.lang.IllegalArgumentException: i");
  EXPECT_EQ(raised(new IllegalStateException("s")), "java.lang.IllegalStateException: s");
  EXPECT_EQ(raised(new NumberFormatException("n")), "java.lang.NumberFormatException: n");
  EXPECT_EQ(raised(new NullPointerException("unused")), null_pointer) << "an empty message, not null";
  EXPECT_EQ(raised(new ArrayIndexOutOfBoundsException(-7, 5)), out_of_bounds + "Array index out of range: -7")
      << "only the index reaches Java, whose class makes the text";
  testing::internal::CaptureStdout();
  EXPECT_EQ(raised(new NativeError("broken")), "tolvi3.graphics2.NativeError: broken");
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "Throwing: broken\n");

  const std::string anything_else = "java.lang.RuntimeException: System exception occured";
  EXPECT_EQ(raised(std::bad_alloc()), anything_else);
  EXPECT_EQ(raised(7), anything_else);
  EXPECT_EQ(natives::frame(java, [&]() -> jint { throw std::string("text"); }), 0);
  EXPECT_EQ(java.take_exception(), anything_else);
}

TEST_F(failures, the_owner_of_a_failure_copies_its_text_and_frees_it) {
  char text[] = "short-lived";
  static int destroyed = 0;
  struct counted : Exception {
    using Exception::Exception;
    ~counted() override { ++destroyed; }
  };
  auto* const failure = new counted(text);
  text[0] = '-';
  EXPECT_EQ(raised(failure), "java.lang.Exception: short-lived");
  EXPECT_EQ(destroyed, 1);
}

TEST_F(failures, a_callbacks_exception_is_not_replaced) {
  natives::frame(java, [&]() -> void {
    java.raise("java/lang/IllegalStateException", "the client's");
    throw new OutOfMemory("native(MPR: 1)");
  });
  EXPECT_EQ(java.take_exception(), "java.lang.IllegalStateException: the client's");
}

TEST_F(failures, contract_checks_name_the_argument_its_value_and_the_limit) {
  if (!contract::checked) GTEST_SKIP();
  EXPECT_EQ(refused([] { contract::not_negative("size", -3); }), bad_argument + "size: -3 is negative");
  EXPECT_EQ(refused([] { contract::not_negative("size", 0); }), "");
  EXPECT_EQ(refused([] { contract::array_holds("out", 3, 4); }), out_of_bounds + "out: length 3, 4 needed");
  EXPECT_EQ(refused([] { contract::not_null(nullptr); }), null_pointer);

  const auto inside = [&](int x, int y, int w, int h) {
    return refused([&] { contract::rectangle_inside("area", x, y, w, h, 10, 8); }).empty();
  };
  EXPECT_TRUE(inside(0, 0, 10, 8) && inside(9, 7, 1, 1) && inside(-5, 99, 0, 4));
  EXPECT_FALSE(inside(-1, 0, 2, 2) || inside(0, -1, 2, 2) || inside(9, 0, 2, 1) || inside(0, 7, 1, 2));
  // Sums that would wrap.
  EXPECT_FALSE(inside(5, 5, INT32_MAX, 1) || inside(INT32_MAX, 5, INT32_MAX, 1) || inside(INT32_MIN, 0, INT32_MAX, 1));

  const auto rows = [&](int length, int offset, int stride, int w, int h) {
    return refused([&] { contract::rows_inside("in", length, offset, stride, w, h); }).empty();
  };
  EXPECT_TRUE(rows(20, 0, 5, 5, 4) && rows(17, 0, 5, 2, 4) && rows(12, 10, -5, 2, 3) && rows(0, 9, 9, 0, 3));
  EXPECT_FALSE(rows(19, 0, 5, 5, 4) || rows(20, 1, 5, 5, 4) || rows(20, -1, 5, 1, 1) || rows(12, 9, -5, 2, 3));
  EXPECT_FALSE(rows(20, 4, INT32_MAX, 1, 4) || rows(20, INT32_MAX, INT32_MAX, INT32_MAX, INT32_MAX));
}

TEST_F(failures, a_peer_is_looked_up_once_and_reads_back_every_address) {
  // The field ids are process-wide: start as a fresh process does.
  objconvert::matrix_nativeid = objconvert::shadow_nativeid = nullptr;
  const jobject first = java.new_object("aa");
  EXPECT_EQ(objconvert::get_shadow(java, first), nullptr) << "nothing was ever bound";
  EXPECT_EQ(java.calls("GetFieldID"), 0);

  for (const std::uintptr_t address : {~std::uintptr_t{15}, std::uintptr_t{0x80000010u}, std::uintptr_t{0}}) {
    auto* const object = reinterpret_cast<shadow*>(address);
    objconvert::set_shadow(java, first, object);
    EXPECT_EQ(objconvert::get_shadow(java, first), object);
    EXPECT_EQ(java.nativeid(first), static_cast<jlong>(static_cast<std::intptr_t>(address)));
  }
  objconvert::set_shadow(java, java.new_object("aa"), nullptr);
  EXPECT_EQ(java.calls("GetFieldID"), 1);
  EXPECT_EQ(java.calls("NewWeakGlobalRef"), 1) << "the class is kept loaded";
  objconvert::set_matrix(java, java.new_object("m4"), nullptr);
  EXPECT_EQ(java.calls("GetFieldID"), 2) << "each class of peers has its own";
  EXPECT_EQ(refused([&] { objconvert::get_shadow(java, nullptr); }), null_pointer);
#if defined(__i386__)
  java.set_nativeid(first, 0x12345678BFFF0010);
  EXPECT_EQ(objconvert::get_shadow(java, first), reinterpret_cast<shadow*>(0xBFFF0010u)) << "the low half alone counts";
#endif
  objconvert::matrix_nativeid = objconvert::shadow_nativeid = nullptr;
}

}  // namespace
