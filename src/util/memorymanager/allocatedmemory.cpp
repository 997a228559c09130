#include "util/memorymanager/allocatedmemory.h"

#include <cstring>

#include "util/assertion.h"
#include "util/memorymanager/allocatedmemory_autopointer.h"

int allocatedmemory::allocated_size = 0;

void allocatedmemory::relocate(unsigned char* to) {
  if (to == address) return;
  std::memmove(to, address, static_cast<unsigned int>(length));
  rebase(to);
}

void allocatedmemory::rebase(unsigned char* to) {
  address = to;
  for (linkable* node = handles.next; node != &handles; node = node->next) {
    static_cast<allocatedmemory_autopointer*>(node)->address = to;
  }
}

void allocatedmemory::resize(int newlength) {
  assertion::require(newlength <= length, "newlength<=length", "../util/memorymanager/allocatedmemory", 44,
                     "void allocatedmemory::resize(s32)");
  allocated_size -= length - newlength;
  length = newlength;
}

void allocatedmemory::deallocate() {
  allocated_size -= length;
  unlink();
  rebase(nullptr);
  delete this;
}

void allocatedmemory::invalidate() {
  allocated_size -= length;
  length = 0;
  rebase(nullptr);
}
