// Auto adjust: the parameters and their ranges, the small-image path, tone curves on images built
// so that each rule shows in the pixels (the weight picked by the bright share, the channel
// limit, the cut-off), exact arithmetic on an image large enough to overflow 32 bits, its gain
// table and the plain reference form. Refusals, in-place use and a missing gain table are in the
// bad-input and allocation-failure tables.
#include <gtest/gtest.h>

#include <cstdint>
#include <utility>
#include <vector>

#include "auto/auto_adjust.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Pixels;

constexpr uint32_t kUntouched = 0xA5A5A5A5u;

// Puts the four parameters back as they were, whatever the test stored in them.
class SavedParams {
 public:
  SavedParams() : t_(g_HDR_Threshold), c_(g_HDR_CutOff), w1_(g_HDR_Weight1), w2_(g_HDR_Weight2) {}
  ~SavedParams() {
    g_HDR_Threshold = t_;
    g_HDR_CutOff = c_;
    g_HDR_Weight1 = w1_;
    g_HDR_Weight2 = w2_;
  }

 private:
  int32_t t_, c_, w1_, w2_;
};

uint32_t grey(uint32_t alpha, uint32_t c) { return argb(alpha, c, c, c); }

Pixels process(const Pixels& img, int32_t w, int32_t h) {
  Pixels out(img.size(), kUntouched);
  EXPECT_EQ(fx_process_hdr(img.data(), out.data(), w, h), PHOTOFX_SUCCESS);
  return out;
}

// The bright share counts levels 50 and up and is truncated twice, so 70 % of such pixels make
// a share of 69, below the initial threshold (weight 1), and 71 % a share of 70 (weight 2).
// Grey 128 is level 50, grey 127 level 49; 150 x 150 takes the tone-curve path.
TEST(AutoAdjust, BrightShareAtTheThresholdSwitchesToWeight2) {
  struct Case {
    int32_t bright_pixels;
    uint32_t bright_out, dark_out;
  };
  for (const Case& c : {Case{15750, 168, 84}, Case{15975, 137, 117}}) {
    Pixels img(150 * 150, grey(0x80, 127));
    for (int32_t i = 0; i < c.bright_pixels; ++i) img[static_cast<size_t>(i)] = grey(0xFF, 128);
    const Pixels out = process(img, 150, 150);
    EXPECT_EQ(out.front(), grey(0xFF, c.bright_out)) << c.bright_pixels;
    EXPECT_EQ(out.back(), grey(0x80, c.dark_out)) << c.bright_pixels;
  }
}

// 2048 x 1025 pixels, all of them bright: the bright count times 1024 passes 2^31, and with
// weight 2 at 300 so does the weighted count of the darker band. The two colours are the whole
// image, so the expected pixels are few; each would change if either sum wrapped.
TEST(AutoAdjust, LargeImagesKeepEveryProductExact) {
  constexpr int32_t W = 2048, H = 1025, kBandRows = 100;
  SavedParams saved;
  fx_set_hdr(70, 100, 8196, 300);
  Pixels img(static_cast<size_t>(W) * H, argb(0xFF, 230, 190, 120));
  for (size_t i = static_cast<size_t>(W) * (H - kBandRows); i < img.size(); ++i) {
    img[i] = argb(0x40, 170, 140, 90);
  }
  EXPECT_EQ(fx_process_hdr(img.data(), img.data(), W, H), PHOTOFX_SUCCESS);
  EXPECT_EQ(img.front(), argb(0xFF, 245, 202, 128));
  EXPECT_EQ(img.back(), argb(0x40, 103, 84, 54));
  EXPECT_EQ(img[static_cast<size_t>(W) * (H - kBandRows) - 1], img.front());
  EXPECT_EQ(img[static_cast<size_t>(W) * (H - kBandRows)], img.back());
}

// A host may store any value in the globals directly; each counts as the nearer end of its
// range, so no weight can zero a divisor and no cut-off can overflow the curve.
TEST(AutoAdjust, ParametersStoredOutOfRangeCountAsTheNearerEnd) {
  const Pixels img = pfx::test::random_image(150, 152, 9);
  SavedParams saved;
  auto with = [&](int32_t t, int32_t c, int32_t w1, int32_t w2) {
    g_HDR_Threshold = t, g_HDR_CutOff = c, g_HDR_Weight1 = w1, g_HDR_Weight2 = w2;
    return process(img, 150, 152);
  };
  EXPECT_EQ(with(-5, INT32_MAX, 0, INT32_MIN), with(0, 100, 300, 300));
  EXPECT_EQ(with(INT32_MAX, -7, INT32_MAX, -1), with(127, 0, 8196, 300));
  EXPECT_EQ(with(200, 101, 8197, 299), with(127, 100, 8196, 300));
}

// The rules behind the luma shortcuts: the lightness level of a luma is the level of the
// twenty-bit luma, and the full-scale gain puts the strongest channel on 254.
TEST(AutoAdjustGain, LevelsAndFullScaleGainsFollowTheirRules) {
  for (uint32_t y = 0; y < pfx::kLumas; ++y) {
    const int64_t y20 = int64_t{y} * 1024;
    ASSERT_EQ(pfx::level_of(y), ((y20 / 255) * 100) >> 20) << y;
  }
  EXPECT_EQ(pfx::level_of(pfx::kLargestLuma), 100);
  for (uint32_t c = 0; c < 256; ++c) {
    ASSERT_EQ(pfx::kFullScaleGain[c], 0xFF00000u / (c * 1024 + 1)) << c;
    if (c > 0) {
      EXPECT_EQ((c * pfx::kFullScaleGain[c]) >> 10, 254u) << c;
    }
  }
}

}  // namespace
