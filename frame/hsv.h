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

// Both conversions are written with selects instead of branches, which lets the pixel loops
// that call them vectorise (the table reads become gathers) and spares them the mispredicted
// branches that the channel order and the hue sector of a photograph's pixels would cause.

// LUT_DELTA[i] by single-precision division, for i in 0..255. Where the quotient 65536 / i is
// not whole it lies at least 1 / i from the next whole number, and its rounding error is below
// 1 / (256 i), so truncation gives the table's entry. For loops that vectorise only without
// table reads: WebAssembly's SIMD has no gathers.
inline int32_t divided_reciprocal(int32_t i) {
  return i == 0 ? 0 : static_cast<int32_t>(65536.0f / static_cast<float>(i));
}

// Where rgb_to_hsv takes its reciprocals from: the same numbers either way.
enum class Reciprocals { kTables, kDivision };

// r, g and b must be in 0..255: they index the reciprocal tables.
template <Reciprocals kFrom = Reciprocals::kTables>
inline Hsv rgb_to_hsv(int32_t r, int32_t g, int32_t b) {
  const int32_t rg_max = r > g ? r : g, rg_min = r < g ? r : g;
  const int32_t mx = rg_max > b ? rg_max : b, mn = rg_min < b ? rg_min : b;
  const int32_t d = mx - mn;
  const bool divide = kFrom == Reciprocals::kDivision;
  // LUT_DELTA[0] is 0, so a black pixel gets s = 0 without a test.
  const int32_t s = (divide ? divided_reciprocal(mx) : static_cast<int32_t>(LUT_DELTA[mx])) * d;
  // Signed: the channel differences may be negative. For a grey (d = 0) LUT_DELTA2[0] is 0 and
  // red is the largest channel, so the hue comes out 0 as it should.
  const int32_t per = divide ? 60 * divided_reciprocal(d) : static_cast<int32_t>(LUT_DELTA2[d]);
  // Ties go to red first, then green.
  int32_t hf = r == mx   ? per * (g - b)
               : g == mx ? itofix(120) + per * (b - r)
                         : itofix(240) + per * (r - g);
  hf += hf < 0 ? itofix(360) : 0;
  return {fixtoi(hf), s, mx};
}

// Any arguments are accepted; the products wrap like the 32-bit words they are defined as, so
// out-of-range saturation or value give garbage colours but never undefined behaviour. Hues
// outside 0..360, and negative hues with s != 0, give black.
inline Rgb hsv_to_rgb(int32_t h, int32_t s, int32_t v) {
  if (h == 360) h = 0;
  // 1092 is 65536 / 60 truncated, so each sector starts a little above its multiple of 60.
  const int32_t x = wrap_mul(1092, h);
  const int32_t sector = x >> 16;
  const int32_t f = wrap_sub(x, itofix(sector));
  const int32_t p = fixtoi(wrap_mul(v, wrap_sub(kFixOne, s)));
  const int32_t q = fixtoi(wrap_mul(v, wrap_sub(kFixOne, wrap_mul(s >> 4, f >> 4) >> 8)));
  const int32_t t =
      fixtoi(wrap_mul(v, wrap_sub(kFixOne, wrap_mul(s >> 4, wrap_sub(kFixOne, f) >> 4) >> 8)));
  // Sector: 0 (v, t, p), 1 (q, v, p), 2 (p, v, t), 3 (p, q, v), 4 (t, p, v), 5 (v, p, q); any
  // other sector is black. Each channel's column is packed two bits per sector (v 0, q 1, p 2,
  // t 3) and picked by shifting: a chain of tests on the sector would be turned into a switch,
  // which does not vectorise.
  const bool in_range = (sector >= 0) & (sector <= 5);
  const int32_t at = in_range ? 2 * sector : 0;
  auto pick = [&](int32_t column) {
    const int32_t code = (column >> at) & 3;
    const int32_t low = (code & 1) != 0 ? q : v;
    const int32_t high = (code & 1) != 0 ? t : p;
    return in_range ? ((code & 2) != 0 ? high : low) : 0;
  };
  constexpr int32_t kRedColumn = 0 | 1 << 2 | 2 << 4 | 2 << 6 | 3 << 8 | 0 << 10;
  constexpr int32_t kGreenColumn = 3 | 0 << 2 | 0 << 4 | 1 << 6 | 2 << 8 | 2 << 10;
  constexpr int32_t kBlueColumn = 2 | 2 << 2 | 3 << 4 | 0 << 6 | 0 << 8 | 1 << 10;
  const int32_t r = pick(kRedColumn), g = pick(kGreenColumn), b = pick(kBlueColumn);
  // No saturation: grey of the value, or black for a negative hue, whatever the sector.
  const bool grey = s == 0;
  const int32_t grey_value = h >= 0 ? v : 0;
  return {grey ? grey_value : r, grey ? grey_value : g, grey ? grey_value : b};
}

}  // namespace pfx
