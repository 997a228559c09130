#include "toolkit/threadresource.h"

#include <cstring>

#include "toolkit/toolkit.h"

int threadresource_debugcount = 0;

void dump_instances(char*) {}

threadresource::threadresource(toolkit& of, int first, int second) : owner(&of), a(first), b(second) {
  std::memset(vertices, 0, sizeof vertices);
  std::memset(vertex_words, 0, sizeof vertex_words);
  std::memset(vertex_flags, 0, sizeof vertex_flags);
  std::memset(light_key_marker, 0, sizeof light_key_marker);
  std::memset(light_table, 0, sizeof light_table);
  std::memset(light_header2, 0, sizeof light_header2);
  std::memset(light_table2, 0, sizeof light_table2);
  std::memset(tail, 0, sizeof tail);
  light_key_marker[0] = 1;
  marker2 = 0;
  owner->threads.linkafter(*this);
}
