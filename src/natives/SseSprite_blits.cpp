// Natives of SseSprite ("fa") that draw. None does anything without a colour buffer, and values that name no colour
// operation or blend draw nothing.
#include "natives/native.h"
#include "raster/SpriteInstances.h"
#include "toolkit/sprite_target.h"

using namespace natives;

namespace {

void draw(sprite_select::Render render, jlong handle, const RenderParams_s& params, const SpriteTarget_s& target) {
  const auto& sprite = from_handle<Sprite_c>(handle);
  if (render != nullptr) (sprite.*render)(params, target);
}

RenderParams_s at(int x, int y, int colour) {
  RenderParams_s params;
  params.x = x;
  params.y = y;
  params.colour = static_cast<unsigned int>(colour);
  return params;
}

RenderParams_s sized(int x, int y, int w, int h, int colour) {
  RenderParams_s params = at(x, y, colour);
  params.width = w;
  params.height = h;
  return params;
}

}  // namespace

VELMARK5_NATIVE(void)
Java_fa_Y(JNIEnv* env, jobject, jlong handle, jint x, jint y, jint colourop, jint colour, jint blend) {
  frame(env, [&] {
    const SpriteTarget_s target = sprite_target(current_toolkit());
    if (target.colour == nullptr) return;
    draw(sprite_select::render<VELMARK5_PLAIN>(colourop, blend), handle, at(x, y, colour), target);
  });
}

VELMARK5_NATIVE(void)
Java_fa_ha(JNIEnv* env, jobject, jlong handle, jint x, jint y, jint w, jint h, jint colourop, jint colour, jint blend) {
  frame(env, [&] {
    const SpriteTarget_s target = sprite_target(current_toolkit());
    if (target.colour == nullptr) return;
    draw(sprite_select::render<VELMARK5_SCALED>(colourop, blend), handle, sized(x, y, w, h, colour), target);
  });
}

VELMARK5_NATIVE(void)
Java_fa_G(JNIEnv* env, jobject, jlong handle, jint x, jint y, jint z, jint w, jint h, jint colourop, jint colour,
          jint blend) {
  frame(env, [&] {
    const SpriteTarget_s target = sprite_target(current_toolkit());
    sprite_select::Render render = nullptr;
    if (target.depth != nullptr) {
      render = target.colour != nullptr ? sprite_select::render<VELMARK5_SCALED_TESTED>(colourop, blend)
                                        : sprite_select::render<VELMARK5_SCALED_UNSEEN>(colourop, blend);
    } else if (target.colour != nullptr) {
      render = sprite_select::render<VELMARK5_SCALED>(colourop, blend);
    } else {
      return;
    }
    RenderParams_s params = sized(x, y, w, h, colour);
    params.z = static_cast<float>(z);
    draw(render, handle, params, target);
  });
}

VELMARK5_NATIVE(void)
Java_fa_o(JNIEnv* env, jobject, jlong handle, jint x, jint y, jlong mask_id, jint maskx, jint masky) {
  frame(env, [&] {
    const SpriteTarget_s target = sprite_target(current_toolkit());
    if (target.colour == nullptr) return;
    const SpanMask_s mask = span_mask(from_handle<clippingmask>(mask_id));
    RenderParams_s params = at(x, y, 0);
    params.mask = &mask;
    params.maskx = maskx;
    params.masky = masky;
    draw(&Sprite_c::Render<ColourOp_e::none, BlendMode_e::alpha, VELMARK5_MASKED>, handle, params, target);
  });
}

VELMARK5_NATIVE(void)
Java_fa_e(JNIEnv* env, jobject, jlong handle, jfloat x0, jfloat y0, jfloat x1, jfloat y1, jfloat x2, jfloat y2,
          jint colourop, jint colour, jint blend) {
  frame(env, [&] {
    const SpriteTarget_s target = sprite_target(current_toolkit());
    if (target.colour == nullptr) return;
    const auto& sprite = from_handle<Sprite_c>(handle);
    ParallelogramRenderParams params = {x0, x1, x2, y0, y1, y2};
    params.colour = static_cast<unsigned int>(colour);
    const auto render = sprite_select::parallelogram(colourop, blend);
    if (render != nullptr) (sprite.*render)(params, target);
  });
}

VELMARK5_NATIVE(void)
Java_fa_FA(JNIEnv* env, jobject, jlong handle, jfloat x0, jfloat y0, jfloat x1, jfloat y1, jfloat x2, jfloat y2, jint,
           jlong mask_id, jint maskx, jint masky, jint blend) {
  frame(env, [&] {
    const SpriteTarget_s target = sprite_target(current_toolkit());
    if (target.colour == nullptr) return;
    const auto& sprite = from_handle<Sprite_c>(handle);
    const SpanMask_s mask = span_mask(from_handle<clippingmask>(mask_id));
    ParallelogramRenderParams params = {x0, x1, x2, y0, y1, y2};
    params.mask = &mask;
    params.maskx = maskx;
    params.masky = masky;
    if (blend == static_cast<int>(BlendMode_e::alpha)) {
      sprite.RenderParallelogram<ColourOp_e::none, BlendMode_e::alpha, true>(params, target);
    } else {
      sprite.RenderParallelogram<ColourOp_e::none, BlendMode_e::replace, true>(params, target);
    }
  });
}

VELMARK5_NATIVE(void)
Java_fa_aa(JNIEnv* env, jobject, jlong handle, jint x, jint y, jint w, jint h, jint colourop, jint colour, jint blend) {
  frame(env, [&] {
    const SpriteTarget_s target = sprite_target(current_toolkit());
    if (target.colour == nullptr) return;
    draw(sprite_select::tiled(colourop, blend), handle, sized(x, y, w, h, colour), target);
  });
}
