// The built library holds exactly the listed instances of each family, each as a function of its own.
#include <gtest/gtest.h>

#include <cstdio>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "raster/triangle_instances.h"

namespace {

// Instances by their template arguments, a digit each; minus one is '-'.
struct family : std::set<std::string> {
  // All combinations of a digit of each column.
  void add(const std::vector<std::string>& columns) {
    std::vector<std::string> rows = {""};
    for (const std::string& column : columns) {
      std::vector<std::string> longer;
      for (const std::string& row : rows) {
        for (const char digit : column) longer.push_back(row + digit);
      }
      rows = longer;
    }
    insert(rows.begin(), rows.end());
  }
};

// The functions NAME<...> of the library.
family built(const std::string& name) {
  family found;
  std::FILE* const symbols = popen("nm -C '" VELMARK5_LIBRARY "'", "r");
  char line[4096];
  while (std::fgets(line, sizeof line, symbols) != nullptr) {
    const std::string text = line, start = name + "<";
    const std::size_t at = text.find(start);
    if (at == std::string::npos) continue;
    std::istringstream list(text.substr(at + start.size(), text.find(">(", at) - at - start.size()));
    std::string digits;
    for (std::string value; std::getline(list, value, ',');) {
      value.erase(0, value.find_first_not_of(' '));
      value.erase(0, value.find(')') + 1);  // the cast to an enumeration
      digits += value == "true" ? '1' : value == "false" ? '0' : value[0];
    }
    found.insert(digits);
  }
  EXPECT_EQ(pclose(symbols), 0);
  return found;
}

TEST(instances, of_triangles) {
  family listed, table;
  // Shade, address of u and of v, transform, fog, blend, key, light map, depth write, colour write, depth test.
  listed.add({"-", "0", "0", "0", "0", "0", "0", "0", "0", "1", "0"});
  listed.add({"0", "0", "0", "0", "0", "0", "0", "0", "0", "1", "0"});
  listed.add({"0", "0", "0", "0", "0", "0", "0", "0", "1", "0", "1"});
  listed.add({"1", "0", "0", "0", "0", "0", "0", "0", "01", "1", "01"});
  listed.add({"1", "0", "0", "0", "0", "0", "0", "0", "0", "0", "1"});
  listed.add({"1", "0", "0", "0", "123", "0", "0", "0", "1", "1", "01"});
  listed.add({"1", "0", "0", "0", "0123", "3", "0", "0", "0", "1", "01"});
  listed.add({"2", "0", "0", "01", "0123", "0", "0", "01", "1", "1", "01"});
  listed.add({"2", "0", "0", "0", "02", "3", "0", "01", "0", "1", "01"});
  listed.add({"2", "0", "0", "1", "02", "3", "0", "01", "1", "1", "01"});
  for (const char* a : {"1", "2"}) {
    listed.add({"2", a, a, "0", "0123", "03", "01", "0", "1", "1", "01"});
    listed.add({"2", a, a, "0", "02", "2", "0", "0", "1", "1", "01"});
    listed.add({"2", a, a, "0", "13", "2", "0", "0", "0", "1", "01"});
  }
  listed.add({"3", "0", "0", "01", "0123", "0", "0", "01", "1", "1", "01"});
  ASSERT_EQ(listed.size(), 182u);
  EXPECT_EQ(built("Rasterizer_n::RenderTriangle"), listed);

  for (const Rasterizer_n::TriangleInstance& i : Rasterizer_n::triangle_instances()) {
    std::string digits = i.shade < 0 ? "-" : std::to_string(i.shade);
    for (const int mode : {i.addr_u, i.addr_v, int{i.transform}, i.fog, i.blend, int{i.key}, int{i.lightmap},
                           int{i.dwrite}, int{i.cwrite}, int{i.dtest}}) {
      digits += std::to_string(mode);
    }
    table.insert(digits);
  }
  EXPECT_EQ(table, listed);
  EXPECT_EQ(Rasterizer_n::triangle_instances().size(), 182u);
}

TEST(instances, of_sprites) {
  family plain, parallelograms, tiles;
  // Operation, blend, scaled, masked, with colour, with depth.
  plain.add({"01234", "012", "01", "0", "1", "0"});
  plain.add({"01234", "012", "1", "0", "01", "1"});
  plain.insert("110110");
  ASSERT_EQ(plain.size(), 61u);
  EXPECT_EQ(built("Sprite_c::Render"), plain);
  // Operation, blend, masked.
  parallelograms.add({"01234", "012", "0"});
  parallelograms.add({"1", "01", "1"});
  ASSERT_EQ(parallelograms.size(), 17u);
  EXPECT_EQ(built("Sprite_c::RenderParallelogram"), parallelograms);
  tiles.add({"01234", "012"});
  EXPECT_EQ(built("Sprite_c::RenderTiled"), tiles);
}

TEST(instances, of_models) {
  family listed;
  // Lit by points, distance fog, height fog, with colour, with depth: one of the two targets at least.
  listed.add({"01", "01", "01", "1", "01"});
  listed.add({"01", "01", "01", "0", "1"});
  ASSERT_EQ(listed.size(), 24u);
  EXPECT_EQ(built("model::render2"), listed);
}

}  // namespace
