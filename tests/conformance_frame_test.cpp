// Conformance goldens of the pixel foundation and the fixed-point arithmetic: every table and
// a sweep of every function over awkward arguments.
#include <gtest/gtest.h>

#include <cmath>

#include "fixmath/fixed.h"
#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::test::Digest;

TEST(Conformance, HsvTablesAndConversion) {
  Digest d;
  d.add(LUT_DELTA, 256);
  d.add(LUT_DELTA2, 256);
  for (int32_t r = 0; r < 256; r += 5) {
    for (int32_t g = 0; g < 256; g += 7) {
      for (int32_t b = 0; b < 256; b += 3) {
        int32_t h, s, v, r2, g2, b2;
        fx_rgb2hsv(r, g, b, &h, &s, &v);
        fx_hsv2rgb(h, s, v, &r2, &g2, &b2);
        d.add(h), d.add(s), d.add(v), d.add(r2), d.add(g2), d.add(b2);
      }
    }
  }
  EXPECT_GOLDEN("hsv", d, 0x65934b4f1c6bb7a2ull);
}

TEST(Conformance, FixedPoint) {
  pfx::test::Rng rng(51);
  Digest d;
  for (int i = 0; i < 20000; ++i) {
    // Mix of small, large and boundary arguments.
    const int32_t a = static_cast<int32_t>(i % 4 == 0 ? rng.word() : rng.word() >> (i % 31));
    const int32_t b = static_cast<int32_t>(i % 3 == 0 ? rng.word() : rng.word() >> (i % 29));
    pfx::fix_error_word() = 0;
    d.add(ftofix(static_cast<double>(a) / 65536.0 * 1.37));
    d.add(itofix(a)), d.add(fixtoi(a)), d.add(fixfloor(a)), d.add(fixceil(a));
    d.add(fixadd(a, b)), d.add(fixsub(a, b)), d.add(fixmul(a, b));
    d.add(fixdiv(a, b)), d.add(idiv(a, b)), d.add(iidiv(a, b));
    d.add(static_cast<int64_t>(std::llround(fixtof(a) * 4.0)));
    d.add(pfx::fix_error_word());
  }
  EXPECT_GOLDEN("fixed-point", d, 0xecabf277005e19e7ull);
}

}  // namespace
