// Vignette: darkens an image toward its borders with an elliptical fall-off centred on
// (width >> 1, height >> 1).
//
// fx_apply_vignette computes its two factors by division and falls off to 9/16 at the middle of
// each border and about 1/8 in the corners; it ends the vintage look. fx_apply_vignette_prev
// takes its factors from LUT_VIGNETTE, needs no division and falls off more steeply (1/2 at the
// borders, 0 in the corners when the half-sizes are multiples of 8); it is meant for previews.
#include "looks/vignette.h"

#include <cstdint>

#include "frame/frame.h"
#include "frame/pixel.h"
#include "frame/table.h"
#include "photofx.h"

namespace {

constexpr int32_t vignette_lut_entry(int32_t k) { return pfx::vignette_factor(k); }

}  // namespace

extern "C" {

constinit const int32_t LUT_VIGNETTE[256] = {PFX_TABLE_256(vignette_lut_entry, 0)};

}  // extern "C"

namespace pfx {

int32_t vignette_entry(int64_t k) {
  return k >= 0 && k < 256 ? LUT_VIGNETTE[k] : vignette_factor(k);
}

namespace {

// Weight 1 - (7/16)(dx/hw)^2 - (7/16)(dy/hh)^2 in units of 2^20. The factors 2^28 / hw^2 and
// 2^28 / hh^2 need both half-sizes to be at least 1; the caller sees to that. Formed in 64 bits:
// for half-sizes up to 16384 (the only ones with a non-zero factor) the products fit 32 bits and
// the values are the same.
class DividedVignette {
 public:
  DividedVignette(int32_t width, int32_t height)
      : hw_(width >> 1),
        hh_(height >> 1),
        kx_((int64_t{1} << 28) / (int64_t{hw_} * hw_)),
        ky_((int64_t{1} << 28) / (int64_t{hh_} * hh_)) {}

  int32_t weight(int32_t x, int32_t y) const {
    const int64_t w =
        (int64_t{1} << 28) - term(x - int64_t{hw_}, kx_) - term(y - int64_t{hh_}, ky_);
    return w < 0 ? 0 : static_cast<int32_t>(w >> 8);
  }

 private:
  static int64_t term(int64_t d, int64_t k) { return k == 0 ? 0 : (k * (7 * d * d)) >> 4; }

  int32_t hw_, hh_;
  int64_t kx_, ky_;
};

// Each colour channel times weight / 2^shift; alpha kept.
constexpr uint32_t scale_pixel(uint32_t p, int32_t weight, int32_t shift) {
  return pack(p, (weight * red_of(p)) >> shift, (weight * green_of(p)) >> shift,
              (weight * blue_of(p)) >> shift);
}

}  // namespace
}  // namespace pfx

extern "C" {

// An image narrower or lower than 2 pixels has a half-size of 0 to divide by; it has no border
// to fall off toward either, so every pixel keeps weight 1 and comes out as its source.
void fx_apply_vignette(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (width < 2 || height < 2) {
    pfx::for_each_pixel(src, dst, width, height, [](uint32_t p) { return p; });
    return;
  }
  if (pfx::pixel_count(width, height) > pfx::kMaxPixels) return;
  const pfx::DividedVignette vignette(width, height);
  pfx::for_each_pixel_at(src, dst, width, height, [&](uint32_t p, int32_t x, int32_t y) {
    return pfx::scale_pixel(p, vignette.weight(x, y), 20);
  });
}

void fx_apply_vignette_prev(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  const pfx::PreviewVignette vignette(width, height);
  pfx::for_each_pixel_at(src, dst, width, height, [&](uint32_t p, int32_t x, int32_t y) {
    return pfx::scale_pixel(p, vignette.weight(x, y), 22);
  });
}

}  // extern "C"
