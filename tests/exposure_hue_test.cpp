// Exposure and hue: worked values, result codes with the destination untouched on refusal,
// exposure's own masked mode, and levels far beyond the slider.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Mask;
using pfx::test::Pixels;

uint32_t exposure(uint32_t p, int32_t level) {
  uint32_t out = 0;
  EXPECT_EQ(fx_control_exposure_all(&p, &out, 1, 1, level), PHOTOFX_SUCCESS);
  return out;
}

uint32_t hue(uint32_t p, int32_t level) {
  uint32_t out = 0;
  EXPECT_EQ(fx_control_hue_all(&p, &out, 1, 1, level), PHOTOFX_SUCCESS);
  return out;
}

Pixels hue_image(const Pixels& img, int32_t w, int32_t h, int32_t level) {
  Pixels out(img.size());
  EXPECT_EQ(fx_control_hue_all(img.data(), out.data(), w, h, level), PHOTOFX_SUCCESS);
  return out;
}

TEST(ExposureHue, NeutralLevelsChangeNothing) {
  const Pixels img = pfx::test::random_image(31, 9, 1);
  Pixels out(img.size());
  EXPECT_EQ(fx_control_exposure_all(img.data(), out.data(), 31, 9, 10), PHOTOFX_SUCCESS);
  EXPECT_EQ(out, img);
  EXPECT_EQ(hue_image(img, 31, 9, 10), img);
}

TEST(Exposure, ScalesEachChannelRoundingHalvesUp) {
  EXPECT_EQ(exposure(0xFF01FF00u, 5), 0xFF018000u);   // 0.5 -> 1, 127.5 -> 128
  EXPECT_EQ(exposure(0xFF808080u, 20), 0xFFFFFFFFu);  // 256 held at 255
  EXPECT_EQ(exposure(0x7F123456u, 0), 0x7F000000u);   // black, alpha kept
  EXPECT_EQ(exposure(0xFF0A6464u, 7), 0xFF074646u);   // factor 45875: 7.0 and 69.99
}

TEST(Exposure, NegativeLevelsGiveBlack) {
  for (int32_t level : {-1, -10, INT32_MIN}) EXPECT_EQ(exposure(0x40FFFFFFu, level), 0x40000000u);
}

// Beyond the slider the channel products no longer fit 32 bits; they saturate to white like
// every brighter exposure instead of wrapping into arbitrary colours.
TEST(Exposure, LevelsFarAboveTheSliderSaturate) {
  EXPECT_EQ(exposure(0xFF0180FFu, 1285), 0xFF81FFFFu);
  EXPECT_EQ(exposure(0xFF0180FFu, 1286), 0xFF81FFFFu);
  EXPECT_EQ(exposure(0xFF0180FFu, 2000), 0xFFC8FFFFu);  // 1 x 200
  for (int32_t level : {3277, 100000, INT32_MAX}) {
    EXPECT_EQ(exposure(0xFF0180FFu, level), 0xFFFFFFFFu) << level;
    EXPECT_EQ(exposure(0xFF000100u, level), 0xFF00FF00u) << level;
  }
}

// Valid bounds only switch masked mode on: a selected pixel is edited wherever it lies.
TEST(Exposure, MaskedModeEditsSelectedPixelsOutsideTheBounds) {
  const Pixels img = pfx::test::filled(6, 4, 0xFF404040u);
  const Mask all(img.size(), 1);
  Pixels out(img.size());
  EXPECT_EQ(fx_control_exposure(img.data(), all.data(), out.data(), 6, 4, 20, 0, 0, 0, 0),
            PHOTOFX_SUCCESS);
  EXPECT_EQ(out, pfx::test::filled(6, 4, 0xFF808080u));

  Mask some(img.size(), 0);
  some[23] = 1;
  some[5] = 2;
  EXPECT_EQ(fx_control_exposure(img.data(), some.data(), out.data(), 6, 4, 20, 0, 0, 0, 0),
            PHOTOFX_SUCCESS);
  for (size_t i = 0; i < out.size(); ++i) EXPECT_EQ(out[i], i == 23 ? 0xFF808080u : 0xFF404040u);
}

TEST(ExposureHue, NullBuffersAreRefusedAndNothingIsWritten) {
  const Pixels img = pfx::test::random_image(4, 3, 2);
  const Mask mask(img.size(), 1);
  Pixels dst(img.size(), 0x5A5A5A5Au);
  const Pixels before = dst;
  constexpr int32_t kBad = PHOTOFX_INVALID_ARGUMENT;
  EXPECT_EQ(fx_control_exposure_all(nullptr, dst.data(), 4, 3, 12), kBad);
  EXPECT_EQ(fx_control_exposure_all(img.data(), nullptr, 4, 3, 12), kBad);
  EXPECT_EQ(fx_control_exposure(nullptr, mask.data(), dst.data(), 4, 3, 12, 1, 0, 0, 0), kBad);
  EXPECT_EQ(fx_control_exposure(img.data(), mask.data(), nullptr, 4, 3, 12, 1, 0, 0, 0), kBad);
  EXPECT_EQ(fx_control_hue_all(nullptr, dst.data(), 4, 3, 12), kBad);
  EXPECT_EQ(fx_control_hue_all(img.data(), nullptr, 4, 3, 12), kBad);
  EXPECT_EQ(fx_control_hue(nullptr, mask.data(), dst.data(), 4, 3, 12, 1, 0, 0, 0), kBad);
  EXPECT_EQ(fx_control_hue(img.data(), mask.data(), nullptr, 4, 3, 12, 1, 0, 0, 0), kBad);
  // Masked mode needs the mask; whole-image mode never reads it.
  EXPECT_EQ(fx_control_exposure(img.data(), nullptr, dst.data(), 4, 3, 12, 0, 3, 0, 2), kBad);
  EXPECT_EQ(fx_control_hue(img.data(), nullptr, dst.data(), 4, 3, 12, 0, 3, 0, 2), kBad);
  // Entry points swallow the code and must not crash either.
  controlExposure(nullptr, dst.data(), 4, 3, 12);
  controlHue(nullptr, dst.data(), 4, 3, 12);
  controlExposurePartial(nullptr, mask.data(), dst.data(), 4, 3, 12, 1, 0, 0, 0);
  controlHuePartial(nullptr, mask.data(), dst.data(), 4, 3, 12, 1, 0, 0, 0);
  EXPECT_EQ(dst, before);

  EXPECT_EQ(fx_control_exposure(img.data(), nullptr, dst.data(), 4, 3, 12, 1, 0, 0, 0),
            PHOTOFX_SUCCESS);
  EXPECT_EQ(fx_control_hue(img.data(), nullptr, dst.data(), 4, 3, 12, 1, 0, 0, 0), PHOTOFX_SUCCESS);
  EXPECT_EQ(fx_control_hue_all(img.data(), dst.data(), 4, 0, 12), PHOTOFX_SUCCESS);
}

TEST(Hue, HalfTurnTakesRedToCyanFromEitherEnd) {
  EXPECT_EQ(hue(0xFFFF0000u, 20), 0xFF00FFFFu);
  EXPECT_EQ(hue(0xFFFF0000u, 0), 0xFF00FFFFu);
  EXPECT_EQ(hue(0x80FF0000u, 20), 0x8000FFFFu);
}

TEST(Hue, GreysKeepTheirValueAtEverySliderLevel) {
  for (int32_t level = 0; level <= 20; ++level) {
    EXPECT_EQ(hue(0xFF808080u, level), 0xFF808080u) << level;
    EXPECT_EQ(hue(0x10FFFFFFu, level), 0x10FFFFFFu) << level;
  }
}

TEST(Hue, StepsTurnBy18Degrees) {
  // Green (hue 120) one step up is 138 degrees; five steps down is 30 degrees.
  EXPECT_EQ(hue(0xFF00FF00u, 11), 0xFF00FF4Cu);
  EXPECT_EQ(hue(0xFF00FF00u, 5), 0xFFFF8000u);
}

// A turn of more than a full circle is corrected once, which leaves the hue outside 0..360: every
// coloured pixel turns black from 41 steps up, greys keep their value; from 41 steps down
// everything is black. Levels further out must give exactly the same.
TEST(Hue, LevelsFarBeyondTheSliderAreStable) {
  const Pixels img = pfx::test::random_image(16, 16, 3);
  const Pixels up = hue_image(img, 16, 16, 51);
  const Pixels down = hue_image(img, 16, 16, -31);
  for (size_t i = 0; i < img.size(); ++i) {
    const uint32_t p = img[i];
    const bool grey = ((p >> 16) & 255) == ((p >> 8) & 255) && ((p >> 8) & 255) == (p & 255);
    EXPECT_EQ(up[i], grey ? p : (p & 0xFF000000u)) << i;
    EXPECT_EQ(down[i], p & 0xFF000000u) << i;
  }
  for (int32_t level : {60, 110, 1000, INT32_MAX}) EXPECT_EQ(hue_image(img, 16, 16, level), up);
  for (int32_t level : {-40, -90, -1000, INT32_MIN}) {
    EXPECT_EQ(hue_image(img, 16, 16, level), down);
  }
  EXPECT_EQ(hue(0xFF808080u, 51), 0xFF808080u);
  EXPECT_EQ(hue(0xFF808080u, -31), 0xFF000000u);
  EXPECT_EQ(hue(0xFFFF0000u, 40), 0xFF00FFFFu);  // 540 degrees, corrected once to 180
  EXPECT_EQ(hue(0xFFFF0000u, 50), 0xFFFF0000u);  // 720 corrected to 360, which paints as 0
}

}  // namespace
