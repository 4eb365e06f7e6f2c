#include "frame/simd_path.h"

#include <atomic>
#include <cstdlib>
#include <cstring>

namespace pfx {
namespace {

constexpr SimdPath kAll[] = {SimdPath::kPortable, SimdPath::kAvx2, SimdPath::kAvx512,
                             SimdPath::kNeon, SimdPath::kWasm128};

bool available(SimdPath path) {
  switch (path) {
    case SimdPath::kPortable:
      return true;
#if defined(__x86_64__) && defined(__GNUC__)
    case SimdPath::kAvx2:
      return __builtin_cpu_supports("avx2") != 0;
    case SimdPath::kAvx512:
      return __builtin_cpu_supports("avx512f") != 0 && __builtin_cpu_supports("avx512bw") != 0 &&
             __builtin_cpu_supports("avx512vl") != 0 && __builtin_cpu_supports("avx512dq") != 0;
#endif
#if defined(__ARM_NEON)
    case SimdPath::kNeon:
      return true;
#endif
#if defined(__wasm_simd128__)
    case SimdPath::kWasm128:
      return true;
#endif
    default:
      return false;
  }
}

// The widest available path at or below `want` (the order of kAll within one architecture).
SimdPath lower_to_available(SimdPath want) {
  SimdPath best = SimdPath::kPortable;
  for (SimdPath p : kAll) {
    if (available(p) && static_cast<uint8_t>(p) <= static_cast<uint8_t>(want)) best = p;
  }
  return best;
}

SimdPath from_environment() {
  const char* v = std::getenv("PHOTOFX_SIMD");
  if (v == nullptr || *v == '\0') return best_simd_path();
  if (std::strcmp(v, "none") == 0) return SimdPath::kPortable;
  for (SimdPath p : kAll) {
    if (std::strcmp(v, simd_path_name(p)) == 0) return lower_to_available(p);
  }
  return best_simd_path();  // an unknown name changes nothing
}

// 0xFF: not chosen yet. Relaxed is enough: every thread that races computes the same value.
std::atomic<uint8_t> g_path{0xFF};

}  // namespace

SimdPath best_simd_path() { return lower_to_available(SimdPath::kWasm128); }

SimdPath simd_path() {
  uint8_t p = g_path.load(std::memory_order_relaxed);
  if (p == 0xFF) {
    p = static_cast<uint8_t>(from_environment());
    g_path.store(p, std::memory_order_relaxed);
  }
  return static_cast<SimdPath>(p);
}

int available_simd_paths(SimdPath out[8]) {
  int n = 0;
  for (SimdPath p : kAll) {
    if (available(p) && n < 8) out[n++] = p;
  }
  return n;
}

void force_simd_path(SimdPath path) {
  g_path.store(static_cast<uint8_t>(lower_to_available(path)), std::memory_order_relaxed);
}

const char* simd_path_name(SimdPath path) {
  switch (path) {
    case SimdPath::kPortable:
      return "portable";
    case SimdPath::kAvx2:
      return "avx2";
    case SimdPath::kAvx512:
      return "avx512";
    case SimdPath::kNeon:
      return "neon";
    case SimdPath::kWasm128:
      return "wasm128";
  }
  return "portable";
}

}  // namespace pfx
