// A mesh as the client hands it over: one array per attribute, in the client's face order, and a few counts. The views
// open in the order of the members and close in reverse.
#pragma once

#include "natives/jniarray.h"

struct mesh_views {
  // Faces and vertices of one model are limited by the scratch of a threadresource.
  static constexpr int max_faces = 16768;
  static constexpr int max_vertices = 16768;

  int vertexcount;
  int meshvertexcount;              // the first vertices, those that faces use; the others are loose points
  copied_jintArrayRO x, y, z;       // vertex positions
  copied_jintArrayRO vertexlabels;  // optional: animation label per vertex, negative for none
  copied_jshortArrayRO vmask;       // optional: part mask per vertex
  int inputfacecount;
  copied_jshortArrayRO a, b, c;   // vertices of each face
  copied_jbyteArrayRO ftype;      // optional: shading type
  copied_jbyteArrayRO fpriority;  // optional
  copied_jbyteArrayRO falpha;     // optional: transparency
  copied_jbyteArrayRO fmapping;   // optional: texture mapping, 255 for the default one
  copied_jshortArrayRO fhsl;      // colour
  copied_jshortArrayRO ftex;      // optional: texture id, 65535 for none
  copied_jintArrayRO facelabels;  // optional: label per face, then one per billboard
  signed char priority;
  copied_jshortArrayRO fmask;  // optional: part mask per face
  int mappingcount;
  copied_jbyteArrayRO mappingtype;                    // 0 plane, 1 cylinder, 2 cube, 3 sphere
  copied_jshortArrayRO mappingp, mappingm, mappingn;  // three vertices of a plane, else x, y, z of a direction
  copied_jintArrayRO mappingscalex, mappingscaley, mappingscalez;
  copied_jbyteArrayRO mappingrotation;
  copied_jbyteArrayRO mappingdirection;  // quarter turns of the coordinates
  copied_jintArrayRO mappingtranslatex, mappingtranslatey, mappingtranslatez;
  copied_jintArrayRO pslist;  // optional: 3 vertices per emitter, then 1 per effector
  int emittercount;
  int effectorcount;
  unsigned int functionmask;
  unsigned int flags;
  int ambient;
  int contrast;
  copied_jintArrayRO billboarddata;  // optional: records of billboard_words

  // A billboard record: face, width, height, texture, colour operation, blend, flag.
  static constexpr int billboard_words = 7;
  // Clients leave eight integers of room for each.
  int billboardcount() const { return billboarddata.length() / 8; }
};
