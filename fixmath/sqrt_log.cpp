// Integer square root and the table-driven natural logarithm.
//
// log_new_FIX samples 512 log2(v / 1024), a base-4 logarithm with 10 fraction bits, at
// breakpoints v in 1024 ... 4096 that are closest where the curve bends most. log_e_FIX_new
// scales its argument by a power of 4 into that range, interpolates, and converts to a natural
// logarithm with 20 fraction bits. Nothing here touches the fixed-point error word.
//
// The table is computed from its rule at compile time and rounded to nearest. The entry closest
// to a half is log_new_FIX[117], 299.50080 at v = 1536 (stored 300); double arithmetic errs by
// many orders of magnitude less, so the rounding is never in doubt (the tests recompute it).
#include "fixmath/table_math.h"
#include "frame/table.h"
#include "photofx.h"

namespace {

// The breakpoints: spacing 2, 4, 8, 16 and 32 over five runs of entries. Each run starts where
// the previous one ends (entry 54 is v = 1132 in both, and so on).
constexpr int32_t log_breakpoint(int32_t i) {
  if (i <= 54) return 1024 + 2 * i;
  if (i <= 79) return 1132 + 4 * (i - 54);
  if (i <= 117) return 1232 + 8 * (i - 79);
  if (i <= 181) return 1536 + 16 * (i - 117);
  return 2560 + 32 * (i - 181);
}

constexpr int32_t log_entry(int32_t i) {
  return pfx::table_math::round_half_away(512.0 *
                                          pfx::table_math::log2_series(log_breakpoint(i) / 1024.0));
}

// One factor of 4 in the result: 1420 (1024 ln 4, rounded) times 1024.
constexpr int32_t kLogOf4 = 1454080;
constexpr int32_t kLogScale = 1420;
// Returned for arguments the table cannot reach: 0, negatives, 2 ... 4 and above 4194304.
constexpr int32_t kLogOutOfRange = 21811200;

}  // namespace

extern "C" {

constinit const int32_t log_new_FIX[230] = {
    PFX_TABLE_128(log_entry, 0), PFX_TABLE_64(log_entry, 128), PFX_TABLE_32(log_entry, 192),
    PFX_TABLE_4(log_entry, 224), PFX_TABLE_2(log_entry, 228)};

// Bit by bit, two bits of x per step, on unsigned words; the final comparison rounds to
// nearest (x - s^2 > s exactly when x is nearer (s + 1)^2, and never equally near).
int32_t isqrt_(int32_t x) {
  if (x <= 0) return 0;
  uint32_t rem = static_cast<uint32_t>(x);
  uint32_t root = 0;
  for (uint32_t bit = 1u << 30; bit != 0; bit >>= 2) {
    if (root + bit <= rem) {
      rem -= root + bit;
      root = (root >> 1) | bit;
    } else {
      root >>= 1;
    }
  }
  if (root < rem) ++root;
  return static_cast<int32_t>(root);
}

int32_t log_interp_FIX(const int32_t* table, int32_t v) {
  if (table == nullptr) return 0;
  // Below 1.0 the index would fall before the table: such values read as 1.0.
  if (v < 1024) v = 1024;
  int32_t base, first, shift;
  if (v < 1133) {
    base = 1024, first = 0, shift = 1;
  } else if (v < 1233) {
    base = 1132, first = 54, shift = 2;
  } else if (v < 1537) {
    base = 1232, first = 79, shift = 3;
  } else if (v < 2561) {
    base = 1536, first = 117, shift = 4;
  } else if (v < 4096) {
    base = 2560, first = 181, shift = 5;
  } else {
    return 1024;
  }
  const int32_t d = v - base;
  const int32_t i = first + (d >> shift);
  const int64_t f = d & ((1 << shift) - 1);
  // 64 bits and a wrapping sum, so that a caller's own table cannot overflow the arithmetic;
  // for log_new_FIX the step is small and positive and nothing wraps.
  const int64_t step = (f * (int64_t{table[i + 1]} - table[i])) >> shift;
  return static_cast<int32_t>(static_cast<uint32_t>(table[i]) + static_cast<uint32_t>(step));
}

int32_t log_e_FIX_new(int32_t x) {
  struct Range {
    int32_t lo, hi;
    int32_t scale_up;  // the argument is x << scale_up, or x >> -scale_up
    int32_t offset;
  };
  static constexpr Range kRanges[] = {
      {5, 16, 8, -4 * kLogOf4},
      {17, 64, 6, -3 * kLogOf4},
      {65, 256, 4, -2 * kLogOf4},
      {257, 1024, 2, -kLogOf4},
      {1025, 4096, 0, 0},
      {4097, 16384, -2, kLogOf4},
      {16385, 65536, -4, 2 * kLogOf4},
      {65537, 262144, -6, 3 * kLogOf4},
      {262145, 1048576, -8, 4 * kLogOf4},
      {1048577, 4194304, -10, 5 * kLogOf4},
  };
  if (x == 1) return 0;
  for (const Range& r : kRanges) {
    if (x < r.lo || x > r.hi) continue;
    const int32_t v = r.scale_up >= 0 ? x << r.scale_up : x >> -r.scale_up;
    return kLogScale * log_interp_FIX(log_new_FIX, v) + r.offset;
  }
  return kLogOutOfRange;
}

}  // extern "C"
