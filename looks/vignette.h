// The table-based vignette weight, shared by the vignette preview, the vintage preview and the
// old-photo look, and the pixel loop that hands each rule its pixel's position.
#pragma once

#include <cstddef>
#include <cstdint>

#include "frame/frame.h"

namespace pfx {

// floor(2^24 / k^2), the rule of LUT_VIGNETTE, for any k (entries 0 and 1 are both 2^24). The
// table covers half-sizes up to 2047; larger images read the rule directly, so any size works.
constexpr int32_t vignette_factor(int64_t k) {
  return k <= 1 ? int32_t{1} << 24 : static_cast<int32_t>((int64_t{1} << 24) / (k * k));
}

// LUT_VIGNETTE[k] where the table has it, the same rule beyond.
int32_t vignette_entry(int64_t k);

// Fall-off about 1 - (dx/hw)^2 / 2 - (dy/hh)^2 / 2 around (width >> 1, height >> 1), where the
// half-sizes are rounded up to a multiple of 8 to pick the factor. weight() is 0 .. 2^22, full
// scale 2^22. Formed in 64 bits: within the sizes the table covers the products fit 32 bits and
// the values are the same; beyond them the 32-bit squares would overflow.
class PreviewVignette {
 public:
  PreviewVignette(int32_t width, int32_t height)
      : hw_(width >> 1),
        hh_(height >> 1),
        kx_(vignette_entry((int64_t{hw_} + 7) >> 3)),
        ky_(vignette_entry((int64_t{hh_} + 7) >> 3)) {}

  int32_t weight(int32_t x, int32_t y) const {
    const int64_t w =
        (int64_t{1} << 30) - term(x - int64_t{hw_}, kx_) - term(y - int64_t{hh_}, ky_);
    return w < 0 ? 0 : static_cast<int32_t>(w >> 8);
  }

 private:
  // A factor of 0 (half-sizes above 32767) gives no fall-off along that side, whatever d is.
  static int64_t term(int64_t d, int64_t k) { return k == 0 ? 0 : (d * d * k) >> 1; }

  int32_t hw_, hh_;
  int64_t kx_, ky_;
};

// dst[i] = rule(src[i], x, y) for every pixel in row order; src and dst may be the same buffer.
// Returns false, having written nothing, for a null buffer or an image too large to address.
template <class Rule>
bool for_each_pixel_at(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                       Rule&& rule) {
  if (src == nullptr || dst == nullptr) return false;
  const int64_t n = pixel_count(width, height);
  if (n > kMaxPixels) return false;
  if (n == 0) return true;
  size_t i = 0;
  for (int32_t y = 0; y < height; ++y) {
    for (int32_t x = 0; x < width; ++x, ++i) dst[i] = rule(src[i], x, y);
  }
  return true;
}

}  // namespace pfx
