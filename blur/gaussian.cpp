// Gaussian blur of a working image.
//
// A separable blur with a nine-entry kernel of small integer weights, of which the level uses a
// window of one to nine taps. Samples of the blurred area (depth byte 1) average only with other
// samples of that area: a tap outside it counts as the centre sample itself, so colour from
// outside the area never bleeds in. Taps beyond the image edge are dropped with their weight.
#include "blur/gaussian.h"

#include <cstddef>

#include "frame/frame.h"
#include "photofx.h"

namespace pfx {

constinit const int32_t kBlurKernel[5] = {9, 8, 7, 5, 3};

namespace {

// Tap offsets lo..hi of a level. Odd levels lean one tap toward negative offsets. The level is
// taken as unsigned, so negative levels also mean the widest window.
struct Window {
  int32_t lo, hi;
};

constexpr Window window_for(int32_t level) {
  const uint32_t l =
      static_cast<uint32_t>(level) > 7u ? uint32_t{kWidestBlurLevel} : static_cast<uint32_t>(level);
  return {-static_cast<int32_t>((l + 1) / 2), static_cast<int32_t>(l / 2)};
}

// One pass along lines of `count` samples, `stride` samples apart, centred on the sample at
// `centre`; `pos` is the centre's place along the line and `len` the line's length. Writes the
// three channels of the result to out.
inline void blur_tap_line(const uint8_t* in, const uint8_t* depth, size_t centre, int32_t pos,
                          int32_t len, ptrdiff_t stride, Window win, uint8_t* out) {
  int32_t sum[3] = {0, 0, 0};
  int32_t weight = 0;
  const uint8_t* c = in + 3 * centre;
  for (int32_t o = win.lo; o <= win.hi; ++o) {
    if (pos + o < 0 || pos + o >= len) continue;
    const ptrdiff_t t = static_cast<ptrdiff_t>(centre) + stride * o;
    if (depth == nullptr || depth[t] == 1) {
      const int32_t k = kBlurKernel[o < 0 ? -o : o];
      const uint8_t* p = in + 3 * t;
      for (int ch = 0; ch < 3; ++ch) sum[ch] += k * p[ch];
      weight += k;
    } else {
      for (int ch = 0; ch < 3; ++ch) sum[ch] += 9 * c[ch];
      weight += 9;
    }
  }
  // The centre tap is always in range, so weight >= 3; sums stay below 255 * 55 * 1024.
  for (int ch = 0; ch < 3; ++ch) {
    const int32_t v = ((sum[ch] * 1024) / weight) >> 10;
    out[ch] = static_cast<uint8_t>(v > 254 ? 255 : (v < 0 ? 0 : v));
  }
}

}  // namespace

bool gaussian_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
                   int32_t height, int32_t level) {
  if (src == nullptr || dst == nullptr) return false;
  const int64_t n = pixel_count(width, height);
  if (n == 0 || n > kMaxPixels) return false;
  auto* scratch = static_cast<uint8_t*>(fx_calloc(static_cast<uint32_t>(n * 3), 1));
  if (scratch == nullptr) return false;

  const Window win = window_for(level);
  const ptrdiff_t w = width;
  // Horizontal pass reads only src, so dst may be src.
  for (int32_t y = 0; y < height; ++y) {
    for (int32_t x = 0; x < width; ++x) {
      const size_t i = static_cast<size_t>(y) * static_cast<size_t>(width) + static_cast<size_t>(x);
      blur_tap_line(src, depth, i, x, width, 1, win, scratch + 3 * i);
    }
  }
  for (int32_t y = 0; y < height; ++y) {
    for (int32_t x = 0; x < width; ++x) {
      const size_t i = static_cast<size_t>(y) * static_cast<size_t>(width) + static_cast<size_t>(x);
      blur_tap_line(scratch, depth, i, y, height, w, win, dst + 3 * i);
    }
  }
  fx_free(scratch);
  return true;
}

}  // namespace pfx

extern "C" {

void make_gaussian_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
                        int32_t height, int32_t level) {
  // Called directly, the depth map is part of the contract; only the tilt-shift blur goes
  // without one.
  if (depth == nullptr) return;
  pfx::gaussian_blur(src, dst, depth, width, height, level);
}

}  // extern "C"
