// The optimised twirl and sphericity against the plain per-pixel rules of reference/warp.h:
// every angle and level, images and windows of awkward sizes, centres on the edges, fast mode,
// and the circles on both sides of each switch between the 32-bit and the 64-bit arithmetic.
#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "photofx.h"
#include "reference/warp.h"
#include "support/images.h"
#include "warp/warp.h"

namespace {

using pfx::test::Pixels;
using pfx::test::Rng;

enum class Warp { kTwirl, kSphericity };

struct Case {
  const char* what;
  Warp warp;
  int32_t width, height, cx, cy, radius;
  int32_t from, to;  // angles or levels tried: every one from `from` to `to`
  pfx::Rect window;  // an empty window (left > right) means the whole image
  uint32_t fast;
};

// Runs one warp both ways on a random image and reports the first pixel that differs.
void expect_same(Warp warp, int32_t w, int32_t h, int32_t cx, int32_t cy, int32_t radius,
                 int32_t strength, pfx::Rect b, uint32_t fast, uint64_t seed) {
  const Pixels src = pfx::test::random_image(w, h, seed);
  Pixels got(src.size(), 0xA5A5A5A5u), want(src.size(), 0x5A5A5A5Au);
  int32_t code = 0;
  if (warp == Warp::kTwirl) {
    code = fx_twirl(src.data(), got.data(), w, h, cx, cy, radius, strength, b.left, b.right, b.top,
                    b.bottom, fast);
    pfx::reference::twirl(src.data(), want.data(), w, h, cx, cy, radius, strength, b.left, b.right,
                          b.top, b.bottom, fast != 0);
  } else {
    code = fx_sphericity(src.data(), got.data(), w, h, cx, cy, radius, strength, b.left, b.right,
                         b.top, b.bottom, fast);
    pfx::reference::sphericity(src.data(), want.data(), w, h, cx, cy, radius, strength, b.left,
                               b.right, b.top, b.bottom, fast != 0);
  }
  ASSERT_EQ(code, PHOTOFX_SUCCESS);
  for (size_t i = 0; i < src.size(); ++i) {
    const int32_t x = static_cast<int32_t>(i % static_cast<size_t>(w));
    const int32_t y = static_cast<int32_t>(i / static_cast<size_t>(w));
    ASSERT_EQ(got[i], want[i]) << (warp == Warp::kTwirl ? "twirl" : "sphericity") << " " << w << "x"
                               << h << " centre " << cx << "," << cy << " radius " << radius
                               << " strength " << strength << " window " << b.left << ".."
                               << b.right << " x " << b.top << ".." << b.bottom << " fast " << fast
                               << " at " << x << "," << y;
  }
}

TEST(WarpPaths, FastPathsMatchThePerPixelRules) {
  constexpr pfx::Rect kWhole{1, 0, 1, 0};
  constexpr Warp kT = Warp::kTwirl, kS = Warp::kSphericity;
  // clang-format off
  const Case cases[] = {
      {"every angle, odd sizes", kT, 37, 29, 18, 13, 16, -360, 360, kWhole, 0},
      {"every angle, fast", kT, 37, 29, 18, 13, 16, -360, 360, kWhole, 1},
      {"every level, odd sizes", kS, 37, 29, 18, 13, 12, -100, 100, kWhole, 0},
      {"every level, fast", kS, 37, 29, 18, 13, 12, -100, 100, kWhole, 1},
      {"circle past every edge", kT, 33, 31, 0, 30, 60, -200, -190, kWhole, 0},
      {"circle past every edge", kS, 33, 31, 32, 0, 40, -100, -90, kWhole, 0},
      {"circle past every edge", kS, 33, 31, 32, 0, 40, 90, 100, kWhole, 1},
      {"fine square roots near the centre", kT, 131, 97, 60, 50, 400, 1, 3, kWhole, 0},
      {"fine square roots near the centre", kT, 131, 97, 61, 50, 400, -3, -1, kWhole, 1},
      {"a window reaching past the edges", kT, 45, 41, 20, 20, 25, 88, 92, {-7, 50, 3, 60}, 1},
      {"a window reaching past the edges", kS, 45, 41, 20, 20, 18, -5, 5, {-7, 50, -2, 38}, 1},
      {"an inner window, odd columns", kT, 45, 41, 20, 20, 25, 30, 33, {5, 29, 4, 36}, 1},
      {"an inner window, odd columns", kS, 45, 41, 20, 20, 18, 60, 63, {5, 29, 4, 36}, 0},
      {"one column", kT, 1, 40, 0, 17, 30, 120, 122, kWhole, 0},
      {"one column", kS, 1, 40, 0, 17, 20, -60, -58, kWhole, 1},
      {"one row", kT, 40, 1, 39, 0, 30, -45, -43, kWhole, 1},
      {"one row", kS, 40, 1, 39, 0, 20, 70, 72, kWhole, 0},
      {"one pixel", kT, 1, 1, 0, 0, 1, 359, 360, kWhole, 1},
      {"two columns, the narrowest paired reads", kT, 2, 23, 1, 11, 30, -181, -179, kWhole, 0},
      {"two columns, the narrowest paired reads", kS, 2, 23, 0, 11, 20, 98, 100, kWhole, 0},
      {"radius 4095, the largest in 32 bits", kT, 8200, 3, 4100, 1, 4095, 359, 360, kWhole, 0},
      {"radius 4095, the largest in 32 bits", kT, 8200, 3, 4100, 1, 4095, -360, -359, kWhole, 0},
      {"radius 4096, in 64 bits", kT, 8200, 3, 4100, 1, 4096, 90, 90, kWhole, 1},
      {"the widest 32-bit rim", kS, 8195, 3, 8193, 1, 5861, -100, -98, kWhole, 0},
      {"the widest 32-bit rim", kS, 8195, 3, 8193, 1, 5861, 98, 100, kWhole, 0},
      {"the widest 32-bit rim", kS, 8195, 3, 1, 2, 5861, 100, 100, kWhole, 1},
      {"a rim in 64 bits", kS, 8195, 3, 8193, 1, 5862, -100, -100, kWhole, 0},
      {"a rim in 64 bits", kS, 8195, 3, 8193, 1, 5862, 100, 100, kWhole, 0},
  };
  // clang-format on
  uint64_t seed = 1;
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    const bool whole = c.window.left > c.window.right;
    const pfx::Rect b = whole ? pfx::Rect{0, c.width - 1, 0, c.height - 1} : c.window;
    for (int32_t s = c.from; s <= c.to; ++s) {
      expect_same(c.warp, c.width, c.height, c.cx, c.cy, c.radius, s, b, c.fast, ++seed);
      if (HasFatalFailure()) return;
    }
  }
}

TEST(WarpPaths, RandomCirclesAndWindowsMatchThePerPixelRules) {
  Rng rng(77);
  for (int32_t n = 0; n < 400; ++n) {
    const Warp warp = n % 2 == 0 ? Warp::kTwirl : Warp::kSphericity;
    const int32_t w = rng.between(1, 70), h = rng.between(1, 50);
    const int32_t cx = rng.between(0, w - 1), cy = rng.between(0, h - 1);
    // Mostly circles of the image's size, now and then ones near the 32-bit limits.
    const int32_t pick = rng.between(0, 9);
    const int32_t radius = pick == 0   ? rng.between(4090, 4100)
                           : pick == 1 ? rng.between(5855, 5870)
                                       : rng.between(1, 80);
    const int32_t strength = warp == Warp::kTwirl ? rng.between(-360, 360) : rng.between(-100, 100);
    const pfx::Rect b{rng.between(-5, w), rng.between(-1, w + 5), rng.between(-5, h),
                      rng.between(-1, h + 5)};
    expect_same(warp, w, h, cx, cy, radius, strength, b, rng.between(0, 1), rng.next());
    if (HasFatalFailure()) return;
  }
}

// Fast mode warps every second pixel of every second row, counted from the window's corner
// (clipped to the image), and fills its whole 2 x 2 block: one past an odd-sized window's last
// column and row, as far as the image reaches. The circles cover the image, so every block's
// value is the plain warp's pixel at the block's corner.
TEST(WarpPaths, FastModeFillsWholeBlocksHeldOnlyToTheImage) {
  constexpr int32_t w = 21, h = 17;
  const struct {
    const char* what;
    pfx::Rect window;
  } windows[] = {
      {"odd columns and rows: blocks one past the right and bottom", {4, 12, 3, 9}},
      {"even columns and rows: nothing past them", {5, 14, 4, 11}},
      {"ending one row above the last: its blocks reach the last row", {3, 10, 3, h - 2}},
      {"touching the last column and row: the blocks are cut there", {2, w - 1, 0, h - 1}},
      {"reaching past every edge: blocks from the image's corner", {-7, 1000, -3, 500}},
  };
  const Pixels src = pfx::test::random_image(w, h, 31);
  for (const Warp warp : {Warp::kTwirl, Warp::kSphericity}) {
    const bool t = warp == Warp::kTwirl;
    const auto run = [&](pfx::Rect b, uint32_t fast) {
      Pixels out(src.size(), 0xA5A5A5A5u);
      if (t) {
        fx_twirl(src.data(), out.data(), w, h, 10, 8, 40, 150, b.left, b.right, b.top, b.bottom,
                 fast);
      } else {
        fx_sphericity(src.data(), out.data(), w, h, 10, 8, 20, 70, b.left, b.right, b.top, b.bottom,
                      fast);
      }
      return out;
    };
    const Pixels plain = run({0, w - 1, 0, h - 1}, 0);
    for (const auto& [what, win] : windows) {
      const Pixels fast = run(win, 1);
      const pfx::Rect b = pfx::clip_to_image(win, w, h);
      for (int32_t y = 0; y < h; ++y) {
        for (int32_t x = 0; x < w; ++x) {
          const int32_t ax = x - (x - b.left) % 2, ay = y - (y - b.top) % 2;
          const bool block = x >= b.left && ax <= b.right && y >= b.top && ay <= b.bottom;
          const size_t i = static_cast<size_t>(y * w + x);
          ASSERT_EQ(fast[i], block ? plain[static_cast<size_t>(ay * w + ax)] : src[i])
              << (t ? "twirl, " : "sphericity, ") << what << ", at " << x << "," << y;
        }
      }
    }
  }
}

TEST(WarpPaths, DerivedTablesFollowTheirRules) {
  EXPECT_EQ(pfx::kInverse29[0], 0u);
  for (uint32_t i = 1; i < 4096; ++i) {
    ASSERT_LE(uint64_t{pfx::kInverse29[i]} * i, uint64_t{1} << 29) << i;
    ASSERT_GT(uint64_t{pfx::kInverse29[i] + 1} * i, uint64_t{1} << 29) << i;
  }
  // The packed sine and cosine must hold both halves whole.
  for (int32_t r = 0; r < 4096; ++r) {
    ASSERT_EQ(pfx::kSinCos[r] & 0xFFFFu, static_cast<uint32_t>(SIN[r])) << r;
    ASSERT_EQ(pfx::kSinCos[r] >> 16, static_cast<uint32_t>(SIN[4096 - r])) << r;
  }
}

}  // namespace
