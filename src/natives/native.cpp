#include "natives/native.h"

#include "natives/in_use.h"
#include "raster/Rasterizer.h"

namespace natives {

void forget_target(const void* colour, const void* depth) {
  if (!contract::checked) return;
  const auto is_target = [](const void* pointer, const void* gone) { return gone != nullptr && pointer == gone; };
  if (is_target(Rasterizer_n::m_pColourBuffer, colour) || is_target(Rasterizer_n::m_pDepthBuffer, depth)) {
    in_use::refuse_target();
  }
  const auto forget = [](auto*& pointer, const void* gone) {
    if (pointer == gone) pointer = nullptr;
  };
  forget(Rasterizer_n::m_pColourBuffer, colour);
  forget(Rasterizer_n::m_pDepthBuffer, depth);
  if (toolkit* instance = toolkit::live_instance; instance != nullptr) {
    forget(instance->colourbuffer, colour);
    forget(instance->depthbuffer, depth);
  }
}

}  // namespace natives
