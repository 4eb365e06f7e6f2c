// The sepia curves as tables, for the looks that tint with them and for the tests that recompute
// them.
#pragma once

#include <cstdint>

namespace pfx {

// Sepia red and blue curves over channel values 0..255.
extern const uint8_t kSepiaRed[256];
extern const uint8_t kSepiaBlue[256];

}  // namespace pfx
