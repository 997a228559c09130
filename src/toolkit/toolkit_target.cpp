// What the toolkit draws into: a canvas, or a sprite and a depth image.
#include "raster/DepthBuffer.h"
#include "raster/Rasterizer.h"
#include "raster/Sprite.h"
#include "toolkit/canvas.h"
#include "toolkit/toolkit.h"

void toolkit::set_active_canvas(canvas* c) {
  offscreen_sprite = nullptr;
  if (c == nullptr) {
    // The toolkit's own fields keep their values: only the raster stage loses its target.
    setup_backbuffer(nullptr, nullptr, 0, 0, 0);
    return;
  }
  colourbuffer = c->colourbuffer;
  depthbuffer = c->depthbuffer;
  width = c->width;
  height = c->height;
  resetclipping();
  setup_backbuffer(colourbuffer, depthbuffer, 0, 0, width);
  rect_fill(clip_x0, clip_y0, clip_x1 - clip_x0, clip_y1 - clip_y0, 0, 0);
  zbuffer_clear(clip_x0, clip_y0, clip_x1 - clip_x0, clip_y1 - clip_y0, Rasterizer_n::far_depth);
}

void toolkit::setup_backbuffer(unsigned int* colour, float* depth, int, int, int pitch) {
  Rasterizer_n::m_pColourBuffer = colour;
  Rasterizer_n::m_pDepthBuffer = depth;
  Rasterizer_n::m_ScreenPitch = pitch;
  resetviewport();
}

void toolkit::start_offscreen_render(Sprite_c* sprite, DepthBuffer_c* depth) {
  offscreen_sprite = sprite;
  offscreen_depth = depth;
  int pitch = 0;
  colourbuffer = nullptr;
  if (sprite != nullptr) {
    width = sprite->width;
    height = sprite->height;
    colourbuffer = sprite->pixels;
    pitch = sprite->pitch;
  } else if (depth != nullptr) {
    width = static_cast<int>(depth->width);
    height = static_cast<int>(depth->height);
    pitch = width;
  }
  depthbuffer = depth != nullptr ? depth->depth : nullptr;
  resetclipping();
  setup_backbuffer(colourbuffer, depthbuffer, 0, 0, pitch);
}

void toolkit::resetviewport() {
  Rasterizer_n::Viewport_s viewport = *Rasterizer_n::GetViewport();
  viewport.x = 0;
  viewport.y = 0;
  viewport.width = width;
  viewport.height = height;
  Rasterizer_n::SetViewport(viewport);
}

void toolkit::set_zwrite(bool enable) {
  zwrite = enable;
  Rasterizer_n::SetZWrite(enable);
}
