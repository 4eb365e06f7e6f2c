// Tilt-shift: the row weights of the sharp band and its fade, the fade-length boundary, the
// workspace life cycle, one-shot and preview agreeing and the lens variant's luma blend. (Failed
// allocations are in the allocation-failure table.)
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <iterator>
#include <tuple>
#include <vector>

#include "frame/alloc_hook.h"
#include "photofx.h"
#include "reference/blur.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;
using Bytes = std::vector<uint8_t>;

constexpr uint32_t kUntouched = 0xA5A5A5A5u;

class TiltShift : public ::testing::Test {
 protected:
  void SetUp() override { fx_destroy_blur(); }
  void TearDown() override {
    pfx::arm_allocation_failure(0);
    fx_destroy_blur();
  }
};

// Sharpness weight of every row of a 2-pixel-wide image of the given height, read back through
// restore_tiltshift: the source is red 255 / green 0 and the blurred image green 255 / red 0,
// so green comes out as 255 - w (0 at 256) and red as w - 1 (0 at 0).
std::vector<int32_t> row_weights(int32_t height, int32_t centre, int32_t half_height) {
  const Pixels src(static_cast<size_t>(2) * height, 0x40FF0000u);
  Bytes blur(2 * 2 * 3, 0);
  for (size_t i = 0; i < 4; ++i) blur[3 * i + 1] = 255;
  Pixels dst(src.size(), kUntouched);
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

// The span-wise mix against the per-pixel form: awkward sizes and working sizes, bands at the
// top, middle and bottom (so every row weight from 0 to 256 occurs), into a second buffer and in
// place.
TEST(TiltShiftRows, RestoreMatchesTheReferenceForm) {
  struct Case {
    int32_t w, h, sw, sh, centre, half;
  };
  const Case cases[] = {{1, 9, 2, 2, 4, 1},          {9, 1, 2, 2, 0, 0},
                        {37, 29, 9, 7, 14, 3},       {101, 67, 6, 4, 0, 10},
                        {250, 190, 15, 11, 189, 20}, {33, 17, 40, 20, 8, 2},
                        {1003, 300, 62, 18, 150, 40}};
  uint64_t seed = 300;
  for (const Case& c : cases) {
    const size_t n = static_cast<size_t>(c.w) * c.h;
    const Pixels src = pfx::test::random_image(c.w, c.h, ++seed);
    Bytes blur(3 * static_cast<size_t>(c.sw) * c.sh);
    pfx::test::Rng rng(++seed);
    for (uint8_t& b : blur) b = static_cast<uint8_t>(rng.word());
    Pixels want(n, kUntouched), got(n, kUntouched), in_place = src;
    pfx::reference::tilt_restore(src.data(), blur.data(), want.data(), c.w, c.h, c.sw, c.sh,
                                 pfx::TiltBand(c.h, c.centre, c.half));
    restore_tiltshift(src.data(), blur.data(), got.data(), c.w, c.h, c.sw, c.sh, c.centre, c.half);
    restore_tiltshift(in_place.data(), blur.data(), in_place.data(), c.w, c.h, c.sw, c.sh, c.centre,
                      c.half);
    EXPECT_EQ(got, want) << c.w << "x" << c.h << " from " << c.sw << "x" << c.sh;
    EXPECT_EQ(in_place, want) << c.w << "x" << c.h << " from " << c.sw << "x" << c.sh;
  }
}

using TiltFn = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t, int32_t, int32_t);

// Tilt-shift of img into a fresh buffer, by the preview or the one-shot call.
Pixels tilt(TiltFn fn, const Pixels& img, int32_t w, int32_t h, int32_t c, int32_t r) {
  Pixels out(img.size(), kUntouched);
  fn(img.data(), out.data(), w, h, c, r);
  return out;
}

TEST_F(TiltShift, PreviewMatchesOneShotAndNeedsAWorkspace) {
  constexpr int32_t W = 60, H = 900;  // k = 2: a 15 x 225 working image
  const Pixels img = pfx::test::random_image(W, H, 21);
  const Pixels untouched(img.size(), kUntouched);
  EXPECT_EQ(tilt(makeTiltShift, img, W, H, 450, 100), untouched);  // before init
  initTiltShift(img.data(), W, H);
  EXPECT_EQ(resize_ratio, 2);
  EXPECT_EQ(g_scaled_wd, 15);
  EXPECT_EQ(g_scaled_ht, 225);
  EXPECT_EQ(g_tempd, nullptr);
  for (const auto& [c, r] : {std::pair{450, 100}, {100, 0}, {899, 30}, {450, 1000}}) {
    const Pixels one_shot = tilt(applyTiltShift, img, W, H, c, r);
    EXPECT_EQ(tilt(makeTiltShift, img, W, H, c, r), one_shot) << c << " " << r;
    Pixels in_place = img;
    makeTiltShift(in_place.data(), in_place.data(), W, H, c, r);
    EXPECT_EQ(in_place, one_shot);
    for (size_t i = 0; i < img.size(); i += 13) ASSERT_EQ(one_shot[i] >> 24, img[i] >> 24);
  }
  // A fade of 128 rows gives the band weight 256: its rows are the source exactly.
  const Pixels sharp_band = tilt(applyTiltShift, img, W, H, 450, 194);
  EXPECT_NE(sharp_band, img);
  for (int32_t y : {256, 450, 644}) {
    EXPECT_TRUE(std::equal(&img[y * W], &img[y * W + W], &sharp_band[y * W])) << y;
  }
  destroyTiltShift();
  destroyTiltShift();
  EXPECT_EQ(g_ssrc, nullptr);
  EXPECT_EQ(resize_ratio, 2);  // kept after destroy
  EXPECT_EQ(tilt(makeTiltShift, img, W, H, 450, 100), untouched);
  // The preview also runs on a blur workspace, and an init releases it.
  const pfx::test::Mask mask(img.size(), 1);
  fx_Init_blur(img.data(), mask.data(), W, H, 0, W - 1, 0, H - 1);
  EXPECT_EQ(tilt(makeTiltShift, img, W, H, 10, 3), tilt(applyTiltShift, img, W, H, 10, 3));
  fx_init_tiltshift(img.data(), W, H);
  fx_init_tiltshift(img.data(), W, H);
  EXPECT_EQ(g_tempd, nullptr);
}

TEST_F(TiltShift, TinyImagesAreCopiedAndRefusedCallsWriteNothing) {
  for (const auto& [w, h] : {std::pair{1, 1}, {1, 9}, {9, 1}, {1000, 3}}) {
    const Pixels img = pfx::test::random_image(w, h, 23);
    EXPECT_EQ(tilt(fx_apply_tiltshift, img, w, h, 0, 0), img) << w << "x" << h;
    fx_init_tiltshift(img.data(), w, h);
    EXPECT_EQ(tilt(fx_tiltshift_preview, img, w, h, 0, 0), img) << w << "x" << h;
  }
  const Pixels img = pfx::test::random_image(8, 8, 24);
  const Pixels untouched(img.size(), kUntouched);
  // restore_tiltshift copies from a working size too small to interpolate, and writes nothing
  // for one whose sample count does not fit.
  const Bytes blur(4 * 3, 0);
  for (const auto& [sw, sh, copied] :
       {std::tuple{1, 4, true}, {2049, 2, true}, {65536, 65536, false}, {INT32_MAX, 3, false}}) {
    Pixels dst = untouched;
    restore_tiltshift(img.data(), blur.data(), dst.data(), 8, 8, sw, sh, 4, 1);
    EXPECT_EQ(dst, copied ? img : untouched) << sw << "x" << sh;
  }
  fx_init_tiltshift(img.data(), 8, 8);
  EXPECT_EQ(tilt(fx_tiltshift_preview, img, -8, 8, 4, 1), untouched);
  fx_tiltshift_preview(nullptr, nullptr, 8, 8, 4, 1);
  fx_init_tiltshift(nullptr, 8, 8);
  EXPECT_EQ(g_ssrc, nullptr);
}

Bytes random_grey(int32_t w, int32_t h, uint64_t seed) {
  pfx::test::Rng rng(seed);
  Bytes out(static_cast<size_t>(w) * h * 3);
  for (size_t i = 0; i < out.size(); i += 3) {
    out[i] = out[i + 1] = out[i + 2] = static_cast<uint8_t>(rng.word());
  }
  return out;
}

TEST(TiltShiftBlur, IsTheWidestGaussianOverEverySample) {
  Bytes img = random_grey(17, 11, 26);
  img[4] ^= 0x55;  // some colour too
  const Bytes depth(17 * 11, 1);
  Bytes tilt(img.size()), gauss(img.size());
  make_tiltshift(img.data(), tilt.data(), 17, 11);
  make_gaussian_blur(img.data(), gauss.data(), depth.data(), 17, 11, 8);
  EXPECT_EQ(tilt, gauss);
  EXPECT_NE(tilt, img);
}

TEST(TiltShiftLens, LumaLeansOnTheSampleItselfInTheBand) {
  // Grey samples have no chroma, so the result's grey level is the blended luma.
  const Bytes grey = random_grey(12, 10, 27), depth(12 * 10, 1);
  Bytes lens(grey.size()), tilt(grey.size());
  make_lens_blur(grey.data(), lens.data(), depth.data(), 12, 10, 8);
  // Height 10, centre 5, half-height 3: a fade of one row, so rows 2..8 have weight 256 (own
  // luma only) and rows 0, 1 and 9 weight 0 (lens luma alone).
  make_tiltshift_lens(grey.data(), tilt.data(), 12, 10, 5, 3);
  for (size_t i = 0; i < grey.size(); ++i) {
    const size_t y = i / 36;
    ASSERT_EQ(tilt[i], (y >= 2 && y <= 8 ? grey : lens)[i]) << i;
  }
  make_tiltshift_lens(grey.data(), tilt.data(), 12, 10, 5, 4);  // no room to fade
  EXPECT_EQ(tilt, grey);
  // Weight 255 in the band (a fade of 3 rows): one 32nd of the lens luma remains.
  make_tiltshift_lens(grey.data(), tilt.data(), 12, 10, 0, 3);
  for (size_t i = 0; i < 36; ++i) EXPECT_EQ(tilt[i], (grey[i] * 31 + lens[i]) >> 5) << i;
}

}  // namespace
