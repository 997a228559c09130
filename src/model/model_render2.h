// The drawing of one model by compile-time switches: vertices into the thread's scratch, the faces that show, and for
// each of them light and one triangle instance. Opaque faces come first, translucent ones second, both in face order;
// the depth buffer does the rest.
#pragma once

#include <bit>
#include <cstdint>
#include <type_traits>

#include "model/model.h"
#include "model/model_culling.h"
#include "model/model_lighting.h"
#include "raster/Occlusion.h"
#include "raster/Rasterizer.h"
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
        sunlight(scene),
        flat_factor(SSEMath::splat(512.0f / static_cast<float>(drawn.contrast))),
        smooth_factor(SSEMath::splat(768.0f / static_cast<float>(drawn.contrast))),
        lights(scene, drawn.lightpos),
        textured_faces(scene.textures != nullptr ? drawn.texfacecount : 0) {
    if constexpr (HEIGHTFOG) triangle.fogcolour = Rasterizer_n::m_HeightFogColour;
  }

  void draw_all(culling::flag_summary flags) {
    read_arrays();
    if constexpr (COLOUR) prefetch_normals();
    culling::find_visible({fa, fb, fc}, mesh.facecount, resource, flags, visible);
    if constexpr (COLOUR && DEPTH) covered = culling::is_covered(mesh.meshvertexcount, resource, flags);
    if (!mesh.hasalpha) {
      draw_visible();
    } else {
      draw_pass<pass::opaque>();
      draw_pass<pass::translucent>();
    }
  }

 private:
  enum class pass { opaque, translucent };
  static constexpr auto fog = Rasterizer_n::FogMode_e((DISTANCEFOG ? 2 : 0) + (HEIGHTFOG ? 1 : 0));
  static constexpr unsigned int blending_texture = 2;
  static constexpr unsigned int keyed_texture = 1;
  static constexpr unsigned char unlit_material = 6;
  static constexpr unsigned char invisible = 255;

  using instance = void (*)(const Rasterizer_n::Triangle_s&);

  // The blocks stay in place until Java is called.
  void read_arrays() {
    fa = mesh.fa.data(), fb = mesh.fb.data(), fc = mesh.fc.data();
    fcolours = mesh.fcolours.data();
    ftex = mesh.ftex.data();
    fuv0 = mesh.fuv0.data(), fuv1 = mesh.fuv1.data(), fuv2 = mesh.fuv2.data();
    ftype = mesh.ftype.data();
    falpha = mesh.falpha.data();
    fnormal = mesh.fnormal.data();
    vnormal = mesh.vnormal.data();
    vsharednormal = mesh.vsharednormal.data();
    vpos = mesh.vpos.data();
  }

  // Read in no order. They arrive while the faces are culled.
  void prefetch_normals() const {
    culling::prefetch(vnormal, mesh.meshvertexcount * static_cast<int>(sizeof *vnormal));
  }

  // A word's faces, while those before them are drawn. Too far is harmless.
  void prefetch_faces(int first) const {
    if (first >= mesh.facecount || visible.word_of(first) == 0) return;
    constexpr int faces = culling::face_set::word_bits;
    culling::prefetch(fcolours + first, faces * static_cast<int>(sizeof *fcolours));
    if (first >= mesh.texfacecount) return;
    culling::prefetch(ftex + first, faces * static_cast<int>(sizeof *ftex));
    culling::prefetch(fuv0 + first, faces * static_cast<int>(sizeof *fuv0));
    culling::prefetch(fuv1 + first, faces * static_cast<int>(sizeof *fuv1));
    culling::prefetch(fuv2 + first, faces * static_cast<int>(sizeof *fuv2));
  }

  // The texture of a face; null for none, and when the client does not deliver it. Can call into Java.
  VELMARK5_LANE const cachedtexture* texture_of(int f) {
    if (f >= textured_faces) return nullptr;
    // The texture that was asked for last is still there. One that did not come is asked for again.
    if (ftex[f] != latest_id) ask_for(ftex[f]);
    return latest;
  }

  [[gnu::noinline]] void ask_for(unsigned short id) {
    latest = scene.textures->gettex(id);
    latest_id = latest != nullptr ? id : no_id;
    read_arrays();
    if (COLOUR && latest != nullptr) prepare(*latest);
  }

  unsigned char type_of(int f) const { return ftype != nullptr ? ftype[f] : FT_SMOOTH; }
  unsigned char transparency_of(int f) const { return falpha != nullptr ? falpha[f] : 0; }

  void draw_visible() {
    if constexpr (COLOUR) prefetch_faces(0);
    for (int first = 0; first < mesh.facecount; first += culling::face_set::word_bits) {
      if constexpr (COLOUR) prefetch_faces(first + culling::face_set::word_bits);
      for (std::uint32_t bits = visible.word_of(first); bits != 0; bits &= bits - 1) {
        const int f = first + std::countr_zero(bits);
        const unsigned char type = type_of(f), transparency = transparency_of(f);
        if (type != FT_HIDDEN && transparency != invisible) draw_face(f, type, transparency);
      }
    }
  }

  // Asks for the textures of faces that do not show, too.
  template <pass P>
  void draw_pass() {
    for (int f = 0; f < mesh.facecount; ++f) {
      const unsigned char type = type_of(f), transparency = transparency_of(f);
      if (type == FT_HIDDEN || transparency == invisible) continue;
      if constexpr (P == pass::opaque) {
        if (transparency != 0 || has_blending_texture(f)) continue;
      } else {
        if (transparency == 0 && !has_blending_texture(f)) continue;
      }
      if (visible.contains(f)) draw_face(f, type, transparency);
    }
  }

  bool has_blending_texture(int f) {
    const cachedtexture* const texture = texture_of(f);
    return texture != nullptr && texture->alpha_kind == blending_texture;
  }

  void draw_face(int f, unsigned char type, unsigned char transparency) {
    const int a = fa[f], b = fb[f], c = fc[f];
    // Whole registers: the triangle stage loads them whole, and would wait for parts.
    const auto copy = [](Vector4_s& out, const Vector4_s& in) { SSEMath::store(&out.x, SSEMath::load(&in.x)); };
    copy(triangle.vertex[0], resource.vertices[a]);
    copy(triangle.vertex[1], resource.vertices[b]);
    copy(triangle.vertex[2], resource.vertices[c]);
    using namespace Rasterizer_n;
    if constexpr (!COLOUR) {
      RenderTriangle<ShadeMode_e::Flat, TexAddressMode_e::GroundWrap, TexAddressMode_e::GroundWrap, false,
                     FogMode_e::None, BlendMode_e::Opaque, false, false, true, false, true>(triangle);
    } else {
      if (HEIGHTFOG && !fog_corners(a, b, c)) return;
      const cachedtexture* const texture = texture_of(f);
      const bool textured = texture != nullptr && texture->texels != nullptr;
      const bool translucent = transparency != 0;
      if (textured && (translucent || texture->alpha_kind == blending_texture)) mesh.hasalpha = true;
      if (DEPTH && (covered ? StaysInBox(triangle) : IsHidden(triangle))) return;
      if (type > FT_FLAT || (texture != nullptr && texture->lighting_kind == unlit_material)) {
        set_colours(SSEMath::widen_shifted(colours_of(f)));
      } else {
        light_face(f, type == FT_SMOOTH, a, b, c);
      }
      triangle.alpha = (255u - transparency) * 0x10001u;
      if (!textured) {
        draw_untextured(translucent);
        return;
      }
      place_texture(f);
      (translucent ? translucent_instance : opaque_instance)(triangle);
    }
  }

  // Height fog of the corners; false when one of them lies wholly in the fog.
  bool fog_corners(int a, int b, int c) {
    using namespace SSEMath;
    const auto word = [this](int v) { return std::bit_cast<float>(resource.vertex_words[v]); };
    const Float4 height = floats(word(a), word(b), word(c), 1) - splat(scene.underwater_height_f);
    const Float4 factor = min(max(height * splat(scene.underwater_scale), splat(0.0f)), splat(1.0f));
    store(&triangle.fogfactor.x, factor);
    return (lane_bits(equal(factor, splat(1.0f))) & 7) == 0;
  }

  // The words of the three corners.
  VELMARK5_LANE SSEMath::Int4 colours_of(int f) const {
    const unsigned int* const corner = fcolours[f].corner;
    const __m128i two = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(corner));
    return {_mm_unpacklo_epi64(two, _mm_cvtsi32_si128(static_cast<int>(corner[2])))};
  }

  // Each channel times 256, of the first two corners and of the third.
  VELMARK5_LANE void set_colours(SSEMath::Channels colours) {
    const auto store = [this](int k) { return reinterpret_cast<double*>(triangle.colour[k].channels); };
    const __m128d two = _mm_castsi128_pd(colours.low.v);
    _mm_store_sd(store(0), two);
    _mm_storeh_pd(store(1), two);
    _mm_store_sd(store(2), _mm_castsi128_pd(colours.high.v));
  }

  // The normal that a smooth face has at a vertex.
  VELMARK5_LANE const Vector4_s& vertex_normal(int v) const {
    const bool shared = vsharednormal != nullptr && vsharednormal[v].w != 0.0f;
    return shared ? vsharednormal[v] : vnormal[v];
  }

  VELMARK5_LANE void light_face(int f, bool smooth, int a, int b, int c) {
    const Vector4_s& na = smooth ? vertex_normal(a) : fnormal[f];
    const Vector4_s& nb = smooth ? vertex_normal(b) : na;
    const Vector4_s& nc = smooth ? vertex_normal(c) : na;
    const lighting::corner_vectors normals = lighting::by_lane(na, nb, nc);
    const SSEMath::Int4 intensities = sunlight.intensities(normals, smooth ? smooth_factor : flat_factor);
    SSEMath::Channels lit = sunlight.corners(colours_of(f), intensities);
    if constexpr (POINTLIT) lit = lights.corners(lit, lighting::by_lane(vpos[a], vpos[b], vpos[c]), normals);
    set_colours(lit);
  }

  // What all faces with the texture have in common.
  void prepare(const cachedtexture& texture) {
    triangle.texture[0] = texture.texels;
    // Each corner has a base of its own in the record.
    const auto base = [](float u, float v) { return SSEMath::floats(u, v, u, v); };
    bases[0] = base(texture.offset_u.z, texture.offset_v.z);
    bases[1] = base(texture.offset_u.y, texture.offset_v.y);
    bases[2] = base(texture.offset_u.x, texture.offset_v.x);
    if (texture.wrap_u || texture.wrap_v) {
      choose<Rasterizer_n::TexAddressMode_e::Wrap>(texture.alpha_kind);
    } else {
      choose<Rasterizer_n::TexAddressMode_e::Clamp>(texture.alpha_kind);
    }
  }

  VELMARK5_LANE void place_texture(int f) {
    const auto place = [this](std::size_t corner, const texture_coordinates& t) {
      const SSEMath::Float4 own{_mm_castpd_ps(_mm_load_sd(reinterpret_cast<const double*>(&t)))};
      SSEMath::store(&triangle.texcoord[corner].x, bases[corner] + SSEMath::shuffle<0, 1, 0, 1>(own));
    };
    place(0, fuv0[f]);
    place(1, fuv1[f]);
    place(2, fuv2[f]);
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

  // The instances that draw a texture's faces.
  template <Rasterizer_n::TexAddressMode_e Address>
  void choose(unsigned int alpha_kind) {
    using namespace Rasterizer_n;
    if (alpha_kind == blending_texture) {
      // Under height fog these faces leave the depth alone.
      opaque_instance = translucent_instance =
          RenderTriangle<ShadeMode_e::Textured, Address, Address, false, fog, BlendMode_e::PixelAlpha, false, false,
                         !HEIGHTFOG, true, DEPTH>;
    } else if (alpha_kind == keyed_texture) {
      choose_keyed<Address, true>();
    } else {
      choose_keyed<Address, false>();
    }
  }

  template <Rasterizer_n::TexAddressMode_e Address, bool ColourKey>
  void choose_keyed() {
    using namespace Rasterizer_n;
    constexpr auto shade = ShadeMode_e::Textured;
    opaque_instance =
        RenderTriangle<shade, Address, Address, false, fog, BlendMode_e::Opaque, ColourKey, false, true, true, DEPTH>;
    translucent_instance = RenderTriangle<shade, Address, Address, false, fog, BlendMode_e::ConstantAlpha, ColourKey,
                                          false, true, true, DEPTH>;
  }

  model& mesh;
  threadresource& resource;
  const toolkit& scene;
  const lighting::sun sunlight;
  const SSEMath::Float4 flat_factor, smooth_factor;
  struct no_lights {
    no_lights(const toolkit&, const Vector4_s*) {}
  };
  const std::conditional_t<POINTLIT, lighting::point_lights, no_lights> lights;

  const unsigned short *fa, *fb, *fc, *ftex;
  const face_colours* fcolours;
  const texture_coordinates *fuv0, *fuv1, *fuv2;
  const unsigned char *ftype, *falpha;
  const Vector4_s *fnormal, *vnormal, *vsharednormal, *vpos;

  const int textured_faces;
  static constexpr int no_id = -1;
  int latest_id = no_id;
  const cachedtexture* latest = nullptr;  // what the cache was asked for last, and what goes with it:
  SSEMath::Float4 bases[3];               // of texture coordinates, per corner
  instance opaque_instance, translucent_instance;

  Rasterizer_n::Triangle_s triangle;
  culling::face_set visible;
  bool covered = false;  // the whole model lies behind what is drawn, but for what leaves its box
};

template <bool POINTLIT, bool DISTANCEFOG, bool HEIGHTFOG, bool COLOUR, bool DEPTH>
void model::render2(threadresource& resource, const Matrix_c& world, const Matrix_c& modelviewprojection) {
  const culling::flag_summary vertex_flags =
      culling::project(vpos.data(), meshvertexcount, modelviewprojection, resource);
  if constexpr (HEIGHTFOG) culling::find_heights(vpos.data(), vertexcount, world, resource);
  face_drawer<POINTLIT, DISTANCEFOG, HEIGHTFOG, COLOUR, DEPTH>(*this, resource).draw_all(vertex_flags);
}
