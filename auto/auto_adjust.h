// Auto adjust, the parts the tests look into: a pixel's luma and lightness level, and the table
// that turns a luma into its gain once the tone curve is known.
#pragma once

#include <cstdint>

#include "frame/pixel.h"
#include "frame/table.h"

namespace pfx {

// Luma with ten fraction bits: 218 R + 732 G + 74 B, weights of 1024. The lightness and the gain
// of a pixel both follow from this one number.
constexpr uint32_t luma_of(uint32_t p) {
  return 218u * static_cast<uint32_t>(red_of(p)) + 732u * static_cast<uint32_t>(green_of(p)) +
         74u * static_cast<uint32_t>(blue_of(p));
}

// The largest luma (255 << 10) and the number of lumas there are.
constexpr uint32_t kLargestLuma = 261120;
constexpr uint32_t kLumas = kLargestLuma + 1;

// Lightness level 0..100 of a luma: the lightness (L / 255) x 100, L the luma with twenty
// fraction bits, with its fraction dropped. The products stay below 2^28.
constexpr int32_t level_of(uint32_t luma) {
  return static_cast<int32_t>((((luma << 10) / 255u) * 100u) >> 20);
}

// The gain that brings a strongest channel c to 254: (255 << 20) / (c x 1024 + 1). It falls as c
// grows, so the strongest channel gives the smallest of the three channels' limits.
constexpr uint32_t full_scale_gain(uint32_t c) { return 0xFF00000u / (c * 1024u + 1u); }
inline constexpr uint32_t kFullScaleGain[256] = {PFX_TABLE_256(full_scale_gain, 0u)};

// Samples of the tone curve: lightness levels 2k and 2k + 1 share sample k.
constexpr int32_t kCurveSamples = 51;

// A luma below this (below 1 with twenty fraction bits) carries no ratio: the pixel keeps its
// channels, as a gain of 1024 (1.0 with ten fraction bits) leaves them.
constexpr uint32_t kDarkLuma = 1024;
constexpr uint32_t kUnitGain = 1024;

// gain[luma] for every luma 0..kLargestLuma: kUnitGain below kDarkLuma, otherwise
// new_luma[level_of(luma) / 2] / luma, truncated. new_luma holds the new luma of each curve sample
// with twenty fraction bits, each below 2^30. Built from running remainders, with a division only
// where the quotient falls by more than one from one luma to the next.
void build_gain_table(const uint32_t new_luma[kCurveSamples], uint32_t* gain);

}  // namespace pfx
