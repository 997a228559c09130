#include "reference/texture_oracle.h"

#include <algorithm>

#include "reference/numbers.h"

namespace oracle {
namespace {

constexpr float weight[5] = {0.053990968f, 0.24197072f, 0.3989423f, 0.24197072f, 0.053990968f};

int sample(int i, bool wrap) { return wrap ? i & 127 : std::clamp(i, 0, 127); }

// One pass: element i of a line lies `step` words after element i - 1.
unsigned int blurred_pixel(const unsigned int* line, int step, int i, bool wrap, bool opaque) {
  if (!opaque && line[i * step] == 0) return 0;
  float channels[4] = {};
  float sum = 0;
  for (int d = -2; d <= 2; ++d) {
    const unsigned int word = line[sample(i + d, wrap) * step];
    if (!opaque && word == 0) continue;
    for (int c = 0; c < 4; ++c) channels[c] += static_cast<float>(channel(word, c)) * weight[d + 2];
    sum += weight[d + 2];
  }
  return word_of([&](int c) { return channels[c] * (1.0f / sum); });
}

}  // namespace

std::vector<unsigned int> blurred_texture(const std::vector<unsigned int>& pixels, bool wrap_u, bool wrap_v,
                                          bool opaque) {
  std::vector<unsigned int> rows(pixels.size()), result(pixels.size());
  for (int y = 0; y < 128; ++y) {
    for (int x = 0; x < 128; ++x) rows[y * 128 + x] = blurred_pixel(&pixels[y * 128], 1, x, wrap_u, opaque);
  }
  for (int y = 0; y < 128; ++y) {
    for (int x = 0; x < 128; ++x) result[y * 128 + x] = blurred_pixel(&rows[x], 128, y, wrap_v, opaque);
  }
  return result;
}

}  // namespace oracle
