// Vintage: the full chain at the vignette centre and in the corners, the preview, the partial
// variant's compositing, sizes the vignette cannot divide by or the table does not cover.
#include <gtest/gtest.h>

#include <cstdint>

#include "frame/alloc_hook.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Mask;
using pfx::test::Pixels;

constexpr uint32_t kBlack = 0xFF000000u, kWhite = 0xFFFFFFFFu, kGrey = 0xFF808080u;
const uint32_t kRose = argb(0xFF, 200, 50, 100);

Pixels vintage(const Pixels& img, int32_t w, int32_t h) {
  Pixels out(img.size(), 0);
  fx_apply_vintage(img.data(), out.data(), w, h);
  return out;
}

TEST(Vintage, OneColourAtTheCentreAndInTheCorners) {
  const uint32_t colours[] = {kBlack, kWhite, kGrey, kRose};
  const uint32_t centre[] = {argb(0xFF, 0, 0, 57), argb(0xFF, 243, 255, 221),
                             argb(0xFF, 131, 134, 133), argb(0xFF, 224, 15, 110)};
  const uint32_t corner[] = {argb(0xFF, 0, 0, 7), argb(0xFF, 30, 31, 27), argb(0xFF, 16, 16, 16),
                             argb(0xFF, 28, 1, 13)};
  for (size_t c = 0; c < 4; ++c) {
    const Pixels big = vintage(pfx::test::filled(20, 14, colours[c]), 20, 14);
    EXPECT_EQ(big[7 * 20 + 10], centre[c]) << c;
    const Pixels small = vintage(pfx::test::filled(3, 3, colours[c]), 3, 3);
    EXPECT_EQ(small[4], centre[c]) << c;
    for (size_t i : {0, 2, 6, 8}) EXPECT_EQ(small[i], corner[c]) << c << " corner " << i;
  }
}

// A single pixel or a single row has no border for the vignette to divide by; the chain then
// gives every pixel the centre's colour.
TEST(Vintage, ImagesBelowTwoPixelsKeepTheCentreColour) {
  EXPECT_EQ(vintage({kRose}, 1, 1), Pixels{argb(0xFF, 224, 15, 110)});
  EXPECT_EQ(vintage(pfx::test::filled(5, 1, kGrey), 5, 1),
            pfx::test::filled(5, 1, argb(0xFF, 131, 134, 133)));
}

TEST(Vintage, KeepsAlphaLeavesTheSourceAndWorksInPlace) {
  const Pixels img = pfx::test::random_image(12, 9, 101);
  const Pixels copy = img;
  const Pixels out = vintage(img, 12, 9);
  EXPECT_EQ(img, copy);
  for (size_t i = 0; i < img.size(); ++i) EXPECT_EQ(out[i] >> 24, img[i] >> 24) << i;
  Pixels in_place = img;
  applyVintage(in_place.data(), in_place.data(), 12, 9);
  EXPECT_EQ(in_place, out);
  Pixels dst(img.size(), 0x12345678u);
  const Pixels before = dst;
  fx_apply_vintage(nullptr, dst.data(), 12, 9);
  fx_apply_vintage(img.data(), dst.data(), 65536, 65536);
  fx_apply_vintage(img.data(), dst.data(), 0, 9);
  EXPECT_EQ(dst, before);
}

// The full look composited through the mask inside the bounds, the source at unselected pixels
// there, and nothing written outside them; empty bounds give the full look everywhere.
TEST(Vintage, PartialCompositesTheFullLook) {
  const int32_t w = 11, h = 9;
  const Pixels img = pfx::test::random_image(w, h, 102);
  const Mask mask = pfx::test::random_mask(w, h, 103);
  const Pixels full = vintage(img, w, h);
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
  // Without its scratch image the call writes nothing.
  Pixels dst(img.size(), 0x0F0F0F0Fu);
  pfx::arm_allocation_failure(1);
  fx_apply_vintage_partial(img.data(), mask.data(), dst.data(), w, h, 1, 0, 0, 8);
  pfx::arm_allocation_failure(0);
  EXPECT_EQ(dst, Pixels(img.size(), 0x0F0F0F0Fu));
}

TEST(Vintage, PreviewAtTheCentre) {
  const auto centre = [](uint32_t colour) {
    const Pixels img = pfx::test::filled(9, 7, colour);
    Pixels out(img.size(), 0);
    fx_apply_vintage_prev(img.data(), out.data(), 9, 7);
    return out[3 * 9 + 4];
  };
  EXPECT_EQ(centre(kBlack), argb(0xFF, 0, 8, 0));
  EXPECT_EQ(centre(kWhite), argb(0xFF, 255, 255, 211));
  EXPECT_EQ(centre(kGrey), argb(0xFF, 147, 155, 103));
  EXPECT_EQ(centre(argb(0x21, 128, 128, 128)), argb(0x21, 147, 155, 103));
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
