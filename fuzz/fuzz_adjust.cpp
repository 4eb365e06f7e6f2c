// Fuzz target: the slider adjustments, full and partial.
#include "fuzz/harness.h"
#include "photofx.h"

namespace {

using namespace pfx::fuzz;
using pfx::Rect;

template <auto Fn>
void full_gains(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider& p) {
    Fn(s, d, z.width, z.height, pick_level(p), pick_level(p), pick_level(p));
  });
}

template <auto Fn>
void partial_gains(FuzzedDataProvider& in) {
  partial_variant(in, [](const uint32_t* s, const uint8_t* m, uint32_t* d, Size z, Rect b,
                         FuzzedDataProvider& p) {
    Fn(s, m, d, z.width, z.height, pick_level(p), pick_level(p), pick_level(p), b.left, b.right,
       b.top, b.bottom);
  });
}

void colour_tone(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider& p) {
    fx_change_colortone(s, d, z.width, z.height, pick_level(p, -5, 365));
  });
}

// A brush stroke edits the destination in place; the centre may lie anywhere and the disc may
// cover none, part or all of the image.
template <auto Fn>
void brush(FuzzedDataProvider& in) {
  Images im(in);
  const int32_t cx = pick_coord(in, im.size.width), cy = pick_coord(in, im.size.height);
  const int32_t strength = pick_level(in, -300, 300), radius = pick_level(in, -3, 40);
  Fn(im.d(), cx, cy, im.size.width, im.size.height, strength, radius);
  im.check();
}

const Op kOps[] = {
    {"brightness", full_level<fx_control_brightness_all>},
    {"brightness partial", partial_level<fx_control_brightness>},
    {"contrast", full_level<fx_control_contrast_all>},
    {"contrast partial", partial_level<fx_control_contrast>},
    {"controlBrightness", full_level<controlBrightness>},
    {"controlBrightnessPartial", partial_level<controlBrightnessPartial>},
    {"controlContrast", full_level<controlContrast>},
    {"controlContrastPartial", partial_level<controlContrastPartial>},
    {"saturation", full_level<fx_control_saturation_all>},
    {"saturation partial", partial_level<fx_control_saturation>},
    {"temperature", full_level<fx_control_temperature_all>},
    {"temperature partial", partial_level<fx_control_temperature>},
    {"exposure", full_level<fx_control_exposure_all>},
    {"exposure partial", partial_level<fx_control_exposure>},
    {"hue", full_level<fx_control_hue_all>},
    {"hue partial", partial_level<fx_control_hue>},
    {"faded colour", full_level<fx_control_fadedcolor_all>},
    {"faded colour partial", partial_level<fx_control_fadedcolor>},
    {"invert", full_plain<fx_apply_invert_all>},
    {"invert partial", partial_plain<fx_apply_invert>},
    {"channel gains", full_gains<fx_adjust_RGB_all>},
    {"channel gains partial", partial_gains<fx_adjust_RGB>},
    {"colour tone", colour_tone},
    {"lighten", brush<fx_apply_lighten>},
    {"darken", brush<fx_apply_darken>},
    {"controlSaturation", full_level<controlSaturation>},
    {"controlTemperaturePartial", partial_level<controlTemperaturePartial>},
    {"controlExposurePartial", partial_level<controlExposurePartial>},
    {"controlHue", full_level<controlHue>},
    {"controlFadedColourPartial", partial_level<controlFadedColourPartial>},
    {"applyInvertPartial", partial_plain<applyInvertPartial>},
    {"AdjustRGB", partial_gains<AdjustRGB>},
    {"rubLighten", brush<rubLighten>},
    {"rubDarken", brush<rubDarken>},
    {"controlSaturationPartial", partial_level<controlSaturationPartial>},
    {"controlTemperature", full_level<controlTemperature>},
    {"controlExposure", full_level<controlExposure>},
    {"controlHuePartial", partial_level<controlHuePartial>},
    {"controlFadedColour", full_level<controlFadedColour>},
    {"applyInvert", full_plain<applyInvert>},
    {"controlAdjustRGB", full_gains<controlAdjustRGB>},
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return run_one(kOps, data, size);
}
