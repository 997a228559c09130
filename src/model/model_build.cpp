// From the client's mesh to the native form: faces are renumbered (textured ones first, dropped ones gone), billboards
// are carved out of the face list, and members are grouped by animation label.
#include <algorithm>
#include <cstring>

#include "maths/colourutils.h"
#include "model/mesh_views.h"
#include "model/model.h"
#include "texture/texturecache.h"
#include "toolkit/toolkit.h"

namespace {

// Entries of the face map that are no face numbers.
constexpr int dropped = -1;
constexpr int goes_untextured = -2;

const texturemetrics* metrics_of(unsigned short texture) { return toolkit::m_pInstance->get_texturemetrics(texture); }

// Groups items by label with a counting sort. `item(i, label, member)` answers whether item i has a label, and which
// label and member it stands for; `items` is asked for twice.
template <class Item>
void group_by_label(memorymanager& pool, int items, Item item, sharedarray2d<unsigned short>& groups) {
  int counters[256] = {};
  int labels = 0;
  int members = 0;
  int label = 0;
  int member = 0;
  for (int i = 0; i < items; ++i) {
    if (!item(i, label, member)) continue;
    ++counters[label];
    ++members;
    labels = std::max(labels, label + 1);
  }

  groups.rows = sharedarray<int>::allocate(pool, 2 * static_cast<unsigned int>(std::max(labels, 1)));
  groups.rows[0] = groups.rows[1] = 0;
  for (int start = 0, l = 0; l < labels; ++l) {
    groups.rows[2 * l] = start;
    groups.rows[2 * l + 1] = counters[l];
    start += counters[l];
  }

  groups.data = sharedarray<unsigned short>::allocate(pool, static_cast<unsigned int>(members));
  std::fill(std::begin(counters), std::end(counters), 0);
  for (int i = 0; i < items; ++i) {
    if (item(i, label, member))
      groups.data[groups.rows[2 * label] + counters[label]++] = static_cast<unsigned short>(member);
  }
}

// An array of the pool with the view's contents; empty for a null view.
template <class T, class View>
sharedarray<T> copied(const View& view, memorymanager* pool) {
  return view.template toSharedarray<T>(pool);
}

}  // namespace

void model::build(const mesh_views& mesh) {
  functionmask = mesh.functionmask;
  flags = mesh.flags;
  ambient = mesh.ambient;
  contrast = mesh.contrast;
  vertexcount = mesh.vertexcount;
  meshvertexcount = mesh.meshvertexcount;

  vpos = sharedarray<Vector4_s>::allocate(*pool, static_cast<unsigned int>(vertexcount));
  for (int i = 0; i < vertexcount; ++i) {
    vpos[i].x = static_cast<float>(mesh.x.elements[i]);
    vpos[i].y = static_cast<float>(mesh.y.elements[i]);
    vpos[i].z = static_cast<float>(mesh.z.elements[i]);
  }
  vmask = copied<unsigned short>(mesh.vmask, pool);

  face_map facemap;
  unsigned short textured = 0;
  unsigned short untextured = 0;
  map_faces(mesh, facemap, textured, untextured);
  make_billboards(mesh, facemap, textured, untextured);
  if ((functionmask & FM_ANIMATE_BILLBOARD) != 0 && mesh.billboarddata.array != nullptr) {
    getbblist(mesh.facelabels, mesh.billboardcount());
  }

  texfacecount = textured;
  facecount = static_cast<unsigned short>(textured + untextured);
  copy_faces(mesh, facemap);
  priority = mesh.priority;
  calculatetexturecoords(mesh, facemap);
  boundsvalid = false;

  if (mesh.facelabels.array != nullptr && (functionmask & (FM_ANIMATE_COLOUR | FM_ANIMATE_ALPHA)) != 0) {
    getflist(mesh.facelabels, facemap);
  }
  if (mesh.vertexlabels.array != nullptr && (functionmask & FM_ANIMATE_VERTICES) != 0) getplist(mesh.vertexlabels);
  pslist = copied<int>(mesh.pslist, pool);
  emittercount = mesh.emittercount;
  effectorcount = mesh.effectorcount;
  if (falpha.block != nullptr) hasalpha = true;
  collapse_carriers();
}

// Numbers the faces: textured ones in their order, then the others in theirs.
void model::map_faces(const mesh_views& mesh, face_map& facemap, unsigned short& textured,
                      unsigned short& untextured) const {
  std::fill(std::begin(facemap), std::end(facemap), dropped);
  const int faces = std::max(mesh.inputfacecount, 0);
  const auto hidden = [&](int i) { return mesh.ftype.array != nullptr && mesh.ftype.elements[i] == FT_HIDDEN; };

  if (mesh.ftex.array == nullptr) {
    for (int i = 0; i < faces; ++i) {
      if (!hidden(i)) facemap[i] = untextured++;
    }
    return;
  }
  for (int i = 0; i < faces; ++i) {
    if (hidden(i)) continue;
    const texturemetrics* const metrics = metrics_of(static_cast<unsigned short>(mesh.ftex.elements[i]));
    if (metrics == nullptr || ((flags & MF_NOALPHATEXTURE) != 0 && metrics->flat_colour)) {
      facemap[i] = goes_untextured;
    } else if (!metrics->do_not_draw) {
      facemap[i] = textured++;
    }
  }
  for (int i = 0; i < faces; ++i) {
    if (facemap[i] == goes_untextured) facemap[i] = textured + untextured++;
  }
}

// A carrier that was dropped comes back at the end of the untextured faces.
void model::make_billboards(const mesh_views& mesh, face_map& facemap, unsigned short textured,
                            unsigned short& untextured) {
  if (mesh.billboarddata.array == nullptr) return;
  const int count = mesh.billboardcount();
  billboards = sharedarray<billboard>::allocate(*pool, static_cast<unsigned int>(count));
  billboardproperties = sharedarray<billboard_properties>::allocate(*pool, static_cast<unsigned int>(count));
  for (int j = 0; j < count; ++j) {
    const int* const record = mesh.billboarddata.elements + j * mesh_views::billboard_words;
    const int f = record[0];
    if (facemap[f] == dropped) facemap[f] = textured + untextured++;
    billboards[j] =
        billboard(static_cast<unsigned short>(facemap[f]), static_cast<unsigned short>(record[1]),
                  static_cast<unsigned short>(record[2]), static_cast<short>(record[3]),
                  static_cast<unsigned char>(record[4]), static_cast<unsigned char>(record[5]), record[6] != 0);
    const unsigned int rgb = colourutils::hsl_2_rgb(static_cast<unsigned short>(mesh.fhsl.elements[f]));
    const unsigned int opacity =
        mesh.falpha.array != nullptr ? 255 - static_cast<unsigned char>(mesh.falpha.elements[f]) : 255;
    billboardproperties[j] = billboard_properties(opacity << 24 | (rgb & 0xFFFFFF));
  }
}

// Brings every attribute of the faces that are left into their new order.
void model::copy_faces(const mesh_views& mesh, const face_map& facemap) {
  const auto bytes = [this] { return sharedarray<unsigned char>::allocate(*pool, facecount); };
  const auto words = [this] { return sharedarray<unsigned short>::allocate(*pool, facecount); };
  fa = words();
  fb = words();
  fc = words();
  fhsl = words();
  if (mesh.fpriority.array != nullptr) fpriority = bytes();
  if (mesh.ftype.array != nullptr && mesh.inputfacecount > 0) ftype = bytes();
  if (mesh.falpha.array != nullptr) falpha = bytes();
  if (mesh.fmask.array != nullptr) fmask = words();

  hasalpha = false;
  hasanimatedtexture = false;
  for (int i = 0; i < mesh.inputfacecount; ++i) {
    const int e = facemap[i];
    if (e == dropped) continue;
    fa[e] = static_cast<unsigned short>(mesh.a.elements[i]);
    fb[e] = static_cast<unsigned short>(mesh.b.elements[i]);
    fc[e] = static_cast<unsigned short>(mesh.c.elements[i]);
    fhsl[e] = static_cast<unsigned short>(mesh.fhsl.elements[i]);
    if (fpriority.block != nullptr) fpriority[e] = static_cast<unsigned char>(mesh.fpriority.elements[i]);
    if (ftype.block != nullptr) ftype[e] = static_cast<unsigned char>(mesh.ftype.elements[i]);
    if (falpha.block != nullptr) falpha[e] = static_cast<unsigned char>(mesh.falpha.elements[i]);
    if (fmask.block != nullptr) fmask[e] = static_cast<unsigned short>(mesh.fmask.elements[i]);
    if (mesh.ftex.array == nullptr) continue;
    if (const texturemetrics* metrics = metrics_of(static_cast<unsigned short>(mesh.ftex.elements[i]))) {
      if (metrics->scroll_u != 0 || metrics->scroll_v != 0) hasanimatedtexture = true;
      if (metrics->alpha_kind == 2) hasalpha = true;
    }
  }
}

// The carrier of a billboard shrinks to the mean of its corners, in billboard order, for every face that shares them.
void model::collapse_carriers() {
  for (int j = 0; j < billboards.count(); ++j) {
    const unsigned short f = billboards[j].face;
    Vector4_s &a = vpos[fa[f]], &b = vpos[fb[f]], &c = vpos[fc[f]];
    constexpr float third = 0.33333334f;
    const Vector4_s mean{(a.x + b.x + c.x) * third, (a.y + b.y + c.y) * third, (a.z + b.z + c.z) * third,
                         (a.w + b.w + c.w) * third};
    a = b = c = mean;
    fa[f] = fb[f] = fc[f];
  }
}

void model::getplist(const copied_jintArrayRO& labels) {
  if (labels.array == nullptr || labels.length() == 0) return;
  group_by_label(
      *pool, vertexcount,
      [&](int i, int& label, int& member) {
        label = labels.elements[i];
        member = i;
        return label >= 0;
      },
      vlabels);
}

void model::getflist(const copied_jintArrayRO& labels, const face_map& facemap) {
  if (labels.array == nullptr || labels.length() == 0) return;
  group_by_label(
      *pool, labels.length(),
      [&](int i, int& label, int& member) {
        label = labels.elements[i];
        member = facemap[i];
        return label >= 0 && member != dropped;
      },
      flabels);
}

void model::getbblist(const copied_jintArrayRO& labels, int billboardcount) {
  if (labels.array == nullptr || labels.length() == 0) return;
  const int first = labels.length() - billboardcount;
  group_by_label(
      *pool, billboardcount,
      [&](int j, int& label, int& member) {
        label = labels.elements[first + j];
        member = j;
        return label >= 0;
      },
      bblabels);
}
