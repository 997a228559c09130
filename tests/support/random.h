// Random numbers for tests: the same sequence from the same seed on every machine and word size.
#pragma once

#include <bit>
#include <cstdint>

class test_random {
 public:
  explicit test_random(std::uint64_t seed) : state(seed) {}

  // 64 bits: a Weyl sequence, scrambled.
  std::uint64_t bits() {
    state += 0x9E3779B97F4A7C15u;
    std::uint64_t z = state;
    z = (z ^ z >> 30) * 0xBF58476D1CE4E5B9u;
    z = (z ^ z >> 27) * 0x94D049BB133111EBu;
    return z ^ z >> 31;
  }

  std::uint32_t word() { return static_cast<std::uint32_t>(bits() >> 32); }

  // Both ends included.
  int between(int low, int high) {
    const auto span = static_cast<std::uint64_t>(static_cast<std::int64_t>(high) - low) + 1;
    return static_cast<int>(low + static_cast<std::int64_t>((bits() >> 32) * span >> 32));
  }

  bool one_in(int n) { return between(1, n) == 1; }

  // In [low, high), from 24 random bits.
  float real(float low, float high) { return low + static_cast<float>(bits() >> 40) * 0x1p-24f * (high - low); }

 private:
  std::uint64_t state;
};
