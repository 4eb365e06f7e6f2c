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

}  // namespace pfx::neon
