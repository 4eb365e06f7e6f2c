// Tilt-shift: the row weights of the sharp band and its fade, the fade-length boundary and
// centres far outside the image. (Failed allocations are in the allocation-failure table.)
#include <gtest/gtest.h>

#include <cstdint>
#include <iterator>
#include <vector>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;
using Bytes = std::vector<uint8_t>;

// Sharpness weight of every row of a 2-pixel-wide image of the given height, read back through
// restore_tiltshift: the source is red 255 / green 0 and the blurred image green 255 / red 0,
// so green comes out as 255 - w (0 at 256) and red as w - 1 (0 at 0).
std::vector<int32_t> row_weights(int32_t height, int32_t centre, int32_t half_height) {
  const Pixels src(static_cast<size_t>(2) * height, 0x40FF0000u);
  Bytes blur(2 * 2 * 3, 0);
  for (size_t i = 0; i < 4; ++i) blur[3 * i + 1] = 255;
  Pixels dst(src.size(), 0xA5A5A5A5u);
  restore_tiltshift(src.data(), blur.data(), dst.data(), 2, height, 2, 2, centre, half_height);
  std::vector<int32_t> w;
  for (int32_t y = 0; y < height; ++y) {
    const uint32_t p = dst[static_cast<size_t>(2) * y];
    EXPECT_EQ(p, dst[static_cast<size_t>(2) * y + 1]);
    EXPECT_EQ(p >> 24, 0x40u);
    const int32_t red = static_cast<int32_t>((p >> 16) & 255), green = (p >> 8) & 255;
    w.push_back(green == 0 && red == 255 ? 256 : 255 - green);
    EXPECT_EQ(red, w.back() == 0 ? 0 : w.back() - 1) << y;
  }
  return w;
}

// A fade of 200 rows either side of the band (its weight 255) falls linearly; a fade of 256 rows
// (a power of two) gives the band 256; a band off centre fades over the longer distance on both
// sides; with weight 255 the band keeps 255 / 256 of the source. A fade below one row keeps the
// whole image sharp instead of dividing by zero, and far-away centres and half-heights stay
// defined.
TEST(TiltShiftRows, WeightFallsLinearlyFromTheBandAndShortFadesKeepTheSource) {
  const std::vector<int32_t> w = row_weights(1000, 500, 100);
  const int32_t rows[] = {0, 200, 250, 300, 350, 400, 500, 600, 650, 700, 750, 800, 999};
  const int32_t weights[] = {0, 0, 63, 127, 191, 255, 255, 255, 191, 127, 63, 0, 0};
  for (size_t i = 0; i < std::size(rows); ++i) EXPECT_EQ(w[rows[i]], weights[i]) << rows[i];
  const std::vector<int32_t> p = row_weights(1024, 512, 0);
  EXPECT_EQ((std::vector<int32_t>{p[512], p[513], p[640], p[768]}),
            (std::vector<int32_t>{256, 255, 128, 0}));
  const std::vector<int32_t> off = row_weights(1000, 300, 50);  // fade 325 on both sides
  EXPECT_EQ((std::vector<int32_t>{off[0], off[673], off[674], off[999]}),
            (std::vector<int32_t>{59, 1, 0, 0}));
  const Pixels tall(2 * 1000, 0xFF646464u);  // channel 100 everywhere
  for (const auto& [blurred, expected] : {std::pair{0, 99u}, {200, 100u}}) {
    const Bytes blur(2 * 2 * 3, static_cast<uint8_t>(blurred));
    Pixels dst(tall.size());
    restore_tiltshift(tall.data(), blur.data(), dst.data(), 2, 1000, 2, 2, 500, 100);
    EXPECT_EQ(dst[2 * 500], 0xFF000000u | expected * 0x010101u) << blurred;
  }

  // Height 10, centre 5: half-height 3 leaves a fade of 1 row, 4 leaves 0, 6 leaves -1.
  EXPECT_EQ(row_weights(10, 5, 3),
            (std::vector<int32_t>{0, 0, 256, 256, 256, 256, 256, 256, 256, 0}));
  for (int32_t r : {4, 5, 6, 1000, INT32_MAX}) {
    EXPECT_EQ(row_weights(10, 5, r), std::vector<int32_t>(10, 256)) << r;
  }
  for (const auto& [c, r] : {std::pair{INT32_MAX, INT32_MIN}, {INT32_MIN, 0}, {-1000000000, 0}}) {
    EXPECT_EQ(row_weights(10, c, r), std::vector<int32_t>(10, 0)) << c << " " << r;
  }
  EXPECT_EQ(row_weights(10, INT32_MAX, INT32_MAX), std::vector<int32_t>(10, 256));
}

}  // namespace
