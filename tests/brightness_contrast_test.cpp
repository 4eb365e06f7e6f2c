// Brightness and contrast: the worked values, the contrast step table, the slider ends and
// levels far outside them.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>

#include "adjust/brightness_contrast.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

uint32_t brightness(uint32_t p, int32_t level) {
  uint32_t out = 0;
  fx_control_brightness_all(&p, &out, 1, 1, level);
  return out;
}

uint32_t contrast(uint32_t p, int32_t level) {
  uint32_t out = 0;
  fx_control_contrast_all(&p, &out, 1, 1, level);
  return out;
}

// Contrast of a grey pixel, reduced to the one channel value.
int32_t contrast_channel(int32_t c, int32_t level) {
  const uint32_t grey = 0xFF000000u | static_cast<uint32_t>(c * 0x010101);
  return static_cast<int32_t>(contrast(grey, level) & 0xFF);
}

TEST(Brightness, MovesLumaTenPerStep) {
  EXPECT_EQ(brightness(0xFF808080u, 10), 0xFF808080u);
  EXPECT_EQ(brightness(0xFF808080u, 20), 0xFFE4E4E4u);
  EXPECT_EQ(brightness(0xFF808080u, 0), 0xFF1C1C1Cu);
}

TEST(Brightness, KeepsAlphaAndLosesAStepOnSaturatedColours) {
  EXPECT_EQ(brightness(0x80FFFFFFu, 10), 0x80FFFFFFu);
  EXPECT_EQ(brightness(0xFFFF0000u, 10), 0xFFFE0000u);
  EXPECT_EQ(brightness(0xFF0000FFu, 10), 0xFF0000FDu);
  EXPECT_EQ(brightness(0xFF00FF00u, 10), 0xFF00FF00u);
  EXPECT_EQ(brightness(0x00000000u, 10), 0x00000000u);
}

TEST(Brightness, ExtremeLevelsSaturateWithoutOverflow) {
  const Pixels img = pfx::test::random_image(16, 16, 1);
  Pixels out(img.size()), ref(img.size());
  for (int32_t level : {INT32_MAX, 1 << 28, 5000}) {
    fx_control_brightness_all(img.data(), out.data(), 16, 16, level);
    fx_control_brightness_all(img.data(), ref.data(), 16, 16, 1010);
    EXPECT_EQ(out, ref) << level;
  }
  fx_control_brightness_all(img.data(), out.data(), 16, 16, INT32_MIN);
  for (size_t i = 0; i < img.size(); ++i) EXPECT_EQ(out[i], img[i] & 0xFF000000u);
}

TEST(Contrast, StepTableIsTheTenthRoundedAwayFromZero) {
  for (int32_t c = 0; c < 256; ++c) {
    const double exact = (c - 128) / 10.0;
    const int32_t expected = static_cast<int32_t>(c < 128 ? std::floor(exact) : std::ceil(exact));
    EXPECT_EQ(pfx::kContrastStep[c], expected) << c;
  }
  EXPECT_EQ(pfx::kContrastStep[7], -13);
  EXPECT_EQ(pfx::kContrastStep[8], -12);
  EXPECT_EQ(pfx::kContrastStep[248], 12);
  EXPECT_EQ(pfx::kContrastStep[249], 13);
}

TEST(Contrast, NeutralLevelChangesNothing) {
  const Pixels img = pfx::test::random_image(32, 8, 2);
  Pixels out(img.size());
  fx_control_contrast_all(img.data(), out.data(), 32, 8, 10);
  EXPECT_EQ(out, img);
}

TEST(Contrast, LevelTwentyPushesAwayFromTheMiddle) {
  EXPECT_EQ(contrast_channel(200, 20), 255);
  EXPECT_EQ(contrast_channel(50, 20), 0);
  EXPECT_EQ(contrast_channel(128, 20), 128);
  EXPECT_EQ(contrast_channel(127, 20), 117);
}

TEST(Contrast, LowLevelsDrawTowardTheMiddleWithoutCrossingIt) {
  EXPECT_EQ(contrast_channel(200, 0), 128);
  EXPECT_EQ(contrast_channel(50, 0), 128);
  EXPECT_EQ(contrast_channel(0, 1), 117);
  EXPECT_EQ(contrast_channel(255, 1), 138);
  const Pixels img = pfx::test::random_image(16, 16, 3);
  Pixels out(img.size());
  fx_control_contrast_all(img.data(), out.data(), 16, 16, 0);
  for (size_t i = 0; i < img.size(); ++i) EXPECT_EQ(out[i], (img[i] & 0xFF000000u) | 0x808080u);
}

TEST(Contrast, ChannelsStayOnTheirSideOfMidAtEveryLevel) {
  for (int32_t level = -30; level <= 50; ++level) {
    for (int32_t c = 0; c < 256; ++c) {
      const int32_t out = contrast_channel(c, level);
      if (c <= 127) {
        EXPECT_TRUE(out >= 0 && out <= 128) << c << " at " << level;
      } else {
        EXPECT_TRUE(out >= 128 && out <= 255) << c << " at " << level;
      }
    }
  }
}

TEST(Contrast, ExtremeLevelsMatchTheSaturatedSlider) {
  for (int32_t c = 0; c < 256; ++c) {
    EXPECT_EQ(contrast_channel(c, INT32_MAX), contrast_channel(c, 1010)) << c;
    EXPECT_EQ(contrast_channel(c, INT32_MIN), 128) << c;
  }
}

TEST(BrightnessContrast, FullVariantsWorkInPlace) {
  const Pixels img = pfx::test::random_image(13, 7, 4);
  for (auto* fn : {&fx_control_brightness_all, &fx_control_contrast_all}) {
    Pixels out(img.size());
    fn(img.data(), out.data(), 13, 7, 17);
    Pixels in_place = img;
    fn(in_place.data(), in_place.data(), 13, 7, 17);
    EXPECT_EQ(in_place, out);
  }
}

TEST(BrightnessContrast, PartialSelectedPixelsMatchTheFullVariant) {
  const Pixels img = pfx::test::random_image(9, 9, 5);
  const auto mask = pfx::test::random_mask(9, 9, 6);
  Pixels full(img.size()), part(img.size());
  fx_control_contrast_all(img.data(), full.data(), 9, 9, 16);
  controlContrastPartial(img.data(), mask.data(), part.data(), 9, 9, 16, 0, 8, 0, 8);
  for (size_t i = 0; i < img.size(); ++i) EXPECT_EQ(part[i], mask[i] == 1 ? full[i] : img[i]);
  fx_control_brightness_all(img.data(), full.data(), 9, 9, 3);
  controlBrightnessPartial(img.data(), mask.data(), part.data(), 9, 9, 3, 1, 0, 0, 8);
  EXPECT_EQ(part, full);
}

TEST(BrightnessContrast, EntryPointsForwardToTheImplementations) {
  const Pixels img = pfx::test::random_image(5, 4, 9);
  Pixels a(img.size()), b(img.size());
  controlBrightness(img.data(), a.data(), 5, 4, 6);
  fx_control_brightness_all(img.data(), b.data(), 5, 4, 6);
  EXPECT_EQ(a, b);
  controlContrast(img.data(), a.data(), 5, 4, 13);
  fx_control_contrast_all(img.data(), b.data(), 5, 4, 13);
  EXPECT_EQ(a, b);
}

}  // namespace
