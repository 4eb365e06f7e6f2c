// The plain old-photo look's curves, for the look and its NEON kernel.
#pragma once

#include <cstdint>

#include "frame/pixel.h"
#include "looks/greyscale_sepia.h"

namespace pfx {

// (v - 128) / 10 rounded away from zero: -13 at 0, 0 at 128 alone, 13 at 255 (LUT_OLDPHOTO).
constexpr int32_t oldphoto_entry(int32_t v) {
  return v < 128 ? -((128 - v + 9) / 10) : (v - 128 + 9) / 10;
}

// Twice the step toward 128 never overshoots it: 0 becomes 26 and 255 becomes 229.
constexpr int32_t flatten(int32_t c) { return clamp_byte(c - 2 * oldphoto_entry(c)); }

// Per channel, the tint and the flattening as one table: sepia red then flattened, green
// flattened, sepia blue then flattened.
struct OldPhotoCurves {
  uint8_t t[3][256];
  constexpr OldPhotoCurves() : t{} {
    for (int32_t c = 0; c < 256; ++c) {
      t[0][c] = static_cast<uint8_t>(flatten(sepia_red(c)));
      t[1][c] = static_cast<uint8_t>(flatten(c));
      t[2][c] = static_cast<uint8_t>(flatten(sepia_blue(c)));
    }
  }
};

inline constexpr OldPhotoCurves kOldPhotoCurves{};

}  // namespace pfx
