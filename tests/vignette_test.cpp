// Vignette: the worked values of both variants, the table and its rule beyond 255, images too
// small to divide by and too large for the table, alpha and in-place calls.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <utility>

#include "looks/vignette.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Pixels;

using Vignette = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t);

// Red channel at (x, y) of a w x h image of one colour after the vignette.
int32_t red_at(Vignette fn, int32_t w, int32_t h, int32_t x, int32_t y, uint32_t colour) {
  const Pixels img = pfx::test::filled(w, h, colour);
  Pixels out(img.size(), 0);
  fn(img.data(), out.data(), w, h);
  return static_cast<int32_t>(
      (out[static_cast<size_t>(y) * static_cast<size_t>(w) + static_cast<size_t>(x)] >> 16) & 0xFF);
}

TEST(Vignette, TableFollowsItsRuleAndBeyond) {
  for (int64_t k = 0; k < 256; ++k) {
    const double rule = k <= 1 ? 16777216.0 : std::floor(16777216.0 / static_cast<double>(k * k));
    EXPECT_EQ(LUT_VIGNETTE[k], static_cast<int32_t>(rule)) << k;
  }
  EXPECT_EQ(LUT_VIGNETTE[2], 4194304);
  EXPECT_EQ(LUT_VIGNETTE[3], 1864135);
  EXPECT_EQ(LUT_VIGNETTE[255], 258);
  for (int64_t k : {int64_t{256}, int64_t{257}, int64_t{511}, int64_t{4096}, int64_t{4097},
                    int64_t{100000}, int64_t{1} << 27}) {
    const double rule = std::floor(16777216.0 / (static_cast<double>(k) * static_cast<double>(k)));
    EXPECT_EQ(pfx::vignette_entry(k), static_cast<int32_t>(rule)) << k;
  }
}

TEST(Vignette, DividedFallOffWorkedValues) {
  const uint32_t white = 0xFFFFFFFFu;
  EXPECT_EQ(red_at(fx_apply_vignette, 100, 100, 50, 50, white), 255);
  EXPECT_EQ(red_at(fx_apply_vignette, 100, 100, 0, 50, white), 143);
  EXPECT_EQ(red_at(fx_apply_vignette, 100, 100, 0, 0, white), 31);
  EXPECT_EQ(red_at(fx_apply_vignette, 100, 100, 99, 99, white), 40);
  const Pixels img = pfx::test::filled(2, 2, argb(0x40, 200, 200, 200));
  Pixels out(4);
  fx_apply_vignette(img.data(), out.data(), 2, 2);
  EXPECT_EQ(out[3], argb(0x40, 200, 200, 200));
  EXPECT_EQ(out[1], argb(0x40, 112, 112, 112));
  EXPECT_EQ(out[2], argb(0x40, 112, 112, 112));
  EXPECT_EQ(out[0], argb(0x40, 25, 25, 25));
}

TEST(Vignette, TableFallOffWorkedValues) {
  const uint32_t white = 0xFFFFFFFFu;
  EXPECT_EQ(red_at(fx_apply_vignette_prev, 96, 96, 48, 48, white), 255);
  EXPECT_EQ(red_at(fx_apply_vignette_prev, 96, 96, 0, 48, white), 127);
  EXPECT_EQ(red_at(fx_apply_vignette_prev, 96, 96, 0, 0, white), 0);
  EXPECT_EQ(red_at(fx_apply_vignette_prev, 100, 100, 0, 50, white), 153);
  EXPECT_EQ(red_at(fx_apply_vignette_prev, 100, 100, 0, 0, white), 51);
}

// Too narrow or too low to have a border: every pixel keeps weight 1 instead of a division by a
// half-size of zero.
TEST(Vignette, ImagesBelowTwoPixelsComeOutAsTheirSource) {
  for (auto [w, h] : {std::pair{1, 1}, std::pair{1, 7}, std::pair{9, 1}}) {
    const Pixels img = pfx::test::random_image(w, h, 90);
    Pixels out(img.size(), 0);
    fx_apply_vignette(img.data(), out.data(), w, h);
    EXPECT_EQ(out, img) << w << "x" << h;
  }
}

// Previews larger than the table covers read the same rule: the weight of every pixel of a row
// 9000 pixels wide, recomputed in double (exact at these magnitudes).
TEST(Vignette, TableFallOffCoversAnySize) {
  const int32_t w = 9000, h = 3;
  const Pixels img = pfx::test::filled(w, h, 0xFFFFFFFFu);
  Pixels out(img.size(), 0);
  fx_apply_vignette_prev(img.data(), out.data(), w, h);
  const auto factor = [](int32_t half) {
    const double k = std::floor((half + 7) / 8.0);
    return k <= 1 ? 16777216.0 : std::floor(16777216.0 / (k * k));
  };
  const double kx = factor(w / 2), ky = factor(h / 2);
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      const double dx = x - w / 2, dy = y - h / 2;
      double weight = 1073741824.0 - std::floor(dx * dx * kx / 2) - std::floor(dy * dy * ky / 2);
      weight = std::floor((weight < 0 ? 0 : weight) / 256);
      const auto c = static_cast<uint32_t>(std::floor(weight * 255 / 4194304.0));
      ASSERT_EQ(out[static_cast<size_t>(y * w + x)], argb(0xFF, c, c, c)) << x << "," << y;
    }
  }
  // So wide that the divided factor truncates to 0: no fall-off across, 9/16 at the top and
  // bottom rows, with no product overflowing on the way.
  const int32_t wide = 40000;
  EXPECT_EQ(red_at(fx_apply_vignette, wide, 3, 0, 0, 0xFFFFFFFFu), 143);
  EXPECT_EQ(red_at(fx_apply_vignette, wide, 3, 0, 1, 0xFFFFFFFFu), 255);
}

TEST(Vignette, KeepsAlphaWorksInPlaceAndRefusesBadCalls) {
  const Pixels img = pfx::test::random_image(17, 12, 91);
  for (Vignette fn : {fx_apply_vignette, fx_apply_vignette_prev}) {
    Pixels out(img.size(), 0), in_place = img;
    fn(img.data(), out.data(), 17, 12);
    fn(in_place.data(), in_place.data(), 17, 12);
    EXPECT_EQ(in_place, out);
    for (size_t i = 0; i < img.size(); ++i) EXPECT_EQ(out[i] >> 24, img[i] >> 24) << i;
    Pixels dst(img.size(), 0x77777777u);
    const Pixels before = dst;
    fn(nullptr, dst.data(), 17, 12);
    fn(img.data(), dst.data(), 0, 12);
    fn(img.data(), dst.data(), 17, -12);
    fn(img.data(), dst.data(), 65536, 65536);
    fn(img.data(), nullptr, 17, 12);
    EXPECT_EQ(dst, before);
  }
}

}  // namespace
