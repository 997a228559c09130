// The system's image: 32-bit pixels with a trim box around them, and the ways of drawing it.
#pragma once

enum class ColourOp_e { modulate, none, mix, add, subtract };  // what a colour does to the image
enum class BlendMode_e { replace, alpha, additive };           // what the outcome does to the target

// A shape of one span per row, to draw through. Its origin is given with each call.
struct SpanMask_s {
  int width, height;  // of the box around it, pixels
  int rows;           // elements of both arrays
  const int* starts;  // per row: first column
  const int* lengths;
};

// Where sprites go. The clip rectangle, right and bottom exclusive, lies inside the buffers; they share one row length.
struct SpriteTarget_s {
  unsigned int* colour;
  const float* depth;  // may be null for drawing without a depth test
  int pitch;           // pixels
  int clip_x0, clip_y0, clip_x1, clip_y1;
};

// Any values are welcome: what is outside the clip rectangle or has no area is not drawn.
struct RenderParams_s {
  int x = 0, y = 0;                  // where the top left of the full image goes
  float z = 0;                       // for HasDepth: pixels with z <= stored depth are drawn
  unsigned int colour = 0;           // operand of the colour operation
  int width = 0, height = 0;         // Scaled: target size of the full image; RenderTiled: the area
  const SpanMask_s* mask = nullptr;  // Masked
  int maskx = 0, masky = 0;          // origin of the mask on screen
};

// The corners of the full image: top left, top right, bottom left.
struct ParallelogramRenderParams {
  float x0, x1, x2;
  float y0, y1, y2;
  unsigned int unused = 0;  // never read
  unsigned int colour = 0;
  const SpanMask_s* mask = nullptr;
  int maskx = 0, masky = 0;
};

struct Sprite_c {
  int left = 0;                    // transparent columns trimmed at the left
  int top = 0;                     // rows trimmed at the top
  int right = 0;                   // columns trimmed at the right
  int bottom = 0;                  // rows trimmed at the bottom
  int width = 0;                   // stored columns
  int height = 0;                  // stored rows
  int pitch = 0;                   // row stride in pixels, always width after Allocate
  unsigned int* pixels = nullptr;  // 0xAARRGGBB, 16-byte aligned, owned

  Sprite_c() = default;
  ~Sprite_c();
  Sprite_c(const Sprite_c&) = delete;
  Sprite_c& operator=(const Sprite_c&) = delete;

  // With the margins. Margins of any value are legal, so the sums wrap.
  int full_width() const { return wrapping_sum(left, width, right); }
  int full_height() const { return wrapping_sum(top, height, bottom); }

  // Replaces the pixels by an undefined block of width by height; the margins stay. Throws RuntimeException*.
  void Allocate(unsigned int width, unsigned int height);

  // Fills the whole image from rows that are `stride` pixels apart. opaque: a word of 0 stays 0, any other gets the
  // alpha 255; otherwise the words are copied as they are.
  void Copy(const unsigned int* source, unsigned int stride, bool opaque);
  // The same into the rectangle w by h at (x, y), which must lie inside the image.
  void CopyRect(int x, int y, unsigned int w, unsigned int h, const unsigned int* source, unsigned int stride,
                bool opaque);

  // Replaces the alpha bytes alone. Channels 0, 1 and 2 take the source's red, green and blue byte; 3 takes 255 where
  // the source word is not 0, else 0.
  void CopyAlpha(const unsigned int* source, unsigned int stride, unsigned int channel);
  void CopyRectAlpha(int x, int y, unsigned int w, unsigned int h, const unsigned int* source, unsigned int stride,
                     unsigned int channel);

  // Fills the whole image through a palette. alpha null: index 0 is transparent, all others opaque; else alpha holds
  // the alpha byte of each pixel. stride is the row stride of both arrays in elements.
  void CopyFrom8Bit(const unsigned char* indices, const unsigned int* palette, const unsigned char* alpha,
                    unsigned int stride);

  // --- Drawing. The instances of each family are listed in SpriteInstances.h. ------------------------------------
  // Pixels are read some way ahead of those written: a sprite drawn onto its own pixels leaves undefined ones there.

  // As it stands, scaled (nearest sampling), depth-tested or through a mask. Depths are read, never written.
  template <ColourOp_e Op, BlendMode_e Blend, bool Scaled, bool Masked, bool HasColour, bool HasDepth>
  void Render(const RenderParams_s& params, const SpriteTarget_s& target) const;

  // Under an affine map, nearest sampling. Without area, and for images with a side of 2^19 or more, nothing is drawn.
  template <ColourOp_e Op, BlendMode_e Blend, bool Masked>
  void RenderParallelogram(const ParallelogramRenderParams& params, const SpriteTarget_s& target) const;

  // Repeated over the area.
  template <ColourOp_e Op, BlendMode_e Blend>
  void RenderTiled(const RenderParams_s& params, const SpriteTarget_s& target) const;

 private:
  static int wrapping_sum(int a, int b, int c) {
    return static_cast<int>(static_cast<unsigned int>(a) + static_cast<unsigned int>(b) + static_cast<unsigned int>(c));
  }
};
