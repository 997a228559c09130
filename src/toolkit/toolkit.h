// The root object, one per process: render target, clip rectangle, scene state, and the way back into Java.
//
// The control thread writes it between passes; worker threads read it during a pass without locks. The operations are
// split by theme over toolkit_*.cpp.
#pragma once

#include <jni.h>

#include "maths/Matrix.h"
#include "maths/Vector4.h"
#include "natives/jniarray.h"
#include "util/memorymanager/linkable.h"

class canvas;
class clippingmask;
class DepthBuffer_c;
class memorymanager;
class texturecache;
struct texturemetrics;
struct Sprite_c;
struct threadresource;

// Java methods of the toolkit's peer class "ja".
extern jmethodID mid_request_texture;  // SA (S)Z
extern jmethodID mid_garbagecollect;   // h ()V
extern jmethodID mid_createshadow;     // WA ()Ljava/lang/Object;

class alignas(16) toolkit {
 public:
  // peer: the SseToolkit object, referenced weakly. texture_source may be null: there is no texture cache then.
  toolkit(JNIEnv* env, jobject peer, jobject texture_source, int texture_count);
  ~toolkit();
  toolkit(const toolkit&) = delete;
  toolkit& operator=(const toolkit&) = delete;

  static toolkit* m_pInstance;
  // The toolkit that was made last, null once it is gone; m_pInstance keeps its value then.
  static toolkit* live_instance;

  // --- Java -----------------------------------------------------------------------------------------------------

  // The calling thread's environment.
  JNIEnv* get_env() const;

  // Callbacks into the client. An exception that they raise stays pending.
  bool request_texture(unsigned short id);
  void garbagecollect();
  jobject createshadow();

  // Moves texture scrolling on. time: milliseconds of the client's clock.
  void service(int time);
  void quit() { quit_requested = true; }

  // The attributes of the texture; null for an id that has none.
  const texturemetrics* get_texturemetrics(unsigned short id) const;
  // Into the texture cache, which must exist.
  void upload_texturemetrics(unsigned short id, const texturemetrics& fields);
  void upload_texture(unsigned short id, const unsigned int* pixels, const texturemetrics& fields);

  // --- Target (toolkit_target.cpp) ------------------------------------------------------------------------------

  // Makes the canvas the target, with clip rectangle and viewport over all of it, and clears it to black and far
  // depth. Null stops triangles and sprites.
  void set_active_canvas(canvas* c);
  void setup_backbuffer(unsigned int* colour, float* depth, int unused0, int unused1, int pitch);
  // Either may be null; a sprite's pitch must equal its width for the 2D primitives.
  void start_offscreen_render(Sprite_c* sprite, DepthBuffer_c* depth);
  void resetviewport();
  void set_zwrite(bool enable);

  // --- Clip rectangle (toolkit_clip.cpp): right and bottom exclusive, within the target -------------------------

  void setclipping(int x0, int y0, int x1, int y1);
  void setsubclipping(int x0, int y0, int x1, int y1);  // only ever narrows
  void resetclipping();
  void getclipping(int* out) const;  // four ints: x0, y0, x1, y1
  void updateClippingDerived();

  // --- Scene state (toolkit_scene.cpp) ---------------------------------------------------------------------------
  //
  // Set between passes; what depends on the values is derived at once, here and in the raster state.

  void set_camera(const Matrix_c& matrix);      // world to view
  void set_projection(const Matrix_c& matrix);  // view to clip; after the viewport, through which fog is measured
  void set_globalambient(float level) { ambient = level; }
  // colour: 0x00RRGGBB; front, back: multipliers on faces toward the sun and away from it; the direction of any length.
  void set_globalsun(int colour, float front, float back, float x, float y, float z);
  // start: distance back from the far plane at which distance fog begins; negative ones count as 0.
  void set_fog(unsigned int colour, int start);
  // Five integers a light: x, y, z, range, colour; one strength each, at most 1. More than four lights are cut to four.
  void set_pointlights(int count, const int* lights, const float* strengths);
  // level: the height of the water; range: over how much depth the fog grows to its full strength. The distance fog
  // takes the colour at the next set_fog or set_projection.
  void underwatermode_enable(int level, unsigned int colour, int range);
  void underwatermode_adjust(int level, unsigned int colour, int range);
  void underwatermode_disable();
  void set_shadow_resolution(int value);  // rounded down to a power of two, at least 1

  // --- Primitives (toolkit_fill.cpp, toolkit_line*.cpp, toolkit_circle.cpp, toolkit_area.cpp) --------------------
  //
  // Pixels are target pixels; everything is clipped but the area copies. mode: 0 opaque, 1 alpha blend, 2 additive; any
  // other throws IllegalArgumentException*. Without a colour buffer nothing is drawn.

  void cls(unsigned int colour);
  void cls_masked(unsigned int colour, clippingmask& mask, int x, int y);
  void rect_fill(int x, int y, int w, int h, unsigned int colour, unsigned int mode);
  void line_h(int x, int y, int length, unsigned int colour, unsigned int mode);
  void line_v(int x, int y, int length, unsigned int colour, unsigned int mode);
  void line_v(int x, int y, int length, unsigned int colour) { line_v(x, y, length, colour, 1); }
  void line(int x0, int y0, int x1, int y1, unsigned int colour, unsigned int mode);
  void line(int x0, int y0, int x1, int y1, unsigned int colour, unsigned int mode, clippingmask& mask, int mask_x,
            int mask_y);
  // Plots one pixel where the world point (x0, y0, z0) is on screen; the second point is not looked at.
  void line(int x0, int y0, int z0, int x1, int y1, int z1, unsigned int colour, unsigned int mode);
  // A line of `thickness` pixels, displaced by the corner of the clip rectangle. Blends in mode 1; any other mode draws
  // the colour word as it stands. The resource is not used and may be null.
  void line_thick(threadresource* resource, int x0, int y0, int x1, int y1, unsigned int colour, int thickness,
                  unsigned int mode);
  void circle_fill(int x, int y, int z, int radius, unsigned int colour, unsigned int mode);
  // Draws nothing, on purpose.
  void circle_outline(int x, int y, int z, int radius, unsigned int colour, unsigned int mode);

  // Shifts the whole target linearly by dy rows and dx pixels; rows wrap at the edges.
  template <bool Colour, bool Depth>
  void scroll(int dx, int dy);

  // Copies w by h pixels at (x, y), which must lie inside the target, to or from rows of the array.
  void getarea(int x, int y, int w, int h, pinned_jintArray& out);
  void setarea(int x, int y, int w, int h, const pinned_jintArrayRO& in, int offset, int stride);

  void zbuffer_clear(int x, int y, int w, int h, float value);

  // --- Record ---------------------------------------------------------------------------------------------------

  bool quit_requested = false;  // the library never reads it
  JavaVM* vm = nullptr;
  jweak java_peer = nullptr;  // target of the callbacks
  int thread_count = 1;       // the texture cache takes its Java monitor at 2 or more
  memorymanager* pool = nullptr;
  texturecache* textures = nullptr;  // null when the client passed no texture source
  linkable threads;                  // ring of threadresource

  int width = 0;  // of the current target, in pixels
  int height = 0;
  unsigned int* colourbuffer = nullptr;
  float* depthbuffer = nullptr;
  Sprite_c* offscreen_sprite = nullptr;
  DepthBuffer_c* offscreen_depth = nullptr;
  int clip_x0 = 0;
  int clip_y0 = 0;
  int clip_x1 = 0;
  int clip_y1 = 0;

  float sun_x = 0;  // normalised direction
  float sun_y = 0;
  float sun_z = 0;
  unsigned char sun_r = 0;
  unsigned char sun_g = 0;
  unsigned char sun_b = 0;
  float sun_front = 0.69921875f;  // multiplier on faces toward the sun
  float sun_back = 1.2f;          // and on faces away from it
  float ambient = 1.15234375f;
  Matrix_c camera = Matrix_c::IdentityRows;      // world to view
  Matrix_c projection = Matrix_c::IdentityRows;  // view to clip
  Matrix_c viewprojection = Matrix_c::IdentityRows;
  Vector4_s frustum[6] = {};  // planes of viewprojection
  float fog_start = 255;      // distance, measured back from the far plane
  bool zwrite = false;        // last value given to set_zwrite
  unsigned int fog_colour = 0;
  unsigned int saved_fog_colour = 0;  // fog colour before underwater mode
  bool underwater = false;
  int underwater_height = 0;
  int underwater_range = 0;
  float underwater_height_f = 0;
  float underwater_scale = 0;  // -1 over the range
  int shadow_slope_x = 0;      // 1/256 per unit of height
  int shadow_slope_z = 0;
  int shadow_resolution = 8;  // power of two
  int shadow_resolution_shift = 3;
  int pointlight_count = 0;  // 0 to 4
  Vector4_s pointlight_pos[4] = {};
  alignas(16) float pointlight_strength[4] = {};
  unsigned int pointlight_colour[4] = {};

 private:
  void update_viewprojection();
  void update_distance_fog();
};
