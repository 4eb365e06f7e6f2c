// The adjustments' rules on eight pixels at a time in NEON, for the adjustments' own kernels
// (adjust/adjust_neon.cpp) and for the looks that chain them. Each is made from its portable
// rule and gives the same channels for every input; the comment on each says why its
// intermediate values fit the lanes they are kept in. NEON builds only.
#pragma once

#include <arm_neon.h>

#include <cstdint>

#include "adjust/brightness_contrast.h"
#include "adjust/exposure_hue.h"
#include "adjust/faded_invert.h"
#include "adjust/gains_colortone.h"
#include "adjust/saturation_temperature.h"
#include "frame/neon.h"

namespace pfx::neon {

// ---- Shapes shared by the rules -------------------------------------------------------------

// A rule on each channel byte alone, f(uint8x8_t) -> uint8x8_t, run on each channel.
template <class F>
inline void per_channel(Rgb8& c, const F& f) {
  c = {f(c.r), f(c.g), f(c.b)};
}

// ---- YCbCr ------------------------------------------------------------------------------------

// The sums 77r + 150g + 29b (0..65280) and 128b - 43r - 85g, 128r - 107g - 21b
// (-32640..32640) of the conversion fit 16 bits, so they are formed in wrapping 16-bit lanes.
struct YCbCrSums {
  uint16x8_t y;
  int16x8_t cb, cr;
};

// Lanes of the conversion's constants.
struct YCbCrConstants {
  int16x4_t in1 = constants(77, 150, 29, 43);
  int16x4_t in2 = constants(85, 107, 21, 103);
  int16x4_t out = constants(73, 88, -58, 0);
};

inline YCbCrSums ycbcr_sums(const Rgb8& c, const YCbCrConstants& k) {
  const int16x8_t r = widen(c.r), g = widen(c.g), b = widen(c.b);
  int16x8_t y = vmulq_lane_s16(r, k.in1, 0);
  y = vmlaq_lane_s16(y, g, k.in1, 1);
  y = vmlaq_lane_s16(y, b, k.in1, 2);
  int16x8_t cb = vshlq_n_s16(b, 7);
  cb = vmlsq_lane_s16(cb, r, k.in1, 3);
  cb = vmlsq_lane_s16(cb, g, k.in2, 0);
  int16x8_t cr = vshlq_n_s16(r, 7);
  cr = vmlsq_lane_s16(cr, g, k.in2, 1);
  cr = vmlsq_lane_s16(cr, b, k.in2, 2);
  return {vreinterpretq_u16_s16(y), cb, cr};
}

// Back to colour from a luma y and chroma cb, cr, clamped to 0..255 (ycbcr.h). The products
// with 359, 183 and 454 would leave 16 bits, so each is split at a multiple of 256, whose part
// passes the shift whole: (359 cr) >> 8 = cr + ((103 cr) >> 8), (88 cb + 183 cr) >> 8 =
// cr + ((88 cb - 73 cr) >> 8), (454 cb) >> 8 = 2 cb + ((-58 cb) >> 8); and y - (x >> 8) is
// y + ((255 - x) >> 8). Exact while |cb| and |cr| stay within 188 and |y| within 10300: every
// value then fits 16 bits.
inline void from_ycbcr(Rgb8& c, int16x8_t y, int16x8_t cb, int16x8_t cr, const YCbCrConstants& k) {
  const int16x8_t r = vsraq_n_s16(vaddq_s16(y, cr), vmulq_lane_s16(cr, k.in2, 3), 8);
  int16x8_t x = vmlaq_lane_s16(vdupq_n_s16(255), cr, k.out, 0);
  x = vmlsq_lane_s16(x, cb, k.out, 1);
  const int16x8_t g = vsraq_n_s16(vsubq_s16(y, cr), x, 8);
  const int16x8_t b =
      vsraq_n_s16(vaddq_s16(y, vshlq_n_s16(cb, 1)), vmulq_lane_s16(cb, k.out, 2), 8);
  c = {clamped(r), clamped(g), clamped(b)};
}

// ---- The rules --------------------------------------------------------------------------------

// Brightness: luma moved by s (|s| <= 10000), chroma kept.
class BrightnessNeon {
 public:
  explicit BrightnessNeon(const Brightness& rule)
      : shift_(vdupq_n_u16(static_cast<uint16_t>(rule.shift()))) {}

  void operator()(Rgb8& c) const {
    const YCbCrSums sum = ycbcr_sums(c, k_);
    const int16x8_t y = vreinterpretq_s16_u16(vsraq_n_u16(shift_, sum.y, 8));
    from_ycbcr(c, y, vshrq_n_s16(sum.cb, 8), vshrq_n_s16(sum.cr, 8), k_);
  }

 private:
  uint16x8_t shift_;
  YCbCrConstants k_;
};

// Temperature: chroma moved by the level's shifts, luma kept. Only for shifts within +-60 (the
// levels -10..30), which keep the moved chroma within 188; other levels leave it to the rule.
class TemperatureNeon {
 public:
  explicit TemperatureNeon(const Temperature& rule)
      : cb_(vdupq_n_s16(static_cast<int16_t>(rule.cb_shift()))),
        cr_(vdupq_n_s16(static_cast<int16_t>(rule.cr_shift()))) {}

  static bool fits(const Temperature& rule) {
    return rule.cb_shift() >= -60 && rule.cb_shift() <= 60 && rule.cr_shift() >= -60 &&
           rule.cr_shift() <= 60;
  }

  void operator()(Rgb8& c) const {
    const YCbCrSums sum = ycbcr_sums(c, k_);
    from_ycbcr(c, vreinterpretq_s16_u16(vshrq_n_u16(sum.y, 8)), vsraq_n_s16(cb_, sum.cb, 8),
               vsraq_n_s16(cr_, sum.cr, 8), k_);
  }

 private:
  int16x8_t cb_, cr_;
  YCbCrConstants k_;
};

// Saturation: (grey + s c) >> 10 per channel, held to 0..255. The sums reach 2^19 in size, so
// they are formed in 32-bit lanes from 16-bit channels and weights (|weight| <= 1024, s <= 2048).
class SaturationNeon {
 public:
  explicit SaturationNeon(const Saturation& rule)
      : w_(constants(
            static_cast<int16_t>(rule.red_weight()), static_cast<int16_t>(rule.green_weight()),
            static_cast<int16_t>(rule.blue_weight()), static_cast<int16_t>(rule.strength()))) {}

  void operator()(Rgb8& c) const {
    const int16x8_t r = widen(c.r), g = widen(c.g), b = widen(c.b);
    const int32x4_t grey_lo = grey(vget_low_s16(r), vget_low_s16(g), vget_low_s16(b));
    const int32x4_t grey_hi = grey(vget_high_s16(r), vget_high_s16(g), vget_high_s16(b));
    c = {channel(r, grey_lo, grey_hi), channel(g, grey_lo, grey_hi), channel(b, grey_lo, grey_hi)};
  }

 private:
  int32x4_t grey(int16x4_t r, int16x4_t g, int16x4_t b) const {
    int32x4_t sum = vmull_lane_s16(r, w_, 0);
    sum = vmlal_lane_s16(sum, g, w_, 1);
    return vmlal_lane_s16(sum, b, w_, 2);
  }

  // (grey + s c) >> 10, narrowed with saturation to 16 bits and then to a byte.
  uint8x8_t channel(int16x8_t c, int32x4_t grey_lo, int32x4_t grey_hi) const {
    const int16x4_t lo = vqshrn_n_s32(vmlal_lane_s16(grey_lo, vget_low_s16(c), w_, 3), 10);
    const int16x4_t hi = vqshrn_n_s32(vmlal_lane_s16(grey_hi, vget_high_s16(c), w_, 3), 10);
    return clamped(vcombine_s16(lo, hi));
  }

  int16x4_t w_;  // red, green and blue weights, strength
};

// Contrast, per channel, for step counts d within +-19 (levels -9..29; others leave it to the
// rule). The step is ((a + 9) * 205) >> 11 with a = |c - 128| (a + 9 <= 137, so the product
// fits 16 bits), at most 13, so |d| step fits a byte. Moving away from 128 (d >= 0, Away) a
// channel goes up from the middle and down below it, held at 255 and 0 by saturating
// arithmetic; moving toward it (d < 0), it is held at 128.
template <bool Away>
class ContrastNeon {
 public:
  explicit ContrastNeon(const Contrast& rule)
      : d_(vdup_n_u8(static_cast<uint8_t>(rule.steps() < 0 ? -rule.steps() : rule.steps()))) {}

  static bool fits(const Contrast& rule) {
    return (rule.steps() >= 0) == Away && rule.steps() >= -19 && rule.steps() <= 19;
  }

  void operator()(Rgb8& c) const {
    per_channel(c, [&](uint8x8_t v) { return channel(v); });
  }

 private:
  uint8x8_t channel(uint8x8_t c) const {
    const uint8x8_t mid = vdup_n_u8(128);
    const uint8x8_t below = vclt_u8(c, mid);
    const uint8x8_t a9 = vaba_u8(vdup_n_u8(9), c, mid);
    // >> 11 as >> 8 while narrowing, then >> 3.
    const uint8x8_t step = vshr_n_u8(vshrn_n_u16(vmull_u8(a9, vdup_n_u8(205)), 8), 3);
    const uint8x8_t move = vmul_u8(step, d_);
    const uint8x8_t up = vqadd_u8(c, move), down = vqsub_u8(c, move);
    if constexpr (Away) return vbsl_u8(below, down, up);
    return vbsl_u8(below, vmin_u8(up, mid), vmax_u8(down, mid));
  }

  uint8x8_t d_;  // |d|
};

// Exposure, per channel: (c F + 2^15) >> 16 held to 255, F the 16.16 factor (at most 2^24).
// With c shifted up by 15 (below 2^23), the rounding doubling high multiply gives
// (2 (c 2^15) F + 2^31) >> 32, which is that value exactly.
class ExposureNeon {
 public:
  explicit ExposureNeon(const Exposure& rule)
      : factor_(vdupq_n_s32(static_cast<int32_t>(rule.factor()))) {}

  void operator()(Rgb8& c) const { c = {channel(c.r), channel(c.g), channel(c.b)}; }

 private:
  uint8x8_t channel(uint8x8_t c8) const {
    const uint16x8_t c = vmovl_u8(c8);
    const int32x4_t lo =
        vqrdmulhq_s32(vreinterpretq_s32_u32(vshll_n_u16(vget_low_u16(c), 15)), factor_);
    const int32x4_t hi =
        vqrdmulhq_s32(vreinterpretq_s32_u32(vshll_n_u16(vget_high_u16(c), 15)), factor_);
    return vqmovn_u16(
        vcombine_u16(vmovn_u32(vreinterpretq_u32_s32(lo)), vmovn_u32(vreinterpretq_u32_s32(hi))));
  }

  int32x4_t factor_;
};

// Faded colour, per channel: (slope c + offset) / 25500 held to 255, the sum below 2^23. The
// quotient is (x M) >> 37 with M = 5389763 (faded_invert.h); the doubling high multiply gives
// (2 x M) >> 32, the product shifted by 31, and six more bits go in the narrowing.
class FadeNeon {
 public:
  explicit FadeNeon(const Fade& rule)
      : slopes_(vreinterpret_u16_s16(constants(static_cast<int16_t>(rule.red().slope),
                                               static_cast<int16_t>(rule.green().slope),
                                               static_cast<int16_t>(rule.blue().slope), 0))),
        offsets_{offset(rule.red()), offset(rule.green()), offset(rule.blue())} {}

  void operator()(Rgb8& c) const { c = {channel<0>(c.r), channel<1>(c.g), channel<2>(c.b)}; }

 private:
  static uint32x4_t offset(const Fade::Line& l) {
    return vdupq_n_u32(static_cast<uint32_t>(l.offset));
  }

  template <int I>
  uint16x4_t quotient(uint16x4_t c) const {
    const uint32x4_t x = vaddq_u32(vmull_lane_u16(c, slopes_, I), offsets_[I]);
    const int32x4_t q = vqdmulhq_s32(vreinterpretq_s32_u32(x), vdupq_n_s32(5389763));
    return vshrn_n_u32(vreinterpretq_u32_s32(q), 6);
  }

  template <int I>
  uint8x8_t channel(uint8x8_t c8) const {
    const uint16x8_t c = vmovl_u8(c8);
    return vqmovn_u16(vcombine_u16(quotient<I>(vget_low_u16(c)), quotient<I>(vget_high_u16(c))));
  }

  uint16x4_t slopes_;  // red, green, blue (at most 25500)
  uint32x4_t offsets_[3];
};

// Channel gains: each channel plus its offset (-255..255), held to 0..255 by saturating adds.
class GainsNeon {
 public:
  explicit GainsNeon(const Gains& rule)
      : up_{part(rule.offsets().r), part(rule.offsets().g), part(rule.offsets().b)},
        down_{part(-rule.offsets().r), part(-rule.offsets().g), part(-rule.offsets().b)} {}

  void operator()(Rgb8& c) const {
    c = {vqsub_u8(vqadd_u8(c.r, up_[0]), down_[0]), vqsub_u8(vqadd_u8(c.g, up_[1]), down_[1]),
         vqsub_u8(vqadd_u8(c.b, up_[2]), down_[2])};
  }

 private:
  static uint8x8_t part(int32_t d) { return vdup_n_u8(static_cast<uint8_t>(d > 0 ? d : 0)); }

  uint8x8_t up_[3], down_[3];
};

}  // namespace pfx::neon
