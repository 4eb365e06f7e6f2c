// The sepia curves as tables, for the looks that tint with them and for the tests that recompute
// them.
#pragma once

#include <cstdint>

namespace pfx {

// Red offset for v in 0..255: rises by one every four values to 32 at 127..128 and falls back
// to 0. Three values sit one step off the plain quarter; they are part of the curve, and images
// tinted with it depend on them. Written as selects rather than branches so that it vectorises.
constexpr int32_t sepia_red_offset(int32_t v) {
  const int32_t quarter = v <= 128 ? (v + 1) >> 2 : (256 - v) >> 2;
  return quarter - (v == 43 ? 1 : 0) + (v == 133 || v == 137 ? 1 : 0);
}

// Blue offset for v in 0..255: a run of 0 at each end and a peak of 31 over 125..130.
constexpr int32_t sepia_blue_offset(int32_t v) {
  const int32_t quarter = v <= 128 ? (v - 1) >> 2 : (254 - v) >> 2;
  return quarter < 0 ? 0 : quarter;
}

// The curves for any int: values outside 0..255 pass unchanged.
constexpr int32_t sepia_red(int32_t v) { return v < 0 || v > 255 ? v : v + sepia_red_offset(v); }
constexpr int32_t sepia_blue(int32_t v) { return v < 0 || v > 255 ? v : v - sepia_blue_offset(v); }

// Sepia red and blue curves over channel values 0..255.
extern const uint8_t kSepiaRed[256];
extern const uint8_t kSepiaBlue[256];

}  // namespace pfx
