// 16.16 fixed point for the library's own per-pixel code: the integer-only conversions as
// inline functions, plus the per-thread error word that the exported functions record range and
// domain errors in.
#pragma once

#include <cstdint>

namespace pfx {

constexpr int32_t kFixOne = 65536;

// Values stored in the error word: ERANGE and EDOM as Linux numbers them.
constexpr int32_t kFixRangeError = 34;
constexpr int32_t kFixDomainError = 33;

// x << 16 in a 32-bit word; bits shifted out are lost.
constexpr int32_t itofix(int32_t x) { return static_cast<int32_t>(static_cast<uint32_t>(x) << 16); }

// Largest integer not above x (an arithmetic shift rounds toward minus infinity).
constexpr int32_t fixfloor(int32_t x) { return x >> 16; }

// Nearest integer, halves toward plus infinity: the floor plus the first fraction bit.
constexpr int32_t fixtoi(int32_t x) { return (x >> 16) + ((x >> 15) & 1); }

// The error word of the calling thread: 0 until a fixed-point function meets an error. Each
// thread has its own, so threads never race on it.
int32_t& fix_error_word();

}  // namespace pfx
