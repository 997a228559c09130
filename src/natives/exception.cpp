// What the library's failures become in Java.
#include "util/exception.h"

#include <jni.h>

#include <cstdio>

namespace {

void throw_new(JNIEnv* env, const char* java_class, const char* message) {
  env->ThrowNew(env->FindClass(java_class), message);
}

}  // namespace

void Exception::throwJavaException(JNIEnv* env) { throw_new(env, "java/lang/Exception", message); }
void RuntimeException::throwJavaException(JNIEnv* env) { throw_new(env, "java/lang/RuntimeException", message); }
void ClassCastException::throwJavaException(JNIEnv* env) { throw_new(env, "java/lang/ClassCastException", message); }
void NullPointerException::throwJavaException(JNIEnv* env) { throw_new(env, "java/lang/NullPointerException", ""); }
void OutOfMemory::throwJavaException(JNIEnv* env) { throw_new(env, "java/lang/OutOfMemoryError", message); }
void IllegalArgumentException::throwJavaException(JNIEnv* env) {
  throw_new(env, "java/lang/IllegalArgumentException", message);
}
void IllegalStateException::throwJavaException(JNIEnv* env) {
  throw_new(env, "java/lang/IllegalStateException", message);
}
void NumberFormatException::throwJavaException(JNIEnv* env) {
  throw_new(env, "java/lang/NumberFormatException", message);
}

void NativeError::throwJavaException(JNIEnv* env) {
  std::printf("Throwing: %s\n", message);
  std::fflush(stdout);
  throw_new(env, "tolvi3/graphics2/NativeError", message);
}

void ArrayIndexOutOfBoundsException::throwJavaException(JNIEnv* env) {
  jclass java_class = env->FindClass("java/lang/ArrayIndexOutOfBoundsException");
  jmethodID constructor = env->GetMethodID(java_class, "<init>", "(I)V");
  env->Throw(static_cast<jthrowable>(env->NewObject(java_class, constructor, index)));
}

void JavaExceptionPending::throwJavaException(JNIEnv*) {}
