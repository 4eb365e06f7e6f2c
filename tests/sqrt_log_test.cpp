// The logarithm's breakpoint table against its rule, entry by entry.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>

#include "fixmath/fixed.h"
#include "photofx.h"

namespace {

// Breakpoint of log_new_FIX entry i.
int32_t breakpoint(int32_t i) {
  if (i <= 54) return 1024 + 2 * i;
  if (i <= 79) return 1132 + 4 * (i - 54);
  if (i <= 117) return 1232 + 8 * (i - 79);
  if (i <= 181) return 1536 + 16 * (i - 117);
  return 2560 + 32 * (i - 181);
}

TEST(Logarithm, TableMatchesItsRuleEntryByEntry) {
  for (int32_t i = 0; i < 230; ++i) {
    const double exact = 512 * std::log2(breakpoint(i) / 1024.0);
    const double frac = exact - std::floor(exact);
    ASSERT_GT(std::fabs(frac - 0.5), 1e-6) << "entry " << i << " is too close to a half";
    EXPECT_EQ(log_new_FIX[i], static_cast<int32_t>(std::round(exact))) << i;
  }
  EXPECT_EQ(log_new_FIX[117], 300);  // 299.50080 to 70 digits, the entry closest to a half
}

}  // namespace
