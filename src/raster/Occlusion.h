// Finding triangles that lie behind what is drawn already, before they are lit and set up.
#pragma once

#include "raster/Triangle.h"

namespace Rasterizer_n {

// True if no pixel of the triangle would pass the depth test against what the depth target holds now: drawing it with
// depth test would change nothing. Reads its vertices alone. False says nothing: large, narrow and odd triangles are
// not looked at, and of the others the whole bounding box must lie nearer than the nearest vertex. Needs a depth
// target.
bool IsHidden(const Triangle_s& triangle);

}  // namespace Rasterizer_n
