// How the 2D primitives put pixels down: the pixel operation of each mode, and the runs that apply one.
//
// An operation is a small struct that holds the colour in the form its formula wants and works on a register of four
// target pixels. A single pixel, at the end of a row or on a line, goes through the same code in lane 0. The blends of
// sprites and spans round differently by one in 256 and stand with them.
#pragma once

#include <cstddef>
#include <cstdint>

#include "maths/SSEMath.h"
#include "util/exception.h"

namespace primitive {

using namespace SSEMath;

// Mode 0: the colour word as it is, with its alpha byte.
struct Opaque {
  explicit Opaque(std::uint32_t colour) : c(splat(colour)) {}
  VELMARK5_LANE Int4 operator()(Int4) const { return c; }

  Int4 c;
};

// Mode 1: each of red, green, blue = (d * (256 - a) >> 8) + (c * a >> 8), alpha = a, where a is the colour's alpha. The
// sum never leaves a byte.
struct Blend {
  explicit Blend(std::uint32_t colour) {
    const std::uint32_t a = colour >> 24;
    const std::uint32_t green = (colour & 0xFF00) * a >> 8 & 0xFF00;
    const std::uint32_t red_blue = (colour & 0xFF00FF) * a >> 8 & 0xFF00FF;
    source = splat(green + red_blue + (a << 24));
    keep_all = splat_word(static_cast<std::uint16_t>(256 - a));
    keep_green = words(splat(256 - a));
    green_byte = splat(0xFF00u);
  }
  // Seen as 16-bit words, a pixel is green:blue and alpha:red. Blue and red shifted to the high byte leave the high
  // half of their product at the bottom of the word; green at the bottom leaves its product's upper byte in place.
  VELMARK5_LANE Int4 operator()(Int4 d) const {
    const Int4 red_blue = pixels(mulhi(shift_left<8>(words(d)), keep_all));
    const Int4 green = pixels(shift_right<8>(words(d)) * keep_green) & green_byte;
    return (red_blue | green) + source;
  }

  Int4 source;
  Word8 keep_all;
  Word8 keep_green;  // nothing of the alpha word is kept
  Int4 green_byte;
};

// Mode 2: red, green and blue = min(d + c, 255); alpha = the low byte of d + c.
struct Add {
  explicit Add(std::uint32_t colour) : channels(splat(colour & 0xFFFFFF)), alpha(splat(colour & 0xFF000000)) {}
  VELMARK5_LANE Int4 operator()(Int4 d) const { return add_saturating_bytes(d, channels) + alpha; }

  Int4 channels;
  Int4 alpha;
};

// Calls draw with the operation of the mode: the one place where a primitive's arithmetic is chosen. Full alpha blends
// as opaque. Throws IllegalArgumentException*.
template <class Draw>
void with_operation(unsigned int mode, std::uint32_t colour, Draw&& draw) {
  if (mode == 0 || (mode == 1 && colour >> 24 == 255)) return draw(Opaque(colour));
  if (mode == 1) return draw(Blend(colour));
  if (mode == 2) return draw(Add(colour));
  throw new IllegalArgumentException;
}

// --- One pixel ------------------------------------------------------------------------------------------------------

template <class Operation>
VELMARK5_LANE void plot(std::uint32_t* p, const Operation& operation) {
  store_one(p, operation(load_one(p)));
}

VELMARK5_LANE bool on_group_boundary(const std::uint32_t* p) { return (reinterpret_cast<std::uintptr_t>(p) & 15) == 0; }

// --- Runs of n pixels -----------------------------------------------------------------------------------------------
//
// Single pixels up to a 16-byte boundary, groups of four, single pixels.

template <class Operation>
inline void draw_run(std::uint32_t* p, std::size_t n, const Operation& operation) {
  for (; n > 0 && !on_group_boundary(p); --n, ++p) plot(p, operation);
  for (; n >= 16; n -= 16, p += 16) {
#pragma GCC unroll 4
    for (int i = 0; i < 16; i += 4) store(p + i, operation(load(p + i)));
  }
  for (; n >= 4; n -= 4, p += 4) store(p, operation(load(p)));
  for (; n > 0; --n, ++p) plot(p, operation);
}

// The same past the caches. The caller ends its fill with stream_end.
inline void stream_run(std::uint32_t* p, std::size_t n, std::uint32_t word) {
  const Int4 group = splat(word);
  for (; n > 0 && !on_group_boundary(p); --n, ++p) stream_one(p, word);
  for (; n >= 16; n -= 16, p += 16) {
#pragma GCC unroll 4
    for (int i = 0; i < 16; i += 4) stream(p + i, group);
  }
  for (; n >= 4; n -= 4, p += 4) stream(p, group);
  for (; n > 0; --n, ++p) stream_one(p, word);
}

// A row of a filled area: opaque pixels stream, since a target is not read soon; blends go through the cache that they
// have just read into.
template <class Operation>
inline void fill_run(std::uint32_t* p, std::size_t n, const Operation& operation) {
  draw_run(p, n, operation);
}
inline void fill_run(std::uint32_t* p, std::size_t n, const Opaque& operation) {
  std::uint32_t word;
  store_one(&word, operation.c);
  stream_run(p, n, word);
}

// --- Clipping -------------------------------------------------------------------------------------------------------

// Cuts the run of `length` pixels from `start` to low (inclusive) and high (exclusive). False when nothing is left.
// Any values are welcome: a run may reach beyond what an int counts.
inline bool clip_run(int& start, int& length, int low, int high) {
  std::int64_t first = start;
  std::int64_t count = length;
  if (first < low) {
    count += first - low;
    first = low;
  }
  if (first + count > high) count = high - first;
  if (count <= 0) return false;
  start = static_cast<int>(first);
  length = static_cast<int>(count);
  return true;
}

// Of (x, y) in an image whose rows are `pitch` pixels.
inline std::ptrdiff_t pixel_index(int x, int y, int pitch) { return static_cast<std::ptrdiff_t>(y) * pitch + x; }

}  // namespace primitive
