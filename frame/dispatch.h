// Choice of instruction set for the hot pixel loops.
//
// The default x86-64 build targets the baseline instruction set (SSE2), which has no 32-bit
// vector multiply, no vector min/max on 32-bit lanes and no byte shuffle, so the compiler's
// vectorised loops crawl there. A hot loop is therefore compiled more than once, for AVX2 and for
// the baseline (vector_paths) or also for AVX-512, the x86-64-v4 level (wide_vector_paths, for
// loops whose pace is set by their integer arithmetic rather than by memory: 16 lanes to a vector
// where AVX2 has 8, and 32 registers), and each call takes the copy of the path in force
// (frame/simd_path.h). That path is the widest the CPU has unless PHOTOFX_SIMD or a test asks for
// a narrower one, so every copy runs on any machine that has its instructions, and the tests hold
// each one to the same bits as the portable copy. All copies come from the same source and do
// integer arithmetic only.
//
// The loop is written as a function with its own arguments (restrict-qualified where they
// cannot alias) and called from a lambda: the copies are flattened, so everything the lambda
// calls is compiled into each copy with that copy's instructions. Elsewhere (ARM, clang, the
// PHOTOFX_NO_CLONES build) the lambda is simply called and the one portable loop is built.
#pragma once

#include "frame/simd_path.h"

#if defined(__GNUC__) && !defined(__clang__) && defined(__x86_64__) && !defined(PHOTOFX_NO_CLONES)
#define PFX_X86_COPIES 1
#endif

// Tells GCC that a loop carries no dependence between iterations, so that it vectorises it
// without a runtime overlap check: one that would send in-place calls down the scalar path, or
// one it cannot make at all where the loop reads scattered pixels. A loop compiled into the
// copies above needs it even where its pointers are restrict-qualified, since inlining loses the
// qualifier.
#if defined(__GNUC__) && !defined(__clang__)
#define PFX_NO_ALIAS_LOOP _Pragma("GCC ivdep")
#else
#define PFX_NO_ALIAS_LOOP
#endif

namespace pfx {

#ifdef PFX_X86_COPIES

template <class F>
__attribute__((target("arch=x86-64-v4"), flatten, noinline)) void run_avx512(const F& f) {
  f();
}
template <class F>
__attribute__((target("avx2"), flatten, noinline)) void run_avx2(const F& f) {
  f();
}
template <class F>
__attribute__((flatten, noinline)) void run_baseline(const F& f) {
  f();
}

// f() compiled for AVX2 or for the baseline.
template <class F>
inline void vector_paths(const F& f) {
  if (simd_path() >= SimdPath::kAvx2) {
    run_avx2(f);
  } else {
    run_baseline(f);
  }
}

// f() compiled for AVX-512, AVX2 or the baseline.
template <class F>
inline void wide_vector_paths(const F& f) {
  const SimdPath path = simd_path();
  if (path == SimdPath::kAvx512) {
    run_avx512(f);
  } else if (path == SimdPath::kAvx2) {
    run_avx2(f);
  } else {
    run_baseline(f);
  }
}

#else

template <class F>
inline void vector_paths(const F& f) {
  f();
}
template <class F>
inline void wide_vector_paths(const F& f) {
  f();
}

#endif

}  // namespace pfx
