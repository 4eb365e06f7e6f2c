// The slider adjustments in their two frames: partial variants that edit exactly the selected
// pixels (in place too), whole-image mode, alpha kept, entry points that forward unchanged.
// Missing buffers, empty sizes and full variants in place are in bad_input_test.
#include <gtest/gtest.h>

#include <cstdint>

#include "frame/frame.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::Rect;
using pfx::test::Mask;
using pfx::test::Pixels;

using Full = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t);
using Partial = void (*)(const uint32_t*, const uint8_t*, uint32_t*, int32_t, int32_t, Rect);

// The functions with their levels fixed.
template <auto F, int32_t... L>
void full(const uint32_t* s, uint32_t* d, int32_t w, int32_t h) {
  F(s, d, w, h, L...);
}

template <auto F, int32_t... L>
void part(const uint32_t* s, const uint8_t* m, uint32_t* d, int32_t w, int32_t h, Rect b) {
  F(s, m, d, w, h, L..., b.left, b.right, b.top, b.bottom);
}

struct Adjustment {
  const char* name;
  Full full, entry;  // the fx_ full variant and its camelCase entry point
  Partial partial, entry_partial;
  bool selects_outside_bounds;  // exposure: valid bounds only choose masked mode
};

// Each adjustment at levels away from neutral, so that edited pixels differ from the source.
const Adjustment kAdjustments[] = {
    {"brightness", full<fx_control_brightness_all, 17>, full<controlBrightness, 17>,
     part<fx_control_brightness, 17>, part<controlBrightnessPartial, 17>, false},
    {"contrast", full<fx_control_contrast_all, 16>, full<controlContrast, 16>,
     part<fx_control_contrast, 16>, part<controlContrastPartial, 16>, false},
    {"saturation", full<fx_control_saturation_all, 16>, full<controlSaturation, 16>,
     part<fx_control_saturation, 16>, part<controlSaturationPartial, 16>, false},
    {"temperature", full<fx_control_temperature_all, 3>, full<controlTemperature, 3>,
     part<fx_control_temperature, 3>, part<controlTemperaturePartial, 3>, false},
    {"exposure", full<fx_control_exposure_all, 13>, full<controlExposure, 13>,
     part<fx_control_exposure, 13>, part<controlExposurePartial, 13>, true},
    {"hue", full<fx_control_hue_all, 6>, full<controlHue, 6>, part<fx_control_hue, 6>,
     part<controlHuePartial, 6>, false},
    {"faded colour", full<fx_control_fadedcolor_all, 70>, full<controlFadedColour, 70>,
     part<fx_control_fadedcolor, 70>, part<controlFadedColourPartial, 70>, false},
    {"invert", full<fx_apply_invert_all>, full<applyInvert>, part<fx_apply_invert>,
     part<applyInvertPartial>, false},
    {"channel gains", full<fx_adjust_RGB_all, 14, 5, 9>, full<controlAdjustRGB, 14, 5, 9>,
     part<fx_adjust_RGB, 14, 5, 9>, part<AdjustRGB, 14, 5, 9>, false},
};

constexpr int32_t kW = 23, kH = 17;

Pixels run_full(Full fn, const Pixels& src) {
  Pixels out(src.size(), 0xA5A5A5A5u);
  fn(src.data(), out.data(), kW, kH);
  return out;
}

Pixels run_partial(Partial fn, const Pixels& src, const Mask& mask, Rect bounds) {
  Pixels out(src.size(), 0xA5A5A5A5u);
  fn(src.data(), mask.data(), out.data(), kW, kH, bounds);
  return out;
}

TEST(AdjustFrames, FullVariantsKeepAlphaAndEntryPointsForward) {
  const Pixels img = pfx::test::random_image(kW, kH, 12);
  const Mask mask = pfx::test::random_mask(kW, kH, 19);
  for (const Adjustment& a : kAdjustments) {
    SCOPED_TRACE(a.name);
    const Pixels out = run_full(a.full, img);
    for (size_t i = 0; i < img.size(); ++i) ASSERT_EQ(out[i] >> 24, img[i] >> 24) << i;
    EXPECT_EQ(run_full(a.entry, img), out);
    for (Rect b : {Rect{2, 20, 1, 9}, Rect{1, 0, 0, 0}}) {
      EXPECT_EQ(run_partial(a.entry_partial, img, mask, b), run_partial(a.partial, img, mask, b));
    }
  }
}

TEST(AdjustFrames, PartialEditsExactlyTheSelectedPixels) {
  const Pixels img = pfx::test::random_image(kW, kH, 13);
  const Mask mask = pfx::test::random_mask(kW, kH, 14);
  const Rect bounds{3, 15, 2, 11};
  for (const Adjustment& a : kAdjustments) {
    SCOPED_TRACE(a.name);
    const Pixels full = run_full(a.full, img);
    const Pixels part = run_partial(a.partial, img, mask, bounds);
    for (int32_t y = 0; y < kH; ++y) {
      for (int32_t x = 0; x < kW; ++x) {
        const size_t i = static_cast<size_t>(y * kW + x);
        const bool inside =
            x >= bounds.left && x <= bounds.right && y >= bounds.top && y <= bounds.bottom;
        const bool edited = mask[i] == 1 && (inside || a.selects_outside_bounds);
        ASSERT_EQ(part[i], edited ? full[i] : img[i]) << x << "," << y;
      }
    }
    // One buffer as source and destination gives the same.
    Pixels in_place = img;
    a.partial(in_place.data(), mask.data(), in_place.data(), kW, kH, bounds);
    EXPECT_EQ(in_place, part);
    // Empty bounds (either axis) edit the whole image whatever the mask says.
    const Mask zeros(img.size(), 0);
    EXPECT_EQ(run_partial(a.partial, img, zeros, {1, 0, 0, kH - 1}), full);
    EXPECT_EQ(run_partial(a.partial, img, zeros, {0, kW - 1, 5, 4}), full);
  }
}

}  // namespace
