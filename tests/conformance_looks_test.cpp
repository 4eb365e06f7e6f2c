// Conformance goldens of greyscale and sepia.
#include <gtest/gtest.h>

#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::Rect;
using pfx::test::Digest;

constexpr int32_t kLevels[] = {-7, -6, 0, 4, 10, 13, 20, 27, 1000};

TEST(Conformance, Greyscale) {
  Digest d;
  for (int32_t level : kLevels) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      fx_control_greyscale_all(s, o, w, h, level);
    });
    pfx::test::digest_partial(
        d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
          fx_control_greyscale(s, m, o, w, h, level, b.left, b.right, b.top, b.bottom);
        });
  }
  EXPECT_GOLDEN("greyscale", d, 0x896bfd6373e01686ull);
}

TEST(Conformance, Sepia) {
  Digest d;
  pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
    d.add(fx_apply_sepia(s, o, w, h));
  });
  pfx::test::digest_partial(
      d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
        d.add(fx_apply_sepia_partial(s, m, o, w, h, b.left, b.right, b.top, b.bottom));
      });
  for (int32_t v = -2; v <= 257; ++v) {
    d.add(fx_get_sepia_r(v));
    d.add(fx_get_sepia_b(v));
  }
  EXPECT_GOLDEN("sepia", d, 0xec400c1fea2bc52cull);
}

}  // namespace
