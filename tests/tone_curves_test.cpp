// Tone curves: the gamma curve against its rule, degenerate gammas, levels outside 0..255 and
// empty level ranges.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <iterator>
#include <limits>
#include <vector>

#include "frame/pixel.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Pixels;

// The red channel of the grey ramp 0..255 passed through a call: the curve it applies.
template <class Call>
std::vector<int32_t> curve_of(Call call) {
  Pixels ramp(256), out(256, 0xA5A5A5A5u);  // a curve not written shows as 165
  for (uint32_t v = 0; v < 256; ++v) ramp[v] = argb(0x5A, v, v, v);
  call(ramp.data(), out.data());
  std::vector<int32_t> curve(256);
  for (size_t v = 0; v < 256; ++v) curve[v] = pfx::red_of(out[v]);
  return curve;
}

std::vector<int32_t> gamma_curve(double gamma) {
  return curve_of([&](const uint32_t* s, uint32_t* d) { control_gamma(s, d, 256, 1, 0, gamma); });
}

// The curve is n / 255 to the power 1 / gamma, rounded half up, recomputed here in long double.
// No entry may lie within a hair of a rounding boundary, or the last bit of pow on one platform
// could change it; and the single-precision gammas of the vintage look give the same curves as
// their decimal values.
TEST(ToneCurves, GammaCurveFollowsThePowerRule) {
  const float single[] = {1.09f, 1.06f, 1.15f, 1.03f, 2.35f, 0.58f};
  const double decimal[] = {1.09, 1.06, 1.15, 1.03, 2.35, 0.58};
  for (size_t g = 0; g < std::size(single); ++g) {
    const auto curve = gamma_curve(static_cast<double>(single[g]));
    EXPECT_EQ(curve, gamma_curve(decimal[g])) << decimal[g];
    for (int32_t n = 0; n < 256; ++n) {
      const long double t =
          std::pow(static_cast<long double>(n) / 255.0L, 1.0L / decimal[g]) * 255.0L + 0.5L;
      EXPECT_EQ(curve[static_cast<size_t>(n)], static_cast<int32_t>(std::floor(t))) << n;
      if (n != 0 && n != 255) {
        EXPECT_GT(std::fabs(t - std::round(t)), 1e-9L) << n;
      }
    }
  }
  for (double gamma : {0.01, 100.0}) {
    EXPECT_EQ(gamma_curve(gamma)[0], 0);
    EXPECT_EQ(gamma_curve(gamma)[255], 255);
  }
}

using Levels = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t, int32_t, int32_t, int32_t);

}  // namespace
