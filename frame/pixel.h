// Pixel words, channels and the small integer helpers every per-pixel rule uses.
//
// A pixel is 0xAARRGGBB. Rules work on plain int32_t channels and pack the result with the
// source pixel's alpha, so alpha survives every adjustment without further thought.
#pragma once

#include <cstdint>

namespace pfx {

constexpr int32_t red_of(uint32_t p) { return static_cast<int32_t>((p >> 16) & 0xFFu); }
constexpr int32_t green_of(uint32_t p) { return static_cast<int32_t>((p >> 8) & 0xFFu); }
constexpr int32_t blue_of(uint32_t p) { return static_cast<int32_t>(p & 0xFFu); }
constexpr uint32_t alpha_bits(uint32_t p) { return p & 0xFF000000u; }

// Alpha of `p` with the low eight bits of each channel; callers clamp first where it matters.
constexpr uint32_t pack(uint32_t p, int32_t r, int32_t g, int32_t b) {
  return alpha_bits(p) | ((static_cast<uint32_t>(r) & 0xFFu) << 16) |
         ((static_cast<uint32_t>(g) & 0xFFu) << 8) | (static_cast<uint32_t>(b) & 0xFFu);
}

// The three colour channels of a pixel as the per-pixel rules pass them along. A chain of rules
// hands each result straight to the next rule and packs only the last one into a pixel; every
// rule's channels lie in 0..255, so nothing is lost by not packing in between.
struct Rgb {
  int32_t r, g, b;
};

constexpr Rgb channels_of(uint32_t p) { return {red_of(p), green_of(p), blue_of(p)}; }

constexpr uint32_t pack(uint32_t p, Rgb c) { return pack(p, c.r, c.g, c.b); }

// clang (the wasm build) calls a chain of a few rules once per pixel rather than inline it,
// which keeps the pixel loop from vectorising: the preset looks ran two to three times as long.
#if defined(__clang__)
#define PFX_INLINE_RULE __attribute__((always_inline))
#else
#define PFX_INLINE_RULE
#endif

// Rules on channels, in order, as one rule on pixels that keeps each pixel's alpha.
template <class... Rules>
constexpr auto on_pixels(Rules... rules) {
  return [=](uint32_t p) PFX_INLINE_RULE {
    Rgb c = channels_of(p);
    ((c = rules(c)), ...);
    return pack(p, c);
  };
}

constexpr int32_t clamp_byte(int32_t v) { return v < 0 ? 0 : (v > 255 ? 255 : v); }

constexpr int32_t clamp_to(int32_t v, int32_t lo, int32_t hi) {
  return v < lo ? lo : (v > hi ? hi : v);
}

// Two's-complement arithmetic for the places where a 32-bit result is meant to wrap. Signed
// overflow is undefined in C++, so the wrap is done on unsigned words.
constexpr int32_t wrap_add(int32_t a, int32_t b) {
  return static_cast<int32_t>(static_cast<uint32_t>(a) + static_cast<uint32_t>(b));
}
constexpr int32_t wrap_sub(int32_t a, int32_t b) {
  return static_cast<int32_t>(static_cast<uint32_t>(a) - static_cast<uint32_t>(b));
}
constexpr int32_t wrap_mul(int32_t a, int32_t b) {
  return static_cast<int32_t>(static_cast<uint32_t>(a) * static_cast<uint32_t>(b));
}

}  // namespace pfx
