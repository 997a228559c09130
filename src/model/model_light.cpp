// Normals, and the baked half of the lighting.
#include <algorithm>
#include <cmath>
#include <utility>

#include "maths/colourutils.h"
#include "model/model.h"
#include "model/model_lighting.h"
#include "texture/texturecache.h"
#include "toolkit/toolkit.h"
#include "util/assertion.h"

namespace {

// Normal of a face in extended precision, of unit length unless the face has no area; w 1.
Vector4_s face_normal(const Vector4_s& a, const Vector4_s& b, const Vector4_s& c) {
  using real = long double;
  const real e1[3] = {static_cast<real>(b.x) - a.x, static_cast<real>(b.y) - a.y, static_cast<real>(b.z) - a.z};
  const real e2[3] = {static_cast<real>(c.x) - a.x, static_cast<real>(c.y) - a.y, static_cast<real>(c.z) - a.z};
  real n[3] = {e1[1] * e2[2] - e1[2] * e2[1], e1[2] * e2[0] - e1[0] * e2[2], e1[0] * e2[1] - e1[1] * e2[0]};
  const real length = std::sqrt(n[0] * n[0] + n[1] * n[1] + n[2] * n[2]);
  if (length != 0) {
    for (real& lane : n) lane /= length;
  }
  return {static_cast<float>(n[0]), static_cast<float>(n[1]), static_cast<float>(n[2]), 1};
}

void add(Vector4_s& sum, const Vector4_s& n) {
  sum.x += n.x;
  sum.y += n.y;
  sum.z += n.z;
  sum.w += n.w;
}

// Share of grey in a colour: grey * g + rgb * (256 - g), out of 256. The grey follows the model's ambient level.
unsigned int tinted_grey(unsigned int rgb, unsigned int ambient, unsigned int g) {
  const unsigned int grey = ambient * 131586;
  const unsigned int grey_green = ambient < 128 ? grey & 0xFF00 : 0xFF00;
  const unsigned int grey_red_blue = ambient < 128 ? grey & 0xFF00FF : 0xFF00FF;
  const unsigned int red_blue = (grey_red_blue * g + (rgb & 0xFF00FF) * (256 - g)) & 0xFF00FF00;
  const unsigned int green = (grey_green * g + (rgb & 0xFF00) * (256 - g)) & 0xFF0000;
  return (red_blue + green) >> 8;
}

unsigned int brightened(unsigned int rgb, unsigned int b) {
  const auto channel = [b](unsigned int byte) { return std::min(byte * (b + 256), 65535u) >> 8; };
  return channel(rgb >> 16 & 0xFF) << 16 | channel(rgb >> 8 & 0xFF) << 8 | channel(rgb & 0xFF);
}

}  // namespace

void model::calculatenormals() {
  pool->monitor_enter();
  // Both or neither: one without the other would pass for complete.
  auto vertices = sharedarray<Vector4_s>::allocate(*pool, static_cast<unsigned int>(meshvertexcount));
  fnormal = sharedarray<Vector4_s>::allocate(*pool, facecount);
  vnormal = std::move(vertices);
  std::fill_n(vnormal.data(), meshvertexcount, Vector4_s{0, 0, 0, 0});
  for (int f = 0; f < facecount; ++f) {
    const Vector4_s n = face_normal(vpos[fa[f]], vpos[fb[f]], vpos[fc[f]]);
    if (ftype.block == nullptr || ftype[f] == FT_SMOOTH) {
      add(vnormal[fa[f]], n);
      add(vnormal[fb[f]], n);
      add(vnormal[fc[f]], n);
    } else if (ftype[f] == FT_FLAT) {
      fnormal[f] = n;
    }
  }
  // The mean of unit normals, which is itself no longer a unit.
  for (int i = 0; i < meshvertexcount; ++i) {
    Vector4_s& n = vnormal[i];
    if (n.w != 0) n = {n.x / n.w, n.y / n.w, n.z / n.w, 1};
  }
  pool->monitor_exit();
}

void model::light(bool) {
  assertion::require(fhsl.block != nullptr, "!fhsl.isnull()", "../model", 855, "void model::light(bool)");
  if (vnormal.block == nullptr) calculatenormals();
  if (fcolours.block == nullptr) {
    pool->monitor_enter();
    fcolours = sharedarray<face_colours>::allocate(*pool, facecount);
    pool->monitor_exit();
  }
  for (int f = 0; f < facecount; ++f) {
    const unsigned int rgb = light_getunlitrgb(fhsl[f], f < texfacecount ? ftex[f] : no_texture);
    const unsigned int opacity = falpha.block != nullptr ? 255u - falpha[f] : 255u;
    const unsigned int word = opacity << 24 | (rgb & 0xFFFFFF);
    if (ftype.block == nullptr || ftype[f] <= FT_FLAT) fcolours[f] = {{word, word, word}};
  }
  if ((functionmask & FM_KEEP_HSL) == 0) fhsl = {};
}

unsigned int model::light_getunlitrgb(unsigned int hsl, unsigned short texture) const {
  const auto level = static_cast<unsigned int>(ambient);
  const unsigned int scaled = ((hsl & 127) * level) >> 7;
  const unsigned int lightness = scaled > 1 ? std::min(scaled, 126u) : 2;
  unsigned int rgb = colourutils::hsl_2_rgb((hsl & 0xFF80) + lightness);
  // A model can outlive the toolkit that knew its textures.
  const texturemetrics* const metrics = toolkit::m_pInstance->get_texturemetrics(texture);
  if (metrics == nullptr) return rgb;
  if (metrics->grey_blend != 0) rgb = tinted_grey(rgb, level, metrics->grey_blend);
  if (metrics->brighten != 0) rgb = brightened(rgb, metrics->brighten);
  return rgb;
}

unsigned int model::light_getsunlitrgb(unsigned int rgb, const Vector4_s& normal, unsigned char alpha,
                                       float contrastfactor) {
  const toolkit& scene = *toolkit::m_pInstance;
  return lighting::sunlit(scene, rgb, alpha, lighting::sun_intensity(scene, normal, contrastfactor));
}

unsigned int model::light_getpointlitrgb(unsigned int rgb, const Vector4_s& position, const Vector4_s& normal) const {
  return lighting::pointlit(*toolkit::m_pInstance, lightpos, rgb, position, normal);
}
