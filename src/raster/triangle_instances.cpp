#include "raster/triangle_instances.h"

namespace Rasterizer_n {

namespace {

template <int Shade, int Address, bool Transform, int Fog, int Blend, bool Key, bool LightMap, bool D, bool C, bool T>
constexpr TriangleInstance entry = {
    Shade,   Address,
    Address, Transform,
    Fog,     Blend,
    Key,     LightMap,
    D,       C,
    T,       &RenderTriangle<VELMARK5_TRIANGLE_MODES(Shade, Address, Transform, Fog, Blend, Key, LightMap, D, C, T)>};

#define VELMARK5_ENTRY(...) entry<__VA_ARGS__>,
constexpr TriangleInstance table[] = {VELMARK5_TRIANGLES(VELMARK5_ENTRY)};
#undef VELMARK5_ENTRY

static_assert(std::size(table) == triangle_instance_count);

}  // namespace

// Retained, so that the linker keeps every instance.
[[gnu::used, gnu::retain]] std::span<const TriangleInstance> triangle_instances() { return table; }

}  // namespace Rasterizer_n
