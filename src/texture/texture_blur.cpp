// The blur that softens a texture at upload: five taps along the rows, then five along the columns.
//
// Both passes are one filter over five rows of unpacked pixels, a register per pixel with the channels as its lanes.
// Along rows the five are the same row shifted by a pixel each; along columns they are five rows around the current
// one.
#include <algorithm>

#include "maths/SSEMath.h"
#include "texture/texturecache.h"

using namespace SSEMath;

namespace {

constexpr int size = texturecache::size;
constexpr int reach = 2;
constexpr int taps = 2 * reach + 1;
// The unit normal density at -2 to 2.
constexpr float weights[taps] = {0.053990968f, 0.24197072f, 0.3989423f, 0.24197072f, 0.053990968f};

// A row of pixels as floats, 0 to 255, with room for the samples beyond its ends. `presence` is 0 for a hole, else 1.
struct unpackedrow {
  alignas(16) float channels[size + 2 * reach][4];
  alignas(16) float presence[size + 2 * reach];
};

struct tap {
  const float (*channels)[4];
  const float* presence;
};

// The place of a sample at distance d from the row's or column's element i.
int sample_place(int i, bool wrap) { return wrap ? i & (size - 1) : std::clamp(i, 0, size - 1); }

void unpack(const unsigned int* row, bool opaque, unpackedrow& out) {
  const Int4 zero = splat(0u);
  const Float4 one = splat(1.0f);
  for (int x = 0; x < size; x += 4) {
    const Int4 pixels = load_unaligned(row + x);
    const Word8 low = widen_low(pixels);
    const Word8 high = widen_high(pixels);
    float* to = out.channels[x + reach];
    store(to, {_mm_cvtepi32_ps(_mm_unpacklo_epi16(low.v, zero.v))});
    store(to + 4, {_mm_cvtepi32_ps(_mm_unpackhi_epi16(low.v, zero.v))});
    store(to + 8, {_mm_cvtepi32_ps(_mm_unpacklo_epi16(high.v, zero.v))});
    store(to + 12, {_mm_cvtepi32_ps(_mm_unpackhi_epi16(high.v, zero.v))});
    const Int4 hole = opaque ? zero : equal(pixels, zero);
    store_unaligned(out.presence + x + reach, {_mm_andnot_ps(_mm_castsi128_ps(hole.v), one.v)});
  }
}

// Copies the samples beyond both ends.
void extend(unpackedrow& row, bool wrap) {
  for (int d = 1; d <= reach; ++d) {
    for (const int i : {-d, size - 1 + d}) {
      const int from = sample_place(i, wrap) + reach;
      std::copy(row.channels[from], row.channels[from] + 4, row.channels[i + reach]);
      row.presence[i + reach] = row.presence[from];
    }
  }
}

// A row of the result: channel sums over the sum of the weights that counted, truncated; a hole at the centre stays.
// A hole's channels are zero, so that it drops out of the sums by itself.
void filter(const tap (&from)[taps], unsigned int* out) {
  for (int x = 0; x < size; x += 4) {
    Float4 weight_sum = splat(0.0f);
    for (int d = 0; d < taps; ++d) weight_sum += load_unaligned(from[d].presence + x) * splat(weights[d]);
    alignas(16) float scale[4];
    store(scale, {_mm_div_ps(splat(1.0f).v, weight_sum.v)});

    Int4 result[4];
    for (int i = 0; i < 4; ++i) {
      Float4 sum = splat(0.0f);
      for (int d = 0; d < taps; ++d) sum += load(from[d].channels[x + i]) * splat(weights[d]);
      result[i] = truncate(sum * splat(scale[i]));
    }
    const Int4 packed =
        narrow({_mm_packs_epi32(result[0].v, result[1].v)}, {_mm_packs_epi32(result[2].v, result[3].v)});
    const Float4 centre = load_unaligned(from[reach].presence + x);
    const Int4 hole{_mm_castps_si128(_mm_cmpeq_ps(centre.v, _mm_setzero_ps()))};
    store(out + x, and_not(packed, hole));
  }
}

}  // namespace

void texturecache::copy_and_blur_texture(const unsigned int* source, int slot, bool wrap_u, bool wrap_v, bool opaque) {
  alignas(16) unsigned int scratch[texture_pixels];

  unpackedrow rows[taps];
  for (int y = 0; y < size; ++y) {
    unpackedrow& row = rows[0];
    unpack(source + y * size, opaque, row);
    extend(row, wrap_u);
    tap shifted[taps];
    for (int d = 0; d < taps; ++d) shifted[d] = {row.channels + d, row.presence + d};
    filter(shifted, scratch + y * size);
  }

  // The five rows around row y lie in a ring, row i at i + reach modulo taps.
  const auto bring = [&](int i) { unpack(scratch + sample_place(i, wrap_v) * size, opaque, rows[(i + reach) % taps]); };
  for (int i = -reach; i < reach; ++i) bring(i);
  unsigned int* out = records[slot].texels;
  for (int y = 0; y < size; ++y, out += stride) {
    bring(y + reach);
    tap around[taps];
    for (int d = 0; d < taps; ++d) {
      const unpackedrow& row = rows[(y + d) % taps];
      around[d] = {row.channels + reach, row.presence + reach};
    }
    filter(around, out);
  }
}
