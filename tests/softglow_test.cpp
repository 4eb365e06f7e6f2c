// Soft glow: the value curve by level, on an image too small for the blur kernel.
#include <gtest/gtest.h>

#include <cstdint>

#include "frame/frame.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Pixels;

uint32_t grey(uint32_t v) { return argb(0xFF, v, v, v); }

// Two by two has no inner pixel: only the value curve by level applies.
TEST(SoftGlow, ValueCurveByLevel) {
  const auto glow = [](const Pixels& img, int32_t level) {
    Pixels out(4, 0);
    EXPECT_EQ(fx_softglow(img.data(), out.data(), 2, 2, level), PHOTOFX_SUCCESS);
    return out;
  };
  EXPECT_EQ(glow({grey(10), grey(200), grey(64), grey(128)}, 100),
            (Pixels{grey(0), grey(255), grey(32), grey(128)}));
  // (3906 + 5000) / 100 = 89, and 256 held to 255.
  EXPECT_EQ(glow({grey(100), grey(200), grey(64), grey(0)}, 50),
            (Pixels{grey(89), grey(255), grey(48), grey(0)}));
}

}  // namespace
