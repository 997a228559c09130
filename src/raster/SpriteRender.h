// Sprite_c::Render: placement, clipping and scaling. Included by the sources that make its instances.
#pragma once

#include <algorithm>
#include <cstdint>

#include "raster/SpriteInstances.h"
#include "raster/SpritePixels.h"
#include "raster/SpritePlacement.h"
#include "raster/SpriteScaling.h"

namespace sprite_render {

// --- Unscaled -------------------------------------------------------------------------------------------------------

template <ColourOp_e Op, BlendMode_e Blend>
void plain(const Sprite_c& sprite, const RenderParams_s& params, const SpriteTarget_s& target) {
  const Visible part = visible_part(i64{params.x} + sprite.left, i64{params.y} + sprite.top, sprite.width,
                                    sprite.height, clip_of(target));
  if (part.empty()) return;
  const sprite_pixels::Operation<Op> operation(params.colour);
  const unsigned int* from = sprite.pixels + part.skipped_y * sprite.pitch + part.skipped_x;
  unsigned int* to = target.colour + pixel_index(part.x, part.y, target.pitch);
  for (int rows = part.height; rows > 0; --rows, from += sprite.pitch, to += target.pitch) {
    if (rows > 2) sprite_pixels::fetch_ahead(to + 2 * std::ptrdiff_t{target.pitch}, part.width);
    sprite_pixels::draw_image_run<Blend>(to, part.width, sprite_pixels::Operated{operation, sprite_pixels::Row{from}});
  }
}

template <ColourOp_e Op, BlendMode_e Blend>
void masked(const Sprite_c& sprite, const RenderParams_s& params, const SpriteTarget_s& target) {
  const SpanMask_s& mask = *params.mask;
  Bounds clip = clip_of(target);
  clip.x0 = std::max<i64>(clip.x0, params.maskx);
  clip.y0 = std::max<i64>(clip.y0, params.masky);
  clip.x1 = std::min(clip.x1, i64{params.maskx} + mask.width);
  clip.y1 = std::min(clip.y1, i64{params.masky} + mask.height);
  const Visible part =
      visible_part(i64{params.x} + sprite.left, i64{params.y} + sprite.top, sprite.width, sprite.height, clip);
  if (part.empty()) return;
  const sprite_pixels::Operation<Op> operation(params.colour);
  const unsigned int* from = sprite.pixels + part.skipped_y * sprite.pitch + part.skipped_x;
  unsigned int* to = target.colour + pixel_index(part.x, part.y, target.pitch);
  for (int j = 0; j < part.height; ++j, from += sprite.pitch, to += target.pitch) {
    const Span span = span_of_row(mask, params.maskx, params.masky, part.y + j, {part.x, i64{part.x} + part.width});
    if (span.to <= span.from) continue;
    const i64 skip = span.from - part.x;
    sprite_pixels::draw_image_run<Blend>(to + skip, static_cast<int>(span.to - span.from),
                                         sprite_pixels::Operated{operation, sprite_pixels::Row{from + skip}});
  }
}

// --- Scaled ---------------------------------------------------------------------------------------------------------

template <ColourOp_e Op, BlendMode_e Blend, bool Tested>
void scaled(const Sprite_c& sprite, const RenderParams_s& params, const SpriteTarget_s& target) {
  const Scale scale = scale_of(sprite, params, target);
  const Visible& part = scale.part;
  if (part.empty()) return;
  const sprite_pixels::Operation<Op> operation(params.colour);
  ScaledRows rows(sprite, scale);
  const std::ptrdiff_t pitch = target.pitch;
  while (rows.next_strip()) {
    const int n = rows.width();
    unsigned int* to = target.colour + pixel_index(rows.x(), part.y, target.pitch);
    for (int left = part.height; left > 0;) {
      // The same image row may show in several rows of the target: they are drawn by twos.
      const int twice = rows.next_rows(Tested ? 1 : 2) == 2;
      for (int ahead = 2; ahead <= 2 + twice && ahead < left; ++ahead)
        sprite_pixels::fetch_ahead(to + ahead * pitch, n);
      sprite_pixels::Operated source{operation, sprite_pixels::Row{rows.pixels()}};
      if constexpr (Tested) {
        sprite_pixels::draw_run_tested<Blend>(to, target.depth + (to - target.colour), SSEMath::splat(params.z), n,
                                              source);
      } else if (twice) {
        sprite_pixels::draw_run<Blend, 2>(to, n, source, pitch);
      } else {
        sprite_pixels::draw_run<Blend>(to, n, source);
      }
      left -= 1 + twice;
      to += (1 + twice) * pitch;
    }
  }
}

}  // namespace sprite_render

template <ColourOp_e Op, BlendMode_e Blend, bool Scaled, bool Masked, bool HasColour, bool HasDepth>
void Sprite_c::Render(const RenderParams_s& params, const SpriteTarget_s& target) const {
  // Without a colour target the placement is found for nothing: a sprite writes no depth.
  if constexpr (!HasColour) {
    return;
  } else if constexpr (Scaled) {
    sprite_render::scaled<Op, Blend, HasDepth>(*this, params, target);
  } else if constexpr (Masked) {
    sprite_render::masked<Op, Blend>(*this, params, target);
  } else {
    sprite_render::plain<Op, Blend>(*this, params, target);
  }
}

// An instance of one pair in one placement.
#define VELMARK5_SPRITE_RENDER(op, mode, ...)                                                                  \
  template void Sprite_c::Render<ColourOp_e::op, BlendMode_e::mode, __VA_ARGS__>(const RenderParams_s& params, \
                                                                                 const SpriteTarget_s& target) const;
