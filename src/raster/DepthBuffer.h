// A depth image, for targets other than a canvas.
#pragma once

class DepthBuffer_c {
 public:
  DepthBuffer_c() = default;
  ~DepthBuffer_c();
  DepthBuffer_c(const DepthBuffer_c&) = delete;
  DepthBuffer_c& operator=(const DepthBuffer_c&) = delete;

  // Replaces the image by an undefined one of width by height. Throws RuntimeException*.
  void Allocate(unsigned int width, unsigned int height);

  unsigned int width = 0;
  unsigned int height = 0;
  float* depth = nullptr;  // row-major, pitch equal to width, 64-byte aligned, owned
};
