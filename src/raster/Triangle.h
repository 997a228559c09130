// Triangles on the screen: what a caller fills in, and the family of fillers that draws it.
//
// RenderTriangle is one function template over eleven compile-time modes; triangle_instances.h lists the combinations
// that exist. A caller fills the fields of a Triangle_s that its instance reads, and calls the instance: all drawing
// state besides (targets, viewport, clip rectangle, distance fog) is that of Rasterizer.h. An instance may be called
// with any coordinates: nothing outside the viewport and the clip rectangle is written. The byte mask alone is not
// clipped.
#pragma once

#include <cstdint>
#include <cstring>

#include "maths/Vector4.h"

namespace Rasterizer_n {

enum class ShadeMode_e : int {
  Mask = -1,     // ones into an array of bytes
  Flat = 0,      // one pixel word
  Smooth = 1,    // a colour per vertex
  Textured = 2,  // one texture, multiplied by a colour per vertex
  Blended = 3,   // three textures, each at full weight at one vertex, multiplied by a colour per vertex
};

// How a texture coordinate becomes a column or a row of 128. The ground's and the models' wrap are the same arithmetic.
enum class TexAddressMode_e : int { GroundWrap = 0, Wrap = 1, Clamp = 2 };

enum class FogMode_e : int { None = 0, Height = 1, Distance = 2, Both = 3 };

enum class BlendMode_e : int {
  Opaque = 0,
  PixelAlpha = 2,     // by the alpha of each pixel
  ConstantAlpha = 3,  // by Triangle_s::alpha
};

// A vertex colour: blue, green, red, alpha, each channel * 256.
struct alignas(16) VertexColour_s {
  std::uint16_t channels[4];
};

// The channels of a colour word, each * 256. Written as one word of 64 bits, as setup reads it.
inline VertexColour_s vertex_colour(std::uint32_t colour) {
  std::uint64_t channels = colour;
  channels = (channels | channels << 16) & 0x0000FFFF0000FFFF;
  channels = (channels << 8 | channels << 16) & 0xFF00FF00FF00FF00;
  VertexColour_s result;
  std::memcpy(result.channels, &channels, sizeof result.channels);
  return result;
}

struct alignas(16) Triangle_s {
  Vector4_s vertex[3];                     // screen x, screen y (pixels), screen depth; w is not read
  VertexColour_s colour[3];                // all shade modes but Mask and Flat
  Vector4_s texcoord[3];                   // x, y: u and v in texels; Textured and Blended
  Vector4_s texscale[3];                   // (su, sv, su, sv) of each texture; with TransformTexCoords
  Vector4_s texoffset[3];                  // (ou, ov, ou, ov) of each texture; with TransformTexCoords
  alignas(16) std::int32_t lightmapshift;  // right shift from texture to light map coordinates; with LightMap
  Vector4_s fogfactor;                     // x, y, z: height fog at vertices 0, 1, 2, from 0 to 1
  Vector4_s fogcolour;                     // of the height fog; blue, green, red, alpha, each channel * 256
  std::uint32_t flatcolour;                // 0xAARRGGBB; Flat
  std::uint32_t alpha;                     // from 0 to 255, times 0x10001; ConstantAlpha
  const std::uint32_t* texture[3];         // texel (u, v) at u + 256 * v; Textured reads the first alone
  const std::uint8_t* lightmap;            // byte (u, v) at u + 256 * v; with LightMap
};

// Draws one triangle. TransformTexCoords scales and offsets the texture coordinates at each pixel, ColourKey leaves out
// texels whose word is 0, LightMap multiplies the colour by a map of bytes. DepthTest and DepthWrite need a depth
// target, ColourWrite a colour target. Only the listed combinations exist.
template <ShadeMode_e Shade, TexAddressMode_e AddressU, TexAddressMode_e AddressV, bool TransformTexCoords,
          FogMode_e Fog, BlendMode_e Blend, bool ColourKey, bool LightMap, bool DepthWrite, bool ColourWrite,
          bool DepthTest>
void RenderTriangle(const Triangle_s& triangle);

// One trapezoid of a triangle: rows between a left and a right edge. Setup fills it, the span filler moves it down row
// by row and leaves it at the row after the last. Where a field holds two sets of lanes, the left edge's come first.
struct alignas(16) HalfTriangle_s {
  std::int32_t y;     // next row
  std::int32_t rows;  // rows to fill
  std::uint32_t flatcolour;
  std::uint32_t alpha;
  const std::uint32_t* texture[3];
  const std::uint8_t* lightmap;
  std::int32_t lightmapshift;
  alignas(16) float edge[4];            // left x, left depth, right x, right depth
  alignas(16) float edgestep[4];        // what each row adds to them
  alignas(16) std::uint16_t colour[8];  // left four channels, right four channels
  alignas(16) std::int16_t colourstep[8];
  alignas(16) std::uint16_t fogadd[8];  // fog that is added after the texture, as colour
  alignas(16) std::int16_t fogaddstep[8];
  alignas(16) float texcoord[4];  // left u/z, v/z, right u/z, v/z
  alignas(16) float texcoordstep[4];
  alignas(16) float blendweight[4];  // left weights of textures 0 and 1, right weights; 65535 is all
  alignas(16) float blendweightstep[4];
  Vector4_s texscale[3];
  Vector4_s texoffset[3];
};

// Fills the rows of one trapezoid. One instance serves all fog modes: Fog tells whether there is any.
template <ShadeMode_e Shade, TexAddressMode_e AddressU, TexAddressMode_e AddressV, bool TransformTexCoords, bool Fog,
          BlendMode_e Blend, bool ColourKey, bool LightMap, bool DepthWrite, bool ColourWrite, bool DepthTest>
class RenderHalfTriangle_c {
 public:
  static void RenderHalfTriangle(HalfTriangle_s& half);
};

}  // namespace Rasterizer_n
