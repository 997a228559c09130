// Sprite_c::Render: placement, clipping and scaling. Included by the sources that make its instances.
#pragma once

#include <algorithm>
#include <cstdint>

#include "raster/SpriteInstances.h"
#include "raster/SpritePixels.h"
#include "raster/SpritePlacement.h"

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

// Where the stored pixels go when the full image is scaled, and how far to step in the image per target pixel.
struct Scale {
  Visible part;
  long double ratio_x;  // target pixels per column
  float step_x, step_y;
  i64 start;  // linear position of the first pixel
};

inline Scale scale_of(const Sprite_c& sprite, const RenderParams_s& params, const SpriteTarget_s& target) {
  Scale scale{};
  if (sprite.width < 1 || sprite.height < 1) return scale;

  // The margins scale with the image and are cut to whole pixels, each by itself.
  const long double factor_x =
      static_cast<long double>(params.width) / (i64{sprite.left} + sprite.width + sprite.right);
  const long double factor_y =
      static_cast<long double>(params.height) / (i64{sprite.top} + sprite.height + sprite.bottom);
  const i64 left = truncate(static_cast<long double>(sprite.left) * factor_x);
  const i64 top = truncate(static_cast<long double>(sprite.top) * factor_y);
  const i64 right = truncate(static_cast<long double>(sprite.right) * factor_x);
  const i64 bottom = truncate(static_cast<long double>(sprite.bottom) * factor_y);
  const i64 width = params.width - left - right;
  const i64 height = params.height - top - bottom;
  if (width < 1 || height < 1) return scale;
  scale.part = visible_part(params.x + left, params.y + top, width, height, clip_of(target));
  if (scale.part.empty()) return scale;

  scale.ratio_x = static_cast<long double>(width) / sprite.width;
  const long double ratio_y = static_cast<long double>(height) / sprite.height;
  scale.step_x = static_cast<float>(1 / scale.ratio_x);
  scale.step_y = static_cast<float>(1 / ratio_y);
  scale.start = i64{truncate(static_cast<long double>(scale.part.skipped_y) / ratio_y)} * sprite.pitch +
                truncate(static_cast<long double>(scale.part.skipped_x) / scale.ratio_x);
  return scale;
}

// The image columns of a run of target columns, relative to its first. Groups of four add their step up in float; what
// is left at the end of the run divides, and may so differ by one.
class ColumnSteps {
 public:
  ColumnSteps(const Scale& scale) : ratio(scale.ratio_x), columns(scale.part.width), at(0) {
    using namespace SSEMath;
    lanes = splat(scale.step_x) * floats(0, 1, 2, 3);
    advance = splat(4 * scale.step_x);
  }

  // The next n columns; all but the last call take a multiple of four.
  void take(int* column, int n) {
    using namespace SSEMath;
    int i = 0;
    for (; i + 4 <= n; i += 4, lanes += advance) {
      store_unaligned(reinterpret_cast<std::uint32_t*>(column + i), SSEMath::truncate(lanes));
    }
    for (; i < n; ++i) column[i] = sprite_render::truncate((at + i) / ratio);
    at += n;
  }

  int remaining() const { return columns - at; }

 private:
  long double ratio;
  int columns, at;
  SSEMath::Float4 lanes, advance;
};

template <ColourOp_e Op, BlendMode_e Blend, bool Tested>
void scaled(const Sprite_c& sprite, const RenderParams_s& params, const SpriteTarget_s& target) {
  const Scale scale = scale_of(sprite, params, target);
  const Visible& part = scale.part;
  if (part.empty()) return;
  const sprite_pixels::Operation<Op> operation(params.colour);
  const i64 last = i64{sprite.height - 1} * sprite.pitch + sprite.width - 1;

  // The columns to take are the same in every row, so they are found once for a strip of the target. The strip's part
  // of an image row is fetched, and meets the colour, only when the row changes.
  using Prepared = sprite_pixels::Prepared<Blend>;
  Prepared prepared;
  int column[Prepared::capacity];
  const auto prepare = [&](const unsigned int* from, const int* indices, int n) {
    const auto* unsigned_indices = reinterpret_cast<const unsigned int*>(indices);
    prepared.put(n, sprite_pixels::Operated{operation, sprite_pixels::Columns{from, unsigned_indices}});
  };
  ColumnSteps steps(scale);
  for (int x = part.x; steps.remaining() > 0; x += Prepared::capacity) {
    const int n = std::min(Prepared::capacity, steps.remaining());
    steps.take(column, n);
    const auto [first_column, last_column] = std::minmax_element(column, column + n);
    const i64 lowest = *first_column;
    const i64 highest = *last_column;

    std::ptrdiff_t at = pixel_index(x, part.y, target.pitch);
    float row = 0;
    i64 prepared_from = -1;
    for (int j = 0; j < part.height; ++j, at += target.pitch, row += scale.step_y) {
      if (j + 2 < part.height) sprite_pixels::fetch_ahead(target.colour + at + 2 * std::ptrdiff_t{target.pitch}, n);
      const i64 from = scale.start + i64{sprite.pitch} * SSEMath::truncate(row);
      if (from != prepared_from || j == 0) {
        if (from >= 0 && lowest >= 0 && from + highest <= last) {
          prepare(sprite.pixels + from, column, n);
        } else {
          // Steps that add up past the image's last pixel take that pixel.
          int inside[Prepared::capacity];
          for (int i = 0; i < n; ++i) inside[i] = static_cast<int>(std::clamp<i64>(from + column[i], 0, last));
          prepare(sprite.pixels, inside, n);
        }
        prepared_from = from;
      }
      if constexpr (Tested) {
        sprite_pixels::draw_run_tested<Blend>(target.colour + at, target.depth + at, SSEMath::splat(params.z), n,
                                              prepared);
      } else {
        sprite_pixels::draw_run<Blend>(target.colour + at, n, prepared);
      }
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
