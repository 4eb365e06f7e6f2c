// The partial-variant rules of the calling frame, exercised through brightness (the simplest
// effect that runs in both frames).
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

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
