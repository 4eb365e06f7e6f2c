// Sharpen: the images it leaves alone, the two partial modes with the caller's mask left intact,
// and a refused scratch image in place. The sharpened values are pinned by the conformance goldens.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>

#include "frame/alloc_hook.h"
#include "frame/frame.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Mask;
using pfx::test::Pixels;

// Images one or two columns wide, and rows of one colour each (no change from left to right),
// come out as their source.
TEST(Sharpen, LeavesNarrowImagesAndFlatRowsAlone) {
  const Pixels img = pfx::test::random_image(12, 6, 51);
  Pixels rows(img.size()), out(img.size());
  for (size_t i = 0; i < rows.size(); ++i) rows[i] = img[i / 12];
  fx_apply_sharpen_all(rows.data(), out.data(), 12, 6);
  EXPECT_EQ(out, rows);
  for (int32_t narrow : {1, 2}) {
    fx_apply_sharpen_all(img.data(), out.data(), narrow, 6);
    EXPECT_TRUE(std::equal(img.begin(), img.begin() + narrow * 6, out.begin())) << narrow;
  }
}

// Valid bounds only choose masked mode: a selected pixel outside the rectangle is sharpened too.
// The level is accepted and ignored, and empty bounds sharpen everything. The mask is only read,
// also in place; and without its scratch image an in-place call leaves the image as it was (the
// two-buffer calls are in alloc_failure_test).
TEST(Sharpen, PartialLetsTheMaskAloneDecideAndNeverWritesIt) {
  const int32_t w = 10, h = 8;
  const Pixels img = pfx::test::random_image(w, h, 53);
  const Mask mask = pfx::test::random_mask(w, h, 54);
  Pixels full(img.size()), out(img.size());
  fx_apply_sharpen_all(img.data(), full.data(), w, h);
  Mask m = mask;
  for (int32_t level : {INT32_MIN, 0, 10, INT32_MAX}) {
    applySharpen(img.data(), m.data(), out.data(), w, h, level, 3, 3, 4, 4);
    size_t edited = 0;
    for (size_t i = 0; i < img.size(); ++i) {
      EXPECT_EQ(out[i], mask[i] == 1 ? full[i] : img[i]) << i << " level " << level;
      edited += out[i] != img[i];
    }
    EXPECT_GT(edited, 1u);
  }
  Pixels in_place = img;
  fx_apply_sharpen(in_place.data(), m.data(), in_place.data(), w, h, 10, 0, 9, 0, 7);
  EXPECT_EQ(in_place, out);
  for (const pfx::Rect& b : {pfx::Rect{1, 0, 0, h - 1}, pfx::Rect{0, w - 1, 5, 4}}) {
    out.assign(out.size(), 0);
    fx_apply_sharpen(img.data(), m.data(), out.data(), w, h, 10, b.left, b.right, b.top, b.bottom);
    EXPECT_EQ(out, full);
  }
  EXPECT_EQ(m, mask);
}

}  // namespace
