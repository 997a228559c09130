// The native of SseModel ("h") that builds a model from a decoded mesh.
#include "model/mesh_views.h"
#include "model/model.h"
#include "natives/in_use.h"
#include "natives/mesh_contract.h"
#include "natives/native.h"
#include "util/memorymanager/alignedmemory.h"

using namespace natives;

namespace {

struct model_deleter {
  void operator()(model* mesh) const {
    mesh->~model();
    _aligned_free(mesh);
  }
};

std::unique_ptr<model, model_deleter> new_model(memorymanager& pool) {
  void* place = _aligned_malloc(sizeof(model), alignof(model));
  return std::unique_ptr<model, model_deleter>(new (place) model(static_cast<memorypool*>(&pool)));
}

}  // namespace

VELMARK5_NATIVE(void)
Java_h_U(JNIEnv* env, jobject peer, jobject, jobject poolobject, jint vertexcount, jint meshvertexcount, jintArray x,
         jintArray y, jintArray z, jintArray vertexlabels, jshortArray vmask, jint inputfacecount, jshortArray a,
         jshortArray b, jshortArray c, jbyteArray ftype, jbyteArray fpriority, jbyteArray falpha, jbyteArray fmapping,
         jshortArray fhsl, jshortArray ftex, jintArray facelabels, jbyte priority, jshortArray fmask, jint mappingcount,
         jbyteArray mappingtype, jshortArray mappingp, jshortArray mappingm, jshortArray mappingn,
         jintArray mappingscalex, jintArray mappingscaley, jintArray mappingscalez, jbyteArray mappingrotation,
         jbyteArray mappingdirection, jintArray mappingtranslatex, jintArray mappingtranslatey,
         jintArray mappingtranslatez, jintArray pslist, jint emittercount, jint effectorcount, jint functionmask,
         jint flags, jint ambient, jint contrast, jintArray billboarddata) {
  frame(env, [&] {
    const toolkit& scene = current_toolkit();
    memorymanager& pool = contract::object(objconvert::get_memorypool(env, poolobject));
    const mesh_views mesh{vertexcount,
                          meshvertexcount,
                          {env, x},
                          {env, y},
                          {env, z},
                          {env, vertexlabels},
                          {env, vmask},
                          inputfacecount,
                          {env, a},
                          {env, b},
                          {env, c},
                          {env, ftype},
                          {env, fpriority},
                          {env, falpha},
                          {env, fmapping},
                          {env, fhsl},
                          {env, ftex},
                          {env, facelabels},
                          priority,
                          {env, fmask},
                          mappingcount,
                          {env, mappingtype},
                          {env, mappingp},
                          {env, mappingm},
                          {env, mappingn},
                          {env, mappingscalex},
                          {env, mappingscaley},
                          {env, mappingscalez},
                          {env, mappingrotation},
                          {env, mappingdirection},
                          {env, mappingtranslatex},
                          {env, mappingtranslatey},
                          {env, mappingtranslatez},
                          {env, pslist},
                          emittercount,
                          effectorcount,
                          static_cast<unsigned int>(functionmask),
                          static_cast<unsigned int>(flags),
                          ambient,
                          contrast,
                          {env, billboarddata}};
    mesh_contract::check(mesh, scene);
    const in_use mark;
    auto built = new_model(pool);
    built->build(mesh);
    // A collection of memory can have failed: its exception is the result then.
    if (env->ExceptionCheck()) return;
    objconvert::set_model(env, peer, built.release());
  });
}
