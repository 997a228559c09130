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
#include <list>
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

// Where a run's circle begins, so that the run goes through its middle.
int mask_y(const place& at) { return at.y - (run_pixels - glyph_height) / 2; }

std::vector<place> places_of(form shape) {
  return shape == form::upwards ? places(glyph_height, run_pixels) : places(run_pixels, glyph_height);
}

template <class Font, form Form>
void plot(benchmark::State& state, unsigned int colour, bool solid) {
  bench_toolkit frame(target_width, target_height);
  loaded_font<Font> loaded;
  const Font& font = loaded.font;
  const auto list = places_of(Form);
  const clippingmask mask = circle(loaded.pool);
  for (auto _ : state) {
    for (const place& at : list) {
      for (int i = 0; i < run_glyphs; ++i) {
        const auto glyph = static_cast<short>(i);
        if constexpr (Form == form::plain) {
          font.plotletter(glyph, at.x + i * advance, at.y, colour, solid);
        } else if constexpr (Form == form::masked) {
          font.plotletter(glyph, at.x + i * advance, at.y, colour, solid, &mask, at.x, mask_y(at));
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

// How pixman gets what the library does. A glyph at a time as an A8 image, or a run in one call from its glyph cache,
// straight to the frame or through a mask of the run. It turns images while it draws them, or the letters are turned
// beforehand.
enum class way { image, turning_image, cache, cache_with_mask };

// The letters as A8 images and in a glyph cache, and a solid colour.
struct pixman_font {
  pixman_font(unsigned int* pixels, pixman_format_code_t format, form shape, way how)
      : up(shape == form::upwards),
        target(pixman_image_create_bits_no_clear(format, target_width, target_height, pixels, target_width * 4)),
        cache(pixman_glyph_cache_create()) {
    const pixman_color_t colour{0xE0E0, 0xC0C0, 0x4040, 0xFFFF};
    source = pixman_image_create_solid_fill(&colour);
    pixman_glyph_cache_freeze(cache);
    for (int i = 0; i < run_glyphs; ++i) {
      const bool turned = up && how != way::turning_image;
      const int w = turned ? glyph_height : glyph_width, h = turned ? glyph_width : glyph_height;
      pixman_image_t* image = pixman_image_create_bits(PIXMAN_a8, w, h, nullptr, (w + 3) / 4 * 4);
      auto* bytes = reinterpret_cast<unsigned char*>(pixman_image_get_data(image));
      const auto shape_bytes = letter(i);
      for (int y = 0; y < h; ++y) {
        for (int x = 0; x < w; ++x) {
          const int from = turned ? x * glyph_width + glyph_width - 1 - y : y * glyph_width + x;
          bytes[y * pixman_image_get_stride(image) + x] = shape_bytes[static_cast<std::size_t>(from)];
        }
      }
      images.push_back(image);
      if (how == way::turning_image) {
        constexpr pixman_fixed_t one = pixman_fixed_1;
        const pixman_transform_t turn = {{{0, -one, glyph_width * one}, {one, 0, 0}, {0, 0, one}}};
        pixman_image_set_transform(image, &turn);
        continue;
      }
      const void* glyph = pixman_glyph_cache_insert(cache, this, &images_key[i], 0, 0, image);
      glyphs.push_back({up ? 0 : i * advance, up ? i * advance : 0, glyph});
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

  void draw(way how, int x, int y) {
    switch (how) {
      case way::image:
      case way::turning_image:
        for (int i = 0; i < run_glyphs; ++i) {
          pixman_image_composite32(PIXMAN_OP_OVER, source, images[static_cast<std::size_t>(i)], target, 0, 0, 0, 0,
                                   x + (up ? 0 : i * advance), y + (up ? i * advance : 0),
                                   up ? glyph_height : glyph_width, up ? glyph_width : glyph_height);
        }
        break;
      case way::cache:
        pixman_composite_glyphs_no_mask(PIXMAN_OP_OVER, source, target, 0, 0, x, y, cache, run_glyphs, glyphs.data());
        break;
      case way::cache_with_mask:
        pixman_composite_glyphs(PIXMAN_OP_OVER, source, target, PIXMAN_a8, 0, 0, 0, 0, x, y,
                                up ? glyph_height : run_pixels, up ? run_pixels : glyph_height, cache, run_glyphs,
                                glyphs.data());
        break;
    }
  }

  bool up;
  pixman_image_t* target;
  pixman_image_t* source;
  pixman_glyph_cache_t* cache;
  std::vector<pixman_image_t*> images;
  std::vector<pixman_glyph_t> glyphs;
  char images_key[run_glyphs] = {};
};

// The spans of a mask at (x, y) as a clip region.
struct span_region {
  span_region(const clippingmask& mask, int x, int y) {
    std::vector<pixman_box32_t> rows;
    for (int row = 0; row < mask.rows(); ++row) {
      const int left = x + mask.starts[row];
      rows.push_back({left, y + row, left + mask.lengths[row], y + row + 1});
    }
    pixman_region32_init_rects(&region, rows.data(), static_cast<int>(rows.size()));
  }
  ~span_region() { pixman_region32_fini(&region); }
  span_region(const span_region&) = delete;
  span_region& operator=(const span_region&) = delete;

  pixman_region32_t region;
};

template <way Way, form Form>
void pixman(benchmark::State& state, pixman_format_code_t format) {
  bench_toolkit frame(target_width, target_height);
  pixman_font font(frame.colour, format, Form, Way);
  memorymanager pool(1 << 16);
  const clippingmask mask = circle(pool);
  const auto list = places_of(Form);
  // A region lies where the frame does: there is one for each place, made beforehand.
  std::list<span_region> regions;
  for (const place& at : list) regions.emplace_back(mask, at.x, mask_y(at));
  for (auto _ : state) {
    auto clip = regions.begin();
    for (const place& at : list) {
      if constexpr (Form == form::masked) pixman_image_set_clip_region32(font.target, &clip++->region);
      font.draw(Way, at.x, at.y);
    }
    benchmark::ClobberMemory();
  }
  report(state);
}

template <form Form>
void add_ways(const std::string& form_name) {
  for (const auto format : {PIXMAN_a8r8g8b8, PIXMAN_x8r8g8b8}) {
    const std::string suffix = form_name + (format == PIXMAN_a8r8g8b8 ? "/a8r8g8b8" : "/x8r8g8b8");
    const auto add_way = [&](const std::string& name, auto function) {
      benchmark::RegisterBenchmark(("fonts/pixman/" + name + suffix).c_str(), function, format);
    };
    add_way("image", pixman<way::image, Form>);
    if (Form == form::upwards) add_way("turning_image", pixman<way::turning_image, Form>);
    add_way("cache", pixman<way::cache, Form>);
    add_way("cache_with_mask", pixman<way::cache_with_mask, Form>);
  }
}

const bool registered = [] {
  add<font_alpha>("alpha", 0xFFE0C040, true);
  add<font_mono>("mono", 0xFFE0C040, true);
  add<font_mono>("mono_blended", 0x80E0C040, true);
  add<font_paletted>("paletted", 0xFFE0C040, false);
  add<font_paletted>("paletted_solid", 0xFFE0C040, true);
  add_ways<form::plain>("/plain");
  add_ways<form::masked>("/masked");
  add_ways<form::upwards>("/upwards");
  return true;
}();

}  // namespace
