// The six one-touch preset looks: retro, sunshine, downlight, bluewash, nostalgia, yellow glow.
//
// Each look is a fixed chain of the slider adjustments with fixed levels, each pass working on
// the previous one's result. The character of a look is nothing but its order of passes and
// their levels. Downlight's second pass is auto adjust, so it follows the module's auto-adjust
// parameters; the other looks read no module state. A pass that refuses or fails (auto adjust
// without memory) leaves its input as it was and the chain goes on.
//
// Every pass but auto adjust works pixel by pixel, so a run of such passes is one function of
// each pixel: the looks make it in one pass over the image, handing each rule's channels to the
// next in registers, which gives the same pixels as one full-image pass per adjustment (none of
// the fixed levels is refused) at the memory cost of one.
//
// The partial variants share preset compositing (looks/preset.h); those of the looks that are
// one rule per pixel make it without a scratch image.
#include <cstdint>

#include "adjust/brightness_contrast.h"
#include "adjust/exposure_hue.h"
#include "adjust/faded_invert.h"
#include "adjust/gains_colortone.h"
#include "adjust/saturation_temperature.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "looks/kernels.h"
#include "looks/preset.h"
#include "photofx.h"

namespace pfx {
namespace {

// A null buffer would leave the later, in-place passes editing whatever dst held; refuse before
// the first pass instead, and likewise an image too large to address.
bool chain_args_ok(const uint32_t* src, const uint32_t* dst, int32_t width, int32_t height) {
  return src != nullptr && dst != nullptr && pixel_count(width, height) <= kMaxPixels;
}

// The looks' passes as one rule per pixel, each with its NEON kernel (looks/preset_neon.cpp).
auto retro() {
  // Seven rules: left to itself GCC calls the chain per pixel rather than inline it.
  const Saturation s5(5), s7(7);
  const Brightness b12(12), b11(11);
  const Fade fade(50);
  const Contrast c9(9), c12(12);
  return [=](uint32_t p) __attribute__((always_inline)) {
    return pack(p, c12(b11(c9(s7(fade(b12(s5(channels_of(p)))))))));
  };
}
auto sunshine() { return on_pixels(Contrast(11), Temperature(14), Gains(11, 12, 8), Contrast(11)); }
auto bluewash() {
  return on_pixels(Contrast(12), Saturation(7), Temperature(6), Exposure(11), Gains(10, 9, 11));
}
auto nostalgia() {
  return on_pixels(Brightness(12), Fade(50), Exposure(11), Saturation(7), Temperature(13));
}
auto yellowglow() {
  return on_pixels(Fade(50), Temperature(12), Exposure(13), Saturation(8), Gains(13, 14, 9),
                   Contrast(13));
}
// Downlight's passes after auto adjust.
auto downlight_tail() {
  return on_pixels(Contrast(9), Saturation(7), Gains(9, 9, 9), Exposure(13));
}

template <class Rule, class Kernel>
void full_look(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, const Rule& rule,
               const Kernel& kernel) {
  if (chain_args_ok(src, dst, width, height)) for_each_pixel(src, dst, width, height, rule, kernel);
}

}  // namespace
}  // namespace pfx

extern "C" {

void fx_apply_retro(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  pfx::full_look(src, dst, width, height, pfx::retro(), pfx::neon::retro);
}

void fx_apply_sunshine(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  pfx::full_look(src, dst, width, height, pfx::sunshine(), pfx::neon::sunshine);
}

// Auto adjust looks at the whole image, so the chain is made in three parts: the faded pass,
// auto adjust in place, then the remaining passes fused into one.
void fx_apply_downlight(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (!pfx::chain_args_ok(src, dst, width, height)) return;
  fx_control_fadedcolor_all(src, dst, width, height, 50);
  fx_process_hdr(dst, dst, width, height);
  pfx::for_each_pixel(dst, dst, width, height, pfx::downlight_tail(), pfx::neon::downlight_tail);
}

void fx_apply_bluewash(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  pfx::full_look(src, dst, width, height, pfx::bluewash(), pfx::neon::bluewash);
}

void fx_apply_nostalgia(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  pfx::full_look(src, dst, width, height, pfx::nostalgia(), pfx::neon::nostalgia);
}

void fx_apply_yellowglow(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  pfx::full_look(src, dst, width, height, pfx::yellowglow(), pfx::neon::yellowglow);
}

// The partial variants of the looks that are one rule per pixel need no scratch image
// (looks/preset.h); downlight's depends on the whole image through auto adjust.
void fx_apply_retro_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                            int32_t height, int32_t left, int32_t right, int32_t top,
                            int32_t bottom) {
  pfx::composite_pixels(src, mask, dst, width, height, {left, right, top, bottom}, pfx::retro(),
                        pfx::neon::retro);
}

void fx_apply_sunshine_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                               int32_t width, int32_t height, int32_t left, int32_t right,
                               int32_t top, int32_t bottom) {
  pfx::composite_pixels(src, mask, dst, width, height, {left, right, top, bottom}, pfx::sunshine(),
                        pfx::neon::sunshine);
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
  pfx::composite_pixels(src, mask, dst, width, height, {left, right, top, bottom}, pfx::bluewash(),
                        pfx::neon::bluewash);
}

void fx_apply_nostalgia_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                int32_t width, int32_t height, int32_t left, int32_t right,
                                int32_t top, int32_t bottom) {
  pfx::composite_pixels(src, mask, dst, width, height, {left, right, top, bottom}, pfx::nostalgia(),
                        pfx::neon::nostalgia);
}

void fx_apply_yellowglow_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                 int32_t width, int32_t height, int32_t left, int32_t right,
                                 int32_t top, int32_t bottom) {
  pfx::composite_pixels(src, mask, dst, width, height, {left, right, top, bottom},
                        pfx::yellowglow(), pfx::neon::yellowglow);
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
