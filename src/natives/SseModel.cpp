// Natives of SseModel ("h"): lifecycle, state and bounds. Building is in SseModel_build.cpp.
#include "model/model.h"

#include "natives/in_use.h"
#include "natives/mesh_contract.h"
#include "natives/native.h"
#include "util/memorymanager/alignedmemory.h"

using namespace natives;

namespace {

model& model_of(JNIEnv* env, jobject peer) {
  model& mesh = contract::object(objconvert::get_model(env, peer));
  mesh_contract::has_storage(mesh);
  return mesh;
}

}  // namespace

// A blank model, for copies to fill.
VELMARK5_NATIVE(void) Java_h_ba(JNIEnv* env, jobject peer, jint) {
  frame(env, [&] {
    void* place = _aligned_malloc(sizeof(model), alignof(model));
    objconvert::set_model(env, peer, new (place) model());
  });
}

VELMARK5_NATIVE(void) Java_h_ma(JNIEnv* env, jobject peer) {
  frame(env, [&] {
    if (model* mesh = objconvert::get_model(env, peer); mesh != nullptr) {
      in_use::refuse(*mesh);
      mesh->~model();
      _aligned_free(mesh);
    }
    objconvert::set_model(env, peer, nullptr);
  });
}

VELMARK5_NATIVE(void) Java_h_KA(JNIEnv* env, jobject peer, jint mask) {
  frame(env, [&] {
    current_toolkit();
    model& mesh = model_of(env, peer);
    in_use::refuse(mesh);
    const in_use mark(&mesh);
    mesh.updatefunctionmask(static_cast<unsigned int>(mask));
  });
}

VELMARK5_NATIVE(jint) Java_h_m(JNIEnv* env, jobject peer) {
  return frame(env, [&] { return static_cast<jint>(model_of(env, peer).functionmask); });
}

VELMARK5_NATIVE(jboolean) Java_h_i(JNIEnv* env, jobject peer) {
  return frame(env, [&] {
    const model& mesh = model_of(env, peer);
    return static_cast<jboolean>(mesh.hasalpha || mesh.falpha.block != nullptr);
  });
}

VELMARK5_NATIVE(jboolean) Java_h_u(JNIEnv* env, jobject peer) {
  return frame(env, [&] { return static_cast<jboolean>(model_of(env, peer).hasanimatedtexture); });
}

VELMARK5_NATIVE(void) Java_h_p(JNIEnv* env, jobject peer, jint ambient) {
  frame(env, [&] { model_of(env, peer).setambient(static_cast<unsigned int>(ambient)); });
}

VELMARK5_NATIVE(void) Java_h_Q(JNIEnv* env, jobject peer, jint contrast) {
  frame(env, [&] { model_of(env, peer).setcontrast(static_cast<unsigned int>(contrast)); });
}

VELMARK5_NATIVE(jint) Java_h_c(JNIEnv* env, jobject peer) {
  return frame(env, [&] { return static_cast<jint>(model_of(env, peer).getambient()); });
}

VELMARK5_NATIVE(jint) Java_h_Z(JNIEnv* env, jobject peer) {
  return frame(env, [&] { return static_cast<jint>(model_of(env, peer).getcontrast()); });
}

#define VELMARK5_BOUND(name, getter)                                 \
  VELMARK5_NATIVE(jint) Java_h_##name(JNIEnv* env, jobject peer) {   \
    return frame(env, [&] { return model_of(env, peer).getter(); }); \
  }
VELMARK5_BOUND(N, getradius_cylinder)
VELMARK5_BOUND(n, getradius_sphere)
VELMARK5_BOUND(RA, get_minx)
VELMARK5_BOUND(ya, get_maxx)
VELMARK5_BOUND(YA, get_miny)
VELMARK5_BOUND(o, get_maxy)
VELMARK5_BOUND(AA, get_minz)
VELMARK5_BOUND(ha, get_maxz)
#undef VELMARK5_BOUND
