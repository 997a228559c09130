// Sprite drawing beside pixman on the same work: the same image at the same places of a 1280x720 frame.
//
// "ns_px" is the time per pixel drawn. Compare medians of one run:
//   velmark5_bench --benchmark_filter=sprites --benchmark_repetitions=9 --benchmark_enable_random_interleaving=true
#include <benchmark/benchmark.h>
#include <pixman.h>

#include <cmath>
#include <cstdint>
#include <vector>

#include "bench_toolkit.h"
#include "raster/SpriteInstances.h"
#include "support/random.h"
#include "toolkit/sprite_target.h"

namespace {

constexpr int target_width = 1280;
constexpr int target_height = 720;
constexpr int none = static_cast<int>(ColourOp_e::none);

void report(benchmark::State& state, double pixels) {
  using benchmark::Counter;
  state.counters["ns_px"] = Counter(pixels * 1e-9, Counter::kIsIterationInvariantRate | Counter::kInvert);
}

struct place {
  int x, y;
};

// Boxes of w by h all over the target.
std::vector<place> places(int w, int h) {
  test_random random(1);
  std::vector<place> list;
  for (int i = 0; i < 64; ++i)
    list.push_back({random.between(0, target_width - w), random.between(0, target_height - h)});
  return list;
}

// soft: every pixel has an alpha of its own. disc: opaque inside, clear in the corners, with a soft rim, as icons are.
enum class look { soft, disc };

// Channels are premultiplied, as the peer wants them; the library does not mind.
void paint(Sprite_c& sprite, int size, look kind) {
  sprite.Allocate(static_cast<unsigned>(size), static_cast<unsigned>(size));
  test_random random(3);
  for (int i = 0; i < size * size; ++i) {
    const double dx = i % size + 0.5 - size / 2.0, dy = i / size + 0.5 - size / 2.0;
    const double inside = std::min(std::max(size / 2.0 - std::sqrt(dx * dx + dy * dy), 0.0), 1.0);
    const auto a = kind == look::soft ? random.word() >> 24 : static_cast<std::uint32_t>(inside * 255);
    std::uint32_t word = a << 24;
    for (int shift = 0; shift < 24; shift += 8) word |= (random.word() >> 24) * a / 255 << shift;
    sprite.pixels[i] = word;
  }
}

// A frame and an image, for the library and as pixman sees them.
struct bench_scene {
  bench_scene(int size, look kind, pixman_format_code_t format) : frame(target_width, target_height) {
    paint(sprite, size, kind);
    to = pixman_image_create_bits_no_clear(format, target_width, target_height, frame.colour, target_width * 4);
    from = pixman_image_create_bits_no_clear(PIXMAN_a8r8g8b8, size, size, sprite.pixels, size * 4);
    target = sprite_target(frame.kit());
  }
  ~bench_scene() {
    pixman_image_unref(from);
    pixman_image_unref(to);
  }
  bench_scene(const bench_scene&) = delete;

  bench_toolkit frame;
  Sprite_c sprite;
  SpriteTarget_s target;
  pixman_image_t* to;
  pixman_image_t* from;
};

// The format in which pixman is fastest.
constexpr pixman_format_code_t best_format(pixman_op_t op) {
  return op == PIXMAN_OP_ADD ? PIXMAN_a8r8g8b8 : PIXMAN_x8r8g8b8;
}

pixman_op_t operator_of(BlendMode_e blend) {
  return blend == BlendMode_e::replace ? PIXMAN_OP_SRC : blend == BlendMode_e::alpha ? PIXMAN_OP_OVER : PIXMAN_OP_ADD;
}

// --- As it stands ---------------------------------------------------------------------------------------------------

template <BlendMode_e Blend, look Kind>
void plain(benchmark::State& state) {
  const int size = static_cast<int>(state.range(0));
  bench_scene scene(size, Kind, PIXMAN_a8r8g8b8);
  const auto render = sprite_select::render<VELMARK5_PLAIN>(none, static_cast<int>(Blend));
  const auto list = places(size, size);
  RenderParams_s params;
  for (auto _ : state) {
    for (const auto& at : list) {
      params.x = at.x;
      params.y = at.y;
      (scene.sprite.*render)(params, scene.target);
    }
    benchmark::ClobberMemory();
  }
  report(state, 64.0 * size * size);
}

template <BlendMode_e Blend, look Kind>
void pixman_plain(benchmark::State& state) {
  const int size = static_cast<int>(state.range(0));
  const pixman_op_t op = operator_of(Blend);
  bench_scene scene(size, Kind, best_format(op));
  const auto list = places(size, size);
  for (auto _ : state) {
    for (const auto& at : list)
      pixman_image_composite32(op, scene.from, nullptr, scene.to, 0, 0, 0, 0, at.x, at.y, size, size);
    benchmark::ClobberMemory();
  }
  report(state, 64.0 * size * size);
}

#define PLAIN(blend, kind)                                                                                           \
  BENCHMARK(plain<BlendMode_e::blend, look::kind>)->Name("sprites/" #blend "/" #kind "/velmark5")->Arg(16)->Arg(64); \
  BENCHMARK(pixman_plain<BlendMode_e::blend, look::kind>)                                                            \
      ->Name("sprites/" #blend "/" #kind "/pixman")                                                                  \
      ->Arg(16)                                                                                                      \
      ->Arg(64);
PLAIN(replace, soft)
PLAIN(alpha, soft)
PLAIN(alpha, disc)
PLAIN(additive, soft)

// --- Scaled: 64x64 to 100x100, nearest
// --------------------------------------------------------------------------------

constexpr int scaled_size = 100;

template <BlendMode_e Blend>
void scaled(benchmark::State& state) {
  bench_scene scene(64, look::soft, PIXMAN_a8r8g8b8);
  const auto render = sprite_select::render<VELMARK5_SCALED>(none, static_cast<int>(Blend));
  const auto list = places(scaled_size, scaled_size);
  RenderParams_s params;
  params.width = params.height = scaled_size;
  for (auto _ : state) {
    for (const auto& at : list) {
      params.x = at.x;
      params.y = at.y;
      (scene.sprite.*render)(params, scene.target);
    }
    benchmark::ClobberMemory();
  }
  report(state, 64.0 * scaled_size * scaled_size);
}

// The same with a depth test that half of the rows pass. pixman has no equal.
void scaled_tested(benchmark::State& state) {
  bench_scene scene(64, look::soft, PIXMAN_a8r8g8b8);
  for (int i = 0; i < target_width * target_height; ++i)
    scene.frame.depth[i] = i / target_width % 2 == 0 ? 10.0f : 1.0f;
  scene.target.depth = scene.frame.depth;
  const auto render = sprite_select::render<VELMARK5_SCALED_TESTED>(none, static_cast<int>(BlendMode_e::alpha));
  const auto list = places(scaled_size, scaled_size);
  RenderParams_s params;
  params.z = 5;
  params.width = params.height = scaled_size;
  for (auto _ : state) {
    for (const auto& at : list) {
      params.x = at.x;
      params.y = at.y;
      (scene.sprite.*render)(params, scene.target);
    }
    benchmark::ClobberMemory();
  }
  report(state, 64.0 * scaled_size * scaled_size);
}

template <BlendMode_e Blend>
void pixman_scaled(benchmark::State& state) {
  const pixman_op_t op = operator_of(Blend);
  bench_scene scene(64, look::soft, best_format(op));
  pixman_transform_t transform;
  pixman_transform_init_scale(&transform, pixman_double_to_fixed(0.64), pixman_double_to_fixed(0.64));
  pixman_image_set_transform(scene.from, &transform);
  pixman_image_set_filter(scene.from, PIXMAN_FILTER_NEAREST, nullptr, 0);
  const auto list = places(scaled_size, scaled_size);
  for (auto _ : state) {
    for (const auto& at : list) {
      pixman_image_composite32(op, scene.from, nullptr, scene.to, 0, 0, 0, 0, at.x, at.y, scaled_size, scaled_size);
    }
    benchmark::ClobberMemory();
  }
  report(state, 64.0 * scaled_size * scaled_size);
}

#define SCALED(blend)                                                                     \
  BENCHMARK(scaled<BlendMode_e::blend>)->Name("sprites/scaled_" #blend "/soft/velmark5"); \
  BENCHMARK(pixman_scaled<BlendMode_e::blend>)->Name("sprites/scaled_" #blend "/soft/pixman");
SCALED(replace)
SCALED(alpha)
SCALED(additive)
BENCHMARK(scaled_tested)->Name("sprites/scaled_tested/soft/velmark5");

// --- Rotated by 30 degrees, nearest
// -----------------------------------------------------------------------------------

template <BlendMode_e Blend>
void rotated(benchmark::State& state) {
  const int size = static_cast<int>(state.range(0));
  bench_scene scene(size, look::soft, PIXMAN_a8r8g8b8);
  const auto render = sprite_select::parallelogram(none, static_cast<int>(Blend));
  const double c = std::cos(M_PI / 6) * size, s = std::sin(M_PI / 6) * size;
  const int box = static_cast<int>(std::ceil(c + s));
  const auto list = places(box, box);
  for (auto _ : state) {
    for (const auto& at : list) {
      ParallelogramRenderParams params{};
      params.x0 = static_cast<float>(at.x + s);
      params.y0 = static_cast<float>(at.y);
      params.x1 = static_cast<float>(params.x0 + c);
      params.y1 = static_cast<float>(params.y0 + s);
      params.x2 = static_cast<float>(params.x0 - s);
      params.y2 = static_cast<float>(params.y0 + c);
      (scene.sprite.*render)(params, scene.target);
    }
    benchmark::ClobberMemory();
  }
  report(state, 64.0 * size * size);
}

// pixman walks the bounding box; what lies outside the image is clear.
template <BlendMode_e Blend>
void pixman_rotated(benchmark::State& state) {
  const int size = static_cast<int>(state.range(0));
  const pixman_op_t op = operator_of(Blend);
  bench_scene scene(size, look::soft, best_format(op));
  const double c = std::cos(M_PI / 6), s = std::sin(M_PI / 6);
  const int box = static_cast<int>(std::ceil((c + s) * size));
  const pixman_f_transform_t map = {{{c, s, -s * size * c}, {-s, c, s * size * s}, {0, 0, 1}}};
  pixman_transform_t transform;
  pixman_transform_from_pixman_f_transform(&transform, &map);
  pixman_image_set_transform(scene.from, &transform);
  pixman_image_set_filter(scene.from, PIXMAN_FILTER_NEAREST, nullptr, 0);
  const auto list = places(box, box);
  for (auto _ : state) {
    for (const auto& at : list)
      pixman_image_composite32(op, scene.from, nullptr, scene.to, 0, 0, 0, 0, at.x, at.y, box, box);
    benchmark::ClobberMemory();
  }
  report(state, 64.0 * size * size);
}

#define ROTATED(blend)                                                                                        \
  BENCHMARK(rotated<BlendMode_e::blend>)->Name("sprites/rotated_" #blend "/soft/velmark5")->Arg(16)->Arg(64); \
  BENCHMARK(pixman_rotated<BlendMode_e::blend>)->Name("sprites/rotated_" #blend "/soft/pixman")->Arg(16)->Arg(64);
ROTATED(alpha)
ROTATED(additive)

// --- Tiled over 256x256
// -----------------------------------------------------------------------------------------------

constexpr int tiled_size = 256;

template <BlendMode_e Blend>
void tiled(benchmark::State& state) {
  bench_scene scene(static_cast<int>(state.range(0)), look::soft, PIXMAN_a8r8g8b8);
  const auto render = sprite_select::tiled(none, static_cast<int>(Blend));
  const auto list = places(tiled_size, tiled_size);
  RenderParams_s params;
  params.width = params.height = tiled_size;
  for (auto _ : state) {
    for (const auto& at : list) {
      params.x = at.x;
      params.y = at.y;
      (scene.sprite.*render)(params, scene.target);
    }
    benchmark::ClobberMemory();
  }
  report(state, 64.0 * tiled_size * tiled_size);
}

template <BlendMode_e Blend>
void pixman_tiled(benchmark::State& state) {
  const pixman_op_t op = operator_of(Blend);
  bench_scene scene(static_cast<int>(state.range(0)), look::soft, best_format(op));
  pixman_image_set_repeat(scene.from, PIXMAN_REPEAT_NORMAL);
  const auto list = places(tiled_size, tiled_size);
  for (auto _ : state) {
    for (const auto& at : list) {
      pixman_image_composite32(op, scene.from, nullptr, scene.to, 0, 0, 0, 0, at.x, at.y, tiled_size, tiled_size);
    }
    benchmark::ClobberMemory();
  }
  report(state, 64.0 * tiled_size * tiled_size);
}

#define TILED(blend)                                                                                      \
  BENCHMARK(tiled<BlendMode_e::blend>)->Name("sprites/tiled_" #blend "/soft/velmark5")->Arg(16)->Arg(64); \
  BENCHMARK(pixman_tiled<BlendMode_e::blend>)->Name("sprites/tiled_" #blend "/soft/pixman")->Arg(16)->Arg(64);
TILED(replace)
TILED(alpha)

}  // namespace
