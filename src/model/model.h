// A mesh as parallel arrays in a pool.
#pragma once

class model {
 public:
  static int modelcount;  // models drawn since the client last asked
};
