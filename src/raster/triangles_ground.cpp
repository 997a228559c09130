#include "raster/RenderTriangle.h"
#include "raster/triangle_instances.h"

VELMARK5_GROUND_TRIANGLES(VELMARK5_INSTANTIATE_TRIANGLE)
