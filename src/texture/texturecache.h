// The textures of the client: the attributes of every id, and the pixels of the 200 textures that were used last.
//
// Pixels are fetched when a visible face needs them: gettex asks the client, which answers with an upload from inside
// that call. So nothing of Java may be pinned by who calls gettex. A texture is 128 by 128 pixel words with a row
// stride of 256; it is softened when it is uploaded.
#pragma once

#include <jni.h>

#include <cstdint>

#include "maths/Vector4.h"
#include "util/memorymanager/simplearray.h"

// The attributes of a texture id. The lettered ones are stored for the client.
struct texturemetrics {
  unsigned short average_hsl = 0;   // HSL word that stands for the texture in a plan view
  unsigned int alpha_kind = 0;      // 1: zero pixels are holes; 2: blends
  unsigned char lighting_kind = 0;  // material: 6 unlit, 4 without grey tint, 4, 8 and 9 translucent on ground
  unsigned char attribute_a = 0;
  unsigned int attribute_b = 0;
  bool attribute_c = false;
  unsigned char grey_blend = 0;  // tint towards grey of ground vertices, out of 256
  unsigned char brighten = 0;    // extra brightness of ground vertices, out of 256
  signed char scroll_u = 0;      // 1/64 of the width per second
  signed char scroll_v = 0;
  bool flat_colour = false;  // may be replaced by its flat colour
  bool do_not_draw = false;  // faces with it are not built
  bool attribute_d = false;
  bool wrap_u = false;  // blur and sampling wrap along the axis, else they clamp
  bool wrap_v = false;
  unsigned char attribute_e = 0;
  bool attribute_f = false;
  bool attribute_g = false;
  unsigned int attribute_h = 0;

  void set(unsigned short hsl, unsigned int alpha, unsigned char lighting, unsigned char a, unsigned int b, bool c,
           unsigned char grey, unsigned char bright, signed char u, signed char v, bool flat, bool no_draw, bool d,
           bool wraps_u, bool wraps_v, unsigned char e, bool f, bool g, unsigned int h) {
    *this = {hsl, alpha, lighting, a, b, c, grey, bright, u, v, flat, no_draw, d, wraps_u, wraps_v, e, f, g, h};
  }
};

// A slot of the cache: the attributes as they came with the pixels, and where the pixels are.
struct alignas(16) cachedtexture : texturemetrics {
  Vector4_s offset_u = {};  // current scroll offset in texels, in all four lanes
  Vector4_s offset_v = {};
  bool scroll_pending = false;     // used since the last service
  unsigned int* texels = nullptr;  // set once
};

class alignas(16) texturecache {
 public:
  static constexpr int slots = 200;
  static constexpr int size = 128;    // of a texture, both ways
  static constexpr int stride = 256;  // of a row of texels: the atlas holds two slots side by side
  static constexpr int texture_pixels = size * size;
  static constexpr unsigned short no_texture = 65535;

  // source: the client's texture source, referenced weakly; count: the number of ids, 0 or more. All attributes are
  // zero until they are uploaded. Throws RuntimeException* or OutOfMemory* when there is no memory.
  texturecache(JNIEnv* env, jobject source, int count);
  virtual ~texturecache();
  texturecache(const texturecache&) = delete;
  texturecache& operator=(const texturecache&) = delete;

  // The record of the texture, which becomes the most recently used one; null for no_texture and when the client does
  // not deliver it. Can call into Java, and then moves the pixels of other textures out.
  cachedtexture* gettex(unsigned short id);

  // The attributes of the id, which must lie below count(); null for no_texture.
  texturemetrics* getmetrics(unsigned short id) { return id == no_texture ? nullptr : &metrics[id]; }
  int count() const { return metrics.count; }

  // Puts texture_pixels pixels, row by row, into the least recently used slot. The slot stays the next to go until
  // gettex uses it. An owner with id 255 leaves its stale entry behind when it goes: 255 is also the mark of "none".
  void upload_texture(unsigned short id, const unsigned int* pixels, const texturemetrics& fields);

  // Replaces the attributes of the id; a cached copy keeps its own.
  void upload_texturemetrics(unsigned short id, const texturemetrics& fields) { metrics[id] = fields; }

  // Once per frame: moves the scroll offsets of the textures used since the last call. time: milliseconds, 0 or more,
  // in a cycle of 128 seconds.
  void service(int time);

  // The pixels into the slot as they are.
  void copy_texture(const unsigned int* pixels, int slot);
  // The pixels into the slot through a blur of five by five taps. Unless opaque, a zero word is a hole: it stays one
  // and lends no colour to its neighbours. Samples beyond an edge wrap or clamp.
  void copy_and_blur_texture(const unsigned int* pixels, int slot, bool wrap_u, bool wrap_v, bool opaque);

  // The Java monitor of the texture source, taken only when several threads use the toolkit.
  void monitor_enter();
  void monitor_exit();

 protected:
  // Asks the client to upload the texture now; true when it says that it did.
  virtual bool request_texture(unsigned short id) = 0;
  virtual bool several_threads() const = 0;

 private:
  // Both as slot number and as id of a slot's owner.
  static constexpr int none = 255;

  JNIEnv* get_env() const;
  void use(std::uint8_t slot);

  unsigned int* pixels;
  cachedtexture records[slots];
  simplearray<texturemetrics> metrics;
  std::uint8_t slot_of_id[65536];
  unsigned short id_of_slot[slots];
  std::uint8_t lru_head, lru_tail;  // least and most recently used slot
  std::uint8_t lru_next[slots], lru_prev[slots];
  std::uint8_t scroll_count;         // slots in scroll_slots
  std::uint8_t scroll_slots[slots];  // scrolling textures used since the last service
  bool scroll_listed[slots];         // a slot stands in scroll_slots, whoever owns it by now
  JavaVM* vm = nullptr;
  jweak monitor;
};
