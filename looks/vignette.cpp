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
  if (src == nullptr || dst == nullptr || pfx::pixel_count(width, height) > pfx::kMaxPixels) {
    return;
  }
  const pfx::DividedVignette vignette(width, height);
  pfx::for_each_pixel_weighted(
      src, nullptr, dst, width, height, vignette,
      [](uint32_t p, uint32_t w) {
        return pfx::scale_pixel(p, static_cast<int32_t>(w), pfx::DividedVignette::kShift);
      },
      [&](const pfx::Run& run, int32_t x0, uint32_t base) {
        return pfx::neon::vignette(run, vignette, x0, base);
      });
}

void fx_apply_vignette_prev(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (src == nullptr || dst == nullptr || pfx::pixel_count(width, height) > pfx::kMaxPixels) {
    return;
  }
  const pfx::PreviewVignette vignette(width, height);
  pfx::for_each_pixel_weighted(
      src, nullptr, dst, width, height, vignette,
      [](uint32_t p, uint32_t w) {
        return pfx::scale_pixel(p, static_cast<int32_t>(w), pfx::PreviewVignette::kShift);
      },
      [&](const pfx::Run& run, int32_t x0, uint32_t base) {
        return pfx::neon::vignette_preview(run, vignette, x0, base);
      });
}

}  // extern "C"
