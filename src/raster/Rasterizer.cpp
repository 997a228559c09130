#include "raster/Rasterizer.h"

#include <emmintrin.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "maths/SSEMath.h"

namespace Rasterizer_n {

unsigned int* m_pColourBuffer = nullptr;
float* m_pDepthBuffer = nullptr;
int m_ScreenPitch = 0;
float m_ZNear = 0;
float m_ZFar = 0;
bool m_ZWriteEnabled = true;
float m_DistanceFogStart = 1;
float m_InvDistanceFogRange = 0;
Vector4_s m_DistanceFogColour{};
Vector4_s m_HeightFogColour{};
TriangleCuller_s m_TriangleCuller{};
Viewport_s m_Viewport{};
Vector4_s m_ViewportMul{};
Vector4_s m_ViewportAdd{};
Cliprect_s m_Cliprect{};
ClipBox_s m_ClipBox{};

namespace {

void recompute_clip_box() {
  using SSEMath::wrapping_add;
  m_ClipBox = {std::max(m_Viewport.x, m_Cliprect.x), std::max(m_Viewport.y, m_Cliprect.y),
               std::min(wrapping_add(m_Viewport.x, m_Viewport.width), wrapping_add(m_Cliprect.x, m_Cliprect.width)),
               std::min(wrapping_add(m_Viewport.y, m_Viewport.height), wrapping_add(m_Cliprect.y, m_Cliprect.height))};
}

}  // namespace

void SetViewport(const Viewport_s& viewport) {
  m_Viewport = viewport;
  const float width = static_cast<float>(viewport.width);
  const float height = static_cast<float>(viewport.height);
  const float half_depth = (viewport.zmax - viewport.zmin) * 0.5f;
  m_ViewportMul = {width * 0.5f, height * 0.5f, half_depth, 1};
  m_ViewportAdd = {width * 0.5f + static_cast<float>(viewport.x), height * 0.5f + static_cast<float>(viewport.y),
                   half_depth + viewport.zmin, 0};
  RecomputeCuller();
  recompute_clip_box();
}

void SetCliprect(const Cliprect_s& cliprect) {
  m_Cliprect = cliprect;
  recompute_clip_box();
}

void RecomputeCuller() {
  const auto low_word = [](unsigned int value) { return static_cast<std::int16_t>(value); };
  // The conversion instruction, which gives every float an integer.
  const auto depth = [&](float z) {
    return low_word(static_cast<unsigned int>(_mm_cvttss_si32(_mm_set_ss(32767.0f * z))));
  };
  const auto x = static_cast<unsigned int>(m_Viewport.x);
  const auto y = static_cast<unsigned int>(m_Viewport.y);
  m_TriangleCuller = {{low_word(x + static_cast<unsigned int>(m_Viewport.width)),
                       low_word(y + static_cast<unsigned int>(m_Viewport.height)), depth(m_Viewport.zmax),
                       depth(m_Viewport.zmin), low_word(x), low_word(y), 0, 0}};
}

void RecomputeDistanceFogParams(float start, unsigned int colour) {
  m_DistanceFogStart = start;
  m_InvDistanceFogRange = static_cast<float>(1.0L / (1.0L - static_cast<long double>(start)));
  m_DistanceFogColour = FogColour(colour);
}

void SetZWrite(bool enable) { m_ZWriteEnabled = enable; }

Vector4_s FogColour(unsigned int colour) {
  const auto channel = [colour](int byte) { return static_cast<float>(colour >> (8 * byte) & 0xFF) * 256.0f; };
  return {channel(0), channel(1), channel(2), channel(3)};
}

void PrefetchDepth(float left, float top, float right, float bottom) {
  constexpr int line = 64 / sizeof(float), largest = 1 << 14;  // pixels
  using namespace SSEMath;
  if (m_pDepthBuffer == nullptr) return;
  const int x0 = std::max(truncate(left), m_ClipBox.left), x1 = std::min(truncate(right), m_ClipBox.right);
  const int y0 = std::max(truncate(top), m_ClipBox.top), y1 = std::min(truncate(bottom), m_ClipBox.bottom);
  if (x0 >= x1 || y0 >= y1 || (std::int64_t{x1} - x0) * (std::int64_t{y1} - y0) > largest) return;
  const float* row = m_pDepthBuffer + std::ptrdiff_t{y0} * m_ScreenPitch;
  for (int y = y0; y < y1; ++y, row += m_ScreenPitch) {
    for (int x = x0; x < x1; x += line) prefetch_nearer(row + x);
    prefetch_nearer(row + x1 - 1);
  }
}

}  // namespace Rasterizer_n
