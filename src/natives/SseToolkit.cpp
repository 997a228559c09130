// Natives of SseToolkit ("ja"): lifecycle, target, viewport. Its drawing natives are in SseToolkit_primitives.cpp.
#include <utility>

#include "model/model.h"
#include "natives/in_use.h"
#include "natives/native.h"
#include "raster/DepthBuffer.h"
#include "raster/Rasterizer.h"
#include "raster/Sprite.h"
#include "util/memorymanager/alignedmemory.h"

using namespace natives;

VELMARK5_NATIVE(void) Java_ja_q(JNIEnv* env, jobject peer, jobject texture_source, jint texture_count) {
  frame(env, [&] {
    if (texture_source != nullptr) {
      contract::not_negative("texture_count", texture_count);
      contract::at_most("texture_count", texture_count, 65536);  // ids have 16 bits
    }
    void* place = _aligned_malloc(sizeof(toolkit), 16);
    toolkit* instance = nullptr;
    try {
      instance = new (place) toolkit(env, peer, texture_source, texture_count);
    } catch (...) {
      _aligned_free(place);
      throw;
    }
    objconvert::set_toolkit(env, peer, instance);
    toolkit::m_pInstance = instance;
  });
}

VELMARK5_NATIVE(void) Java_ja_ma(JNIEnv* env, jobject peer) {
  frame(env, [&] {
    toolkit& instance = contract::object(objconvert::get_toolkit(env, peer));
    in_use::refuse_toolkit();
    instance.~toolkit();
    _aligned_free(&instance);
    objconvert::set_toolkit(env, peer, nullptr);
  });
}

VELMARK5_NATIVE(void) Java_ja_Y(JNIEnv* env, jobject, jint time) {
  frame(env, [&] { current_toolkit().service(time); });
}

VELMARK5_NATIVE(void) Java_ja_da(JNIEnv* env, jobject) {
  frame(env, [&] { current_toolkit().quit(); });
}

VELMARK5_NATIVE(void) Java_ja_n(JNIEnv* env, jobject, jobject pool) {
  frame(env, [&] { current_toolkit().pool = objconvert::get_memorypool(env, pool); });
}

VELMARK5_NATIVE(void) Java_ja_PA(JNIEnv* env, jobject, jobject target) {
  frame(env, [&] {
    toolkit& instance = current_toolkit();
    in_use::refuse_target();
    if (target == nullptr) {
      instance.set_active_canvas(nullptr);
    } else {
      instance.set_active_canvas(&contract::object(objconvert::get_canvas(env, target)));
    }
  });
}

VELMARK5_NATIVE(void) Java_ja_d(JNIEnv* env, jobject, jlong sprite, jlong depth) {
  frame(env, [&] {
    auto* image = from_optional_handle<Sprite_c>(sprite);
    auto* depth_image = from_optional_handle<DepthBuffer_c>(depth);
    if (contract::checked && image != nullptr && depth_image != nullptr &&
        (depth_image->width != static_cast<unsigned int>(image->width) ||
         depth_image->height < static_cast<unsigned int>(image->height))) {
      contract::fail_argument("depth: %ux%u does not fit the sprite's %dx%d", depth_image->width, depth_image->height,
                              image->width, image->height);
    }
    in_use::refuse_target();
    current_toolkit().start_offscreen_render(image, depth_image);
  });
}

// Without a frame: nothing here can fail.
VELMARK5_NATIVE(jint) Java_ja_za(JNIEnv*, jobject) { return allocatedmemory::allocated_size; }
VELMARK5_NATIVE(jint) Java_ja_oa(JNIEnv*, jobject) { return std::exchange(model::modelcount, 0); }
VELMARK5_NATIVE(jint) Java_ja_j(JNIEnv*, jobject) { return 0; }
VELMARK5_NATIVE(void) Java_ja_N(JNIEnv*, jobject) {}

VELMARK5_NATIVE(void) Java_ja_k(JNIEnv* env, jobject) {
  frame(env, [&] { current_toolkit().resetviewport(); });
}

VELMARK5_NATIVE(void) Java_ja_A(JNIEnv* env, jobject, jint x, jint y, jint width, jint height) {
  frame(env, [&] {
    Rasterizer_n::Viewport_s viewport = *Rasterizer_n::GetViewport();
    viewport.x = x;
    viewport.y = y;
    viewport.width = width;
    viewport.height = height;
    Rasterizer_n::SetViewport(viewport);
  });
}

VELMARK5_NATIVE(void) Java_ja_GA(JNIEnv* env, jobject, jfloat near, jfloat far) {
  frame(env, [&] {
    Rasterizer_n::Viewport_s viewport = *Rasterizer_n::GetViewport();
    viewport.zmin = near;
    viewport.zmax = far;
    Rasterizer_n::SetViewport(viewport);
  });
}

VELMARK5_NATIVE(void) Java_ja_xa(JNIEnv* env, jobject, jintArray out) {
  frame(env, [&] {
    contract::not_null(out);
    const jint length = array_length(env, out);
    contract::array_holds("out", length, 4);
    pinned_jintArray view(env, out, length);
    const Rasterizer_n::Viewport_s& viewport = *Rasterizer_n::GetViewport();
    view.elements[0] = viewport.x;
    view.elements[1] = viewport.y;
    view.elements[2] = viewport.width;
    view.elements[3] = viewport.height;
  });
}
