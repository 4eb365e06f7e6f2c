// Brightness and contrast: the worked values, the contrast step table, the slider ends and
// levels far outside them. Both frames are covered in adjust_frames_test.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>

#include "adjust/brightness_contrast.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

// Contrast of a grey pixel, reduced to the one channel value.
int32_t contrast(int32_t c, int32_t level) {
  uint32_t p = 0xFF000000u | static_cast<uint32_t>(c * 0x010101), out = 0;
  fx_control_contrast_all(&p, &out, 1, 1, level);
  return static_cast<int32_t>(out & 0xFF);
}

TEST(Brightness, ExtremeLevelsSaturateWithoutOverflow) {
  const Pixels img = pfx::test::random_image(16, 16, 1);
  Pixels out(img.size()), ref(img.size());
  fx_control_brightness_all(img.data(), ref.data(), 16, 16, 1010);
  for (int32_t level : {INT32_MAX, 1 << 28, 5000}) {
    fx_control_brightness_all(img.data(), out.data(), 16, 16, level);
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
}

// Low levels draw toward the middle without crossing it; levels far out act like the ends.
TEST(Contrast, ChannelsStayOnTheirSideOfMidAtEveryLevel) {
  for (int32_t c = 0; c < 256; ++c) {
    for (int32_t level = -30; level <= 50; ++level) {
      const int32_t out = contrast(c, level);
      EXPECT_TRUE(c <= 127 ? out >= 0 && out <= 128 : out >= 128 && out <= 255)
          << c << " " << level;
    }
    EXPECT_EQ(contrast(c, INT32_MAX), contrast(c, 1010)) << c;
    EXPECT_EQ(contrast(c, INT32_MIN), 128) << c;
  }
}

}  // namespace
