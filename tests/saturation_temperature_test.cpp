// Saturation and temperature: the worked values, the level table of the chroma shifts, the ends
// of the slider and levels far beyond them.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

uint32_t saturation(uint32_t p, int32_t level) {
  uint32_t out = 0;
  fx_control_saturation_all(&p, &out, 1, 1, level);
  return out;
}

uint32_t temperature(uint32_t p, int32_t level) {
  uint32_t out = 0;
  fx_control_temperature_all(&p, &out, 1, 1, level);
  return out;
}

Pixels saturated(const Pixels& img, int32_t w, int32_t h, int32_t level) {
  Pixels out(img.size());
  fx_control_saturation_all(img.data(), out.data(), w, h, level);
  return out;
}

Pixels warmed(const Pixels& img, int32_t w, int32_t h, int32_t level) {
  Pixels out(img.size());
  fx_control_temperature_all(img.data(), out.data(), w, h, level);
  return out;
}

TEST(Saturation, NeutralLevelChangesNothing) {
  const Pixels img = pfx::test::random_image(32, 8, 1);
  EXPECT_EQ(saturated(img, 32, 8, 10), img);
}

TEST(Saturation, LevelZeroIsTheWeightedGrey) {
  EXPECT_EQ(saturation(0xFFFF0000u, 0), 0xFF4E4E4Eu);
  EXPECT_EQ(saturation(0xFF3366CCu, 0), 0xFF5E5E5Eu);
  const Pixels img = pfx::test::random_image(16, 16, 2);
  const Pixels out = saturated(img, 16, 16, 0);
  for (size_t i = 0; i < img.size(); ++i) {
    const uint32_t p = img[i];
    const uint32_t grey = (316 * ((p >> 16) & 255) + 624 * ((p >> 8) & 255) + 84 * (p & 255)) >> 10;
    ASSERT_EQ(out[i], (p & 0xFF000000u) | grey * 0x010101u) << i;
  }
}

TEST(Saturation, AboveNeutralPushesAwayFromGreyAndHoldsTheChannels) {
  EXPECT_EQ(saturation(0xFFFF0000u, 20), 0xFFFF0000u);
  // Level 15: the grey weights are negative (rounded toward minus infinity), blue overshoots
  // to 258 and is held at 255.
  EXPECT_EQ(saturation(0xFF3366CCu, 15), 0xFF1C69FFu);
  EXPECT_EQ(saturation(0x20808080u, 20), 0x20808080u);
}

TEST(Saturation, LevelsBeyondTheEndsActLikeTheEnds) {
  const Pixels img = pfx::test::random_image(16, 16, 3);
  const Pixels grey = saturated(img, 16, 16, 0);
  const Pixels vivid = saturated(img, 16, 16, 20);
  EXPECT_NE(grey, vivid);
  for (int32_t level : {-1, -5, -1000, INT32_MIN}) EXPECT_EQ(saturated(img, 16, 16, level), grey);
  for (int32_t level : {21, 25, 1000, INT32_MAX}) EXPECT_EQ(saturated(img, 16, 16, level), vivid);
  EXPECT_NE(saturated(img, 16, 16, 19), vivid);
  EXPECT_NE(saturated(img, 16, 16, 1), grey);
}

TEST(Temperature, WarmsAboveAndCoolsBelowNeutral) {
  EXPECT_EQ(temperature(0xFF808080u, 20), 0xFFA3794Au);
  EXPECT_EQ(temperature(0xFF808080u, 0), 0xFF5C88B5u);
  EXPECT_EQ(temperature(0xFF808080u, 10), 0xFF808080u);
  EXPECT_EQ(temperature(0x33808080u, 20), 0x33A3794Au);
}

TEST(Temperature, NeutralLevelStillMakesTheYCbCrRoundTrip) {
  EXPECT_EQ(temperature(0xFFFF0000u, 10), 0xFFFE0000u);
  EXPECT_EQ(temperature(0xFF0000FFu, 10), 0xFF0000FDu);
  EXPECT_EQ(temperature(0xFFFFFFFFu, 10), 0xFFFFFFFFu);
}

// The signed chroma shifts per level, as the slider documents them. On mid grey (luma 128,
// chroma 0) they show directly in the converted-back channels.
TEST(Temperature, ChromaShiftsFollowTheLevelTable) {
  constexpr int32_t kCb[21] = {30, 27, 24, 21,  18,  15,  12,  9,   6,   3,  0,
                               -3, -6, -9, -12, -15, -18, -21, -24, -27, -30};
  constexpr int32_t kCr[21] = {-25, -22, -20, -17, -15, -12, -10, -7, -5, -2, 0,
                               3,   5,   8,   10,  13,  15,  18,  20, 23, 25};
  for (int32_t level = 0; level <= 20; ++level) {
    const int32_t cb = kCb[level], cr = kCr[level];
    const int32_t r = 128 + ((359 * cr) >> 8);
    const int32_t g = 128 - ((88 * cb + 183 * cr) >> 8);
    const int32_t b = 128 + ((454 * cb) >> 8);
    EXPECT_EQ(temperature(0xFF808080u, level), pfx::test::argb(255, r, g, b)) << level;
  }
}

// Holding the level at 1000 steps from neutral is exact only if every colour is already pinned
// there; check all of them, then that levels further out give the same pinned colours.
TEST(Temperature, ThousandStepsFromNeutralPinEveryColour) {
  Pixels img(256 * 256), hot(img.size()), cold(img.size());
  for (uint32_t r = 0; r < 256; ++r) {
    for (uint32_t i = 0; i < img.size(); ++i) img[i] = 0xFF000000u | r << 16 | i;
    fx_control_temperature_all(img.data(), hot.data(), 256, 256, 1010);
    fx_control_temperature_all(img.data(), cold.data(), 256, 256, -990);
    for (uint32_t i = 0; i < img.size(); ++i) {
      ASSERT_EQ(hot[i], 0xFFFF0000u) << std::hex << img[i];
      ASSERT_EQ(cold[i], 0xFF00FFFFu) << std::hex << img[i];
    }
  }
}

TEST(Temperature, LevelsFarBeyondTheSliderStayPinned) {
  const Pixels img = pfx::test::random_image(16, 16, 4);
  for (int32_t level : {1011, 5000, INT32_MAX}) {
    const Pixels out = warmed(img, 16, 16, level);
    for (size_t i = 0; i < img.size(); ++i) ASSERT_EQ(out[i], (img[i] & 0xFF000000u) | 0xFF0000u);
  }
  for (int32_t level : {-991, -5000, INT32_MIN}) {
    const Pixels out = warmed(img, 16, 16, level);
    for (size_t i = 0; i < img.size(); ++i) ASSERT_EQ(out[i], (img[i] & 0xFF000000u) | 0x00FFFFu);
  }
}

}  // namespace
