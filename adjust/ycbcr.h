// Fixed-point YCbCr (full-range BT.601 coefficients scaled by 256), shared by brightness and
// temperature. The round trip loses a step or two on saturated colours (pure red comes back as
// 254); that loss is part of both adjustments' output.
#pragma once

#include <cstdint>

#include "frame/pixel.h"

namespace pfx {

struct YCbCr {
  int32_t y, cb, cr;
};

constexpr YCbCr to_ycbcr(int32_t r, int32_t g, int32_t b) {
  return {(77 * r + 150 * g + 29 * b) >> 8, (128 * b - 43 * r - 85 * g) >> 8,
          (128 * r - 107 * g - 21 * b) >> 8};
}

constexpr YCbCr to_ycbcr(Rgb c) { return to_ycbcr(c.r, c.g, c.b); }

// Back to colour, each channel clamped to 0..255.
constexpr Rgb to_rgb(int32_t y, int32_t cb, int32_t cr) {
  return {clamp_byte(y + ((359 * cr) >> 8)), clamp_byte(y - ((88 * cb + 183 * cr) >> 8)),
          clamp_byte(y + ((454 * cb) >> 8))};
}

// Back to a pixel with the alpha of `p`.
constexpr uint32_t from_ycbcr(uint32_t p, int32_t y, int32_t cb, int32_t cr) {
  return pack(p, to_rgb(y, cb, cr));
}

}  // namespace pfx
