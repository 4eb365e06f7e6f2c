// Twirl's square-root and sine tables against <cmath>, and the 2 x 2 blocks of the warps' fast
// mode, which reach one past an odd-sized window and stop only at the image's edge.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <cstdlib>

#include "frame/frame.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

TEST(TwirlTables, SquareRootStepsAreTheRoundedRootsOfTheirLowerEnds) {
  const struct {
    const int32_t* table;
    int32_t n, step, first;
  } tables[] = {{SQRT_STEP_1, 128, 1, 0},
                {SQRT_STEP_2, 480, 4, 128},
                {SQRT_STEP_3, 768, 8, 2048},
                {SQRT_STEP_4, 65536, 64, 0}};
  for (const auto& t : tables) {
    for (int32_t j = 0; j < t.n; ++j) {
      const double u = static_cast<double>(t.step) * j + t.first;
      ASSERT_EQ(t.table[j], static_cast<int32_t>(std::llround(256.0 * std::sqrt(u))))
          << t.step << " " << j;
    }
  }
}

TEST(TwirlTables, SineIsTheRoundedQuarterWave) {
  for (int32_t k = 0; k <= 4096; ++k) {
    const double exact = 32768.0 * std::sin(2.0 * 3.14159265358979323846 * k / 16384.0);
    ASSERT_GT(std::fabs(exact - std::floor(exact) - 0.5), 1e-6) << k;
    ASSERT_EQ(SIN[k], static_cast<int32_t>(std::llround(exact))) << k;
  }
  EXPECT_EQ(SIN[3655], 32301);  // 32300.50003 to 60 digits, the entry closest to a half
}

// Fast mode warps every second pixel of every second row, counted from the window's corner
// (clipped to the image), and fills its whole 2 x 2 block: one past an odd-sized window's last
// column and row, as far as the image reaches. The circles cover the image, so every block's
// value is the plain warp's pixel at the block's corner.
TEST(WarpFastMode, FillsWholeBlocksHeldOnlyToTheImage) {
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
  for (const bool twirl : {true, false}) {
    const auto run = [&](pfx::Rect b, uint32_t fast) {
      Pixels out(src.size(), 0xA5A5A5A5u);
      if (twirl) {
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
              << (twirl ? "twirl, " : "sphericity, ") << what << ", at " << x << "," << y;
        }
      }
    }
  }
}

}  // namespace
