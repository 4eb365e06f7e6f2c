// Old photo: the plain look's table against its rule.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>

#include "photofx.h"

namespace {

// (v - 128) / 10 rounded away from zero.
TEST(OldPhoto, TableFollowsItsRule) {
  for (int32_t v = 0; v < 256; ++v) {
    const double d = v - 128.0;
    const double rule = d == 0 ? 0 : std::copysign(std::ceil(std::fabs(d) / 10), d);
    EXPECT_EQ(LUT_OLDPHOTO[v], static_cast<int32_t>(rule)) << v;
  }
}

}  // namespace
