// The exposure rule, for the adjustment itself and for the looks that chain it.
#pragma once

#include <cstdint>

#include "frame/pixel.h"

namespace pfx {

// Every colour channel times level / 10, the factor itofix(10 * level) / 100 in 16.16 fixed
// point (truncated toward zero), rounded to the nearest integer with halves upward (fixtoi) and
// held to 0..255.
//
// The factor is formed in 64 bits, so every level, INT32_MAX included, gives the unbounded
// result, and then held to 0 .. 16678912 so that the product fits an unsigned 32-bit word: a
// factor of 0 or less makes every channel 0, since the product is never positive, and one of
// 16678912 (255 - 1/2 in 16.16) or more makes every non-zero channel 255 already. In between,
// fixtoi(x) is (x + 32768) >> 16 for the non-negative x it sees.
class Exposure {
 public:
  explicit constexpr Exposure(int32_t level) : factor_(held_factor(level)) {}

  constexpr int32_t channel(int32_t c) const {
    const uint32_t v = (static_cast<uint32_t>(c) * factor_ + 32768u) >> 16;
    return static_cast<int32_t>(v > 255u ? 255u : v);
  }

  constexpr Rgb operator()(Rgb c) const { return {channel(c.r), channel(c.g), channel(c.b)}; }

  // The 16.16 factor, 0 .. 16678912.
  constexpr uint32_t factor() const { return factor_; }

 private:
  static constexpr uint32_t held_factor(int32_t level) {
    const int64_t factor = int64_t{level} * 655360 / 100;
    return static_cast<uint32_t>(factor < 0 ? 0 : (factor > 16678912 ? 16678912 : factor));
  }

  uint32_t factor_;
};

}  // namespace pfx
