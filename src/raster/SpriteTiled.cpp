// Sprite_c::RenderTiled: an area filled with copies of the image, each a full image wide and high.
#include "raster/SpriteInstances.h"
#include "raster/SpritePlacement.h"

namespace sprite_render {

namespace {

// Tiles from first to last (exclusive) of one row or column of tiles.
struct Tiles {
  i64 first, last;
};

// Those of the tiles that cover `extent` whose stored pixels can be seen: tile i has its pixels at
// origin + i * full + margin.
Tiles visible_tiles(i64 origin, i64 extent, i64 full, i64 margin, i64 stored, i64 clip_from, i64 clip_to) {
  const i64 all = (extent + full - 1) / full;
  const i64 before = clip_from - (origin + margin + stored);  // a tile that ends here or earlier is not seen
  const i64 until = clip_to - (origin + margin);              // nor one that begins here or later
  return {before < 0 ? 0 : before / full + 1, until <= 0 ? 0 : std::min(all, (until + full - 1) / full)};
}

bool is_coordinate(i64 value) {
  return value >= std::numeric_limits<int>::min() && value <= std::numeric_limits<int>::max();
}

}  // namespace

template <ColourOp_e Op, BlendMode_e Blend>
void tiled(const Sprite_c& sprite, const RenderParams_s& params, SpriteTarget_s target) {
  const i64 full_width = i64{sprite.left} + sprite.width + sprite.right;
  const i64 full_height = i64{sprite.top} + sprite.height + sprite.bottom;
  const i64 right = std::min<i64>(target.clip_x1, i64{params.x} + params.width);
  const i64 bottom = std::min<i64>(target.clip_y1, i64{params.y} + params.height);
  if (full_width < 1 || full_height < 1 || right <= target.clip_x0 || bottom <= target.clip_y0) return;
  // The area cuts at its right and bottom; nothing is drawn left of or above its origin but by negative margins.
  target.clip_x1 = static_cast<int>(right);
  target.clip_y1 = static_cast<int>(bottom);

  const Tiles columns =
      visible_tiles(params.x, params.width, full_width, sprite.left, sprite.width, target.clip_x0, right);
  const Tiles rows =
      visible_tiles(params.y, params.height, full_height, sprite.top, sprite.height, target.clip_y0, bottom);
  RenderParams_s tile;
  tile.colour = params.colour;
  for (i64 row = rows.first; row < rows.last; ++row) {
    for (i64 column = columns.first; column < columns.last; ++column) {
      const i64 x = params.x + column * full_width;
      const i64 y = params.y + row * full_height;
      if (!is_coordinate(x) || !is_coordinate(y)) continue;
      tile.x = static_cast<int>(x);
      tile.y = static_cast<int>(y);
      sprite.Render<Op, Blend, VELMARK5_PLAIN>(tile, target);
    }
  }
}

}  // namespace sprite_render

template <ColourOp_e Op, BlendMode_e Blend>
void Sprite_c::RenderTiled(const RenderParams_s& params, const SpriteTarget_s& target) const {
  sprite_render::tiled<Op, Blend>(*this, params, target);
}

#define X(op, mode)                                                                                    \
  template void Sprite_c::RenderTiled<ColourOp_e::op, BlendMode_e::mode>(const RenderParams_s& params, \
                                                                         const SpriteTarget_s& target) const;
VELMARK5_SPRITE_PAIRS(X)
#undef X
