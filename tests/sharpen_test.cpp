// Sharpen: the worked values, the columns and edges it leaves alone, the two partial modes, the
// caller's mask left intact, in-place calls and a refused scratch image.
#include <gtest/gtest.h>

#include <cstdint>

#include "frame/alloc_hook.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Mask;
using pfx::test::Pixels;

// Sharpens a 3 x 1 image and returns its middle pixel.
uint32_t middle(uint32_t left, uint32_t centre, uint32_t right) {
  const uint32_t src[3] = {left, centre, right};
  uint32_t dst[3] = {};
  fx_apply_sharpen_all(src, dst, 3, 1);
  EXPECT_EQ(dst[0], left);
  EXPECT_EQ(dst[2], right);
  return dst[1];
}

uint32_t grey(uint32_t v) { return argb(0xFF, v, v, v); }

TEST(Sharpen, WorkedValues) {
  EXPECT_EQ(middle(grey(10), grey(50), grey(10)), grey(90));
  EXPECT_EQ(middle(grey(100), grey(50), grey(100)), grey(0));
  EXPECT_EQ(middle(grey(0), grey(200), grey(0)), grey(255));
  EXPECT_EQ(middle(grey(10), grey(11), grey(11)), grey(12));
}

TEST(Sharpen, ChannelsAreSharpenedApartAndAlphaIsKept) {
  EXPECT_EQ(middle(argb(0x00, 10, 100, 0), argb(0x42, 50, 50, 200), argb(0xFF, 10, 100, 0)),
            argb(0x42, 90, 0, 255));
  EXPECT_EQ(middle(argb(0xFF, 255, 0, 7), argb(0x00, 255, 0, 9), argb(0x80, 255, 0, 8)),
            argb(0x00, 255, 0, 11));
}

TEST(Sharpen, UniformImagesAndNarrowImagesPassUnchanged) {
  Pixels out(40 * 3);
  const Pixels uniform = pfx::test::filled(40, 3, argb(0x9A, 1, 128, 254));
  fx_apply_sharpen_all(uniform.data(), out.data(), 40, 3);
  EXPECT_EQ(out, uniform);
  for (int32_t w : {1, 2}) {
    const Pixels img = pfx::test::random_image(w, 9, 50);
    Pixels dst(img.size());
    fx_apply_sharpen_all(img.data(), dst.data(), w, 9);
    EXPECT_EQ(dst, img) << w;
  }
}

TEST(Sharpen, EdgeColumnsAndHorizontalEdgesAreLeftAlone) {
  const int32_t w = 12, h = 6;
  const Pixels img = pfx::test::random_image(w, h, 51);
  Pixels out(img.size());
  fx_apply_sharpen_all(img.data(), out.data(), w, h);
  for (int32_t y = 0; y < h; ++y) {
    EXPECT_EQ(out[static_cast<size_t>(y * w)], img[static_cast<size_t>(y * w)]);
    EXPECT_EQ(out[static_cast<size_t>(y * w + w - 1)], img[static_cast<size_t>(y * w + w - 1)]);
  }
  EXPECT_NE(out, img);
  // Rows of one colour each: nothing changes from left to right, so nothing is sharpened.
  Pixels rows(img.size());
  for (size_t i = 0; i < rows.size(); ++i) rows[i] = img[i / static_cast<size_t>(w)];
  fx_apply_sharpen_all(rows.data(), out.data(), w, h);
  EXPECT_EQ(out, rows);
}

TEST(Sharpen, FullVariantWorksInPlace) {
  const Pixels img = pfx::test::random_image(17, 5, 52);
  Pixels out(img.size()), in_place = img;
  fx_apply_sharpen_all(img.data(), out.data(), 17, 5);
  fx_apply_sharpen_all(in_place.data(), in_place.data(), 17, 5);
  EXPECT_EQ(in_place, out);
}

class SharpenPartial : public ::testing::Test {
 protected:
  static constexpr int32_t kW = 10, kH = 8;
  const Pixels img = pfx::test::random_image(kW, kH, 53);
  Mask mask = pfx::test::random_mask(kW, kH, 54);
  Pixels full = Pixels(img.size());
  Pixels out = Pixels(img.size(), 0xDEADBEEFu);

  void SetUp() override { fx_apply_sharpen_all(img.data(), full.data(), kW, kH); }
};

// Valid bounds only choose masked mode: a selected pixel outside the rectangle is sharpened too.
// The level is accepted and ignored, and the mask is only read.
TEST_F(SharpenPartial, ValidBoundsLetTheMaskAloneDecide) {
  const Mask before = mask;
  for (int32_t level : {INT32_MIN, 0, 10, INT32_MAX}) {
    applySharpen(img.data(), mask.data(), out.data(), kW, kH, level, 3, 3, 4, 4);
    size_t edited = 0;
    for (size_t i = 0; i < img.size(); ++i) {
      EXPECT_EQ(out[i], mask[i] == 1 ? full[i] : img[i]) << i << " level " << level;
      edited += out[i] != img[i];
    }
    EXPECT_GT(edited, 1u);
  }
  EXPECT_EQ(mask, before);
}

TEST_F(SharpenPartial, EmptyBoundsSharpenEverythingAndLeaveTheMaskIntact) {
  const Mask before = mask;
  fx_apply_sharpen(img.data(), mask.data(), out.data(), kW, kH, 10, 1, 0, 0, kH - 1);
  EXPECT_EQ(out, full);
  EXPECT_EQ(mask, before);
  out.assign(out.size(), 0);
  fx_apply_sharpen(img.data(), mask.data(), out.data(), kW, kH, 10, 0, kW - 1, 5, 4);
  EXPECT_EQ(out, full);
  EXPECT_EQ(mask, before);
  // Without bounds there is nothing to read the mask for, so it need not be there.
  out.assign(out.size(), 0);
  fx_apply_sharpen(img.data(), nullptr, out.data(), kW, kH, 10, 1, 0, 1, 0);
  EXPECT_EQ(out, full);
}

TEST_F(SharpenPartial, WorksInPlace) {
  fx_apply_sharpen(img.data(), mask.data(), out.data(), kW, kH, 10, 0, 9, 0, 7);
  Pixels in_place = img;
  fx_apply_sharpen(in_place.data(), mask.data(), in_place.data(), kW, kH, 10, 0, 9, 0, 7);
  EXPECT_EQ(in_place, out);
}

TEST_F(SharpenPartial, RefusedScratchWritesNothing) {
  const Pixels before = out;
  pfx::arm_allocation_failure(1);
  fx_apply_sharpen_all(img.data(), out.data(), kW, kH);
  pfx::arm_allocation_failure(1);
  fx_apply_sharpen(img.data(), mask.data(), out.data(), kW, kH, 10, 0, kW - 1, 0, kH - 1);
  pfx::arm_allocation_failure(1);
  fx_apply_sharpen(img.data(), mask.data(), out.data(), kW, kH, 10, 1, 0, 0, 0);
  pfx::arm_allocation_failure(1);
  Pixels in_place = img;
  fx_apply_sharpen_all(in_place.data(), in_place.data(), kW, kH);
  pfx::arm_allocation_failure(0);
  EXPECT_EQ(out, before);
  EXPECT_EQ(in_place, img);
  // The next call, with memory to spare, works again.
  fx_apply_sharpen_all(img.data(), out.data(), kW, kH);
  EXPECT_EQ(out, full);
}

TEST_F(SharpenPartial, BadArgumentsWriteNothing) {
  const Pixels before = out;
  fx_apply_sharpen_all(nullptr, out.data(), kW, kH);
  fx_apply_sharpen_all(img.data(), nullptr, kW, kH);
  fx_apply_sharpen(nullptr, mask.data(), out.data(), kW, kH, 10, 0, 1, 0, 1);
  fx_apply_sharpen(img.data(), mask.data(), nullptr, kW, kH, 10, 0, 1, 0, 1);
  fx_apply_sharpen(img.data(), nullptr, out.data(), kW, kH, 10, 0, 1, 0, 1);
  fx_apply_sharpen_all(img.data(), out.data(), 0, kH);
  fx_apply_sharpen_all(img.data(), out.data(), -kW, -kH);
  fx_apply_sharpen(img.data(), mask.data(), out.data(), kW, -1, 10, 1, 0, 0, 0);
  fx_apply_sharpen_all(img.data(), out.data(), 65536, 65536);
  fx_apply_sharpen(img.data(), mask.data(), out.data(), 65536, 65536, 10, 1, 0, 0, 0);
  EXPECT_EQ(out, before);
}

}  // namespace
