// Mirror: output sizes, the column and row layout of every mode, exact symmetry, and the
// refusals that keep the copies inside the buffers.
#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

// Pixel words that name their own column and row (alpha included, which the mirror copies).
Pixels labelled(int32_t w, int32_t h) {
  Pixels px(static_cast<size_t>(w) * static_cast<size_t>(h));
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      px[static_cast<size_t>(y * w + x)] =
          0x5A000000u | static_cast<uint32_t>(y) << 12 | static_cast<uint32_t>(x);
    }
  }
  return px;
}

struct Mirrored {
  int32_t code, width, height;
  Pixels px;
  uint32_t at(int32_t x, int32_t y) const { return px[static_cast<size_t>(y * width + x)]; }
};

// Asks the entry points for the size, then mirrors into a buffer of exactly that size.
Mirrored mirror(const Pixels& src, int32_t w, int32_t h, int32_t pos, int32_t mode, int32_t axis) {
  Mirrored m{0, getMirrorOutwidth(w, pos, mode, axis), getMirrorOutheight(h, pos, mode, axis), {}};
  m.px.assign(static_cast<size_t>(m.width) * static_cast<size_t>(m.height), 0xDEADBEEFu);
  m.code = runMirror(src.data(), w, h, m.px.data(), m.width, m.height, pos, mode, axis);
  return m;
}

// Every row of m must be the source row with columns taken in the order `want`.
void expect_columns(const Mirrored& m, const Pixels& src, int32_t w,
                    const std::vector<int32_t>& want) {
  ASSERT_EQ(m.code, PHOTOFX_SUCCESS);
  ASSERT_EQ(m.width, static_cast<int32_t>(want.size()));
  for (int32_t y = 0; y < m.height; ++y) {
    for (int32_t x = 0; x < m.width; ++x) EXPECT_EQ(m.at(x, y), src[y * w + want[x]]) << x;
  }
}

// Every column of m must be the source column with rows taken in the order `want`.
void expect_rows(const Mirrored& m, const Pixels& src, int32_t w,
                 const std::vector<int32_t>& want) {
  ASSERT_EQ(m.code, PHOTOFX_SUCCESS);
  ASSERT_EQ(m.width, w);
  ASSERT_EQ(m.height, static_cast<int32_t>(want.size()));
  for (int32_t y = 0; y < m.height; ++y) {
    for (int32_t x = 0; x < w; ++x) EXPECT_EQ(m.at(x, y), src[want[y] * w + x]) << y;
  }
}

TEST(Mirror, KeepLeftAndKeepRightReflectColumns) {
  const Pixels src = labelled(10, 3);
  expect_columns(mirror(src, 10, 3, 4, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL), src, 10,
                 {0, 1, 2, 3, 4, 4, 3, 2, 1, 0});
  expect_columns(mirror(src, 10, 3, 4, MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL), src, 10,
                 {9, 8, 7, 6, 5, 4, 4, 5, 6, 7, 8, 9});
  expect_columns(mirror(src, 10, 3, 0, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL), src, 10, {0, 0});
  expect_columns(mirror(src, 10, 3, 9, MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL), src, 10, {9, 9});
}

TEST(Mirror, KeepTopAndKeepBottomReflectRows) {
  const Pixels src = labelled(3, 7);
  expect_rows(mirror(src, 3, 7, 2, MIRROR_KEEP_TOP, MIRROR_VERTICAL), src, 3, {0, 1, 2, 2, 1, 0});
  expect_rows(mirror(src, 3, 7, 2, MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL), src, 3,
              {6, 5, 4, 3, 2, 2, 3, 4, 5, 6});
  expect_rows(mirror(src, 3, 7, 0, MIRROR_KEEP_TOP, MIRROR_VERTICAL), src, 3, {0, 0});
  expect_rows(mirror(src, 3, 7, 6, MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL), src, 3, {6, 6});
}

TEST(Mirror, EveryModeAndPositionGivesASymmetricImage) {
  const int32_t w = 9, h = 6;
  const Pixels src = pfx::test::random_image(w, h, 31);
  const int32_t modes[4][2] = {{MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL},
                               {MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL},
                               {MIRROR_KEEP_TOP, MIRROR_VERTICAL},
                               {MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL}};
  for (const auto& [mode, axis] : modes) {
    const bool horizontal = axis == MIRROR_HORIZONTAL;
    for (int32_t pos = 0; pos < (horizontal ? w : h); ++pos) {
      const Mirrored m = mirror(src, w, h, pos, mode, axis);
      ASSERT_EQ(m.code, PHOTOFX_SUCCESS);
      for (int32_t y = 0; y < m.height; ++y) {
        for (int32_t x = 0; x < m.width; ++x) {
          const uint32_t mirror_image =
              horizontal ? m.at(m.width - 1 - x, y) : m.at(x, m.height - 1 - y);
          ASSERT_EQ(m.at(x, y), mirror_image) << mode << " pos " << pos;
        }
      }
    }
  }
}

TEST(MirrorSize, UnchangedWhenPositionOrAxisDoesNotMirrorThatSide) {
  for (int32_t pos : {-1, 10, 11, INT32_MIN}) {
    EXPECT_EQ(getMirrorOutwidth(10, pos, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL), 10);
    EXPECT_EQ(getMirrorOutheight(10, pos, MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL), 10);
  }
  EXPECT_EQ(getMirrorOutwidth(10, 4, MIRROR_KEEP_LEFT, MIRROR_VERTICAL), 10);
  EXPECT_EQ(getMirrorOutheight(10, 4, MIRROR_KEEP_TOP, MIRROR_HORIZONTAL), 10);
  EXPECT_EQ(getMirrorOutwidth(10, 4, MIRROR_KEEP_TOP, MIRROR_HORIZONTAL), 10);
  EXPECT_EQ(getMirrorOutheight(10, 4, MIRROR_KEEP_RIGHT, MIRROR_VERTICAL), 10);
  EXPECT_EQ(getMirrorOutwidth(10, 4, MIRROR_KEEP_LEFT, 0), 10);
  EXPECT_EQ(getMirrorOutwidth(-3, 0, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL), -3);
  EXPECT_EQ(getMirrorOutheight(0, 0, MIRROR_KEEP_TOP, MIRROR_VERTICAL), 0);
  // Doubled sizes that 32 bits cannot hold are reported unchanged rather than wrapped.
  EXPECT_EQ(getMirrorOutwidth(INT32_MAX, 0x40000000, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL),
            INT32_MAX);
  EXPECT_EQ(getMirrorOutheight(INT32_MAX, 0, MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL), INT32_MAX);
  EXPECT_EQ(getMirrorOutwidth(INT32_MAX, 0x3FFFFFFE, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL),
            0x7FFFFFFE);
  EXPECT_EQ(fx_get_mirror_out_width(10, 4, MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL), 12);
  EXPECT_EQ(fx_get_mirror_out_height(7, 2, MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL), 10);
}

TEST(Mirror, RefusedCallsLeaveTheDestinationUntouched) {
  Pixels buf = labelled(16, 8);  // src is its first 10 x 4 pixels, dst the rest
  const Pixels before = buf;
  const uint32_t* src = buf.data();
  uint32_t* dst = buf.data() + 40;
  struct Case {
    const char* why;
    const uint32_t* s;
    int32_t w, h;
    uint32_t* d;
    int32_t dw, dh, pos, mode, axis;
  };
  const int32_t L = MIRROR_KEEP_LEFT, R = MIRROR_KEEP_RIGHT, T = MIRROR_KEEP_TOP;
  const int32_t B = MIRROR_KEEP_BOTTOM, HZ = MIRROR_HORIZONTAL, VT = MIRROR_VERTICAL;
  const Case cases[] = {
      {"mode of the other axis", src, 10, 4, dst, 10, 4, 4, T, HZ},
      {"mode of the other axis", src, 10, 4, dst, 10, 4, 1, L, VT},
      {"unknown axis", src, 10, 4, dst, 10, 4, 4, L, 0},
      {"unknown mode", src, 10, 4, dst, 10, 4, 4, 0, HZ},
      {"null source", nullptr, 10, 4, dst, 10, 4, 4, L, HZ},
      {"null destination", src, 10, 4, nullptr, 10, 4, 4, L, HZ},
      {"position left of the image", src, 10, 4, dst, 10, 4, -1, L, HZ},
      {"position right of the image", src, 10, 4, dst, 10, 4, 10, R, HZ},
      {"position below the image", src, 10, 4, dst, 10, 4, 4, T, VT},
      {"position above the image", src, 10, 4, dst, 10, 4, -1, B, VT},
      {"width not the getter's", src, 10, 4, dst, 5, 4, 1, L, HZ},
      {"height changed across columns", src, 10, 4, dst, 4, 5, 1, L, HZ},
      {"width not the getter's", src, 10, 4, dst, 14, 4, 4, R, HZ},
      {"width changed across rows", src, 10, 4, dst, 11, 4, 1, T, VT},
      {"height not the getter's", src, 10, 4, dst, 10, 5, 1, T, VT},
      {"overlapping buffers", src, 10, 4, buf.data() + 30, 10, 4, 4, L, HZ},
      {"more pixels than addressable", src, 40000, 40000, dst, 40000, 40000, 19999, L, HZ},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(runMirror(c.s, c.w, c.h, c.d, c.dw, c.dh, c.pos, c.mode, c.axis),
              PHOTOFX_INVALID_ARGUMENT)
        << c.why;
    ASSERT_EQ(buf, before) << c.why;
  }
  // The same call with every argument right goes through.
  EXPECT_EQ(runMirror(src, 10, 4, dst, 4, 4, 1, L, HZ), PHOTOFX_SUCCESS);
}

TEST(Mirror, EmptyOtherSideSucceedsWithoutWriting) {
  const Pixels src = labelled(4, 1);
  Pixels dst(8, 0xDEADBEEFu);
  EXPECT_EQ(fx_mirror(src.data(), 4, 0, dst.data(), 4, 0, 1, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL),
            PHOTOFX_SUCCESS);
  EXPECT_EQ(fx_mirror(src.data(), 0, 4, dst.data(), 0, 4, 1, MIRROR_KEEP_TOP, MIRROR_VERTICAL),
            PHOTOFX_SUCCESS);
  for (uint32_t p : dst) EXPECT_EQ(p, 0xDEADBEEFu);
}

}  // namespace
