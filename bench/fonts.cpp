// Glyphs of the three fonts beside pixman's glyph cache on the same work: runs of twenty 12x16 glyphs in a 1280x720
// frame.
//
// "ns_glyph" and "ns_px" are processor time per glyph, and per pixel of its box. Compare medians of one run:
//   velmark5_bench --benchmark_filter=fonts --benchmark_repetitions=9 --benchmark_enable_random_interleaving=true
#include <benchmark/benchmark.h>
#include <pixman.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <string>
#include <vector>

#include "bench_toolkit.h"
#include "support/random.h"
#include "toolkit/font_alpha.h"
#include "toolkit/font_mono.h"
#include "toolkit/font_paletted.h"

namespace {

constexpr int target_width = 1280, target_height = 720;
constexpr int glyph_width = 12, glyph_height = 16, advance = 12;
constexpr int run_glyphs = 20, runs = 16;
constexpr int run_pixels = run_glyphs * advance;

void report(benchmark::State& state) {
  using benchmark::Counter;
  constexpr double glyphs = run_glyphs * runs;
  constexpr double pixels = glyphs * glyph_width * glyph_height;
  state.counters["ns_glyph"] = Counter(glyphs * 1e-9, Counter::kIsIterationInvariantRate | Counter::kInvert);
  state.counters["ns_px"] = Counter(pixels * 1e-9, Counter::kIsIterationInvariantRate | Counter::kInvert);
  state.counters["glyphs/s"] = Counter(glyphs, Counter::kIsIterationInvariantRate);
}

// Coverage of a letter-like shape: a bowl and a stem of two pixels' breadth with soft rims. The shape differs from
// glyph to glyph; about half of the box stays empty, as in text.
std::vector<unsigned char> letter(int number) {
  std::vector<unsigned char> bytes;
  const double radius = 3.0 + number % 3, centre_y = 5 + number % 5, stem = 2 + number % 7;
  for (int y = 0; y < glyph_height; ++y) {
    for (int x = 0; x < glyph_width; ++x) {
      const double dx = x + 0.5 - 6, dy = y + 0.5 - centre_y - 1;
      const double bowl = std::abs(std::sqrt(dx * dx + dy * dy) - radius);
      const double line = std::abs(x + 0.5 - stem - 1);
      const double inside = 1.5 - std::min(bowl, y > 1 && y < 14 ? line : 9);
      bytes.push_back(static_cast<unsigned char>(std::clamp(inside, 0.0, 1.0) * 255));
    }
  }
  return bytes;
}

// Any of the fonts with run_glyphs letters.
template <class Font>
struct loaded_font {
  loaded_font() : pool(1 << 20), font(&pool) {
    const auto all = [this](int value) {
      auto array = sharedarray<int>::allocate(pool, run_glyphs);
      std::fill_n(array.data(), run_glyphs, value);
      return array;
    };
    font.metrics = {all(glyph_width), all(glyph_height), all(0), all(0)};
    glyph_bitmaps bitmaps(run_glyphs);
    for (int i = 0; i < run_glyphs; ++i) {
      const auto bytes = letter(i);
      bitmaps[i] = sharedarray<unsigned char>::allocate(pool, static_cast<unsigned int>(bytes.size()));
      std::copy(bytes.begin(), bytes.end(), bitmaps[i].data());
    }
    font.glyphs.swap(bitmaps);
    if constexpr (requires { font.palette; }) {
      font.palette = sharedarray<unsigned int>::allocate(pool, 256);
      for (int i = 0; i < 256; ++i) font.palette[i] = static_cast<unsigned int>(i) * 0x10101u;
    }
  }
  memorymanager pool;
  Font font;
};

struct place {
  int x, y;
};

// Where the runs begin.
std::vector<place> places(int width, int height) {
  test_random random(7);
  std::vector<place> list;
  for (int i = 0; i < runs; ++i) {
    list.push_back({random.between(0, target_width - width), random.between(0, target_height - height)});
  }
  return list;
}

// --- The library ----------------------------------------------------------------------------------------------------

enum class form { plain, masked, upwards };

// A circle of the run's breadth around its middle; only its first and last glyphs are cut.
clippingmask circle(memorymanager& pool) {
  clippingmask mask(&pool, run_pixels, run_pixels, {nullptr, nullptr}, {nullptr, nullptr});
  mask.starts = sharedarray<int>::allocate(pool, run_pixels);
  mask.lengths = sharedarray<int>::allocate(pool, run_pixels);
  for (int row = 0; row < run_pixels; ++row) {
    const double radius = run_pixels / 2, dy = row + 0.5 - radius;
    const int half = static_cast<int>(std::sqrt(radius * radius - dy * dy));
    mask.starts[row] = run_pixels / 2 - half;
    mask.lengths[row] = 2 * half;
  }
  return mask;
}

template <class Font, form Form>
void plot(benchmark::State& state, unsigned int colour, bool solid) {
  bench_toolkit frame(target_width, target_height);
  loaded_font<Font> loaded;
  const Font& font = loaded.font;
  constexpr bool up = Form == form::upwards;
  const auto list = up ? places(glyph_height, run_pixels) : places(run_pixels, glyph_height);
  const clippingmask mask = circle(loaded.pool);
  for (auto _ : state) {
    for (const place& at : list) {
      for (int i = 0; i < run_glyphs; ++i) {
        const auto glyph = static_cast<short>(i);
        if constexpr (Form == form::plain) {
          font.plotletter(glyph, at.x + i * advance, at.y, colour, solid);
        } else if constexpr (Form == form::masked) {
          font.plotletter(glyph, at.x + i * advance, at.y, colour, solid, &mask, at.x,
                          at.y - (run_pixels - glyph_height) / 2);
        } else {
          font.plotletter_upwards(glyph, at.x, at.y + i * advance, colour, solid);
        }
      }
    }
    benchmark::ClobberMemory();
  }
  report(state);
}

template <class Font>
void add(const std::string& name, unsigned int colour, bool solid) {
  const auto add_form = [&](const char* form_name, auto function) {
    benchmark::RegisterBenchmark(("fonts/" + name + form_name).c_str(), function, colour, solid);
  };
  add_form("/plain", plot<Font, form::plain>);
  add_form("/masked", plot<Font, form::masked>);
  add_form("/upwards", plot<Font, form::upwards>);
}

// --- pixman ---------------------------------------------------------------------------------------------------------

// The letters as A8 images and in a glyph cache, and a solid colour.
struct pixman_font {
  explicit pixman_font(unsigned int* pixels, pixman_format_code_t format)
      : target(pixman_image_create_bits_no_clear(format, target_width, target_height, pixels, target_width * 4)),
        cache(pixman_glyph_cache_create()) {
    const pixman_color_t colour{0xE0E0, 0xC0C0, 0x4040, 0xFFFF};
    source = pixman_image_create_solid_fill(&colour);
    pixman_glyph_cache_freeze(cache);
    for (int i = 0; i < run_glyphs; ++i) {
      pixman_image_t* image = pixman_image_create_bits(PIXMAN_a8, glyph_width, glyph_height, nullptr, glyph_width);
      auto* bytes = reinterpret_cast<unsigned char*>(pixman_image_get_data(image));
      const auto shape = letter(i);
      for (int y = 0; y < glyph_height; ++y) {
        std::copy_n(shape.data() + y * glyph_width, glyph_width, bytes + y * pixman_image_get_stride(image));
      }
      images.push_back(image);
      glyphs.push_back({i * advance, 0, pixman_glyph_cache_insert(cache, this, &images_key[i], 0, 0, image)});
    }
  }
  ~pixman_font() {
    pixman_glyph_cache_thaw(cache);
    pixman_glyph_cache_destroy(cache);
    for (pixman_image_t* image : images) pixman_image_unref(image);
    pixman_image_unref(source);
    pixman_image_unref(target);
  }
  pixman_font(const pixman_font&) = delete;
  pixman_font& operator=(const pixman_font&) = delete;

  pixman_image_t* target;
  pixman_image_t* source;
  pixman_glyph_cache_t* cache;
  std::vector<pixman_image_t*> images;
  std::vector<pixman_glyph_t> glyphs;
  char images_key[run_glyphs] = {};
};

// Each glyph straight to the frame; through a mask of the whole run first; and as a call for each glyph.
enum class way { cache, cache_with_mask, image };

template <way Way>
void pixman(benchmark::State& state, pixman_format_code_t format) {
  bench_toolkit frame(target_width, target_height);
  pixman_font font(frame.colour, format);
  const auto list = places(run_pixels, glyph_height);
  for (auto _ : state) {
    for (const place& at : list) {
      if constexpr (Way == way::cache) {
        pixman_composite_glyphs_no_mask(PIXMAN_OP_OVER, font.source, font.target, 0, 0, at.x, at.y, font.cache,
                                        run_glyphs, font.glyphs.data());
      } else if constexpr (Way == way::cache_with_mask) {
        pixman_composite_glyphs(PIXMAN_OP_OVER, font.source, font.target, PIXMAN_a8, 0, 0, 0, 0, at.x, at.y, run_pixels,
                                glyph_height, font.cache, run_glyphs, font.glyphs.data());
      } else {
        for (int i = 0; i < run_glyphs; ++i) {
          pixman_image_composite32(PIXMAN_OP_OVER, font.source, font.images[static_cast<std::size_t>(i)], font.target,
                                   0, 0, 0, 0, at.x + i * advance, at.y, glyph_width, glyph_height);
        }
      }
    }
    benchmark::ClobberMemory();
  }
  report(state);
}

const bool registered = [] {
  add<font_alpha>("alpha", 0xFFE0C040, true);
  add<font_mono>("mono", 0xFFE0C040, true);
  add<font_mono>("mono_blended", 0x80E0C040, true);
  add<font_paletted>("paletted", 0xFFE0C040, false);
  add<font_paletted>("paletted_solid", 0xFFE0C040, true);
  for (const auto format : {PIXMAN_a8r8g8b8, PIXMAN_x8r8g8b8}) {
    const char* const suffix = format == PIXMAN_a8r8g8b8 ? "/a8r8g8b8" : "/x8r8g8b8";
    const auto add_way = [&](const std::string& name, auto function) {
      benchmark::RegisterBenchmark(("fonts/pixman/" + name + suffix).c_str(), function, format);
    };
    add_way("glyph_cache", pixman<way::cache>);
    add_way("run_mask", pixman<way::cache_with_mask>);
    add_way("a8_image", pixman<way::image>);
  }
  return true;
}();

}  // namespace
