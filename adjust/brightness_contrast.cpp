// Brightness and contrast.
//
// Brightness moves the luma of each pixel by 10 per level step from the neutral 10 and keeps its
// chroma. Contrast pushes each colour channel away from 128 (levels above 10) or draws it toward
// 128 (below 10) by a step read from a table; a channel never crosses 128.
#include <cstdint>

#include "adjust/brightness_contrast.h"
#include "adjust/channel_map.h"
#include "adjust/kernels.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "frame/table.h"
#include "photofx.h"

namespace pfx {

// (c - 128) / 10 rounded away from zero.
constexpr int32_t contrast_step_entry(int32_t c) {
  return c < 128 ? -((128 - c + 9) / 10) : (c - 128 + 9) / 10;
}

constinit const int32_t kContrastStep[256] = {PFX_TABLE_256(contrast_step_entry, 0)};

}  // namespace pfx

extern "C" {

void fx_control_brightness_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                               int32_t level) {
  const pfx::Brightness rule(level);
  pfx::for_each_pixel(src, dst, width, height, pfx::on_pixels(rule), pfx::kernel_for(rule));
}

void fx_control_brightness(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                           int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                           int32_t bottom) {
  const pfx::Brightness rule(level);
  pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                     pfx::on_pixels(rule), pfx::kernel_for(rule));
}

void fx_control_contrast_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                             int32_t level) {
  const pfx::Contrast rule(level);
  pfx::for_each_pixel_by_channel(src, dst, width, height, rule, pfx::kernel_for(rule));
}

void fx_control_contrast(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                         int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                         int32_t bottom) {
  const pfx::Contrast rule(level);
  pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                     pfx::on_pixels(rule), pfx::kernel_for(rule));
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
