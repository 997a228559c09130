// What a pool needs of the toolkit.
#include "util/memorymanager/memorypool.h"

#include "toolkit/toolkit.h"

memorypool::memorypool(toolkit& of, jobject peer, unsigned int usable)
    : memorymanager(usable), owner(&of), java_peer(of.get_env()->NewWeakGlobalRef(peer)) {}

memorypool::~memorypool() { owner->get_env()->DeleteWeakGlobalRef(java_peer); }

void memorypool::garbagecollect() {
  // A pool that outlives its toolkit has nobody to ask.
  if (owner == toolkit::live_instance) owner->garbagecollect();
}
