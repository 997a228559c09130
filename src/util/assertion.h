// Assertions that stay in every build: a programmer's error that must end the process with its text.
#pragma once

// glibc's own reporter. <cassert> hides it in builds with NDEBUG.
extern "C" [[noreturn]] void __assert_fail(const char* condition, const char* file, unsigned int line,
                                           const char* function) noexcept;

namespace assertion {
inline void require(bool holds, const char* condition, const char* file, unsigned int line, const char* function) {
  if (!holds) __assert_fail(condition, file, line, function);
}
}  // namespace assertion
