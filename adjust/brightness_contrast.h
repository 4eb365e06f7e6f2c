// Tables of the brightness and contrast family, visible to the tests that recompute them.
#pragma once

#include <cstdint>

namespace pfx {

// Contrast step per channel value: (c - 128) / 10 rounded away from zero.
extern const int32_t kContrastStep[256];

}  // namespace pfx
