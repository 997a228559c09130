// Natives of SseThreadedResource ("a") that draw triangles at once.
#include "natives/native.h"
#include "raster/Rasterizer.h"
#include "raster/Triangle.h"
#include "toolkit/threadresource.h"

using namespace natives;
using namespace Rasterizer_n;

namespace {

// A smooth triangle at depth 0 that writes no depth.
template <bool ColourWrite, bool DepthTest>
void draw_smooth(const Triangle_s& triangle) {
  RenderTriangle<ShadeMode_e::Smooth, TexAddressMode_e::GroundWrap, TexAddressMode_e::GroundWrap, false,
                 FogMode_e::None, BlendMode_e::Opaque, false, false, false, ColourWrite, DepthTest>(triangle);
}

}  // namespace

VELMARK5_NATIVE(void)
Java_a_ra(JNIEnv* env, jobject, jlong, jfloat x0, jfloat y0, jfloat x1, jfloat y1, jfloat x2, jfloat y2, jint colour0,
          jint colour1, jint colour2) {
  frame(env, [&] {
    Triangle_s triangle;
    triangle.vertex[0] = {x0, y0, 0, 1};
    triangle.vertex[1] = {x1, y1, 0, 1};
    triangle.vertex[2] = {x2, y2, 0, 1};
    triangle.colour[0] = vertex_colour(static_cast<std::uint32_t>(colour0));
    triangle.colour[1] = vertex_colour(static_cast<std::uint32_t>(colour1));
    triangle.colour[2] = vertex_colour(static_cast<std::uint32_t>(colour2));
    const bool colour = m_pColourBuffer != nullptr, depth = m_pDepthBuffer != nullptr;
    if (colour) {
      depth ? draw_smooth<true, true>(triangle) : draw_smooth<true, false>(triangle);
    } else if (depth) {
      draw_smooth<false, true>(triangle);
    }
  });
}

VELMARK5_NATIVE(void)
Java_a_K(JNIEnv* env, jobject, jlong resource, jint x0, jint y0, jint x1, jint y1, jint colour, jint thickness,
         jint mode) {
  frame(env, [&] {
    current_toolkit().line_thick(from_optional_handle<threadresource>(resource), x0, y0, x1, y1,
                                 static_cast<unsigned int>(colour), thickness, static_cast<unsigned int>(mode));
  });
}
