// Vintage: sizes the vignette cannot divide by or its table does not cover, and the partial
// variant's compositing.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Mask;
using pfx::test::Pixels;

constexpr uint32_t kGrey = 0xFF808080u;

Pixels vintage(const Pixels& img, int32_t w, int32_t h) {
  Pixels out(img.size(), 0);
  fx_apply_vintage(img.data(), out.data(), w, h);
  return out;
}

// A single pixel or a single row has no border for the vignette to divide by; the chain then
// gives every pixel the colour the centre of a larger image gets.
TEST(Vintage, ImagesBelowTwoPixelsKeepTheCentreColour) {
  for (uint32_t colour : {kGrey, argb(0xFF, 200, 50, 100)}) {
    const uint32_t centre = vintage(pfx::test::filled(21, 15, colour), 21, 15)[7 * 21 + 10];
    EXPECT_NE(centre, colour);
    EXPECT_EQ(vintage({colour}, 1, 1), Pixels{centre});
    EXPECT_EQ(vintage(pfx::test::filled(5, 1, colour), 5, 1), pfx::test::filled(5, 1, centre));
    EXPECT_EQ(vintage(pfx::test::filled(1, 4, colour), 1, 4), pfx::test::filled(1, 4, centre));
  }
}

// The full look composited through the mask inside the bounds, the source at unselected pixels
// there, and nothing written outside them; empty bounds give the full look everywhere.
TEST(Vintage, PartialCompositesTheFullLook) {
  const int32_t w = 11, h = 9;
  const Pixels img = pfx::test::random_image(w, h, 102);
  const Mask mask = pfx::test::random_mask(w, h, 103);
  const Pixels full = vintage(img, w, h);
  Pixels alias(img.size());
  applyVintage(img.data(), alias.data(), w, h);
  EXPECT_EQ(alias, full);
  Pixels part(img.size(), 0x0F0F0F0Fu);
  applyVintagePartial(img.data(), mask.data(), part.data(), w, h, 2, 8, 1, 6);
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      const size_t i = static_cast<size_t>(y * w + x);
      const bool inside = x >= 2 && x <= 8 && y >= 1 && y <= 6;
      EXPECT_EQ(part[i], !inside ? 0x0F0F0F0Fu : (mask[i] == 1 ? full[i] : img[i]))
          << x << "," << y;
    }
  }
  fx_apply_vintage_partial(img.data(), mask.data(), part.data(), w, h, 1, 0, 0, 8);
  EXPECT_EQ(part, full);
}

// Larger than the vignette table covers: the weight follows the same rule, so the preview of a
// wide one-colour strip matches the vignette preview of the toned colour.
TEST(Vintage, PreviewCoversAnySize) {
  const int32_t w = 8500, h = 2;
  const Pixels img = pfx::test::filled(w, h, kGrey);
  Pixels out(img.size(), 0), expected(img.size(), 0);
  fx_apply_vintage_prev(img.data(), out.data(), w, h);
  const Pixels toned = pfx::test::filled(w, h, argb(0xFF, 147, 155, 103));
  fx_apply_vignette_prev(toned.data(), expected.data(), w, h);
  EXPECT_EQ(out, expected);
  EXPECT_NE(out.front(), out[w / 2]);
}

}  // namespace
