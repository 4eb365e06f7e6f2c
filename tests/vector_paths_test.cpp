// Shapes that only some vector paths take, against the plain forms in reference/: upscaling from
// working images exactly 2, 4 and 8 times narrower (the NEON rows then repeat one pattern per
// block of eight), with and without a selection, into a second buffer and in place. The ARM
// builds run this with and without their vector paths.
#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "blur/composite.h"
#include "blur/tiltshift.h"
#include "photofx.h"
#include "reference/blur.h"
#include "support/images.h"

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

TEST(VectorPaths, UpscalingFromPowerOfTwoWorkingSizes) {
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
      Pixels want(n, kUntouched), got(n, kUntouched), in_place = src;
      pfx::reference::composite(src.data(), blur.data(), mask.data(), depth.data(), want.data(),
                                s.w, s.h, s.sw, s.sh, every);
      pfx::composite(src.data(), blur.data(), mask.data(), depth.data(), got.data(), s.w, s.h, s.sw,
                     s.sh, every);
      pfx::composite(in_place.data(), blur.data(), mask.data(), depth.data(), in_place.data(), s.w,
                     s.h, s.sw, s.sh, every);
      ASSERT_EQ(got, want) << "composite " << every;
      ASSERT_EQ(in_place, want) << "composite in place " << every;
    }
    const pfx::TiltBand band(s.h, s.h / 3, 1);
    Pixels want(n, kUntouched), got(n, kUntouched), in_place = src;
    pfx::reference::tilt_restore(src.data(), blur.data(), want.data(), s.w, s.h, s.sw, s.sh, band);
    restore_tiltshift(src.data(), blur.data(), got.data(), s.w, s.h, s.sw, s.sh, s.h / 3, 1);
    restore_tiltshift(in_place.data(), blur.data(), in_place.data(), s.w, s.h, s.sw, s.sh, s.h / 3,
                      1);
    ASSERT_EQ(got, want) << "restore";
    ASSERT_EQ(in_place, want) << "restore in place";
  }
}

}  // namespace
