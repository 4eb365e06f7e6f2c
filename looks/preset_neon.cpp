// NEON kernels of the preset chains: the adjustments' NEON rules (adjust/rules_neon.h) in the
// order and with the levels of looks/preset_chains.cpp, fused into one pass.
#if defined(__ARM_NEON)

#include <cstddef>

#include "adjust/rules_neon.h"
#include "frame/neon.h"
#include "looks/kernels.h"

namespace pfx::neon {

size_t retro(const Run& run) {
  return run_blocks(
      run, Chain(SaturationNeon(Saturation(5)), BrightnessNeon(Brightness(12)), FadeNeon(Fade(50)),
                 SaturationNeon(Saturation(7)), ContrastNeon<false>(Contrast(9)),
                 BrightnessNeon(Brightness(11)), ContrastNeon<true>(Contrast(12))));
}

size_t sunshine(const Run& run) {
  return run_blocks(run, Chain(ContrastNeon<true>(Contrast(11)), TemperatureNeon(Temperature(14)),
                               GainsNeon(Gains(11, 12, 8)), ContrastNeon<true>(Contrast(11))));
}

size_t bluewash(const Run& run) {
  return run_blocks(run, Chain(ContrastNeon<true>(Contrast(12)), SaturationNeon(Saturation(7)),
                               TemperatureNeon(Temperature(6)), ExposureNeon(Exposure(11)),
                               GainsNeon(Gains(10, 9, 11))));
}

size_t nostalgia(const Run& run) {
  return run_blocks(
      run, Chain(BrightnessNeon(Brightness(12)), FadeNeon(Fade(50)), ExposureNeon(Exposure(11)),
                 SaturationNeon(Saturation(7)), TemperatureNeon(Temperature(13))));
}

size_t yellowglow(const Run& run) {
  return run_blocks(run, Chain(FadeNeon(Fade(50)), TemperatureNeon(Temperature(12)),
                               ExposureNeon(Exposure(13)), SaturationNeon(Saturation(8)),
                               GainsNeon(Gains(13, 14, 9)), ContrastNeon<true>(Contrast(13))));
}

size_t downlight_tail(const Run& run) {
  return run_blocks(run, Chain(ContrastNeon<false>(Contrast(9)), SaturationNeon(Saturation(7)),
                               GainsNeon(Gains(9, 9, 9)), ExposureNeon(Exposure(13))));
}

}  // namespace pfx::neon

#endif
