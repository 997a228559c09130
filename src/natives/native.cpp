#include "natives/native.h"

#include "raster/Rasterizer.h"

namespace natives {

void forget_target(const void* colour, const void* depth) {
  if (!contract::checked) return;
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
