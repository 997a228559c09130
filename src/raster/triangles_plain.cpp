#include "raster/RenderTriangle.h"
#include "raster/triangle_instances.h"

VELMARK5_PLAIN_TRIANGLES(VELMARK5_INSTANTIATE_TRIANGLE)
