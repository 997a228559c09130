// The library exports the natives that its table lists and that the client's peers declare, and nothing else.
#include <gtest/gtest.h>
#include <stdio.h>
#include <string.h>

#include <fstream>
#include <set>
#include <string>

namespace {

using names = std::set<std::string>;

// The names of natives, as the lines of a file have them.
names natives_in(const char* file_name) {
  std::ifstream file(file_name);
  EXPECT_TRUE(file.good()) << file_name;
  names found;
  for (std::string line; std::getline(file, line);) {
    const std::size_t name = line.find("Java_");
    if (name != std::string::npos) found.insert(line.substr(name));
  }
  return found;
}

TEST(exports, are_the_natives_of_the_table_and_of_the_peers) {
  names exported;
  FILE* const pipe = popen("nm -D --defined-only --format=posix '" VELMARK5_LIBRARY "'", "r");
  ASSERT_NE(pipe, nullptr);
  char line[1000];
  while (fgets(line, sizeof line, pipe) != nullptr) exported.insert(std::string(line, strcspn(line, " \n")));
  ASSERT_EQ(pclose(pipe), 0) << "nm comes with the compiler";
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
  std::erase_if(exported, [](const std::string& name) { return !name.starts_with("Java_"); });
#endif
  EXPECT_EQ(exported, natives_in(VELMARK5_TEST_DATA "/natives/exports.txt")) << "the table is a line for each, sorted";
  EXPECT_EQ(exported, natives_in(VELMARK5_CLIENT_NATIVES));
}

}  // namespace
