// The drawing of one model by compile-time switches: vertices into the thread's scratch, then face by face through the
// cheapest rejections first, light, and one triangle instance. Opaque faces come first, translucent ones second, both
// in face order; the depth buffer does the rest.
#pragma once

#include <bit>
#include <cstdint>

#include "model/model.h"
#include "model/model_lighting.h"
#include "raster/Projection.h"
#include "raster/Triangle.h"
#include "texture/texturecache.h"
#include "toolkit/threadresource.h"
#include "toolkit/toolkit.h"

template <bool POINTLIT, bool DISTANCEFOG, bool HEIGHTFOG, bool COLOUR, bool DEPTH>
class face_drawer {
 public:
  face_drawer(model& drawn, threadresource& scratch)
      : mesh(drawn),
        resource(scratch),
        scene(*toolkit::m_pInstance),
        flat_factor(512.0f / static_cast<float>(drawn.contrast)),
        smooth_factor(768.0f / static_cast<float>(drawn.contrast)) {
    if constexpr (HEIGHTFOG) triangle.fogcolour = Rasterizer_n::m_HeightFogColour;
  }

  void draw_all() {
    if (!mesh.hasalpha) {
      draw_pass<pass::all>();
    } else {
      draw_pass<pass::opaque>();
      draw_pass<pass::translucent>();
    }
  }

 private:
  enum class pass { all, opaque, translucent };
  static constexpr auto fog = Rasterizer_n::FogMode_e((DISTANCEFOG ? 2 : 0) + (HEIGHTFOG ? 1 : 0));
  static constexpr unsigned int blending_texture = 2;
  static constexpr unsigned int keyed_texture = 1;
  static constexpr unsigned char unlit_material = 6;
  static constexpr unsigned char invisible = 255;

  // The texture of a face; null for none, and when the client does not deliver it. Can call into Java: what was read
  // from the model's arrays before is stale.
  cachedtexture* texture_of(int f) {
    if (f >= mesh.texfacecount || scene.textures == nullptr) return nullptr;
    return scene.textures->gettex(mesh.ftex[f]);
  }

  template <pass P>
  void draw_pass() {
    for (int f = 0; f < mesh.facecount; ++f) {
      const unsigned char type = mesh.ftype.address != nullptr ? mesh.ftype[f] : FT_SMOOTH;
      const unsigned char transparency = mesh.falpha.address != nullptr ? mesh.falpha[f] : 0;
      if (type == FT_HIDDEN || transparency == invisible) continue;
      if constexpr (P == pass::opaque) {
        if (transparency != 0 || has_blending_texture(f)) continue;
      }
      if constexpr (P == pass::translucent) {
        if (transparency == 0 && !has_blending_texture(f)) continue;
      }
      draw_face(f, type, transparency);
    }
  }

  bool has_blending_texture(int f) {
    const cachedtexture* const texture = texture_of(f);
    return texture != nullptr && texture->alpha_kind == blending_texture;
  }

  void draw_face(int f, unsigned char type, unsigned char transparency) {
    const int a = mesh.fa[f], b = mesh.fb[f], c = mesh.fc[f];
    const int flags = resource.vertex_flags[a] & resource.vertex_flags[b] & resource.vertex_flags[c];
    if (flags != Rasterizer_n::CullFlagsVisible) return;
    // Whole registers: the triangle stage loads them whole, and would wait for parts.
    const auto copy = [](Vector4_s& out, const Vector4_s& in) { SSEMath::store(&out.x, SSEMath::load(&in.x)); };
    copy(triangle.vertex[0], resource.vertices[a]);
    copy(triangle.vertex[1], resource.vertices[b]);
    copy(triangle.vertex[2], resource.vertices[c]);
    if (!Rasterizer_n::FacesViewer(triangle.vertex[0], triangle.vertex[1], triangle.vertex[2])) return;
    using namespace Rasterizer_n;
    if constexpr (!COLOUR) {
      RenderTriangle<ShadeMode_e::Flat, TexAddressMode_e::GroundWrap, TexAddressMode_e::GroundWrap, false,
                     FogMode_e::None, BlendMode_e::Opaque, false, false, true, false, true>(triangle);
    } else {
      if (HEIGHTFOG && !fog_corners(a, b, c)) return;
      const auto& corners = mesh.fcolours[f].corner;
      alignas(16) unsigned int words[4] = {corners[0], corners[1], corners[2], 0};
      const cachedtexture* const texture = texture_of(f);
      if (texture == nullptr || texture->lighting_kind != unlit_material) light_face(f, type, a, b, c, words);
      for (int k = 0; k < 3; ++k) expand(words[k], triangle.colour[k]);
      triangle.alpha = (255u - transparency) * 0x10001u;
      if (texture == nullptr || texture->texels == nullptr) {
        draw_untextured(transparency != 0);
        return;
      }
      place_texture(f, *texture);
      if (transparency != 0 || texture->alpha_kind == blending_texture) mesh.hasalpha = true;
      if (texture->wrap_u || texture->wrap_v) {
        draw_textured<TexAddressMode_e::Wrap>(texture->alpha_kind, transparency != 0);
      } else {
        draw_textured<TexAddressMode_e::Clamp>(texture->alpha_kind, transparency != 0);
      }
    }
  }

  // Height fog of the corners; false when one of them lies wholly in the fog.
  bool fog_corners(int a, int b, int c) {
    using namespace SSEMath;
    const auto word = [this](int v) { return std::bit_cast<float>(resource.vertex_words[v]); };
    const Float4 height = floats(word(a), word(b), word(c), 1) - splat(scene.underwater_height_f);
    const Float4 factor = min(max(height * splat(scene.underwater_scale), splat(0.0f)), splat(1.0f));
    store(&triangle.fogfactor.x, factor);
    const Vector4_s& f = triangle.fogfactor;
    return f.x != 1.0f && f.y != 1.0f && f.z != 1.0f;
  }

  // The normal that a smooth face has at a vertex.
  const Vector4_s& vertex_normal(int v) const {
    const bool shared = mesh.vsharednormal.address != nullptr && mesh.vsharednormal[v].w != 0.0f;
    return shared ? mesh.vsharednormal[v] : mesh.vnormal[v];
  }

  // Lights the words of the three corners.
  VELMARK5_LANE void light_face(int f, unsigned char type, int a, int b, int c, unsigned int* words) {
    if (type > FT_FLAT) return;
    const bool smooth = type == FT_SMOOTH;
    const Vector4_s& na = smooth ? vertex_normal(a) : mesh.fnormal[f];
    const Vector4_s& nb = smooth ? vertex_normal(b) : na;
    const Vector4_s& nc = smooth ? vertex_normal(c) : na;
    const float contrast_factor = smooth ? smooth_factor : flat_factor;
    const SSEMath::Int4 intensities = lighting::sun_intensities(scene, na, nb, nc, contrast_factor);
    SSEMath::store(words, lighting::sunlit_corners(scene, SSEMath::load(words), intensities));
    if constexpr (POINTLIT) {
      words[0] = lighting::pointlit(scene, mesh.lightpos, words[0], mesh.vpos[a], na);
      words[1] = lighting::pointlit(scene, mesh.lightpos, words[1], mesh.vpos[b], nb);
      words[2] = lighting::pointlit(scene, mesh.lightpos, words[2], mesh.vpos[c], nc);
    }
  }

  // Bytes to channels times 256.
  static void expand(unsigned int word, Rasterizer_n::VertexColour_s& out) {
    _mm_store_si128(reinterpret_cast<__m128i*>(&out),
                    _mm_unpacklo_epi8(_mm_setzero_si128(), _mm_cvtsi32_si128(static_cast<int>(word))));
  }

  // Each corner has a base of its own in the record.
  void place_texture(int f, const cachedtexture& texture) {
    const auto row = [](Vector4_s& out, float u, float v, const texture_coordinates& t) {
      const SSEMath::Float4 own{_mm_castpd_ps(_mm_load_sd(reinterpret_cast<const double*>(&t)))};
      SSEMath::store(&out.x, SSEMath::floats(u, v, u, v) + SSEMath::shuffle<0, 1, 0, 1>(own));
    };
    row(triangle.texcoord[0], texture.offset_u.z, texture.offset_v.z, mesh.fuv0[f]);
    row(triangle.texcoord[1], texture.offset_u.y, texture.offset_v.y, mesh.fuv1[f]);
    row(triangle.texcoord[2], texture.offset_u.x, texture.offset_v.x, mesh.fuv2[f]);
    triangle.texture[0] = texture.texels;
  }

  void draw_untextured(bool translucent) const {
    using namespace Rasterizer_n;
    constexpr auto address = TexAddressMode_e::GroundWrap;
    if (translucent) {
      RenderTriangle<ShadeMode_e::Smooth, address, address, false, fog, BlendMode_e::ConstantAlpha, false, false, false,
                     true, DEPTH>(triangle);
    } else {
      RenderTriangle<ShadeMode_e::Smooth, address, address, false, fog, BlendMode_e::Opaque, false, false, true, true,
                     DEPTH>(triangle);
    }
  }

  template <Rasterizer_n::TexAddressMode_e Address>
  void draw_textured(unsigned int alpha_kind, bool translucent) const {
    using namespace Rasterizer_n;
    constexpr auto shade = ShadeMode_e::Textured;
    if (alpha_kind == blending_texture) {
      // Under height fog these faces leave the depth alone.
      RenderTriangle<shade, Address, Address, false, fog, BlendMode_e::PixelAlpha, false, false, !HEIGHTFOG, true,
                     DEPTH>(triangle);
    } else if (alpha_kind == keyed_texture) {
      draw_keyed<Address, true>(translucent);
    } else {
      draw_keyed<Address, false>(translucent);
    }
  }

  template <Rasterizer_n::TexAddressMode_e Address, bool ColourKey>
  void draw_keyed(bool translucent) const {
    using namespace Rasterizer_n;
    constexpr auto shade = ShadeMode_e::Textured;
    if (translucent) {
      RenderTriangle<shade, Address, Address, false, fog, BlendMode_e::ConstantAlpha, ColourKey, false, true, true,
                     DEPTH>(triangle);
    } else {
      RenderTriangle<shade, Address, Address, false, fog, BlendMode_e::Opaque, ColourKey, false, true, true, DEPTH>(
          triangle);
    }
  }

  model& mesh;
  threadresource& resource;
  const toolkit& scene;
  const float flat_factor, smooth_factor;
  Rasterizer_n::Triangle_s triangle;
};

template <bool POINTLIT, bool DISTANCEFOG, bool HEIGHTFOG, bool COLOUR, bool DEPTH>
void model::render2(threadresource& resource, const Matrix_c& world, const Matrix_c& modelviewprojection) {
  using namespace SSEMath;
  for (int i = 0; i < meshvertexcount; ++i) {
    const Float4 p = load(&vpos[i].x);
    const Float4 screen = Rasterizer_n::ToScreen(
        Rasterizer_n::Transform(modelviewprojection, broadcast<0>(p), broadcast<1>(p), broadcast<2>(p)));
    store(&resource.vertices[i].x, shuffle<0, 1, 2, 2>(screen));
    resource.vertex_flags[i] =
        static_cast<unsigned char>(Rasterizer_n::CullFlags(Rasterizer_n::PackForCulling<false>(screen)));
  }
  if constexpr (HEIGHTFOG) {
    // Up is minus y.
    for (int i = 0; i < vertexcount; ++i) {
      const Vector4_s& p = vpos[i];
      const float y = p.x * world.rows[0].y + p.y * world.rows[1].y + p.z * world.rows[2].y + world.rows[3].y;
      resource.vertex_words[i] = std::bit_cast<unsigned int>(-y);
    }
  }
  face_drawer<POINTLIT, DISTANCEFOG, HEIGHTFOG, COLOUR, DEPTH>(*this, resource).draw_all();
}
