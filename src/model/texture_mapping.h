// The arithmetic of the texture mappings: from a point, given relative to the mapping's centre, to coordinates in
// repeats of the texture. Angles and scales are the client's.
#pragma once

#include "model/model.h"

namespace texture_mapping {

using real = long double;

struct vector {
  real x, y, z;
};

using matrix = float[9];  // three rows

// The rotation that carries the y axis to the direction (x, y, z; 32767 is 1), turned about it by rotation * 64 angle
// units, with its rows scaled.
void getmatrix(int x, int y, int z, int rotation, float sx, float sy, float sz, matrix& out);

// direction: quarter turns of the coordinates, 0 to 3. vshift, tu, tv, tw: offsets in repeats. wrap: repeats around.
texture_coordinates sphere_map(const vector& d, const matrix& m, int direction, float vshift);
texture_coordinates cylinder_map(const vector& d, const matrix& m, float wrap, int direction, float vshift);
texture_coordinates cube_map(const vector& d, int face, const matrix& m, int direction, float tu, float tv, float tw);

// The side of a cube: 0 and 1 for y, 2 and 3 for z, 4 and 5 for x, the first of each pair above 0. Ties go to x.
int getcubeface(float x, float y, float z);

}  // namespace texture_mapping
