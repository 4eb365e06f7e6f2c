// Depth-of-field blur: the reduction rule, scale-down, compositing back to full size, the
// workspace life cycle, the one-shot path, the untouched selection mask, tiny images and every
// allocation failure.
#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "blur/composite.h"
#include "blur/workspace.h"
#include "frame/alloc_hook.h"
#include "photofx.h"
#include "reference/blur.h"
#include "support/conformance.h"
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

TEST(BlurReduction, ShiftFollowsTheLongerSide) {
  const struct {
    int32_t w, h, k;
  } cases[] = {{420, 300, 0}, {421, 300, 1}, {300, 421, 1}, {850, 10, 1},    {851, 10, 2},
               {1650, 9, 2},  {9, 1651, 3},  {3250, 1, 3},  {3251, 3000, 4}, {100000, 1, 4}};
  for (const auto& c : cases) EXPECT_EQ(pfx::reduction_shift(c.w, c.h), c.k) << c.w << "x" << c.h;
}

TEST(BlurScaleDown, SamplesTheTopLeftPixelOfEachBlock) {
  const Pixels img = pfx::test::random_image(16, 12, 3);
  Bytes out(4 * 3 * 3, 0xEE);
  scale_down_img(img.data(), 16, 12, out.data(), 4, 3);
  for (size_t s = 0; s < 12; ++s) {
    const uint32_t p = img[(s / 4) * 4 * 16 + (s % 4) * 4];
    EXPECT_EQ(out[3 * s] << 16 | out[3 * s + 1] << 8 | out[3 * s + 2], p & 0xFFFFFFu) << s;
  }
  // An elongated image steps by whole quotients: 10 / 3 = 3 columns and 12 / 2 = 6 rows.
  const Mask m = pfx::test::random_mask(10, 12, 4);
  Bytes depth(6, 0xEE);
  scale_down_depth(m.data(), 10, 12, depth.data(), 3, 2);
  for (size_t s = 0; s < 6; ++s) EXPECT_EQ(depth[s], m[(s / 3) * 6 * 10 + (s % 3) * 3]) << s;
  scale_down_depth(m.data(), 10, 12, depth.data(), 0, 2);  // would divide by zero: a no-op
}

// 1000 x 800 over a 250 x 200 working image (k = 2), everything selected. Working sample (i, j)
// holds red i, green 4j and blue 4i (mod 256), so fractions show up exactly.
TEST(BlurComposite, InterpolatesBetweenWorkingSamplesUpToTheEdges) {
  constexpr int32_t W = 1000, H = 800, SW = 250, SH = 200;
  Bytes blur(SW * SH * 3);
  for (size_t s = 0; s < SW * SH; ++s) {
    blur[3 * s] = static_cast<uint8_t>(s % SW);
    blur[3 * s + 1] = static_cast<uint8_t>(4 * (s / SW));
    blur[3 * s + 2] = static_cast<uint8_t>(4 * (s % SW));
  }
  const Bytes depth(SW * SH, 3);
  const Mask mask(W * H, 255);
  const Pixels src = pfx::test::random_image(W, H, 9);
  Pixels dst(src.size());
  run_blur(src.data(), blur.data(), mask.data(), depth.data(), dst.data(), W, H, SW, SH);
  auto channel = [&](int32_t x, int32_t y, int shift) {
    return static_cast<int32_t>((dst[static_cast<size_t>(y) * W + x] >> shift) & 255);
  };
  for (int32_t j = 0; j <= 198; j += 33) {
    for (int32_t i = 0; i <= 248; i += 31) {
      EXPECT_EQ(channel(4 * i, 4 * j, 16), i);
      EXPECT_EQ(channel(4 * i, 4 * j, 8), 4 * j & 255);
      // Halfway between working columns holding 4i and 4i + 4: their mean.
      if (i < 63) {
        EXPECT_EQ(channel(4 * i + 2, 4 * j, 0), 4 * i + 2);
      }
    }
  }
  // Working columns 248 and 249 hold blue 224 and 228: column 995 takes 3/4 of column 249, and
  // columns 996..999 start again from 248 alone and blend in 1/4, 1/2, 3/4 of 249.
  const int32_t edge[5] = {227, 224, 225, 226, 227};
  for (int32_t x = 995; x <= 999; ++x) EXPECT_EQ(channel(x, 0, 0), edge[x - 995]) << x;
  // Rows 795..799 likewise over working rows 198 and 199 (green 24 and 28).
  for (int32_t y = 795; y <= 799; ++y) EXPECT_EQ(channel(0, y, 8), edge[y - 795] - 200) << y;
  for (size_t i = 0; i < dst.size(); i += 997) EXPECT_EQ(dst[i] >> 24, src[i] >> 24);
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
  EXPECT_EQ(run(every.data(), zeros, SW, SH), src);  // selected, but nowhere blurred
  EXPECT_EQ(run(none.data(), ones, SW, SH), src);    // blurred, but nothing selected
  all = 1;                                           // every pixel eligible, no mask needed
  const Pixels black = run(nullptr, ones, SW, SH);
  all = 0;
  for (size_t i = 0; i < src.size(); ++i) ASSERT_EQ(black[i], src[i] & 0xFF000000u) << i;
  Pixels in_place = src;
  run_blur(in_place.data(), blur.data(), some.data(), ones.data(), in_place.data(), W, H, SW, SH);
  EXPECT_EQ(in_place, run(some.data(), ones, SW, SH));
  // Fewer than two working samples a side (or more than the coordinates hold): the source.
  for (const auto& [sw, sh] : {std::pair{1, 4}, {4, 1}, {0, 0}, {2049, 2}, {2, 2049}}) {
    EXPECT_EQ(run(every.data(), ones, sw, sh), src) << sw << "x" << sh;
  }
  EXPECT_EQ(run(nullptr, ones, SW, SH), Pixels(src.size(), kUntouched));
}

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
  // Empty bounds: the depth map covers everything and the mask is not needed.
  fx_Init_blur(img.data(), nullptr, 421, 300, 1, 0, 0, 0);
  EXPECT_EQ(g_scaled_wd, 210);
  EXPECT_EQ(g_scaled_ht, 150);
  EXPECT_EQ(all, 1);
  EXPECT_EQ(Bytes(g_tempd, g_tempd + 210 * 150), Bytes(210 * 150, 1));
  fx_destroy_blur();
  EXPECT_TRUE(no_workspace());
  EXPECT_EQ(all, 1);  // flag and sizes outlive the workspace
  EXPECT_EQ(g_scaled_wd, 210);
}

TEST_F(Workspace, PreviewNeedsABlurWorkspace) {
  const Pixels img = pfx::test::random_image(40, 30, 14);
  const Mask mask = disc_mask(40, 30, 20, 15, 9);
  const Pixels untouched(img.size(), kUntouched);
  Pixels dst = untouched;
  auto init = [&] { fx_Init_blur(img.data(), mask.data(), 40, 30, 0, 39, 0, 29); };
  auto preview = [&] { fx_make_blur_preview(img.data(), mask.data(), dst.data(), 40, 30, 8); };
  preview();  // before any init
  init();
  fx_destroy_blur();
  fx_destroy_blur();  // twice is harmless
  preview();
  init();
  fx_init_tiltshift(img.data(), 40, 30);  // releases the depth map with the rest
  EXPECT_EQ(g_tempd, nullptr);
  preview();
  init();
  fx_destroy_tiltshift();  // leaves the depth map to fx_destroy_blur
  EXPECT_NE(g_tempd, nullptr);
  preview();
  EXPECT_EQ(dst, untouched);
  init();
  init();  // the first workspace is released (the leak checker would see it otherwise)
  preview();
  EXPECT_EQ(dst, blur_once(img, mask.data(), 40, 30, 8));
}

// The preview gives what the one-shot blur gives, in both modes and at every level, and neither
// writes the caller's mask.
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

TEST_F(Workspace, OneShotKeepsItsOwnWholeImageFlag) {
  const Pixels img = pfx::test::random_image(48, 40, 16);
  const Mask mask = disc_mask(48, 40, 24, 20, 10), ones(img.size(), 1);
  const Pixels expected = blur_once(img, mask.data(), 48, 40, 8);
  fx_Init_blur(img.data(), nullptr, 48, 40, 1, 0, 1, 0);
  ASSERT_EQ(all, 1);
  EXPECT_EQ(blur_once(img, mask.data(), 48, 40, 8), expected);
  // Whole-image mode needs no mask and equals a mask selecting everything.
  EXPECT_EQ(blur_once(img, nullptr, 48, 40, 5, {0, 47, 9, 8}),
            blur_once(img, ones.data(), 48, 40, 5));
  Pixels in_place = img;
  fx_make_blur(in_place.data(), mask.data(), in_place.data(), 48, 40, 8, 0, 47, 0, 39);
  EXPECT_EQ(in_place, expected);
}

// The photograph crop at full size and enlarged 8 times (k = 2): pixels outside the selection
// keep their value exactly, the selection is blurred, alpha survives.
TEST_F(Workspace, PhotoBlurKeepsUnselectedPixels) {
  const pfx::test::Input photo = pfx::test::photo_input();
  ASSERT_EQ(photo.pixels.size(), 64u * 48u);
  for (int32_t scale : {1, 8}) {
    const int32_t w = 64 * scale, h = 48 * scale;
    Pixels img(static_cast<size_t>(w) * h);
    for (size_t i = 0; i < img.size(); ++i) {
      const size_t x = i % w, y = i / w;
      img[i] = (photo.pixels[(y / scale) * 64 + x / scale] & 0xFFFFFFu) | (x % 3 ? 0xFFu : 0x80u)
                                                                              << 24;
    }
    const Mask mask = disc_mask(w, h, 40 * scale, 20 * scale, 15 * scale);
    const Pixels dst = blur_once(img, mask.data(), w, h, 8);
    size_t changed = 0;
    for (size_t i = 0; i < img.size(); ++i) {
      if (mask[i] == 0) {
        ASSERT_EQ(dst[i], img[i]) << scale << " " << i;
      }
      ASSERT_EQ(dst[i] >> 24, img[i] >> 24);
      changed += dst[i] != img[i];
    }
    EXPECT_GT(changed, img.size() / 20) << scale;
  }
}

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
  const Pixels untouched(img.size(), kUntouched);
  EXPECT_EQ(blur_once(img, nullptr, 20, 20, 8), untouched);  // masked mode without a mask
  EXPECT_EQ(blur_once(img, nullptr, 0, 20, 8, {1, 0, 0, 0}), untouched);
  EXPECT_EQ(blur_once(img, nullptr, 1 << 16, 1 << 16, 8, {1, 0, 0, 0}), untouched);
  fx_Init_blur(img.data(), nullptr, 20, 20, 0, 19, 0, 19);
  EXPECT_TRUE(no_workspace());
  fx_Init_blur(nullptr, nullptr, 20, 20, 1, 0, 0, 0);
  EXPECT_TRUE(no_workspace());
  const Mask ones(img.size(), 1);
  fx_Init_blur(img.data(), ones.data(), 20, 20, 0, 19, 0, 19);
  Pixels dst = untouched;
  fx_make_blur_preview(img.data(), nullptr, dst.data(), 20, 20, 8);  // masked mode needs it
  fx_make_blur_preview(img.data(), ones.data(), dst.data(), -20, 20, 8);
  fx_make_blur_preview(img.data(), ones.data(), nullptr, 20, 20, 8);
  EXPECT_EQ(dst, untouched);
}

TEST_F(Workspace, FailedAllocationsLeaveNoWorkspaceAndNoOutput) {
  constexpr int32_t W = 500, H = 60;  // k = 1
  const Pixels img = pfx::test::random_image(W, H, 19);
  const Mask mask = disc_mask(W, H, 250, 30, 20);
  const Pixels untouched(img.size(), kUntouched);
  const Pixels expected = blur_once(img, mask.data(), W, H, 6);
  Pixels dst = untouched;
  auto preview = [&] { fx_make_blur_preview(img.data(), mask.data(), dst.data(), W, H, 6); };

  for (int64_t n = 1; n <= 3; ++n) {  // init takes three buffers
    pfx::arm_allocation_failure(n);
    fx_Init_blur(img.data(), mask.data(), W, H, 0, W - 1, 0, H - 1);
    pfx::arm_allocation_failure(0);
    EXPECT_TRUE(no_workspace()) << n;
    preview();
    EXPECT_EQ(dst, untouched) << n;
  }
  pfx::arm_allocation_failure(4);
  fx_Init_blur(img.data(), mask.data(), W, H, 0, W - 1, 0, H - 1);
  EXPECT_EQ(pfx::allocation_requests(), 3);
  pfx::arm_allocation_failure(1);  // the preview's blur scratch
  preview();
  EXPECT_EQ(dst, untouched);
  pfx::arm_allocation_failure(0);
  preview();
  EXPECT_EQ(dst, expected);

  for (int64_t n = 1; n <= 4; ++n) {  // the one-shot blur takes four, the last the blur's scratch
    pfx::arm_allocation_failure(n);
    EXPECT_EQ(blur_once(img, mask.data(), W, H, 6), untouched) << n;
  }
  pfx::arm_allocation_failure(5);
  EXPECT_EQ(blur_once(img, mask.data(), W, H, 6), expected);
  EXPECT_EQ(pfx::allocation_requests(), 4);
}

}  // namespace
