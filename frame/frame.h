// The calling frame shared by the effects: visit order, copy-then-edit, whole-image or masked
// mode, the mask-equals-1 test and the guards that keep every access inside the caller's
// buffers. An effect supplies only its per-pixel rule, a callable uint32_t(uint32_t) that maps
// a source pixel to its result (keeping alpha is the rule's business; pfx::pack does it).
//
// The frames return false when they refuse the call (a buffer the call needs is null, or the
// image is too large to address); nothing has been written then. Effects that return a result
// code turn that into PHOTOFX_INVALID_ARGUMENT.
#pragma once

#include <cstddef>
#include <cstdint>

#include "frame/dispatch.h"
#include "frame/kernel.h"
#include "photofx.h"

namespace pfx {

// Largest image the library addresses: its byte size must fit the 32-bit counts of the memory
// wrappers and its pixel indices a signed 32-bit integer, on every target.
constexpr int64_t kMaxPixels = INT32_MAX / 4;

// Pixel count of a width x height image; 0 when either side is zero or negative, since such an
// image has no pixels to visit.
constexpr int64_t pixel_count(int32_t width, int32_t height) {
  return (width <= 0 || height <= 0) ? 0 : static_cast<int64_t>(width) * height;
}

// Region bounds, inclusive on both ends.
struct Rect {
  int32_t left, right, top, bottom;
};

// Valid bounds select masked mode; bounds with left > right or top > bottom mean whole image.
constexpr bool is_region(const Rect& r) { return r.left <= r.right && r.top <= r.bottom; }

// The part of `r` that lies inside a width x height image. May come out empty (left > right or
// top > bottom): a rectangle entirely off the image selects nothing, it does not turn into
// whole-image mode, so decide the mode before clipping.
constexpr Rect clip_to_image(Rect r, int32_t width, int32_t height) {
  // An image without pixels leaves nothing of any rectangle (and width - 1 would overflow for a
  // width of INT32_MIN, letting the rectangle through unclipped).
  if (width <= 0 || height <= 0) return {0, -1, 0, -1};
  if (r.left < 0) r.left = 0;
  if (r.top < 0) r.top = 0;
  if (r.right > width - 1) r.right = width - 1;
  if (r.bottom > height - 1) r.bottom = height - 1;
  return r;
}

// Copies a whole image of n pixels, unless source and destination are the same buffer (a
// partial variant called in place then gives the same result as with two buffers).
inline void copy_image(const uint32_t* src, uint32_t* dst, int64_t n) {
  if (src != dst) fx_memcpy(dst, src, static_cast<uint32_t>(n * 4));
}

// The loops under the frames. They are written as plain loops over one run of pixels so that a
// rule of plain integer arithmetic vectorises, and compiled for the widest vectors of the path
// in force (frame/dispatch.h).
//
// dst[i] = rule(src[i]) for i < n. Each output reads only its own source pixel, so src and dst
// may be the same buffer.
template <class Rule>
inline void map_pixels_loop(const uint32_t* src, uint32_t* dst, size_t n, const Rule& rule) {
  for (size_t i = 0; i < n; ++i) dst[i] = rule(src[i]);
}

template <class Rule>
inline void map_pixels(const uint32_t* src, uint32_t* dst, size_t n, const Rule& rule) {
  wide_vector_paths([&] { map_pixels_loop(src, dst, n, rule); });
}

// dst[i] = rule(src[i]) where mask[i] is exactly 1, src[i] elsewhere, for i < n. The rule is
// worked out for every pixel and the mask picks, which is cheaper than a branch per pixel when
// the rule vectorises.
template <class Rule>
inline void map_selected_loop(const uint32_t* src, const uint8_t* mask, uint32_t* dst, size_t n,
                              const Rule& rule) {
  for (size_t i = 0; i < n; ++i) {
    const uint32_t p = src[i];
    const uint32_t q = rule(p);
    dst[i] = mask[i] == 1 ? q : p;
  }
}

template <class Rule>
inline void map_selected_pixels(const uint32_t* src, const uint8_t* mask, uint32_t* dst, size_t n,
                                const Rule& rule) {
  wide_vector_paths([&] { map_selected_loop(src, mask, dst, n, rule); });
}

// Copies pixels [begin, end) unless source and destination are the same buffer.
inline void copy_run(const uint32_t* src, uint32_t* dst, size_t begin, size_t end) {
  if (src != dst && end > begin) {
    fx_memcpy(dst + begin, src + begin, static_cast<uint32_t>((end - begin) * 4));
  }
}

// Full variant: dst[i] = rule(src[i]) for every pixel in row order. Each output reads only its
// own source pixel, so src and dst may be the same buffer. A vector kernel of the rule
// (frame/kernel.h), where the build has one, does what it can first.
template <class Rule, class Kernel = NoKernel>
inline bool for_each_pixel(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                           Rule&& rule, Kernel&& kernel = {}) {
  if (src == nullptr || dst == nullptr) return false;
  const int64_t n = pixel_count(width, height);
  if (n > kMaxPixels) return false;
  const size_t done = neon_kernels() ? kernel(Run{src, nullptr, dst, static_cast<size_t>(n)}) : 0;
  map_pixels(src + done, dst + done, static_cast<size_t>(n) - done, rule);
  return true;
}

// The full-variant frame for rules that look their results up in tables. Vectorised, each
// table read becomes a gather, which is slower than plain loads on the CPUs measured, so this
// loop is left scalar.
template <class Rule>
inline bool for_each_pixel_by_table(const uint32_t* src, uint32_t* dst, int32_t width,
                                    int32_t height, Rule&& rule) {
  if (src == nullptr || dst == nullptr) return false;
  const int64_t n = pixel_count(width, height);
  if (n > kMaxPixels) return false;
  for (size_t i = 0; i < static_cast<size_t>(n); ++i) dst[i] = rule(src[i]);
  return true;
}

// Calls visit(i) for every pixel index a partial variant edits: every pixel in whole-image
// mode, otherwise the pixels inside the (clipped) bounds whose mask byte is exactly 1, rows top
// to bottom and columns left to right.
template <class Visit>
inline void for_each_selected(const uint8_t* mask, int32_t width, int32_t height, Rect bounds,
                              Visit&& visit) {
  if (!is_region(bounds)) {
    const size_t n = static_cast<size_t>(pixel_count(width, height));
    for (size_t i = 0; i < n; ++i) visit(i);
    return;
  }
  const Rect r = clip_to_image(bounds, width, height);
  for (int32_t y = r.top; y <= r.bottom; ++y) {
    const size_t row = static_cast<size_t>(y) * static_cast<size_t>(width);
    for (int32_t x = r.left; x <= r.right; ++x) {
      const size_t i = row + static_cast<size_t>(x);
      if (mask[i] == 1) visit(i);
    }
  }
}

// The masked mode of a partial frame within the clipped, non-empty rectangle r: in each row
// the pixels whose mask byte is 1 get rule(src), the others src, through the kernel first where
// the path has one; around(row) handles the rest of each row.
template <class Rule, class Kernel, class Around>
inline void edit_rows(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                      const Rect& r, const Rule& rule, const Kernel& kernel, const Around& around) {
  const bool vector = neon_kernels();
  const size_t w = static_cast<size_t>(width);
  const size_t left = static_cast<size_t>(r.left),
               count = static_cast<size_t>(r.right - r.left) + 1;
  for (int32_t y = r.top; y <= r.bottom; ++y) {
    const size_t row = static_cast<size_t>(y) * w;
    around(row);
    const size_t at = row + left;
    const size_t done = vector ? kernel(Run{src + at, mask + at, dst + at, count}) : 0;
    map_selected_pixels(src + at + done, mask + at + done, dst + at + done, count - done, rule);
  }
}

// Checks shared by the partial variants: both pixel buffers present, a mask present whenever
// the bounds select masked mode, and an image small enough to address.
inline bool partial_args_ok(const uint32_t* src, const uint8_t* mask, const uint32_t* dst,
                            int32_t width, int32_t height, const Rect& bounds) {
  if (src == nullptr || dst == nullptr) return false;
  if (is_region(bounds) && mask == nullptr) return false;
  return pixel_count(width, height) <= kMaxPixels;
}

// Partial variant: copy the source into the destination, then apply the rule to the selected
// pixels (see for_each_selected). Unselected pixels keep their source value.
//
// The copy and the edit are made in one pass, each destination pixel written once: since the
// rule reads only the source, a pixel that is copied and then edited ends up the same as one
// that is edited straight away. Whole-image mode edits every pixel, so nothing needs copying.
template <class Rule, class Kernel = NoKernel>
inline bool edit_selected(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                          int32_t height, Rect bounds, Rule&& rule, Kernel&& kernel = {}) {
  if (!partial_args_ok(src, mask, dst, width, height, bounds)) return false;
  const size_t n = static_cast<size_t>(pixel_count(width, height));
  if (!is_region(bounds)) {
    const size_t done = neon_kernels() ? kernel(Run{src, nullptr, dst, n}) : 0;
    map_pixels(src + done, dst + done, n - done, rule);
    return true;
  }
  const Rect r = clip_to_image(bounds, width, height);
  if (n == 0 || r.left > r.right || r.top > r.bottom) {
    copy_run(src, dst, 0, n);
    return true;
  }
  const size_t w = static_cast<size_t>(width);
  const size_t left = static_cast<size_t>(r.left), right = static_cast<size_t>(r.right);
  copy_run(src, dst, 0, static_cast<size_t>(r.top) * w);
  edit_rows(src, mask, dst, width, r, rule, kernel, [&](size_t row) {
    copy_run(src, dst, row, row + left);
    copy_run(src, dst, row + right + 1, row + w);
  });
  copy_run(src, dst, (static_cast<size_t>(r.bottom) + 1) * w, n);
  return true;
}

}  // namespace pfx
