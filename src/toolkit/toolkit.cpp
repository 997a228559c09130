#include "toolkit/toolkit.h"

#include <xmmintrin.h>

#include "maths/colourutils.h"
#include "maths/mymath.h"
#include "natives/se_handling.h"
#include "texture/texturecache.h"
#include "util/memorymanager/alignedmemory.h"

toolkit* toolkit::m_pInstance = nullptr;
toolkit* toolkit::live_instance = nullptr;

jmethodID mid_request_texture = nullptr;
jmethodID mid_garbagecollect = nullptr;
jmethodID mid_createshadow = nullptr;

namespace {

// The cache's way to the client.
class toolkit_texturecache final : public texturecache {
 public:
  toolkit_texturecache(JNIEnv* env, jobject source, int count, toolkit& of)
      : texturecache(env, source, count), owner(of) {}

 protected:
  bool request_texture(unsigned short id) override { return owner.request_texture(id); }
  bool several_threads() const override { return owner.thread_count >= 2; }

 private:
  toolkit& owner;
};

texturecache* make_texturecache(JNIEnv* env, jobject source, int count, toolkit& owner) {
  void* place = _aligned_malloc(sizeof(toolkit_texturecache), alignof(toolkit_texturecache));
  try {
    return new (place) toolkit_texturecache(env, source, count, owner);
  } catch (...) {
    _aligned_free(place);
    throw;
  }
}

}  // namespace

toolkit::toolkit(JNIEnv* env, jobject peer, jobject texture_source, int texture_count) {
  threads.makesentinel();
  setup_se_handling(env);
  env->GetJavaVM(&vm);
  java_peer = env->NewWeakGlobalRef(peer);
  mymath::init();
  colourutils::init();
  if (texture_source != nullptr) {
    try {
      textures = make_texturecache(env, texture_source, texture_count, *this);
    } catch (...) {
      env->DeleteWeakGlobalRef(java_peer);
      restore_se_handling();
      throw;
    }
  }

  jclass peer_class = env->FindClass("ja");
  mid_request_texture = env->GetMethodID(peer_class, "SA", "(S)Z");
  mid_garbagecollect = env->GetMethodID(peer_class, "h", "()V");
  mid_createshadow = env->GetMethodID(peer_class, "WA", "()Ljava/lang/Object;");

  // Flush-to-zero and denormals-are-zero, on this thread and those that the runtime starts from it.
  _mm_setcsr(_mm_getcsr() | 0x8040);
  live_instance = this;
}

toolkit::~toolkit() {
  if (live_instance == this) live_instance = nullptr;
  // Thread resources may go later than the ring.
  while (!threads.isempty()) threads.next->unlink();
  restore_se_handling();
  get_env()->DeleteWeakGlobalRef(java_peer);
  if (textures != nullptr) {
    textures->~texturecache();
    _aligned_free(textures);
    textures = nullptr;
  }
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
  if (env->ExceptionCheck()) return false;  // an earlier request failed: Java may not be called now
  const jboolean answer =
      env->CallBooleanMethod(java_peer, mid_request_texture, static_cast<jint>(static_cast<jshort>(id)));
  acknowledge(env);
  return answer == 1;
}

void toolkit::garbagecollect() {
  JNIEnv* env = get_env();
  if (env->ExceptionCheck()) return;
  env->CallVoidMethod(java_peer, mid_garbagecollect);
  acknowledge(env);
}

jobject toolkit::createshadow() {
  JNIEnv* env = get_env();
  const jobject shadow = env->CallObjectMethod(java_peer, mid_createshadow);
  acknowledge(env);
  return shadow;
}

void toolkit::service(int time) {
  if (textures != nullptr) textures->service(time);
}

const texturemetrics* toolkit::get_texturemetrics(unsigned short id) const {
  return textures != nullptr && id < textures->count() ? textures->getmetrics(id) : nullptr;
}

void toolkit::upload_texturemetrics(unsigned short id, const texturemetrics& fields) {
  textures->upload_texturemetrics(id, fields);
}

void toolkit::upload_texture(unsigned short id, const unsigned int* pixels, const texturemetrics& fields) {
  textures->upload_texture(id, pixels, fields);
}
