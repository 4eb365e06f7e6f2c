// Depth-of-field blur: the reduction rule, scale-down, what compositing changes, the
// workspace life cycle and its globals, the one-shot path, the untouched selection mask and tiny
// images. (Failed allocations are in the allocation-failure table.)
#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "blur/composite.h"
#include "blur/workspace.h"
#include "frame/alloc_hook.h"
#include "photofx.h"
#include "reference/blur.h"
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

bool no_workspace() { return g_ssrc == nullptr && g_sblur == nullptr && g_tempd == nullptr; }

// One-shot blur into a fresh buffer; bounds (0, w - 1, 0, h - 1) unless given.
Pixels blur_once(const Pixels& img, const uint8_t* mask, int32_t w, int32_t h, int32_t level,
                 pfx::Rect b = {0, -1, 0, -1}) {
  if (b.right < 0) b = {0, w - 1, 0, h - 1};
  Pixels out(img.size(), kUntouched);
  applyBlur(img.data(), mask, out.data(), w, h, level, b.left, b.right, b.top, b.bottom);
  return out;
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

// The span-wise compositing against the plain per-pixel form: awkward widths, working sizes
// from the smallest to more samples than pixels, random depth (0 keeps the source colour) and
// mask bytes, whole-image and masked, into a second buffer and in place.
TEST(BlurComposite, MatchesTheReferenceForm) {
  struct Case {
    int32_t w, h, sw, sh;
  };
  const Case cases[] = {{1, 7, 2, 2},     {7, 1, 2, 2},    {2, 2, 2, 2},       {13, 11, 3, 5},
                        {37, 29, 9, 7},   {101, 67, 6, 4}, {250, 190, 15, 11}, {33, 17, 40, 20},
                        {1003, 5, 62, 2}, {9, 600, 2, 37}};
  uint64_t seed = 100;
  for (const Case& c : cases) {
    const size_t n = static_cast<size_t>(c.w) * c.h, samples = static_cast<size_t>(c.sw) * c.sh;
    const Pixels src = pfx::test::random_image(c.w, c.h, ++seed);
    const Mask mask = pfx::test::random_mask(c.w, c.h, ++seed);
    const Mask depth = pfx::test::random_mask(c.sw, c.sh, ++seed);
    Bytes blur(3 * samples);
    pfx::test::Rng rng(++seed);
    for (uint8_t& b : blur) b = static_cast<uint8_t>(rng.word());
    for (const bool every : {true, false}) {
      Pixels want(n, kUntouched), got(n, kUntouched), in_place = src;
      pfx::reference::composite(src.data(), blur.data(), mask.data(), depth.data(), want.data(),
                                c.w, c.h, c.sw, c.sh, every);
      pfx::composite(src.data(), blur.data(), mask.data(), depth.data(), got.data(), c.w, c.h, c.sw,
                     c.sh, every);
      pfx::composite(in_place.data(), blur.data(), mask.data(), depth.data(), in_place.data(), c.w,
                     c.h, c.sw, c.sh, every);
      EXPECT_EQ(got, want) << c.w << "x" << c.h << " from " << c.sw << "x" << c.sh << every;
      EXPECT_EQ(in_place, want) << c.w << "x" << c.h << " from " << c.sw << "x" << c.sh << every;
    }
  }
}

// Compositing changes only pixels both selected and blurred (depth nonzero), and nothing for
// working images under two samples a side. (The interpolation itself, edges included, is pinned
// by the blur goldens.)
TEST(BlurComposite, DepthMaskAndWorkingSizeDecideWhatChanges) {
  constexpr int32_t W = 24, H = 20, SW = 6, SH = 5;
  const Pixels src = pfx::test::random_image(W, H, 10);
  const Bytes blur(4100 * 3, 0), zeros(SW * SH, 0), ones(4100, 1);
  const Mask every(W * H, 1), none(W * H, 0), some = pfx::test::random_mask(W, H, 11);
  auto run = [&](const uint8_t* mask, const Bytes& depth, int32_t sw, int32_t sh) {
    Pixels dst(src.size(), kUntouched);
    run_blur(src.data(), blur.data(), mask, depth.data(), dst.data(), W, H, sw, sh);
    return dst;
  };
  all = 0;
  EXPECT_EQ(run(every.data(), zeros, SW, SH), src);  // selected, but nowhere blurred
  EXPECT_EQ(run(none.data(), ones, SW, SH), src);    // blurred, but nothing selected
  EXPECT_EQ(run(nullptr, ones, SW, SH), Pixels(src.size(), kUntouched));  // no mask, not `all`
  all = 1;  // every pixel eligible, no mask needed
  const Pixels black = run(nullptr, ones, SW, SH);
  all = 0;
  for (size_t i = 0; i < src.size(); ++i) ASSERT_EQ(black[i], src[i] & 0xFF000000u) << i;
  Pixels in_place = src;
  run_blur(in_place.data(), blur.data(), some.data(), ones.data(), in_place.data(), W, H, SW, SH);
  EXPECT_EQ(in_place, run(some.data(), ones, SW, SH));
  // Fewer than two working samples a side (or more than the coordinates hold): the source; a
  // working size whose sample count does not fit: nothing.
  for (const auto& [sw, sh] : {std::pair{1, 4}, {4, 1}, {0, 0}, {2049, 2}, {2, 2049}}) {
    EXPECT_EQ(run(every.data(), ones, sw, sh), src) << sw << "x" << sh;
  }
  for (const auto& [sw, sh] : {std::pair{65536, 65536}, {INT32_MAX, 3}, {1, INT32_MAX}}) {
    EXPECT_EQ(run(every.data(), ones, sw, sh), Pixels(src.size(), kUntouched)) << sw << "x" << sh;
  }
}

// Init keeps working copies of the reduced size and the depth map (all ones with empty bounds,
// which need no mask); the flag and sizes outlive the workspace.
TEST_F(Workspace, InitKeepsWorkingCopiesOfTheReducedSize) {
  const Pixels img = pfx::test::random_image(1920, 1080, 13);
  const Mask mask = disc_mask(1920, 1080, 900, 500, 300);
  fx_Init_blur(img.data(), mask.data(), 1920, 1080, 0, 1919, 0, 1079);
  EXPECT_EQ(g_scaled_wd, 240);
  EXPECT_EQ(g_scaled_ht, 135);
  EXPECT_EQ(all, 0);
  ASSERT_FALSE(no_workspace());
  EXPECT_EQ(g_ssrc[3 * (135 * 240 - 1) + 2], img[(134 * 8) * 1920 + 239 * 8] & 255);
  EXPECT_EQ(g_tempd[67 * 240 + 112], mask[(67 * 8) * 1920 + 112 * 8]);
  fx_Init_blur(img.data(), nullptr, 421, 300, 1, 0, 0, 0);
  EXPECT_EQ(g_scaled_wd, 210);
  EXPECT_EQ(g_scaled_ht, 150);
  EXPECT_EQ(all, 1);
  EXPECT_EQ(Bytes(g_tempd, g_tempd + 210 * 150), Bytes(210 * 150, 1));
  fx_destroy_blur();
  EXPECT_TRUE(no_workspace());
  EXPECT_EQ(all, 1);
  EXPECT_EQ(g_scaled_wd, 210);
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
  EXPECT_EQ(dst, blur_once(img, mask.data(), 40, 30, 8));
}

// The preview gives what the one-shot blur gives, in both modes and at every level, keeps the
// unselected pixels, and neither writes the caller's mask.
TEST_F(Workspace, PreviewMatchesOneShotAndNeverWritesTheMask) {
  constexpr int32_t W = 900, H = 120;  // k = 2: a 225 x 30 working image
  const Pixels img = pfx::test::random_image(W, H, 15);
  const Mask mask = disc_mask(W, H, 450, 60, 50);
  const Mask seen = mask;
  for (const pfx::Rect b : {pfx::Rect{0, W - 1, 0, H - 1}, pfx::Rect{5, 4, 0, 0}}) {
    fx_Init_blur(img.data(), seen.data(), W, H, b.left, b.right, b.top, b.bottom);
    for (int32_t level : {0, 3, 8, -7}) {
      Pixels preview(img.size(), kUntouched);
      fx_make_blur_preview(img.data(), seen.data(), preview.data(), W, H, level);
      EXPECT_EQ(preview, blur_once(img, seen.data(), W, H, level, b)) << level;
      EXPECT_NE(preview, img) << level;
      for (size_t i = 0; i < img.size() && pfx::is_region(b); ++i) {
        if (mask[i] == 0) {
          ASSERT_EQ(preview[i], img[i]) << i;
        }
      }
    }
    ASSERT_EQ(seen, mask);
  }
}

// The one-shot blur decides whole-image mode from its own bounds, not from a workspace's flag;
// whole-image mode needs no mask and equals a mask selecting everything.
TEST_F(Workspace, OneShotKeepsItsOwnWholeImageFlag) {
  const Pixels img = pfx::test::random_image(48, 40, 16);
  const Mask mask = disc_mask(48, 40, 24, 20, 10), ones(img.size(), 1);
  const Pixels expected = blur_once(img, mask.data(), 48, 40, 8);
  fx_Init_blur(img.data(), nullptr, 48, 40, 1, 0, 1, 0);
  ASSERT_EQ(all, 1);
  EXPECT_EQ(blur_once(img, mask.data(), 48, 40, 8), expected);
  EXPECT_EQ(blur_once(img, nullptr, 48, 40, 5, {0, 47, 9, 8}),
            blur_once(img, ones.data(), 48, 40, 5));
  Pixels in_place = img;
  fx_make_blur(in_place.data(), mask.data(), in_place.data(), 48, 40, 8, 0, 47, 0, 39);
  EXPECT_EQ(in_place, expected);
}

// Images too small for two working samples a side are copied; refused inits build nothing and
// refused previews write nothing (the one-shot's refusals are in the bad-input table).
TEST_F(Workspace, TinyImagesAreCopiedAndRefusedCallsWriteNothing) {
  for (const auto& [w, h] : {std::pair{1, 1}, {1, 5}, {7, 1}, {3, 1000}, {1000, 5}}) {
    const Pixels img = pfx::test::random_image(w, h, 17);
    EXPECT_EQ(blur_once(img, nullptr, w, h, 8, {1, 0, 0, 0}), img) << w << "x" << h;
    fx_Init_blur(img.data(), nullptr, w, h, 1, 0, 0, 0);
    ASSERT_FALSE(no_workspace());
    Pixels dst(img.size(), kUntouched);
    fx_make_blur_preview(img.data(), nullptr, dst.data(), w, h, 8);
    EXPECT_EQ(dst, img) << w << "x" << h;
  }
  const Pixels two = {0xFF000000u, 0xFFFFFFFFu, 0xFFFFFFFFu, 0xFFFFFFFFu};
  EXPECT_NE(blur_once(two, nullptr, 2, 2, 8, {1, 0, 0, 0}), two);  // two samples a side suffice

  const Pixels img = pfx::test::random_image(20, 20, 18);
  fx_Init_blur(img.data(), nullptr, 20, 20, 0, 19, 0, 19);  // masked mode without a mask
  EXPECT_TRUE(no_workspace());
  fx_Init_blur(nullptr, nullptr, 20, 20, 1, 0, 0, 0);
  EXPECT_TRUE(no_workspace());
  const Mask ones(img.size(), 1);
  fx_Init_blur(img.data(), ones.data(), 20, 20, 0, 19, 0, 19);
  const Pixels untouched(img.size(), kUntouched);
  Pixels dst = untouched;
  fx_make_blur_preview(img.data(), nullptr, dst.data(), 20, 20, 8);
  fx_make_blur_preview(img.data(), ones.data(), dst.data(), -20, 20, 8);
  fx_make_blur_preview(img.data(), ones.data(), nullptr, 20, 20, 8);
  EXPECT_EQ(dst, untouched);
}

}  // namespace
