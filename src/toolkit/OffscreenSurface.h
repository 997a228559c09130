// Copies between the current target and a pair of images. Words and depths are copied bit for bit, nothing is clipped:
// the rectangles lie inside both sides. A size below 1 copies nothing.
#pragma once

class DepthBuffer_c;
class toolkit;
struct Sprite_c;

namespace OffscreenSurface_c {

// From (x, y) of the target to (dst_x, dst_y) of the images. `colour` and `depth` choose what is copied; either counts
// only when the target has that buffer, and an image that is not chosen is not looked at. When both are copied, the
// sprite's width is the row length of both images.
void BlitFromFramebuffer(toolkit& t, Sprite_c& s, DepthBuffer_c& d, int x, int y, int w, int h, int dst_x, int dst_y,
                         bool colour, bool depth);

// From (x, y) of the images to (dst_x, dst_y) of the target, by the same rules.
void BlitToFramebuffer(toolkit& t, Sprite_c& s, DepthBuffer_c& d, int x, int y, int w, int h, int dst_x, int dst_y,
                       bool colour, bool depth);

}  // namespace OffscreenSurface_c
