// Bilinear sampling and the fast arctangent: the ATAN table against <cmath>, the blend's weights
// and truncation, and FATAN2 on the axes, off them within a table step, and at the ends of its
// range.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

constexpr double kPi = 3.14159265358979323846;

TEST(AtanTable, EveryEntryIsTheRoundedArctangentInDegreesTimes2To19) {
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

// Weights run 0..2048; the result is opaque and each channel truncated. Weights beyond a whole
// pixel hold at the far neighbour; a null pixel stores nothing, a null output still returns.
TEST(Bilinear, WeightsTruncationAndNullPointers) {
  const uint32_t a = 0x10203040u, b = 0x80506070u, c = 0x00A0B0C0u, d = 0x7FD0E0F0u;
  EXPECT_EQ(blend(0, 0, a, b, c, d), 0xFF203040u);
  EXPECT_EQ(blend(2048, 2048, a, b, c, d), 0xFFD0E0F0u);
  EXPECT_EQ(blend(1024, 1024, 0xFF000000u, ~0u, ~0u, 0xFF000000u), 0xFF7F7F7Fu);
  // Red 3 to 4 across x at a quarter: 3.25 truncates to 3; blue 0 to 255 down y at 3/4: 191.25.
  EXPECT_EQ(blend(512, 1536, 0x030000u, 0x040000u, 0x0300FFu, 0x0400FFu), 0xFF0300BFu);
  EXPECT_EQ(blend(5000, 0, 0, ~0u, 0, ~0u), 0xFFFFFFFFu);
  EXPECT_EQ(blend(0xFFFFFFFFu, 0xFFFFFFFFu, 0, 0, 0, ~0u), 0xFFFFFFFFu);

  const uint32_t p = 0x00123456u;
  uint32_t out = 0xDEADBEEFu;
  EXPECT_EQ(Bilinear_Fixed(0, 0, &p, nullptr, &p, &p, &out), 0u);
  EXPECT_EQ(out, 0xDEADBEEFu);
  EXPECT_EQ(Bilinear_Fixed(0, 0, &p, &p, &p, &p, nullptr), 0xFF123456u);
}

}  // namespace
