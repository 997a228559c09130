// The render context of one worker thread: scratch that model and ground rendering need, so that several threads can
// draw at a time. Allocated with _aligned_malloc.
#pragma once

#include "maths/Vector4.h"
#include "util/memorymanager/linkable.h"

class toolkit;

// For debuggers: a count that nothing keeps, and a listing that lists nothing.
extern int threadresource_debugcount;
void dump_instances(char* out);

struct alignas(16) threadresource : linkable {
  static constexpr int max_vertices = 16768;
  static constexpr int light_table_vectors = 1249;

  // Links itself at the head of owner.threads.
  threadresource(toolkit& owner, int a, int b);
  ~threadresource() { unlink(); }

  // The client calls these at the start and the end of a worker thread; nothing is to be done here.
  void linkthread() {}
  void unlinkthread() {}

  toolkit* owner;
  int a, b;  // two integers of the client

  Vector4_s vertices[max_vertices];         // transformed positions of a model or tile
  unsigned int vertex_words[max_vertices];  // a word per vertex, of the same

  unsigned char vertex_flags[max_vertices];  // culling flags of the vertices

  // Scratch of the shared lighting of models: two tables, each behind its 16-byte header.
  alignas(16) unsigned short light_key_marker[8];  // marker, then counters
  Vector4_s light_table[light_table_vectors];
  unsigned short light_header2[8];
  Vector4_s light_table2[light_table_vectors];
  alignas(16) unsigned short marker2;
  Vector4_s tail[3];
};
