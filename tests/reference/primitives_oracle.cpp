#include "reference/primitives_oracle.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace {

using std::int64_t;
using std::uint32_t;

bool known(unsigned int mode) { return mode <= 2; }

}  // namespace

uint32_t primitives_oracle::combine(uint32_t d, uint32_t c, unsigned int mode) {
  const uint32_t a = c >> 24;
  if (mode == 0 || (mode == 1 && a == 255)) return c;
  if (mode == 1) {
    const uint32_t ia = 256 - a;
    const uint32_t p = (((c & 0xFF00) * a) >> 8 & 0xFF00) + (((c & 0xFF00FF) * a) >> 8 & 0xFF00FF) + (a << 24);
    return (((d & 0xFF00FF) * ia) >> 8 & 0xFF00FF) + (((d & 0xFF00) * ia) >> 8 & 0xFF00) + p;
  }
  const uint32_t rb = (d & 0xFF00FF) + (c & 0xFF00FF);
  const uint32_t s = d + c;
  const uint32_t k = ((s - rb) & 0x10000) + (rb & 0x1000100);
  return (k - (k >> 8)) | (s - k);
}

void primitives_oracle::put(int64_t x, int64_t y, uint32_t c, unsigned int mode) {
  if (!in_clip(x, y)) return;
  uint32_t& d = colour[static_cast<std::size_t>(y * width + x)];
  d = combine(d, c, mode);
}

bool primitives_oracle::rect_fill(int x, int y, int w, int h, uint32_t c, unsigned int mode) {
  if (colour.empty()) return true;
  if (!known(mode)) return false;
  for (int64_t py = y0; py < y1; ++py) {
    for (int64_t px = x0; px < x1; ++px) {
      if (px >= x && px - x < w && py >= y && py - y < h) put(px, py, c, mode);
    }
  }
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
  int64_t top = y0;
  int64_t bottom = y1;
  if (mask != nullptr) {
    top = std::max<int64_t>(mask_y, y0);
    bottom = std::min<int64_t>(y1, static_cast<int64_t>(mask_y) + static_cast<int64_t>(mask->starts.size()));
  }
  const auto plot = [&](int64_t x, int64_t y) {
    if (y < top || y >= bottom) return;
    if (mask != nullptr) {
      const auto r = static_cast<std::size_t>(y - mask_y);
      const int64_t start = static_cast<int64_t>(mask_x) + mask->starts[r];
      if (x < start || x >= start + mask->lengths[r]) return;
    }
    put(x, y, c, mode);
  };

  int64_t x = ax;
  int64_t y = ay;
  int64_t dx = static_cast<int64_t>(bx) - ax;
  int64_t dy = static_cast<int64_t>(by) - ay;
  if (dx + dy < 0) {
    x += dx;
    y += dy;
    dx = -dx;
    dy = -dy;
  }
  const auto slope = [](int64_t minor, int64_t major) {
    if (major == 0) return int64_t{0};
    return static_cast<int64_t>(std::floor(static_cast<double>(minor * 65536) / static_cast<double>(major) + 0.5));
  };
  if (dx > dy) {
    const int64_t step = slope(dy, dx);
    const int64_t end = x + dx;
    int64_t f = y * 65536 + 0x8000;
    if (x < x0) {
      f += (x0 - x) * step;
      x = x0;
    }
    const int64_t last = end < x1 ? end : int64_t{x1} - 1;
    for (; x <= last; ++x, f += step) plot(x, f >> 16);
  } else {
    const int64_t step = slope(dx, dy);
    const int64_t end = y + dy;
    int64_t f = x * 65536 + 0x8000;
    if (y < top) {
      f += (top - y) * step;
      y = top;
    }
    const int64_t last = end < bottom ? end : bottom - 1;
    for (; y <= last; ++y, f += step) plot(f >> 16, y);
  }
  return true;
}

bool primitives_oracle::circle_fill(int x, int y, int z, int radius, uint32_t c, unsigned int mode) {
  if (colour.empty()) return true;
  if (!known(mode)) return false;
  const auto fill = [&](int64_t row, int64_t first, int64_t last) {
    for (int64_t px = std::max<int64_t>(first, x0); px <= std::min(last, int64_t{x1} - 1); ++px) {
      const auto i = static_cast<std::size_t>(row * width + px);
      if (depth.empty() || depth[i] > static_cast<float>(z)) put(px, row, c, mode);
    }
  };
  const int64_t cx = x;
  const int64_t cy = y;
  const int64_t r = std::abs(static_cast<int64_t>(radius));
  const int64_t rr = r * r;
  const int64_t top = std::max<int64_t>(cy - r, y0);
  const int64_t bottom = std::min<int64_t>(cy + r + 1, y1);
  const int64_t half = std::min(bottom, cy);
  const int64_t dy = cy - top;
  int64_t row = top;

  int64_t a = dy * dy;
  int64_t b = a - dy;
  int64_t s = -2 * dy;
  int64_t j = 0;
  while (row < half) {
    while (rr >= a || rr >= b) {
      a += 2 * j;
      b += 2 * j;
      j += 1;
    }
    fill(row, cx + 1 - j, cx + j - 1);
    s += 2;
    b += s;
    a += s - 2;
    ++row;
  }

  const int64_t d = row - cy;
  int64_t q = d * d + rr - r;
  int64_t p = d * d + rr - d;
  int64_t t = 2 * d;
  j = r;
  while (row < bottom) {
    while (rr < q && rr < p) {
      const int64_t u = -2 * j;
      p += u;
      q += u + 2;
      j -= 1;
    }
    fill(row, cx - j, cx + j);
    p += t;
    q += t;
    t += 2;
    ++row;
  }
  return true;
}

void primitives_oracle::cls_masked(uint32_t c, const shape& mask, int x, int y) {
  if (colour.empty()) return;
  for (std::size_t r = 0; r < mask.starts.size(); ++r) {
    const int64_t row = static_cast<int64_t>(y) + static_cast<int64_t>(r);
    if (row < y0 || row >= y1) continue;
    const int64_t start = static_cast<int64_t>(x) + mask.starts[r];
    for (int64_t px = x0; px < x1; ++px) {
      if (px >= start && px < start + mask.lengths[r]) put(px, row, c, 0);
    }
  }
}

void primitives_oracle::zbuffer_clear(int x, int y, int w, int h, float value) {
  if (depth.empty()) return;
  for (int64_t py = y0; py < y1; ++py) {
    for (int64_t px = x0; px < x1; ++px) {
      if (px >= x && px - x < w && py >= y && py - y < h) depth[static_cast<std::size_t>(py * width + px)] = value;
    }
  }
}

void primitives_oracle::scroll(int dx, int dy) {
  const auto move = [&](auto& image) {
    const auto before = image;
    const int64_t offset = static_cast<int64_t>(dy) * width + dx;
    const auto total = static_cast<int64_t>(image.size());
    for (int64_t i = 0; i < total; ++i) {
      const int64_t from = i - offset;
      if (from >= 0 && from < total) image[static_cast<std::size_t>(i)] = before[static_cast<std::size_t>(from)];
    }
  };
  move(colour);
  move(depth);
}
