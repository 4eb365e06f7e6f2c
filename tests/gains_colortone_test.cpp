// Channel gains and colour tone: worked values, sliders far beyond their range, the brightness
// curve of colour tone and its hue range.
#include <gtest/gtest.h>

#include <cstdint>
#include <iterator>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

uint32_t gains(uint32_t p, int32_t red, int32_t green, int32_t blue) {
  uint32_t out = 0;
  fx_adjust_RGB_all(&p, &out, 1, 1, red, green, blue);
  return out;
}

uint32_t tone(uint32_t p, int32_t hue) {
  uint32_t out = 0;
  EXPECT_EQ(fx_change_colortone(&p, &out, 1, 1, hue), PHOTOFX_SUCCESS);
  return out;
}

// One step moves its channel by six and the others by three. The offsets are exact whatever the
// sliders: in the first far case red and green run off to opposite extremes, and the terms they
// add to blue nearly cancel, leaving 3 x 21.
TEST(ChannelGains, WorkedValuesAndSlidersFarBeyondTheRange) {
  const struct {
    uint32_t in;
    int32_t r, g, b;
    uint32_t out;
  } kCases[] = {
      {0xFF808080u, 20, 10, 10, 0xFFBC6262u},
      {0xFF808080u, 0, 10, 10, 0xFF449E9Eu},
      {0xFF808080u, 10, 11, 10, 0xFF7D867Du},
      {0xFF808080u, 10, 10, 9, 0xFF83837Au},
      {0x11FF0000u, 20, 10, 10, 0x11FF0000u},  // held at 255 and at 0
      {0xFF102030u, INT32_MAX, INT32_MIN, 10, 0xFFFF006Fu},
      {0xFF102030u, 10, 10, INT32_MAX, 0xFF0000FFu},
      {0xFF102030u, 10 + 43, 10, 10, 0xFFFF0000u},  // offset 258: red held
      {0xFF102030u, 10 - 42, 10, 10, 0xFF009EAEu},  // offset -252 on red, +126 others
  };
  for (const auto& c : kCases) EXPECT_EQ(gains(c.in, c.r, c.g, c.b), c.out) << c.r << c.g << c.b;
}

TEST(ChannelGains, EqualSlidersChangeNothingAtAnyLevel) {
  const Pixels img = pfx::test::random_image(21, 13, 1);
  for (int32_t level : {0, 10, 20, -7, 99999, INT32_MIN, INT32_MAX}) {
    Pixels out(img.size());
    fx_adjust_RGB_all(img.data(), out.data(), 21, 13, level, level, level);
    EXPECT_EQ(out, img) << level;
  }
}

TEST(ColourTone, PaintsOneHueAtThreeTenthsSaturation) {
  EXPECT_EQ(tone(0xFF808080u, 0), 0xFF805A5Au);
  EXPECT_EQ(tone(0xFF808080u, 360), 0xFF805A5Au);
  EXPECT_EQ(tone(0xFFFFFFFFu, 30), 0xFFFFD9B3u);
  for (int32_t hue : {0, 77, 200, 360}) EXPECT_EQ(tone(0x80000000u, hue), 0x80000000u) << hue;
  // Only the largest channel matters.
  const uint32_t expected = tone(0xFF909090u, 123) & 0x00FFFFFFu;
  for (uint32_t p : {0xFF900000u, 0xFF009000u, 0x40000090u, 0xFF901090u, 0x00458890u}) {
    EXPECT_EQ(tone(p, 123), (p & 0xFF000000u) | expected) << std::hex << p;
  }
}

// At hue 0 the red channel is the curved value itself.
TEST(ColourTone, BrightnessCurveDarkensShadowsAndLightensHighlights) {
  constexpr int32_t kIn[] = {0, 1, 50, 100, 127, 128, 150, 199, 200, 255};
  constexpr int32_t kOut[] = {0, 0, 34, 89, 126, 128, 162, 254, 255, 255};
  for (size_t i = 0; i < std::size(kIn); ++i) {
    const uint32_t grey = 0xFF000000u | static_cast<uint32_t>(kIn[i]) * 0x010101u;
    EXPECT_EQ(static_cast<int32_t>((tone(grey, 0) >> 16) & 255), kOut[i]) << kIn[i];
  }
}

TEST(ColourTone, HuesOutsideTheCircleAreRefusedAndNothingIsWritten) {
  const Pixels img = pfx::test::random_image(4, 3, 3);
  Pixels dst(img.size(), 0x5A5A5A5Au);
  const Pixels before = dst;
  for (int32_t hue : {-1, 361, INT32_MIN, INT32_MAX}) {
    EXPECT_EQ(fx_change_colortone(img.data(), dst.data(), 4, 3, hue), PHOTOFX_INVALID_ARGUMENT);
  }
  EXPECT_EQ(dst, before);
}

}  // namespace
