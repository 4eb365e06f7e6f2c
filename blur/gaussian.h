// The separable nine-tap blur of working images shared by the depth-of-field blur and the
// tilt-shift blur.
#pragma once

#include <cstdint>

namespace pfx {

// Weights by distance from the centre tap.
extern const int32_t kBlurKernel[5];

// Level that selects the widest window (offsets -4..4); every level outside 0..7 means it.
constexpr int32_t kWidestBlurLevel = 8;

// Blurs a width x height working image from src into dst (which may be src). Taps whose depth
// byte is not 1 stand in for the centre sample; a null depth map counts every tap as inside the
// area. Returns false, with dst untouched, when the scratch image cannot be allocated or the
// arguments are refused.
bool gaussian_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
                   int32_t height, int32_t level);

}  // namespace pfx
