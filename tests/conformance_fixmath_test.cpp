// Conformance goldens of the fixed-point trigonometry, square root and logarithm: every table,
// and sweeps of every function over ordinary, wrapped and out-of-range arguments together with
// the error word each call leaves.
#include <gtest/gtest.h>

#include "fixmath/fixed.h"
#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::test::Digest;

void add_table(Digest& d, const int32_t* table, size_t n) {
  for (size_t i = 0; i < n; ++i) d.add(table[i]);
}

TEST(Conformance, TrigTables) {
  Digest d;
  add_table(d, _cos_tbl, 512);
  add_table(d, _tan_tbl, 256);
  add_table(d, _acos_tbl, 513);
  d.add(fixtorad_r), d.add(radtofix_r);
  EXPECT_GOLDEN("trig tables", d, 0xc299a0e295eb70fbull);
}

TEST(Conformance, SineCosineTangent) {
  Digest d;
  for (int64_t a = INT32_MIN; a <= INT32_MAX; a += 0x1357F) {
    const auto angle = static_cast<int32_t>(a);
    d.add(fixcos(angle)), d.add(fixsin(angle)), d.add(fixtan(angle));
  }
  for (int32_t angle : {INT32_MIN, INT32_MAX, -1, 0, 0x3FFF, 0x4000, 0x3FC000, 0x400000}) {
    d.add(fixcos(angle)), d.add(fixsin(angle)), d.add(fixtan(angle));
  }
  EXPECT_GOLDEN("fixcos fixsin fixtan", d, 0x070282be8fee8c2eull);
}

TEST(Conformance, Arctangents) {
  pfx::test::Rng rng(57);
  Digest d;
  for (int i = 0; i < 256; ++i) d.add(fixatan(_tan_tbl[i] - 1)), d.add(fixatan(_tan_tbl[i] + 1));
  for (int i = 0; i < 20000; ++i) {
    const auto x = static_cast<int32_t>(rng.word()) >> (i % 32);
    const auto y = static_cast<int32_t>(rng.word()) >> ((i / 32) % 32);
    d.add(fixatan(x));
    pfx::fix_error_word() = 34;
    d.add(fixatan2(y, x)), d.add(pfx::fix_error_word());
    d.add(fixatan2(y % 100, x % 100)), d.add(pfx::fix_error_word());
  }
  EXPECT_GOLDEN("fixatan fixatan2", d, 0x15d84771c960ce90ull);
}

TEST(Conformance, InverseCosineAndSine) {
  Digest d;
  for (int32_t x = -70001; x <= 70001; x += 7) {
    pfx::fix_error_word() = 0;
    d.add(fixacos(x)), d.add(fixasin(x)), d.add(pfx::fix_error_word());
  }
  EXPECT_GOLDEN("fixacos fixasin", d, 0x48b1f5540a879581ull);
}

TEST(Conformance, SquareRootAndLogarithm) {
  pfx::test::Rng rng(58);
  Digest d;
  add_table(d, log_new_FIX, 230);
  for (int32_t v = 1000; v <= 4200; ++v) d.add(log_interp_FIX(log_new_FIX, v));
  for (int i = 0; i < 20000; ++i) {
    const auto x = static_cast<int32_t>(rng.word()) >> (i % 32);
    d.add(isqrt_(x)), d.add(log_e_FIX_new(x));
  }
  for (int32_t x = -8; x <= 70000; ++x) d.add(log_e_FIX_new(x));
  EXPECT_GOLDEN("isqrt_ log", d, 0x9cfc7d2dbcd580adull);
}

}  // namespace
