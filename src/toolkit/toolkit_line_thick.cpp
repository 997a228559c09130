// Thick lines: a rectangle around the line, as two triangles.
#include <algorithm>
#include <cstdint>
#include <cstdlib>

#include "raster/Rasterizer.h"
#include "raster/Triangle.h"
#include "toolkit/toolkit.h"

namespace {

using namespace Rasterizer_n;

constexpr auto fill_opaque =
    &RenderTriangle<ShadeMode_e::Flat, TexAddressMode_e::GroundWrap, TexAddressMode_e::GroundWrap, false,
                    FogMode_e::None, BlendMode_e::Opaque, false, false, false, true, false>;
constexpr auto fill_translucent =
    &RenderTriangle<ShadeMode_e::Smooth, TexAddressMode_e::GroundWrap, TexAddressMode_e::GroundWrap, false,
                    FogMode_e::None, BlendMode_e::ConstantAlpha, false, false, false, true, false>;

}  // namespace

void toolkit::line_thick(threadresource*, int x0, int y0, int x1, int y1, unsigned int colour, int thickness,
                         unsigned int mode) {
  if (colourbuffer == nullptr || m_pColourBuffer == nullptr) return;

  // The direction in 16.16, of which one coordinate is turned to make the normal; then half the thickness along it. The
  // two halves of an odd thickness differ by one.
  const std::int64_t dx = std::int64_t{x1} - x0, dy = std::int64_t{y1} - y0;
  const std::int64_t length = std::max(std::abs(dx), std::abs(dy));
  if (length == 0) return;
  std::int64_t ax = dx * 65536 / length, ay = dy * 65536 / length;
  if (ax >= ay) {
    ax = -ax;
  } else {
    ay = -ay;
  }
  const auto half = [thickness](std::int64_t direction, int round) {
    return static_cast<float>((direction * thickness + round) >> 17);
  };
  const float hx = half(ay, 0), hx2 = half(ay, 1), hy = half(ax, 0), hy2 = half(ax, 1);

  // The ends count from the clip rectangle's corner.
  const auto from_clip = [](int coordinate, int origin) {
    return static_cast<float>(std::int64_t{coordinate} - origin);
  };
  const float start_x = from_clip(x0, clip_x0), start_y = from_clip(y0, clip_y0);
  const float end_x = from_clip(x1, clip_x0), end_y = from_clip(y1, clip_y0);

  const bool translucent = mode == 1 && colour >> 24 != 255;
  Triangle_s triangle;
  triangle.flatcolour = colour;
  triangle.alpha = (colour >> 24) * 0x10001;
  for (VertexColour_s& c : triangle.colour) c = vertex_colour(colour);
  const auto draw = [&] { translucent ? fill_translucent(triangle) : fill_opaque(triangle); };
  triangle.vertex[0] = {start_x + hx, start_y + hy, 0, 1};
  triangle.vertex[1] = {start_x - hx2, start_y - hy2, 0, 1};
  triangle.vertex[2] = {end_x - hx2, end_y - hy2, 0, 1};
  draw();
  triangle.vertex[1] = {end_x + hx, end_y + hy, 0, 1};
  draw();
}
