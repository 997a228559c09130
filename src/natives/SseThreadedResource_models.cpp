// Natives of SseThreadedResource ("a") that draw models.
#include <cstring>

#include "maths/Matrix.h"
#include "model/model.h"
#include "natives/in_use.h"
#include "natives/mesh_contract.h"
#include "natives/native.h"
#include "toolkit/threadresource.h"

using namespace natives;

VELMARK5_NATIVE(void)
Java_a_wa(JNIEnv* env, jobject, jlong resource, jobject mesh, jfloatArray matrix, jintArray result) {
  frame(env, [&] {
    current_toolkit();
    auto& scratch = from_handle<threadresource>(resource);
    model& drawn = contract::object(objconvert::get_model(env, mesh));
    mesh_contract::has_storage(drawn);
    in_use::refuse(drawn);
    in_use::refuse(scratch);
    contract::not_null(matrix);
    contract::array_is("matrix", array_length(env, matrix), 16);
    if (result != nullptr) contract::array_holds("result", array_length(env, result), 6);
    Matrix_c world;
    {
      const pinned_jfloatArrayRO floats(env, matrix, 16);
      std::memcpy(&world, floats.elements, sizeof world);
    }
    copied_jintArray view(env, result);
    const in_use mark(&drawn, &scratch);
    drawn.render(scratch, world, view);
  });
}
