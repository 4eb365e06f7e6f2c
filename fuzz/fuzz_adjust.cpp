// Fuzz target: the slider adjustments, full and partial.
#include "fuzz/harness.h"
#include "photofx.h"

namespace {

using namespace pfx::fuzz;
using pfx::Rect;

template <auto Fn>
void full_level(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider& p) {
    Fn(s, d, z.width, z.height, pick_level(p));
  });
}

template <auto Fn>
void partial_level(FuzzedDataProvider& in) {
  partial_variant(in, [](const uint32_t* s, const uint8_t* m, uint32_t* d, Size z, Rect b,
                         FuzzedDataProvider& p) {
    Fn(s, m, d, z.width, z.height, pick_level(p), b.left, b.right, b.top, b.bottom);
  });
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
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return run_one(kOps, data, size);
}
