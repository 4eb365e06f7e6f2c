// Depth-of-field blur: the reduction rule, scale-down, and the workspace life cycle.
#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "blur/workspace.h"
#include "frame/alloc_hook.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Mask;
using pfx::test::Pixels;
using Bytes = std::vector<uint8_t>;

constexpr uint32_t kUntouched = 0xA5A5A5A5u;

// Every test starts and ends with the module as a fresh load has it.
class Workspace : public ::testing::Test {
 protected:
  void SetUp() override { TearDown(); }
  void TearDown() override {
    pfx::arm_allocation_failure(0);
    fx_destroy_blur();
    all = 0;
  }
};

// A disc of 1s; outside it 0, with a sprinkling of 2s (nonzero also selects for the blur).
Mask disc_mask(int32_t w, int32_t h, int32_t cx, int32_t cy, int32_t r) {
  Mask m(static_cast<size_t>(w) * h);
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      const int32_t d2 = (x - cx) * (x - cx) + (y - cy) * (y - cy);
      m[static_cast<size_t>(y) * w + x] = d2 <= r * r ? 1 : ((x + y) % 7 == 0 ? 2 : 0);
    }
  }
  return m;
}

// The shift follows the longer side; scale-down samples the top-left pixel of each block, by
// whole quotients on an elongated image, and a zero working size (a division by zero) is a no-op.
TEST(BlurReduction, ShiftAndScaleDown) {
  const struct {
    int32_t w, h, k;
  } cases[] = {{420, 300, 0}, {421, 300, 1}, {300, 421, 1}, {850, 10, 1},    {851, 10, 2},
               {1650, 9, 2},  {9, 1651, 3},  {3250, 1, 3},  {3251, 3000, 4}, {100000, 1, 4}};
  for (const auto& c : cases) EXPECT_EQ(pfx::reduction_shift(c.w, c.h), c.k) << c.w << "x" << c.h;

  const Mask m = pfx::test::random_mask(10, 12, 4);
  Bytes depth(6, 0xEE);
  scale_down_depth(m.data(), 10, 12, depth.data(), 3, 2);  // steps of 10 / 3 = 3 and 12 / 2 = 6
  for (size_t s = 0; s < 6; ++s) EXPECT_EQ(depth[s], m[(s / 3) * 6 * 10 + (s % 3) * 3]) << s;
  const Bytes before = depth;
  scale_down_depth(m.data(), 10, 12, depth.data(), 0, 2);
  EXPECT_EQ(depth, before);
}

// A working size whose sample count no buffer could hold is refused by both compositing calls:
// they write nothing (and read nothing of the small working image they are given).
TEST(BlurComposite, WorkingSizesBeyondTheLimitWriteNothing) {
  const Pixels src = pfx::test::random_image(24, 20, 10);
  const Bytes blur(64 * 3, 0), depth(64, 1);
  for (const auto& [sw, sh] : {std::pair{65536, 65536}, {INT32_MAX, 3}, {1, INT32_MAX}}) {
    Pixels dst(src.size(), kUntouched);
    run_blur(src.data(), blur.data(), nullptr, depth.data(), dst.data(), 24, 20, sw, sh);
    restore_tiltshift(src.data(), blur.data(), dst.data(), 24, 20, sw, sh, 10, 2);
    EXPECT_EQ(dst, Pixels(src.size(), kUntouched)) << sw << "x" << sh;
  }
}

// The preview needs a blur workspace: none yet, destroyed (twice is harmless), or taken apart by
// the tilt-shift's init (which releases the depth map too) or destroy (which leaves the depth
// map to the blur's). A second init releases the first workspace (the leak checker would see it).
TEST_F(Workspace, PreviewNeedsABlurWorkspace) {
  const Pixels img = pfx::test::random_image(40, 30, 14);
  const Mask mask = disc_mask(40, 30, 20, 15, 9);
  const Pixels untouched(img.size(), kUntouched);
  Pixels dst = untouched;
  auto init = [&] { fx_Init_blur(img.data(), mask.data(), 40, 30, 0, 39, 0, 29); };
  auto preview = [&] { fx_make_blur_preview(img.data(), mask.data(), dst.data(), 40, 30, 8); };
  preview();
  init();
  fx_destroy_blur();
  fx_destroy_blur();
  preview();
  init();
  fx_init_tiltshift(img.data(), 40, 30);
  EXPECT_EQ(g_tempd, nullptr);
  preview();
  init();
  fx_destroy_tiltshift();
  EXPECT_NE(g_tempd, nullptr);
  preview();
  EXPECT_EQ(dst, untouched);
  init();
  init();
  preview();
  Pixels once = untouched;
  fx_make_blur(img.data(), mask.data(), once.data(), 40, 30, 8, 0, 39, 0, 29);
  EXPECT_EQ(dst, once);
}

}  // namespace
