// Natives of SseToolkit ("ja"): the attributes and the pixels of textures.
#include "natives/native.h"
#include "texture/texturecache.h"

using namespace natives;

namespace {

// The cache that is to take an upload for the id.
void check_upload(const toolkit& instance, unsigned short id) {
  if (!contract::checked) return;
  if (instance.textures == nullptr) contract::fail_state("id: %u, but there is no texture source", id);
  const int count = instance.textures->count();
  if (id >= count) contract::fail_argument("id: %u is not below the number of textures, %d", id, count);
}

// Any boolean but 0 is true here.
texturemetrics fields_of(jshort average_hsl, jint alpha_kind, jbyte lighting_kind, jbyte attribute_a, jint attribute_b,
                         jboolean attribute_c, jbyte grey_blend, jbyte brighten, jbyte scroll_u, jbyte scroll_v,
                         jboolean flat_colour, jboolean do_not_draw, jboolean attribute_d, jboolean wrap_u,
                         jboolean wrap_v, jbyte attribute_e, jboolean attribute_f, jboolean attribute_g,
                         jint attribute_h) {
  const auto byte = [](jbyte value) { return static_cast<unsigned char>(value); };
  texturemetrics fields;
  fields.set(static_cast<unsigned short>(average_hsl), static_cast<unsigned int>(alpha_kind), byte(lighting_kind),
             byte(attribute_a), static_cast<unsigned int>(attribute_b), attribute_c != 0, byte(grey_blend),
             byte(brighten), scroll_u, scroll_v, flat_colour != 0, do_not_draw != 0, attribute_d != 0, wrap_u != 0,
             wrap_v != 0, byte(attribute_e), attribute_f != 0, attribute_g != 0,
             static_cast<unsigned int>(attribute_h));
  return fields;
}

}  // namespace

VELMARK5_NATIVE(void)
Java_ja_V(JNIEnv* env, jobject, jshort id, jshort average_hsl, jint alpha_kind, jbyte lighting_kind, jbyte attribute_a,
          jint attribute_b, jboolean attribute_c, jbyte grey_blend, jbyte brighten, jbyte scroll_u, jbyte scroll_v,
          jboolean flat_colour, jboolean do_not_draw, jboolean attribute_d, jboolean wrap_u, jboolean wrap_v,
          jbyte attribute_e, jboolean attribute_f, jboolean attribute_g, jint attribute_h) {
  frame(env, [&] {
    toolkit& instance = current_toolkit();
    const auto number = static_cast<unsigned short>(id);
    check_upload(instance, number);
    const texturemetrics fields =
        fields_of(average_hsl, alpha_kind, lighting_kind, attribute_a, attribute_b, attribute_c, grey_blend, brighten,
                  scroll_u, scroll_v, flat_colour, do_not_draw, attribute_d, wrap_u, wrap_v, attribute_e, attribute_f,
                  attribute_g, attribute_h);
    instance.upload_texturemetrics(number, fields);
  });
}

VELMARK5_NATIVE(void)
Java_ja_F(JNIEnv* env, jobject, jshort id, jintArray pixels, jshort average_hsl, jint alpha_kind, jbyte lighting_kind,
          jbyte attribute_a, jint attribute_b, jboolean attribute_c, jbyte grey_blend, jbyte brighten, jbyte scroll_u,
          jbyte scroll_v, jboolean flat_colour, jboolean do_not_draw, jboolean attribute_d, jboolean wrap_u,
          jboolean wrap_v, jbyte attribute_e, jboolean attribute_f, jboolean attribute_g, jint attribute_h) {
  frame(env, [&] {
    toolkit& instance = current_toolkit();
    const auto number = static_cast<unsigned short>(id);
    contract::not_null(pixels);
    check_upload(instance, number);
    const jint length = array_length(env, pixels);
    contract::array_is("pixels", length, texturecache::texture_pixels);
    const texturemetrics fields =
        fields_of(average_hsl, alpha_kind, lighting_kind, attribute_a, attribute_b, attribute_c, grey_blend, brighten,
                  scroll_u, scroll_v, flat_colour, do_not_draw, attribute_d, wrap_u, wrap_v, attribute_e, attribute_f,
                  attribute_g, attribute_h);
    const pinned_jintArray view(env, pixels, length);
    instance.upload_texture(number, reinterpret_cast<const unsigned int*>(view.elements), fields);
  });
}
