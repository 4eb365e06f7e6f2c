// Shapes that only some vector paths take, on every path against the portable one: upscaling
// from working images exactly 2, 4 and 8 times narrower (the NEON rows then repeat one pattern
// per block of eight), and sharpening rows long enough for the NEON blocks (against the rule as
// it reads, too), with and without a selection, into a second buffer and in place.
#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "blur/composite.h"
#include "blur/tiltshift.h"
#include "photofx.h"
#include "support/images.h"
#include "support/paths.h"

namespace {

using pfx::test::Mask;
using pfx::test::Pixels;
using Bytes = std::vector<uint8_t>;

constexpr uint32_t kUntouched = 0xA5A5A5A5u;

struct Size {
  int32_t w, h, sw, sh;
};
constexpr Size kPowersOfTwo[] = {{64, 21, 32, 10}, {72, 9, 36, 4},   {96, 30, 24, 7},
                                 {44, 13, 11, 3},  {200, 40, 25, 5}, {136, 17, 17, 2}};

class VectorPaths : public pfx::test::EveryPath {};

// The call on the portable path, then on the path under test.
template <class F>
void against_portable(pfx::SimdPath path, const F& f) {
  pfx::force_simd_path(pfx::SimdPath::kPortable);
  const auto want = f();
  pfx::force_simd_path(path);
  ASSERT_EQ(f(), want);
}

TEST_P(VectorPaths, UpscalingFromPowerOfTwoWorkingSizes) {
  uint64_t seed = 700;
  for (const Size& s : kPowersOfTwo) {
    SCOPED_TRACE(testing::Message() << s.w << "x" << s.h << " from " << s.sw << "x" << s.sh);
    const size_t n = static_cast<size_t>(s.w) * s.h;
    const Pixels src = pfx::test::random_image(s.w, s.h, ++seed);
    const Mask mask = pfx::test::random_mask(s.w, s.h, ++seed);
    const Mask depth = pfx::test::random_mask(s.sw, s.sh, ++seed);
    Bytes blur(3 * static_cast<size_t>(s.sw) * s.sh);
    pfx::test::Rng rng(++seed);
    for (uint8_t& b : blur) b = static_cast<uint8_t>(rng.word());
    for (const bool every : {true, false}) {
      against_portable(GetParam(), [&] {
        Pixels got(n, kUntouched), in_place = src;
        pfx::composite(src.data(), blur.data(), mask.data(), depth.data(), got.data(), s.w, s.h,
                       s.sw, s.sh, every);
        pfx::composite(in_place.data(), blur.data(), mask.data(), depth.data(), in_place.data(),
                       s.w, s.h, s.sw, s.sh, every);
        EXPECT_EQ(in_place, got) << "in place";
        return got;
      });
    }
    against_portable(GetParam(), [&] {
      Pixels got(n, kUntouched), in_place = src;
      restore_tiltshift(src.data(), blur.data(), got.data(), s.w, s.h, s.sw, s.sh, s.h / 3, 1);
      restore_tiltshift(in_place.data(), blur.data(), in_place.data(), s.w, s.h, s.sw, s.sh,
                        s.h / 3, 1);
      EXPECT_EQ(in_place, got) << "restore in place";
      return got;
    });
  }
}

// Sharpen as its rule reads: every channel clamp(2c - ((left + right) >> 1)), the first and last
// columns kept, and with a mask only where its byte is 1.
Pixels sharpened(const Pixels& img, const Mask* mask, int32_t w) {
  Pixels out = img;
  for (size_t i = 0; i < img.size(); ++i) {
    const int32_t x = static_cast<int32_t>(i % static_cast<size_t>(w));
    if (x == 0 || x == w - 1 || (mask != nullptr && (*mask)[i] != 1)) continue;
    uint32_t p = img[i] & 0xFF000000u;
    for (int32_t shift = 0; shift < 24; shift += 8) {
      const auto c = [&](size_t j) { return static_cast<int32_t>((img[j] >> shift) & 255u); };
      const int32_t v = 2 * c(i) - ((c(i - 1) + c(i + 1)) >> 1);
      p |= static_cast<uint32_t>(v < 0 ? 0 : (v > 255 ? 255 : v)) << shift;
    }
    out[i] = p;
  }
  return out;
}

TEST_P(VectorPaths, SharpenOnLongRows) {
  for (const int32_t w : {17, 18, 24, 25, 61}) {
    SCOPED_TRACE(w);
    const int32_t h = 3;
    const Pixels img = pfx::test::random_image(w, h, 800 + w);
    const Mask mask = pfx::test::random_mask(w, h, 900 + w);
    Pixels out(img.size(), kUntouched), in_place = img;
    fx_apply_sharpen_all(img.data(), out.data(), w, h);
    fx_apply_sharpen_all(in_place.data(), in_place.data(), w, h);
    ASSERT_EQ(out, sharpened(img, nullptr, w));
    ASSERT_EQ(in_place, out);
    in_place = img;
    fx_apply_sharpen(img.data(), mask.data(), out.data(), w, h, 0, 0, 0, 0, 0);
    fx_apply_sharpen(in_place.data(), mask.data(), in_place.data(), w, h, 0, 0, 0, 0, 0);
    ASSERT_EQ(out, sharpened(img, &mask, w));
    ASSERT_EQ(in_place, out);
  }
}

INSTANTIATE_TEST_SUITE_P(EveryPath, VectorPaths, pfx::test::every_path(), pfx::test::path_name);

}  // namespace
