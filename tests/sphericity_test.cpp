// Sphericity: the fixed points of the warp (level 0, the centre, the rim), the argument checks,
// the window clipped to the image, and positions on images wide enough that 32-bit
// arithmetic would overflow. The falloff table is given by its values; the warp tables' golden
// digest pins it.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstdlib>

#include "frame/frame.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

constexpr uint32_t kOpaque = 0xFF000000u;

// Random colours with alpha 0x40, so that the opaque alpha of a warped pixel marks it.
Pixels translucent_image(int32_t w, int32_t h, uint64_t seed) {
  Pixels px = pfx::test::random_image(w, h, seed);
  for (uint32_t& p : px) p = (p & 0xFFFFFFu) | 0x40000000u;
  return px;
}

struct Warped {
  int32_t code;
  Pixels px;
};

// The whole image is the window unless one is given.
Warped sphericity(const Pixels& src, int32_t w, int32_t h, int32_t cx, int32_t cy, int32_t radius,
                  int32_t level, pfx::Rect win = {0, -1, 0, -1}, uint32_t fast = 0) {
  if (win.right < 0 && win.left == 0) win = {0, w - 1, 0, h - 1};
  Warped r{0, Pixels(src.size(), 0xDEADBEEFu)};
  r.code = fx_sphericity(src.data(), r.px.data(), w, h, cx, cy, radius, level, win.left, win.right,
                         win.top, win.bottom, fast);
  return r;
}

// Level 0 keeps every colour and makes the circle (d2 up to radius^2 * 500 / 256, the rim
// included) opaque while pixels beyond it are copied; at every level the centre samples itself.
TEST(Sphericity, LevelZeroKeepsColoursAndTheCentreMapsToItself) {
  const int32_t w = 23, h = 19, cx = 11, cy = 8, radius = 6;
  const Pixels src = pfx::test::random_image(w, h, 5);
  const Warped r = sphericity(src, w, h, cx, cy, radius, 0);
  ASSERT_EQ(r.code, PHOTOFX_SUCCESS);
  const int32_t rim = (radius * radius * 500 + 128) >> 8;
  for (size_t i = 0; i < src.size(); ++i) {
    const int32_t x = int32_t(i % w), y = int32_t(i / w);
    const bool inside = (x - cx) * (x - cx) + (y - cy) * (y - cy) <= rim;
    ASSERT_EQ(r.px[i], inside ? (src[i] | kOpaque) : src[i]) << x << "," << y;
  }
  for (int32_t level : {-100, -37, -1, 1, 50, 100}) {
    EXPECT_EQ(sphericity(src, w, h, cx, cy, 5, level).px[cy * w + cx], src[cy * w + cx] | kOpaque)
        << level;
  }
}

// Radii below 1, levels beyond +-100, centres outside the image, missing buffers and one buffer
// as source and destination (the warp would read pixels it had already moved) are refused.
TEST(Sphericity, BadArgumentsWriteNothing) {
  Pixels src = pfx::test::random_image(8, 6, 8);
  const Pixels original = src, untouched(src.size(), 0xDEADBEEFu);
  Pixels dst = untouched;
  const struct {
    const uint32_t* s;
    uint32_t* d;
    int32_t cx, cy, radius, level;
  } cases[] = {
      // clang-format off
      {src.data(), dst.data(), 4, 3, 0, 50},   {src.data(), dst.data(), 4, 3, -5, 50},
      {src.data(), dst.data(), 4, 3, 3, 101},  {src.data(), dst.data(), 4, 3, 3, -101},
      {src.data(), dst.data(), -1, 3, 3, 50},  {src.data(), dst.data(), 8, 3, 3, 50},
      {src.data(), dst.data(), 4, 6, 3, 50},   {src.data(), dst.data(), 4, -1, 3, 50},
      {nullptr, dst.data(), 4, 3, 3, 50},      {src.data(), nullptr, 4, 3, 3, 50},
      {src.data(), src.data(), 4, 3, 3, 50},
      // clang-format on
  };
  for (const auto& c : cases) {
    EXPECT_EQ(fx_sphericity(c.s, c.d, 8, 6, c.cx, c.cy, c.radius, c.level, 0, 7, 0, 5, 0),
              PHOTOFX_INVALID_ARGUMENT)
        << &c - cases;
  }
  runSphericity(src.data(), dst.data(), 8, 6, 4, 3, 3, 200, 0, 7, 0, 5, 0);
  EXPECT_EQ(dst, untouched);
  EXPECT_EQ(src, original);
  EXPECT_EQ(fx_sphericity(src.data(), dst.data(), 8, 6, 4, 3, 3, -100, 0, 7, 0, 5, 0),
            PHOTOFX_SUCCESS);
}

// Only the window is warped, clipped to the image; an empty window warps nothing. (Fast mode's
// blocks: warp_paths_test.)
TEST(Sphericity, WindowIsClippedToTheImage) {
  const int32_t w = 20, h = 16;
  const Pixels src = translucent_image(w, h, 9);
  const Warped full = sphericity(src, w, h, 10, 8, 20, 70);
  const Warped part = sphericity(src, w, h, 10, 8, 20, 70, {4, 12, 3, 9});
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      const size_t i = static_cast<size_t>(y * w + x);
      const bool in = x >= 4 && x <= 12 && y >= 3 && y <= 9;
      ASSERT_EQ(part.px[i], in ? full.px[i] : src[i]) << x << "," << y;
    }
  }
  EXPECT_EQ(sphericity(src, w, h, 10, 8, 20, 70, {INT32_MIN, INT32_MAX, -5, 1000}).px, full.px);
  EXPECT_EQ(sphericity(src, w, h, 10, 8, 20, 70, {5, 4, 0, h - 1}).px, src);
}

TEST(Sphericity, FarFromTheOriginTheWarpMovesWithItsCentre) {
  // At x = 11000, x * 2^18 and cx * k pass 2^31; 1000 columns in, nothing comes near it. The
  // same circle must give the same pixels in both places.
  const int32_t h = 5, big_w = 12000, small_w = 2000, shift = 10000;
  const Pixels big = pfx::test::random_image(big_w, h, 12);
  Pixels small(static_cast<size_t>(small_w) * h);
  for (size_t i = 0; i < small.size(); ++i)
    small[i] = big[i / small_w * big_w + i % small_w + shift];
  for (int32_t level : {-100, -41, 0, 57, 100}) {
    const Warped far = sphericity(big, big_w, h, 11000, 2, 300, level, {10500, 11500, 0, h - 1});
    const Warped near = sphericity(small, small_w, h, 1000, 2, 300, level);
    ASSERT_EQ(far.code, PHOTOFX_SUCCESS);
    for (size_t i = 0; i < small.size(); ++i) {
      ASSERT_EQ(far.px[i / small_w * big_w + i % small_w + shift], near.px[i]) << level << " " << i;
    }
  }
}

TEST(Sphericity, WidePinchAndBulgeSampleBetweenTheLimitsOfTheirPull) {
  // Each output must come from a column pushed out by at most 147 % (pinch) or pulled in by at
  // most 79 % (bulge). The centre column, 35000, times the bulge's pull passes 2^31 at either
  // radius; k * dx of the pinch passes it only where the pull stays strong far out, which
  // radius 25000 gives (its squared rim exceeds 2^30, so the falloff index stays 0).
  const int32_t w = 70001, cx = 35000;
  const Pixels src = pfx::test::distance_code(w, cx);
  for (int32_t radius : {4500, 25000}) {
    const int64_t rim = (int64_t{radius} * radius * 500 + 128) >> 8;
    for (int32_t level : {-100, 100}) {
      const Warped r = sphericity(src, w, 1, cx, 0, radius, level);
      ASSERT_EQ(r.code, PHOTOFX_SUCCESS);
      for (int32_t x = 0; x < w; ++x) {
        const int32_t d = std::abs(x - cx);
        const int32_t from = pfx::test::distance_named(r.px[static_cast<size_t>(x)]);
        if (int64_t{d} * d > rim) {
          ASSERT_EQ(from, d) << x;
        } else if (level < 0) {
          ASSERT_GE(from, d - 1) << radius << " " << x;
          ASSERT_LE(from, d + d * 147 / 100 + 1) << radius << " " << x;
        } else {
          ASSERT_LE(from, d + 1) << radius << " " << x;
          ASSERT_GE(from, d * 21 / 100 - 1) << radius << " " << x;
        }
      }
    }
  }
}

}  // namespace
