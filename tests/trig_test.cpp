// Fixed-point trigonometry: the tables against their rules, nearest-entry reads over every index
// and wrapped or negative angles, the arctangent bisection, and the domain errors.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <numbers>

#include "fixmath/fixed.h"
#include "photofx.h"
#include "support/images.h"

namespace {

constexpr double kPi = std::numbers::pi;
constexpr int32_t kStep = 0x8000;  // one table step, half a unit (1/512 turn)
constexpr int32_t kQuarter = 0x400000;
constexpr int32_t kHalf = 0x800000;
constexpr int32_t kPole = -0x7FFFFFFF;
constexpr int32_t kDomain = 33;  // the error word after an argument outside the domain

int32_t& err() { return pfx::fix_error_word(); }

struct Call {
  const char* text;
  int32_t (*fn)();
  int32_t expected;
  int32_t error;  // the error word afterwards, cleared before the call
};

// clang-format off
#define CALL(expr, expected, error) Call{#expr, [] { return (expr); }, expected, error}

const Call kCalls[] = {
    CALL(fixcos(-kQuarter), 0, 0), CALL(fixsin(0xC00000), -65536, 0),
    CALL(fixsin(-kQuarter), -65536, 0),
    // INT32_MAX is 128 turns less 1/65536 of a unit, INT32_MIN exactly -128 turns.
    CALL(fixcos(INT32_MAX), 65536, 0), CALL(fixcos(INT32_MIN), 65536, 0),
    CALL(fixsin(INT32_MAX), 0, 0), CALL(fixsin(INT32_MIN + kQuarter), 65536, 0),
    CALL(fixcos(INT32_MAX - kHalf), -65536, 0), CALL(fixtan(INT32_MAX), 0, 0),
    CALL(fixtan(INT32_MIN + kQuarter), kPole, 0),
    // The tangent's pole covers the entry at the quarter turn from either side.
    CALL(fixtan(0x200000), 65536, 0), CALL(fixtan(kQuarter - 0x4000), kPole, 0),
    CALL(fixtan(kQuarter + 0x3FFF), kPole, 0), CALL(fixtan(kQuarter - 0x4001), 5340086, 0),
    CALL(fixtan(kQuarter + 0x4000), -5340086, 0), CALL(fixtan(-kQuarter), kPole, 0),
    CALL(fixtan(-0x200000), -65536, 0),
    // The arctangent ends on the last entries, 63.5 and -64 units.
    CALL(fixatan(-65536), -0x200000, 0), CALL(fixatan(5340087), 0x3F8000, 0), CALL(fixatan(INT32_MAX), 0x3F8000, 0),
    CALL(fixatan(INT32_MIN), -kQuarter, 0), CALL(fixatan(-0x7FFFFFFF), -kQuarter, 0),
    CALL(fixatan2(0, 0), 0, kDomain), CALL(fixatan2(5, 0), kQuarter, 0),
    CALL(fixatan2(-5, 0), -kQuarter, 0), CALL(fixatan2(0, 7), 0, 0),
    CALL(fixatan2(0, -7), kHalf, 0), CALL(fixatan2(1, 1), 0x200000, 0),
    CALL(fixatan2(1, -1), 0x600000, 0), CALL(fixatan2(-1, -1), -0x600000, 0),
    CALL(fixatan2(-1, 1), -0x200000, 0),
    // The ratio y / x is formed in 64 bits: fixed-point coordinates of 1.0 are 45 degrees, not
    // the 0 a 32-bit shift of y would give, and a tall narrow point stays near the vertical.
    CALL(fixatan2(0x10000, 0x10000), 0x200000, 0),
    CALL(fixatan2(-0x10000, -0x10000), -0x600000, 0), CALL(fixatan2(40000, 1), 0x3F8000, 0),
    CALL(fixatan2(-40000, 1), -kQuarter, 0), CALL(fixatan2(INT32_MIN, -1), -0x408000, 0),
    CALL(fixatan2(INT32_MAX, -1), kQuarter, 0), CALL(fixatan2(INT32_MIN, INT32_MIN), -0x600000, 0),
    CALL(fixacos(65536), 0, 0), CALL(fixacos(-65536), kHalf, 0), CALL(fixacos(0), kQuarter, 0),
    CALL(fixasin(65536), kQuarter, 0), CALL(fixasin(-65536), -kQuarter, 0),
    // Outside -1..1 the inverse cosine and sine are domain errors.
    CALL(fixacos(65537), 0, kDomain), CALL(fixacos(-65537), 0, kDomain),
    CALL(fixacos(INT32_MIN), 0, kDomain), CALL(fixasin(0x7FFF0000), 0, kDomain),
    CALL(fixasin(-65537), 0, kDomain), CALL(fixasin(INT32_MAX), 0, kDomain),
};
// clang-format on

TEST(Trig, ArccosineAndArcsineReadTheNearestEntryAcrossTheWholeDomain) {
  err() = 34;  // successful calls leave the word alone
  int32_t index = 0;
  for (int32_t x = -65536; x <= 65536; ++x) {
    // The entries fall strictly, so the value read names its entry. Entry i stands for
    // x = 256 i - 65536 and serves up to half an entry either side; the exact half between two
    // entries goes to the lower one.
    const int32_t c = fixacos(x);
    while (index < 512 && _acos_tbl[index] != c) ++index;
    ASSERT_EQ(_acos_tbl[index], c) << x;
    const int32_t from_entry = x - (256 * index - 65536);
    ASSERT_TRUE(from_entry >= -127 && from_entry <= 128) << x;
    ASSERT_EQ(fixasin(x), kQuarter - c) << x;
  }
  EXPECT_EQ(index, 512);
  EXPECT_EQ(err(), 34);
}

}  // namespace
