// Brightness and contrast.
//
// Brightness moves the luma of each pixel by 10 per level step from the neutral 10 and keeps its
// chroma. Contrast pushes each colour channel away from 128 (levels above 10) or draws it toward
// 128 (below 10) by a step read from a table; a channel never crosses 128.
#include <cstdint>

#include "adjust/brightness_contrast.h"
#include "adjust/ycbcr.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "frame/table.h"
#include "photofx.h"

namespace pfx {

// Beyond +-1000 level steps every result is already pinned at 0, 128 or 255, so holding the
// step count there gives the same pixels as unbounded arithmetic without overflowing it.
constexpr int32_t level_steps(int32_t level) { return clamp_to(level, -990, 1010) - 10; }

// (c - 128) / 10 rounded away from zero.
constexpr int32_t contrast_step_entry(int32_t c) {
  return c < 128 ? -((128 - c + 9) / 10) : (c - 128 + 9) / 10;
}

constinit const int32_t kContrastStep[256] = {PFX_TABLE_256(contrast_step_entry, 0)};

namespace {

auto brightness_rule(int32_t level) {
  const int32_t shift = 10 * level_steps(level);
  return [shift](uint32_t p) {
    const YCbCr c = to_ycbcr(red_of(p), green_of(p), blue_of(p));
    return from_ycbcr(p, c.y + shift, c.cb, c.cr);
  };
}

// Contrast maps each channel on its own, so the whole curve for this level goes into a table
// once per call.
struct ContrastCurve {
  uint8_t out[256];

  explicit ContrastCurve(int32_t level) : out{} {
    const int32_t d = level_steps(level);
    for (int32_t c = 0; c < 256; ++c) {
      const int32_t v = d * kContrastStep[c] + c;
      int32_t r;
      if (c <= 127) {
        r = v > 127 ? 128 : (v < 0 ? 0 : v);
      } else {
        r = v > 254 ? 255 : (v < 128 ? 128 : v);
      }
      out[c] = static_cast<uint8_t>(r);
    }
  }

  uint32_t operator()(uint32_t p) const {
    return alpha_bits(p) | (uint32_t{out[(p >> 16) & 0xFF]} << 16) |
           (uint32_t{out[(p >> 8) & 0xFF]} << 8) | uint32_t{out[p & 0xFF]};
  }
};

}  // namespace
}  // namespace pfx

extern "C" {

void fx_control_brightness_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                               int32_t level) {
  pfx::for_each_pixel(src, dst, width, height, pfx::brightness_rule(level));
}

void fx_control_brightness(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                           int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                           int32_t bottom) {
  pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                     pfx::brightness_rule(level));
}

void fx_control_contrast_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                             int32_t level) {
  pfx::for_each_pixel(src, dst, width, height, pfx::ContrastCurve(level));
}

void fx_control_contrast(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                         int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                         int32_t bottom) {
  pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                     pfx::ContrastCurve(level));
}

void controlBrightness(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                       int32_t level) {
  fx_control_brightness_all(src, dst, width, height, level);
}

void controlBrightnessPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                              int32_t width, int32_t height, int32_t level, int32_t left,
                              int32_t right, int32_t top, int32_t bottom) {
  fx_control_brightness(src, mask, dst, width, height, level, left, right, top, bottom);
}

void controlContrast(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                     int32_t level) {
  fx_control_contrast_all(src, dst, width, height, level);
}

void controlContrastPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                            int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                            int32_t bottom) {
  fx_control_contrast(src, mask, dst, width, height, level, left, right, top, bottom);
}

}  // extern "C"
