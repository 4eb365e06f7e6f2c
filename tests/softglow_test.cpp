// Soft glow: the kernel, the value curve, the edges, the partial rule, the result codes, and
// in-place calls giving the result of two buffers.
#include <gtest/gtest.h>

#include <cstdint>

#include "frame/alloc_hook.h"
#include "frame/frame.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Mask;
using pfx::test::Pixels;

uint32_t grey(uint32_t v) { return argb(0xFF, v, v, v); }

// A 5 x 5 black image with one grey 180 in the middle: at level 0 (value unchanged, and greys
// survive the HSV round trip) the kernel shows directly, 16, 4 and 1 parts in 36.
TEST(SoftGlow, KernelWeightsTheNeighbourhood) {
  Pixels img = pfx::test::filled(5, 5, grey(0));
  img[12] = grey(180);
  Pixels out(img.size(), 0);
  ASSERT_EQ(fx_softglow(img.data(), out.data(), 5, 5, 0), PHOTOFX_SUCCESS);
  Pixels expected = pfx::test::filled(5, 5, grey(0));
  expected[12] = grey(80);                                  // 16 x 180 / 36
  for (size_t i : {7, 11, 13, 17}) expected[i] = grey(20);  // 4 x 180 / 36
  for (size_t i : {6, 8, 16, 18}) expected[i] = grey(5);    // 180 / 36
  EXPECT_EQ(out, expected);
  // On the image's edge nothing is blurred: the same grey moved to a corner stays alone.
  img = pfx::test::filled(5, 5, grey(0));
  img[0] = grey(180);
  ASSERT_EQ(fx_softglow(img.data(), out.data(), 5, 5, 0), PHOTOFX_SUCCESS);
  expected = pfx::test::filled(5, 5, grey(0));
  expected[0] = grey(180);
  expected[6] = grey(5);
  EXPECT_EQ(out, expected);
}

TEST(SoftGlow, ValueCurveByLevel) {
  const auto glow = [](uint32_t p, int32_t level) {
    uint32_t out = 0;
    EXPECT_EQ(fx_softglow(&p, &out, 1, 1, level), PHOTOFX_SUCCESS);
    return out;
  };
  EXPECT_EQ(glow(grey(64), 100), grey(32));
  EXPECT_EQ(glow(grey(128), 100), grey(128));
  EXPECT_EQ(glow(grey(255), 100), grey(255));
  EXPECT_EQ(glow(grey(100), 50), grey(89));   // (3906 + 5000) / 100
  EXPECT_EQ(glow(grey(200), 50), grey(255));  // 256, held
  EXPECT_EQ(glow(grey(64), 0), grey(64));
  // Level 0 on a colour: its own HSV round trip, alpha kept.
  const uint32_t colour = argb(0x2D, 200, 100, 50);
  int32_t h = 0, s = 0, v = 0, r = 0, g = 0, b = 0;
  fx_rgb2hsv(200, 100, 50, &h, &s, &v);
  fx_hsv2rgb(h, s, v, &r, &g, &b);
  EXPECT_EQ(glow(colour, 0), pfx::test::argb(0x2D, static_cast<uint32_t>(r),
                                             static_cast<uint32_t>(g), static_cast<uint32_t>(b)));
}

// One colour everywhere at level 0: the blur changes nothing, so every pixel is the round trip.
// Two by two has no inner pixel and only the curve applies.
TEST(SoftGlow, OneColourAndTinyImages) {
  const Pixels img = pfx::test::filled(6, 4, argb(0x80, 51, 102, 204));
  Pixels out(img.size(), 0);
  ASSERT_EQ(fx_softglow(img.data(), out.data(), 6, 4, 0), PHOTOFX_SUCCESS);
  EXPECT_EQ(out, img);  // (51, 102, 204) survives the round trip
  const Pixels small = {grey(10), grey(200), grey(64), grey(128)};
  Pixels small_out(4, 0);
  ASSERT_EQ(fx_softglow(small.data(), small_out.data(), 2, 2, 100), PHOTOFX_SUCCESS);
  EXPECT_EQ(small_out, (Pixels{grey(0), grey(255), grey(32), grey(128)}));
}

TEST(SoftGlow, PartialGlowsSelectedPixelsFromTheSource) {
  const int32_t w = 9, h = 8;
  const Pixels img = pfx::test::random_image(w, h, 131);
  const Mask mask = pfx::test::random_mask(w, h, 132);
  Pixels full(img.size()), part(img.size(), 0);
  ASSERT_EQ(fx_softglow(img.data(), full.data(), w, h, 70), PHOTOFX_SUCCESS);
  ASSERT_EQ(fx_softglow_partial(img.data(), mask.data(), part.data(), w, h, 70, 1, 7, 0, 6),
            PHOTOFX_SUCCESS);
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      const size_t i = static_cast<size_t>(y * w + x);
      const bool selected = x >= 1 && x <= 7 && y <= 6 && mask[i] == 1;
      EXPECT_EQ(part[i], selected ? full[i] : img[i]) << x << "," << y;
    }
  }
  ASSERT_EQ(fx_softglow_partial(img.data(), nullptr, part.data(), w, h, 70, 8, 1, 0, 7),
            PHOTOFX_SUCCESS);
  EXPECT_EQ(part, full);
}

// dst equal to src: the blur must still read the neighbours as they were, full and partial.
TEST(SoftGlow, InPlaceMatchesTwoBuffers) {
  const int32_t w = 13, h = 11;
  const Pixels img = pfx::test::random_image(w, h, 133);
  const Mask mask = pfx::test::random_mask(w, h, 134);
  Pixels expected(img.size()), in_place = img;
  ASSERT_EQ(fx_softglow(img.data(), expected.data(), w, h, 35), PHOTOFX_SUCCESS);
  ASSERT_EQ(fx_softglow(in_place.data(), in_place.data(), w, h, 35), PHOTOFX_SUCCESS);
  EXPECT_EQ(in_place, expected);
  const pfx::Rect bounds[] = {{1, 0, 0, 0}, {0, w - 1, 0, h - 1}, {2, 9, 3, 8}, {5, 5, 5, 5}};
  for (const pfx::Rect& b : bounds) {
    Pixels part(img.size()), same(img);
    fx_softglow_partial(img.data(), mask.data(), part.data(), w, h, 90, b.left, b.right, b.top,
                        b.bottom);
    applySoftglowPartial(same.data(), mask.data(), same.data(), w, h, 90, b.left, b.right, b.top,
                         b.bottom);
    EXPECT_EQ(same, part) << b.left << " " << b.right << " " << b.top << " " << b.bottom;
  }
}

TEST(SoftGlow, RefusalsWriteNothing) {
  const int32_t w = 5, h = 4;
  const Pixels img = pfx::test::random_image(w, h, 135);
  const Mask mask(img.size(), 1);
  Pixels dst(img.size(), 0x3E3E3E3Eu);
  const Pixels before = dst;
  EXPECT_EQ(fx_softglow(img.data(), dst.data(), w, h, 101), PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_softglow(img.data(), dst.data(), w, h, -1), PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_softglow_partial(img.data(), mask.data(), dst.data(), w, h, 101, 1, 0, 0, 0),
            PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_softglow_partial(img.data(), mask.data(), dst.data(), w, h, INT32_MIN, 1, 0, 0, 0),
            PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_softglow(nullptr, dst.data(), w, h, 50), PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_softglow(img.data(), nullptr, w, h, 50), PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_softglow_partial(img.data(), nullptr, dst.data(), w, h, 50, 0, 4, 0, 3),
            PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_softglow(img.data(), dst.data(), 65536, 65536, 50), PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_softglow(img.data(), dst.data(), 0, h, 50), PHOTOFX_SUCCESS);
  EXPECT_EQ(dst, before);
  // In place without its two saved rows: out of memory, image untouched.
  Pixels in_place = img;
  pfx::arm_allocation_failure(1);
  EXPECT_EQ(fx_softglow(in_place.data(), in_place.data(), w, h, 50), PHOTOFX_OUT_OF_MEMORY);
  pfx::arm_allocation_failure(1);
  EXPECT_EQ(
      fx_softglow_partial(in_place.data(), mask.data(), in_place.data(), w, h, 50, 0, 4, 0, 3),
      PHOTOFX_OUT_OF_MEMORY);
  pfx::arm_allocation_failure(0);
  EXPECT_EQ(in_place, img);
}

}  // namespace
