// Triangles, by instance and size, beside llvmpipe on the same scenes. Times are of drawing alone, clearing is left
// out; both sides begin with plain vertices, and both write and test depth.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "mesa_peer.h"
#include "raster/Rasterizer.h"
#include "raster/Triangle.h"
#include "triangle_scene.h"
#include "util/memorymanager/alignedmemory.h"

namespace {

using namespace Rasterizer_n;
using triangle_scene::kind;

constexpr auto wrap = TexAddressMode_e::Wrap, ground = TexAddressMode_e::GroundWrap;

using render_function = void (*)(const Triangle_s&);

constexpr render_function instances[] = {
    &RenderTriangle<ShadeMode_e::Flat, ground, ground, false, FogMode_e::None, BlendMode_e::Opaque, false, false, true,
                    false, true>,
    &RenderTriangle<ShadeMode_e::Smooth, ground, ground, false, FogMode_e::None, BlendMode_e::Opaque, false, false,
                    true, true, true>,
    &RenderTriangle<ShadeMode_e::Textured, wrap, wrap, false, FogMode_e::None, BlendMode_e::Opaque, false, false, true,
                    true, true>,
    &RenderTriangle<ShadeMode_e::Textured, wrap, wrap, false, FogMode_e::Distance, BlendMode_e::Opaque, false, false,
                    true, true, true>,
    &RenderTriangle<ShadeMode_e::Textured, wrap, wrap, false, FogMode_e::None, BlendMode_e::ConstantAlpha, false, false,
                    true, true, true>,
    &RenderTriangle<ShadeMode_e::Textured, wrap, wrap, false, FogMode_e::None, BlendMode_e::PixelAlpha, false, false,
                    true, true, true>,
    &RenderTriangle<ShadeMode_e::Blended, ground, ground, false, FogMode_e::None, BlendMode_e::Opaque, false, false,
                    true, true, true>,
    &RenderTriangle<ShadeMode_e::Textured, ground, ground, false, FogMode_e::None, BlendMode_e::Opaque, false, true,
                    true, true, true>,
};

// The target, the textures and one scene.
class scene {
 public:
  scene(kind what, int size) : what_(what), size_(size) {
    for (const auto& t : triangle_scene::make(size, what == kind::textured_translucent)) {
      for (const auto& v : t) vertices_.push_back({{v.x, v.y, v.z, 1}, {v.u, v.v, 0, 0}, v.colour});
    }
    for (int i = 0; i < 3; ++i) {
      for (int v = 0; v < 128; ++v) {
        for (int u = 0; u < 128; ++u) textures_[i][u + 256 * v] = triangle_scene::texel(i, u, v);
      }
    }
    for (int v = 0; v < 128; ++v) {
      for (int u = 0; u < 128; ++u) light_map_[static_cast<std::size_t>(u + 256 * v)] = triangle_scene::light(u, v);
    }
    m_pColourBuffer = colour_.get();
    m_pDepthBuffer = depth_.get();
    m_ScreenPitch = triangle_scene::width;
    SetViewport({0, 0, triangle_scene::width, triangle_scene::height, 0, 1});
    SetCliprect({0, 0, triangle_scene::width, triangle_scene::height});
    RecomputeDistanceFogParams(0.5f, 0x999980);
  }

  void clear() {
    std::fill_n(colour_.get(), pixels, 0u);
    std::fill_n(depth_.get(), pixels, far_depth);
  }

  // Makes a Triangle_s of each triangle's vertices, as a mesh renderer does, and draws it.
  void draw(std::size_t step = 1) {
    const render_function render = instances[static_cast<int>(what_)];
    Triangle_s t;
    for (int i = 0; i < 3; ++i) t.texture[i] = textures_[i].data();
    t.lightmap = light_map_.data();
    t.lightmapshift = 0;
    t.alpha = 128 * 0x10001;
    t.flatcolour = 0;
    for (std::size_t n = 0; n < count(); n += step) {
      for (std::size_t i = 0; i < 3; ++i) {
        const vertex& v = vertices_[3 * n + i];
        t.vertex[i] = v.position;
        t.colour[i] = vertex_colour(v.colour);
        t.texcoord[i] = v.texcoord;
      }
      render(t);
    }
  }

  std::size_t count() const { return vertices_.size() / 3; }

  long covered() {
    clear();
    draw(triangle_scene::sparse_step(size_, count()));
    return static_cast<long>(pixels) - std::count(depth_.get(), depth_.get() + pixels, far_depth);
  }

  static constexpr std::size_t pixels = std::size_t{triangle_scene::width} * triangle_scene::height;

 private:
  struct release {
    void operator()(void* memory) const { _aligned_free(memory); }
  };
  // As images and canvases get theirs.
  template <class T>
  using buffer = std::unique_ptr<T[], release>;
  template <class T>
  static buffer<T> make_buffer() {
    return buffer<T>(static_cast<T*>(_aligned_malloc(pixels * sizeof(T), 64)));
  }

  // A vertex as the renderers keep it after projection.
  struct vertex {
    Vector4_s position, texcoord;
    std::uint32_t colour;
  };

  kind what_;
  int size_;
  std::vector<vertex> vertices_;  // three of each triangle
  buffer<unsigned int> colour_ = make_buffer<unsigned int>();
  buffer<float> depth_ = make_buffer<float>();
  std::vector<std::uint32_t> textures_[3] = {std::vector<std::uint32_t>(256 * 128),
                                             std::vector<std::uint32_t>(256 * 128),
                                             std::vector<std::uint32_t>(256 * 128)};
  std::vector<std::uint8_t> light_map_ = std::vector<std::uint8_t>(256 * 128);
};

void report(benchmark::State& state, int size, std::size_t count) {
  const double triangles = static_cast<double>(state.iterations()) * static_cast<double>(count);
  state.counters["ns/px"] =
      benchmark::Counter(triangles * size / 1e9, benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
  state.counters["tri/s"] = benchmark::Counter(triangles, benchmark::Counter::kIsRate);
}

void draw_here(benchmark::State& state, kind what, int size) {
  scene s(what, size);
  // Once beforehand: the peer is warm too.
  s.clear();
  s.draw();
  for (auto _ : state) {
    s.clear();
    const double begin = triangle_scene::thread_seconds();
    s.draw();
    state.SetIterationTime(triangle_scene::thread_seconds() - begin);
  }
  report(state, size, s.count());
}

mesa_peer& peer(int vector_width) {
  static mesa_peer narrow(128), wide(256);
  return vector_width == 128 ? narrow : wide;
}

void draw_with_mesa(benchmark::State& state, kind what, int size, int vector_width) {
  mesa_peer& mesa = peer(vector_width);
  // Both must cover the same pixels, or the figures say nothing.
  const long ours = scene(what, size).covered();
  const mesa_peer::result theirs = mesa.draw(what, size, true);
  if (theirs.seconds < 0) return state.SkipWithError("OSMesa has no llvmpipe");
  if (std::abs(ours - theirs.covered) * 100 > theirs.covered) {
    return state.SkipWithError(
        ("covers " + std::to_string(theirs.covered) + " pixels, not " + std::to_string(ours)).c_str());
  }
  for (auto _ : state) state.SetIterationTime(mesa.draw(what, size, false).seconds);
  report(state, size, 2000000 / static_cast<std::size_t>(size));
}

const bool registered = [] {
  for (int k = 0; k < 8; ++k) {
    for (const int size : triangle_scene::sizes) {
      const kind what{k};
      const std::string name =
          std::string("triangles/") + triangle_scene::names[k] + "/" + std::to_string(size) + "px/";
      const auto add = [](const std::string& full, auto function) {
        benchmark::RegisterBenchmark(full.c_str(), function)
            ->UseManualTime()
            ->Unit(benchmark::kMillisecond)
            ->MinTime(0.1);
      };
      add(name + "velmark5", [=](benchmark::State& state) { draw_here(state, what, size); });
      for (const int bits : {128, 256}) {
        add(name + "llvmpipe" + std::to_string(bits),
            [=](benchmark::State& state) { draw_with_mesa(state, what, size, bits); });
      }
    }
  }
  return true;
}();

}  // namespace
