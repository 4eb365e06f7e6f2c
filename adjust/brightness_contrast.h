// The brightness and contrast rules, for the adjustments themselves and for the looks that chain
// them, and the contrast step table for the tests that recompute it.
#pragma once

#include <cstdint>

#include "adjust/ycbcr.h"
#include "frame/divide.h"
#include "frame/pixel.h"

namespace pfx {

// Contrast step per channel value: (c - 128) / 10 rounded away from zero.
extern const int32_t kContrastStep[256];

// Beyond +-1000 level steps every result is already pinned at 0, 128 or 255, so holding the
// step count there gives the same pixels as unbounded arithmetic without overflowing it.
constexpr int32_t level_steps(int32_t level) { return clamp_to(level, -990, 1010) - 10; }

// Luma moved by 10 per level step, chroma kept.
class Brightness {
 public:
  explicit constexpr Brightness(int32_t level) : shift_(10 * level_steps(level)) {}

  constexpr Rgb operator()(Rgb c) const {
    const YCbCr ycc = to_ycbcr(c);
    return to_rgb(ycc.y + shift_, ycc.cb, ycc.cr);
  }

  constexpr int32_t shift() const { return shift_; }

 private:
  int32_t shift_;
};

// Each channel moved d = level - 10 steps of kContrastStep[c] away from 128 (toward it when d is
// negative), never across it: below-mid values stay in 0..128, the others in 128..255.
//
// Written without the table so that it vectorises. With a = |c - 128| (0..128) the step is
// (a + 9) / 10 in size, made by a multiplication (frame/divide.h). The channel's new distance
// from 128, a + d * step, is held to 0..128 below the middle and to 0..127 above it, which is the
// table rule's hold at 0 and 128, or 128 and 255.
class Contrast {
 public:
  explicit constexpr Contrast(int32_t level) : d_(level_steps(level)) {}

  constexpr int32_t channel(int32_t c) const {
    const int32_t u = c - 128;
    const int32_t a = u < 0 ? -u : u;
    const int32_t step = contrast_step(a);
    const int32_t m = a + d_ * step;
    return u < 0 ? 128 - clamp_to(m, 0, 128) : 128 + clamp_to(m, 0, 127);
  }

  constexpr Rgb operator()(Rgb c) const { return {channel(c.r), channel(c.g), channel(c.b)}; }

  constexpr int32_t steps() const { return d_; }

 private:
  int32_t d_;
};

}  // namespace pfx
