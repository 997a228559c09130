#include "reference/model_oracle.h"

#include <algorithm>
#include <cmath>

#include "maths/colourutils.h"
#include "maths/mymath.h"
#include "raster/Rasterizer.h"
#include "reference/numbers.h"
#include "reference/triangle_oracle.h"
#include "toolkit/toolkit.h"

using namespace Rasterizer_n;

namespace oracle {
namespace {

using real = long double;
real single(real x) { return static_cast<float>(x); }

toolkit& kit() { return *toolkit::m_pInstance; }
const texturemetrics* metrics(std::int16_t id) { return kit().textures->getmetrics(static_cast<unsigned short>(id)); }

struct Real3 {
  real x, y, z;
};
Real3 point(const Vector4_s& p) { return {p.x, p.y, p.z}; }
Real3 operator-(Real3 a, Real3 b) { return {a.x - b.x, a.y - b.y, a.z - b.z}; }
real dot(Real3 a, Real3 b) { return a.x * b.x + a.y * b.y + a.z * b.z; }
Real3 cross(Real3 a, Real3 b) { return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x}; }

// Members that are not negative, by their labels.
Labels group(const std::vector<int>& label, const std::vector<int>& member) {
  Labels groups;
  const int items = static_cast<int>(label.size());
  int highest = 0;
  for (int i = 0; i < items; ++i) highest = std::max(highest, member[i] < 0 ? 0 : label[i]);
  for (int l = 0; l <= highest; ++l) {
    const auto start = static_cast<int>(groups.members.size());
    for (int i = 0; i < items; ++i) {
      if (label[i] == l && member[i] >= 0) groups.members.push_back(static_cast<unsigned short>(member[i]));
    }
    groups.rows.insert(groups.rows.end(), {start, static_cast<int>(groups.members.size()) - start});
  }
  return groups;
}

// --- Texture mappings -----------------------------------------------------------------------------------------------

// A mapping that is no plane.
struct Mapping {
  Mapping(const Mesh& mesh, int m);

  // `from` as seen along the mapping's own axes.
  real along(int axis, Real3 from) const { return dot(rows[axis], from); }

  int type, direction;
  float scale[3], wrap;
  real translate[3];
  Real3 rows[3];
};

// y to the direction, a turn about it, scaled rows.
Mapping::Mapping(const Mesh& mesh, int m) : type((*mesh.mappingtype)[m]), direction((*mesh.mappingdirection)[m]) {
  int p[3];
  for (int k = 0; k < 3; ++k) {
    p[k] = (*mesh.mappingaxis[k])[m];
    scale[k] = static_cast<float>((*mesh.mappingscale[k])[m]);
    translate[k] = static_cast<real>((*mesh.mappingtranslate[k])[m]) / 256;
  }
  wrap = scale[2] / 1024;
  float by[3] = {scale[0] / 1024, scale[1] / 1024, scale[2] / 1024};
  if (type == 1) {
    by[0] = scale[0] < 0 ? -scale[0] / 1024 : 1;
    by[1] = 64 / scale[1];
    by[2] = scale[0] > 0 ? scale[0] / 1024 : 1;
  } else if (type == 2) {
    for (int k = 0; k < 3; ++k) by[k] = 64 / scale[k];
  }

  const real c = static_cast<real>(p[1]) / 32767, s = -std::sqrt(1 - c * c), t = 1 - c;
  const real length = std::sqrt(static_cast<real>(p[0] * p[0] + p[2] * p[2]));
  const real ax = length != 0 ? -p[2] / length : 1, az = length != 0 ? p[0] / length : 0;
  const Real3 x = {ax * ax * t + c, az * s, az * ax * t}, y = {-az * s, c, ax * s};
  const Real3 z = {az * ax * t, -ax * s, az * az * t + c};
  const auto angle = static_cast<unsigned int>((*mesh.mappingrotation)[m] * 64);
  const real co = mymath::cos(angle), si = mymath::sin(angle);
  const auto row = [](real a, Real3 u, real b, Real3 v, float factor) {
    return Real3{single((a * u.x + b * v.x) * factor), single((a * u.y + b * v.y) * factor),
                 single((a * u.z + b * v.z) * factor)};
  };
  rows[0] = row(co, x, si, z, by[0]);
  rows[1] = row(1, y, 0, z, by[1]);
  rows[2] = row(-si, x, co, z, by[2]);
}

int cube_face(float x, float y, float z) {
  if (std::abs(y) > std::abs(x) && std::abs(y) > std::abs(z)) return y > 0 ? 0 : 1;
  if (std::abs(z) > std::abs(x) && std::abs(z) > std::abs(y)) return z > 0 ? 2 : 3;
  return x > 0 ? 4 : 5;
}

// The coordinates of the corners of a face in repeats of the texture; centre: of all faces of the mapping.
void map_onto(const Mapping& m, const Real3 (&corner)[3], Real3 centre, float (&u)[3], float (&v)[3]) {
  // All corners of a cube's face are seen from the side that the face shows.
  const Real3 n = cross(corner[1] - corner[0], corner[2] - corner[0]);
  const auto unscaled = [&](int axis) { return static_cast<float>(m.along(axis, n) / (64 / m.scale[axis])); };
  const int side = cube_face(unscaled(0), unscaled(1), unscaled(2));
  const real* const shift = m.translate;
  for (int k = 0; k < 3; ++k) {
    const Real3 d = corner[k] - centre;
    const real x = m.along(0, d), y = m.along(1, d), z = m.along(2, d);
    const real turns = single(std::atan2(single(x), single(z))) / 6.2831855f + 0.5L;
    real s, t;
    if (m.type == 1) {
      s = turns * m.wrap;
      t = y + 0.5L + shift[0];
    } else if (m.type == 2) {
      const real us[6] = {x + shift[0], x + shift[0], shift[0] - x, x + shift[0], z + shift[2], shift[2] - z};
      const real vs[6] = {shift[2] - z, z + shift[2], shift[1] - y, shift[1] - y, shift[1] - y, shift[1] - y};
      s = us[side] + 0.5L;
      t = vs[side] + 0.5L;
    } else {
      s = turns;
      t = single(std::asin(single(y / std::sqrt(x * x + y * y + z * z)))) / 3.1415927f + 0.5L + shift[0];
    }
    // Floats from here on: opposite corners lie half a period apart, and the last bit decides. A quarter turn each.
    u[k] = static_cast<float>(s), v[k] = static_cast<float>(t);
    for (int turn = 0; turn < m.direction && m.direction < 4; ++turn) {
      std::swap(u[k], v[k]);
      u[k] = -u[k];
    }
  }
  if (m.type == 2) return;
  // Corners beyond the seam come to the first one's side.
  const float period = m.type == 1 ? m.wrap : 1;
  float* const round = (m.direction & 1) != 0 ? v : u;
  for (int k = 1; k < 3; ++k) {
    if (round[k] - round[0] > period / 2) {
      round[k] -= period;
    } else if (round[0] - round[k] > period / 2) {
      round[k] += period;
    }
  }
}

// --- Light ----------------------------------------------------------------------------------------------------------

unsigned int sunlit(unsigned int rgb, const Vector4_s& n, float factor) {
  const toolkit& k = kit();
  const float d = (k.sun_x * n.x + k.sun_y * n.y + k.sun_z * n.z) / n.w;
  const float t = k.ambient + d * (d > 0 ? k.sun_front : k.sun_back) * factor;
  const int intensity = truncate(t * 256);
  const unsigned int sun[4] = {k.sun_b, k.sun_g, k.sun_r, 0};
  return 0xFF000000 | word_of([&](int c) {
           const auto product = static_cast<std::int64_t>(channel(rgb, c) * sun[c] >> 8) * intensity;
           return c == 3 ? 255 : std::clamp(static_cast<std::int32_t>(product) >> 8, 4, 252);  // wraps
         });
}

unsigned int pointlit(unsigned int rgb, const Vector4_s& at, const Vector4_s& n, const Vector4_s (&lights)[4]) {
  const toolkit& k = kit();
  return word_of([&](int c) {
    const auto own = static_cast<float>(channel(rgb, c));
    float sum = own;
    for (int i = 0; i < k.pointlight_count; ++i) {
      const float dx = lights[i].x - at.x, dy = lights[i].y - at.y, dz = lights[i].z - at.z;
      const float s = dx * dx + dy * dy + dz * dz, towards = dx * n.x + dy * n.y + dz * n.z;
      const float e = (towards > 0 ? towards : 0) * k.pointlight_strength[i] * reciprocal(s) * reciprocal_root(s);
      sum += static_cast<float>(channel(k.pointlight_colour[i], c)) * (1.5259022e-5f * own) * e;
    }
    return std::clamp(signed_word(round_to_nearest(sum)), 0, 255);
  });
}

// --- Projection -----------------------------------------------------------------------------------------------------

Matrix_c product(const Matrix_c& a, const Matrix_c& b) {
  Matrix_c m;
  for (int i = 0; i < 4; ++i) {
    const Vector4_s& l = a.rows[i];
    for (int j = 0; j < 4; ++j) {
      const auto column = [&](int k) { return lane(b.rows[k], j); };
      lane(m.rows[i], j) = (l.x * column(0) + l.z * column(2)) + (l.y * column(1) + l.w * column(3));
    }
  }
  return m;
}

Vector4_s transform(const Vector4_s& p, const Matrix_c& m) {
  Vector4_s r;
  for (int j = 0; j < 4; ++j) {
    lane(r, j) = p.x * lane(m.rows[0], j) + p.y * lane(m.rows[1], j) + p.z * lane(m.rows[2], j) + lane(m.rows[3], j);
  }
  return r;
}

Vector4_s to_screen(const Vector4_s& p, const Matrix_c& m) {
  const Vector4_s clip = transform(p, m);
  Vector4_s s;
  for (int j = 0; j < 4; ++j) {
    float divided = lane(clip, j) / clip.w;
    if (j == 2 && std::signbit(clip.z)) divided = -std::abs(divided);
    lane(s, j) = divided * lane(m_ViewportMul, j) + lane(m_ViewportAdd, j);
  }
  return s;
}

// Neither all beyond one side, nor all nearer than the nearest, nor seen from behind.
bool visible(const Vector4_s (&p)[3]) {
  unsigned int common = 0xFF;
  for (const Vector4_s& at : p) {
    const int lanes[4] = {truncate(at.x), truncate(at.y), truncate(at.z * 32767), truncate(at.z * 32767)};
    unsigned int flags = 0;
    for (int i = 0; i < 4; ++i) {
      const int word = signed_word(lanes[i]);
      flags |= (word > m_TriangleCuller.lanes[i] ? 1u : 0u) << i | (word < 0 ? 16u : 0u) << i;
    }
    common &= flags;
  }
  return common == 8 && (p[2].x - p[0].x) * (p[1].y - p[0].y) > (p[2].y - p[0].y) * (p[1].x - p[0].x);
}

}  // namespace

// --- Building -------------------------------------------------------------------------------------------------------

Model::Model(const Mesh& mesh)
    : functionmask(static_cast<unsigned int>(mesh.functionmask)),
      flags(static_cast<unsigned int>(mesh.flags)),
      ambient(mesh.ambient),
      contrast(mesh.contrast),
      meshvertexcount(mesh.meshvertexcount) {
  for (int i = 0; i < mesh.vertexcount; ++i) {
    const auto at = [&](int axis) { return static_cast<float>((*mesh.position[axis])[i]); };
    vpos.push_back({at(0), at(1), at(2), 0});
  }

  // Faces: textured ones first, then the others, then carriers of billboards that would have gone.
  constexpr int gone = -1;
  const int inputs = mesh.inputfacecount;
  std::vector<int> number(inputs, gone), plain;
  for (int i = 0; i < inputs; ++i) {
    if (mesh.ftype && (*mesh.ftype)[i] == 2) continue;
    const texturemetrics* const texture = mesh.ftex ? metrics((*mesh.ftex)[i]) : nullptr;
    if (texture == nullptr || ((flags & 0x40) != 0 && texture->flat_colour)) {
      plain.push_back(i);
    } else if (!texture->do_not_draw) {
      number[i] = texfacecount++;
    }
  }
  facecount = texfacecount;
  for (int i : plain) number[i] = facecount++;

  const int billboardcount = mesh.billboarddata ? static_cast<int>(mesh.billboarddata->size()) / 8 : 0;
  for (int j = 0; j < billboardcount; ++j) {
    const int* const r = mesh.billboarddata->data() + 7 * j;
    if (number[r[0]] == gone) number[r[0]] = facecount++;
    const unsigned int alpha = mesh.falpha ? ~static_cast<unsigned int>((*mesh.falpha)[r[0]]) & 0xFF : 255;
    const unsigned int rgb = colourutils::hsl_2_rgb(static_cast<unsigned short>((*mesh.fhsl)[r[0]]));
    billboards.push_back({number[r[0]], static_cast<unsigned short>(r[1]), static_cast<unsigned short>(r[2]),
                          static_cast<short>(r[3]), static_cast<unsigned char>(r[4]), static_cast<unsigned char>(r[5]),
                          r[6] != 0, alpha << 24 | (rgb & 0xFFFFFF)});
  }

  const auto take = [&](auto& out, const auto& in) {
    if (!in) return;
    out.resize(facecount);
    for (int i = 0; i < inputs; ++i) {
      if (number[i] != gone) out[number[i]] = static_cast<std::decay_t<decltype(out[0])>>((*in)[i]);
    }
  };
  for (int k = 0; k < 3; ++k) take(corner[k], mesh.corner[k]);
  take(fhsl, mesh.fhsl), take(fpriority, mesh.fpriority), take(ftype, mesh.ftype);
  take(falpha, mesh.falpha), take(fmask, mesh.fmask);
  hasalpha = mesh.falpha.has_value();
  for (int i = 0; i < inputs && mesh.ftex; ++i) {
    const texturemetrics* const texture = metrics((*mesh.ftex)[i]);
    if (number[i] == gone || texture == nullptr) continue;
    hasalpha |= texture->alpha_kind == 2;
    hasanimatedtexture |= texture->scroll_u != 0 || texture->scroll_v != 0;
  }
  if (mesh.ftex && texfacecount > 0) texture_coordinates(mesh, number);

  // Labels.
  if (mesh.vmask) vmask.assign(mesh.vmask->begin(), mesh.vmask->end());
  if (mesh.pslist) pslist = *mesh.pslist;
  const auto labelled = [this](unsigned int mask, const Mesh::ints& list) {
    return (functionmask & mask) != 0 && list && !list->empty();
  };
  std::vector<int> all(std::max(mesh.vertexcount, billboardcount));
  for (int i = 0; i < static_cast<int>(all.size()); ++i) all[i] = i;
  if (mesh.billboarddata && labelled(0x400, mesh.facelabels)) {
    bblabels = group({mesh.facelabels->end() - billboardcount, mesh.facelabels->end()}, all);
  }
  if (labelled(0x180, mesh.facelabels)) {
    number.resize(mesh.facelabels->size(), gone);
    flabels = group(*mesh.facelabels, number);
  }
  if (labelled(0x20, mesh.vertexlabels)) vlabels = group(*mesh.vertexlabels, all);

  // A carrier shrinks to its centre, with whatever hangs on its corners.
  for (const Billboard& b : billboards) {
    Vector4_s *const p = &vpos[corner[0][b.face]], *const q = &vpos[corner[1][b.face]];
    Vector4_s* const r = &vpos[corner[2][b.face]];
    constexpr float third = 0.33333334f;
    *p = *q = *r = {(p->x + q->x + r->x) * third, (p->y + q->y + r->y) * third, (p->z + q->z + r->z) * third, 0};
    corner[0][b.face] = corner[1][b.face] = corner[2][b.face];
  }
}

void Model::texture_coordinates(const Mesh& mesh, const std::vector<int>& number) {
  ftex.resize(texfacecount);
  for (auto& coordinates : fuv) coordinates.resize(texfacecount);
  const auto at = [&](int i, int k) { return vpos[(*mesh.corner[k])[i]]; };
  const auto mapping_of = [&](int i) { return mesh.fmapping ? static_cast<unsigned char>((*mesh.fmapping)[i]) : -1; };

  std::vector<Vector4_s> least(256, {2e9f, 2e9f, 2e9f, 0}), most(256, {-2e9f, -2e9f, -2e9f, 0});
  for (int i = 0; i < mesh.inputfacecount && mesh.fmapping; ++i) {
    for (int k = 0; k < 3; ++k) {
      for (int axis = 0; axis < 3; ++axis) {
        float &from = lane(least[mapping_of(i)], axis), &to = lane(most[mapping_of(i)], axis);
        from = std::min(from, lane(at(i, k), axis));
        to = std::max(to, lane(at(i, k), axis));
      }
    }
  }
  for (int i = 0; i < mesh.inputfacecount; ++i) {
    const int e = number[i], m = mapping_of(i);
    if (e < 0 || e >= texfacecount) continue;
    ftex[e] = static_cast<unsigned short>((*mesh.ftex)[i]);
    if (m < 0 || m == 255) {
      const float side = m < 0 ? 127 : 128;
      fuv[0][e] = {0, side}, fuv[1][e] = {side, side}, fuv[2][e] = {0, 0};
      continue;
    }
    const Real3 corners[3] = {point(at(i, 0)), point(at(i, 1)), point(at(i, 2))};
    float u[3] = {}, v[3] = {};
    if ((*mesh.mappingtype)[m] == 0) {
      const auto spanning = [&](int k) { return point(vpos[(*mesh.mappingaxis[k])[m]]); };
      const Real3 origin = spanning(0), along = spanning(1) - origin, down = spanning(2) - origin;
      const Real3 w = cross(along, down), q = cross(down, w), r = cross(along, w);
      for (int k = 0; k < 3; ++k) {
        u[k] = static_cast<float>(dot(corners[k] - origin, q) / dot(along, q));
        v[k] = static_cast<float>(dot(corners[k] - origin, r) / dot(down, r));
      }
    } else if ((*mesh.mappingtype)[m] > 0) {
      const Real3 centre = {(least[m].x + most[m].x) * 0.5f, (least[m].y + most[m].y) * 0.5f,
                            (least[m].z + most[m].z) * 0.5f};
      map_onto(Mapping(mesh, m), corners, centre, u, v);
    }
    for (int k = 0; k < 3; ++k) fuv[k][e] = {u[k] * 128, v[k] * 128};
  }
}

// --- State ----------------------------------------------------------------------------------------------------------

void Model::update_mask(unsigned int mask) {
  if ((functionmask & ~mask & 0x10000) != 0) {
    std::replace(ftype.begin(), ftype.end(), static_cast<unsigned char>(2), static_cast<unsigned char>(0));
    light();
  }
  functionmask = mask;
}

void Model::bounds() {
  float least[3] = {32767, 32767, 32767}, most[3] = {-32768, -32768, -32768}, cylinder = 0, sphere = 0;
  for (int i = 0; i < meshvertexcount; ++i) {
    const Vector4_s& p = vpos[i];
    for (int k = 0; k < 3; ++k) least[k] = std::min(least[k], lane(p, k)), most[k] = std::max(most[k], lane(p, k));
    cylinder = std::max(cylinder, p.x * p.x + p.z * p.z);
    sphere = std::max(sphere, p.x * p.x + p.y * p.y + p.z * p.z);
  }
  const auto bound = [](float f) { return static_cast<int>(static_cast<short>(truncate(f))); };
  for (int k = 0; k < 3; ++k) low[k] = bound(least[k]), high[k] = bound(most[k]);
  radiuscylinder = bound(std::sqrt(cylinder) + 0.99f);
  radiussphere = bound(std::sqrt(sphere) + 0.99f);
  boundsvalid = true;
}

void Model::calculate_normals() {
  vnormal.assign(meshvertexcount, {});
  fnormal.assign(facecount, {});
  for (int f = 0; f < facecount; ++f) {
    const Real3 a = point(vpos[corner[0][f]]);
    Real3 n = cross(point(vpos[corner[1][f]]) - a, point(vpos[corner[2][f]]) - a);
    const real length = std::sqrt(dot(n, n));
    if (length != 0) n = {n.x / length, n.y / length, n.z / length};
    const Vector4_s unit = {static_cast<float>(n.x), static_cast<float>(n.y), static_cast<float>(n.z), 1};
    if (type(f) == 1) fnormal[f] = unit;
    for (int k = 0; k < 3 && type(f) == 0; ++k) {
      for (int i = 0; i < 4; ++i) lane(vnormal[corner[k][f]], i) += lane(unit, i);
    }
  }
  for (Vector4_s& n : vnormal) {
    if (n.w != 0) n = {n.x / n.w, n.y / n.w, n.z / n.w, 1};
  }
}

unsigned int Model::unlit(unsigned int hsl, unsigned short texture) const {
  const auto level = static_cast<unsigned int>(ambient);
  const unsigned int scaled = (hsl & 127) * level >> 7;
  const unsigned int rgb = colourutils::hsl_2_rgb((hsl & 0xFF80) + (scaled > 1 ? std::min(scaled, 126u) : 2));
  if (texture == 65535) return rgb;
  const texturemetrics& m = *kit().textures->getmetrics(texture);
  return word_of([&](int i) {
    unsigned int c = channel(rgb, i);
    const unsigned int grey = level < 128 ? level * 2 : 255;
    if (m.grey_blend != 0) c = (grey * m.grey_blend + c * (256u - m.grey_blend)) >> 8;
    if (m.brighten != 0) c = std::min(c * (m.brighten + 256u), 65535u) >> 8;
    return c;
  });
}

void Model::light() {
  if (vnormal.empty()) calculate_normals();
  fcolours.resize(3 * facecount);
  for (int f = 0; f < facecount; ++f) {
    if (type(f) > 1) continue;
    const unsigned int rgb = unlit(fhsl[f], f < texfacecount ? ftex[f] : 65535);
    std::fill_n(&fcolours[3 * f], 3, (255 - transparency(f)) << 24 | (rgb & 0xFFFFFF));
  }
  if ((functionmask & 0x97298) == 0) fhsl.clear();
}

// --- Drawing --------------------------------------------------------------------------------------------------------

int Model::render(const Matrix_c& world, int* result) {
  const toolkit& k = kit();
  if (facecount == 0 || (m_pColourBuffer == nullptr && m_pDepthBuffer == nullptr)) return -1;
  const Matrix_c mvp = product(world, k.viewprojection);
  if (!boundsvalid) bounds();
  const Vector4_s bottom = {0, static_cast<float>(low[1]), 0, 1}, top = {0, static_cast<float>(high[1]), 0, 1};
  const Vector4_s w0 = transform(bottom, world), w1 = transform(top, world);
  const auto radius = static_cast<float>(radiuscylinder);
  for (const Vector4_s& plane : k.frustum) {
    const auto beyond = [&](const Vector4_s& p) {
      return -radius > plane.x * p.x + plane.y * p.y + plane.z * p.z + plane.w * p.w;
    };
    if (beyond(w0) && beyond(w1)) return -1;
  }
  const Vector4_s s0 = to_screen(bottom, mvp), s1 = to_screen(top, mvp);
  if (result != nullptr) {
    Vector4_s end = w0.z > w1.z ? w0 : w1;
    const float middle = to_screen(end, k.viewprojection).x;
    for (int i = 0; i < 3; ++i) lane(end, i) += radius * k.camera.rows[i].x;
    const int across = round_to_nearest(to_screen(end, k.viewprojection).x - middle);
    const int values[6] = {truncate(s0.x), truncate(s0.y), truncate(s1.x), truncate(s1.y), std::abs(across), 1};
    std::copy_n(values, 6, result);
  }
  if (fcolours.empty()) light();
  if (vnormal.empty()) calculate_normals();
  Vector4_s lights[4] = {};
  for (int i = 0; i < k.pointlight_count; ++i) {
    const Vector4_s &from = k.pointlight_pos[i], &origin = world.rows[3];
    const float x = from.x - origin.x, y = from.y - origin.y, z = from.z - origin.z;
    for (int j = 0; j < 3; ++j) lane(lights[i], j) = x * world.rows[j].x + y * world.rows[j].y + z * world.rows[j].z;
  }
  const int variant = ((flags & 0x10) != 0 && k.pointlight_count > 0 ? 1 : 0) |
                      (k.fog_start > 0 && std::max(s0.z, s1.z) > m_DistanceFogStart ? 2 : 0) | (k.underwater ? 4 : 0) |
                      (m_pColourBuffer != nullptr ? 8 : 0) | (m_pDepthBuffer != nullptr ? 16 : 0);

  // With anything that blends: first what is opaque, then what is not.
  const bool two_passes = hasalpha;
  for (int pass = 0; pass < (two_passes ? 2 : 1); ++pass) {
    for (int f = 0; f < facecount; ++f) {
      const unsigned int alpha = transparency(f);
      if (type(f) == 2 || alpha == 255) continue;
      if (two_passes) {
        if (pass == 0 && alpha != 0) continue;
        bool translucent = alpha != 0;
        if (!translucent) {
          const cachedtexture* const texture = gettex(f);
          translucent = texture != nullptr && texture->alpha_kind == 2;
        }
        if (translucent != (pass == 1)) continue;
      }
      draw(f, variant, world, mvp, lights);
    }
  }
  return variant;
}

const cachedtexture* Model::gettex(int f) const { return f < texfacecount ? kit().textures->gettex(ftex[f]) : nullptr; }

void Model::draw(int f, int variant, const Matrix_c& world, const Matrix_c& mvp, const Vector4_s (&lights)[4]) {
  const toolkit& k = kit();
  const bool height_fog = (variant & 4) != 0, depth = (variant & 16) != 0;
  const int fog = ((variant & 2) != 0 ? 2 : 0) + (height_fog ? 1 : 0);
  Triangle_s t{};
  for (int i = 0; i < 3; ++i) t.vertex[i] = to_screen(vpos[corner[i][f]], mvp);
  if (!visible(t.vertex)) return;
  if ((variant & 8) == 0) {
    render_triangle({0, 0, false, 0, 0, false, false, true, false, true}, t);
    return;
  }
  for (int i = 0; i < 3 && height_fog; ++i) {
    const float height = -transform(vpos[corner[i][f]], world).y;
    const float factor = std::clamp((height - k.underwater_height_f) * k.underwater_scale, 0.0f, 1.0f);
    if (factor == 1) return;
    lane(t.fogfactor, i) = factor;
  }
  t.fogcolour = m_HeightFogColour;

  const cachedtexture* const texture = gettex(f);
  for (int i = 0; i < 3; ++i) {
    const int v = corner[i][f];
    unsigned int rgb = fcolours[3 * f + i];
    if (type(f) <= 1 && (texture == nullptr || texture->lighting_kind != 6)) {
      const bool shared = !vsharednormal.empty() && vsharednormal[v].w != 0;
      const Vector4_s n = type(f) == 1 ? fnormal[f] : shared ? vsharednormal[v] : vnormal[v];
      rgb = sunlit(rgb, n, (type(f) == 1 ? 512.0f : 768.0f) / static_cast<float>(contrast));
      if ((variant & 1) != 0) rgb = pointlit(rgb, vpos[v], n, lights);
    }
    t.colour[i] = vertex_colour(rgb);
  }
  const unsigned int alpha = transparency(f);
  t.alpha = (255 - alpha) * 0x10001;
  const int blend = alpha != 0 ? 3 : 0;
  if (texture == nullptr) {
    render_triangle({1, 0, false, fog, blend, false, false, alpha == 0, true, depth}, t);
    return;
  }
  for (int i = 0; i < 3; ++i) {
    t.texcoord[i] = {lane(texture->offset_u, 2 - i) + fuv[i][f].u, lane(texture->offset_v, 2 - i) + fuv[i][f].v, 0, 0};
  }
  t.texture[0] = texture->texels;
  if (alpha != 0 || texture->alpha_kind == 2) hasalpha = true;
  const int address = texture->wrap_u || texture->wrap_v ? 1 : 2;
  if (texture->alpha_kind == 2) {
    render_triangle({2, address, false, fog, 2, false, false, !height_fog, true, depth}, t);
  } else {
    render_triangle({2, address, false, fog, blend, texture->alpha_kind == 1, false, true, true, depth}, t);
  }
}

}  // namespace oracle
