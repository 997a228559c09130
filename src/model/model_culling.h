// The first half of drawing a model: where its vertices stand on the screen, and which of its faces show there. Four
// vertices or faces at a time, and nothing but the thread's scratch is written.
#pragma once

#include <algorithm>
#include <cstdint>

#include "maths/Matrix.h"
#include "maths/SSEMath.h"
#include "maths/Vector4.h"
#include "model/mesh_views.h"
#include "toolkit/threadresource.h"

namespace culling {

// Asks for memory that is read soon. Past some lines the processor looks ahead by itself.
VELMARK5_LANE void prefetch(const void* from, int bytes) {
  constexpr int line = 64, enough = 64 * line;
  const char* const p = static_cast<const char*>(from);
  for (int i = 0; i < std::min(bytes, enough); i += line) _mm_prefetch(p + i, _MM_HINT_T0);
}

// What the flags of a model's vertices have in common.
struct flag_summary {
  int any;  // flags that some vertex has
  int all;  // flags that every vertex has
};

// Screen x, y, depth, depth and the culling flags of each vertex. Up to three entries past the last are overwritten.
flag_summary project(const Vector4_s* positions, int count, const Matrix_c& modelviewprojection, threadresource& out);

// Minus the world y of each vertex, as the bits of a float. Up to three entries past the last are overwritten.
void find_heights(const Vector4_s* positions, int count, const Matrix_c& world, threadresource& out);

// A bit per face.
class face_set {
 public:
  static constexpr int word_bits = 32;

  bool contains(int face) const { return (words_[face / word_bits] >> (face % word_bits) & 1) != 0; }
  std::uint32_t& word_of(int face) { return words_[face / word_bits]; }
  std::uint32_t word_of(int face) const { return words_[face / word_bits]; }

 private:
  std::uint32_t words_[(mesh_views::max_faces + word_bits - 1) / word_bits];
};

// The corners of all faces.
struct corners {
  const unsigned short *a, *b, *c;
};

// Into visible: the faces that turn their front to the viewer and that no bound of the view shuts out.
void find_visible(const corners& faces, int count, const threadresource& projected, flag_summary flags,
                  face_set& visible);

// Whether the box of the vertices lies behind what is drawn already. Models that reach out of view are not looked at.
bool is_covered(int count, const threadresource& projected, flag_summary flags);

}  // namespace culling
