// The NEON kernel of the vintage look: the folded curves by table instructions, brightness by its
// NEON rule, the divided vignette in 32-bit lanes.
#if defined(__ARM_NEON)

#include <cstddef>
#include <cstdint>

#include "adjust/rules_neon.h"
#include "frame/neon.h"
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

// The column terms (7 kx d^2) >> 4 of the divided vignette for the pixels of a row, four at a
// time from the row's first column: 7 kx d^2 is kept by its differences, which grow by
// 7 kx (8d + 16) and then by 32 * 7 kx from one step of four columns to the next. The
// unsigned words wrap, but 7 kx d^2 itself fits them (FallOff), so it comes out exact.
class ColumnTerms {
 public:
  ColumnTerms(uint32_t k7, int32_t d0) {
    uint32_t t[4], step[4];
    for (uint32_t j = 0; j < 4; ++j) {
      const uint32_t d = static_cast<uint32_t>(d0) + j;
      t[j] = k7 * (d * d);
      step[j] = k7 * (8 * d + 16);
    }
    product_ = vld1q_u32(t);
    step_ = vld1q_u32(step);
    growth_ = vdupq_n_u32(32 * k7);
  }

  // The next four terms.
  uint32x4_t next() {
    const uint32x4_t term = vshrq_n_u32(product_, 4);
    product_ = vaddq_u32(product_, step_);
    step_ = vaddq_u32(step_, growth_);
    return term;
  }

 private:
  uint32x4_t product_, step_, growth_;
};

// (c w) >> 20 for sixteen channel values and their weights (w <= 2^20, so c w < 2^28): the
// products' top halves gathered by unzipping, shifted by the remaining 4, and their low bytes
// gathered the same way, which keeps every value in place in its register.
inline uint8x16_t scaled(uint8x16_t c8, const uint32x4_t (&w)[4]) {
  const uint16x8_t lo = vmovl_u8(vget_low_u8(c8)), hi = vmovl_u8(vget_high_u8(c8));
  const uint32x4_t p0 = vmulq_u32(vmovl_u16(vget_low_u16(lo)), w[0]);
  const uint32x4_t p1 = vmulq_u32(vmovl_u16(vget_high_u16(lo)), w[1]);
  const uint32x4_t p2 = vmulq_u32(vmovl_u16(vget_low_u16(hi)), w[2]);
  const uint32x4_t p3 = vmulq_u32(vmovl_u16(vget_high_u16(hi)), w[3]);
  const uint16x8_t top_lo =
      vshrq_n_u16(vuzpq_u16(vreinterpretq_u16_u32(p0), vreinterpretq_u16_u32(p1)).val[1], 4);
  const uint16x8_t top_hi =
      vshrq_n_u16(vuzpq_u16(vreinterpretq_u16_u32(p2), vreinterpretq_u16_u32(p3)).val[1], 4);
  return vuzpq_u8(vreinterpretq_u8_u16(top_lo), vreinterpretq_u8_u16(top_hi)).val[0];
}

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
  ColumnTerms terms(7 * look.vignette().kx(), x0 - look.vignette().hw());
  const uint32x4_t base = vdupq_n_u32(row_base);
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
      if (!look.flat()) {
        // max(0, base - term) >> 8.
        uint32x4_t w[4];
        for (uint32x4_t& quarter : w) quarter = vshrq_n_u32(vqsubq_u32(base, terms.next()), 8);
        for (uint8x16_t& c : out) c = scaled(c, w);
      }
      uint8x16x4_t px = vld4q_u8(src + 4 * k);
      if (run.mask != nullptr) {
        const uint8x16_t selected = vceqq_u8(vld1q_u8(run.mask + i + k), vdupq_n_u8(1));
        for (int32_t c = 0; c < 3; ++c) out[c] = vbslq_u8(selected, out[c], px.val[2 - c]);
      }
      px.val[2] = out[0];
      px.val[1] = out[1];
      px.val[0] = out[2];
      vst4q_u8(dst + 4 * k, px);
    }
    i += m;
  }
  return n;
}

}  // namespace pfx::neon

#endif
