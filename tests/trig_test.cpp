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

// Rounds a double reference of a table entry, after making sure it is far enough from a rounding
// half that double precision cannot have tipped it.
int32_t settled_round(double exact, const char* table, int i) {
  const double frac = std::fabs(exact) - std::floor(std::fabs(exact));
  EXPECT_GT(std::fabs(frac - 0.5), 1e-6) << table << "[" << i << "] is too close to a half";
  return static_cast<int32_t>(std::round(exact));  // halves away from zero
}

// Angle in units (256 to the turn) of a 16.16 angle.
double units(int64_t fixed_angle) { return static_cast<double>(fixed_angle) / 65536.0; }

TEST(Trig, TablesMatchTheirRulesEntryByEntry) {
  for (int i = 0; i < 512; ++i) {
    EXPECT_EQ(_cos_tbl[i], settled_round(std::cos(2 * kPi * i / 512) * 65536, "_cos_tbl", i)) << i;
  }
  for (int i = 0; i < 256; ++i) {
    if (i == 128) continue;
    EXPECT_EQ(_tan_tbl[i], settled_round(std::tan(kPi * i / 256) * 65536, "_tan_tbl", i)) << i;
  }
  EXPECT_EQ(_tan_tbl[128], kPole);
  for (int i = 0; i < 513; ++i) {
    const double angle = std::acos(i / 256.0 - 1.0) * (256 / (2 * kPi)) * 65536;
    EXPECT_EQ(_acos_tbl[i], settled_round(angle, "_acos_tbl", i)) << i;
  }
  EXPECT_EQ(fixtorad_r, settled_round(2 * kPi / 256 * 65536, "fixtorad_r", 0));
  EXPECT_EQ(radtofix_r, settled_round(256 / (2 * kPi) * 65536, "radtofix_r", 0));
  // The entries nearest a half, worked out to 70 digits; see the note in fixmath/trig.cpp.
  EXPECT_EQ(_acos_tbl[24], 7223159);   // 7223158.50036
  EXPECT_EQ(_acos_tbl[488], 1165449);  // 1165449.49964
  EXPECT_EQ(_tan_tbl[59], 57950);      // 57949.50121
  EXPECT_EQ(_tan_tbl[197], -57950);
  EXPECT_EQ(_cos_tbl[83], 34380);  // 34379.50944
  EXPECT_EQ(_cos_tbl[173], -34380);
  EXPECT_EQ(fixtorad_r, 1608);  // 1608.49544
}

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

TEST(Trig, ResultsAndErrorWord) {
  for (const Call& c : kCalls) {
    err() = 0;
    EXPECT_EQ(c.fn(), c.expected) << c.text;
    EXPECT_EQ(err(), c.error) << c.text;
  }
  // The arctangent of two clears an earlier error, except on the axes, which return early.
  err() = 34;
  EXPECT_EQ(fixatan2(3, 4), fixatan(fixdiv(3, 4)));
  EXPECT_EQ(err(), 0);
  err() = 34;
  EXPECT_EQ(fixatan2(9, 0), kQuarter);
  EXPECT_EQ(err(), 34);
}

TEST(Trig, EveryEntryIsReadAtItsAnglesInEveryTurn) {
  // Around each entry the angles from a quarter step below to just under a quarter step above
  // read it; the same holds any whole number of turns away, negative ones included. The tangent
  // repeats every half turn, and the arctangent finds every entry exactly.
  for (int64_t turn : {-128, -3, -1, 0, 1, 5, 127}) {
    for (int64_t i = 0; i < 512; ++i) {
      for (int64_t offset : {int64_t{-0x4000}, int64_t{-1}, int64_t{0}, int64_t{0x3FFF}}) {
        const int64_t angle = turn * 0x1000000 + i * kStep + offset;
        if (angle < INT32_MIN || angle > INT32_MAX) continue;
        ASSERT_EQ(fixcos(static_cast<int32_t>(angle)), _cos_tbl[i]) << angle;
        ASSERT_EQ(fixtan(static_cast<int32_t>(angle)), _tan_tbl[i % 256]) << angle;
      }
    }
  }
  for (int32_t i = 0; i < 256; ++i) {
    EXPECT_EQ(fixatan(_tan_tbl[i]), i < 128 ? i * kStep : i * kStep - kHalf) << i;
  }
}

TEST(Trig, ResultsFollowTheTrueFunctionsOverRandomArguments) {
  pfx::test::Rng rng(52);
  for (int n = 0; n < 300000; ++n) {
    // Entries are half a unit apart, so the nearest is at most a quarter unit (2 pi / 1024
    // radians) away: off by at most 65536 x 2 pi / 1024 ~ 402, plus rounding. The sine is the
    // cosine a quarter turn earlier, to the bit.
    const int32_t a = static_cast<int32_t>(rng.word());
    const double radians = 2 * kPi * units(a) / 256;
    ASSERT_NEAR(fixcos(a), std::cos(radians) * 65536, 403) << a;
    ASSERT_NEAR(fixsin(a), std::sin(radians) * 65536, 403) << a;
    ASSERT_EQ(fixsin(a), fixcos(static_cast<int32_t>(static_cast<uint32_t>(a) - kQuarter))) << a;
    // The arctangent's last probe is one of the two entries around x, so it is at most one step
    // from the exact angle; the arctangent of two adds a little for the truncated ratio.
    const int32_t y = static_cast<int32_t>(rng.word()) >> (n % 32);
    const int32_t x = static_cast<int32_t>(rng.word()) >> ((n / 32) % 32);
    const int32_t t = fixatan(y);
    ASSERT_NEAR(units(t), std::atan(y / 65536.0) / (2 * kPi) * 256, 0.5 + 1e-6) << y;
    ASSERT_EQ(t % kStep, 0) << y;
    if (x == 0) continue;
    const double exact = std::atan2(static_cast<double>(y), static_cast<double>(x)) / (2 * kPi);
    ASSERT_NEAR(units(fixatan2(y, x)), exact * 256, 0.5 + 1e-3) << y << ", " << x;
  }
}

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
