// NEON kernels of the adjustments: the rules of adjust/rules_neon.h over a Run.
#if defined(__ARM_NEON)

#include <cstddef>

#include "adjust/kernels.h"
#include "adjust/rules_neon.h"
#include "frame/neon.h"

namespace pfx::neon {

size_t kernel(const Run& run, const Brightness& rule) {
  return run_blocks(run, BrightnessNeon(rule));
}

size_t kernel(const Run& run, const Contrast& rule) {
  if (ContrastNeon<true>::fits(rule)) return run_blocks(run, ContrastNeon<true>(rule));
  if (ContrastNeon<false>::fits(rule)) return run_blocks(run, ContrastNeon<false>(rule));
  return 0;
}

size_t kernel(const Run& run, const Saturation& rule) {
  return run_blocks(run, SaturationNeon(rule));
}

size_t kernel(const Run& run, const Temperature& rule) {
  return TemperatureNeon::fits(rule) ? run_blocks(run, TemperatureNeon(rule)) : 0;
}

size_t kernel(const Run& run, const Exposure& rule) { return run_blocks(run, ExposureNeon(rule)); }

size_t kernel(const Run& run, const Fade& rule) { return run_blocks(run, FadeNeon(rule)); }

size_t kernel(const Run& run, const Gains& rule) { return run_blocks(run, GainsNeon(rule)); }

// The channels are looked up as planes of up to 64 pixels, a loop per channel that is not
// the identity (channel selectors leave the others alone).
size_t kernel(const Run& run, const ChannelMap& map) {
  LookupTable tables[3];
  bool identity[3] = {true, true, true};
  const uint32_t* words[3] = {map.red, map.green, map.blue};
  for (int32_t k = 0; k < 3; ++k) {
    uint8_t bytes[256];
    for (int32_t c = 0; c < 256; ++c) {
      bytes[c] = static_cast<uint8_t>(words[k][c] >> (16 - 8 * k));
      identity[k] = identity[k] && bytes[c] == c;
    }
    tables[k] = lookup_table(bytes);
  }
  constexpr size_t kChunk = 64;
  const size_t n = run.n & ~size_t{31};
  alignas(16) uint8_t plane[3][kChunk];
  for (size_t i = 0; i < n;) {
    const size_t m = n - i < kChunk ? n - i : kChunk;
    const uint8_t* src = reinterpret_cast<const uint8_t*>(run.src + i);
    uint8_t* dst = reinterpret_cast<uint8_t*>(run.dst + i);
    for (size_t j = 0; j < m; j += 16) {
      const uint8x16x4_t px = vld4q_u8(src + 4 * j);
      for (int32_t c = 0; c < 3; ++c) vst1q_u8(plane[c] + j, px.val[2 - c]);
    }
    for (int32_t c = 0; c < 3; ++c) {
      if (!identity[c]) look_up(tables[c], plane[c], plane[c], m);
    }
    for (size_t j = 0; j < m; j += 16) {
      uint8x16x4_t px = vld4q_u8(src + 4 * j);
      for (int32_t c = 0; c < 3; ++c) px.val[2 - c] = vld1q_u8(plane[c] + j);
      vst4q_u8(dst + 4 * j, px);
    }
    i += m;
  }
  return n;
}

}  // namespace pfx::neon

#endif
