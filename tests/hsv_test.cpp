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

Hsv to_hsv(Rgb c) {
  Hsv x{};
  fx_rgb2hsv(c.r, c.g, c.b, &x.h, &x.s, &x.v);
  return x;
}

Rgb to_rgb(Hsv c) {
  Rgb x{-1, -1, -1};
  fx_hsv2rgb(c.h, c.s, c.v, &x.r, &x.g, &x.b);
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
}

// Ties go to red, then green; hue can reach 360; channels outside 0..255 are held to the tables.
TEST(RgbToHsv, WorkedColours) {
  const struct {
    Rgb in;
    Hsv out;
  } kCases[] = {
      {{0, 0, 0}, {0, 0, 0}},
      {{128, 128, 128}, {0, 0, 128}},
      {{255, 0, 0}, {0, 65535, 255}},
      {{0, 255, 0}, {120, 65535, 255}},
      {{0, 0, 255}, {240, 65535, 255}},
      {{255, 255, 0}, {60, 65535, 255}},
      {{0, 255, 255}, {180, 65535, 255}},
      {{255, 0, 1}, {360, 65535, 255}},
      {{51, 102, 204}, {220, 49113, 204}},
      {{200, 100, 50}, {20, 49050, 200}},
      {{300, -5, 0}, {0, 65535, 255}},
      {{INT32_MIN, INT32_MAX, 7}, to_hsv({0, 255, 7})},
  };
  for (const auto& c : kCases) EXPECT_EQ(to_hsv(c.in), c.out) << c.in.r << "," << c.in.g;
}

// Sectors start just above multiples of sixty; hues outside the circle give black.
TEST(HsvToRgb, WorkedColours) {
  const struct {
    Hsv in;
    Rgb out;
  } kCases[] = {
      {{60, 65536, 255}, {255, 255, 0}},   {{61, 65536, 255}, {251, 255, 0}},
      {{0, 65536, 255}, {255, 0, 0}},      {{360, 65536, 255}, {255, 0, 0}},
      {{220, 49113, 204}, {51, 102, 204}}, {{20, 49050, 200}, {200, 100, 50}},
      {{361, 65536, 255}, {0, 0, 0}},      {{-1, 0, 100}, {0, 0, 0}},
      {{-1, 100, 100}, {0, 0, 0}},         {{5, 0, 100}, {100, 100, 100}},
  };
  for (const auto& c : kCases) EXPECT_EQ(to_rgb(c.in), c.out) << c.in.h << "," << c.in.s;
  // Absurd arguments: the colours are meaningless, but the sanitizer build checks that nothing
  // overflows on the way.
  to_rgb({INT32_MAX, INT32_MIN, INT32_MAX});
  to_rgb({INT32_MIN, INT32_MAX, INT32_MIN});
  to_rgb({359, INT32_MIN, 255});
}

TEST(HsvRoundTrip, NoChannelMovesByMoreThanThree) {
  int changed = 0, total = 0;
  for (int32_t r = 0; r < 256; r += 3) {
    for (int32_t g = 0; g < 256; g += 3) {
      for (int32_t b = 0; b < 256; b += 3) {
        const Rgb back = to_rgb(to_hsv({r, g, b}));
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
