// Natives of SseThreadedResource ("a"): the per-thread render context.
#include "natives/in_use.h"
#include "natives/native.h"
#include "toolkit/threadresource.h"
#include "util/memorymanager/alignedmemory.h"

using namespace natives;

VELMARK5_NATIVE(void) Java_a_ha(JNIEnv* env, jobject peer, jint, jint, jint, jint a, jint b) {
  frame(env, [&] {
    toolkit& owner = current_toolkit();
    void* place = _aligned_malloc(sizeof(threadresource), 16);
    objconvert::set_threadresource(env, peer, new (place) threadresource(owner, a, b));
  });
}

VELMARK5_NATIVE(void) Java_a_R(JNIEnv* env, jobject peer, jlong handle) {
  frame(env, [&] {
    auto& resource = from_handle<threadresource>(handle);
    in_use::refuse(resource);
    resource.~threadresource();
    _aligned_free(&resource);
    objconvert::set_threadresource(env, peer, nullptr);
  });
}

VELMARK5_NATIVE(void) Java_a_JA(JNIEnv* env, jobject, jlong handle) {
  frame(env, [&] { from_handle<threadresource>(handle).linkthread(); });
}

VELMARK5_NATIVE(void) Java_a_UA(JNIEnv* env, jobject, jlong handle) {
  frame(env, [&] { from_handle<threadresource>(handle).unlinkthread(); });
}
