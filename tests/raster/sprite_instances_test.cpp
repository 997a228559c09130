// The library holds exactly the listed instances of each family of sprite drawing.
#include <gtest/gtest.h>

#include <cstdio>
#include <map>
#include <set>
#include <string>

namespace {

// The distinct instances of "Sprite_c::NAME<...>" among the library's symbols.
std::set<std::string> instances(const std::string& name) {
  std::set<std::string> found;
  std::FILE* const symbols = popen("nm -C '" VELMARK5_LIBRARY "'", "r");
  if (symbols == nullptr) return found;
  char line[4096];
  const std::string start = "Sprite_c::" + name + "<";
  while (std::fgets(line, sizeof line, symbols) != nullptr) {
    const std::string text = line;
    const auto at = text.find(start);
    if (at == std::string::npos) continue;
    found.insert(text.substr(at + start.size(), text.find(">(", at) - at - start.size()));
  }
  pclose(symbols);
  return found;
}

TEST(sprite_instances, render) {
  const auto found = instances("Render");
  EXPECT_EQ(found.size(), 61u);
  // The last four arguments: scaled, masked, with colour, with depth.
  std::map<std::string, int> placements;
  for (const auto& arguments : found) {
    std::size_t at = arguments.find(',');
    at = arguments.find(',', at + 1);
    ++placements[arguments.substr(at + 2)];
  }
  const std::map<std::string, int> listed = {{"false, false, true, false", 15},
                                             {"true, false, true, false", 15},
                                             {"true, false, true, true", 15},
                                             {"true, false, false, true", 15},
                                             {"false, true, true, false", 1}};
  EXPECT_EQ(placements, listed);
  EXPECT_EQ(found.count("(ColourOp_e)1, (BlendMode_e)1, false, true, true, false"), 1u);
}

TEST(sprite_instances, parallelograms_and_tiles) {
  const auto found = instances("RenderParallelogram");
  EXPECT_EQ(found.size(), 17u);
  EXPECT_EQ(found.count("(ColourOp_e)1, (BlendMode_e)0, true"), 1u);
  EXPECT_EQ(found.count("(ColourOp_e)1, (BlendMode_e)1, true"), 1u);
  EXPECT_EQ(instances("RenderTiled").size(), 15u);
}

}  // namespace
