#include "reference/triangle_oracle.h"

#include <algorithm>
#include <cstdint>

#include "raster/Rasterizer.h"
#include "reference/numbers.h"

using namespace Rasterizer_n;

namespace oracle {
namespace {

// --- Numbers --------------------------------------------------------------------------------------------------------

// Of rows and of pixels. Those of absurd coordinates wrap.
using distance = std::int32_t;
distance between(int from, int to) {
  return static_cast<distance>(static_cast<unsigned>(to) - static_cast<unsigned>(from));
}

std::uint16_t low_word(int x) { return static_cast<std::uint16_t>(x); }

// Float to unsigned 16 bits; what is out of range saturates. The subtraction wraps, as the conversion's answer for
// what is no integer shows.
std::uint16_t unsigned_word(float x) {
  return low_word(signed_word(static_cast<int>(static_cast<unsigned>(truncate(x)) - 32768u)) + 32768);
}
// Float to the step of a 16-bit value.
std::int16_t step_word(float x) { return static_cast<std::int16_t>(signed_word(truncate(x))); }

unsigned mulhi(unsigned p, unsigned q) { return (p & 0xFFFF) * (q & 0xFFFF) >> 16; }

// Not a number gives the lower bound.
float clamp_float(float x, float low, float high) {
  const float at_least = x > low ? x : low;
  return at_least < high ? at_least : high;
}

// --- What a triangle interpolates -----------------------------------------------------------------------------------

// Floats; u and v over depth, and the weights of the first two textures.
enum Real { X, Depth, U, V, Weight0, Weight1, reals };
// Words of 16 bits: four channels of colour, then four of the fog that is added after the texture.
constexpr int FogAdd = 4, words = 8;

// At a vertex. Words stand before their conversion.
struct Corner {
  float real[reals], word[words];
};

// What each row adds along an edge.
struct Step {
  float real[reals];
  std::int16_t word[words];

  Step(const Corner& from, const Corner& to, distance rows) {
    const float share = reciprocal(std::max(static_cast<float>(rows), 1e-6f));
    for (int k = 0; k < reals; ++k) real[k] = (to.real[k] - from.real[k]) * share;
    for (int k = 0; k < words; ++k) word[k] = step_word((to.word[k] - from.word[k]) * share);
  }
};

// An edge at a row: `skip` rows below its corner to begin with.
struct Edge {
  float real[reals];
  std::uint16_t word[words];
  Step step;

  Edge(const Corner& corner, const Step& each, distance skip) : step(each) {
    for (int k = 0; k < reals; ++k) real[k] = corner.real[k] + static_cast<float>(skip) * step.real[k];
    for (int k = 0; k < words; ++k) word[k] = low_word(unsigned_word(corner.word[k]) + low_word(skip) * step.word[k]);
  }
  void next_row() {
    for (int k = 0; k < reals; ++k) real[k] += step.real[k];
    for (int k = 0; k < words; ++k) word[k] = low_word(word[k] + step.word[k]);
  }
};

Corner corner_of(const TriangleModes& modes, const Triangle_s& t, int k) {
  const float z = t.vertex[k].z;
  Corner corner{{t.vertex[k].x, z}, {}};
  if (modes.shade >= 1) {
    const bool height_fog = modes.fog == 1 || modes.fog == 3, distance_fog = modes.fog == 2 || modes.fog == 3;
    const float h = height_fog ? lane(t.fogfactor, k) : 0;
    const float d = distance_fog ? clamp_float((z - m_DistanceFogStart) * m_InvDistanceFogRange, 0, 1) : 0;
    for (int c = 0; c < 4; ++c) {
      const float base = static_cast<float>(t.colour[k].channels[c]) * (1 - h) * (1 - d);
      const float fog = (height_fog ? lane(t.fogcolour, c) * h * (1 - d) : 0) + lane(m_DistanceFogColour, c) * d;
      corner.word[c] = modes.shade == 1 ? base + fog : base;
      corner.word[FogAdd + c] = modes.shade == 1 ? 0 : fog;
    }
  }
  if (modes.shade >= 2) {
    corner.real[U] = t.texcoord[k].x * reciprocal(z);
    corner.real[V] = t.texcoord[k].y * reciprocal(z);
  }
  if (modes.shade == 3 && k < 2) corner.real[Weight0 + k] = 65535;
  return corner;
}

// --- One pixel ------------------------------------------------------------------------------------------------------

struct Pixel {
  float depth, u, v;
  std::uint16_t word[words + 2];  // the last two are the weights
};

// Texture k at (u, v).
unsigned texel(const TriangleModes& modes, const Triangle_s& t, int k, float u, float v) {
  if (modes.transform) {
    u = u * t.texscale[k].x + t.texoffset[k].x;
    v = v * t.texscale[k].y + t.texoffset[k].y;
  }
  const auto place = [&](float x) { return modes.address == 2 ? truncate(clamp_float(x, 0, 127)) : truncate(x) & 127; };
  return t.texture[k][place(u) + 256 * place(v)];
}

// A coordinate of the light map: the halves of the integer are shifted apart, then packed down to a byte.
int light_coordinate(float x, int shift) {
  const auto whole = static_cast<unsigned>(truncate(x));
  const unsigned low = shift < 0 || shift > 15 ? 0 : (whole & 0xFFFF) >> shift;
  const unsigned high = shift < 0 || shift > 15 ? 0 : (whole >> 16) >> shift;
  return std::clamp(signed_word(static_cast<int>(high << 16 | low)), 0, 255);
}

unsigned light(const Triangle_s& t, float u, float v) {
  const int index = light_coordinate(u, t.lightmapshift) + 256 * light_coordinate(v, t.lightmapshift);
  return t.lightmap[static_cast<std::int16_t>(index)];
}

// The new word of a pixel whose target holds `old`; false when nothing is to be written.
bool shade_pixel(const TriangleModes& modes, const Triangle_s& t, const Pixel& p, unsigned old, unsigned& out) {
  if (modes.shade == 0) {
    out = t.flatcolour;
    return true;
  }

  unsigned colour[4], s[4], key = 1;
  std::copy_n(p.word, 4, colour);
  if (modes.shade == 1) {
    for (int c = 0; c < 4; ++c) s[c] = colour[c] >> 8;
  } else {
    const float u = p.u * p.depth, v = p.v * p.depth;
    if (modes.light_map) {
      for (unsigned& c : colour) c = mulhi(c, light(t, u, v) << 8);
    }
    if (modes.shade == 2) {
      key = texel(modes, t, 0, u, v);
      for (int c = 0; c < 4; ++c) s[c] = mulhi(channel(key, c), colour[c]);
    } else {
      const unsigned weight0 = p.word[words], weight1 = p.word[words + 1];
      const unsigned weights[3] = {weight0, weight1, low_word(65535 - static_cast<int>(weight0 + weight1))};
      for (int c = 0; c < 4; ++c) {
        unsigned mixed = 0;
        for (int k = 0; k < 3; ++k) mixed += mulhi(channel(texel(modes, t, k, u, v), c), weights[k]);
        s[c] = mulhi(mixed, colour[c]);
      }
    }
    if (modes.fog != 0) {
      for (int c = 0; c < 4; ++c) s[c] = std::min(s[c] + (p.word[FogAdd + c] >> 8), 65535u);
    }
  }

  const unsigned alpha = modes.blend == 2 ? s[3] : t.alpha & 0xFFFF;
  out = word_of([&](int c) {
    const unsigned d = channel(old, c);
    unsigned result = s[c];
    if (modes.blend == 2) {
      result = ((s[c] * alpha + d * (256 - alpha)) & 0xFFFF) >> 8;
    } else if (modes.blend == 3) {
      const unsigned source = modes.shade == 1 ? mulhi(colour[c], alpha) : mulhi(s[c], alpha << 8);
      result = source + mulhi(d << 8, 256 - alpha);
    }
    return std::min(result, 255u);
  });
  return !(modes.colour_key && key == 0) && !(modes.blend == 2 && alpha == 0);
}

// --- One row --------------------------------------------------------------------------------------------------------

// The span between the two edges at row y.
void fill_row(const TriangleModes& modes, const Triangle_s& t, int y, const Edge& left, const Edge& right) {
  if (modes.shade == -1) {
    auto* bytes = reinterpret_cast<unsigned char*>(m_pColourBuffer) + y * m_ScreenPitch;
    for (int x = truncate(left.real[X]); x < truncate(right.real[X]); ++x) bytes[x] = 1;
    return;
  }

  const int x0 = round_to_nearest(left.real[X]), x1 = round_to_nearest(right.real[X]);
  const int start = std::max({x0, m_Viewport.x, m_Cliprect.x});
  const int end = std::min({x1, m_Viewport.x + m_Viewport.width, m_Cliprect.x + m_Cliprect.width});
  if (end <= start || (!modes.colour_write && !modes.depth_write)) return;
  const distance skip = between(x0, start);
  const float skipped = static_cast<float>(skip);
  const float share = reciprocal(static_cast<float>(between(x0, x1)));

  // Words: the first pixel's, and what one pixel adds.
  Pixel first{};
  std::int16_t step[words + 2];
  for (int k = 0; k < words + 2; ++k) {
    const auto at = [k](const Edge& edge) { return k < words ? edge.word[k] : edge.real[Weight0 + k - words]; };
    const float slope = (at(right) - at(left)) * share;
    step[k] = step_word(slope);
    first.word[k] = unsigned_word(at(left) + slope * skipped);
  }

  // Floats run in the lanes of aligned groups of four: the first group begins up to three pixels before the span, lane
  // k is k steps further, and each group adds four steps to each lane.
  const int index = y * m_ScreenPitch + start;
  const auto address = modes.colour_write ? reinterpret_cast<std::uintptr_t>(m_pColourBuffer + index)
                                          : reinterpret_cast<std::uintptr_t>(m_pDepthBuffer + index);
  const int before = static_cast<int>(address % 16) / 4;
  float slope[3], lanes[3][4];
  for (int k = 0; k < 3; ++k) {
    const float from = left.real[Depth + k];
    slope[k] = (right.real[Depth + k] - from) * share;
    float at = k == 0 ? static_cast<float>(static_cast<long double>(from) + static_cast<long double>(slope[k]) * skip)
                      : from + skipped * slope[k];
    if (before > 0) at -= static_cast<float>(before) * slope[k];
    for (int i = 0; i < 4; ++i) lanes[k][i] = at + static_cast<float>(i) * slope[k];
  }

  for (int n = 0; n < end - start; ++n) {
    const int i = (before + n) % 4;
    for (int k = 0; k < 3 && i == 0 && n > 0; ++k) {
      for (float& value : lanes[k]) value += 4 * slope[k];
    }
    Pixel p{lanes[0][i], lanes[1][i], lanes[2][i], {}};
    for (int k = 0; k < words + 2; ++k) p.word[k] = low_word(first.word[k] + n * step[k]);

    if (modes.depth_test && !(p.depth <= m_pDepthBuffer[index + n])) continue;
    unsigned out;
    if (modes.colour_write) {
      if (!shade_pixel(modes, t, p, m_pColourBuffer[index + n], out)) continue;
      m_pColourBuffer[index + n] = out;
    }
    if (modes.depth_test && modes.depth_write) m_pDepthBuffer[index + n] = p.depth;
  }
}

void fill_rows(const TriangleModes& modes, const Triangle_s& t, int& y, distance rows, Edge& left, Edge& right) {
  for (; rows > 0; --rows, ++y) {
    fill_row(modes, t, y, left, right);
    left.next_row();
    right.next_row();
  }
}

}  // namespace

void render_triangle(const TriangleModes& modes, const Triangle_s& t) {
  // From top to bottom; of vertices at one height the last comes first.
  int order[3] = {2, 1, 0};
  std::stable_sort(order, order + 3, [&t](int a, int b) { return t.vertex[a].y < t.vertex[b].y; });
  const auto row = [&](int place) { return truncate(t.vertex[order[place]].y); };
  const auto corner = [&](int place) { return corner_of(modes, t, order[place]); };
  const int y_top = row(0), y_middle = row(1), y_bottom = row(2);
  const Corner top = corner(0), middle = corner(1), bottom = corner(2);
  const Step top_middle(top, middle, between(y_top, y_middle));
  const Step top_bottom(top, bottom, between(y_top, y_bottom));
  const Step middle_bottom(middle, bottom, between(y_middle, y_bottom));

  // The upper trapezoid. Its left edge is the long one when the middle vertex lies strictly to the right.
  const int first = std::max({y_top, m_Viewport.y, m_Cliprect.y});
  const int end = std::min(m_Viewport.y + m_Viewport.height, m_Cliprect.y + m_Cliprect.height);
  const distance skip = between(y_top, first);
  const bool left_is_long = top_middle.real[X] > top_bottom.real[X];
  Edge left(top, left_is_long ? top_bottom : top_middle, skip);
  Edge right(top, left_is_long ? top_middle : top_bottom, skip);
  const int end_upper = std::min(y_middle, end);
  int y = first;
  if (first < end_upper) fill_rows(modes, t, y, between(first, end_upper), left, right);

  // The lower trapezoid: one edge is replaced, the other carries on. Rows that the clipping took from above both count
  // as skipped.
  const distance skip_lower = first < end_upper ? 0 : between(end_upper, first);
  const distance lower = std::min(between(y, end), between(skip_lower, between(y_middle, y_bottom)));
  if (y >= end || lower <= 0) return;
  (top_bottom.real[X] > middle_bottom.real[X] ? right : left) = Edge(middle, middle_bottom, skip_lower);
  fill_rows(modes, t, y, lower, left, right);
}

}  // namespace oracle
