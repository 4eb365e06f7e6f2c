// Reference blur paths: the plain per-pixel forms the library's fast paths replaced. The fast
// forms must match them bit for bit; the tests compare the two.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "blur/composite.h"
#include "blur/gaussian.h"
#include "blur/tiltshift.h"
#include "frame/pixel.h"

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

// The nine-tap blur one output sample at a time, each tap tested for the image edge and the area,
// one division per channel. Level as the library takes it.
inline void gaussian_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
                          int32_t height, int32_t level) {
  const uint32_t l = static_cast<uint32_t>(level) > 7u ? 8u : static_cast<uint32_t>(level);
  const int32_t lo = -static_cast<int32_t>((l + 1) / 2), hi = static_cast<int32_t>(l / 2);
  auto line = [&](const uint8_t* in, size_t centre, int32_t pos, int32_t len, ptrdiff_t stride,
                  uint8_t* out) {
    int32_t sum[3] = {0, 0, 0};
    int32_t weight = 0;
    const uint8_t* c = in + 3 * centre;
    for (int32_t o = lo; o <= hi; ++o) {
      if (pos + o < 0 || pos + o >= len) continue;
      const ptrdiff_t t = static_cast<ptrdiff_t>(centre) + stride * o;
      if (depth == nullptr || depth[t] == 1) {
        const int32_t k = kBlurKernel[o < 0 ? -o : o];
        for (int ch = 0; ch < 3; ++ch) sum[ch] += k * in[3 * t + ch];
        weight += k;
      } else {
        for (int ch = 0; ch < 3; ++ch) sum[ch] += 9 * c[ch];
        weight += 9;
      }
    }
    for (int ch = 0; ch < 3; ++ch) {
      const int32_t v = ((sum[ch] * 1024) / weight) >> 10;
      out[ch] = static_cast<uint8_t>(v > 254 ? 255 : (v < 0 ? 0 : v));
    }
  };
  const size_t n = static_cast<size_t>(width) * static_cast<size_t>(height);
  std::vector<uint8_t> scratch(3 * n);
  for (size_t i = 0; i < n; ++i) {
    line(src, i, static_cast<int32_t>(i % width), width, 1, scratch.data() + 3 * i);
  }
  for (size_t i = 0; i < n; ++i) {
    line(scratch.data(), i, static_cast<int32_t>(i / width), height, width, dst + 3 * i);
  }
}

// The tilt-shift mix of the upscaled blur and the source, one pixel and channel at a time.
inline void tilt_restore(const uint32_t* src, const uint8_t* blur, uint32_t* dst, int32_t width,
                         int32_t height, int32_t sw, int32_t sh, const TiltBand& band) {
  const int32_t yscale = working_scale(sh, height);
  const int32_t xscale = working_scale(sw, width);
  const size_t row_samples = static_cast<size_t>(sw);
  for (int32_t y = 0; y < height; ++y) {
    const int32_t w = band.weight(y);
    const WorkingPos py = working_pos(y, yscale, sh);
    const uint8_t* top = blur + 3 * static_cast<size_t>(py.index) * row_samples;
    const uint8_t* bottom = top + 3 * row_samples;
    const size_t row = static_cast<size_t>(y) * static_cast<size_t>(width);
    for (int32_t x = 0; x < width; ++x) {
      const size_t i = row + static_cast<size_t>(x);
      const uint32_t s = src[i];
      const WorkingPos px = working_pos(x, xscale, sw);
      const size_t j = 3 * static_cast<size_t>(px.index);
      uint32_t out = s & 0xFF000000u;
      for (int32_t c = 0; c < 3; ++c) {
        const int32_t shift = 16 - 8 * c;
        const int32_t b = clamp_byte(bilinear(top[j + c], top[j + 3 + c], bottom[j + c],
                                              bottom[j + 3 + c], px.frac, py.frac));
        const int32_t own = static_cast<int32_t>((s >> shift) & 255u);
        const int32_t v = clamp_byte((b * (256 - w) + own * w) >> 8);
        out |= static_cast<uint32_t>(v) << shift;
      }
      dst[i] = out;
    }
  }
}

}  // namespace pfx::reference
