// The library exports the natives that its table lists and that the client's peers declare, and nothing else.
#include <gtest/gtest.h>
#include <stdio.h>
#include <string.h>

#include <filesystem>
#include <fstream>
#include <set>
#include <string>

namespace {

using names = std::set<std::string>;

names lines_of(const std::filesystem::path& file_name) {
  std::ifstream file(file_name);
  EXPECT_TRUE(file.good()) << file_name;
  names found;
  for (std::string line; std::getline(file, line);) found.insert(line);
  return found;
}

// The natives of the peers, as the runtime looks them up.
names declared_by_peers() {
  names found;
  for (const auto& peer : std::filesystem::directory_iterator(VELMARK5_TEST_DATA "/../client/peers")) {
    for (const std::string& line : lines_of(peer.path())) {
      const std::string head = line.substr(0, line.find('('));
      if (!head.starts_with("  native ")) continue;
      found.insert("Java_" + peer.path().stem().string() + "_" + head.substr(head.rfind(' ') + 1));
    }
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
  EXPECT_EQ(exported, lines_of(VELMARK5_TEST_DATA "/natives/exports.txt")) << "the table is a line for each, sorted";
  EXPECT_EQ(exported, declared_by_peers());
}

}  // namespace
