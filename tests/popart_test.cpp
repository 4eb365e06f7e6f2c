// Pop art: the quadrant palettes and ramps, the preview hues, odd sizes and in-place calls.
#include <gtest/gtest.h>

#include <cstdint>
#include <utility>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Pixels;

using Look = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t);

const uint32_t kBlack = 0xFF000000u, kGrey = 0xFF808080u, kWhite = 0xFFFFFFFFu;
const uint32_t kRose = argb(0xFF, 200, 50, 100);  // brightness 100

// A 4 x 4 image whose every-second pixels are black, grey, white and rose; the others must not
// matter.
Pixels four_by_four() {
  Pixels img = pfx::test::random_image(4, 4, 121);
  img[0] = kBlack;
  img[2] = kGrey;
  img[8] = kWhite;
  img[10] = kRose;
  return img;
}

Pixels run(Look look, const Pixels& img, int32_t w, int32_t h) {
  Pixels out(img.size(), 0);
  look(img.data(), out.data(), w, h);
  return out;
}

// The quadrant at (qx, qy) of a 4 x 4 result, row by row.
Pixels quadrant(const Pixels& out, size_t qx, size_t qy) {
  const size_t o = qy * 8 + qx * 2;
  return {out[o], out[o + 1], out[o + 4], out[o + 5]};
}

TEST(PopArt, EachQuadrantPosterisesWithItsPalette) {
  const Pixels out = run(fx_apply_popart, four_by_four(), 4, 4);
  // Dark colour for black and rose, light colour for grey and white.
  const uint32_t dark[4] = {argb(0xFF, 23, 4, 158), argb(0xFF, 4, 0, 17), argb(0xFF, 11, 35, 1),
                            argb(0xFF, 131, 1, 3)};
  const uint32_t light[4] = {argb(0xFF, 254, 247, 17), argb(0xFF, 131, 255, 192),
                             argb(0xFF, 242, 158, 243), argb(0xFF, 245, 204, 18)};
  for (size_t q = 0; q < 4; ++q) {
    EXPECT_EQ(quadrant(out, q & 1, q >> 1), (Pixels{dark[q], light[q], light[q], dark[q]})) << q;
  }
}

TEST(PopArt, PreviewPaintsEachQuadrantInItsHue) {
  const Pixels out = run(fx_apply_popart_prev, four_by_four(), 4, 4);
  const auto c = [](uint32_t r, uint32_t g, uint32_t b) { return argb(0xFF, r, g, b); };
  EXPECT_EQ(quadrant(out, 0, 0),
            (Pixels{kBlack, c(128, 123, 108), c(255, 245, 216), c(200, 155, 20)}));
  EXPECT_EQ(quadrant(out, 1, 0),
            (Pixels{kBlack, c(128, 108, 128), c(255, 216, 255), c(200, 20, 200)}));
  EXPECT_EQ(quadrant(out, 0, 1),
            (Pixels{kBlack, c(108, 128, 128), c(216, 255, 255), c(20, 200, 200)}));
  EXPECT_EQ(quadrant(out, 1, 1),
            (Pixels{kBlack, c(118, 128, 108), c(236, 255, 216), c(110, 200, 20)}));
}

// Greys have their own level as brightness. The top-right ramps: the lower one ends at green 17
// at 115, the upper one starts again from green 34, so green jumps at 116.
TEST(PopArt, RampsBetweenDarkAndLight) {
  const auto top_right = [](uint32_t level) {
    const uint32_t p = argb(0xFF, level, level, level);
    return run(fx_apply_popart, {p, p}, 2, 1)[1];
  };
  EXPECT_EQ(top_right(107), argb(0xFF, 4, 0, 17));
  EXPECT_EQ(top_right(112), argb(0xFF, 70, 10, 147));
  EXPECT_EQ(top_right(115), argb(0xFF, 111, 17, 226));
  EXPECT_EQ(top_right(116), argb(0xFF, 113, 61, 221));
  EXPECT_EQ(top_right(120), argb(0xFF, 123, 172, 204));
  EXPECT_EQ(top_right(123), argb(0xFF, 131, 255, 192));
  EXPECT_EQ(top_right(124), argb(0xFF, 131, 255, 192));
}

TEST(PopArt, TinyAndOddSizes) {
  const uint32_t p = argb(0x44, 128, 128, 128);
  EXPECT_EQ(run(fx_apply_popart, {p}, 1, 1), Pixels{argb(0x44, 254, 247, 17)});
  EXPECT_EQ(run(fx_apply_popart, {p, kBlack}, 2, 1),
            (Pixels{argb(0x44, 254, 247, 17), argb(0x44, 131, 255, 192)}));
  // Width 5: left quadrants 3 wide showing source columns 0, 2, 4; right ones 2 wide showing
  // half-size columns 0 and 1. Height 3: top rows 2, bottom row 1 showing half-size row 0.
  Pixels img(15);
  for (size_t i = 0; i < 15; ++i) img[i] = i % 2 == 0 ? kWhite : kBlack;
  img[2] = kBlack;  // half-size column 1 of row 0 is dark
  const Pixels out = run(fx_apply_popart, img, 5, 3);
  const uint32_t tl_a = argb(0xFF, 254, 247, 17), tl_d = argb(0xFF, 23, 4, 158);
  const uint32_t tr_a = argb(0xFF, 131, 255, 192), tr_d = argb(0xFF, 4, 0, 17);
  const uint32_t bl_a = argb(0xFF, 242, 158, 243), bl_d = argb(0xFF, 11, 35, 1);
  const uint32_t br_a = argb(0xFF, 245, 204, 18), br_d = argb(0xFF, 131, 1, 3);
  EXPECT_EQ(out, (Pixels{tl_a, tl_d, tl_a, tr_a, tr_d,  //
                         tl_a, tl_a, tl_a, tr_a, tr_a,  //
                         bl_a, bl_d, bl_a, br_a, br_d}));
}

TEST(PopArt, InPlaceMatchesTwoBuffersAndBadCallsWriteNothing) {
  for (Look look : {fx_apply_popart, fx_apply_popart_prev, applyPopArt}) {
    for (auto [w, h] : {std::pair{11, 7}, std::pair{8, 8}, std::pair{1, 5}, std::pair{6, 1}}) {
      const Pixels img = pfx::test::random_image(w, h, 122);
      Pixels in_place = img;
      look(in_place.data(), in_place.data(), w, h);
      EXPECT_EQ(in_place, run(look, img, w, h)) << w << "x" << h;
    }
    Pixels dst(16, 0x99999999u);
    const Pixels img = pfx::test::random_image(4, 4, 123);
    look(nullptr, dst.data(), 4, 4);
    look(img.data(), dst.data(), 0, 4);
    look(img.data(), dst.data(), 4, -4);
    look(img.data(), dst.data(), 65536, 65536);
    look(img.data(), nullptr, 4, 4);
    EXPECT_EQ(dst, Pixels(16, 0x99999999u));
  }
}

}  // namespace
