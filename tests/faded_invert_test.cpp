// Faded colour and invert: worked values and the level range. Missing buffers and masks are refused
// in bad_input_test.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Mask;
using pfx::test::Pixels;

uint32_t faded(uint32_t p, int32_t level) {
  uint32_t out = 0;
  EXPECT_EQ(fx_control_fadedcolor_all(&p, &out, 1, 1, level), PHOTOFX_SUCCESS);
  return out;
}

TEST(FadedColour, FullFadeMapsIntoTheNarrowRanges) {
  EXPECT_EQ(faded(0xFF123456u, 0), 0xFF123456u);
  EXPECT_EQ(faded(0xFF000000u, 100), 0xFF683448u);  // 104, 52, 72
  EXPECT_EQ(faded(0xFFFFFFFFu, 100), 0xFFF5F0B3u);  // 245, 240, 179
  EXPECT_EQ(faded(0x40808080u, 100), 0x40AE927Du);
  EXPECT_EQ(faded(0xFF000000u, 50), 0xFF341A24u);
}

TEST(FadedColour, LevelsOutsideZeroToHundredAreRefused) {
  const Pixels img = pfx::test::random_image(5, 5, 2);
  const Mask mask(img.size(), 1);
  Pixels dst(img.size(), 0x5A5A5A5Au);
  const Pixels before = dst;
  for (int32_t level : {-1, 101, INT32_MIN, INT32_MAX}) {
    EXPECT_EQ(fx_control_fadedcolor_all(img.data(), dst.data(), 5, 5, level),
              PHOTOFX_INVALID_ARGUMENT);
    EXPECT_EQ(fx_control_fadedcolor(img.data(), mask.data(), dst.data(), 5, 5, level, 0, 4, 0, 4),
              PHOTOFX_INVALID_ARGUMENT);
    controlFadedColour(img.data(), dst.data(), 5, 5, level);
  }
  EXPECT_EQ(dst, before);
}

TEST(Invert, FlipsTheColourChannelsAndKeepsAlpha) {
  uint32_t p = 0x80123456u, out = 0;
  EXPECT_EQ(fx_apply_invert_all(&p, &out, 1, 1), PHOTOFX_SUCCESS);
  EXPECT_EQ(out, 0x80EDCBA9u);
  const Pixels img = pfx::test::random_image(17, 6, 3);
  Pixels twice = img;
  EXPECT_EQ(fx_apply_invert_all(twice.data(), twice.data(), 17, 6), PHOTOFX_SUCCESS);
  EXPECT_EQ(fx_apply_invert_all(twice.data(), twice.data(), 17, 6), PHOTOFX_SUCCESS);
  EXPECT_EQ(twice, img);
}

}  // namespace
