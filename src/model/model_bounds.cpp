// The box and the radii around a model's mesh.
#include <xmmintrin.h>

#include <algorithm>
#include <cmath>

#include "model/model.h"

namespace {

// To 16 bits as the conversion instruction and a narrowing store do it, whatever the value.
short truncated(float value) { return static_cast<short>(_mm_cvttss_si32(_mm_set_ss(value))); }

}  // namespace

void model::calcbounding() {
  float low[3] = {32767, 32767, 32767};
  float high[3] = {-32768, -32768, -32768};
  float cylinder = 0;
  float sphere = 0;
  for (int i = 0; i < meshvertexcount; ++i) {
    const Vector4_s& p = vpos[i];
    const float position[3] = {p.x, p.y, p.z};
    for (int axis = 0; axis < 3; ++axis) {
      low[axis] = std::min(low[axis], position[axis]);
      high[axis] = std::max(high[axis], position[axis]);
    }
    cylinder = std::max(cylinder, p.x * p.x + p.z * p.z);
    sphere = std::max(sphere, p.x * p.x + p.y * p.y + p.z * p.z);
  }
  minx = truncated(low[0]);
  miny = truncated(low[1]);
  minz = truncated(low[2]);
  maxx = truncated(high[0]);
  maxy = truncated(high[1]);
  maxz = truncated(high[2]);
  // 0.99: the integer radius encloses every vertex.
  radiuscylinder = truncated(std::sqrt(cylinder) + 0.99f);
  radiussphere = truncated(std::sqrt(sphere) + 0.99f);
  boundsvalid = true;
}

// Clients get the 16 bits as they are; they narrow them to a short themselves.
#define VELMARK5_BOUND(getter, field)          \
  int model::getter() {                        \
    if (!boundsvalid) calcbounding();          \
    return static_cast<unsigned short>(field); \
  }
VELMARK5_BOUND(getradius_cylinder, radiuscylinder)
VELMARK5_BOUND(getradius_sphere, radiussphere)
VELMARK5_BOUND(get_minx, minx)
VELMARK5_BOUND(get_maxx, maxx)
VELMARK5_BOUND(get_miny, miny)
VELMARK5_BOUND(get_maxy, maxy)
VELMARK5_BOUND(get_minz, minz)
VELMARK5_BOUND(get_maxz, maxz)
#undef VELMARK5_BOUND
