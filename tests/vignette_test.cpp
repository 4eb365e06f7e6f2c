// Vignette: the table and its rule beyond 255, images too small to divide by and too large for
// the table.
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

// Red channel at (x, y) of a w x h white image after the vignette.
int32_t red_at(void (*fn)(const uint32_t*, uint32_t*, int32_t, int32_t), int32_t w, int32_t h,
               int32_t x, int32_t y) {
  const Pixels img = pfx::test::filled(w, h, 0xFFFFFFFFu);
  Pixels out(img.size(), 0);
  fn(img.data(), out.data(), w, h);
  return static_cast<int32_t>(
      (out[static_cast<size_t>(y) * static_cast<size_t>(w) + static_cast<size_t>(x)] >> 16) & 0xFF);
}

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
  const auto factor = [](int32_t half) { return vignette_rule(std::floor((half + 7) / 8.0)); };
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
  EXPECT_EQ(red_at(fx_apply_vignette, 40000, 3, 0, 0), 143);
  EXPECT_EQ(red_at(fx_apply_vignette, 40000, 3, 0, 1), 255);
}

}  // namespace
