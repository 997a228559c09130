// Models: single ones by size, drawn and culled in both ways, and a scene of 500, beside llvmpipe on the same
// triangles.
//
// A frame of the scene is clearing colour and depth, and 500 models of 300 faces, sunlit, textured and depth-tested:
// the nearest first, as who draws with a depth test orders them, or in any order.
// Times are processor time of the drawing thread, but those named wall. Compare medians of one run:
//   velmark5_bench --benchmark_filter=models --benchmark_repetitions=9 --benchmark_enable_random_interleaving=true
#include <benchmark/benchmark.h>

#include <algorithm>
#include <barrier>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <thread>
#include <tuple>
#include <vector>

#include "bench_toolkit.h"
#include "mesa_peer.h"
#include "model/mesh_views.h"
#include "model/model.h"
#include "model_scene.h"
#include "raster/Rasterizer.h"
#include "support/random.h"
#include "texture/texturecache.h"
#include "toolkit/threadresource.h"
#include "triangle_scene.h"

namespace {

using triangle_scene::thread_seconds;

// --- As much of a Java runtime as building a model needs ------------------------------------------------------------

// A Java array is this and its elements; views get the elements themselves.
struct plain_array {
  int length;
  void* elements;
};

template <class T>
T* elements(jarray array, jboolean*) {
  return static_cast<T*>(reinterpret_cast<plain_array*>(array)->elements);
}

JNIEnv* plain_env() {
  static JNINativeInterface_ functions{};
  static JNIEnv env{};
  static JNIInvokeInterface_ invoke{};
  static JavaVM vm{};
  env.functions = &functions;
  vm.functions = &invoke;
  functions.GetJavaVM = [](JNIEnv*, JavaVM** out) -> jint { return *out = &vm, 0; };
  invoke.GetEnv = [](JavaVM*, void** out, jint) -> jint { return *out = &env, 0; };
  functions.DeleteWeakGlobalRef = [](JNIEnv*, jweak) {};
  functions.NewWeakGlobalRef = [](JNIEnv*, jobject) -> jweak { return nullptr; };
  functions.GetArrayLength = [](JNIEnv*, jarray a) -> jsize { return reinterpret_cast<plain_array*>(a)->length; };
  functions.GetIntArrayElements = [](JNIEnv*, jintArray a, jboolean* c) { return elements<jint>(a, c); };
  functions.GetShortArrayElements = [](JNIEnv*, jshortArray a, jboolean* c) { return elements<jshort>(a, c); };
  functions.GetByteArrayElements = [](JNIEnv*, jbyteArray a, jboolean* c) { return elements<jbyte>(a, c); };
  functions.ReleaseIntArrayElements = [](JNIEnv*, jintArray, jint*, jint) {};
  functions.ReleaseShortArrayElements = [](JNIEnv*, jshortArray, jshort*, jint) {};
  functions.ReleaseByteArrayElements = [](JNIEnv*, jbyteArray, jbyte*, jint) {};
  return &env;
}

// The one texture is there from the start.
class loaded_textures final : public texturecache {
 public:
  loaded_textures() : texturecache(plain_env(), nullptr, 1) {
    texturemetrics fields;
    fields.wrap_u = fields.wrap_v = true;
    std::vector<unsigned int> texels;
    for (int v = 0; v < size; ++v) {
      for (int u = 0; u < size; ++u) texels.push_back(triangle_scene::texel(0, u, v));
    }
    upload_texturemetrics(0, fields);
    upload_texture(0, texels.data(), fields);
  }

 private:
  bool request_texture(unsigned short) override { return false; }
  bool several_threads() const override { return false; }
};

// --- Meshes ---------------------------------------------------------------------------------------------------------

struct mesh {
  std::vector<jint> x, y, z;
  std::vector<jshort> a, b, c;
  jshort plane[3];  // vertices P, M, N of the texture mapping

  void vertex(double vx, double vy, double vz) {
    x.push_back(static_cast<jint>(std::lround(vx)));
    y.push_back(static_cast<jint>(std::lround(vy)));
    z.push_back(static_cast<jint>(std::lround(vz)));
  }
  void face(int p, int q, int r) {
    a.push_back(static_cast<jshort>(p));
    b.push_back(static_cast<jshort>(q));
    c.push_back(static_cast<jshort>(r));
  }
  int faces() const { return static_cast<int>(a.size()); }
};

constexpr double cell = 18;  // units; two faces

// A gently rolling sheet of columns by rows cells, square to the view. It turns its front or its back.
mesh sheet(int columns, int rows, bool front) {
  mesh m;
  for (int j = 0; j <= rows; ++j) {
    for (int i = 0; i <= columns; ++i) {
      m.vertex((i - columns / 2.0) * cell, (j - rows / 2.0) * cell, 9 * std::sin(i * 0.9) * std::cos(j * 0.7));
    }
  }
  for (int j = 0; j < rows; ++j) {
    for (int i = 0; i < columns; ++i) {
      const int p = j * (columns + 1) + i, q = p + 1, r = p + columns + 1, s = r + 1;
      front ? m.face(p, r, q) : m.face(p, q, r);
      front ? m.face(q, r, s) : m.face(q, s, r);
    }
  }
  m.plane[0] = 0;
  m.plane[1] = static_cast<jshort>(columns);
  m.plane[2] = static_cast<jshort>(rows * (columns + 1));
  return m;
}

// A bumpy ball of 2 * segments * (bands - 1) faces.
mesh ball(int segments, int bands, double radius, test_random& random) {
  mesh m;
  m.vertex(0, -radius, 0);
  for (int j = 1; j < bands; ++j) {
    for (int i = 0; i < segments; ++i) {
      const double up = j * 3.14159265 / bands, around = i * 6.2831853 / segments;
      const double r = radius * (1 + random.between(-50, 50) / 1000.0);
      m.vertex(r * std::sin(up) * std::cos(around), -r * std::cos(up), r * std::sin(up) * std::sin(around));
    }
  }
  m.vertex(0, radius, 0);
  const int last = static_cast<int>(m.x.size()) - 1;
  const auto at = [&](int j, int i) { return 1 + (j - 1) * segments + i % segments; };
  for (int i = 0; i < segments; ++i) {
    m.face(0, at(1, i), at(1, i + 1));
    for (int j = 1; j + 1 < bands; ++j) {
      m.face(at(j, i), at(j + 1, i), at(j, i + 1));
      m.face(at(j, i + 1), at(j + 1, i), at(j + 1, i + 1));
    }
    m.face(last, at(bands - 1, i + 1), at(bands - 1, i));
  }
  m.plane[0] = 0;
  m.plane[1] = static_cast<jshort>(last);
  m.plane[2] = static_cast<jshort>(at(bands / 2, 0));
  return m;
}

// All faces smooth, of one colour, with the texture laid over them by a plane.
void build(model& into, mesh& m) {
  JNIEnv* const env = plain_env();
  std::vector<plain_array> arrays;
  arrays.reserve(16);
  const auto java = [&](auto& values) {
    arrays.push_back({static_cast<int>(values.size()), values.data()});
    return reinterpret_cast<jarray>(&arrays.back());
  };
  const auto ints = [&](auto& v) { return static_cast<jintArray>(java(v)); };
  const auto shorts = [&](auto& v) { return static_cast<jshortArray>(java(v)); };
  const auto bytes = [&](auto& v) { return static_cast<jbyteArray>(java(v)); };
  const int vertices = static_cast<int>(m.x.size());
  const auto faces = static_cast<std::size_t>(m.faces());
  std::vector<jbyte> mapping(faces, 0), kind{0}, zero{0};
  std::vector<jshort> hsl(faces, 0x5C40), texture(faces, 0), p{m.plane[0]}, q{m.plane[1]}, r{m.plane[2]};
  const mesh_views views{vertices,
                         vertices,
                         {env, ints(m.x)},
                         {env, ints(m.y)},
                         {env, ints(m.z)},
                         {env, nullptr},
                         {env, nullptr},
                         m.faces(),
                         {env, shorts(m.a)},
                         {env, shorts(m.b)},
                         {env, shorts(m.c)},
                         {env, nullptr},
                         {env, nullptr},
                         {env, nullptr},
                         {env, bytes(mapping)},
                         {env, shorts(hsl)},
                         {env, shorts(texture)},
                         {env, nullptr},
                         0,
                         {env, nullptr},
                         1,
                         {env, bytes(kind)},
                         {env, shorts(p)},
                         {env, shorts(q)},
                         {env, shorts(r)},
                         {env, nullptr},
                         {env, nullptr},
                         {env, nullptr},
                         {env, bytes(zero)},
                         {env, bytes(zero)},
                         {env, nullptr},
                         {env, nullptr},
                         {env, nullptr},
                         {env, nullptr},
                         0,
                         0,
                         0,
                         MF_LIT,
                         128,
                         768,
                         {env, nullptr}};
  into.build(views);
}

// --- The stage ------------------------------------------------------------------------------------------------------

Matrix_c placed_at(double x, double y, double z) {
  Matrix_c m = Matrix_c::IdentityRows;
  m.rows[3] = {static_cast<float>(x), static_cast<float>(y), static_cast<float>(z), 1};
  return m;
}

struct placed_model {
  model* drawn;
  Matrix_c world;
};

// A target with sun, camera and texture, a view of 90 degrees along z, and a pool for models.
class stage {
 public:
  stage() : frame(model_scene::width, model_scene::height), pool_(bench_toolkit::kit(), nullptr, 64 << 20) {
    toolkit& t = frame.kit();
    t.depthbuffer = frame.depth;
    t.setup_backbuffer(frame.colour, frame.depth, 0, 0, model_scene::width);
    Rasterizer_n::SetViewport({0, 0, model_scene::width, model_scene::height, 0, 1});
    t.textures = &textures_;
    t.set_camera(Matrix_c::IdentityRows);
    Matrix_c projection{};
    constexpr float near = 50, far = 4000, depth = (far + near) / (far - near);
    projection.rows[0].x = 1;
    projection.rows[1].y = 16.0f / 9;
    projection.rows[2] = {0, 0, depth, 1};
    projection.rows[3].z = -2 * far * near / (far - near);
    t.set_projection(projection);
    t.set_fog(0, 0);
    t.set_globalambient(0.5f);
    t.set_globalsun(0xFFFFFF, 0.6f, 0.2f, 1, -2, -3);
    t.set_pointlights(0, nullptr, nullptr);
    t.set_zwrite(true);
  }
  ~stage() {
    models.clear();
    frame.kit().textures = nullptr;
  }
  stage(const stage&) = delete;

  model& add(mesh m) {
    models.push_back(std::make_unique<model>(&pool_));
    build(*models.back(), m);
    return *models.back();
  }
  void clear() {
    toolkit& t = frame.kit();
    t.cls(0);
    t.zbuffer_clear(0, 0, t.width, t.height, Rasterizer_n::far_depth);
  }
  static void draw(threadresource& scratch, const std::vector<placed_model>& list) {
    copied_jintArray no_result(nullptr, nullptr);
    for (const placed_model& p : list) p.drawn->render(scratch, p.world, no_result);
  }
  long covered() const {
    return static_cast<long>(frame.pixels) -
           std::count(frame.depth, frame.depth + frame.pixels, Rasterizer_n::far_depth);
  }

  bench_toolkit frame;
  std::vector<std::unique_ptr<model>> models;
  threadresource& scratch() { return *scratch_; }

 private:
  // The toolkit's way back into Java serves the pool.
  struct runtime {
    runtime() { plain_env()->GetJavaVM(&bench_toolkit::kit().vm); }
    ~runtime() { bench_toolkit::kit().vm = nullptr; }
  };
  runtime runtime_;
  memorypool pool_;
  loaded_textures textures_;
  std::unique_ptr<threadresource> scratch_ = std::make_unique<threadresource>(bench_toolkit::kit(), 0, 0);
};

// --- Single models --------------------------------------------------------------------------------------------------

enum class fate { visible, facing_away, out_of_view };

struct model_size {
  int columns, rows;  // of cells
  int across, down;   // as many fit on the screen
  int faces() const { return 2 * columns * rows; }
};
constexpr model_size model_sizes[] = {{5, 5, 20, 10}, {25, 10, 4, 5}, {50, 50, 2, 1}};

// Sheets side by side, of about 66 pixels a face.
void single_models(benchmark::State& state, model_size size, fate what) {
  stage s;
  model& m = s.add(sheet(size.columns, size.rows, what != fate::facing_away));
  std::vector<placed_model> list;
  constexpr double z = 1000;  // 0.64 pixels to a unit
  for (int j = 0; j < size.down; ++j) {
    for (int i = 0; i < size.across; ++i) {
      const double x = what == fate::out_of_view ? 5000 : 0;
      list.push_back({&m, placed_at(x + (i + 0.5 - size.across / 2.0) * (size.columns + 0.5) * cell,
                                    (j + 0.5 - size.down / 2.0) * (size.rows + 0.5) * cell, z)});
    }
  }
  s.clear();
  s.draw(s.scratch(), list);
  const double expected = what == fate::visible ? 0.41 * cell * cell / 2 * size.faces() * double(list.size()) : 0;
  if (std::abs(static_cast<double>(s.covered()) - expected) > expected * 0.05) {
    return state.SkipWithError(("covers " + std::to_string(s.covered()) + " pixels").c_str());
  }
  // What is culled leaves the frame alone, so only visible models need a cleared one.
  if (what != fate::visible) {
    for (auto _ : state) {
      const double begin = thread_seconds();
      for (int i = 0; i < 100; ++i) s.draw(s.scratch(), list);
      state.SetIterationTime((thread_seconds() - begin) / 100);
    }
  } else {
    for (auto _ : state) {
      s.clear();
      const double begin = thread_seconds();
      s.draw(s.scratch(), list);
      state.SetIterationTime(thread_seconds() - begin);
    }
  }
  using benchmark::Counter;
  const double drawn = static_cast<double>(state.iterations()) * static_cast<double>(list.size());
  state.counters["models/s"] = Counter(drawn, Counter::kIsRate);
  state.counters["ns_model"] = Counter(drawn * 1e-9, Counter::kIsRate | Counter::kInvert);
  state.counters["ns_face"] = Counter(drawn * size.faces() * 1e-9, Counter::kIsRate | Counter::kInvert);
}

// --- The scene of models --------------------------------------------------------------------------------------------

enum class order { nearest_first, any };

void nearest_first(std::vector<placed_model>& list) {
  std::sort(list.begin(), list.end(),
            [](const placed_model& p, const placed_model& q) { return p.world.rows[3].z < q.world.rows[3].z; });
}

// 500 balls of 300 faces anywhere in view.
class models_scene : public stage {
 public:
  explicit models_scene(order drawn) {
    test_random random(500);
    for (int i = 0; i < 500; ++i) {
      model& m = add(ball(15, 11, 60, random));
      const double z = random.real(600, 3000);
      list.push_back({&m, placed_at(random.real(-0.93f, 0.93f) * z, random.real(-0.52f, 0.52f) * z, z)});
    }
    if (drawn == order::nearest_first) nearest_first(list);
    frame_here();  // what is computed at the first draw
  }

  void frame_here() {
    clear();
    draw(scratch(), list);
  }

  // The same for the peer: equal vertices of neighbouring faces are one.
  model_scene::scene for_peer() const {
    model_scene::scene out;
    const toolkit& t = *toolkit::m_pInstance;
    const unsigned int rgb = list[0].drawn->fcolours[0].corner[0];
    for (std::size_t i = 0; i < 3; ++i) out.colour[i] = static_cast<float>(rgb >> (16 - 8 * i) & 0xFF) / 255;
    out.sun = {t.sun_x, t.sun_y, t.sun_z};
    out.ambient = t.ambient;
    out.front = t.sun_front;
    out.back = t.sun_back;
    for (const placed_model& p : list) {
      const model& m = *p.drawn;
      const std::size_t first = out.indices.size();
      std::map<model_scene::vertex, std::uint32_t> known;
      for (int f = 0; f < m.facecount; ++f) {
        const int corners[3] = {m.fa[f], m.fb[f], m.fc[f]};
        const texture_coordinates uv[3] = {m.fuv0[f], m.fuv1[f], m.fuv2[f]};
        for (int k = 0; k < 3; ++k) {
          const Vector4_s &at = m.vpos[corners[k]], &n = m.vnormal[corners[k]];
          const model_scene::vertex v{{at.x, at.y, at.z}, {n.x, n.y, n.z}, {uv[k].u / 128, uv[k].v / 128}};
          const auto [found, fresh] = known.emplace(v, static_cast<std::uint32_t>(out.vertices.size()));
          if (fresh) out.vertices.push_back(v);
          out.indices.push_back(found->second);
        }
      }
      const Matrix_c matrix = Matrix_c::Multiply(p.world, t.viewprojection);
      model_scene::piece piece{first, out.indices.size() - first, {}};
      std::copy_n(&matrix.rows[0].x, 16, piece.transform.begin());
      out.models.push_back(piece);
    }
    return out;
  }

  std::vector<placed_model> list;
};

double wall_seconds() {
  return std::chrono::duration<double>(std::chrono::steady_clock::now().time_since_epoch()).count();
}

void report_frames(benchmark::State& state, double wall) {
  using benchmark::Counter;
  const auto frames = static_cast<double>(state.iterations());
  state.counters["frames/s"] = Counter(frames, Counter::kIsRate);
  state.counters["wall_frames/s"] = frames / wall;
}

// Four lights among the models, or none.
void scene_here(benchmark::State& state, order drawn, bool point_lit) {
  models_scene s(drawn);
  if (point_lit) {
    // x, y, z, range, colour.
    const int lights[4][5] = {{-500, -200, 900, 800, 0xFFC080},
                              {600, 100, 1300, 900, 0x80FFC0},
                              {-300, 300, 1900, 900, 0xC080FF},
                              {900, -400, 2500, 1000, 0xFFFFFF}};
    const float strengths[4] = {1, 1, 1, 1};
    toolkit::m_pInstance->set_pointlights(4, lights[0], strengths);
  }
  double wall = 0;
  for (auto _ : state) {
    const double wall_begin = wall_seconds(), begin = thread_seconds();
    s.frame_here();
    state.SetIterationTime(thread_seconds() - begin);
    wall += wall_seconds() - wall_begin;
  }
  report_frames(state, wall);
}

// Two workers draw the left and the right half of the models. The frame takes as long as the busier of them and the
// clearing before.
void scene_by_two(benchmark::State& state) {
  models_scene s(order::any);
  const auto helper_scratch = std::make_unique<threadresource>(*toolkit::m_pInstance, 0, 0);
  const auto side = [](const placed_model& p) { return p.world.rows[3].x / p.world.rows[3].z; };
  const auto middle = s.list.begin() + 250;
  std::nth_element(s.list.begin(), middle, s.list.end(),
                   [&](const placed_model& p, const placed_model& q) { return side(p) < side(q); });
  std::vector<placed_model> left(s.list.begin(), middle), right(middle, s.list.end());
  nearest_first(left);
  nearest_first(right);
  std::barrier meeting(2);
  bool stop = false;
  double helper_time = 0;
  std::thread helper([&] {
    for (;;) {
      meeting.arrive_and_wait();
      if (stop) return;
      const double begin = thread_seconds();
      s.draw(*helper_scratch, right);
      helper_time = thread_seconds() - begin;
      meeting.arrive_and_wait();
    }
  });
  double wall = 0, clearing = 0, own_half = 0, helper_half = 0;
  for (auto _ : state) {
    const double wall_begin = wall_seconds(), begin = thread_seconds();
    s.clear();
    const double cleared = thread_seconds() - begin;
    meeting.arrive_and_wait();
    const double start = thread_seconds();
    s.draw(s.scratch(), left);
    const double own_time = thread_seconds() - start;
    meeting.arrive_and_wait();
    wall += wall_seconds() - wall_begin;
    state.SetIterationTime(cleared + std::max(own_time, helper_time));
    clearing += cleared;
    own_half += own_time;
    helper_half += helper_time;
  }
  stop = true;
  meeting.arrive_and_wait();
  helper.join();
  report_frames(state, wall);
  const auto milliseconds = [&](double sum) { return sum * 1000 / static_cast<double>(state.iterations()); };
  state.counters["clear_ms"] = milliseconds(clearing);
  state.counters["left_ms"] = milliseconds(own_half);
  state.counters["right_ms"] = milliseconds(helper_half);
}

// threads: 0 to draw on the calling thread.
void scene_with_mesa(benchmark::State& state, order drawn, int vector_width, int threads) {
  static std::map<std::tuple<order, int, int>, std::unique_ptr<mesa_peer>> peers;
  auto& mesa = peers[{drawn, vector_width, threads}];
  long ours = 0;
  {
    models_scene s(drawn);
    ours = s.covered();
    if (mesa == nullptr) {
      const model_scene::scene scene = s.for_peer();
      mesa = std::make_unique<mesa_peer>(vector_width, threads, &scene);
    }
  }
  const mesa_peer::result theirs = mesa->draw_models(true);
  if (theirs.seconds < 0) return state.SkipWithError("OSMesa has no llvmpipe");
  // Both must cover the same pixels, or the figures say nothing.
  if (std::abs(ours - theirs.covered) * 100 > theirs.covered) {
    return state.SkipWithError(
        ("covers " + std::to_string(theirs.covered) + " pixels, not " + std::to_string(ours)).c_str());
  }
  double wall = 0;
  for (auto _ : state) {
    const mesa_peer::result frame = mesa->draw_models(false);
    // With threads of its own the calling one is mostly idle.
    state.SetIterationTime(threads == 0 ? frame.seconds : frame.wall_seconds);
    wall += frame.wall_seconds;
  }
  report_frames(state, wall);
}

const bool registered = [] {
  const auto add = [](const std::string& name, auto function, int iterations) {
    benchmark::RegisterBenchmark(("models/" + name).c_str(), function)->UseManualTime()->Iterations(iterations);
  };
  for (const model_size& size : model_sizes) {
    const std::string name = std::to_string(size.faces());
    add(
        name + "/visible", [=](benchmark::State& s) { single_models(s, size, fate::visible); }, 20);
    add(
        name + "/facing_away", [=](benchmark::State& s) { single_models(s, size, fate::facing_away); }, 5);
    add(
        name + "/out_of_view", [=](benchmark::State& s) { single_models(s, size, fate::out_of_view); }, 20);
  }
  constexpr auto sorted = order::nearest_first;
  for (const order drawn : {sorted, order::any}) {
    const std::string scene = drawn == sorted ? "scene/" : "scene_in_any_order/";
    add(
        scene + "velmark5", [=](benchmark::State& s) { scene_here(s, drawn, false); }, 40);
    for (const int bits : {128, 256}) {
      add(
          scene + "llvmpipe" + std::to_string(bits), [=](benchmark::State& s) { scene_with_mesa(s, drawn, bits, 0); },
          10);
    }
  }
  add(
      "scene/velmark5_four_lights", [](benchmark::State& s) { scene_here(s, sorted, true); }, 40);
  add("scene/velmark5_two_threads", scene_by_two, 40);
  add(
      "scene/llvmpipe256_two_threads", [](benchmark::State& s) { scene_with_mesa(s, sorted, 256, 2); }, 10);
  return true;
}();

}  // namespace
