#include "natives/objconvert.h"

#include <cstdint>

#include "util/exception.h"

namespace {

// A native address as a Java long: on 32-bit, sign-extended.
void bind(JNIEnv* env, jobject peer, void* value, jweak& java_class, jfieldID& nativeid) {
  if (nativeid == nullptr) {
    jclass found = env->GetObjectClass(peer);
    java_class = env->NewWeakGlobalRef(found);
    nativeid = env->GetFieldID(found, "nativeid", "J");
  }
  env->SetLongField(peer, nativeid, static_cast<jlong>(reinterpret_cast<std::intptr_t>(value)));
}

template <class T>
T* resolve(JNIEnv* env, jobject peer, jfieldID nativeid) {
  if (peer == nullptr) throw new NullPointerException;
  if (nativeid == nullptr) return nullptr;  // no object of this class was ever bound
  return reinterpret_cast<T*>(static_cast<std::intptr_t>(env->GetLongField(peer, nativeid)));
}

}  // namespace

#define VELMARK5_SETTER(name, type)                                     \
  jweak cl_##name = nullptr;                                            \
  jfieldID objconvert::name##_nativeid = nullptr;                       \
  void objconvert::set_##name(JNIEnv* env, jobject peer, type* value) { \
    bind(env, peer, value, cl_##name, name##_nativeid);                 \
  }
#define VELMARK5_GETTER(name, type) \
  type* objconvert::get_##name(JNIEnv* env, jobject peer) { return resolve<type>(env, peer, name##_nativeid); }

VELMARK5_SETTER(toolkit, toolkit)
VELMARK5_SETTER(memorypool, memorymanager)
VELMARK5_SETTER(model, model)
VELMARK5_SETTER(sprite, Sprite_c)
VELMARK5_SETTER(depthbuffer, DepthBuffer_c)
VELMARK5_SETTER(clippingmask, clippingmask)
VELMARK5_SETTER(matrix, Matrix_c)
VELMARK5_SETTER(ground, ground)
VELMARK5_SETTER(font_mono, font_mono)
VELMARK5_SETTER(font_paletted, font_paletted)
VELMARK5_SETTER(font_alpha, font_alpha)
VELMARK5_SETTER(shadow, shadow)
VELMARK5_SETTER(threadresource, threadresource)
VELMARK5_SETTER(canvas, canvas)

VELMARK5_GETTER(toolkit, toolkit)
VELMARK5_GETTER(memorypool, memorymanager)
VELMARK5_GETTER(model, model)
VELMARK5_GETTER(clippingmask, clippingmask)
VELMARK5_GETTER(ground, ground)
VELMARK5_GETTER(font_mono, font_mono)
VELMARK5_GETTER(font_paletted, font_paletted)
VELMARK5_GETTER(font_alpha, font_alpha)
VELMARK5_GETTER(shadow, shadow)
VELMARK5_GETTER(canvas, canvas)
