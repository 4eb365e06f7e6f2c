// Saturation and temperature.
//
// Saturation blends each pixel between a grey value and an exaggerated copy of itself through a
// 3 x 3 channel matrix in 10-bit fixed point: level 0 is grey, 10 leaves the colour alone and 20
// doubles the distance from grey. Temperature shifts the two chroma components by amounts that
// depend only on the level: above 10 the image warms (less blue, more red), below it cools.
#include <cstdint>

#include "adjust/kernels.h"
#include "adjust/saturation_temperature.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "photofx.h"

extern "C" {

void fx_control_saturation_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                               int32_t level) {
  const pfx::Saturation rule(level);
  pfx::for_each_pixel(src, dst, width, height, pfx::on_pixels(rule), pfx::kernel_for(rule));
}

void fx_control_saturation(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                           int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                           int32_t bottom) {
  const pfx::Saturation rule(level);
  pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                     pfx::on_pixels(rule), pfx::kernel_for(rule));
}

void fx_control_temperature_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                int32_t level) {
  const pfx::Temperature rule(level);
  pfx::for_each_pixel(src, dst, width, height, pfx::on_pixels(rule), pfx::kernel_for(rule));
}

void fx_control_temperature(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                            int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                            int32_t bottom) {
  const pfx::Temperature rule(level);
  pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                     pfx::on_pixels(rule), pfx::kernel_for(rule));
}

void controlSaturation(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                       int32_t level) {
  fx_control_saturation_all(src, dst, width, height, level);
}

void controlSaturationPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                              int32_t width, int32_t height, int32_t level, int32_t left,
                              int32_t right, int32_t top, int32_t bottom) {
  fx_control_saturation(src, mask, dst, width, height, level, left, right, top, bottom);
}

void controlTemperature(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                        int32_t level) {
  fx_control_temperature_all(src, dst, width, height, level);
}

void controlTemperaturePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                               int32_t width, int32_t height, int32_t level, int32_t left,
                               int32_t right, int32_t top, int32_t bottom) {
  fx_control_temperature(src, mask, dst, width, height, level, left, right, top, bottom);
}

}  // extern "C"
