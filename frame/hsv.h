// HSV conversion of one pixel's colour, integer and 16.16 fixed point, with reciprocal tables in
// place of divisions. Inline so that the per-pixel loops of hue, colour tone, pop art and soft
// glow compile it into their own bodies.
//
// Hue is whole degrees (rgb_to_hsv gives 0..360), saturation a 16.16 fraction (0..65536) and
// value the largest channel, 0..255.
#pragma once

#include <cstdint>

#include "fixmath/fixed.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {

struct Hsv {
  int32_t h, s, v;
};

struct Rgb {
  int32_t r, g, b;
};

// r, g and b must be in 0..255: they index the reciprocal tables.
inline Hsv rgb_to_hsv(int32_t r, int32_t g, int32_t b) {
  int32_t mx = r > g ? r : g;  // ties go to green here; the hue test below starts with red
  int32_t mn = r < g ? r : g;
  if (b > mx) mx = b;
  if (b < mn) mn = b;
  const int32_t s = mx != 0 ? static_cast<int32_t>(LUT_DELTA[mx]) * (mx - mn) : 0;
  int32_t h = 0;
  if (s != 0) {
    const int32_t d = mx - mn;
    const int32_t per = static_cast<int32_t>(LUT_DELTA2[d]);  // signed: the differences may be < 0
    int32_t hf;
    if (r == mx) {
      hf = per * (g - b);
    } else if (g == mx) {
      hf = itofix(120) + per * (b - r);
    } else {
      hf = itofix(240) + per * (r - g);
    }
    if (hf < 0) hf += itofix(360);
    h = fixtoi(hf);
  }
  return {h, s, mx};
}

// Any arguments are accepted; the products wrap like the 32-bit words they are specified as, so
// out-of-range saturation or value give garbage colours but never undefined behaviour. Hues
// outside 0..360, and negative hues with s != 0, give black.
inline Rgb hsv_to_rgb(int32_t h, int32_t s, int32_t v) {
  if (s == 0) return h >= 0 ? Rgb{v, v, v} : Rgb{0, 0, 0};
  if (h == 360) h = 0;
  // 1092 is 65536 / 60 truncated, so each sector starts a little above its multiple of 60.
  const int32_t x = wrap_mul(1092, h);
  const int32_t sector = x >> 16;
  const int32_t f = wrap_sub(x, itofix(sector));
  const int32_t p = fixtoi(wrap_mul(v, wrap_sub(kFixOne, s)));
  const int32_t q = fixtoi(wrap_mul(v, wrap_sub(kFixOne, wrap_mul(s >> 4, f >> 4) >> 8)));
  const int32_t t =
      fixtoi(wrap_mul(v, wrap_sub(kFixOne, wrap_mul(s >> 4, wrap_sub(kFixOne, f) >> 4) >> 8)));
  switch (sector) {
    case 0:
      return {v, t, p};
    case 1:
      return {q, v, p};
    case 2:
      return {p, v, t};
    case 3:
      return {p, q, v};
    case 4:
      return {t, p, v};
    case 5:
      return {v, p, q};
    default:
      return {0, 0, 0};
  }
}

}  // namespace pfx
