// Presents frames on the X11 drawable of an AWT component: by a pair of shared-memory images where the display offers
// MIT-SHM, else by one ordinary image. The display connection is AWT's.
#pragma once

#include <jni.h>

class canvas {
 public:
  int width;
  int height;
  unsigned int* colourbuffer;  // the back buffer, pitch equal to width
  float* depthbuffer;
};
