// Natives of SseClippingMask ("wa").
#include "natives/native.h"
#include "toolkit/clippingmask.h"

using namespace natives;

VELMARK5_NATIVE(void)
Java_wa_l(JNIEnv* env, jobject peer, jint, jobject pool, jint width, jint height, jintArray starts, jintArray lengths) {
  frame(env, [&] {
    memorymanager& memory = contract::object(objconvert::get_memorypool(env, pool));
    contract::array_holds("lengths", array_length(env, lengths), array_length(env, starts));
    const copied_jintArrayRO starts_view(env, starts);
    const copied_jintArrayRO lengths_view(env, lengths);
    auto mask = std::make_unique<clippingmask>(&memory, width, height, starts_view, lengths_view);
    objconvert::set_clippingmask(env, peer, mask.release());
  });
}

VELMARK5_NATIVE(void) Java_wa_ma(JNIEnv* env, jobject peer) {
  frame(env, [&] {
    delete objconvert::get_clippingmask(env, peer);
    objconvert::set_clippingmask(env, peer, nullptr);
  });
}
