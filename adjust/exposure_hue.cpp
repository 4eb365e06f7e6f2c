// Exposure and hue.
//
// Exposure multiplies every colour channel by level / 10 in 16.16 fixed point (level 20 doubles,
// level 0 is black). Hue turns each pixel's hue by 18 degrees per level step from the neutral 10
// through the HSV conversion; greys have no hue and stay as they are. Both refuse null buffers
// with PHOTOFX_INVALID_ARGUMENT and then write nothing.
#include <cstddef>
#include <cstdint>

#include "adjust/channel_map.h"
#include "frame/frame.h"
#include "frame/hsv.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

constexpr int32_t status(bool done) { return done ? PHOTOFX_SUCCESS : PHOTOFX_INVALID_ARGUMENT; }

// Nearest integer of a 16.16 value, halves upward, for products that need more than 32 bits.
constexpr int64_t fixtoi64(int64_t x) { return (x >> 16) + ((x >> 15) & 1); }

// The factor itofix(10 * level) / 100, truncated toward zero, and each channel times it. Both are
// formed in 64 bits: from level 1286 up the 32-bit product of a bright channel and the factor
// would overflow, and from 3277 up the factor itself. In 64 bits every level, INT32_MAX included,
// gives the unbounded result (white for every non-zero channel from level 2555 up), and every
// level whose 32-bit arithmetic fits gives the same value as before. The curve goes into a
// table once per call, so the wide arithmetic costs nothing per pixel.
ChannelMap exposure_map(int32_t level) {
  const int64_t factor = int64_t{level} * 655360 / 100;
  return ChannelMap([factor](int32_t c) {
    const int64_t v = fixtoi64(c * factor);
    return static_cast<int32_t>(v < 0 ? 0 : (v > 255 ? 255 : v));
  });
}

// Exposure's partial variant: valid bounds only switch masked mode on; the mask is then read for
// every pixel of the image, and a selected pixel is edited whether it lies inside the bounds or
// not. Invalid bounds edit every pixel without reading the mask.
template <class Rule>
bool edit_mask_over_whole_image(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                int32_t width, int32_t height, Rect bounds, const Rule& rule) {
  if (!partial_args_ok(src, mask, dst, width, height, bounds)) return false;
  const int64_t n = pixel_count(width, height);
  copy_image(src, dst, n);
  if (is_region(bounds)) {
    for (size_t i = 0; i < static_cast<size_t>(n); ++i) {
      if (mask[i] == 1) dst[i] = rule(src[i]);
    }
  } else {
    for (size_t i = 0; i < static_cast<size_t>(n); ++i) dst[i] = rule(src[i]);
  }
  return true;
}

// The hue is turned by the shift and brought back into range with one correction each way, so a
// turn of more than a full circle leaves a hue outside 0..360, which the HSV conversion paints
// black (greys keep their value when the hue is not negative). From 41 steps on either side of 10
// that is already the case for every hue, so holding the steps at +-100 changes no result and
// keeps the shift from overflowing.
auto hue_rule(int32_t level) {
  const int32_t shift = 18 * (clamp_to(level, -90, 110) - 10);
  return [shift](uint32_t p) {
    if (shift == 0) return p;
    const Hsv hsv = rgb_to_hsv(red_of(p), green_of(p), blue_of(p));
    int32_t h = hsv.h + shift;
    if (h < 0) h += 360;
    if (h > 359) h -= 360;
    const Rgb c = hsv_to_rgb(h, hsv.s, hsv.v);
    return pack(p, c.r, c.g, c.b);
  };
}

}  // namespace
}  // namespace pfx

extern "C" {

int32_t fx_control_exposure_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                int32_t level) {
  if (src == nullptr || dst == nullptr) return PHOTOFX_INVALID_ARGUMENT;
  return pfx::status(pfx::for_each_pixel(src, dst, width, height, pfx::exposure_map(level)));
}

int32_t fx_control_exposure(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                            int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                            int32_t bottom) {
  if (src == nullptr || dst == nullptr) return PHOTOFX_INVALID_ARGUMENT;
  return pfx::status(pfx::edit_mask_over_whole_image(
      src, mask, dst, width, height, {left, right, top, bottom}, pfx::exposure_map(level)));
}

int32_t fx_control_hue_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                           int32_t level) {
  return pfx::status(pfx::for_each_pixel(src, dst, width, height, pfx::hue_rule(level)));
}

int32_t fx_control_hue(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                       int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                       int32_t bottom) {
  return pfx::status(pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                                        pfx::hue_rule(level)));
}

void controlExposure(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                     int32_t level) {
  fx_control_exposure_all(src, dst, width, height, level);
}

void controlExposurePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                            int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                            int32_t bottom) {
  fx_control_exposure(src, mask, dst, width, height, level, left, right, top, bottom);
}

void controlHue(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t level) {
  fx_control_hue_all(src, dst, width, height, level);
}

void controlHuePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                       int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                       int32_t bottom) {
  fx_control_hue(src, mask, dst, width, height, level, left, right, top, bottom);
}

}  // extern "C"
