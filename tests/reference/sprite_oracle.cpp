#include "reference/sprite_oracle.h"

#include <algorithm>
#include <cmath>
#include <cstddef>

namespace sprite_oracle {

namespace {

using i64 = std::int64_t;

unsigned channel(std::uint32_t word, int c) { return word >> (8 * c) & 0xFF; }

unsigned operate(int colourop, unsigned s, unsigned c, unsigned top_byte) {
  switch (colourop) {
    case 0:
      return s * c >> 8;
    case 1:
      return s;
    case 2: {
      const int a = top_byte < 128 ? static_cast<int>(top_byte) : static_cast<int>(top_byte) - 256;
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

unsigned blend(int mode, unsigned s, unsigned a, unsigned d) {
  switch (mode) {
    case 0:
      return s;
    case 1:
      return std::min((a << 8) * s / 65536 + (256 - a) * (d << 8) / 65536, 255u);
    default:
      return std::min(d + s, 255u);
  }
}

int whole(long double value) {
  // What the processor gives: values that do not fit become the lowest integer.
  return value > -2147483649.0L && value < 2147483648.0L ? static_cast<int>(value) : INT32_MIN;
}

int whole(float value) { return whole(static_cast<long double>(value)); }

bool in_span(const mask* span, int x, int y) {
  if (span == nullptr) return true;
  const i64 row = i64{y} - span->y;
  if (row < 0 || row >= static_cast<i64>(span->starts.size())) return false;
  const i64 start = i64{span->x} + span->starts[static_cast<std::size_t>(row)];
  return x >= start && x < start + span->lengths[static_cast<std::size_t>(row)];
}

template <class Each>
void for_clip(const target& t, Each each) {
  for (int y = t.clip_y0; y < t.clip_y1; ++y) {
    for (int x = t.clip_x0; x < t.clip_x1; ++x) each(x, y);
  }
}

// z null: no depth test.
void scale(target& t, const image& s, const modes& m, int x, int y, int w, int h, const float* z) {
  const i64 full_width = i64{s.left} + s.width + s.right;
  const i64 full_height = i64{s.top} + s.height + s.bottom;
  if (s.width < 1 || s.height < 1 || full_width == 0 || full_height == 0) return;  // without area
  const long double fx = static_cast<long double>(w) / full_width;
  const long double fy = static_cast<long double>(h) / full_height;
  const i64 l = whole(s.left * fx);
  const i64 top = whole(s.top * fy);
  const i64 r = whole(s.right * fx);
  const i64 b = whole(s.bottom * fy);
  const i64 x0 = x + l;
  const i64 y0 = y + top;
  const i64 tw = w - l - r;
  const i64 th = h - top - b;
  if (tw < 1 || th < 1) return;
  const long double rx = static_cast<long double>(tw) / s.width;
  const long double ry = static_cast<long double>(th) / s.height;
  const float stepx = static_cast<float>(1 / rx);
  const float stepy = static_cast<float>(1 / ry);

  const i64 first_x = std::max<i64>(x0, t.clip_x0);
  const i64 first_y = std::max<i64>(y0, t.clip_y0);
  const i64 columns = std::min<i64>(t.clip_x1, x0 + tw) - first_x;
  const i64 rows = std::min<i64>(t.clip_y1, y0 + th) - first_y;
  if (columns < 1 || rows < 1) return;
  const i64 start =
      i64{whole(std::max<i64>(t.clip_y0 - y0, 0) / ry)} * s.pitch + whole(std::max<i64>(t.clip_x0 - x0, 0) / rx);

  // The column of each pixel of a row: whole groups of four add up in float, the rest divides.
  std::vector<int> column(static_cast<std::size_t>(columns));
  for (int lane = 0; lane < 4; ++lane) {
    float at = stepx * static_cast<float>(lane);
    for (i64 i = lane; i < columns / 4 * 4; i += 4) {
      column[static_cast<std::size_t>(i)] = whole(at);
      at += 4 * stepx;
    }
  }
  for (i64 i = columns / 4 * 4; i < columns; ++i) column[static_cast<std::size_t>(i)] = whole(i / rx);

  float row = 0;
  for (i64 j = 0; j < rows; ++j, row += stepy) {
    for (i64 i = 0; i < columns; ++i) {
      const int px = static_cast<int>(first_x + i);
      const int py = static_cast<int>(first_y + j);
      if (z != nullptr && !(*z <= t.depth[static_cast<std::size_t>(py * t.width + px)])) continue;
      const std::uint32_t word = s.word(start + i64{s.pitch} * whole(row) + column[static_cast<std::size_t>(i)]);
      t.at(px, py) = combine(m, word, t.at(px, py));
    }
  }
}

}  // namespace

std::uint32_t image::word(i64 position) const {
  const i64 last = i64{height - 1} * pitch + width - 1;
  return pixels[static_cast<std::size_t>(std::clamp<i64>(position, 0, last))];
}

std::uint32_t combine(const modes& m, std::uint32_t source, std::uint32_t destination) {
  std::uint32_t operated = 0;
  for (int c = 0; c < 4; ++c) {
    operated |= operate(m.colourop, channel(source, c), channel(m.colour, c), channel(m.colour, 3)) << (8 * c);
  }
  std::uint32_t result = 0;
  for (int c = 0; c < 4; ++c) {
    result |= blend(m.blend, channel(operated, c), channel(operated, 3), channel(destination, c)) << (8 * c);
  }
  return result;
}

void draw(target& t, const image& s, const modes& m, int x, int y, const mask* span) {
  for_clip(t, [&](int px, int py) {
    const i64 column = i64{px} - x - s.left;
    const i64 row = i64{py} - y - s.top;
    if (column < 0 || column >= s.width || row < 0 || row >= s.height) return;
    if (span != nullptr) {
      const i64 across = i64{px} - span->x;
      const i64 down = i64{py} - span->y;
      if (across < 0 || across >= span->width || down < 0 || down >= span->height || !in_span(span, px, py)) return;
    }
    t.at(px, py) = combine(m, s.word(row * s.pitch + column), t.at(px, py));
  });
}

void draw_scaled(target& t, const image& s, const modes& m, int x, int y, int w, int h) {
  scale(t, s, m, x, y, w, h, nullptr);
}

void draw_depth_tested(target& t, const image& s, const modes& m, int x, int y, int z, int w, int h) {
  const float depth = static_cast<float>(z);
  scale(t, s, m, x, y, w, h, &depth);
}

void draw_parallelogram(target& t, const image& s, const modes& m, const float corners[6], const mask* span) {
  if (s.width < 1 || s.height < 1) return;
  float x0 = corners[0], y0 = corners[1], x1 = corners[2], y1 = corners[3], x2 = corners[4], y2 = corners[5];
  const int full_width = s.left + s.width + s.right;
  const int full_height = s.top + s.height + s.bottom;
  if (s.width != full_width || s.height != full_height) {
    const float along_x = (x1 - x0) / static_cast<float>(full_width);
    const float along_y = (y1 - y0) / static_cast<float>(full_width);
    const float down_x = (x2 - x0) / static_cast<float>(full_height);
    const float down_y = (y2 - y0) / static_cast<float>(full_height);
    const float left = static_cast<float>(s.left), top = static_cast<float>(s.top);
    const float right = static_cast<float>(s.right), bottom = static_cast<float>(s.bottom);
    x0 += left * along_x + top * down_x;
    y0 += left * along_y + top * down_y;
    x1 += top * down_x - right * along_x;
    y1 += top * down_y - right * along_y;
    x2 += left * along_x - bottom * down_x;
    y2 += left * along_y - bottom * down_y;
  }
  const float x3 = x1 - x0 + x2;
  const float y3 = y1 - y0 + y2;

  const float box_left = std::max(std::min({x0, x1, x2, x3}), static_cast<float>(t.clip_x0));
  const float box_top = std::max(std::min({y0, y1, y2, y3}), static_cast<float>(t.clip_y0));
  const float box_width = std::min(std::max({x0, x1, x2, x3}), static_cast<float>(t.clip_x1)) - box_left;
  const float box_height = std::min(std::max({y0, y1, y2, y3}), static_cast<float>(t.clip_y1)) - box_top;
  if (!(box_width > 0) || !(box_height > 0)) return;
  const int left = whole(box_left), top = whole(box_top), columns = whole(box_width), rows = whole(box_height);

  const float dx1 = x1 - x0, dy1 = y1 - y0, dx2 = x2 - x0, dy2 = y2 - y0;
  const float area = dx1 * dy2 - dy1 * dx2;
  if (area == 0) return;
  const float width = static_cast<float>(s.width), height = static_cast<float>(s.height);
  const i64 du_x = whole(dy2 * 4096 * width / area);
  const i64 dv_x = whole(dy1 * 4096 * height / -area);
  const i64 du_y = whole(dx2 * 4096 * width / -area);
  const i64 dv_y = whole(dx1 * 4096 * height / area);
  const i64 rx = whole(static_cast<float>(left) * 16 + 8 - (x0 + x1 + x2 + x3) / 4 * 16);
  const i64 ry = whole(static_cast<float>(top) * 16 + 8 - (y0 + y1 + y2 + y3) / 4 * 16);
  const i64 u = (du_y * ry >> 4) + (du_x * rx >> 4) + (i64{s.width >> 1} << 12);
  const i64 v = (dv_y * ry >> 4) + (dv_x * rx >> 4) + (i64{s.height >> 1} << 12);

  for (int j = 0; j < rows; ++j) {
    for (int i = 0; i < columns; ++i) {
      const i64 texel_u = (u + du_x * i + du_y * j) >> 12;
      const i64 texel_v = (v + dv_x * i + dv_y * j) >> 12;
      if (texel_u < 0 || texel_u >= s.width || texel_v < 0 || texel_v >= s.height) continue;
      if (!in_span(span, left + i, top + j)) continue;
      std::uint32_t& pixel = t.at(left + i, top + j);
      pixel = combine(m, s.word(texel_v * s.width + texel_u), pixel);
    }
  }
}

void draw_tiled(target& t, const image& s, const modes& m, int x, int y, int w, int h) {
  const target whole_target{t.width, t.height, t.clip_x0, t.clip_y0, t.clip_x1, t.clip_y1, {}, {}};
  t.clip_x1 = static_cast<int>(std::min<i64>(t.clip_x1, i64{x} + w));
  t.clip_y1 = static_cast<int>(std::min<i64>(t.clip_y1, i64{y} + h));
  const int full_width = s.left + s.width + s.right;
  const int full_height = s.top + s.height + s.bottom;
  const int columns = full_width < 1 ? 0 : (w + full_width - 1) / full_width;
  const int rows = full_height < 1 ? 0 : (h + full_height - 1) / full_height;
  for (int row = 0; row < rows; ++row) {
    for (int column = 0; column < columns; ++column) {
      draw(t, s, m, x + column * full_width, y + row * full_height, nullptr);
    }
  }
  t.clip_x1 = whole_target.clip_x1;
  t.clip_y1 = whole_target.clip_y1;
}

}  // namespace sprite_oracle
