// Aligned heap calls, for objects and buffers outside the pools.
#pragma once

#include <cstddef>

// Returns size bytes at a multiple of alignment (a power of two, raised to at least 8). Throws RuntimeException* with
// the system's text for the failure. The caller frees with _aligned_free.
void* _aligned_malloc(std::size_t size, std::size_t alignment);

// realloc: the contents are kept, the alignment is not. Null when there is no memory; the old block then stays.
void* _aligned_realloc(void* p, std::size_t size, std::size_t alignment);

void _aligned_free(void* p);
