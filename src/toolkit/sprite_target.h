// The current target as sprites see it.
#pragma once

#include "raster/Rasterizer.h"
#include "raster/Sprite.h"
#include "toolkit/clippingmask.h"
#include "toolkit/toolkit.h"

// Sprites draw to the raster stage's buffers, inside the toolkit's clip rectangle. colour is null when sprites have no
// colour target, depth when they have no depth target: both the toolkit and the raster stage must have the buffer.
inline SpriteTarget_s sprite_target(const toolkit& t) {
  return {t.colourbuffer != nullptr ? Rasterizer_n::m_pColourBuffer : nullptr,
          t.depthbuffer != nullptr ? Rasterizer_n::m_pDepthBuffer : nullptr,
          Rasterizer_n::m_ScreenPitch,
          t.clip_x0,
          t.clip_y0,
          t.clip_x1,
          t.clip_y1};
}

// Good until the next allocation from the mask's pool.
inline SpanMask_s span_mask(const clippingmask& mask) {
  return {mask.width, mask.height, mask.rows(), mask.starts.data(), mask.lengths.data()};
}
