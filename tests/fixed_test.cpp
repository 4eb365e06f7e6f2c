// 16.16 fixed point: conversions, saturating arithmetic, the integer divisions and the error word.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>
#include <thread>

#include "fixmath/fixed.h"
#include "photofx.h"

namespace {

constexpr int32_t kMax = 0x7FFFFFFF;
constexpr int32_t kMin = -0x7FFFFFFF;

int32_t& err() { return pfx::fix_error_word(); }

class Fixed : public ::testing::Test {
 protected:
  void SetUp() override { err() = 0; }
};

TEST_F(Fixed, FtofixRoundsHalvesAwayFromZeroAndSaturatesAt32767) {
  EXPECT_EQ(ftofix(1.0), 65536);
  EXPECT_EQ(ftofix(-0.5 / 65536), -1);
  EXPECT_EQ(ftofix(0.5 / 65536), 1);
  EXPECT_EQ(ftofix(32767.0), 0x7FFF0000);
  EXPECT_EQ(err(), 0);
  EXPECT_EQ(ftofix(32767.25), kMax);
  EXPECT_EQ(err(), 34);
  err() = 0;
  EXPECT_EQ(ftofix(-40000.0), kMin);
  EXPECT_EQ(err(), 34);
  err() = 0;
  EXPECT_EQ(ftofix(std::numeric_limits<double>::quiet_NaN()), 0);
  EXPECT_EQ(ftofix(std::numeric_limits<double>::infinity()), kMax);
}

TEST_F(Fixed, ConversionsToAndFromIntegers) {
  EXPECT_EQ(fixtof(0x18000), 1.5);
  EXPECT_EQ(fixtof(-1), -1.0 / 65536);
  EXPECT_EQ(itofix(3), 0x30000);
  EXPECT_EQ(itofix(0x12345), 0x23450000);  // high bits are shifted out
  EXPECT_EQ(itofix(-1), -65536);
  EXPECT_EQ(fixtoi(0x8000), 1);
  EXPECT_EQ(fixtoi(-0x8000), 0);
  EXPECT_EQ(fixtoi(-0x8001), -1);
  EXPECT_EQ(fixtoi(-0x1C000), -2);  // -1.75
  EXPECT_EQ(fixfloor(-1), -1);
  EXPECT_EQ(fixfloor(-65536), -1);
  EXPECT_EQ(fixfloor(-65537), -2);
  EXPECT_EQ(err(), 0);
}

TEST_F(Fixed, CeilingSaturatesAbove32767) {
  EXPECT_EQ(fixceil(0x7FFF0000), 32767);
  EXPECT_EQ(err(), 0);
  EXPECT_EQ(fixceil(1), 1);
  EXPECT_EQ(fixceil(-65535), 0);
  EXPECT_EQ(fixceil(INT32_MIN), -32768);
  EXPECT_EQ(fixceil(0x7FFF0001), 32767);
  EXPECT_EQ(err(), 34);
}

TEST_F(Fixed, AddAndSubtractSaturateOnOverflow) {
  EXPECT_EQ(fixadd(0x7FFFFFFF, -1), 0x7FFFFFFE);
  EXPECT_EQ(err(), 0);
  EXPECT_EQ(fixadd(0x7FFFFFFF, 1), kMax);
  EXPECT_EQ(err(), 34);
  err() = 0;
  EXPECT_EQ(fixadd(-0x7FFFFFFF, -2), kMin);
  EXPECT_EQ(err(), 34);
  err() = 0;
  EXPECT_EQ(fixsub(0, INT32_MIN), INT32_MIN);  // a is not positive: wraps, no error
  EXPECT_EQ(err(), 0);
  EXPECT_EQ(fixsub(1, INT32_MIN), kMax);
  EXPECT_EQ(err(), 34);
  err() = 0;
  EXPECT_EQ(fixsub(-2, 0x7FFFFFFF), kMin);
  EXPECT_EQ(err(), 34);
}

TEST_F(Fixed, MultiplyRoundsThroughDouble) {
  EXPECT_EQ(fixmul(0x18000, 0x18000), 0x24000);
  EXPECT_EQ(fixmul(-0x18000, 0x18000), -0x24000);
  EXPECT_EQ(fixmul(1, 0x8000), 1);  // half a unit rounds away from zero
  EXPECT_EQ(err(), 0);
  EXPECT_EQ(fixmul(0x1000000, 0x1000000), kMax);
  EXPECT_EQ(err(), 34);
}

TEST_F(Fixed, DivideShiftsTheNumeratorIn32Bits) {
  EXPECT_EQ(fixdiv(0, 0), 0);
  EXPECT_EQ(err(), 0);
  EXPECT_EQ(fixdiv(3, 2), 0x18000);
  EXPECT_EQ(fixdiv(0x10000, 0x10000), 0);  // the numerator's bits all shift out
  EXPECT_EQ(fixdiv(-7, 2), -0x38000);
  EXPECT_EQ(fixdiv(5, 0), kMax);
  EXPECT_EQ(err(), 34);
  err() = 0;
  EXPECT_EQ(fixdiv(-5, 0), kMin);
  EXPECT_EQ(err(), 34);
}

TEST_F(Fixed, QuotientsThatDoNotFitWrapWithoutTrapping) {
  EXPECT_EQ(fixdiv(0x8000, -1), INT32_MIN);  // numerator INT32_MIN
  EXPECT_EQ(idiv(INT32_MIN, -1), INT32_MIN);
  EXPECT_EQ(iidiv(INT32_MIN, -1), INT32_MIN);
  EXPECT_EQ(iidiv(INT32_MIN, 1), INT32_MAX);  // truncated quotient minus one wraps
  EXPECT_EQ(err(), 0);
}

TEST_F(Fixed, IdivRoundsToNearestHalvesAwayFromZero) {
  EXPECT_EQ(idiv(5, 2), 3);
  EXPECT_EQ(idiv(-5, 2), -3);
  EXPECT_EQ(idiv(4, 3), 1);
  EXPECT_EQ(idiv(5, 3), 2);
  EXPECT_EQ(idiv(7, 1), 7);
  EXPECT_EQ(idiv(-7, 2), -4);
  EXPECT_EQ(idiv(4, -2), -2);
  EXPECT_EQ(idiv(INT32_MAX, INT32_MIN), -1);
  EXPECT_EQ(idiv(0, 0), 0);
  EXPECT_EQ(err(), 0);
  EXPECT_EQ(idiv(5, 0), kMax);
  EXPECT_EQ(err(), 34);
}

TEST_F(Fixed, IidivLowersByOneWhenTheSignsDiffer) {
  EXPECT_EQ(iidiv(-5, 2), -3);
  EXPECT_EQ(iidiv(-4, 2), -3);
  EXPECT_EQ(iidiv(4, -4), -2);
  EXPECT_EQ(iidiv(5, 2), 2);
  EXPECT_EQ(iidiv(-6, -3), 2);
  EXPECT_EQ(iidiv(0, 0), 0);
  EXPECT_EQ(err(), 0);
  EXPECT_EQ(iidiv(-1, 0), kMin);
  EXPECT_EQ(err(), 34);
}

TEST_F(Fixed, ErrorWordStaysUntilOverwrittenAndIsPerThread) {
  fixadd(0x7FFFFFFF, 1);
  fixadd(1, 2);
  EXPECT_EQ(err(), 34);  // a successful call does not clear it
  int32_t seen_by_other_thread = -1;
  std::thread([&] { seen_by_other_thread = pfx::fix_error_word(); }).join();
  EXPECT_EQ(seen_by_other_thread, 0);
}

}  // namespace
