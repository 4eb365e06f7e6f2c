// Greyscale and sepia.
//
// Greyscale replaces each pixel by the mean of its three channels times a gain set by the
// slider, so the same control also lightens or darkens the grey. Sepia warms an image with two
// fixed curves: red is lifted and blue lowered, both most strongly in the mid-tones, and green
// passes unchanged.
#include "looks/greyscale_sepia.h"

#include <cstdint>

#include "frame/divide.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "frame/table.h"
#include "looks/kernels.h"
#include "photofx.h"

namespace pfx {
namespace {

constexpr uint8_t sepia_red_entry(int32_t v) { return static_cast<uint8_t>(sepia_red(v)); }
constexpr uint8_t sepia_blue_entry(int32_t v) { return static_cast<uint8_t>(sepia_blue(v)); }

// The channel mean m times the gain, (m * gain) >> 16, held to a byte.
//
// The gain is formed in 64 bits, so every int32_t level gives the exact product (far beyond the
// slider ends the grey simply pins at 0 or 255), and then held to 0 .. 255 << 16 so that the
// product fits an unsigned 32-bit word: a gain of 0 or less makes every grey 0 and one of
// 255 << 16 or more makes every non-zero mean 255 already. The mean is sum / 3 by a
// multiplication (frame/divide.h), which vectorises.
class GreyscaleRule {
 public:
  explicit constexpr GreyscaleRule(int32_t level) : gain_(held_gain(level)) {}

  constexpr uint32_t operator()(uint32_t p) const {
    const uint32_t mean = third(static_cast<uint32_t>(red_of(p) + green_of(p) + blue_of(p)));
    const uint32_t v = (mean * gain_) >> 16;
    return alpha_bits(p) | (v > 255u ? 255u : v) * 0x010101u;
  }

 private:
  static constexpr uint32_t held_gain(int32_t level) {
    const int64_t gain = (int64_t{level} - 10) * 4000 + 65536;
    return static_cast<uint32_t>(gain < 0 ? 0 : (gain > (255 << 16) ? (255 << 16) : gain));
  }

  uint32_t gain_;
};

// Sepia of one pixel, arithmetic so that it vectorises: red lifted, blue lowered, green and
// alpha kept.
constexpr auto sepia_rule = [](uint32_t p) {
  const int32_t r = red_of(p), b = blue_of(p);
  return pack(p, r + sepia_red_offset(r), green_of(p), b - sepia_blue_offset(b));
};

int32_t sepia_status(bool done) { return done ? PHOTOFX_SUCCESS : PHOTOFX_INVALID_ARGUMENT; }

}  // namespace

constinit const uint8_t kSepiaRed[256] = {PFX_TABLE_256(sepia_red_entry, 0)};
constinit const uint8_t kSepiaBlue[256] = {PFX_TABLE_256(sepia_blue_entry, 0)};

}  // namespace pfx

extern "C" {

void fx_control_greyscale_all(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                              int32_t level) {
  pfx::for_each_pixel(src, dst, width, height, pfx::GreyscaleRule(level));
}

void fx_control_greyscale(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                          int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                          int32_t bottom) {
  pfx::edit_selected(src, mask, dst, width, height, {left, right, top, bottom},
                     pfx::GreyscaleRule(level));
}

int32_t fx_apply_sepia(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  return pfx::sepia_status(
      pfx::for_each_pixel(src, dst, width, height, pfx::sepia_rule, pfx::neon::sepia));
}

int32_t fx_apply_sepia_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                               int32_t width, int32_t height, int32_t left, int32_t right,
                               int32_t top, int32_t bottom) {
  return pfx::sepia_status(pfx::edit_selected(src, mask, dst, width, height,
                                              {left, right, top, bottom}, pfx::sepia_rule,
                                              pfx::neon::sepia));
}

int32_t fx_get_sepia_r(int32_t value) { return pfx::sepia_red(value); }

int32_t fx_get_sepia_b(int32_t value) { return pfx::sepia_blue(value); }

void controlGreyscale(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                      int32_t level) {
  fx_control_greyscale_all(src, dst, width, height, level);
}

void controlGreyscalePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                             int32_t height, int32_t level, int32_t left, int32_t right,
                             int32_t top, int32_t bottom) {
  fx_control_greyscale(src, mask, dst, width, height, level, left, right, top, bottom);
}

}  // extern "C"
