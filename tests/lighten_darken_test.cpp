// Lighten and darken brushes: the worked 5 x 5 disc, discs clipped at the image edges, radii
// that edit nothing, and strengths and radii far beyond the intended range.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

using Brush = void (*)(uint32_t*, int32_t, int32_t, int32_t, int32_t, int32_t, int32_t);

constexpr uint32_t kLit[3] = {0xFF969696u, 0xFF898989u, 0xFF7D7D7Du};
constexpr uint32_t kDark[3] = {0xFF323232u, 0xFF3E3E3Eu, 0xFF4B4B4Bu};
constexpr uint32_t kOpaque[3] = {0xFF646464u, 0xFF646464u, 0xFF646464u};

// The 5 x 5 image of channels 100 with a brush of radius 2 at (cx, cy), the centre possibly
// outside the image: centre, direct and diagonal neighbours get the three given colours,
// everything else stays.
TEST(LightenDarken, DiscFadesFromTheCentreToTheRimAndIsClippedAtTheEdges) {
  const struct {
    Brush brush;
    int32_t cx, cy, strength;
    const uint32_t* colours;
  } kCases[] = {
      {fx_apply_lighten, 2, 2, 50, kLit},   {fx_apply_darken, 2, 2, 50, kDark},
      {rubLighten, 2, 2, 50, kLit},         {rubDarken, 2, 2, 50, kDark},
      {fx_apply_lighten, 0, 0, 50, kLit},   {fx_apply_darken, 4, 4, 50, kDark},
      {fx_apply_darken, 4, 0, 50, kDark},   {fx_apply_lighten, -1, 2, 50, kLit},
      {fx_apply_darken, 3, 5, 50, kDark},   {fx_apply_lighten, 5, -1, 50, kLit},
      {fx_apply_lighten, 2, 2, 0, kOpaque},  // strength 0 still makes the disc opaque
      {fx_apply_darken, 1, 3, 0, kOpaque},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(testing::Message() << c.cx << "," << c.cy << " strength " << c.strength);
    Pixels img = pfx::test::filled(5, 5, 0x40646464u);
    c.brush(img.data(), c.cx, c.cy, 5, 5, c.strength, 2);
    for (int32_t y = 0; y < 5; ++y) {
      for (int32_t x = 0; x < 5; ++x) {
        const int32_t d2 = (x - c.cx) * (x - c.cx) + (y - c.cy) * (y - c.cy);
        EXPECT_EQ(img[static_cast<size_t>(y * 5 + x)], d2 <= 2 ? c.colours[d2] : 0x40646464u)
            << x << "," << y;
      }
    }
  }
}

TEST(LightenDarken, NoRadiusNoImageOrNoPixelsEditNothing) {
  fx_apply_lighten(nullptr, 1, 1, 4, 4, 50, 3);
  rubDarken(nullptr, 1, 1, 4, 4, 50, 3);
  const Pixels img = pfx::test::random_image(6, 6, 4);
  Pixels out = img;
  for (Brush brush : {&fx_apply_lighten, &fx_apply_darken}) {
    for (int32_t radius : {0, -1, -3, INT32_MIN}) brush(out.data(), 3, 3, 6, 6, 200, radius);
    brush(out.data(), 1, 1, 0, 4, 50, 3);
    brush(out.data(), 1, 1, 4, -4, 50, 3);
    brush(out.data(), 1, 1, 65536, 65536, 50, 3);  // beyond the addressable size
  }
  EXPECT_EQ(out, img);
}

// Strengths and radii whose products no longer fit 32 bits: the results stay those of exact
// arithmetic (and the sanitizer build checks that nothing overflows on the way).
TEST(LightenDarken, ExtremeStrengthsAndRadiiStayExact) {
  const Pixels img = pfx::test::random_image(5, 4, 6);
  const auto expect_all = [](const Pixels& out, auto expected) {
    for (size_t i = 0; i < out.size(); ++i) EXPECT_EQ(out[i], expected(i)) << i;
  };
  const auto opaque = [&](size_t i) { return img[i] | 0xFF000000u; };

  // Every pixel of this 5 x 4 image lies within d^2 <= 8 < 9 of the centre.
  Pixels out = img;
  fx_apply_lighten(out.data(), 2, 2, 5, 4, INT32_MAX, 3);
  expect_all(out, [](size_t) { return 0xFFFFFFFFu; });
  out = img;
  fx_apply_darken(out.data(), 2, 2, 5, 4, INT32_MAX, 3);
  expect_all(out, [](size_t) { return 0xFF000000u; });

  // Pushing the wrong way changes no colour, only the alpha inside the disc.
  out = img;
  fx_apply_lighten(out.data(), 2, 1, 5, 4, INT32_MIN, 1000);
  expect_all(out, opaque);
  out = img;
  fx_apply_darken(out.data(), 2, 1, 5, 4, -INT32_MAX, 1000);
  expect_all(out, opaque);

  // A radius of 2048 gives the reciprocal 1 and the widest weights; the full strength still
  // lifts a channel of 100 to the limit at the centre.
  out = pfx::test::filled(5, 4, 0x00646464u);
  fx_apply_lighten(out.data(), 2, 2, 5, 4, INT32_MAX, 2048);
  expect_all(out, [](size_t) { return 0xFFFFFFFFu; });

  // Beyond a radius of 2048 the reciprocal 2^22 / R^2 is 0: lightening changes no colour.
  for (int32_t radius : {2049, 46341, INT32_MAX}) {
    out = img;
    fx_apply_lighten(out.data(), 2, 2, 5, 4, 255, radius);
    expect_all(out, opaque);
  }
}

}  // namespace
