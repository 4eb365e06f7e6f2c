// Depth compositing: a blurred working image scaled back up to full size.
//
// Each recomputed pixel interpolates the four working samples around it; a sample that lies
// outside the blurred area (depth 0) contributes the pixel's own source colour instead of its
// blurred colour. Inside the area the result is the smooth upscaled blur, outside it the source,
// and along the border the two mix over about one working sample: the soft edge of the
// depth-of-field effect.
#include "blur/composite.h"

#include <cstddef>

#include "blur/workspace.h"
#include "frame/frame.h"
#include "photofx.h"

namespace pfx {

void composite(const uint32_t* src, const uint8_t* blur, const uint8_t* mask, const uint8_t* depth,
               uint32_t* dst, int32_t width, int32_t height, int32_t sw, int32_t sh,
               bool every_pixel) {
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
      const uint32_t s = src[i];  // read once, before dst[i] is written: dst may be src
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

}  // namespace pfx

extern "C" {

void run_blur(const uint32_t* src, const uint8_t* blur, const uint8_t* mask, const uint8_t* depth,
              uint32_t* dst, int32_t width, int32_t height, int32_t sw, int32_t sh) {
  const bool every_pixel = all != 0;
  if (src == nullptr || blur == nullptr || depth == nullptr || dst == nullptr) return;
  if (mask == nullptr && !every_pixel) return;
  const int64_t n = pfx::pixel_count(width, height);
  if (n == 0 || n > pfx::kMaxPixels) return;
  if (!pfx::can_composite(sw, sh)) {
    // Too few working samples to interpolate between (or too many for the coordinates): hand
    // back the source rather than read past the working image.
    pfx::copy_image(src, dst, n);
    return;
  }
  pfx::composite(src, blur, mask, depth, dst, width, height, sw, sh, every_pixel);
}

}  // extern "C"
