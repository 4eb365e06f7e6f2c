// Shared machinery of the fuzz targets.
//
// Every caller buffer is a Guarded<T>: its elements sit between two guard zones filled with a
// known pattern, so a write outside the buffer shows even where AddressSanitizer's redzones would
// not (inside a larger allocation). Sizes, levels and bounds are drawn from the fuzzer's bytes
// with a bias toward the edges that break code: zero, negative, one past the image, the 32-bit
// extremes, and images too large to address.
#pragma once

#include <fuzzer/FuzzedDataProvider.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <limits>
#include <vector>

#include "frame/frame.h"

#define FUZZ_CHECK(cond)                                                            \
  do {                                                                              \
    if (!(cond)) {                                                                  \
      std::fprintf(stderr, "%s:%d: check failed: %s\n", __FILE__, __LINE__, #cond); \
      std::abort();                                                                 \
    }                                                                               \
  } while (0)

namespace pfx::fuzz {

template <class T>
class Guarded {
 public:
  static constexpr size_t kGuard = 32;

  Guarded(size_t n, T pattern) : n_(n), pattern_(pattern), store_(n + 2 * kGuard, pattern) {}

  T* data() { return store_.data() + kGuard; }
  const T* data() const { return store_.data() + kGuard; }
  size_t size() const { return n_; }

  void fill(FuzzedDataProvider& in) {
    for (size_t i = 0; i < n_; ++i) data()[i] = in.ConsumeIntegral<T>();
  }
  std::vector<T> contents() const { return std::vector<T>(data(), data() + n_); }

  bool guards_intact() const {
    for (size_t i = 0; i < kGuard; ++i) {
      if (store_[i] != pattern_ || store_[kGuard + n_ + i] != pattern_) return false;
    }
    return true;
  }

 private:
  size_t n_;
  T pattern_;
  std::vector<T> store_;
};

using Pixels = Guarded<uint32_t>;
using Mask = Guarded<uint8_t>;

struct Size {
  int32_t width, height;
  size_t pixels;  // elements the caller's buffers hold
};

// Mostly small images, sometimes empty or negative, sometimes a size whose pixel count no
// library buffer could hold or a side at the negative end of 32 bits (the library must refuse
// either without touching the small buffer it is given).
inline Size pick_size(FuzzedDataProvider& in, int32_t max_side = 24) {
  if (in.ConsumeIntegralInRange<int>(0, 15) == 0) {
    static constexpr int32_t kExtreme[][2] = {
        {65536, 65536},         {INT32_MAX, 2},        {2, INT32_MAX}, {46341, 46341},
        {INT32_MAX, INT32_MAX}, {INT32_MIN, 3},        {3, INT32_MIN}, {INT32_MIN, INT32_MIN},
        {-65536, 65536},        {INT32_MIN, INT32_MAX}};
    const auto& s = kExtreme[in.ConsumeIntegralInRange<size_t>(0, 9)];
    // A few pixels where the size claims too many; none where it claims none.
    return {s[0], s[1], pixel_count(s[0], s[1]) == 0 ? size_t{0} : size_t{16}};
  }
  const int32_t w = in.ConsumeIntegralInRange<int32_t>(-2, max_side);
  const int32_t h = in.ConsumeIntegralInRange<int32_t>(-2, max_side);
  return {w, h, static_cast<size_t>(pixel_count(w, h))};
}

// A level: usually near the slider range, sometimes anywhere in 32 bits.
inline int32_t pick_level(FuzzedDataProvider& in, int32_t lo = -5, int32_t hi = 120) {
  switch (in.ConsumeIntegralInRange<int>(0, 7)) {
    case 0:
      return in.ConsumeIntegral<int32_t>();
    case 1:
      return in.PickValueInArray({INT32_MIN, INT32_MAX, -1, 0, 1});
    default:
      return in.ConsumeIntegralInRange<int32_t>(lo, hi);
  }
}

// A coordinate around an image side: inside, just outside, or a 32-bit extreme.
inline int32_t pick_coord(FuzzedDataProvider& in, int32_t side) {
  if (in.ConsumeIntegralInRange<int>(0, 9) == 0) {
    return in.PickValueInArray({INT32_MIN, INT32_MAX, INT32_MIN + 1, INT32_MAX - 1});
  }
  const int32_t s = side < 0 ? 0 : (side > 1 << 20 ? 1 << 20 : side);
  return in.ConsumeIntegralInRange<int32_t>(-4, s + 4);
}

inline Rect pick_bounds(FuzzedDataProvider& in, const Size& s) {
  return {pick_coord(in, s.width), pick_coord(in, s.width), pick_coord(in, s.height),
          pick_coord(in, s.height)};
}

}  // namespace pfx::fuzz
