// The separable nine-tap blur of working images shared by the depth-of-field blur and the
// tilt-shift blur.
#pragma once

#include <cstdint>

#include "frame/table.h"

namespace pfx {

// Weights by distance from the centre tap.
extern const int32_t kBlurKernel[5];

// Level that selects the widest window (offsets -4..4); every level outside 0..7 means it.
constexpr int32_t kWidestBlurLevel = 8;

// A blurred channel is sum / weight, truncated, for a weight of at most 81 (nine taps of 9) and
// a sum of at most 255 x weight. (sum x kBlurReciprocal[weight]) >> 22 gives that quotient
// without dividing: the reciprocal 2^22 / weight, rounded up, overshoots sum / weight by less
// than sum / 2^22 <= 20655 / 2^22 < 1 / 81 <= 1 / weight, too little to reach the next
// integer, and the product stays below 255 x (2^22 + 81) < 2^32. A test checks every sum of
// every weight.
constexpr uint32_t kBlurReciprocalShift = 22;
constexpr uint32_t blur_reciprocal(uint32_t weight) {
  return weight == 0 ? 0 : ((1u << kBlurReciprocalShift) + weight - 1) / weight;
}
inline constexpr uint32_t kBlurReciprocal[82] = {PFX_TABLE_64(blur_reciprocal, 0u),
                                                 PFX_TABLE_16(blur_reciprocal, 64u),
                                                 PFX_TABLE_2(blur_reciprocal, 80u)};

// The nine taps of one line of outputs: for tap t, output x reads present[t][x] (1 where the tap
// lies in the image), inside[t][x] (1 where it lies inside the area) and v[c][t][x]. A tap
// outside the level's window, or beyond the edge, has kernel weight 0 and active 0, and so
// contributes nothing however its bytes read.
constexpr int32_t kTaps = 9;
struct Taps {
  const uint8_t* present[kTaps];
  const uint8_t* inside[kTaps];
  const uint8_t* v[3][kTaps];
  uint16_t k[kTaps];
  uint16_t active[kTaps];
};

// Blurs a width x height working image from src into dst (which may be src). Taps whose depth
// byte is not 1 stand in for the centre sample; a null depth map counts every tap as inside the
// area. Returns false, with dst untouched, when the scratch image cannot be allocated or the
// arguments are refused.
bool gaussian_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
                   int32_t height, int32_t level);

}  // namespace pfx
