// Typed arrays over a pool: sharedarray and sharedarray2d share their block with their copies and move with it.
#pragma once

#include <algorithm>
#include <cstdint>
#include <limits>

#include "util/memorymanager/memorymanager.h"

template <class T>
class sharedarray : public allocatedmemory_autopointer {
 public:
  sharedarray() = default;

  // `count` elements from `pool`, not initialised beyond what the pool holds. Can move every block of the pool.
  static sharedarray allocate(memorymanager& pool, unsigned int count) {
    // Bytes that no pool can hold must not wrap to a few.
    const auto bytes = std::min<std::uint64_t>(std::uint64_t{count} * sizeof(T), std::numeric_limits<unsigned>::max());
    sharedarray array;
    static_cast<allocatedmemory_autopointer&>(array) = pool.allocate(static_cast<unsigned>(bytes), alignof(T));
    array.manager = &pool;
    return array;
  }

  // Valid until the next allocation from the pool; null for an empty array.
  T* data() const { return reinterpret_cast<T*>(address); }
  T& operator[](int i) const { return data()[i]; }

  // Elements of the block, 0 for an empty array.
  int count() const {
    return block == nullptr ? 0 : static_cast<int>(static_cast<unsigned>(block->length) / sizeof(T));
  }

  // Shrinks to `count` elements.
  void resize(unsigned int count) { allocatedmemory_autopointer::resize(static_cast<unsigned int>(count * sizeof(T))); }

  memorymanager* manager = nullptr;  // the pool it came from, null when empty
};

// Rows of different lengths, end to end.
template <class T>
class sharedarray2d {
 public:
  sharedarray<int> rows;  // two integers per row: start in data, number of elements
  sharedarray<T> data;
};
