// Sprite drawing beside pixman on the same work: the same image at the same places of a 1280x720 frame.
//
// "ns_px" is the time per pixel drawn. Compare medians of one run:
//   velmark5_bench --benchmark_filter=sprites --benchmark_repetitions=9 --benchmark_enable_random_interleaving=true
#include <benchmark/benchmark.h>
#include <pixman.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <string>
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

// Squares of `side` all over the target.
std::vector<place> places(int side) {
  test_random random(1);
  std::vector<place> list;
  for (int i = 0; i < 64; ++i)
    list.push_back({random.between(0, target_width - side), random.between(0, target_height - side)});
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

// What is drawn: a square image, the side of the square it is drawn in, and the pixels that it covers there.
struct work {
  std::string name;
  int size;
  look kind;
  BlendMode_e blend;
  int side;
  int pixels;
};

// A frame and the image, for the library and as pixman sees them.
struct bench_scene {
  explicit bench_scene(const work& w)
      : frame(target_width, target_height),
        op(w.blend == BlendMode_e::replace ? PIXMAN_OP_SRC
           : w.blend == BlendMode_e::alpha ? PIXMAN_OP_OVER
                                           : PIXMAN_OP_ADD) {
    paint(sprite, w.size, w.kind);
    // The format in which pixman is fastest.
    to = pixman_image_create_bits_no_clear(op == PIXMAN_OP_ADD ? PIXMAN_a8r8g8b8 : PIXMAN_x8r8g8b8, target_width,
                                           target_height, frame.colour, target_width * 4);
    from = pixman_image_create_bits_no_clear(PIXMAN_a8r8g8b8, w.size, w.size, sprite.pixels, w.size * 4);
    target = sprite_target(frame.kit());
  }
  ~bench_scene() {
    pixman_image_unref(from);
    pixman_image_unref(to);
  }
  bench_scene(const bench_scene&) = delete;
  bench_scene& operator=(const bench_scene&) = delete;

  bench_toolkit frame;
  pixman_op_t op;
  Sprite_c sprite;
  SpriteTarget_s target;
  pixman_image_t* to;
  pixman_image_t* from;
};

// Measures what make(scene) gives: a function that draws at a place.
template <class Make>
void add(const work& w, const std::string& who, Make make) {
  const std::string name = "sprites/" + w.name + "/" + who + "/" + std::to_string(w.size);
  benchmark::RegisterBenchmark(name.c_str(), [=](benchmark::State& state) {
    bench_scene scene(w);
    const auto draw = make(scene);
    const auto list = places(w.side);
    for (auto _ : state) {
      for (const place& at : list) draw(at);
      benchmark::ClobberMemory();
    }
    report(state, 64.0 * w.pixels);
  });
}

// One of the library's placements that take a rectangle.
void add_ours(const work& w, sprite_select::Render render) {
  add(w, "velmark5", [=](bench_scene& scene) {
    // For those that test depths: every other row passes.
    for (int i = 0; i < target_width * target_height; ++i) scene.frame.depth[i] = i / target_width % 2 == 0 ? 10 : 1;
    scene.target.depth = scene.frame.depth;
    return [=, &scene](place at) {
      RenderParams_s params;
      params.x = at.x;
      params.y = at.y;
      params.z = 5;
      params.width = params.height = w.side;
      (scene.sprite.*render)(params, scene.target);
    };
  });
}

// pixman over the whole square, from the image as prepare(image) leaves it.
template <class Prepare>
void add_pixman(const work& w, Prepare prepare) {
  add(w, "pixman", [=](bench_scene& scene) {
    prepare(scene.from);
    return [=, &scene](place at) {
      pixman_image_composite32(scene.op, scene.from, nullptr, scene.to, 0, 0, 0, 0, at.x, at.y, w.side, w.side);
    };
  });
}

void use_transform(pixman_image_t* image, const pixman_f_transform_t& map) {
  pixman_transform_t transform;
  pixman_transform_from_pixman_f_transform(&transform, &map);
  pixman_image_set_transform(image, &transform);
  pixman_image_set_filter(image, PIXMAN_FILTER_NEAREST, nullptr, 0);
}

void add_plain(const std::string& name, int size, look kind, BlendMode_e blend) {
  const work w{name, size, kind, blend, size, size * size};
  add_ours(w, sprite_select::render<VELMARK5_PLAIN>(none, static_cast<int>(blend)));
  add_pixman(w, [](pixman_image_t*) {});
}

void add_scaled(const std::string& name, BlendMode_e blend) {
  constexpr int from = 64, to = 100;
  const work w{name, from, look::soft, blend, to, to * to};
  add_ours(w, sprite_select::render<VELMARK5_SCALED>(none, static_cast<int>(blend)));
  constexpr double step = static_cast<double>(from) / to;
  add_pixman(w, [](pixman_image_t* image) { use_transform(image, {{{step, 0, 0}, {0, step, 0}, {0, 0, 1}}}); });
}

// The scaled image behind a depth test that half of the rows pass. pixman has no equal.
void add_tested() {
  const work w{"scaled_tested/soft", 64, look::soft, BlendMode_e::alpha, 100, 100 * 100};
  add_ours(w, sprite_select::render<VELMARK5_SCALED_TESTED>(none, static_cast<int>(w.blend)));
}

// By 30 degrees. pixman walks the bounding box; what lies outside the image is clear.
void add_rotated(const std::string& name, int size, BlendMode_e blend) {
  const double c = std::cos(M_PI / 6), s = std::sin(M_PI / 6);
  const int box = static_cast<int>(std::ceil((c + s) * size));
  const work w{name, size, look::soft, blend, box, size * size};
  const auto render = sprite_select::parallelogram(none, static_cast<int>(blend));
  add(w, "velmark5", [=](bench_scene& scene) {
    return [=, &scene](place at) {
      ParallelogramRenderParams params{};
      params.x0 = static_cast<float>(at.x + s * size);
      params.y0 = static_cast<float>(at.y);
      params.x1 = static_cast<float>(params.x0 + c * size);
      params.y1 = static_cast<float>(params.y0 + s * size);
      params.x2 = static_cast<float>(params.x0 - s * size);
      params.y2 = static_cast<float>(params.y0 + c * size);
      (scene.sprite.*render)(params, scene.target);
    };
  });
  add_pixman(w, [=](pixman_image_t* image) {
    use_transform(image, {{{c, s, -s * size * c}, {-s, c, s * size * s}, {0, 0, 1}}});
  });
}

void add_tiled(const std::string& name, int size, BlendMode_e blend) {
  constexpr int side = 256;
  const work w{name, size, look::soft, blend, side, side * side};
  add_ours(w, sprite_select::tiled(none, static_cast<int>(blend)));
  add_pixman(w, [](pixman_image_t* image) { pixman_image_set_repeat(image, PIXMAN_REPEAT_NORMAL); });
}

const bool registered = [] {
  using enum BlendMode_e;
  for (const int size : {16, 64}) {
    add_plain("replace/soft", size, look::soft, replace);
    add_plain("alpha/soft", size, look::soft, alpha);
    add_plain("alpha/disc", size, look::disc, alpha);
    add_plain("additive/soft", size, look::soft, additive);
    add_rotated("rotated_alpha/soft", size, alpha);
    add_rotated("rotated_additive/soft", size, additive);
    add_tiled("tiled_replace/soft", size, replace);
    add_tiled("tiled_alpha/soft", size, alpha);
  }
  add_scaled("scaled_replace/soft", replace);
  add_scaled("scaled_alpha/soft", alpha);
  add_scaled("scaled_additive/soft", additive);
  add_tested();
  return true;
}();

}  // namespace
