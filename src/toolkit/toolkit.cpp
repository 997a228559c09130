#include "toolkit/toolkit.h"

#include <xmmintrin.h>

#include "maths/colourutils.h"
#include "maths/mymath.h"
#include "natives/se_handling.h"

toolkit* toolkit::m_pInstance = nullptr;

jmethodID mid_request_texture = nullptr;
jmethodID mid_garbagecollect = nullptr;
jmethodID mid_createshadow = nullptr;

toolkit::toolkit(JNIEnv* env, jobject peer, jobject /*texture_source*/, int /*texture_count*/) {
  threads.makesentinel();
  setup_se_handling(env);
  env->GetJavaVM(&vm);
  java_peer = env->NewWeakGlobalRef(peer);
  mymath::init();
  colourutils::init();

  jclass peer_class = env->FindClass("ja");
  mid_request_texture = env->GetMethodID(peer_class, "SA", "(S)Z");
  mid_garbagecollect = env->GetMethodID(peer_class, "h", "()V");
  mid_createshadow = env->GetMethodID(peer_class, "WA", "()Ljava/lang/Object;");

  // Flush-to-zero and denormals-are-zero, on this thread and those that the runtime starts from it.
  _mm_setcsr(_mm_getcsr() | 0x8040);
}

toolkit::~toolkit() {
  restore_se_handling();
  get_env()->DeleteWeakGlobalRef(java_peer);
}

JNIEnv* toolkit::get_env() const {
  void* env = nullptr;
  vm->GetEnv(&env, 0x10001);
  return static_cast<JNIEnv*>(env);
}

// What a callback threw stays pending for the native's caller. Asking is what a checking runtime wants to see.
static void acknowledge(JNIEnv* env) { static_cast<void>(env->ExceptionCheck()); }

bool toolkit::request_texture(unsigned short id) {
  JNIEnv* env = get_env();
  const jboolean answer =
      env->CallBooleanMethod(java_peer, mid_request_texture, static_cast<jint>(static_cast<jshort>(id)));
  acknowledge(env);
  return answer == 1;
}

void toolkit::garbagecollect() {
  JNIEnv* env = get_env();
  env->CallVoidMethod(java_peer, mid_garbagecollect);
  acknowledge(env);
}

jobject toolkit::createshadow() {
  JNIEnv* env = get_env();
  const jobject shadow = env->CallObjectMethod(java_peer, mid_createshadow);
  acknowledge(env);
  return shadow;
}

void toolkit::service(int /*time*/) {}
