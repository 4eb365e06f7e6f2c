// Hand-written vector kernels beside the portable rules.
//
// A kernel does an effect's work on a run of pixels with the instructions of one CPU family and
// must give exactly the pixels its portable rule gives; the frames (frame/frame.h) call it first
// and let the rule finish what it left, so a kernel may stop short (it works in blocks, or the
// arguments fall outside the ranges it is written for). Kernels live in their family's *_neon.cpp
// file and run only on the NEON path (simd_path(), PHOTOFX_SIMD=portable turns them off). In a
// build without NEON, PFX_NEON_KERNEL declares a stub that does nothing, so the entry points name
// their kernels without conditionals and the compiler drops the call.
#pragma once

#include <cstddef>
#include <cstdint>

#include "frame/simd_path.h"

namespace pfx {

// The pixels a kernel works on. With a mask, a pixel whose mask byte is exactly 1 is edited and
// every other pixel gets its source value; without one (mask null) every pixel is edited.
struct Run {
  const uint32_t* src;
  const uint8_t* mask;
  uint32_t* dst;
  size_t n;
};

// A kernel: edits a prefix of the run and returns its length (0: leaves it all to the rule).
struct NoKernel {
  size_t operator()(const Run&) const { return 0; }
};

// True when the NEON kernels run: a build for NEON, on the NEON path.
inline bool neon_kernels() {
#if defined(__ARM_NEON)
  return simd_path() == SimdPath::kNeon;
#else
  return false;
#endif
}

}  // namespace pfx

#if defined(__ARM_NEON)
#define PFX_NEON_KERNEL(...) __VA_ARGS__;
#else
#define PFX_NEON_KERNEL(...) \
  inline __VA_ARGS__ { return 0; }
#endif
