// Saturation and temperature.
//
// Saturation blends each pixel between a grey value and an exaggerated copy of itself through a
// 3 x 3 channel matrix in 10-bit fixed point: level 0 is grey, 10 leaves the colour alone and 20
// doubles the distance from grey. Temperature shifts the two chroma components by amounts that
// depend only on the level: above 10 the image warms (less blue, more red), below it cools.
#include <cstdint>

#include "adjust/ycbcr.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

// Strength 1024 is the unchanged colour, 0 pure grey, 2048 the strongest push away from grey.
// The formula already holds the strength at 0 from level 0 down and at 2048 from level 20 up, so
// holding the level to 0..20 first changes no result and keeps the product from overflowing.
constexpr int32_t saturation_strength(int32_t level) {
  return clamp_to(103 * (clamp_to(level, 0, 20) - 10) + 1024, 0, 2048);
}

auto saturation_rule(int32_t level) {
  const int32_t s = saturation_strength(level);
  const int32_t k = 1024 - s;
  // Grey weights; they sum to 1024 and are not the luma weights of the YCbCr conversion.
  const int32_t wr = (316 * k) >> 10;
  const int32_t wg = (624 * k) >> 10;
  const int32_t wb = (84 * k) >> 10;
  return [=](uint32_t p) {
    const int32_t r = red_of(p), g = green_of(p), b = blue_of(p);
    const int32_t nr = (r * (wr + s) + g * wg + b * wb) >> 10;
    const int32_t ng = (r * wr + g * (wg + s) + b * wb) >> 10;
    const int32_t nb = (r * wr + g * wg + b * (wb + s)) >> 10;
    return pack(p, clamp_byte(nr), clamp_byte(ng), clamp_byte(nb));
  };
}

// The chroma shifts for one level, each rounded from a fixed-point magnitude and signed by the
// side of 128 its control value lies on.
struct ChromaShift {
  int32_t cb, cr;
};

constexpr int32_t signed_shift(int32_t control) {
  const int32_t diff = control - 128;
  const int32_t magnitude = (512 * (diff < 0 ? -diff : diff) + 256) >> 9;
  return control > 127 ? magnitude : -magnitude;
}

// From 1000 steps on either side of 10 the blue-difference shift passes +-3000 and the
// red-difference shift +-2500 in the opposite direction, which drives red, green and blue to
// 0 or 255 for every source colour (255, 0, 0 when warming, 0, 255, 255 when cooling). Both shifts
// only grow with the step count, so holding it at +-1000 gives the same pixels as unbounded
// arithmetic and keeps every product small.
constexpr ChromaShift temperature_shift(int32_t level) {
  const int32_t t = 3 * (10 - clamp_to(level, -990, 1010));
  const int32_t a = 128 + t;
  const int32_t u = 235 - ((858 * a) >> 10);
  return {signed_shift(a), signed_shift(u)};
}

auto temperature_rule(int32_t level) {
  const ChromaShift shift = temperature_shift(level);
  return [shift](uint32_t p) {
    const YCbCr c = to_ycbcr(red_of(p), green_of(p), blue_of(p));
    return from_ycbcr(p, c.y, c.cb + shift.cb, c.cr + shift.cr);
  };
}

}  // namespace
}  // namespace pfx

extern "C" {

void fx_control_saturation_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                               int32_t level) {
  pfx::for_each_pixel(src, dst, width, height, pfx::saturation_rule(level));
}

void fx_control_saturation(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                           int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                           int32_t bottom) {
  pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                     pfx::saturation_rule(level));
}

void fx_control_temperature_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                int32_t level) {
  pfx::for_each_pixel(src, dst, width, height, pfx::temperature_rule(level));
}

void fx_control_temperature(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                            int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                            int32_t bottom) {
  pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                     pfx::temperature_rule(level));
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
