// HSV conversion: the reciprocal tables, the worked colours, sector edges and the round trip.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstdlib>

#include "photofx.h"

namespace {

struct Hsv {
  int32_t h, s, v;
  bool operator==(const Hsv&) const = default;
};
struct Rgb {
  int32_t r, g, b;
  bool operator==(const Rgb&) const = default;
};

Hsv to_hsv(int32_t r, int32_t g, int32_t b) {
  Hsv x{};
  fx_rgb2hsv(r, g, b, &x.h, &x.s, &x.v);
  return x;
}

Rgb to_rgb(int32_t h, int32_t s, int32_t v) {
  Rgb x{-1, -1, -1};
  fx_hsv2rgb(h, s, v, &x.r, &x.g, &x.b);
  return x;
}

void PrintTo(const Hsv& x, std::ostream* os) { *os << x.h << "," << x.s << "," << x.v; }
void PrintTo(const Rgb& x, std::ostream* os) { *os << x.r << "," << x.g << "," << x.b; }

TEST(HsvTables, AreTheTruncatedReciprocals) {
  EXPECT_EQ(LUT_DELTA[0], 0u);
  EXPECT_EQ(LUT_DELTA2[0], 0u);
  for (uint32_t i = 1; i < 256; ++i) {
    const uint32_t expected = static_cast<uint32_t>(65536.0 / i);  // truncation of the quotient
    EXPECT_EQ(LUT_DELTA[i], expected) << i;
    EXPECT_EQ(LUT_DELTA2[i], 60 * expected) << i;
  }
  EXPECT_EQ(LUT_DELTA[3], 21845u);
  EXPECT_EQ(LUT_DELTA[255], 257u);
  EXPECT_EQ(LUT_DELTA2[1], 3932160u);
  EXPECT_EQ(LUT_DELTA2[255], 15420u);
}

TEST(RgbToHsv, GreysAndPrimaries) {
  EXPECT_EQ(to_hsv(0, 0, 0), (Hsv{0, 0, 0}));
  EXPECT_EQ(to_hsv(128, 128, 128), (Hsv{0, 0, 128}));
  EXPECT_EQ(to_hsv(255, 0, 0), (Hsv{0, 65535, 255}));
  EXPECT_EQ(to_hsv(0, 255, 0), (Hsv{120, 65535, 255}));
  EXPECT_EQ(to_hsv(0, 0, 255), (Hsv{240, 65535, 255}));
}

TEST(RgbToHsv, TiesGoToRedThenGreenAndHueCanReach360) {
  EXPECT_EQ(to_hsv(255, 255, 0).h, 60);
  EXPECT_EQ(to_hsv(0, 255, 255).h, 180);
  EXPECT_EQ(to_hsv(255, 0, 1), (Hsv{360, 65535, 255}));
}

TEST(RgbToHsv, OutOfRangeChannelsAreHeldToTheTables) {
  EXPECT_EQ(to_hsv(300, -5, 0), to_hsv(255, 0, 0));
  EXPECT_EQ(to_hsv(INT32_MIN, INT32_MAX, 7), to_hsv(0, 255, 7));
}

TEST(HsvToRgb, SectorBoundariesSitAboveMultiplesOfSixty) {
  EXPECT_EQ(to_rgb(60, 65536, 255), (Rgb{255, 255, 0}));
  EXPECT_EQ(to_rgb(61, 65536, 255), (Rgb{251, 255, 0}));
  EXPECT_EQ(to_rgb(360, 65536, 255), to_rgb(0, 65536, 255));
  EXPECT_EQ(to_rgb(0, 65536, 255), (Rgb{255, 0, 0}));
}

TEST(HsvToRgb, HuesOutsideTheCircleGiveBlack) {
  EXPECT_EQ(to_rgb(361, 65536, 255), (Rgb{0, 0, 0}));
  EXPECT_EQ(to_rgb(-1, 0, 100), (Rgb{0, 0, 0}));
  EXPECT_EQ(to_rgb(-1, 100, 100), (Rgb{0, 0, 0}));
  EXPECT_EQ(to_rgb(5, 0, 100), (Rgb{100, 100, 100}));
}

TEST(HsvToRgb, AbsurdArgumentsDoNotOverflow) {
  // Only meant to run clean under the sanitizers; the colours are meaningless.
  to_rgb(INT32_MAX, INT32_MIN, INT32_MAX);
  to_rgb(INT32_MIN, INT32_MAX, INT32_MIN);
  to_rgb(359, INT32_MIN, 255);
  SUCCEED();
}

TEST(HsvRoundTrip, WorkedColoursComeBackUnchanged) {
  EXPECT_EQ(to_hsv(51, 102, 204), (Hsv{220, 49113, 204}));
  EXPECT_EQ(to_rgb(220, 49113, 204), (Rgb{51, 102, 204}));
  EXPECT_EQ(to_hsv(200, 100, 50), (Hsv{20, 49050, 200}));
  EXPECT_EQ(to_rgb(20, 49050, 200), (Rgb{200, 100, 50}));
}

TEST(HsvRoundTrip, NoChannelMovesByMoreThanThree) {
  int changed = 0, total = 0;
  for (int32_t r = 0; r < 256; r += 3) {
    for (int32_t g = 0; g < 256; g += 3) {
      for (int32_t b = 0; b < 256; b += 3) {
        const Hsv x = to_hsv(r, g, b);
        const Rgb back = to_rgb(x.h, x.s, x.v);
        ASSERT_LE(std::abs(back.r - r), 3) << r << "," << g << "," << b;
        ASSERT_LE(std::abs(back.g - g), 3) << r << "," << g << "," << b;
        ASSERT_LE(std::abs(back.b - b), 3) << r << "," << g << "," << b;
        changed += !(back == Rgb{r, g, b});
        ++total;
      }
    }
  }
  // A little under half of all colours come back changed.
  EXPECT_GT(changed, total / 3);
  EXPECT_LT(changed, total / 2);
}

}  // namespace
