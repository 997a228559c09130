// Scaled drawing.
#include "raster/SpriteRender.h"

#define X(op, mode) VELMARK5_SPRITE_RENDER(op, mode, VELMARK5_SCALED)
VELMARK5_SPRITE_PAIRS(X)
#undef X
