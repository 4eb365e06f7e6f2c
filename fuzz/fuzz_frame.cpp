// Fuzz target: channel packing, the HSV conversion, the fixed-point arithmetic and the memory
// wrappers, with arbitrary 32-bit arguments.
#include <cstring>

#include "fixmath/fixed.h"
#include "fuzz/harness.h"
#include "photofx.h"

namespace {

using namespace pfx::fuzz;

void packing(FuzzedDataProvider& in) {
  int32_t r, g, b;
  fx_unpack_rgb888(in.ConsumeIntegral<int32_t>(), &r, &g, &b);
  FUZZ_CHECK(r >= 0 && r <= 255 && g >= 0 && g <= 255 && b >= 0 && b <= 255);
  const uint32_t p = in.ConsumeIntegral<uint32_t>();
  const uint32_t q = fx_pack_rgb888(p, in.ConsumeIntegral<int32_t>(), in.ConsumeIntegral<int32_t>(),
                                    in.ConsumeIntegral<int32_t>());
  FUZZ_CHECK((q >> 24) == (p >> 24));
}

void hsv(FuzzedDataProvider& in) {
  int32_t h, s, v, r, g, b;
  fx_rgb2hsv(in.ConsumeIntegral<int32_t>(), in.ConsumeIntegral<int32_t>(),
             in.ConsumeIntegral<int32_t>(), &h, &s, &v);
  FUZZ_CHECK(h >= 0 && h <= 360 && s >= 0 && s <= 65536 && v >= 0 && v <= 255);
  fx_hsv2rgb(in.ConsumeIntegral<int32_t>(), in.ConsumeIntegral<int32_t>(),
             in.ConsumeIntegral<int32_t>(), &r, &g, &b);
  fx_hsv2rgb(h, s, v, &r, &g, &b);
  FUZZ_CHECK(r >= 0 && r <= 255 && g >= 0 && g <= 255 && b >= 0 && b <= 255);
}

void fixed(FuzzedDataProvider& in) {
  const int32_t a = in.ConsumeIntegral<int32_t>();
  const int32_t b = in.ConsumeIntegral<int32_t>();
  double x;
  const uint64_t bits = in.ConsumeIntegral<uint64_t>();
  std::memcpy(&x, &bits, sizeof x);  // any double, NaNs and infinities included
  (void)ftofix(x);
  (void)fixtof(a);
  (void)itofix(a);
  (void)fixtoi(a);
  (void)fixfloor(a);
  (void)fixceil(a);
  (void)fixadd(a, b);
  (void)fixsub(a, b);
  (void)fixmul(a, b);
  (void)fixdiv(a, b);
  (void)idiv(a, b);
  (void)iidiv(a, b);
  const int32_t e = pfx::fix_error_word();
  FUZZ_CHECK(e == 0 || e == pfx::kFixRangeError || e == pfx::kFixDomainError);
}

void memory(FuzzedDataProvider& in) {
  // Either a small block or a count x size product beyond 32 bits, which must give null rather
  // than a short block (a product that fits is never large enough to exhaust the fuzzer's memory).
  const bool overflow = in.ConsumeBool();
  const uint32_t count = overflow ? in.ConsumeIntegralInRange<uint32_t>(0x80000000u, UINT32_MAX)
                                  : in.ConsumeIntegralInRange<uint32_t>(0, 65536);
  const uint32_t size = in.ConsumeIntegralInRange<uint32_t>(overflow ? 2 : 0, 64);
  void* p = fx_malloc(count, size);
  if (overflow) FUZZ_CHECK(p == nullptr);
  fx_free(p);
  const uint32_t n = in.ConsumeIntegralInRange<uint32_t>(0, 4096);
  auto* q = static_cast<uint8_t*>(fx_calloc(n, 1));
  if (q != nullptr) {
    const uint8_t v = in.ConsumeIntegral<uint8_t>();
    FUZZ_CHECK(fx_memset(q, v, n) == q);
    Guarded<uint8_t> copy(n, 0x6B);
    FUZZ_CHECK(fx_memcpy(copy.data(), q, n) == copy.data());
    FUZZ_CHECK(copy.guards_intact() && copy.contents() == std::vector<uint8_t>(n, v));
    q = static_cast<uint8_t*>(fx_realloc(q, n + 8));
  }
  fx_free(q);
}

const Op kOps[] = {{"packing", packing}, {"hsv", hsv}, {"fixed", fixed}, {"memory", memory}};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return run_one(kOps, data, size);
}
