// 16.16 fixed point: conversions, saturating arithmetic, the integer divisions and the error word.
#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <thread>
#include <type_traits>

#include "fixmath/fixed.h"
#include "photofx.h"

namespace {

constexpr int32_t kMax = 0x7FFFFFFF;
constexpr int32_t kMin = -0x7FFFFFFF;
constexpr int32_t kRange = 34;  // the error word after a saturated result

int32_t& err() { return pfx::fix_error_word(); }

using Fn = int32_t (*)(int32_t, int32_t);

// Any one- or two-argument function as a two-argument one.
template <auto F>
int32_t call(int32_t a, int32_t b) {
  if constexpr (std::is_invocable_v<decltype(F), int32_t>) {
    return F(a);
  } else {
    return F(a, b);
  }
}

struct Row {
  const char* name;
  Fn fn;
  int32_t a, b, expected;
  int32_t error;  // the error word afterwards, cleared before the call
};

// Integer conversions: high bits of itofix shift out, fixtoi rounds halves up, the ceiling
// saturates above 32767. Add and subtract saturate on overflow, but a subtraction from a
// non-positive value wraps. Multiplication rounds half a unit away from zero. Division shifts the
// numerator in 32 bits; idiv rounds to nearest, halves away from zero; iidiv lowers the
// truncated quotient by one when the signs differ. Quotients that do not fit wrap untrapped.
// clang-format off
const Row kRows[] = {
    {"itofix", call<itofix>, 3, 0, 0x30000, 0}, {"itofix", call<itofix>, 0x12345, 0, 0x23450000, 0},
    {"itofix", call<itofix>, -1, 0, -65536, 0}, {"fixtoi", call<fixtoi>, 0x8000, 0, 1, 0},
    {"fixtoi", call<fixtoi>, -0x8000, 0, 0, 0}, {"fixtoi", call<fixtoi>, -0x8001, 0, -1, 0},
    {"fixtoi", call<fixtoi>, -0x1C000, 0, -2, 0}, {"fixfloor", call<fixfloor>, -1, 0, -1, 0},
    {"fixfloor", call<fixfloor>, -65536, 0, -1, 0}, {"fixfloor", call<fixfloor>, -65537, 0, -2, 0},
    {"fixceil", call<fixceil>, 0x7FFF0000, 0, 32767, 0}, {"fixceil", call<fixceil>, 1, 0, 1, 0},
    {"fixceil", call<fixceil>, -65535, 0, 0, 0}, {"fixceil", call<fixceil>, INT32_MIN, 0, -32768, 0},
    {"fixceil", call<fixceil>, 0x7FFF0001, 0, 32767, kRange},
    {"fixadd", call<fixadd>, kMax, -1, 0x7FFFFFFE, 0},
    {"fixadd", call<fixadd>, kMax, 1, kMax, kRange},
    {"fixadd", call<fixadd>, kMin, -2, kMin, kRange},
    {"fixsub", call<fixsub>, 0, INT32_MIN, INT32_MIN, 0},
    {"fixsub", call<fixsub>, 1, INT32_MIN, kMax, kRange},
    {"fixsub", call<fixsub>, -2, kMax, kMin, kRange},
    {"fixmul", call<fixmul>, 0x18000, 0x18000, 0x24000, 0},
    {"fixmul", call<fixmul>, -0x18000, 0x18000, -0x24000, 0},
    {"fixmul", call<fixmul>, 1, 0x8000, 1, 0},
    {"fixmul", call<fixmul>, 0x1000000, 0x1000000, kMax, kRange},
    {"fixdiv", call<fixdiv>, 0, 0, 0, 0}, {"fixdiv", call<fixdiv>, 3, 2, 0x18000, 0},
    {"fixdiv", call<fixdiv>, 0x10000, 0x10000, 0, 0}, {"fixdiv", call<fixdiv>, -7, 2, -0x38000, 0},
    {"fixdiv", call<fixdiv>, 5, 0, kMax, kRange}, {"fixdiv", call<fixdiv>, -5, 0, kMin, kRange},
    {"fixdiv", call<fixdiv>, 0x8000, -1, INT32_MIN, 0}, {"idiv", call<idiv>, 5, 2, 3, 0},
    {"idiv", call<idiv>, -5, 2, -3, 0}, {"idiv", call<idiv>, 4, 3, 1, 0},
    {"idiv", call<idiv>, 5, 3, 2, 0}, {"idiv", call<idiv>, 7, 1, 7, 0},
    {"idiv", call<idiv>, -7, 2, -4, 0}, {"idiv", call<idiv>, 4, -2, -2, 0},
    {"idiv", call<idiv>, INT32_MAX, INT32_MIN, -1, 0}, {"idiv", call<idiv>, 0, 0, 0, 0},
    {"idiv", call<idiv>, 5, 0, kMax, kRange}, {"idiv", call<idiv>, INT32_MIN, -1, INT32_MIN, 0},
    {"iidiv", call<iidiv>, -5, 2, -3, 0}, {"iidiv", call<iidiv>, -4, 2, -3, 0},
    {"iidiv", call<iidiv>, 4, -4, -2, 0}, {"iidiv", call<iidiv>, 5, 2, 2, 0},
    {"iidiv", call<iidiv>, -6, -3, 2, 0}, {"iidiv", call<iidiv>, 0, 0, 0, 0},
    {"iidiv", call<iidiv>, -1, 0, kMin, kRange}, {"iidiv", call<iidiv>, INT32_MIN, -1, INT32_MIN, 0},
    {"iidiv", call<iidiv>, INT32_MIN, 1, INT32_MAX, 0},
};
// clang-format on

TEST(Fixed, ResultsAndErrorWord) {
  for (const Row& r : kRows) {
    err() = 0;
    EXPECT_EQ(r.fn(r.a, r.b), r.expected) << r.name << "(" << r.a << ", " << r.b << ")";
    EXPECT_EQ(err(), r.error) << r.name << "(" << r.a << ", " << r.b << ")";
  }
  // ftofix rounds halves away from zero and saturates at 32767.
  const struct {
    double x;
    int32_t expected, error;
  } kFloats[] = {{1.0, 65536, 0},
                 {-0.5 / 65536, -1, 0},
                 {0.5 / 65536, 1, 0},
                 {32767.0, 0x7FFF0000, 0},
                 {32767.25, kMax, kRange},
                 {-40000.0, kMin, kRange},
                 {std::numeric_limits<double>::quiet_NaN(), 0, 0},
                 {std::numeric_limits<double>::infinity(), kMax, kRange}};
  for (const auto& f : kFloats) {
    err() = 0;
    EXPECT_EQ(ftofix(f.x), f.expected) << f.x;
    EXPECT_EQ(err(), f.error) << f.x;
  }
  EXPECT_EQ(fixtof(0x18000), 1.5);
  EXPECT_EQ(fixtof(-1), -1.0 / 65536);
}

TEST(Fixed, ErrorWordStaysUntilOverwritten) {
  err() = 0;
  fixadd(0x7FFFFFFF, 1);
  fixadd(1, 2);
  EXPECT_EQ(err(), kRange);  // a successful call does not clear it
}

TEST(Fixed, ErrorWordIsPerThread) {
#if defined(__EMSCRIPTEN__) && !defined(__EMSCRIPTEN_PTHREADS__)
  GTEST_SKIP() << "this WebAssembly build has one thread (the web editor runs the library in one "
                  "worker); the native and ARM builds check the word per thread";
#endif
  fixadd(0x7FFFFFFF, 1);
  int32_t seen_by_other_thread = -1;
  std::thread([&] { seen_by_other_thread = pfx::fix_error_word(); }).join();
  EXPECT_EQ(seen_by_other_thread, 0);
}

}  // namespace
