// Conformance goldens of sharpen, pixelize and red-eye removal.
#include <gtest/gtest.h>

#include <vector>

#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::Rect;
using pfx::test::Digest;
using pfx::test::Input;
using pfx::test::Pixels;

// Brush dabs of every kind: inside, on each edge, beyond a corner, off the image, radius 0 and
// negative, and one large enough to cover everything.
struct Dab {
  int32_t cx, cy, radius;
};

std::vector<Dab> dabs(int32_t w, int32_t h) {
  return {{w / 2, h / 2, 5},  {0, h / 3, 7},      {w - 1, h - 1, 9}, {-4, -3, 8},
          {w + 2, h / 2, 4},  {w / 3, h / 4, 0},  {w / 3, 2, -3},    {w / 2, h / 2, 10000},
          {w / 4, h - 2, 13}, {3 * w / 4, -1, 6}, {w * 4, h * 4, 2}};
}

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

TEST(Conformance, Pixelize) {
  Digest d;
  for (int32_t shift : {0, 1, 2, 3, 5, 31, -1, 32}) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      fx_apply_pixelize(s, o, w, h, shift);
    });
  }
  EXPECT_GOLDEN("pixelize", d, 0x38c30d0e41a36169ull);
}

TEST(Conformance, PixelizeBrush) {
  Digest d;
  for (const Input& in : pfx::test::conformance_inputs()) {
    for (int32_t shift : {0, 2, 3, 4, 32}) {
      Pixels img = in.pixels;
      for (const Dab& dab : dabs(in.width, in.height)) {
        fx_rub_pixelize(img.data(), in.width, in.height, shift, dab.cx, dab.cy, dab.radius);
        d.add(img);
      }
    }
  }
  EXPECT_GOLDEN("pixelize brush", d, 0x0f4c47439120bc67ull);
}

TEST(Conformance, Redeye) {
  Digest d;
  for (const Input& in : pfx::test::conformance_inputs()) {
    Pixels img = in.pixels;
    for (const Dab& dab : dabs(in.width, in.height)) {
      fx_remove_redeye(img.data(), in.width, in.height, dab.cx, dab.cy, dab.radius);
      d.add(img);
    }
  }
  EXPECT_GOLDEN("red-eye", d, 0x320ce44206c87afcull);
}

}  // namespace
