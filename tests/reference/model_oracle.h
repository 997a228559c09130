// Models the slow way: from a client's mesh to the frame, one number at a time, in plain vectors. Reads the toolkit's
// scene state and texture cache, and draws its triangles by the slow renderer into the process-wide target.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "maths/Matrix.h"
#include "maths/Vector4.h"
#include "texture/texturecache.h"

namespace oracle {

// The 43 build arguments but the two objects; arrays that are not there are null to the library.
struct Mesh {
  template <class T>
  using array = std::optional<std::vector<T>>;
  using ints = array<std::int32_t>;
  using shorts = array<std::int16_t>;
  using bytes = array<std::int8_t>;

  int vertexcount = 0, meshvertexcount = 0;
  ints position[3], vertexlabels;  // x, y, z
  shorts vmask;
  int inputfacecount = 0;
  shorts corner[3];  // a, b, c
  bytes ftype, fpriority, falpha, fmapping;
  shorts fhsl, ftex;
  ints facelabels;
  std::int8_t priority = 0;
  shorts fmask;
  int mappingcount = 0;
  bytes mappingtype;
  shorts mappingaxis[3];  // p, m, n
  ints mappingscale[3];   // x, y, z
  bytes mappingrotation, mappingdirection;
  ints mappingtranslate[3];  // x, y, z
  ints pslist;
  int emittercount = 0, effectorcount = 0;
  int functionmask = 0, flags = 0, ambient = 128, contrast = 768;
  ints billboarddata;
};

struct Coordinates {
  float u, v;
};

struct Billboard {
  int face, width, height, texture, colourop, blend;
  bool flag;
  unsigned int argb;
};

struct Labels {
  std::vector<int> rows;
  std::vector<unsigned short> members;
};

// Empty vectors stand for arrays without a block.
struct Model {
  explicit Model(const Mesh& mesh);

  void update_mask(unsigned int mask);
  void calculate_normals();
  void light();
  void bounds();

  // Draws, and gives the number of the variant: 1 point lit, 2 distance fog, 4 height fog, 8 colour, 16 depth; -1 for a
  // model that is not drawn. result: six ints or null.
  int render(const Matrix_c& world, int* result);

  int type(int f) const { return ftype.empty() ? 0 : ftype[f]; }

  unsigned int functionmask, flags;
  int ambient, contrast, meshvertexcount, facecount = 0, texfacecount = 0;
  std::vector<Vector4_s> vpos, vnormal, vsharednormal, fnormal;
  std::vector<unsigned short> vmask, corner[3], ftex, fhsl, fmask;
  std::vector<Coordinates> fuv[3];
  std::vector<unsigned char> ftype, fpriority, falpha;
  std::vector<unsigned int> fcolours;  // three a face; of faces that get no light, 0
  std::vector<int> pslist;
  std::vector<Billboard> billboards;
  Labels vlabels, flabels, bblabels;
  bool hasalpha = false, hasanimatedtexture = false, boundsvalid = false;
  int radiuscylinder = 0, radiussphere = 0, low[3], high[3];

 private:
  unsigned int transparency(int f) const { return falpha.empty() ? 0 : falpha[f]; }
  const cachedtexture* gettex(int f) const;
  void texture_coordinates(const Mesh& mesh, const std::vector<int>& number);
  unsigned int unlit(unsigned int hsl, unsigned short texture) const;
  void draw(int f, int variant, const Matrix_c& world, const Matrix_c& mvp, const Vector4_s (&lights)[4]);
};

}  // namespace oracle
