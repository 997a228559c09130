// Four floats, one SIMD register.
#pragma once

struct alignas(16) Vector4_s {
  float x, y, z, w;
};
