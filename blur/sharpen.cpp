// Sharpen.
//
// A fixed one-dimensional filter with no strength setting: each colour channel is pushed away
// from the mean of its left and right neighbours, which crisps vertical edges. The first and
// last columns have only one neighbour and pass unchanged, as do rows-only (horizontal) edges.
//
// Every neighbour must be the source's, and dst may be the source buffer itself: each row is made
// left to right carrying its previous source pixel, which is all the filter needs of what it has
// already overwritten, so no scratch image is needed.
#include <cstddef>
#include <cstdint>

#include "blur/kernels.h"
#include "frame/dispatch.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

constexpr int32_t sharpen_channel(int32_t left, int32_t c, int32_t right) {
  return clamp_byte(2 * c - ((left + right) >> 1));
}

constexpr uint32_t sharpen_pixel(uint32_t left, uint32_t p, uint32_t right) {
  return pack(p, sharpen_channel(red_of(left), red_of(p), red_of(right)),
              sharpen_channel(green_of(left), green_of(p), green_of(right)),
              sharpen_channel(blue_of(left), blue_of(p), blue_of(right)));
}

// The middle of a row into another buffer: every neighbour is read straight from the source, so
// the loop vectorises (on x86-64 in the copy of the path in force).
template <bool Masked>
void sharpen_apart_loop(const uint32_t* __restrict in, const uint8_t* __restrict mask,
                        uint32_t* __restrict out, size_t from, size_t w) {
  PFX_NO_ALIAS_LOOP
  for (size_t x = from; x + 1 < w; ++x) {
    const uint32_t p = in[x];
    const uint32_t s = sharpen_pixel(in[x - 1], p, in[x + 1]);
    out[x] = !Masked || mask[x] == 1 ? s : p;
  }
}

template <bool Masked>
void sharpen_apart(const uint32_t* in, const uint8_t* mask, uint32_t* out, size_t from, size_t w) {
  vector_paths([&] { sharpen_apart_loop<Masked>(in, mask, out, from, w); });
}

// Sharpens the pixels whose mask byte is 1 (every pixel without a mask) and keeps the others.
template <bool Masked>
void sharpen(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
             int32_t height) {
  const int64_t n = pixel_count(width, height);
  if (n == 0 || n > kMaxPixels) return;
  const size_t w = static_cast<size_t>(width);
  for (size_t row = 0; row < static_cast<size_t>(n); row += w) {
    const uint32_t* in = src + row;
    uint32_t* out = dst + row;
    // The NEON kernel does what it can of the row's middle, returning where it stopped and the
    // source pixel left of there.
    uint32_t left = in[0];
    size_t x = 1;
    if (neon_kernels()) x = neon::sharpen_row(in, Masked ? mask + row : nullptr, out, w, left);
    if (dst != src) {
      sharpen_apart<Masked>(in, Masked ? mask + row : nullptr, out, x, w);
      out[0] = in[0];
      out[w - 1] = in[w - 1];
      continue;
    }
    for (; x + 1 < w; ++x) {
      const uint32_t p = in[x];
      out[x] = !Masked || mask[row + x] == 1 ? sharpen_pixel(left, p, in[x + 1]) : p;
      left = p;
    }
  }
}

}  // namespace
}  // namespace pfx

extern "C" {

void fx_apply_sharpen_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (src == nullptr || dst == nullptr) return;
  pfx::sharpen<false>(src, nullptr, dst, width, height);
}

// The bounds only choose the mode: with valid bounds the mask alone decides which pixels are
// sharpened, inside the rectangle or not. Empty bounds select every pixel without touching the
// caller's mask, which may not even be there.
void fx_apply_sharpen(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                      int32_t height, int32_t /*level: the filter has no strength*/, int32_t left,
                      int32_t right, int32_t top, int32_t bottom) {
  if (src == nullptr || dst == nullptr) return;
  if (!pfx::is_region({left, right, top, bottom})) {
    pfx::sharpen<false>(src, nullptr, dst, width, height);
    return;
  }
  if (mask == nullptr) return;
  pfx::sharpen<true>(src, mask, dst, width, height);
}

void applySharpen(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                  int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                  int32_t bottom) {
  fx_apply_sharpen(src, mask, dst, width, height, level, left, right, top, bottom);
}

}  // extern "C"
