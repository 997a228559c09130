#include "natives/mesh_contract.h"

#include <algorithm>

#include "model/mesh_views.h"
#include "model/model.h"
#include "natives/contract.h"
#include "texture/texturecache.h"
#include "toolkit/toolkit.h"

namespace mesh_contract {

namespace {

constexpr int max_label = 255;

void in_range(const char* name, int i, int value, int limit) {
  if (value < 0 || value >= limit) contract::fail_argument("%s[%d]: %d is not from 0 to %d", name, i, value, limit - 1);
}

template <class View>
void required(const char* name, const View& view, int count) {
  contract::not_null(view.array);
  contract::array_holds(name, view.length(), count);
}

template <class View>
void optional(const char* name, const View& view, int count) {
  if (view.array != nullptr) contract::array_holds(name, view.length(), count);
}

void check_counts(const mesh_views& mesh) {
  const auto at_most = [](const char* name, int value, int limit) {
    if (value > limit) contract::fail_argument("%s: %d is more than %d", name, value, limit);
  };
  contract::not_negative("vertexcount", mesh.vertexcount);
  at_most("vertexcount", mesh.vertexcount, mesh_views::max_vertices);
  contract::not_negative("meshvertexcount", mesh.meshvertexcount);
  at_most("meshvertexcount", mesh.meshvertexcount, mesh.vertexcount);
  at_most("inputfacecount", mesh.inputfacecount, mesh_views::max_faces);
  contract::not_negative("emittercount", mesh.emittercount);
  contract::not_negative("effectorcount", mesh.effectorcount);
}

void check_vertices(const mesh_views& mesh) {
  required("x", mesh.x, mesh.vertexcount);
  required("y", mesh.y, mesh.vertexcount);
  required("z", mesh.z, mesh.vertexcount);
  if (mesh.vertexlabels.length() > 0 && (mesh.functionmask & FM_ANIMATE_VERTICES) != 0) {
    contract::array_holds("vertexlabels", mesh.vertexlabels.length(), mesh.vertexcount);
    for (int i = 0; i < mesh.vertexcount; ++i) {
      if (mesh.vertexlabels.elements[i] > max_label) {
        in_range("vertexlabels", i, mesh.vertexlabels.elements[i], max_label + 1);
      }
    }
  }
  const long long points = 3LL * mesh.emittercount + mesh.effectorcount;
  contract::array_holds("pslist", mesh.pslist.length(), points);
  for (int i = 0; i < points; ++i) in_range("pslist", i, mesh.pslist.elements[i], mesh.vertexcount);
}

void check_texture(const char* name, int i, int texture, const toolkit& scene) {
  const int known = scene.textures != nullptr ? scene.textures->count() : 0;
  if (texture != no_texture && texture >= known) {
    contract::fail_argument("%s[%d]: texture %d has no metrics, %d textures have", name, i, texture, known);
  }
}

void check_faces(const mesh_views& mesh, const toolkit& scene) {
  const int faces = std::max(mesh.inputfacecount, 0);
  required("a", mesh.a, faces);
  required("b", mesh.b, faces);
  required("c", mesh.c, faces);
  required("fhsl", mesh.fhsl, faces);
  optional("ftype", mesh.ftype, faces);
  optional("fpriority", mesh.fpriority, faces);
  optional("falpha", mesh.falpha, faces);
  optional("fmapping", mesh.fmapping, faces);
  optional("ftex", mesh.ftex, faces);
  optional("fmask", mesh.fmask, faces);
  for (int i = 0; i < faces; ++i) {
    in_range("a", i, mesh.a.elements[i], mesh.meshvertexcount);
    in_range("b", i, mesh.b.elements[i], mesh.meshvertexcount);
    in_range("c", i, mesh.c.elements[i], mesh.meshvertexcount);
    if (mesh.ftex.array != nullptr) {
      check_texture("ftex", i, static_cast<unsigned short>(mesh.ftex.elements[i]), scene);
    }
  }
}

void check_billboards_and_labels(const mesh_views& mesh, const toolkit& scene) {
  const int count = mesh.billboardcount();
  for (int j = 0; j < count; ++j) {
    const int* const record = mesh.billboarddata.elements + j * mesh_views::billboard_words;
    in_range("billboarddata", j * mesh_views::billboard_words, record[0], mesh.inputfacecount);
    check_texture("billboarddata", j * mesh_views::billboard_words + 3, static_cast<unsigned short>(record[3]), scene);
  }

  const bool groups_faces = (mesh.functionmask & (FM_ANIMATE_COLOUR | FM_ANIMATE_ALPHA)) != 0;
  const bool groups_billboards = (mesh.functionmask & FM_ANIMATE_BILLBOARD) != 0 && mesh.billboarddata.array != nullptr;
  const int length = mesh.facelabels.length();
  if (length == 0 || (!groups_faces && !groups_billboards)) return;
  if (groups_billboards) contract::array_holds("facelabels", length, count);
  if (groups_faces && length > mesh_views::max_faces) {
    contract::fail_argument("facelabels: length %d is more than %d", length, mesh_views::max_faces);
  }
  for (int i = groups_faces ? 0 : length - count; i < length; ++i) {
    if (mesh.facelabels.elements[i] > max_label) in_range("facelabels", i, mesh.facelabels.elements[i], max_label + 1);
  }
}

// Whether the face has a texture in the model.
bool keeps_texture(const mesh_views& mesh, const toolkit& scene, int i) {
  if (mesh.ftype.array != nullptr && mesh.ftype.elements[i] == FT_HIDDEN) return false;
  const texturemetrics* const metrics = scene.get_texturemetrics(static_cast<unsigned short>(mesh.ftex.elements[i]));
  if (metrics == nullptr || metrics->do_not_draw) return false;
  return (mesh.flags & MF_NOALPHATEXTURE) == 0 || !metrics->flat_colour;
}

void check_mappings(const mesh_views& mesh, const toolkit& scene) {
  if (mesh.ftex.array == nullptr || mesh.fmapping.array == nullptr) return;
  const auto textured = [&](int i) { return keeps_texture(mesh, scene, i); };
  int first = 0;
  while (first < mesh.inputfacecount && !textured(first)) ++first;
  if (first >= mesh.inputfacecount) return;
  const int count = std::max(mesh.mappingcount, 0);
  if (count > 0) {
    required("mappingtype", mesh.mappingtype, count);
    required("mappingp", mesh.mappingp, count);
    required("mappingm", mesh.mappingm, count);
    required("mappingn", mesh.mappingn, count);
    required("mappingscalex", mesh.mappingscalex, count);
    required("mappingscaley", mesh.mappingscaley, count);
    required("mappingscalez", mesh.mappingscalez, count);
    required("mappingrotation", mesh.mappingrotation, count);
    required("mappingdirection", mesh.mappingdirection, count);
    required("mappingtranslatex", mesh.mappingtranslatex, count);
    required("mappingtranslatey", mesh.mappingtranslatey, count);
    required("mappingtranslatez", mesh.mappingtranslatez, count);
  }
  for (int i = 0; i < mesh.inputfacecount; ++i) {
    const int m = static_cast<unsigned char>(mesh.fmapping.elements[i]);
    if (m == 255) continue;
    in_range("fmapping", i, m, count);
    if (mesh.mappingtype.elements[m] != 0 || !textured(i)) continue;
    in_range("mappingp", m, mesh.mappingp.elements[m], mesh.vertexcount);
    in_range("mappingm", m, mesh.mappingm.elements[m], mesh.vertexcount);
    in_range("mappingn", m, mesh.mappingn.elements[m], mesh.vertexcount);
  }
}

}  // namespace

void check(const mesh_views& mesh, const toolkit& scene) {
  if (!contract::checked) return;
  check_counts(mesh);
  check_vertices(mesh);
  check_faces(mesh, scene);
  check_mappings(mesh, scene);
  check_billboards_and_labels(mesh, scene);
}

void has_storage(const model& mesh) {
  if (contract::checked && mesh.vpos.block != nullptr && mesh.vpos.address == nullptr) {
    contract::fail_state("model: its pool is gone");
  }
}

}  // namespace mesh_contract
