// The pixel loop of the per-call channel tables. A table read per channel does not vectorise
// well (as gathers it is slower than scalar loads), so the scalar loop stays the portable
// version; where the CPU can permute bytes across a whole 64-byte register, a 256-entry byte
// table fits in four registers and sixteen pixels are looked up in a handful of instructions,
// which leaves the loop as fast as a copy of the image.
#include "adjust/channel_map.h"

#include <cstddef>
#include <cstdint>

#include "frame/simd_path.h"

#if defined(__x86_64__) && defined(__GNUC__) && !defined(PHOTOFX_NO_CLONES)
#include <immintrin.h>
#define PFX_BYTE_PERMUTES 1
#endif

namespace pfx {
namespace {

void map_channels_scalar(const ChannelMap& map, const uint32_t* src, uint32_t* dst, size_t n) {
  for (size_t i = 0; i < n; ++i) dst[i] = map(src[i]);
}

#ifdef PFX_BYTE_PERMUTES

// One channel's 256-byte table as two 128-entry halves; each half is two registers, looked up
// by the low seven bits of every byte (vpermi2b).
struct ByteTable {
  __m512i low0, low1, high0, high1;
};

__attribute__((target("avx512f,avx512bw,avx512vbmi"))) ByteTable load_table(const uint8_t* t) {
  return {_mm512_loadu_si512(t), _mm512_loadu_si512(t + 64), _mm512_loadu_si512(t + 128),
          _mm512_loadu_si512(t + 192)};
}

// Every byte of `x` looked up in `t`: the low half's entry where the byte's top bit is clear,
// the high half's where it is set.
__attribute__((target("avx512f,avx512bw,avx512vbmi"))) inline __m512i look_up(const ByteTable& t,
                                                                              __m512i x,
                                                                              __mmask64 top_bit) {
  const __m512i low = _mm512_permutex2var_epi8(t.low0, x, t.low1);
  const __m512i high = _mm512_permutex2var_epi8(t.high0, x, t.high1);
  return _mm512_mask_blend_epi8(top_bit, low, high);
}

__attribute__((target("avx512f,avx512bw,avx512vbmi"))) void map_channels_vbmi(const ChannelMap& map,
                                                                              const uint32_t* src,
                                                                              uint32_t* dst,
                                                                              size_t n) {
  alignas(64) uint8_t bytes[3][256];
  for (size_t c = 0; c < 256; ++c) {
    bytes[0][c] = static_cast<uint8_t>(map.blue[c]);
    bytes[1][c] = static_cast<uint8_t>(map.green[c] >> 8);
    bytes[2][c] = static_cast<uint8_t>(map.red[c] >> 16);
  }
  const ByteTable blue = load_table(bytes[0]), green = load_table(bytes[1]),
                  red = load_table(bytes[2]);
  // Byte positions within each little-endian pixel word: blue 0, green 1, red 2, alpha 3.
  constexpr __mmask64 kBlue = 0x1111111111111111ull, kGreen = kBlue << 1, kRed = kBlue << 2;
  size_t i = 0;
  for (; i + 16 <= n; i += 16) {
    const __m512i x = _mm512_loadu_si512(src + i);
    const __mmask64 top = _mm512_movepi8_mask(x);
    __m512i out = _mm512_mask_mov_epi8(x, kBlue, look_up(blue, x, top));
    out = _mm512_mask_mov_epi8(out, kGreen, look_up(green, x, top));
    out = _mm512_mask_mov_epi8(out, kRed, look_up(red, x, top));
    _mm512_storeu_si512(dst + i, out);
  }
  map_channels_scalar(map, src + i, dst + i, n - i);
}

// Part of the AVX-512 path, where the CPU has them: the portable and AVX2 paths look pixels up
// one at a time, or work the rule out per pixel (channel_map_is_fast).
bool has_byte_permutes() {
  static const bool has =
      __builtin_cpu_supports("avx512vbmi") != 0 && __builtin_cpu_supports("avx512bw") != 0;
  return has && simd_path() == SimdPath::kAvx512;
}

#endif

}  // namespace

bool channel_map_is_fast() {
#ifdef PFX_BYTE_PERMUTES
  return has_byte_permutes();
#else
  return false;
#endif
}

void map_channels(const ChannelMap& map, const uint32_t* src, uint32_t* dst, size_t n) {
#ifdef PFX_BYTE_PERMUTES
  if (has_byte_permutes()) {
    map_channels_vbmi(map, src, dst, n);
    return;
  }
#endif
  map_channels_scalar(map, src, dst, n);
}

}  // namespace pfx
