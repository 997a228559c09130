// Array of fixed length on the heap. It never moves.
#pragma once

#include <limits>
#include <memory>
#include <type_traits>
#include <utility>

#include "util/exception.h"
#include "util/memorymanager/alignedmemory.h"

template <class T>
class simplearray {
 public:
  // `count` elements; built where T has a constructor, left alone otherwise. A count of 0 or less has no element.
  explicit simplearray(int length) : count(length), data(nullptr) {
    const std::size_t elements = length > 0 ? static_cast<std::size_t>(length) : 0;
    if (elements <= std::numeric_limits<std::size_t>::max() / sizeof(T)) {
      data = static_cast<T*>(_aligned_malloc(elements * sizeof(T), 4));
    }
    if (data == nullptr) throw new OutOfMemory("native(SIA)");
    if constexpr (!std::is_trivially_default_constructible_v<T>) std::uninitialized_default_construct_n(data, elements);
  }

  ~simplearray() {
    if (data == nullptr) return;
    if constexpr (!std::is_trivially_destructible_v<T>) std::destroy_n(data, count > 0 ? count : 0);
    _aligned_free(data);
    data = nullptr;
  }

  simplearray(const simplearray&) = delete;
  simplearray& operator=(const simplearray&) = delete;

  void swap(simplearray& other) noexcept {
    std::swap(count, other.count);
    std::swap(data, other.data);
  }

  T& operator[](int i) const { return data[i]; }

  int count;
  T* data;
};
