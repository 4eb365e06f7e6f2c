// NEON kernels of the blur family: a line of the Gaussian, the column sums of the upscaling, and
// the composited and restored rows. Each gives the bits of the portable loop it stands in for
// (gaussian.cpp, composite.cpp, tiltshift.cpp); the comments say why the lanes hold the values.
#if defined(__ARM_NEON)

#include <arm_neon.h>

#include <cstddef>
#include <cstdint>

#include "blur/composite.h"
#include "blur/gaussian.h"
#include "blur/kernels.h"
#include "frame/neon.h"

namespace pfx::neon {
namespace {

// ---- Gaussian -----------------------------------------------------------------------------

// The sums of eight outputs over the active taps: the kernel weight of the taps inside the area
// (at most 55), the count of taps present but outside it (at most 9), and each channel's sum of
// weight times value (at most 255 x 55). All fit 16 bits.
struct TapSums {
  uint16x8_t inside, outside, s[3];
};

// The divisions of eight outputs: sum / weight for each channel, with weight = inside + 9 x
// outside (9..81) and the stand-in channels counted 9 x outside times over. Where all eight
// weights are one value, one reciprocal serves them (kBlurReciprocal: (sum x r) >> 22, sums at
// most 255 x 81, products below 2^32); otherwise each output is divided on its own.
inline void divide(const TapSums& t, const uint8_t* const* centre, size_t x, uint8_t* const* out) {
  const uint16x8_t stand_in = vmulq_n_u16(t.outside, 9);
  const uint16x8_t weight = vaddq_u16(t.inside, stand_in);
  const uint16_t first = vgetq_lane_u16(weight, 0);
  const uint16x8_t same = vceqq_u16(weight, vdupq_n_u16(first));
  const uint8x8_t all = vmovn_u16(same);
  if (vget_lane_u64(vreinterpret_u64_u8(all), 0) != ~uint64_t{0}) {
    // Weights differ along the block (an edge of the image or of the area): one by one.
    uint16_t w[8], stand[8], s[3][8];
    vst1q_u16(w, weight);
    vst1q_u16(stand, stand_in);
    for (int32_t c = 0; c < 3; ++c) vst1q_u16(s[c], t.s[c]);
    for (int32_t l = 0; l < 8; ++l) {
      const uint32_t r = kBlurReciprocal[w[l]];
      for (int32_t c = 0; c < 3; ++c) {
        const uint32_t num = s[c][l] + uint32_t{stand[l]} * centre[c][x + static_cast<size_t>(l)];
        out[c][x + static_cast<size_t>(l)] =
            static_cast<uint8_t>((num * r) >> kBlurReciprocalShift);
      }
    }
    return;
  }
  const uint32_t r = kBlurReciprocal[first];
  for (int32_t c = 0; c < 3; ++c) {
    const uint16x8_t num = vmlaq_u16(t.s[c], stand_in, vmovl_u8(vld1_u8(centre[c] + x)));
    const uint32x4_t lo = vmulq_n_u32(vmovl_u16(vget_low_u16(num)), r);
    const uint32x4_t hi = vmulq_n_u32(vmovl_u16(vget_high_u16(num)), r);
    // >> 22 as >> 16 while narrowing, then >> 6 while narrowing again (the quotient is a byte).
    vst1_u8(out[c] + x, vshrn_n_u16(vcombine_u16(vshrn_n_u32(lo, 16), vshrn_n_u32(hi, 16)), 6));
  }
}

}  // namespace

namespace {

// The taps of the two passes lie at a fixed stride from one another (1 along a padded row, the
// width down the planes), so each stream is read by one pointer walking through the taps.
struct Walk {
  const uint8_t* inside;
  const uint8_t* present;  // null: every tap present (the vertical pass)
  const uint8_t* v[3];
  ptrdiff_t stride;
  int32_t count;
  uint8_t k[kTaps];
};

// The general block: inside flags and presence read for every tap.
inline TapSums sums_of(const Walk& w, size_t x) {
  TapSums t{vdupq_n_u16(0), vdupq_n_u16(0), {vdupq_n_u16(0), vdupq_n_u16(0), vdupq_n_u16(0)}};
  const uint8_t* in = w.inside + x;
  const uint8_t* pr = w.present == nullptr ? nullptr : w.present + x;
  const uint8_t* v0 = w.v[0] + x;
  const uint8_t* v1 = w.v[1] + x;
  const uint8_t* v2 = w.v[2] + x;
  // Kept a loop: unrolled, each tap's pointers become registers of their own, which run out.
#pragma GCC unroll 1
  for (int32_t a = 0; a < w.count; ++a) {
    const uint8x8_t d = vld1_u8(in);
    const uint8x8_t kd = vmul_u8(d, vdup_n_u8(w.k[a]));
    t.inside = vaddw_u8(t.inside, kd);
    const uint8x8_t there = pr == nullptr ? vdup_n_u8(1) : vld1_u8(pr);
    t.outside = vaddw_u8(t.outside, vsub_u8(there, d));
    t.s[0] = vmlal_u8(t.s[0], kd, vld1_u8(v0));
    t.s[1] = vmlal_u8(t.s[1], kd, vld1_u8(v1));
    t.s[2] = vmlal_u8(t.s[2], kd, vld1_u8(v2));
    in += w.stride;
    if (pr != nullptr) pr += w.stride;
    v0 += w.stride;
    v1 += w.stride;
    v2 += w.stride;
  }
  return t;
}

// The block of a line whose every tap is present and inside the area: the weight is the sum of
// the kernel weights, the same for all eight outputs, and no flag needs reading.
inline void clean_block(const Walk& w, size_t x, uint32_t r, uint8_t* const* out) {
  uint16x8_t s0 = vdupq_n_u16(0), s1 = vdupq_n_u16(0), s2 = vdupq_n_u16(0);
  const uint8_t* v0 = w.v[0] + x;
  const uint8_t* v1 = w.v[1] + x;
  const uint8_t* v2 = w.v[2] + x;
#pragma GCC unroll 1
  for (int32_t a = 0; a < w.count; ++a) {
    const uint8x8_t k = vdup_n_u8(w.k[a]);
    s0 = vmlal_u8(s0, k, vld1_u8(v0));
    s1 = vmlal_u8(s1, k, vld1_u8(v1));
    s2 = vmlal_u8(s2, k, vld1_u8(v2));
    v0 += w.stride;
    v1 += w.stride;
    v2 += w.stride;
  }
  const uint16x8_t s[3] = {s0, s1, s2};
  for (int32_t c = 0; c < 3; ++c) {
    const uint32x4_t lo = vmulq_n_u32(vmovl_u16(vget_low_u16(s[c])), r);
    const uint32x4_t hi = vmulq_n_u32(vmovl_u16(vget_high_u16(s[c])), r);
    vst1_u8(out[c] + x, vshrn_n_u16(vcombine_u16(vshrn_n_u32(lo, 16), vshrn_n_u32(hi, 16)), 6));
  }
}

}  // namespace

size_t blur_line(int32_t n, const Taps& taps, const uint8_t* c0, const uint8_t* c1,
                 const uint8_t* c2, uint8_t* o0, uint8_t* o1, uint8_t* o2, bool clean) {
  // The active taps, which the passes make a run of consecutive taps at one stride; the others
  // add nothing.
  int32_t first = -1, count = 0;
  for (int32_t i = 0; i < kTaps; ++i) {
    if (taps.active[i] == 0) continue;
    if (first < 0) first = i;
    if (i != first + count) return 0;
    ++count;
  }
  if (count == 0 || n <= 0) return 0;
  Walk w{};
  w.inside = taps.inside[first];
  w.stride = count > 1 ? taps.inside[first + 1] - taps.inside[first] : 0;
  const bool flat = taps.present[first] == taps.present[first + count - 1];
  w.present = flat ? nullptr : taps.present[first];
  for (int32_t c = 0; c < 3; ++c) w.v[c] = taps.v[c][first];
  w.count = count;
  uint32_t total = 0;
  for (int32_t a = 0; a < count; ++a) {
    w.k[a] = static_cast<uint8_t>(taps.k[first + a]);
    total += w.k[a];
    const ptrdiff_t at = a * w.stride;
    const bool strided =
        taps.inside[first + a] == w.inside + at && taps.v[0][first + a] == w.v[0] + at &&
        taps.v[1][first + a] == w.v[1] + at && taps.v[2][first + a] == w.v[2] + at &&
        (flat ? taps.present[first + a] == taps.present[first]
              : taps.present[first + a] == w.present + at);
    if (!strided) return 0;
  }
  // Blocks whose taps all lie within the line, on a clean line (every sample inside the area);
  // along a row the taps reach from first - 4 to first + count - 5 columns off the output.
  const ptrdiff_t reach_left = w.stride == 1 ? 4 - first : 0;
  const ptrdiff_t reach_right = w.stride == 1 ? first + count - 5 : 0;
  const uint32_t r = kBlurReciprocal[total];
  const uint8_t* const centre[3] = {c0, c1, c2};
  uint8_t* const out[3] = {o0, o1, o2};
  const size_t m = static_cast<size_t>(n) & ~size_t{7};
  for (size_t x = 0; x < m; x += 8) {
    const ptrdiff_t lo = static_cast<ptrdiff_t>(x) - reach_left;
    const ptrdiff_t hi = static_cast<ptrdiff_t>(x) + 7 + reach_right;
    if (clean && lo >= 0 && hi < n) {
      clean_block(w, x, r, out);
    } else {
      divide(sums_of(w, x), centre, x, out);
    }
  }
  return m;
}

// ---- Upscaling ----------------------------------------------------------------------------

bool column_sums(const uint8_t* blur, const uint8_t* depth, int32_t sw, int32_t index, int32_t frac,
                 uint16_t* const* sums) {
  const size_t row = static_cast<size_t>(sw), top = static_cast<size_t>(index) * row;
  const uint8x8_t wt = vdup_n_u8(static_cast<uint8_t>(32 - frac));
  const uint8x8_t wb = vdup_n_u8(static_cast<uint8_t>(frac));
  size_t j = 0;
  for (; j + 8 <= row; j += 8) {
    uint8x8x3_t t = vld3_u8(blur + 3 * (top + j));
    uint8x8x3_t b = vld3_u8(blur + 3 * (top + row + j));
    uint16x8_t own = vdupq_n_u16(0);  // without a depth map: every sample inside, no own plane
    if (depth != nullptr) {
      // A sample outside the area (depth 0) gives its weight to the pixel's own colour.
      const uint8x8_t dt = vtst_u8(vld1_u8(depth + top + j), vld1_u8(depth + top + j));
      const uint8x8_t db = vtst_u8(vld1_u8(depth + top + row + j), vld1_u8(depth + top + row + j));
      for (int32_t c = 0; c < 3; ++c) {
        t.val[c] = vand_u8(t.val[c], dt);
        b.val[c] = vand_u8(b.val[c], db);
      }
      own = vaddl_u8(vbic_u8(wt, dt), vbic_u8(wb, db));
    }
    for (int32_t c = 0; c < 3; ++c) {
      vst1q_u16(sums[c] + j, vmlal_u8(vmull_u8(t.val[c], wt), b.val[c], wb));
    }
    if (depth != nullptr) vst1q_u16(sums[3] + j, own);
  }
  for (; j < row; ++j) {
    const bool dt = depth == nullptr || depth[top + j] != 0;
    const bool db = depth == nullptr || depth[top + row + j] != 0;
    const uint8_t* tp = blur + 3 * (top + j);
    const uint8_t* bp = blur + 3 * (top + row + j);
    for (int32_t c = 0; c < 3; ++c) {
      sums[c][j] = static_cast<uint16_t>((dt ? tp[c] * (32 - frac) : 0) + (db ? bp[c] * frac : 0));
    }
    if (depth != nullptr)
      sums[3][j] = static_cast<uint16_t>((dt ? 0 : 32 - frac) + (db ? 0 : frac));
  }
  return true;
}

namespace {

// Where eight full-size columns fall between working columns: the first of the two (rel to the
// block's first, as byte indices of 16-bit entries for the table instructions), and the weights
// of the second (wx) and the first (32 - wx), as working_pos has them. The columns of a block
// span at most five working columns while xscale is at most 2^14 (a working image at most half
// the size), so the sums of a block are eight entries from the block's first.
struct Columns {
  size_t first;
  uint8x16_t idx, idx_next;  // gather indices of entries j and j + 1
  uint16x8_t wx, w0;
};

// The columns of the blocks of a row in turn: x xscale kept for the eight lanes and stepped.
class ColumnWalk {
 public:
  ColumnWalk(int32_t xscale, int32_t sw)
      : step_(vdupq_n_u32(8 * static_cast<uint32_t>(xscale))),
        last_(vdupq_n_u16(static_cast<uint16_t>(sw - 2))) {
    uint32_t lo[4], hi[4];
    for (uint32_t l = 0; l < 4; ++l) {
      lo[l] = l * static_cast<uint32_t>(xscale);
      hi[l] = (l + 4) * static_cast<uint32_t>(xscale);
    }
    lo_ = vld1q_u32(lo);
    hi_ = vld1q_u32(hi);
  }

  Columns next() {
    const uint16x8_t f = vcombine_u16(vshrn_n_u32(lo_, 10), vshrn_n_u32(hi_, 10));  // & 65535
    lo_ = vaddq_u32(lo_, step_);
    hi_ = vaddq_u32(hi_, step_);
    const uint16x8_t j = vminq_u16(vshrq_n_u16(f, 5), last_);
    const uint16_t first = vgetq_lane_u16(j, 0);
    // Entry rel as bytes 2 rel and 2 rel + 1.
    const uint16x8_t twice = vshlq_n_u16(vsubq_u16(j, vdupq_n_u16(first)), 1);
    const uint16x8_t pair = vorrq_u16(twice, vshlq_n_u16(vaddq_u16(twice, vdupq_n_u16(1)), 8));
    Columns c;
    c.first = first;
    c.idx = vreinterpretq_u8_u16(pair);
    c.idx_next = vaddq_u8(c.idx, vdupq_n_u8(2));
    c.wx = vandq_u16(f, vdupq_n_u16(31));
    c.w0 = vsubq_u16(vdupq_n_u16(32), c.wx);
    return c;
  }

 private:
  uint32x4_t lo_, hi_, step_;
  uint16x8_t last_;
};

// Entries j and j + 1 of a plane of sums for the eight columns.
inline void gather(const uint16_t* plane, const Columns& c, uint16x8_t& a, uint16x8_t& b) {
  const uint8x16_t block = vreinterpretq_u8_u16(vld1q_u16(plane + c.first));
  const uint8x8x2_t table = {{vget_low_u8(block), vget_high_u8(block)}};
  a = vreinterpretq_u16_u8(
      vcombine_u8(vtbl2_u8(table, vget_low_u8(c.idx)), vtbl2_u8(table, vget_high_u8(c.idx))));
  b = vreinterpretq_u16_u8(vcombine_u8(vtbl2_u8(table, vget_low_u8(c.idx_next)),
                                       vtbl2_u8(table, vget_high_u8(c.idx_next))));
}

// a (32 - wx) + b wx for eight columns, in 32-bit halves (at most 255 x 1024).
inline uint32x4_t blend_lo(uint16x8_t a, uint16x8_t b, const Columns& c) {
  return vmlal_u16(vmull_u16(vget_low_u16(a), vget_low_u16(c.w0)), vget_low_u16(b),
                   vget_low_u16(c.wx));
}
inline uint32x4_t blend_hi(uint16x8_t a, uint16x8_t b, const Columns& c) {
  return vmlal_u16(vmull_u16(vget_high_u16(a), vget_high_u16(c.w0)), vget_high_u16(b),
                   vget_high_u16(c.wx));
}

}  // namespace

namespace {

// Eight composited pixels (out: red, green, blue) stored over their source pixels px at dst + x,
// alpha kept; under a mask only where its byte is non-zero.
template <bool Masked>
inline void store_composited(const uint8x8_t (&out)[3], uint8x8x4_t px, const uint8_t* mask,
                             size_t x, uint32_t* dst) {
  if constexpr (Masked) {
    const uint8x8_t m = vld1_u8(mask + x);
    const uint8x8_t selected = vtst_u8(m, m);
    for (int32_t k = 0; k < 3; ++k) px.val[2 - k] = vbsl_u8(selected, out[k], px.val[2 - k]);
  } else {
    for (int32_t k = 0; k < 3; ++k) px.val[2 - k] = out[k];
  }
  vst4_u8(reinterpret_cast<uint8_t*>(dst + x), px);
}

template <bool Masked>
void composite_blocks(const uint32_t* src, const uint8_t* mask, uint32_t* dst, uint32_t n,
                      int32_t sw, int32_t xscale, const uint16_t* const* sums) {
  const uint16_t *red = sums[0], *green = sums[1], *blue = sums[2], *own_plane = sums[3];
  const uint16_t* const plane[3] = {red, green, blue};
  ColumnWalk walk(xscale, sw);
  for (uint32_t x = 0; x < n; x += 8) {
    const Columns c = walk.next();
    uint8x8x4_t px = vld4_u8(reinterpret_cast<const uint8_t*>(src + x));
    uint16x8_t oa, ob;
    gather(own_plane, c, oa, ob);
    const uint16x8_t own = vmlaq_u16(vmulq_u16(oa, c.w0), ob, c.wx);  // at most 1024
    uint8x8_t out[3];
    for (int32_t k = 0; k < 3; ++k) {
      uint16x8_t a, b;
      gather(plane[k], c, a, b);
      const uint16x8_t s = vmovl_u8(px.val[2 - k]);
      const uint32x4_t lo = vmlal_u16(blend_lo(a, b, c), vget_low_u16(s), vget_low_u16(own));
      const uint32x4_t hi = vmlal_u16(blend_hi(a, b, c), vget_high_u16(s), vget_high_u16(own));
      out[k] = vmovn_u16(vcombine_u16(vshrn_n_u32(lo, 10), vshrn_n_u32(hi, 10)));
    }
    store_composited<Masked>(out, px, mask, x, dst);
  }
}

// A working image exactly 2^K times narrower (K 1..3, width = sw << K): column x lies between
// working columns x >> K and the next with wx = (x mod 2^K) 32 / 2^K, so every block of eight
// has the same pattern, and with the weights divided by g = 32 / 2^K the sums fit 16 bits:
// (A (2^K - u) + A' u) + s own' is (c + s own) / g, at most 255 x 32 x 2^K <= 65280, and the
// value is that >> (10 - log2 g) = >> (K + 5). Columns of the last working column are clamped
// (their pair is the one before), so the periodic blocks stop short of them.
template <int K>
struct Periodic {
  uint8x16_t idx, idx_next;
  uint16x8_t u, u0;

  Periodic() {
    uint8_t bytes[16];
    uint16_t u_lanes[8], u0_lanes[8];
    for (int32_t l = 0; l < 8; ++l) {
      const int32_t rel = l >> K;
      bytes[2 * l] = static_cast<uint8_t>(2 * rel);
      bytes[2 * l + 1] = static_cast<uint8_t>(2 * rel + 1);
      u_lanes[l] = static_cast<uint16_t>(l & ((1 << K) - 1));
      u0_lanes[l] = static_cast<uint16_t>((1 << K) - u_lanes[l]);
    }
    idx = vld1q_u8(bytes);
    idx_next = vaddq_u8(idx, vdupq_n_u8(2));
    u = vld1q_u16(u_lanes);
    u0 = vld1q_u16(u0_lanes);
  }

  // End of the periodic blocks of a row.
  static uint32_t end(int32_t sw) { return (static_cast<uint32_t>(sw - 1) << K) & ~7u; }

  // A (2^K - u) + A' u for the block starting at working column j0.
  uint16x8_t mix(const uint16_t* plane, uint32_t j0) const {
    if constexpr (K == 1) {
      // Half size: even columns 2 A, odd ones A + A'; four working columns, zipped.
      const uint16x4_t a = vld1_u16(plane + j0), b = vld1_u16(plane + j0 + 1);
      const uint16x4x2_t z = vzip_u16(vadd_u16(a, a), vadd_u16(a, b));
      return vcombine_u16(z.val[0], z.val[1]);
    }
    const uint8x16_t block = vreinterpretq_u8_u16(vld1q_u16(plane + j0));
    const uint8x8x2_t table = {{vget_low_u8(block), vget_high_u8(block)}};
    const uint16x8_t a = vreinterpretq_u16_u8(
        vcombine_u8(vtbl2_u8(table, vget_low_u8(idx)), vtbl2_u8(table, vget_high_u8(idx))));
    const uint16x8_t b = vreinterpretq_u16_u8(vcombine_u8(vtbl2_u8(table, vget_low_u8(idx_next)),
                                                          vtbl2_u8(table, vget_high_u8(idx_next))));
    return vmlaq_u16(vmulq_u16(a, u0), b, u);
  }
};

template <bool Masked, int K>
uint32_t composite_periodic(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t sw,
                            const uint16_t* const* sums) {
  const Periodic<K> p;
  const uint16_t* const plane[3] = {sums[0], sums[1], sums[2]};
  const uint16_t* own_plane = sums[3];
  const uint32_t end = Periodic<K>::end(sw);
  for (uint32_t x = 0; x < end; x += 8) {
    const uint32_t j0 = x >> K;
    uint8x8x4_t px = vld4_u8(reinterpret_cast<const uint8_t*>(src + x));
    const uint16x8_t own = p.mix(own_plane, j0);
    uint8x8_t out[3];
    for (int32_t k = 0; k < 3; ++k) {
      const uint16x8_t t = vmlaq_u16(p.mix(plane[k], j0), vmovl_u8(px.val[2 - k]), own);
      out[k] = vshrn_n_u16(t, K + 5);
    }
    store_composited<Masked>(out, px, mask, x, dst);
  }
  return end;
}

// The blocks of a row: periodic where the sizes allow, otherwise by the column walk. Returns
// where the blocks stopped.
template <bool Masked>
uint32_t composite_any(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                       int32_t sw, int32_t xscale, const uint16_t* const* sums) {
  const uint32_t w = static_cast<uint32_t>(width), s = static_cast<uint32_t>(sw);
  if (w == s << 1 && xscale == 16384) {
    return composite_periodic<Masked, 1>(src, mask, dst, sw, sums);
  }
  if (w == s << 2 && xscale == 8192) return composite_periodic<Masked, 2>(src, mask, dst, sw, sums);
  if (w == s << 3 && xscale == 4096) return composite_periodic<Masked, 3>(src, mask, dst, sw, sums);
  const uint32_t n = w & ~7u;
  composite_blocks<Masked>(src, mask, dst, n, sw, xscale, sums);
  return n;
}

}  // namespace

bool composite_row(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                   int32_t sw, int32_t xscale, const uint16_t* const* sums) {
  if (xscale > 16384) return false;
  const uint32_t n = mask != nullptr
                         ? composite_any<true>(src, mask, dst, width, sw, xscale, sums)
                         : composite_any<false>(src, mask, dst, width, sw, xscale, sums);
  for (uint32_t x = n; x < static_cast<uint32_t>(width); ++x) {
    const uint32_t s = src[x];
    if (mask != nullptr && mask[x] == 0) {
      dst[x] = s;
      continue;
    }
    const WorkingPos p = working_pos(static_cast<int32_t>(x), xscale, sw);
    const size_t j = static_cast<size_t>(p.index);
    const int32_t wx = p.frac, w0 = 32 - wx;
    const int32_t own = sums[3][j] * w0 + sums[3][j + 1] * wx;
    uint32_t word = s & 0xFF000000u;
    for (int32_t k = 0; k < 3; ++k) {
      const int32_t sc = static_cast<int32_t>((s >> (16 - 8 * k)) & 255u);
      const int32_t v = (sums[k][j] * w0 + sums[k][j + 1] * wx + sc * own) >> 10;
      word |= static_cast<uint32_t>(v) << (16 - 8 * k);
    }
    dst[x] = word;
  }
  return true;
}

namespace {

// restore_row's blocks for a working image 2^K times narrower (see Periodic).
template <int K>
uint32_t restore_periodic(const uint32_t* src, uint32_t* dst, int32_t sw, uint16x8_t keep,
                          uint16x8_t blur_w, const uint16_t* const* sums) {
  const Periodic<K> p;
  const uint16_t* const plane[3] = {sums[0], sums[1], sums[2]};
  const uint32_t end = Periodic<K>::end(sw);
  for (uint32_t x = 0; x < end; x += 8) {
    uint8x8x4_t px = vld4_u8(reinterpret_cast<const uint8_t*>(src + x));
    for (int32_t k = 0; k < 3; ++k) {
      const uint16x8_t v = vshrq_n_u16(p.mix(plane[k], x >> K), K + 5);
      const uint16x8_t mix = vmlaq_u16(vmulq_u16(v, blur_w), vmovl_u8(px.val[2 - k]), keep);
      px.val[2 - k] = vshrn_n_u16(mix, 8);
    }
    vst4_u8(reinterpret_cast<uint8_t*>(dst + x), px);
  }
  return end;
}

}  // namespace

bool restore_row(const uint32_t* src, uint32_t* dst, int32_t width, int32_t sw, int32_t xscale,
                 int32_t w, const uint16_t* const* sums) {
  if (xscale > 16384) return false;
  uint32_t n = static_cast<uint32_t>(width) & ~7u;
  const uint16x8_t keep = vdupq_n_u16(static_cast<uint16_t>(w));
  const uint16x8_t blur_w = vdupq_n_u16(static_cast<uint16_t>(256 - w));
  const uint16_t* const plane[3] = {sums[0], sums[1], sums[2]};
  const uint32_t wide = static_cast<uint32_t>(width), narrow = static_cast<uint32_t>(sw);
  uint32_t from = 0;
  if (wide == narrow << 1 && xscale == 16384) {
    n = restore_periodic<1>(src, dst, sw, keep, blur_w, sums);
    from = n;
  } else if (wide == narrow << 2 && xscale == 8192) {
    n = restore_periodic<2>(src, dst, sw, keep, blur_w, sums);
    from = n;
  } else if (wide == narrow << 3 && xscale == 4096) {
    n = restore_periodic<3>(src, dst, sw, keep, blur_w, sums);
    from = n;
  }
  ColumnWalk walk(xscale, sw);
  for (uint32_t x = from; x < n; x += 8) {
    const Columns c = walk.next();
    uint8x8x4_t px = vld4_u8(reinterpret_cast<const uint8_t*>(src + x));
    for (int32_t k = 0; k < 3; ++k) {
      uint16x8_t a, b;
      gather(plane[k], c, a, b);
      // The upscaled blur (a byte), then the mix: at most 255 x 256, within 16 bits.
      const uint16x8_t v =
          vcombine_u16(vshrn_n_u32(blend_lo(a, b, c), 10), vshrn_n_u32(blend_hi(a, b, c), 10));
      const uint16x8_t mix = vmlaq_u16(vmulq_u16(v, blur_w), vmovl_u8(px.val[2 - k]), keep);
      px.val[2 - k] = vshrn_n_u16(mix, 8);
    }
    vst4_u8(reinterpret_cast<uint8_t*>(dst + x), px);
  }
  for (uint32_t x = n; x < static_cast<uint32_t>(width); ++x) {
    const uint32_t s = src[x];
    const WorkingPos p = working_pos(static_cast<int32_t>(x), xscale, sw);
    const size_t j = static_cast<size_t>(p.index);
    const int32_t wx = p.frac, w0 = 32 - wx;
    uint32_t word = s & 0xFF000000u;
    for (int32_t k = 0; k < 3; ++k) {
      const int32_t sc = static_cast<int32_t>((s >> (16 - 8 * k)) & 255u);
      const int32_t v = (sums[k][j] * w0 + sums[k][j + 1] * wx) >> 10;
      word |= static_cast<uint32_t>((v * (256 - w) + sc * w) >> 8) << (16 - 8 * k);
    }
    dst[x] = word;
  }
  return true;
}

// ---- Sharpen ------------------------------------------------------------------------------

// Eight pixels at a time from column 1: the left and right neighbours by extracting from the
// blocks on either side (the source's, kept in registers, so the call may work in place), then
// clamp(2c - ((l + r) >> 1)) per channel: the halving add is the mean exactly, and 2c - mean
// lies in -255..510.
size_t sharpen_row(const uint32_t* src, const uint8_t* mask, uint32_t* dst, size_t w,
                   uint32_t& left) {
  if (w < 18) return 1;
  const uint8_t* in = reinterpret_cast<const uint8_t*>(src);
  uint8_t* out = reinterpret_cast<uint8_t*>(dst);
  // prev holds the eight source columns before the block (only its last lane is read), cur the
  // block's, next the eight after it.
  const uint8x8x4_t first = vld4_u8(in);
  uint8x8x4_t prev;
  for (int32_t c = 0; c < 4; ++c) prev.val[c] = vdup_lane_u8(first.val[c], 0);
  uint8x8x4_t cur = vld4_u8(in + 4);  // columns 1..8
  uint32_t last = src[0];
  size_t x = 1;
  for (; x + 16 <= w; x += 8) {
    const uint8x8x4_t next = vld4_u8(in + 4 * (x + 8));
    uint8x8x4_t res = cur;
    for (int32_t c = 0; c < 3; ++c) {
      const uint8x8_t l = vext_u8(prev.val[c], cur.val[c], 7);
      const uint8x8_t r = vext_u8(cur.val[c], next.val[c], 1);
      const uint8x8_t mean = vhadd_u8(l, r);
      res.val[c] = vqmovun_s16(vreinterpretq_s16_u16(vsubw_u8(vshll_n_u8(cur.val[c], 1), mean)));
    }
    if (mask != nullptr) {
      const uint8x8_t selected = vceq_u8(vld1_u8(mask + x), vdup_n_u8(1));
      for (int32_t c = 0; c < 3; ++c) res.val[c] = vbsl_u8(selected, res.val[c], cur.val[c]);
    }
    last = src[x + 7];  // before the store overwrites it, when in place
    vst4_u8(out + 4 * x, res);
    prev = cur;
    cur = next;
  }
  left = last;
  return x;
}

}  // namespace pfx::neon

#endif
