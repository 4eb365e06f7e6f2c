// Soft glow: the kernel, the value curve, levels out of range, and in-place calls giving the
// result of two buffers.
#include <gtest/gtest.h>

#include <cstdint>

#include "frame/frame.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Mask;
using pfx::test::Pixels;

uint32_t grey(uint32_t v) { return argb(0xFF, v, v, v); }

// A 5 x 5 black image with one grey 180: at level 0 (value unchanged, and greys survive the HSV
// round trip) the kernel shows directly, 16, 4 and 1 parts in 36. On the image's edge nothing is
// blurred: the same grey in a corner stays alone.
TEST(SoftGlow, KernelWeightsTheNeighbourhood) {
  for (size_t lit : {12, 0}) {
    Pixels img = pfx::test::filled(5, 5, grey(0));
    img[lit] = grey(180);
    Pixels out(img.size(), 0), expected = pfx::test::filled(5, 5, grey(0));
    ASSERT_EQ(fx_softglow(img.data(), out.data(), 5, 5, 0), PHOTOFX_SUCCESS);
    if (lit == 12) {
      expected[12] = grey(80);                                  // 16 x 180 / 36
      for (size_t i : {7, 11, 13, 17}) expected[i] = grey(20);  // 4 x 180 / 36
      for (size_t i : {6, 8, 16, 18}) expected[i] = grey(5);    // 180 / 36
    } else {
      expected[0] = grey(180);
      expected[6] = grey(5);
    }
    EXPECT_EQ(out, expected) << lit;
  }
}

// Two by two has no inner pixel: only the value curve by level applies.
TEST(SoftGlow, ValueCurveByLevel) {
  const auto glow = [](const Pixels& img, int32_t level) {
    Pixels out(4, 0);
    EXPECT_EQ(fx_softglow(img.data(), out.data(), 2, 2, level), PHOTOFX_SUCCESS);
    return out;
  };
  EXPECT_EQ(glow({grey(10), grey(200), grey(64), grey(128)}, 100),
            (Pixels{grey(0), grey(255), grey(32), grey(128)}));
  // (3906 + 5000) / 100 = 89, and 256 held to 255.
  EXPECT_EQ(glow({grey(100), grey(200), grey(64), grey(0)}, 50),
            (Pixels{grey(89), grey(255), grey(48), grey(0)}));
}

// Levels outside 0..100 are refused before anything is written.
TEST(SoftGlow, LevelsOutOfRangeAreRefused) {
  const Pixels img = pfx::test::random_image(5, 4, 131);
  const Mask mask(img.size(), 1);
  const Pixels untouched(img.size(), 0x3E3E3E3Eu);
  Pixels dst = untouched;
  for (int32_t level : {-1, 101, INT32_MIN, INT32_MAX}) {
    EXPECT_EQ(fx_softglow(img.data(), dst.data(), 5, 4, level), PHOTOFX_INVALID_ARGUMENT);
    for (const pfx::Rect& b : {pfx::Rect{1, 0, 0, 0}, pfx::Rect{0, 4, 0, 3}}) {
      EXPECT_EQ(fx_softglow_partial(img.data(), mask.data(), dst.data(), 5, 4, level, b.left,
                                    b.right, b.top, b.bottom),
                PHOTOFX_INVALID_ARGUMENT);
    }
  }
  EXPECT_EQ(dst, untouched);
}

// dst equal to src: the blur must still read the neighbours as they were, full and partial, with
// every kind of bounds.
TEST(SoftGlow, InPlaceMatchesTwoBuffers) {
  const int32_t w = 13, h = 11;
  const Pixels img = pfx::test::random_image(w, h, 133);
  const Mask mask = pfx::test::random_mask(w, h, 134);
  Pixels expected(img.size()), in_place = img;
  ASSERT_EQ(fx_softglow(img.data(), expected.data(), w, h, 35), PHOTOFX_SUCCESS);
  applySoftglow(in_place.data(), in_place.data(), w, h, 35);
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

}  // namespace
