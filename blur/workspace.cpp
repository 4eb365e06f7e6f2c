// Depth-of-field blur: working copies and the blur workspace.
//
// The selected area is blurred on a working copy scaled down by a power of two per side, then
// scaled back up through the selection while it is composited into the full-size result. For
// previews the working copies live in a module-wide workspace between fx_Init_blur and
// fx_destroy_blur, so each slider position costs one small blur and one compositing pass;
// fx_make_blur does the same in one call with private copies. The tilt-shift workspace shares
// these globals.
#include "blur/workspace.h"

#include <cstddef>

#include "blur/composite.h"
#include "blur/gaussian.h"
#include "frame/frame.h"
#include "photofx.h"

extern "C" {

uint8_t* g_ssrc = nullptr;
uint8_t* g_sblur = nullptr;
uint8_t* g_tempd = nullptr;
int32_t g_scaled_wd = 0;
int32_t g_scaled_ht = 0;
int32_t all = 0;

}  // extern "C"

namespace pfx {

int64_t g_workspace_samples = 0;

uint8_t* take_workspace_buffer(int64_t bytes) {
  return static_cast<uint8_t*>(fx_calloc(static_cast<uint32_t>(bytes > 0 ? bytes : 1), 1));
}

namespace {

// Private working copies of the one-shot blur, released together.
struct OneShot {
  uint8_t* image = nullptr;
  uint8_t* depth = nullptr;
  uint8_t* blurred = nullptr;
  ~OneShot() {
    fx_free(image);
    fx_free(depth);
    fx_free(blurred);
  }
};

// The working depth map: a copy of the mask, or the whole image when every pixel is selected.
// Carrying "everything" as a flag keeps the caller's mask unwritten.
void fill_depth(const uint8_t* mask, int32_t width, int32_t height, uint8_t* depth, int32_t sw,
                int32_t sh, bool every_pixel) {
  if (every_pixel) {
    fx_memset(depth, 1, static_cast<uint32_t>(int64_t{sw} * sh));
  } else {
    scale_down_depth(mask, width, height, depth, sw, sh);
  }
}

}  // namespace

}  // namespace pfx

extern "C" {

void scale_down_img(const uint32_t* src, int32_t width, int32_t height, uint8_t* out, int32_t sw,
                    int32_t sh) {
  if (src == nullptr || out == nullptr) return;
  if (!pfx::is_image(width, height) || !pfx::is_image(sw, sh)) return;
  const int32_t step_x = width / sw, step_y = height / sh;
  for (int32_t y = 0; y < sh; ++y) {
    // y * step_y < height and x * step_x < width: every read lies inside the source.
    const size_t row =
        static_cast<size_t>(y) * static_cast<size_t>(step_y) * static_cast<size_t>(width);
    uint8_t* o = out + static_cast<size_t>(y) * static_cast<size_t>(sw) * 3;
    for (int32_t x = 0; x < sw; ++x) {
      const uint32_t p = src[row + static_cast<size_t>(x) * static_cast<size_t>(step_x)];
      o[3 * x + 0] = static_cast<uint8_t>(p >> 16);
      o[3 * x + 1] = static_cast<uint8_t>(p >> 8);
      o[3 * x + 2] = static_cast<uint8_t>(p);
    }
  }
}

void scale_down_depth(const uint8_t* mask, int32_t width, int32_t height, uint8_t* depth,
                      int32_t sw, int32_t sh) {
  if (mask == nullptr || depth == nullptr) return;
  if (!pfx::is_image(width, height) || !pfx::is_image(sw, sh)) return;
  const int32_t step_x = width / sw, step_y = height / sh;
  for (int32_t y = 0; y < sh; ++y) {
    const size_t row =
        static_cast<size_t>(y) * static_cast<size_t>(step_y) * static_cast<size_t>(width);
    uint8_t* o = depth + static_cast<size_t>(y) * static_cast<size_t>(sw);
    for (int32_t x = 0; x < sw; ++x) {
      o[x] = mask[row + static_cast<size_t>(x) * static_cast<size_t>(step_x)];
    }
  }
}

void fx_destroy_blur() {
  if (g_ssrc != nullptr) {
    fx_free(g_ssrc);
    g_ssrc = nullptr;
  }
  if (g_tempd != nullptr) {
    fx_free(g_tempd);
    g_tempd = nullptr;
  }
  if (g_sblur != nullptr) {
    fx_free(g_sblur);
    g_sblur = nullptr;
  }
  pfx::g_workspace_samples = 0;
}

void fx_Init_blur(const uint32_t* src, const uint8_t* mask, int32_t width, int32_t height,
                  int32_t left, int32_t right, int32_t top, int32_t bottom) {
  fx_destroy_blur();
  const bool every_pixel = !pfx::is_region({left, right, top, bottom});
  if (src == nullptr || (mask == nullptr && !every_pixel)) return;
  if (!pfx::is_image(width, height)) return;

  const int32_t k = pfx::reduction_shift(width, height);
  const int32_t sw = width >> k, sh = height >> k;
  all = every_pixel ? 1 : 0;
  g_scaled_wd = sw;
  g_scaled_ht = sh;
  const bool usable = pfx::can_composite(sw, sh);
  const int64_t bytes = usable ? pfx::working_bytes(sw, sh) : 0;

  g_ssrc = pfx::take_workspace_buffer(bytes);
  g_tempd = pfx::take_workspace_buffer(bytes / 3);
  g_sblur = pfx::take_workspace_buffer(bytes);
  if (g_ssrc == nullptr || g_tempd == nullptr || g_sblur == nullptr) {
    // Half a workspace would let previews composite from buffers that were never filled.
    fx_destroy_blur();
    return;
  }
  if (usable) {
    scale_down_img(src, width, height, g_ssrc, sw, sh);
    pfx::fill_depth(mask, width, height, g_tempd, sw, sh, every_pixel);
    pfx::g_workspace_samples = int64_t{sw} * sh;
  }
}

void fx_make_blur_preview(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                          int32_t height, int32_t level) {
  if (g_ssrc == nullptr || g_sblur == nullptr || g_tempd == nullptr) return;
  const bool every_pixel = all != 0;
  if (src == nullptr || dst == nullptr || (mask == nullptr && !every_pixel)) return;
  if (!pfx::is_image(width, height)) return;
  if (!pfx::workspace_fits(g_scaled_wd, g_scaled_ht)) {
    pfx::copy_image(src, dst, pfx::pixel_count(width, height));
    return;
  }
  // The working source is never modified, so every preview starts from the same data.
  if (!pfx::gaussian_blur(g_ssrc, g_sblur, g_tempd, g_scaled_wd, g_scaled_ht, level)) return;
  pfx::composite(src, g_sblur, mask, g_tempd, dst, width, height, g_scaled_wd, g_scaled_ht,
                 every_pixel);
}

void fx_make_blur(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                  int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                  int32_t bottom) {
  // The one-shot blur keeps its own whole-image flag: its result never depends on what an
  // earlier preview left in the module's flag.
  const bool every_pixel = !pfx::is_region({left, right, top, bottom});
  if (src == nullptr || dst == nullptr || (mask == nullptr && !every_pixel)) return;
  if (!pfx::is_image(width, height)) return;
  const int32_t k = pfx::reduction_shift(width, height);
  const int32_t sw = width >> k, sh = height >> k;
  if (!pfx::can_composite(sw, sh)) {
    pfx::copy_image(src, dst, pfx::pixel_count(width, height));
    return;
  }

  const int64_t bytes = pfx::working_bytes(sw, sh);
  pfx::OneShot w;
  w.image = static_cast<uint8_t*>(fx_calloc(static_cast<uint32_t>(bytes), 1));
  if (w.image == nullptr) return;
  scale_down_img(src, width, height, w.image, sw, sh);
  w.depth = static_cast<uint8_t*>(fx_calloc(static_cast<uint32_t>(bytes / 3), 1));
  if (w.depth == nullptr) return;
  pfx::fill_depth(mask, width, height, w.depth, sw, sh, every_pixel);
  w.blurred = static_cast<uint8_t*>(fx_calloc(static_cast<uint32_t>(bytes), 1));
  if (w.blurred == nullptr) return;
  if (!pfx::gaussian_blur(w.image, w.blurred, w.depth, sw, sh, level)) return;
  fx_free(w.image);
  w.image = nullptr;
  pfx::composite(src, w.blurred, mask, w.depth, dst, width, height, sw, sh, every_pixel);
}

void applyBlur(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
               int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
               int32_t bottom) {
  fx_make_blur(src, mask, dst, width, height, level, left, right, top, bottom);
}

}  // extern "C"
