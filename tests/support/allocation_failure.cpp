#include "support/allocation_failure.h"

#include <malloc.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <utility>
#include <vector>

namespace {

std::atomic<unsigned long> allocations = 0;
int memalign_countdown = 0;
int memalign_error = 0;
bool realloc_fails = false;
bool realloc_moves = false;
unsigned int realloc_phase = 0;

}  // namespace

void allocation_failure::fail_memalign(int n, int error) {
  memalign_countdown = n;
  memalign_error = error;
}
unsigned long allocation_failure::count() { return allocations; }
void allocation_failure::fail_realloc(bool fail) { realloc_fails = fail; }
void allocation_failure::move_realloc(bool move, unsigned int phase) {
  realloc_moves = move;
  realloc_phase = phase;
}
void allocation_failure::none() {
  memalign_countdown = 0;
  realloc_fails = realloc_moves = false;
}

// operator new(size_t), by its name in each word size.
#ifdef __x86_64__
#define VELMARK5_NEW(prefix) prefix##_Znwm
#else
#define VELMARK5_NEW(prefix) prefix##_Znwj
#endif

extern "C" {

void* __real_malloc(std::size_t size);
void* VELMARK5_NEW(__real_)(std::size_t size);
int __real_posix_memalign(void** out, std::size_t alignment, std::size_t size);
void* __real_realloc(void* p, std::size_t size);

void* __wrap_malloc(std::size_t size) {
  ++allocations;
  return __real_malloc(size);
}
void* VELMARK5_NEW(__wrap_)(std::size_t size) {
  ++allocations;
  return VELMARK5_NEW(__real_)(size);
}

int __wrap_posix_memalign(void** out, std::size_t alignment, std::size_t size) {
  ++allocations;
  if (memalign_countdown > 0 && --memalign_countdown == 0) return memalign_error;
  return __real_posix_memalign(out, alignment, size);
}

void* __wrap_realloc(void* p, std::size_t size) {
  ++allocations;
  if (realloc_fails) {
    errno = ENOMEM;
    return nullptr;
  }
  if (!realloc_moves || p == nullptr) return __real_realloc(p, size);
  // Blocks of the heap lie at any multiple of 16: one of many has the phase.
  std::vector<void*> others;
  void* moved = nullptr;
  for (int i = 0; i < 200 && moved == nullptr; ++i) {
    void* const candidate = std::malloc(size + static_cast<std::size_t>(i % 8) * 16);
    const bool right = (reinterpret_cast<std::uintptr_t>(candidate) & 127) == realloc_phase;
    (right ? moved : others.emplace_back()) = candidate;
  }
  for (void* other : others) std::free(other);
  if (moved == nullptr) return __real_realloc(p, size);
  const std::size_t old_size = malloc_usable_size(p);
  std::memcpy(moved, p, std::min(old_size, size));
  std::memset(p, 0xDD, old_size);
  std::free(p);
  return moved;
}
}
