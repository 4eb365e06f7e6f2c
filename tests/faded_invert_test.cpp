// Faded colour and invert: worked values, the blend staying between a channel and its faded
// target, and the argument checks with the destination untouched on refusal.
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

TEST(FadedColour, LevelZeroChangesNothing) {
  const Pixels img = pfx::test::random_image(19, 11, 1);
  Pixels out(img.size());
  EXPECT_EQ(fx_control_fadedcolor_all(img.data(), out.data(), 19, 11, 0), PHOTOFX_SUCCESS);
  EXPECT_EQ(out, img);
}

TEST(FadedColour, FullFadeMapsIntoTheNarrowRanges) {
  EXPECT_EQ(faded(0xFF000000u, 100), 0xFF683448u);  // 104, 52, 72
  EXPECT_EQ(faded(0xFFFFFFFFu, 100), 0xFFF5F0B3u);  // 245, 240, 179
  EXPECT_EQ(faded(0x40808080u, 100), 0x40AE927Du);
  EXPECT_EQ(faded(0xFF000000u, 50), 0xFF341A24u);
}

// Each channel lands between its own value and its faded target (k c + o) / 255, and moves
// toward the target as the level grows.
TEST(FadedColour, BlendStaysBetweenTheChannelAndItsTarget) {
  struct Line {
    int32_t shift, k, o;
  };
  constexpr Line kLines[3] = {{16, 141, 26520}, {8, 188, 13260}, {0, 107, 18360}};
  for (int32_t c = 0; c < 256; ++c) {
    const uint32_t grey = 0xFF000000u | static_cast<uint32_t>(c) * 0x010101u;
    int32_t previous[3] = {c, c, c};
    for (int32_t level = 0; level <= 100; ++level) {
      const uint32_t out = faded(grey, level);
      for (int ch = 0; ch < 3; ++ch) {
        const Line& l = kLines[ch];
        const int32_t v = static_cast<int32_t>((out >> l.shift) & 255);
        const int32_t target = (l.k * c + l.o) / 255;
        const int32_t lo = c < target ? c : target, hi = c < target ? target : c;
        ASSERT_TRUE(v >= lo && v <= hi) << c << " level " << level << " channel " << ch;
        ASSERT_TRUE(target >= c ? v >= previous[ch] : v <= previous[ch])
            << c << " level " << level << " channel " << ch;
        previous[ch] = v;
      }
    }
  }
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
  EXPECT_EQ(fx_control_fadedcolor_all(img.data(), dst.data(), 5, 5, 100), PHOTOFX_SUCCESS);
  EXPECT_EQ(fx_control_fadedcolor(img.data(), mask.data(), dst.data(), 5, 5, 0, 0, 4, 0, 4),
            PHOTOFX_SUCCESS);
}

TEST(Invert, FlipsTheColourChannelsAndKeepsAlpha) {
  uint32_t p = 0x80123456u, out = 0;
  EXPECT_EQ(fx_apply_invert_all(&p, &out, 1, 1), PHOTOFX_SUCCESS);
  EXPECT_EQ(out, 0x80EDCBA9u);
  const Pixels img = pfx::test::random_image(17, 6, 3);
  Pixels twice = img;
  EXPECT_EQ(fx_apply_invert_all(twice.data(), twice.data(), 17, 6), PHOTOFX_SUCCESS);
  EXPECT_NE(twice, img);
  EXPECT_EQ(fx_apply_invert_all(twice.data(), twice.data(), 17, 6), PHOTOFX_SUCCESS);
  EXPECT_EQ(twice, img);
}

// Both partial variants refuse a null mask even when the bounds would select the whole image.
TEST(FadedInvert, NullBuffersAndMasksAreRefusedAndNothingIsWritten) {
  const Pixels img = pfx::test::random_image(4, 3, 4);
  const Mask mask(img.size(), 1);
  Pixels dst(img.size(), 0x5A5A5A5Au);
  const Pixels before = dst;
  constexpr int32_t kBad = PHOTOFX_INVALID_ARGUMENT;
  uint32_t* const d = dst.data();
  EXPECT_EQ(fx_control_fadedcolor_all(nullptr, d, 4, 3, 50), kBad);
  EXPECT_EQ(fx_control_fadedcolor_all(img.data(), nullptr, 4, 3, 50), kBad);
  EXPECT_EQ(fx_control_fadedcolor(nullptr, mask.data(), d, 4, 3, 50, 1, 0, 0, 0), kBad);
  EXPECT_EQ(fx_control_fadedcolor(img.data(), nullptr, d, 4, 3, 50, 1, 0, 0, 0), kBad);
  EXPECT_EQ(fx_control_fadedcolor(img.data(), mask.data(), nullptr, 4, 3, 50, 1, 0, 0, 0), kBad);
  EXPECT_EQ(fx_apply_invert_all(nullptr, d, 4, 3), kBad);
  EXPECT_EQ(fx_apply_invert_all(img.data(), nullptr, 4, 3), kBad);
  EXPECT_EQ(fx_apply_invert(nullptr, mask.data(), d, 4, 3, 1, 0, 0, 0), kBad);
  EXPECT_EQ(fx_apply_invert(img.data(), nullptr, d, 4, 3, 1, 0, 0, 0), kBad);
  EXPECT_EQ(fx_apply_invert(img.data(), mask.data(), nullptr, 4, 3, 1, 0, 0, 0), kBad);
  controlFadedColourPartial(img.data(), nullptr, d, 4, 3, 50, 1, 0, 0, 0);
  applyInvertPartial(img.data(), nullptr, d, 4, 3, 1, 0, 0, 0);
  applyInvert(nullptr, d, 4, 3);
  EXPECT_EQ(dst, before);
  EXPECT_EQ(fx_apply_invert(img.data(), mask.data(), d, 4, 3, 1, 0, 0, 0), PHOTOFX_SUCCESS);
}

}  // namespace
