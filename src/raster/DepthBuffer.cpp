#include "raster/DepthBuffer.h"

#include "raster/imagememory.h"

DepthBuffer_c::~DepthBuffer_c() { _aligned_free(depth); }

void DepthBuffer_c::Allocate(unsigned int image_width, unsigned int image_height) {
  _aligned_free(depth);
  depth = nullptr;
  width = height = 0;  // what remains when the allocation fails
  depth = static_cast<float*>(raster::allocate_image(image_width, image_height, 64));
  width = image_width;
  height = image_height;
}
