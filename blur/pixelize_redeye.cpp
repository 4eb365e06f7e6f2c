// Pixelize, the pixelize brush and red-eye removal.
//
// Pixelize turns the image into a mosaic of 2^shift-pixel square blocks, each taking the colour
// of its top-left pixel (its anchor). The grid is anchored at the image origin, so the brush,
// which paints the same mosaic inside a disc, continues an earlier stroke seamlessly. Red-eye
// removal replaces the red of strongly red pixels inside a square by a value built mostly from
// green and blue, which darkens them.
//
// An anchor always precedes or equals its pixels in row order and maps to itself, so both
// pixelize tools may read anchors from the buffer they are writing.
#include <cstddef>
#include <cstdint>

#include "frame/frame.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

// A block shift outside 0..31 has no block size; shifting by it would be undefined.
constexpr bool valid_shift(int32_t shift) { return shift >= 0 && shift <= 31; }

constexpr size_t anchor_of(int32_t v, int32_t shift) {
  return static_cast<size_t>((static_cast<uint32_t>(v) >> shift) << shift);
}

// The part of a brush's bounding square [c - r, c + r] that lies on an axis of n pixels. Formed
// in 64 bits: any centre and radius the caller passes is safe, and a negative radius or a brush
// off the image gives an empty span (first > last).
struct Span {
  int32_t first, last;
};

constexpr Span brush_span(int32_t centre, int32_t radius, int32_t n) {
  const int64_t lo = int64_t{centre} - radius;
  const int64_t hi = int64_t{centre} + radius;
  return {static_cast<int32_t>(lo < 0 ? 0 : (lo > n ? n : lo)),
          static_cast<int32_t>(hi > n - 1 ? n - 1 : (hi < -1 ? -1 : hi))};
}

// The image a brush may edit: present, non-empty and small enough to index.
inline bool brush_image_ok(const uint32_t* img, int32_t width, int32_t height) {
  const int64_t n = pixel_count(width, height);
  return img != nullptr && n > 0 && n <= kMaxPixels;
}

// Red-eye: a pixel whose red is more than two and a half times its green gets a red of about
// 0.05 R + 0.6 G + 0.3 B. Blue takes no part in the test.
inline bool is_red_eye(int32_t r, int32_t g) { return 2 * r > 5 * g; }

inline int32_t red_eye_red(int32_t r, int32_t g, int32_t b) {
  return clamp_byte((51 * r + 614 * g + 307 * b) >> 10);
}

}  // namespace
}  // namespace pfx

extern "C" {

void fx_apply_pixelize(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                       int32_t shift) {
  if (src == nullptr || dst == nullptr || !pfx::valid_shift(shift)) return;
  const int64_t n = pfx::pixel_count(width, height);
  if (n == 0 || n > pfx::kMaxPixels) return;
  const size_t w = static_cast<size_t>(width);
  for (int32_t y = 0; y < height; ++y) {
    const uint32_t* anchors = src + pfx::anchor_of(y, shift) * w;
    uint32_t* out = dst + static_cast<size_t>(y) * w;
    for (int32_t x = 0; x < width; ++x) out[x] = anchors[pfx::anchor_of(x, shift)];
  }
}

void fx_rub_pixelize(uint32_t* img, int32_t width, int32_t height, int32_t shift, int32_t cx,
                     int32_t cy, int32_t radius) {
  if (!pfx::brush_image_ok(img, width, height) || !pfx::valid_shift(shift)) return;
  const pfx::Span xs = pfx::brush_span(cx, radius, width);
  const pfx::Span ys = pfx::brush_span(cy, radius, height);
  // Inside the spans every offset is at most |radius| < 2^31, so each square fits 62 bits and
  // their sum fits an unsigned 64-bit word.
  const uint64_t r2 = static_cast<uint64_t>(int64_t{radius} * radius);
  const size_t w = static_cast<size_t>(width);
  for (int32_t y = ys.first; y <= ys.last; ++y) {
    const int64_t dy = int64_t{cy} - y;
    const uint64_t dy2 = static_cast<uint64_t>(dy * dy);
    const uint32_t* anchors = img + pfx::anchor_of(y, shift) * w;
    uint32_t* row = img + static_cast<size_t>(y) * w;
    for (int32_t x = xs.first; x <= xs.last; ++x) {
      const int64_t dx = int64_t{cx} - x;
      if (static_cast<uint64_t>(dx * dx) + dy2 <= r2) row[x] = anchors[pfx::anchor_of(x, shift)];
    }
  }
}

void fx_remove_redeye(uint32_t* img, int32_t width, int32_t height, int32_t cx, int32_t cy,
                      int32_t radius) {
  if (!pfx::brush_image_ok(img, width, height)) return;
  const pfx::Span xs = pfx::brush_span(cx, radius, width);
  const pfx::Span ys = pfx::brush_span(cy, radius, height);
  for (int32_t y = ys.first; y <= ys.last; ++y) {
    uint32_t* row = img + static_cast<size_t>(y) * static_cast<size_t>(width);
    for (int32_t x = xs.first; x <= xs.last; ++x) {
      const uint32_t p = row[x];
      const int32_t r = pfx::red_of(p), g = pfx::green_of(p), b = pfx::blue_of(p);
      if (pfx::is_red_eye(r, g)) row[x] = pfx::pack(p, pfx::red_eye_red(r, g, b), g, b);
    }
  }
}

void applyPixelize(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                   int32_t shift) {
  fx_apply_pixelize(src, dst, width, height, shift);
}

void rubPixelize(uint32_t* img, int32_t width, int32_t height, int32_t shift, int32_t cx,
                 int32_t cy, int32_t radius) {
  fx_rub_pixelize(img, width, height, shift, cx, cy, radius);
}

void removeRedeye(uint32_t* img, int32_t width, int32_t height, int32_t cx, int32_t cy,
                  int32_t radius) {
  fx_remove_redeye(img, width, height, cx, cy, radius);
}

}  // extern "C"
