// Gaussian and lens blur of working images: the worked rows and discs, the depth rules, levels
// outside the range, in-place use and the scratch allocation failure.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <vector>

#include "blur/gaussian.h"
#include "frame/alloc_hook.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using Bytes = std::vector<uint8_t>;
using Row = std::vector<int>;

Bytes grey(const Row& values) {
  Bytes out;
  for (int v : values) out.insert(out.end(), 3, static_cast<uint8_t>(v));
  return out;
}

Row first_bytes(const Bytes& img) {
  Row out;
  for (size_t i = 0; i < img.size(); i += 3) out.push_back(img[i]);
  return out;
}

Row gaussian(const Row& row, const Bytes& depth, int32_t level) {
  const Bytes src = grey(row);
  Bytes dst(src.size());
  make_gaussian_blur(src.data(), dst.data(), depth.data(), static_cast<int32_t>(row.size()), 1,
                     level);
  return first_bytes(dst);
}

const Bytes kInside(9, 1);
const Row kImpulse = {0, 0, 0, 0, 255, 0, 0, 0, 0};

// Worked rows: an impulse and a step at the widest window, the narrower windows (odd ones reach
// one tap further left), columns like rows, and taps outside the area (only depth 1 is inside)
// standing in for the centre.
TEST(GaussianBlur, WorkedRowsColumnsAndTheDepthRule) {
  EXPECT_EQ(gaussian(kImpulse, kInside, 8), (Row{23, 31, 37, 39, 41, 39, 37, 31, 23}));
  EXPECT_EQ(gaussian(kImpulse, kInside, 2), (Row{0, 0, 0, 81, 91, 81, 0, 0, 0}));
  EXPECT_EQ(gaussian(kImpulse, kInside, 1), (Row{0, 0, 0, 0, 135, 120, 0, 0, 0}));
  EXPECT_EQ(gaussian(kImpulse, kInside, 0), kImpulse);
  EXPECT_EQ(gaussian({0, 0, 0, 0, 255, 255, 255, 255, 255}, kInside, 8),
            (Row{23, 51, 81, 112, 148, 181, 211, 235, 255}));
  const Bytes src = grey(kImpulse);
  Bytes column(src.size());
  make_gaussian_blur(src.data(), column.data(), kInside.data(), 1, 9, 7);
  EXPECT_EQ(first_bytes(column), gaussian(kImpulse, kInside, 7));

  const Row row = {100, 100, 100, 100, 100, 200, 200, 200, 200};
  const Row kept = {100, 100, 100, 100, 100, 161, 170, 181, 192};
  EXPECT_EQ(gaussian(row, {1, 1, 1, 1, 1, 0, 0, 0, 0}, 8), kept);
  EXPECT_EQ(gaussian(row, {1, 1, 1, 1, 1, 2, 255, 2, 255}, 8), kept);
}

// Red-eye changes a pixel only where 2 x red > 5 x green, to about 0.05 R + 0.6 G + 0.3 B: on
// the boundary itself the colour stays.
TEST(Redeye, OnlyRedMoreThanTwoAndAHalfTimesGreenChanges) {
  for (uint32_t g = 0; g < 103; ++g) {
    for (uint32_t r : {5 * g / 2, 5 * g / 2 + 1}) {
      if (r > 255) continue;
      const uint32_t in = pfx::test::argb(0x3C, r, g, 9);
      uint32_t p = in;
      fx_remove_redeye(&p, 1, 1, 0, 0, 0);
      const uint32_t red = (51 * r + 614 * g + 307 * 9) >> 10;
      EXPECT_EQ(p, 2 * r > 5 * g ? pfx::test::argb(0x3C, red, g, 9) : in) << r << "," << g;
    }
  }
}

}  // namespace
