// A mesh as parallel arrays in a pool. A copy shares every array that it is not going to change; the function mask says
// in advance which operations may still come, and bits of it can only be taken away.
//
// Allocated with _aligned_malloc at 16 bytes. Operations that allocate can move every block of the pool. The sources
// are split by theme: model.cpp (state), model_build.cpp, model_texcoords.cpp, model_light.cpp, model_bounds.cpp,
// model_render.cpp.
#pragma once

#include "maths/Vector4.h"
#include "model/billboard.h"
#include "natives/jniarray.h"
#include "util/memorymanager/memorypool.h"
#include "util/memorymanager/sharedarray.h"

class Matrix_c;
struct mesh_views;
struct threadresource;

// Operations that a model may still be put through, and what they keep alive.
enum functionmask_bits : unsigned int {
  FM_MOVE_X = 0x00001,
  FM_MOVE_Y = 0x00002,
  FM_MOVE_Z = 0x00004,
  FM_ROTATE_NORMALS = 0x00008,
  FM_MIRROR = 0x00010,
  FM_ANIMATE_VERTICES = 0x00020,
  FM_ANIMATE_COLOUR = 0x00080,
  FM_ANIMATE_ALPHA = 0x00100,
  FM_ANIMATE_NORMALS = 0x00200,
  FM_ANIMATE_BILLBOARD = 0x00400,
  FM_RELIGHT_A = 0x01000,
  FM_RELIGHT_B = 0x02000,
  FM_RECOLOUR = 0x04000,
  FM_RETEXTURE = 0x08000,
  FM_SHARELIGHT = 0x10000,
  FM_GETSHADOW = 0x40000,
  FM_TINT = 0x80000,
};

// A model with any of these may be lit again: its face colours outlive the lighting.
inline constexpr unsigned int FM_KEEP_HSL = FM_ROTATE_NORMALS | FM_MIRROR | FM_ANIMATE_COLOUR | FM_ANIMATE_NORMALS |
                                            FM_RELIGHT_A | FM_RELIGHT_B | FM_RECOLOUR | FM_SHARELIGHT | FM_TINT;
static_assert(FM_KEEP_HSL == 0x97298);

// Build flags; all other bits are the client's.
enum modelflag_bits : unsigned int {
  MF_LIT = 0x10,             // takes light at its vertices: point lights, and normals at once when it moves
  MF_NOALPHATEXTURE = 0x40,  // textures that may be replaced by their flat colour are
};

// Shading types of faces. Others get no light.
inline constexpr unsigned char FT_SMOOTH = 0, FT_FLAT = 1, FT_HIDDEN = 2;

inline constexpr unsigned short no_texture = 65535;

// Colours of a face's corners before sun and point lights, 0xAARRGGBB with the face's opacity on top.
struct face_colours {
  unsigned int corner[3];
};

struct texture_coordinates {
  float u, v;  // 128 to a repeat
};

class alignas(16) model {
 public:
  explicit model(memorypool* from = nullptr) : pool(from) {}
  model(const model&) = delete;
  model& operator=(const model&) = delete;

  // --- Building (model_build.cpp, model_texcoords.cpp) ----------------------------------------------------------

  // Fills a fresh model from the client's mesh. Throws OutOfMemory*; the arrays made so far go with the model.
  void build(const mesh_views& mesh);

  // --- State (model.cpp) ----------------------------------------------------------------------------------------

  // Takes bits of the mask away; a bit that is not held throws IllegalArgumentException*.
  void updatefunctionmask(unsigned int mask);
  // After vertices have moved and normals have not.
  void geometrychanged();

  void setambient(unsigned int value) { ambient = static_cast<int>(value); }
  void setcontrast(unsigned int value) { contrast = static_cast<int>(value); }
  unsigned int getambient() const { return static_cast<unsigned int>(ambient); }
  unsigned int getcontrast() const { return static_cast<unsigned int>(contrast); }

  // --- Bounds (model_bounds.cpp): computed when asked for, over the mesh vertices -------------------------------

  void calcbounding();
  int getradius_cylinder();
  int getradius_sphere();
  int get_minx();
  int get_maxx();
  int get_miny();
  int get_maxy();
  int get_minz();
  int get_maxz();

  // --- Light (model_light.cpp) ----------------------------------------------------------------------------------

  // Means of the unit normals of the smooth faces at each vertex, and a normal for each flat face.
  void calculatenormals();
  // Bakes what depends on neither sun nor camera into fcolours. Needs fhsl, and drops it when no function keeps it.
  void light(bool);

  unsigned int light_getunlitrgb(unsigned int hsl, unsigned short texture) const;
  static unsigned int light_getsunlitrgb(unsigned int rgb, const Vector4_s& normal, unsigned char alpha,
                                         float contrastfactor);
  unsigned int light_getpointlitrgb(unsigned int rgb, const Vector4_s& position, const Vector4_s& normal) const;

  // --- Drawing (model_render.cpp) -------------------------------------------------------------------------------

  // Draws the model on the current target. result: null or six ints: x and y of both ends of the axis, radius, 1;
  // written when the model is not culled. The scratch is the calling thread's own.
  void render(threadresource& resource, const Matrix_c& world, copied_jintArray& result);

  static int modelcount;  // models drawn since the client last asked

  // --- Record ---------------------------------------------------------------------------------------------------

  memorypool* pool;
  unsigned int functionmask = 0;
  unsigned int flags = 0;
  int vertexcount = 0;
  int meshvertexcount = 0;  // the first vertices, those of the faces; the others are loose points

  sharedarray<Vector4_s> vpos;           // model units, y down; w is not used
  sharedarray<Vector4_s> vnormal;        // w 1, or all 0 where no smooth face touches; empty until computed
  sharedarray<Vector4_s> vsharednormal;  // merged with a neighbour; entries with w 0 defer to vnormal
  sharedarray<unsigned short> vmask;     // part mask

  unsigned short texfacecount = 0;  // the first faces, the textured ones
  unsigned short facecount = 0;
  sharedarray<unsigned short> fa, fb, fc;  // vertices
  sharedarray<face_colours> fcolours;      // empty: to be rebuilt by light
  sharedarray<unsigned short> ftex;        // textured faces only
  sharedarray<texture_coordinates> fuv0, fuv1, fuv2;
  sharedarray<unsigned char> ftype;      // empty: all smooth
  sharedarray<unsigned char> fpriority;  // carried
  sharedarray<unsigned char> falpha;     // transparency, 255 invisible; empty: all opaque
  sharedarray<unsigned short> fhsl;      // colours; released when nothing needs them
  sharedarray<unsigned short> fmask;     // part mask
  sharedarray<Vector4_s> fnormal;        // of flat faces, w 1

  sharedarray<int> pslist;  // 3 vertices per emitter, then 1 per effector
  sharedarray<billboard> billboards;
  sharedarray<billboard_properties> billboardproperties;
  sharedarray2d<unsigned short> vlabels, flabels, bblabels;  // members by animation label

  signed char priority = -1;
  int ambient = 0;   // 128 is 1.0
  int contrast = 0;  // divisor of the sun term
  bool boundsvalid = false;
  short radiuscylinder = 0;
  short radiussphere = 0;
  short miny = 0;
  short maxy = 0;
  short minx = 0;
  short maxx = 0;
  short minz = 0;
  short maxz = 0;
  int emittercount = 0;
  int effectorcount = 0;
  float originx = 0;  // of the animation
  float originy = 0;
  float originz = 0;
  bool partialalpha = false;
  bool needrelight = false;
  bool hasalpha = false;            // some face is translucent: drawing takes two passes
  bool hasanimatedtexture = false;  // some texture scrolls
  Vector4_s lightpos[4] = {};       // point lights in model space, as of the last draw

 private:
  using face_map = int[16768];  // per input face: its new number, or dropped

  void map_faces(const mesh_views& mesh, face_map& facemap, unsigned short& textured, unsigned short& untextured) const;
  void make_billboards(const mesh_views& mesh, face_map& facemap, unsigned short textured, unsigned short& untextured);
  void copy_faces(const mesh_views& mesh, const face_map& facemap);
  void collapse_carriers();
  void calculatetexturecoords(const mesh_views& mesh, const face_map& facemap);
  void getplist(const copied_jintArrayRO& labels);
  void getflist(const copied_jintArrayRO& labels, const face_map& facemap);
  void getbblist(const copied_jintArrayRO& labels, int billboardcount);

  // Draws the model by five compile-time switches. model_variants.h lists the instances.
  template <bool POINTLIT, bool DISTANCEFOG, bool HEIGHTFOG, bool COLOUR, bool DEPTH>
  void render2(threadresource& resource, const Matrix_c& world, const Matrix_c& modelviewprojection);

  using render_variant = void (model::*)(threadresource&, const Matrix_c&, const Matrix_c&);
  static render_variant select_variant(bool pointlit, bool distancefog, bool heightfog, bool colour, bool depth);

  template <bool, bool, bool, bool, bool>
  friend class face_drawer;
};
