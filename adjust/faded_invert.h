// The faded-colour rule, for the adjustment itself and for the looks that chain it.
#pragma once

#include <cstdint>

#include "frame/divide.h"
#include "frame/pixel.h"

namespace pfx {

// Each channel blended toward a washed-out, warm-tinted line of itself, (k * c + o) / 255: red
// into 104..245, green into 52..240, blue into 72..179. The level, 0..100 (the caller checks it),
// is the percentage of the line's value.
class Fade {
 public:
  explicit constexpr Fade(int32_t level)
      : red_(line(141, 26520, level)),
        green_(line(188, 13260, level)),
        blue_(line(107, 18360, level)) {}

  constexpr Rgb operator()(Rgb c) const {
    return {red_.channel(c.r), green_.channel(c.g), blue_.channel(c.b)};
  }

  // The blend (255 * c * (100 - L) + (k * c + o) * L) / 25500 with a single truncating division,
  // so only the final value is rounded, gathered as (slope * c + offset) / 25500. For every
  // level 0..100 and channel 0..255 the sum lies in 0 .. 6502500, below 2^23, and never
  // reaches 256 * 25500: the limit at 255 is only a guard.
  struct Line {
    int32_t slope, offset;

    constexpr int32_t channel(int32_t c) const {
      const int32_t v = quotient_25500(static_cast<uint32_t>(slope * c + offset));
      return v > 255 ? 255 : v;
    }
  };

  constexpr const Line& red() const { return red_; }
  constexpr const Line& green() const { return green_; }
  constexpr const Line& blue() const { return blue_; }

 private:
  static constexpr Line line(int32_t k, int32_t o, int32_t level) {
    return {255 * (100 - level) + k * level, o * level};
  }

  Line red_, green_, blue_;
};

}  // namespace pfx
