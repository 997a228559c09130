#include "maths/Matrix.h"

#include "maths/SSEMath.h"

constinit const Matrix_c Matrix_c::IdentityRows{{{1, 0, 0, 0}, {0, 1, 0, 0}, {0, 0, 1, 0}, {0, 0, 0, 1}}};
constinit const Vector4_s Matrix_c::NegateX{-1, 1, 1, 1};
constinit const Vector4_s Matrix_c::NegateY{1, -1, 1, 1};
constinit const Vector4_s Matrix_c::NegateZ{1, 1, -1, 1};
constinit const Vector4_s Matrix_c::OneOneOneZero{1, 1, 1, 0};
constinit const std::uint32_t Matrix_c::XYZMask[4] = {0xFFFFFFFF, 0xFFFFFFFF, 0xFFFFFFFF, 0};
constinit const std::uint32_t Matrix_c::ZSignMask[4] = {0, 0, 0x80000000, 0};

Matrix_c Matrix_c::Multiply(const Matrix_c& a, const Matrix_c& b) {
  using namespace SSEMath;
  const auto row = [&b](int i) { return load(&b.rows[i].x); };
  Matrix_c product;
  for (int i = 0; i < 4; ++i) {
    const Vector4_s& left = a.rows[i];
    store(&product.rows[i].x,
          (splat(left.x) * row(0) + splat(left.z) * row(2)) + (splat(left.y) * row(1) + splat(left.w) * row(3)));
  }
  return product;
}

void Matrix_c::ExtractFrustumPlanes(const Matrix_c& matrix, Vector4_s planes[6]) {
  // The planes are sums and differences of columns.
  __m128 c0 = _mm_load_ps(&matrix.rows[0].x);
  __m128 c1 = _mm_load_ps(&matrix.rows[1].x);
  __m128 c2 = _mm_load_ps(&matrix.rows[2].x);
  __m128 c3 = _mm_load_ps(&matrix.rows[3].x);
  _MM_TRANSPOSE4_PS(c0, c1, c2, c3);

  const auto store_normalised = [](Vector4_s& out, __m128 plane) {
    const __m128 squares = _mm_mul_ps(plane, plane);
    const __m128 y = _mm_shuffle_ps(squares, squares, _MM_SHUFFLE(1, 1, 1, 1));
    const __m128 z = _mm_shuffle_ps(squares, squares, _MM_SHUFFLE(2, 2, 2, 2));
    const __m128 length_squared = _mm_add_ss(_mm_add_ss(squares, y), z);
    const __m128 scale = _mm_rsqrt_ss(length_squared);
    _mm_store_ps(&out.x, _mm_mul_ps(plane, _mm_shuffle_ps(scale, scale, 0)));
  };
  store_normalised(planes[0], _mm_add_ps(c3, c0));
  store_normalised(planes[1], _mm_sub_ps(c3, c0));
  store_normalised(planes[2], _mm_add_ps(c3, c1));
  store_normalised(planes[3], _mm_sub_ps(c3, c1));
  store_normalised(planes[4], _mm_add_ps(c3, c2));
  store_normalised(planes[5], _mm_sub_ps(c3, c2));
}
