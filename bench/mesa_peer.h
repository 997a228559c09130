// Draws triangle scenes and models with OSMesa's llvmpipe, in a process of its own for each setting: Mesa reads its
// settings once, and neither side shares memory or threads with the other.
#pragma once

#include "model_scene.h"
#include "triangle_scene.h"

class mesa_peer {
 public:
  // vector_width: bits of llvmpipe's vectors; threads: how many it rasterizes with beside the drawing one, or 0 to do
  // all on that. The models are copied.
  explicit mesa_peer(int vector_width, int threads = 0, const model_scene::scene* models = nullptr);
  mesa_peer(const mesa_peer&) = delete;
  mesa_peer& operator=(const mesa_peer&) = delete;

  struct result {
    double seconds;  // of processor time of the drawing thread, from the first call until everything is drawn;
                     // negative: no such renderer
    long covered;    // pixels whose depth has changed
    double wall_seconds;
  };
  // Clears, outside the time, then draws the scene's triangles; for counting pixels, only the sparse ones.
  result draw(triangle_scene::kind kind, int size, bool count_pixels);
  // Clears and draws the models, both within the time.
  result draw_models(bool count_pixels);

 private:
  struct request {
    triangle_scene::kind what;
    int size;
    bool count_pixels;
    bool models;
  };
  friend class mesa_renderer;
  [[noreturn]] static void serve(int requests, int results, int vector_width, int threads,
                                 const model_scene::scene* models);
  result ask(const request& r);

  int requests_;  // pipe to the process
  int results_;   // and back
};
