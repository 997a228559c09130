// The clip rectangle.
#include <algorithm>

#include "raster/Rasterizer.h"
#include "toolkit/toolkit.h"

void toolkit::resetclipping() {
  clip_x0 = 0;
  clip_y0 = 0;
  clip_x1 = width;
  clip_y1 = height;
  updateClippingDerived();
}

void toolkit::setclipping(int x0, int y0, int x1, int y1) {
  clip_x0 = std::max(x0, 0);
  clip_y0 = std::max(y0, 0);
  clip_x1 = std::min(x1, width);
  clip_y1 = std::min(y1, height);
  updateClippingDerived();
}

void toolkit::setsubclipping(int x0, int y0, int x1, int y1) {
  clip_x0 = std::max(x0, clip_x0);
  clip_y0 = std::max(y0, clip_y0);
  clip_x1 = std::min(x1, clip_x1);
  clip_y1 = std::min(y1, clip_y1);
  updateClippingDerived();
}

void toolkit::getclipping(int* out) const {
  out[0] = clip_x0;
  out[1] = clip_y0;
  out[2] = clip_x1;
  out[3] = clip_y1;
}

void toolkit::updateClippingDerived() {
  // An empty rectangle may have any corners, and its extents wrap.
  const auto extent = [](int from, int to) {
    return static_cast<int>(static_cast<unsigned int>(to) - static_cast<unsigned int>(from));
  };
  Rasterizer_n::SetCliprect({clip_x0, clip_y0, extent(clip_x0, clip_x1), extent(clip_y0, clip_y1)});
}
