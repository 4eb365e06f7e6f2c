// NEON kernels of the weighted looks: the two vignettes, and the old photo with its curves
// worked out first.
#if defined(__ARM_NEON)

#include <cstddef>
#include <cstdint>

#include "frame/neon.h"
#include "looks/oldphoto.h"
#include "looks/vignette.h"
#include "looks/vignette_neon.h"

namespace pfx::neon {
namespace {

// The old photo's curves worked out on sixteen channel bytes (looks/oldphoto.h), cheaper than
// looking them up. The sepia offsets as in greyscale_sepia_neon.cpp; the flattening moves a value
// by twice its contrast step ceil(|v - 128| / 10) = ((|v - 128| + 9) * 205) >> 11 toward 128,
// which stays within 26..229, so the bytes neither wrap nor need holding.
inline uint8x16_t flattened(uint8x16_t v) {
  const uint8x16_t mid = vdupq_n_u8(128);
  const uint8x16_t below = vcltq_u8(v, mid);
  const uint8x16_t a9 = vabaq_u8(vdupq_n_u8(9), v, mid);
  const uint8x8_t k = vdup_n_u8(205);
  const uint8x16_t step = vshrq_n_u8(vcombine_u8(vshrn_n_u16(vmull_u8(vget_low_u8(a9), k), 8),
                                                 vshrn_n_u16(vmull_u8(vget_high_u8(a9), k), 8)),
                                     3);
  const uint8x16_t twice = vaddq_u8(step, step);
  return vbslq_u8(below, vaddq_u8(v, twice), vsubq_u8(v, twice));
}

inline uint8x16_t sepia_red(uint8x16_t v) {
  const uint8x16_t low = vcleq_u8(v, vdupq_n_u8(128));
  uint8x16_t up = vbslq_u8(low, vshrq_n_u8(vaddq_u8(v, vdupq_n_u8(1)), 2),
                           vshrq_n_u8(vsubq_u8(vdupq_n_u8(0), v), 2));
  up = vaddq_u8(up, vceqq_u8(v, vdupq_n_u8(43)));
  up = vsubq_u8(up, vceqq_u8(v, vdupq_n_u8(133)));
  up = vsubq_u8(up, vceqq_u8(v, vdupq_n_u8(137)));
  return vaddq_u8(v, up);
}

inline uint8x16_t sepia_blue(uint8x16_t v) {
  const uint8x16_t low = vcleq_u8(v, vdupq_n_u8(128));
  const uint8x16_t down = vbslq_u8(low, vshrq_n_u8(vqsubq_u8(v, vdupq_n_u8(1)), 2),
                                   vshrq_n_u8(vqsubq_u8(vdupq_n_u8(254), v), 2));
  return vsubq_u8(v, down);
}

// The pixels of a run of one row, in blocks of 16, each channel through curve(channel, value)
// first (the old photo's, or none).
// Shift: of the scaling (20 or 22); TermShift: of the fall-off's terms (4 or 1). Masked or not
// is a loop of its own, so that neither tests the mask in every block.
template <int Shift, int TermShift, bool Masked, class Curve>
size_t weighted(const Run& run, const FallOff& falloff, uint32_t k, int32_t x0, uint32_t base,
                const Curve& curve) {
  const size_t n = run.n & ~size_t{15};
  const uint32_t* const source = run.src;
  const uint8_t* const mask = run.mask;
  uint32_t* const target = run.dst;
  RowWeights<TermShift> weights(k, x0 - falloff.hw(), base);
  for (size_t i = 0; i < n; i += 16) {
    const uint8x16x4_t px = vld4q_u8(reinterpret_cast<const uint8_t*>(source + i));
    uint8x16_t c[3] = {curve(0, px.val[2]), curve(1, px.val[1]), curve(2, px.val[0])};
    weigh16<Shift>(px, Masked ? mask + i : nullptr, reinterpret_cast<uint8_t*>(target + i), c,
                   weights);
  }
  return n;
}

template <int Shift, int TermShift, class Curve>
size_t weighted(const Run& run, const FallOff& falloff, uint32_t k, int32_t x0, uint32_t base,
                const Curve& curve) {
  return run.mask != nullptr ? weighted<Shift, TermShift, true>(run, falloff, k, x0, base, curve)
                             : weighted<Shift, TermShift, false>(run, falloff, k, x0, base, curve);
}

constexpr auto kUnchanged = [](int32_t, uint8x16_t v) { return v; };

}  // namespace

size_t vignette(const Run& run, const DividedVignette& v, int32_t x0, uint32_t base) {
  return weighted<20, 4>(run, v, 7 * v.kx(), x0, base, kUnchanged);
}

size_t vignette_preview(const Run& run, const PreviewVignette& v, int32_t x0, uint32_t base) {
  return weighted<22, 1>(run, v, v.kx(), x0, base, kUnchanged);
}

size_t oldphoto(const Run& run, const PreviewVignette& v, int32_t x0, uint32_t base) {
  return weighted<22, 1>(run, v, v.kx(), x0, base, [](int32_t channel, uint8x16_t c) {
    if (channel == 0) return flattened(sepia_red(c));
    if (channel == 1) return flattened(c);
    return flattened(sepia_blue(c));
  });
}

}  // namespace pfx::neon

#endif
