// Bilinear sampling and the fast arctangent: the ATAN table against <cmath>, the blend's
// weights and truncation, and FATAN2 in every quadrant and on the axes.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

constexpr uint32_t kDeg = 524288;  // one degree in warp-angle units
constexpr uint32_t k45 = 0x1680000u, k90 = 0x2D00000u, k180 = 0x5A00000u, k270 = 0x8700000u,
                   k360 = 0xB400000u;

TEST(AtanTable, EveryEntryIsTheRoundedArctangentInDegreesTimes2To19) {
  constexpr double kPi = 3.14159265358979323846;
  for (int32_t i = 0; i < 2048; ++i) {
    const double exact = std::atan(i / 2048.0) * (180.0 / kPi) * 524288.0;
    // A value this close to a half would make the double recomputation itself untrustworthy.
    ASSERT_GT(std::fabs(exact - std::floor(exact) - 0.5), 1e-6) << i;
    EXPECT_EQ(ATAN[i], static_cast<int32_t>(std::llround(exact))) << i;
  }
  EXPECT_EQ(ATAN[1891], 22396285);  // 22396284.50007 to 60 digits, the entry closest to a half
}

uint32_t blend(uint32_t fx, uint32_t fy, uint32_t p00, uint32_t p10, uint32_t p01, uint32_t p11) {
  uint32_t out = 0xDEADBEEFu;
  const uint32_t r = Bilinear_Fixed(fx, fy, &p00, &p10, &p01, &p11, &out);
  EXPECT_EQ(r, out);
  return r;
}

TEST(Bilinear, CornerWeightsPickOneNeighbourWithOpaqueAlpha) {
  const uint32_t a = 0x10203040u, b = 0x80506070u, c = 0x00A0B0C0u, d = 0x7FD0E0F0u;
  EXPECT_EQ(blend(0, 0, a, b, c, d), 0xFF203040u);
  EXPECT_EQ(blend(2048, 0, a, b, c, d), 0xFF506070u);
  EXPECT_EQ(blend(0, 2048, a, b, c, d), 0xFFA0B0C0u);
  EXPECT_EQ(blend(2048, 2048, a, b, c, d), 0xFFD0E0F0u);
}

TEST(Bilinear, BlendTruncatesEachChannel) {
  const uint32_t black = 0xFF000000u, white = 0xFFFFFFFFu;
  EXPECT_EQ(blend(1024, 1024, black, white, white, black), 0xFF7F7F7Fu);
  // Red 3 to 4 across x at a quarter: 3.25 truncates to 3; blue 0 to 255 down y at 3/4: 191.25.
  EXPECT_EQ(blend(512, 1536, 0x030000u, 0x040000u, 0x0300FFu, 0x0400FFu), 0xFF0300BFu);
}

TEST(Bilinear, WeightsBeyondAWholePixelHoldAtTheFarNeighbour) {
  const uint32_t a = 0xFF000000u, b = 0xFFFFFFFFu;
  EXPECT_EQ(blend(5000, 0, a, b, a, b), 0xFFFFFFFFu);
  EXPECT_EQ(blend(0xFFFFFFFFu, 0xFFFFFFFFu, a, a, a, b), 0xFFFFFFFFu);
}

TEST(Bilinear, NullPixelsStoreNothingAndNullOutStillReturns) {
  const uint32_t p = 0x00123456u;
  uint32_t out = 0xDEADBEEFu;
  EXPECT_EQ(Bilinear_Fixed(0, 0, &p, nullptr, &p, &p, &out), 0u);
  EXPECT_EQ(out, 0xDEADBEEFu);
  EXPECT_EQ(Bilinear_Fixed(0, 0, &p, &p, &p, &p, nullptr), 0xFF123456u);
}

TEST(Fatan2, AxesAndTheOrigin) {
  EXPECT_EQ(FATAN2(0, 0), 0u);
  EXPECT_EQ(FATAN2(0, 5), 0u);
  EXPECT_EQ(FATAN2(5, 0), k90);
  EXPECT_EQ(FATAN2(0, -5), k180);
  EXPECT_EQ(FATAN2(-5, 0), k270);
}

TEST(Fatan2, DiagonalsOfEveryQuadrantReadTheSupplied45Degrees) {
  EXPECT_EQ(FATAN2(1, 1), k45);
  EXPECT_EQ(FATAN2(1, -1), k180 - k45);
  EXPECT_EQ(FATAN2(-1, -1), k180 + k45);
  EXPECT_EQ(FATAN2(-1, 1), k360 - k45);
}

TEST(Fatan2, EachOctantFoldsTheTableAngleTheRightWay) {
  const uint32_t t = 13927738;  // ATAN[1024], ratio 1/2
  EXPECT_EQ(FATAN2(1, 2), t);
  EXPECT_EQ(FATAN2(2, 1), k90 - t);
  EXPECT_EQ(FATAN2(2, -1), k90 + t);
  EXPECT_EQ(FATAN2(1, -2), k180 - t);
  EXPECT_EQ(FATAN2(-1, -2), k180 + t);
  EXPECT_EQ(FATAN2(-2, -1), k270 - t);
  EXPECT_EQ(FATAN2(-2, 1), k270 + t);
  EXPECT_EQ(FATAN2(-1, 2), k360 - t);
}

TEST(Fatan2, FollowsTheTrueAngleWithinTheTableStep) {
  pfx::test::Rng rng(99);
  for (int n = 0; n < 20000; ++n) {
    const int32_t a = rng.between(-20000, 20000), b = rng.between(-20000, 20000);
    if (a == 0 && b == 0) continue;
    const uint32_t got = FATAN2(a, b);
    ASSERT_LT(got, k360);
    double want =
        std::atan2(static_cast<double>(a), static_cast<double>(b)) * 180.0 / 3.14159265358979323846;
    if (want < 0) want += 360.0;
    double diff = std::fabs(got / static_cast<double>(kDeg) - want);
    diff = std::fmin(diff, 360.0 - diff);
    // The ratio has 11 fraction bits: one step is at most 1/2048 radian, about 0.028 degree;
    // the truncated reciprocal adds under 0.003 degree at these lengths.
    ASSERT_LT(diff, 0.031) << a << "," << b;
  }
}

TEST(Fatan2, TinyAnglesBelowTheZeroAxisStayBelowAFullTurn) {
  EXPECT_EQ(FATAN2(-1, 3000), 0u);
  EXPECT_EQ(FATAN2(-1, 1000), k360 - static_cast<uint32_t>(ATAN[2]));
}

TEST(Fatan2, TheMostNegativeIntegerHasAMagnitude) {
  EXPECT_EQ(FATAN2(INT32_MIN, 0), k270);
  EXPECT_EQ(FATAN2(0, INT32_MIN), k180);
  const uint32_t third_quadrant = FATAN2(INT32_MIN, INT32_MIN);
  EXPECT_GE(third_quadrant, k180);
  EXPECT_LT(third_quadrant, k270);
  EXPECT_EQ(FATAN2(1, INT32_MIN), k180);
}

}  // namespace
