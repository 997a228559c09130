#include "util/memorymanager/alignedmemory.h"

#include <sys/mman.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>

#include "util/exception.h"

namespace {

// Frames, pools and textures are read all over: with large pages the processor knows more of their addresses. A wish
// that the system may leave open, for the whole pages of a block. Blocks that all began with a large page drew slower.
void prefer_large_pages(void* p, std::size_t size) {
  constexpr std::uintptr_t page = 4096, large_page = 512 * page;
  if (size < large_page) return;
  const auto begin = (reinterpret_cast<std::uintptr_t>(p) + page - 1) / page * page;
  const auto end = (reinterpret_cast<std::uintptr_t>(p) + size) / page * page;
  madvise(reinterpret_cast<void*>(begin), end - begin, MADV_HUGEPAGE);
}

}  // namespace

void* _aligned_malloc(std::size_t size, std::size_t alignment) {
  void* p = nullptr;
  const int error = posix_memalign(&p, std::max<std::size_t>(alignment, 8), size);
  if (error != 0) throw new RuntimeException(std::strerror(error));
  prefer_large_pages(p, size);
  return p;
}

void* _aligned_realloc(void* p, std::size_t size, std::size_t /*alignment*/) {
  void* const moved = std::realloc(p, size);
  if (moved != nullptr) prefer_large_pages(moved, size);
  return moved;
}

void _aligned_free(void* p) { std::free(p); }
