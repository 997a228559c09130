// Hashes of what tests drew, so that a script can compare the runs of two builds.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

class frame_record {
 public:
  // Appends "name hash" (64-bit FNV-1a of the bytes, in hex) to the file named by VELMARK5_FRAME_HASHES, if that is
  // set. Names are unique over all tests and hold no blanks. words: 32-bit elements, integer or float.
  template <class Word>
  static void add(const char* name, const Word* words, std::size_t count) {
    static_assert(sizeof(Word) == 4);
    const char* const file_name = std::getenv("VELMARK5_FRAME_HASHES");
    if (file_name == nullptr || *file_name == 0) return;
    std::FILE* const file = std::fopen(file_name, "a");
    if (file == nullptr) {
      std::perror(file_name);
      std::abort();
    }
    std::fprintf(file, "%s %016llx\n", name, static_cast<unsigned long long>(hash(words, count * sizeof(Word))));
    std::fclose(file);
  }

  static std::uint64_t hash(const void* data, std::size_t bytes) {
    std::uint64_t h = 0xCBF29CE484222325u;
    for (const auto* p = static_cast<const unsigned char*>(data); bytes > 0; ++p, --bytes) {
      h = (h ^ *p) * 0x100000001B3u;
    }
    return h;
  }
};
