// Scratch memory of a call, counted without touching the library: the benchmark program
// replaces the C allocator's entry points (alloc_count.cpp) with thin wrappers around the C
// library's own, and the library's fx_ wrappers reach them like any other caller. Counting is off
// except between start_counting and stop_counting; off, a wrapper costs one load and a branch.
// Bytes are those requested, not the allocator's rounded block sizes.
#pragma once

#include <cstdint>

namespace fxbench {

struct Usage {
  int64_t peak = 0;       // most bytes held at once in blocks allocated while counting
  int64_t kept = 0;       // bytes of those blocks still held at the end (a workspace)
  bool overflow = false;  // more blocks than the counter can follow: the figures are short
};

void start_counting();
Usage stop_counting();

}  // namespace fxbench
