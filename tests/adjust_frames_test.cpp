// The slider adjustments in their two frames: partial variants that edit exactly the selected
// pixels (in place too), whole-image mode, alpha kept, entry points that forward unchanged.
// Missing buffers, empty sizes and full variants in place are in bad_input_test.
#include <gtest/gtest.h>

#include <cstdint>
#include <functional>
#include <vector>

#include "frame/frame.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::Rect;
using pfx::test::Mask;
using pfx::test::Pixels;

using Full = std::function<void(const uint32_t*, uint32_t*, int32_t, int32_t)>;
using Partial =
    std::function<void(const uint32_t*, const uint8_t*, uint32_t*, int32_t, int32_t, Rect)>;

struct Adjustment {
  const char* name;
  Full full;        // the fx_ full variant
  Partial partial;  // the fx_ partial variant
  Full entry;       // the camelCase entry points
  Partial entry_partial;
  bool selects_outside_bounds;  // exposure: valid bounds only choose masked mode
};

// One row of the table: the four functions of an adjustment called with the given levels.
#define ADJUSTMENT(name, full, partial, entry, entry_partial, outside, ...)                    \
  Adjustment {                                                                                 \
    name, [](auto s, auto d, auto w, auto h) { full(s, d, w, h __VA_OPT__(, ) __VA_ARGS__); }, \
        [](auto s, auto m, auto d, auto w, auto h, Rect b) {                                   \
          partial(s, m, d, w, h __VA_OPT__(, ) __VA_ARGS__, b.left, b.right, b.top, b.bottom); \
        },                                                                                     \
        [](auto s, auto d, auto w, auto h) { entry(s, d, w, h __VA_OPT__(, ) __VA_ARGS__); },  \
        [](auto s, auto m, auto d, auto w, auto h, Rect b) {                                   \
          entry_partial(s, m, d, w, h __VA_OPT__(, ) __VA_ARGS__, b.left, b.right, b.top,      \
                        b.bottom);                                                             \
        },                                                                                     \
        outside                                                                                \
  }

// Each adjustment at levels away from neutral, so that edited pixels differ from the source.
std::vector<Adjustment> adjustments() {
  return {
      ADJUSTMENT("brightness", fx_control_brightness_all, fx_control_brightness, controlBrightness,
                 controlBrightnessPartial, false, 17),
      ADJUSTMENT("contrast", fx_control_contrast_all, fx_control_contrast, controlContrast,
                 controlContrastPartial, false, 16),
      ADJUSTMENT("saturation", fx_control_saturation_all, fx_control_saturation, controlSaturation,
                 controlSaturationPartial, false, 16),
      ADJUSTMENT("temperature", fx_control_temperature_all, fx_control_temperature,
                 controlTemperature, controlTemperaturePartial, false, 3),
      ADJUSTMENT("exposure", fx_control_exposure_all, fx_control_exposure, controlExposure,
                 controlExposurePartial, true, 13),
      ADJUSTMENT("hue", fx_control_hue_all, fx_control_hue, controlHue, controlHuePartial, false,
                 6),
      ADJUSTMENT("faded colour", fx_control_fadedcolor_all, fx_control_fadedcolor,
                 controlFadedColour, controlFadedColourPartial, false, 70),
      ADJUSTMENT("invert", fx_apply_invert_all, fx_apply_invert, applyInvert, applyInvertPartial,
                 false),
      ADJUSTMENT("channel gains", fx_adjust_RGB_all, fx_adjust_RGB, controlAdjustRGB, AdjustRGB,
                 false, 14, 5, 9),
  };
}

constexpr int32_t kW = 23, kH = 17;

Pixels run_full(const Full& fn, const Pixels& src) {
  Pixels out(src.size(), 0xA5A5A5A5u);
  fn(src.data(), out.data(), kW, kH);
  return out;
}

Pixels run_partial(const Partial& fn, const Pixels& src, const Mask& mask, Rect bounds) {
  Pixels out(src.size(), 0xA5A5A5A5u);
  fn(src.data(), mask.data(), out.data(), kW, kH, bounds);
  return out;
}

TEST(AdjustFrames, FullVariantsKeepAlphaAndEntryPointsForward) {
  const Pixels img = pfx::test::random_image(kW, kH, 12);
  const Mask mask = pfx::test::random_mask(kW, kH, 19);
  for (const Adjustment& a : adjustments()) {
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
  for (const Adjustment& a : adjustments()) {
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
