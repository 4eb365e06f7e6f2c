// Auto adjust: a one-touch tone mapping driven by the image's own lightness histogram.
//
// The first pass measures each pixel's luma and lightness (percent, 20 fraction bits) and counts
// the lightness levels 1..100. From the counts comes an equalising tone curve: each level's
// weight is its count damped by the logarithm of that count against the largest one, plus a
// uniform weight chosen by how much of the image is already bright. The second pass maps each
// pixel's lightness through the curve (sampled at even levels) and scales red, green and blue by
// the ratio of new to old luma; where that would push a channel past 255 the pixel is scaled so
// its strongest channel lands on 254 instead, which keeps saturated colours bright and their
// hue intact. Images under 150 pixels in either direction get a fixed contrast boost instead.
//
// Counts reach the pixel count of the image, so the bright share, the weighted histogram and the
// per-pixel gains are formed in 64 bits: a few megapixels already carry them past 2^31.
//
// Four module-wide parameters tune the curve; fx_set_hdr changes them within their ranges.
#include <cstddef>
#include <cstdint>

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

constexpr int32_t kLevels = 101;              // lightness levels 0..100
constexpr int32_t kSamples = 51;              // the curve at the even levels
constexpr int64_t kChannelLimit = 0xFF00000;  // 255 with 20 fraction bits
constexpr int32_t kFullLightness = 100 << 20;

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

// Weighted histogram -> cumulative tone curve -> samples at the even levels, 16 x the curve.
//
// The damping w = 1024 - 1024 ln(1 + H/1024) / ln(2 + M/1024) lies in 0..1024: the logarithm
// never decreases and H <= M, so the first logarithm is at most the second, and the second is at
// least ln 2 (727040), large enough that dropping its low five bits cannot lift the quotient
// past 1024. With a weight of at least 300 the divisor (w + W) >> 6 is therefore at least 4.
void build_curve(const Histogram& h, int64_t pixels, const Params& p, int32_t samples[kSamples]) {
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
  for (int32_t k = 0; k < kSamples; ++k) samples[k] = 16 * curve[2 * k];
}

// Luma with 20 fraction bits (weights 218, 732, 74 of 1024) and lightness in percent, likewise.
constexpr int32_t luma_of(uint32_t p) {
  return 218 * 1024 * red_of(p) + 732 * 1024 * green_of(p) + 74 * 1024 * blue_of(p);
}
constexpr int32_t lightness_of(int32_t luma) { return (luma / 255) * 100; }

// One pixel of the second pass.
uint32_t map_pixel(uint32_t p, int32_t luma, int32_t lightness, const int32_t samples[kSamples]) {
  if ((luma >> 20) == 0) return p;  // too dark to carry a ratio
  int64_t v;
  if (lightness == 0) {
    v = 0;
  } else if (lightness <= kFullLightness) {
    v = int64_t{samples[lightness >> 21]} * 65536;
  } else {
    v = kFullLightness;
  }
  const int64_t new_luma = (v / 100) * 255;
  const int64_t gain = new_luma / (luma >> 10);
  const int64_t r = int64_t{red_of(p)} * 1024, g = int64_t{green_of(p)} * 1024,
                b = int64_t{blue_of(p)} * 1024;
  int64_t out_r, out_g, out_b;
  if (r * gain <= kChannelLimit && g * gain <= kChannelLimit && b * gain <= kChannelLimit) {
    out_r = (r * gain) >> 20;
    out_g = (g * gain) >> 20;
    out_b = (b * gain) >> 20;
  } else {
    // The strongest channel sets the largest gain every channel can take.
    int64_t limit = kChannelLimit / (r + 1);
    const int64_t limit_g = kChannelLimit / (g + 1), limit_b = kChannelLimit / (b + 1);
    if (limit_g < limit) limit = limit_g;
    if (limit_b < limit) limit = limit_b;
    out_r = (limit * r) >> 20;
    out_g = (limit * g) >> 20;
    out_b = (limit * b) >> 20;
  }
  auto settle = [](int64_t c) -> int32_t { return c > 254 ? 255 : (c < 0 ? 0 : int32_t(c)); };
  return pack(p, settle(out_r), settle(out_g), settle(out_b));
}

int32_t process(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (src == nullptr || dst == nullptr) return PHOTOFX_INVALID_ARGUMENT;
  const int64_t n = pixel_count(width, height);
  if (n > kMaxPixels) return PHOTOFX_INVALID_ARGUMENT;
  const Params params = read_params();

  if (width < kMinCurveSide || height < kMinCurveSide) {
    fx_control_contrast_all(src, dst, width, height, kSmallImageContrast);
    return PHOTOFX_SUCCESS;
  }

  auto* luma = static_cast<int32_t*>(fx_calloc(static_cast<uint32_t>(n), 4));
  if (luma == nullptr) return PHOTOFX_OUT_OF_MEMORY;
  auto* lightness = static_cast<int32_t*>(fx_calloc(static_cast<uint32_t>(n), 4));
  if (lightness == nullptr) {
    fx_free(luma);
    return PHOTOFX_OUT_OF_MEMORY;
  }

  Histogram h{};
  const size_t count = static_cast<size_t>(n);
  for (size_t i = 0; i < count; ++i) {
    const int32_t y = luma_of(src[i]);
    const int32_t l = lightness_of(y);
    luma[i] = y;
    lightness[i] = l;
    const int32_t level = l >> 20;
    if (level == 0) continue;
    if (++h.count[level] > h.largest) h.largest = h.count[level];
    if (level > 49) ++h.bright;
  }

  int32_t samples[kSamples];
  build_curve(h, n, params, samples);

  // Each pixel is read before its own destination word is written, so dst may be src.
  for (size_t i = 0; i < count; ++i) dst[i] = map_pixel(src[i], luma[i], lightness[i], samples);

  fx_free(lightness);
  fx_free(luma);
  return PHOTOFX_SUCCESS;
}

}  // namespace
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
