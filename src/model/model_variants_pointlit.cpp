// The variants with point lights.
#include "model/model_render2.h"
#include "model/model_variants.h"

#define INSTANTIATE(...) template void model::render2<__VA_ARGS__>(threadresource&, const Matrix_c&, const Matrix_c&);
VELMARK5_MODEL_VARIANTS_POINTLIT(INSTANTIATE)
