// Views of Java arrays: small stack objects that obtain the elements when they are made and give them back when they
// go, also when a failure unwinds.
//
// copiedjniarray is for long work that may allocate or call back into Java. pinnedjniarray holds a JNI critical
// section: while one lives the thread makes no JNI call but the release, raises nothing, and is done soon. A native
// with two pinned arrays reads both lengths before it pins the first.
#pragma once

#include <jni.h>

#include <atomic>
#include <cstring>

#include "util/exception.h"
#include "util/memorymanager/sharedarray.h"

// Pinned arrays held at this moment, over all threads. A debugging aid.
extern std::atomic<int> pin_count;

// The length of a Java array, 0 for null.
inline jint array_length(JNIEnv* env, jarray array) { return array == nullptr ? 0 : env->GetArrayLength(array); }

namespace jni {

// The Get/Release pair of each element type.
template <class A>
struct array_calls;

#define VELMARK5_ARRAY_CALLS(array_type, element_type, Name)                           \
  template <>                                                                          \
  struct array_calls<array_type> {                                                     \
    using element = element_type;                                                      \
    static element* get(JNIEnv* env, array_type array, jboolean* iscopy) {             \
      return env->Get##Name##ArrayElements(array, iscopy);                             \
    }                                                                                  \
    static void release(JNIEnv* env, array_type array, element* elements, jint mode) { \
      env->Release##Name##ArrayElements(array, elements, mode);                        \
    }                                                                                  \
  }
VELMARK5_ARRAY_CALLS(jintArray, jint, Int);
VELMARK5_ARRAY_CALLS(jshortArray, jshort, Short);
VELMARK5_ARRAY_CALLS(jbyteArray, jbyte, Byte);
VELMARK5_ARRAY_CALLS(jbooleanArray, jboolean, Boolean);
VELMARK5_ARRAY_CALLS(jfloatArray, jfloat, Float);
#undef VELMARK5_ARRAY_CALLS

// A read-only view throws its changes away.
constexpr jint release_mode(bool read_only) { return read_only ? JNI_ABORT : 0; }

}  // namespace jni

template <class T, class A, bool RO>
class copiedjniarray {
 public:
  copiedjniarray(JNIEnv* environment, A java_array)
      : array(java_array), env(environment), elementcount(array_length(environment, java_array)) {
    if (array != nullptr) getElements();
  }
  ~copiedjniarray() {
    if (array == nullptr) return;
    if (elements != nullptr) releaseElements();
    array = nullptr;
    elements = nullptr;
  }
  copiedjniarray(const copiedjniarray&) = delete;
  copiedjniarray& operator=(const copiedjniarray&) = delete;

  // The elements; when the runtime has no memory for them its OutOfMemoryError goes to the caller.
  T* getElements() {
    elements = reinterpret_cast<T*>(jni::array_calls<A>::get(env, array, &iscopy));
    if (elements == nullptr) throw new JavaExceptionPending;
    return elements;
  }
  void releaseElements() {
    jni::array_calls<A>::release(env, array, reinterpret_cast<typename jni::array_calls<A>::element*>(elements),
                                 jni::release_mode(RO));
  }

  // A block of `pool` with the array's contents; empty for null. Can move every block of the pool and call into Java.
  template <class U>
  sharedarray<U> toSharedarray(memorymanager* pool) const {
    static_assert(sizeof(U) == sizeof(T));
    if (array == nullptr) return {};
    const jint n = elementcount;
    auto result = sharedarray<U>::allocate(*pool, static_cast<unsigned int>(n));
    if (n > 0) std::memcpy(result.data(), elements, static_cast<unsigned int>(n) * sizeof(T));
    return result;
  }

  // Asks no runtime: a callback's exception may be pending.
  jint length() const { return elementcount; }

  jboolean iscopy = JNI_FALSE;
  A array;
  T* elements = nullptr;

 private:
  JNIEnv* env;
  jint elementcount;
};

template <class T, class A, bool RO>
class pinnedjniarray {
 public:
  pinnedjniarray(JNIEnv* environment, A java_array)
      : pinnedjniarray(environment, java_array, array_length(environment, java_array)) {}

  // For natives with several pinned arrays, whose lengths were read before.
  pinnedjniarray(JNIEnv* environment, A java_array, jint array_length)
      : array(java_array), length(array_length), env(environment) {
    if (array == nullptr) return;
    elements = static_cast<T*>(env->GetPrimitiveArrayCritical(array, &iscopy));
    if (elements == nullptr) throw new JavaExceptionPending;
    pin_count.fetch_add(1, std::memory_order_relaxed);
  }
  ~pinnedjniarray() {
    if (array == nullptr) return;
    env->ReleasePrimitiveArrayCritical(array, elements, jni::release_mode(RO));
    pin_count.fetch_sub(1, std::memory_order_relaxed);
    array = nullptr;
    elements = nullptr;
  }
  pinnedjniarray(const pinnedjniarray&) = delete;
  pinnedjniarray& operator=(const pinnedjniarray&) = delete;

  jboolean iscopy = JNI_FALSE;
  A array;
  T* elements = nullptr;
  jint length;

 private:
  JNIEnv* env;
};

using copied_jintArray = copiedjniarray<int, jintArray, false>;
using copied_jintArrayRO = copiedjniarray<int, jintArray, true>;
using copied_jshortArray = copiedjniarray<short, jshortArray, false>;
using copied_jshortArrayRO = copiedjniarray<short, jshortArray, true>;
using copied_jbyteArray = copiedjniarray<signed char, jbyteArray, false>;
using copied_jbyteArrayRO = copiedjniarray<signed char, jbyteArray, true>;
using copied_jbooleanArray = copiedjniarray<unsigned char, jbooleanArray, false>;
using copied_jbooleanArrayRO = copiedjniarray<unsigned char, jbooleanArray, true>;
using copied_jfloatArray = copiedjniarray<float, jfloatArray, false>;
using copied_jfloatArrayRO = copiedjniarray<float, jfloatArray, true>;
using pinned_jintArray = pinnedjniarray<int, jintArray, false>;
using pinned_jintArrayRO = pinnedjniarray<int, jintArray, true>;
using pinned_jfloatArray = pinnedjniarray<float, jfloatArray, false>;
using pinned_jfloatArrayRO = pinnedjniarray<float, jfloatArray, true>;
using pinned_jshortArrayRO = pinnedjniarray<short, jshortArray, true>;
using pinned_jbooleanArray = pinnedjniarray<unsigned char, jbooleanArray, false>;
