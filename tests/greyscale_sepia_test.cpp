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
