// Built models against the slow reference, array by array, and meshes with one broken promise.
#include <cstring>
#include <functional>

#include "model/mesh_fixture.h"
#include "support/frame_record.h"
#include "util/memorymanager/allocatedmemory.h"

namespace {

class ModelBuildTest : public mesh_fixture {
 protected:
  template <class T, class U>
  static void same(const char* name, const sharedarray<T>& found, const std::vector<U>& expected) {
    static_assert(sizeof(T) == sizeof(U));
    if (expected.empty()) {
      EXPECT_EQ(found.count(), 0) << name;
      return;
    }
    ASSERT_GE(found.count(), static_cast<int>(expected.size())) << name;
    EXPECT_EQ(std::memcmp(found.data(), expected.data(), expected.size() * sizeof(T)), 0) << name;
  }
  static void same_labels(const char* name, const sharedarray2d<unsigned short>& found,
                          const oracle::Labels& expected) {
    EXPECT_EQ(found.rows.count(), static_cast<int>(expected.rows.size())) << name;
    same(name, found.rows, expected.rows);
    same(name, found.data, expected.members);
  }
  // Bit for bit but for the sign of zero: the reference rounds where the library does. Not a number equals itself.
  static void same_floats(const char* name, const float* found, const float* expected, int lanes) {
    for (int k = 0; k < lanes; ++k) {
      const bool both_none = found[k] != found[k] && expected[k] != expected[k];
      ASSERT_TRUE(found[k] == expected[k] || both_none)
          << name << " lane " << k << ": " << found[k] << ", expected " << expected[k];
    }
  }
  static void same_vectors(const char* name, const sharedarray<Vector4_s>& found,
                           const std::vector<Vector4_s>& expected, int lanes) {
    const int n = static_cast<int>(expected.size());
    ASSERT_GE(found.count(), n) << name;
    for (int i = 0; i < n; ++i) same_floats(name, &found[i].x, &expected[i].x, lanes);
  }

  static void same_model(const model& m, const oracle::Model& o) {
    EXPECT_EQ(m.facecount, o.facecount);
    EXPECT_EQ(m.texfacecount, o.texfacecount);
    EXPECT_EQ(m.hasalpha, o.hasalpha);
    EXPECT_EQ(m.hasanimatedtexture, o.hasanimatedtexture);
    EXPECT_TRUE(m.facecount == 0 || (m.ftype.block == nullptr) == o.ftype.empty());
    same_vectors("vpos", m.vpos, o.vpos, 3);
    same("fa", m.fa, o.corner[0]), same("fb", m.fb, o.corner[1]), same("fc", m.fc, o.corner[2]);
    same("vmask", m.vmask, o.vmask), same("fhsl", m.fhsl, o.fhsl), same("ftype", m.ftype, o.ftype);
    same("fpriority", m.fpriority, o.fpriority), same("falpha", m.falpha, o.falpha), same("fmask", m.fmask, o.fmask);
    same("ftex", m.ftex, o.ftex), same("pslist", m.pslist, o.pslist);
    same_labels("vlabels", m.vlabels, o.vlabels);
    same_labels("flabels", m.flabels, o.flabels);
    same_labels("bblabels", m.bblabels, o.bblabels);
    for (int e = 0; e < o.texfacecount; ++e) {
      same_floats("fuv0", &m.fuv0[e].u, &o.fuv[0][e].u, 2);
      same_floats("fuv1", &m.fuv1[e].u, &o.fuv[1][e].u, 2);
      same_floats("fuv2", &m.fuv2[e].u, &o.fuv[2][e].u, 2);
    }
    ASSERT_EQ(m.billboards.count(), static_cast<int>(o.billboards.size()));
    ASSERT_EQ(m.billboardproperties.count(), m.billboards.count());
    for (int j = 0; j < m.billboards.count(); ++j) {
      const billboard& b = m.billboards[j];
      const oracle::Billboard& e = o.billboards[j];
      const billboard_properties& p = m.billboardproperties[j];
      EXPECT_EQ(std::tuple(b.face, b.width, b.height, b.texture, b.colourop, b.blend, b.flag, p.argb),
                std::tuple(e.face, e.width, e.height, e.texture, e.colourop, e.blend, e.flag, e.argb));
      EXPECT_EQ(std::tuple(p.scalex, p.scaley, p.offsetx, p.offsety, p.rotation), std::tuple(1, 1, 0, 0, 0));
    }
  }

  static void same_light(const model& m, const oracle::Model& o) {
    same("ftype", m.ftype, o.ftype);
    if (o.fcolours.empty()) return;
    same_vectors("vnormal", m.vnormal, o.vnormal, 4);
    for (int f = 0; f < o.facecount; ++f) {
      const int type = o.ftype.empty() ? 0 : o.ftype[f];
      if (type == 1) same_floats("fnormal", &m.fnormal[f].x, &o.fnormal[f].x, 4);
      for (int k = 0; k < 3 && type < 2; ++k) ASSERT_EQ(m.fcolours[f].corner[k], o.fcolours[3 * f + k]) << "face " << f;
    }
    EXPECT_TRUE(m.facecount == 0 || (m.fhsl.block == nullptr) == o.fhsl.empty());
  }

  void same_bounds(jobject mesh, oracle::Model& o) {
    o.bounds();
    const std::pair<jint (*)(JNIEnv*, jobject), int> getters[] = {
        {Java_h_N, o.radiuscylinder}, {Java_h_n, o.radiussphere}, {Java_h_RA, o.low[0]}, {Java_h_ya, o.high[0]},
        {Java_h_YA, o.low[1]},        {Java_h_o, o.high[1]},      {Java_h_AA, o.low[2]}, {Java_h_ha, o.high[2]}};
    for (const auto& [getter, expected] : getters) EXPECT_EQ(getter(env, mesh), expected & 0xFFFF);
  }
};

TEST_F(ModelBuildTest, RandomMeshesBecomeTheReferencesModels) {
  test_random random(1);
  int textured = 0, billboards = 0;
  std::vector<float> coordinates;
  for (int n = 0; n < 1500 && !HasFailure(); ++n) {
    SCOPED_TRACE(n);
    const Mesh mesh = random_mesh(random, false);
    const jobject object = build(mesh);
    ASSERT_EQ(java.take_exception(), "");
    oracle::Model o(mesh);
    model& m = get(object);
    same_model(m, o);
    EXPECT_EQ(std::tuple(m.priority, m.emittercount, m.effectorcount),
              std::tuple(mesh.priority, mesh.emittercount, mesh.effectorcount));
    textured += o.texfacecount;
    billboards += static_cast<int>(o.billboards.size());
    for (const auto& corner : o.fuv) {
      for (const oracle::Coordinates& c : corner) coordinates.insert(coordinates.end(), {c.u, c.v});
    }
    EXPECT_EQ(Java_h_m(env, object), mesh.functionmask);
    EXPECT_EQ(Java_h_i(env, object) != 0, o.hasalpha || !o.falpha.empty());
    EXPECT_EQ(Java_h_u(env, object) != 0, o.hasanimatedtexture);
    same_bounds(object, o);

    // Functions that are given up; faces without a type come back into the light when theirs is.
    const int mask = mesh.functionmask & static_cast<int>(random.word());
    const bool relit = !o.ftype.empty() && (mesh.functionmask & ~mask & 0x10000) != 0;
    Java_h_KA(env, object, mesh.functionmask | 1 << 20);
    EXPECT_EQ(java.take_exception(),
              "java.lang.IllegalArgumentException: Can't re-enable previously disabled functions");
    Java_h_p(env, object, o.ambient = random.between(0, 500));
    Java_h_KA(env, object, mask);
    o.update_mask(static_cast<unsigned int>(mask));
    EXPECT_EQ(Java_h_m(env, object), mask);
    if (!relit && !o.fhsl.empty()) {
      m.light(false);
      o.light();
    }
    same_light(m, o);
    Java_h_ma(env, object);
    ASSERT_EQ(allocatedmemory::allocated_size, 0);
  }
  frame_record::add("models.texture_coordinates", coordinates.data(), coordinates.size());
  EXPECT_GT(textured, 5000);
  EXPECT_GT(billboards, 400);
}

// A mesh with one broken promise names the argument, makes no model and costs no memory.
TEST_F(ModelBuildTest, BrokenPromisesAreRefused) {
  if (!VELMARK5_CHECKS) GTEST_SKIP();
  test_random r(2);
  struct promise {
    std::string exception;
    std::function<bool(Mesh&)> break_it;  // false where this mesh does not make it
  };
  std::vector<promise> promises;
  const std::string argument = "java.lang.IllegalArgumentException: ";
  const std::string array = "java.lang.ArrayIndexOutOfBoundsException: ";
  const auto always = [](const Mesh&) { return true; };
  const auto textured = [](const Mesh& m) { return m.ftex && m.fmapping && oracle::Model(m).texfacecount > 0; };
  const auto mapped = [textured](const Mesh& m) { return m.mappingcount > 0 && textured(m); };
  const auto outside = [&](int limit) { return r.one_in(2) ? -r.between(1, 30000) : r.between(limit, 32767); };

  // A count that `wrong` sets.
  const auto count = [&](const std::string& name, auto wrong) {
    promises.push_back({argument + name, [wrong](Mesh& m) { return wrong(m), true; }});
  };
  // An array that is too short.
  const auto length = [&](const std::string& name, auto field, auto when) {
    promises.push_back({array + name + ": length", [&r, field, when](Mesh& m) {
                          auto& list = std::invoke(field, m);
                          if (!list || list->empty() || !when(m)) return false;
                          list->resize(r.between(0, static_cast<int>(list->size()) - 1));
                          return true;
                        }});
  };
  // An array that is too short, or not there at all.
  const auto needed = [&](const std::string& name, auto field, auto when) {
    length(name, field, when);
    promises.push_back({"java.lang.NullPointerException: ",
                        [field, when](Mesh& m) { return when(m) && (std::invoke(field, m).reset(), true); }});
  };
  // An element of a wrong value.
  const auto element = [&](const std::string& name, auto field, auto when, auto value) {
    promises.push_back({argument + name + "[", [&r, field, when, value](Mesh& m) {
                          auto& list = std::invoke(field, m);
                          if (!list || list->empty() || !when(m)) return false;
                          auto& wrong = (*list)[r.between(0, static_cast<int>(list->size()) - 1)];
                          wrong = static_cast<std::decay_t<decltype(wrong)>>(value(m));
                          return true;
                        }});
  };

  count("vertexcount", [&](Mesh& m) { m.vertexcount = r.one_in(2) ? -r.between(1, 9) : r.between(16769, 0x7FFFFFFF); });
  count("meshvertexcount", [&](Mesh& m) { m.meshvertexcount = r.one_in(2) ? -r.between(1, 9) : m.vertexcount + 1; });
  count("inputfacecount", [&](Mesh& m) { m.inputfacecount = r.between(16769, 0x7FFFFFFF); });
  count("emittercount", [&](Mesh& m) { m.emittercount = -r.between(1, 9); });
  count("effectorcount", [&](Mesh& m) { m.effectorcount = -r.between(1, 9); });
  for (int k = 0; k < 3; ++k) {
    const auto each_of = [k](auto fields) {
      return [ k, fields ](Mesh & m) -> auto& { return (m.*fields)[k]; };
    };
    const auto name = [k](const std::string& start, const char* ends) { return start + ends[k]; };
    needed(name("", "xyz"), each_of(&Mesh::position), always);
    needed(name("", "abc"), each_of(&Mesh::corner), always);
    element(name("", "abc"), each_of(&Mesh::corner), always, [&](Mesh& m) { return outside(m.meshvertexcount); });
    needed(name("mappingscale", "xyz"), each_of(&Mesh::mappingscale), mapped);
    needed(name("mappingtranslate", "xyz"), each_of(&Mesh::mappingtranslate), mapped);
    needed(name("mapping", "pmn"), each_of(&Mesh::mappingaxis), mapped);
    // The vertices that span a plane.
    promises.push_back({argument + name("mapping", "pmn") + "[", [&, k](Mesh& m) {
                          const int used = mapped(m) ? static_cast<unsigned char>(m.fmapping->front()) : 255;
                          if (used == 255) return false;
                          (*m.ftex)[0] = textures - 1;
                          if (m.ftype) (*m.ftype)[0] = 0;
                          m.flags &= ~MF_NOALPHATEXTURE;
                          (*m.mappingtype)[used] = 0;
                          for (auto& point : m.mappingaxis) (*point)[used] = 0;
                          (*m.mappingaxis[k])[used] = static_cast<std::int16_t>(outside(m.vertexcount));
                          return true;
                        }});
  }
  needed("fhsl", &Mesh::fhsl, always);
  needed("mappingtype", &Mesh::mappingtype, mapped);
  needed("mappingrotation", &Mesh::mappingrotation, mapped);
  needed("mappingdirection", &Mesh::mappingdirection, mapped);
  length("ftype", &Mesh::ftype, always);
  length("fpriority", &Mesh::fpriority, always);
  length("falpha", &Mesh::falpha, always);
  length("fmapping", &Mesh::fmapping, always);
  length("ftex", &Mesh::ftex, always);
  length("fmask", &Mesh::fmask, always);
  promises.push_back({array + "pslist", [](Mesh& m) { return m.effectorcount = 99, true; }});
  const auto vertex_labels = [](const Mesh& m) { return (m.functionmask & 0x20) != 0; };
  const auto face_labels = [](const Mesh& m) { return (m.functionmask & 0x180) != 0; };
  const auto no_label = [&](const Mesh&) { return r.between(256, 0x7FFFFFFF); };
  element("vertexlabels", &Mesh::vertexlabels, vertex_labels, no_label);
  element("facelabels", &Mesh::facelabels, face_labels, no_label);
  const auto counted_points = [](Mesh& m) {
    m.pslist->resize(3 * m.emittercount + m.effectorcount);
    return !m.pslist->empty();
  };
  element("pslist", &Mesh::pslist, counted_points, [&](const Mesh& m) { return outside(m.vertexcount); });
  element("ftex", &Mesh::ftex, always, [&](const Mesh&) { return r.one_in(2) ? r.between(textures, 32767) : -2; });
  element("fmapping", &Mesh::fmapping, textured, [&](const Mesh& m) { return r.between(m.mappingcount, 254); });
  for (const int word : {0, 3}) {
    promises.push_back({argument + "billboarddata[", [&, word](Mesh& m) {
                          if (!m.billboarddata || m.billboarddata->size() < 8) return false;
                          (*m.billboarddata)[word] = word == 0 ? outside(m.inputfacecount) : textures;
                          return true;
                        }});
  }

  std::vector<int> broken(promises.size());
  for (std::size_t n = 0; n < 4000; ++n) {
    const auto& [exception, break_it] = promises[n % promises.size()];
    Mesh mesh = random_mesh(r, false);
    if (!break_it(mesh)) continue;
    ++broken[n % promises.size()];
    const jobject object = build(mesh);
    ASSERT_EQ(java.take_exception().substr(0, exception.size()), exception) << "mesh " << n;
    ASSERT_EQ(java.nativeid(object), 0);
    ASSERT_EQ(Java_ja_za(env, peer), 0);
    ASSERT_EQ(java.arrays_out(), 0);
  }
  for (std::size_t kind = 0; kind < promises.size(); ++kind) {
    EXPECT_GT(broken[kind], 3) << promises[kind].exception << ", promise " << kind;
  }
}

// What no model is made of may hold anything.
TEST_F(ModelBuildTest, OddMeshesThatAreAllowed) {
  const auto two_billboards = [](Mesh& m, int mask, std::vector<int> labels) {
    m.functionmask = mask;
    m.billboarddata = {{0, 1, 1, -1, 0, 0, 0, 0, 1, 1, -1, 0, 0, 0, 0, 0}};
    m.facelabels = std::move(labels);
  };
  const auto plane = [](Mesh& m) {
    m.mappingcount = 1;
    for (auto* list : {&m.mappingtype, &m.mappingrotation, &m.mappingdirection}) *list = {{0}};
    for (auto& list : m.mappingaxis) list = {{99}};
    for (auto& list : m.mappingscale) list = {{1}};
    for (auto& list : m.mappingtranslate) list = {{1}};
    m.inputfacecount = 2;
    for (auto& list : m.corner) list->push_back(list->front());
    m.fhsl = {{1, 2}}, m.fmapping = {{0, -1}}, m.ftex = {{-1, textures - 1}};
  };
  const std::function<void(Mesh&)> odd[] = {
      [](Mesh& m) { m.ftex = {{-1}}, m.fmapping = {{0}}; },
      [](Mesh& m) { m.ftex = {{-1}}, m.fmapping = {{0}}, m.mappingcount = 1; },
      [](Mesh& m) { m.ftex = {{1}}, m.ftype = {{2}}, m.fmapping = {{0}}; },
      [&](Mesh& m) { two_billboards(m, FM_ANIMATE_COLOUR, {1}); },
      [&](Mesh& m) { two_billboards(m, FM_ANIMATE_BILLBOARD, std::vector<int>(16769, 1)); },
      [&](Mesh& m) {
        two_billboards(m, FM_ANIMATE_BILLBOARD, {256, 3, 4});
      },
      [](Mesh& m) {
        m.pslist = {{0, -1}}, m.effectorcount = 1;
      },
      plane,
  };
  for (const auto& change : odd) {
    SCOPED_TRACE(&change - odd);
    Mesh mesh = triangle();
    change(mesh);
    const jobject object = build(mesh);
    ASSERT_EQ(java.take_exception(), "");
    same_model(get(object), oracle::Model(mesh));
    Java_h_ma(env, object);
  }
}

}  // namespace
