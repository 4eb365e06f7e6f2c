// Shared machinery of the warps: the bilinear blend, the fast arctangent, clamped sampling of
// the source and the window loop with its fast mode. Sphericity and twirl differ only in how a
// destination pixel finds its source position; everything around that lives here.
#pragma once

#include <cstdint>

#include "frame/frame.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {

constexpr uint32_t kBilinearOne = 2048;  // a whole pixel in bilinear weights

// Warp angles: degrees with 19 fraction bits.
constexpr uint32_t kAngle45 = 0x1680000u;
constexpr uint32_t kAngle90 = 0x2D00000u;
constexpr uint32_t kAngle180 = 0x5A00000u;
constexpr uint32_t kAngle270 = 0x8700000u;
constexpr uint32_t kAngle360 = 0xB400000u;

// Blend of four neighbours with weights fx, fy in 0..2048, alpha 255. Each channel sum stays
// below 2048 * 2048 * 256 = 2^30, so 32 bits hold it exactly.
constexpr uint32_t blend_bilinear(uint32_t fx, uint32_t fy, uint32_t p00, uint32_t p10,
                                  uint32_t p01, uint32_t p11) {
  const uint32_t gx = kBilinearOne - fx, gy = kBilinearOne - fy;
  const auto blend = [&](int32_t (*channel)(uint32_t)) {
    const uint32_t top =
        gx * static_cast<uint32_t>(channel(p00)) + fx * static_cast<uint32_t>(channel(p10));
    const uint32_t bottom =
        gx * static_cast<uint32_t>(channel(p01)) + fx * static_cast<uint32_t>(channel(p11));
    return static_cast<int32_t>((top * gy + bottom * fy) >> 22);
  };
  return pack(0xFF000000u, blend(red_of), blend(green_of), blend(blue_of));
}

// Angle of the vector (b along 0 degrees, a along 90 degrees) in warp-angle units, from the
// ATAN table of the ratio of the shorter to the longer component.
inline uint32_t fatan2(int32_t a, int32_t b) {
  if (b == 0) return a > 0 ? kAngle90 : (a < 0 ? kAngle270 : 0);
  if (a == 0) return b > 0 ? 0 : kAngle180;
  // Magnitudes as unsigned words, so that INT32_MIN has one (2^31).
  const uint32_t ax = b < 0 ? 0u - static_cast<uint32_t>(b) : static_cast<uint32_t>(b);
  const uint32_t ay = a < 0 ? 0u - static_cast<uint32_t>(a) : static_cast<uint32_t>(a);
  const bool steep = ay > ax;
  const uint32_t lo = steep ? ax : ay, hi = steep ? ay : ax;
  const uint32_t index = (lo * (0x20000000u / hi)) >> 18;  // lo <= hi keeps it within 0..2048
  uint32_t t = index == 2048 ? kAngle45 : static_cast<uint32_t>(ATAN[index]);
  if (steep) t = kAngle90 - t;
  if (b > 0) {
    if (a >= 0) return t;
    // A vector just below the 0-degree axis can read ATAN[0]; that angle is 0, not a full turn.
    return t == 0 ? 0 : kAngle360 - t;
  }
  return a < 0 ? kAngle180 + t : kAngle180 - t;
}

// Where a warped pixel samples the source: the top-left neighbour and the weights toward the
// right and lower neighbours (0..2048). Coordinates may lie anywhere; sampling clamps them.
struct SourcePoint {
  int64_t x, y;
  uint32_t fx, fy;
};

// The four neighbours of p, each coordinate held to the image, blended. Inside the image the
// clamp changes nothing, so one rule covers both cases.
inline uint32_t sample_clamped(const uint32_t* src, int32_t width, int32_t height,
                               const SourcePoint& p) {
  const auto hold = [](int64_t v, int32_t size) {
    return static_cast<size_t>(v < 0 ? 0 : (v > size - 1 ? size - 1 : v));
  };
  const size_t w = static_cast<size_t>(width);
  const size_t xa = hold(p.x, width), xb = hold(p.x + 1, width);
  const size_t ya = hold(p.y, height) * w, yb = hold(p.y + 1, height) * w;
  return blend_bilinear(p.fx, p.fy, src[ya + xa], src[ya + xb], src[yb + xa], src[yb + xb]);
}

// True when the blocks of na and nb words at a and b share any byte.
inline bool buffers_overlap(const uint32_t* a, int64_t na, const uint32_t* b, int64_t nb) {
  const uintptr_t pa = reinterpret_cast<uintptr_t>(a), pb = reinterpret_cast<uintptr_t>(b);
  const uintptr_t ea = pa + static_cast<uintptr_t>(na) * 4,
                  eb = pb + static_cast<uintptr_t>(nb) * 4;
  return na > 0 && nb > 0 && pa < eb && pb < ea;
}

// Checks common to the circle warps: both buffers present and apart, an addressable image and
// a centre inside it.
inline bool warp_args_ok(const uint32_t* src, const uint32_t* dst, int32_t width, int32_t height,
                         int32_t cx, int32_t cy) {
  if (src == nullptr || dst == nullptr) return false;
  if (cx < 0 || cx >= width || cy < 0 || cy >= height) return false;  // also width, height >= 1
  const int64_t n = pixel_count(width, height);
  return n <= kMaxPixels && !buffers_overlap(src, n, dst, n);
}

// Visits the window (clipped to the image) rows top to bottom, columns left to right. For each
// pixel, locate(x, y, point) says whether it is warped and where it samples the source. In fast
// mode a warped pixel's value also fills the pixels right of it, below it and diagonally, as
// far as they lie inside the window, and the scan skips the pixel to its right; rows advance by
// two. Neighbours are always read from src, which the caller has copied into dst beforehand.
template <class Locate>
void warp_window(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, Rect window,
                 bool fast, Locate&& locate) {
  const Rect w = clip_to_image(window, width, height);
  const size_t stride = static_cast<size_t>(width);
  const int32_t row_step = fast ? 2 : 1;
  for (int32_t y = w.top; y <= w.bottom; y += row_step) {
    uint32_t* row = dst + static_cast<size_t>(y) * stride;
    const bool below = fast && y + 1 <= w.bottom;
    for (int32_t x = w.left; x <= w.right;) {
      SourcePoint p{};
      if (!locate(x, y, p)) {
        ++x;
        continue;
      }
      const uint32_t value = sample_clamped(src, width, height, p);
      const size_t i = static_cast<size_t>(x);
      row[i] = value;
      if (!fast) {
        ++x;
        continue;
      }
      const bool right = x + 1 <= w.right;
      if (right) row[i + 1] = value;
      if (below) row[stride + i] = value;
      if (below && right) row[stride + i + 1] = value;
      x += 2;
    }
  }
}

}  // namespace pfx
