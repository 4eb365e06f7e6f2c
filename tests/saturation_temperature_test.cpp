// Saturation and temperature: the worked values, the chroma shifts per level, and every colour
// pinned where levels far beyond the slider are held.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

using FullFn = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t, int32_t);

uint32_t one(FullFn fn, uint32_t p, int32_t level) {
  uint32_t out = 0;
  fn(&p, &out, 1, 1, level);
  return out;
}

TEST(SaturationTemperature, WorkedValues) {
  const struct {
    FullFn fn;
    uint32_t in;
    int32_t level;
    uint32_t out;
  } kCases[] = {
      {fx_control_saturation_all, 0xFF123456u, 10, 0xFF123456u},  // neutral
      {fx_control_saturation_all, 0xFFFF0000u, 0, 0xFF4E4E4Eu},   // the weighted grey
      {fx_control_saturation_all, 0xFF3366CCu, 0, 0xFF5E5E5Eu},
      {fx_control_saturation_all, 0xFFFF0000u, 20, 0xFFFF0000u},
      // Level 15: the grey weights are negative (rounded toward minus infinity), blue overshoots
      // to 258 and is held at 255.
      {fx_control_saturation_all, 0xFF3366CCu, 15, 0xFF1C69FFu},
      {fx_control_saturation_all, 0x20808080u, 20, 0x20808080u},
      {fx_control_temperature_all, 0xFF808080u, 20, 0xFFA3794Au},  // warmer
      {fx_control_temperature_all, 0xFF808080u, 0, 0xFF5C88B5u},   // cooler
      {fx_control_temperature_all, 0x33808080u, 20, 0x33A3794Au},
      // The neutral level still makes the YCbCr round trip.
      {fx_control_temperature_all, 0xFFFF0000u, 10, 0xFFFE0000u},
      {fx_control_temperature_all, 0xFF0000FFu, 10, 0xFF0000FDu},
      {fx_control_temperature_all, 0xFFFFFFFFu, 10, 0xFFFFFFFFu},
  };
  for (const auto& c : kCases) EXPECT_EQ(one(c.fn, c.in, c.level), c.out) << std::hex << c.in;
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
    EXPECT_EQ(one(fx_control_temperature_all, 0xFF808080u, level), pfx::test::argb(255, r, g, b))
        << level;
  }
}

// Holding the level at 1000 steps from neutral is exact only if every colour is already pinned
// there; check all of them.
TEST(Temperature, ThousandStepsFromNeutralPinEveryColour) {
  Pixels img(256 * 256), out(img.size());
  const struct {
    int32_t level;
    uint32_t colour;
  } kEnds[] = {{1010, 0xFF0000u}, {-990, 0x00FFFFu}};
  for (uint32_t r = 0; r < 256; ++r) {
    for (uint32_t i = 0; i < img.size(); ++i) img[i] = (i & 0xFF) << 24 | r << 16 | i;
    for (const auto& e : kEnds) {
      fx_control_temperature_all(img.data(), out.data(), 256, 256, e.level);
      for (uint32_t i = 0; i < img.size(); ++i) {
        ASSERT_EQ(out[i], (img[i] & 0xFF000000u) | e.colour) << std::hex << img[i];
      }
    }
  }
}

}  // namespace
