// Draws the triangle scenes with OSMesa's llvmpipe, in a process of its own per vector width: Mesa reads its settings
// once, and neither side shares memory or threads with the other.
#pragma once

#include "triangle_scene.h"

class mesa_peer {
 public:
  // vector_width: bits of llvmpipe's vectors. It draws on one thread.
  explicit mesa_peer(int vector_width);
  mesa_peer(const mesa_peer&) = delete;
  mesa_peer& operator=(const mesa_peer&) = delete;

  struct result {
    double seconds;  // of processor time, from the draw call until everything is drawn, clearing not counted; negative:
                     // no such renderer
    long covered;    // pixels whose depth has changed
  };
  // Clears, then draws the scene's triangles; for counting pixels, only the sparse ones.
  result draw(triangle_scene::kind kind, int size, bool count_pixels);

 private:
  int requests_;  // pipe to the process
  int results_;   // and back
};
