// The NEON kernels of the looks (looks/*_neon.cpp); in other builds, stubs that leave every
// pixel to the portable rule (frame/kernel.h).
#pragma once

#include <cstddef>

#include "frame/kernel.h"

namespace pfx::neon {

// The fused preset chains, all passes of retro, sunshine, bluewash, nostalgia and yellow glow and
// the passes after auto adjust of downlight.
PFX_NEON_KERNEL(size_t retro(const Run&))
PFX_NEON_KERNEL(size_t sunshine(const Run&))
PFX_NEON_KERNEL(size_t bluewash(const Run&))
PFX_NEON_KERNEL(size_t nostalgia(const Run&))
PFX_NEON_KERNEL(size_t yellowglow(const Run&))
PFX_NEON_KERNEL(size_t downlight_tail(const Run&))

PFX_NEON_KERNEL(size_t sepia(const Run&))

// Levels within 0 <= low < high <= 255 on the channels a selector picks: input levels
// (scale (c - low)) >> 10 or output levels ((scale c) >> 10) + low, for scales below 2^15.
PFX_NEON_KERNEL(size_t levels(const Run&, int32_t, bool, int32_t, int32_t))

}  // namespace pfx::neon
