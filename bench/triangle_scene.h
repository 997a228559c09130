// The triangles that the benchmarks draw, here and in the peer renderer: random turns, colours and order of depth, all
// of one area, wholly inside the target. They come in patches of neighbours, as the triangles of a mesh do.
#pragma once

#include <time.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <random>
#include <vector>

namespace triangle_scene {

inline constexpr int width = 1280, height = 720;

inline constexpr int sizes[] = {8, 64, 1000, 100000};  // pixels of a triangle

enum class kind {
  depth_only,
  smooth,
  textured,
  textured_fog,
  textured_translucent,
  pixel_alpha,
  three_textures,
  light_map
};

inline constexpr const char* names[] = {"depth_only",           "smooth",      "textured",       "textured_fog",
                                        "textured_translucent", "pixel_alpha", "three_textures", "light_map"};

// Processor time of this thread in seconds: both renderers draw on one thread, and others use the machine too.
inline double thread_seconds() {
  timespec t;
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &t);
  return static_cast<double>(t.tv_sec) + static_cast<double>(t.tv_nsec) * 1e-9;
}

struct vertex {
  float x, y, z;         // pixels, and depth from 0 to 1
  float u, v;            // texels
  std::uint32_t colour;  // 0xAARRGGBB
};

using triangle = std::array<vertex, 3>;

// As many triangles of one size as make two million pixels. A patch is about 128 pixels wide and covers itself twice.
inline std::vector<triangle> make(int pixels, bool half_alpha) {
  std::mt19937 random(static_cast<unsigned int>(pixels));
  const auto uniform = [&](double low, double high) {
    return low + (high - low) * static_cast<double>(random()) / 4294967296.0;
  };
  std::vector<triangle> triangles(static_cast<std::size_t>(2000000 / pixels));
  double patch_x = 0, patch_y = 0;  // 0 to 1 across the target
  const auto patch_size = static_cast<std::size_t>(std::max(1, 2 * 128 * 128 / pixels));
  std::size_t index = 0;
  for (triangle& t : triangles) {
    if (index++ % patch_size == 0) {
      patch_x = uniform(0, 1);
      patch_y = uniform(0, 1);
    }
    const double turn = uniform(0, 6.2832), depth = uniform(0.2, 0.8);
    double x[3], y[3];
    for (int i = 0; i < 3; ++i) {
      const double angle = turn + 2.0944 * i + uniform(-0.5, 0.5);
      x[i] = std::cos(angle);
      y[i] = std::sin(angle);
    }
    const double area = std::abs((x[1] - x[0]) * (y[2] - y[0]) - (x[2] - x[0]) * (y[1] - y[0])) / 2;
    const double scale = std::sqrt(pixels / area);
    const auto place = [&](double patch, double extent) {
      return std::clamp(patch * extent + uniform(-64, 64), scale, extent - scale);
    };
    const double centre_x = place(patch_x, width), centre_y = place(patch_y, height);
    for (int i = 0; i < 3; ++i) {
      t[static_cast<std::size_t>(i)] = {
          static_cast<float>(centre_x + scale * x[i]),
          static_cast<float>(centre_y + scale * y[i]),
          static_cast<float>(depth + uniform(0, 0.1)),
          static_cast<float>(64 + scale * x[i] * 2),
          static_cast<float>(64 + scale * y[i] * 2),
          (static_cast<std::uint32_t>(random()) & 0xFFFFFFu) | (half_alpha ? 0x80000000u : 0xFF000000u)};
    }
  }
  return triangles;
}

// Every how manieth triangle to draw, so that about a third of the target is covered: for counting pixels.
inline std::size_t sparse_step(int pixels, std::size_t count) {
  return std::max<std::size_t>(1, count / static_cast<std::size_t>(std::max(2, width * height / 3 / pixels)));
}

// Texel (u, v) of a 128 by 128 texture, and of a light map.
inline std::uint32_t texel(int texture, int u, int v) {
  const auto shade = static_cast<std::uint32_t>((u ^ v) & 127) + 64u;
  return (shade | 0x3Fu) << 24 | shade << (8 * texture) | 0x202020u;
}
inline std::uint8_t light(int u, int v) { return static_cast<std::uint8_t>(128 + ((u + v) & 127)); }

}  // namespace triangle_scene
