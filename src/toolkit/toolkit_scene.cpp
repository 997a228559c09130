// Scene state: camera, lights, fog, water, and what is derived from them.
#include <algorithm>
#include <bit>
#include <cmath>

#include "maths/SSEMath.h"
#include "raster/Projection.h"
#include "raster/Rasterizer.h"
#include "toolkit/toolkit.h"

void toolkit::set_camera(const Matrix_c& matrix) {
  camera = matrix;
  update_viewprojection();
}

void toolkit::set_projection(const Matrix_c& matrix) {
  projection = matrix;
  update_viewprojection();

  // The planes of the projection alone hold its near and far distances.
  Vector4_s planes[6];
  Matrix_c::ExtractFrustumPlanes(projection, planes);
  Rasterizer_n::m_ZNear = -planes[4].w;
  Rasterizer_n::m_ZFar = planes[5].w;
  update_distance_fog();
}

void toolkit::update_viewprojection() {
  viewprojection = Matrix_c::Multiply(camera, projection);
  Matrix_c::ExtractFrustumPlanes(viewprojection, frustum);
}

void toolkit::set_fog(unsigned int colour, int start) {
  fog_colour = colour;
  fog_start = start < 0 ? 0.0f : static_cast<float>(start);
  update_distance_fog();
}

// Fog is compared in screen depth: project the point on the view axis at which it begins.
void toolkit::update_distance_fog() {
  const float distance = Rasterizer_n::m_ZFar - fog_start;
  const SSEMath::Float4 screen = Rasterizer_n::ToScreen(Rasterizer_n::Transform(projection, 0, 0, distance));
  Rasterizer_n::RecomputeDistanceFogParams(SSEMath::lane0(SSEMath::broadcast<2>(screen)), fog_colour);
}

void toolkit::set_globalsun(int colour, float front, float back, float x, float y, float z) {
  sun_r = static_cast<unsigned char>(colour >> 16);
  sun_g = static_cast<unsigned char>(colour >> 8);
  sun_b = static_cast<unsigned char>(colour);
  sun_front = front;
  sun_back = back;
  const float scale = 1.0f / std::sqrt(x * x + y * y + z * z);
  sun_x = x * scale;
  sun_y = y * scale;
  sun_z = z * scale;
  // How far a shadow moves per unit of height. The conversion instruction gives every float an integer.
  const auto slope = [this](float across) { return _mm_cvttss_si32(_mm_set_ss(256.0f * across / sun_y)); };
  shadow_slope_x = slope(sun_x);
  shadow_slope_z = slope(sun_z);
}

void toolkit::set_pointlights(int count, const int* lights, const float* strengths) {
  pointlight_count = std::min(count, 4);
  alignas(16) float scaled[4] = {};
  for (int i = 0; i < pointlight_count; ++i, lights += 5) {
    pointlight_pos[i].x = static_cast<float>(lights[0]);
    pointlight_pos[i].y = static_cast<float>(lights[1]);
    pointlight_pos[i].z = static_cast<float>(lights[2]);
    const auto range = static_cast<float>(lights[3]);
    scaled[i] = range * range * std::min(strengths[i], 1.0f) * 256.0f;
    pointlight_colour[i] = static_cast<unsigned int>(lights[4]);
  }
  std::copy(scaled, scaled + 4, pointlight_strength);
}

void toolkit::underwatermode_enable(int level, unsigned int colour, int range) {
  saved_fog_colour = fog_colour;
  underwater = true;
  underwatermode_adjust(level, colour, range);
}

void toolkit::underwatermode_adjust(int level, unsigned int colour, int range) {
  underwater_height = level;
  underwater_range = range;
  fog_colour = colour;
  underwater_height_f = static_cast<float>(level);
  underwater_scale = -1.0f / static_cast<float>(range);
  Rasterizer_n::m_HeightFogColour = Rasterizer_n::FogColour(colour);
}

void toolkit::underwatermode_disable() {
  underwater = false;
  fog_colour = saved_fog_colour;
}

void toolkit::set_shadow_resolution(int value) {
  shadow_resolution_shift = value <= 1 ? 0 : std::bit_width(static_cast<unsigned int>(value)) - 1;
  shadow_resolution = 1 << shadow_resolution_shift;
}
