// Exposure and hue: worked values, exposure's own masked mode, and levels far beyond the slider.
// Missing buffers and masks are refused in bad_input_test.
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

Pixels hue_image(const Pixels& img, int32_t level) {
  Pixels out(img.size());
  EXPECT_EQ(fx_control_hue_all(img.data(), out.data(), 16, 16, level), PHOTOFX_SUCCESS);
  return out;
}

struct Case {
  uint32_t in;
  int32_t level;
  uint32_t out;
};

// Beyond the slider the channel products no longer fit 32 bits; they saturate to white like
// every brighter exposure instead of wrapping into arbitrary colours.
TEST(Exposure, ScalesEachChannelRoundingHalvesUpAndSaturatesFarAboveTheSlider) {
  const Case kCases[] = {
      {0xFF01FF00u, 5, 0xFF018000u},   // 0.5 -> 1, 127.5 -> 128
      {0xFF808080u, 20, 0xFFFFFFFFu},  // 256 held at 255
      {0x7F123456u, 0, 0x7F000000u},   // black, alpha kept
      {0xFF0A6464u, 7, 0xFF074646u},   // factor 45875: 7.0 and 69.99
      {0xFF123456u, 10, 0xFF123456u},  // neutral
      {0x40FFFFFFu, -1, 0x40000000u},     {0x40FFFFFFu, INT32_MIN, 0x40000000u},
      {0xFF0180FFu, 1285, 0xFF81FFFFu},   {0xFF0180FFu, 1286, 0xFF81FFFFu},
      {0xFF0180FFu, 2000, 0xFFC8FFFFu},  // 1 x 200
      {0xFF0180FFu, 3277, 0xFFFFFFFFu},   {0xFF000100u, 3277, 0xFF00FF00u},
      {0xFF0180FFu, 100000, 0xFFFFFFFFu}, {0xFF000100u, INT32_MAX, 0xFF00FF00u},
  };
  for (const Case& c : kCases) EXPECT_EQ(exposure(c.in, c.level), c.out) << c.level;
}

// Valid bounds only switch masked mode on: a selected pixel is edited wherever it lies.
TEST(Exposure, MaskedModeEditsSelectedPixelsOutsideTheBounds) {
  const Pixels img = pfx::test::filled(6, 4, 0xFF404040u);
  Mask some(img.size(), 0);
  some[23] = 1;
  some[5] = 2;
  Pixels out(img.size());
  EXPECT_EQ(fx_control_exposure(img.data(), some.data(), out.data(), 6, 4, 20, 0, 0, 0, 0),
            PHOTOFX_SUCCESS);
  for (size_t i = 0; i < out.size(); ++i) EXPECT_EQ(out[i], i == 23 ? 0xFF808080u : 0xFF404040u);
}

TEST(Hue, WorkedTurns) {
  const Case kCases[] = {
      {0xFFFF0000u, 20, 0xFF00FFFFu},
      {0xFFFF0000u, 0, 0xFF00FFFFu},  // half a turn either way
      {0x80FF0000u, 20, 0x8000FFFFu},
      {0xFF00FF00u, 11, 0xFF00FF4Cu},  // green to 138 degrees
      {0xFF00FF00u, 5, 0xFFFF8000u},   // and to 30
      {0xFF00FF00u, 10, 0xFF00FF00u},
      {0xFFFF0000u, 40, 0xFF00FFFFu},  // 540 degrees, corrected once to 180
      {0xFFFF0000u, 50, 0xFFFF0000u},  // 720 corrected to 360, which paints as 0
      {0xFF808080u, 51, 0xFF808080u},
      {0xFF808080u, -31, 0xFF000000u},
  };
  for (const Case& c : kCases) EXPECT_EQ(hue(c.in, c.level), c.out) << c.level;
  for (int32_t level = 0; level <= 20; ++level) {
    EXPECT_EQ(hue(0xFF808080u, level), 0xFF808080u) << level;
    EXPECT_EQ(hue(0x10FFFFFFu, level), 0x10FFFFFFu) << level;
  }
}

// A turn of more than a full circle is corrected once, which leaves the hue outside 0..360: every
// coloured pixel turns black from 41 steps up, greys keep their value; from 41 steps down
// everything is black. Levels further out must give exactly the same.
TEST(Hue, LevelsFarBeyondTheSliderAreStable) {
  const Pixels img = pfx::test::random_image(16, 16, 3);
  const Pixels up = hue_image(img, 51), down = hue_image(img, -31);
  for (size_t i = 0; i < img.size(); ++i) {
    const uint32_t p = img[i];
    const bool grey = ((p >> 16) & 255) == ((p >> 8) & 255) && ((p >> 8) & 255) == (p & 255);
    EXPECT_EQ(up[i], grey ? p : (p & 0xFF000000u)) << i;
    EXPECT_EQ(down[i], p & 0xFF000000u) << i;
  }
  for (int32_t level : {60, 110, 1000, INT32_MAX}) EXPECT_EQ(hue_image(img, level), up);
  for (int32_t level : {-40, -90, -1000, INT32_MIN}) EXPECT_EQ(hue_image(img, level), down);
}

}  // namespace
