// The bad-input rules over every full and every partial variant at once: missing buffers and
// masks, empty, negative and unaddressable sizes, the caller's inputs never written, and full
// variants given one buffer as source and destination. Family tests pin the rest (levels out of
// range, bounds and brushes clipped at the image edge, failed allocations in alloc_failure_test).
#include <gtest/gtest.h>

#include <cstdint>
#include <type_traits>
#include <vector>

#include "frame/frame.h"
#include "photofx.h"
#include "support/calls.h"
#include "support/images.h"

namespace {

using pfx::Rect;
using pfx::test::code_of;
using pfx::test::kNoCode;
using pfx::test::Mask;
using pfx::test::Pixels;

constexpr uint32_t kUntouched = 0xA5A5A5A5u;
constexpr int32_t kW = 23, kH = 17;

using FullFn = int32_t (*)(const uint32_t*, uint32_t*, int32_t, int32_t);
using PartialFn = int32_t (*)(const uint32_t*, const uint8_t*, uint32_t*, int32_t, int32_t, Rect);

// Adapters: the function with its levels fixed (away from neutral, so that results differ from
// the source).
template <auto Fn, int32_t... Levels>
int32_t full(const uint32_t* s, uint32_t* d, int32_t w, int32_t h) {
  return code_of([&] { return Fn(s, d, w, h, Levels...); });
}

template <auto Fn, int32_t... Levels>
int32_t partial(const uint32_t* s, const uint8_t* m, uint32_t* d, int32_t w, int32_t h, Rect b) {
  return code_of([&] { return Fn(s, m, d, w, h, Levels..., b.left, b.right, b.top, b.bottom); });
}

template <auto Fn>
int32_t tilt(const uint32_t* s, uint32_t* d, int32_t w, int32_t h) {
  Fn(s, d, w, h, h / 2, 1);
  return kNoCode;
}

// The texture the textured old-photo looks mix in.
const Pixels kTexture = pfx::test::random_image(kW, kH, 80);

struct FullRow {
  const char* name;
  FullFn fn;
};

struct PartialRow {
  const char* name;
  PartialFn fn;
  bool mask_in_every_mode = false;  // refuses a null mask even with whole-image bounds
};

const FullRow kFull[] = {
    {"fx_control_brightness_all", full<fx_control_brightness_all, 14>},
    {"controlBrightness", full<controlBrightness, 6>},
    {"fx_control_contrast_all", full<fx_control_contrast_all, 15>},
    {"controlContrast", full<controlContrast, 4>},
    {"fx_control_saturation_all", full<fx_control_saturation_all, 16>},
    {"controlSaturation", full<controlSaturation, 3>},
    {"fx_control_temperature_all", full<fx_control_temperature_all, 3>},
    {"controlTemperature", full<controlTemperature, 17>},
    {"fx_control_exposure_all", full<fx_control_exposure_all, 13>},
    {"controlExposure", full<controlExposure, 7>},
    {"fx_control_hue_all", full<fx_control_hue_all, 6>},
    {"controlHue", full<controlHue, 14>},
    {"fx_control_fadedcolor_all", full<fx_control_fadedcolor_all, 70>},
    {"controlFadedColour", full<controlFadedColour, 30>},
    {"fx_apply_invert_all", full<fx_apply_invert_all>},
    {"applyInvert", full<applyInvert>},
    {"fx_adjust_RGB_all", full<fx_adjust_RGB_all, 14, 5, 9>},
    {"controlAdjustRGB", full<controlAdjustRGB, 2, 12, 19>},
    {"fx_change_colortone", full<fx_change_colortone, 200>},
    {"fx_control_greyscale_all", full<fx_control_greyscale_all, 13>},
    {"controlGreyscale", full<controlGreyscale, 8>},
    {"fx_apply_sepia", full<fx_apply_sepia>},
    {"fx_apply_sharpen_all", full<fx_apply_sharpen_all>},
    {"fx_apply_pixelize", full<fx_apply_pixelize, 2>},
    {"applyPixelize", full<applyPixelize, 1>},
    {"fx_apply_tiltshift", tilt<fx_apply_tiltshift>},
    {"applyTiltShift", tilt<applyTiltShift>},
    {"fx_apply_retro", full<fx_apply_retro>},
    {"applyRetro", full<applyRetro>},
    {"fx_apply_sunshine", full<fx_apply_sunshine>},
    {"applySunshine", full<applySunshine>},
    {"fx_apply_downlight", full<fx_apply_downlight>},
    {"applyDownlight", full<applyDownlight>},
    {"fx_apply_bluewash", full<fx_apply_bluewash>},
    {"applyBluewash", full<applyBluewash>},
    {"fx_apply_nostalgia", full<fx_apply_nostalgia>},
    {"applyNostalgia", full<applyNostalgia>},
    {"fx_apply_yellowglow", full<fx_apply_yellowglow>},
    {"applyYellowglow", full<applyYellowglow>},
    {"fx_process_hdr", full<fx_process_hdr>},
    {"applyAutoAdjust", full<applyAutoAdjust>},
    {"control_gamma",
     [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h) {
       control_gamma(s, d, w, h, 0, 1.8);
       return kNoCode;
     }},
    {"changeHistogramByInput", full<changeHistogramByInput, 1, 30, 200>},
    {"changeHistogramByOutput", full<changeHistogramByOutput, 3, 40, 220>},
    {"fx_apply_vignette", full<fx_apply_vignette>},
    {"fx_apply_vignette_prev", full<fx_apply_vignette_prev>},
    {"fx_apply_vintage", full<fx_apply_vintage>},
    {"applyVintage", full<applyVintage>},
    {"fx_apply_vintage_prev", full<fx_apply_vintage_prev>},
    {"fx_apply_oldphoto", full<fx_apply_oldphoto>},
    {"applyOldPhoto", full<applyOldPhoto>},
    {"fx_apply_oldphoto_texture",
     [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h) {
       fx_apply_oldphoto_texture(s, d, kTexture.data(), w, h);
       return kNoCode;
     }},
    {"fx_apply_popart", full<fx_apply_popart>},
    {"applyPopArt", full<applyPopArt>},
    {"fx_apply_popart_prev", full<fx_apply_popart_prev>},
    {"fx_softglow", full<fx_softglow, 60>},
    {"applySoftglow", full<applySoftglow, 35>},
};

const PartialRow kPartial[] = {
    {"fx_control_brightness", partial<fx_control_brightness, 14>},
    {"controlBrightnessPartial", partial<controlBrightnessPartial, 6>},
    {"fx_control_contrast", partial<fx_control_contrast, 15>},
    {"controlContrastPartial", partial<controlContrastPartial, 4>},
    {"fx_control_saturation", partial<fx_control_saturation, 16>},
    {"controlSaturationPartial", partial<controlSaturationPartial, 3>},
    {"fx_control_temperature", partial<fx_control_temperature, 3>},
    {"controlTemperaturePartial", partial<controlTemperaturePartial, 17>},
    {"fx_control_exposure", partial<fx_control_exposure, 13>},
    {"controlExposurePartial", partial<controlExposurePartial, 7>},
    {"fx_control_hue", partial<fx_control_hue, 6>},
    {"controlHuePartial", partial<controlHuePartial, 14>},
    {"fx_control_fadedcolor", partial<fx_control_fadedcolor, 70>, true},
    {"controlFadedColourPartial", partial<controlFadedColourPartial, 30>, true},
    {"fx_apply_invert", partial<fx_apply_invert>, true},
    {"applyInvertPartial", partial<applyInvertPartial>, true},
    {"fx_adjust_RGB", partial<fx_adjust_RGB, 14, 5, 9>},
    {"AdjustRGB", partial<AdjustRGB, 2, 12, 19>},
    {"fx_control_greyscale", partial<fx_control_greyscale, 13>},
    {"controlGreyscalePartial", partial<controlGreyscalePartial, 8>},
    {"fx_apply_sepia_partial", partial<fx_apply_sepia_partial>},
    {"fx_apply_sharpen", partial<fx_apply_sharpen, 10>},
    {"applySharpen", partial<applySharpen, 10>},
    {"fx_make_blur", partial<fx_make_blur, 5>},
    {"applyBlur", partial<applyBlur, 8>},
    {"fx_apply_retro_partial", partial<fx_apply_retro_partial>},
    {"applyRetroPartial", partial<applyRetroPartial>},
    {"fx_apply_sunshine_partial", partial<fx_apply_sunshine_partial>},
    {"applySunshinePartial", partial<applySunshinePartial>},
    {"fx_apply_downlight_partial", partial<fx_apply_downlight_partial>},
    {"applyDownlightPartial", partial<applyDownlightPartial>},
    {"fx_apply_bluewash_partial", partial<fx_apply_bluewash_partial>},
    {"applyBluewashPartial", partial<applyBluewashPartial>},
    {"fx_apply_nostalgia_partial", partial<fx_apply_nostalgia_partial>},
    {"applyNostalgiaPartial", partial<applyNostalgiaPartial>},
    {"fx_apply_yellowglow_partial", partial<fx_apply_yellowglow_partial>},
    {"applyYellowglowPartial", partial<applyYellowglowPartial>},
    {"fx_apply_vintage_partial", partial<fx_apply_vintage_partial>},
    {"applyVintagePartial", partial<applyVintagePartial>},
    {"fx_apply_oldphoto_partial", partial<fx_apply_oldphoto_partial>},
    {"applyOldPhotoPartial", partial<applyOldPhotoPartial>},
    {"fx_apply_oldphoto_texture_partial",
     [](const uint32_t* s, const uint8_t* m, uint32_t* d, int32_t w, int32_t h, Rect b) {
       fx_apply_oldphoto_texture_partial(s, d, kTexture.data(), m, w, h, b.left, b.right, b.top,
                                         b.bottom);
       return kNoCode;
     }},
    {"fx_softglow_partial", partial<fx_softglow_partial, 60>},
    {"applySoftglowPartial", partial<applySoftglowPartial, 35>},
};

// A refused call returns the invalid-argument code where it returns a code at all.
bool refused(int32_t code) { return code == PHOTOFX_INVALID_ARGUMENT || code == kNoCode; }
bool accepted(int32_t code) { return code == PHOTOFX_SUCCESS || code == kNoCode; }

// Sizes whose pixel count no buffer could hold, each given a buffer of a few pixels: they must be
// refused before anything is read or written. Then empty and negative sizes, which have nothing
// to visit.
constexpr int32_t kUnaddressable[][2] = {
    {65536, 65536}, {INT32_MAX, 2}, {2, INT32_MAX}, {46341, 46341}, {23170, 23171}};
constexpr int32_t kEmpty[][2] = {
    {0, kH}, {kW, 0}, {-1, kH}, {kW, -5}, {INT32_MIN, kH}, {kW, INT32_MIN}, {INT32_MIN, INT32_MIN}};

const Rect kMasked{2, kW - 3, 1, kH - 2};
const Rect kWhole{1, 0, 0, 0};

TEST(BadInput, PartialVariantsRefuseMissingBuffersAndUnaddressableSizes) {
  const Pixels img = pfx::test::random_image(kW, kH, 81);
  const Mask mask = pfx::test::random_mask(kW, kH, 82);
  const Pixels untouched(img.size(), kUntouched);
  for (const PartialRow& row : kPartial) {
    SCOPED_TRACE(row.name);
    for (Rect b : {kMasked, kWhole}) {
      Pixels dst = untouched;
      EXPECT_TRUE(refused(row.fn(nullptr, mask.data(), dst.data(), kW, kH, b)));
      EXPECT_TRUE(refused(row.fn(img.data(), mask.data(), nullptr, kW, kH, b)));
      for (const auto& s : kUnaddressable) {
        EXPECT_TRUE(refused(row.fn(img.data(), mask.data(), dst.data(), s[0], s[1], b)));
      }
      for (const auto& s : kEmpty) row.fn(img.data(), mask.data(), dst.data(), s[0], s[1], b);
      EXPECT_EQ(dst, untouched);
    }
    // A mask is needed in masked mode only (two functions check it in either mode).
    Pixels dst = untouched;
    EXPECT_TRUE(refused(row.fn(img.data(), nullptr, dst.data(), kW, kH, kMasked)));
    EXPECT_EQ(dst, untouched);
    const int32_t code = row.fn(img.data(), nullptr, dst.data(), kW, kH, kWhole);
    if (row.mask_in_every_mode) {
      EXPECT_TRUE(refused(code));
      EXPECT_EQ(dst, untouched);
    } else {
      EXPECT_TRUE(accepted(code));
      EXPECT_NE(dst, untouched);
    }
  }
}

TEST(BadInput, PartialVariantsNeverWriteTheirSourceOrMask) {
  const Pixels img = pfx::test::random_image(kW, kH, 83);
  const Mask mask = pfx::test::random_mask(kW, kH, 84);
  for (const PartialRow& row : kPartial) {
    SCOPED_TRACE(row.name);
    for (Rect b : {kMasked, kWhole}) {
      Pixels src = img, dst(img.size(), kUntouched);
      Mask m = mask;
      EXPECT_TRUE(accepted(row.fn(src.data(), m.data(), dst.data(), kW, kH, b)));
      EXPECT_EQ(src, img);
      EXPECT_EQ(m, mask);
      EXPECT_NE(dst, Pixels(img.size(), kUntouched));
    }
  }
}

TEST(BadInput, FullVariantsRefuseMissingBuffersAndUnaddressableSizes) {
  const Pixels img = pfx::test::random_image(kW, kH, 85);
  const Pixels untouched(img.size(), kUntouched);
  for (const FullRow& row : kFull) {
    SCOPED_TRACE(row.name);
    Pixels dst = untouched;
    EXPECT_TRUE(refused(row.fn(nullptr, dst.data(), kW, kH)));
    EXPECT_TRUE(refused(row.fn(img.data(), nullptr, kW, kH)));
    for (const auto& s : kUnaddressable) {
      EXPECT_TRUE(refused(row.fn(img.data(), dst.data(), s[0], s[1])));
    }
    for (const auto& s : kEmpty) row.fn(img.data(), dst.data(), s[0], s[1]);
    EXPECT_EQ(dst, untouched);
  }
}

// One buffer as source and destination gives what two buffers give, and with two buffers the
// source is never written.
TEST(BadInput, FullVariantsInPlaceMatchTwoBuffers) {
  const Pixels img = pfx::test::random_image(kW, kH, 86);
  for (const FullRow& row : kFull) {
    SCOPED_TRACE(row.name);
    Pixels src = img, dst(img.size(), kUntouched);
    const int32_t code = row.fn(src.data(), dst.data(), kW, kH);
    EXPECT_TRUE(accepted(code));
    EXPECT_EQ(src, img);
    EXPECT_NE(dst, img);
    Pixels in_place = img;
    EXPECT_EQ(row.fn(in_place.data(), in_place.data(), kW, kH), code);
    EXPECT_EQ(in_place, dst);
  }
}

TEST(BadInput, TexturedLooksRefuseANullTexture) {
  const Pixels img = pfx::test::random_image(kW, kH, 88);
  const Mask mask = pfx::test::random_mask(kW, kH, 89);
  const Pixels untouched(img.size(), kUntouched);
  Pixels dst = untouched;
  fx_apply_oldphoto_texture(img.data(), dst.data(), nullptr, kW, kH);
  for (Rect b : {kMasked, kWhole}) {
    fx_apply_oldphoto_texture_partial(img.data(), dst.data(), nullptr, mask.data(), kW, kH, b.left,
                                      b.right, b.top, b.bottom);
  }
  EXPECT_EQ(dst, untouched);
}

// A centre at (0, 0) lies outside an image with no columns or rows, however negative the size.
TEST(BadInput, CircleWarpsRefuseImagesWithoutPixels) {
  const Pixels img = pfx::test::random_image(kW, kH, 87);
  const Pixels untouched(img.size(), kUntouched);
  Pixels dst = untouched;
  for (const auto& s : kEmpty) {
    EXPECT_EQ(fx_sphericity(img.data(), dst.data(), s[0], s[1], 0, 0, 5, 50, 1, 0, 0, 0, 0),
              PHOTOFX_INVALID_ARGUMENT);
    EXPECT_EQ(fx_twirl(img.data(), dst.data(), s[0], s[1], 0, 0, 5, 90, 0, 9, 0, 9, 1),
              PHOTOFX_INVALID_ARGUMENT);
  }
  EXPECT_EQ(dst, untouched);
}

}  // namespace
