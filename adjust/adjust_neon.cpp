// NEON kernels of the adjustments: the rules of adjust/rules_neon.h over a Run.
#if defined(__ARM_NEON)

#include <cstddef>

#include "adjust/kernels.h"
#include "adjust/rules_neon.h"
#include "frame/neon.h"

namespace pfx::neon {

size_t kernel(const Run& run, const Brightness& rule) {
  return run_blocks(run, BrightnessNeon(rule));
}

size_t kernel(const Run& run, const Contrast& rule) {
  if (ContrastNeon<true>::fits(rule)) return run_blocks(run, ContrastNeon<true>(rule));
  if (ContrastNeon<false>::fits(rule)) return run_blocks(run, ContrastNeon<false>(rule));
  return 0;
}

size_t kernel(const Run& run, const Saturation& rule) {
  return run_blocks(run, SaturationNeon(rule));
}

size_t kernel(const Run& run, const Temperature& rule) {
  return TemperatureNeon::fits(rule) ? run_blocks(run, TemperatureNeon(rule)) : 0;
}

size_t kernel(const Run& run, const Exposure& rule) { return run_blocks(run, ExposureNeon(rule)); }

size_t kernel(const Run& run, const Fade& rule) { return run_blocks(run, FadeNeon(rule)); }

size_t kernel(const Run& run, const Gains& rule) { return run_blocks(run, GainsNeon(rule)); }

}  // namespace pfx::neon

#endif
