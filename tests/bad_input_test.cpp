// The bad-input rules over every catalogue row that takes an image through the common frame
// (src, [mask,] dst, width, height ...): missing buffers and masks, empty, negative and
// unaddressable sizes, the caller's inputs never written, full variants in place, and every
// refusal (PHOTOFX_INVALID_ARGUMENT) at any representative call writing nothing.
#include <gtest/gtest.h>

#include "support/catalog.h"

namespace {

namespace cat = pfx::catalog;
using pfx::test::Buffers;
using pfx::test::kUntouched;
using pfx::test::Pixels;

constexpr int32_t kW = 23, kH = 17;

// Sizes whose pixel count no buffer could hold, given a buffer of a few pixels: refused before
// anything is read or written. Then empty and negative sizes, which have nothing to visit.
constexpr int32_t kUnaddressable[][2] = {
    {65536, 65536}, {INT32_MAX, 2}, {2, INT32_MAX}, {46341, 46341}, {23170, 23171}};
constexpr int32_t kEmpty[][2] = {
    {0, kH}, {kW, 0}, {-1, kH}, {kW, -5}, {INT32_MIN, kH}, {kW, INT32_MIN}, {INT32_MIN, INT32_MIN}};

bool refused(int64_t code) { return code == PHOTOFX_INVALID_ARGUMENT || code == cat::kNoCode; }
bool accepted(int64_t code) { return code == PHOTOFX_SUCCESS || code == cat::kNoCode; }

// The rows under test: the frame's shapes and the one-shot tilt-shift, which takes the same
// buffers. Module state is left as the test found it.
bool under_test(const cat::Export& e) {
  return pfx::test::is_frame_call(e.shape) ||
         (e.shape == cat::Shape::kTilt && !e.has(cat::kWorkspace));
}

TEST(BadInput, MissingBuffersAndImpossibleSizesWriteNothing) {
  for (const cat::Export& e : cat::kExports) {
    if (!under_test(e)) continue;
    SCOPED_TRACE(e.name);
    const bool partial = pfx::test::is_partial(e.shape);
    for (bool whole : {false, true}) {
      Buffers b(kW, kH, 81, whole);
      const Pixels untouched = b.dst;
      cat::Args a = b.args(e, pfx::test::typical(e));
      cat::Args no_src = a, no_dst = a;
      no_src.src = nullptr;
      no_dst.dst = nullptr;
      EXPECT_TRUE(refused(e.call(no_src)));
      EXPECT_TRUE(refused(e.call(no_dst)));
      for (const auto& s : kUnaddressable) {
        cat::Args big = a;
        big.width = s[0], big.height = s[1];
        EXPECT_TRUE(refused(e.call(big)));
      }
      for (const auto& s : kEmpty) {
        cat::Args none = a;
        none.width = s[0], none.height = s[1];
        e.call(none);
      }
      EXPECT_EQ(b.dst, untouched);
      if (e.shape == cat::Shape::kTextureFull || e.shape == cat::Shape::kTexturePartial) {
        cat::Args no_texture = a;
        no_texture.texture = nullptr;
        e.call(no_texture);
        EXPECT_EQ(b.dst, untouched);
      }
      if (!partial) break;
      // A mask is needed in masked mode only, unless the row reads it in every mode.
      cat::Args no_mask = a;
      no_mask.mask = nullptr;
      const int64_t code = e.call(no_mask);
      if (!whole || e.has(cat::kMaskEveryMode)) {
        EXPECT_TRUE(refused(code));
        EXPECT_EQ(b.dst, untouched);
      } else {
        EXPECT_TRUE(accepted(code));
        EXPECT_NE(b.dst, untouched);
      }
    }
  }
}

// At every representative call: the source and the mask are never written, a refusal writes
// nothing, and a full variant given one buffer as source and destination makes what it makes
// with two.
TEST(BadInput, InputsStayUnwrittenRefusalsWriteNothingAndInPlaceMatches) {
  for (const cat::Export& e : cat::kExports) {
    if (!under_test(e)) continue;
    const std::span<const cat::Rep> reps = pfx::test::reps_of(e);
    for (const cat::Rep& rep : reps) {
      SCOPED_TRACE(std::string(e.name) + " at level " + std::to_string(rep.v[0]));
      Buffers b(kW, kH, 83);
      const Buffers fresh = b;
      const int64_t code = e.call(b.args(e, rep));
      EXPECT_EQ(b.src, fresh.src);
      EXPECT_EQ(b.mask, fresh.mask);
      EXPECT_EQ(b.texture, fresh.texture);
      if (code == PHOTOFX_INVALID_ARGUMENT) {
        EXPECT_EQ(b.dst, fresh.dst);
      }
      if (pfx::test::is_partial(e.shape)) continue;
      const Pixels two_buffers = b.dst;
      b.dst = b.src;
      EXPECT_EQ(e.call(b.args(e, rep, true)), code);
      // A call that writes nothing (a refused level) leaves the source as it is in place.
      EXPECT_EQ(b.dst, two_buffers == fresh.dst ? fresh.src : two_buffers);
    }
  }
}

// A centre at (0, 0) lies outside an image with no columns or rows, however negative the size.
TEST(BadInput, CircleWarpsRefuseImagesWithoutPixels) {
  for (const cat::Export& e : cat::kExports) {
    if (e.shape != cat::Shape::kWarp || !e.has(cat::kReturnsCode)) continue;
    Buffers b(kW, kH, 87);
    const Pixels untouched = b.dst;
    for (const auto& s : kEmpty) {
      cat::Args a = b.args(e, pfx::test::typical(e));
      a.width = s[0], a.height = s[1], a.cx = 0, a.cy = 0;
      EXPECT_EQ(e.call(a), PHOTOFX_INVALID_ARGUMENT) << e.name;
    }
    EXPECT_EQ(b.dst, untouched);
  }
}

}  // namespace
