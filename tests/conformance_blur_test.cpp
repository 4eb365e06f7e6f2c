// Conformance goldens of sharpen.
#include <gtest/gtest.h>

#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::Rect;
using pfx::test::Digest;

TEST(Conformance, Sharpen) {
  Digest d;
  pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
    fx_apply_sharpen_all(s, o, w, h);
  });
  for (int32_t level : {0, 10, 20}) {
    pfx::test::digest_partial(
        d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
          fx_apply_sharpen(s, m, o, w, h, level, b.left, b.right, b.top, b.bottom);
        });
  }
  EXPECT_GOLDEN("sharpen", d, 0x6683a4fde5105c9full);
}

}  // namespace
