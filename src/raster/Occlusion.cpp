#include "raster/Occlusion.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>

#include "maths/SSEMath.h"
#include "raster/Rasterizer.h"

namespace Rasterizer_n {
namespace {

using namespace SSEMath;

constexpr float largest_side = 32;  // pixels
constexpr int last_pixel = 65536;

// What is added to the box of the vertices, so that rounding makes it the first column and row that spans can reach,
// and the ones after the last. Spans can leave the box by the largest side times the error of a reciprocal, and by what
// float sums lose in as many rows. Rows are truncated, not rounded.
alignas(16) constexpr float to_first[4] = {-0.25f, -0.52f, 0, 0}, to_last[4] = {0.25f, -0.48f, 0, 0};

// How far a depth can fall below the nearest vertex, in parts of the largest: it is a sum of some 50 terms.
alignas(16) constexpr float depth_slack[4] = {1e-5f, 1e-5f, 1e-5f, 1e-5f};

alignas(16) constexpr float third[4] = {1.0f / 3, 1.0f / 3, 1.0f / 3, 1.0f / 3};
alignas(16) constexpr std::uint32_t lane_numbers[4] = {0, 1, 2, 3};

// Twice the area of the triangle with its vertices moved to whole rows, as setup has it.
VELMARK5_LANE float double_area(Float4 a, Float4 b, Float4 c) {
  const Float4 ab = interleave_low(a, b);  // xa, xb, ya, yb
  const Float4 x = shuffle<0, 1, 0, 0>(ab, c) - broadcast<0>(a);
  const Float4 y = to_float(truncate(shuffle<2, 3, 1, 1>(ab, c)));
  const Float4 terms = x * (shuffle<1, 2, 0, 3>(y) - shuffle<2, 0, 1, 3>(y));
  return lane0(terms) + lane0(broadcast<1>(terms)) + lane0(broadcast<2>(terms));
}

}  // namespace

bool IsHidden(const Triangle_s& triangle) {
  const Float4 a = load(&triangle.vertex[0].x), b = load(&triangle.vertex[1].x), c = load(&triangle.vertex[2].x);
  const Float4 low = min(min(a, b), c);
  const ClipBox_s& clip = m_ClipBox;
  const std::ptrdiff_t pitch = m_ScreenPitch;

  // One pixel in the middle tells most triangles that show. A coordinate that is no number has no pixel.
  const Int4 middle = truncate((a + b + c) * load(third));
  const int x = lane<0>(middle), y = lane<1>(middle);
  if (x < clip.left || x >= clip.right || y < clip.top || y >= clip.bottom) return false;
  if (!(lane0(broadcast<2>(low)) > m_pDepthBuffer[y * pitch + x])) return false;

  const Float4 high = max(max(a, b), c);
  if ((lane_bits(less_equal(high - low, splat(largest_side))) & 3) != 3) return false;
  const Int4 first = round(low + load(to_first)), last = round(high + load(to_last));
  const int left = std::max(lane<0>(first), clip.left), right = std::min(lane<0>(last), clip.right);
  const int top = std::max(lane<1>(first), clip.top), bottom = std::min(lane<1>(last), clip.bottom);
  if (right < 4 || right > last_pixel || bottom > last_pixel) return false;
  if (top >= bottom) return true;

  // Each row is covered by a group at its left, one at its right, and what is between; rows of less than four pixels
  // have one group, whose first lanes lie outside.
  const int right_group = right - 4, left_group = std::min(left, right_group);
  const Int4 outside = less(load(lane_numbers), splat(static_cast<std::uint32_t>(left - left_group)));
  const Float4 nearest = broadcast<2>(low - max(magnitude(low), magnitude(high)) * load(depth_slack));
  const auto nearer = [nearest](const float* depths) { return less(load_unaligned(depths), nearest); };
  const float* row = m_pDepthBuffer + top * pitch;
  const float* const last_row = m_pDepthBuffer + (bottom - 1) * pitch;

  // The groups at the ends of four rows at a time, of the last row again where there are less: nobody can foresee how
  // many rows there are.
  for (int rows = bottom - top; rows > 0; rows -= 4) {
    Int4 hidden = splat(~0u);
#pragma GCC unroll 4
    for (int i = 0; i < 4; ++i) {
      hidden = hidden & nearer(row + left_group) & nearer(row + right_group);
      row = std::min(row + pitch, last_row);
    }
    if (lane_bits(hidden | outside) != 15) return false;
  }
  for (int at = left_group + 4; at < right_group; at += 4) {
    row = m_pDepthBuffer + top * pitch;
    for (int i = top; i < bottom; ++i, row += pitch) {
      if (lane_bits(nearer(row + at)) != 15) return false;
    }
  }

  // In a sliver the approximate slopes of two edges can change places, and then one of them runs on beyond its vertex.
  return std::abs(double_area(a, b, c)) >= 1.0f;
}

}  // namespace Rasterizer_n
