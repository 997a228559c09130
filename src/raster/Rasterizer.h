// Process-wide state that every triangle, sprite and primitive draws by: target buffers, viewport, clip rectangle and
// what is derived from them. Written between passes on the control thread, read during a pass.
//
// Depth is the screen depth, a float per pixel, smaller is nearer; a pixel passes when new <= stored. Colour and depth
// buffers are 16-byte aligned and share one pitch.
#pragma once

#include <bit>
#include <cstdint>

#include "maths/Vector4.h"

namespace Rasterizer_n {

struct Viewport_s {
  int x, y, width, height;  // pixels
  float zmin, zmax;         // screen depth of the projected depths -1 and +1
};

// Pixels; the right edge x + width and the bottom edge y + height are exclusive.
struct Cliprect_s {
  int x, y, width, height;
};

// What a cleared depth buffer holds: about 3.4e38.
inline constexpr float far_depth = std::bit_cast<float>(0x7F7FC99Eu);

// Not exported: every triangle reads them, without the detour of a symbol that another library could replace.
#pragma GCC visibility push(hidden)
extern unsigned int* m_pColourBuffer;  // 0xAARRGGBB words; null without a colour target
extern float* m_pDepthBuffer;          // null without a depth target
extern int m_ScreenPitch;              // row length of both, in pixels

extern float m_ZNear, m_ZFar;  // eye-space distances of the projection
extern bool m_ZWriteEnabled;   // last value of SetZWrite

extern float m_DistanceFogStart;       // screen depth at which distance fog begins
extern float m_InvDistanceFogRange;    // 1 / (1 - m_DistanceFogStart)
extern Vector4_s m_DistanceFogColour;  // blue, green, red, alpha, each times 256
extern Vector4_s m_HeightFogColour;    // the same for underwater fog

// Packed culling bounds: right, bottom, 32767 zmax, 32767 zmin, left, top, 0, 0. The culling tests compare x and y with
// zero, not with lanes 4 and 5.
struct alignas(16) TriangleCuller_s {
  std::int16_t lanes[8];
};
extern TriangleCuller_s m_TriangleCuller;

extern Viewport_s m_Viewport;
extern Vector4_s m_ViewportMul;  // from projected to screen coordinates: scale
extern Vector4_s m_ViewportAdd;  // and offset
extern Cliprect_s m_Cliprect;

// Where pixels may be drawn: what the viewport and the clip rectangle have in common. Right and bottom are exclusive.
struct ClipBox_s {
  int left, top, right, bottom;
};
extern ClipBox_s m_ClipBox;
#pragma GCC visibility pop

// Stores the viewport and derives m_ViewportMul, m_ViewportAdd, m_TriangleCuller and m_ClipBox from it.
void SetViewport(const Viewport_s& viewport);
inline const Viewport_s* GetViewport() { return &m_Viewport; }

// Stores the clip rectangle and derives m_ClipBox.
void SetCliprect(const Cliprect_s& cliprect);
inline const Cliprect_s* GetCliprect() { return &m_Cliprect; }

void RecomputeCuller();

// start: screen depth at which fog begins; colour: 0xAARRGGBB. Fog is full at screen depth 1.
void RecomputeDistanceFogParams(float start, unsigned int colour);

void SetZWrite(bool enable);

// Asks for a small part of the depth target before it is tested or drawn to, so that it is near by then: columns left
// to right and rows top to bottom, in pixels, as far as they lie in the clip box. A large part is not asked for: it
// would push out what is near.
void PrefetchDepth(float left, float top, float right, float bottom);

// The four bytes of a colour word, lowest first, each times 256.
Vector4_s FogColour(unsigned int colour);

}  // namespace Rasterizer_n
