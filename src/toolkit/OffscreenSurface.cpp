#include "toolkit/OffscreenSurface.h"

#include <cstddef>
#include <cstring>

#include "raster/DepthBuffer.h"
#include "raster/Sprite.h"
#include "toolkit/toolkit.h"

namespace {

// A pixel or depth in a block of rows.
template <class T>
struct Place {
  T* block;
  std::ptrdiff_t pitch;
  int x, y;

  T* row(int r) const { return block + (static_cast<std::ptrdiff_t>(y) + r) * pitch + x; }
};

// The two sides may be one block, when the image is the target itself: rows are moved.
template <class T>
void copy_rows(Place<T> to, Place<T> from, int w, int h) {
  if (w < 1) return;
  for (int r = 0; r < h; ++r) std::memmove(to.row(r), from.row(r), static_cast<std::size_t>(w) * sizeof(T));
}

}  // namespace

namespace OffscreenSurface_c {

void BlitFromFramebuffer(toolkit& t, Sprite_c& s, DepthBuffer_c& d, int x, int y, int w, int h, int dst_x, int dst_y,
                         bool colour, bool depth) {
  const bool do_colour = colour && t.colourbuffer != nullptr;
  const bool do_depth = depth && t.depthbuffer != nullptr;
  if (do_colour) copy_rows<unsigned int>({s.pixels, s.width, dst_x, dst_y}, {t.colourbuffer, t.width, x, y}, w, h);
  if (do_depth) {
    const std::ptrdiff_t pitch = do_colour ? s.width : static_cast<std::ptrdiff_t>(d.width);
    copy_rows<float>({d.depth, pitch, dst_x, dst_y}, {t.depthbuffer, t.width, x, y}, w, h);
  }
}

void BlitToFramebuffer(toolkit& t, Sprite_c& s, DepthBuffer_c& d, int x, int y, int w, int h, int dst_x, int dst_y,
                       bool colour, bool depth) {
  const bool do_colour = colour && t.colourbuffer != nullptr;
  const bool do_depth = depth && t.depthbuffer != nullptr;
  if (do_colour) copy_rows<unsigned int>({t.colourbuffer, t.width, dst_x, dst_y}, {s.pixels, s.width, x, y}, w, h);
  if (do_depth) {
    const std::ptrdiff_t pitch = do_colour ? s.width : static_cast<std::ptrdiff_t>(d.width);
    copy_rows<float>({t.depthbuffer, t.width, dst_x, dst_y}, {d.depth, pitch, x, y}, w, h);
  }
}

}  // namespace OffscreenSurface_c
