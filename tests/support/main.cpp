// The test program. VELMARK5_MOVE_BLOCKS=1 in its environment moves every block of a pool at every allocation, and so
// finds each address that is kept over one.
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>

#include "util/memorymanager/memorymanager.h"

int main(int argc, char** argv) {
  testing::InitGoogleTest(&argc, argv);
  const char* const move = std::getenv("VELMARK5_MOVE_BLOCKS");
  memorymanager::move_at_every_allocation = move != nullptr && std::strcmp(move, "1") == 0;
  return RUN_ALL_TESTS();
}
