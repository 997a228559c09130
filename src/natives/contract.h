// Checks of what a caller promises, made once at the boundary before anything has changed. They cost a call, never a
// pixel. VELMARK5_CHECKS=0 leaves them out; a call that keeps its promises behaves the same with and without them.
#pragma once

#include "util/exception.h"

namespace contract {

inline constexpr bool checked = VELMARK5_CHECKS != 0;

[[noreturn]] void fail_null();
// The texts name the argument, its value and the limit.
[[noreturn]] __attribute__((format(printf, 1, 2))) void fail_argument(const char* format, ...);
[[noreturn]] __attribute__((format(printf, 1, 2))) void fail_array(const char* format, ...);
[[noreturn]] __attribute__((format(printf, 1, 2))) void fail_state(const char* format, ...);

// The object behind the pointer; null raises NullPointerException.
template <class T>
T& object(T* pointer) {
  if (checked && pointer == nullptr) fail_null();
  return *pointer;
}

// A required Java reference; null raises NullPointerException.
inline void not_null(const void* reference) {
  if (checked && reference == nullptr) fail_null();
}

inline void not_negative(const char* name, int value) {
  if (checked && value < 0) fail_argument("%s: %d is negative", name, value);
}

inline void at_most(const char* name, int value, int most) {
  if (checked && value > most) fail_argument("%s: %d is more than %d", name, value, most);
}

inline void at_least(const char* name, int value, int least) {
  if (checked && value < least) fail_argument("%s: %d is less than %d", name, value, least);
}

// An array of at least `needed` elements; a shorter one raises ArrayIndexOutOfBoundsException.
inline void array_holds(const char* name, int length, long long needed) {
  if (checked && length < needed) fail_array("%s: length %d, %lld needed", name, length, needed);
}

// An array of exactly `needed` elements.
inline void array_is(const char* name, int length, int needed) {
  if (checked && length != needed) fail_array("%s: length %d, %d needed", name, length, needed);
}

// A rectangle that lies inside width by height; one without area needs no room. Coordinates are pixels.
void rectangle_inside(const char* name, int x, int y, int w, int h, int width, int height);

// The same for the rows that a copy of w by h elements reads or writes in an array, `stride` elements apart and
// starting at `offset`.
void rows_inside(const char* name, int length, int offset, int stride, int w, int h);

// The size of a new image or depth image: neither is negative, and the bytes can be counted in an int.
void image_size(int width, int height);

}  // namespace contract
