// 4 by 4 matrices for row vectors: a point is x * row0 + y * row1 + z * row2 + row3, and in A * B, A is applied first.
#pragma once

#include <cstdint>

#include "maths/Vector4.h"

class alignas(16) Matrix_c {
 public:
  Vector4_s rows[4];

  static const Matrix_c IdentityRows;
  static const Vector4_s NegateX, NegateY, NegateZ;
  static const Vector4_s OneOneOneZero;
  alignas(16) static const std::uint32_t XYZMask[4];    // clears the w lane
  alignas(16) static const std::uint32_t ZSignMask[4];  // picks the sign of the z lane

  // a * b: a is applied first.
  static Matrix_c Multiply(const Matrix_c& a, const Matrix_c& b);

  // The six planes of a view or view-projection matrix: (a, b, c) is a unit normal within 12 bits, d its offset.
  static void ExtractFrustumPlanes(const Matrix_c& matrix, Vector4_s planes[6]);
};
