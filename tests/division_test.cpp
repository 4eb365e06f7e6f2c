// Every division the pixel loops make by multiplying (frame/divide.h, and the blur's reciprocal
// table), against true division over the whole range its callers give it.
#include <gtest/gtest.h>

#include <cstdint>
#include <set>

#include "blur/gaussian.h"
#include "frame/divide.h"
#include "photofx.h"

namespace {

TEST(Division, ConstantDivisorsAreExactOverTheirRanges) {
  for (int32_t a = 0; a <= 1019; ++a) ASSERT_EQ(pfx::contrast_step(a), (a + 9) / 10) << a;
  for (uint32_t sum = 0; sum <= 765; ++sum) ASSERT_EQ(pfx::third(sum), sum / 3) << sum;
  for (int32_t x = 0; x < 1 << 14; ++x) ASSERT_EQ(pfx::div36(x), x / 36) << x;
  for (uint32_t x = 0; x < 1u << 23; ++x) {
    ASSERT_EQ(pfx::quotient_25500(x), static_cast<int32_t>(x / 25500)) << x;
  }
}

TEST(Division, BlurReciprocalsAreExactForEverySumOfEveryWeight) {
  for (uint32_t weight = 1; weight <= 81; ++weight) {
    for (uint32_t sum = 0; sum <= 255 * weight; ++sum) {
      ASSERT_EQ((sum * pfx::kBlurReciprocal[weight]) >> pfx::kBlurReciprocalShift, sum / weight)
          << sum << " / " << weight;
    }
  }
}

// Every divisor the bulge forms (levels 1 ... 100, falloff index 0 ... 256) with every offset
// below 2^13.
TEST(Division, BulgeQuotientIsExactForEveryDivisorTheWarpForms) {
  std::set<uint32_t> divisors;
  for (int64_t level = 1; level <= 100; ++level) {
    for (int32_t t = 0; t <= 256; ++t) {
      const int64_t e = (t == 256 ? 0 : EXP_n7[t]) >> 7;
      divisors.insert(static_cast<uint32_t>(((75 * level * e) >> 12) + (1 << 18)));
    }
  }
  for (uint32_t den : divisors) {
    const uint32_t recip = static_cast<uint32_t>((int64_t{1} << 37) / den);
    for (uint32_t m = 0; m < 1u << 13; ++m) {
      const pfx::QuotientRemainder qr = pfx::bulge_quotient(m, den, recip);
      const uint64_t n = uint64_t{m} << 18;
      ASSERT_TRUE(qr.q == n / den && qr.r == n % den) << m << " / " << den;
    }
  }
}

}  // namespace
