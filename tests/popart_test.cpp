// Pop art: quadrants of unequal size in place. The palettes and the quadrant layout are pinned by
// the conformance goldens (odd sizes included).
#include <gtest/gtest.h>

#include <cstdint>
#include <utility>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

using Look = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t);

Pixels run(Look look, const Pixels& img, int32_t w, int32_t h) {
  Pixels out(img.size(), 0);
  look(img.data(), out.data(), w, h);
  return out;
}

// Quadrants of unequal size (odd widths and heights, single rows and columns) still give the
// result of two buffers when the source is the destination.
TEST(PopArt, OddSizesInPlaceMatchTwoBuffers) {
  for (Look look : {fx_apply_popart, fx_apply_popart_prev, applyPopArt}) {
    for (auto [w, h] : {std::pair{11, 7}, std::pair{5, 3}, std::pair{1, 5}, std::pair{6, 1}}) {
      const Pixels img = pfx::test::random_image(w, h, 122);
      Pixels in_place = img;
      look(in_place.data(), in_place.data(), w, h);
      EXPECT_EQ(in_place, run(look, img, w, h)) << w << "x" << h;
      if (look == applyPopArt) {
        EXPECT_EQ(in_place, run(fx_apply_popart, img, w, h));
      }
    }
  }
}

}  // namespace
