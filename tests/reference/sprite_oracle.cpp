#include "reference/sprite_oracle.h"

#include <algorithm>
#include <cmath>

#include "reference/numbers.h"

namespace oracle {

namespace {

using i64 = std::int64_t;

// One channel of a colour operation; top: that of the operand.
unsigned operate(int colourop, unsigned s, unsigned c, unsigned top) {
  switch (colourop) {
    case 0:
      return s * c >> 8;
    case 1:
      return s;
    case 2: {
      const int a = top < 128 ? static_cast<int>(top) : static_cast<int>(top) - 256;
      const unsigned first = a >= 0 ? s * static_cast<unsigned>(a) >> 8 : s == 0 ? 0 : 255;
      const unsigned second = std::min(c * static_cast<unsigned>(255 - a) >> 8, 255u);
      return (first + second) & 0xFF;
    }
    case 3:
      return std::min(s + c, 255u);
    default:
      return s < c ? 0 : s - c;
  }
}

// One channel of a blend. Each product loses its low byte on its own, so a full alpha costs one.
unsigned blend(int mode, unsigned s, unsigned a, unsigned d) {
  if (mode == 0) return s;
  if (mode == 1) return std::min((a << 8) * s / 65536 + (256 - a) * (d << 8) / 65536, 255u);
  return std::min(d + s, 255u);
}

void put(target& t, int x, int y, const sprite_modes& m, std::uint32_t source) {
  const std::uint32_t operated = word_of(
      [&](int c) { return operate(m.colourop, channel(source, c), channel(m.colour, c), channel(m.colour, 3)); });
  std::uint32_t& d = t.at(x, y);
  d = word_of([&](int c) { return blend(m.blend, channel(operated, c), channel(operated, 3), channel(d, c)); });
}

// What the processor gives: values that do not fit become the lowest integer.
int whole(long double value) {
  return value > -2147483649.0L && value < 2147483648.0L ? static_cast<int>(value) : INT32_MIN;
}

// One axis of a scaled sprite: the texel of each of its pixels inside the clip rectangle.
struct axis {
  i64 first;                // pixel
  std::vector<i64> texels;  // counted from `start`, groups of four in float with `grouped`
  i64 start;
};

// An axis of a sprite at `at` on the screen, with its margins, of the width `size` after scaling.
axis scaled_axis(int at, int before, int texels, int after, int size, int clip_from, int clip_to, bool grouped) {
  const i64 full = i64{before} + texels + after;
  if (texels < 1 || full == 0) return {};  // without area
  const long double factor = static_cast<long double>(size) / full;
  const i64 margin = whole(before * factor), end_margin = whole(after * factor);
  const i64 from = at + margin, length = size - margin - end_margin;
  axis a{std::max<i64>(from, clip_from), {}, 0};
  const i64 pixels = std::min<i64>(clip_to, from + length) - a.first;
  if (length < 1 || pixels < 1) return a;
  const long double ratio = static_cast<long double>(length) / texels;
  const float step = static_cast<float>(1 / ratio);
  a.start = whole(std::max<i64>(clip_from - from, 0) / ratio);
  // Rows, and the columns of whole groups of four, add up in float; the columns behind the last group divide.
  const int lanes = grouped ? 4 : 1;
  for (i64 i = 0; i < pixels; ++i) {
    float sum = step * static_cast<float>(i % lanes);
    for (i64 group = 0; group < i / lanes; ++group) sum += static_cast<float>(lanes) * step;
    a.texels.push_back(i < pixels / lanes * lanes ? whole(sum) : whole(i / ratio));
  }
  return a;
}

}  // namespace

std::uint32_t image::word(i64 position) const {
  return pixels[static_cast<std::size_t>(std::clamp<i64>(position, 0, static_cast<i64>(pixels.size()) - 1))];
}

void draw(target& t, const image& s, const sprite_modes& m, int x, int y, const placed_mask* mask) {
  t.for_clip([&](int px, int py) {
    const i64 column = i64{px} - x - s.left, row = i64{py} - y - s.top;
    if (column < 0 || column >= s.width || row < 0 || row >= s.height) return;
    if (mask != nullptr) {
      const i64 across = i64{px} - mask->x, down = i64{py} - mask->y;
      if (across < 0 || across >= mask->width || down >= mask->height || !mask->covers(across, down)) return;
    }
    put(t, px, py, m, s.word(row * s.width + column));
  });
}

void draw_scaled(target& t, const image& s, const sprite_modes& m, int x, int y, int w, int h, const float* z) {
  const axis across = scaled_axis(x, s.left, s.width, s.right, w, t.x0, t.x1, true);
  const axis down = scaled_axis(y, s.top, s.height, s.bottom, h, t.y0, t.y1, false);
  for (int j = 0; j < static_cast<int>(down.texels.size()); ++j) {
    for (int i = 0; i < static_cast<int>(across.texels.size()); ++i) {
      const int px = static_cast<int>(across.first) + i, py = static_cast<int>(down.first) + j;
      if (z != nullptr && !(*z <= t.depth[t.index(px, py)])) continue;
      put(t, px, py, m, s.word((down.start + down.texels[j]) * s.width + across.start + across.texels[i]));
    }
  }
}

void draw_parallelogram(target& t, const image& s, const sprite_modes& m, const float corners[6],
                        const placed_mask* mask) {
  if (s.width < 1 || s.height < 1) return;
  // Three corners and the fourth, without the margins.
  float p[4][2];
  const int clip[2][2] = {{t.x0, t.x1}, {t.y0, t.y1}};
  int first[2], count[2];
  i64 centre[2];
  for (int k = 0; k < 2; ++k) {
    for (int i = 0; i < 3; ++i) p[i][k] = corners[2 * i + k];
    if (s.width != s.full_width() || s.height != s.full_height()) {
      const float along = (p[1][k] - p[0][k]) / static_cast<float>(s.full_width());
      const float down = (p[2][k] - p[0][k]) / static_cast<float>(s.full_height());
      const float left = static_cast<float>(s.left), top = static_cast<float>(s.top);
      p[0][k] += left * along + top * down;
      p[1][k] += top * down - static_cast<float>(s.right) * along;
      p[2][k] += left * along - static_cast<float>(s.bottom) * down;
    }
    p[3][k] = p[1][k] - p[0][k] + p[2][k];

    const auto all = {p[0][k], p[1][k], p[2][k], p[3][k]};
    const float from = std::max(std::min(all), static_cast<float>(clip[k][0]));
    const float size = std::min(std::max(all), static_cast<float>(clip[k][1])) - from;
    if (!(size > 0)) return;
    first[k] = whole(from);
    count[k] = whole(size);
    centre[k] = whole(static_cast<float>(first[k]) * 16 + 8 - (p[0][k] + p[1][k] + p[2][k] + p[3][k]) / 4 * 16);
  }

  const float dx1 = p[1][0] - p[0][0], dy1 = p[1][1] - p[0][1], dx2 = p[2][0] - p[0][0], dy2 = p[2][1] - p[0][1];
  const float area = dx1 * dy2 - dy1 * dx2;
  if (area == 0) return;
  const float width = static_cast<float>(s.width), height = static_cast<float>(s.height);
  const i64 du_x = whole(dy2 * 4096 * width / area), du_y = whole(dx2 * 4096 * width / -area);
  const i64 dv_x = whole(dy1 * 4096 * height / -area), dv_y = whole(dx1 * 4096 * height / area);
  const i64 u = (du_y * centre[1] >> 4) + (du_x * centre[0] >> 4) + (i64{s.width >> 1} << 12);
  const i64 v = (dv_y * centre[1] >> 4) + (dv_x * centre[0] >> 4) + (i64{s.height >> 1} << 12);
  for (int j = 0; j < count[1]; ++j) {
    for (int i = 0; i < count[0]; ++i) {
      const i64 column = (u + du_x * i + du_y * j) >> 12, row = (v + dv_x * i + dv_y * j) >> 12;
      if (column < 0 || column >= s.width || row < 0 || row >= s.height) continue;
      const int px = first[0] + i, py = first[1] + j;
      if (mask == nullptr || mask->covers(i64{px} - mask->x, i64{py} - mask->y)) {
        put(t, px, py, m, s.word(row * s.width + column));
      }
    }
  }
}

void draw_tiled(target& t, const image& s, const sprite_modes& m, int x, int y, int w, int h) {
  if (s.full_width() < 1 || s.full_height() < 1) return;
  const int right = t.x1, bottom = t.y1;
  t.x1 = static_cast<int>(std::min<i64>(right, i64{x} + w));
  t.y1 = static_cast<int>(std::min<i64>(bottom, i64{y} + h));
  for (int row = 0; row * s.full_height() < h; ++row) {
    for (int column = 0; column * s.full_width() < w; ++column) {
      draw(t, s, m, x + column * s.full_width(), y + row * s.full_height(), nullptr);
    }
  }
  t.x1 = right;
  t.y1 = bottom;
}

}  // namespace oracle
