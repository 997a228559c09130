#include "reference/primitives_oracle.h"

#include <algorithm>
#include <cmath>

#include "reference/numbers.h"

namespace {

using std::int64_t;
using std::uint32_t;

bool known(unsigned int mode) { return mode <= 2; }

bool inside(int64_t value, int from, int size) { return value >= from && value - from < size; }

}  // namespace

// Alpha becomes the colour's in a blend, and wraps in an addition.
uint32_t primitives_oracle::combine(uint32_t d, uint32_t c, unsigned int mode) {
  const uint32_t a = c >> 24;
  if (mode == 0 || (mode == 1 && a == 255)) return c;
  return oracle::word_of([&](int i) {
    const uint32_t from = oracle::channel(d, i), to = oracle::channel(c, i);
    if (mode == 1) return i == 3 ? a : (from * (256 - a) >> 8) + (to * a >> 8);
    return i == 3 ? (from + to) & 0xFF : std::min(from + to, 255u);
  });
}

void primitives_oracle::put(int64_t x, int64_t y, uint32_t c, unsigned int mode) {
  if (in_clip(x, y)) at(x, y) = combine(at(x, y), c, mode);
}

bool primitives_oracle::rect_fill(int x, int y, int w, int h, uint32_t c, unsigned int mode) {
  if (colour.empty()) return true;
  if (!known(mode)) return false;
  for_clip([&](int px, int py) {
    if (inside(px, x, w) && inside(py, y, h)) put(px, py, c, mode);
  });
  return true;
}

bool primitives_oracle::line_h(int x, int y, int length, uint32_t c, unsigned int mode) {
  return y < y0 || y >= y1 || rect_fill(x, y, length, 1, c, mode);
}

bool primitives_oracle::line_v(int x, int y, int length, uint32_t c, unsigned int mode) {
  return x < x0 || x >= x1 || rect_fill(x, y, 1, length, c, mode);
}

bool primitives_oracle::line(int ax, int ay, int bx, int by, uint32_t c, unsigned int mode, const shape* mask,
                             int mask_x, int mask_y) {
  if (colour.empty()) return true;
  if (!known(mode)) return false;
  const auto plot = [&](int64_t x, int64_t y) {
    if (mask == nullptr || mask->covers(x - mask_x, y - mask_y)) put(x, y, c, mode);
  };

  // From the end that makes the sum of the steps positive, along the longer axis; the other in 16.16.
  int64_t x = ax, y = ay, dx = int64_t{bx} - ax, dy = int64_t{by} - ay;
  if (dx + dy < 0) {
    x = bx, y = by;
    dx = -dx, dy = -dy;
  }
  const bool flat = dx > dy;
  const int64_t major = flat ? dx : dy, minor = flat ? dy : dx;
  const double slope = major == 0 ? 0 : static_cast<double>(minor * 65536) / static_cast<double>(major);
  const int64_t step = static_cast<int64_t>(std::floor(slope + 0.5));
  int64_t from = flat ? x0 : y0, end = flat ? x1 : y1;
  if (mask != nullptr && !flat) {
    from = std::max<int64_t>(from, mask_y);
    end = std::min<int64_t>(end, mask_y + static_cast<int64_t>(mask->starts.size()));
  }
  int64_t place = flat ? x : y, f = (flat ? y : x) * 65536 + 0x8000;
  const int64_t last = std::min(place + major, end - 1);
  f += std::max<int64_t>(from - place, 0) * step;
  for (place = std::max(place, from); place <= last; ++place, f += step) {
    flat ? plot(place, f >> 16) : plot(f >> 16, place);
  }
  return true;
}

bool primitives_oracle::circle_fill(int x, int y, int z, int radius, uint32_t c, unsigned int mode) {
  if (colour.empty()) return true;
  if (!known(mode)) return false;
  const auto fill = [&](int64_t row, int64_t first, int64_t last) {
    for (int64_t px = std::max<int64_t>(first, x0); px <= std::min(last, int64_t{x1} - 1); ++px) {
      if (depth.empty() || depth[index(px, row)] > static_cast<float>(z)) put(px, row, c, mode);
    }
  };
  const int64_t cx = x, cy = y, r = std::abs(int64_t{radius}), rr = r * r;
  const int64_t bottom = std::min<int64_t>(cy + r + 1, y1), half = std::min(bottom, cy);
  int64_t row = std::max<int64_t>(cy - r, y0);

  // Above the centre the half width j grows, from there on it shrinks.
  const int64_t dy = cy - row;
  int64_t a = dy * dy, b = a - dy, s = -2 * dy, j = 0;
  for (; row < half; ++row) {
    for (; rr >= a || rr >= b; ++j) {
      a += 2 * j;
      b += 2 * j;
    }
    fill(row, cx + 1 - j, cx + j - 1);
    s += 2;
    b += s;
    a += s - 2;
  }
  const int64_t d = row - cy;
  int64_t q = d * d + rr - r, p = d * d + rr - d, t = 2 * d;
  for (j = r; row < bottom; ++row) {
    for (; rr < q && rr < p; --j) {
      p -= 2 * j;
      q -= 2 * j - 2;
    }
    fill(row, cx - j, cx + j);
    p += t;
    q += t;
    t += 2;
  }
  return true;
}

void primitives_oracle::cls_masked(uint32_t c, const shape& mask, int x, int y) {
  if (colour.empty()) return;
  for_clip([&](int px, int py) {
    if (mask.covers(int64_t{px} - x, int64_t{py} - y)) at(px, py) = c;
  });
}

void primitives_oracle::zbuffer_clear(int x, int y, int w, int h, float value) {
  if (depth.empty()) return;
  for_clip([&](int px, int py) {
    if (inside(px, x, w) && inside(py, y, h)) depth[index(px, py)] = value;
  });
}

void primitives_oracle::scroll(int dx, int dy) {
  const auto move = [&](auto& image) {
    const auto before = image;
    const auto total = static_cast<int64_t>(image.size());
    for (int64_t i = 0; i < total; ++i) {
      const int64_t from = i - (int64_t{dy} * width + dx);
      if (from >= 0 && from < total) image[static_cast<std::size_t>(i)] = before[static_cast<std::size_t>(from)];
    }
  };
  move(colour);
  move(depth);
}
