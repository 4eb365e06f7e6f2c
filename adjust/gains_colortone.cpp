// Channel gains and colour tone.
//
// Channel gains take one slider per colour channel: each step away from 10 adds 6 to its own
// channel and takes 3 from each of the other two, so moving all three sliders together changes
// nothing. Colour tone repaints the image in one hue: each pixel keeps only its value (largest
// channel), reshaped by a fixed curve that darkens the shadows and lightens the highlights, and
// takes the given hue at saturation 0.3. Colour tone refuses null buffers and hues outside
// 0..360 with PHOTOFX_INVALID_ARGUMENT and then writes nothing.
#include <cstdint>

#include "adjust/channel_map.h"
#include "adjust/gains_colortone.h"
#include "adjust/kernels.h"
#include "frame/frame.h"
#include "frame/hsv.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

// Saturation 0.3 in 16.16, truncated.
constexpr int32_t kToneSaturation = 19660;

// About v^2 / 256 + v / 2: 128 stays, darker values get darker and lighter ones lighter; every
// value from 200 up comes out above 255 and is held there.
constexpr int32_t tone_curve(int32_t v) {
  const int32_t out = ((v * v * 50) / 128 + 50 * v) / 100;
  return out > 255 ? 255 : out;
}

// The new colour depends only on the source value (the largest channel) once the hue is fixed,
// so the 256 possible colours are painted once per call and each pixel looks its colour up.
class ToneMap {
 public:
  explicit ToneMap(int32_t hue) : colour_{} {
    for (int32_t v = 0; v < 256; ++v) {
      const Rgb c = hsv_to_rgb(hue, kToneSaturation, tone_curve(v));
      colour_[v] = pack(0, c.r, c.g, c.b);
    }
  }

  uint32_t operator()(uint32_t p) const {
    const uint32_t r = (p >> 16) & 0xFFu, g = (p >> 8) & 0xFFu, b = p & 0xFFu;
    const uint32_t rg = r > g ? r : g;
    return alpha_bits(p) | colour_[rg > b ? rg : b];
  }

 private:
  uint32_t colour_[256];
};

}  // namespace
}  // namespace pfx

extern "C" {

void fx_adjust_RGB_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                       int32_t red, int32_t green, int32_t blue) {
  const pfx::Gains rule(red, green, blue);
  pfx::for_each_pixel_by_channel(src, dst, width, height, rule, pfx::kernel_for(rule));
}

void fx_adjust_RGB(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                   int32_t height, int32_t red, int32_t green, int32_t blue, int32_t left,
                   int32_t right, int32_t top, int32_t bottom) {
  const pfx::Gains rule(red, green, blue);
  pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                     pfx::on_pixels(rule), pfx::kernel_for(rule));
}

int32_t fx_change_colortone(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                            int32_t hue) {
  if (src == nullptr || dst == nullptr || hue < 0 || hue > 360) return PHOTOFX_INVALID_ARGUMENT;
  const bool done = pfx::for_each_pixel_by_table(src, dst, width, height, pfx::ToneMap(hue));
  return done ? PHOTOFX_SUCCESS : PHOTOFX_INVALID_ARGUMENT;
}

void controlAdjustRGB(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                      int32_t red, int32_t green, int32_t blue) {
  fx_adjust_RGB_all(src, dst, width, height, red, green, blue);
}

void AdjustRGB(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
               int32_t height, int32_t red, int32_t green, int32_t blue, int32_t left,
               int32_t right, int32_t top, int32_t bottom) {
  fx_adjust_RGB(src, mask, dst, width, height, red, green, blue, left, right, top, bottom);
}

}  // extern "C"
