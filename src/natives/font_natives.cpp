#include "natives/font_natives.h"

#include <algorithm>
#include <cstring>

namespace font_natives {

namespace {

// A local reference that does not outlive its glyph: fonts have more glyphs than a native has reference slots.
class local_reference {
 public:
  local_reference(JNIEnv* environment, jobject reference) : env(environment), object(reference) {}
  ~local_reference() {
    if (object != nullptr) env->DeleteLocalRef(object);
  }
  local_reference(const local_reference&) = delete;
  local_reference& operator=(const local_reference&) = delete;
  jbyteArray bytes() const { return static_cast<jbyteArray>(object); }

 private:
  JNIEnv* env;
  jobject object;
};

void check_indices(int glyph, const unsigned char* bytes, int length, int palette_length) {
  if (!contract::checked || palette_length >= no_palette || length == 0) return;
  const int largest = *std::max_element(bytes, bytes + length);
  if (largest >= palette_length && largest > 0) {
    contract::fail_array("palette: length %d, but glyphs[%d] uses index %d", palette_length, glyph, largest);
  }
}

}  // namespace

void check(JNIEnv* env, const arguments& from, int palette_length) {
  if (!contract::checked) return;
  const copied_jintArrayRO widths(env, from.widths);
  const copied_jintArrayRO heights(env, from.heights);
  const int glyphs = env->GetArrayLength(from.glyphs);
  const int sized = std::min({glyphs, widths.length(), heights.length()});
  for (int i = 0; i < glyphs; ++i) {
    const local_reference glyph(env, env->GetObjectArrayElement(from.glyphs, i));
    const copied_jbyteArrayRO bytes(env, glyph.bytes());
    int drawn = 0;
    if (bytes.array != nullptr && i < sized && widths.elements[i] > 0 && heights.elements[i] > 0) {
      const auto needed = static_cast<long long>(widths.elements[i]) * heights.elements[i];
      if (bytes.length() < needed) {
        contract::fail_array("glyphs[%d]: length %d, %lld needed", i, bytes.length(), needed);
      }
      drawn = static_cast<int>(needed);
    }
    check_indices(i, reinterpret_cast<const unsigned char*>(bytes.elements), drawn, palette_length);
  }
}

void load_metrics(JNIEnv* env, memorymanager* pool, const arguments& from, font_metrics& metrics) {
  const copied_jintArrayRO widths(env, from.widths);
  const copied_jintArrayRO heights(env, from.heights);
  const copied_jintArrayRO y_offsets(env, from.y_offsets);
  const copied_jintArrayRO x_offsets(env, from.x_offsets);
  metrics.widths = widths.toSharedarray<int>(pool);
  metrics.heights = heights.toSharedarray<int>(pool);
  metrics.y_offsets = y_offsets.toSharedarray<int>(pool);
  metrics.x_offsets = x_offsets.toSharedarray<int>(pool);
}

void load_glyphs(JNIEnv* env, memorymanager* pool, jobjectArray from, int palette_length, const font_metrics& metrics,
                 glyph_bitmaps& glyphs) {
  glyph_bitmaps loaded(env->GetArrayLength(from));
  glyphs.swap(loaded);
  for (int i = 0; i < glyphs.count; ++i) {
    const local_reference glyph(env, env->GetObjectArrayElement(from, i));
    const copied_jbyteArrayRO bytes(env, glyph.bytes());
    if (bytes.array == nullptr) continue;
    const int length = bytes.length();
    glyphs[i] = sharedarray<unsigned char>::allocate(*pool, static_cast<unsigned int>(length));
    std::memcpy(glyphs[i].data(), bytes.elements, static_cast<unsigned int>(length));
    const glyph::bitmap drawn = glyph_bitmap(glyphs, metrics, static_cast<short>(i));
    check_indices(i, drawn.bytes, drawn.width * drawn.height, palette_length);
  }
}

}  // namespace font_natives
