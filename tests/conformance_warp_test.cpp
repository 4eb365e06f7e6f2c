// Conformance goldens of the warps and their tables.
#include <gtest/gtest.h>

#include <cstdint>
#include <iterator>
#include <vector>

#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::Rect;
using pfx::test::Digest;
using pfx::test::Input;
using pfx::test::Pixels;

// Windows of every kind: the whole image, an inner rectangle with an odd number of columns and
// rows, one reaching past every edge, a single pixel and an empty one.
std::vector<Rect> windows(int32_t w, int32_t h) {
  return {{0, w - 1, 0, h - 1},
          {w / 5, w - 8, h / 4, h - 3},
          {-9, w + 9, -4, h + 40},
          {w / 2, w / 2, h / 3, h / 3},
          {3, 2, 0, h - 1}};
}

// Centres (x, y) and radii tried on each input: mid-image, near a corner, on the edge.
struct Circle {
  int32_t cx, cy, radius;
};
std::vector<Circle> circles(int32_t w, int32_t h) {
  return {{w / 2, h / 2, h / 3}, {3, h - 4, 9}, {w - 1, 0, w}, {w / 3, h / 2, 1}};
}

// Runs a circle warp fn(src, dst, w, h, cx, cy, radius, strength, window, fast) over every input,
// circle, window and speed, digesting the code and the pixels.
template <class Fn>
void digest_warp(Digest& d, const int32_t* strengths, size_t n, Fn fn) {
  for (const Input& in : pfx::test::conformance_inputs()) {
    for (const Circle& c : circles(in.width, in.height)) {
      for (size_t s = 0; s < n; ++s) {
        for (const Rect& win : windows(in.width, in.height)) {
          for (uint32_t fast : {0u, 1u}) {
            Pixels out(in.pixels.size(), 0xA5A5A5A5u);
            d.add(fn(in.pixels.data(), out.data(), in.width, in.height, c.cx, c.cy, c.radius,
                     strengths[s], win, fast));
            d.add(out);
          }
        }
      }
    }
  }
}

TEST(Conformance, Tables) {
  Digest d;
  d.add(reinterpret_cast<const uint32_t*>(ATAN), 2048);
  d.add(reinterpret_cast<const uint32_t*>(EXP_n7), 256);
  d.add(reinterpret_cast<const uint32_t*>(SQRT_STEP_1), 128);
  d.add(reinterpret_cast<const uint32_t*>(SQRT_STEP_2), 480);
  d.add(reinterpret_cast<const uint32_t*>(SQRT_STEP_3), 768);
  d.add(reinterpret_cast<const uint32_t*>(SQRT_STEP_4), 65536);
  d.add(reinterpret_cast<const uint32_t*>(SIN), 4097);
  EXPECT_GOLDEN("warp tables", d, 0xb9affe6d8907ef4aull);
}

TEST(Conformance, BilinearAndFatan2) {
  Digest d;
  const uint32_t px[4] = {0x80123456u, 0x00FEDCBAu, 0xFF0F1E2Du, 0x7F99AA01u};
  for (uint32_t fx = 0; fx <= 2048; fx += 97) {
    for (uint32_t fy = 0; fy <= 2048; fy += 131) {
      d.add(Bilinear_Fixed(fx, fy, &px[0], &px[1], &px[2], &px[3], nullptr));
    }
  }
  for (int32_t a = -300; a <= 300; a += 7) {
    for (int32_t b = -300; b <= 300; b += 11) d.add(FATAN2(a, b));
  }
  EXPECT_GOLDEN("bilinear and fatan2", d, 0x3f035bf41d238ec7ull);
}

TEST(Conformance, Mirror) {
  Digest d;
  const int32_t modes[6][2] = {
      {MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL}, {MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL},
      {MIRROR_KEEP_TOP, MIRROR_VERTICAL},    {MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL},
      {MIRROR_KEEP_TOP, MIRROR_HORIZONTAL},  {MIRROR_KEEP_LEFT, 0}};
  for (const Input& in : pfx::test::conformance_inputs()) {
    for (const auto& [mode, axis] : modes) {
      for (int32_t pos : {0, 5, in.height - 1, in.width - 1, in.width}) {
        const int32_t dw = fx_get_mirror_out_width(in.width, pos, mode, axis);
        const int32_t dh = fx_get_mirror_out_height(in.height, pos, mode, axis);
        Pixels out(static_cast<size_t>(dw) * static_cast<size_t>(dh), 0xA5A5A5A5u);
        d.add(dw);
        d.add(dh);
        d.add(
            fx_mirror(in.pixels.data(), in.width, in.height, out.data(), dw, dh, pos, mode, axis));
        d.add(out);
      }
    }
  }
  EXPECT_GOLDEN("mirror", d, 0xd998d751a70e258bull);
}

TEST(Conformance, Sphericity) {
  Digest d;
  const int32_t levels[] = {-101, -100, -57, -1, 0, 1, 33, 100};
  digest_warp(d, levels, std::size(levels),
              [](const uint32_t* s, uint32_t* o, int32_t w, int32_t h, int32_t cx, int32_t cy,
                 int32_t radius, int32_t level, Rect b, uint32_t fast) {
                return fx_sphericity(s, o, w, h, cx, cy, radius, level, b.left, b.right, b.top,
                                     b.bottom, fast);
              });
  EXPECT_GOLDEN("sphericity", d, 0x062ce101510a03dcull);
}

TEST(Conformance, Twirl) {
  Digest d;
  const int32_t angles[] = {-361, -360, -200, -45, 0, 1, 90, 271, 360};
  digest_warp(d, angles, std::size(angles),
              [](const uint32_t* s, uint32_t* o, int32_t w, int32_t h, int32_t cx, int32_t cy,
                 int32_t radius, int32_t angle, Rect b, uint32_t fast) {
                return fx_twirl(s, o, w, h, cx, cy, radius, angle, b.left, b.right, b.top, b.bottom,
                                fast);
              });
  EXPECT_GOLDEN("twirl", d, 0x4c3d888052e5b48aull);
}

}  // namespace
