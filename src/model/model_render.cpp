// From a model to pixels: the culling of the whole model, its place in the result array, and the choice of the variant
// that draws it. The variants are in model_variants_*.cpp.
#include <algorithm>
#include <cmath>

#include "model/model.h"
#include "raster/Projection.h"
#include "toolkit/toolkit.h"

namespace {

using SSEMath::Float4;

Vector4_s stored(Float4 v) {
  Vector4_s out;
  SSEMath::store(&out.x, v);
  return out;
}

float dot(const Vector4_s& p, const Vector4_s& q) { return p.x * q.x + p.y * q.y + p.z * q.z + p.w * q.w; }

int rounded(float x) { return _mm_cvtss_si32(_mm_set_ss(x)); }

// True when some plane has both ends of a vertical capsule further outside than its radius.
bool outside_frustum(const toolkit& scene, const Vector4_s& top, const Vector4_s& bottom, float radius) {
  return std::any_of(std::begin(scene.frustum), std::end(scene.frustum),
                     [&](const Vector4_s& plane) { return -radius > dot(plane, top) && -radius > dot(plane, bottom); });
}

// Half the width that the model has on the screen: its cylinder radius along the camera's x axis, at the end of the
// axis that is deeper in the world.
int screen_radius(const toolkit& scene, const Vector4_s& end, float end_screen_x, float radius) {
  const Matrix_c& camera = scene.camera;
  const Float4 moved = Rasterizer_n::Transform(scene.viewprojection, end.x + camera.rows[0].x * radius,
                                               end.y + camera.rows[1].x * radius, end.z + camera.rows[2].x * radius);
  const int distance = rounded(SSEMath::lane0(Rasterizer_n::ToScreen(moved)) - end_screen_x);
  return distance < 0 ? SSEMath::wrapping_subtract(0, distance) : distance;
}

// A light's position relative to the model, turned by the transposed rotation of its matrix.
Vector4_s into_model_space(const Vector4_s& light, const Matrix_c& world) {
  const Vector4_s& origin = world.rows[3];
  const Vector4_s d{light.x - origin.x, light.y - origin.y, light.z - origin.z, 0};
  const auto along = [&d](const Vector4_s& axis) { return d.x * axis.x + d.y * axis.y + d.z * axis.z; };
  return {along(world.rows[0]), along(world.rows[1]), along(world.rows[2]), 0};
}

}  // namespace

void model::render(threadresource& resource, const Matrix_c& world_matrix, copied_jintArray& result) {
  if (facecount == 0) return;
  if (Rasterizer_n::m_pColourBuffer == nullptr && Rasterizer_n::m_pDepthBuffer == nullptr) return;
  const toolkit& scene = *toolkit::m_pInstance;
  const Matrix_c world = world_matrix;
  const Matrix_c modelviewprojection = Matrix_c::Multiply(world, scene.viewprojection);
  if (!boundsvalid) calcbounding();

  const auto low = static_cast<float>(miny);
  const auto high = static_cast<float>(maxy);
  const auto radius = static_cast<float>(radiuscylinder);
  const Vector4_s world0 = stored(Rasterizer_n::Transform(world, 0, low, 0));
  const Vector4_s world1 = stored(Rasterizer_n::Transform(world, 0, high, 0));
  if (outside_frustum(scene, world0, world1, radius)) return;

  const Vector4_s screen0 = stored(Rasterizer_n::ToScreen(Rasterizer_n::Transform(modelviewprojection, 0, low, 0)));
  const Vector4_s screen1 = stored(Rasterizer_n::ToScreen(Rasterizer_n::Transform(modelviewprojection, 0, high, 0)));
  const float maxdepth = std::max(screen0.z, screen1.z);
  const bool first_deeper = world0.z > world1.z;
  const int half_width =
      screen_radius(scene, first_deeper ? world0 : world1, first_deeper ? screen0.x : screen1.x, radius);
  const auto half = static_cast<float>(half_width);
  Rasterizer_n::PrefetchDepth(std::min(screen0.x, screen1.x) - half, std::min(screen0.y, screen1.y),
                              std::max(screen0.x, screen1.x) + half, std::max(screen0.y, screen1.y));
  if (result.elements != nullptr) {
    result.elements[0] = SSEMath::truncate(screen0.x);
    result.elements[1] = SSEMath::truncate(screen0.y);
    result.elements[2] = SSEMath::truncate(screen1.x);
    result.elements[3] = SSEMath::truncate(screen1.y);
    result.elements[4] = half_width;
    result.elements[5] = 1;
  }

  // What a first draw finds missing.
  if (fcolours.block == nullptr) light(false);
  if (vnormal.block == nullptr) calculatenormals();
  for (int i = 0; i < scene.pointlight_count; ++i) lightpos[i] = into_model_space(scene.pointlight_pos[i], world);
  ++modelcount;

  const bool pointlit = (flags & MF_LIT) != 0 && scene.pointlight_count > 0;
  const bool distancefog = scene.fog_start > 0 && maxdepth > Rasterizer_n::m_DistanceFogStart;
  const bool colour = Rasterizer_n::m_pColourBuffer != nullptr;
  const bool depth = Rasterizer_n::m_pDepthBuffer != nullptr;
  const render_variant variant = select_variant(pointlit, distancefog, scene.underwater, colour, depth);
  (this->*variant)(resource, world, modelviewprojection);
}
