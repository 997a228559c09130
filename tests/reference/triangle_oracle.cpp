#include "reference/triangle_oracle.h"

#include <xmmintrin.h>

#include <algorithm>
#include <cstdint>
#include <cstring>

#include "raster/Rasterizer.h"

using namespace Rasterizer_n;

namespace oracle {
namespace {

// --- Numbers --------------------------------------------------------------------------------------------------------

float rcp(float x) { return _mm_cvtss_f32(_mm_rcp_ss(_mm_set_ss(x))); }
int truncate(float x) { return _mm_cvttss_si32(_mm_set_ss(x)); }
int round_to_nearest(float x) { return _mm_cvtss_si32(_mm_set_ss(x)); }

// Of rows and of pixels: wide enough for the difference of any two coordinates.
using distance = std::int64_t;
distance between(int from, int to) { return static_cast<distance>(to) - from; }

std::int16_t signed_word(int x) { return static_cast<std::int16_t>(std::clamp(x, -32768, 32767)); }
std::uint16_t low_word(distance x) { return static_cast<std::uint16_t>(x); }

// Float to unsigned 16 bits; what is out of range saturates. The subtraction wraps, as the conversion's answer for
// what is no integer shows.
std::uint16_t unsigned_word(float x) {
  return low_word(signed_word(static_cast<int>(static_cast<unsigned>(truncate(x)) - 32768u)) + 32768);
}
// Float to the step of a 16-bit value.
std::int16_t step_word(float x) { return signed_word(truncate(x)); }

unsigned mulhi(unsigned p, unsigned q) { return (p & 0xFFFF) * (q & 0xFFFF) >> 16; }

// Not a number gives the lower bound.
float clamp_float(float x, float low, float high) {
  const float at_least = x > low ? x : low;
  return at_least < high ? at_least : high;
}

// --- What a triangle interpolates -----------------------------------------------------------------------------------

// At a vertex. Colours stand before their conversion to 16 bits.
struct Corner {
  float x, depth;
  float colour[4], fogadd[4];
  float u, v;  // over depth
  float i, j;  // weights of the first two textures
};

// What each row adds along an edge.
struct Step {
  float x, depth;
  std::int16_t colour[4], fogadd[4];
  float u, v;
  float i, j;
};

// An edge at a row.
struct Side {
  float x, depth;
  std::uint16_t colour[4], fogadd[4];
  float u, v;
  float i, j;
  Step step;

  void next_row() {
    x += step.x;
    depth += step.depth;
    for (int c = 0; c < 4; ++c) {
      colour[c] = low_word(colour[c] + step.colour[c]);
      fogadd[c] = low_word(fogadd[c] + step.fogadd[c]);
    }
    u += step.u;
    v += step.v;
    i += step.i;
    j += step.j;
  }
};

Step edge_step(const Corner& from, const Corner& to, float reciprocal) {
  Step s;
  s.x = (to.x - from.x) * reciprocal;
  s.depth = (to.depth - from.depth) * reciprocal;
  for (int c = 0; c < 4; ++c) {
    s.colour[c] = step_word((to.colour[c] - from.colour[c]) * reciprocal);
    s.fogadd[c] = step_word((to.fogadd[c] - from.fogadd[c]) * reciprocal);
  }
  s.u = (to.u - from.u) * reciprocal;
  s.v = (to.v - from.v) * reciprocal;
  s.i = (to.i - from.i) * reciprocal;
  s.j = (to.j - from.j) * reciprocal;
  return s;
}

Side start_edge(const Corner& corner, const Step& step, distance skip) {
  const float rows = static_cast<float>(skip);
  Side side;
  side.x = corner.x + rows * step.x;
  side.depth = corner.depth + rows * step.depth;
  for (int c = 0; c < 4; ++c) {
    side.colour[c] = low_word(unsigned_word(corner.colour[c]) + low_word(skip) * step.colour[c]);
    side.fogadd[c] = low_word(unsigned_word(corner.fogadd[c]) + low_word(skip) * step.fogadd[c]);
  }
  side.u = corner.u + rows * step.u;
  side.v = corner.v + rows * step.v;
  side.i = corner.i + rows * step.i;
  side.j = corner.j + rows * step.j;
  side.step = step;
  return side;
}

Corner corner_of(const TriangleModes& modes, const Triangle_s& t, int k) {
  Corner corner{};
  corner.x = t.vertex[k].x;
  corner.depth = t.vertex[k].z;
  if (modes.shade >= 1) {
    const bool height_fog = modes.fog == 1 || modes.fog == 3;
    const bool distance_fog = modes.fog == 2 || modes.fog == 3;
    const float d =
        distance_fog ? clamp_float((corner.depth - m_DistanceFogStart) * m_InvDistanceFogRange, 0.0f, 1.0f) : 0.0f;
    const float h = height_fog ? (&t.fogfactor.x)[k] : 0.0f;
    for (int c = 0; c < 4; ++c) {
      const float base = static_cast<float>(t.colour[k].channels[c]) * (1.0f - h) * (1.0f - d);
      const float height_part = height_fog ? (&t.fogcolour.x)[c] * h * (1.0f - d) : 0.0f;
      const float additive = height_part + (&m_DistanceFogColour.x)[c] * d;
      if (modes.shade == 1) {
        corner.colour[c] = base + additive;
      } else {
        corner.colour[c] = base;
        corner.fogadd[c] = additive;
      }
    }
  }
  if (modes.shade >= 2) {
    corner.u = t.texcoord[k].x * rcp(corner.depth);
    corner.v = t.texcoord[k].y * rcp(corner.depth);
  }
  if (modes.shade == 3) {
    corner.i = k == 0 ? 65535.0f : 0.0f;
    corner.j = k == 1 ? 65535.0f : 0.0f;
  }
  return corner;
}

// --- One pixel ------------------------------------------------------------------------------------------------------

struct Pixel {
  float depth;
  float u, v;  // over depth
  std::uint16_t colour[4], fogadd[4];
  std::uint16_t i, j;
};

unsigned channel(unsigned word, int c) { return word >> (8 * c) & 0xFF; }

unsigned texel(const TriangleModes& modes, const Triangle_s& t, int k, float u, float v) {
  if (modes.transform) {
    u = u * t.texscale[k].x + t.texoffset[k].x;
    v = v * t.texscale[k].y + t.texoffset[k].y;
  }
  int column;
  int row;
  if (modes.address == 2) {
    column = truncate(clamp_float(u, 0.0f, 127.0f));
    row = truncate(clamp_float(v, 0.0f, 127.0f));
  } else {
    column = truncate(u) & 127;
    row = truncate(v) & 127;
  }
  return t.texture[k][column + 256 * row];
}

// A coordinate of the light map: the halves of the integer are shifted apart, then packed down to a byte.
int light_coordinate(float x, int shift) {
  const auto whole = static_cast<unsigned>(truncate(x));
  const unsigned low = shift < 0 || shift > 15 ? 0 : (whole & 0xFFFF) >> shift;
  const unsigned high = shift < 0 || shift > 15 ? 0 : (whole >> 16) >> shift;
  const int word = signed_word(static_cast<int>(high << 16 | low));
  return std::clamp(word, 0, 255);
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

  unsigned colour[4];
  std::copy(p.colour, p.colour + 4, colour);
  unsigned s[4];
  unsigned key = 1;
  if (modes.shade == 1) {
    for (int c = 0; c < 4; ++c) s[c] = colour[c] >> 8;
  } else {
    const float u = p.u * p.depth;
    const float v = p.v * p.depth;
    if (modes.light_map) {
      const unsigned b = light(t, u, v);
      for (unsigned& c : colour) c = mulhi(c, b << 8);
    }
    if (modes.shade == 2) {
      key = texel(modes, t, 0, u, v);
      for (int c = 0; c < 4; ++c) s[c] = mulhi(channel(key, c), colour[c]);
    } else {
      const unsigned t0 = texel(modes, t, 0, u, v);
      const unsigned t1 = texel(modes, t, 1, u, v);
      const unsigned t2 = texel(modes, t, 2, u, v);
      const unsigned k = low_word(65535 - p.i - p.j);
      for (int c = 0; c < 4; ++c) {
        const unsigned mixed = mulhi(channel(t0, c), p.i) + mulhi(channel(t1, c), p.j) + mulhi(channel(t2, c), k);
        s[c] = mulhi(mixed, colour[c]);
      }
    }
    if (modes.fog != 0) {
      for (int c = 0; c < 4; ++c) s[c] = std::min(s[c] + (p.fogadd[c] >> 8), 65535u);
    }
  }

  out = 0;
  const unsigned alpha = modes.blend == 2 ? s[3] : t.alpha & 0xFFFF;
  for (int c = 0; c < 4; ++c) {
    const unsigned d = channel(old, c);
    unsigned result = s[c];
    if (modes.blend == 2) {
      result = ((s[c] * alpha + d * (256 - alpha)) & 0xFFFF) >> 8;
    } else if (modes.blend == 3) {
      const unsigned source = modes.shade == 1 ? mulhi(colour[c], alpha) : mulhi(s[c], alpha << 8);
      result = source + mulhi(d << 8, 256 - alpha);
    }
    out |= std::min(result, 255u) << (8 * c);
  }
  return !(modes.colour_key && key == 0) && !(modes.blend == 2 && alpha == 0);
}

// --- One row --------------------------------------------------------------------------------------------------------

// The span between the two edges at row y.
void fill_row(const TriangleModes& modes, const Triangle_s& t, int y, const Side& left, const Side& right) {
  if (modes.shade == -1) {
    const int x0 = truncate(left.x);
    const int x1 = truncate(right.x);
    auto* bytes = reinterpret_cast<unsigned char*>(m_pColourBuffer) + y * m_ScreenPitch;
    for (int x = x0; x < x1; ++x) bytes[x] = 1;
    return;
  }

  const int x0 = round_to_nearest(left.x);
  const int x1 = round_to_nearest(right.x);
  const float w = rcp(static_cast<float>(between(x0, x1)));

  const int end = std::min({x1, m_Viewport.x + m_Viewport.width, m_Cliprect.x + m_Cliprect.width});
  int start = x0;
  distance skip = 0;
  if (m_Viewport.x > start) {
    skip += between(start, m_Viewport.x);
    start = m_Viewport.x;
  }
  if (m_Cliprect.x > start) {
    skip += between(start, m_Cliprect.x);
    start = m_Cliprect.x;
  }
  if (end <= start) return;

  if (!modes.colour_write && !modes.depth_write) return;

  // The first pixel, and what one pixel adds.
  const float skipped = static_cast<float>(skip);
  const float dz = (right.depth - left.depth) * w;
  const float du = (right.u - left.u) * w;
  const float dv = (right.v - left.v) * w;
  float z = static_cast<float>(static_cast<long double>(left.depth) + static_cast<long double>(dz) * skip);
  float u = left.u + skipped * du;
  float v = left.v + skipped * dv;
  Pixel first{};
  std::int16_t dcolour[4], dfogadd[4];
  const auto begin = [&](float from, float to, std::uint16_t& value, std::int16_t& step) {
    const float slope = (to - from) * w;
    step = step_word(slope);
    value = unsigned_word(from + slope * skipped);
  };
  for (int c = 0; c < 4; ++c) {
    begin(left.colour[c], right.colour[c], first.colour[c], dcolour[c]);
    begin(left.fogadd[c], right.fogadd[c], first.fogadd[c], dfogadd[c]);
  }
  std::int16_t di, dj;
  begin(left.i, right.i, first.i, di);
  begin(left.j, right.j, first.j, dj);

  // Float values run in the lanes of aligned groups of four: the first group begins up to three pixels before the span,
  // lane k is k steps further, and each group adds four steps to each lane.
  const int index = y * m_ScreenPitch + start;
  const auto address = modes.colour_write ? reinterpret_cast<std::uintptr_t>(m_pColourBuffer + index)
                                          : reinterpret_cast<std::uintptr_t>(m_pDepthBuffer + index);
  const int before = static_cast<int>(address % 16) / 4;
  if (before > 0) {
    z -= static_cast<float>(before) * dz;
    u -= static_cast<float>(before) * du;
    v -= static_cast<float>(before) * dv;
  }
  float z_lane[4], u_lane[4], v_lane[4];
  for (int k = 0; k < 4; ++k) {
    z_lane[k] = z + static_cast<float>(k) * dz;
    u_lane[k] = u + static_cast<float>(k) * du;
    v_lane[k] = v + static_cast<float>(k) * dv;
  }

  for (int x = start, place = before; x < end; ++x, ++place) {
    const int lane = place % 4;
    const int n = x - start;
    if (lane == 0 && place > 0) {
      for (int k = 0; k < 4; ++k) {
        z_lane[k] += 4.0f * dz;
        u_lane[k] += 4.0f * du;
        v_lane[k] += 4.0f * dv;
      }
    }

    Pixel p;
    p.depth = z_lane[lane];
    p.u = u_lane[lane];
    p.v = v_lane[lane];
    for (int c = 0; c < 4; ++c) {
      p.colour[c] = low_word(first.colour[c] + n * dcolour[c]);
      p.fogadd[c] = low_word(first.fogadd[c] + n * dfogadd[c]);
    }
    p.i = low_word(first.i + n * di);
    p.j = low_word(first.j + n * dj);

    if (modes.depth_test && !(p.depth <= m_pDepthBuffer[index + n])) continue;
    if (modes.colour_write) {
      unsigned out;
      if (!shade_pixel(modes, t, p, m_pColourBuffer[index + n], out)) continue;
      m_pColourBuffer[index + n] = out;
    }
    if (modes.depth_test && modes.depth_write) m_pDepthBuffer[index + n] = p.depth;
  }
}

void fill_rows(const TriangleModes& modes, const Triangle_s& t, int& y, distance rows, Side& left, Side& right) {
  for (; rows > 0; --rows) {
    fill_row(modes, t, y, left, right);
    left.next_row();
    right.next_row();
    ++y;
  }
}

}  // namespace

void render_triangle(const TriangleModes& modes, const Triangle_s& t) {
  // Sort by screen y.
  const float y0 = t.vertex[0].y;
  const float y1 = t.vertex[1].y;
  const float y2 = t.vertex[2].y;
  int top, middle, bottom;
  const auto order = [&](int a, int b, int c) {
    top = a;
    middle = b;
    bottom = c;
  };
  if (y1 > y0) {
    if (y2 > y1) {
      order(0, 1, 2);
    } else if (y2 > y0) {
      order(0, 2, 1);
    } else {
      order(2, 0, 1);
    }
  } else {
    if (y2 > y0) {
      order(1, 0, 2);
    } else if (y2 > y1) {
      order(1, 2, 0);
    } else {
      order(2, 1, 0);
    }
  }
  const int y_top = truncate(t.vertex[top].y);
  const int y_middle = truncate(t.vertex[middle].y);
  const int y_bottom = truncate(t.vertex[bottom].y);

  // Steps of the three edges.
  const auto reciprocal = [](distance rows) { return rcp(std::max(static_cast<float>(rows), 1e-6f)); };
  const Corner at_top = corner_of(modes, t, top);
  const Corner at_middle = corner_of(modes, t, middle);
  const Corner at_bottom = corner_of(modes, t, bottom);
  const Step top_middle = edge_step(at_top, at_middle, reciprocal(between(y_top, y_middle)));
  const Step top_bottom = edge_step(at_top, at_bottom, reciprocal(between(y_top, y_bottom)));
  const Step middle_bottom = edge_step(at_middle, at_bottom, reciprocal(between(y_middle, y_bottom)));

  // The rows of the upper trapezoid.
  const int viewport_end = m_Viewport.y + m_Viewport.height;
  const int clip_end = m_Cliprect.y + m_Cliprect.height;
  const int end = std::min({y_middle, viewport_end, clip_end});
  int start = y_top;
  distance skip = 0;
  if (start < m_Viewport.y) {
    skip += between(start, m_Viewport.y);
    start = m_Viewport.y;
  }
  if (start < m_Cliprect.y) {
    skip += between(start, m_Cliprect.y);
    start = m_Cliprect.y;
  }
  int y = start;
  distance rows = between(start, end);

  // The left edge is the long one when the middle vertex lies strictly to the right.
  const bool left_is_long = top_middle.x > top_bottom.x;
  Side left = start_edge(at_top, left_is_long ? top_bottom : top_middle, skip);
  Side right = start_edge(at_top, left_is_long ? top_middle : top_bottom, skip);

  distance lower = between(y_middle, y_bottom);
  distance skip2 = 0;
  if (rows >= 1) {
    fill_rows(modes, t, y, rows, left, right);
  } else {
    skip2 = -rows;
    lower += rows;
  }

  // The lower trapezoid: one edge is replaced, the other carries on.
  rows = std::min({between(y, viewport_end), between(y, clip_end), lower});
  if (rows <= 0) return;
  if (top_bottom.x > middle_bottom.x) {
    right = start_edge(at_middle, middle_bottom, skip2);
  } else {
    left = start_edge(at_middle, middle_bottom, skip2);
  }
  fill_rows(modes, t, y, rows, left, right);
}

}  // namespace oracle
