// Tone curves: identities, the worked values, the channel selector, the gamma curve against its
// rule, empty level ranges and levels outside 0..255, and refused calls.
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

// The 256 grey levels 0..255 in one row, with an alpha that must survive.
Pixels grey_ramp() {
  Pixels px(256);
  for (uint32_t v = 0; v < 256; ++v) px[v] = argb(0x5A, v, v, v);
  return px;
}

// What a curve made of the red channel of a ramp passed through a call.
template <class Call>
std::vector<int32_t> curve_of(Call call) {
  const Pixels ramp = grey_ramp();
  Pixels out(256, 0);
  call(ramp.data(), out.data());
  std::vector<int32_t> curve(256);
  for (size_t v = 0; v < 256; ++v) curve[v] = pfx::red_of(out[v]);
  return curve;
}

std::vector<int32_t> gamma_curve(double gamma) {
  return curve_of([&](const uint32_t* s, uint32_t* d) { control_gamma(s, d, 256, 1, 0, gamma); });
}

TEST(ToneCurves, NeutralSettingsAreIdentities) {
  const Pixels img = pfx::test::random_image(13, 9, 81);
  Pixels out(img.size());
  control_gamma(img.data(), out.data(), 13, 9, 0, 1.0);
  EXPECT_EQ(out, img);
  out.assign(img.size(), 0);
  changeHistogramByInput(img.data(), out.data(), 13, 9, 0, 0, 255);
  EXPECT_EQ(out, img);
  out.assign(img.size(), 0);
  changeHistogramByOutput(img.data(), out.data(), 13, 9, 0, 0, 255);
  EXPECT_EQ(out, img);
}

TEST(ToneCurves, LevelsTruncateTheirScale) {
  const auto in = curve_of(
      [](const uint32_t* s, uint32_t* d) { changeHistogramByInput(s, d, 256, 1, 0, 28, 255); });
  EXPECT_EQ(in[255], 254);
  EXPECT_EQ(in[29], 1);
  for (int32_t v = 0; v <= 28; ++v) EXPECT_EQ(in[static_cast<size_t>(v)], 0) << v;
  const auto out = curve_of(
      [](const uint32_t* s, uint32_t* d) { changeHistogramByOutput(s, d, 256, 1, 0, 45, 255); });
  EXPECT_EQ(out[0], 45);
  EXPECT_EQ(out[128], 150);
  EXPECT_EQ(out[255], 254);
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
  EXPECT_EQ(gamma_curve(0.77)[128], 104);
  EXPECT_EQ(gamma_curve(2.35)[128], 190);
  for (double gamma : {0.01, 0.77, 1.0, 2.35, 100.0}) {
    EXPECT_EQ(gamma_curve(gamma)[0], 0);
    EXPECT_EQ(gamma_curve(gamma)[255], 255);
  }
}

// Gammas the library never passes: zero and NaN leave only 255 lit, a negative gamma lights
// everything. Each is a byte curve, reached without converting an infinity to an integer.
TEST(ToneCurves, DegenerateGammasStillGiveByteCurves) {
  const auto zero = gamma_curve(0.0);
  const auto nan = gamma_curve(std::numeric_limits<double>::quiet_NaN());
  const auto negative = gamma_curve(-1.0);
  for (size_t n = 0; n < 255; ++n) {
    EXPECT_EQ(zero[n], 0) << n;
    EXPECT_EQ(nan[n], 0) << n;
    EXPECT_EQ(negative[n], 255) << n;
  }
  EXPECT_EQ(zero[255], 255);
  EXPECT_EQ(nan[255], 255);
}

TEST(ToneCurves, ChannelSelectorPicksTheChannels) {
  const uint32_t p = argb(0x33, 100, 150, 200);
  const auto run = [p](int32_t channel) {
    uint32_t out = 0;
    changeHistogramByInput(&p, &out, 1, 1, channel, 50, 250);
    return out;
  };
  // 100, 150 and 200 stretched from 50..250: 63, 127, 191.
  EXPECT_EQ(run(0), argb(0x33, 63, 127, 191));
  EXPECT_EQ(run(1), argb(0x33, 63, 150, 200));
  EXPECT_EQ(run(2), argb(0x33, 100, 127, 200));
  EXPECT_EQ(run(3), argb(0x33, 100, 150, 191));
  for (int32_t channel : {4, -1, INT32_MIN}) EXPECT_EQ(run(channel), p) << channel;
  uint32_t out = 0;
  control_gamma(&p, &out, 1, 1, 2, 2.35);
  EXPECT_EQ(out & 0xFFFF00FFu, p & 0xFFFF00FFu);
  EXPECT_NE(out, p);
}

TEST(ToneCurves, EmptyRangesAndRefusedCallsWriteNothing) {
  const Pixels img = pfx::test::random_image(6, 5, 82);
  Pixels dst(img.size(), 0xC3C3C3C3u);
  const Pixels before = dst;
  changeHistogramByInput(img.data(), dst.data(), 6, 5, 0, 100, 100);
  changeHistogramByOutput(img.data(), dst.data(), 6, 5, 0, 100, 99);
  changeHistogramByInput(img.data(), dst.data(), 6, 5, 0, INT32_MAX, INT32_MIN);
  control_gamma(nullptr, dst.data(), 6, 5, 0, 1.5);
  changeHistogramByInput(nullptr, dst.data(), 6, 5, 0, 0, 200);
  changeHistogramByOutput(img.data(), dst.data(), 65536, 65536, 0, 0, 200);
  control_gamma(img.data(), dst.data(), -6, 5, 0, 1.5);
  EXPECT_EQ(dst, before);
  control_gamma(img.data(), nullptr, 6, 5, 0, 1.5);  // must simply return
}

// Levels beyond 0..255 follow the same formulas in exact arithmetic, held to a byte.
TEST(ToneCurves, LevelsOutsideTheByteRangeDoNotOverflow) {
  const auto wide_in = curve_of([](const uint32_t* s, uint32_t* d) {
    changeHistogramByInput(s, d, 256, 1, 0, INT32_MIN, INT32_MAX);
  });
  for (int32_t v : wide_in) EXPECT_EQ(v, 0);
  const auto shifted_in = curve_of(
      [](const uint32_t* s, uint32_t* d) { changeHistogramByInput(s, d, 256, 1, 0, -255, 255); });
  EXPECT_EQ(shifted_in[0], 127);  // scale 512: (512 x 255) >> 10
  EXPECT_EQ(shifted_in[255], 255);
  const auto out = curve_of(
      [](const uint32_t* s, uint32_t* d) { changeHistogramByOutput(s, d, 256, 1, 0, -300, 600); });
  EXPECT_EQ(out[0], 0);
  EXPECT_EQ(out[100], 52);  // scale 3614: (3614 x 100) >> 10 = 352, less 300
  EXPECT_EQ(out[255], 255);
  const auto huge = curve_of([](const uint32_t* s, uint32_t* d) {
    changeHistogramByOutput(s, d, 256, 1, 0, INT32_MIN, INT32_MAX);
  });
  EXPECT_EQ(huge[0], 0);
  EXPECT_EQ(huge[255], 255);
}

}  // namespace
