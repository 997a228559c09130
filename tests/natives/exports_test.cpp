// The library exports its natives and nothing else.
#include <gtest/gtest.h>
#include <stdio.h>
#include <string.h>

#include <fstream>
#include <set>
#include <string>

namespace {

using names = std::set<std::string>;

names lines_of(const std::string& file_name) {
  std::ifstream file(file_name);
  EXPECT_TRUE(file.good()) << file_name;
  names found;
  for (std::string line; std::getline(file, line);) found.insert(line);
  return found;
}

std::string missing(const names& from, const names& in) {
  std::string list;
  for (const std::string& name : in) {
    if (!from.contains(name)) list += "\n  " + name;
  }
  return list;
}

TEST(exports, are_the_natives_of_the_table) {
  names exported;
  FILE* const pipe = popen("nm -D --defined-only --format=posix '" VELMARK5_LIBRARY "'", "r");
  ASSERT_NE(pipe, nullptr);
  char line[1000];
  while (fgets(line, sizeof line, pipe) != nullptr) exported.insert(std::string(line, strcspn(line, " \n")));
  ASSERT_EQ(pclose(pipe), 0) << "nm comes with the compiler";
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
  std::erase_if(exported, [](const std::string& name) { return !name.starts_with("Java_"); });
#endif

  const std::string table = VELMARK5_TEST_DATA "/natives/exports.txt";
  const names listed = lines_of(table);
  EXPECT_EQ(missing(listed, exported), "") << "exported, but not in " << table << ": add these lines, sorted";
  EXPECT_EQ(missing(exported, listed), "") << "in " << table << ", but not exported: remove these lines, or build them";

  // Every name is one of the client's.
  names declared;
  for (const std::string& line_of_header : lines_of(VELMARK5_TEST_DATA "/support/natives.h")) {
    const std::size_t start = line_of_header.find("Java_");
    if (start != std::string::npos) {
      declared.insert(line_of_header.substr(start, line_of_header.find('(', start) - start));
    }
  }
  EXPECT_EQ(declared.size(), 161u);
  EXPECT_EQ(missing(declared, listed), "") << "no native of the client";
}

}  // namespace
