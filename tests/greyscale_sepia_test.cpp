// Greyscale and sepia: the worked values, the gain at and beyond the slider ends, the two sepia
// curves and their tables, the partial modes and the result codes.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <utility>
#include <vector>

#include "looks/greyscale_sepia.h"
#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Mask;
using pfx::test::Pixels;

uint32_t grey(uint32_t p, int32_t level) {
  uint32_t out = 0;
  fx_control_greyscale_all(&p, &out, 1, 1, level);
  return out;
}

uint32_t sepia(uint32_t p) {
  uint32_t out = 0;
  EXPECT_EQ(fx_apply_sepia(&p, &out, 1, 1), PHOTOFX_SUCCESS);
  return out;
}

TEST(Greyscale, WorkedValues) {
  EXPECT_EQ(grey(argb(0xFF, 30, 60, 91), 10), argb(0xFF, 60, 60, 60));
  EXPECT_EQ(grey(argb(0xFF, 30, 60, 91), 20), argb(0xFF, 96, 96, 96));
  EXPECT_EQ(grey(argb(0xFF, 30, 60, 91), 0), argb(0xFF, 23, 23, 23));
  EXPECT_EQ(grey(argb(0xFF, 255, 255, 255), 11), argb(0xFF, 255, 255, 255));
}

TEST(Greyscale, MeanIsTruncatedAndAlphaKept) {
  EXPECT_EQ(grey(argb(0x12, 1, 1, 0), 10), argb(0x12, 0, 0, 0));
  EXPECT_EQ(grey(argb(0x00, 255, 255, 254), 10), argb(0x00, 254, 254, 254));
  EXPECT_EQ(grey(argb(0x80, 0, 0, 255), 10), argb(0x80, 85, 85, 85));
}

// The grey of a channel mean m is floor(m x gain / 65536), gain = (level - 10) x 4000 + 65536,
// held to 0..255. Computed here in double, which is exact at these magnitudes, for levels well
// past both slider ends and at the ends of the int32_t range.
TEST(Greyscale, GainFollowsTheLevelAtAndBeyondTheSliderEnds) {
  std::vector<int32_t> levels = {INT32_MIN, INT32_MIN + 1, -100000,
                                 INT32_MAX, INT32_MAX - 1, 1 << 30};
  for (int32_t level = -40; level <= 1100; ++level) levels.push_back(level);
  for (int32_t level : levels) {
    const double gain = (static_cast<double>(level) - 10.0) * 4000.0 + 65536.0;
    for (int32_t m = 0; m < 256; ++m) {
      const double exact = std::floor(m * gain / 65536.0);
      const uint32_t v = exact < 0 ? 0 : (exact > 255 ? 255 : static_cast<uint32_t>(exact));
      const uint32_t p =
          argb(0xFF, static_cast<uint32_t>(m), static_cast<uint32_t>(m), static_cast<uint32_t>(m));
      ASSERT_EQ(grey(p, level), argb(0xFF, v, v, v)) << "mean " << m << " level " << level;
    }
  }
  // Just below zero gain the grey is black; just above, the brightest mean still shows.
  EXPECT_EQ(grey(0xFFFFFFFFu, -6), 0xFF050505u);
  EXPECT_EQ(grey(0xFFFFFFFFu, -7), 0xFF000000u);
}

TEST(Greyscale, FullVariantWorksInPlace) {
  const Pixels img = pfx::test::random_image(11, 7, 31);
  Pixels out(img.size()), in_place = img;
  fx_control_greyscale_all(img.data(), out.data(), 11, 7, 14);
  controlGreyscale(in_place.data(), in_place.data(), 11, 7, 14);
  EXPECT_EQ(in_place, out);
}

TEST(Greyscale, PartialEditsSelectedPixelsInsideTheBoundsOnly) {
  const Pixels img = pfx::test::random_image(9, 8, 32);
  const Mask mask = pfx::test::random_mask(9, 8, 33);
  Pixels full(img.size()), part(img.size(), 0xDEADBEEFu);
  fx_control_greyscale_all(img.data(), full.data(), 9, 8, 7);
  controlGreyscalePartial(img.data(), mask.data(), part.data(), 9, 8, 7, 2, 6, 1, 5);
  for (int32_t y = 0; y < 8; ++y) {
    for (int32_t x = 0; x < 9; ++x) {
      const size_t i = static_cast<size_t>(y * 9 + x);
      const bool edit = x >= 2 && x <= 6 && y >= 1 && y <= 5 && mask[i] == 1;
      EXPECT_EQ(part[i], edit ? full[i] : img[i]) << x << "," << y;
    }
  }
  // Empty bounds: every pixel, without reading the (absent) mask.
  fx_control_greyscale(img.data(), nullptr, part.data(), 9, 8, 7, 0, 8, 5, 4);
  EXPECT_EQ(part, full);
  // Valid bounds and a mask that selects nothing: an exact copy.
  const Mask zeros(img.size(), 0);
  fx_control_greyscale(img.data(), zeros.data(), part.data(), 9, 8, 20, 0, 8, 0, 7);
  EXPECT_EQ(part, img);
}

// The curves again, from the runs of equal offset they are known by: {run length, offset}.
std::vector<int32_t> curve_from_runs(const std::vector<std::pair<int32_t, int32_t>>& runs,
                                     int32_t sign) {
  std::vector<int32_t> out;
  for (const auto& [length, offset] : runs) {
    for (int32_t k = 0; k < length; ++k) {
      const int32_t v = static_cast<int32_t>(out.size());
      out.push_back(v + sign * offset);
    }
  }
  return out;
}

std::vector<int32_t> red_curve() {
  std::vector<std::pair<int32_t, int32_t>> runs = {{3, 0}};
  for (int32_t o = 1; o <= 9; ++o) runs.push_back({4, o});
  runs.push_back({5, 10});
  runs.push_back({3, 11});
  for (int32_t o = 12; o <= 31; ++o) runs.push_back({4, o});
  runs.push_back({2, 32});
  runs.push_back({5, 31});
  runs.push_back({4, 30});
  runs.push_back({3, 29});
  for (int32_t o = 28; o >= 1; --o) runs.push_back({4, o});
  runs.push_back({3, 0});
  return curve_from_runs(runs, +1);
}

std::vector<int32_t> blue_curve() {
  std::vector<std::pair<int32_t, int32_t>> runs = {{5, 0}};
  for (int32_t o = 1; o <= 30; ++o) runs.push_back({4, o});
  runs.push_back({6, 31});
  for (int32_t o = 30; o >= 1; --o) runs.push_back({4, o});
  runs.push_back({5, 0});
  return curve_from_runs(runs, -1);
}

TEST(Sepia, CurvesAndTablesFollowTheirRuns) {
  const std::vector<int32_t> red = red_curve(), blue = blue_curve();
  ASSERT_EQ(red.size(), 256u);
  ASSERT_EQ(blue.size(), 256u);
  for (int32_t v = 0; v < 256; ++v) {
    const size_t i = static_cast<size_t>(v);
    EXPECT_EQ(fx_get_sepia_r(v), red[i]) << v;
    EXPECT_EQ(fx_get_sepia_b(v), blue[i]) << v;
    EXPECT_EQ(pfx::kSepiaRed[i], red[i]) << v;
    EXPECT_EQ(pfx::kSepiaBlue[i], blue[i]) << v;
    if (v > 0) {
      EXPECT_GE(red[i], red[i - 1]) << v;
      EXPECT_GE(blue[i], blue[i - 1]) << v;
    }
    EXPECT_LE(red[i], 255);
  }
}

TEST(Sepia, CurveSamplesAndValuesOutsideTheRange) {
  const int32_t red_in[] = {0, 3, 43, 64, 127, 128, 129, 133, 137, 192, 255};
  const int32_t red_out[] = {0, 4, 53, 80, 159, 160, 160, 164, 167, 208, 255};
  for (size_t k = 0; k < std::size(red_in); ++k) {
    EXPECT_EQ(fx_get_sepia_r(red_in[k]), red_out[k]) << red_in[k];
  }
  const int32_t blue_in[] = {0, 5, 64, 125, 128, 130, 192, 255};
  const int32_t blue_out[] = {0, 4, 49, 94, 97, 99, 177, 255};
  for (size_t k = 0; k < std::size(blue_in); ++k) {
    EXPECT_EQ(fx_get_sepia_b(blue_in[k]), blue_out[k]) << blue_in[k];
  }
  for (int32_t v : {INT32_MIN, -1, 256, 1000, INT32_MAX}) {
    EXPECT_EQ(fx_get_sepia_r(v), v);
    EXPECT_EQ(fx_get_sepia_b(v), v);
  }
}

TEST(Sepia, TintsRedAndBlueKeepingGreenAndAlpha) {
  EXPECT_EQ(sepia(argb(0xFF, 128, 128, 128)), argb(0xFF, 160, 128, 97));
  EXPECT_EQ(sepia(argb(0x00, 0, 0, 0)), argb(0x00, 0, 0, 0));
  EXPECT_EQ(sepia(argb(0x7F, 255, 255, 255)), argb(0x7F, 255, 255, 255));
  EXPECT_EQ(sepia(argb(0x31, 64, 200, 64)), argb(0x31, 80, 200, 49));
}

TEST(Sepia, FullInPlaceAndPartialModes) {
  const Pixels img = pfx::test::random_image(8, 7, 37);
  const Mask mask = pfx::test::random_mask(8, 7, 38);
  Pixels full(img.size()), part(img.size()), in_place = img;
  fx_apply_sepia(img.data(), full.data(), 8, 7);
  EXPECT_EQ(fx_apply_sepia(in_place.data(), in_place.data(), 8, 7), PHOTOFX_SUCCESS);
  EXPECT_EQ(in_place, full);
  EXPECT_EQ(fx_apply_sepia_partial(img.data(), mask.data(), part.data(), 8, 7, 1, 5, 2, 6),
            PHOTOFX_SUCCESS);
  for (int32_t y = 0; y < 7; ++y) {
    for (int32_t x = 0; x < 8; ++x) {
      const size_t i = static_cast<size_t>(y * 8 + x);
      const bool edit = x >= 1 && x <= 5 && y >= 2 && mask[i] == 1;
      EXPECT_EQ(part[i], edit ? full[i] : img[i]) << x << "," << y;
    }
  }
  // left > right: every pixel, whatever the mask says.
  EXPECT_EQ(fx_apply_sepia_partial(img.data(), mask.data(), part.data(), 8, 7, 1, 0, 0, 6),
            PHOTOFX_SUCCESS);
  EXPECT_EQ(part, full);
}

TEST(Sepia, RefusalsReturnInvalidArgumentAndWriteNothing) {
  const Pixels img = pfx::test::random_image(5, 4, 39);
  const Mask mask(img.size(), 1);
  Pixels dst(img.size(), 0x5A5A5A5Au);
  const Pixels before = dst;
  EXPECT_EQ(fx_apply_sepia(nullptr, dst.data(), 5, 4), PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_apply_sepia(img.data(), nullptr, 5, 4), PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_apply_sepia(img.data(), dst.data(), 65536, 65536), PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_apply_sepia_partial(nullptr, mask.data(), dst.data(), 5, 4, 0, 4, 0, 3),
            PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(fx_apply_sepia_partial(img.data(), mask.data(), nullptr, 5, 4, 0, 4, 0, 3),
            PHOTOFX_INVALID_ARGUMENT);
  // A mask is needed only when the bounds select masked mode.
  EXPECT_EQ(fx_apply_sepia_partial(img.data(), nullptr, dst.data(), 5, 4, 0, 4, 0, 3),
            PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(dst, before);
  EXPECT_EQ(fx_apply_sepia_partial(img.data(), nullptr, dst.data(), 5, 4, 0, 4, 3, 0),
            PHOTOFX_SUCCESS);
  EXPECT_NE(dst, before);
  // An empty image is not an error; it simply has nothing to tint.
  const Pixels tinted = dst;
  EXPECT_EQ(fx_apply_sepia(img.data(), dst.data(), 0, 4), PHOTOFX_SUCCESS);
  EXPECT_EQ(fx_apply_sepia(img.data(), dst.data(), -5, -4), PHOTOFX_SUCCESS);
  EXPECT_EQ(dst, tinted);
}

}  // namespace
