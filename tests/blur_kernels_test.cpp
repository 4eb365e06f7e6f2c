// Gaussian and lens blur of working images: the worked rows and discs, the depth rules, levels
// outside the range, in-place use and the scratch allocation failure.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <vector>

#include "blur/gaussian.h"
#include "frame/alloc_hook.h"
#include "photofx.h"
#include "reference/blur.h"
#include "support/images.h"

namespace {

using Bytes = std::vector<uint8_t>;
using Row = std::vector<int>;

Bytes grey(const Row& values) {
  Bytes out;
  for (int v : values) out.insert(out.end(), 3, static_cast<uint8_t>(v));
  return out;
}

Row first_bytes(const Bytes& img) {
  Row out;
  for (size_t i = 0; i < img.size(); i += 3) out.push_back(img[i]);
  return out;
}

Bytes random_bytes(size_t n, uint64_t seed) {
  pfx::test::Rng rng(seed);
  Bytes out(n);
  for (auto& b : out) b = static_cast<uint8_t>(rng.word());
  return out;
}

Row gaussian(const Row& row, const Bytes& depth, int32_t level) {
  const Bytes src = grey(row);
  Bytes dst(src.size());
  make_gaussian_blur(src.data(), dst.data(), depth.data(), static_cast<int32_t>(row.size()), 1,
                     level);
  return first_bytes(dst);
}

const Bytes kInside(9, 1);
const Row kImpulse = {0, 0, 0, 0, 255, 0, 0, 0, 0};

// Worked rows: an impulse and a step at the widest window, the narrower windows (odd ones reach
// one tap further left), columns like rows, and taps outside the area (only depth 1 is inside)
// standing in for the centre.
TEST(GaussianBlur, WorkedRowsColumnsAndTheDepthRule) {
  EXPECT_EQ(gaussian(kImpulse, kInside, 8), (Row{23, 31, 37, 39, 41, 39, 37, 31, 23}));
  EXPECT_EQ(gaussian(kImpulse, kInside, 2), (Row{0, 0, 0, 81, 91, 81, 0, 0, 0}));
  EXPECT_EQ(gaussian(kImpulse, kInside, 1), (Row{0, 0, 0, 0, 135, 120, 0, 0, 0}));
  EXPECT_EQ(gaussian(kImpulse, kInside, 0), kImpulse);
  EXPECT_EQ(gaussian({0, 0, 0, 0, 255, 255, 255, 255, 255}, kInside, 8),
            (Row{23, 51, 81, 112, 148, 181, 211, 235, 255}));
  const Bytes src = grey(kImpulse);
  Bytes column(src.size());
  make_gaussian_blur(src.data(), column.data(), kInside.data(), 1, 9, 7);
  EXPECT_EQ(first_bytes(column), gaussian(kImpulse, kInside, 7));

  const Row row = {100, 100, 100, 100, 100, 200, 200, 200, 200};
  const Row kept = {100, 100, 100, 100, 100, 161, 170, 181, 192};
  EXPECT_EQ(gaussian(row, {1, 1, 1, 1, 1, 0, 0, 0, 0}, 8), kept);
  EXPECT_EQ(gaussian(row, {1, 1, 1, 1, 1, 2, 255, 2, 255}, 8), kept);
}

// Levels outside 0..8 blur as 8; one buffer may be source and destination; refused calls and a
// failed scratch allocation leave the destination as it was.
TEST(GaussianBlur, UniformStaysUniformWideLevelsAgreeAndBadCallsWriteNothing) {
  const Bytes flat(13 * 7 * 3, 77), ones(13 * 7, 1);
  Bytes dst(flat.size());
  for (int32_t level = -2; level <= 9; ++level) {
    make_gaussian_blur(flat.data(), dst.data(), ones.data(), 13, 7, level);
    EXPECT_EQ(dst, flat) << level;
  }
  const Bytes img = random_bytes(13 * 7 * 3, 5), depth = random_bytes(13 * 7, 6);
  Bytes widest(img.size());
  make_gaussian_blur(img.data(), widest.data(), depth.data(), 13, 7, 8);
  for (int32_t level : {100, -1, INT32_MIN, INT32_MAX}) {
    make_gaussian_blur(img.data(), dst.data(), depth.data(), 13, 7, level);
    EXPECT_EQ(dst, widest) << level;
  }
  Bytes in_place = img;
  make_gaussian_blur(in_place.data(), in_place.data(), depth.data(), 13, 7, 8);
  EXPECT_EQ(in_place, widest);

  const Bytes before(img.size(), 0x5A);
  dst = before;
  pfx::arm_allocation_failure(1);
  make_gaussian_blur(img.data(), dst.data(), depth.data(), 13, 7, 4);
  pfx::arm_allocation_failure(0);
  make_gaussian_blur(img.data(), dst.data(), nullptr, 13, 7, 4);
  make_gaussian_blur(nullptr, dst.data(), depth.data(), 13, 7, 4);
  make_gaussian_blur(img.data(), dst.data(), depth.data(), 0, 7, 4);
  make_lens_blur(img.data(), dst.data(), nullptr, 13, 7, 4);
  make_lens_blur(img.data(), dst.data(), depth.data(), -13, 7, 4);
  EXPECT_EQ(dst, before);
}

// The line-at-a-time blur against the per-sample form: awkward sizes down to single rows and
// columns, every level and some beyond, random depth (only 1 is inside) or none, into a second
// buffer and in place. The reciprocal that replaces the division is checked on every sum of
// every weight.
TEST(GaussianBlur, MatchesTheReferenceForm) {
  for (uint32_t weight = 1; weight < 82; ++weight) {
    for (uint32_t sum = 0; sum <= 255 * weight; ++sum) {
      ASSERT_EQ((sum * pfx::kBlurReciprocal[weight]) >> pfx::kBlurReciprocalShift, sum / weight)
          << sum << " / " << weight;
    }
  }
  const std::pair<int32_t, int32_t> sizes[] = {{1, 1},  {1, 13}, {13, 1},   {2, 3},
                                               {17, 9}, {31, 5}, {250, 187}};
  uint64_t seed = 40;
  for (const auto& [w, h] : sizes) {
    const size_t n = static_cast<size_t>(w) * h;
    const Bytes img = random_bytes(3 * n, ++seed);
    const pfx::test::Mask depth = pfx::test::random_mask(w, h, ++seed);
    for (const uint8_t* d : {depth.data(), static_cast<const uint8_t*>(nullptr)}) {
      for (int32_t level : {-1, 0, 1, 2, 3, 4, 5, 6, 7, 8, 9, INT32_MIN}) {
        Bytes want(3 * n), got(3 * n), in_place = img;
        pfx::reference::gaussian_blur(img.data(), want.data(), d, w, h, level);
        ASSERT_TRUE(pfx::gaussian_blur(img.data(), got.data(), d, w, h, level));
        ASSERT_TRUE(pfx::gaussian_blur(in_place.data(), in_place.data(), d, w, h, level));
        EXPECT_EQ(got, want) << w << "x" << h << " level " << level << (d ? " depth" : "");
        EXPECT_EQ(in_place, want) << w << "x" << h << " level " << level;
      }
    }
  }
}

// Lens blur of a 5 x 5 black image with a white middle, all depth 1, drawn as '#' for white.
std::string white_dot(int32_t level) {
  Bytes src(75, 0), dst(75, 9);
  src[36] = src[37] = src[38] = 255;
  const Bytes depth(25, 1);
  make_lens_blur(src.data(), dst.data(), depth.data(), 5, 5, level);
  std::string out;
  for (size_t i = 0; i < 25; ++i) {
    const bool grey_byte = dst[3 * i] == dst[3 * i + 1] && dst[3 * i] == dst[3 * i + 2];
    out += !grey_byte ? '?' : dst[3 * i] == 255 ? '#' : dst[3 * i] == 0 ? '.' : '?';
    if (i % 5 == 4 && i < 24) out += '/';
  }
  return out;
}

TEST(LensBlur, HighlightsSpreadIntoTheApertureAndColoursLoseAUnit) {
  EXPECT_EQ(white_dot(2), "...../..#../.###./..#../.....");
  EXPECT_EQ(white_dot(4), ".###./#####/#####/#####/.###.");
  EXPECT_EQ(white_dot(1), "...../...../...#./..#../.....");  // even sides reach further left
  // Bright taps dominate the luma mean.
  const Bytes row = grey({200, 200, 50, 50}), depth(4, 1);
  Bytes dst(row.size());
  make_lens_blur(row.data(), dst.data(), depth.data(), 4, 1, 2);
  EXPECT_EQ(first_bytes(dst), (Row{200, 183, 150, 50}));
  // A flat coloured patch loses a unit through luma and chroma at every level.
  Bytes patch, expected;
  for (int i = 0; i < 4; ++i) patch.insert(patch.end(), {50, 100, 200});
  for (int i = 0; i < 4; ++i) expected.insert(expected.end(), {49, 100, 199});
  for (int32_t level : {0, 3, 8}) {
    Bytes out(patch.size());
    make_lens_blur(patch.data(), out.data(), depth.data(), 2, 2, level);
    EXPECT_EQ(out, expected) << level;
  }
}

TEST(LensBlur, DepthZeroSamplesAreCopiedAndNeverContribute) {
  const Bytes src = grey({0, 0, 255, 0, 0}), depth = {1, 1, 0, 1, 1};
  Bytes dst(src.size(), 7);
  make_lens_blur(src.data(), dst.data(), depth.data(), 5, 1, 8);
  EXPECT_EQ(first_bytes(dst), (Row{0, 0, 255, 0, 0}));

  const Bytes img = random_bytes(11 * 9 * 3, 8);
  Bytes d(99);
  for (size_t i = 0; i < d.size(); ++i) d[i] = static_cast<uint8_t>(i % 4 * 60);
  Bytes widest(img.size()), other(img.size());
  make_lens_blur(img.data(), widest.data(), d.data(), 11, 9, 8);
  for (size_t i = 0; i < d.size(); i += 4) {
    EXPECT_TRUE(std::equal(&img[3 * i], &img[3 * i + 3], &widest[3 * i])) << i;
  }
  for (int32_t level : {100, -1, INT32_MIN}) {
    make_lens_blur(img.data(), other.data(), d.data(), 11, 9, level);
    EXPECT_EQ(other, widest) << level;
  }
}

}  // namespace
