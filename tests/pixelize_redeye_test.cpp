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

TEST(Pixelize, BlocksCutByTheEdgesTakeTheirTopLeftPixel) {
  const Pixels img = numbered(3, 3);
  Pixels out(img.size());
  fx_apply_pixelize(img.data(), out.data(), 3, 3, 1);
  for (int32_t y = 0; y < 2; ++y) {
    for (int32_t x = 0; x < 2; ++x) EXPECT_EQ(out[at(3, x, y)], img[0]) << x << "," << y;
  }
  EXPECT_EQ(out[at(3, 2, 0)], img[at(3, 2, 0)]);
  EXPECT_EQ(out[at(3, 2, 1)], img[at(3, 2, 0)]);
  EXPECT_EQ(out[at(3, 0, 2)], img[at(3, 0, 2)]);
  EXPECT_EQ(out[at(3, 1, 2)], img[at(3, 0, 2)]);
  EXPECT_EQ(out[at(3, 2, 2)], img[at(3, 2, 2)]);
}

TEST(Pixelize, EveryPixelTakesItsBlockAnchorAndShiftZeroCopies) {
  const int32_t w = 37, h = 21;
  const Pixels img = numbered(w, h);
  for (int32_t s : {0, 1, 2, 3, 4, 5, 6, 30, 31}) {
    Pixels out(img.size());
    fx_apply_pixelize(img.data(), out.data(), w, h, s);
    const int32_t block = s >= 6 ? 64 : 1 << s;  // beyond the image, one block holds it all
    for (int32_t y = 0; y < h; ++y) {
      for (int32_t x = 0; x < w; ++x) {
        ASSERT_EQ(out[at(w, x, y)], img[at(w, x / block * block, y / block * block)])
            << x << "," << y << " shift " << s;
      }
    }
  }
}

TEST(Pixelize, WorksInPlace) {
  const Pixels img = pfx::test::random_image(23, 14, 61);
  for (int32_t s : {1, 2, 3}) {
    Pixels out(img.size()), in_place = img;
    fx_apply_pixelize(img.data(), out.data(), 23, 14, s);
    fx_apply_pixelize(in_place.data(), in_place.data(), 23, 14, s);
    EXPECT_EQ(in_place, out) << s;
  }
}

TEST(Pixelize, BadShiftsBuffersAndSizesWriteNothing) {
  const Pixels img = numbered(8, 8);
  Pixels out(img.size(), 0x5A5A5A5Au);
  const Pixels before = out;
  for (int32_t s : {-1, 32, 33, 64, INT32_MIN, INT32_MAX}) {
    fx_apply_pixelize(img.data(), out.data(), 8, 8, s);
    Pixels brushed = img;
    fx_rub_pixelize(brushed.data(), 8, 8, s, 4, 4, 100);
    EXPECT_EQ(brushed, img) << s;
  }
  fx_apply_pixelize(nullptr, out.data(), 8, 8, 1);
  fx_apply_pixelize(img.data(), nullptr, 8, 8, 1);
  fx_apply_pixelize(img.data(), out.data(), 0, 8, 1);
  fx_apply_pixelize(img.data(), out.data(), -8, -8, 1);
  fx_apply_pixelize(img.data(), out.data(), 65536, 65536, 1);
  EXPECT_EQ(out, before);
  // The brushes refuse a missing or unaddressable image the same way.
  Pixels brushed = img;
  fx_rub_pixelize(nullptr, 8, 8, 1, 4, 4, 3);
  removeRedeye(nullptr, 8, 8, 4, 4, 3);
  fx_rub_pixelize(brushed.data(), 0, 8, 1, 4, 4, 3);
  fx_rub_pixelize(brushed.data(), 65536, 65536, 1, 1, 1, 3);
  Pixels red = pfx::test::filled(4, 4, argb(0xFF, 200, 50, 50));
  const Pixels red_before = red;
  fx_remove_redeye(red.data(), -4, -4, 1, 1, 3);
  fx_remove_redeye(red.data(), 65536, 65536, 1, 1, 3);
  EXPECT_EQ(brushed, img);
  EXPECT_EQ(red, red_before);
}

// The expected result of one pixelize dab, from the closed disc dx^2 + dy^2 <= r^2.
Pixels dabbed(const Pixels& img, int32_t w, int32_t h, int32_t s, int32_t cx, int32_t cy,
              int32_t r) {
  Pixels out = img;
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      const int64_t dx = int64_t{cx} - x, dy = int64_t{cy} - y;
      if (r >= 0 && static_cast<uint64_t>(dx * dx) + static_cast<uint64_t>(dy * dy) <=
                        static_cast<uint64_t>(int64_t{r} * r)) {
        out[at(w, x, y)] = img[at(w, (x >> s) << s, (y >> s) << s)];
      }
    }
  }
  return out;
}

TEST(PixelizeBrush, PaintsAClosedDisc) {
  const int32_t w = 20, h = 16;
  const Pixels img = numbered(w, h);
  Pixels out = img;
  rubPixelize(out.data(), w, h, 2, 9, 7, 5);
  EXPECT_EQ(out, dabbed(img, w, h, 2, 9, 7, 5));
  // The disc is closed: (9 + 5, 7) and (9 + 4, 7 - 3) lie on the rim; (9 + 4, 7 - 4) is outside.
  EXPECT_EQ(out[at(w, 14, 7)], img[at(w, 12, 4)]);
  EXPECT_EQ(out[at(w, 13, 4)], img[at(w, 12, 4)]);
  EXPECT_EQ(out[at(w, 13, 3)], img[at(w, 13, 3)]);
}

TEST(PixelizeBrush, RadiusZeroTouchesAtMostTheCentre) {
  const int32_t w = 6, h = 6;
  const Pixels img = numbered(w, h);
  Pixels out = img;
  fx_rub_pixelize(out.data(), w, h, 1, 3, 3, 0);
  for (size_t i = 0; i < img.size(); ++i) {
    EXPECT_EQ(out[i], i == at(w, 3, 3) ? img[at(w, 2, 2)] : img[i]) << i;
  }
  out = img;
  fx_rub_pixelize(out.data(), w, h, 1, 2, 2, 0);  // an anchor maps to itself
  fx_rub_pixelize(out.data(), w, h, 1, 3, 3, -4);
  fx_rub_pixelize(out.data(), w, h, 1, 3, 3, INT32_MIN);
  EXPECT_EQ(out, img);
}

TEST(PixelizeBrush, DiscsAreClippedAtTheImageEdges) {
  const int32_t w = 9, h = 7;
  const Pixels img = numbered(w, h);
  struct Dab {
    int32_t cx, cy, r;
  };
  for (const Dab& d :
       {Dab{-2, 3, 4}, Dab{8, -1, 3}, Dab{12, 9, 6}, Dab{0, 0, 100}, Dab{INT32_MAX, 1, INT32_MAX},
        Dab{INT32_MIN, INT32_MIN, INT32_MAX}, Dab{-5, 3, 4}}) {
    Pixels out = img;
    fx_rub_pixelize(out.data(), w, h, 1, d.cx, d.cy, d.r);
    EXPECT_EQ(out, dabbed(img, w, h, 1, d.cx, d.cy, d.r)) << d.cx << "," << d.cy << " r " << d.r;
  }
}

TEST(PixelizeBrush, NeighbouringDabsContinueOneMosaic) {
  const int32_t w = 32, h = 24;
  const Pixels img = pfx::test::random_image(w, h, 62);
  Pixels out = img;
  for (int32_t cx = 0; cx < w; cx += 5) rubPixelize(out.data(), w, h, 3, cx, 12, 14);
  Pixels mosaic(img.size());
  applyPixelize(img.data(), mosaic.data(), w, h, 3);
  EXPECT_EQ(out, mosaic);
}

uint32_t redeye(uint32_t p) {
  fx_remove_redeye(&p, 1, 1, 0, 0, 0);
  return p;
}

TEST(Redeye, WorkedValues) {
  EXPECT_EQ(redeye(argb(0xFF, 200, 50, 50)), argb(0xFF, 54, 50, 50));
  EXPECT_EQ(redeye(argb(0xFF, 255, 0, 0)), argb(0xFF, 12, 0, 0));
  EXPECT_EQ(redeye(argb(0xFF, 126, 50, 0)), argb(0xFF, 36, 50, 0));
  EXPECT_EQ(redeye(argb(0xFF, 125, 50, 0)), argb(0xFF, 125, 50, 0));
  EXPECT_EQ(redeye(argb(0xFF, 0, 0, 0)), argb(0xFF, 0, 0, 0));
  EXPECT_EQ(redeye(argb(0xFF, 255, 255, 255)), argb(0xFF, 255, 255, 255));
  EXPECT_EQ(redeye(argb(0xFF, 200, 90, 60)), argb(0xFF, 200, 90, 60));
  EXPECT_EQ(redeye(argb(0xFF, 10, 0, 255)), argb(0xFF, 76, 0, 255));
  EXPECT_EQ(redeye(argb(0x3C, 200, 50, 50)), argb(0x3C, 54, 50, 50));
}

TEST(Redeye, OnlyStronglyRedPixelsChangeAndTheirRedStaysAtMost242) {
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

TEST(Redeye, EditsASquareClippedAtTheImageEdges) {
  const int32_t w = 7, h = 6;
  const uint32_t red = argb(0xFF, 200, 50, 50), fixed = argb(0xFF, 54, 50, 50);
  struct Brush {
    int32_t cx, cy, r;
  };
  for (const Brush& b :
       {Brush{3, 2, 1}, Brush{0, 0, 2}, Brush{8, 7, 3}, Brush{-3, 2, 2}, Brush{3, 3, -1},
        Brush{INT32_MIN, INT32_MAX, INT32_MAX}, Brush{INT32_MAX, INT32_MAX, INT32_MAX}}) {
    Pixels img = pfx::test::filled(w, h, red);
    removeRedeye(img.data(), w, h, b.cx, b.cy, b.r);
    for (int32_t y = 0; y < h; ++y) {
      for (int32_t x = 0; x < w; ++x) {
        const bool inside = b.r >= 0 && int64_t{x} >= int64_t{b.cx} - b.r &&
                            int64_t{x} <= int64_t{b.cx} + b.r &&
                            int64_t{y} >= int64_t{b.cy} - b.r && int64_t{y} <= int64_t{b.cy} + b.r;
        EXPECT_EQ(img[at(w, x, y)], inside ? fixed : red)
            << x << "," << y << " brush " << b.cx << "," << b.cy << " r " << b.r;
      }
    }
  }
}

}  // namespace
