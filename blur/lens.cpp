// Lens blur of a working image.
//
// Every sample of the blurred area becomes the mean of the samples under a circular aperture,
// with the luma averaged contraharmonically (each tap weighted by its own luma) so that bright
// highlights spread into discs, as out-of-focus highlights do through a real lens. Chroma is a
// plain mean. The aperture grows with the level from a single tap to a 9 x 9 disc.
#include "blur/lens.h"

#include <cstddef>

#include "blur/tiltshift.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

// The aperture grids. Even sides sit half a sample toward negative offsets; the 2 x 2 grid
// leaves out its own centre, so level 1 averages the samples above and to the left.
constexpr int32_t kGrid1[1] = {1};
constexpr int32_t kGrid2[4] = {0, 1,  //
                               1, 0};
constexpr int32_t kGrid3[9] = {0, 1, 0,  //
                               1, 1, 1,  //
                               0, 1, 0};
constexpr int32_t kGrid4[16] = {0, 1, 1, 0,  //
                                1, 1, 1, 1,  //
                                1, 1, 1, 1,  //
                                0, 1, 1, 0};
constexpr int32_t kGrid5[25] = {0, 1, 1, 1, 0,  //
                                1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1,  //
                                0, 1, 1, 1, 0};
constexpr int32_t kGrid6[36] = {0, 1, 1, 1, 1, 0,  //
                                1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1,  //
                                0, 1, 1, 1, 1, 0};
constexpr int32_t kGrid7[49] = {0, 0, 1, 1, 1, 0, 0,  //
                                0, 1, 1, 1, 1, 1, 0,  //
                                1, 1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1, 1,  //
                                0, 1, 1, 1, 1, 1, 0,  //
                                0, 0, 1, 1, 1, 0, 0};
constexpr int32_t kGrid8[64] = {0, 0, 1, 1, 1, 1, 0, 0,  //
                                0, 1, 1, 1, 1, 1, 1, 0,  //
                                1, 1, 1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1, 1, 1,  //
                                0, 1, 1, 1, 1, 1, 1, 0,  //
                                0, 0, 1, 1, 1, 1, 0, 0};
constexpr int32_t kGrid9[81] = {0, 0, 1, 1, 1, 1, 1, 0, 0,  //
                                0, 1, 1, 1, 1, 1, 1, 1, 0,  //
                                1, 1, 1, 1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1, 1, 1, 1,  //
                                1, 1, 1, 1, 1, 1, 1, 1, 1,  //
                                0, 1, 1, 1, 1, 1, 1, 1, 0,  //
                                0, 0, 1, 1, 1, 1, 1, 0, 0};

constexpr Aperture kApertures[9] = {{1, 0, kGrid1}, {2, 1, kGrid2}, {3, 1, kGrid3},
                                    {4, 2, kGrid4}, {5, 2, kGrid5}, {6, 3, kGrid6},
                                    {7, 3, kGrid7}, {8, 4, kGrid8}, {9, 4, kGrid9}};

// Luma and chroma of a sample whose bytes are read as blue, green, red.
struct Ycc {
  int32_t y, cb, cr;
};

constexpr Ycc to_ycc(const uint8_t* p) {
  const int32_t b0 = p[0], b1 = p[1], b2 = p[2];
  return {(77 * b2 + 150 * b1 + 29 * b0) >> 8, (128 * b0 - 85 * b1 - 43 * b2) >> 8,
          (128 * b2 - 107 * b1 - 21 * b0) >> 8};
}

constexpr uint8_t to_byte(int32_t v) { return static_cast<uint8_t>(clamp_byte(v)); }

}  // namespace

const Aperture& aperture_for(int32_t level) {
  const uint32_t l = static_cast<uint32_t>(level);
  return kApertures[l > 7u ? 8u : l];
}

void lens_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
               int32_t height, int32_t level, const TiltBand* band) {
  const Aperture& ap = aperture_for(level);
  for (int32_t y = 0; y < height; ++y) {
    // Luma blend toward the centre sample: 0 (lens luma only) up to 32 (own luma only).
    int32_t t = 0;
    if (band != nullptr) {
      const int32_t w = band->weight(y);
      t = (w > 192 ? w - 192 : 0) >> 1;
    }
    for (int32_t x = 0; x < width; ++x) {
      const size_t i = static_cast<size_t>(y) * static_cast<size_t>(width) + static_cast<size_t>(x);
      const uint8_t* s = src + 3 * i;
      uint8_t* d = dst + 3 * i;
      if (depth != nullptr && depth[i] == 0) {
        d[0] = s[0], d[1] = s[1], d[2] = s[2];
        continue;
      }
      // At most 81 taps: S2 <= 81 * 255^2, far inside 32 bits.
      int32_t s2 = 0, s1 = 0, scb = 0, scr = 0, n = 0;
      for (int32_t dy = -ap.r0; dy < ap.side - ap.r0; ++dy) {
        if (y + dy < 0 || y + dy >= height) continue;
        const int32_t* grid_row = ap.grid + (dy + ap.r0) * ap.side + ap.r0;
        for (int32_t dx = -ap.r0; dx < ap.side - ap.r0; ++dx) {
          if (x + dx < 0 || x + dx >= width || grid_row[dx] != 1) continue;
          const size_t j = static_cast<size_t>(y + dy) * static_cast<size_t>(width) +
                           static_cast<size_t>(x + dx);
          if (depth != nullptr && depth[j] == 0) continue;
          const Ycc c = to_ycc(src + 3 * j);
          s2 += c.y * c.y;
          s1 += c.y;
          scb += c.cb;
          scr += c.cr;
          ++n;
        }
      }
      if (n == 0) {
        d[0] = s[0], d[1] = s[1], d[2] = s[2];
        continue;
      }
      int32_t yw = 0;
      if (s1 != 0) {
        yw = s2 / s1;
        if (band != nullptr) yw = (to_ycc(s).y * t + yw * (32 - t)) >> 5;
      }
      const int32_t cbm = scb / n, crm = scr / n;
      d[2] = to_byte(yw + ((359 * crm) >> 8));
      d[1] = to_byte(yw - ((88 * cbm + 183 * crm) >> 8));
      d[0] = to_byte(yw + ((454 * cbm) >> 8));
    }
  }
}

}  // namespace pfx

extern "C" {

void make_lens_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
                    int32_t height, int32_t level) {
  if (src == nullptr || dst == nullptr || depth == nullptr) return;
  const int64_t n = pfx::pixel_count(width, height);
  if (n == 0 || n > pfx::kMaxPixels) return;
  pfx::lens_blur(src, dst, depth, width, height, level, nullptr);
}

}  // extern "C"
