// Allocation-failure seam. The wrappers ask allocation_allowed() before every allocation; tests
// arm a failure at the nth request to prove that every allocating path copes with a null block.
// The state is per thread and costs one counter per allocation, never per pixel.
#pragma once

#include <cstdint>

namespace pfx {

bool allocation_allowed();

// Makes the nth allocation request from now fail (1 = the next one); 0 disarms. Requests are
// counted from the call either way.
void arm_allocation_failure(int64_t nth);

// Allocation requests seen since the last arm_allocation_failure call.
int64_t allocation_requests();

}  // namespace pfx
