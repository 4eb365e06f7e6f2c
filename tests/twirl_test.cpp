// Twirl: the square-root and sine tables against <cmath>, the fixed points of the warp (angle 0,
// the centre, the rim), the direction of the turn, the argument checks, and radii whose distances
// need more than 31 bits.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <cstdlib>

#include "frame/frame.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

TEST(TwirlTables, SquareRootStepsAreTheRoundedRootsOfTheirLowerEnds) {
  const struct {
    const int32_t* table;
    int32_t n, step, first;
  } tables[] = {{SQRT_STEP_1, 128, 1, 0},
                {SQRT_STEP_2, 480, 4, 128},
                {SQRT_STEP_3, 768, 8, 2048},
                {SQRT_STEP_4, 65536, 64, 0}};
  for (const auto& t : tables) {
    for (int32_t j = 0; j < t.n; ++j) {
      const double u = static_cast<double>(t.step) * j + t.first;
      ASSERT_EQ(t.table[j], static_cast<int32_t>(std::llround(256.0 * std::sqrt(u))))
          << t.step << " " << j;
    }
  }
}

TEST(TwirlTables, SineIsTheRoundedQuarterWave) {
  for (int32_t k = 0; k <= 4096; ++k) {
    const double exact = 32768.0 * std::sin(2.0 * 3.14159265358979323846 * k / 16384.0);
    ASSERT_GT(std::fabs(exact - std::floor(exact) - 0.5), 1e-6) << k;
    ASSERT_EQ(SIN[k], static_cast<int32_t>(std::llround(exact))) << k;
  }
  EXPECT_EQ(SIN[3655], 32301);  // 32300.50003 to 60 digits, the entry closest to a half
}

struct Warped {
  int32_t code;
  Pixels px;
};

Warped twirl(const Pixels& src, int32_t w, int32_t h, int32_t cx, int32_t cy, int32_t radius,
             int32_t angle, pfx::Rect win = {0, -1, 0, -1}, uint32_t fast = 0) {
  if (win.right < 0) win = {0, w - 1, 0, h - 1};
  Warped r{0, Pixels(src.size(), 0xDEADBEEFu)};
  r.code = fx_twirl(src.data(), r.px.data(), w, h, cx, cy, radius, angle, win.left, win.right,
                    win.top, win.bottom, fast);
  return r;
}

// Angle 0 copies the image exactly. Otherwise the centre samples itself, and only pixels strictly
// inside the rim are warped (made opaque, which the source's alpha 0x40 tells apart).
TEST(Twirl, AngleZeroTheCentreAndTheRimKeepTheirPixels) {
  const Pixels random = pfx::test::random_image(17, 13, 20);
  EXPECT_EQ(twirl(random, 17, 13, 8, 6, 40, 0).px, random);
  Pixels src = pfx::test::random_image(21, 21, 21);
  for (uint32_t& p : src) p = (p & 0xFFFFFFu) | 0x40000000u;
  for (int32_t angle : {-360, -90, 1, 45, 200, 360}) {
    const Warped r = twirl(src, 21, 21, 10, 10, 5, angle);
    ASSERT_EQ(r.code, PHOTOFX_SUCCESS);
    EXPECT_EQ(r.px[10 * 21 + 10], src[10 * 21 + 10] | 0xFF000000u) << angle;
    for (size_t i = 0; i < src.size(); ++i) {
      const int32_t x = int32_t(i % 21), y = int32_t(i / 21);
      // d2 = 25 (for example 3^2 + 4^2) lies on the rim and keeps its pixel.
      if ((x - 10) * (x - 10) + (y - 10) * (y - 10) >= 25) {
        ASSERT_EQ(r.px[i], src[i]) << x << "," << y;
      } else {
        ASSERT_EQ(r.px[i] >> 24, 0xFFu) << x << "," << y;
      }
    }
  }
}

TEST(Twirl, PositiveAnglesTurnFromDownTowardRight) {
  // Left half blue, right half red, the centre column green. Near the centre the twist is
  // almost the full angle, so the pixel two below the centre samples two to the right of it
  // for +90 and two to the left for -90.
  const int32_t w = 41, c = 20;
  Pixels src(static_cast<size_t>(w * w));
  for (size_t i = 0; i < src.size(); ++i) {
    const int32_t x = int32_t(i % w);
    src[i] = x < c ? 0xFF0000FFu : (x > c ? 0xFFFF0000u : 0xFF00FF00u);
  }
  EXPECT_EQ(twirl(src, w, w, c, c, 20, 90).px[(c + 2) * w + c], 0xFFFF0000u);
  EXPECT_EQ(twirl(src, w, w, c, c, 20, -90).px[(c + 2) * w + c], 0xFF0000FFu);
}

// Angles beyond a turn, radius 0, centres outside the image, missing buffers and one buffer as
// source and destination (the warp would read pixels it had already moved) are refused.
TEST(Twirl, BadArgumentsWriteNothing) {
  Pixels src = pfx::test::random_image(8, 6, 22);
  const Pixels original = src, untouched(src.size(), 0xDEADBEEFu);
  Pixels dst = untouched;
  const struct {
    const uint32_t* s;
    uint32_t* d;
    int32_t cx, cy, radius, angle;
  } cases[] = {
      // clang-format off
      {src.data(), dst.data(), 4, 3, 3, 361},  {src.data(), dst.data(), 4, 3, 3, -361},
      {src.data(), dst.data(), 4, 3, 0, 90},   {src.data(), dst.data(), 8, 3, 3, 90},
      {src.data(), dst.data(), 4, -1, 3, 90},  {src.data(), dst.data(), 4, 6, 3, 90},
      {nullptr, dst.data(), 4, 3, 3, 90},      {src.data(), nullptr, 4, 3, 3, 90},
      {src.data(), src.data(), 4, 3, 3, 90},
      // clang-format on
  };
  for (const auto& c : cases) {
    EXPECT_EQ(fx_twirl(c.s, c.d, 8, 6, c.cx, c.cy, c.radius, c.angle, 0, 7, 0, 5, 0),
              PHOTOFX_INVALID_ARGUMENT)
        << &c - cases;
  }
  runTwirl(src.data(), dst.data(), 8, 6, 4, 3, 0, 90, 0, 7, 0, 5, 0);
  EXPECT_EQ(dst, untouched);
  EXPECT_EQ(src, original);
  EXPECT_EQ(fx_twirl(src.data(), dst.data(), 8, 6, 4, 3, 1, 360, 0, 7, 0, 5, 0), PHOTOFX_SUCCESS);
}

TEST(Twirl, LargeRadiiKeepEachPixelAtItsDistanceNearTheRim) {
  // Radius 5000 makes radius * rho pass 2^31 beyond about 4100 pixels out; radius 40000 is far
  // past where the 30-bit reciprocal of radius^2 would be 0. Near the rim the twist is small,
  // so a pixel on the row of the centre samples close to its own distance; the weighting of the
  // distance's bytes adds at most half a pixel.
  for (int32_t radius : {5000, 40000}) {
    const int32_t c = radius, w = 2 * radius + 1;
    const Warped r = twirl(pfx::test::distance_code(w, c), w, 1, c, 0, radius, 90);
    ASSERT_EQ(r.code, PHOTOFX_SUCCESS);
    for (int32_t x = 0; x < w; ++x) {
      const int32_t d = std::abs(x - c);
      if (d < radius * 85 / 100) continue;
      // The twist is at most 90 * (1 - 0.85) = 13.5 degrees: |sin| >= 0.97.
      const int32_t got = pfx::test::distance_named(r.px[static_cast<size_t>(x)]);
      ASSERT_LE(got, d + 1) << radius << " " << x;
      ASSERT_GE(got, d * 97 / 100 - 1) << radius << " " << x;
    }
  }
}

}  // namespace
