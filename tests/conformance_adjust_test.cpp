// Conformance goldens of the slider adjustments.
#include <gtest/gtest.h>

#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::Rect;
using pfx::test::Digest;

constexpr int32_t kLevels[] = {-3, 0, 4, 10, 13, 20, 27};

TEST(Conformance, Brightness) {
  Digest d;
  for (int32_t level : kLevels) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      fx_control_brightness_all(s, o, w, h, level);
    });
    pfx::test::digest_partial(
        d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
          fx_control_brightness(s, m, o, w, h, level, b.left, b.right, b.top, b.bottom);
        });
  }
  EXPECT_GOLDEN("brightness", d, 0x39a04a28e3451119ull);
}

TEST(Conformance, Contrast) {
  Digest d;
  for (int32_t level : kLevels) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      fx_control_contrast_all(s, o, w, h, level);
    });
    pfx::test::digest_partial(
        d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
          fx_control_contrast(s, m, o, w, h, level, b.left, b.right, b.top, b.bottom);
        });
  }
  EXPECT_GOLDEN("contrast", d, 0x6c4de60cdc023460ull);
}

}  // namespace
