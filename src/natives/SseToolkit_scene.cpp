// Natives of SseToolkit ("ja"): camera, projection, lights, fog, water.
#include <algorithm>

#include "natives/native.h"

using namespace natives;

namespace {

// The 16 floats of a Java array as rows; the array is let go before anything is done with them.
Matrix_c matrix_from(JNIEnv* env, jfloatArray array) {
  contract::not_null(array);
  const jint length = array_length(env, array);
  contract::array_is("matrix", length, 16);
  const pinned_jfloatArrayRO view(env, array, length);
  Matrix_c matrix;
  std::copy(view.elements, view.elements + 16, &matrix.rows[0].x);
  return matrix;
}

}  // namespace

VELMARK5_NATIVE(void) Java_ja_AA(JNIEnv* env, jobject, jfloatArray matrix) {
  frame(env, [&] { current_toolkit().set_camera(matrix_from(env, matrix)); });
}

VELMARK5_NATIVE(void) Java_ja_wa(JNIEnv* env, jobject, jfloatArray matrix) {
  frame(env, [&] { current_toolkit().set_projection(matrix_from(env, matrix)); });
}

VELMARK5_NATIVE(void) Java_ja_IA(JNIEnv* env, jobject, jfloat ambient) {
  frame(env, [&] { current_toolkit().set_globalambient(ambient); });
}

VELMARK5_NATIVE(void)
Java_ja_m(JNIEnv* env, jobject, jint colour, jfloat front, jfloat back, jfloat x, jfloat y, jfloat z) {
  frame(env, [&] { current_toolkit().set_globalsun(colour, front, back, x, y, z); });
}

VELMARK5_NATIVE(void) Java_ja_c(JNIEnv* env, jobject, jint colour, jint start) {
  frame(env, [&] { current_toolkit().set_fog(static_cast<unsigned int>(colour), start); });
}

VELMARK5_NATIVE(void) Java_ja_Q(JNIEnv* env, jobject, jint count, jintArray lights, jfloatArray strengths) {
  frame(env, [&] {
    toolkit& instance = current_toolkit();
    const jint lights_length = array_length(env, lights);
    const jint strengths_length = array_length(env, strengths);
    if (count > 0) {
      contract::not_null(lights);
      contract::not_null(strengths);
      contract::array_holds("lights", lights_length, 5LL * std::min<jint>(count, 4));
      contract::array_holds("strengths", strengths_length, std::min<jint>(count, 4));
    }
    const pinned_jintArrayRO light_view(env, lights, lights_length);
    const pinned_jfloatArrayRO strength_view(env, strengths, strengths_length);
    instance.set_pointlights(count, light_view.elements, strength_view.elements);
  });
}

VELMARK5_NATIVE(void) Java_ja_M(JNIEnv* env, jobject, jint height, jint colour, jint range, jint) {
  frame(env, [&] { current_toolkit().underwatermode_enable(height, static_cast<unsigned int>(colour), range); });
}

VELMARK5_NATIVE(void) Java_ja_JA(JNIEnv* env, jobject, jint height, jint colour, jint range, jint) {
  frame(env, [&] { current_toolkit().underwatermode_adjust(height, static_cast<unsigned int>(colour), range); });
}

VELMARK5_NATIVE(void) Java_ja_O(JNIEnv* env, jobject) {
  frame(env, [&] { current_toolkit().underwatermode_disable(); });
}

VELMARK5_NATIVE(void) Java_ja_J(JNIEnv* env, jobject, jint resolution) {
  frame(env, [&] { current_toolkit().set_shadow_resolution(resolution); });
}
