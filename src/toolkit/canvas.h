// Presents frames on the X11 drawable of an AWT component: by a pair of shared-memory images where the display offers
// MIT-SHM, else by one ordinary image. The display connection is AWT's.
//
// Pixels are 0xAARRGGBB words, rows follow each other without gaps; the display ignores the alpha byte. All operations
// belong to the control thread, between passes.
#pragma once

#include <jni.h>

// Xlib's records, without its headers and their macros.
struct _XDisplay;
struct _XImage;
struct display_binding;

class canvas {
 public:
  // The layout of MIT-SHM's XShmSegmentInfo.
  struct segment {
    unsigned long shmseg;  // the server's id
    int shmid;             // the kernel's id
    char* shmaddr;
    int readOnly;
  };

  // component: a displayable AWT component with a window of its own, referenced weakly. Sizes are pixels, at least 1
  // and together at most 2 GB. Throws RuntimeException* without memory, IllegalStateException* when AWT or the
  // display cannot serve the component; nothing is left behind then.
  canvas(JavaVM* vm, jobject component, int width, int height, const display_binding& binding);
  ~canvas();
  canvas(const canvas&) = delete;
  canvas& operator=(const canvas&) = delete;

  // Moves to another component or size. The old buffers are gone, so the canvas must be made active again before
  // anything is drawn. A failure, as for the constructor, leaves a canvas without buffers that shows nothing.
  void resized(jobject component, int width, int height);

  // Shows the rectangle at (x, y), which must lie inside the image, at the drawable's top left corner. With shared
  // memory the other image becomes the back buffer, and the colour target of the toolkit and of the raster stage,
  // whichever target was active; it holds the frame before the last. Shows nothing when AWT will not lock.
  void flip(int x, int y, int width, int height);

  // Shows nothing: full flips do the presenting.
  void flip_dirtyrect(int, int, int, int, int, int);

  // The calling thread's environment.
  JNIEnv* get_env() const;

  JavaVM* vm;
  jweak java_canvas = nullptr;
  bool use_shm = false;
  int current = 0;  // which image is the back buffer
  segment shm[2] = {};
  _XDisplay* display = nullptr;  // AWT's
  _XImage* image[2] = {};        // the second only with shared memory
  int width = 0;
  int height = 0;
  unsigned int* colourbuffer = nullptr;  // the back buffer
  float* depthbuffer = nullptr;

 private:
  void create_backbuffer(int new_width, int new_height);
  bool create_shared_images();
  bool map_shared_image(int i);
  void create_local_image();
  void release_shared_image(int i);
  void free_backbuffer();

  const display_binding& binding;
};
