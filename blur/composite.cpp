// Depth compositing: a blurred working image scaled back up to full size.
//
// Each recomputed pixel interpolates the four working samples around it; a sample that lies
// outside the blurred area (depth 0) contributes the pixel's own source colour instead of its
// blurred colour. Inside the area the result is the smooth upscaled blur, outside it the source,
// and along the border the two mix over about one working sample: the soft edge of the
// depth-of-field effect.
#include "blur/composite.h"

#include <cstddef>

#include "blur/kernels.h"
#include "blur/workspace.h"
#include "frame/dispatch.h"
#include "frame/frame.h"
#include "photofx.h"

namespace pfx {

namespace {

// One row of the depth compositing, from its column sums. Within a span only the column
// fraction wx changes, so the per-pixel work is a few multiply-adds the compiler vectorises.
void composite_row_loop(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                        const ColumnSum* sums, const int32_t* span_start, int32_t spans,
                        int32_t xscale) {
  for (int32_t j = 0; j < spans; ++j) {
    const ColumnSum a = sums[j], b = sums[j + 1];
    const int32_t r0 = a.r * 32, dr = b.r - a.r;
    const int32_t g0 = a.g * 32, dg = b.g - a.g;
    const int32_t b0 = a.b * 32, db = b.b - a.b;
    const int32_t o0 = a.own * 32, dow = b.own - a.own;
    const int32_t end = span_start[j + 1];
    // Each pixel is read before it is written and no other is touched: safe when dst is src.
    PFX_NO_ALIAS_LOOP
    for (int32_t x = span_start[j]; x < end; ++x) {
      const uint32_t s = src[x];
      const int32_t wx = ((x * xscale) >> 10) & 31;  // the column's weight, as working_pos has it
      const int32_t own = o0 + dow * wx;
      const int32_t r = (r0 + dr * wx + static_cast<int32_t>((s >> 16) & 255u) * own) >> 10;
      const int32_t g = (g0 + dg * wx + static_cast<int32_t>((s >> 8) & 255u) * own) >> 10;
      const int32_t bl = (b0 + db * wx + static_cast<int32_t>(s & 255u) * own) >> 10;
      const uint32_t out = (s & 0xFF000000u) | (static_cast<uint32_t>(r) << 16) |
                           (static_cast<uint32_t>(g) << 8) | static_cast<uint32_t>(bl);
      dst[x] = (mask == nullptr || mask[x] != 0) ? out : s;
    }
  }
}

void composite_row(const uint32_t* src, const uint8_t* mask, uint32_t* dst, const ColumnSum* sums,
                   const int32_t* span_start, int32_t spans, int32_t xscale) {
  vector_paths([&] { composite_row_loop(src, mask, dst, sums, span_start, spans, xscale); });
}

}  // namespace

void working_spans(int32_t width, int32_t sw, int32_t xscale, int32_t* span_start) {
  // working_pos never decreases along a row, so each span is one run of columns; the clamp at
  // the right edge leaves the last span open to the end of the row.
  const int32_t spans = sw - 1;
  int32_t x = 0;
  for (int32_t j = 0; j < spans; ++j) {
    while (x < width && working_pos(x, xscale, sw).index < j) ++x;
    span_start[j] = x;
  }
  span_start[spans] = width;
}

namespace {

// The column sums as planes (red, green, blue, own), padded by 8 entries that the NEON rows read
// past the last working column (and never use).
struct SumPlanes {
  uint16_t plane[4][kMaxWorkingSide + 8] = {};
  uint16_t* const p[4] = {plane[0], plane[1], plane[2], plane[3]};
};

// composite() through the NEON kernels, where they apply (false: nothing done).
bool composite_neon(const uint32_t* src, const uint8_t* blur, const uint8_t* mask,
                    const uint8_t* depth, uint32_t* dst, int32_t width, int32_t height, int32_t sw,
                    int32_t sh, bool every_pixel, int32_t xscale, int32_t yscale) {
  // The rows gather each block's sums from eight entries, which needs a working image at most
  // half the width.
  if (xscale > 16384) return false;
  SumPlanes sums;
  for (int32_t y = 0; y < height; ++y) {
    const WorkingPos py = working_pos(y, yscale, sh);
    const size_t row = static_cast<size_t>(y) * static_cast<size_t>(width);
    neon::column_sums(blur, depth, sw, py.index, py.frac, sums.p);
    neon::composite_row(src + row, every_pixel ? nullptr : mask + row, dst + row, width, sw, xscale,
                        sums.p);
  }
  return true;
}

}  // namespace

void column_sums(const uint8_t* blur, const uint8_t* depth, int32_t sw, WorkingPos py,
                 ColumnSum* sums) {
  const size_t row_samples = static_cast<size_t>(sw);
  const size_t top = static_cast<size_t>(py.index) * row_samples;
  const size_t bottom = top + row_samples;
  const int32_t wt = 32 - py.frac, wb = py.frac;
  for (size_t j = 0; j < row_samples; ++j) {
    const bool dt = depth == nullptr || depth[top + j] != 0;
    const bool db = depth == nullptr || depth[bottom + j] != 0;
    const uint8_t* t = blur + 3 * (top + j);
    const uint8_t* b = blur + 3 * (bottom + j);
    ColumnSum& c = sums[j];
    c.r = (dt ? t[0] * wt : 0) + (db ? b[0] * wb : 0);
    c.g = (dt ? t[1] * wt : 0) + (db ? b[1] * wb : 0);
    c.b = (dt ? t[2] * wt : 0) + (db ? b[2] * wb : 0);
    c.own = (dt ? 0 : wt) + (db ? 0 : wb);
  }
}

void composite(const uint32_t* src, const uint8_t* blur, const uint8_t* mask, const uint8_t* depth,
               uint32_t* dst, int32_t width, int32_t height, int32_t sw, int32_t sh,
               bool every_pixel) {
  const int32_t yscale = working_scale(sh, height);
  const int32_t xscale = working_scale(sw, width);
  if (neon_kernels() && composite_neon(src, blur, mask, depth, dst, width, height, sw, sh,
                                       every_pixel, xscale, yscale)) {
    return;
  }
  const int32_t spans = sw - 1;
  int32_t span_start[kMaxWorkingSide];
  ColumnSum sums[kMaxWorkingSide];
  working_spans(width, sw, xscale, span_start);
  for (int32_t y = 0; y < height; ++y) {
    column_sums(blur, depth, sw, working_pos(y, yscale, sh), sums);
    const size_t row = static_cast<size_t>(y) * static_cast<size_t>(width);
    composite_row(src + row, every_pixel ? nullptr : mask + row, dst + row, sums, span_start, spans,
                  xscale);
  }
}

}  // namespace pfx

extern "C" {

void run_blur(const uint32_t* src, const uint8_t* blur, const uint8_t* mask, const uint8_t* depth,
              uint32_t* dst, int32_t width, int32_t height, int32_t sw, int32_t sh) {
  const bool every_pixel = all != 0;
  if (src == nullptr || blur == nullptr || depth == nullptr || dst == nullptr) return;
  if (mask == nullptr && !every_pixel) return;
  const int64_t n = pfx::pixel_count(width, height);
  if (n == 0 || n > pfx::kMaxPixels) return;
  // A working size no buffer could hold is refused like any other such size.
  if (pfx::pixel_count(sw, sh) > pfx::kMaxPixels) return;
  if (!pfx::can_composite(sw, sh)) {
    // Too few working samples to interpolate between (or too many for the coordinates): hand
    // back the source rather than read past the working image.
    pfx::copy_image(src, dst, n);
    return;
  }
  pfx::composite(src, blur, mask, depth, dst, width, height, sw, sh, every_pixel);
}

}  // extern "C"
