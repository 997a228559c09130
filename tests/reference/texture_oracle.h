// The texture blur the slow way: one pixel, one tap and one channel at a time, in single precision.
#pragma once

#include <vector>

namespace oracle {

// 128 by 128 words in and out, row by row.
std::vector<unsigned int> blurred_texture(const std::vector<unsigned int>& pixels, bool wrap_u, bool wrap_v,
                                          bool opaque);

}  // namespace oracle
