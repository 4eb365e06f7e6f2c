// Tone curves: gamma, input levels and output levels.
//
// Each maps the colour channels picked by a channel selector (0 all, 1 red, 2 green, 3 blue; any
// other value picks none and the pixels are copied) through one monotone curve and keeps alpha.
// Gamma raises each channel to the power 1 / gamma; input levels stretch low..high to 0..255;
// output levels squeeze 0..255 into low..high. They are the building blocks of the vintage look,
// which runs them in place.
#include <cmath>
#include <cstdint>

#include "adjust/channel_map.h"
#include "adjust/kernels.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "looks/kernels.h"
#include "looks/tone_curves.h"
#include "photofx.h"

namespace pfx {
namespace {

// The channels a selector picks get curve(c); the others keep c. The table form, for any curve.
template <class Curve>
ChannelMap selected_channels(int32_t channel, const Curve& curve) {
  const bool red = channel == 0 || channel == 1;
  const bool green = channel == 0 || channel == 2;
  const bool blue = channel == 0 || channel == 3;
  return ChannelMap([&](int32_t c) { return red ? curve(c) : c; },
                    [&](int32_t c) { return green ? curve(c) : c; },
                    [&](int32_t c) { return blue ? curve(c) : c; });
}

// The same, with the curve worked out per pixel: for curves of a few integer operations, which
// vectorise where the three table reads of the table form do not.
template <class Curve>
auto selected_channels_arithmetic(int32_t channel, Curve curve) {
  const bool red = channel == 0 || channel == 1;
  const bool green = channel == 0 || channel == 2;
  const bool blue = channel == 0 || channel == 3;
  return [=](uint32_t p) {
    const int32_t r = red_of(p), g = green_of(p), b = blue_of(p);
    return pack(p, red ? curve(r) : r, green ? curve(g) : g, blue ? curve(b) : b);
  };
}

// Levels within 0 <= low < high <= 255, the range the looks use, keep every product within 32
// bits and take the arithmetic form (through the NEON kernel on that path), unless the table
// form is the faster one on this CPU; other levels take the table, made in 64 bits.
bool levels_by_arithmetic(int32_t low, int32_t high) {
  return low >= 0 && low < high && high <= 255 && !channel_map_is_fast() &&
         (neon_kernels() || !kChannelTablesBeatArithmetic);
}

// The full-variant frame for the table form, through the NEON table lookups on that path.
void map_image(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
               const ChannelMap& map) {
  if (src == nullptr || dst == nullptr) return;
  const int64_t n = pixel_count(width, height);
  if (n > kMaxPixels) return;
  const size_t done =
      neon_kernels() ? neon::kernel(Run{src, nullptr, dst, static_cast<size_t>(n)}, map) : 0;
  map_channels(map, src + done, dst + done, static_cast<size_t>(n) - done);
}

}  // namespace
}  // namespace pfx

extern "C" {

void control_gamma(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                   int32_t channel, double gamma) {
  if (src == nullptr || dst == nullptr) return;
  int32_t curve[256];
  for (int32_t n = 0; n < 256; ++n) curve[n] = pfx::gamma_entry(n, gamma);
  pfx::map_image(src, dst, width, height,
                 pfx::selected_channels(channel, [&](int32_t c) { return curve[c]; }));
}

// The level arithmetic is done in 64 bits: for 0 <= low < high <= 255 it gives the same values
// as 32 bits, and any other pair of levels follows the same formulas without overflowing.
void changeHistogramByInput(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                            int32_t channel, int32_t low, int32_t high) {
  if (high <= low) return;  // no range to stretch; dst is left as it was
  const pfx::InputLevels curve(low, high);
  if (pfx::levels_by_arithmetic(low, high)) {
    const int32_t s32 = static_cast<int32_t>(curve.scale);
    pfx::for_each_pixel(
        src, dst, width, height,
        pfx::selected_channels_arithmetic(
            channel, [=](int32_t c) { return pfx::clamp_byte((s32 * (c - low)) >> 10); }),
        [&](const pfx::Run& run) { return pfx::neon::levels(run, channel, true, low, s32); });
    return;
  }
  pfx::map_image(src, dst, width, height, pfx::selected_channels(channel, curve));
}

void changeHistogramByOutput(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                             int32_t channel, int32_t low, int32_t high) {
  if (high <= low) return;
  const pfx::OutputLevels curve(low, high);
  if (pfx::levels_by_arithmetic(low, high)) {
    const int32_t s32 = static_cast<int32_t>(curve.scale);
    pfx::for_each_pixel(
        src, dst, width, height,
        pfx::selected_channels_arithmetic(
            channel, [=](int32_t c) { return pfx::clamp_byte(((s32 * c) >> 10) + low); }),
        [&](const pfx::Run& run) { return pfx::neon::levels(run, channel, false, low, s32); });
    return;
  }
  pfx::map_image(src, dst, width, height, pfx::selected_channels(channel, curve));
}

}  // extern "C"
