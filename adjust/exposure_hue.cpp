// Exposure and hue.
//
// Exposure multiplies every colour channel by level / 10 in 16.16 fixed point (level 20 doubles,
// level 0 is black). Hue turns each pixel's hue by 18 degrees per level step from the neutral 10
// through the HSV conversion; greys have no hue and stay as they are. Both refuse null buffers
// with PHOTOFX_INVALID_ARGUMENT and then write nothing.
#include <cstddef>
#include <cstdint>

#include "adjust/channel_map.h"
#include "adjust/exposure_hue.h"
#include "adjust/kernels.h"
#include "frame/frame.h"
#include "frame/hsv.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

constexpr int32_t status(bool done) { return done ? PHOTOFX_SUCCESS : PHOTOFX_INVALID_ARGUMENT; }

// Exposure's partial variant: valid bounds only switch masked mode on; the mask is then read for
// every pixel of the image, and a selected pixel is edited whether it lies inside the bounds or
// not. Invalid bounds edit every pixel without reading the mask. As in the common frame, the
// copy of the source and the edit are one pass.
template <class Rule, class Kernel>
bool edit_mask_over_whole_image(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                int32_t width, int32_t height, Rect bounds, const Rule& rule,
                                const Kernel& kernel) {
  if (!partial_args_ok(src, mask, dst, width, height, bounds)) return false;
  const size_t n = static_cast<size_t>(pixel_count(width, height));
  const uint8_t* selection = is_region(bounds) ? mask : nullptr;
  const size_t done = neon_kernels() ? kernel(Run{src, selection, dst, n}) : 0;
  if (selection != nullptr) {
    map_selected_pixels(src + done, mask + done, dst + done, n - done, rule);
  } else {
    map_pixels(src + done, dst + done, n - done, rule);
  }
  return true;
}

// The hue is turned by the shift and brought back into range with one correction each way, so a
// turn of more than a full circle leaves a hue outside 0..360, which the HSV conversion paints
// black (greys keep their value when the hue is not negative). From 41 steps on either side of 10
// that is already the case for every hue, so holding the steps at +-100 changes no result and
// keeps the shift from overflowing.
class HueTurn {
 public:
  explicit HueTurn(int32_t level) : shift_(18 * (clamp_to(level, -90, 110) - 10)) {}

  // Level 10 repacks every pixel unchanged: the callers then skip the conversion altogether,
  // which also keeps this test out of the pixel loop.
  bool turns() const { return shift_ != 0; }

  Rgb operator()(Rgb c) const {
    const Hsv hsv = rgb_to_hsv(c.r, c.g, c.b);
    int32_t h = hsv.h + shift_;
    h += h < 0 ? 360 : 0;
    h -= h > 359 ? 360 : 0;
    return hsv_to_rgb(h, hsv.s, hsv.v);
  }

 private:
  int32_t shift_;
};

constexpr auto unchanged = [](uint32_t p) { return p; };

}  // namespace
}  // namespace pfx

extern "C" {

int32_t fx_control_exposure_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                int32_t level) {
  if (src == nullptr || dst == nullptr) return PHOTOFX_INVALID_ARGUMENT;
  const pfx::Exposure rule(level);
  return pfx::status(
      pfx::for_each_pixel_by_channel(src, dst, width, height, rule, pfx::kernel_for(rule)));
}

int32_t fx_control_exposure(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                            int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                            int32_t bottom) {
  if (src == nullptr || dst == nullptr) return PHOTOFX_INVALID_ARGUMENT;
  const pfx::Exposure rule(level);
  return pfx::status(pfx::edit_mask_over_whole_image(src, mask, dst, width, height,
                                                     {left, right, top, bottom},
                                                     pfx::on_pixels(rule), pfx::kernel_for(rule)));
}

int32_t fx_control_hue_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                           int32_t level) {
  const pfx::HueTurn turn(level);
  if (!turn.turns())
    return pfx::status(pfx::for_each_pixel(src, dst, width, height, pfx::unchanged));
  return pfx::status(pfx::for_each_pixel(src, dst, width, height, pfx::on_pixels(turn)));
}

int32_t fx_control_hue(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                       int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                       int32_t bottom) {
  const pfx::HueTurn turn(level);
  const pfx::Rect bounds{left, right, top, bottom};
  if (!turn.turns()) {
    return pfx::status(pfx::edit_selected(src, mask, dst, width, height, bounds, pfx::unchanged));
  }
  return pfx::status(
      pfx::edit_selected(src, mask, dst, width, height, bounds, pfx::on_pixels(turn)));
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
