// Triangles the slow way: setup and span filling for modes given at run time, one vertex, one row and one pixel at a
// time. Draws into the same process-wide target as the library and uses the processor's own reciprocal estimate, so
// that whole targets can be compared bit for bit.
#pragma once

#include <compare>

#include "raster/Triangle.h"

namespace oracle {

// The parameters of a triangle instance as plain numbers.
struct TriangleModes {
  int shade;    // -1 byte mask, 0 flat, 1 smooth, 2 textured, 3 three textures
  int address;  // 0 and 1 wrap, 2 clamps
  bool transform;
  int fog;    // 0 none, 1 height, 2 distance, 3 both
  int blend;  // 0 opaque, 2 per-pixel alpha, 3 constant alpha
  bool colour_key;
  bool light_map;
  bool depth_write;
  bool colour_write;
  bool depth_test;

  auto operator<=>(const TriangleModes&) const = default;
};

void render_triangle(const TriangleModes& modes, const Rasterizer_n::Triangle_s& triangle);

}  // namespace oracle
