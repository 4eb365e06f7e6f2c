// Scratch memory of a call, counted without touching the library: the benchmark program
// replaces the C allocator's entry points (alloc_count.cpp) with thin wrappers around the C
// library's own, and the library's fx_ wrappers reach them like any other caller. Counting is off
// except between start_counting and stop_counting; off, a wrapper costs one load and a branch.
#pragma once

#include <cstdint>

namespace fxbench {

struct Usage {
  int64_t peak = 0;  // most bytes held at once above what was held at the start
  int64_t kept = 0;  // bytes still held at the end (a workspace), less any released
};

void start_counting();
Usage stop_counting();

}  // namespace fxbench
