#include "raster/SpriteScaling.h"

#include "raster/SpritePixels.h"

namespace sprite_render {

using namespace SSEMath;

namespace {

struct Margins {
  i64 before, after;
};

// Margins scale with the image and are cut to whole pixels, each by itself. Margins that cancel the whole image leave
// no room for it.
Margins scaled_margins(int before, int stored, int after, int size) {
  if (before == 0 && after == 0) return {0, 0};
  const i64 full = i64{before} + stored + after;
  if (full == 0) return {size, 0};
  const long double factor = static_cast<long double>(size) / full;
  return {sprite_render::truncate(static_cast<long double>(before) * factor),
          sprite_render::truncate(static_cast<long double>(after) * factor)};
}

}  // namespace

Scale scale_of(const Sprite_c& sprite, const RenderParams_s& params, const SpriteTarget_s& target) {
  Scale scale{};
  if (sprite.width < 1 || sprite.height < 1) return scale;

  const Margins x = scaled_margins(sprite.left, sprite.width, sprite.right, params.width);
  const Margins y = scaled_margins(sprite.top, sprite.height, sprite.bottom, params.height);
  const i64 width = params.width - x.before - x.after;
  const i64 height = params.height - y.before - y.after;
  if (width < 1 || height < 1) return scale;
  scale.part = visible_part(params.x + x.before, params.y + y.before, width, height, clip_of(target));
  if (scale.part.empty()) return scale;

  scale.ratio_x = static_cast<long double>(width) / sprite.width;
  const long double ratio_y = static_cast<long double>(height) / sprite.height;
  scale.step_x = static_cast<float>(1 / scale.ratio_x);
  scale.step_y = static_cast<float>(1 / ratio_y);
  const auto position = [](i64 skipped, long double ratio) {
    return skipped == 0 ? 0 : sprite_render::truncate(static_cast<long double>(skipped) / ratio);
  };
  scale.start =
      i64{position(scale.part.skipped_y, ratio_y)} * sprite.pitch + position(scale.part.skipped_x, scale.ratio_x);
  return scale;
}

ScaledRows::ScaledRows(const Sprite_c& from, const Scale& by)
    : sprite(from),
      scale(by),
      last(i64{from.height - 1} * from.pitch + from.width - 1),
      strip_x(by.part.x),
      lanes(splat(by.step_x) * floats(0, 1, 2, 3)),
      advance(splat(4 * by.step_x)) {}

bool ScaledRows::next_strip() {
  strip_x += strip_width;
  strip_width = std::min(capacity, scale.part.width - columns_done);
  if (strip_width < 1) return false;
  find_columns();
  rows_left = scale.part.height;
  row = 0;
  count = current = 0;
  repeats[0] = 0;
  return true;
}

Int4 ScaledRows::group_of_columns(int i) const { return load(reinterpret_cast<const std::uint32_t*>(column + i)); }

// Groups of four add their step up in float; what is left at the end of the run divides, and may so differ by one.
void ScaledRows::find_columns() {
  int i = 0;
  for (; i + 4 <= strip_width; i += 4, lanes += advance) {
    store_unaligned(reinterpret_cast<std::uint32_t*>(column + i), SSEMath::truncate(lanes));
  }
  for (; i < strip_width; ++i) column[i] = sprite_render::truncate((columns_done + i) / scale.ratio_x);
  columns_done += strip_width;
  // Makes the last group whole.
  for (; i % 4 != 0; ++i) column[i] = column[i - 1];

  Int4 least = group_of_columns(0);
  Int4 greatest = least;
  for (int k = 4; k < i; k += 4) {
    const Int4 four = group_of_columns(k);
    least = select(less(four, least), four, least);
    greatest = select(less(greatest, four), four, greatest);
  }
  lowest = std::min({lane<0>(least), lane<1>(least), lane<2>(least), lane<3>(least)});
  highest = std::max({lane<0>(greatest), lane<1>(greatest), lane<2>(greatest), lane<3>(greatest)});

  // A pattern takes its pixels out of four neighbours: all of them must be of the row.
  for (int k = 0; k < i; k += 4) {
    const Int4 four = group_of_columns(k);
    const Int4 step = shuffle<1, 2, 3, 3>(four) - four;
    const bool follows = lane_bits(equal(and_not(step, splat(1u)), splat(0u))) == 15 && i64{column[k]} + 3 <= highest;
    pattern[k / 4] = static_cast<unsigned char>(follows ? lane_bits(shift_left<31>(step)) : mixed);
  }
}

void ScaledRows::fetch() {
  // The next different rows of the image.
  i64 from[batch];
  float next = row;
  for (count = 0; count < batch && rows_left > 0; ++count) {
    const int at = SSEMath::truncate(next);
    int times = 0;
    do {
      ++times;
      next += scale.step_y;
    } while (times < rows_left && SSEMath::truncate(next) == at);
    from[count] = scale.start + i64{sprite.pitch} * at;
    repeats[count] = times;
    rows_left -= times;
  }
  row = next;
  current = 0;

  const auto inside = [&](int r) { return from[r] >= 0 && lowest >= 0 && from[r] + highest <= last; };
  const std::uint32_t* rows[batch];
  const std::uint32_t* some = nullptr;
  int outside = 0;
  for (int r = 0; r < count; ++r) {
    rows[r] = nullptr;
    if (inside(r)) {
      rows[r] = some = sprite.pixels + from[r];
    } else {
      ++outside;
    }
  }
  if (some != nullptr) {
    // Always a whole batch, though some of it may be of no use.
    for (int r = 0; r < batch; ++r) {
      if (r >= count || rows[r] == nullptr) rows[r] = some;
    }
    fetch_groups(rows);
  }
  for (int r = 0; outside > 0; ++r) {
    if (inside(r)) continue;
    --outside;
    // Steps that add up past the image's last pixel take that pixel.
    for (int i = 0; i < strip_width; ++i) fetched[r][i] = sprite.pixels[std::clamp<i64>(from[r] + column[i], 0, last)];
  }
}

namespace {

// The group at one place of all rows, for columns that follow the pattern A, B, C.
template <int A, int B, int C, int Rows, int Pitch>
VELMARK5_LANE void spread(std::uint32_t* to, const std::uint32_t* const* rows, std::size_t column) {
#pragma GCC unroll 8
  for (int r = 0; r < Rows; ++r) {
    store(to + r * Pitch, shuffle<0, A, A + B, A + B + C>(load_unaligned(rows[r] + column)));
  }
}

}  // namespace

void ScaledRows::fetch_groups(const std::uint32_t* const* rows) {
  for (int i = 0; i < strip_width; i += 4) {
    std::uint32_t* const to = fetched[0] + i;
    const auto first = static_cast<std::size_t>(column[i]);
    switch (pattern[i / 4]) {
#define PATTERN(bits, a, b, c)                         \
  case bits:                                           \
    spread<a, b, c, batch, capacity>(to, rows, first); \
    break;
      PATTERN(0, 0, 0, 0)
      PATTERN(1, 1, 0, 0)
      PATTERN(2, 0, 1, 0)
      PATTERN(3, 1, 1, 0)
      PATTERN(4, 0, 0, 1)
      PATTERN(5, 1, 0, 1)
      PATTERN(6, 0, 1, 1)
      PATTERN(7, 1, 1, 1)
#undef PATTERN
      default: {
        const auto second = static_cast<std::size_t>(column[i + 1]);
        const auto third = static_cast<std::size_t>(column[i + 2]);
        const auto fourth = static_cast<std::size_t>(column[i + 3]);
        for (int r = 0; r < batch; ++r) {
          const std::uint32_t* const from = rows[r];
          store(to + r * capacity, sprite_pixels::gathered(load_one(from + first), load_one(from + second),
                                                           load_one(from + third), load_one(from + fourth)));
        }
      }
    }
  }
}

}  // namespace sprite_render
