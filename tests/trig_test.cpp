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
constexpr int32_t kUnit = 0x10000;  // one angle unit, 1/256 turn
constexpr int32_t kStep = 0x8000;   // one table step, half a unit
constexpr int32_t kQuarter = 0x400000;
constexpr int32_t kHalf = 0x800000;

int32_t& err() { return pfx::fix_error_word(); }

class Trig : public ::testing::Test {
 protected:
  void SetUp() override { err() = 0; }
};

// Rounds a double reference of a table entry, after making sure it is far enough from a rounding
// half that double precision cannot have tipped it.
int32_t settled_round(double exact, const char* table, int i) {
  const double frac = std::fabs(exact) - std::floor(std::fabs(exact));
  EXPECT_GT(std::fabs(frac - 0.5), 1e-6) << table << "[" << i << "] is too close to a half";
  return static_cast<int32_t>(std::round(exact));  // halves away from zero
}

// Angle in units (256 to the turn) of a 16.16 angle.
double units(int64_t fixed_angle) { return static_cast<double>(fixed_angle) / 65536.0; }

TEST_F(Trig, TablesMatchTheirRulesEntryByEntry) {
  for (int i = 0; i < 512; ++i) {
    EXPECT_EQ(_cos_tbl[i], settled_round(std::cos(2 * kPi * i / 512) * 65536, "_cos_tbl", i)) << i;
  }
  for (int i = 0; i < 256; ++i) {
    if (i == 128) continue;
    EXPECT_EQ(_tan_tbl[i], settled_round(std::tan(kPi * i / 256) * 65536, "_tan_tbl", i)) << i;
  }
  EXPECT_EQ(_tan_tbl[128], -0x7FFFFFFF);
  for (int i = 0; i < 513; ++i) {
    const double angle = std::acos(i / 256.0 - 1.0) * (256 / (2 * kPi)) * 65536;
    EXPECT_EQ(_acos_tbl[i], settled_round(angle, "_acos_tbl", i)) << i;
  }
  EXPECT_EQ(fixtorad_r, settled_round(2 * kPi / 256 * 65536, "fixtorad_r", 0));
  EXPECT_EQ(radtofix_r, settled_round(256 / (2 * kPi) * 65536, "radtofix_r", 0));
}

TEST_F(Trig, TableEntriesThatSitNearAHalfRoundToTheNearerSide) {
  // Values worked out to 70 digits; see the note in fixmath/trig.cpp.
  EXPECT_EQ(_acos_tbl[24], 7223159);   // 7223158.50036
  EXPECT_EQ(_acos_tbl[488], 1165449);  // 1165449.49964
  EXPECT_EQ(_tan_tbl[59], 57950);      // 57949.50121
  EXPECT_EQ(_tan_tbl[197], -57950);
  EXPECT_EQ(_cos_tbl[83], 34380);  // 34379.50944
  EXPECT_EQ(_cos_tbl[173], -34380);
  EXPECT_EQ(fixtorad_r, 1608);  // 1608.49544
  EXPECT_EQ(radtofix_r, 2670177);
}

TEST_F(Trig, CosineAndSineAtTheQuarterTurns) {
  EXPECT_EQ(fixcos(0), 65536);
  EXPECT_EQ(fixcos(kQuarter), 0);
  EXPECT_EQ(fixcos(kHalf), -65536);
  EXPECT_EQ(fixcos(-kQuarter), 0);
  EXPECT_EQ(fixcos(0x1000000), fixcos(0));
  EXPECT_EQ(fixsin(kQuarter), 65536);
  EXPECT_EQ(fixsin(0), 0);
  EXPECT_EQ(fixsin(0xC00000), -65536);
  EXPECT_EQ(fixsin(-kQuarter), -65536);
}

TEST_F(Trig, CosineReadsTheNearestEntryForEveryIndexAndEveryTurn) {
  // Around each entry the angles from a quarter step below to just under a quarter step above
  // read it; the same holds any whole number of turns away, negative ones included.
  for (int64_t turn : {-128, -3, -1, 0, 1, 5, 127}) {
    for (int64_t i = 0; i < 512; ++i) {
      const int64_t centre = turn * 0x1000000 + i * kStep;
      for (int64_t offset : {int64_t{-0x4000}, int64_t{-1}, int64_t{0}, int64_t{0x3FFF}}) {
        const int64_t angle = centre + offset;
        if (angle < INT32_MIN || angle > INT32_MAX) continue;
        ASSERT_EQ(fixcos(static_cast<int32_t>(angle)), _cos_tbl[i]) << angle;
      }
    }
  }
  EXPECT_EQ(fixcos(0x4000), _cos_tbl[1]);
  EXPECT_EQ(fixcos(-0x4001), _cos_tbl[511]);
}

TEST_F(Trig, ExtremeAnglesWrapLikeAnyOther) {
  // INT32_MAX is 128 turns less 1/65536 of a unit, INT32_MIN exactly -128 turns.
  EXPECT_EQ(fixcos(INT32_MAX), 65536);
  EXPECT_EQ(fixcos(INT32_MIN), 65536);
  EXPECT_EQ(fixsin(INT32_MAX), 0);
  EXPECT_EQ(fixsin(INT32_MIN), 0);
  EXPECT_EQ(fixsin(INT32_MIN + kQuarter), 65536);
  EXPECT_EQ(fixtan(INT32_MAX), 0);
  EXPECT_EQ(fixtan(INT32_MIN + kQuarter), -0x7FFFFFFF);
  EXPECT_EQ(fixcos(INT32_MAX - kHalf), -65536);
}

TEST_F(Trig, SineAndCosineFollowTheCircleOverRandomAngles) {
  // Entries are half a unit apart, so the nearest is at most a quarter unit (2 pi / 1024
  // radians) away: off by at most 65536 x 2 pi / 1024 ~ 402, plus rounding.
  pfx::test::Rng rng(52);
  for (int n = 0; n < 200000; ++n) {
    const int32_t a = static_cast<int32_t>(rng.word());
    const double radians = 2 * kPi * units(a) / 256;
    ASSERT_NEAR(fixcos(a), std::cos(radians) * 65536, 403) << a;
    ASSERT_NEAR(fixsin(a), std::sin(radians) * 65536, 403) << a;
    // The sine is the cosine a quarter turn earlier, to the bit.
    ASSERT_EQ(fixsin(a), fixcos(static_cast<int32_t>(static_cast<uint32_t>(a) - kQuarter))) << a;
  }
}

TEST_F(Trig, TangentRepeatsEveryHalfTurnWithItsPoleAtTheQuarter) {
  EXPECT_EQ(fixtan(0x200000), 65536);
  EXPECT_EQ(fixtan(kQuarter), -0x7FFFFFFF);
  EXPECT_EQ(fixtan(kQuarter - 0x4000), -0x7FFFFFFF);
  EXPECT_EQ(fixtan(kQuarter + 0x3FFF), -0x7FFFFFFF);
  EXPECT_EQ(fixtan(kQuarter - 0x4001), 5340086);
  EXPECT_EQ(fixtan(kQuarter + 0x4000), -5340086);
  EXPECT_EQ(fixtan(-kQuarter), -0x7FFFFFFF);
  EXPECT_EQ(fixtan(-0x200000), -65536);
  for (int64_t i = 0; i < 256; ++i) {
    for (int64_t turn : {-64, -1, 0, 1, 63}) {
      const auto angle = static_cast<int32_t>(turn * kHalf * 2 + i * kStep);
      ASSERT_EQ(fixtan(angle), _tan_tbl[i]) << angle;
      ASSERT_EQ(fixtan(angle + kHalf), _tan_tbl[i]) << angle;
    }
  }
  EXPECT_EQ(err(), 0);
}

TEST_F(Trig, ArctangentSpotValues) {
  EXPECT_EQ(fixatan(0), 0);
  EXPECT_EQ(fixatan(65536), 0x200000);
  EXPECT_EQ(fixatan(-65536), -0x200000);
  EXPECT_EQ(fixatan(5340087), 0x3F8000);
  EXPECT_EQ(fixatan(INT32_MAX), 0x3F8000);
  EXPECT_EQ(fixatan(INT32_MIN), -kQuarter);
  EXPECT_EQ(fixatan(-0x7FFFFFFF), -kQuarter);
  EXPECT_EQ(err(), 0);
}

TEST_F(Trig, ArctangentFindsEveryEntryExactly) {
  for (int32_t i = 0; i < 256; ++i) {
    const int32_t expected = i < 128 ? i * kStep : i * kStep - kHalf;
    EXPECT_EQ(fixatan(_tan_tbl[i]), expected) << i;
  }
}

TEST_F(Trig, ArctangentLandsOnAnEntryNextToTheTrueAngle) {
  // The last probe is one of the two entries around x, so the result is at most one step from
  // the exact arctangent; beyond the last entries it is 63.5 or -64.0.
  pfx::test::Rng rng(53);
  for (int n = 0; n < 300000; ++n) {
    const int32_t x = static_cast<int32_t>(rng.word()) >> (n % 32);
    const double exact = std::atan(x / 65536.0) / (2 * kPi) * 256;
    const int32_t a = fixatan(x);
    ASSERT_NEAR(units(a), exact, 0.5 + 1e-6) << x;
    ASSERT_EQ(a % kStep, 0) << x;
    ASSERT_GE(a, -kQuarter);
    ASSERT_LE(a, kQuarter - kStep);
  }
}

TEST_F(Trig, Arctangent2OnTheAxesAndInEveryQuadrant) {
  EXPECT_EQ(fixatan2(0, 0), 0);
  EXPECT_EQ(err(), 33);
  err() = 0;
  EXPECT_EQ(fixatan2(5, 0), kQuarter);
  EXPECT_EQ(fixatan2(-5, 0), -kQuarter);
  EXPECT_EQ(fixatan2(0, 7), 0);
  EXPECT_EQ(fixatan2(0, -7), kHalf);
  EXPECT_EQ(fixatan2(1, 1), 0x200000);
  EXPECT_EQ(fixatan2(1, -1), 0x600000);
  EXPECT_EQ(fixatan2(-1, -1), -0x600000);
  EXPECT_EQ(fixatan2(-1, 1), -0x200000);
  EXPECT_EQ(err(), 0);
}

TEST_F(Trig, Arctangent2ClearsAnEarlierErrorUnlessItFails) {
  err() = 34;
  EXPECT_EQ(fixatan2(3, 4), fixatan(fixdiv(3, 4)));
  EXPECT_EQ(err(), 0);
  err() = 34;
  EXPECT_EQ(fixatan2(9, 0), kQuarter);  // the axes return early and leave the word
  EXPECT_EQ(err(), 34);
  EXPECT_EQ(fixatan2(0, 0), 0);
  EXPECT_EQ(err(), 33);
}

TEST_F(Trig, Arctangent2OfLargeCoordinatesKeepsTheirQuadrant) {
  // The ratio y / x is formed in 64 bits: fixed-point coordinates of 1.0 are 45 degrees, not
  // the 0 a 32-bit shift of y would give, and a tall narrow point stays near the vertical.
  EXPECT_EQ(fixatan2(0x10000, 0x10000), 0x200000);
  EXPECT_EQ(fixatan2(-0x10000, -0x10000), -0x600000);
  EXPECT_EQ(fixatan2(40000, 1), 0x3F8000);
  EXPECT_EQ(fixatan2(-40000, 1), -kQuarter);
  EXPECT_EQ(fixatan2(INT32_MIN, -1), -0x408000);
  EXPECT_EQ(fixatan2(INT32_MAX, -1), kQuarter);
  EXPECT_EQ(fixatan2(INT32_MIN, INT32_MIN), -0x600000);
  EXPECT_EQ(err(), 0);
}

TEST_F(Trig, Arctangent2FollowsTheTrueAngleForAnyCoordinates) {
  pfx::test::Rng rng(54);
  for (int n = 0; n < 300000; ++n) {
    const int32_t y = static_cast<int32_t>(rng.word()) >> (n % 32);
    const int32_t x = static_cast<int32_t>(rng.word()) >> ((n / 32) % 32);
    if (x == 0) continue;
    const double exact =
        std::atan2(static_cast<double>(y), static_cast<double>(x)) / (2 * kPi) * 256;
    // One step for the bisection, a little for the truncated ratio.
    ASSERT_NEAR(units(fixatan2(y, x)), exact, 0.5 + 1e-3) << y << ", " << x;
  }
}

TEST_F(Trig, Arctangent2AgreesWithFixdivWhereItsQuotientFits) {
  // Where y << 16 fits in 32 bits the 64-bit ratio is the fixed-point quotient itself.
  pfx::test::Rng rng(55);
  for (int n = 0; n < 100000; ++n) {
    const int32_t y = rng.between(-32767, 32767);
    const int32_t x = static_cast<int32_t>(rng.word()) >> (n % 32);
    if (x == 0) continue;
    const int32_t a = fixatan(fixdiv(y, x));
    const int32_t expected = x > 0 ? a : (y >= 0 ? a + kHalf : a - kHalf);
    ASSERT_EQ(fixatan2(y, x), expected) << y << ", " << x;
  }
}

TEST_F(Trig, ArccosineAndArcsineReadTheNearestEntryAcrossTheWholeDomain) {
  EXPECT_EQ(fixacos(65536), 0);
  EXPECT_EQ(fixacos(-65536), kHalf);
  EXPECT_EQ(fixacos(0), kQuarter);
  EXPECT_EQ(fixasin(65536), kQuarter);
  EXPECT_EQ(fixasin(-65536), -kQuarter);
  EXPECT_EQ(fixasin(0), 0);
  err() = 34;  // successful calls leave the word alone
  int32_t index = 0;
  for (int32_t x = -65536; x <= 65536; ++x) {
    // The entries fall strictly, so the value read names its entry.
    const int32_t c = fixacos(x);
    while (index < 512 && _acos_tbl[index] != c) ++index;
    ASSERT_EQ(_acos_tbl[index], c) << x;
    // Entry i stands for x = 256 i - 65536 and serves up to half an entry either side; the
    // exact half between two entries goes to the lower one.
    const int32_t from_entry = x - (256 * index - 65536);
    ASSERT_GE(from_entry, -127) << x;
    ASSERT_LE(from_entry, 128) << x;
    ASSERT_EQ(fixasin(x), kQuarter - c) << x;
  }
  EXPECT_EQ(index, 512);
  EXPECT_EQ(err(), 34);
}

TEST_F(Trig, InverseCosineAndSineOutsideTheUnitRangeAreDomainErrors) {
  for (int32_t x : {65537, -65537, INT32_MAX, INT32_MIN, 0x7FFF0000}) {
    err() = 0;
    EXPECT_EQ(fixacos(x), 0) << x;
    EXPECT_EQ(err(), 33) << x;
    err() = 0;
    EXPECT_EQ(fixasin(x), 0) << x;
    EXPECT_EQ(err(), 33) << x;
  }
}

}  // namespace
