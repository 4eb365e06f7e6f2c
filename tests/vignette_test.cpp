// Vignette: the fall-off table against its rule, within the table and beyond it.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <utility>

#include "looks/vignette.h"
#include "photofx.h"
#include "support/images.h"

namespace {

// 2^24 / k^2, truncated, and 2^24 for k <= 1.
double vignette_rule(double k) { return k <= 1 ? 16777216.0 : std::floor(16777216.0 / (k * k)); }

TEST(Vignette, TableFollowsItsRuleAndBeyond) {
  for (int64_t k = 0; k < 256; ++k) {
    EXPECT_EQ(LUT_VIGNETTE[k], static_cast<int32_t>(vignette_rule(static_cast<double>(k)))) << k;
  }
  for (int64_t k : {int64_t{256}, int64_t{257}, int64_t{511}, int64_t{4096}, int64_t{4097},
                    int64_t{100000}, int64_t{1} << 27}) {
    EXPECT_EQ(pfx::vignette_entry(k), static_cast<int32_t>(vignette_rule(static_cast<double>(k))))
        << k;
  }
}

}  // namespace
