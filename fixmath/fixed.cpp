// 16.16 fixed-point conversions and arithmetic.
//
// Overflowing results saturate to 0x7FFFFFFF or -0x7FFFFFFF and record a range error; the few
// results that are meant to wrap (itofix, the numerator of fixdiv, INT32_MIN / -1) are computed
// on unsigned words so that the wrap is defined behaviour.
#include "fixmath/fixed.h"

#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {

int32_t& fix_error_word() {
  thread_local int32_t word = 0;
  return word;
}

namespace {

constexpr int32_t kFixMax = 0x7FFFFFFF;
constexpr int32_t kFixMin = -0x7FFFFFFF;  // saturation stops one short of INT32_MIN

int32_t range_error(int32_t saturated) {
  fix_error_word() = kFixRangeError;
  return saturated;
}

// a / b truncated toward zero, b != 0. INT32_MIN / -1 wraps to INT32_MIN instead of trapping.
constexpr int32_t div_trunc(int32_t a, int32_t b) { return b == -1 ? wrap_sub(0, a) : a / b; }

}  // namespace
}  // namespace pfx

extern "C" {

int32_t ftofix(double x) {
  if (x > 32767.0) return pfx::range_error(pfx::kFixMax);
  if (x < -32767.0) return pfx::range_error(pfx::kFixMin);
  if (x != x) return 0;  // NaN passes both tests; converting it would be undefined
  // The product and the rounding offset are two separate double operations (no fused
  // multiply-add: the build turns contraction off), so every platform rounds alike.
  const double scaled = x * 65536.0 + (x >= 0 ? 0.5 : -0.5);
  return static_cast<int32_t>(scaled);
}

double fixtof(int32_t x) { return x / 65536.0; }

int32_t itofix(int32_t x) { return pfx::itofix(x); }

int32_t fixtoi(int32_t x) { return pfx::fixtoi(x); }

int32_t fixfloor(int32_t x) { return pfx::fixfloor(x); }

int32_t fixceil(int32_t x) {
  if (x > 0x7FFF0000) return pfx::range_error(32767);
  return pfx::fixfloor(x + 65535);
}

int32_t fixadd(int32_t a, int32_t b) {
  const int32_t s = pfx::wrap_add(a, b);
  if (s < 0 && a > 0 && b > 0) return pfx::range_error(pfx::kFixMax);
  if (s >= 0 && a < 0 && b < 0) return pfx::range_error(pfx::kFixMin);
  return s;
}

int32_t fixsub(int32_t a, int32_t b) {
  const int32_t s = pfx::wrap_sub(a, b);
  if (s < 0 && a > 0 && b < 0) return pfx::range_error(pfx::kFixMax);
  if (s >= 0 && a < 0 && b > 0) return pfx::range_error(pfx::kFixMin);
  return s;
}

int32_t fixmul(int32_t a, int32_t b) { return ftofix(fixtof(a) * fixtof(b)); }

int32_t fixdiv(int32_t a, int32_t b) {
  if (a == 0) return 0;
  if (b == 0) return pfx::range_error(a < 0 ? pfx::kFixMin : pfx::kFixMax);
  return pfx::div_trunc(pfx::itofix(a), b);
}

int32_t idiv(int32_t a, int32_t b) {
  if (a == 0) return 0;
  if (b == 0) return pfx::range_error(a < 0 ? pfx::kFixMin : pfx::kFixMax);
  const int32_t q = pfx::div_trunc(a, b);
  // The remainder in 32-bit arithmetic, so the wrapped INT32_MIN / -1 quotient leaves 0.
  const int64_t r = pfx::wrap_sub(a, pfx::wrap_mul(q, b));
  const int64_t abs_r = r < 0 ? -r : r;
  const int64_t abs_b = b < 0 ? -static_cast<int64_t>(b) : b;
  if (2 * abs_r >= abs_b) return (a < 0) == (b < 0) ? pfx::wrap_add(q, 1) : pfx::wrap_sub(q, 1);
  return q;
}

int32_t iidiv(int32_t a, int32_t b) {
  if (a == 0) return 0;
  if (b == 0) return pfx::range_error(a < 0 ? pfx::kFixMin : pfx::kFixMax);
  const int32_t q = pfx::div_trunc(a, b);
  return (a < 0) != (b < 0) ? pfx::wrap_sub(q, 1) : q;
}

}  // extern "C"
