// A shape for 2D drawing: one horizontal span per row, placed at draw time by an offset.
#pragma once

#include "natives/jniarray.h"
#include "util/memorymanager/sharedarray.h"

class clippingmask {
 public:
  // Copies both arrays into the pool; null arrays give a mask of no rows.
  clippingmask(memorymanager* pool, int width, int height, const copied_jintArrayRO& starts,
               const copied_jintArrayRO& lengths);

  int rows() const { return starts.count(); }

  int width;
  int height;
  sharedarray<int> starts;   // per row: x offset at which the span begins
  sharedarray<int> lengths;  // per row: pixels of the span; as long as starts, by the caller's promise
};
