// Natives of SseDepthBuffer ("oa").
#include "raster/DepthBuffer.h"

#include "natives/native.h"

using namespace natives;

VELMARK5_NATIVE(void) Java_oa_g(JNIEnv* env, jobject peer, jint width, jint height) {
  frame(env, [&] {
    contract::image_size(width, height);
    auto depth = std::make_unique<DepthBuffer_c>();
    depth->Allocate(static_cast<unsigned int>(width), static_cast<unsigned int>(height));
    objconvert::set_depthbuffer(env, peer, depth.release());
  });
}

VELMARK5_NATIVE(void) Java_oa_za(JNIEnv* env, jobject peer, jlong handle) {
  frame(env, [&] {
    const auto* const image = from_optional_handle<DepthBuffer_c>(handle);
    if (image != nullptr) {
      forget_target(nullptr, image->depth);
      if (toolkit* t = toolkit::live_instance; t != nullptr && t->offscreen_depth == image) {
        t->offscreen_depth = nullptr;
      }
      delete image;
    }
    objconvert::set_depthbuffer(env, peer, nullptr);
  });
}
