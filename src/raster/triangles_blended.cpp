#include "raster/RenderTriangle.h"
#include "raster/triangle_instances.h"

VELMARK5_BLENDED_TRIANGLES(VELMARK5_INSTANTIATE_TRIANGLE)
