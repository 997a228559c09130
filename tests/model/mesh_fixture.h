// Random meshes, materials and scenes for the tests of models: each mesh goes to the library and to the slow reference.
#pragma once

#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <functional>
#include <string>
#include <vector>

#include "model/model.h"
#include "reference/model_oracle.h"
#include "support/random.h"
#include "support/toolkit_fixture.h"
#include "texture/texturecache.h"

class mesh_fixture : public toolkit_fixture {
 public:
  static constexpr int textures = 42;
  static constexpr int undelivered = 7;  // the client has no pixels for multiples of it
  using Mesh = oracle::Mesh;

  std::vector<int> refused;  // undelivered textures that were asked for, repeats in a row left out
  std::function<void()> inside_request;

  void SetUp() override {
    Java_ja_q(env, peer, java.new_object("source"), textures);
    Java_ba_sa(env, pool_peer, 0, pool_size);
    Java_ja_n(env, peer, pool_peer);
    Java_a_ha(env, resource_peer, 0, 0, 0, 0, 0);
    ASSERT_EQ(java.take_exception(), "");
    test_random random(77);
    for (jshort id = 0; id < textures; ++id) {
      texture_image& m = images[id];
      m.attributes = random_attributes(random, id);
      std::apply([&](auto... values) { Java_ja_V(env, peer, id, values...); }, m.attributes);
      if (id == textures - 1) m.attributes[1] = 2;  // it blends, which only its pixels tell
      std::vector<jint> pixels(16384);
      for (jint& p : pixels) p = static_cast<jint>(random.one_in(6) ? 0 : random.word());
      m.pixels = java.new_ints(pixels);
    }
    java.request_texture = [this](jshort id) -> jboolean {
      if (inside_request) inside_request();
      if (id % undelivered == 0) {
        if (refused.empty() || refused.back() != id) refused.push_back(id);
        return 0;
      }
      const texture_image& m = images[id];
      std::apply([&](auto... values) { Java_ja_F(env, peer, id, m.pixels, values...); }, m.attributes);
      return 1;
    };
  }

  void TearDown() override {
    if (java.nativeid(resource_peer) != 0) Java_a_R(env, resource_peer, java.nativeid(resource_peer));
    toolkit_fixture::TearDown();
  }

  // --- Meshes -----------------------------------------------------------------------------------------------------

  // One face, which faces the viewer.
  static Mesh triangle() {
    Mesh m;
    m.vertexcount = m.meshvertexcount = 3;
    m.position[0] = {{-5, 100, -5}}, m.position[1] = {{-60, 60, 60}}, m.position[2] = {{0, 0, 0}};
    m.inputfacecount = 1;
    m.corner[0] = {{0}}, m.corner[1] = {{2}}, m.corner[2] = {{1}};
    m.fhsl = {{0}};
    return m;
  }

  // A drawn mesh leaves no colour open, and its billboards show nothing. A full one has every array, all functions, and
  // something of each kind.
  enum mesh_kind { any_mesh, drawn_mesh, full_mesh };
  static Mesh random_mesh(test_random& r, mesh_kind kind) {
    Mesh m;
    const int least = kind == full_mesh ? 1 : 0;
    const auto list = [&r, kind]<class T>(Mesh::array<T>& out, int n, int share, auto value) {
      if (share > 1 && kind != full_mesh && !r.one_in(share)) return;
      out.emplace();
      for (int i = 0; i < n; ++i) out->push_back(static_cast<T>(value()));
    };
    const auto range = [&r](int low, int high) { return [&r, low, high] { return r.between(low, high); }; };
    m.vertexcount = r.between(4, 60);
    m.meshvertexcount = r.one_in(3) ? r.between(4, m.vertexcount) : m.vertexcount;
    for (int axis = 0; axis < 3; ++axis) {
      list(m.position[axis], m.vertexcount, 1, range(-120, 120));
      // Four points that span a volume.
      for (int i = 0; i < 4; ++i) (*m.position[axis])[i] = i == axis + 1 ? 90 + 4 * axis : 0;
    }
    const int top_label = r.one_in(5) ? 255 : 9;
    list(m.vertexlabels, m.vertexcount, 2, range(-2, top_label));
    list(m.vmask, r.between(0, 70), 2, range(-32768, 32767));

    const int n = m.inputfacecount = r.between(kind == any_mesh ? 0 : 1, 40);
    for (auto& corner : m.corner) list(corner, n, 1, range(0, m.meshvertexcount - 1));
    list(m.ftype, n, 2, [&] {
      return r.one_in(5) ? 2 : r.one_in(8) && kind != drawn_mesh ? r.between(3, 255) : r.between(0, 1);
    });
    list(m.fpriority, n, 2, range(-128, 127));
    list(m.falpha, n, 2, [&] { return r.one_in(8) ? 255 : r.one_in(2) ? 0 : r.between(1, 254); });
    list(m.fhsl, n, 1, range(-32768, 32767));
    const int first_texture = r.one_in(3) ? textures - 3 : 0;  // the last three do not seem to blend
    if (kind == full_mesh || !r.one_in(5))
      list(m.ftex, n, 1, [&] { return r.one_in(4) ? -1 : r.between(first_texture, textures - 1); });
    list(m.fmask, n, 2, range(-32768, 32767));
    m.priority = static_cast<std::int8_t>(r.between(-128, 127));

    const int k = m.mappingcount = r.between(least, 5);
    if (k > 0 || r.one_in(2)) {
      list(m.fmapping, n, r.one_in(4) ? 2 : 1, [&] { return k == 0 || r.one_in(5) ? -1 : r.between(0, k - 1); });
    }
    list(m.mappingtype, k, 1, range(-1, 4));
    for (int axis = 0; axis < 3; ++axis) {
      m.mappingaxis[axis].emplace();
      list(m.mappingscale[axis], k, 1, [&] { return r.between(1, 3000) * (r.one_in(4) ? -1 : 1); });
      list(m.mappingtranslate[axis], k, 1, range(-999, 999));
    }
    for (int i = 0; i < k; ++i) {
      // A direction, or vertices that span a plane.
      float to[3] = {r.real(-1, 1), r.real(-1, 1), r.real(-1, 1)};
      if (r.one_in(4)) to[0] = to[2] = 0;
      const float scale = 32767 / std::sqrt(to[0] * to[0] + to[1] * to[1] + to[2] * to[2]);
      const int type = (*m.mappingtype)[i], first = r.between(0, 3);
      for (int axis = 0; axis < 3; ++axis) {
        const int value = type == 0 ? (first + axis) % 4 : static_cast<int>(to[axis] * scale);
        m.mappingaxis[axis]->push_back(static_cast<std::int16_t>(value));
      }
      if (type == 1 && r.one_in(3)) (*m.mappingscale[0])[i] = 0;
    }
    list(m.mappingrotation, k, 1, range(-128, 127));
    list(m.mappingdirection, k, 1, range(0, 5));

    m.emittercount = r.between(least, 2);
    m.effectorcount = r.between(0, 2);
    const int points = 3 * m.emittercount + m.effectorcount;
    list(m.pslist, points + (kind == full_mesh ? 0 : r.between(0, 2)), points > 0 ? 1 : 2, range(0, m.vertexcount - 1));
    m.functionmask = kind == full_mesh ? 0xFFFFF : static_cast<int>(r.word() & 0xFFFFF);
    m.flags = static_cast<int>(r.word());
    m.ambient = r.between(0, 300);
    m.contrast = r.between(200, 2000);
    const int billboards = n > 0 && (kind == full_mesh || r.one_in(2)) ? r.between(least, 3) : 0;
    list(m.billboarddata, billboards * 8 + r.between(0, 7), billboards > 0 ? 1 : 2, [&] { return 0; });
    for (int j = 0; j < billboards; ++j) {
      const int texture = kind == drawn_mesh ? -1 : r.between(0, 41);
      const int record[] = {r.between(0, n - 1), r.between(0, 65535), r.between(0, 65535), texture,
                            r.between(0, 4),     r.between(0, 2),     r.between(0, 2)};
      std::copy(std::begin(record), std::end(record), m.billboarddata->begin() + 7 * j);
    }
    // Sometimes labels for fewer faces, or for more things than there are.
    const int labels = n + billboards + (kind != full_mesh && r.one_in(4) ? r.between(-n, 5) : 0);
    list(m.facelabels, labels, 2, range(-2, top_label));
    if (kind == full_mesh) {  // and a face with a texture
      (*m.ftype)[0] = 0, (*m.ftex)[0] = textures - 1;
      m.flags &= ~MF_NOALPHATEXTURE;
    }
    return m;
  }

  jobject build(const Mesh& m) {
    const jobject object = java.new_object("h");
    build_into(object, m);
    return object;
  }

  void build_into(jobject object, const Mesh& m) {
    const auto ints = [this](const Mesh::ints& v) { return v ? java.new_ints({v->begin(), v->end()}) : nullptr; };
    const auto shorts = [this](const Mesh::shorts& v) { return v ? java.new_shorts({v->begin(), v->end()}) : nullptr; };
    const auto bytes = [this](const Mesh::bytes& v) { return v ? java.new_bytes({v->begin(), v->end()}) : nullptr; };
    Java_h_U(env, object, nullptr, pool_peer, m.vertexcount, m.meshvertexcount, ints(m.position[0]),
             ints(m.position[1]), ints(m.position[2]), ints(m.vertexlabels), shorts(m.vmask), m.inputfacecount,
             shorts(m.corner[0]), shorts(m.corner[1]), shorts(m.corner[2]), bytes(m.ftype), bytes(m.fpriority),
             bytes(m.falpha), bytes(m.fmapping), shorts(m.fhsl), shorts(m.ftex), ints(m.facelabels), m.priority,
             shorts(m.fmask), m.mappingcount, bytes(m.mappingtype), shorts(m.mappingaxis[0]), shorts(m.mappingaxis[1]),
             shorts(m.mappingaxis[2]), ints(m.mappingscale[0]), ints(m.mappingscale[1]), ints(m.mappingscale[2]),
             bytes(m.mappingrotation), bytes(m.mappingdirection), ints(m.mappingtranslate[0]),
             ints(m.mappingtranslate[1]), ints(m.mappingtranslate[2]), ints(m.pslist), m.emittercount, m.effectorcount,
             m.functionmask, m.flags, m.ambient, m.contrast, ints(m.billboarddata));
  }

  model& get(jobject object) const { return *native<model>(object); }

  // --- Scenes -----------------------------------------------------------------------------------------------------

  using Numbers = std::vector<jfloat>;

  // A turn about y and then about x, a scale, and a displacement.
  static Numbers placed(float turn, float tilt, float scale, float x, float y, float z) {
    const float c = std::cos(turn) * scale, s = std::sin(turn) * scale, p = std::cos(tilt), q = std::sin(tilt);
    return {c, s * q, -s * p, 0, 0, p * scale, q * scale, 0, s, -c * q, c * p, 0, x, y, z, 1};
  }

  void perspective(float near, float far) {
    const float range = (far + near) / (far - near);
    Java_ja_wa(env, peer,
               java.new_floats({1, 0, 0, 0, 0, 1.4f, 0, 0, 0, 0, range, 1, 0, 0, -2 * far * near / (far - near), 0}));
  }

  void draw(jobject mesh, const Numbers& world, jintArray result = nullptr) {
    Java_a_wa(env, resource_peer, java.nativeid(resource_peer), mesh, java.new_floats(world), result);
  }

  const jobject resource_peer = java.new_object("a");

 private:
  // As the natives take them.
  using attribute_values = std::array<jint, 19>;
  static attribute_values random_attributes(test_random& r, int id) {
    const auto byte = [&r](int one_in) { return r.one_in(one_in) ? r.between(-128, 127) : 0; };
    const jint hsl = r.between(-32768, 32767), alpha = id == textures - 1 ? 0 : id % 3, lighting = r.one_in(5) ? 6 : 1;
    const jint grey = byte(2), bright = byte(2), u = byte(4), v = byte(4);
    const jint flat = r.one_in(5), hidden = r.one_in(9) && id < textures - 3, wrap_u = r.one_in(3),
               wrap_v = r.one_in(3);
    return {hsl, alpha, lighting, 0, 0, 0, grey, bright, u, v, flat, hidden, 0, wrap_u, wrap_v};
  }

  struct texture_image {
    attribute_values attributes;
    jintArray pixels;
  };
  texture_image images[textures];
};
