// Per-call lookup for rules that map red, green and blue each on its own: the rule is evaluated
// once for each of the 256 values of each channel, and the pixel loop is three loads and an or.
// Exact by construction, since the table holds the rule's own results.
#pragma once

#include <cstddef>
#include <cstdint>

#include "frame/frame.h"
#include "frame/pixel.h"

namespace pfx {

struct ChannelMap {
  // Results already shifted into their place in the pixel word.
  uint32_t red[256], green[256], blue[256];

  // fr, fg, fb: int32_t(int32_t c) giving the new channel, 0..255, for a source channel c.
  template <class Fr, class Fg, class Fb>
  ChannelMap(Fr&& fr, Fg&& fg, Fb&& fb) : red{}, green{}, blue{} {
    for (int32_t c = 0; c < 256; ++c) {
      red[c] = (static_cast<uint32_t>(fr(c)) & 0xFFu) << 16;
      green[c] = (static_cast<uint32_t>(fg(c)) & 0xFFu) << 8;
      blue[c] = static_cast<uint32_t>(fb(c)) & 0xFFu;
    }
  }

  // The same curve on all three channels.
  template <class F>
  explicit ChannelMap(F&& f) : ChannelMap(f, f, f) {}

  uint32_t operator()(uint32_t p) const {
    return alpha_bits(p) | red[(p >> 16) & 0xFFu] | green[(p >> 8) & 0xFFu] | blue[p & 0xFFu];
  }
};

// dst[i] = map(src[i]) for i < n; src and dst may be the same buffer. On x86-64 CPUs with byte
// permutes (AVX-512 VBMI) sixteen pixels are looked up at once, the three tables held in
// registers; elsewhere, and for the last few pixels, one pixel at a time.
void map_channels(const ChannelMap& map, const uint32_t* src, uint32_t* dst, size_t n);

// True where map_channels looks sixteen pixels up at once. Three byte permutes a pixel then beat
// working out a rule of a few multiplies and clamps per channel, which is what the per-pixel
// frame does best everywhere else.
bool channel_map_is_fast();

// Where the rule's arithmetic is not done in wide vectors (32-bit ARM without NEON, and the
// tails of the NEON kernels), three table loads a pixel are fewer instructions than a rule of a
// few multiplies and clamps per channel; x86-64 vectorises the arithmetic instead.
#if defined(__x86_64__)
constexpr bool kChannelTablesBeatArithmetic = false;
#else
constexpr bool kChannelTablesBeatArithmetic = true;
#endif

// The full-variant frame for a rule on Rgb that treats each channel on its own (exposure, the
// channel gains, levels): a vector kernel where the build has one, then a channel map where
// that is fast, else the rule per pixel. The map holds the rule's own results, so all give the
// same pixels.
template <class Rule, class Kernel = NoKernel>
bool for_each_pixel_by_channel(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                               const Rule& rule, Kernel&& kernel = {}) {
  if (!channel_map_is_fast() && !kChannelTablesBeatArithmetic) {
    return for_each_pixel(src, dst, width, height, on_pixels(rule), kernel);
  }
  if (src == nullptr || dst == nullptr) return false;
  const int64_t n = pixel_count(width, height);
  if (n > kMaxPixels) return false;
  const size_t done = neon_kernels() ? kernel(Run{src, nullptr, dst, static_cast<size_t>(n)}) : 0;
  if (done == static_cast<size_t>(n)) return true;
  const ChannelMap map(
      [&](int32_t c) {
        return rule(Rgb{c, 0, 0}).r;
      },
      [&](int32_t c) {
        return rule(Rgb{0, c, 0}).g;
      },
      [&](int32_t c) {
        return rule(Rgb{0, 0, c}).b;
      });
  map_channels(map, src + done, dst + done, static_cast<size_t>(n) - done);
  return true;
}

}  // namespace pfx
