// Natives of SseMemoryPool ("ba").
#include "natives/in_use.h"
#include "natives/native.h"
#include "util/memorymanager/memorypool.h"

using namespace natives;

namespace {

// The callback that asks for memory runs inside an allocation, and the one that asks for a texture inside a draw: their
// pool must outlive them.
void not_needed(const memorymanager& pool) {
  if (contract::checked && pool.is_allocating()) contract::fail_state("pool: it is in the middle of an allocation");
  in_use::refuse(pool);
}

}  // namespace

VELMARK5_NATIVE(void) Java_ba_sa(JNIEnv* env, jobject peer, jint, jint size) {
  frame(env, [&] {
    toolkit& owner = current_toolkit();
    contract::not_negative("size", size);
    auto pool = std::make_unique<memorypool>(owner, peer, static_cast<unsigned int>(size));
    objconvert::set_memorypool(env, peer, pool.release());
  });
}

VELMARK5_NATIVE(void) Java_ba_ma(JNIEnv* env, jobject peer) {
  frame(env, [&] {
    // Only the storage goes: the weak reference to the peer stays until the process ends.
    if (memorymanager* pool = objconvert::get_memorypool(env, peer); pool != nullptr) {
      not_needed(*pool);
      pool->~memorymanager();
      ::operator delete(pool);
    }
    objconvert::set_memorypool(env, peer, nullptr);
  });
}

VELMARK5_NATIVE(void) Java_ba_ha(JNIEnv* env, jobject peer) {
  frame(env, [&] {
    memorymanager& pool = contract::object(objconvert::get_memorypool(env, peer));
    not_needed(pool);
    pool.release_resources();
    objconvert::set_memorypool(env, peer, nullptr);
  });
}

VELMARK5_NATIVE(void) Java_ba_u(JNIEnv*, jobject) {}
