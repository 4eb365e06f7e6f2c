// Pop art: a two-by-two poster.
//
// The image is shrunk to half size (every second pixel of every second row) and repeated in the
// four quadrants, each recoloured with its own palette. The full look posterises by brightness:
// a dark colour up to 107, a light colour from 124, and two short ramps between them. The
// preview keeps each pixel's value, raises its saturation a little and paints it in a fixed hue
// per quadrant. For odd sizes the left and top quadrants are one pixel wider or taller.
#include <cstddef>
#include <cstdint>

#include "frame/frame.h"
#include "frame/hsv.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

enum Quadrant { kTopLeft, kTopRight, kBottomLeft, kBottomRight };

struct Colour {
  int32_t r, g, b;
};

// Dark colour (brightness up to 107), end of the lower ramp (115), start of the upper ramp and
// light colour (124 and up). Only the top-right palette starts its upper ramp from a colour
// other than where the lower one ended, so its green jumps between 115 and 116.
struct Palette {
  Colour dark, lower_end, upper_start, light;
};

constexpr Palette kPalettes[4] = {
    {{23, 4, 158}, {254, 0, 26}, {254, 0, 26}, {254, 247, 17}},
    {{4, 0, 17}, {111, 17, 226}, {111, 34, 226}, {131, 255, 192}},
    {{11, 35, 1}, {193, 38, 10}, {193, 38, 10}, {242, 158, 243}},
    {{131, 1, 3}, {56, 99, 194}, {56, 99, 194}, {245, 204, 18}},
};

// k eighths of the way from a to b, rounded down (never negative: k <= 8).
constexpr int32_t ramp(int32_t a, int32_t b, int32_t k) { return (8 * a + k * (b - a)) >> 3; }

constexpr Colour ramp(const Colour& a, const Colour& b, int32_t k) {
  return {ramp(a.r, b.r, k), ramp(a.g, b.g, k), ramp(a.b, b.b, k)};
}

constexpr Colour palette_colour(const Palette& p, int32_t brightness) {
  if (brightness >= 124) return p.light;
  if (brightness >= 116) return ramp(p.upper_start, p.light, brightness - 115);
  if (brightness >= 108) return ramp(p.dark, p.lower_end, brightness - 107);
  return p.dark;
}

// The colour depends only on the brightness, so each quadrant's 256 colours are made once per
// call.
class Posterise {
 public:
  Posterise() : colour_{} {
    for (int32_t q = 0; q < 4; ++q) {
      for (int32_t l = 0; l < 256; ++l) {
        const Colour c = palette_colour(kPalettes[q], l);
        colour_[q][l] = pack(0, c.r, c.g, c.b);
      }
    }
  }

  uint32_t operator()(Quadrant q, uint32_t s) const {
    const int32_t l = (77 * red_of(s) + 150 * green_of(s) + 29 * blue_of(s)) >> 8;
    return alpha_bits(s) | colour_[q][l];
  }

 private:
  uint32_t colour_[4][256];
};

constexpr int32_t kPreviewHue[4] = {45, 300, 180, 90};

// In WebAssembly the preview's loop vectorises only with its reciprocals divided out (there are
// no gathers there), which makes it almost twice as fast; elsewhere the tables are the faster.
#if defined(__wasm_simd128__)
constexpr Reciprocals kPreviewReciprocals = Reciprocals::kDivision;
#else
constexpr Reciprocals kPreviewReciprocals = Reciprocals::kTables;
#endif

// Value kept, saturation raised by 10000 (held below full), hue fixed per quadrant.
constexpr auto preview_recolour = [](Quadrant q, uint32_t s) {
  const Hsv hsv = rgb_to_hsv<kPreviewReciprocals>(red_of(s), green_of(s), blue_of(s));
  const int32_t sat = hsv.s + 10000 > 65535 ? 65535 : hsv.s + 10000;
  return pack(s, hsv_to_rgb(kPreviewHue[q], sat, hsv.v));
};

// The poster layout. The half-size copy is made into the top-left quadrant first and the other
// three quadrants are recoloured from it before it is recoloured itself. Each write lands at or
// before the source pixels still to be read, so dst may be the source. Each run of a quadrant's
// row goes through recolour_run(from, to, n, quadrant).
template <class RecolourRun>
void poster(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
            const RecolourRun& recolour_run) {
  const size_t w = static_cast<size_t>(width), h = static_cast<size_t>(height);
  const size_t qw = (w >> 1) + (w & 1), qh = (h >> 1) + (h & 1);
  for (size_t y = 0; y < qh; ++y) {
    uint32_t* row = dst + y * w;
    const uint32_t* from = src + 2 * y * w;
    for (size_t x = 0; x < qw; ++x) row[x] = from[2 * x];
    recolour_run(row, row + qw, w - qw, kTopRight);
  }
  for (size_t y = qh; y < h; ++y) {
    uint32_t* row = dst + y * w;
    const uint32_t* copy = dst + (y - qh) * w;
    recolour_run(copy, row, qw, kBottomLeft);
    recolour_run(copy, row + qw, w - qw, kBottomRight);
  }
  for (size_t y = 0; y < qh; ++y) recolour_run(dst + y * w, dst + y * w, qw, kTopLeft);
}

bool poster_args_ok(const uint32_t* src, const uint32_t* dst, int32_t width, int32_t height) {
  if (src == nullptr || dst == nullptr) return false;
  const int64_t n = pixel_count(width, height);
  return n > 0 && n <= kMaxPixels;
}

}  // namespace
}  // namespace pfx

extern "C" {

void fx_apply_popart(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (!pfx::poster_args_ok(src, dst, width, height)) return;
  // The palette lookup stays a scalar loop: as vector gathers it would be slower.
  const pfx::Posterise posterise;
  pfx::poster(src, dst, width, height,
              [&](const uint32_t* from, uint32_t* to, size_t n, pfx::Quadrant q) {
                for (size_t x = 0; x < n; ++x) to[x] = posterise(q, from[x]);
              });
}

void fx_apply_popart_prev(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (!pfx::poster_args_ok(src, dst, width, height)) return;
  // The HSV round trip vectorises in the frame's pixel loop.
  pfx::poster(
      src, dst, width, height, [](const uint32_t* from, uint32_t* to, size_t n, pfx::Quadrant q) {
        pfx::map_pixels(from, to, n, [q](uint32_t s) { return pfx::preview_recolour(q, s); });
      });
}

void applyPopArt(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_popart(src, dst, width, height);
}

}  // extern "C"
