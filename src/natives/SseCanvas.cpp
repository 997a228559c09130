// Natives of SseCanvas ("za"): presentation in a window.
#include <memory>

#include "natives/native.h"
#include "toolkit/canvas.h"
#include "toolkit/display_binding.h"

using namespace natives;

namespace {

// X11 counts pixels in 16 bits, and a buffer's bytes are counted in an int.
constexpr int longest_side = 65535;
constexpr long long largest_buffer = 0x7FFFFFFF;

void size_is_possible(int width, int height) {
  contract::at_least("width", width, 1);
  contract::at_least("height", height, 1);
  if (!contract::checked) return;
  if (width > longest_side) contract::fail_argument("width: %d is more than %d", width, longest_side);
  if (height > longest_side) contract::fail_argument("height: %d is more than %d", height, longest_side);
  const long long bytes = 4LL * width * height;
  if (bytes > largest_buffer) {
    contract::fail_argument("width, height: %dx%d needs %lld bytes, more than %lld", width, height, bytes,
                            largest_buffer);
  }
}

// AWT reads the window of whatever it is given: only a component that has one may reach it.
void has_window(JNIEnv* env, jobject component) {
  if (!contract::checked) return;
  jclass component_class = env->FindClass("java/awt/Component");
  if (component_class == nullptr) throw new JavaExceptionPending;
  if (!env->IsInstanceOf(component, component_class)) {
    contract::fail_argument("component: not a java.awt.Component");
  }
  const auto answers = [&](const char* question) {
    const bool yes = is_true(env->CallBooleanMethod(component, env->GetMethodID(component_class, question, "()Z")));
    if (env->ExceptionCheck()) throw new JavaExceptionPending;
    return yes;
  };
  if (!answers("isDisplayable")) contract::fail_state("component: not displayable");
  if (answers("isLightweight")) contract::fail_argument("component: lightweight, it has no window of its own");
}

// Checks a canvas's new component and size before anything changes.
const display_binding& check_new_surface(JNIEnv* env, jobject component, int width, int height) {
  contract::not_null(component);
  size_is_possible(width, height);
  const display_binding& binding = display_binding::get(current_toolkit().vm);
  has_window(env, component);
  return binding;
}

canvas& canvas_of(JNIEnv* env, jobject peer) { return contract::object(objconvert::get_canvas(env, peer)); }

// A flip makes the canvas's other image the target under the size and clip rectangle of the last one, even if that is
// gone by now: where they described more pixels, drawing would go past the image's end.
void target_fits(const canvas& c) {
  const toolkit& scene = current_toolkit();
  if (!contract::checked || !c.use_shm || c.colourbuffer == nullptr) return;
  if (static_cast<long long>(scene.width) * scene.height > static_cast<long long>(c.width) * c.height) {
    contract::fail_state("canvas: %dx%d cannot become the target of %dx%d", c.width, c.height, scene.width,
                         scene.height);
  }
}

}  // namespace

VELMARK5_NATIVE(void) Java_za_n(JNIEnv* env, jobject peer, jint, jobject component, jint width, jint height) {
  frame(env, [&] {
    const display_binding& binding = check_new_surface(env, component, width, height);
    auto made = std::make_unique<canvas>(current_toolkit().vm, component, width, height, binding);
    objconvert::set_canvas(env, peer, made.release());
  });
}

VELMARK5_NATIVE(void) Java_za_ma(JNIEnv* env, jobject peer) {
  frame(env, [&] {
    if (canvas* old = objconvert::get_canvas(env, peer)) {
      forget_target(old->colourbuffer, old->depthbuffer);
      delete old;
    }
    objconvert::set_canvas(env, peer, nullptr);
  });
}

VELMARK5_NATIVE(void) Java_za_wa(JNIEnv* env, jobject peer, jobject component, jint width, jint height) {
  frame(env, [&] {
    canvas& c = canvas_of(env, peer);
    check_new_surface(env, component, width, height);
    forget_target(c.colourbuffer, c.depthbuffer);
    c.resized(component, width, height);
  });
}

VELMARK5_NATIVE(void) Java_za_H(JNIEnv* env, jobject peer, jint x, jint y, jint width, jint height) {
  frame(env, [&] {
    canvas& c = canvas_of(env, peer);
    contract::not_negative("x", x);
    contract::not_negative("y", y);
    contract::not_negative("width", width);
    contract::not_negative("height", height);
    contract::rectangle_inside("rectangle", x, y, width, height, c.width, c.height);
    target_fits(c);
    c.flip(x, y, width, height);
  });
}

VELMARK5_NATIVE(void) Java_za_CA(JNIEnv* env, jobject peer, jint a, jint b, jint c, jint d, jint e, jint f) {
  frame(env, [&] { canvas_of(env, peer).flip_dirtyrect(a, b, c, d, e, f); });
}
