// Real-valued table rules (sine, arctangent) evaluated by the compiler.
//
// Standard C++20 has no constexpr sin or atan, so the warp tables are computed here from power
// series in double arithmetic, which every conforming compiler carries out as IEEE binary64,
// the same on every target. The arguments are first brought close to zero, where the series
// converge within a few units in the last place: far below 1e-7 of a table unit for the tables
// built from them (whose entries stay under 2^25).
//
// Rounding to nearest can only go wrong for a value that lies within that error of a half.
// round_settled() therefore refuses any value closer than 2^-20 to a half: evaluating such an
// entry calls a function that is not constexpr, which stops the build. Every entry that
// compiles is thus the correctly rounded one. (No entry of the current tables comes within
// 3e-5 of a half.)
#pragma once

#include <cstdint>

namespace pfx::const_math {

constexpr double kPi = 3.14159265358979323846;

// Reached only during constant evaluation, where calling it is an error: the entry being
// rounded lies too close to a half for its rounding to be trusted.
inline void entry_too_close_to_a_half_to_round() {}

// Nearest integer to v >= 0 (v below 2^31), refusing values within 2^-20 of a half.
constexpr int32_t round_settled(double v) {
  const int64_t whole = static_cast<int64_t>(v);
  const double fraction = v - static_cast<double>(whole);  // exact for v below 2^52
  const double from_half = fraction - 0.5;
  if (from_half < 0x1p-20 && from_half > -0x1p-20) entry_too_close_to_a_half_to_round();
  return static_cast<int32_t>(fraction > 0.5 ? whole + 1 : whole);
}

// Square root of x >= 1 by Newton's iteration from above; stops when it no longer falls.
constexpr double sqrt_of(double x) {
  double y = x;
  for (;;) {
    const double next = 0.5 * (y + x / y);
    if (next >= y) return y;
    y = next;
  }
}

// sin x for 0 <= x <= pi / 2 (the Taylor terms fall fast there), summed until a term no longer
// changes the sum.
constexpr double sin_of(double x) {
  const double x2 = x * x;
  double term = x, sum = x;
  for (int32_t n = 1;; ++n) {
    term = -term * x2 / (static_cast<double>(2 * n) * static_cast<double>(2 * n + 1));
    const double updated = sum + term;
    if (updated == sum) return sum;
    sum = updated;
  }
}

// atan x for 0 <= x <= 1. Two half-angle steps, atan x = 2 atan(x / (1 + sqrt(1 + x^2))),
// bring x below tan(11.25 degrees) before the series.
constexpr double atan_of(double x) {
  for (int32_t i = 0; i < 2; ++i) x = x / (1.0 + sqrt_of(1.0 + x * x));
  const double x2 = x * x;
  // Terms (-1)^n x^(2n+1) / (2n+1): carry the power and divide on the way out.
  double power = x, sum = x;
  for (int32_t n = 1;; ++n) {
    power = -power * x2;
    const double updated = sum + power / static_cast<double>(2 * n + 1);
    if (updated == sum) return 4.0 * sum;
    sum = updated;
  }
}

}  // namespace pfx::const_math
