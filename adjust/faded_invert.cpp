// Faded colour and invert.
//
// Faded colour maps each channel linearly into a narrower, warm-tinted range (red 104..245,
// green 52..240, blue 72..179) and blends that with the pixel's own value; the level, 0..100, is
// the percentage of the mapped value. Invert replaces each colour channel by 255 minus itself.
// Both refuse null buffers (the partial variants also a null mask, whatever the bounds) and
// faded colour a level outside 0..100, with PHOTOFX_INVALID_ARGUMENT and nothing written.
#include <cstdint>

#include "adjust/faded_invert.h"
#include "adjust/kernels.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

constexpr int32_t status(bool done) { return done ? PHOTOFX_SUCCESS : PHOTOFX_INVALID_ARGUMENT; }

constexpr bool fade_level_ok(int32_t level) { return level >= 0 && level <= 100; }

constexpr auto invert = [](uint32_t p) { return p ^ 0x00FFFFFFu; };

}  // namespace
}  // namespace pfx

extern "C" {

int32_t fx_control_fadedcolor_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                  int32_t level) {
  if (src == nullptr || dst == nullptr || !pfx::fade_level_ok(level)) {
    return PHOTOFX_INVALID_ARGUMENT;
  }
  const pfx::Fade rule(level);
  return pfx::status(
      pfx::for_each_pixel(src, dst, width, height, pfx::on_pixels(rule), pfx::kernel_for(rule)));
}

int32_t fx_control_fadedcolor(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                              int32_t width, int32_t height, int32_t level, int32_t left,
                              int32_t right, int32_t top, int32_t bottom) {
  if (src == nullptr || mask == nullptr || dst == nullptr || !pfx::fade_level_ok(level)) {
    return PHOTOFX_INVALID_ARGUMENT;
  }
  const pfx::Fade rule(level);
  return pfx::status(pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                                        pfx::on_pixels(rule), pfx::kernel_for(rule)));
}

int32_t fx_apply_invert_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  return pfx::status(pfx::for_each_pixel(src, dst, width, height, pfx::invert));
}

int32_t fx_apply_invert(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                        int32_t height, int32_t left, int32_t right, int32_t top, int32_t bottom) {
  if (mask == nullptr) return PHOTOFX_INVALID_ARGUMENT;
  return pfx::status(
      pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom}, pfx::invert));
}

void controlFadedColour(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                        int32_t level) {
  fx_control_fadedcolor_all(src, dst, width, height, level);
}

void controlFadedColourPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                               int32_t width, int32_t height, int32_t level, int32_t left,
                               int32_t right, int32_t top, int32_t bottom) {
  fx_control_fadedcolor(src, mask, dst, width, height, level, left, right, top, bottom);
}

void applyInvert(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_invert_all(src, dst, width, height);
}

void applyInvertPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                        int32_t height, int32_t left, int32_t right, int32_t top, int32_t bottom) {
  fx_apply_invert(src, mask, dst, width, height, left, right, top, bottom);
}

}  // extern "C"
