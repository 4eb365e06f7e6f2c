// Running a test once per instruction-set path: every path the build and the machine have (the
// portable loops, the x86 vector clones, NEON ...), each forced in turn, so that every path is
// held to the same expectations on every machine. New paths join without test changes.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "frame/simd_path.h"

namespace pfx::test {

inline std::vector<SimdPath> available_paths() {
  SimdPath paths[8];
  const int n = available_simd_paths(paths);
  return std::vector<SimdPath>(paths, paths + n);
}

inline auto every_path() { return ::testing::ValuesIn(available_paths()); }

inline std::string path_name(const ::testing::TestParamInfo<SimdPath>& info) {
  return simd_path_name(info.param);
}

// Forces the parameter's path for the test and restores the widest one after it.
class EveryPath : public ::testing::TestWithParam<SimdPath> {
 protected:
  void SetUp() override { force_simd_path(GetParam()); }
  void TearDown() override { force_simd_path(best_simd_path()); }
};

}  // namespace pfx::test
