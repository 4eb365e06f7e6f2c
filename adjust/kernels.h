// The NEON kernels of the adjustments (adjust/adjust_neon.cpp), one overload per rule; in other
// builds, stubs that leave every pixel to the portable rule (frame/kernel.h).
#pragma once

#include <cstddef>

#include "adjust/brightness_contrast.h"
#include "adjust/channel_map.h"
#include "adjust/exposure_hue.h"
#include "adjust/faded_invert.h"
#include "adjust/gains_colortone.h"
#include "adjust/saturation_temperature.h"
#include "frame/kernel.h"

namespace pfx::neon {

PFX_NEON_KERNEL(size_t kernel(const Run&, const Brightness&))
PFX_NEON_KERNEL(size_t kernel(const Run&, const Contrast&))
PFX_NEON_KERNEL(size_t kernel(const Run&, const Saturation&))
PFX_NEON_KERNEL(size_t kernel(const Run&, const Temperature&))
PFX_NEON_KERNEL(size_t kernel(const Run&, const Exposure&))
PFX_NEON_KERNEL(size_t kernel(const Run&, const Fade&))
PFX_NEON_KERNEL(size_t kernel(const Run&, const Gains&))
// Any per-channel rule as its channel map, by the table instructions (no mask).
PFX_NEON_KERNEL(size_t kernel(const Run&, const ChannelMap&))

}  // namespace pfx::neon

namespace pfx {

// The frames' kernel argument for a rule with a kernel above; the rule must outlive the call.
template <class Rule>
auto kernel_for(const Rule& rule) {
  return [&rule](const Run& run) { return neon::kernel(run, rule); };
}

}  // namespace pfx
