// Failing and counted allocations: the test program routes the library's posix_memalign, realloc, malloc and operator
// new through here.
#pragma once

namespace allocation_failure {

// The call of posix_memalign number `n` from now returns the error code; 0 for none.
void fail_memalign(int n, int error);

// Allocations since the start, by all threads, that went this way.
unsigned long count();

// Every realloc returns null, while set.
void fail_realloc(bool fail);

// Every realloc moves the block, while set, to an address that is `phase` (a multiple of 16) beyond a multiple of 128.
void move_realloc(bool move, unsigned int phase = 16);

// Back to allocations as the system makes them.
void none();

}  // namespace allocation_failure
