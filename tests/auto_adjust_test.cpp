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
#include "reference/auto_adjust.h"
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

// Every test puts the parameters back as it found them, so these hold in any test order.
TEST(AutoAdjust, ParametersStartAtTheirInitialValues) {
  EXPECT_EQ(fx_get_threshold_hdr(), 70);
  EXPECT_EQ(fx_get_cutoff_hdr(), 100);
  EXPECT_EQ(fx_get_weight1_hdr(), 1000);
  EXPECT_EQ(fx_get_weight2_hdr(), 5120);
}

TEST(AutoAdjust, SetterStoresEachValueOnlyWithinItsRange) {
  SavedParams saved;
  auto params = [] {
    return std::vector<int32_t>{fx_get_threshold_hdr(), fx_get_cutoff_hdr(), fx_get_weight1_hdr(),
                                fx_get_weight2_hdr()};
  };
  fx_set_hdr(200, 50, 100, 9000);
  EXPECT_EQ(params(), (std::vector<int32_t>{70, 50, 1000, 5120}));
  fx_set_hdr(0, 0, 300, 300);
  EXPECT_EQ(params(), (std::vector<int32_t>{0, 0, 300, 300}));
  fx_set_hdr(127, 100, 8196, 8196);
  EXPECT_EQ(params(), (std::vector<int32_t>{127, 100, 8196, 8196}));
  fx_set_hdr(-1, 101, 299, 8197);
  fx_set_hdr(128, -1, INT32_MIN, INT32_MAX);
  EXPECT_EQ(params(), (std::vector<int32_t>{127, 100, 8196, 8196}));
  g_HDR_Weight2 = 4242;  // the getters read the globals themselves
  EXPECT_EQ(fx_get_weight2_hdr(), 4242);
}

TEST(AutoAdjust, ImagesUnder150PixelsEitherWayGetContrast12) {
  for (const auto& [w, h] : {std::pair{149, 1000}, std::pair{1000, 149}, std::pair{3, 2}}) {
    const Pixels img = pfx::test::random_image(w, h, 7);
    Pixels expected(img.size());
    fx_control_contrast_all(img.data(), expected.data(), w, h, 12);
    EXPECT_EQ(process(img, w, h), expected) << w << "x" << h;
  }
  // Empty and negative sizes take the same path and so write nothing.
  uint32_t px = 0x12345678u, out = kUntouched;
  for (const auto& [w, h] : {std::pair{0, 200}, std::pair{200, 0}, std::pair{-1, 1}}) {
    EXPECT_EQ(fx_process_hdr(&px, &out, w, h), PHOTOFX_SUCCESS);
    EXPECT_EQ(applyAutoAdjust(&px, &out, w, h), PHOTOFX_SUCCESS);
  }
  EXPECT_EQ(out, kUntouched);
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

// Dark grey strips (levels 1 to 6) with a few saturated blues. The curve lifts the blues far
// beyond what their luma can carry, so they are scaled to put their strongest channel at 254
// and keep the others in proportion. With weight 1 at 300 the pure blue's gain is so large that
// blue x 1024 x gain passes 2^31: wrapped, it would come out black.
TEST(AutoAdjust, SaturatedColoursHitTheChannelLimitAndStayBright) {
  constexpr uint32_t kGreys[6] = {3, 6, 8, 11, 13, 16};
  Pixels img(150 * 150);
  for (size_t y = 0; y < 150; ++y) {
    for (size_t x = 0; x < 150; ++x) {
      const bool saturated = y < 6 && x < 10;
      img[y * 150 + x] = saturated ? (x % 2 ? argb(0x7F, 40, 0, 255) : argb(0x7F, 0, 0, 255))
                                   : grey(0xFF, kGreys[x / 25 < 5 ? x / 25 : 5]);
    }
  }
  struct Case {
    int32_t weight1;
    uint32_t greys[6];
  };
  for (const Case& c :
       {Case{1000, {2, 35, 35, 71, 71, 104}}, Case{300, {0, 68, 68, 135, 135, 201}}}) {
    SavedParams saved;
    fx_set_hdr(70, 100, c.weight1, 5120);
    const Pixels out = process(img, 150, 150);
    EXPECT_EQ(out[0], argb(0x7F, 0, 0, 254)) << c.weight1;
    EXPECT_EQ(out[1], argb(0x7F, 39, 0, 254)) << c.weight1;
    for (size_t s = 0; s < 6; ++s) {
      EXPECT_EQ(out[149 * 150 + 25 * s], grey(0xFF, c.greys[s])) << c.weight1 << " strip " << s;
    }
  }
}

// With cut-off 0 the curve is flat at 0: every pixel with a luma of at least 1 turns black, the
// darker ones are copied as they are; alpha stays either way.
TEST(AutoAdjust, CutOffZeroBlackensAllButTheDarkestPixels) {
  SavedParams saved;
  fx_set_hdr(70, 0, 1000, 5120);
  Pixels img = pfx::test::random_image(150, 150, 11);
  const uint32_t darkest[] = {0x40000000u, 0xFF000003u, 0x12010000u, 0x80000100u, 0x01010001u};
  for (size_t i = 0; i < 5; ++i) img[i * 1000] = darkest[i];
  const Pixels out = process(img, 150, 150);
  for (size_t i = 0; i < img.size(); ++i) {
    const uint32_t p = img[i];
    const uint32_t luma = 218 * ((p >> 16) & 255) + 732 * ((p >> 8) & 255) + 74 * (p & 255);
    ASSERT_EQ(out[i], luma < 1024 ? p : p & 0xFF000000u) << i;
  }
  // An all-black image has an empty histogram and comes back unchanged.
  fx_set_hdr(70, 100, 1000, 5120);
  const Pixels black(160 * 150, 0x7F000000u);
  EXPECT_EQ(process(black, 160, 150), black);
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

// The gain table holds new_luma / luma for every luma, whatever the curve: every new luma a curve
// sample can give (a curve value of 0 to 200) is tried on every luma, and so are rising curves.
TEST(AutoAdjustGain, TableMatchesDivisionForEveryNumeratorAndLuma) {
  std::vector<uint32_t> gain(pfx::kLumas);
  uint32_t new_luma[pfx::kCurveSamples];
  auto check = [&](const char* what) {
    pfx::build_gain_table(new_luma, gain.data());
    for (uint32_t y = 0; y < pfx::kLumas; ++y) {
      const uint32_t want = y < 1024 ? 1024u : new_luma[pfx::level_of(y) / 2] / y;
      ASSERT_EQ(gain[y], want) << what << " luma " << y;
    }
  };
  for (int64_t value = 0; value <= 200; ++value) {
    const auto n = static_cast<uint32_t>(((16 * value * 65536) / 100) * 255);
    for (uint32_t& v : new_luma) v = n;
    check("flat");
  }
  pfx::test::Rng rng(12);
  for (int rising = 0; rising < 8; ++rising) {
    int64_t value = 0;
    for (uint32_t& v : new_luma) {
      value += rng.between(0, 8);
      v = static_cast<uint32_t>(((16 * value * 65536) / 100) * 255);
    }
    check("rising");
  }
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

// The fast passes against the plain two-pass form with its planes and per-pixel division: on
// noise with random alpha, on images that hold every luma, at awkward sizes on both sides of the
// table threshold, under extreme parameters, into a second buffer and in place.
TEST(AutoAdjust, MatchesTheReferenceForm) {
  // Every luma from dark to full, as grey-ish ramps plus channel noise.
  auto ramps = [](int32_t w, int32_t h, uint64_t seed) {
    pfx::test::Rng rng(seed);
    Pixels img(static_cast<size_t>(w) * h);
    for (size_t i = 0; i < img.size(); ++i) {
      const uint32_t base = static_cast<uint32_t>(i * 256 / img.size());
      const uint32_t r = base ^ (rng.word() & 7), g = base ^ (rng.word() & 3);
      img[i] = argb(rng.word() >> 24, r, g, (i % 5 == 0) ? 255 : base ^ (rng.word() & 15));
    }
    return img;
  };
  struct Case {
    int32_t w, h;
    bool noise;
    pfx::reference::AutoParams p;
  };
  const Case cases[] = {
      {150, 150, true, {70, 100, 1000, 5120}}, {151, 157, false, {0, 100, 300, 300}},
      {509, 257, true, {70, 100, 1000, 5120}}, {512, 300, false, {127, 100, 8196, 8196}},
      {1021, 151, true, {50, 60, 300, 8196}},  {362, 361, false, {70, 0, 1000, 5120}},
      {257, 509, false, {30, 1, 4000, 2000}},  {150, 871, true, {127, 37, 300, 300}},
  };
  for (const Case& c : cases) {
    SavedParams saved;
    fx_set_hdr(c.p.threshold, c.p.cutoff, c.p.weight1, c.p.weight2);
    const Pixels img = c.noise ? pfx::test::random_image(c.w, c.h, uint64_t(c.w) * c.h)
                               : ramps(c.w, c.h, uint64_t(c.w) + c.h);
    Pixels want(img.size());
    pfx::reference::auto_adjust(img.data(), want.data(), c.w, c.h, c.p);
    EXPECT_EQ(process(img, c.w, c.h), want) << c.w << "x" << c.h;
    Pixels in_place = img;
    EXPECT_EQ(fx_process_hdr(in_place.data(), in_place.data(), c.w, c.h), PHOTOFX_SUCCESS);
    EXPECT_EQ(in_place, want) << c.w << "x" << c.h << " in place";
  }
}

}  // namespace
