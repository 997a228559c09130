// The list of triangle instances: what the renderer can draw. Everything that needs the list (the explicit
// instantiations, the table for run-time search, the count in the tests) is expanded from the rows below.
#pragma once

#include <cstddef>
#include <span>

#include "raster/Triangle.h"

// Each row is a product of sets. A set is written as its values side by side: 0123 is 0, 1, 2 and 3. The address mode
// stands once for u and v. D, C, T: depth write, colour write, depth test. VISIT is called once for each combination,
// with ten values in the order of the columns.
//
// clang-format off
//
//                             shade  address  transform   fog  blend  key  lightmap   D  C   T
#define VELMARK5_PLAIN_TRIANGLES(VISIT)                                                           \
  VELMARK5_TRIANGLE_ROW(VISIT,    -1,       0,         0,    0,     0,   0,        0,  0, 1,  0)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     0,       0,         0,    0,     0,   0,        0,  0, 1,  0)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     0,       0,         0,    0,     0,   0,        0,  1, 0,  1)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     1,       0,         0,    0,     0,   0,        0, 01, 1, 01)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     1,       0,         0,    0,     0,   0,        0,  0, 0,  1)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     1,       0,         0,  123,     0,   0,        0,  1, 1, 01)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     1,       0,         0, 0123,     3,   0,        0,  0, 1, 01)

#define VELMARK5_GROUND_TRIANGLES(VISIT)                                                          \
  VELMARK5_TRIANGLE_ROW(VISIT,     2,       0,        01, 0123,     0,   0,       01,  1, 1, 01)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     2,       0,         0,   02,     3,   0,       01,  0, 1, 01)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     2,       0,         1,   02,     3,   0,       01,  1, 1, 01)

#define VELMARK5_MODEL_TRIANGLES(VISIT)                                                           \
  VELMARK5_TRIANGLE_ROW(VISIT,     2,      12,         0, 0123,     0,  01,        0,  1, 1, 01)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     2,      12,         0, 0123,     3,  01,        0,  1, 1, 01)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     2,      12,         0,   02,     2,   0,        0,  1, 1, 01)  \
  VELMARK5_TRIANGLE_ROW(VISIT,     2,      12,         0,   13,     2,   0,        0,  0, 1, 01)

#define VELMARK5_BLENDED_TRIANGLES(VISIT)                                                         \
  VELMARK5_TRIANGLE_ROW(VISIT,     3,       0,        01, 0123,     0,   0,       01,  1, 1, 01)
//
// clang-format on

#define VELMARK5_TRIANGLES(VISIT)  \
  VELMARK5_PLAIN_TRIANGLES(VISIT)  \
  VELMARK5_GROUND_TRIANGLES(VISIT) \
  VELMARK5_MODEL_TRIANGLES(VISIT)  \
  VELMARK5_BLENDED_TRIANGLES(VISIT)

// The template arguments of one combination, as VISIT gets it: RenderTriangle<VELMARK5_TRIANGLE_MODES(...)>.
#define VELMARK5_TRIANGLE_MODES(shade, address, transform, fog, blend, key, lightmap, d, c, t)                        \
  Rasterizer_n::ShadeMode_e(shade), Rasterizer_n::TexAddressMode_e(address), Rasterizer_n::TexAddressMode_e(address), \
      bool(transform), Rasterizer_n::FogMode_e(fog), Rasterizer_n::BlendMode_e(blend), bool(key), bool(lightmap),     \
      bool(d), bool(c), bool(t)

// --- How a row becomes its combinations -----------------------------------------------------------------------------

// Each level fixes one column and hands what it has (after the columns still to come) to the next: address, transform,
// fog and blend, key, light map, depth write and colour write, depth test. A set splits into its first value and the
// rest.
#define VELMARK5_TRIANGLE_ROW(visit, shade, address, transform, fog, blend, key, lightmap, d, c, t) \
  VELMARK5_EACH_ADDRESS_##address(visit, transform, fog, blend, key, lightmap, d, c, t, shade)

#define VELMARK5_EACH_ADDRESS_0(visit, transform, fog, blend, key, lightmap, d, c, t, ...) \
  VELMARK5_EACH_TRANSFORM_##transform(visit, fog, blend, key, lightmap, d, c, t, __VA_ARGS__, 0)
#define VELMARK5_EACH_ADDRESS_1(visit, transform, fog, blend, key, lightmap, d, c, t, ...) \
  VELMARK5_EACH_TRANSFORM_##transform(visit, fog, blend, key, lightmap, d, c, t, __VA_ARGS__, 1)
#define VELMARK5_EACH_ADDRESS_2(visit, transform, fog, blend, key, lightmap, d, c, t, ...) \
  VELMARK5_EACH_TRANSFORM_##transform(visit, fog, blend, key, lightmap, d, c, t, __VA_ARGS__, 2)
#define VELMARK5_EACH_ADDRESS_12(...) VELMARK5_EACH_ADDRESS_1(__VA_ARGS__) VELMARK5_EACH_ADDRESS_2(__VA_ARGS__)

#define VELMARK5_EACH_TRANSFORM_0(visit, fog, blend, key, lightmap, d, c, t, ...) \
  VELMARK5_EACH_FOG_##fog(visit, blend, key, lightmap, d, c, t, __VA_ARGS__, 0)
#define VELMARK5_EACH_TRANSFORM_1(visit, fog, blend, key, lightmap, d, c, t, ...) \
  VELMARK5_EACH_FOG_##fog(visit, blend, key, lightmap, d, c, t, __VA_ARGS__, 1)
#define VELMARK5_EACH_TRANSFORM_01(...) VELMARK5_EACH_TRANSFORM_0(__VA_ARGS__) VELMARK5_EACH_TRANSFORM_1(__VA_ARGS__)

#define VELMARK5_EACH_FOG_0(visit, blend, key, lightmap, d, c, t, ...) \
  VELMARK5_EACH_KEY_##key(visit, lightmap, d, c, t, __VA_ARGS__, 0, blend)
#define VELMARK5_EACH_FOG_1(visit, blend, key, lightmap, d, c, t, ...) \
  VELMARK5_EACH_KEY_##key(visit, lightmap, d, c, t, __VA_ARGS__, 1, blend)
#define VELMARK5_EACH_FOG_2(visit, blend, key, lightmap, d, c, t, ...) \
  VELMARK5_EACH_KEY_##key(visit, lightmap, d, c, t, __VA_ARGS__, 2, blend)
#define VELMARK5_EACH_FOG_3(visit, blend, key, lightmap, d, c, t, ...) \
  VELMARK5_EACH_KEY_##key(visit, lightmap, d, c, t, __VA_ARGS__, 3, blend)
#define VELMARK5_EACH_FOG_02(...) VELMARK5_EACH_FOG_0(__VA_ARGS__) VELMARK5_EACH_FOG_2(__VA_ARGS__)
#define VELMARK5_EACH_FOG_13(...) VELMARK5_EACH_FOG_1(__VA_ARGS__) VELMARK5_EACH_FOG_3(__VA_ARGS__)
#define VELMARK5_EACH_FOG_23(...) VELMARK5_EACH_FOG_2(__VA_ARGS__) VELMARK5_EACH_FOG_3(__VA_ARGS__)
#define VELMARK5_EACH_FOG_123(...) VELMARK5_EACH_FOG_1(__VA_ARGS__) VELMARK5_EACH_FOG_23(__VA_ARGS__)
#define VELMARK5_EACH_FOG_0123(...) VELMARK5_EACH_FOG_0(__VA_ARGS__) VELMARK5_EACH_FOG_123(__VA_ARGS__)

#define VELMARK5_EACH_KEY_0(visit, lightmap, d, c, t, ...) \
  VELMARK5_EACH_LIGHTMAP_##lightmap(visit, d, c, t, __VA_ARGS__, 0)
#define VELMARK5_EACH_KEY_1(visit, lightmap, d, c, t, ...) \
  VELMARK5_EACH_LIGHTMAP_##lightmap(visit, d, c, t, __VA_ARGS__, 1)
#define VELMARK5_EACH_KEY_01(...) VELMARK5_EACH_KEY_0(__VA_ARGS__) VELMARK5_EACH_KEY_1(__VA_ARGS__)

#define VELMARK5_EACH_LIGHTMAP_0(visit, d, c, t, ...) VELMARK5_EACH_D_##d(visit, c, t, __VA_ARGS__, 0)
#define VELMARK5_EACH_LIGHTMAP_1(visit, d, c, t, ...) VELMARK5_EACH_D_##d(visit, c, t, __VA_ARGS__, 1)
#define VELMARK5_EACH_LIGHTMAP_01(...) VELMARK5_EACH_LIGHTMAP_0(__VA_ARGS__) VELMARK5_EACH_LIGHTMAP_1(__VA_ARGS__)

#define VELMARK5_EACH_D_0(visit, c, t, ...) VELMARK5_EACH_T_##t(visit, __VA_ARGS__, 0, c)
#define VELMARK5_EACH_D_1(visit, c, t, ...) VELMARK5_EACH_T_##t(visit, __VA_ARGS__, 1, c)
#define VELMARK5_EACH_D_01(...) VELMARK5_EACH_D_0(__VA_ARGS__) VELMARK5_EACH_D_1(__VA_ARGS__)

#define VELMARK5_EACH_T_0(visit, ...) visit(__VA_ARGS__, 0)
#define VELMARK5_EACH_T_1(visit, ...) visit(__VA_ARGS__, 1)
#define VELMARK5_EACH_T_01(...) VELMARK5_EACH_T_0(__VA_ARGS__) VELMARK5_EACH_T_1(__VA_ARGS__)

// --------------------------------------------------------------------------------------------------------------------

namespace Rasterizer_n {

// One instance and the modes that it was made for.
struct TriangleInstance {
  int shade, addr_u, addr_v;
  bool transform;
  int fog;
  int blend;
  bool key, lightmap, dwrite, cwrite, dtest;
  void (*render)(const Triangle_s&);
};

// All instances, in the order of the list.
std::span<const TriangleInstance> triangle_instances();

#define VELMARK5_COUNT_ONE(...) +1
inline constexpr std::size_t triangle_instance_count = 0 VELMARK5_TRIANGLES(VELMARK5_COUNT_ONE);
#undef VELMARK5_COUNT_ONE

}  // namespace Rasterizer_n
