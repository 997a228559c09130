// The image rows that a scaled sprite shows, by nearest sampling. The columns to take are the same in every row, so
// they are found once for a strip of the target, and a row that shows several times is fetched once.
#pragma once

#include <algorithm>
#include <cstdint>

#include "maths/SSEMath.h"
#include "raster/Sprite.h"
#include "raster/SpritePlacement.h"

namespace sprite_render {

// Where the stored pixels go when the full image is scaled, and how far to step in the image per target pixel.
struct Scale {
  Visible part;
  long double ratio_x;  // target pixels per column
  float step_x, step_y;
  i64 start;  // linear position of the first pixel
};

Scale scale_of(const Sprite_c& sprite, const RenderParams_s& params, const SpriteTarget_s& target);

// Gives the rows in order from the top, for one strip of columns after the other. Lives on the stack; the sprite must
// outlive it.
class ScaledRows {
 public:
  ScaledRows(const Sprite_c& sprite, const Scale& scale);

  // To the next strip and its top; false at the end.
  bool next_strip();
  // Of the strip, in target pixels.
  int x() const { return strip_x; }
  int width() const { return strip_width; }

  // To the next row of the part, or as many as `most` of them if they are equal; how many.
  int next_rows(int most) {
    if (repeats[current] == 0 && ++current >= count) fetch();
    const int n = std::min(repeats[current], most);
    repeats[current] -= n;
    return n;
  }
  // Of the row: width() of them, aligned to 16 bytes and padded to a group of four.
  const std::uint32_t* pixels() const { return fetched[current]; }

 private:
  static constexpr int capacity = 512;  // columns of a strip
  static constexpr int batch = 8;       // rows fetched at once
  static constexpr int mixed = 8;       // the pattern of a group that follows none

  void find_columns();
  SSEMath::Int4 group_of_columns(int i) const;
  void fetch();
  void fetch_groups(const std::uint32_t* const* rows);

  const Sprite_c& sprite;
  const Scale& scale;
  const i64 last;  // linear position of the image's last pixel
  int strip_x, strip_width = 0;

  // The strip's columns, relative to its first, in groups of four. In most groups each column is that of its left
  // neighbour or the next one: bit k of the pattern is set where column k + 1 is the next.
  alignas(16) int column[capacity];
  unsigned char pattern[capacity / 4];
  int lowest, highest;  // of column
  int columns_done = 0;
  SSEMath::Float4 lanes, advance;

  // The rows that are ready, and how often each of them is still to be given.
  int count, current;
  int repeats[batch];
  int rows_left;
  float row;  // image rows from the start to the next row to fetch
  alignas(16) std::uint32_t fetched[batch][capacity];
};

}  // namespace sprite_render
