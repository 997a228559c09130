#include "natives/jniarray.h"

std::atomic<int> pin_count{0};
