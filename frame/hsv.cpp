// HSV conversion: the exported functions and their two reciprocal tables.
#include "frame/hsv.h"

#include "frame/table.h"

namespace {

// 16.16 reciprocal of i, truncated; 0 for i = 0 (only ever read with a non-zero difference).
constexpr uint32_t delta_entry(uint32_t i) { return i == 0 ? 0 : 65536u / i; }

// 60 degrees per sector divided by i.
constexpr uint32_t delta2_entry(uint32_t i) { return 60u * delta_entry(i); }

}  // namespace

extern "C" {

constinit const uint32_t LUT_DELTA[256] = {PFX_TABLE_256(delta_entry, 0u)};
constinit const uint32_t LUT_DELTA2[256] = {PFX_TABLE_256(delta2_entry, 0u)};

void fx_rgb2hsv(int32_t r, int32_t g, int32_t b, int32_t* h, int32_t* s, int32_t* v) {
  // Channels index the reciprocal tables, so a caller's out-of-range value is held to 0..255
  // rather than read outside them.
  const pfx::Hsv hsv = pfx::rgb_to_hsv(pfx::clamp_byte(r), pfx::clamp_byte(g), pfx::clamp_byte(b));
  if (h) *h = hsv.h;
  if (s) *s = hsv.s;
  if (v) *v = hsv.v;
}

void fx_hsv2rgb(int32_t h, int32_t s, int32_t v, int32_t* r, int32_t* g, int32_t* b) {
  const pfx::Rgb rgb = pfx::hsv_to_rgb(h, s, v);
  if (r) *r = rgb.r;
  if (g) *g = rgb.g;
  if (b) *b = rgb.b;
}

}  // extern "C"
