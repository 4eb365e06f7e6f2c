// Integer square root and the table-driven logarithm: rounding of the root at every boundary,
// the table against its rule, the interpolation over its whole range and outside it, and the
// argument ranges of the logarithm.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <vector>

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

// True when r is the square root of x rounded to nearest: (r - 1/2)^2 <= x < (r + 1/2)^2.
bool is_rounded_root(int64_t x, int64_t r) {
  if (r < 0) return false;
  const bool above_lower = r == 0 || (2 * r - 1) * (2 * r - 1) <= 4 * x;
  return above_lower && 4 * x < (2 * r + 1) * (2 * r + 1);
}

TEST(SquareRoot, SpotValuesAndNegativeArguments) {
  constexpr int32_t kCases[][2] = {
      {0, 0}, {1, 1}, {2, 1}, {3, 2}, {12, 3}, {13, 4}, {INT32_MAX, 46341}};
  for (const auto& c : kCases) EXPECT_EQ(isqrt_(c[0]), c[1]) << c[0];
  for (int32_t x : {-1, -2, -13, -65536, INT32_MIN}) EXPECT_EQ(isqrt_(x), 0) << x;
}

TEST(SquareRoot, RoundsToNearestForSmallArgumentsAndAtEveryRoundingBoundary) {
  for (int32_t x = 0; x < (1 << 21); ++x) ASSERT_TRUE(is_rounded_root(x, isqrt_(x))) << x;
  // The root steps from s to s + 1 between s^2 + s and s^2 + s + 1.
  for (int64_t s = 1; s <= 46340; ++s) {
    for (int64_t x : {s * s - 1, s * s, s * s + s, s * s + s + 1}) {
      if (x > INT32_MAX) continue;
      ASSERT_TRUE(is_rounded_root(x, isqrt_(static_cast<int32_t>(x)))) << x;
    }
  }
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

TEST(Logarithm, InterpolationHitsEveryBreakpointAndRisesBetweenThem) {
  for (int32_t i = 0; i < 230; ++i) {
    EXPECT_EQ(log_interp_FIX(log_new_FIX, breakpoint(i)), log_new_FIX[i]) << i;
  }
  EXPECT_EQ(log_interp_FIX(log_new_FIX, 1133), 74);
  int32_t previous = 0;
  for (int32_t v = 1024; v <= 4096; ++v) {
    const int32_t l = log_interp_FIX(log_new_FIX, v);
    ASSERT_GE(l, previous) << v;
    // Chords of a concave curve lie below it, and the shift drops up to one more unit.
    const double exact = 512 * std::log2(v / 1024.0);
    ASSERT_LE(l, exact + 0.5) << v;
    ASSERT_GE(l, exact - 1.6) << v;
    previous = l;
  }
}

// A table of exactly 230 entries on the heap, so a read past either end shows up under the
// address sanitizer: arguments below 1024 read as 1.0, from 4096 up as the last entry. A foreign
// table's differences may not fit 32 bits; the sum wraps instead of overflowing.
TEST(Logarithm, InterpolationOfAnyTableStaysInsideItAndCannotOverflow) {
  std::vector<int32_t> table(log_new_FIX, log_new_FIX + 230);
  table[0] = 7;
  for (int32_t v : {1023, 1000, 0, -1, INT32_MIN}) EXPECT_EQ(log_interp_FIX(table.data(), v), 7);
  for (int32_t v : {4096, 4097, 1 << 20, INT32_MAX}) {
    EXPECT_EQ(log_interp_FIX(table.data(), v), 1024) << v;
  }
  EXPECT_EQ(log_interp_FIX(table.data(), 4095),
            table[228] + ((31 * (table[229] - table[228])) >> 5));
  EXPECT_EQ(log_interp_FIX(nullptr, 2048), 0);
  EXPECT_EQ(log_interp_FIX(nullptr, 100), 0);
  table[0] = INT32_MIN;
  table[1] = INT32_MAX;
  // INT32_MIN + (1 x (2^32 - 1)) / 2, the sum wrapping in 32 bits.
  EXPECT_EQ(log_interp_FIX(table.data(), 1025), -1);
  table[54] = INT32_MAX;
  table[55] = INT32_MIN;
  // INT32_MAX + floor(3 x (INT32_MIN - INT32_MAX) / 4), wrapped.
  EXPECT_EQ(log_interp_FIX(table.data(), 1135), -1073741825);
}

TEST(Logarithm, SpotValuesAndArgumentsOutsideTheRanges) {
  constexpr int32_t kCases[][2] = {{1024, 0}, {1025, 0}, {2048, 727040}, {4096, 1454080}, {1, 0}};
  for (const auto& c : kCases) EXPECT_EQ(log_e_FIX_new(c[0]), c[1]) << c[0];
  for (int32_t x : {2, 3, 4, 0, -5, 4194305, INT32_MIN, INT32_MAX}) {
    EXPECT_EQ(log_e_FIX_new(x), 21811200) << x;
  }
  EXPECT_EQ(log_e_FIX_new(5), 1420 * log_interp_FIX(log_new_FIX, 1280) - 5816320);
  EXPECT_EQ(log_e_FIX_new(4194304), 1420 * 1024 + 7270400);
}

// Every range scales into the same interpolation, so four times the argument adds exactly one
// range's worth, 1454080. 1420 stands for 1024 ln 4 = 1419.57, so the result runs 3.1e-4 high
// relative to the whole octaves it holds; the interpolation costs at most 2.5 table units on top.
TEST(Logarithm, FollowsTheNaturalLogarithmOverItsWholeRange) {
  pfx::fix_error_word() = 77;
  for (int32_t x = 5; x <= 4194304; x += (x < 1048576 ? 1 : 61)) {
    const double exact = std::log(x / 1024.0) * 1048576;
    ASSERT_NEAR(log_e_FIX_new(x), exact, 3.1e-4 * std::fabs(exact) + 2.5 * 1420) << x;
    if (x <= 1048576) {
      ASSERT_EQ(log_e_FIX_new(4 * x), log_e_FIX_new(x) + 1454080) << x;
    }
  }
  EXPECT_EQ(pfx::fix_error_word(), 77);  // no call touches the error word
}

}  // namespace
