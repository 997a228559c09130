// Natives of SseSprite ("fa"): storage and copies. Its drawing natives are in SseSprite_blits.cpp.
#include <algorithm>

#include "natives/native.h"
#include "raster/Rasterizer.h"
#include "raster/Sprite.h"

using namespace natives;

namespace {

// The active colour buffer, as the copying natives read it.
struct Framebuffer {
  const unsigned int* pixels;
  int width, height;

  const unsigned int* at(int x, int y) const { return pixels + static_cast<std::ptrdiff_t>(y) * width + x; }
  unsigned int stride() const { return static_cast<unsigned int>(width); }
};

Framebuffer framebuffer() {
  const toolkit& t = current_toolkit();
  if (t.colourbuffer == nullptr || Rasterizer_n::m_pColourBuffer == nullptr) {
    throw new Exception("No colour buffer");
  }
  return {t.colourbuffer, t.width, t.height};
}

// A new sprite of the size, not yet bound to a peer.
std::unique_ptr<Sprite_c> make_sprite(int w, int h) {
  contract::image_size(w, h);
  auto sprite = std::make_unique<Sprite_c>();
  sprite->Allocate(static_cast<unsigned int>(w), static_cast<unsigned int>(h));
  return sprite;
}

const unsigned int* words(const int* elements) { return reinterpret_cast<const unsigned int*>(elements); }
const unsigned char* bytes(const signed char* elements) { return reinterpret_cast<const unsigned char*>(elements); }

// The palette must hold the largest index in use. With the alpha array that includes index 0, without it index 0 is
// never looked up.
void check_palette(int palette_length, const unsigned char* indices, int stride, int w, int h, bool looks_up_zero) {
  if (!contract::checked) return;
  int largest = looks_up_zero && w > 0 && h > 0 ? 0 : -1;
  for (int y = 0; y < h; ++y) {
    const unsigned char* row = indices + static_cast<std::ptrdiff_t>(y) * stride;
    for (int x = 0; x < w; ++x) {
      if (row[x] != 0) largest = std::max<int>(largest, row[x]);
    }
  }
  contract::array_holds("palette", palette_length, largest + 1);
}

}  // namespace

VELMARK5_NATIVE(void) Java_fa_UA(JNIEnv* env, jobject peer, jint, jint w, jint h) {
  frame(env, [&] { objconvert::set_sprite(env, peer, make_sprite(w, h).release()); });
}

VELMARK5_NATIVE(void) Java_fa_K(JNIEnv* env, jobject peer, jint, jint x, jint y, jint w, jint h, jboolean opaque) {
  frame(env, [&] {
    const Framebuffer source = framebuffer();
    contract::rectangle_inside("framebuffer", x, y, w, h, source.width, source.height);
    auto sprite = make_sprite(w, h);
    if (w > 0 && h > 0) sprite->Copy(source.at(x, y), source.stride(), opaque != JNI_FALSE);
    objconvert::set_sprite(env, peer, sprite.release());
  });
}

// The offset argument is not applied.
VELMARK5_NATIVE(void)
Java_fa_RA(JNIEnv* env, jobject peer, jint, jintArray pixels, jint, jint stride, jint w, jint h, jboolean opaque) {
  frame(env, [&] {
    contract::not_null(pixels);
    contract::rows_inside("pixels", array_length(env, pixels), 0, stride, w, h);
    const copied_jintArrayRO view(env, pixels);
    auto sprite = make_sprite(w, h);
    sprite->Copy(words(view.elements), static_cast<unsigned int>(stride), opaque != JNI_FALSE);
    objconvert::set_sprite(env, peer, sprite.release());
  });
}

// The offset argument is not applied.
VELMARK5_NATIVE(void)
Java_fa_EA(JNIEnv* env, jobject peer, jint, jintArray palette, jbyteArray indices, jbyteArray alpha, jint, jint stride,
           jint w, jint h) {
  frame(env, [&] {
    contract::not_null(palette);
    contract::not_null(indices);
    contract::image_size(w, h);
    contract::rows_inside("indices", array_length(env, indices), 0, stride, w, h);
    if (alpha != nullptr) contract::rows_inside("alpha", array_length(env, alpha), 0, stride, w, h);
    const copied_jintArrayRO palette_view(env, palette);
    const copied_jbyteArrayRO indices_view(env, indices);
    const copied_jbyteArrayRO alpha_view(env, alpha);
    check_palette(palette_view.length(), bytes(indices_view.elements), stride, w, h, alpha != nullptr);
    auto sprite = make_sprite(w, h);
    sprite->CopyFrom8Bit(bytes(indices_view.elements), words(palette_view.elements), bytes(alpha_view.elements),
                         static_cast<unsigned int>(stride));
    objconvert::set_sprite(env, peer, sprite.release());
  });
}

VELMARK5_NATIVE(void) Java_fa_M(JNIEnv* env, jobject peer, jlong handle) {
  frame(env, [&] {
    const auto* const sprite = from_optional_handle<Sprite_c>(handle);
    if (sprite != nullptr) {
      forget_target(sprite->pixels, nullptr);
      if (toolkit* t = toolkit::live_instance; t != nullptr && t->offscreen_sprite == sprite) {
        t->offscreen_sprite = nullptr;
      }
      delete sprite;
    }
    objconvert::set_sprite(env, peer, nullptr);
  });
}

VELMARK5_NATIVE(jint) Java_fa_da(JNIEnv* env, jobject, jlong handle) {
  return frame(env, [&] { return from_handle<Sprite_c>(handle).width; });
}

VELMARK5_NATIVE(jint) Java_fa_GA(JNIEnv* env, jobject, jlong handle) {
  return frame(env, [&] { return from_handle<Sprite_c>(handle).height; });
}

VELMARK5_NATIVE(jint) Java_fa_WA(JNIEnv* env, jobject, jlong handle) {
  return frame(env, [&] { return from_handle<Sprite_c>(handle).full_width(); });
}

VELMARK5_NATIVE(jint) Java_fa_ba(JNIEnv* env, jobject, jlong handle) {
  return frame(env, [&] { return from_handle<Sprite_c>(handle).full_height(); });
}

VELMARK5_NATIVE(void)
Java_fa_U(JNIEnv* env, jobject, jlong handle, jint left, jint top, jint right, jint bottom) {
  frame(env, [&] {
    auto& sprite = from_handle<Sprite_c>(handle);
    sprite.left = left;
    sprite.top = top;
    sprite.right = right;
    sprite.bottom = bottom;
  });
}

VELMARK5_NATIVE(void) Java_fa_F(JNIEnv* env, jobject, jlong handle, jintArray result) {
  frame(env, [&] {
    const auto& sprite = from_handle<Sprite_c>(handle);
    contract::not_null(result);
    const jint length = array_length(env, result);
    contract::array_holds("result", length, 4);
    pinned_jintArray view(env, result, length);
    view.elements[0] = sprite.left;
    view.elements[1] = sprite.top;
    view.elements[2] = sprite.right;
    view.elements[3] = sprite.bottom;
  });
}

VELMARK5_NATIVE(void)
Java_fa_na(JNIEnv* env, jobject, jlong handle, jint x, jint y, jint w, jint h, jintArray pixels, jint offset,
           jint stride) {
  frame(env, [&] {
    auto& sprite = from_handle<Sprite_c>(handle);
    contract::not_null(pixels);
    contract::not_negative("w", w);
    contract::not_negative("h", h);
    contract::rectangle_inside("rectangle", x, y, w, h, sprite.width, sprite.height);
    const jint length = array_length(env, pixels);
    contract::rows_inside("pixels", length, offset, stride, w, h);
    if (w == 0 || h == 0) return;
    const pinned_jintArrayRO view(env, pixels, length);
    sprite.CopyRect(x, y, static_cast<unsigned int>(w), static_cast<unsigned int>(h), words(view.elements) + offset,
                    static_cast<unsigned int>(stride), false);
  });
}

VELMARK5_NATIVE(void)
Java_fa_ea(JNIEnv* env, jobject, jlong handle, jint x, jint y, jint w, jint h, jint fbx, jint fby) {
  frame(env, [&] {
    const Framebuffer source = framebuffer();
    auto& sprite = from_handle<Sprite_c>(handle);
    contract::not_negative("w", w);
    contract::not_negative("h", h);
    contract::rectangle_inside("rectangle", x, y, w, h, sprite.width, sprite.height);
    contract::rectangle_inside("framebuffer", fbx, fby, w, h, source.width, source.height);
    if (w == 0 || h == 0) return;
    sprite.CopyRect(x, y, static_cast<unsigned int>(w), static_cast<unsigned int>(h), source.at(fbx, fby),
                    source.stride(), true);
  });
}

VELMARK5_NATIVE(void) Java_fa_j(JNIEnv* env, jobject, jlong handle, jint fbx, jint fby, jint channel) {
  frame(env, [&] {
    const Framebuffer source = framebuffer();
    auto& sprite = from_handle<Sprite_c>(handle);
    contract::rectangle_inside("framebuffer", fbx, fby, sprite.width, sprite.height, source.width, source.height);
    if (contract::checked && (channel < 0 || channel > 3))
      contract::fail_argument("channel: %d is not 0 to 3", channel);
    if (sprite.width == 0 || sprite.height == 0) return;
    sprite.CopyAlpha(source.at(fbx, fby), source.stride(), static_cast<unsigned int>(channel));
  });
}
