// Mirror: output sizes, the column and row layout of every mode, exact symmetry, and the
// refusals that keep the copies inside the buffers.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;

// Pixel words that name their own column and row (alpha included, which the mirror copies).
Pixels labelled(int32_t w, int32_t h) {
  Pixels px(static_cast<size_t>(w) * static_cast<size_t>(h));
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x)
      px[static_cast<size_t>(y * w + x)] =
          0x5A000000u | static_cast<uint32_t>(y) << 12 | static_cast<uint32_t>(x);
  }
  return px;
}
int32_t column_of(uint32_t p) { return static_cast<int32_t>(p & 0xFFFu); }
int32_t row_of(uint32_t p) { return static_cast<int32_t>((p >> 12) & 0xFFFu); }

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

TEST(Mirror, KeepLeftAppendsTheKeptColumnsReversed) {
  const Pixels src = labelled(10, 3);
  const Mirrored m = mirror(src, 10, 3, 4, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL);
  ASSERT_EQ(m.code, PHOTOFX_SUCCESS);
  ASSERT_EQ(m.width, 10);
  ASSERT_EQ(m.height, 3);
  const int32_t want[10] = {0, 1, 2, 3, 4, 4, 3, 2, 1, 0};
  for (int32_t y = 0; y < 3; ++y) {
    for (int32_t x = 0; x < 10; ++x) EXPECT_EQ(m.at(x, y), src[y * 10 + want[x]]) << x << "," << y;
  }
}

TEST(Mirror, KeepRightPutsTheReversedColumnsInFront) {
  const Pixels src = labelled(10, 3);
  const Mirrored m = mirror(src, 10, 3, 4, MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL);
  ASSERT_EQ(m.code, PHOTOFX_SUCCESS);
  ASSERT_EQ(m.width, 12);
  const int32_t want[12] = {9, 8, 7, 6, 5, 4, 4, 5, 6, 7, 8, 9};
  for (int32_t y = 0; y < 3; ++y) {
    for (int32_t x = 0; x < 12; ++x) EXPECT_EQ(m.at(x, y), src[y * 10 + want[x]]) << x << "," << y;
  }
}

TEST(Mirror, KeepTopAndKeepBottomReflectWholeRows) {
  const Pixels src = labelled(3, 7);
  const Mirrored top = mirror(src, 3, 7, 2, MIRROR_KEEP_TOP, MIRROR_VERTICAL);
  ASSERT_EQ(top.code, PHOTOFX_SUCCESS);
  ASSERT_EQ(top.width, 3);
  ASSERT_EQ(top.height, 6);
  const int32_t want_top[6] = {0, 1, 2, 2, 1, 0};
  for (int32_t y = 0; y < 6; ++y) {
    for (int32_t x = 0; x < 3; ++x) EXPECT_EQ(top.at(x, y), src[want_top[y] * 3 + x]);
  }
  const Mirrored bottom = mirror(src, 3, 7, 2, MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL);
  ASSERT_EQ(bottom.code, PHOTOFX_SUCCESS);
  ASSERT_EQ(bottom.height, 10);
  const int32_t want_bottom[10] = {6, 5, 4, 3, 2, 2, 3, 4, 5, 6};
  for (int32_t y = 0; y < 10; ++y) {
    for (int32_t x = 0; x < 3; ++x) EXPECT_EQ(bottom.at(x, y), src[want_bottom[y] * 3 + x]);
  }
}

TEST(Mirror, LinesAtTheEdgesGiveTwoCopiesOfThatLine) {
  const Pixels src = labelled(5, 4);
  const Mirrored left = mirror(src, 5, 4, 0, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL);
  const Mirrored right = mirror(src, 5, 4, 4, MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL);
  const Mirrored top = mirror(src, 5, 4, 0, MIRROR_KEEP_TOP, MIRROR_VERTICAL);
  const Mirrored bottom = mirror(src, 5, 4, 3, MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL);
  EXPECT_EQ(left.width, 2);
  EXPECT_EQ(right.width, 2);
  EXPECT_EQ(top.height, 2);
  EXPECT_EQ(bottom.height, 2);
  for (int32_t y = 0; y < 4; ++y) {
    for (int32_t x = 0; x < 2; ++x) {
      EXPECT_EQ(left.at(x, y), src[y * 5]);
      EXPECT_EQ(right.at(x, y), src[y * 5 + 4]);
    }
  }
  for (int32_t y = 0; y < 2; ++y) {
    for (int32_t x = 0; x < 5; ++x) {
      EXPECT_EQ(top.at(x, y), src[x]);
      EXPECT_EQ(bottom.at(x, y), src[15 + x]);
    }
  }
}

TEST(Mirror, EveryModeAndPositionGivesASymmetricImageOfKeptPixels) {
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
      // The half that is kept reads straight from the source, from the mirror line outward.
      const Pixels lab = labelled(w, h);
      const Mirrored l = mirror(lab, w, h, pos, mode, axis);
      const bool low = mode == MIRROR_KEEP_LEFT || mode == MIRROR_KEEP_TOP;
      const int32_t out_line = low ? pos : (horizontal ? l.width : l.height) / 2;
      const uint32_t p = horizontal ? l.at(out_line, 1) : l.at(1, out_line);
      EXPECT_EQ(horizontal ? column_of(p) : row_of(p), pos) << mode;
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

class MirrorRefusal : public ::testing::Test {
 protected:
  Pixels src = labelled(10, 4);
  Pixels dst = Pixels(64, 0xDEADBEEFu);

  // runMirror into dst, which must come back untouched.
  void expect_refused(const uint32_t* s, int32_t w, int32_t h, uint32_t* d, int32_t dw, int32_t dh,
                      int32_t pos, int32_t mode, int32_t axis) {
    const Pixels before = dst;
    EXPECT_EQ(runMirror(s, w, h, d, dw, dh, pos, mode, axis), PHOTOFX_INVALID_ARGUMENT);
    EXPECT_EQ(dst, before);
  }
};

TEST_F(MirrorRefusal, ModesThatDoNotBelongToTheAxis) {
  expect_refused(src.data(), 10, 4, dst.data(), 10, 4, 4, MIRROR_KEEP_TOP, MIRROR_HORIZONTAL);
  expect_refused(src.data(), 10, 4, dst.data(), 10, 4, 1, MIRROR_KEEP_LEFT, MIRROR_VERTICAL);
  expect_refused(src.data(), 10, 4, dst.data(), 10, 4, 4, MIRROR_KEEP_LEFT, 0);
  expect_refused(src.data(), 10, 4, dst.data(), 10, 4, 4, 0, MIRROR_HORIZONTAL);
}

TEST_F(MirrorRefusal, MissingBuffers) {
  expect_refused(nullptr, 10, 4, dst.data(), 10, 4, 4, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL);
  EXPECT_EQ(runMirror(src.data(), 10, 4, nullptr, 10, 4, 4, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL),
            PHOTOFX_INVALID_ARGUMENT);
}

TEST_F(MirrorRefusal, PositionsOutsideTheImage) {
  expect_refused(src.data(), 10, 4, dst.data(), 10, 4, -1, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL);
  expect_refused(src.data(), 10, 4, dst.data(), 10, 4, 10, MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL);
  expect_refused(src.data(), 10, 4, dst.data(), 10, 4, 4, MIRROR_KEEP_TOP, MIRROR_VERTICAL);
  expect_refused(src.data(), 10, 4, dst.data(), 10, 4, -1, MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL);
}

TEST_F(MirrorRefusal, DestinationSizesOtherThanTheGetters) {
  // Width 4 at pos 1 keep left is right: the call goes through once everything matches.
  expect_refused(src.data(), 10, 4, dst.data(), 5, 4, 1, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL);
  expect_refused(src.data(), 10, 4, dst.data(), 4, 5, 1, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL);
  expect_refused(src.data(), 10, 4, dst.data(), 14, 4, 4, MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL);
  expect_refused(src.data(), 10, 4, dst.data(), 11, 4, 1, MIRROR_KEEP_TOP, MIRROR_VERTICAL);
  expect_refused(src.data(), 10, 4, dst.data(), 10, 5, 1, MIRROR_KEEP_TOP, MIRROR_VERTICAL);
  EXPECT_EQ(runMirror(src.data(), 10, 4, dst.data(), 4, 4, 1, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL),
            PHOTOFX_SUCCESS);
}

TEST_F(MirrorRefusal, OverlappingBuffersAndUnaddressableSizes) {
  Pixels both = labelled(16, 4);
  const Pixels before = both;
  EXPECT_EQ(
      runMirror(both.data(), 5, 4, both.data() + 3, 10, 4, 4, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL),
      PHOTOFX_INVALID_ARGUMENT);
  EXPECT_EQ(both, before);
  // The sizes claim far more pixels than the library addresses; nothing is touched.
  expect_refused(src.data(), 40000, 40000, dst.data(), 40000, 40000, 19999, MIRROR_KEEP_LEFT,
                 MIRROR_HORIZONTAL);
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
