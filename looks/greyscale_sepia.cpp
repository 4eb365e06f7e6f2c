// Greyscale and sepia.
//
// Greyscale replaces each pixel by the mean of its three channels times a gain set by the
// slider, so the same control also lightens or darkens the grey. Sepia warms an image with two
// fixed curves: red is lifted and blue lowered, both most strongly in the mid-tones, and green
// passes unchanged.
#include "looks/greyscale_sepia.h"

#include <cstdint>

#include "frame/frame.h"
#include "frame/pixel.h"
#include "frame/table.h"
#include "photofx.h"

namespace pfx {
namespace {

// Red offset: rises by one every four values to 32 at 127..128 and falls back to 0. Three values
// sit one step off the plain quarter; they are part of the curve, and images tinted with it
// depend on them.
constexpr int32_t sepia_red(int32_t v) {
  if (v < 0 || v > 255) return v;
  int32_t offset;
  if (v <= 128) {
    offset = v == 43 ? 10 : (v + 1) >> 2;
  } else if (v == 133) {
    offset = 31;
  } else if (v == 137) {
    offset = 30;
  } else {
    offset = (256 - v) >> 2;
  }
  return v + offset;
}

// Blue offset: a run of 0 at each end and a peak of 31 over 125..130.
constexpr int32_t sepia_blue(int32_t v) {
  if (v < 0 || v > 255) return v;
  int32_t offset = 0;
  if (v >= 1 && v <= 128) {
    offset = (v - 1) >> 2;
  } else if (v >= 129) {
    offset = (254 - v) >> 2;
    if (offset < 0) offset = 0;
  }
  return v - offset;
}

constexpr uint8_t sepia_red_entry(int32_t v) { return static_cast<uint8_t>(sepia_red(v)); }
constexpr uint8_t sepia_blue_entry(int32_t v) { return static_cast<uint8_t>(sepia_blue(v)); }

// (m x gain) >> 16 for every channel mean m, clamped to a byte. The gain is formed in 64 bits,
// so every int32_t level gives the exact product: far beyond the slider ends the grey simply
// pins at 0 or 255.
struct GreyscaleRule {
  uint8_t grey[256];

  explicit GreyscaleRule(int32_t level) : grey{} {
    const int64_t gain = (int64_t{level} - 10) * 4000 + 65536;
    for (int32_t m = 0; m < 256; ++m) {
      const int64_t v = (m * gain) >> 16;
      grey[m] = static_cast<uint8_t>(v < 0 ? 0 : (v > 255 ? 255 : v));
    }
  }

  uint32_t operator()(uint32_t p) const {
    const uint32_t mean = static_cast<uint32_t>(red_of(p) + green_of(p) + blue_of(p)) / 3;
    return alpha_bits(p) | uint32_t{grey[mean]} * 0x010101u;
  }
};

int32_t sepia_status(bool done) { return done ? PHOTOFX_SUCCESS : PHOTOFX_INVALID_ARGUMENT; }

}  // namespace

constinit const uint8_t kSepiaRed[256] = {PFX_TABLE_256(sepia_red_entry, 0)};
constinit const uint8_t kSepiaBlue[256] = {PFX_TABLE_256(sepia_blue_entry, 0)};

uint32_t sepia_pixel(uint32_t p) {
  return pack(p, kSepiaRed[red_of(p)], green_of(p), kSepiaBlue[blue_of(p)]);
}

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
  return pfx::sepia_status(pfx::for_each_pixel(src, dst, width, height, pfx::sepia_pixel));
}

int32_t fx_apply_sepia_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                               int32_t width, int32_t height, int32_t left, int32_t right,
                               int32_t top, int32_t bottom) {
  return pfx::sepia_status(pfx::edit_selected(src, mask, dst, width, height,
                                              {left, right, top, bottom}, pfx::sepia_pixel));
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
