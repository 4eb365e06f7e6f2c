// Fixed-point trigonometry: sine, cosine and tangent by nearest-entry table reads, arctangent
// by bisection of the tangent table, arccosine and arcsine by nearest-entry reads of their own
// table. Angles count 256.0 (0x1000000) to a full turn, so every 32-bit angle wraps cleanly
// through the table masks.
//
// The tables are computed from their rules at compile time (fixmath/table_math.h) and rounded to
// nearest, halves away from zero. Entries closest to a half, checked against a 70-digit
// computation: _acos_tbl[24] = 7223158.50036 (stored 7223159) and _acos_tbl[488] =
// 1165449.49964 (stored 1165449); _tan_tbl[59] = 57949.50121 (57950, and -57950 at 197);
// _cos_tbl[83] = 34379.50944 (34380); fixtorad_r = 1608.49544 (1608). Double arithmetic is off by
// far less than these margins, so the compiler's values and a <cmath> recomputation round alike;
// the tests check both.
#include "fixmath/fixed.h"
#include "fixmath/table_math.h"
#include "frame/table.h"
#include "photofx.h"

namespace {

namespace tmath = pfx::table_math;

constexpr int32_t kQuarterTurn = 0x400000;
constexpr int32_t kHalfTurn = 0x800000;
constexpr int32_t kPole = -0x7FFFFFFF;

// One entry per half unit of angle over a full turn.
constexpr int32_t cos_entry(int32_t i) {
  return tmath::round_half_away(65536.0 * tmath::cos_turns(i, 512));
}

// One entry per half unit over half a turn; the quarter turn, where the tangent has its pole,
// holds the most negative saturated value.
constexpr int32_t tan_entry(int32_t i) {
  if (i == 128) return kPole;
  return tmath::round_half_away(65536.0 * tmath::sin_turns(i, 512) / tmath::cos_turns(i, 512));
}

// acos(i / 256 - 1) in angle units: acos / pi x 128.0.
constexpr int32_t acos_entry(int32_t i) {
  return tmath::round_half_away(8388608.0 * tmath::acos_over_pi(i / 256.0 - 1.0));
}

// The angle plus an offset, counted in table steps (half units). Adding a quarter step (0x4000)
// before dropping the 15 low bits selects the nearest entry. Unsigned, so that angles near the
// 32-bit ends wrap instead of overflowing; 2^32 is 256 whole turns, so the wrap cannot change
// the masked index.
constexpr uint32_t half_units(int32_t angle, uint32_t offset) {
  return (static_cast<uint32_t>(angle) + offset) >> 15;
}

// Index of the _acos_tbl entry nearest to x in -1.0 ... 1.0; exact halves go to the lower entry.
constexpr int32_t acos_index(int32_t x) { return (x + 65536 + 127) >> 8; }

bool outside_unit_range(int32_t x) { return x < -65536 || x > 65536; }

int32_t domain_error() {
  pfx::fix_error_word() = pfx::kFixDomainError;
  return 0;
}

// (y << 16) / x truncated toward zero, held to the saturated range. Formed in 64 bits so that
// the quotient of any two coordinates is right, not only of those whose shifted numerator fits
// in 32 bits.
int32_t ratio(int32_t y, int32_t x) {
  const int64_t q = (static_cast<int64_t>(y) * 65536) / x;
  if (q > 0x7FFFFFFF) return 0x7FFFFFFF;
  if (q < -0x7FFFFFFF) return -0x7FFFFFFF;
  return static_cast<int32_t>(q);
}

}  // namespace

extern "C" {

constinit const int32_t _cos_tbl[512] = {PFX_TABLE_512(cos_entry, 0)};
constinit const int32_t _tan_tbl[256] = {PFX_TABLE_256(tan_entry, 0)};
constinit const int32_t _acos_tbl[513] = {PFX_TABLE_512(acos_entry, 0), acos_entry(512)};

constinit const int32_t fixtorad_r = tmath::round_half_away(2.0 * tmath::kPi / 256.0 * 65536.0);
constinit const int32_t radtofix_r = tmath::round_half_away(256.0 / (2.0 * tmath::kPi) * 65536.0);

int32_t fixcos(int32_t angle) { return _cos_tbl[half_units(angle, 0x4000u) & 511u]; }

// The cosine a quarter turn earlier: 0x3FC000 is 64.0 less the rounding quarter step.
int32_t fixsin(int32_t angle) { return _cos_tbl[half_units(angle, 0u - 0x3FC000u) & 511u]; }

int32_t fixtan(int32_t angle) { return _tan_tbl[half_units(angle, 0x4000u) & 255u]; }

// Bisects the half of the tangent table whose entries share x's sign (the table rises over
// 0 ... 127 and over 128 ... 255) and returns the angle of the last entry probed, which is one
// of the two entries around x.
int32_t fixatan(int32_t x) {
  int32_t lo = x >= 0 ? 0 : 128;
  int32_t hi = lo + 127;
  int32_t mid;
  for (;;) {
    mid = (lo + hi) >> 1;
    // 64 bits keeps the difference exact for every x and entry.
    const int64_t d = static_cast<int64_t>(x) - _tan_tbl[mid];
    if (d > 0) lo = mid + 1;
    if (d < 0) hi = mid - 1;
    if (d == 0 || lo > hi) break;
  }
  return x >= 0 ? mid * 0x8000 : mid * 0x8000 - kHalfTurn;
}

int32_t fixatan2(int32_t y, int32_t x) {
  if (x == 0) {
    if (y == 0) return domain_error();
    return y < 0 ? -kQuarterTurn : kQuarterTurn;
  }
  pfx::fix_error_word() = 0;
  const int32_t a = fixatan(ratio(y, x));
  if (x > 0) return a;
  return y >= 0 ? a + kHalfTurn : a - kHalfTurn;
}

int32_t fixacos(int32_t x) {
  if (outside_unit_range(x)) return domain_error();
  return _acos_tbl[acos_index(x)];
}

int32_t fixasin(int32_t x) {
  if (outside_unit_range(x)) return domain_error();
  return kQuarterTurn - _acos_tbl[acos_index(x)];
}

}  // extern "C"
