// Fuzz target: fixed-point trigonometry, square root and logarithm with arbitrary 32-bit
// arguments, and the table interpolation over a caller's own table of arbitrary values.
#include "fixmath/fixed.h"
#include "fuzz/harness.h"
#include "photofx.h"

namespace {

using namespace pfx::fuzz;

void trig(FuzzedDataProvider& in) {
  const int32_t a = pick_level(in, -0x1000000, 0x1000000);
  const int32_t b = pick_level(in, -0x20000, 0x20000);
  const int32_t c = fixcos(a), s = fixsin(a);
  FUZZ_CHECK(c >= -65536 && c <= 65536 && s >= -65536 && s <= 65536);
  (void)fixtan(a);
  const int32_t t = fixatan(a);
  FUZZ_CHECK(t >= -0x400000 && t <= 0x3F8000 && t % 0x8000 == 0);

  pfx::fix_error_word() = 0;
  const int32_t angle = fixatan2(a, b);
  FUZZ_CHECK(angle >= -0x800000 && angle <= 0x800000);
  FUZZ_CHECK(pfx::fix_error_word() == (a == 0 && b == 0 ? pfx::kFixDomainError : 0));

  const bool outside = b < -65536 || b > 65536;
  pfx::fix_error_word() = 0;
  const int32_t ac = fixacos(b);
  FUZZ_CHECK(ac >= 0 && ac <= 0x800000);
  const int32_t as = fixasin(b);
  FUZZ_CHECK(as >= -0x400000 && as <= 0x400000);
  FUZZ_CHECK(pfx::fix_error_word() == (outside ? pfx::kFixDomainError : 0));
}

void sqrt_log(FuzzedDataProvider& in) {
  const int32_t x = pick_level(in, -16, 5000000);
  const int64_t r = isqrt_(x);
  if (x <= 0) {
    FUZZ_CHECK(r == 0);
  } else {
    FUZZ_CHECK((r == 0 || (2 * r - 1) * (2 * r - 1) <= 4 * int64_t{x}) &&
               4 * int64_t{x} < (2 * r + 1) * (2 * r + 1));
  }

  pfx::fix_error_word() = 0;
  (void)log_e_FIX_new(x);
  FUZZ_CHECK(pfx::fix_error_word() == 0);

  const int32_t v = pick_level(in, 900, 4200);
  const int32_t l = log_interp_FIX(log_new_FIX, v);
  FUZZ_CHECK(l >= 0 && l <= 1024);
  Guarded<int32_t> table(230, 0x5A5A5A5A);
  table.fill(in);
  (void)log_interp_FIX(table.data(), v);
  FUZZ_CHECK(table.guards_intact());
}

const Op kOps[] = {{"trig", trig}, {"sqrt_log", sqrt_log}};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return run_one(kOps, data, size);
}
