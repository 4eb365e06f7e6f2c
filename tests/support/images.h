// Test images: deterministic pseudo-random pixels, masks and a content hash that is the same on
// every platform (it hashes pixel words, not bytes, so byte order cannot matter).
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace pfx::test {

using Pixels = std::vector<uint32_t>;
using Mask = std::vector<uint8_t>;

// splitmix64: small, fast, and identical on every platform for a given seed.
class Rng {
 public:
  explicit Rng(uint64_t seed) : state_(seed) {}
  uint64_t next() {
    uint64_t z = (state_ += 0x9E3779B97F4A7C15ull);
    z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9ull;
    z = (z ^ (z >> 27)) * 0x94D049BB133111EBull;
    return z ^ (z >> 31);
  }
  uint32_t word() { return static_cast<uint32_t>(next() >> 32); }
  // Uniform-ish integer in [lo, hi].
  int32_t between(int32_t lo, int32_t hi) {
    return lo + static_cast<int32_t>(next() % static_cast<uint64_t>(int64_t{hi} - lo + 1));
  }

 private:
  uint64_t state_;
};

// Random colours with random alpha.
inline Pixels random_image(int32_t width, int32_t height, uint64_t seed) {
  Rng rng(seed);
  Pixels px(static_cast<size_t>(width) * static_cast<size_t>(height));
  for (auto& p : px) p = rng.word();
  return px;
}

inline Pixels filled(int32_t width, int32_t height, uint32_t colour) {
  return Pixels(static_cast<size_t>(width) * static_cast<size_t>(height), colour);
}

// Mask bytes drawn from {0, 1, 2, 255}, so that "exactly 1 selects" is always exercised.
inline Mask random_mask(int32_t width, int32_t height, uint64_t seed) {
  static constexpr uint8_t kValues[4] = {0, 1, 2, 255};
  Rng rng(seed);
  Mask m(static_cast<size_t>(width) * static_cast<size_t>(height));
  for (auto& b : m) b = kValues[rng.next() & 3];
  return m;
}

// FNV-1a over pixel words, most significant byte first within each word.
inline uint64_t hash_pixels(const uint32_t* px, size_t n) {
  uint64_t h = 0xCBF29CE484222325ull;
  for (size_t i = 0; i < n; ++i) {
    for (int shift = 24; shift >= 0; shift -= 8) {
      h ^= (px[i] >> shift) & 0xFFu;
      h *= 0x100000001B3ull;
    }
  }
  return h;
}

inline uint64_t hash_pixels(const Pixels& px) { return hash_pixels(px.data(), px.size()); }

inline uint32_t argb(uint32_t a, uint32_t r, uint32_t g, uint32_t b) {
  return (a << 24) | (r << 16) | (g << 8) | b;
}

}  // namespace pfx::test
