// Tilt-shift: a horizontal band of rows stays sharp and the picture blurs progressively above
// and below it, as if photographed through a tilted lens.
//
// Like the depth-of-field blur it works on a working copy: the photograph is scaled down and
// blurred with the widest Gaussian window, and the blurred copy is scaled back up and mixed
// with the source row by row, by the row's distance from the band. Previews keep the working
// copies in the blur workspace between fx_init_tiltshift and fx_destroy_tiltshift.
#include "blur/tiltshift.h"

#include <cstddef>

#include "blur/composite.h"
#include "blur/gaussian.h"
#include "blur/kernels.h"
#include "blur/lens.h"
#include "blur/workspace.h"
#include "frame/dispatch.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "photofx.h"

extern "C" {
int32_t resize_ratio = 0;
}

namespace pfx {
namespace {

// One row of the upscaled blur mixed with the source: weight w (0..256) of the source, the rest
// of the blur. Spans and column sums as for the depth compositing, with no depth; the bilinear
// value is at most 255 and the mix at most 255, so neither needs clamping.
void restore_row_loop(const uint32_t* src, uint32_t* dst, const ColumnSum* sums,
                      const int32_t* span_start, int32_t spans, int32_t xscale, int32_t w) {
  const int32_t blur_w = 256 - w;
  for (int32_t j = 0; j < spans; ++j) {
    const ColumnSum a = sums[j], b = sums[j + 1];
    const int32_t r0 = a.r * 32, dr = b.r - a.r;
    const int32_t g0 = a.g * 32, dg = b.g - a.g;
    const int32_t b0 = a.b * 32, db = b.b - a.b;
    const int32_t end = span_start[j + 1];
    // Each pixel is read before it is written and no other is touched: safe when dst is src.
    PFX_NO_ALIAS_LOOP
    for (int32_t x = span_start[j]; x < end; ++x) {
      const uint32_t s = src[x];
      const int32_t wx = ((x * xscale) >> 10) & 31;  // the column's weight, as working_pos has it
      const int32_t r =
          (((r0 + dr * wx) >> 10) * blur_w + static_cast<int32_t>((s >> 16) & 255u) * w) >> 8;
      const int32_t g =
          (((g0 + dg * wx) >> 10) * blur_w + static_cast<int32_t>((s >> 8) & 255u) * w) >> 8;
      const int32_t bl =
          (((b0 + db * wx) >> 10) * blur_w + static_cast<int32_t>(s & 255u) * w) >> 8;
      dst[x] = (s & 0xFF000000u) | (static_cast<uint32_t>(r) << 16) |
               (static_cast<uint32_t>(g) << 8) | static_cast<uint32_t>(bl);
    }
  }
}

void restore_row(const uint32_t* src, uint32_t* dst, const ColumnSum* sums,
                 const int32_t* span_start, int32_t spans, int32_t xscale, int32_t w) {
  vector_paths([&] { restore_row_loop(src, dst, sums, span_start, spans, xscale, w); });
}

// Blurred working image, scaled up and mixed with the source by each row's sharpness weight.
// Arguments are checked by the caller, including can_composite(sw, sh).
void restore(const uint32_t* src, const uint8_t* blur, uint32_t* dst, int32_t width, int32_t height,
             int32_t sw, int32_t sh, const TiltBand& band) {
  if (band.sharp_everywhere()) {
    copy_image(src, dst, pixel_count(width, height));
    return;
  }
  const int32_t yscale = working_scale(sh, height);
  const int32_t xscale = working_scale(sw, width);
  // On the NEON path, with a working image at most half the width, rows go through the
  // kernels (blur/blur_neon.cpp), sharp rows as plain copies.
  if (neon_kernels() && xscale <= 16384) {
    uint16_t planes[3][kMaxWorkingSide + 8] = {};
    uint16_t* const p[3] = {planes[0], planes[1], planes[2]};
    for (int32_t y = 0; y < height; ++y) {
      const size_t row = static_cast<size_t>(y) * static_cast<size_t>(width);
      const int32_t w = band.weight(y);
      if (w == 256) {
        copy_run(src, dst, row, row + static_cast<size_t>(width));
        continue;
      }
      const WorkingPos py = working_pos(y, yscale, sh);
      neon::column_sums(blur, nullptr, sw, py.index, py.frac, p);
      neon::restore_row(src + row, dst + row, width, sw, xscale, w, p);
    }
    return;
  }
  int32_t span_start[kMaxWorkingSide];
  ColumnSum sums[kMaxWorkingSide];
  working_spans(width, sw, xscale, span_start);
  for (int32_t y = 0; y < height; ++y) {
    const size_t row = static_cast<size_t>(y) * static_cast<size_t>(width);
    column_sums(blur, nullptr, sw, working_pos(y, yscale, sh), sums);
    restore_row(src + row, dst + row, sums, span_start, sw - 1, xscale, band.weight(y));
  }
}

// The widest Gaussian over every sample; false (dst untouched) when its scratch is missing.
bool tilt_blur(const uint8_t* src, uint8_t* dst, int32_t sw, int32_t sh) {
  return gaussian_blur(src, dst, nullptr, sw, sh, kWidestBlurLevel);
}

}  // namespace
}  // namespace pfx

extern "C" {

void make_tiltshift(const uint8_t* src, uint8_t* dst, int32_t width, int32_t height) {
  pfx::tilt_blur(src, dst, width, height);
}

void restore_tiltshift(const uint32_t* src, const uint8_t* blur, uint32_t* dst, int32_t width,
                       int32_t height, int32_t sw, int32_t sh, int32_t centre,
                       int32_t half_height) {
  if (src == nullptr || blur == nullptr || dst == nullptr) return;
  if (!pfx::is_image(width, height)) return;
  // A working size no buffer could hold is refused like any other such size.
  if (pfx::pixel_count(sw, sh) > pfx::kMaxPixels) return;
  if (!pfx::can_composite(sw, sh)) {
    pfx::copy_image(src, dst, pfx::pixel_count(width, height));
    return;
  }
  pfx::restore(src, blur, dst, width, height, sw, sh, pfx::TiltBand(height, centre, half_height));
}

void make_tiltshift_lens(const uint8_t* src, uint8_t* dst, int32_t width, int32_t height,
                         int32_t centre, int32_t half_height) {
  if (src == nullptr || dst == nullptr || !pfx::is_image(width, height)) return;
  // The luma blend follows the sharpness weight restore_tiltshift gives the same row of an
  // image this high: rows in and near the band (weight above 192) keep more of their own luma,
  // up to all of it at 256, while rows further out take the lens luma alone.
  const pfx::TiltBand band(height, centre, half_height);
  pfx::lens_blur(src, dst, nullptr, width, height, pfx::kWidestBlurLevel, &band);
}

void fx_destroy_tiltshift() {
  if (g_ssrc != nullptr) {
    fx_free(g_ssrc);
    g_ssrc = nullptr;
  }
  if (g_sblur != nullptr) {
    fx_free(g_sblur);
    g_sblur = nullptr;
  }
  pfx::g_workspace_samples = 0;
}

void fx_init_tiltshift(const uint32_t* src, int32_t width, int32_t height) {
  fx_destroy_blur();
  if (src == nullptr || !pfx::is_image(width, height)) return;
  const int32_t k = pfx::reduction_shift(width, height);
  const int32_t sw = width >> k, sh = height >> k;
  resize_ratio = k;
  g_scaled_wd = sw;
  g_scaled_ht = sh;
  const bool usable = pfx::can_composite(sw, sh);
  const int64_t bytes = usable ? pfx::working_bytes(sw, sh) : 0;
  g_ssrc = pfx::take_workspace_buffer(bytes);
  g_sblur = pfx::take_workspace_buffer(bytes);
  if (g_ssrc == nullptr || g_sblur == nullptr) {
    fx_destroy_tiltshift();
    return;
  }
  if (usable) {
    scale_down_img(src, width, height, g_ssrc, sw, sh);
    pfx::g_workspace_samples = int64_t{sw} * sh;
  }
}

void fx_tiltshift_preview(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                          int32_t centre, int32_t half_height) {
  if (g_ssrc == nullptr || g_sblur == nullptr) return;
  if (src == nullptr || dst == nullptr || !pfx::is_image(width, height)) return;
  if (!pfx::workspace_fits(g_scaled_wd, g_scaled_ht)) {
    pfx::copy_image(src, dst, pfx::pixel_count(width, height));
    return;
  }
  // The blur does not depend on the band, but g_sblur is public and is kept current.
  if (!pfx::tilt_blur(g_ssrc, g_sblur, g_scaled_wd, g_scaled_ht)) return;
  pfx::restore(src, g_sblur, dst, width, height, g_scaled_wd, g_scaled_ht,
               pfx::TiltBand(height, centre, half_height));
}

void fx_apply_tiltshift(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                        int32_t centre, int32_t half_height) {
  if (src == nullptr || dst == nullptr || !pfx::is_image(width, height)) return;
  const int32_t k = pfx::reduction_shift(width, height);
  const int32_t sw = width >> k, sh = height >> k;
  if (!pfx::can_composite(sw, sh)) {
    pfx::copy_image(src, dst, pfx::pixel_count(width, height));
    return;
  }
  const uint32_t bytes = static_cast<uint32_t>(pfx::working_bytes(sw, sh));
  auto* image = static_cast<uint8_t*>(fx_calloc(bytes, 1));
  if (image == nullptr) return;
  scale_down_img(src, width, height, image, sw, sh);
  auto* blurred = static_cast<uint8_t*>(fx_calloc(bytes, 1));
  const bool ok = blurred != nullptr && pfx::tilt_blur(image, blurred, sw, sh);
  fx_free(image);
  if (ok) {
    pfx::restore(src, blurred, dst, width, height, sw, sh,
                 pfx::TiltBand(height, centre, half_height));
  }
  fx_free(blurred);
}

void initTiltShift(const uint32_t* src, int32_t width, int32_t height) {
  fx_init_tiltshift(src, width, height);
}

void makeTiltShift(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                   int32_t centre, int32_t half_height) {
  fx_tiltshift_preview(src, dst, width, height, centre, half_height);
}

void applyTiltShift(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                    int32_t centre, int32_t half_height) {
  fx_apply_tiltshift(src, dst, width, height, centre, half_height);
}

void destroyTiltShift() { fx_destroy_tiltshift(); }

}  // extern "C"
