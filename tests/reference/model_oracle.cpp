#include "reference/model_oracle.h"

#include <xmmintrin.h>

#include <algorithm>
#include <bit>
#include <cmath>

#include "maths/colourutils.h"
#include "maths/mymath.h"
#include "raster/Rasterizer.h"
#include "reference/triangle_oracle.h"
#include "texture/texturecache.h"
#include "toolkit/toolkit.h"

using namespace Rasterizer_n;

namespace oracle {
namespace {

using real = long double;

int truncate(float x) { return _mm_cvttss_si32(_mm_set_ss(x)); }
int round_to_nearest(float x) { return _mm_cvtss_si32(_mm_set_ss(x)); }
int word(int x) { return std::clamp(x, -32768, 32767); }
real single(real x) { return static_cast<float>(x); }
float lane(const Vector4_s& v, int i) { return (&v.x)[i]; }

toolkit& kit() { return *toolkit::m_pInstance; }
const texturemetrics* metrics(std::int16_t id) { return kit().textures->getmetrics(static_cast<unsigned short>(id)); }

template <class T, class U>
void copy(std::vector<T>& out, const std::optional<std::vector<U>>& in) {
  if (in) out.assign(in->begin(), in->end());
}

// --- Numbers of three -----------------------------------------------------------------------------------------------

struct Real3 {
  real x, y, z;
};
Real3 point(const Vector4_s& p) { return {p.x, p.y, p.z}; }
Real3 operator-(Real3 a, Real3 b) { return {a.x - b.x, a.y - b.y, a.z - b.z}; }
real dot(Real3 a, Real3 b) { return a.x * b.x + a.y * b.y + a.z * b.z; }
Real3 cross(Real3 a, Real3 b) { return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x}; }

Labels group(int items, const std::vector<int>& label, const std::vector<int>& member) {
  Labels groups;
  int highest = -1;
  for (int i = 0; i < items; ++i) {
    if (member[i] >= 0) highest = std::max(highest, label[i]);
  }
  for (int l = 0; l <= std::max(highest, 0); ++l) {
    const auto start = static_cast<int>(groups.members.size());
    for (int i = 0; i < items; ++i) {
      if (label[i] == l && member[i] >= 0) groups.members.push_back(static_cast<unsigned short>(member[i]));
    }
    groups.rows.insert(groups.rows.end(), {start, static_cast<int>(groups.members.size()) - start});
  }
  return groups;
}

// The mapping's rotation: y to the direction, a turn about it, scaled rows.
void mapping_matrix(const Mesh& mesh, int m, real (&rows)[3][3]) {
  const int type = (*mesh.mappingtype)[m];
  const int sx = (*mesh.mappingscalex)[m], sy = (*mesh.mappingscaley)[m], sz = (*mesh.mappingscalez)[m];
  const auto f = [](int i) { return static_cast<float>(i); };
  float scale[3] = {f(sx) / 1024, f(sy) / 1024, f(sz) / 1024};
  if (type == 1) {
    scale[0] = sx < 0 ? -f(sx) / 1024 : 1;
    scale[1] = 64 / f(sy);
    scale[2] = sx > 0 ? f(sx) / 1024 : 1;
  } else if (type == 2) {
    scale[0] = 64 / f(sx), scale[1] = 64 / f(sy), scale[2] = 64 / f(sz);
  }
  const int x = (*mesh.mappingp)[m], y = (*mesh.mappingm)[m], z = (*mesh.mappingn)[m];
  const real c = static_cast<real>(y) / 32767, s = -std::sqrt(1 - c * c), t = 1 - c;
  const real length = std::sqrt(static_cast<real>(x * x + z * z));
  const real ax = length != 0 ? -z / length : 1, az = length != 0 ? x / length : 0;
  const real base[3][3] = {
      {ax * ax * t + c, az * s, az * ax * t}, {-az * s, c, ax * s}, {az * ax * t, -ax * s, az * az * t + c}};
  const auto angle = static_cast<unsigned int>((*mesh.mappingrotation)[m] * 64);
  const real co = mymath::cos(angle), si = mymath::sin(angle);
  for (int k = 0; k < 3; ++k) {
    rows[0][k] = static_cast<float>((co * base[0][k] + si * base[2][k]) * scale[0]);
    rows[1][k] = static_cast<float>(base[1][k] * scale[1]);
    rows[2][k] = static_cast<float>((-si * base[0][k] + co * base[2][k]) * scale[2]);
  }
}

int cube_face(real x, real y, real z) {
  if (std::abs(y) > std::abs(x) && std::abs(y) > std::abs(z)) return y > 0 ? 0 : 1;
  if (std::abs(z) > std::abs(x) && std::abs(z) > std::abs(y)) return z > 0 ? 2 : 3;
  return x > 0 ? 4 : 5;
}

// --- Light ----------------------------------------------------------------------------------------------------------

unsigned int sunlit(unsigned int rgb, const Vector4_s& n, float factor) {
  const toolkit& k = kit();
  const float d = (k.sun_x * n.x + k.sun_y * n.y + k.sun_z * n.z) / n.w;
  const float t = k.ambient + d * (d > 0 ? k.sun_front : k.sun_back) * factor;
  const int intensity = truncate(t * 256);
  unsigned int result = 0xFF000000;
  for (const auto& [shift, sun] : {std::pair(16, k.sun_r), std::pair(8, k.sun_g), std::pair(0, k.sun_b)}) {
    const std::int64_t channel = static_cast<int>((rgb >> shift & 0xFF) * sun >> 8);
    const std::int64_t lit = channel * intensity >> 8;
    result |= static_cast<unsigned int>(std::clamp<std::int64_t>(lit, 4, 252)) << shift;
  }
  return result;
}

unsigned int pointlit(unsigned int rgb, const Vector4_s& at, const Vector4_s& n, const Vector4_s (&lights)[4]) {
  const toolkit& k = kit();
  float sum[4];
  for (int c = 0; c < 4; ++c) sum[c] = static_cast<float>(rgb >> 8 * c & 0xFF);
  for (int i = 0; i < k.pointlight_count; ++i) {
    const float dx = lights[i].x - at.x, dy = lights[i].y - at.y, dz = lights[i].z - at.z;
    const float s = dx * dx + dy * dy + dz * dz;
    const float towards = dx * n.x + dy * n.y + dz * n.z;
    const float r = _mm_cvtss_f32(_mm_rcp_ss(_mm_set_ss(s))), q = _mm_cvtss_f32(_mm_rsqrt_ss(_mm_set_ss(s)));
    const float e = (towards > 0 ? towards : 0) * k.pointlight_strength[i] * r * q;
    for (int c = 0; c < 4; ++c) {
      const auto own = static_cast<float>(rgb >> 8 * c & 0xFF);
      const auto light = static_cast<float>(k.pointlight_colour[i] >> 8 * c & 0xFF);
      sum[c] += light * (1.5259022e-5f * own) * e;
    }
  }
  unsigned int result = 0;
  for (int c = 0; c < 4; ++c) {
    result |= static_cast<unsigned int>(std::clamp(word(round_to_nearest(sum[c])), 0, 255)) << 8 * c;
  }
  return result;
}

// --- Projection -----------------------------------------------------------------------------------------------------

Matrix_c product(const Matrix_c& a, const Matrix_c& b) {
  Matrix_c m;
  for (int i = 0; i < 4; ++i) {
    const Vector4_s& l = a.rows[i];
    for (int j = 0; j < 4; ++j) {
      (&m.rows[i].x)[j] =
          (l.x * lane(b.rows[0], j) + l.z * lane(b.rows[2], j)) + (l.y * lane(b.rows[1], j) + l.w * lane(b.rows[3], j));
    }
  }
  return m;
}

Vector4_s transform(const Vector4_s& p, const Matrix_c& m) {
  Vector4_s r;
  for (int j = 0; j < 4; ++j) {
    (&r.x)[j] = p.x * lane(m.rows[0], j) + p.y * lane(m.rows[1], j) + p.z * lane(m.rows[2], j) + lane(m.rows[3], j);
  }
  return r;
}

Vector4_s to_screen(const Vector4_s& p, const Matrix_c& m) {
  const Vector4_s clip = transform(p, m);
  Vector4_s s;
  for (int j = 0; j < 4; ++j) {
    float divided = lane(clip, j) / clip.w;
    if (j == 2 && std::signbit(clip.z)) divided = -std::abs(divided);
    (&s.x)[j] = divided * lane(m_ViewportMul, j) + lane(m_ViewportAdd, j);
  }
  return s;
}

bool visible(const Vector4_s& p0, const Vector4_s& p1, const Vector4_s& p2) {
  unsigned int common = 0xFF;
  for (const Vector4_s* p : {&p0, &p1, &p2}) {
    const int lanes[4] = {truncate(p->x), truncate(p->y), truncate(p->z * 32767), truncate(p->z * 32767)};
    unsigned int flags = 0;
    for (int i = 0; i < 4; ++i) {
      flags |= (word(lanes[i]) > m_TriangleCuller.lanes[i] ? 1u : 0u) << i | (word(lanes[i]) < 0 ? 16u : 0u) << i;
    }
    common &= flags;
  }
  return common == 8 && (p2.x - p0.x) * (p1.y - p0.y) > (p2.y - p0.y) * (p1.x - p0.x);
}

}  // namespace

// --- Building -------------------------------------------------------------------------------------------------------

Model::Model(const Mesh& mesh)
    : functionmask(static_cast<unsigned int>(mesh.functionmask)),
      flags(static_cast<unsigned int>(mesh.flags)),
      ambient(mesh.ambient),
      contrast(mesh.contrast),
      vertexcount(mesh.vertexcount),
      meshvertexcount(mesh.meshvertexcount) {
  for (int i = 0; i < vertexcount; ++i) {
    const auto f = [i](const Mesh::ints& v) { return static_cast<float>((*v)[i]); };
    vpos.push_back({f(mesh.x), f(mesh.y), f(mesh.z), 0});
  }
  copy(vmask, mesh.vmask);

  // Faces: textured ones first, then the others, then carriers of billboards that would have gone.
  constexpr int gone = -1;
  const int inputs = mesh.inputfacecount;
  std::vector<int> number(inputs, gone), plain;
  for (int i = 0; i < inputs; ++i) {
    if (mesh.ftype && (*mesh.ftype)[i] == 2) continue;
    const texturemetrics* const texture = mesh.ftex ? metrics((*mesh.ftex)[i]) : nullptr;
    const bool flat = texture != nullptr && (flags & 0x40) != 0 && texture->flat_colour;
    if (texture == nullptr || flat) {
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
  take(fa, mesh.a), take(fb, mesh.b), take(fc, mesh.c), take(fhsl, mesh.fhsl);
  take(fpriority, mesh.fpriority), take(ftype, mesh.ftype), take(falpha, mesh.falpha), take(fmask, mesh.fmask);
  hasalpha = mesh.falpha.has_value();
  for (int i = 0; i < inputs && mesh.ftex; ++i) {
    const texturemetrics* const texture = metrics((*mesh.ftex)[i]);
    if (number[i] == gone || texture == nullptr) continue;
    hasalpha |= texture->alpha_kind == 2;
    hasanimatedtexture |= texture->scroll_u != 0 || texture->scroll_v != 0;
  }
  if (mesh.ftex && texfacecount > 0) texture_coordinates(mesh, number);

  // Labels.
  const auto count = [](const auto& v) { return v ? static_cast<int>(v->size()) : 0; };
  std::vector<int> members(std::max(vertexcount, std::max(billboardcount, 1)));
  for (int i = 0; i < static_cast<int>(members.size()); ++i) members[i] = i;
  const int labels = count(mesh.facelabels);
  if ((functionmask & 0x400) != 0 && mesh.billboarddata && labels > 0) {
    bblabels = group(billboardcount, {mesh.facelabels->end() - billboardcount, mesh.facelabels->end()}, members);
  }
  if ((functionmask & 0x180) != 0 && labels > 0) {
    std::vector<int> mapped = number;
    mapped.resize(labels, gone);
    flabels = group(labels, *mesh.facelabels, mapped);
  }
  if ((functionmask & 0x20) != 0 && count(mesh.vertexlabels) > 0) {
    vlabels = group(vertexcount, *mesh.vertexlabels, members);
  }
  copy(pslist, mesh.pslist);

  // A carrier shrinks to its centre, with whatever hangs on its corners.
  for (const Billboard& b : billboards) {
    Vector4_s *const p = &vpos[fa[b.face]], *const q = &vpos[fb[b.face]], *const r = &vpos[fc[b.face]];
    constexpr float third = 0.33333334f;
    const Vector4_s mean = {(p->x + q->x + r->x) * third, (p->y + q->y + r->y) * third, (p->z + q->z + r->z) * third,
                            0};
    *p = *q = *r = mean;
    fa[b.face] = fb[b.face] = fc[b.face];
  }
}

void Model::texture_coordinates(const Mesh& mesh, const std::vector<int>& number) {
  ftex.resize(texfacecount);
  for (auto& corner : fuv) corner.resize(texfacecount);

  const int mappings = mesh.fmapping ? mesh.mappingcount : 0;
  std::vector<Vector4_s> low(mappings, {2e9f, 2e9f, 2e9f, 0}), high(mappings, {-2e9f, -2e9f, -2e9f, 0});
  const auto corner = [&](int i, int k) { return vpos[(*(k == 0 ? mesh.a : k == 1 ? mesh.b : mesh.c))[i]]; };
  for (int i = 0; i < mesh.inputfacecount && mesh.fmapping; ++i) {
    const int m = static_cast<unsigned char>((*mesh.fmapping)[i]);
    for (int k = 0; k < 3 && m < 255; ++k) {
      const Vector4_s p = corner(i, k);
      low[m] = {std::min(low[m].x, p.x), std::min(low[m].y, p.y), std::min(low[m].z, p.z), 0};
      high[m] = {std::max(high[m].x, p.x), std::max(high[m].y, p.y), std::max(high[m].z, p.z), 0};
    }
  }
  for (int i = 0; i < mesh.inputfacecount; ++i) {
    const int e = number[i];
    if (e < 0 || e >= texfacecount) continue;
    ftex[e] = static_cast<unsigned short>((*mesh.ftex)[i]);
    const int m = mesh.fmapping ? static_cast<unsigned char>((*mesh.fmapping)[i]) : -1;
    if (m < 0 || m == 255) {
      const float side = m < 0 ? 127 : 128;
      fuv[0][e] = {0, side}, fuv[1][e] = {side, side}, fuv[2][e] = {0, 0};
      continue;
    }
    float u[3], v[3];
    const int type = (*mesh.mappingtype)[m];
    if (type == 0) {
      const Real3 origin = point(vpos[(*mesh.mappingp)[m]]);
      const Real3 along = point(vpos[(*mesh.mappingm)[m]]) - origin, down = point(vpos[(*mesh.mappingn)[m]]) - origin;
      const Real3 w = cross(along, down), q = cross(down, w), r = cross(along, w);
      for (int k = 0; k < 3; ++k) {
        const Real3 d = point(corner(i, k)) - origin;
        u[k] = static_cast<float>(dot(d, q) / dot(along, q));
        v[k] = static_cast<float>(dot(d, r) / dot(down, r));
      }
    } else {
      real rows[3][3];
      mapping_matrix(mesh, m, rows);
      const Real3 centre = {(low[m].x + high[m].x) * 0.5f, (low[m].y + high[m].y) * 0.5f,
                            (low[m].z + high[m].z) * 0.5f};
      const auto turned = [&](Real3 d, int row) { return dot({rows[row][0], rows[row][1], rows[row][2]}, d); };
      const auto shift = [m](const Mesh::ints& t) { return static_cast<real>((*t)[m]) / 256; };
      const real tu = shift(mesh.mappingtranslatex);
      const float wrap = static_cast<float>((*mesh.mappingscalez)[m]) / 1024;
      const real pi = 3.1415927f, two_pi = 6.2831855f;

      // All corners of a cube's face are seen from the side that the face shows.
      const Real3 n = cross(point(corner(i, 1)) - point(corner(i, 0)), point(corner(i, 2)) - point(corner(i, 0)));
      const auto unscaled = [&](int row, const Mesh::ints& scale) {
        return turned(n, row) / (64 / static_cast<float>((*scale)[m]));
      };
      const int side =
          cube_face(unscaled(0, mesh.mappingscalex), unscaled(1, mesh.mappingscaley), unscaled(2, mesh.mappingscalez));
      for (int k = 0; k < 3; ++k) {
        const Real3 d = point(corner(i, k)) - centre;
        const real q0 = turned(d, 0), q1 = turned(d, 1), q2 = turned(d, 2);
        const real turns = single(std::atan2(single(q0), single(q2))) / two_pi + 0.5L;
        real s, t;
        if (type == 1) {
          s = turns * wrap;
          t = q1 + 0.5L + tu;
        } else if (type == 2) {
          const real tv = shift(mesh.mappingtranslatey), tw = shift(mesh.mappingtranslatez);
          const real us[6] = {q0 + tu, q0 + tu, tu - q0, q0 + tu, q2 + tw, tw - q2};
          const real vs[6] = {tw - q2, q2 + tw, tv - q1, tv - q1, tv - q1, tv - q1};
          s = us[side] + 0.5L;
          t = vs[side] + 0.5L;
        } else {
          const real length = std::sqrt(q0 * q0 + q1 * q1 + q2 * q2);
          s = turns;
          t = single(std::asin(single(q1 / length))) / pi + 0.5L + tu;
        }
        // Floats from here on: opposite corners lie half a period apart, and the last bit decides.
        u[k] = static_cast<float>(s), v[k] = static_cast<float>(t);
        const float u0 = u[k], v0 = v[k];
        switch ((*mesh.mappingdirection)[m]) {
          case 1:
            u[k] = -v0, v[k] = u0;
            break;
          case 2:
            u[k] = -u0, v[k] = -v0;
            break;
          case 3:
            u[k] = v0, v[k] = -u0;
            break;
          default:
            break;
        }
      }
      if (type != 2) {
        const float period = type == 1 ? wrap : 1;
        float* const x = ((*mesh.mappingdirection)[m] & 1) != 0 ? v : u;
        for (int k = 1; k < 3; ++k) {
          if (x[k] - x[0] > period / 2) {
            x[k] -= period;
          } else if (x[0] - x[k] > period / 2) {
            x[k] += period;
          }
        }
      }
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
  float low[3] = {32767, 32767, 32767}, high[3] = {-32768, -32768, -32768}, cylinder = 0, sphere = 0;
  for (int i = 0; i < meshvertexcount; ++i) {
    const Vector4_s& p = vpos[i];
    for (int k = 0; k < 3; ++k) {
      low[k] = std::min(low[k], lane(p, k));
      high[k] = std::max(high[k], lane(p, k));
    }
    cylinder = std::max(cylinder, p.x * p.x + p.z * p.z);
    sphere = std::max(sphere, p.x * p.x + p.y * p.y + p.z * p.z);
  }
  const auto bound = [](float f) { return static_cast<int>(static_cast<short>(truncate(f))); };
  minx = bound(low[0]), miny = bound(low[1]), minz = bound(low[2]);
  maxx = bound(high[0]), maxy = bound(high[1]), maxz = bound(high[2]);
  radiuscylinder = bound(std::sqrt(cylinder) + 0.99f);
  radiussphere = bound(std::sqrt(sphere) + 0.99f);
  boundsvalid = true;
}

void Model::calculate_normals() {
  vnormal.assign(meshvertexcount, {});
  fnormal.assign(facecount, {});
  for (int f = 0; f < facecount; ++f) {
    const Real3 a = point(vpos[fa[f]]);
    Real3 n = cross(point(vpos[fb[f]]) - a, point(vpos[fc[f]]) - a);
    const real length = std::sqrt(dot(n, n));
    if (length != 0) n = {n.x / length, n.y / length, n.z / length};
    const Vector4_s unit = {static_cast<float>(n.x), static_cast<float>(n.y), static_cast<float>(n.z), 1};
    if (!ftype.empty() && ftype[f] != 0) {
      if (ftype[f] == 1) fnormal[f] = unit;
      continue;
    }
    for (int v : {fa[f], fb[f], fc[f]}) {
      for (int k = 0; k < 4; ++k) (&vnormal[v].x)[k] += lane(unit, k);
    }
  }
  for (Vector4_s& n : vnormal) {
    if (n.w != 0) n = {n.x / n.w, n.y / n.w, n.z / n.w, 1};
  }
}

unsigned int Model::unlit(unsigned int hsl, unsigned short texture) const {
  const auto level = static_cast<unsigned int>(ambient);
  const unsigned int scaled = (hsl & 127) * level >> 7;
  unsigned int rgb = colourutils::hsl_2_rgb((hsl & 0xFF80) + (scaled > 1 ? std::min(scaled, 126u) : 2));
  if (texture == 65535) return rgb;
  const texturemetrics& m = *kit().textures->getmetrics(texture);
  for (int shift = 0; shift < 24; shift += 8) {
    unsigned int c = rgb >> shift & 0xFF;
    const unsigned int grey = level < 128 ? level * 2 : 255;
    if (m.grey_blend != 0) c = (grey * m.grey_blend + c * (256u - m.grey_blend)) >> 8;
    if (m.brighten != 0) c = std::min(c * (m.brighten + 256u), 65535u) >> 8;
    rgb = (rgb & ~(0xFFu << shift)) | c << shift;
  }
  return rgb;
}

void Model::light() {
  if (vnormal.empty()) calculate_normals();
  fcolours.resize(3 * facecount);
  for (int f = 0; f < facecount; ++f) {
    if (!ftype.empty() && ftype[f] > 1) continue;
    const unsigned int rgb = unlit(fhsl[f], f < texfacecount ? ftex[f] : 65535);
    const unsigned int alpha = falpha.empty() ? 255 : 255u - falpha[f];
    std::fill_n(&fcolours[3 * f], 3, alpha << 24 | (rgb & 0xFFFFFF));
  }
  if ((functionmask & 0x97298) == 0) fhsl.clear();
}

// --- Drawing --------------------------------------------------------------------------------------------------------

int Model::render(const Matrix_c& world, int* result) {
  toolkit& k = kit();
  if (facecount == 0 || (m_pColourBuffer == nullptr && m_pDepthBuffer == nullptr)) return -1;
  const Matrix_c mvp = product(world, k.viewprojection);
  if (!boundsvalid) bounds();
  const Vector4_s low = {0, static_cast<float>(miny), 0, 1}, high = {0, static_cast<float>(maxy), 0, 1};
  const Vector4_s w0 = transform(low, world), w1 = transform(high, world);
  for (const Vector4_s& plane : k.frustum) {
    const auto side = [&plane](const Vector4_s& p) {
      return plane.x * p.x + plane.y * p.y + plane.z * p.z + plane.w * p.w;
    };
    const auto r = static_cast<float>(-radiuscylinder);
    if (r > side(w0) && r > side(w1)) return -1;
  }
  const Vector4_s s0 = to_screen(low, mvp), s1 = to_screen(high, mvp);
  if (result != nullptr) {
    Vector4_s end = w0.z > w1.z ? w0 : w1;
    const float middle = to_screen(end, k.viewprojection).x;
    const auto radius = static_cast<float>(radiuscylinder);
    end.x += radius * k.camera.rows[0].x, end.y += radius * k.camera.rows[1].x, end.z += radius * k.camera.rows[2].x;
    const int across = round_to_nearest(to_screen(end, k.viewprojection).x - middle);
    const int values[6] = {truncate(s0.x), truncate(s0.y), truncate(s1.x), truncate(s1.y), std::abs(across), 1};
    std::copy_n(values, 6, result);
  }
  if (fcolours.empty()) light();
  if (vnormal.empty()) calculate_normals();
  Vector4_s lights[4] = {};
  for (int i = 0; i < k.pointlight_count; ++i) {
    const Vector4_s& from = k.pointlight_pos[i];
    const Vector4_s& origin = world.rows[3];
    const Vector4_s d = {from.x - origin.x, from.y - origin.y, from.z - origin.z, 0};
    const auto along = [&](int row) {
      const Vector4_s& axis = world.rows[row];
      return d.x * axis.x + d.y * axis.y + d.z * axis.z;
    };
    lights[i] = {along(0), along(1), along(2), 0};
  }
  const int variant = ((flags & 0x10) != 0 && k.pointlight_count > 0 ? 1 : 0) |
                      (k.fog_start > 0 && std::max(s0.z, s1.z) > m_DistanceFogStart ? 2 : 0) | (k.underwater ? 4 : 0) |
                      (m_pColourBuffer != nullptr ? 8 : 0) | (m_pDepthBuffer != nullptr ? 16 : 0);
  draw(variant, world, mvp, lights);
  return variant;
}

void Model::draw(int variant, const Matrix_c& world, const Matrix_c& mvp, const Vector4_s (&lights)[4]) {
  toolkit& k = kit();
  const bool point_lights = (variant & 1) != 0, height_fog = (variant & 4) != 0;
  const bool colour = (variant & 8) != 0, depth = (variant & 16) != 0;
  const int fog = ((variant & 2) != 0 ? 2 : 0) + (height_fog ? 1 : 0);

  const auto gettex = [&](int f) -> const cachedtexture* {
    return f < texfacecount ? k.textures->gettex(ftex[f]) : nullptr;
  };
  const auto transparency = [this](int f) { return falpha.empty() ? 0u : falpha[f]; };

  const auto face = [&](int f) {
    const int v[3] = {fa[f], fb[f], fc[f]};
    Triangle_s t{};
    for (int i = 0; i < 3; ++i) t.vertex[i] = to_screen(vpos[v[i]], mvp);
    if (!visible(t.vertex[0], t.vertex[1], t.vertex[2])) return;
    if (!colour) {
      render_triangle({0, 0, false, 0, 0, false, false, true, false, true}, t);
      return;
    }
    if (height_fog) {
      for (int i = 0; i < 3; ++i) {
        const Vector4_s& p = vpos[v[i]];
        const float height = -(p.x * world.rows[0].y + p.y * world.rows[1].y + p.z * world.rows[2].y + world.rows[3].y);
        const float factor = std::clamp((height - k.underwater_height_f) * k.underwater_scale, 0.0f, 1.0f);
        if (factor == 1) return;
        (&t.fogfactor.x)[i] = factor;
      }
      t.fogcolour = m_HeightFogColour;
    }
    const cachedtexture* const texture = gettex(f);
    const int type = ftype.empty() ? 0 : ftype[f];
    for (int i = 0; i < 3; ++i) {
      unsigned int rgb = fcolours[3 * f + i];
      if (type <= 1 && (texture == nullptr || texture->lighting_kind != 6)) {
        const bool shared = !vsharednormal.empty() && vsharednormal[v[i]].w != 0;
        const Vector4_s n = type == 1 ? fnormal[f] : shared ? vsharednormal[v[i]] : vnormal[v[i]];
        rgb = sunlit(rgb, n, (type == 1 ? 512.0f : 768.0f) / static_cast<float>(contrast));
        if (point_lights) rgb = pointlit(rgb, vpos[v[i]], n, lights);
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
      t.texcoord[i] = {lane(texture->offset_u, 2 - i) + fuv[i][f].u, lane(texture->offset_v, 2 - i) + fuv[i][f].v, 0,
                       0};
    }
    t.texture[0] = texture->texels;
    if (alpha != 0 || texture->alpha_kind == 2) hasalpha = true;
    const int address = texture->wrap_u || texture->wrap_v ? 1 : 2;
    if (texture->alpha_kind == 2) {
      render_triangle({2, address, false, fog, 2, false, false, !height_fog, true, depth}, t);
    } else {
      render_triangle({2, address, false, fog, blend, texture->alpha_kind == 1, false, true, true, depth}, t);
    }
  };

  const bool two_passes = hasalpha;
  for (int pass = 0; pass < (two_passes ? 2 : 1); ++pass) {
    for (int f = 0; f < facecount; ++f) {
      if (!ftype.empty() && ftype[f] == 2) continue;
      if (two_passes) {
        const unsigned int alpha = transparency(f);
        if (alpha == 255) continue;
        if (pass == 0 && alpha != 0) continue;
        bool translucent = alpha != 0;
        if (!translucent) {
          const cachedtexture* const texture = gettex(f);
          translucent = texture != nullptr && texture->alpha_kind == 2;
        }
        if (translucent != (pass == 1)) continue;
      }
      face(f);
    }
  }
}

}  // namespace oracle
