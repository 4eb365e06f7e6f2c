// Auto adjust: a one-touch tone mapping driven by the image's own lightness histogram.
//
// The first pass measures each pixel's lightness (percent, 20 fraction bits) and counts the
// lightness levels 1..100. From the counts comes an equalising tone curve: each level's weight is
// its count damped by the logarithm of that count against the largest one, plus a uniform weight
// chosen by how much of the image is already bright. The second pass maps each pixel's lightness
// through the curve (sampled at even levels) and scales red, green and blue by the ratio of new
// to old luma; where that would push a channel past 255 the pixel is scaled so its strongest
// channel lands on 254 instead, which keeps saturated colours bright and their hue intact. Images
// under 150 pixels in either direction get a fixed contrast boost instead.
//
// Everything the second pass needs of a pixel follows from its luma, so it recomputes the luma
// from the source pixel instead of keeping planes of it from the first pass: the call needs no
// per-pixel scratch, and in place each pixel is still read before its own word is written. The
// gain, new luma over old, depends on the luma alone once the curve is known; large images look
// it up in a table of every luma, built once per call, instead of dividing for every pixel.
//
// Counts reach the pixel count of the image, so the bright share and the weighted histogram are
// formed in 64 bits: a few megapixels already carry them past 2^31.
//
// Four module-wide parameters tune the curve; fx_set_hdr changes them within their ranges.
#include "auto/auto_adjust.h"

#include <cstddef>
#include <cstdint>

#include "frame/dispatch.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "photofx.h"

extern "C" {

int32_t g_HDR_Threshold = 70;
int32_t g_HDR_CutOff = 100;
int32_t g_HDR_Weight1 = 1000;
int32_t g_HDR_Weight2 = 5120;

}  // extern "C"

namespace pfx {
namespace {

// Smaller sides than this take the contrast path; the histogram would say little about them.
constexpr int32_t kMinCurveSide = 150;
constexpr int32_t kSmallImageContrast = 12;

constexpr int32_t kLevels = 101;  // lightness levels 0..100

// (c x 1024) x gain may reach 255 << 20 and no further; with c x gain that is 255 << 10, the
// largest luma.
constexpr uint32_t kChannelLimit = kLargestLuma;

struct Range {
  int32_t lo, hi;
};

constexpr Range kThresholdRange{0, 127};
constexpr Range kCutOffRange{0, 100};
constexpr Range kWeightRange{300, 8196};

constexpr bool in_range(int32_t v, Range r) { return v >= r.lo && v <= r.hi; }

struct Params {
  int32_t threshold, cutoff, weight1, weight2;
};

// The globals are exported, so a host can store any value in them directly, bypassing
// fx_set_hdr. Each is held to its accepted range here: that keeps the weights from zeroing a
// divisor and the curve within the arithmetic below. A threshold outside 0..127 already gives
// the same choice as the nearer end, since the bright share is 0..100.
Params read_params() {
  return {clamp_to(g_HDR_Threshold, kThresholdRange.lo, kThresholdRange.hi),
          clamp_to(g_HDR_CutOff, kCutOffRange.lo, kCutOffRange.hi),
          clamp_to(g_HDR_Weight1, kWeightRange.lo, kWeightRange.hi),
          clamp_to(g_HDR_Weight2, kWeightRange.lo, kWeightRange.hi)};
}

struct Histogram {
  int64_t count[kLevels];  // level 0 is never counted
  int64_t largest;
  int64_t bright;  // pixels of level 50 and above
};

// Counts the lightness levels of n pixels into count[0..100] (level 0 included). The levels of a
// block are worked out first, in a loop the compiler vectorises; the counting is split four ways
// so that a run of one level does not wait on its own increments.
void count_levels_loop(const uint32_t* src, size_t n, uint32_t count[kLevels]) {
  constexpr size_t kBlock = 1024;
  uint32_t split[4][kLevels] = {};
  uint8_t level[kBlock];
  for (size_t start = 0; start < n; start += kBlock) {
    const size_t m = n - start < kBlock ? n - start : kBlock;
    const uint32_t* in = src + start;
    for (size_t i = 0; i < m; ++i) level[i] = static_cast<uint8_t>(level_of(luma_of(in[i])));
    size_t i = 0;
    for (; i + 4 <= m; i += 4) {
      ++split[0][level[i]];
      ++split[1][level[i + 1]];
      ++split[2][level[i + 2]];
      ++split[3][level[i + 3]];
    }
    for (; i < m; ++i) ++split[0][level[i]];
  }
  for (int32_t l = 0; l < kLevels; ++l) {
    count[l] = split[0][l] + split[1][l] + split[2][l] + split[3][l];
  }
}

void count_levels(const uint32_t* src, size_t n, uint32_t count[kLevels]) {
  vector_paths([&] { count_levels_loop(src, n, count); });
}

Histogram measure(const uint32_t* src, size_t n) {
  uint32_t count[kLevels];
  count_levels(src, n, count);
  Histogram h{};
  for (int32_t l = 1; l < kLevels; ++l) {
    h.count[l] = count[l];
    if (h.count[l] > h.largest) h.largest = h.count[l];
    if (l > 49) h.bright += h.count[l];
  }
  return h;
}

// Weighted histogram -> cumulative tone curve -> samples at the even levels, 16 x the curve.
//
// The damping w = 1024 - 1024 ln(1 + H/1024) / ln(2 + M/1024) lies in 0..1024: the logarithm
// never decreases and H <= M, so the first logarithm is at most the second, and the second is at
// least ln 2 (727040), large enough that dropping its low five bits cannot lift the quotient
// past 1024. With a weight of at least 300 the divisor (w + W) >> 6 is therefore at least 4.
void build_curve(const Histogram& h, int64_t pixels, const Params& p,
                 int32_t samples[kCurveSamples]) {
  const int64_t share = ((h.bright * 1024 / pixels) * 100) / 1024;
  const int64_t weight = share < p.threshold ? p.weight1 : p.weight2;
  const int64_t uniform = (pixels >> 8) * weight;
  const int64_t fullest = log_e_FIX_new(static_cast<int32_t>(h.largest + 2048)) >> 5;

  int64_t weighted[kLevels];
  int64_t total = 0;
  for (int32_t i = 0; i < kLevels; ++i) {
    const int64_t a = log_e_FIX_new(static_cast<int32_t>(h.count[i] + 1024));
    const int64_t w = 1024 - (a * 32) / fullest;
    const int64_t f = 1024 / ((w + weight) >> 6);
    weighted[i] = ((w * h.count[i] + uniform) * f) >> 10;
    total += weighted[i];
  }
  if (total < 1024) total = 1024;

  const int64_t unit = total >> 10;
  int64_t running = 0;
  int32_t curve[kLevels];
  for (int32_t i = 0; i < kLevels; ++i) {
    running += weighted[i];
    curve[i] = static_cast<int32_t>((p.cutoff * (running / unit) + 512) >> 10);
  }
  for (int32_t k = 0; k < kCurveSamples; ++k) samples[k] = 16 * curve[2 * k];
}

// New luma of each curve sample, with twenty fraction bits: the sample is a lightness percent
// with four fraction bits, scaled to twenty, and 100 % is a luma of 255. The running total over
// the unit is at most 2047 (the total is at least 1024), so a curve value is at most 200 and a
// new luma at most ((3200 << 16) / 100) x 255 = 534773760, below 2^30.
void new_lumas(const int32_t samples[kCurveSamples], uint32_t new_luma[kCurveSamples]) {
  for (int32_t k = 0; k < kCurveSamples; ++k) {
    new_luma[k] = static_cast<uint32_t>(((int64_t{samples[k]} * 65536) / 100) * 255);
  }
}

// One pixel of the second pass, given its gain (new luma over old, ten fraction bits).
//
// Each channel becomes ((c x 1024) x gain) >> 20, that is (c x gain) >> 10, when no channel
// would pass 255 << 20 before the shift; the strongest channel decides that. Otherwise every
// channel takes the full-scale gain of the strongest. Either way a channel comes out at most 255
// (at most 254 in the second case), so there is nothing left to clamp. All products stay below
// 2^32: a gain is at most 534773760 / 1024.
constexpr uint32_t apply_gain(uint32_t p, uint32_t gain) {
  const uint32_t r = static_cast<uint32_t>(red_of(p)), g = static_cast<uint32_t>(green_of(p)),
                 b = static_cast<uint32_t>(blue_of(p));
  uint32_t top = r > g ? r : g;
  top = top > b ? top : b;
  const uint32_t limited = kFullScaleGain[top];
  const uint32_t k = top * gain > kChannelLimit ? limited : gain;
  return alpha_bits(p) | ((r * k) >> 10) << 16 | ((g * k) >> 10) << 8 | ((b * k) >> 10);
}

// Second pass with the gain table. Each pixel is read before its own word is written, so dst
// may be src.
void map_by_table_loop(const uint32_t* src, uint32_t* dst, size_t n,
                       const uint32_t* __restrict gain) {
  PFX_NO_ALIAS_LOOP
  for (size_t i = 0; i < n; ++i) {
    const uint32_t p = src[i];
    dst[i] = apply_gain(p, gain[luma_of(p)]);
  }
}

void map_by_table(const uint32_t* src, uint32_t* dst, size_t n, const uint32_t* gain) {
  vector_paths([&] { map_by_table_loop(src, dst, n, gain); });
}

// Second pass dividing per pixel, for images too small to pay for the table (or when its memory
// cannot be had).
void map_by_division(const uint32_t* src, uint32_t* dst, size_t n,
                     const uint32_t new_luma[kCurveSamples]) {
  for (size_t i = 0; i < n; ++i) {
    const uint32_t p = src[i];
    const uint32_t y = luma_of(p);
    dst[i] = apply_gain(p, y < kDarkLuma ? kUnitGain : new_luma[level_of(y) >> 1] / y);
  }
}

// The first luma whose curve sample is k or later (kLumas past the last sample).
constexpr uint32_t first_luma_of_sample(int32_t k) {
  uint32_t lo = 0, hi = kLumas;  // the answer lies in lo..hi
  while (lo < hi) {
    const uint32_t mid = lo + (hi - lo) / 2;
    if (level_of(mid) >> 1 >= k) {
      hi = mid;
    } else {
      lo = mid + 1;
    }
  }
  return lo;
}

// The table costs 4 bytes per luma; below this many pixels it would cost more than the 8 bytes
// per pixel the two planes of the first design took, and dividing is cheap anyway.
constexpr int64_t kGainTableBytes = int64_t{kLumas} * 4;
constexpr int64_t kMinPixelsForTable = (kGainTableBytes + 7) / 8;

int32_t process(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (src == nullptr || dst == nullptr) return PHOTOFX_INVALID_ARGUMENT;
  const int64_t n = pixel_count(width, height);
  if (n > kMaxPixels) return PHOTOFX_INVALID_ARGUMENT;
  const Params params = read_params();

  if (width < kMinCurveSide || height < kMinCurveSide) {
    fx_control_contrast_all(src, dst, width, height, kSmallImageContrast);
    return PHOTOFX_SUCCESS;
  }

  const size_t count = static_cast<size_t>(n);
  int32_t samples[kCurveSamples];
  build_curve(measure(src, count), n, params, samples);
  uint32_t new_luma[kCurveSamples];
  new_lumas(samples, new_luma);

  uint32_t* gain = nullptr;
  if (n >= kMinPixelsForTable) gain = static_cast<uint32_t*>(fx_malloc(kLumas, 4));
  if (gain != nullptr) {
    build_gain_table(new_luma, gain);
    map_by_table(src, dst, count, gain);
    fx_free(gain);
  } else {
    map_by_division(src, dst, count, new_luma);
  }
  return PHOTOFX_SUCCESS;
}

}  // namespace

void build_gain_table(const uint32_t new_luma[kCurveSamples], uint32_t* gain) {
  for (uint32_t y = 0; y < kDarkLuma; ++y) gain[y] = kUnitGain;
  for (int32_t k = 0; k < kCurveSamples; ++k) {
    const uint32_t num = new_luma[k];
    uint32_t y = first_luma_of_sample(k);
    const uint32_t end = first_luma_of_sample(k + 1);
    if (y < kDarkLuma) y = kDarkLuma;
    // While num >= y (y - 1) the quotient may fall by more than one per step: divide.
    for (; y < end && uint64_t{y} * (y - 1) <= num; ++y) gain[y] = num / y;
    if (y >= end) continue;
    // From here on num < y (y - 1), so the last quotient q is below y - 1 and the remainder
    // num - q y moves by -q, within (-y, y): at most one correction per step.
    uint32_t q = num / y;
    int64_t r = int64_t{num} - int64_t{q} * y;
    gain[y++] = q;
    for (; y < end; ++y) {
      r -= q;
      if (r < 0) {
        --q;
        r += y;
      }
      gain[y] = q;
    }
  }
}

}  // namespace pfx

extern "C" {

int32_t fx_process_hdr(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  return pfx::process(src, dst, width, height);
}

int32_t applyAutoAdjust(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (src == nullptr || dst == nullptr) return PHOTOFX_INVALID_ARGUMENT;
  return fx_process_hdr(src, dst, width, height);
}

void fx_set_hdr(int32_t threshold, int32_t cutoff, int32_t weight1, int32_t weight2) {
  if (pfx::in_range(threshold, pfx::kThresholdRange)) g_HDR_Threshold = threshold;
  if (pfx::in_range(cutoff, pfx::kCutOffRange)) g_HDR_CutOff = cutoff;
  if (pfx::in_range(weight1, pfx::kWeightRange)) g_HDR_Weight1 = weight1;
  if (pfx::in_range(weight2, pfx::kWeightRange)) g_HDR_Weight2 = weight2;
}

int32_t fx_get_threshold_hdr(void) { return g_HDR_Threshold; }
int32_t fx_get_cutoff_hdr(void) { return g_HDR_CutOff; }
int32_t fx_get_weight1_hdr(void) { return g_HDR_Weight1; }
int32_t fx_get_weight2_hdr(void) { return g_HDR_Weight2; }

}  // extern "C"
