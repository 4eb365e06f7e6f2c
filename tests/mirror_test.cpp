// Mirror: the column and row layout of every mode, output sizes, and the refusals that keep the
// copies inside the buffers.
#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

constexpr int32_t L = MIRROR_KEEP_LEFT, R = MIRROR_KEEP_RIGHT, T = MIRROR_KEEP_TOP,
                  B = MIRROR_KEEP_BOTTOM, HZ = MIRROR_HORIZONTAL, VT = MIRROR_VERTICAL;

// Pixel words that name their own column and row (alpha included, which the mirror copies).
Pixels labelled(int32_t w, int32_t h) {
  Pixels px(static_cast<size_t>(w) * static_cast<size_t>(h));
  for (size_t i = 0; i < px.size(); ++i) {
    px[i] = 0x5A000000u | static_cast<uint32_t>(i / w) << 12 | static_cast<uint32_t>(i % w);
  }
  return px;
}

// The source's columns (horizontal axis) or rows (vertical) taken in the order `want`: a 10 x 7
// source mirrored at column 4 or row 2, and at its first and last column or row.
TEST(Mirror, EachModeKeepsItsSideAndAddsItsReflection) {
  const int32_t w = 10, h = 7;
  const Pixels src = labelled(w, h);
  const struct {
    int32_t pos, mode, axis;
    std::vector<int32_t> want;
  } cases[] = {
      {4, L, HZ, {0, 1, 2, 3, 4, 4, 3, 2, 1, 0}},
      {4, R, HZ, {9, 8, 7, 6, 5, 4, 4, 5, 6, 7, 8, 9}},
      {0, L, HZ, {0, 0}},
      {9, R, HZ, {9, 9}},
      {2, T, VT, {0, 1, 2, 2, 1, 0}},
      {2, B, VT, {6, 5, 4, 3, 2, 2, 3, 4, 5, 6}},
      {0, T, VT, {0, 0}},
      {6, B, VT, {6, 6}},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(testing::Message() << "mode " << c.mode << " at " << c.pos);
    const bool horizontal = c.axis == HZ;
    const int32_t n = static_cast<int32_t>(c.want.size());
    const int32_t dw = getMirrorOutwidth(w, c.pos, c.mode, c.axis);
    const int32_t dh = getMirrorOutheight(h, c.pos, c.mode, c.axis);
    ASSERT_EQ(dw, horizontal ? n : w);
    ASSERT_EQ(dh, horizontal ? h : n);
    Pixels dst(static_cast<size_t>(dw) * dh, 0xDEADBEEFu);
    ASSERT_EQ(runMirror(src.data(), w, h, dst.data(), dw, dh, c.pos, c.mode, c.axis),
              PHOTOFX_SUCCESS);
    for (int32_t y = 0; y < dh; ++y) {
      for (int32_t x = 0; x < dw; ++x) {
        const uint32_t want = horizontal ? src[y * w + c.want[x]] : src[c.want[y] * w + x];
        ASSERT_EQ(dst[y * dw + x], want) << x << "," << y;
      }
    }
  }
}

TEST(MirrorSize, UnchangedWhenNothingIsMirroredOrTheDoubleWouldNotFit) {
  for (int32_t pos : {-1, 10, 11, INT32_MIN}) {
    EXPECT_EQ(getMirrorOutwidth(10, pos, L, HZ), 10);
    EXPECT_EQ(getMirrorOutheight(10, pos, B, VT), 10);
  }
  // A side of the other axis, or no axis, mirrors nothing along this one.
  EXPECT_EQ(getMirrorOutwidth(10, 4, L, VT), 10);
  EXPECT_EQ(getMirrorOutheight(10, 4, T, HZ), 10);
  EXPECT_EQ(getMirrorOutwidth(10, 4, T, HZ), 10);
  EXPECT_EQ(getMirrorOutheight(10, 4, R, VT), 10);
  EXPECT_EQ(getMirrorOutwidth(10, 4, L, 0), 10);
  EXPECT_EQ(getMirrorOutwidth(-3, 0, L, HZ), -3);
  EXPECT_EQ(getMirrorOutheight(0, 0, T, VT), 0);
  // Doubled sizes that 32 bits cannot hold are reported unchanged rather than wrapped.
  EXPECT_EQ(getMirrorOutwidth(INT32_MAX, 0x40000000, L, HZ), INT32_MAX);
  EXPECT_EQ(getMirrorOutheight(INT32_MAX, 0, B, VT), INT32_MAX);
  EXPECT_EQ(getMirrorOutwidth(INT32_MAX, 0x3FFFFFFE, L, HZ), 0x7FFFFFFE);
  EXPECT_EQ(fx_get_mirror_out_width(10, 4, R, HZ), 12);
  EXPECT_EQ(fx_get_mirror_out_height(7, 2, B, VT), 10);
}

// Every refusal returns the invalid-argument code and writes nothing: a side of the other axis,
// an unknown axis or mode, missing buffers, positions outside the image, destination sizes other
// than the getters' (the copies would run past the buffer), overlapping buffers and sizes no
// buffer could hold.
TEST(Mirror, RefusedCallsLeaveTheDestinationUntouched) {
  Pixels buf = labelled(16, 8);  // src is its first 10 x 4 pixels, dst the rest
  const Pixels before = buf;
  const uint32_t* src = buf.data();
  uint32_t* dst = buf.data() + 40;
  const struct {
    const uint32_t* s;
    int32_t w, h;
    uint32_t* d;
    int32_t dw, dh, pos, mode, axis;
  } cases[] = {
      // clang-format off
      {src, 10, 4, dst, 10, 4, 4, T, HZ},     {src, 10, 4, dst, 10, 4, 1, L, VT},
      {src, 10, 4, dst, 10, 4, 4, L, 0},      {src, 10, 4, dst, 10, 4, 4, 0, HZ},
      {nullptr, 10, 4, dst, 10, 4, 4, L, HZ}, {src, 10, 4, nullptr, 10, 4, 4, L, HZ},
      {src, 10, 4, dst, 10, 4, -1, L, HZ},    {src, 10, 4, dst, 10, 4, 10, R, HZ},
      {src, 10, 4, dst, 10, 4, 4, T, VT},     {src, 10, 4, dst, 10, 4, -1, B, VT},
      {src, 10, 4, dst, 5, 4, 1, L, HZ},      {src, 10, 4, dst, 4, 5, 1, L, HZ},
      {src, 10, 4, dst, 14, 4, 4, R, HZ},     {src, 10, 4, dst, 11, 4, 1, T, VT},
      {src, 10, 4, dst, 10, 5, 1, T, VT},     {src, 10, 4, buf.data() + 30, 10, 4, 4, L, HZ},
      {src, 40000, 40000, dst, 40000, 40000, 19999, L, HZ},
      // clang-format on
  };
  for (const auto& c : cases) {
    EXPECT_EQ(runMirror(c.s, c.w, c.h, c.d, c.dw, c.dh, c.pos, c.mode, c.axis),
              PHOTOFX_INVALID_ARGUMENT)
        << &c - cases;
    ASSERT_EQ(buf, before) << &c - cases;
  }
  EXPECT_EQ(runMirror(src, 10, 4, dst, 4, 4, 1, L, HZ), PHOTOFX_SUCCESS);  // every argument right
  // An empty other side succeeds without writing.
  Pixels empty(8, 0xDEADBEEFu);
  EXPECT_EQ(fx_mirror(src, 4, 0, empty.data(), 4, 0, 1, L, HZ), PHOTOFX_SUCCESS);
  EXPECT_EQ(fx_mirror(src, 0, 4, empty.data(), 0, 4, 1, T, VT), PHOTOFX_SUCCESS);
  EXPECT_EQ(empty, Pixels(8, 0xDEADBEEFu));
}

}  // namespace
