// The pool that Java clients own: its collection asks the client, through the toolkit, to destroy what it can spare.
// The operations that need the toolkit are in toolkit/memorypool.cpp.
#pragma once

#include <jni.h>

#include "util/memorymanager/memorymanager.h"

class toolkit;

class memorypool : public memorymanager {
 public:
  // peer is the SseMemoryPool object; it is referenced weakly. Throws as memorymanager does.
  memorypool(toolkit& owner, jobject peer, unsigned int size);
  ~memorypool();

  void garbagecollect() override;

 private:
  toolkit* owner;
  jweak java_peer;
};
