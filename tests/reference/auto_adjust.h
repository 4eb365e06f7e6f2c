// Reference auto adjust: the plain two-pass form, with the luma and lightness planes kept between
// the passes and one 64-bit division per pixel. The library's fast form must match it bit for
// bit; the tests compare the two.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "photofx.h"

namespace pfx::reference {

struct AutoParams {
  int32_t threshold, cutoff, weight1, weight2;
};

// The tone curve sampled at the even levels (16 x the curve), from the first pass's histogram.
inline void auto_curve(const int64_t count[101], int64_t largest, int64_t bright, int64_t pixels,
                       const AutoParams& p, int32_t samples[51]) {
  const int64_t share = ((bright * 1024 / pixels) * 100) / 1024;
  const int64_t weight = share < p.threshold ? p.weight1 : p.weight2;
  const int64_t uniform = (pixels >> 8) * weight;
  const int64_t fullest = log_e_FIX_new(static_cast<int32_t>(largest + 2048)) >> 5;
  int64_t weighted[101];
  int64_t total = 0;
  for (int32_t i = 0; i < 101; ++i) {
    const int64_t a = log_e_FIX_new(static_cast<int32_t>(count[i] + 1024));
    const int64_t w = 1024 - (a * 32) / fullest;
    const int64_t f = 1024 / ((w + weight) >> 6);
    weighted[i] = ((w * count[i] + uniform) * f) >> 10;
    total += weighted[i];
  }
  if (total < 1024) total = 1024;
  const int64_t unit = total >> 10;
  int64_t running = 0;
  int32_t curve[101];
  for (int32_t i = 0; i < 101; ++i) {
    running += weighted[i];
    curve[i] = static_cast<int32_t>((p.cutoff * (running / unit) + 512) >> 10);
  }
  for (int32_t k = 0; k < 51; ++k) samples[k] = 16 * curve[2 * k];
}

// The tone-curve path for images of at least 150 x 150 pixels, parameters already in range.
inline void auto_adjust(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                        const AutoParams& p) {
  const size_t n = static_cast<size_t>(width) * static_cast<size_t>(height);
  std::vector<int32_t> luma(n), lightness(n);
  int64_t count[101] = {};
  int64_t largest = 0, bright = 0;
  for (size_t i = 0; i < n; ++i) {
    const int32_t r = (src[i] >> 16) & 255, g = (src[i] >> 8) & 255, b = src[i] & 255;
    luma[i] = 218 * 1024 * r + 732 * 1024 * g + 74 * 1024 * b;
    lightness[i] = (luma[i] / 255) * 100;
    const int32_t level = lightness[i] >> 20;
    if (level == 0) continue;
    if (++count[level] > largest) largest = count[level];
    if (level > 49) ++bright;
  }
  int32_t samples[51];
  auto_curve(count, largest, bright, static_cast<int64_t>(n), p, samples);

  for (size_t i = 0; i < n; ++i) {
    const uint32_t px = src[i];
    const int32_t y = luma[i], l = lightness[i];
    if ((y >> 20) == 0) {
      dst[i] = px;
      continue;
    }
    int64_t v;
    if (l == 0) {
      v = 0;
    } else if (l <= (100 << 20)) {
      v = int64_t{samples[l >> 21]} * 65536;
    } else {
      v = 100 << 20;
    }
    const int64_t new_luma = (v / 100) * 255;
    const int64_t gain = new_luma / (y >> 10);
    const int64_t r = int64_t{(px >> 16) & 255} * 1024, g = int64_t{(px >> 8) & 255} * 1024,
                  b = int64_t{px & 255} * 1024;
    int64_t out[3];
    if (r * gain <= 0xFF00000 && g * gain <= 0xFF00000 && b * gain <= 0xFF00000) {
      out[0] = (r * gain) >> 20, out[1] = (g * gain) >> 20, out[2] = (b * gain) >> 20;
    } else {
      int64_t limit = 0xFF00000 / (r + 1);
      if (0xFF00000 / (g + 1) < limit) limit = 0xFF00000 / (g + 1);
      if (0xFF00000 / (b + 1) < limit) limit = 0xFF00000 / (b + 1);
      out[0] = (limit * r) >> 20, out[1] = (limit * g) >> 20, out[2] = (limit * b) >> 20;
    }
    for (int64_t& c : out) c = c > 254 ? 255 : (c < 0 ? 0 : c);
    dst[i] = (px & 0xFF000000u) | static_cast<uint32_t>(out[0] << 16 | out[1] << 8 | out[2]);
  }
}

}  // namespace pfx::reference
