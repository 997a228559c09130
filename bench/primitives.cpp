// The 2D primitives beside what limits them, loops of the benchmark's own, and beside pixman.
//
// "ns_px" is the time per pixel drawn. Compare medians of one run:
//   velmark5_bench --benchmark_filter=primitives --benchmark_repetitions=9 --benchmark_enable_random_interleaving=true
#include <benchmark/benchmark.h>
#include <emmintrin.h>
#include <pixman.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstdlib>
#include <vector>

#include "bench_toolkit.h"
#include "raster/Rasterizer.h"
#include "support/random.h"

namespace {

constexpr int target_width = 1280;
constexpr int target_height = 720;
constexpr unsigned int translucent = 0x80402010;

void report(benchmark::State& state, double pixels) {
  using benchmark::Counter;
  state.counters["ns_px"] = Counter(pixels * 1e-9, Counter::kIsIterationInvariantRate | Counter::kInvert);
}

// Squares of one size all over the target, or the whole target alone.
struct places {
  struct place {
    int x, y;
  };
  places(int w, int h) : width(w), height(h) {
    if (w == target_width) {
      list = {{0, 0}};
      return;
    }
    test_random random(1);
    for (int i = 0; i < 64; ++i)
      list.push_back({random.between(0, target_width - w), random.between(0, target_height - h)});
  }
  double pixels() const { return static_cast<double>(list.size()) * width * height; }

  int width, height;
  std::vector<place> list;
};

// Runs draw(x, y, w, h) for each place, the size taken from the benchmark's arguments.
template <class Draw>
void run_places(benchmark::State& state, Draw&& draw) {
  const places at(static_cast<int>(state.range(0)), static_cast<int>(state.range(1)));
  for (auto _ : state) {
    for (const auto& place : at.list) draw(place.x, place.y, at.width, at.height);
    benchmark::ClobberMemory();
  }
  report(state, at.pixels());
}

void sizes(benchmark::internal::Benchmark* b) {
  b->Args({16, 16})->Args({64, 64})->Args({target_width, target_height});
}
void whole(benchmark::internal::Benchmark* b) { b->Args({target_width, target_height}); }

// --- Rectangles
// -------------------------------------------------------------------------------------------------------

template <unsigned int Mode>
void rect_fill(benchmark::State& state) {
  const bench_toolkit target(target_width, target_height);
  run_places(state, [&](int x, int y, int w, int h) { target.kit().rect_fill(x, y, w, h, translucent, Mode); });
}
BENCHMARK(rect_fill<0>)->Name("primitives/opaque/rect_fill")->Apply(sizes);
BENCHMARK(rect_fill<1>)->Name("primitives/blend/rect_fill")->Apply(sizes);
BENCHMARK(rect_fill<2>)->Name("primitives/add/rect_fill")->Apply(sizes);

// A row as a fill streams it, through the cache instead.
inline void plain_row(unsigned int* p, int n) {
  const __m128i group = _mm_set1_epi32(static_cast<int>(translucent));
  for (; n > 0 && (reinterpret_cast<std::uintptr_t>(p) & 15) != 0; --n) *p++ = translucent;
  for (; n >= 16; n -= 16, p += 16) {
#pragma GCC unroll 4
    for (int i = 0; i < 16; i += 4) _mm_store_si128(reinterpret_cast<__m128i*>(p + i), group);
  }
  for (; n >= 4; n -= 4, p += 4) _mm_store_si128(reinterpret_cast<__m128i*>(p), group);
  for (; n > 0; --n) *p++ = translucent;
}

void plain_stores(benchmark::State& state) {
  const bench_toolkit target(target_width, target_height);
  run_places(state, [&](int x, int y, int w, int h) {
    for (int row = y; row < y + h; ++row) plain_row(target.colour + row * target_width + x, w);
  });
}
BENCHMARK(plain_stores)->Name("primitives/opaque/plain_stores")->Apply(sizes);

// What memory gives: one run of streaming stores over the whole target, nothing else.
void nontemporal_memset(benchmark::State& state) {
  const bench_toolkit target(target_width, target_height);
  run_places(state, [&](int, int, int, int) {
    auto* p = reinterpret_cast<__m128i*>(target.colour);
    auto* const end = p + target.pixels / 4;
    const __m128i group = _mm_set1_epi32(static_cast<int>(translucent));
    for (; p < end; p += 4) {
      _mm_stream_si128(p, group);
      _mm_stream_si128(p + 1, group);
      _mm_stream_si128(p + 2, group);
      _mm_stream_si128(p + 3, group);
    }
    _mm_sfence();
  });
}
BENCHMARK(nontemporal_memset)->Name("primitives/opaque/nontemporal_memset")->Apply(whole);
BENCHMARK(nontemporal_memset)->Name("primitives/depth/nontemporal_memset")->Apply(whole);

// What memory gives to a blend: every group read, changed by one instruction, and written.
void read_modify_write(benchmark::State& state) {
  const bench_toolkit target(target_width, target_height);
  run_places(state, [&](int x, int y, int w, int h) {
    const __m128i flip = _mm_set1_epi32(0x55);
    for (int row = y; row < y + h; ++row) {
      auto* p = reinterpret_cast<__m128i*>(target.colour + row * target_width + x);
      for (int i = 0; i < w / 4; ++i) _mm_storeu_si128(p + i, _mm_xor_si128(_mm_loadu_si128(p + i), flip));
    }
  });
}
BENCHMARK(read_modify_write)->Name("primitives/blend/read_modify_write")->Apply(sizes);

template <pixman_op_t Operator>
void pixman_fill(benchmark::State& state) {
  const bench_toolkit target(target_width, target_height);
  pixman_image_t* image =
      pixman_image_create_bits_no_clear(PIXMAN_a8r8g8b8, target_width, target_height, target.colour, target_width * 4);
  const pixman_color_t colour{0x4040, 0x2020, 0x1010, 0x8080};
  run_places(state, [&](int x, int y, int w, int h) {
    const pixman_box32_t box{x, y, x + w, y + h};
    pixman_image_fill_boxes(Operator, image, &colour, 1, &box);
  });
  pixman_image_unref(image);
}
BENCHMARK(pixman_fill<PIXMAN_OP_SRC>)->Name("primitives/opaque/pixman_src")->Apply(sizes);
BENCHMARK(pixman_fill<PIXMAN_OP_OVER>)->Name("primitives/blend/pixman_over")->Apply(sizes);
BENCHMARK(pixman_fill<PIXMAN_OP_ADD>)->Name("primitives/add/pixman_add")->Apply(sizes);

void zbuffer_clear(benchmark::State& state) {
  const bench_toolkit target(target_width, target_height);
  toolkit& kit = target.kit();
  kit.depthbuffer = target.depth;
  run_places(state, [&](int x, int y, int w, int h) { kit.zbuffer_clear(x, y, w, h, Rasterizer_n::far_depth); });
}
BENCHMARK(zbuffer_clear)->Name("primitives/depth/zbuffer_clear")->Apply(whole);

// --- Lines
// --------------------------------------------------------------------------------------------------------------

// Lines of one length in all directions.
std::vector<std::array<int, 4>> lines(int length) {
  test_random random(2);
  std::vector<std::array<int, 4>> result;
  for (int i = 0; i < 256; ++i) {
    const int x = random.between(length, target_width - 1 - length);
    const int y = random.between(length, target_height - 1 - length);
    int dx = random.between(-length, length);
    int dy = random.one_in(2) ? length - 1 : 1 - length;
    if (random.one_in(2)) std::swap(dx, dy);
    result.push_back({x, y, x + dx, y + dy});
  }
  return result;
}

template <class Draw>
void run_lines(benchmark::State& state, Draw&& draw) {
  const auto list = lines(static_cast<int>(state.range(0)));
  double pixels = 0;
  for (const auto& l : list) pixels += std::max(std::abs(l[2] - l[0]), std::abs(l[3] - l[1])) + 1;
  for (auto _ : state) {
    for (const auto& l : list) draw(l[0], l[1], l[2], l[3]);
    benchmark::ClobberMemory();
  }
  report(state, pixels);
}

template <unsigned int Mode>
void line(benchmark::State& state) {
  const bench_toolkit target(target_width, target_height);
  run_lines(state, [&](int x0, int y0, int x1, int y1) { target.kit().line(x0, y0, x1, y1, translucent, Mode); });
}
BENCHMARK(line<0>)->Name("primitives/line_opaque/line")->Arg(20)->Arg(300);
BENCHMARK(line<1>)->Name("primitives/line_blend/line")->Arg(20)->Arg(300);

// An opaque line by the midpoint method that knows no clip.
void unclipped_line(benchmark::State& state) {
  const bench_toolkit target(target_width, target_height);
  run_lines(state, [&](int x0, int y0, int x1, int y1) {
    int major = std::abs(x1 - x0);
    int minor = std::abs(y1 - y0);
    int major_step = x1 < x0 ? -1 : 1;
    int minor_step = y1 < y0 ? -target_width : target_width;
    if (minor > major) std::swap(major, minor), std::swap(major_step, minor_step);
    unsigned int* p = target.colour + y0 * target_width + x0;
    int error = major / 2;
    for (int i = 0; i <= major; ++i) {
      *p = translucent;
      p += major_step;
      error -= minor;
      const int turn = error >> 31;
      p += minor_step & turn;
      error += major & turn;
    }
  });
}
BENCHMARK(unclipped_line)->Name("primitives/line_opaque/unclipped_loop")->Arg(20)->Arg(300);

// --- Circles
// ------------------------------------------------------------------------------------------------------------

constexpr int circle_count = 64;

std::vector<std::array<int, 2>> centres(int radius) {
  test_random random(3);
  std::vector<std::array<int, 2>> result;
  for (int i = 0; i < circle_count; ++i) {
    result.push_back(
        {random.between(radius, target_width - 1 - radius), random.between(radius, target_height - 1 - radius)});
  }
  return result;
}

// The rows of one circle, as the library draws it: offset and number of pixels.
std::vector<std::array<int, 2>> circle_rows(bench_toolkit& target, int radius) {
  target.kit().cls(0);
  target.kit().circle_fill(radius, radius, 0, radius, 1, 0);
  std::vector<std::array<int, 2>> rows;
  for (int y = 0; y <= 2 * radius; ++y) {
    const unsigned int* row = target.colour + y * target_width;
    const auto count = static_cast<int>(std::count(row, row + 2 * radius + 1, 1u));
    rows.push_back({static_cast<int>(std::find(row, row + 2 * radius + 1, 1u) - row), count});
  }
  return rows;
}

template <class Draw>
void run_circles(benchmark::State& state, bench_toolkit& target, Draw&& draw) {
  const auto radius = static_cast<int>(state.range(0));
  const auto rows = circle_rows(target, radius);
  double pixels = 0;
  for (const auto& row : rows) pixels += row[1];
  const auto list = centres(radius);
  for (auto _ : state) {
    for (const auto& centre : list) draw(centre[0], centre[1], radius, rows);
    benchmark::ClobberMemory();
  }
  report(state, pixels * circle_count);
}

template <unsigned int Mode, bool Depth>
void circle_fill(benchmark::State& state) {
  bench_toolkit target(target_width, target_height);
  target.kit().depthbuffer = Depth ? target.depth : nullptr;
  run_circles(state, target, [&](int x, int y, int radius, const auto&) {
    target.kit().circle_fill(x, y, 0, radius, translucent, Mode);
  });
}
BENCHMARK(circle_fill<0, false>)->Name("primitives/circle_opaque/circle_fill")->Arg(8)->Arg(32)->Arg(128);
BENCHMARK(circle_fill<1, false>)->Name("primitives/circle_blend/circle_fill")->Arg(8)->Arg(32)->Arg(128);
BENCHMARK(circle_fill<1, true>)->Name("primitives/circle_blend/circle_fill_depth")->Arg(8)->Arg(32)->Arg(128);

// The same rows, known beforehand, through the cache.
void known_rows(benchmark::State& state) {
  bench_toolkit target(target_width, target_height);
  run_circles(state, target, [&](int x, int y, int radius, const auto& rows) {
    unsigned int* row = target.colour + (y - radius) * target_width + x - radius;
    for (const auto& [offset, count] : rows) {
      plain_row(row + offset, count);
      row += target_width;
    }
  });
}
BENCHMARK(known_rows)->Name("primitives/circle_opaque/known_rows")->Arg(8)->Arg(32)->Arg(128);

}  // namespace
