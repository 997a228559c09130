// The instances of each family of sprite drawing, stated once. The sources that define a family expand these tables
// into its instances, and the selections below expand them into the chains that choose one at run time.
#pragma once

#include "raster/Sprite.h"

// Colour operation and blend: 15 pairs, which every family has.
#define VELMARK5_SPRITE_PAIRS(X) \
  X(modulate, replace)           \
  X(modulate, alpha)             \
  X(modulate, additive)          \
  X(none, replace)               \
  X(none, alpha)                 \
  X(none, additive)              \
  X(mix, replace)                \
  X(mix, alpha)                  \
  X(mix, additive)               \
  X(add, replace)                \
  X(add, alpha)                  \
  X(add, additive)               \
  X(subtract, replace)           \
  X(subtract, alpha)             \
  X(subtract, additive)

// Render, 61 instances. Every pair in the four placements of the table, and one pair masked:
//
//   Scaled, Masked, HasColour, HasDepth     pairs   source
#define VELMARK5_PLAIN false, false, true, false         //  15      SpriteRender_plain.cpp
#define VELMARK5_SCALED true, false, true, false         //  15      SpriteRender_scaled.cpp
#define VELMARK5_SCALED_TESTED true, false, true, true   //  15      SpriteRender_tested.cpp
#define VELMARK5_SCALED_UNSEEN true, false, false, true  //  15      SpriteRender_plain.cpp
#define VELMARK5_MASKED_RENDER_PAIR(X) X(none, alpha)
#define VELMARK5_MASKED false, true, true, false  //   1      SpriteRender_plain.cpp

// RenderParallelogram, 17 instances: every pair unmasked, and these two masked.
#define VELMARK5_MASKED_PARALLELOGRAM_PAIRS(X) \
  X(none, replace)                             \
  X(none, alpha)

// RenderTiled, 15 instances: every pair.

namespace sprite_select {

using Render = void (Sprite_c::*)(const RenderParams_s&, const SpriteTarget_s&) const;
using RenderParallelogram = void (Sprite_c::*)(const ParallelogramRenderParams&, const SpriteTarget_s&) const;

#define VELMARK5_CHOOSE(op, mode, ...)                                                              \
  if (colourop == static_cast<int>(ColourOp_e::op) && blend == static_cast<int>(BlendMode_e::mode)) \
    return &Sprite_c::__VA_ARGS__;

// The instance for a colour operation and a blend given as integers; null for values that are neither.
template <bool Scaled, bool Masked, bool HasColour, bool HasDepth>
Render render(int colourop, int blend) {
#define X(op, mode) \
  VELMARK5_CHOOSE(op, mode, Render<ColourOp_e::op, BlendMode_e::mode, Scaled, Masked, HasColour, HasDepth>)
  VELMARK5_SPRITE_PAIRS(X)
#undef X
  return nullptr;
}

inline RenderParallelogram parallelogram(int colourop, int blend) {
#define X(op, mode) VELMARK5_CHOOSE(op, mode, RenderParallelogram<ColourOp_e::op, BlendMode_e::mode, false>)
  VELMARK5_SPRITE_PAIRS(X)
#undef X
  return nullptr;
}

inline Render tiled(int colourop, int blend) {
#define X(op, mode) VELMARK5_CHOOSE(op, mode, RenderTiled<ColourOp_e::op, BlendMode_e::mode>)
  VELMARK5_SPRITE_PAIRS(X)
#undef X
  return nullptr;
}

#undef VELMARK5_CHOOSE

}  // namespace sprite_select
