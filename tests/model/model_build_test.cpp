// Built models against the slow reference, array by array, and meshes with one broken promise.
#include <cmath>
#include <functional>

#include "model/mesh_fixture.h"
#include "reference/numbers.h"
#include "support/frame_record.h"
#include "util/memorymanager/allocatedmemory.h"

namespace {

class ModelBuildTest : public mesh_fixture {
 protected:
  // The reference rounds where the library does; not a number equals itself.
  static bool equal(float found, float expected) {
    return found == expected || (std::isnan(found) && std::isnan(expected));
  }
  // Of elements made of floats the first `lanes`.
  template <class T, class U>
  static void same(const char* name, const sharedarray<T>& found, const std::vector<U>& expected,
                   int lanes = sizeof(T) / sizeof(float)) {
    static_assert(sizeof(T) == sizeof(U));
    const int n = static_cast<int>(expected.size());
    ASSERT_GE(found.count(), n) << name;
    EXPECT_EQ(found.count() == 0, n == 0) << name;
    for (int i = 0; i < n; ++i) {
      if constexpr (std::is_integral_v<T>) {
        ASSERT_EQ(found[i], static_cast<T>(expected[i])) << name << ' ' << i;
      } else {
        const auto *const is = reinterpret_cast<const float*>(&found[i]), *const wanted =
                                                                              reinterpret_cast<const float*>(
                                                                                  &expected[i]);
        for (int k = 0; k < lanes; ++k) ASSERT_PRED2(equal, is[k], wanted[k]) << name << ' ' << i << " lane " << k;
      }
    }
  }
  static void same(const char* name, const sharedarray2d<unsigned short>& found, const oracle::Labels& expected) {
    EXPECT_EQ(found.rows.count(), static_cast<int>(expected.rows.size())) << name;
    same(name, found.rows, expected.rows);
    same(name, found.data, expected.members);
  }

  static void same_model(const model& m, const oracle::Model& o) {
    EXPECT_EQ(std::tuple(m.facecount, m.texfacecount, m.hasalpha, m.hasanimatedtexture),
              std::tuple(o.facecount, o.texfacecount, o.hasalpha, o.hasanimatedtexture));
    EXPECT_TRUE(m.facecount == 0 || (m.ftype.block == nullptr) == o.ftype.empty());
    same("vpos", m.vpos, o.vpos, 3), same("vmask", m.vmask, o.vmask);
    same("fa", m.fa, o.corner[0]), same("fb", m.fb, o.corner[1]), same("fc", m.fc, o.corner[2]);
    same("fhsl", m.fhsl, o.fhsl), same("ftype", m.ftype, o.ftype), same("fpriority", m.fpriority, o.fpriority);
    same("falpha", m.falpha, o.falpha), same("fmask", m.fmask, o.fmask), same("ftex", m.ftex, o.ftex);
    same("fuv0", m.fuv0, o.fuv[0]), same("fuv1", m.fuv1, o.fuv[1]), same("fuv2", m.fuv2, o.fuv[2]);
    same("vlabels", m.vlabels, o.vlabels), same("flabels", m.flabels, o.flabels);
    same("bblabels", m.bblabels, o.bblabels), same("pslist", m.pslist, o.pslist);
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
    same("vnormal", m.vnormal, o.vnormal);
    for (int f = 0; f < o.facecount; ++f) {
      const int type = o.type(f);
      for (int k = 0; k < 4 && type == 1; ++k) {
        EXPECT_PRED2(equal, oracle::lane(m.fnormal[f], k), oracle::lane(o.fnormal[f], k)) << "face " << f;
      }
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
    const Mesh mesh = random_mesh(random, any_mesh);
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
  std::vector<std::pair<std::string, std::function<void(Mesh&)>>> promises;  // exception and how it comes
  const std::string argument = "java.lang.IllegalArgumentException: ";
  const std::string array = "java.lang.ArrayIndexOutOfBoundsException: ";
  const auto negative = [&r] { return -r.between(1, 30000); };
  const auto outside = [&r, negative](int limit) { return r.one_in(2) ? negative() : r.between(limit, 32767); };
  const auto index = [&r](const auto& list) { return r.between(0, static_cast<int>(list->size()) - 1); };

  const auto shortened = [&](const std::string& name, auto field) {
    promises.push_back({array + name + ": length", [=](Mesh& m) {
                          auto& list = std::invoke(field, m);
                          list->resize(static_cast<std::size_t>(index(list)));
                        }});
  };
  const auto shortened_or_missing = [&](const std::string& name, auto field) {
    shortened(name, field);
    promises.push_back({"java.lang.NullPointerException: ", [=](Mesh& m) { std::invoke(field, m).reset(); }});
  };
  const auto wrong_element = [&](const std::string& name, auto field, auto value) {
    promises.push_back({argument + name + "[", [=](Mesh& m) {
                          auto& list = std::invoke(field, m);
                          auto& element = (*list)[index(list)];
                          element = static_cast<std::decay_t<decltype(element)>>(value(m));
                        }});
  };

  promises = {
      {argument + "vertexcount", [=](Mesh& m) { m.vertexcount = negative(); }},
      {argument + "vertexcount", [&r](Mesh& m) { m.vertexcount = r.between(16769, 0x7FFFFFFF); }},
      {argument + "meshvertexcount", [=](Mesh& m) { m.meshvertexcount = negative(); }},
      {argument + "meshvertexcount", [](Mesh& m) { m.meshvertexcount = m.vertexcount + 1; }},
      {argument + "inputfacecount", [&r](Mesh& m) { m.inputfacecount = r.between(16769, 0x7FFFFFFF); }},
      {argument + "emittercount", [=](Mesh& m) { m.emittercount = negative(); }},
      {argument + "effectorcount", [=](Mesh& m) { m.effectorcount = negative(); }},
      {array + "pslist", [](Mesh& m) { m.effectorcount = 99; }},
      {argument + "billboarddata[", [=](Mesh& m) { (*m.billboarddata)[0] = outside(m.inputfacecount); }},
      {argument + "billboarddata[", [](Mesh& m) { (*m.billboarddata)[3] = textures; }},
  };
  for (int k = 0; k < 3; ++k) {
    const auto each_of = [k](auto fields) {
      return [ k, fields ](Mesh & m) -> auto& { return (m.*fields)[k]; };
    };
    const std::string xyz(1, "xyz"[k]), abc(1, "abc"[k]), pmn(1, "pmn"[k]);
    shortened_or_missing(xyz, each_of(&Mesh::position));
    shortened_or_missing(abc, each_of(&Mesh::corner));
    wrong_element(abc, each_of(&Mesh::corner), [=](Mesh& m) { return outside(m.meshvertexcount); });
    shortened_or_missing("mappingscale" + xyz, each_of(&Mesh::mappingscale));
    shortened_or_missing("mappingtranslate" + xyz, each_of(&Mesh::mappingtranslate));
    shortened_or_missing("mapping" + pmn, each_of(&Mesh::mappingaxis));
    // A vertex that spans a plane.
    promises.push_back({argument + "mapping" + pmn + "[", [=](Mesh& m) {
                          (*m.fmapping)[0] = 0, (*m.mappingtype)[0] = 0;
                          for (auto& axis : m.mappingaxis) (*axis)[0] = 0;
                          (*m.mappingaxis[k])[0] = static_cast<std::int16_t>(outside(m.vertexcount));
                        }});
  }
  shortened_or_missing("fhsl", &Mesh::fhsl);
  shortened_or_missing("mappingtype", &Mesh::mappingtype);
  shortened_or_missing("mappingrotation", &Mesh::mappingrotation);
  shortened_or_missing("mappingdirection", &Mesh::mappingdirection);
  shortened("ftype", &Mesh::ftype);
  shortened("fpriority", &Mesh::fpriority);
  shortened("falpha", &Mesh::falpha);
  shortened("fmapping", &Mesh::fmapping);
  shortened("ftex", &Mesh::ftex);
  shortened("fmask", &Mesh::fmask);
  wrong_element("vertexlabels", &Mesh::vertexlabels, [&](Mesh&) { return r.between(256, 0x7FFFFFFF); });
  wrong_element("facelabels", &Mesh::facelabels, [&](Mesh&) { return r.between(256, 0x7FFFFFFF); });
  wrong_element("pslist", &Mesh::pslist, [=](Mesh& m) { return outside(m.vertexcount); });
  wrong_element("ftex", &Mesh::ftex, [&](Mesh&) { return r.one_in(2) ? r.between(textures, 32767) : -2; });
  wrong_element("fmapping", &Mesh::fmapping, [&](Mesh& m) { return r.between(m.mappingcount, 254); });

  for (std::size_t n = 0; n < 4000; ++n) {
    const auto& [exception, break_it] = promises[n % promises.size()];
    Mesh mesh = random_mesh(r, full_mesh);
    break_it(mesh);
    const jobject object = build(mesh);
    ASSERT_EQ(java.take_exception().substr(0, exception.size()), exception) << "mesh " << n;
    ASSERT_EQ(java.nativeid(object), 0);
    ASSERT_EQ(Java_ja_za(env, peer), 0);
    ASSERT_EQ(java.arrays_out(), 0);
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
