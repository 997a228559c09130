// Sprite_c::RenderParallelogram: the image under an affine map. The target is scanned in rows; for each the pixels that
// fall inside the image are found by division, so that the walk along them tests nothing.
#include "raster/SpriteInstances.h"
#include "raster/SpritePixels.h"
#include "raster/SpritePlacement.h"

namespace sprite_render {

namespace {

struct Point {
  float x, y;
};
Point operator+(Point a, Point b) { return {a.x + b.x, a.y + b.y}; }
Point operator-(Point a, Point b) { return {a.x - b.x, a.y - b.y}; }
Point operator*(float k, Point a) { return {k * a.x, k * a.y}; }
Point operator/(Point a, float k) { return {a.x / k, a.y / k}; }

// Texture coordinates are 20.12 fixed point.
constexpr int fraction_bits = 12;
constexpr int largest_side = (1 << 19) - 1;

// The box to scan and the image coordinates over it.
struct Scan {
  int left, top, columns = 0, rows = 0;
  i64 u, v;  // at the centre of the box's top left pixel
  i64 du_x, dv_x, du_y, dv_y;
};

// Without area in the clip rectangle the scan has no rows.
Scan scan_of(const Sprite_c& sprite, const ParallelogramRenderParams& params, const SpriteTarget_s& target) {
  Scan scan{};
  if (sprite.width < 1 || sprite.height < 1 || sprite.width > largest_side || sprite.height > largest_side) return scan;

  // The corners are of the full image: move them in by the margins, to bound the stored pixels.
  Point p0 = {params.x0, params.y0};
  Point p1 = {params.x1, params.y1};
  Point p2 = {params.x2, params.y2};
  if (sprite.width != sprite.full_width() || sprite.height != sprite.full_height()) {
    const Point along = (p1 - p0) / static_cast<float>(sprite.full_width());
    const Point down = (p2 - p0) / static_cast<float>(sprite.full_height());
    const auto left = static_cast<float>(sprite.left);
    const auto top = static_cast<float>(sprite.top);
    p0 = p0 + (left * along + top * down);
    p1 = p1 + (top * down - static_cast<float>(sprite.right) * along);
    p2 = p2 + (left * along - static_cast<float>(sprite.bottom) * down);
  }
  const Point p3 = p1 - p0 + p2;

  // The bounding box inside the clip rectangle, cut to whole pixels.
  const float left = std::max(std::min({p0.x, p1.x, p2.x, p3.x}), static_cast<float>(target.clip_x0));
  const float top = std::max(std::min({p0.y, p1.y, p2.y, p3.y}), static_cast<float>(target.clip_y0));
  const float width = std::min(std::max({p0.x, p1.x, p2.x, p3.x}), static_cast<float>(target.clip_x1)) - left;
  const float height = std::min(std::max({p0.y, p1.y, p2.y, p3.y}), static_cast<float>(target.clip_y1)) - top;
  if (!(width > 0) || !(height > 0)) return scan;
  const Point d1 = p1 - p0;
  const Point d2 = p2 - p0;
  const float area = d1.x * d2.y - d1.y * d2.x;
  if (!(area < 0) && !(area > 0)) return scan;
  // Floats cannot tell every column of a very wide target.
  scan.left = std::max(SSEMath::truncate(left), target.clip_x0);
  scan.top = std::max(SSEMath::truncate(top), target.clip_y0);
  scan.columns = std::min(SSEMath::truncate(width), target.clip_x1 - scan.left);
  scan.rows = std::min(SSEMath::truncate(height), target.clip_y1 - scan.top);

  const auto image_width = static_cast<float>(sprite.width);
  const auto image_height = static_cast<float>(sprite.height);
  scan.du_x = SSEMath::truncate(d2.y * 4096 * image_width / area);
  scan.dv_x = SSEMath::truncate(d1.y * 4096 * image_height / -area);
  scan.du_y = SSEMath::truncate(d2.x * 4096 * image_width / -area);
  scan.dv_y = SSEMath::truncate(d1.x * 4096 * image_height / area);

  // From the parallelogram's centre, which is the image's, to the centre of the first pixel, in 1/16 pixels.
  const i64 rx = SSEMath::truncate(static_cast<float>(scan.left) * 16 + 8 - (p0.x + p1.x + p2.x + p3.x) / 4 * 16);
  const i64 ry = SSEMath::truncate(static_cast<float>(scan.top) * 16 + 8 - (p0.y + p1.y + p2.y + p3.y) / 4 * 16);
  scan.u = (scan.du_y * ry >> 4) + (scan.du_x * rx >> 4) + (i64{sprite.width >> 1} << fraction_bits);
  scan.v = (scan.dv_y * ry >> 4) + (scan.dv_x * rx >> 4) + (i64{sprite.height >> 1} << fraction_bits);
  return scan;
}

// n / d rounded up, for positive n and a step d that fits 32 bits.
i64 divide_up(i64 n, i64 d) {
  const i64 sum = n + (d - 1);
  // The short division is several times faster, and the usual one.
  if (sum <= 0xFFFFFFFF) return static_cast<std::uint32_t>(sum) / static_cast<std::uint32_t>(d);
  return sum / d;
}

// Cuts the run to those i for which at + i * step lies in 0 to end (exclusive).
void cut_run(Span& run, i64 at, i64 step, i64 end) {
  if (step < 0) {
    // The same seen from the other side.
    at = end - 1 - at;
    step = -step;
  }
  if (at + run.from * step < 0) run.from = step == 0 ? run.to : divide_up(-at, step);
  if (at + (run.to - 1) * step >= end) run.to = step == 0 || at >= end ? run.from : divide_up(end - at, step);
}

}  // namespace

template <ColourOp_e Op, BlendMode_e Blend, bool Masked>
void parallelogram(const Sprite_c& sprite, const ParallelogramRenderParams& params, const SpriteTarget_s& target) {
  const Scan scan = scan_of(sprite, params, target);
  if (scan.columns < 1 || scan.rows < 1) return;
  const sprite_pixels::Operation<Op> operation(params.colour);
  const i64 u_end = i64{sprite.width} << fraction_bits;
  const i64 v_end = i64{sprite.height} << fraction_bits;
  unsigned int* to = target.colour + pixel_index(scan.left, scan.top, target.pitch);
  i64 u = scan.u;
  i64 v = scan.v;
  for (int row = 0; row < scan.rows; ++row, to += target.pitch, u += scan.du_y, v += scan.dv_y) {
    Span run{0, scan.columns};
    if constexpr (Masked) {
      run = span_of_row(*params.mask, params.maskx, params.masky, scan.top + row,
                        {scan.left, i64{scan.left} + scan.columns});
      run.from -= scan.left;
      run.to -= scan.left;
      if (run.to <= run.from) continue;
    }
    cut_run(run, u, scan.du_x, u_end);
    if (run.to <= run.from) continue;
    cut_run(run, v, scan.dv_x, v_end);
    if (run.to <= run.from) continue;
    if (row + 2 < scan.rows) {
      sprite_pixels::fetch_ahead(to + 2 * std::ptrdiff_t{target.pitch} + run.from, static_cast<int>(run.to - run.from));
    }
    const sprite_pixels::Line line = {sprite.pixels,
                                      static_cast<std::uint32_t>(sprite.width),
                                      static_cast<std::uint32_t>(u + run.from * scan.du_x),
                                      static_cast<std::uint32_t>(v + run.from * scan.dv_x),
                                      static_cast<std::uint32_t>(scan.du_x),
                                      static_cast<std::uint32_t>(scan.dv_x)};
    sprite_pixels::draw_run<Blend>(to + run.from, static_cast<int>(run.to - run.from),
                                   sprite_pixels::Operated{operation, line});
  }
}

}  // namespace sprite_render

template <ColourOp_e Op, BlendMode_e Blend, bool Masked>
void Sprite_c::RenderParallelogram(const ParallelogramRenderParams& params, const SpriteTarget_s& target) const {
  sprite_render::parallelogram<Op, Blend, Masked>(*this, params, target);
}

#define VELMARK5_SPRITE_PARALLELOGRAM(op, mode, masked)                                   \
  template void Sprite_c::RenderParallelogram<ColourOp_e::op, BlendMode_e::mode, masked>( \
      const ParallelogramRenderParams& params, const SpriteTarget_s& target) const;

#define X(op, mode) VELMARK5_SPRITE_PARALLELOGRAM(op, mode, false)
VELMARK5_SPRITE_PAIRS(X)
#undef X
#define X(op, mode) VELMARK5_SPRITE_PARALLELOGRAM(op, mode, true)
VELMARK5_MASKED_PARALLELOGRAM_PAIRS(X)
#undef X
