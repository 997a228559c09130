#include "util/memorymanager/memorymanager.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <limits>
#include <vector>

#include "util/exception.h"
#include "util/memorymanager/alignedmemory.h"

namespace {

constexpr unsigned int storage_alignment = 128;

// After a collection, a pool with a smaller free tail than this grows at once.
constexpr unsigned int comfortable_tail = 307200;

unsigned char* align_up(unsigned char* p, unsigned int alignment) {
  const auto address = reinterpret_cast<std::uintptr_t>(p);
  return p + ((alignment - (address & (alignment - 1))) & (alignment - 1));
}

// True when length bytes at candidate end at or before limit; written without a sum that could wrap.
bool fits(const unsigned char* candidate, unsigned int length, const unsigned char* limit) {
  return candidate <= limit && static_cast<std::size_t>(limit - candidate) >= length;
}

[[noreturn]] void throw_growth_failed(std::uint64_t wanted) {
  char text[200];
  std::snprintf(text, sizeof text, "native(MPR: %d)", static_cast<int>(wanted >> 10));
  throw new OutOfMemory(text);
}

// Counts an allocation while it is under way, also when it fails.
class allocation_mark {
 public:
  explicit allocation_mark(int& count) : marks(count) { ++marks; }
  ~allocation_mark() { --marks; }
  allocation_mark(const allocation_mark&) = delete;
  allocation_mark& operator=(const allocation_mark&) = delete;

 private:
  int& marks;
};

}  // namespace

bool memorymanager::move_at_every_allocation = false;

memorymanager::memorymanager(unsigned int usable) : size(usable), base(nullptr) {
  blocks.makesentinel();
  const std::size_t total = std::size_t{size} + slack;
  if (total < size) throw new OutOfMemory("native(MPA)");
  base = static_cast<unsigned char*>(_aligned_malloc(total, storage_alignment));
  // An allocator that reports failure by null gets a second chance.
  if (base == nullptr) base = static_cast<unsigned char*>(_aligned_malloc(total, storage_alignment));
  if (base == nullptr) throw new OutOfMemory("native(MPA)");
  std::memset(base, 0, size);
}

memorymanager::~memorymanager() {
  invalidate_blocks();
  if (base != nullptr) _aligned_free(base);
  // Surviving descriptors leave the ring, whose sentinel goes with this object.
  while (!blocks.isempty()) blocks.next->unlink();
}

unsigned char* memorymanager::defragment() {
  // From the lowest block to the highest, each moves down onto the end of the one before.
  unsigned char* top = base;
  for (linkable* node = blocks.prev; node != &blocks;) {
    auto* block = static_cast<allocatedmemory*>(node);
    unsigned char* to = align_up(top, block->alignment);
    if (to <= block->address) {
      block->relocate(to);
      top = to + block->length;
      node = node->prev;
      continue;
    }

    // Storage that a growth moved can lie at another phase, so that alignment pushes blocks up, into the ones above. A
    // run of such blocks moves from its highest to its lowest. No push exceeds the greatest alignment, for which the
    // slack has room.
    linkable* const first = node;
    linkable* last = node;
    std::vector<unsigned char*> places;
    for (; node != &blocks; node = node->prev) {
      block = static_cast<allocatedmemory*>(node);
      to = align_up(top, block->alignment);
      if (to <= block->address) break;
      places.push_back(to);
      top = to + block->length;
      last = node;
    }
    for (;; last = last->next) {
      static_cast<allocatedmemory*>(last)->relocate(places.back());
      places.pop_back();
      if (last == first) break;
    }
  }
  return top;
}

allocatedmemory_autopointer memorymanager::allocate(unsigned int length, unsigned int alignment) {
  alignment = std::max(alignment, 8u);
  if (base == nullptr) throw new IllegalStateException("the pool's storage is released");
  // Lengths are signed. A longer block could not be had in 32 bits either.
  if (length > std::numeric_limits<int>::max()) throw_growth_failed(length);
  monitor_enter();
  if (move_at_every_allocation) move_storage();
  const allocation_mark mark(allocating);
  unsigned char* address = findspace(length, alignment, true);
  auto* block = new allocatedmemory;
  block->length = static_cast<int>(length);
  block->alignment = alignment;
  block->address = address;
  blocks.linkafter(*block);
  allocatedmemory::allocated_size += block->length;
  allocatedmemory_autopointer handle(block);
  monitor_exit();
  return handle;
}

unsigned char* memorymanager::findspace(unsigned int length, unsigned int alignment, bool collect) {
  for (;;) {
    if (blocks.isempty()) {
      // An empty pool takes any first block, up to the end of its slack; only a longer one makes it grow first.
      while (length > std::size_t{size} + slack) resizepool();
      return base;
    }

    unsigned char* candidate = align_up(newest()->endadr(), alignment);
    if (fits(candidate, length, storage_end())) return candidate;

    candidate = align_up(defragment(), alignment);
    if (fits(candidate, length, storage_end())) return candidate;

    if (!collect) {
      resizepool();
      continue;
    }
    garbagecollect();
    defragment();
    if (get_free_space() < comfortable_tail) resizepool();
    collect = false;
  }
}

void memorymanager::resizepool() {
  // Exact size times the single-precision 1.1 in extended precision, rounded to single, then truncated.
  const auto scaled = static_cast<float>(static_cast<long double>(size) * 1.1f);
  const auto newsize = static_cast<std::uint64_t>(scaled);
  unsigned char* moved = nullptr;
  const std::uint64_t total = newsize + slack;
  const bool grows = newsize > size && newsize <= std::numeric_limits<unsigned int>::max();
  if (grows && total <= std::numeric_limits<std::size_t>::max()) {
    moved = static_cast<unsigned char*>(_aligned_realloc(base, static_cast<std::size_t>(total), storage_alignment));
  }
  if (moved == nullptr) throw_growth_failed(newsize);
  rebase_blocks(moved);
  size = static_cast<unsigned int>(newsize);
}

void memorymanager::release_resources() {
  invalidate_blocks();
  _aligned_free(base);
  base = nullptr;
}

unsigned int memorymanager::get_free_space() const {
  if (blocks.isempty()) return size;
  return static_cast<unsigned int>(base + size - newest()->endadr());
}

void memorymanager::invalidate_blocks() {
  for (linkable* node = blocks.prev; node != &blocks; node = node->prev) {
    static_cast<allocatedmemory*>(node)->invalidate();
  }
}

void memorymanager::rebase_blocks(unsigned char* new_base) {
  unsigned char* const old_base = base;
  base = new_base;
  if (new_base == old_base) return;
  for (linkable* node = blocks.prev; node != &blocks; node = node->prev) {
    auto* block = static_cast<allocatedmemory*>(node);
    block->rebase(new_base + (block->address - old_base));
  }
}

void memorymanager::move_storage() {
  const std::size_t total = std::size_t{size} + slack;
  auto* moved = static_cast<unsigned char*>(_aligned_malloc(total, storage_alignment));
  std::memcpy(moved, base, total);
  unsigned char* const old_base = base;
  rebase_blocks(moved);
  _aligned_free(old_base);
  defragment();
}
