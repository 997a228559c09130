// A movable block of a pool. The descriptor knows every handle of its block, so that a move can patch the address that
// each of them caches.
#pragma once

#include "util/memorymanager/linkable.h"

class allocatedmemory : public linkable {
 public:
  allocatedmemory() { handles.makesentinel(); }

  unsigned char* endadr() const { return address + length; }

  // Moves the bytes to `to` and patches every handle. The ranges may overlap.
  void relocate(unsigned char* to);

  // The storage has already moved by `distance` bytes: patches the addresses only.
  void rebase(unsigned char* to);

  // Shrinks the block in place; a greater length ends the process.
  void resize(int newlength);

  // Takes the block out of its pool, clears every cached address and deletes the descriptor.
  void deallocate();

  // Forgets the bytes: handles read null. The descriptor stays in its ring until its last handle goes.
  void invalidate();

  unsigned char* address = nullptr;
  int length = 0;              // bytes in use
  unsigned int alignment = 1;  // power of two
  linkable handles;            // ring of allocatedmemory_autopointer

  static int allocated_size;  // sum of length over all live blocks of all pools
};
