#include "model/model.h"

#include "util/exception.h"

int model::modelcount = 0;

void model::updatefunctionmask(unsigned int mask) {
  if ((mask & ~functionmask) != 0) {
    throw new IllegalArgumentException("Can't re-enable previously disabled functions");
  }
  if ((functionmask & ~mask & FM_SHARELIGHT) != 0) {
    for (int f = 0; ftype.block != nullptr && f < facecount; ++f) {
      if (ftype[f] == FT_HIDDEN) ftype[f] = FT_SMOOTH;
    }
    // Still with the old mask, which may keep the face colours.
    light(true);
  }
  functionmask = mask;
}

void model::geometrychanged() {
  pool->monitor_enter();
  vnormal = {};
  vsharednormal = {};
  fnormal = {};
  boundsvalid = false;
  if ((flags & MF_LIT) != 0) calculatenormals();
  pool->monitor_exit();
}
