// NEON kernel of the level curves within 0 <= low < high <= 255 (the looks' range): input levels
// (scale (c - low)) >> 10 and output levels ((scale c) >> 10) + low, held to 0..255. With x a
// byte and scale below 2^15, the doubling high multiply of x 2^5 and scale is (x scale) >> 10
// exactly and never saturates; c - low is taken with saturation at 0, where the curve is 0 anyway.
#if defined(__ARM_NEON)

#include <arm_neon.h>

#include <cstddef>
#include <cstdint>

#include "frame/neon.h"
#include "looks/kernels.h"

namespace pfx::neon {
namespace {

template <bool Input>
struct Levels {
  uint8x8_t low8;
  int16x8_t low16, scale;

  uint8x8_t operator()(uint8x8_t c) const {
    const uint8x8_t x = Input ? vqsub_u8(c, low8) : c;
    const int16x8_t t = vqdmulhq_s16(vreinterpretq_s16_u16(vshll_n_u8(x, 5)), scale);
    return vqmovun_s16(Input ? t : vaddq_s16(t, low16));
  }
};

template <bool Input, bool Red, bool Green, bool Blue>
size_t run_levels(const Run& run, const Levels<Input>& curve) {
  return run_blocks(run, [&](Rgb8& c) {
    if (Red) c.r = curve(c.r);
    if (Green) c.g = curve(c.g);
    if (Blue) c.b = curve(c.b);
  });
}

template <bool Input>
size_t by_channel(const Run& run, int32_t channel, const Levels<Input>& curve) {
  switch (channel) {
    case 0:
      return run_levels<Input, true, true, true>(run, curve);
    case 1:
      return run_levels<Input, true, false, false>(run, curve);
    case 2:
      return run_levels<Input, false, true, false>(run, curve);
    case 3:
      return run_levels<Input, false, false, true>(run, curve);
    default:
      return 0;
  }
}

}  // namespace

size_t levels(const Run& run, int32_t channel, bool input, int32_t low, int32_t scale) {
  if (low < 0 || low > 255 || scale < 0 || scale > 32767) return 0;
  const uint8x8_t low8 = vdup_n_u8(static_cast<uint8_t>(low));
  const int16x8_t low16 = vdupq_n_s16(static_cast<int16_t>(low));
  const int16x8_t s = vdupq_n_s16(static_cast<int16_t>(scale));
  return input ? by_channel(run, channel, Levels<true>{low8, low16, s})
               : by_channel(run, channel, Levels<false>{low8, low16, s});
}

}  // namespace pfx::neon

#endif
