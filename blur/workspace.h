// Working copies: the reduction rule that picks how far a photograph is scaled down before it
// is blurred, and the limits within which a working image can be scaled back up.
#pragma once

#include <cstdint>

#include "frame/frame.h"

namespace pfx {

// An image with at least one pixel that the library can address.
constexpr bool is_image(int32_t width, int32_t height) {
  const int64_t n = pixel_count(width, height);
  return n > 0 && n <= kMaxPixels;
}

// Reduction shift k for a photograph: the working image is (width >> k) x (height >> k). The
// thresholds keep the working image's longer side near 200..425 samples for photographs of up
// to 6800 pixels, so a blur costs about the same whatever the camera.
constexpr int32_t reduction_shift(int32_t width, int32_t height) {
  const int32_t m = width > height ? width : height;
  if (m > 3250) return 4;
  if (m > 1650) return 3;
  if (m > 850) return 2;
  if (m > 420) return 1;
  return 0;
}

// Upscaling interpolates between two neighbouring working rows and columns, and working
// coordinates are kept to 16 bits with 5 fraction bits. A working image outside these limits
// cannot be composited; the blur calls then hand back an unchanged copy of the source.
constexpr int32_t kMinWorkingSide = 2;
constexpr int32_t kMaxWorkingSide = 2048;

constexpr bool can_composite(int32_t sw, int32_t sh) {
  return sw >= kMinWorkingSide && sw <= kMaxWorkingSide && sh >= kMinWorkingSide &&
         sh <= kMaxWorkingSide;
}

// Bytes of a working image of sw x sh samples (red, green, blue per sample).
constexpr int64_t working_bytes(int32_t sw, int32_t sh) {
  return (sw <= 0 || sh <= 0) ? 0 : int64_t{sw} * sh * 3;
}

// Samples the workspace buffers behind g_ssrc, g_sblur (and g_tempd) actually hold: 0 when
// there is no workspace or its working image is too small to composite. g_scaled_wd and
// g_scaled_ht are public and writable, so previews trust them only as far as the buffers reach.
extern int64_t g_workspace_samples;

// Whether the workspace holds an sw x sh working image that can be composited.
inline bool workspace_fits(int32_t sw, int32_t sh) {
  return can_composite(sw, sh) && int64_t{sw} * sh <= g_workspace_samples;
}

// Takes one workspace buffer of `bytes` zero bytes. A working image too small to composite
// still gets a one-byte marker, so that the workspace exists and its previews copy the source
// through; a null result means the allocation failed.
uint8_t* take_workspace_buffer(int64_t bytes);

}  // namespace pfx
