// Reference versions of the per-pixel effects: the plain scalar code the library ran before its
// pixel loops were rewritten for speed (tables where the rule has them, branches where it
// branches, one pass per adjustment). The equivalence tests hold the fast paths to these, bit
// for bit. Nothing here is meant to be fast.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "photofx.h"

namespace pfx::reference {

using Pixels = std::vector<uint32_t>;

inline int32_t red(uint32_t p) { return static_cast<int32_t>((p >> 16) & 0xFF); }
inline int32_t green(uint32_t p) { return static_cast<int32_t>((p >> 8) & 0xFF); }
inline int32_t blue(uint32_t p) { return static_cast<int32_t>(p & 0xFF); }
inline int32_t clamp(int64_t v, int64_t lo, int64_t hi) {
  return static_cast<int32_t>(v < lo ? lo : (v > hi ? hi : v));
}
inline int32_t byte(int64_t v) { return clamp(v, 0, 255); }
inline uint32_t pack(uint32_t p, int32_t r, int32_t g, int32_t b) {
  return (p & 0xFF000000u) | (static_cast<uint32_t>(r & 0xFF) << 16) |
         (static_cast<uint32_t>(g & 0xFF) << 8) | static_cast<uint32_t>(b & 0xFF);
}

// ---- YCbCr, brightness, contrast, saturation, temperature ------------------------------------

struct YCbCr {
  int32_t y, cb, cr;
};

inline YCbCr to_ycbcr(int32_t r, int32_t g, int32_t b) {
  return {(77 * r + 150 * g + 29 * b) >> 8, (128 * b - 43 * r - 85 * g) >> 8,
          (128 * r - 107 * g - 21 * b) >> 8};
}

inline uint32_t from_ycbcr(uint32_t p, int32_t y, int32_t cb, int32_t cr) {
  return pack(p, byte(y + ((359 * cr) >> 8)), byte(y - ((88 * cb + 183 * cr) >> 8)),
              byte(y + ((454 * cb) >> 8)));
}

inline int32_t level_steps(int32_t level) { return clamp(level, -990, 1010) - 10; }

inline uint32_t brightness(uint32_t p, int32_t level) {
  const YCbCr c = to_ycbcr(red(p), green(p), blue(p));
  return from_ycbcr(p, c.y + 10 * level_steps(level), c.cb, c.cr);
}

// The step table: (c - 128) / 10 rounded away from zero.
inline int32_t contrast_step(int32_t c) {
  return c < 128 ? -((128 - c + 9) / 10) : (c - 128 + 9) / 10;
}

inline int32_t contrast_channel(int32_t c, int32_t level) {
  const int32_t v = level_steps(level) * contrast_step(c) + c;
  if (c <= 127) return v > 127 ? 128 : (v < 0 ? 0 : v);
  return v > 254 ? 255 : (v < 128 ? 128 : v);
}

inline uint32_t contrast(uint32_t p, int32_t level) {
  return pack(p, contrast_channel(red(p), level), contrast_channel(green(p), level),
              contrast_channel(blue(p), level));
}

inline uint32_t saturation(uint32_t p, int32_t level) {
  const int32_t s = clamp(103 * (clamp(level, 0, 20) - 10) + 1024, 0, 2048);
  const int32_t k = 1024 - s;
  const int32_t wr = (316 * k) >> 10, wg = (624 * k) >> 10, wb = (84 * k) >> 10;
  const int32_t r = red(p), g = green(p), b = blue(p);
  return pack(p, byte((r * (wr + s) + g * wg + b * wb) >> 10),
              byte((r * wr + g * (wg + s) + b * wb) >> 10),
              byte((r * wr + g * wg + b * (wb + s)) >> 10));
}

inline int32_t signed_shift(int32_t control) {
  const int32_t diff = control - 128;
  const int32_t magnitude = (512 * (diff < 0 ? -diff : diff) + 256) >> 9;
  return control > 127 ? magnitude : -magnitude;
}

inline uint32_t temperature(uint32_t p, int32_t level) {
  const int32_t a = 128 + 3 * (10 - clamp(level, -990, 1010));
  const int32_t u = 235 - ((858 * a) >> 10);
  const YCbCr c = to_ycbcr(red(p), green(p), blue(p));
  return from_ycbcr(p, c.y, c.cb + signed_shift(a), c.cr + signed_shift(u));
}

// ---- Exposure, faded colour, invert, gains --------------------------------------------------

inline uint32_t exposure(uint32_t p, int32_t level) {
  const int64_t factor = int64_t{level} * 655360 / 100;
  auto channel = [&](int32_t c) {
    const int64_t x = c * factor;
    return byte((x >> 16) + ((x >> 15) & 1));
  };
  return pack(p, channel(red(p)), channel(green(p)), channel(blue(p)));
}

inline uint32_t faded(uint32_t p, int32_t level) {
  auto channel = [&](int32_t c, int32_t k, int32_t o) {
    const int32_t v = (255 * c * (100 - level) + (k * c + o) * level) / 25500;
    return v > 255 ? 255 : v;
  };
  return pack(p, channel(red(p), 141, 26520), channel(green(p), 188, 13260),
              channel(blue(p), 107, 18360));
}

inline uint32_t invert(uint32_t p) { return pack(p, 255 - red(p), 255 - green(p), 255 - blue(p)); }

inline uint32_t gains(uint32_t p, int32_t red_level, int32_t green_level, int32_t blue_level) {
  const int64_t dr = red_level - int64_t{10}, dg = green_level - int64_t{10},
                db = blue_level - int64_t{10};
  return pack(p, byte(red(p) + 6 * dr - 3 * dg - 3 * db), byte(green(p) - 3 * dr + 6 * dg - 3 * db),
              byte(blue(p) - 3 * dr - 3 * dg + 6 * db));
}

// ---- Greyscale and sepia ------------------------------------------------------------------

inline uint32_t greyscale(uint32_t p, int32_t level) {
  const int64_t gain = (int64_t{level} - 10) * 4000 + 65536;
  const int64_t mean = (red(p) + green(p) + blue(p)) / 3;
  const int32_t v = byte((mean * gain) >> 16);
  return (p & 0xFF000000u) | static_cast<uint32_t>(v) * 0x010101u;
}

inline int32_t sepia_red(int32_t v) {
  int32_t offset;
  if (v <= 128) {
    offset = v == 43 ? 10 : (v + 1) >> 2;
  } else if (v == 133) {
    offset = 31;
  } else if (v == 137) {
    offset = 30;
  } else {
    offset = (256 - v) >> 2;
  }
  return v + offset;
}

inline int32_t sepia_blue(int32_t v) {
  int32_t offset = 0;
  if (v >= 1 && v <= 128) {
    offset = (v - 1) >> 2;
  } else if (v >= 129) {
    offset = (254 - v) >> 2;
    if (offset < 0) offset = 0;
  }
  return v - offset;
}

inline uint32_t sepia(uint32_t p) {
  return pack(p, sepia_red(red(p)), green(p), sepia_blue(blue(p)));
}

// ---- Levels -------------------------------------------------------------------------------

inline uint32_t on_channels(uint32_t p, int32_t channel,
                            int32_t (*curve)(int32_t, int32_t, int32_t), int32_t low,
                            int32_t high) {
  const bool r = channel == 0 || channel == 1, g = channel == 0 || channel == 2,
             b = channel == 0 || channel == 3;
  return pack(p, r ? curve(red(p), low, high) : red(p), g ? curve(green(p), low, high) : green(p),
              b ? curve(blue(p), low, high) : blue(p));
}

inline int32_t levels_in(int32_t c, int32_t low, int32_t high) {
  const int64_t scale = 261120 / (int64_t{high} - low);
  return byte((scale * (c - int64_t{low})) >> 10);
}

inline int32_t levels_out(int32_t c, int32_t low, int32_t high) {
  const int64_t scale = (int64_t{high} - low) * 1024 / 255;
  return byte(((scale * c) >> 10) + low);
}

// ---- HSV, as first written: branches and the reciprocal tables ----------------------------

struct Hsv {
  int32_t h, s, v;
};

inline int32_t fixtoi(int32_t x) { return (x >> 16) + ((x >> 15) & 1); }
inline int32_t wrap(int64_t x) { return static_cast<int32_t>(static_cast<uint32_t>(x)); }

inline Hsv rgb_to_hsv(int32_t r, int32_t g, int32_t b) {
  int32_t mx = r > g ? r : g;
  int32_t mn = r < g ? r : g;
  if (b > mx) mx = b;
  if (b < mn) mn = b;
  const int32_t s = mx != 0 ? static_cast<int32_t>(LUT_DELTA[mx]) * (mx - mn) : 0;
  int32_t h = 0;
  if (s != 0) {
    const int32_t per = static_cast<int32_t>(LUT_DELTA2[mx - mn]);
    int32_t hf;
    if (r == mx) {
      hf = per * (g - b);
    } else if (g == mx) {
      hf = 120 * 65536 + per * (b - r);
    } else {
      hf = 240 * 65536 + per * (r - g);
    }
    if (hf < 0) hf += 360 * 65536;
    h = fixtoi(hf);
  }
  return {h, s, mx};
}

inline void hsv_to_rgb(int32_t h, int32_t s, int32_t v, int32_t* r, int32_t* g, int32_t* b) {
  *r = *g = *b = 0;
  if (s == 0) {
    if (h >= 0) *r = *g = *b = v;
    return;
  }
  if (h == 360) h = 0;
  const int32_t x = wrap(int64_t{1092} * h);
  const int32_t sector = x >> 16;
  const int32_t f = wrap(int64_t{x} - int64_t{sector} * 65536);
  const int32_t p = fixtoi(wrap(int64_t{v} * (65536 - int64_t{s})));
  const int32_t q = fixtoi(wrap(int64_t{v} * (65536 - (wrap(int64_t{s >> 4} * (f >> 4)) >> 8))));
  const int32_t t = fixtoi(
      wrap(int64_t{v} * (65536 - (wrap(int64_t{s >> 4} * (wrap(65536 - int64_t{f}) >> 4)) >> 8))));
  switch (sector) {
    case 0:
      *r = v, *g = t, *b = p;
      break;
    case 1:
      *r = q, *g = v, *b = p;
      break;
    case 2:
      *r = p, *g = v, *b = t;
      break;
    case 3:
      *r = p, *g = q, *b = v;
      break;
    case 4:
      *r = t, *g = p, *b = v;
      break;
    case 5:
      *r = v, *g = p, *b = q;
      break;
    default:
      break;
  }
}

inline uint32_t hue(uint32_t p, int32_t level) {
  const int32_t shift = 18 * (clamp(level, -90, 110) - 10);
  if (shift == 0) return p;
  const Hsv hsv = rgb_to_hsv(red(p), green(p), blue(p));
  int32_t h = hsv.h + shift;
  if (h < 0) h += 360;
  if (h > 359) h -= 360;
  int32_t r, g, b;
  hsv_to_rgb(h, hsv.s, hsv.v, &r, &g, &b);
  return pack(p, r, g, b);
}

inline uint32_t colour_tone(uint32_t p, int32_t hue_degrees) {
  const Hsv hsv = rgb_to_hsv(red(p), green(p), blue(p));
  const int32_t v = byte(((hsv.v * hsv.v * 50) / 128 + 50 * hsv.v) / 100);
  int32_t r, g, b;
  hsv_to_rgb(hue_degrees, 19660, v, &r, &g, &b);
  return pack(p, r, g, b);
}

// The pop-art preview's recolouring of one pixel in a quadrant of the given hue.
inline uint32_t pop_art_preview_recolour(uint32_t s, int32_t quadrant_hue) {
  const Hsv hsv = rgb_to_hsv(red(s), green(s), blue(s));
  const int32_t sat = hsv.s + 10000 > 65535 ? 65535 : hsv.s + 10000;
  int32_t r, g, b;
  hsv_to_rgb(quadrant_hue, sat, hsv.v, &r, &g, &b);
  return pack(s, r, g, b);
}

inline Pixels pop_art_preview(const Pixels& src, int32_t width, int32_t height) {
  static constexpr int32_t kHue[4] = {45, 300, 180, 90};
  const size_t w = static_cast<size_t>(width), h = static_cast<size_t>(height);
  const size_t qw = (w + 1) / 2, qh = (h + 1) / 2;
  Pixels dst(src.size());
  for (size_t y = 0; y < h; ++y) {
    for (size_t x = 0; x < w; ++x) {
      const size_t sx = x < qw ? x : x - qw, sy = y < qh ? y : y - qh;
      const int32_t quadrant = (y < qh ? 0 : 2) + (x < qw ? 0 : 1);
      dst[y * w + x] = pop_art_preview_recolour(src[2 * sy * w + 2 * sx], kHue[quadrant]);
    }
  }
  return dst;
}

// Soft glow over separate buffers: every selected pixel from the untouched source.
inline uint32_t soft_glow_pixel(const Pixels& src, int32_t width, int32_t height, int32_t x,
                                int32_t y, int32_t level) {
  static constexpr int32_t kDx[8] = {-1, 0, 1, -1, 1, -1, 0, 1};
  static constexpr int32_t kDy[8] = {-1, -1, -1, 0, 0, 1, 1, 1};
  static constexpr int32_t kShift[8] = {0, 2, 0, 2, 2, 0, 2, 0};
  const uint32_t p = src[static_cast<size_t>(y) * static_cast<size_t>(width) + x];
  int32_t r = red(p), g = green(p), b = blue(p);
  if (x >= 1 && x < width - 1 && y >= 1 && y < height - 1) {
    r <<= 4, g <<= 4, b <<= 4;
    for (int32_t k = 0; k < 8; ++k) {
      const uint32_t q =
          src[static_cast<size_t>(y + kDy[k]) * static_cast<size_t>(width) + (x + kDx[k])];
      r += red(q) << kShift[k], g += green(q) << kShift[k], b += blue(q) << kShift[k];
    }
    r /= 36, g /= 36, b /= 36;
  }
  const Hsv hsv = rgb_to_hsv(r, g, b);
  const int32_t v = byte(((level * hsv.v * hsv.v) / 128 + (100 - level) * hsv.v) / 100);
  int32_t nr, ng, nb;
  hsv_to_rgb(hsv.h, hsv.s, v, &nr, &ng, &nb);
  return pack(p, nr, ng, nb);
}

}  // namespace pfx::reference
