// The calling frame: memory wrappers, channel packing and the partial-variant rules, exercised
// through brightness (the simplest effect that runs in both frames).
#include <gtest/gtest.h>

#include <cstdint>

#include "frame/alloc_hook.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Mask;
using pfx::test::Pixels;

TEST(Memory, MallocRefusesProductsBeyond32Bits) {
  EXPECT_EQ(fx_malloc(0x10000u, 0x10000u), nullptr);
  EXPECT_EQ(fx_malloc(0x80000000u, 2u), nullptr);
  void* p = fx_malloc(16u, 4u);
  ASSERT_NE(p, nullptr);
  fx_memset(p, 0xAB, 64u);
  EXPECT_EQ(static_cast<uint8_t*>(p)[63], 0xAB);
  fx_free(p);
}

TEST(Memory, CallocZeroFillsAndReallocKeepsContents) {
  auto* p = static_cast<uint32_t*>(fx_calloc(8u, 4u));
  ASSERT_NE(p, nullptr);
  for (int i = 0; i < 8; ++i) EXPECT_EQ(p[i], 0u);
  p[7] = 0x12345678u;
  p = static_cast<uint32_t*>(fx_realloc(p, 64u));
  ASSERT_NE(p, nullptr);
  EXPECT_EQ(p[7], 0x12345678u);
  uint32_t copy[8] = {};
  EXPECT_EQ(fx_memcpy(copy, p, 32u), copy);
  EXPECT_EQ(copy[7], 0x12345678u);
  fx_free(p);
}

TEST(Memory, ArmedFailureHitsTheNthRequestOnly) {
  pfx::arm_allocation_failure(2);
  void* first = fx_malloc(1u, 4u);
  void* second = fx_calloc(1u, 4u);
  void* third = fx_realloc(nullptr, 4u);
  pfx::arm_allocation_failure(0);
  EXPECT_NE(first, nullptr);
  EXPECT_EQ(second, nullptr);
  EXPECT_NE(third, nullptr);
  fx_free(first);
  fx_free(third);
}

TEST(Packing, PackTakesAlphaFromThePixelAndCutsChannelsToEightBits) {
  EXPECT_EQ(fx_pack_rgb888(0x12345678u, 0x1AB, 0xCD, 0xEF), 0x12ABCDEFu);
  EXPECT_EQ(fx_pack_rgb888(0xFF000000u, -1, 256, 0), 0xFFFF0000u);
}

TEST(Packing, UnpackSplitsRedGreenBlue) {
  int32_t r = -1, g = -1, b = -1;
  fx_unpack_rgb888(static_cast<int32_t>(0xFF102030u), &r, &g, &b);
  EXPECT_EQ(r, 16);
  EXPECT_EQ(g, 32);
  EXPECT_EQ(b, 48);
}

// Brightness 20 on this grey gives 0xFFE4E4E4, so edited pixels are easy to tell apart.
constexpr uint32_t kGrey = 0xFF808080u;
constexpr uint32_t kBright = 0xFFE4E4E4u;

class PartialFrame : public ::testing::Test {
 protected:
  static constexpr int32_t kW = 6, kH = 5;
  Pixels src = pfx::test::filled(kW, kH, kGrey);
  Pixels dst = pfx::test::filled(kW, kH, 0xDEADBEEFu);
  Mask mask = Mask(kW * kH, 1);

  void run(int32_t l, int32_t r, int32_t t, int32_t b) {
    fx_control_brightness(src.data(), mask.data(), dst.data(), kW, kH, 20, l, r, t, b);
  }
  uint32_t at(int32_t x, int32_t y) const { return dst[static_cast<size_t>(y * kW + x)]; }
};

TEST_F(PartialFrame, OnlyMaskByteOneSelects) {
  mask[0] = 0;
  mask[1] = 2;
  mask[2] = 255;
  run(0, kW - 1, 0, kH - 1);
  EXPECT_EQ(at(0, 0), kGrey);
  EXPECT_EQ(at(1, 0), kGrey);
  EXPECT_EQ(at(2, 0), kGrey);
  EXPECT_EQ(at(3, 0), kBright);
}

TEST_F(PartialFrame, EmptyBoundsEditTheWholeImageWithoutReadingTheMask) {
  fx_control_brightness(src.data(), nullptr, dst.data(), kW, kH, 20, 1, 0, 0, kH - 1);
  for (uint32_t p : dst) EXPECT_EQ(p, kBright);
  dst.assign(dst.size(), 0);
  fx_control_brightness(src.data(), nullptr, dst.data(), kW, kH, 20, 0, kW - 1, 3, 2);
  for (uint32_t p : dst) EXPECT_EQ(p, kBright);
}

TEST_F(PartialFrame, SinglePixelRectangleEditsOnlyThatPixel) {
  run(2, 2, 3, 3);
  for (int32_t y = 0; y < kH; ++y) {
    for (int32_t x = 0; x < kW; ++x) EXPECT_EQ(at(x, y), x == 2 && y == 3 ? kBright : kGrey);
  }
  mask[3 * kW + 2] = 0;
  run(2, 2, 3, 3);
  for (uint32_t p : dst) EXPECT_EQ(p, kGrey);
}

TEST_F(PartialFrame, SelectedPixelsOutsideTheBoundsKeepTheirSource) {
  run(1, 3, 1, 2);
  for (int32_t y = 0; y < kH; ++y) {
    for (int32_t x = 0; x < kW; ++x) {
      const bool inside = x >= 1 && x <= 3 && y >= 1 && y <= 2;
      EXPECT_EQ(at(x, y), inside ? kBright : kGrey) << x << "," << y;
    }
  }
}

TEST_F(PartialFrame, BoundsReachingOutsideTheImageAreClipped) {
  run(-100, 2, 3, 1000);
  for (int32_t y = 0; y < kH; ++y) {
    for (int32_t x = 0; x < kW; ++x) EXPECT_EQ(at(x, y), x <= 2 && y >= 3 ? kBright : kGrey);
  }
  // A valid rectangle that misses the image entirely selects nothing; it is not whole-image mode.
  run(kW, kW + 5, 0, 1);
  for (uint32_t p : dst) EXPECT_EQ(p, kGrey);
}

TEST_F(PartialFrame, InPlaceGivesTheSameResultAsTwoBuffers) {
  src = pfx::test::random_image(kW, kH, 7);
  mask = pfx::test::random_mask(kW, kH, 8);
  run(1, 4, 0, 3);
  Pixels in_place = src;
  fx_control_brightness(in_place.data(), mask.data(), in_place.data(), kW, kH, 20, 1, 4, 0, 3);
  EXPECT_EQ(in_place, dst);
}

TEST_F(PartialFrame, MissingBuffersWriteNothing) {
  const Pixels before = dst;
  fx_control_brightness(src.data(), nullptr, dst.data(), kW, kH, 20, 0, 1, 0, 1);
  fx_control_brightness(nullptr, mask.data(), dst.data(), kW, kH, 20, 0, 1, 0, 1);
  fx_control_brightness(src.data(), mask.data(), nullptr, kW, kH, 20, 0, 1, 0, 1);
  EXPECT_EQ(dst, before);
}

TEST_F(PartialFrame, EmptyOrNegativeSizesWriteNothing) {
  const Pixels before = dst;
  fx_control_brightness(src.data(), mask.data(), dst.data(), 0, kH, 20, 1, 0, 0, 0);
  fx_control_brightness(src.data(), mask.data(), dst.data(), -2, -3, 20, 1, 0, 0, 0);
  fx_control_brightness(src.data(), mask.data(), dst.data(), -2, -3, 20, 0, 0, 0, 0);
  fx_control_brightness_all(src.data(), dst.data(), kW, -1, 20);
  EXPECT_EQ(dst, before);
}

TEST_F(PartialFrame, PixelCountsBeyondTheAddressableLimitAreRefused) {
  const Pixels before = dst;
  fx_control_brightness_all(src.data(), dst.data(), 65536, 65536, 20);
  fx_control_brightness(src.data(), mask.data(), dst.data(), 65536, 65536, 20, 1, 0, 0, 0);
  EXPECT_EQ(dst, before);
}

TEST_F(PartialFrame, MaskIsNeverWritten) {
  mask = pfx::test::random_mask(kW, kH, 3);
  const Mask before = mask;
  run(0, kW - 1, 0, kH - 1);
  run(1, 0, 0, 0);
  EXPECT_EQ(mask, before);
}

}  // namespace
