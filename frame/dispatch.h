// Choice of instruction set for the hot pixel loops.
//
// The default x86-64 build targets the baseline instruction set (SSE2), which has no 32-bit
// vector multiply, no vector min/max on 32-bit lanes and no byte shuffle, so the compiler's
// vectorised loops crawl there. PFX_VECTOR_CLONES on a function (it must not be inline) makes
// GCC compile it twice, for AVX2 and for the baseline, and pick one when the library is loaded,
// by the CPU it runs on. Both clones come from the same source and do integer arithmetic only,
// so they give the same bits; the sanitizer build defines PHOTOFX_NO_CLONES and so tests the
// baseline code against the same goldens that the default build checks on the AVX2 clone.
//
// Elsewhere (ARM, clang) the macro is empty and the one portable version is built.
#pragma once

#if defined(__GNUC__) && !defined(__clang__) && defined(__x86_64__) && !defined(PHOTOFX_NO_CLONES)
#define PFX_VECTOR_CLONES __attribute__((target_clones("avx2", "default"), noinline))
#else
#define PFX_VECTOR_CLONES
#endif
