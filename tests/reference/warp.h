// Reference warps: the plain per-pixel twirl and sphericity, one pixel at a time with 64-bit
// arithmetic and a division wherever the rule has one, exactly as the library first computed
// them. The optimised warps must give the same words for every input; the equivalence tests
// compare the two. Only the exported tables are shared with the library.
#pragma once

#include <cstddef>
#include <cstdint>

#include "photofx.h"

namespace pfx::reference {

inline uint32_t blend(uint32_t fx, uint32_t fy, uint32_t p00, uint32_t p10, uint32_t p01,
                      uint32_t p11) {
  const uint32_t gx = 2048 - fx, gy = 2048 - fy;
  uint32_t out = 0xFF000000u;
  for (int32_t shift = 0; shift <= 16; shift += 8) {
    const uint32_t c00 = (p00 >> shift) & 255, c10 = (p10 >> shift) & 255,
                   c01 = (p01 >> shift) & 255, c11 = (p11 >> shift) & 255;
    const uint32_t top = gx * c00 + fx * c10, bottom = gx * c01 + fx * c11;
    out |= ((top * gy + bottom * fy) >> 22) << shift;
  }
  return out;
}

inline uint32_t fatan2(int32_t a, int32_t b) {
  if (b == 0) return a > 0 ? 0x2D00000u : (a < 0 ? 0x8700000u : 0);
  if (a == 0) return b > 0 ? 0 : 0x5A00000u;
  const uint32_t ax = b < 0 ? 0u - static_cast<uint32_t>(b) : static_cast<uint32_t>(b);
  const uint32_t ay = a < 0 ? 0u - static_cast<uint32_t>(a) : static_cast<uint32_t>(a);
  const bool steep = ay > ax;
  const uint32_t lo = steep ? ax : ay, hi = steep ? ay : ax;
  const uint32_t index = (lo * (0x20000000u / hi)) >> 18;
  uint32_t t = index == 2048 ? 0x1680000u : static_cast<uint32_t>(ATAN[index]);
  if (steep) t = 0x2D00000u - t;
  if (b > 0) {
    if (a >= 0) return t;
    return t == 0 ? 0 : 0xB400000u - t;
  }
  return a < 0 ? 0x5A00000u + t : 0x5A00000u - t;
}

struct SourcePoint {
  int64_t x, y;
  uint32_t fx, fy;
};

inline uint32_t sample(const uint32_t* src, int32_t width, int32_t height, const SourcePoint& p) {
  const auto hold = [](int64_t v, int32_t size) {
    return static_cast<size_t>(v < 0 ? 0 : (v > size - 1 ? size - 1 : v));
  };
  const size_t w = static_cast<size_t>(width);
  const size_t xa = hold(p.x, width), xb = hold(p.x + 1, width);
  const size_t ya = hold(p.y, height) * w, yb = hold(p.y + 1, height) * w;
  return blend(p.fx, p.fy, src[ya + xa], src[ya + xb], src[yb + xa], src[yb + xb]);
}

// Every pixel of the window (clipped to the image) in turn; fast mode fills 2 x 2 blocks from
// every second warped pixel of every second row, each whole as far as the image reaches, even
// one past the window. dst starts as a copy of src.
template <class Locate>
void warp_window(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t left,
                 int32_t right, int32_t top, int32_t bottom, bool fast, const Locate& locate) {
  for (size_t i = 0; i < static_cast<size_t>(width) * static_cast<size_t>(height); ++i) {
    dst[i] = src[i];
  }
  if (left < 0) left = 0;
  if (top < 0) top = 0;
  if (right > width - 1) right = width - 1;
  if (bottom > height - 1) bottom = height - 1;
  const size_t stride = static_cast<size_t>(width);
  for (int32_t y = top; y <= bottom; y += fast ? 2 : 1) {
    uint32_t* row = dst + static_cast<size_t>(y) * stride;
    for (int32_t x = left; x <= right;) {
      SourcePoint p{};
      if (!locate(x, y, p)) {
        ++x;
        continue;
      }
      const uint32_t value = sample(src, width, height, p);
      const size_t i = static_cast<size_t>(x);
      row[i] = value;
      if (!fast) {
        ++x;
        continue;
      }
      if (x + 1 < width) row[i + 1] = value;
      if (y + 1 < height) row[stride + i] = value;
      if (x + 1 < width && y + 1 < height) row[stride + i + 1] = value;
      x += 2;
    }
  }
}

// The twirl of an argument set the library accepts (checked by the caller).
inline void twirl(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t cx,
                  int32_t cy, int32_t radius, int32_t angle, int32_t left, int32_t right,
                  int32_t top, int32_t bottom, bool fast) {
  const int64_t rr = int64_t{radius} * radius;
  const int64_t inv_rr = radius <= 4095 ? (int64_t{1} << 30) / rr : (int64_t{1} << 62) / rr;
  const int32_t inv_shift = radius <= 4095 ? 8 : 40;
  const int64_t turn = angle < 0 ? -int64_t{angle} : angle;
  const auto rho_of = [](int64_t u) -> int64_t {
    if (u <= 127) return SQRT_STEP_1[u];
    if ((u >> 2) <= 511) return SQRT_STEP_2[(u >> 2) - 32];
    if ((u >> 3) <= 1023) return SQRT_STEP_3[(u >> 3) - 256];
    return SQRT_STEP_4[u >> 6];
  };
  const auto sin_of = [](int64_t k) -> int64_t {
    if (k <= 4096) return SIN[k];
    if (k <= 8191) return SIN[8192 - k];
    if (k <= 12288) return -SIN[k - 8192];
    return -SIN[16384 - k];
  };
  const auto cos_of = [](int64_t k) -> int64_t {
    if (k <= 4096) return SIN[4096 - k];
    if (k <= 8191) return -SIN[k - 4096];
    if (k <= 12288) return -SIN[12288 - k];
    return SIN[k - 12288];
  };
  // Coordinate and 25-bit weight at distance D along an axis with sine or cosine v.
  const auto offset = [](int64_t centre, int64_t D, int64_t v, int64_t& coord) -> uint32_t {
    const int64_t magnitude = v < 0 ? -v : v;
    const int64_t T = magnitude * (128 * (D >> 16) + ((D >> 8) & 255) + (D & 255));
    const int64_t I = T >> 25, F = T & ((int64_t{1} << 25) - 1);
    coord = v >= 0 ? centre + I : centre - I - 1;
    return static_cast<uint32_t>((v >= 0 ? F : (int64_t{1} << 25) - F) >> 14);
  };
  const auto locate = [&](int32_t x, int32_t y, SourcePoint& p) {
    const int64_t dx = x - int64_t{cx}, dy = y - int64_t{cy};
    const int64_t d2 = dx * dx + dy * dy;
    if (d2 >= rr) return false;
    const int64_t rho = rho_of((d2 * inv_rr) >> inv_shift);
    const int64_t D = radius * rho;
    const int64_t theta = fatan2(static_cast<int32_t>(dx), static_cast<int32_t>(dy));
    const int64_t twist = ((int64_t{1} << 19) - rho) * turn;
    const int64_t full = 0xB400000;
    const int64_t turned = (angle < 0 ? theta + full - twist : theta + twist) % full;
    const int64_t k = (turned / 360) >> 5;
    p.fx = offset(cx, D, sin_of(k), p.x);
    p.fy = offset(cy, D, cos_of(k), p.y);
    return true;
  };
  if (angle == 0) {
    for (size_t i = 0; i < static_cast<size_t>(width) * static_cast<size_t>(height); ++i) {
      dst[i] = src[i];
    }
    return;
  }
  warp_window(src, dst, width, height, left, right, top, bottom, fast, locate);
}

// The sphericity of an argument set the library accepts (checked by the caller).
inline void sphericity(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                       int32_t cx, int32_t cy, int32_t radius, int32_t level, int32_t left,
                       int32_t right, int32_t top, int32_t bottom, bool fast) {
  // (radius^2 * 500 + 128) >> 8 without overflow: radius^2 split at 64.
  const uint64_t r2 = static_cast<uint64_t>(radius) * static_cast<uint64_t>(radius);
  const int64_t rim = static_cast<int64_t>((r2 >> 6) * 125u + (((r2 & 63u) * 125u + 32u) >> 6));
  const int64_t inv_rim = (int64_t{1} << 30) / rim;
  const int64_t one = int64_t{1} << 18;
  const auto locate = [&](int32_t x, int32_t y, SourcePoint& p) {
    const int64_t dx = x - int64_t{cx}, dy = y - int64_t{cy};
    const int64_t d2 = dx * dx + dy * dy;
    if (d2 > rim) return false;
    const int64_t t = (d2 * inv_rim) >> 22;
    const int64_t e = (t >= 256 ? 0 : EXP_n7[t]) >> 7;
    if (level < 0) {
      const int64_t k = (30 * -int64_t{level} * e) >> 12;
      const int64_t sx = x * one + k * dx, sy = y * one + k * dy;
      p.x = sx >> 18;
      p.y = sy >> 18;
      p.fx = static_cast<uint32_t>((sx & (one - 1)) >> 7);
      p.fy = static_cast<uint32_t>((sy & (one - 1)) >> 7);
    } else {
      const int64_t k = (75 * int64_t{level} * e) >> 12;
      const int64_t den = k + one;
      const int64_t nx = x * one + cx * k, ny = y * one + cy * k;
      p.x = nx / den;
      p.y = ny / den;
      const int64_t q = (int64_t{1} << 30) / den;
      p.fx = static_cast<uint32_t>((q * (nx - p.x * den)) >> 19);
      p.fy = static_cast<uint32_t>((q * (ny - p.y * den)) >> 19);
    }
    return true;
  };
  warp_window(src, dst, width, height, left, right, top, bottom, fast, locate);
}

}  // namespace pfx::reference
