// The saturation and temperature rules, for the adjustments themselves and for the looks that
// chain them.
#pragma once

#include <cstdint>

#include "adjust/ycbcr.h"
#include "frame/pixel.h"

namespace pfx {

// Each pixel blended between a grey value and an exaggerated copy of itself, in 10-bit fixed
// point: strength 1024 is the unchanged colour, 0 pure grey, 2048 the strongest push away from
// grey.
class Saturation {
 public:
  explicit constexpr Saturation(int32_t level)
      : s_(strength(level)),
        wr_((316 * (1024 - s_)) >> 10),
        wg_((624 * (1024 - s_)) >> 10),
        wb_((84 * (1024 - s_)) >> 10) {}

  // The matrix has the strength on its diagonal and the grey weights in every row, so each
  // channel is the shared grey sum plus strength times the channel.
  constexpr Rgb operator()(Rgb c) const {
    const int32_t grey = c.r * wr_ + c.g * wg_ + c.b * wb_;
    return {clamp_byte((grey + s_ * c.r) >> 10), clamp_byte((grey + s_ * c.g) >> 10),
            clamp_byte((grey + s_ * c.b) >> 10)};
  }

  constexpr int32_t strength() const { return s_; }
  constexpr int32_t red_weight() const { return wr_; }
  constexpr int32_t green_weight() const { return wg_; }
  constexpr int32_t blue_weight() const { return wb_; }

 private:
  // The formula already holds the strength at 0 from level 0 down and at 2048 from level 20 up,
  // so holding the level to 0..20 first changes no result and keeps the product from
  // overflowing.
  static constexpr int32_t strength(int32_t level) {
    return clamp_to(103 * (clamp_to(level, 0, 20) - 10) + 1024, 0, 2048);
  }

  // Strength and grey weights; the weights sum to 1024 - s and are not the luma weights of the
  // YCbCr conversion.
  int32_t s_, wr_, wg_, wb_;
};

// The two chroma components shifted by amounts that depend only on the level: above 10 the image
// warms (less blue, more red), below it cools. Luma is kept.
class Temperature {
 public:
  explicit constexpr Temperature(int32_t level)
      : cb_(signed_shift(control(level))),
        cr_(signed_shift(235 - ((858 * control(level)) >> 10))) {}

  constexpr Rgb operator()(Rgb c) const {
    const YCbCr ycc = to_ycbcr(c);
    return to_rgb(ycc.y, ycc.cb + cb_, ycc.cr + cr_);
  }

  constexpr int32_t cb_shift() const { return cb_; }
  constexpr int32_t cr_shift() const { return cr_; }

 private:
  // From 1000 steps on either side of 10 the blue-difference shift passes +-3000 and the
  // red-difference shift +-2500 in the opposite direction, which drives red, green and blue to
  // 0 or 255 for every source colour (255, 0, 0 when warming, 0, 255, 255 when cooling). Both
  // shifts only grow with the step count, so holding it at +-1000 gives the same pixels as
  // unbounded arithmetic and keeps every product small.
  static constexpr int32_t control(int32_t level) {
    return 128 + 3 * (10 - clamp_to(level, -990, 1010));
  }

  // A shift rounded from a fixed-point magnitude and signed by the side of 128 its control value
  // lies on.
  static constexpr int32_t signed_shift(int32_t control) {
    const int32_t diff = control - 128;
    const int32_t magnitude = (512 * (diff < 0 ? -diff : diff) + 256) >> 9;
    return control > 127 ? magnitude : -magnitude;
  }

  int32_t cb_, cr_;
};

}  // namespace pfx
