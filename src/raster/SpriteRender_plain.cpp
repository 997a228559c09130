// Unscaled drawing, masked and not, and the instances that have no colour target to draw on.
#include "raster/SpriteRender.h"

#define X(op, mode) VELMARK5_SPRITE_RENDER(op, mode, VELMARK5_PLAIN)
VELMARK5_SPRITE_PAIRS(X)
#undef X
#define X(op, mode) VELMARK5_SPRITE_RENDER(op, mode, VELMARK5_SCALED_UNSEEN)
VELMARK5_SPRITE_PAIRS(X)
#undef X
#define X(op, mode) VELMARK5_SPRITE_RENDER(op, mode, VELMARK5_MASKED)
VELMARK5_MASKED_RENDER_PAIR(X)
#undef X
