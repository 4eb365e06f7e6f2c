// HSV conversion: the reciprocal tables follow their rule, and division gives the same numbers.
#include <gtest/gtest.h>

#include <cstdint>

#include "frame/hsv.h"
#include "photofx.h"

namespace {

TEST(HsvTables, AreTheTruncatedReciprocals) {
  EXPECT_EQ(LUT_DELTA[0], 0u);
  EXPECT_EQ(LUT_DELTA2[0], 0u);
  for (uint32_t i = 1; i < 256; ++i) {
    const uint32_t expected = static_cast<uint32_t>(65536.0 / i);  // truncation of the quotient
    EXPECT_EQ(LUT_DELTA[i], expected) << i;
    EXPECT_EQ(LUT_DELTA2[i], 60 * expected) << i;
  }
  for (int32_t i = 0; i < 256; ++i) EXPECT_EQ(pfx::divided_reciprocal(i), LUT_DELTA[i]) << i;
}

}  // namespace
