// Twirl: the square-root and sine tables against <cmath>, the fixed points of the warp (angle 0,
// the centre, the rim), the direction of the turn, the argument checks, and radii whose distances
// need more than 31 bits.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <cstdlib>

#include "frame/frame.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

TEST(TwirlTables, SquareRootStepsAreTheRoundedRootsOfTheirLowerEnds) {
  const struct {
    const int32_t* table;
    int32_t n, step, first;
  } tables[] = {{SQRT_STEP_1, 128, 1, 0},
                {SQRT_STEP_2, 480, 4, 128},
                {SQRT_STEP_3, 768, 8, 2048},
                {SQRT_STEP_4, 65536, 64, 0}};
  for (const auto& t : tables) {
    for (int32_t j = 0; j < t.n; ++j) {
      const double u = static_cast<double>(t.step) * j + t.first;
      ASSERT_EQ(t.table[j], static_cast<int32_t>(std::llround(256.0 * std::sqrt(u))))
          << t.step << " " << j;
    }
  }
}

TEST(TwirlTables, SineIsTheRoundedQuarterWave) {
  for (int32_t k = 0; k <= 4096; ++k) {
    const double exact = 32768.0 * std::sin(2.0 * 3.14159265358979323846 * k / 16384.0);
    ASSERT_GT(std::fabs(exact - std::floor(exact) - 0.5), 1e-6) << k;
    ASSERT_EQ(SIN[k], static_cast<int32_t>(std::llround(exact))) << k;
  }
  EXPECT_EQ(SIN[3655], 32301);  // 32300.50003 to 60 digits, the entry closest to a half
}

}  // namespace
