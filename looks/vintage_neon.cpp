// The NEON kernel of the vintage look: the folded curves by table instructions, brightness by its
// NEON rule, the divided vignette in 32-bit lanes.
#if defined(__ARM_NEON)

#include <cstddef>
#include <cstdint>

#include "adjust/rules_neon.h"
#include "frame/neon.h"
#include "looks/vignette_neon.h"
#include "looks/vintage.h"

namespace pfx::neon {
namespace {

struct Tables {
  LookupTable before[3], after[3];  // red, green, blue
};

constexpr Tables laid_out() {
  Tables t{};
  for (int32_t k = 0; k < 3; ++k) {
    t.before[k] = lookup_table(kVintageBefore.t[k]);
    t.after[k] = lookup_table(kVintageAfter.t[k]);
  }
  return t;
}

constexpr Tables kTables = laid_out();

}  // namespace

// The look is made in steps over chunks of up to 64 pixels held as channel planes on the stack:
// each step is a small loop whose values stay in registers, where one loop doing all of it for
// sixteen pixels spills half of them.
size_t vintage(const Run& run, const VintageLook& look, int32_t x0, uint32_t row_base) {
  constexpr size_t kChunk = 64;
  const size_t n = run.n & ~size_t{31};
  // Read through a pointer the compiler cannot see into: knowing the bytes, GCC copies the
  // tables onto the stack already rearranged by segment.
  const Tables* tables = &kTables;
  asm("" : "+r"(tables));
  const BrightnessNeon brightness(look.brightness());
  // Without a border to fall off toward every weight is full scale: 2^28 >> 8.
  const bool flat = look.flat();
  RowWeights<4> weights(flat ? 0 : 7 * look.vignette().kx(), x0 - look.vignette().hw(),
                        flat ? uint32_t{1} << 28 : row_base);
  alignas(16) uint8_t plane[3][kChunk];  // red, green, blue
  for (size_t i = 0; i < n;) {
    const size_t m = n - i < kChunk ? n - i : kChunk;
    const uint8_t* src = reinterpret_cast<const uint8_t*>(run.src + i);
    uint8_t* dst = reinterpret_cast<uint8_t*>(run.dst + i);
    for (size_t k = 0; k < m; k += 16) {
      const uint8x16x4_t px = vld4q_u8(src + 4 * k);  // [0] blue, [1] green, [2] red, [3] alpha
      for (int32_t c = 0; c < 3; ++c) vst1q_u8(plane[c] + k, px.val[2 - c]);
    }
    for (int32_t c = 0; c < 3; ++c) look_up(tables->before[c], plane[c], plane[c], m);
    for (size_t k = 0; k < m; k += 8) {
      Rgb8 c{vld1_u8(plane[0] + k), vld1_u8(plane[1] + k), vld1_u8(plane[2] + k)};
      brightness(c);
      vst1_u8(plane[0] + k, c.r);
      vst1_u8(plane[1] + k, c.g);
      vst1_u8(plane[2] + k, c.b);
    }
    for (int32_t c = 0; c < 3; ++c) look_up(tables->after[c], plane[c], plane[c], m);
    for (size_t k = 0; k < m; k += 16) {
      uint8x16_t out[3] = {vld1q_u8(plane[0] + k), vld1q_u8(plane[1] + k), vld1q_u8(plane[2] + k)};
      weigh16<20>(vld4q_u8(src + 4 * k), run.mask == nullptr ? nullptr : run.mask + i + k,
                  dst + 4 * k, out, weights);
    }
    i += m;
  }
  return n;
}

}  // namespace pfx::neon

#endif
