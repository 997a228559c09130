#include "texture/texturecache.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "util/memorymanager/alignedmemory.h"

namespace {

// The first pixel of a slot: two slots share the rows of the atlas.
constexpr int slot_offset(int slot) { return ((slot / 2) * texturecache::stride + (slot & 1)) * texturecache::size; }

constexpr std::size_t atlas_bytes = sizeof(unsigned int) * texturecache::slots * texturecache::texture_pixels;
static_assert(atlas_bytes == 0xC80000);

}  // namespace

texturecache::texturecache(JNIEnv* env, jobject source, int count) : metrics(count) {
  pixels = static_cast<unsigned int*>(_aligned_malloc(atlas_bytes, 64));
  env->GetJavaVM(&vm);
  monitor = env->NewWeakGlobalRef(source);

  for (int slot = 0; slot < slots; ++slot) {
    records[slot].texels = pixels + slot_offset(slot);
    id_of_slot[slot] = none;
    lru_next[slot] = static_cast<std::uint8_t>(slot + 1);
    lru_prev[slot] = static_cast<std::uint8_t>(slot - 1);
    scroll_listed[slot] = false;
  }
  lru_head = 0;
  lru_tail = slots - 1;
  lru_prev[lru_head] = none;
  lru_next[lru_tail] = none;
  std::memset(slot_of_id, none, sizeof slot_of_id);
  scroll_count = 0;
}

texturecache::~texturecache() {
  _aligned_free(pixels);
  get_env()->DeleteWeakGlobalRef(monitor);
}

cachedtexture* texturecache::gettex(unsigned short id) {
  if (id == no_texture) return nullptr;
  std::uint8_t slot = slot_of_id[id];
  if (slot == none) {
    if (!request_texture(id)) return nullptr;
    slot = slot_of_id[id];
    if (slot == none) return nullptr;  // the client said yes and has uploaded nothing
  }
  use(slot);

  cachedtexture& record = records[slot];
  if (!record.scroll_pending && (record.scroll_u != 0 || record.scroll_v != 0)) {
    record.scroll_pending = true;
    // A slot that was uploaded again since its last use is listed already.
    if (!scroll_listed[slot]) {
      scroll_listed[slot] = true;
      scroll_slots[scroll_count++] = slot;
    }
  }
  return &record;
}

// Makes the slot the most recently used one.
void texturecache::use(std::uint8_t slot) {
  if (slot == lru_tail) return;
  const std::uint8_t before = lru_prev[slot];
  const std::uint8_t after = lru_next[slot];
  if (before == none) {
    lru_head = after;
  } else {
    lru_next[before] = after;
  }
  lru_prev[after] = before;

  lru_next[lru_tail] = slot;
  lru_prev[slot] = lru_tail;
  lru_next[slot] = none;
  lru_tail = slot;
}

void texturecache::upload_texture(unsigned short id, const unsigned int* source, const texturemetrics& fields) {
  const std::uint8_t slot = lru_head;
  const unsigned short owner = id_of_slot[slot];
  if (owner != none) slot_of_id[owner] = none;
  id_of_slot[slot] = id;
  slot_of_id[id] = slot;

  cachedtexture& record = records[slot];
  static_cast<texturemetrics&>(record) = fields;
  record.offset_u = {};
  record.offset_v = {};
  record.scroll_pending = false;
  copy_and_blur_texture(source, slot, fields.wrap_u, fields.wrap_v, fields.alpha_kind != 1);
}

void texturecache::service(int time) {
  const float seconds = static_cast<float>(time % 128000) / 1000.0f;
  const auto offset = [seconds](signed char speed) {
    const float texels = std::fmod(static_cast<float>(speed) * seconds * 0.015625f * 128.0f, 128.0f);
    return Vector4_s{texels, texels, texels, texels};
  };
  for (int i = 0; i < scroll_count; ++i) {
    const std::uint8_t slot = scroll_slots[i];
    cachedtexture& record = records[slot];
    record.offset_u = offset(record.scroll_u);
    record.offset_v = offset(record.scroll_v);
    record.scroll_pending = false;
    scroll_listed[slot] = false;
  }
  scroll_count = 0;
}

void texturecache::copy_texture(const unsigned int* source, int slot) {
  unsigned int* row = pixels + slot_offset(slot);
  for (int y = 0; y < size; ++y, row += stride, source += size) std::copy(source, source + size, row);
}

void texturecache::monitor_enter() {
  if (several_threads()) get_env()->MonitorEnter(monitor);
}

void texturecache::monitor_exit() {
  if (several_threads()) get_env()->MonitorExit(monitor);
}

JNIEnv* texturecache::get_env() const {
  void* env = nullptr;
  vm->GetEnv(&env, 0x10001);
  return static_cast<JNIEnv*>(env);
}
