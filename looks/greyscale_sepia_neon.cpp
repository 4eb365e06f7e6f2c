// NEON kernel of sepia: the two offset curves worked out on the channel bytes, as the portable
// rule does (greyscale_sepia.h).
#if defined(__ARM_NEON)

#include <arm_neon.h>

#include <cstddef>
#include <cstdint>

#include "frame/neon.h"
#include "looks/kernels.h"

namespace pfx::neon {

size_t sepia(const Run& run) {
  return run_blocks(run, [](Rgb8& c) {
    const uint8x8_t low = vcle_u8(c.r, vdup_n_u8(128));
    // Red: (v + 1) >> 2 up to 128 (no wrap there), (256 - v) >> 2 above, one step less at 43
    // and one more at 133 and 137 (a compare gives all ones, -1).
    uint8x8_t up = vbsl_u8(low, vshr_n_u8(vadd_u8(c.r, vdup_n_u8(1)), 2),
                           vshr_n_u8(vsub_u8(vdup_n_u8(0), c.r), 2));
    up = vadd_u8(up, vceq_u8(c.r, vdup_n_u8(43)));
    up = vsub_u8(up, vceq_u8(c.r, vdup_n_u8(133)));
    up = vsub_u8(up, vceq_u8(c.r, vdup_n_u8(137)));
    c.r = vadd_u8(c.r, up);
    // Blue: (v - 1) >> 2 up to 128, (254 - v) >> 2 above, neither below 0.
    const uint8x8_t low_b = vcle_u8(c.b, vdup_n_u8(128));
    const uint8x8_t down = vbsl_u8(low_b, vshr_n_u8(vqsub_u8(c.b, vdup_n_u8(1)), 2),
                                   vshr_n_u8(vqsub_u8(vdup_n_u8(254), c.b), 2));
    c.b = vsub_u8(c.b, down);
  });
}

}  // namespace pfx::neon

#endif
