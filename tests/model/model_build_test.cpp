// Built models against the slow reference, array by array, and meshes with one broken promise.
#include <bit>
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
    if (expected.empty()) return;
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
  static bool equal(float found, float expected) {
    return found == expected || (found != found && expected != expected);
  }
  static void same_vectors(const char* name, const sharedarray<Vector4_s>& found,
                           const std::vector<Vector4_s>& expected, int lanes) {
    ASSERT_GE(found.count(), static_cast<int>(expected.size())) << name;
    for (int i = 0; i < static_cast<int>(expected.size()); ++i) {
      for (int k = 0; k < lanes; ++k) {
        ASSERT_PRED2(equal, (&found[i].x)[k], (&expected[i].x)[k]) << name << " " << i << " lane " << k;
      }
    }
  }

  static void same_model(const model& m, const oracle::Model& o) {
    EXPECT_EQ(m.facecount, o.facecount);
    EXPECT_EQ(m.texfacecount, o.texfacecount);
    same_vectors("vpos", m.vpos, o.vpos, 3);
    same("vmask", m.vmask, o.vmask);
    same("fa", m.fa, o.fa), same("fb", m.fb, o.fb), same("fc", m.fc, o.fc), same("fhsl", m.fhsl, o.fhsl);
    same("ftype", m.ftype, o.ftype), same("fpriority", m.fpriority, o.fpriority), same("falpha", m.falpha, o.falpha);
    same("fmask", m.fmask, o.fmask), same("ftex", m.ftex, o.ftex), same("pslist", m.pslist, o.pslist);
    same_labels("vlabels", m.vlabels, o.vlabels);
    same_labels("flabels", m.flabels, o.flabels);
    same_labels("bblabels", m.bblabels, o.bblabels);
    EXPECT_EQ(m.hasalpha, o.hasalpha);
    EXPECT_EQ(m.hasanimatedtexture, o.hasanimatedtexture);
    EXPECT_TRUE(m.facecount == 0 || (m.ftype.block == nullptr) == o.ftype.empty());
    const sharedarray<texture_coordinates>* const fuv[] = {&m.fuv0, &m.fuv1, &m.fuv2};
    for (int k = 0; k < 3; ++k) {
      for (int e = 0; e < o.texfacecount; ++e) {
        ASSERT_PRED2(equal, (*fuv[k])[e].u, o.fuv[k][e].u) << "face " << e << " corner " << k;
        ASSERT_PRED2(equal, (*fuv[k])[e].v, o.fuv[k][e].v) << "face " << e << " corner " << k;
      }
    }
    ASSERT_EQ(m.billboards.count(), static_cast<int>(o.billboards.size()));
    ASSERT_EQ(m.billboardproperties.count(), m.billboards.count());
    for (int j = 0; j < m.billboards.count(); ++j) {
      const billboard& b = m.billboards[j];
      const oracle::Billboard& e = o.billboards[j];
      EXPECT_EQ(std::tuple(b.face, b.width, b.height, b.texture, b.colourop, b.blend, b.flag),
                std::tuple(e.face, e.width, e.height, e.texture, e.colourop, e.blend, e.flag));
      const billboard_properties& p = m.billboardproperties[j];
      EXPECT_EQ(p.argb, e.argb);
      EXPECT_EQ(std::tuple(p.scalex, p.scaley, p.offsetx, p.offsety, p.rotation), std::tuple(1, 1, 0, 0, 0));
    }
  }

  static void same_light(const model& m, const oracle::Model& o) {
    same_vectors("vnormal", m.vnormal, o.vnormal, 4);
    for (int f = 0; f < o.facecount; ++f) {
      if (!o.ftype.empty() && o.ftype[f] == 1) {
        for (int k = 0; k < 4; ++k) EXPECT_PRED2(equal, (&m.fnormal[f].x)[k], (&o.fnormal[f].x)[k]);
      }
      if (!o.ftype.empty() && o.ftype[f] > 1) continue;
      for (int k = 0; k < 3; ++k) ASSERT_EQ(m.fcolours[f].corner[k], o.fcolours[3 * f + k]) << "face " << f;
    }
    EXPECT_TRUE(m.facecount == 0 || (m.fhsl.block == nullptr) == o.fhsl.empty());
  }

  void same_bounds(jobject mesh, oracle::Model& o) {
    o.bounds();
    const std::pair<jint (*)(JNIEnv*, jobject), int> getters[] = {
        {Java_h_N, o.radiuscylinder}, {Java_h_n, o.radiussphere}, {Java_h_RA, o.minx}, {Java_h_ya, o.maxx},
        {Java_h_YA, o.miny},          {Java_h_o, o.maxy},         {Java_h_AA, o.minz}, {Java_h_ha, o.maxz}};
    for (const auto& [getter, expected] : getters) EXPECT_EQ(getter(env, mesh), expected & 0xFFFF);
  }
};

}  // namespace

TEST_F(ModelBuildTest, RandomMeshesBecomeTheReferencesModels) {
  test_random random(1);
  int textured = 0, billboards = 0;
  std::vector<float> coordinates;
  for (int n = 0; n < 1500; ++n) {
    SCOPED_TRACE(n);
    const Mesh mesh = random_mesh(random, false);
    const jobject object = build(mesh);
    ASSERT_EQ(java.take_exception(), "");
    oracle::Model o(mesh);
    model& m = get(object);
    same_model(m, o);
    if (HasFailure()) break;
    textured += o.texfacecount;
    for (const auto& corner : o.fuv) {
      for (const oracle::Coordinates& c : corner) coordinates.insert(coordinates.end(), {c.u, c.v});
    }
    billboards += static_cast<int>(o.billboards.size());
    EXPECT_EQ(Java_h_m(env, object), mesh.functionmask);
    EXPECT_EQ(Java_h_i(env, object) != 0, o.hasalpha || !o.falpha.empty());
    EXPECT_EQ(Java_h_u(env, object) != 0, o.hasanimatedtexture);
    same_bounds(object, o);

    {
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
      same("ftype", m.ftype, o.ftype);
      if (o.fcolours.size() == 3 * static_cast<std::size_t>(o.facecount)) same_light(m, o);
    }
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
  const std::string argument = "java.lang.IllegalArgumentException: ", array = "java.lang.ArrayIndexOutOfBounds";
  std::vector<promise> promises;
  const auto add = [&](const std::string& name, auto break_it) {
    promises.push_back({argument + name, [break_it](Mesh& m) { return break_it(m), true; }});
  };
  const auto shortened = [&](const char* name, auto field, bool optional, auto when) {
    promises.push_back({array + "Exception: " + name + ": length", [&r, field, when](Mesh& m) {
                          auto& list = m.*field;
                          if (!list || list->empty() || !when(m)) return false;
                          list->resize(r.between(0, static_cast<int>(list->size()) - 1));
                          return true;
                        }});
    if (optional) return;
    promises.push_back({"java.lang.NullPointerException: ", [field, when](Mesh& m) {
                          if (!when(m)) return false;
                          (m.*field).reset();
                          return true;
                        }});
  };
  const auto wrong = [&](const char* name, auto field, auto when, auto value) {
    promises.push_back({argument + name + "[", [&r, field, when, value](Mesh& m) {
                          auto& list = m.*field;
                          const int n = list ? static_cast<int>(list->size()) : 0;
                          if (n == 0 || !when(m)) return false;
                          const int i = r.between(0, n - 1);
                          (*list)[i] = static_cast<std::decay_t<decltype((*list)[0])>>(value(m));
                          return true;
                        }});
  };
  const auto always = [](const Mesh&) { return true; };
  const auto mapped = [](const Mesh& m) { return m.ftex && m.fmapping && m.inputfacecount > 0 && m.mappingcount > 0; };
  const auto outside = [&](int limit) { return r.one_in(2) ? -r.between(1, 30000) : r.between(limit, 32767); };

  add("vertexcount", [&](Mesh& m) { m.vertexcount = r.one_in(2) ? -r.between(1, 9) : r.between(16769, 0x7FFFFFFF); });
  add("meshvertexcount", [&](Mesh& m) { m.meshvertexcount = r.one_in(2) ? -r.between(1, 9) : m.vertexcount + 1; });
  add("inputfacecount", [&](Mesh& m) { m.inputfacecount = r.between(16769, 0x7FFFFFFF); });
  add("emittercount", [&](Mesh& m) { m.emittercount = -r.between(1, 9); });
  add("effectorcount", [&](Mesh& m) { m.effectorcount = -r.between(1, 9); });
  for (const auto& [name, field] : {std::pair("x", &Mesh::x), std::pair("y", &Mesh::y), std::pair("z", &Mesh::z)}) {
    shortened(name, field, false, always);
  }
  for (const auto& [name, field] : {std::pair("a", &Mesh::a), std::pair("b", &Mesh::b), std::pair("c", &Mesh::c)}) {
    shortened(name, field, false, always);
    wrong(name, field, always, [&](const Mesh& m) { return outside(m.meshvertexcount); });
  }
  shortened("fhsl", &Mesh::fhsl, false, always);
  for (const auto& [name, field] : {std::pair("ftype", &Mesh::ftype), std::pair("fpriority", &Mesh::fpriority),
                                    std::pair("falpha", &Mesh::falpha), std::pair("fmapping", &Mesh::fmapping)}) {
    shortened(name, field, true, always);
  }
  shortened("ftex", &Mesh::ftex, true, always);
  shortened("fmask", &Mesh::fmask, true, always);
  wrong("ftex", &Mesh::ftex, always, [&](const Mesh&) { return r.one_in(2) ? r.between(textures, 32767) : -2; });
  wrong(
      "vertexlabels", &Mesh::vertexlabels, [](const Mesh& m) { return (m.functionmask & 0x20) != 0; },
      [&](const Mesh&) { return r.between(256, 0x7FFFFFFF); });
  wrong(
      "facelabels", &Mesh::facelabels, [](const Mesh& m) { return (m.functionmask & 0x180) != 0; },
      [&](const Mesh&) { return r.between(256, 0x7FFFFFFF); });
  wrong("pslist", &Mesh::pslist, always, [&](const Mesh& m) { return outside(m.vertexcount); });
  promises.push_back({array + "Exception: pslist", [](Mesh& m) {
                        m.effectorcount = 99;
                        return true;
                      }});
  wrong(
      "fmapping", &Mesh::fmapping, [](const Mesh& m) { return m.ftex.has_value(); },
      [&](const Mesh& m) { return r.between(m.mappingcount, 254); });
  for (const auto& [name, field] :
       {std::pair("mappingtype", &Mesh::mappingtype), std::pair("mappingrotation", &Mesh::mappingrotation),
        std::pair("mappingdirection", &Mesh::mappingdirection)}) {
    shortened(name, field, false, mapped);
  }
  for (const auto& [name, field] :
       {std::pair("mappingscalex", &Mesh::mappingscalex), std::pair("mappingscaley", &Mesh::mappingscaley),
        std::pair("mappingscalez", &Mesh::mappingscalez), std::pair("mappingtranslatex", &Mesh::mappingtranslatex),
        std::pair("mappingtranslatey", &Mesh::mappingtranslatey),
        std::pair("mappingtranslatez", &Mesh::mappingtranslatez)}) {
    shortened(name, field, false, mapped);
  }
  for (const auto& [name, field] : {std::pair("mappingp", &Mesh::mappingp), std::pair("mappingm", &Mesh::mappingm),
                                    std::pair("mappingn", &Mesh::mappingn)}) {
    shortened(name, field, false, mapped);
    promises.push_back({argument + name + "[", [&, field](Mesh& m) {
                          if (!mapped(m)) return false;
                          const int used = static_cast<unsigned char>(m.fmapping->front());
                          if (used == 255 || (*m.mappingtype)[used] != 0) return false;
                          (*(m.*field))[used] = static_cast<std::int16_t>(outside(m.vertexcount));
                          return true;
                        }});
  }
  for (const int word : {0, 3}) {
    promises.push_back({argument + "billboarddata[", [&, word](Mesh& m) {
                          if (!m.billboarddata || m.billboarddata->size() < 8) return false;
                          (*m.billboarddata)[word] = word == 0 ? outside(m.inputfacecount) : textures;
                          return true;
                        }});
  }

  std::vector<int> broken(promises.size());
  for (int n = 0; n < 4000; ++n) {
    const auto kind = static_cast<std::size_t>(n) % promises.size();
    Mesh mesh = random_mesh(r, false);
    if (!promises[kind].break_it(mesh)) continue;
    ++broken[kind];
    const jobject object = build(mesh);
    const std::string exception = java.take_exception();
    ASSERT_EQ(exception.substr(0, promises[kind].exception.size()), promises[kind].exception) << "mesh " << n;
    ASSERT_EQ(java.nativeid(object), 0);
    ASSERT_EQ(Java_ja_za(env, peer), 0);
    ASSERT_EQ(java.arrays_out(), 0);
  }
  for (std::size_t kind = 0; kind < promises.size(); ++kind) {
    EXPECT_GT(broken[kind], 3) << promises[kind].exception << ", promise " << kind;
  }
}
