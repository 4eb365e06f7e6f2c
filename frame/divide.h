// Divisions the pixel loops make by multiplying instead: a multiplication vectorises where a
// division does not, and ARMv7 has no divide instruction at all. Each helper is exact over the
// range its caller gives it, which the comment states; tests/division_test.cpp checks every
// value of that range against true division.
#pragma once

#include <cstdint>

namespace pfx {

// (a + 9) / 10, the contrast step, for 0 <= a <= 1019 (the caller's a is at most 128):
// 205 / 2^11 exceeds 1 / 10 by 1 / 10240, which carries (a + 9) / 10 to the next integer only
// from a + 9 = 1029 on.
constexpr int32_t contrast_step(int32_t a) { return ((a + 9) * 205) >> 11; }

// sum / 3 for 0 <= sum <= 765, the mean of three channels: (sum * 683) >> 11 exceeds sum / 3 by
// sum / 6144, less than a third for every sum up to 765, so the floor is the same.
constexpr uint32_t third(uint32_t sum) { return (sum * 683u) >> 11; }

// x / 36 for 0 <= x < 2^14 (a weighted sum is at most 36 * 255): with M = ceil(2^19 / 36) =
// 14564, M * 36 - 2^19 = 16 is below 2^(19 - 14), so x * M / 2^19 exceeds x / 36 by less than
// 1 / 36 and never reaches the next integer.
constexpr int32_t div36(int32_t x) { return (x * 14564) >> 19; }

// x / 25500 for 0 <= x < 2^23: with M = ceil(2^37 / 25500) = 5389763, M * 25500 - 2^37 = 3028 is
// below 2^(37 - 23), so x * M / 2^37 exceeds x / 25500 by less than 1 / 25500 and never reaches
// the next integer.
constexpr int32_t quotient_25500(uint32_t x) {
  return static_cast<int32_t>((uint64_t{x} * 5389763u) >> 37);
}

// floor(m 2^18 / den) and its remainder, for m < 2^13 and 2^18 <= den < 2^21, from
// recip = floor(2^37 / den): floor(m recip / 2^19) falls short of m 2^18 / den by less than
// m / 2^19 < 1 / 64, so it is the quotient or one less, and one correction step makes it exact
// (the remainder of an estimate one short is den or more, den itself when the division is
// exact). m recip < 2^13 * 2^19 fits 32 bits, as does m 2^18.
struct QuotientRemainder {
  uint32_t q, r;
};
constexpr QuotientRemainder bulge_quotient(uint32_t m, uint32_t den, uint32_t recip) {
  uint32_t q = (m * recip) >> 19;
  uint32_t r = (m << 18) - q * den;
  q = r >= den ? q + 1 : q;
  r = r >= den ? r - den : r;
  return {q, r};
}

}  // namespace pfx
