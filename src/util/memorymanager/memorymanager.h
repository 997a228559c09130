// A pool of movable blocks in one contiguous storage, served by a bump pointer. Freed space comes back by sliding the
// live blocks down; when that is not enough the pool asks its client to drop objects, and then grows by a tenth.
//
// An allocation can therefore move every block of the pool and can call into the client. Re-read the address of a
// handle after each one.
#pragma once

#include "util/memorymanager/allocatedmemory_autopointer.h"

class memorymanager {
 public:
  // Bytes behind the usable size of every storage; no fit test counts them.
  static constexpr unsigned int slack = 204800;

  // A pool of `size` usable bytes, zeroed. Throws RuntimeException* or OutOfMemory*.
  explicit memorymanager(unsigned int size);

  // Frees the storage. Handles that outlive the pool read null, and their destruction is legal.
  ~memorymanager();

  memorymanager(const memorymanager&) = delete;
  memorymanager& operator=(const memorymanager&) = delete;

  // Hooks of a derived pool, in the order of their slots.
  virtual void garbagecollect() {}
  virtual void monitor_enter() {}
  virtual void monitor_exit() {}
  virtual unsigned char* defragment();  // returns the first free address

  // A block of `length` bytes at a multiple of `alignment` (at least 8). Throws OutOfMemory* with the pool intact, and
  // IllegalStateException* after release_resources.
  allocatedmemory_autopointer allocate(unsigned int length) { return allocate(length, 8); }
  allocatedmemory_autopointer allocate(unsigned int length, unsigned int alignment);

  // Where a block of this length would go: tail, compaction, collection, growth, in this order.
  unsigned char* findspace(unsigned int length, unsigned int alignment) { return findspace(length, alignment, true); }
  unsigned char* findspace(unsigned int length, unsigned int alignment, bool collect);

  // Grows the storage by a tenth; throws OutOfMemory* when that cannot be had.
  void resizepool();

  // Frees the storage and clears every handle; the object stays, so that handles may still be destroyed.
  void release_resources();

  // True while an allocation is under way, as in the collection that it may call for.
  bool is_allocating() const { return allocating > 0; }

  // Bytes in use in all pools together.
  unsigned int get_size() const { return static_cast<unsigned int>(allocatedmemory::allocated_size); }

  // Bytes between the newest block and the end of the usable storage.
  unsigned int get_free_space() const;

  // Testing aid: every allocation moves the whole storage to a new place, so that an address that was kept over an
  // allocation is found at once.
  static bool move_at_every_allocation;

 protected:
  unsigned int size;    // usable bytes
  unsigned char* base;  // null after release_resources
  linkable blocks;      // ring of allocatedmemory: next is the newest and highest block, prev the oldest and lowest

 private:
  int allocating = 0;  // allocations under way: a collection may allocate too

  unsigned char* storage_end() const { return base + size; }
  allocatedmemory* newest() const { return static_cast<allocatedmemory*>(blocks.next); }
  void invalidate_blocks();
  void rebase_blocks(unsigned char* new_base);
  void move_storage();
};
