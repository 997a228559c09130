// Texture coordinates: planar, cylinder, cube and sphere mappings, worked out once when a model is built. 128 units are
// one repeat of the texture.
#include <cmath>

#include "maths/mymath.h"
#include "model/mesh_views.h"
#include "model/model.h"
#include "model/texture_mapping.h"

namespace texture_mapping {

namespace {

vector minus(const Vector4_s& p, const Vector4_s& q) { return {p.x - q.x, p.y - q.y, p.z - q.z}; }

real dot(const vector& p, const vector& q) { return p.x * q.x + p.y * q.y + p.z * q.z; }

vector cross(const vector& p, const vector& q) {
  return {p.y * q.z - p.z * q.y, p.z * q.x - p.x * q.z, p.x * q.y - p.y * q.x};
}

// Row r of the matrix times the vector.
real row(const matrix& m, int r, const vector& p) { return m[3 * r] * p.x + m[3 * r + 1] * p.y + m[3 * r + 2] * p.z; }

// Arcs in single precision. Rounded from the wide functions: the narrow ones differ between the word sizes.
real narrow(real x) { return static_cast<float>(x); }
real arctangent(real y, real x) { return narrow(std::atan2(narrow(y), narrow(x))); }
real arcsine(real x) { return narrow(std::asin(narrow(x))); }

texture_coordinates turned(texture_coordinates t, int direction) {
  switch (direction) {
    case 1:
      return {-t.v, t.u};
    case 2:
      return {-t.u, -t.v};
    case 3:
      return {t.v, -t.u};
    default:
      return t;
  }
}

}  // namespace

void getmatrix(int x, int y, int z, int rotation, float sx, float sy, float sz, matrix& out) {
  // Carries the y axis to the direction: a turn about (ax, 0, az), which is level.
  const real c = y / static_cast<real>(32767);
  const real s = -std::sqrt(1 - c * c);
  const real t = 1 - c;
  const auto squares = static_cast<unsigned int>(x) * static_cast<unsigned int>(x) +
                       static_cast<unsigned int>(z) * static_cast<unsigned int>(z);
  const real l = std::sqrt(static_cast<real>(static_cast<int>(squares)));
  const real ax = l != 0 ? -z / l : 1;
  const real az = l != 0 ? x / l : 0;
  const real base[3][3] = {
      {ax * ax * t + c, az * s, az * ax * t}, {-az * s, c, ax * s}, {az * ax * t, -ax * s, az * az * t + c}};

  // Then a turn about the direction, and the scale of each row.
  const auto angle = static_cast<unsigned int>(rotation) << 6;
  const real co = mymath::cos(angle);
  const real si = mymath::sin(angle);
  for (int i = 0; i < 3; ++i) {
    out[i] = static_cast<float>((co * base[0][i] + si * base[2][i]) * sx);
    out[3 + i] = static_cast<float>(base[1][i] * sy);
    out[6 + i] = static_cast<float>((-si * base[0][i] + co * base[2][i]) * sz);
  }
}

texture_coordinates sphere_map(const vector& d, const matrix& m, int direction, float vshift) {
  const real q0 = row(m, 0, d);
  const real q1 = row(m, 1, d);
  const real q2 = row(m, 2, d);
  const real length = std::sqrt(q0 * q0 + q1 * q1 + q2 * q2);
  const real u = arctangent(q0, q2) / static_cast<real>(6.2831855f) + 0.5L;
  const real v = arcsine(q1 / length) / static_cast<real>(3.1415927f) + 0.5L + vshift;
  return turned({static_cast<float>(u), static_cast<float>(v)}, direction);
}

texture_coordinates cylinder_map(const vector& d, const matrix& m, float wrap, int direction, float vshift) {
  const real q0 = row(m, 0, d);
  const real q2 = row(m, 2, d);
  real u = arctangent(q0, q2) / static_cast<real>(6.2831855f) + 0.5L;
  if (wrap != 1.0f) u *= wrap;
  const real v = row(m, 1, d) + 0.5L + vshift;
  return turned({static_cast<float>(u), static_cast<float>(v)}, direction);
}

int getcubeface(float x, float y, float z) {
  const float ax = std::fabs(x);
  const float ay = std::fabs(y);
  const float az = std::fabs(z);
  if (ay > ax && ay > az) return y > 0 ? 0 : 1;
  if (az > ax && az > ay) return z > 0 ? 2 : 3;
  return x > 0 ? 4 : 5;
}

texture_coordinates cube_map(const vector& d, int face, const matrix& m, int direction, float tu, float tv, float tw) {
  const real r0 = row(m, 0, d);
  const real r1 = row(m, 1, d);
  const real r2 = row(m, 2, d);
  real u = 0;
  real v = tv - r1 + 0.5L;
  switch (face) {
    case 0:
      u = r0 + tu + 0.5L, v = tw - r2 + 0.5L;
      break;
    case 1:
      u = r0 + tu + 0.5L, v = r2 + tw + 0.5L;
      break;
    case 2:
      u = tu - r0 + 0.5L;
      break;
    case 3:
      u = r0 + tu + 0.5L;
      break;
    case 4:
      u = r2 + tw + 0.5L;
      break;
    default:
      u = tw - r2 + 0.5L;
      break;
  }
  return turned({static_cast<float>(u), static_cast<float>(v)}, direction);
}

namespace {

using corners = texture_coordinates[3];

// M of the plane lands at (1, 0), N at (0, 1).
void plane_map(const Vector4_s* const at[3], const Vector4_s& P, const Vector4_s& M, const Vector4_s& N, corners& out) {
  const vector m = minus(M, P);
  const vector n = minus(N, P);
  const vector w = cross(m, n);
  const vector q = cross(n, w);
  const vector r = cross(m, w);
  for (int k = 0; k < 3; ++k) {
    const vector corner = minus(*at[k], P);
    out[k] = {static_cast<float>(dot(corner, q) / dot(m, q)), static_cast<float>(dot(corner, r) / dot(n, r))};
  }
}

// Pulls the second and third corner to the first one's side of the seam.
void fix_seam(corners& c, float period, bool second_coordinate) {
  const auto coordinate = [second_coordinate](texture_coordinates& t) -> float& {
    return second_coordinate ? t.v : t.u;
  };
  const float first = coordinate(c[0]);
  for (int k = 1; k < 3; ++k) {
    float& x = coordinate(c[k]);
    if (x - first > period / 2) {
      x -= period;
    } else if (first - x > period / 2) {
      x += period;
    }
  }
}

// The side of the cube that a face looks at, from its normal in the mapping's unscaled axes.
int cube_side(const Vector4_s* const at[3], const matrix& m, float sx, float sy, float sz) {
  const vector n = cross(minus(*at[1], *at[0]), minus(*at[2], *at[0]));
  return getcubeface(static_cast<float>(row(m, 0, n) / sx), static_cast<float>(row(m, 1, n) / sy),
                     static_cast<float>(row(m, 2, n) / sz));
}

}  // namespace

}  // namespace texture_mapping

namespace {

using texture_mapping::matrix;

enum mapping_kind { plane = 0, cylinder = 1, cube = 2 };

struct box {
  float low[3], high[3];
};

// What is prepared once for each mapping that is no plane.
struct prepared_mapping {
  float centre[3];
  matrix axes;
};

// The box of each mapping over the corners of its faces, dropped ones too.
void widen(box& b, const Vector4_s& p) {
  const float position[3] = {p.x, p.y, p.z};
  for (int axis = 0; axis < 3; ++axis) {
    if (position[axis] < b.low[axis]) b.low[axis] = position[axis];
    if (position[axis] > b.high[axis]) b.high[axis] = position[axis];
  }
}

// How a mapping scales the axes of its matrix.
void axis_scales(const mesh_views& mesh, int m, float (&scale)[3]) {
  const auto sx = static_cast<float>(mesh.mappingscalex.elements[m]);
  const auto sy = static_cast<float>(mesh.mappingscaley.elements[m]);
  const auto sz = static_cast<float>(mesh.mappingscalez.elements[m]);
  switch (mesh.mappingtype.elements[m]) {
    case cylinder:
      scale[0] = sx < 0 ? -sx / 1024 : 1;
      scale[1] = 64 / sy;
      scale[2] = sx > 0 ? sx / 1024 : 1;
      break;
    case cube:
      scale[0] = 64 / sx;
      scale[1] = 64 / sy;
      scale[2] = 64 / sz;
      break;
    default:
      scale[0] = sx / 1024;
      scale[1] = sy / 1024;
      scale[2] = sz / 1024;
      break;
  }
}

prepared_mapping prepare(const mesh_views& mesh, int m, const box& b) {
  prepared_mapping mapping;
  for (int axis = 0; axis < 3; ++axis) mapping.centre[axis] = (b.low[axis] + b.high[axis]) * 0.5f;
  float scale[3];
  axis_scales(mesh, m, scale);
  texture_mapping::getmatrix(mesh.mappingp.elements[m], mesh.mappingm.elements[m], mesh.mappingn.elements[m],
                             mesh.mappingrotation.elements[m], scale[0], scale[1], scale[2], mapping.axes);
  return mapping;
}

void map_corners(const mesh_views& mesh, int m, const prepared_mapping& mapping, const Vector4_s* const at[3],
                 texture_mapping::corners& out) {
  const int kind = mesh.mappingtype.elements[m];
  const int direction = mesh.mappingdirection.elements[m];
  const float tx = static_cast<float>(mesh.mappingtranslatex.elements[m]) / 256;
  const float ty = static_cast<float>(mesh.mappingtranslatey.elements[m]) / 256;
  const float tz = static_cast<float>(mesh.mappingtranslatez.elements[m]) / 256;
  const float wrap = static_cast<float>(mesh.mappingscalez.elements[m]) / 1024;
  float scale[3];
  axis_scales(mesh, m, scale);
  const int side = kind == cube ? texture_mapping::cube_side(at, mapping.axes, scale[0], scale[1], scale[2]) : 0;
  for (int k = 0; k < 3; ++k) {
    const texture_mapping::vector d{at[k]->x - mapping.centre[0], at[k]->y - mapping.centre[1],
                                    at[k]->z - mapping.centre[2]};
    if (kind == cylinder) {
      out[k] = texture_mapping::cylinder_map(d, mapping.axes, wrap, direction, tx);
    } else if (kind == cube) {
      out[k] = texture_mapping::cube_map(d, side, mapping.axes, direction, tx, ty, tz);
    } else {
      out[k] = texture_mapping::sphere_map(d, mapping.axes, direction, tx);
    }
  }
  if (kind != cube) texture_mapping::fix_seam(out, kind == cylinder ? wrap : 1.0f, (direction & 1) != 0);
}

}  // namespace

void model::calculatetexturecoords(const mesh_views& mesh, const face_map& facemap) {
  if (mesh.ftex.array == nullptr || texfacecount == 0) return;
  ftex = sharedarray<unsigned short>::allocate(*pool, texfacecount);
  fuv0 = sharedarray<texture_coordinates>::allocate(*pool, texfacecount);
  fuv1 = sharedarray<texture_coordinates>::allocate(*pool, texfacecount);
  fuv2 = sharedarray<texture_coordinates>::allocate(*pool, texfacecount);

  const auto is_textured = [&](int i) { return facemap[i] >= 0 && facemap[i] < texfacecount; };
  const auto store = [&](int e, texture_coordinates a, texture_coordinates b, texture_coordinates c) {
    fuv0[e] = a;
    fuv1[e] = b;
    fuv2[e] = c;
  };
  if (mesh.fmapping.array == nullptr) {
    for (int i = 0; i < mesh.inputfacecount; ++i) {
      if (!is_textured(i)) continue;
      ftex[facemap[i]] = static_cast<unsigned short>(mesh.ftex.elements[i]);
      store(facemap[i], {0, 127}, {127, 127}, {0, 0});
    }
    return;
  }

  constexpr int default_mapping = 255;
  const auto mapping_of = [&](int i) {
    return static_cast<int>(static_cast<unsigned char>(mesh.fmapping.elements[i]));
  };
  const auto mappings = static_cast<unsigned int>(mesh.mappingcount > 0 ? mesh.mappingcount : 0);

  // The temporaries' number depends on the client, so they stand in the pool.
  const auto boxes = sharedarray<box>::allocate(*pool, mappings);
  const auto prepared = sharedarray<prepared_mapping>::allocate(*pool, mappings);
  for (unsigned int m = 0; m < mappings; ++m) boxes.data()[m] = {{2e9f, 2e9f, 2e9f}, {-2e9f, -2e9f, -2e9f}};
  for (int i = 0; i < mesh.inputfacecount; ++i) {
    if (mapping_of(i) == default_mapping) continue;
    box& b = boxes[mapping_of(i)];
    widen(b, vpos[mesh.a.elements[i]]);
    widen(b, vpos[mesh.b.elements[i]]);
    widen(b, vpos[mesh.c.elements[i]]);
  }
  for (int m = 0; m < static_cast<int>(mappings); ++m) {
    if (mesh.mappingtype.elements[m] > plane) prepared[m] = prepare(mesh, m, boxes[m]);
  }

  for (int i = 0; i < mesh.inputfacecount; ++i) {
    if (!is_textured(i)) continue;
    const int e = facemap[i];
    ftex[e] = static_cast<unsigned short>(mesh.ftex.elements[i]);
    if (ftex[e] == no_texture) continue;
    const int m = mapping_of(i);
    if (m == default_mapping) {
      store(e, {0, 128}, {128, 128}, {0, 0});
      continue;
    }
    const Vector4_s* const at[3] = {&vpos[mesh.a.elements[i]], &vpos[mesh.b.elements[i]], &vpos[mesh.c.elements[i]]};
    texture_mapping::corners c = {};
    if (mesh.mappingtype.elements[m] == plane) {
      texture_mapping::plane_map(at, vpos[mesh.mappingp.elements[m]], vpos[mesh.mappingm.elements[m]],
                                 vpos[mesh.mappingn.elements[m]], c);
    } else if (mesh.mappingtype.elements[m] > plane) {
      map_corners(mesh, m, prepared[m], at, c);
    }
    const auto scaled = [](texture_coordinates t) { return texture_coordinates{t.u * 128, t.v * 128}; };
    store(e, scaled(c[0]), scaled(c[1]), scaled(c[2]));
  }
}
