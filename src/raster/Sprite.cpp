#include "raster/Sprite.h"

#include <cstddef>
#include <cstring>

#include "maths/SSEMath.h"
#include "raster/imagememory.h"

using namespace SSEMath;

namespace {

constexpr unsigned int opaque_alpha = 0xFF000000;

// Calls op(new words, old words) for every group of four pixels of a row and for each pixel that is left over.
template <bool ReadsOld, class Op>
void combine_row(unsigned int* to, const unsigned int* from, unsigned int count, Op op) {
  unsigned int i = 0;
  for (; i + 4 <= count; i += 4) {
    store_unaligned(to + i, op(load_unaligned(from + i), ReadsOld ? load_unaligned(to + i) : splat(0u)));
  }
  for (; i < count; ++i) store_one(to + i, op(load_one(from + i), ReadsOld ? load_one(to + i) : splat(0u)));
}

// word | 0xFF000000; 0 stays 0.
struct MakeOpaque {
  Int4 operator()(Int4 words, Int4) const { return and_not(words | splat(opaque_alpha), equal(words, splat(0u))); }
};

// (word << Shift) & 0xFF000000 over the low 24 bits of the old word.
template <int Shift>
struct AlphaFromByte {
  Int4 operator()(Int4 words, Int4 old) const {
    return (shift_left<Shift>(words) & splat(opaque_alpha)) | and_not(old, splat(opaque_alpha));
  }
};

// 255 where the word is not 0, else 0, over the low 24 bits of the old word.
struct AlphaWhereSet {
  Int4 operator()(Int4 words, Int4 old) const {
    return and_not(splat(opaque_alpha), equal(words, splat(0u))) | and_not(old, splat(opaque_alpha));
  }
};

}  // namespace

Sprite_c::~Sprite_c() { _aligned_free(pixels); }

void Sprite_c::Allocate(unsigned int image_width, unsigned int image_height) {
  _aligned_free(pixels);
  pixels = nullptr;
  width = height = pitch = 0;  // what remains when the allocation fails
  pixels = static_cast<unsigned int*>(raster::allocate_image(image_width, image_height, 16));
  width = pitch = static_cast<int>(image_width);
  height = static_cast<int>(image_height);
}

// Calls row(target, source) for the rows of a rectangle. A stride with its top bit set walks upwards.
template <class Row>
static void for_rows(const Sprite_c& sprite, int x, int y, unsigned int h, const unsigned int* source,
                     unsigned int stride, Row row) {
  const std::ptrdiff_t source_step = static_cast<int>(stride);
  for (unsigned int r = 0; r < h; ++r) {
    row(sprite.pixels + (static_cast<std::ptrdiff_t>(y) + r) * sprite.pitch + x,
        source + static_cast<std::ptrdiff_t>(r) * source_step);
  }
}

void Sprite_c::Copy(const unsigned int* source, unsigned int stride, bool opaque) {
  CopyRect(0, 0, static_cast<unsigned int>(width), static_cast<unsigned int>(height), source, stride, opaque);
}

void Sprite_c::CopyRect(int x, int y, unsigned int w, unsigned int h, const unsigned int* source, unsigned int stride,
                        bool opaque) {
  if (w == 0 || h == 0) return;
  if (opaque) {
    for_rows(*this, x, y, h, source, stride,
             [w](unsigned int* to, const unsigned int* from) { combine_row<false>(to, from, w, MakeOpaque()); });
  } else {
    // The source may be this very image, when it is the render target.
    for_rows(*this, x, y, h, source, stride, [w](unsigned int* to, const unsigned int* from) {
      std::memmove(to, from, std::size_t{w} * sizeof(unsigned int));
    });
  }
}

void Sprite_c::CopyAlpha(const unsigned int* source, unsigned int stride, unsigned int channel) {
  CopyRectAlpha(0, 0, static_cast<unsigned int>(width), static_cast<unsigned int>(height), source, stride, channel);
}

void Sprite_c::CopyRectAlpha(int x, int y, unsigned int w, unsigned int h, const unsigned int* source,
                             unsigned int stride, unsigned int channel) {
  if (w == 0 || h == 0) return;
  const auto run = [&](auto op) {
    for_rows(*this, x, y, h, source, stride,
             [w, op](unsigned int* to, const unsigned int* from) { combine_row<true>(to, from, w, op); });
  };
  switch (channel) {
    case 0:
      run(AlphaFromByte<8>());
      break;
    case 1:
      run(AlphaFromByte<16>());
      break;
    case 2:
      run(AlphaFromByte<24>());
      break;
    case 3:
      run(AlphaWhereSet());
      break;
    default:
      break;
  }
}

void Sprite_c::CopyFrom8Bit(const unsigned char* indices, const unsigned int* palette, const unsigned char* alpha,
                            unsigned int stride) {
  for (int y = 0; y < height; ++y) {
    unsigned int* row = pixels + static_cast<std::ptrdiff_t>(y) * pitch;
    const std::ptrdiff_t start = static_cast<std::ptrdiff_t>(y) * static_cast<int>(stride);
    if (alpha == nullptr) {
      for (int x = 0; x < width; ++x) {
        const unsigned char index = indices[start + x];
        row[x] = index == 0 ? 0 : palette[index] | opaque_alpha;
      }
    } else {
      for (int x = 0; x < width; ++x) {
        row[x] = (palette[indices[start + x]] & ~opaque_alpha) | static_cast<unsigned int>(alpha[start + x]) << 24;
      }
    }
  }
}
