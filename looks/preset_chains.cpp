// The six one-touch preset looks: retro, sunshine, downlight, bluewash, nostalgia, yellow glow.
//
// Each look is a fixed chain of the slider adjustments' full variants with fixed levels: the
// first pass reads the source and writes the destination, every later pass works on the
// destination in place. The character of a look is nothing but its order of passes and their
// levels. Downlight's second pass is auto adjust, so it follows the module's auto-adjust
// parameters; the other looks read no module state. A pass that refuses or fails (auto adjust
// without memory) leaves its input as it was and the chain goes on.
//
// The partial variants share preset compositing (looks/preset.h).
#include <cstdint>

#include "frame/frame.h"
#include "looks/preset.h"
#include "photofx.h"

namespace pfx {
namespace {

// A null buffer would leave the later, in-place passes editing whatever dst held; refuse before
// the first pass instead, and likewise an image too large to address.
bool chain_args_ok(const uint32_t* src, const uint32_t* dst, int32_t width, int32_t height) {
  return src != nullptr && dst != nullptr && pixel_count(width, height) <= kMaxPixels;
}

}  // namespace
}  // namespace pfx

extern "C" {

void fx_apply_retro(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (!pfx::chain_args_ok(src, dst, width, height)) return;
  fx_control_saturation_all(src, dst, width, height, 5);
  fx_control_brightness_all(dst, dst, width, height, 12);
  fx_control_fadedcolor_all(dst, dst, width, height, 50);
  fx_control_saturation_all(dst, dst, width, height, 7);
  fx_control_contrast_all(dst, dst, width, height, 9);
  fx_control_brightness_all(dst, dst, width, height, 11);
  fx_control_contrast_all(dst, dst, width, height, 12);
}

void fx_apply_sunshine(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (!pfx::chain_args_ok(src, dst, width, height)) return;
  fx_control_contrast_all(src, dst, width, height, 11);
  fx_control_temperature_all(dst, dst, width, height, 14);
  fx_adjust_RGB_all(dst, dst, width, height, 11, 12, 8);
  fx_control_contrast_all(dst, dst, width, height, 11);
}

void fx_apply_downlight(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (!pfx::chain_args_ok(src, dst, width, height)) return;
  fx_control_fadedcolor_all(src, dst, width, height, 50);
  fx_process_hdr(dst, dst, width, height);
  fx_control_contrast_all(dst, dst, width, height, 9);
  fx_control_saturation_all(dst, dst, width, height, 7);
  fx_adjust_RGB_all(dst, dst, width, height, 9, 9, 9);
  fx_control_exposure_all(dst, dst, width, height, 13);
}

void fx_apply_bluewash(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (!pfx::chain_args_ok(src, dst, width, height)) return;
  fx_control_contrast_all(src, dst, width, height, 12);
  fx_control_saturation_all(dst, dst, width, height, 7);
  fx_control_temperature_all(dst, dst, width, height, 6);
  fx_control_exposure_all(dst, dst, width, height, 11);
  fx_adjust_RGB_all(dst, dst, width, height, 10, 9, 11);
}

void fx_apply_nostalgia(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (!pfx::chain_args_ok(src, dst, width, height)) return;
  fx_control_brightness_all(src, dst, width, height, 12);
  fx_control_fadedcolor_all(dst, dst, width, height, 50);
  fx_control_exposure_all(dst, dst, width, height, 11);
  fx_control_saturation_all(dst, dst, width, height, 7);
  fx_control_temperature_all(dst, dst, width, height, 13);
}

void fx_apply_yellowglow(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (!pfx::chain_args_ok(src, dst, width, height)) return;
  fx_control_fadedcolor_all(src, dst, width, height, 50);
  fx_control_temperature_all(dst, dst, width, height, 12);
  fx_control_exposure_all(dst, dst, width, height, 13);
  fx_control_saturation_all(dst, dst, width, height, 8);
  fx_adjust_RGB_all(dst, dst, width, height, 13, 14, 9);
  fx_control_contrast_all(dst, dst, width, height, 13);
}

void fx_apply_retro_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                            int32_t height, int32_t left, int32_t right, int32_t top,
                            int32_t bottom) {
  pfx::composite_preset(fx_apply_retro, src, mask, dst, width, height, {left, right, top, bottom});
}

void fx_apply_sunshine_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                               int32_t width, int32_t height, int32_t left, int32_t right,
                               int32_t top, int32_t bottom) {
  pfx::composite_preset(fx_apply_sunshine, src, mask, dst, width, height,
                        {left, right, top, bottom});
}

void fx_apply_downlight_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                int32_t width, int32_t height, int32_t left, int32_t right,
                                int32_t top, int32_t bottom) {
  pfx::composite_preset(fx_apply_downlight, src, mask, dst, width, height,
                        {left, right, top, bottom});
}

void fx_apply_bluewash_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                               int32_t width, int32_t height, int32_t left, int32_t right,
                               int32_t top, int32_t bottom) {
  pfx::composite_preset(fx_apply_bluewash, src, mask, dst, width, height,
                        {left, right, top, bottom});
}

void fx_apply_nostalgia_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                int32_t width, int32_t height, int32_t left, int32_t right,
                                int32_t top, int32_t bottom) {
  pfx::composite_preset(fx_apply_nostalgia, src, mask, dst, width, height,
                        {left, right, top, bottom});
}

void fx_apply_yellowglow_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                 int32_t width, int32_t height, int32_t left, int32_t right,
                                 int32_t top, int32_t bottom) {
  pfx::composite_preset(fx_apply_yellowglow, src, mask, dst, width, height,
                        {left, right, top, bottom});
}

void applyRetro(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_retro(src, dst, width, height);
}

void applyRetroPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                       int32_t height, int32_t left, int32_t right, int32_t top, int32_t bottom) {
  fx_apply_retro_partial(src, mask, dst, width, height, left, right, top, bottom);
}

void applySunshine(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_sunshine(src, dst, width, height);
}

void applySunshinePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                          int32_t height, int32_t left, int32_t right, int32_t top,
                          int32_t bottom) {
  fx_apply_sunshine_partial(src, mask, dst, width, height, left, right, top, bottom);
}

void applyDownlight(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_downlight(src, dst, width, height);
}

void applyDownlightPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                           int32_t height, int32_t left, int32_t right, int32_t top,
                           int32_t bottom) {
  fx_apply_downlight_partial(src, mask, dst, width, height, left, right, top, bottom);
}

void applyBluewash(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_bluewash(src, dst, width, height);
}

void applyBluewashPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                          int32_t height, int32_t left, int32_t right, int32_t top,
                          int32_t bottom) {
  fx_apply_bluewash_partial(src, mask, dst, width, height, left, right, top, bottom);
}

void applyNostalgia(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_nostalgia(src, dst, width, height);
}

void applyNostalgiaPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                           int32_t height, int32_t left, int32_t right, int32_t top,
                           int32_t bottom) {
  fx_apply_nostalgia_partial(src, mask, dst, width, height, left, right, top, bottom);
}

void applyYellowglow(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_yellowglow(src, dst, width, height);
}

void applyYellowglowPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                            int32_t height, int32_t left, int32_t right, int32_t top,
                            int32_t bottom) {
  fx_apply_yellowglow_partial(src, mask, dst, width, height, left, right, top, bottom);
}

}  // extern "C"
