#include "natives/contract.h"

#include <jni.h>

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <limits>
#include <string>

namespace contract {

namespace {

// Java's own class with a text, which the library's ArrayIndexOutOfBoundsException cannot carry.
class ArrayTooShort : public Exception {
 public:
  using Exception::Exception;
  void throwJavaException(JNIEnv* env) override {
    env->ThrowNew(env->FindClass("java/lang/ArrayIndexOutOfBoundsException"), message);
  }
};

std::string format_text(const char* format, std::va_list arguments) {
  char text[200];
  std::vsnprintf(text, sizeof text, format, arguments);
  return text;
}

}  // namespace

void fail_null() { throw new NullPointerException; }

void fail_argument(const char* format, ...) {
  std::va_list arguments;
  va_start(arguments, format);
  const std::string text = format_text(format, arguments);
  va_end(arguments);
  throw new IllegalArgumentException(text.c_str());
}

void fail_array(const char* format, ...) {
  std::va_list arguments;
  va_start(arguments, format);
  const std::string text = format_text(format, arguments);
  va_end(arguments);
  throw new ArrayTooShort(text.c_str());
}

void fail_state(const char* format, ...) {
  std::va_list arguments;
  va_start(arguments, format);
  const std::string text = format_text(format, arguments);
  va_end(arguments);
  throw new IllegalStateException(text.c_str());
}

void rectangle_inside(const char* name, int x, int y, int w, int h, int width, int height) {
  if (!checked || w <= 0 || h <= 0) return;
  const bool inside = x >= 0 && y >= 0 && w <= width - x && h <= height - y && x <= width && y <= height;
  if (!inside) fail_argument("%s: %dx%d at (%d, %d) is not inside %dx%d", name, w, h, x, y, width, height);
}

void rows_inside(const char* name, int length, int offset, int stride, int w, int h) {
  if (!checked || w <= 0 || h <= 0) return;
  const long long first_row = offset;
  const long long last_row = offset + static_cast<long long>(h - 1) * stride;
  const long long lowest = std::min(first_row, last_row);
  const long long highest = std::max(first_row, last_row) + w;
  if (lowest < 0 || highest > length) {
    fail_array("%s: length %d, but offset %d, stride %d and %dx%d reach from %lld to %lld", name, length, offset,
               stride, w, h, lowest, highest);
  }
}

constexpr int longest_side = 1 << 20;

void image_size(int width, int height) {
  not_negative("width", width);
  not_negative("height", height);
  // An image without area has no pixels to limit its sides.
  at_most("width", width, longest_side);
  at_most("height", height, longest_side);
  constexpr long long most = std::numeric_limits<int>::max() / 4;
  if (checked && static_cast<long long>(width) * height > most) {
    fail_argument("size: %dx%d is more than %lld pixels", width, height, most);
  }
}

}  // namespace contract
