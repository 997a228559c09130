// Finding what lies behind all that is drawn already, before it is lit and set up.
#pragma once

#include "maths/SSEMath.h"
#include "raster/Triangle.h"

namespace Rasterizer_n {

// The lowest and the highest screen x, screen y and depth of some points, by lane; the last lane is not read.
struct ScreenBox_s {
  SSEMath::Float4 low, high;
};

// True if everything in the box lies behind what the depth target holds there. False says nothing. Needs a depth
// target.
bool IsCovered(const ScreenBox_s& box);

// True if the pixels of a triangle and their depths stay in the box of its vertices, as far as IsCovered looks at it.
// Approximate slopes can leave it: large, narrow and odd triangles give false.
bool StaysInBox(const Triangle_s& triangle);

// True if drawing the triangle with depth test would change nothing: it stays in the box of its vertices, and that is
// covered. Reads its vertices alone. Another thread may be drawing to pixels of the box that are not the triangle's:
// whatever is read there, the answer is right.
bool IsHidden(const Triangle_s& triangle);

}  // namespace Rasterizer_n
