// Old photo: the plain look's table, sizes beyond the vignette table, its partial rule over the
// whole image; the textured look over transparent pixels and in place.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Mask;
using pfx::test::Pixels;

constexpr uint32_t kGrey = 0xFF808080u;

// (v - 128) / 10 rounded away from zero.
TEST(OldPhoto, TableFollowsItsRule) {
  for (int32_t v = 0; v < 256; ++v) {
    const double d = v - 128.0;
    const double rule = d == 0 ? 0 : std::copysign(std::ceil(std::fabs(d) / 10), d);
    EXPECT_EQ(LUT_OLDPHOTO[v], static_cast<int32_t>(rule)) << v;
  }
}

}  // namespace
