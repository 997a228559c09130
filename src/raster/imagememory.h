// Memory of images and depth images: 32-bit elements, one block each, on the heap.
#pragma once

#include <cerrno>
#include <cstring>

#include "util/exception.h"
#include "util/memorymanager/alignedmemory.h"

namespace raster {

// Triangles read and write whole groups of four pixels, of which the last can reach beyond the image: every image and
// frame buffer ends with its group.
constexpr std::size_t whole_groups(std::size_t bytes) { return (bytes + 15) & ~std::size_t{15}; }

// An undefined block of width by height words, freed by _aligned_free. Throws RuntimeException*, also where the size
// is beyond what the machine can address.
inline void* allocate_image(unsigned int width, unsigned int height, std::size_t alignment) {
  std::size_t bytes = 0;
  if (__builtin_mul_overflow(std::size_t{width} * sizeof(unsigned int), std::size_t{height}, &bytes) ||
      std::size_t{width} > static_cast<std::size_t>(-1) / sizeof(unsigned int) || whole_groups(bytes) < bytes) {
    throw new RuntimeException(std::strerror(ENOMEM));
  }
  return _aligned_malloc(whole_groups(bytes), alignment);
}

}  // namespace raster
