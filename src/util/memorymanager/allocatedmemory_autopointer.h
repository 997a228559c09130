// Counted handle of a movable block. It caches the block's address, which is right at all times; the block dies with
// its last handle.
#pragma once

#include "util/memorymanager/allocatedmemory.h"

class allocatedmemory_autopointer : public linkable {
 public:
  allocatedmemory_autopointer() = default;
  explicit allocatedmemory_autopointer(allocatedmemory* of) { join(of); }
  allocatedmemory_autopointer(const allocatedmemory_autopointer& other) : linkable() { join(other.block); }
  ~allocatedmemory_autopointer() { release(); }

  allocatedmemory_autopointer& operator=(const allocatedmemory_autopointer& other) {
    if (this == &other) return *this;
    release();
    join(other.block);
    return *this;
  }

  // Shrinks the block to `length` bytes.
  void resize(unsigned int length) { block->resize(static_cast<int>(length)); }

  unsigned char* address = nullptr;  // start of the block; any allocation from the pool can change it
  allocatedmemory* block = nullptr;  // null for an empty handle

 private:
  void join(allocatedmemory* of) {
    if (of == nullptr) return;
    block = of;
    address = of->address;
    of->handles.linkafter(*this);
  }

  void release() {
    if (block == nullptr) return;
    unlink();
    if (block->handles.isempty()) block->deallocate();
    block = nullptr;
    address = nullptr;
  }
};
