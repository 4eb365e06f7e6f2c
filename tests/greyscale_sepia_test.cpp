// Greyscale and sepia: the gain at and beyond the slider ends, the entry points, and the two sepia
// curves and their tables. The partial variants follow the common frame (tested in frame_test).
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
using pfx::test::Pixels;

uint32_t grey(uint32_t p, int32_t level) {
  uint32_t out = 0;
  fx_control_greyscale_all(&p, &out, 1, 1, level);
  return out;
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
    for (uint32_t m = 0; m < 256; ++m) {
      const double exact = std::floor(m * gain / 65536.0);
      const uint32_t v = exact < 0 ? 0 : (exact > 255 ? 255 : static_cast<uint32_t>(exact));
      ASSERT_EQ(grey(argb(0xFF, m, m, m), level), argb(0xFF, v, v, v)) << m << " level " << level;
    }
  }
}

// The entry points forward to the implementations (whose partial rule frame_test pins).
TEST(Greyscale, EntryPointsForward) {
  const Pixels img = pfx::test::random_image(9, 8, 32);
  const pfx::test::Mask mask = pfx::test::random_mask(9, 8, 33);
  Pixels expected(img.size()), actual(img.size());
  fx_control_greyscale_all(img.data(), expected.data(), 9, 8, 14);
  controlGreyscale(img.data(), actual.data(), 9, 8, 14);
  EXPECT_EQ(actual, expected);
  fx_control_greyscale(img.data(), mask.data(), expected.data(), 9, 8, 7, 2, 6, 1, 5);
  controlGreyscalePartial(img.data(), mask.data(), actual.data(), 9, 8, 7, 2, 6, 1, 5);
  EXPECT_EQ(actual, expected);
}

// The curves again, from the runs of equal offset they are known by: {run length, offset}.
std::vector<int32_t> curve_from_runs(const std::vector<std::pair<int32_t, int32_t>>& runs,
                                     int32_t sign) {
  std::vector<int32_t> out;
  for (const auto& [length, offset] : runs) {
    for (int32_t k = 0; k < length; ++k) {
      out.push_back(static_cast<int32_t>(out.size()) + sign * offset);
    }
  }
  return out;
}

std::vector<int32_t> red_curve() {
  std::vector<std::pair<int32_t, int32_t>> runs = {{3, 0}};
  for (int32_t o = 1; o <= 9; ++o) runs.push_back({4, o});
  runs.insert(runs.end(), {{5, 10}, {3, 11}});
  for (int32_t o = 12; o <= 31; ++o) runs.push_back({4, o});
  runs.insert(runs.end(), {{2, 32}, {5, 31}, {4, 30}, {3, 29}});
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
  }
  for (int32_t v : {INT32_MIN, -1, 256, INT32_MAX}) {
    EXPECT_EQ(fx_get_sepia_r(v), v);
    EXPECT_EQ(fx_get_sepia_b(v), v);
  }
}

}  // namespace
