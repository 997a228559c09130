#include "toolkit/clippingmask.h"

clippingmask::clippingmask(memorymanager* pool, int mask_width, int mask_height, const copied_jintArrayRO& row_starts,
                           const copied_jintArrayRO& row_lengths)
    : width(mask_width),
      height(mask_height),
      starts(row_starts.toSharedarray<int>(pool)),
      lengths(row_lengths.toSharedarray<int>(pool)) {}
