// The NEON side of the frame: eight pixels at a time as three planes of channel bytes, and the
// loop that runs a kernel's block over a Run. Included by the *_neon.cpp files only, which the
// armv7-neon build compiles with NEON; every rule written here has a portable twin it is tested
// against bit for bit.
//
// Conventions of the rules: a channel plane is a uint8x8_t of eight values 0..255; wider
// intermediate values live in int16x8_t lanes, whose arithmetic wraps like the unsigned words it
// is, and each rule states the ranges that keep its true values inside its lanes.
#pragma once

#if !defined(__ARM_NEON)
#error "frame/neon.h is for NEON builds"
#endif

#include <arm_neon.h>

#include <cstddef>
#include <cstdint>
#include <tuple>
#include <utility>

#include "frame/kernel.h"

namespace pfx::neon {

// Eight pixels' colour channels, one d register each. Blocks of eight keep a rule's working
// values within the sixteen q registers; with sixteen pixels GCC spills them.
struct Rgb8 {
  uint8x8_t r, g, b;
};

// Runs block(Rgb8&) over the run in blocks of eight pixels and returns how many pixels it did;
// alpha passes through. With a mask, each pixel takes the block's result where its mask byte is
// 1 and its source value elsewhere.
template <class Block>
inline size_t run_blocks(const Run& run, const Block& block) {
  // Locals, so that the stores through dst cannot make the compiler read the run again; the
  // loops count by pointer, which leaves one compare and branch per block.
  const size_t n = run.n & ~size_t{7};
  const uint8_t* src = reinterpret_cast<const uint8_t*>(run.src);
  const uint8_t* const end = src + 4 * n;
  const uint8_t* mask = run.mask;
  uint8_t* dst = reinterpret_cast<uint8_t*>(run.dst);
  if (mask == nullptr) {
    for (; src != end; src += 32, dst += 32) {
      uint8x8x4_t px = vld4_u8(src);  // val[0] blue, [1] green, [2] red, [3] alpha
      Rgb8 c{px.val[2], px.val[1], px.val[0]};
      block(c);
      px.val[2] = c.r;
      px.val[1] = c.g;
      px.val[0] = c.b;
      vst4_u8(dst, px);
    }
    return n;
  }
  const uint8x8_t one = vdup_n_u8(1);
  for (; src != end; src += 32, dst += 32, mask += 8) {
    uint8x8x4_t px = vld4_u8(src);
    Rgb8 c{px.val[2], px.val[1], px.val[0]};
    block(c);
    const uint8x8_t selected = vceq_u8(vld1_u8(mask), one);
    px.val[2] = vbsl_u8(selected, c.r, px.val[2]);
    px.val[1] = vbsl_u8(selected, c.g, px.val[1]);
    px.val[0] = vbsl_u8(selected, c.b, px.val[0]);
    vst4_u8(dst, px);
  }
  return n;
}

// A channel widened to signed 16-bit lanes, and back with the clamp to 0..255.
inline int16x8_t widen(uint8x8_t v) { return vreinterpretq_s16_u16(vmovl_u8(v)); }
inline uint8x8_t clamped(int16x8_t v) { return vqmovun_s16(v); }

// Four 16-bit constants in one d register, for the multiplies by lane: GCC keeps such a
// register in the loop, where it reloads the scalar of a multiply by an immediate every time.
inline int16x4_t constants(int16_t a, int16_t b, int16_t c, int16_t d) {
  const int16_t v[4] = {a, b, c, d};
  return vld1_s16(v);
}

// A 256-entry byte table laid out for lookup(): in each 32-entry segment the byte at 4i + j holds
// entry 8j + i, so that one vld4 puts the segment's entries in order into four registers, as the
// table instructions want them, without moving them about.
struct LookupTable {
  uint8_t bytes[256];
};

constexpr LookupTable lookup_table(const uint8_t (&t)[256]) {
  LookupTable out{};
  for (int32_t segment = 0; segment < 256; segment += 32) {
    for (int32_t i = 0; i < 8; ++i) {
      for (int32_t j = 0; j < 4; ++j) out.bytes[segment + 4 * i + j] = t[segment + 8 * j + i];
    }
  }
  return out;
}

// table[idx] for n bytes of in (n a multiple of 32) into out, which may be in: eight segments of
// 32 entries, each looked up by the index less the segment's start (an index outside a segment
// leaves the result as it was). Thirty-two bytes a step share each segment's load.
inline void look_up(const LookupTable& table, const uint8_t* in, uint8_t* out, size_t n) {
  const uint8x8_t segment = vdup_n_u8(32);
  for (size_t k = 0; k < n; k += 32) {
    uint8x8_t idx[4] = {vld1_u8(in + k), vld1_u8(in + k + 8), vld1_u8(in + k + 16),
                        vld1_u8(in + k + 24)};
    uint8x8x4_t s = vld4_u8(table.bytes);
    uint8x8_t res[4];
    for (int32_t j = 0; j < 4; ++j) res[j] = vtbl4_u8(s, idx[j]);
    for (int32_t part = 1; part < 8; ++part) {
      s = vld4_u8(table.bytes + 32 * part);
      for (int32_t j = 0; j < 4; ++j) {
        idx[j] = vsub_u8(idx[j], segment);
        // Left to itself GCC computes all eight offsets of every index at once and spills them.
        asm("" : "+w"(idx[j]));
        res[j] = vtbx4_u8(res[j], s, idx[j]);
      }
    }
    for (int32_t j = 0; j < 4; ++j) vst1_u8(out + k + 8 * j, res[j]);
  }
}

// A chain of rules on Rgb8, applied in order, as one block.
template <class... Rules>
struct Chain {
  explicit Chain(const Rules&... rules) : rules_{rules...} {}
  void operator()(Rgb8& c) const { apply(c, std::index_sequence_for<Rules...>{}); }

 private:
  template <size_t... I>
  void apply(Rgb8& c, std::index_sequence<I...>) const {
    ((std::get<I>(rules_)(c)), ...);
  }
  std::tuple<Rules...> rules_;
};

}  // namespace pfx::neon
