// The system's image: 32-bit pixels with a trim box around them.
#pragma once

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

 private:
  static int wrapping_sum(int a, int b, int c) {
    return static_cast<int>(static_cast<unsigned int>(a) + static_cast<unsigned int>(b) + static_cast<unsigned int>(c));
  }
};
