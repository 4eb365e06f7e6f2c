// The NEON sampler of the warps: source points in chunks, four at a time, blended as
// sample_pairs does (warp.h). The edge clamp of read_pair is folded into the weights: a point
// left of the image reads the pair at column 0 with a weight of 0 toward the right neighbour, one
// right of it the last pair with a whole weight toward the last column, which gives the same
// sums as reading one pixel twice.
#if defined(__ARM_NEON)

#include <arm_neon.h>

#include <cstddef>
#include <cstdint>

#include "photofx.h"
#include "warp/warp.h"

namespace pfx::neon {
namespace {

// The blend of one point from its top and bottom pairs and its weights (lane k of the weight
// vectors): per channel ((2048 - fx) c00 + fx c10) (2048 - fy) + (...) fy, at most 2^30, with
// the four channels of the pixel in the four 32-bit lanes; >> 22 as >> 16 here, >> 6 later.
template <int K>
inline uint16x4_t blend(uint32x2_t top, uint32x2_t bottom, uint16x4_t gx, uint16x4_t fx,
                        uint32x4_t gy, uint32x4_t fy) {
  const uint16x8_t t = vmovl_u8(vreinterpret_u8_u32(top));
  const uint16x8_t b = vmovl_u8(vreinterpret_u8_u32(bottom));
  const uint32x4_t ts =
      vmlal_lane_u16(vmull_lane_u16(vget_low_u16(t), gx, K), vget_high_u16(t), fx, K);
  const uint32x4_t bs =
      vmlal_lane_u16(vmull_lane_u16(vget_low_u16(b), gx, K), vget_high_u16(b), fx, K);
  const uint32x2_t gy_k = K < 2 ? vget_low_u32(gy) : vget_high_u32(gy);
  const uint32x2_t fy_k = K < 2 ? vget_low_u32(fy) : vget_high_u32(fy);
  return vshrn_n_u32(vmlaq_lane_u32(vmulq_lane_u32(ts, gy_k, K & 1), bs, fy_k, K & 1), 16);
}

}  // namespace

size_t bilinear(const uint32_t* src, int32_t width, int32_t height, const PointChunk& points,
                size_t n, uint32_t* out) {
  const size_t m = n & ~size_t{3};
  const int32x4_t zero = vdupq_n_s32(0), last_row = vdupq_n_s32(height - 1);
  const int32x4_t last_pair = vdupq_n_s32(width - 2);
  const uint32x4_t whole = vdupq_n_u32(kBilinearOne);
  const uint32x4_t opaque = vdupq_n_u32(0xFF000000u);
  for (size_t i = 0; i < m; i += 4) {
    const int32x4_t sx = vld1q_s32(points.sx + i), sy = vld1q_s32(points.sy + i);
    const int32x4_t ya = vmaxq_s32(vminq_s32(sy, last_row), zero);
    const int32x4_t yb = vmaxq_s32(vminq_s32(vaddq_s32(sy, vdupq_n_s32(1)), last_row), zero);
    const int32x4_t j = vmaxq_s32(vminq_s32(sx, last_pair), zero);
    uint32x4_t fx = vmovl_u16(vld1_u16(points.fx + i));
    fx = vbslq_u32(vcltq_s32(sx, zero), vdupq_n_u32(0), fx);
    fx = vbslq_u32(vcgtq_s32(sx, last_pair), whole, fx);
    const uint32x4_t fy = vmovl_u16(vld1_u16(points.fy + i));
    const uint16x4_t fx16 = vmovn_u32(fx), gx16 = vmovn_u32(vsubq_u32(whole, fx));
    const uint32x4_t gy = vsubq_u32(whole, fy);
    // Offsets within the image fit 32 bits (it has at most kMaxPixels pixels).
    const int32x4_t top = vmlaq_n_s32(j, ya, width), bottom = vmlaq_n_s32(j, yb, width);
    const auto pair = [&](int32_t offset) { return vld1_u32(src + offset); };
    const uint16x4_t p0 =
        blend<0>(pair(vgetq_lane_s32(top, 0)), pair(vgetq_lane_s32(bottom, 0)), gx16, fx16, gy, fy);
    const uint16x4_t p1 =
        blend<1>(pair(vgetq_lane_s32(top, 1)), pair(vgetq_lane_s32(bottom, 1)), gx16, fx16, gy, fy);
    const uint16x4_t p2 =
        blend<2>(pair(vgetq_lane_s32(top, 2)), pair(vgetq_lane_s32(bottom, 2)), gx16, fx16, gy, fy);
    const uint16x4_t p3 =
        blend<3>(pair(vgetq_lane_s32(top, 3)), pair(vgetq_lane_s32(bottom, 3)), gx16, fx16, gy, fy);
    const uint8x8_t lo = vshrn_n_u16(vcombine_u16(p0, p1), 6);
    const uint8x8_t hi = vshrn_n_u16(vcombine_u16(p2, p3), 6);
    const uint32x4_t words = vreinterpretq_u32_u8(vcombine_u8(lo, hi));
    vst1q_u32(out + i, vorrq_u32(words, opaque));
  }
  return m;
}

namespace {

// Four lanes of table[t] for the four t, one scalar read each: the tables have 257 entries.
inline uint32x4_t look_up4(const uint32_t* table, uint32x4_t t) {
  uint32x4_t v = vdupq_n_u32(table[vgetq_lane_u32(t, 0)]);
  v = vsetq_lane_u32(table[vgetq_lane_u32(t, 1)], v, 1);
  v = vsetq_lane_u32(table[vgetq_lane_u32(t, 2)], v, 2);
  return vsetq_lane_u32(table[vgetq_lane_u32(t, 3)], v, 3);
}

// The bulge along one axis, as sphericity_points has it: centre + floor(d 2^18 / den) from the
// reciprocal and one correction, the remainder giving the weight. Offsets below 2^13 and
// reciprocals below 2^19 keep every product within 32 bits (the fast path's rim < 2^26).
inline void bulge_axis(int32x4_t centre, int32x4_t d, uint32x4_t den, uint32x4_t recip,
                       int32_t* coord, uint16_t* weight) {
  const uint32x4_t m = vreinterpretq_u32_s32(vabsq_s32(d));
  uint32x4_t q = vshrq_n_u32(vmulq_u32(m, recip), 19);
  uint32x4_t r = vmlsq_u32(vshlq_n_u32(m, 18), q, den);
  const uint32x4_t over = vcgeq_u32(r, den);  // all ones: one more
  q = vsubq_u32(q, over);
  r = vsubq_u32(r, vandq_u32(den, over));
  const int32x4_t neg = vreinterpretq_s32_u32(vcltq_s32(d, vdupq_n_s32(0)));  // 0 or -1
  const uint32x4_t back = vandq_u32(vtstq_u32(r, r), vreinterpretq_u32_s32(neg));
  // q negated where d < 0 ((q ^ -1) + 1), then one further down where inexact.
  const int32x4_t signed_q = vsubq_s32(veorq_s32(vreinterpretq_s32_u32(q), neg), neg);
  vst1q_s32(coord, vaddq_s32(vaddq_s32(centre, signed_q), vreinterpretq_s32_u32(back)));
  const uint32x4_t part = vbslq_u32(back, vsubq_u32(den, r), r);
  vst1_u16(weight, vmovn_u32(vshrq_n_u32(vmulq_u32(vshrq_n_u32(recip, 7), part), 19)));
}

// The pinch along one axis: pos + k d / 2^18 with k in two parts, p7 = kh d + ((kl d) >> 7).
inline void pinch_axis(int32x4_t pos, int32x4_t d, int32x4_t kh, int32x4_t kl, int32_t* coord,
                       uint16_t* weight) {
  const int32x4_t p7 = vaddq_s32(vmulq_s32(kh, d), vshrq_n_s32(vmulq_s32(kl, d), 7));
  vst1q_s32(coord, vaddq_s32(pos, vshrq_n_s32(p7, 11)));
  vst1_u16(weight, vmovn_u32(vandq_u32(vreinterpretq_u32_s32(p7), vdupq_n_u32(2047))));
}

}  // namespace

size_t sphericity_points(const SphereRun& run, int32_t dy, int32_t dx0, int32_t step, int32_t n,
                         PointChunk& out) {
  const size_t m = n > 0 ? static_cast<size_t>(n) & ~size_t{3} : 0;
  const int32_t lanes[4] = {0, 1, 2, 3};
  int32x4_t dx = vmlaq_n_s32(vdupq_n_s32(dx0), vld1q_s32(lanes), step);
  const int32x4_t advance = vdupq_n_s32(4 * step);
  const uint32x4_t dy2 = vdupq_n_u32(static_cast<uint32_t>(dy * dy));
  const int32x4_t vdy = vdupq_n_s32(dy);
  const int32x4_t cx = vdupq_n_s32(run.cx), cy = vdupq_n_s32(run.cy);
  for (size_t i = 0; i < m; i += 4, dx = vaddq_s32(dx, advance)) {
    const uint32x4_t udx = vreinterpretq_u32_s32(dx);
    const uint32x4_t d2 = vmlaq_u32(dy2, udx, udx);
    const uint32x4_t t = vshrq_n_u32(vmulq_n_u32(d2, run.inv_rim), 22);
    if (run.pinch) {
      const int32x4_t kh =
          vreinterpretq_s32_u32(look_up4(reinterpret_cast<const uint32_t*>(run.k_hi), t));
      const int32x4_t kl =
          vreinterpretq_s32_u32(look_up4(reinterpret_cast<const uint32_t*>(run.k_lo), t));
      pinch_axis(vaddq_s32(cx, dx), dx, kh, kl, out.sx + i, out.fx + i);
      pinch_axis(vaddq_s32(cy, vdy), vdy, kh, kl, out.sy + i, out.fy + i);
    } else {
      const uint32x4_t den = look_up4(run.den, t), recip = look_up4(run.recip, t);
      bulge_axis(cx, dx, den, recip, out.sx + i, out.fx + i);
      bulge_axis(cy, vdy, den, recip, out.sy + i, out.fy + i);
    }
  }
  return m;
}

namespace {

// Four lanes of a table of signed or unsigned 32-bit entries, one scalar read each.
template <class T>
inline uint32x4_t look_up_any(const T* table, uint32x4_t index) {
  uint32x4_t v = vdupq_n_u32(static_cast<uint32_t>(table[vgetq_lane_u32(index, 0)]));
  v = vsetq_lane_u32(static_cast<uint32_t>(table[vgetq_lane_u32(index, 1)]), v, 1);
  v = vsetq_lane_u32(static_cast<uint32_t>(table[vgetq_lane_u32(index, 2)]), v, 2);
  return vsetq_lane_u32(static_cast<uint32_t>(table[vgetq_lane_u32(index, 3)]), v, 3);
}

// One axis of the twirl's offset, as twirl_points has it: T >> 14 = (a + (b >> 7)) >> 7 from
// a = mag h and b = mag ml, exact when T's low 14 bits, those of (a << 7) + b, are zero.
inline void twirl_axis(int32x4_t centre, uint32x4_t h, uint32x4_t ml, uint32x4_t mag,
                       uint32x4_t neg, int32_t* coord, uint16_t* weight) {
  const uint32x4_t a = vmulq_u32(mag, h), b = vmulq_u32(mag, ml);
  const uint32x4_t t14 = vshrq_n_u32(vsraq_n_u32(a, b, 7), 7);
  const int32x4_t whole = vreinterpretq_s32_u32(vshrq_n_u32(t14, 11));
  const uint32x4_t part = vandq_u32(t14, vdupq_n_u32(2047));
  const uint32x4_t inexact =
      vtstq_u32(vaddq_u32(vshlq_n_u32(a, 7), b), vdupq_n_u32(16383));  // all ones: inexact
  // neg: centre - whole - 1 and 2048 - part - (inexact ? 1 : 0); else centre + whole and part.
  const int32x4_t down = vsubq_s32(vsubq_s32(centre, whole), vdupq_n_s32(1));
  vst1q_s32(coord, vbslq_s32(neg, down, vaddq_s32(centre, whole)));
  const uint32x4_t flipped = vaddq_u32(vsubq_u32(vdupq_n_u32(2048), part), inexact);
  vst1_u16(weight, vmovn_u32(vbslq_u32(neg, flipped, part)));
}

}  // namespace

size_t twirl_points(const TwirlRun& run, int32_t dy, int32_t dx0, int32_t step, int32_t n,
                    PointChunk& out) {
  const size_t m = n > 0 ? static_cast<size_t>(n) & ~size_t{3} : 0;
  const int32_t lanes[4] = {0, 1, 2, 3};
  int32x4_t dx = vmlaq_n_s32(vdupq_n_s32(dx0), vld1q_s32(lanes), step);
  const int32x4_t advance = vdupq_n_s32(4 * step);
  const uint32_t ax = static_cast<uint32_t>(dy < 0 ? -dy : dy);  // |b| of FATAN2(dx, dy)
  const uint32x4_t vax = vdupq_n_u32(ax), dy2 = vdupq_n_u32(ax * ax);
  const bool below = dy > 0;
  const uint32_t start = run.clockwise ? kAngle360 : 0;
  const uint32_t signed_turn = run.clockwise ? 0u - run.turn : run.turn;
  const int32x4_t cx = vdupq_n_s32(run.cx), cy = vdupq_n_s32(run.cy);
  for (size_t i = 0; i < m; i += 4, dx = vaddq_s32(dx, advance)) {
    const uint32x4_t ay = vreinterpretq_u32_s32(vabsq_s32(dx));
    const uint32x4_t d2 = vmlaq_u32(dy2, ay, ay);
    const uint32x4_t rho = look_up_any(SQRT_STEP_4, vshrq_n_u32(vmulq_n_u32(d2, run.inv_rr), 14));
    const uint32x4_t D = vmulq_n_u32(rho, run.radius);
    // FATAN2(dx, dy); the centre is never here.
    const uint32x4_t steep = vcgtq_u32(ay, vax);
    const uint32x4_t lo = vbslq_u32(steep, vax, ay), hi = vbslq_u32(steep, ay, vax);
    const uint32x4_t index = vshrq_n_u32(vmulq_u32(lo, look_up_any(kInverse29, hi)), 18);
    const uint32x4_t tab = look_up_any(ATAN, vandq_u32(index, vdupq_n_u32(2047)));
    const uint32x4_t t0 =
        vbslq_u32(vceqq_u32(index, vdupq_n_u32(2048)), vdupq_n_u32(kAngle45), tab);
    const uint32x4_t t = vbslq_u32(steep, vsubq_u32(vdupq_n_u32(kAngle90), t0), t0);
    // Quadrants as base + t or base - t: (0, +), (360, -) below the centre, (180, -), (180, +)
    // above it.
    const uint32x4_t right = vcgeq_s32(dx, vdupq_n_s32(0));
    const uint32x4_t base =
        below ? vbslq_u32(right, vdupq_n_u32(0), vdupq_n_u32(kAngle360)) : vdupq_n_u32(kAngle180);
    const uint32x4_t plus = below ? right : vmvnq_u32(right);
    const uint32x4_t theta = vbslq_u32(plus, vaddq_u32(base, t), vsubq_u32(base, t));
    // theta + twist in 0 .. 720 degrees (below 2^29); divided by 11520 with the doubling high
    // multiply by ceil(2^44 / 11520) = 1527099484 (excess 11264, so sum x 11264 < 2^44 keeps it
    // exact), the product shifted by 31 and then 13.
    const uint32x4_t sum = vmlaq_n_u32(vaddq_u32(theta, vdupq_n_u32(start)),
                                       vsubq_u32(vdupq_n_u32(uint32_t{1} << 19), rho), signed_turn);
    const uint32x4_t quotient = vshrq_n_u32(
        vreinterpretq_u32_s32(vqdmulhq_s32(vreinterpretq_s32_u32(sum), vdupq_n_s32(1527099484))),
        13);
    const uint32x4_t k = vandq_u32(quotient, vdupq_n_u32(16383));
    const uint32x4_t q = vshrq_n_u32(k, 12), r = vandq_u32(k, vdupq_n_u32(4095));
    const uint32x4_t pair = look_up_any(kSinCos, r);
    const uint32x4_t near = vandq_u32(pair, vdupq_n_u32(0xFFFF)), far = vshrq_n_u32(pair, 16);
    const uint32x4_t odd = vtstq_u32(q, vdupq_n_u32(1));
    const uint32x4_t sv = vbslq_u32(odd, far, near), cv = vbslq_u32(odd, near, far);
    const uint32x4_t s_neg = vandq_u32(vcgeq_u32(q, vdupq_n_u32(2)), vtstq_u32(sv, sv));
    const uint32x4_t c_quarter =
        vorrq_u32(vceqq_u32(q, vdupq_n_u32(1)), vceqq_u32(q, vdupq_n_u32(2)));
    const uint32x4_t c_neg = vandq_u32(c_quarter, vtstq_u32(cv, cv));
    const uint32x4_t h = vshrq_n_u32(D, 16);
    const uint32x4_t ml =
        vaddq_u32(vandq_u32(vshrq_n_u32(D, 8), vdupq_n_u32(255)), vandq_u32(D, vdupq_n_u32(255)));
    twirl_axis(cx, h, ml, sv, s_neg, out.sx + i, out.fx + i);
    twirl_axis(cy, h, ml, cv, c_neg, out.sy + i, out.fy + i);
  }
  return m;
}

}  // namespace pfx::neon

#endif
