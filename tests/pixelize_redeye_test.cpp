// Pixelize, the pixelize brush and red-eye removal: block anchors, shifts at and beyond their
// range, brush discs and squares clipped at the image edges, and the red-eye threshold.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Pixels;

// Every pixel different, so a pixel that takes another's colour is always visible.
Pixels numbered(int32_t width, int32_t height) {
  Pixels px(static_cast<size_t>(width) * static_cast<size_t>(height));
  // An odd multiplier is a bijection on 32-bit words: no two pixels alike, alpha included.
  for (size_t i = 0; i < px.size(); ++i) px[i] = 0x9E3779B1u * static_cast<uint32_t>(i + 1);
  return px;
}

size_t at(int32_t width, int32_t x, int32_t y) { return static_cast<size_t>(y * width + x); }

// Blocks cut by the right and bottom edges still take their top-left pixel; from shift 6 one
// block holds the whole image, and shift 0 copies. Shifts outside 0..31 would shift by 32 or
// more: the mosaic and the brush write nothing instead.
TEST(Pixelize, EveryPixelTakesItsBlockAnchorAndBadShiftsWriteNothing) {
  const int32_t w = 37, h = 21;
  const Pixels img = numbered(w, h);
  for (int32_t s : {0, 1, 2, 3, 4, 5, 6, 30, 31, -1, 32, 33, 64, INT32_MIN, INT32_MAX}) {
    const bool bad = s < 0 || s > 31;
    Pixels out(img.size(), 0x5A5A5A5Au), brushed = img;
    fx_apply_pixelize(img.data(), out.data(), w, h, s);
    if (bad) {
      fx_rub_pixelize(brushed.data(), w, h, s, 4, 4, 100);
      EXPECT_EQ(brushed, img) << s;
    }
    const int32_t block = bad || s >= 6 ? 64 : 1 << s;
    for (int32_t y = 0; y < h; ++y) {
      for (int32_t x = 0; x < w; ++x) {
        const uint32_t expected =
            bad ? 0x5A5A5A5Au : img[at(w, x / block * block, y / block * block)];
        ASSERT_EQ(out[at(w, x, y)], expected) << x << "," << y << " shift " << s;
      }
    }
  }
}

// The brushes refuse a missing or unaddressable image.
TEST(Pixelize, BrushesRefuseBadImages) {
  const Pixels img = numbered(8, 8), red = pfx::test::filled(8, 8, argb(0xFF, 200, 50, 50));
  Pixels a = img, b = red;
  fx_rub_pixelize(nullptr, 8, 8, 1, 4, 4, 3);
  removeRedeye(nullptr, 8, 8, 4, 4, 3);
  fx_rub_pixelize(a.data(), 0, 8, 1, 4, 4, 3);
  fx_rub_pixelize(a.data(), 65536, 65536, 1, 1, 1, 3);
  fx_remove_redeye(b.data(), -4, -4, 1, 1, 3);
  fx_remove_redeye(b.data(), 65536, 65536, 1, 1, 3);
  EXPECT_EQ(a, img);
  EXPECT_EQ(b, red);
}

// One pixelize dab (shift 2) paints the closed disc dx^2 + dy^2 <= r^2 with the image's own
// mosaic (blocks anchored on the image, so neighbouring dabs continue one mosaic), and one red-eye
// brush the square |dx|, |dy| <= r, both clipped to the image; a radius of zero touches at most
// the centre and a negative one nothing, whatever the magnitudes.
TEST(PixelizeBrush, DiscsAndRedeyeSquaresAreClippedAtTheImageEdges) {
  const int32_t w = 20, h = 16;
  const Pixels img = numbered(w, h);
  const uint32_t red = argb(0xFF, 200, 50, 50), fixed = argb(0xFF, 54, 50, 50);
  struct Brush {
    int32_t cx, cy, r;
  };
  for (const auto& [cx, cy, r] :
       {Brush{9, 7, 5}, Brush{-2, 3, 4}, Brush{19, -1, 3}, Brush{23, 18, 6}, Brush{0, 0, 100},
        Brush{-5, 3, 4}, Brush{3, 3, 0}, Brush{3, 3, -4}, Brush{3, 3, INT32_MIN},
        Brush{INT32_MAX, 1, INT32_MAX}, Brush{INT32_MIN, INT32_MIN, INT32_MAX},
        Brush{INT32_MAX, INT32_MAX, INT32_MAX}}) {
    SCOPED_TRACE(testing::Message() << cx << "," << cy << " r " << r);
    Pixels dabbed = img, redeyed = pfx::test::filled(w, h, red);
    fx_rub_pixelize(dabbed.data(), w, h, 2, cx, cy, r);
    removeRedeye(redeyed.data(), w, h, cx, cy, r);
    for (int32_t y = 0; y < h; ++y) {
      for (int32_t x = 0; x < w; ++x) {
        const int64_t dx = int64_t{cx} - x, dy = int64_t{cy} - y, r64 = r;
        const bool disc =
            r >= 0 && static_cast<uint64_t>(dx * dx) + static_cast<uint64_t>(dy * dy) <=
                          static_cast<uint64_t>(r64 * r64);
        const bool square = r >= 0 && dx <= r64 && -dx <= r64 && dy <= r64 && -dy <= r64;
        ASSERT_EQ(dabbed[at(w, x, y)], img[disc ? at(w, x & ~3, y & ~3) : at(w, x, y)])
            << x << "," << y;
        ASSERT_EQ(redeyed[at(w, x, y)], square ? fixed : red) << x << "," << y;
      }
    }
  }
}

// The entry points: dabs along a row cover it with the mosaic of the whole image.
TEST(PixelizeBrush, NeighbouringDabsContinueOneMosaic) {
  const int32_t w = 32, h = 24;
  const Pixels img = pfx::test::random_image(w, h, 62);
  Pixels out = img, mosaic(img.size());
  for (int32_t cx = 0; cx < w; cx += 5) rubPixelize(out.data(), w, h, 3, cx, 12, 14);
  applyPixelize(img.data(), mosaic.data(), w, h, 3);
  EXPECT_EQ(out, mosaic);
}

uint32_t redeye(uint32_t p) {
  fx_remove_redeye(&p, 1, 1, 0, 0, 0);
  return p;
}

// Only pixels with 2 x red > 5 x green change, and only in red, which then stays at most 242.
TEST(Redeye, OnlyStronglyRedPixelsChange) {
  EXPECT_EQ(redeye(argb(0x3C, 126, 50, 0)), argb(0x3C, 36, 50, 0));
  for (uint32_t r = 0; r < 256; r += 5) {
    for (uint32_t g = 0; g < 103; ++g) {
      for (uint32_t b = 0; b < 256; b += 15) {
        const uint32_t in = argb(0xFF, r, g, b), out = redeye(in);
        if (2 * r > 5 * g) {
          EXPECT_LE((out >> 16) & 0xFF, 242u) << r << "," << g << "," << b;
          EXPECT_EQ(out & 0xFF00FFFFu, in & 0xFF00FFFFu);
        } else {
          EXPECT_EQ(out, in) << r << "," << g << "," << b;
        }
      }
    }
  }
}

}  // namespace
