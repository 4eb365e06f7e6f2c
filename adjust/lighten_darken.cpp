// Lighten and darken brushes.
//
// Each call edits one image in place inside an open disc around (cx, cy): every colour channel
// moves by about strength x (1 - d^2 / R^2), strongest at the centre and nothing at the rim.
// Lighten never darkens a channel and darken never lightens one. Every pixel inside the disc
// comes out opaque, even where its colour does not change; pixels outside it are never touched.
#include <cstddef>
#include <cstdint>

#include "frame/frame.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

constexpr int64_t max64(int64_t a, int64_t b) { return a > b ? a : b; }
constexpr int64_t min64(int64_t a, int64_t b) { return a < b ? a : b; }

// One channel: the weighted mean of c (weight d^2) and c +- strength (weight R^2 - d^2), scaled
// by inv = 2^22 / R^2 and shifted back. The two weights are multiplied by inv first, which is the
// same exact product regrouped: each is then at most 2^22, so with any strength the sums stay far
// inside 64 bits, and with the intended strengths (0..255) and radii they equal the 32-bit
// products exactly.
template <bool kLighten>
int32_t brush_channel(int32_t c, int64_t strength, int64_t far_weight, int64_t near_weight) {
  const int64_t target = kLighten ? c + strength : c - strength;
  const int64_t v = (c * far_weight + target * near_weight) >> 22;
  if (kLighten) {
    const int64_t up = v < 255 ? v : 255;
    return static_cast<int32_t>(up > c ? up : c);
  }
  const int64_t down = v > 0 ? v : 0;
  return static_cast<int32_t>(down < c ? down : c);
}

template <bool kLighten>
void rub(uint32_t* image, int32_t cx, int32_t cy, int32_t width, int32_t height, int32_t strength,
         int32_t radius) {
  // A radius of 0 or less has no pixel strictly inside it; returning here also keeps the
  // reciprocal below from dividing by zero.
  if (image == nullptr || radius <= 0) return;
  const int64_t n = pixel_count(width, height);
  if (n == 0 || n > kMaxPixels) return;

  const int64_t r2 = int64_t{radius} * radius;
  // Integer floor of 2^22 / R^2; the same value a single-precision quotient gives for every
  // radius up to 4096, and 0 beyond 2048.
  const int64_t inv = 4194304 / r2;
  // The square around the centre, clipped to the image; the centre may lie outside it.
  const int64_t x0 = max64(int64_t{cx} - radius, 0), x1 = min64(int64_t{cx} + radius, width - 1);
  const int64_t y0 = max64(int64_t{cy} - radius, 0), y1 = min64(int64_t{cy} + radius, height - 1);

  for (int64_t y = y0; y <= y1; ++y) {
    const int64_t dy = cy - y;
    uint32_t* row = image + static_cast<size_t>(y) * static_cast<size_t>(width);
    for (int64_t x = x0; x <= x1; ++x) {
      const int64_t dx = cx - x;
      const int64_t d2 = dx * dx + dy * dy;  // |dx|, |dy| <= radius < 2^31: no overflow
      if (d2 >= r2) continue;
      const int64_t far_weight = d2 * inv;
      const int64_t near_weight = (r2 - d2) * inv;
      const uint32_t p = row[x];
      const int32_t r = brush_channel<kLighten>(red_of(p), strength, far_weight, near_weight);
      const int32_t g = brush_channel<kLighten>(green_of(p), strength, far_weight, near_weight);
      const int32_t b = brush_channel<kLighten>(blue_of(p), strength, far_weight, near_weight);
      row[x] = pack(0xFF000000u, r, g, b);
    }
  }
}

}  // namespace
}  // namespace pfx

extern "C" {

void fx_apply_lighten(uint32_t* image, int32_t cx, int32_t cy, int32_t width, int32_t height,
                      int32_t strength, int32_t radius) {
  pfx::rub<true>(image, cx, cy, width, height, strength, radius);
}

void fx_apply_darken(uint32_t* image, int32_t cx, int32_t cy, int32_t width, int32_t height,
                     int32_t strength, int32_t radius) {
  pfx::rub<false>(image, cx, cy, width, height, strength, radius);
}

void rubLighten(uint32_t* image, int32_t cx, int32_t cy, int32_t width, int32_t height,
                int32_t strength, int32_t radius) {
  fx_apply_lighten(image, cx, cy, width, height, strength, radius);
}

void rubDarken(uint32_t* image, int32_t cx, int32_t cy, int32_t width, int32_t height,
               int32_t strength, int32_t radius) {
  fx_apply_darken(image, cx, cy, width, height, strength, radius);
}

}  // extern "C"
