// The channel-gains rule, for the adjustment itself and for the looks that chain it.
#pragma once

#include <cstdint>

#include "frame/pixel.h"

namespace pfx {

// Each channel moved by a fixed offset: 6 per step of its own slider away from 10, less 3 per
// step of each other slider, held to 0..255.
class Gains {
 public:
  constexpr Gains(int32_t red, int32_t green, int32_t blue)
      : dr_(offset(red, green, blue)),
        dg_(offset(green, red, blue)),
        db_(offset(blue, red, green)) {}

  constexpr Rgb operator()(Rgb c) const {
    return {clamp_byte(c.r + dr_), clamp_byte(c.g + dg_), clamp_byte(c.b + db_)};
  }

  // The offsets, -255..255.
  constexpr Rgb offsets() const { return {dr_, dg_, db_}; }

 private:
  // Formed in 64 bits (levels may be anything) and held to +-255: an offset of 255 or more
  // already makes every channel 255 and one of -255 or less every channel 0, so the hold changes
  // no result.
  static constexpr int32_t offset(int64_t own, int64_t other1, int64_t other2) {
    const int64_t v = 6 * (own - 10) - 3 * (other1 - 10) - 3 * (other2 - 10);
    return static_cast<int32_t>(v < -255 ? -255 : (v > 255 ? 255 : v));
  }

  int32_t dr_, dg_, db_;
};

}  // namespace pfx
