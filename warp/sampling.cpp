// Bilinear sampling and the fast arctangent, the two building blocks of the warps.
//
// Bilinear_Fixed blends four neighbouring pixels with 11-bit weights; FATAN2 gives the
// full-circle angle of a vector in degrees with 19 fraction bits, from one division and a
// read of the ATAN table.
#include "frame/table.h"
#include "photofx.h"
#include "warp/const_math.h"
#include "warp/warp.h"

namespace {

// atan(i / 2048) in degrees << 19, for i = 0..2047 (i / 2048 is exact in a double).
constexpr int32_t atan_entry(int32_t i) {
  using namespace pfx::const_math;
  return round_settled(atan_of(i / 2048.0) * (180.0 / kPi) * 524288.0);
}

constexpr uint32_t inverse29_entry(uint32_t i) { return i == 0 ? 0 : 0x20000000u / i; }

}  // namespace

namespace pfx {

constinit const uint32_t kInverse29[4096] = {PFX_TABLE_4096(inverse29_entry, 0u)};

}  // namespace pfx

extern "C" {

constinit const int32_t ATAN[2048] = {PFX_TABLE_2048(atan_entry, 0)};

uint32_t Bilinear_Fixed(uint32_t fx, uint32_t fy, const uint32_t* p00, const uint32_t* p10,
                        const uint32_t* p01, const uint32_t* p11, uint32_t* out) {
  if (p00 == nullptr || p10 == nullptr || p01 == nullptr || p11 == nullptr) return 0;
  // Weights past a whole pixel would turn 2048 - w negative; hold them to the last neighbour.
  if (fx > pfx::kBilinearOne) fx = pfx::kBilinearOne;
  if (fy > pfx::kBilinearOne) fy = pfx::kBilinearOne;
  const uint32_t value = pfx::blend_bilinear(fx, fy, *p00, *p10, *p01, *p11);
  if (out != nullptr) *out = value;
  return value;
}

uint32_t FATAN2(int32_t a, int32_t b) { return pfx::fatan2(a, b); }

}  // extern "C"
