#include "util/memorymanager/alignedmemory.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

#include "util/exception.h"

void* _aligned_malloc(std::size_t size, std::size_t alignment) {
  void* p = nullptr;
  const int error = posix_memalign(&p, std::max<std::size_t>(alignment, 8), size);
  if (error != 0) throw new RuntimeException(std::strerror(error));
  return p;
}

void* _aligned_realloc(void* p, std::size_t size, std::size_t /*alignment*/) { return std::realloc(p, size); }

void _aligned_free(void* p) { std::free(p); }
