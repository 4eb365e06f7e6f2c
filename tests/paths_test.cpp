// Every instruction-set path against the portable one, bit for bit, on awkward sizes: widths on
// either side of every vector width, single rows and columns, at every representative call of
// every catalogue row that takes an image. The portable path runs every call too, so the
// sanitizer build (which has every path) sees each one read and write only its own buffers:
// that is how a read one pixel past a row is caught even where its result is overwritten.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "support/catalog.h"
#include "support/paths.h"

namespace {

namespace cat = pfx::catalog;
using pfx::test::Buffers;

constexpr int32_t kSizes[][2] = {{1, 1},  {2, 3},  {3, 2},  {1, 17}, {7, 4},  {9, 3},
                                 {15, 4}, {17, 5}, {31, 3}, {33, 2}, {63, 3}, {65, 4}};

struct Output {
  int64_t code;
  pfx::test::Pixels dst;
  pfx::test::Bytes work_out;
  bool operator==(const Output&) const = default;
};

Output run(const cat::Export& e, const cat::Rep& rep, int32_t w, int32_t h, pfx::SimdPath path) {
  pfx::force_simd_path(path);
  fx_destroy_blur();
  Buffers b(w, h, static_cast<uint64_t>(w * 1000 + h));
  if (e.shape == cat::Shape::kBlurPreview) {
    fx_Init_blur(b.src.data(), b.mask.data(), w, h, b.bounds.left, b.bounds.right, b.bounds.top,
                 b.bounds.bottom);
  } else if (e.shape == cat::Shape::kTilt && e.has(cat::kWorkspace)) {
    fx_init_tiltshift(b.src.data(), w, h);
  }
  const int64_t code = e.call(b.args(e, rep));
  fx_destroy_blur();
  return {code, b.dst, b.work_out};
}

class Paths : public pfx::test::EveryPath {};

TEST_P(Paths, EveryCallOnAwkwardSizesMatchesThePortablePath) {
  for (const cat::Export& e : cat::kExports) {
    if (!pfx::test::is_image_call(e.shape)) continue;
    const std::span<const cat::Rep> reps = pfx::test::reps_of(e);
    for (const cat::Rep& rep : reps) {
      for (const auto& s : kSizes) {
        const Output mine = run(e, rep, s[0], s[1], GetParam());
        if (GetParam() == pfx::SimdPath::kPortable) continue;
        const Output portable = run(e, rep, s[0], s[1], pfx::SimdPath::kPortable);
        EXPECT_TRUE(mine == portable)
            << e.name << " at level " << rep.v[0] << " on " << s[0] << " x " << s[1];
      }
    }
  }
}

INSTANTIATE_TEST_SUITE_P(EveryPath, Paths, pfx::test::every_path(), pfx::test::path_name);

}  // namespace
