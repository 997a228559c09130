#include "model/model_variants.h"

#include "model/model.h"

model::render_variant model::select_variant(bool pointlit, bool distancefog, bool heightfog, bool colour, bool depth) {
#define CHOOSE(p, d, h, c, z)                                                           \
  if (pointlit == p && distancefog == d && heightfog == h && colour == c && depth == z) \
    return &model::render2<p, d, h, c, z>;
  VELMARK5_MODEL_VARIANTS(CHOOSE)
#undef CHOOSE
  return nullptr;
}
