// The calling frame: memory wrappers, channel packing and the partial-variant rules, exercised
// through brightness (the simplest effect that runs in both frames). Missing buffers, empty and
// unaddressable sizes and the mask never written are in bad_input_test; failed allocations in
// alloc_failure_test.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

TEST(Memory, WrappersRefuseProductsBeyond32BitsZeroFillAndKeepContents) {
  for (const auto alloc : {fx_malloc, fx_calloc}) {
    EXPECT_EQ(alloc(0x10000u, 0x10000u), nullptr);  // exactly 2^32 bytes
    EXPECT_EQ(alloc(0x80000000u, 2u), nullptr);
  }
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
  fx_memset(p, 0xAB, 64u);
  EXPECT_EQ(p[15], 0xABABABABu);
  fx_free(p);
}

TEST(Packing, PackTakesAlphaFromThePixelAndUnpackSplitsTheChannels) {
  EXPECT_EQ(fx_pack_rgb888(0x12345678u, 0x1AB, 0xCD, 0xEF), 0x12ABCDEFu);
  EXPECT_EQ(fx_pack_rgb888(0xFF000000u, -1, 256, 0), 0xFFFF0000u);
  int32_t r = -1, g = -1, b = -1;
  fx_unpack_rgb888(static_cast<int32_t>(0xFF102030u), &r, &g, &b);
  EXPECT_EQ(r, 16);
  EXPECT_EQ(g, 32);
  EXPECT_EQ(b, 48);
}

// Brightness 20 on grey 0x80 gives 0xE4, so edited pixels are easy to tell apart. Only mask
// byte 1 selects; a valid rectangle edits the selected pixels inside it, clipped to the image; a
// valid rectangle that misses the image selects nothing (it is not whole-image mode); empty
// bounds edit the whole image without reading the mask.
TEST(PartialFrame, BoundsAndMaskSelectThePixels) {
  constexpr int32_t kW = 6, kH = 5;
  constexpr uint32_t kGrey = 0xFF808080u, kBright = 0xFFE4E4E4u;
  const struct {
    int32_t l, r, t, b;
    bool use_mask;
    int32_t x0, x1, y0, y1;  // the pixels expected to change, before the mask's say
  } kCases[] = {
      {0, kW - 1, 0, kH - 1, true, 0, kW - 1, 0, kH - 1},
      {2, 2, 3, 3, true, 2, 2, 3, 3},
      {1, 3, 1, 2, true, 1, 3, 1, 2},
      {-100, 2, 3, 1000, true, 0, 2, 3, kH - 1},
      {kW, kW + 5, 0, 1, true, 1, 0, 0, 0},
      {1, 0, 0, kH - 1, false, 0, kW - 1, 0, kH - 1},
      {0, kW - 1, 3, 2, false, 0, kW - 1, 0, kH - 1},
  };
  pfx::test::Mask mask(kW * kH, 1);
  mask[0] = 0, mask[1] = 2, mask[2] = 255, mask[3 * kW + 3] = 0;
  const pfx::test::Pixels src = pfx::test::filled(kW, kH, kGrey);
  for (const auto& c : kCases) {
    SCOPED_TRACE(testing::Message() << c.l << "," << c.r << "," << c.t << "," << c.b);
    pfx::test::Pixels dst = pfx::test::filled(kW, kH, 0xDEADBEEFu);
    fx_control_brightness(src.data(), c.use_mask ? mask.data() : nullptr, dst.data(), kW, kH, 20,
                          c.l, c.r, c.t, c.b);
    for (int32_t y = 0; y < kH; ++y) {
      for (int32_t x = 0; x < kW; ++x) {
        const bool selected = !c.use_mask || mask[static_cast<size_t>(y * kW + x)] == 1;
        const bool edited = selected && x >= c.x0 && x <= c.x1 && y >= c.y0 && y <= c.y1;
        EXPECT_EQ(dst[static_cast<size_t>(y * kW + x)], edited ? kBright : kGrey) << x << "," << y;
      }
    }
  }
}

}  // namespace
