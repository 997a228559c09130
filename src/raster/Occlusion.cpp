#include "raster/Occlusion.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>

#include "raster/Rasterizer.h"

namespace Rasterizer_n {
namespace {

using namespace SSEMath;

// Pixels. What is larger is seldom hidden as a whole.
constexpr float largest_triangle = 32, largest_box = 256;
constexpr int last_pixel = 65536;

// What is added to a box, so that rounding makes it the first column and row that spans of a triangle can reach, and
// the ones after the last. Spans can leave the box by the largest side times the error of a reciprocal, and by what
// float sums lose in as many rows. Rows are truncated, not rounded.
alignas(16) constexpr float to_first[4] = {-0.25f, -0.52f, 0, 0}, to_last[4] = {0.25f, -0.48f, 0, 0};

// How far a depth can fall below the nearest vertex, in parts of the largest: it is a sum of some 50 terms.
// Depths so small that such a part is lost count as larger ones.
alignas(16) constexpr float depth_slack[4] = {1e-5f, 1e-5f, 1e-5f, 1e-5f};
constexpr float least_depth = 1e-30f;

VELMARK5_LANE ScreenBox_s box_of(Float4 a, Float4 b, Float4 c) { return {min(min(a, b), c), max(max(a, b), c)}; }

VELMARK5_LANE float nearest_of(const ScreenBox_s& box) { return lane0(broadcast<2>(box.low)); }

VELMARK5_LANE bool at_most(const ScreenBox_s& box, float side) {
  return (lane_bits(less_equal(box.high - box.low, splat(side))) & 3) == 3;
}

// Twice the area of the triangle with its vertices moved to whole rows, as setup has it.
VELMARK5_LANE float double_area(Float4 a, Float4 b, Float4 c) {
  const Float4 ab = interleave_low(a, b);  // xa, xb, ya, yb
  const Float4 x = shuffle<0, 1, 0, 0>(ab, c) - broadcast<0>(a);
  const Float4 y = to_float(truncate(shuffle<2, 3, 1, 1>(ab, c)));
  const Float4 terms = x * (shuffle<1, 2, 0, 3>(y) - shuffle<2, 0, 1, 3>(y));
  return std::abs(lane0(terms) + lane0(broadcast<1>(terms)) + lane0(broadcast<2>(terms)));
}

// In a sliver the approximate slopes of two edges can change places, and then one of them runs on beyond its vertex.
VELMARK5_LANE bool is_sliver(Float4 a, Float4 b, Float4 c) { return !(double_area(a, b, c) >= 1.0f); }

VELMARK5_LANE const float* depth_row(int y) { return m_pDepthBuffer + std::ptrdiff_t{y} * m_ScreenPitch; }

// Whether the depth at a point lies below a limit. Points outside the clip box, and what is no number, do not.
VELMARK5_LANE bool is_nearer(Float4 point, float limit) {
  const Int4 pixel = truncate(point);
  const int x = lane<0>(pixel), y = lane<1>(pixel);
  const ClipBox_s& clip = m_ClipBox;
  return x >= clip.left && x < clip.right && y >= clip.top && y < clip.bottom && depth_row(y)[x] < limit;
}

VELMARK5_LANE bool is_covered(const ScreenBox_s& box) {
  const ClipBox_s& clip = m_ClipBox;
  const Int4 first = round(box.low + load(to_first)), last = round(box.high + load(to_last));
  const int left = std::max(lane<0>(first), clip.left), right = std::min(lane<0>(last), clip.right);
  const int top = std::max(lane<1>(first), clip.top), bottom = std::min(lane<1>(last), clip.bottom);
  if (right < 4 || right > last_pixel || bottom > last_pixel) return false;
  if (top >= bottom) return true;

  // Each row is covered by a group at its left, one at its right, and what is between; rows of less than four pixels
  // have one group, whose first lanes lie outside.
  alignas(16) static constexpr std::uint32_t lane_numbers[4] = {0, 1, 2, 3};
  const int right_group = right - 4, left_group = std::min(left, right_group);
  const Int4 outside = less(load(lane_numbers), splat(static_cast<std::uint32_t>(left - left_group)));
  const Float4 largest = max(max(magnitude(box.low), magnitude(box.high)), splat(least_depth));
  const Float4 limit = broadcast<2>(box.low - largest * load(depth_slack));
  const auto nearer = [limit](const float* depths) { return less(load_unaligned(depths), limit); };
  const float* row = depth_row(top);
  const float* const last_row = depth_row(bottom - 1);

  // The groups at the ends of four rows at a time, of the last row again where there are less: nobody can foresee how
  // many rows there are.
  for (int rows = bottom - top; rows > 0; rows -= 4) {
    Int4 all = splat(~0u);
#pragma GCC unroll 4
    for (int i = 0; i < 4; ++i) {
      all = all & nearer(row + left_group) & nearer(row + right_group);
      row = std::min(row + m_ScreenPitch, last_row);
    }
    if (lane_bits(all | outside) != 15) return false;
  }
  for (int at = left_group + 4; at < right_group; at += 4) {
    row = depth_row(top);
    for (int y = top; y < bottom; ++y, row += m_ScreenPitch) {
      if (lane_bits(nearer(row + at)) != 15) return false;
    }
  }
  return true;
}

}  // namespace

bool IsCovered(const ScreenBox_s& box) {
  // One pixel in the middle tells most boxes that show.
  return is_nearer((box.low + box.high) * splat(0.5f), nearest_of(box)) && at_most(box, largest_box) && is_covered(box);
}

bool StaysInBox(const Triangle_s& triangle) {
  const Float4 a = load(&triangle.vertex[0].x), b = load(&triangle.vertex[1].x), c = load(&triangle.vertex[2].x);
  const Float4 sum = a + b + c;
  return at_most(box_of(a, b, c), largest_triangle) && !is_sliver(a, b, c) && (lane_bits(equal(sum, sum)) & 3) == 3;
}

bool IsHidden(const Triangle_s& triangle) {
  const Float4 a = load(&triangle.vertex[0].x), b = load(&triangle.vertex[1].x), c = load(&triangle.vertex[2].x);
  const ScreenBox_s box = box_of(a, b, c);
  return is_nearer((a + b + c) * splat(1.0f / 3), nearest_of(box)) && at_most(box, largest_triangle) &&
         is_covered(box) && !is_sliver(a, b, c);
}

}  // namespace Rasterizer_n
