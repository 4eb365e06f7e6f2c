// NEON pieces of the vignette weights, for the weighted looks' kernels (vignette, vintage, old
// photo). NEON builds only.
#pragma once

#include <arm_neon.h>

#include <cstdint>

#include "frame/neon.h"
#include "looks/vignette.h"

namespace pfx::neon {

// The fall-off weights of a row, four columns at a time from its first column:
// max(0, base - term) >> 8 with term = (k d^2) >> Shift, k the factor times its multiplier
// (FallOff). k d^2 is kept by its differences, which grow by k (8d + 16) and then by 32k from one
// step of four columns to the next. The unsigned words wrap, but k d^2 itself fits them wherever
// k is non-zero (FallOff), so it comes out exact.
template <int Shift>
class RowWeights {
 public:
  RowWeights(uint32_t k, int32_t d0, uint32_t base) : base_(vdupq_n_u32(base)) {
    uint32_t t[4], step[4];
    for (uint32_t j = 0; j < 4; ++j) {
      const uint32_t d = static_cast<uint32_t>(d0) + j;
      t[j] = k * (d * d);
      step[j] = k * (8 * d + 16);
    }
    product_ = vld1q_u32(t);
    step_ = vld1q_u32(step);
    growth_ = vdupq_n_u32(32 * k);
  }

  // The weights of the next four columns.
  uint32x4_t next() {
    const uint32x4_t term = vshrq_n_u32(product_, Shift);
    product_ = vaddq_u32(product_, step_);
    step_ = vaddq_u32(step_, growth_);
    return vshrq_n_u32(vqsubq_u32(base_, term), 8);
  }

 private:
  uint32x4_t base_, product_, step_, growth_;
};

// (c w) >> Shift for sixteen channel values and their weights (w at most 2^Shift, Shift 20 or
// 22, so c w < 2^30): the products' top halves gathered by unzipping, shifted by the rest, and
// their low bytes gathered the same way, which keeps every value in place in its register.
template <int Shift>
inline uint8x16_t scaled(uint8x16_t c8, const uint32x4_t (&w)[4]) {
  const uint16x8_t lo = vmovl_u8(vget_low_u8(c8)), hi = vmovl_u8(vget_high_u8(c8));
  const uint32x4_t p0 = vmulq_u32(vmovl_u16(vget_low_u16(lo)), w[0]);
  const uint32x4_t p1 = vmulq_u32(vmovl_u16(vget_high_u16(lo)), w[1]);
  const uint32x4_t p2 = vmulq_u32(vmovl_u16(vget_low_u16(hi)), w[2]);
  const uint32x4_t p3 = vmulq_u32(vmovl_u16(vget_high_u16(hi)), w[3]);
  const uint16x8_t top_lo = vshrq_n_u16(
      vuzpq_u16(vreinterpretq_u16_u32(p0), vreinterpretq_u16_u32(p1)).val[1], Shift - 16);
  const uint16x8_t top_hi = vshrq_n_u16(
      vuzpq_u16(vreinterpretq_u16_u32(p2), vreinterpretq_u16_u32(p3)).val[1], Shift - 16);
  return vuzpq_u8(vreinterpretq_u8_u16(top_lo), vreinterpretq_u8_u16(top_hi)).val[0];
}

// Sixteen source pixels px (vld4: [0] blue, [1] green, [2] red, [3] alpha) to dst: the channels
// in c (red, green, blue; the pixels' own, or what a look made of them) scaled by the next
// weights; with a mask, only the pixels whose byte is 1, the others keeping their source value.
template <int Shift, class Weights>
inline void weigh16(uint8x16x4_t px, const uint8_t* mask, uint8_t* dst, uint8x16_t (&c)[3],
                    Weights& weights) {
  uint32x4_t w[4];
  for (uint32x4_t& quarter : w) quarter = weights.next();
  for (uint8x16_t& v : c) v = scaled<Shift>(v, w);
  if (mask != nullptr) {
    const uint8x16_t selected = vceqq_u8(vld1q_u8(mask), vdupq_n_u8(1));
    for (int32_t k = 0; k < 3; ++k) c[k] = vbslq_u8(selected, c[k], px.val[2 - k]);
  }
  px.val[2] = c[0];
  px.val[1] = c[1];
  px.val[0] = c[2];
  vst4q_u8(dst, px);
}

}  // namespace pfx::neon
