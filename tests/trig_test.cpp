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
constexpr int32_t kQuarter = 0x400000;
constexpr int32_t kPole = -0x7FFFFFFF;

int32_t& err() { return pfx::fix_error_word(); }

// Rounds a double reference of a table entry, after making sure it is far enough from a rounding
// half that double precision cannot have tipped it.
int32_t settled_round(double exact, const char* table, int i) {
  const double frac = std::fabs(exact) - std::floor(std::fabs(exact));
  EXPECT_GT(std::fabs(frac - 0.5), 1e-6) << table << "[" << i << "] is too close to a half";
  return static_cast<int32_t>(std::round(exact));  // halves away from zero
}

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
