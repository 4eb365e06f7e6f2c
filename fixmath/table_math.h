// Double-precision sine, cosine, arcsine and base-2 logarithm that the compiler can evaluate, so
// the trigonometry and logarithm tables are computed from their rules while the library builds
// (the <cmath> functions are not constexpr). Each function folds its argument into a range where
// a short power series converges, and is good to a few units in the last place. That is far more
// than the tables need: no entry lies within 3e-4 of a rounding half (see trig.cpp and
// sqrt_log.cpp), so any error below that rounds every entry the same way.
//
// The compiler evaluates these with IEEE double arithmetic whatever the target, so the tables
// come out identical in the native and the cross build.
#pragma once

#include <cstdint>

namespace pfx::table_math {

inline constexpr double kPi = 3.14159265358979323846264338327950288;
inline constexpr double kLn2 = 0.69314718055994530941723212145817657;

// Taylor series of sin and cos; the callers keep |x| <= pi / 4, where the terms fall below
// 1e-30 long before the loop ends.
constexpr double sin_series(double x) {
  double term = x, sum = x;
  for (int n = 2; n < 40; n += 2) {
    term *= -x * x / (n * (n + 1));
    sum += term;
  }
  return sum;
}

constexpr double cos_series(double x) {
  double term = 1.0, sum = 1.0;
  for (int n = 1; n < 40; n += 2) {
    term *= -x * x / (n * (n + 1));
    sum += term;
  }
  return sum;
}

// cos(2 pi k / n) for n a multiple of 8. The angle is folded by symmetry into the first eighth
// of a turn using integers only, so quarter and half turns come out exactly 0 and -1.
constexpr double cos_turns(int64_t k, int64_t n) {
  k %= n;
  if (k < 0) k += n;
  if (k > n / 2) k = n - k;                        // cos(-x) = cos x
  if (k > n / 4) return -cos_turns(n / 2 - k, n);  // cos(pi - x) = -cos x
  if (k > n / 8) {                                 // cos(pi/2 - x) = sin x
    return sin_series(2.0 * kPi * static_cast<double>(n / 4 - k) / static_cast<double>(n));
  }
  return cos_series(2.0 * kPi * static_cast<double>(k) / static_cast<double>(n));
}

// sin(2 pi k / n) = cos(2 pi (k - n/4) / n).
constexpr double sin_turns(int64_t k, int64_t n) { return cos_turns(k - n / 4, n); }

// Square root by Newton's iteration from above, x >= 0.
constexpr double sqrt_newton(double x) {
  if (x <= 0.0) return 0.0;
  double r = x > 1.0 ? x : 1.0;
  for (int i = 0; i < 200; ++i) {
    const double next = 0.5 * (r + x / r);
    if (next >= r) break;  // stopped decreasing: converged
    r = next;
  }
  return r;
}

// asin z for |z| <= 1/2: the sum over n of (2n)! / (4^n n!^2) z^(2n+1) / (2n+1), whose terms
// shrink at least fourfold each.
constexpr double asin_series(double z) {
  double power = z, sum = z;
  for (int n = 1; n < 60; ++n) {
    power *= z * z * (2 * n - 1) / (2 * n);
    sum += power / (2 * n + 1);
  }
  return sum;
}

// acos(t) / pi for -1 <= t <= 1, using acos t = 2 asin(sqrt((1 - t) / 2)) near the ends so the
// series argument never exceeds 1/2.
constexpr double acos_over_pi(double t) {
  if (t > 0.5) return 2.0 * asin_series(sqrt_newton((1.0 - t) / 2.0)) / kPi;
  if (t < -0.5) return 1.0 - 2.0 * asin_series(sqrt_newton((1.0 + t) / 2.0)) / kPi;
  return 0.5 - asin_series(t) / kPi;
}

// log2 x for x >= 1: whole octaves are taken out exactly, and ln m = 2 atanh((m - 1) / (m + 1))
// on the rest, where the atanh argument is at most 1/3.
constexpr double log2_series(double x) {
  double octaves = 0.0;
  while (x >= 2.0) {
    x /= 2.0;
    octaves += 1.0;
  }
  const double y = (x - 1.0) / (x + 1.0);
  double power = y, sum = y;
  for (int n = 3; n < 80; n += 2) {
    power *= y * y;
    sum += power / n;
  }
  return octaves + 2.0 * sum / kLn2;
}

// Nearest integer, halves away from zero; |x| stays well inside the int32_t range here.
constexpr int32_t round_half_away(double x) {
  return static_cast<int32_t>(x < 0.0 ? x - 0.5 : x + 0.5);
}

}  // namespace pfx::table_math
