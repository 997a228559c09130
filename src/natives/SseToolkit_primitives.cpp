// Drawing natives of SseToolkit ("ja"): clears, rectangles, lines, circles, area copies, scrolling, clip rectangle.
#include "natives/native.h"
#include "raster/Rasterizer.h"

using namespace natives;

// --- Clears ---------------------------------------------------------------------------------------------------------

VELMARK5_NATIVE(void) Java_ja_ba(JNIEnv* env, jobject, jint flags, jint colour) {
  frame(env, [&] {
    toolkit& instance = current_toolkit();
    if (flags & 1) instance.cls(static_cast<unsigned int>(colour));
    if (flags & 2) instance.zbuffer_clear(0, 0, instance.width, instance.height, Rasterizer_n::far_depth);
  });
}

VELMARK5_NATIVE(void) Java_ja_DA(JNIEnv* env, jobject, jint colour, jobject mask, jint x, jint y) {
  frame(env, [&] {
    clippingmask& shape = contract::object(objconvert::get_clippingmask(env, mask));
    current_toolkit().cls_masked(static_cast<unsigned int>(colour), shape, x, y);
  });
}

// --- Rectangles, lines, circles -------------------------------------------------------------------------------------

VELMARK5_NATIVE(void) Java_ja_B(JNIEnv* env, jobject, jint x, jint y, jint w, jint h, jint colour, jint mode) {
  frame(env, [&] {
    current_toolkit().rect_fill(x, y, w, h, static_cast<unsigned int>(colour), static_cast<unsigned int>(mode));
  });
}

VELMARK5_NATIVE(void) Java_ja_XA(JNIEnv* env, jobject, jint x, jint y, jint length, jint colour, jint mode) {
  frame(env, [&] {
    current_toolkit().line_h(x, y, length, static_cast<unsigned int>(colour), static_cast<unsigned int>(mode));
  });
}

VELMARK5_NATIVE(void) Java_ja_G(JNIEnv* env, jobject, jint x, jint y, jint length, jint colour, jint mode) {
  frame(env, [&] {
    current_toolkit().line_v(x, y, length, static_cast<unsigned int>(colour), static_cast<unsigned int>(mode));
  });
}

VELMARK5_NATIVE(void) Java_ja_YA(JNIEnv* env, jobject, jint x0, jint y0, jint x1, jint y1, jint colour, jint mode) {
  frame(env, [&] {
    current_toolkit().line(x0, y0, x1, y1, static_cast<unsigned int>(colour), static_cast<unsigned int>(mode));
  });
}

VELMARK5_NATIVE(void)
Java_ja_R(JNIEnv* env, jobject, jint x0, jint y0, jint x1, jint y1, jint colour, jint mode, jobject mask, jint mask_x,
          jint mask_y) {
  frame(env, [&] {
    clippingmask& shape = contract::object(objconvert::get_clippingmask(env, mask));
    current_toolkit().line(x0, y0, x1, y1, static_cast<unsigned int>(colour), static_cast<unsigned int>(mode), shape,
                           mask_x, mask_y);
  });
}

VELMARK5_NATIVE(void) Java_ja_CA(JNIEnv* env, jobject, jint x, jint y, jint radius, jint colour, jint mode) {
  frame(env, [&] {
    current_toolkit().circle_fill(x, y, 0, radius, static_cast<unsigned int>(colour), static_cast<unsigned int>(mode));
  });
}

VELMARK5_NATIVE(void) Java_ja_b(JNIEnv* env, jobject, jint x, jint y, jint radius, jint colour, jint mode) {
  frame(env, [&] {
    current_toolkit().circle_outline(x, y, 0, radius, static_cast<unsigned int>(colour),
                                     static_cast<unsigned int>(mode));
  });
}

// --- Area copies and scrolling --------------------------------------------------------------------------------------

VELMARK5_NATIVE(jintArray) Java_ja_E(JNIEnv* env, jobject, jint x, jint y, jint w, jint h) {
  return frame(env, [&]() -> jintArray {
    toolkit& instance = current_toolkit();
    if (instance.colourbuffer != nullptr) {
      contract::not_negative("w", w);
      contract::not_negative("h", h);
      contract::rectangle_inside("area", x, y, w, h, instance.width, instance.height);
    }
    // Inside a target the product is an int; an area without pixels may have any other side.
    const bool has_area = instance.colourbuffer != nullptr && w > 0 && h > 0;
    const jintArray result = env->NewIntArray(has_area ? w * h : 0);
    if (result == nullptr) throw new JavaExceptionPending;
    pinned_jintArray view(env, result, has_area ? w * h : 0);
    instance.getarea(x, y, w, h, view);
    return result;
  });
}

VELMARK5_NATIVE(void)
Java_ja_BA(JNIEnv* env, jobject, jint x, jint y, jint w, jint h, jintArray pixels, jint offset, jint stride) {
  frame(env, [&] {
    toolkit& instance = current_toolkit();
    if (instance.colourbuffer == nullptr || w < 1 || h < 1) return;
    contract::not_null(pixels);
    const jint length = array_length(env, pixels);
    contract::rectangle_inside("area", x, y, w, h, instance.width, instance.height);
    contract::rows_inside("pixels", length, offset, stride, w, h);
    const pinned_jintArrayRO view(env, pixels, length);
    instance.setarea(x, y, w, h, view, offset, stride);
  });
}

VELMARK5_NATIVE(void) Java_ja_VA(JNIEnv* env, jobject, jint dx, jint dy) {
  frame(env, [&] {
    toolkit& instance = current_toolkit();
    if (instance.colourbuffer != nullptr && instance.depthbuffer != nullptr) {
      instance.scroll<true, true>(dx, dy);
    } else if (instance.colourbuffer != nullptr) {
      instance.scroll<true, false>(dx, dy);
    } else if (instance.depthbuffer != nullptr) {
      instance.scroll<false, true>(dx, dy);
    }
  });
}

// --- State ----------------------------------------------------------------------------------------------------------

VELMARK5_NATIVE(void) Java_ja_L(JNIEnv* env, jobject) {
  frame(env, [&] { current_toolkit().resetclipping(); });
}

VELMARK5_NATIVE(void) Java_ja_r(JNIEnv* env, jobject, jint x0, jint y0, jint x1, jint y1) {
  frame(env, [&] { current_toolkit().setclipping(x0, y0, x1, y1); });
}

VELMARK5_NATIVE(void) Java_ja_o(JNIEnv* env, jobject, jint x0, jint y0, jint x1, jint y1) {
  frame(env, [&] { current_toolkit().setsubclipping(x0, y0, x1, y1); });
}

VELMARK5_NATIVE(void) Java_ja_qa(JNIEnv* env, jobject, jintArray out) {
  frame(env, [&] {
    contract::not_null(out);
    const jint length = array_length(env, out);
    contract::array_holds("out", length, 4);
    toolkit& instance = current_toolkit();
    const pinned_jintArray view(env, out, length);
    instance.getclipping(view.elements);
  });
}

VELMARK5_NATIVE(void) Java_ja_RA(JNIEnv* env, jobject, jboolean enable) {
  frame(env, [&] { current_toolkit().set_zwrite(enable != JNI_FALSE); });
}
