// The frame that every native has around its work, and the ways in which a native reaches its objects.
#pragma once

#include <jni.h>

#include <cstdint>
#include <memory>

#include "natives/contract.h"
#include "natives/jniarray.h"
#include "natives/objconvert.h"
#include "toolkit/toolkit.h"
#include "util/exception.h"

// Starts the definition of an exported native. 32-bit runtimes need not keep the stack aligned for SSE.
#if defined(__i386__)
#define VELMARK5_NATIVE(type) extern "C" JNIEXPORT __attribute__((force_align_arg_pointer)) type JNICALL
#else
#define VELMARK5_NATIVE(type) extern "C" JNIEXPORT type JNICALL
#endif

namespace natives {

#if defined(__i386__)
// 32-bit runtimes may cut x87 arithmetic to double precision. While one of these lives, extended precision is what it
// says.
class extended_precision {
 public:
  extended_precision() {
    asm volatile("fnstcw %0" : "=m"(callers)::"memory");
    if (callers == full()) return;
    const unsigned short own = full();
    asm volatile("fldcw %0" ::"m"(own) : "memory");
  }
  ~extended_precision() {
    if (callers != full()) asm volatile("fldcw %0" ::"m"(callers) : "memory");
  }
  extended_precision(const extended_precision&) = delete;
  extended_precision& operator=(const extended_precision&) = delete;

 private:
  unsigned short full() const { return callers | 0x300; }
  unsigned short callers;
};
#else
struct extended_precision {};
#endif

// Runs the body and turns whatever it throws into the pending Java exception. The views that the body declares are gone
// by then, so nothing is raised while an array is pinned. On failure the result is a zero that no caller reads.
template <class Body>
auto frame(JNIEnv* env, Body&& body) noexcept -> decltype(body()) {
  using Result = decltype(body());
  [[maybe_unused]] const extended_precision precision;
  try {
    return body();
  } catch (Exception* failure) {
    const std::unique_ptr<Exception> owned(failure);
    // A callback's own exception stays: it came first, and it says more.
    if (!env->ExceptionCheck()) failure->throwJavaException(env);
  } catch (...) {
    if (!env->ExceptionCheck()) {
      env->ThrowNew(env->FindClass("java/lang/RuntimeException"), "System exception occured");
    }
  }
  return Result();
}

// The object behind a raw handle; a zero handle raises.
template <class T>
T& from_handle(jlong handle) {
  return contract::object(reinterpret_cast<T*>(static_cast<std::intptr_t>(handle)));
}

// The same where a zero handle is legal.
template <class T>
T* from_optional_handle(jlong handle) {
  return reinterpret_cast<T*>(static_cast<std::intptr_t>(handle));
}

// The process's toolkit; raises before there is one, and after it is gone.
inline toolkit& current_toolkit() {
  if (contract::checked && toolkit::m_pInstance != toolkit::live_instance) contract::fail_null();
  return contract::object(toolkit::m_pInstance);
}

// Buffers are about to be freed: what is drawn before another target is active must not go to where they were. Raises,
// with nothing changed, when a draw of this thread is under way on them.
void forget_target(const void* colour, const void* depth);

// Only the value 1 is true.
inline bool is_true(jboolean value) { return value == 1; }

}  // namespace natives
