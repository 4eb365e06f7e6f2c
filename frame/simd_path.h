// Which instruction-set path the optimised loops take.
//
// Every vector path (the x86 clones, hand-written NEON, wasm SIMD) is checked bit for bit
// against the portable code, and that check is only worth something if each path actually runs
// on the test machine. So the choice is made in one place: the widest path that both the build
// and the CPU have, lowered by the environment variable PHOTOFX_SIMD (read once, on first use)
// or, in tests, by force_simd_path. PHOTOFX_SIMD takes a path name below; "portable" (or
// "none") turns every vector path off and runs the plain loops the other paths are tested
// against. A path the machine lacks is never taken: asking for it gives the widest one below it.
#pragma once

#include <cstdint>

namespace pfx {

// Narrowest first within each architecture; only the paths of the build's architecture exist.
enum class SimdPath : uint8_t {
  kPortable = 0,  // plain loops, no hand-written vectors, no byte permutes; the reference
  kAvx2,          // x86-64: AVX2 clones of the hot loops
  kAvx512,        // x86-64: AVX-512 clones, and byte permutes where the CPU has them
  kNeon,          // ARMv7 built with NEON: hand-written NEON loops
  kWasm128,       // WebAssembly built with SIMD128
};

// The path in force.
SimdPath simd_path();

// The widest path this build and CPU can take, whatever PHOTOFX_SIMD says.
SimdPath best_simd_path();

// Every path this build and CPU can take, narrowest first; fills `out` (room for 8) and returns
// the count. Tests run their equivalence checks once per entry.
int available_simd_paths(SimdPath out[8]);

// Test hook: take `path` from now on (lowered to the widest available path at or below it).
// Not for concurrent use with running effects.
void force_simd_path(SimdPath path);

// "portable", "avx2", "avx512", "neon", "wasm128".
const char* simd_path_name(SimdPath path);

}  // namespace pfx
