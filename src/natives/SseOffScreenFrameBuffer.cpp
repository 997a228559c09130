// Natives of SseOffScreenFrameBuffer ("o"). The class has no object of its own.
#include "natives/native.h"
#include "raster/DepthBuffer.h"
#include "raster/Sprite.h"
#include "toolkit/OffscreenSurface.h"

using namespace natives;

namespace {

struct Corner {
  int x, y;
};

// One call of either direction: resolves what it needs and checks both rectangles before the first word is copied.
// The size stands for both corners.
struct Blit {
  toolkit& t;
  Sprite_c* sprite;
  DepthBuffer_c* depth_image;
  int w, h;
  bool colour, depth;

  Blit(jlong toolkit_handle, jlong sprite_handle, jlong depth_handle, int width, int height, jboolean with_colour,
       jboolean with_depth)
      : t(from_handle<toolkit>(toolkit_handle)),
        sprite(from_optional_handle<Sprite_c>(sprite_handle)),
        depth_image(from_optional_handle<DepthBuffer_c>(depth_handle)),
        w(width),
        h(height),
        colour(is_true(with_colour) && t.colourbuffer != nullptr),
        depth(is_true(with_depth) && t.depthbuffer != nullptr) {}

  bool copies() const { return colour || depth; }

  void check(Corner on_target, Corner on_images) const {
    if (colour) contract::object(sprite);
    if (depth) contract::object(depth_image);
    if (w < 1 || h < 1) return;
    contract::rectangle_inside("target", on_target.x, on_target.y, w, h, t.width, t.height);
    if (colour) {
      contract::rectangle_inside("sprite", on_images.x, on_images.y, w, h, sprite->width, sprite->height);
    }
    if (!depth) return;
    const int depth_width = static_cast<int>(depth_image->width);
    const int depth_height = static_cast<int>(depth_image->height);
    if (colour) {
      // The sprite's width is the row length of the depth image too, whatever its own is.
      contract::rows_inside("depth", depth_width * depth_height, on_images.y * sprite->width + on_images.x,
                            sprite->width, w, h);
    } else {
      contract::rectangle_inside("depth", on_images.x, on_images.y, w, h, depth_width, depth_height);
    }
  }
};

using Operation = void(toolkit&, Sprite_c&, DepthBuffer_c&, int, int, int, int, int, int, bool, bool);

void run(Operation operation, const Blit& blit, Corner from, Corner to) {
  Sprite_c no_sprite;
  DepthBuffer_c no_depth;
  operation(blit.t, blit.colour ? *blit.sprite : no_sprite, blit.depth ? *blit.depth_image : no_depth, from.x, from.y,
            blit.w, blit.h, to.x, to.y, blit.colour, blit.depth);
}

}  // namespace

VELMARK5_NATIVE(void)
Java_o_AA(JNIEnv* env, jobject, jlong toolkit_handle, jlong sprite, jlong depth, jint x, jint y, jint w, jint h,
          jint dst_x, jint dst_y, jboolean colour, jboolean depth_too) {
  frame(env, [&] {
    const Blit blit(toolkit_handle, sprite, depth, w, h, colour, depth_too);
    if (!blit.copies()) return;
    blit.check({x, y}, {dst_x, dst_y});
    run(OffscreenSurface_c::BlitFromFramebuffer, blit, {x, y}, {dst_x, dst_y});
  });
}

VELMARK5_NATIVE(void)
Java_o_BA(JNIEnv* env, jobject, jlong toolkit_handle, jlong sprite, jlong depth, jint x, jint y, jint w, jint h,
          jint dst_x, jint dst_y, jboolean colour, jboolean depth_too) {
  frame(env, [&] {
    const Blit blit(toolkit_handle, sprite, depth, w, h, colour, depth_too);
    if (!blit.copies()) return;
    blit.check({dst_x, dst_y}, {x, y});
    run(OffscreenSurface_c::BlitToFramebuffer, blit, {x, y}, {dst_x, dst_y});
  });
}
