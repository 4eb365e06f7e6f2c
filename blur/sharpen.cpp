// Sharpen.
//
// A fixed one-dimensional filter with no strength setting: each colour channel is pushed away
// from the mean of its left and right neighbours, which crisps vertical edges. The first and
// last columns have only one neighbour and pass unchanged, as do rows-only (horizontal) edges.
//
// The result is built in a scratch image and copied out at the end, so that every neighbour is
// read from the source and dst may be the source buffer itself.
#include <cstddef>
#include <cstdint>

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

// Sharpens the pixels i for which selected(i) holds and keeps the others. Writes nothing when
// the scratch image cannot be had, so a failed call leaves dst as it was.
template <class Selected>
void sharpen(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
             Selected&& selected) {
  const int64_t n = pixel_count(width, height);
  if (n == 0 || n > kMaxPixels) return;
  auto* scratch = static_cast<uint32_t*>(fx_calloc(static_cast<uint32_t>(n), 4u));
  if (scratch == nullptr) return;
  const size_t w = static_cast<size_t>(width);
  for (size_t row = 0; row < static_cast<size_t>(n); row += w) {
    const uint32_t* in = src + row;
    uint32_t* out = scratch + row;
    out[0] = in[0];
    for (size_t x = 1; x + 1 < w; ++x) {
      out[x] = selected(row + x) ? sharpen_pixel(in[x - 1], in[x], in[x + 1]) : in[x];
    }
    out[w - 1] = in[w - 1];
  }
  fx_memcpy(dst, scratch, static_cast<uint32_t>(n * 4));
  fx_free(scratch);
}

}  // namespace
}  // namespace pfx

extern "C" {

void fx_apply_sharpen_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (src == nullptr || dst == nullptr) return;
  pfx::sharpen(src, dst, width, height, [](size_t) { return true; });
}

// The bounds only choose the mode: with valid bounds the mask alone decides which pixels are
// sharpened, inside the rectangle or not. Empty bounds select every pixel without touching the
// caller's mask, which may not even be there.
void fx_apply_sharpen(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                      int32_t height, int32_t /*level: the filter has no strength*/, int32_t left,
                      int32_t right, int32_t top, int32_t bottom) {
  if (src == nullptr || dst == nullptr) return;
  if (!pfx::is_region({left, right, top, bottom})) {
    pfx::sharpen(src, dst, width, height, [](size_t) { return true; });
    return;
  }
  if (mask == nullptr) return;
  pfx::sharpen(src, dst, width, height, [mask](size_t i) { return mask[i] == 1; });
}

void applySharpen(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                  int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                  int32_t bottom) {
  fx_apply_sharpen(src, mask, dst, width, height, level, left, right, top, bottom);
}

}  // extern "C"
