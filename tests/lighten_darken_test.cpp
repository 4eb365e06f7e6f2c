// Lighten and darken brushes: the worked 5 x 5 disc, discs clipped at the image edges, radii
// that edit nothing, and strengths and radii far beyond the intended range.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

using Brush = void (*)(uint32_t*, int32_t, int32_t, int32_t, int32_t, int32_t, int32_t);

uint32_t at(const Pixels& img, int32_t w, int32_t x, int32_t y) {
  return img[static_cast<size_t>(y * w + x)];
}

// The 5 x 5 image of channels 100 with a brush of radius 2 at (cx, cy): centre, direct and
// diagonal neighbours get the three given colours, everything else stays.
void expect_disc(Brush brush, int32_t cx, int32_t cy, uint32_t centre, uint32_t side,
                 uint32_t diagonal, int32_t strength = 50) {
  Pixels img = pfx::test::filled(5, 5, 0x40646464u);
  brush(img.data(), cx, cy, 5, 5, strength, 2);
  for (int32_t y = 0; y < 5; ++y) {
    for (int32_t x = 0; x < 5; ++x) {
      const int32_t d2 = (x - cx) * (x - cx) + (y - cy) * (y - cy);
      const uint32_t expected =
          d2 == 0 ? centre : (d2 == 1 ? side : (d2 == 2 ? diagonal : 0x40646464u));
      EXPECT_EQ(at(img, 5, x, y), expected) << x << "," << y;
    }
  }
}

TEST(LightenDarken, DiscFadesFromTheCentreToTheRim) {
  expect_disc(&fx_apply_lighten, 2, 2, 0xFF969696u, 0xFF898989u, 0xFF7D7D7Du);
  expect_disc(&fx_apply_darken, 2, 2, 0xFF323232u, 0xFF3E3E3Eu, 0xFF4B4B4Bu);
  expect_disc(&rubLighten, 2, 2, 0xFF969696u, 0xFF898989u, 0xFF7D7D7Du);
  expect_disc(&rubDarken, 2, 2, 0xFF323232u, 0xFF3E3E3Eu, 0xFF4B4B4Bu);
}

TEST(LightenDarken, StrengthZeroStillMakesTheDiscOpaque) {
  expect_disc(&fx_apply_lighten, 2, 2, 0xFF646464u, 0xFF646464u, 0xFF646464u, 0);
  expect_disc(&fx_apply_darken, 1, 3, 0xFF646464u, 0xFF646464u, 0xFF646464u, 0);
}

TEST(LightenDarken, CornerCentreEditsOnlyTheQuarterInside) {
  expect_disc(&fx_apply_lighten, 0, 0, 0xFF969696u, 0xFF898989u, 0xFF7D7D7Du);
  expect_disc(&fx_apply_darken, 4, 4, 0xFF323232u, 0xFF3E3E3Eu, 0xFF4B4B4Bu);
  expect_disc(&fx_apply_darken, 4, 0, 0xFF323232u, 0xFF3E3E3Eu, 0xFF4B4B4Bu);
}

// Over the intended strengths (0..255) every product of the brush formula fits 32 bits; the
// brushes must give exactly the formula's values there, also where the disc is cut by an edge
// or its centre lies outside the image.
int32_t formula_channel(bool lighten, int32_t c, int32_t d2, int32_t r2, int32_t strength) {
  const int32_t inv = 4194304 / r2;
  const int32_t target = lighten ? c + strength : c - strength;
  const int32_t v = ((c * d2 + target * (r2 - d2)) * inv) >> 22;
  if (lighten) return std::max(c, std::min(v, 255));
  return std::min(c, std::max(v, 0));
}

TEST(LightenDarken, MatchesTheFormulaOverTheIntendedRange) {
  constexpr int32_t kW = 33, kH = 27;
  pfx::test::Rng rng(3);
  for (bool lighten : {true, false}) {
    for (int trial = 0; trial < 40; ++trial) {
      const Pixels img = pfx::test::random_image(kW, kH, 10 + static_cast<uint64_t>(trial));
      const int32_t cx = rng.between(-5, kW + 5), cy = rng.between(-5, kH + 5);
      const int32_t strength = rng.between(0, 255), radius = rng.between(1, 40);
      Pixels out = img;
      (lighten ? fx_apply_lighten : fx_apply_darken)(out.data(), cx, cy, kW, kH, strength, radius);
      for (int32_t y = 0; y < kH; ++y) {
        for (int32_t x = 0; x < kW; ++x) {
          const uint32_t p = at(img, kW, x, y);
          const int32_t d2 = (x - cx) * (x - cx) + (y - cy) * (y - cy);
          uint32_t expected = p;
          if (d2 < radius * radius) {
            const auto ch = [&](int shift) {
              const int32_t c = static_cast<int32_t>((p >> shift) & 255);
              return static_cast<uint32_t>(
                         formula_channel(lighten, c, d2, radius * radius, strength))
                     << shift;
            };
            expected = 0xFF000000u | ch(16) | ch(8) | ch(0);
          }
          ASSERT_EQ(at(out, kW, x, y), expected) << x << "," << y << " trial " << trial;
        }
      }
    }
  }
}

TEST(LightenDarken, ZeroOrNegativeRadiusEditsNothing) {
  const Pixels img = pfx::test::random_image(6, 6, 4);
  for (Brush brush : {&fx_apply_lighten, &fx_apply_darken}) {
    for (int32_t radius : {0, -1, -3, INT32_MIN}) {
      Pixels out = img;
      brush(out.data(), 3, 3, 6, 6, 200, radius);
      EXPECT_EQ(out, img) << radius;
    }
  }
}

TEST(LightenDarken, MissingImageOrEmptySizesEditNothing) {
  fx_apply_lighten(nullptr, 1, 1, 4, 4, 50, 3);
  rubDarken(nullptr, 1, 1, 4, 4, 50, 3);
  const Pixels img = pfx::test::random_image(4, 4, 5);
  Pixels out = img;
  fx_apply_lighten(out.data(), 1, 1, 0, 4, 50, 3);
  fx_apply_darken(out.data(), 1, 1, 4, -4, 50, 3);
  fx_apply_darken(out.data(), 1, 1, 65536, 65536, 50, 3);  // beyond the addressable size
  EXPECT_EQ(out, img);
}

// Strengths and radii whose products no longer fit 32 bits: the results stay those of exact
// arithmetic (and the sanitizer build checks that nothing overflows on the way).
TEST(LightenDarken, ExtremeStrengthsAndRadiiStayExact) {
  const Pixels img = pfx::test::random_image(5, 4, 6);
  const auto opaque = [](uint32_t p) { return p | 0xFF000000u; };

  // Every pixel of this 5 x 4 image lies within d^2 <= 8 < 9 of the centre.
  Pixels out = img;
  fx_apply_lighten(out.data(), 2, 2, 5, 4, INT32_MAX, 3);
  for (uint32_t p : out) EXPECT_EQ(p, 0xFFFFFFFFu);
  out = img;
  fx_apply_darken(out.data(), 2, 2, 5, 4, INT32_MAX, 3);
  for (uint32_t p : out) EXPECT_EQ(p, 0xFF000000u);

  // Pushing the wrong way changes no colour, only the alpha inside the disc.
  for (Brush brush : {&fx_apply_lighten, &fx_apply_darken}) {
    out = img;
    const int32_t strength = brush == &fx_apply_lighten ? INT32_MIN : -INT32_MAX;
    brush(out.data(), 2, 1, 5, 4, strength, 1000);
    for (size_t i = 0; i < img.size(); ++i) EXPECT_EQ(out[i], opaque(img[i])) << i;
  }

  // A radius of 2048 gives the reciprocal 1 and the widest weights; the full strength still
  // lifts a channel of 100 to the limit at the centre.
  out = pfx::test::filled(5, 4, 0x00646464u);
  fx_apply_lighten(out.data(), 2, 2, 5, 4, INT32_MAX, 2048);
  for (uint32_t p : out) EXPECT_EQ(p, 0xFFFFFFFFu);

  // Beyond a radius of 2048 the reciprocal 2^22 / R^2 is 0: lightening changes no colour.
  for (int32_t radius : {2049, 46341, INT32_MAX}) {
    out = img;
    fx_apply_lighten(out.data(), 2, 2, 5, 4, 255, radius);
    for (size_t i = 0; i < img.size(); ++i) EXPECT_EQ(out[i], opaque(img[i])) << radius;
  }
}

}  // namespace
