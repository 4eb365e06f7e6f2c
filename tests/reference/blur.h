// Reference blur paths: the plain per-pixel forms the library's fast paths replaced. The fast
// forms must match them bit for bit; the tests compare the two.
#pragma once

#include <cstddef>
#include <cstdint>

#include "blur/composite.h"

namespace pfx::reference {

// Upscaling and depth compositing, one pixel and one channel at a time.
inline void composite(const uint32_t* src, const uint8_t* blur, const uint8_t* mask,
                      const uint8_t* depth, uint32_t* dst, int32_t width, int32_t height,
                      int32_t sw, int32_t sh, bool every_pixel) {
  const int32_t yscale = working_scale(sh, height);
  const int32_t xscale = working_scale(sw, width);
  const size_t row_samples = static_cast<size_t>(sw);
  for (int32_t y = 0; y < height; ++y) {
    const WorkingPos py = working_pos(y, yscale, sh);
    const size_t top = static_cast<size_t>(py.index) * row_samples;
    const size_t bottom = top + row_samples;
    const size_t row = static_cast<size_t>(y) * static_cast<size_t>(width);
    for (int32_t x = 0; x < width; ++x) {
      const size_t i = row + static_cast<size_t>(x);
      const uint32_t s = src[i];
      if (!every_pixel && mask[i] == 0) {
        dst[i] = s;
        continue;
      }
      const WorkingPos px = working_pos(x, xscale, sw);
      const size_t j00 = top + static_cast<size_t>(px.index), j01 = j00 + 1;
      const size_t j10 = bottom + static_cast<size_t>(px.index), j11 = j10 + 1;
      const bool d00 = depth[j00] != 0, d01 = depth[j01] != 0;
      const bool d10 = depth[j10] != 0, d11 = depth[j11] != 0;
      uint32_t out = s & 0xFF000000u;
      for (int32_t c = 0; c < 3; ++c) {
        const int32_t shift = 16 - 8 * c;
        const int32_t own = static_cast<int32_t>((s >> shift) & 255u);
        const int32_t v = bilinear(d00 ? blur[3 * j00 + c] : own, d01 ? blur[3 * j01 + c] : own,
                                   d10 ? blur[3 * j10 + c] : own, d11 ? blur[3 * j11 + c] : own,
                                   px.frac, py.frac);
        out |= (static_cast<uint32_t>(v) & 255u) << shift;
      }
      dst[i] = out;
    }
  }
}

}  // namespace pfx::reference
