// Twirl: rotates the image inside a circle around a centre by an angle that is largest at the
// centre and falls linearly to zero at the rim, so straight lines become spirals. Each pixel
// inside the circle samples the source at the same distance from the centre (read from the
// square-root tables) but at the turned angle (FATAN2 plus the twist, then the quarter-wave
// sine table).
//
// The distance D = radius * rho has 19 fraction bits, so it passes 2^31 above radius 4095, and
// the offsets T built from it pass 2^32 at any useful radius; both are 64-bit.
#include <cstdint>

#include "frame/frame.h"
#include "frame/table.h"
#include "photofx.h"
#include "warp/const_math.h"
#include "warp/warp.h"

namespace {

// Integer square root: the largest r with r * r <= n.
constexpr uint64_t isqrt(uint64_t n) {
  uint64_t root = 0, bit = uint64_t{1} << 62;
  while (bit > n) bit >>= 2;
  while (bit != 0) {
    if (n >= root + bit) {
      n -= root + bit;
      root = (root >> 1) + bit;
    } else {
      root >>= 1;
    }
    bit >>= 2;
  }
  return root;
}

// 256 * sqrt(u) rounded to nearest, in integers: that is the nearest integer to sqrt(n) with
// n = 65536 u. With r = isqrt(n), sqrt(n) > r + 1/2 exactly when n > r^2 + r (as
// (r + 1/2)^2 = r^2 + r + 1/4), and no square root of an integer is ever a half, so there are
// no ties to settle.
constexpr int32_t root_entry(uint32_t u) {
  const uint64_t n = uint64_t{u} << 16;
  const uint64_t r = isqrt(n);
  return static_cast<int32_t>(n - r * r > r ? r + 1 : r);
}

constexpr int32_t step1_entry(uint32_t j) { return root_entry(j); }
constexpr int32_t step2_entry(uint32_t j) { return root_entry(4 * (j + 32)); }
constexpr int32_t step3_entry(uint32_t j) { return root_entry(8 * (j + 256)); }
constexpr int32_t step4_entry(uint32_t j) { return root_entry(64 * j); }

// Compilers cap the work of one constant evaluation (clang at about a million steps), and the
// 65536 roots of SQRT_STEP_4 take more than that in a single initialiser. So they are computed
// in blocks of 4096, each a constant of its own and well within the cap, and the table's
// initialiser only gathers them.
struct RootBlock {
  int32_t root[4096];
};

template <uint32_t Block>
constexpr RootBlock kRootBlock = [] {
  RootBlock b{};
  for (uint32_t i = 0; i < 4096; ++i) b.root[i] = step4_entry(Block * 4096 + i);
  return b;
}();

constexpr const RootBlock* kRootBlocks[16] = {
    &kRootBlock<0>,  &kRootBlock<1>,  &kRootBlock<2>,  &kRootBlock<3>,
    &kRootBlock<4>,  &kRootBlock<5>,  &kRootBlock<6>,  &kRootBlock<7>,
    &kRootBlock<8>,  &kRootBlock<9>,  &kRootBlock<10>, &kRootBlock<11>,
    &kRootBlock<12>, &kRootBlock<13>, &kRootBlock<14>, &kRootBlock<15>};

constexpr int32_t step4_gathered(uint32_t j) { return kRootBlocks[j >> 12]->root[j & 4095]; }

// 32768 sin(2 pi k / 16384), k = 0..4096 (a quarter wave).
constexpr int32_t sin_entry(int32_t k) {
  using namespace pfx::const_math;
  return round_settled(sin_of(kPi * k / 8192.0) * 32768.0);
}

}  // namespace

extern "C" {

constinit const int32_t SQRT_STEP_1[128] = {PFX_TABLE_128(step1_entry, 0u)};
constinit const int32_t SQRT_STEP_2[480] = {
    PFX_TABLE_256(step2_entry, 0u), PFX_TABLE_128(step2_entry, 256u),
    PFX_TABLE_64(step2_entry, 384u), PFX_TABLE_32(step2_entry, 448u)};
constinit const int32_t SQRT_STEP_3[768] = {PFX_TABLE_512(step3_entry, 0u),
                                            PFX_TABLE_256(step3_entry, 512u)};
constinit const int32_t SQRT_STEP_4[65536] = {PFX_TABLE_65536(step4_gathered, 0u)};
constinit const int32_t SIN[4097] = {PFX_TABLE_4096(sin_entry, 0), sin_entry(4096)};

}  // extern "C"

namespace pfx {
namespace {

constexpr int64_t kRhoOne = int64_t{1} << 19;  // rho at the rim
constexpr int64_t kOffsetOne = int64_t{1} << 25;

// rho = sqrt(u / 2^22) with 19 fraction bits, u < 2^22, from the table whose step suits u.
inline int64_t rho_of(int64_t u) {
  if (u <= 127) return SQRT_STEP_1[u];
  if ((u >> 2) <= 511) return SQRT_STEP_2[(u >> 2) - 32];
  if ((u >> 3) <= 1023) return SQRT_STEP_3[(u >> 3) - 256];
  return SQRT_STEP_4[u >> 6];
}

struct SinCos {
  int32_t s, c;
};

// Sine and cosine of sine index k (16384 to the turn) from the quarter wave.
inline SinCos sin_cos(int64_t k) {
  if (k <= 4096) return {SIN[k], SIN[4096 - k]};
  if (k <= 8191) return {SIN[8192 - k], -SIN[k - 4096]};
  if (k <= 12288) return {-SIN[k - 8192], -SIN[12288 - k]};
  return {-SIN[16384 - k], SIN[k - 12288]};
}

// Source coordinate and weight (25 fraction bits) at distance D along an axis whose sine or
// cosine is v. T weighs the bytes of D as 128 : 1 : 1 rather than 128 : 1/2 : 1/512, which puts
// the sampled point up to about 0.37 pixel farther out than d * v; that is part of the look.
struct AxisOffset {
  int64_t coord, weight;
};
constexpr AxisOffset offset_along(int64_t centre, int64_t D, int32_t v) {
  const int64_t magnitude = v < 0 ? -int64_t{v} : v;
  const int64_t T = magnitude * (128 * (D >> 16) + ((D >> 8) & 255) + (D & 255));
  const int64_t I = T >> 25, F = T & (kOffsetOne - 1);
  if (v >= 0) return {centre + I, F};
  return {centre - I - 1, kOffsetOne - F};
}

struct Twirl {
  int64_t cx, cy, radius, rr;
  int64_t inv_rr;  // reciprocal of rr scaled by 2^(22 + inv_shift)
  int32_t inv_shift;
  int64_t turn;    // |angle|
  bool clockwise;  // angle < 0 (on screen, with y pointing down)

  Twirl(int32_t cx_, int32_t cy_, int32_t radius_, int32_t angle)
      : cx(cx_),
        cy(cy_),
        radius(radius_),
        rr(int64_t{radius_} * radius_),
        inv_rr(0),
        inv_shift(8),
        turn(angle < 0 ? -int64_t{angle} : angle),
        clockwise(angle < 0) {
    // Up to radius 4095 the reciprocal is 2^30 / rr, which keeps 6 or more significant bits.
    // Beyond that it would run out (at radius 32769 it is 0 and the whole disc would sample the
    // centre), so larger circles take it with 32 more bits. Both forms agree where rr is a
    // power of two, and d2 * inv_rr stays below 2^62 because d2 < rr.
    if (radius_ <= 4095) {
      inv_rr = (int64_t{1} << 30) / rr;
    } else {
      inv_rr = (int64_t{1} << 62) / rr;
      inv_shift = 40;
    }
  }

  bool operator()(int32_t x, int32_t y, SourcePoint& p) const {
    const int64_t dx = x - cx, dy = y - cy;
    const int64_t d2 = dx * dx + dy * dy;
    if (d2 >= rr) return false;
    const int64_t rho = rho_of((d2 * inv_rr) >> inv_shift);
    const int64_t D = radius * rho;
    // Offsets within the image fit 32 bits (the image has at most kMaxPixels pixels).
    const int64_t theta = fatan2(static_cast<int32_t>(dx), static_cast<int32_t>(dy));
    const int64_t twist = (kRhoOne - rho) * turn;
    const int64_t full = kAngle360;
    const int64_t turned = (clockwise ? theta + full - twist : theta + twist) % full;
    const SinCos sc = sin_cos((turned / 360) >> 5);
    const AxisOffset ox = offset_along(cx, D, sc.s), oy = offset_along(cy, D, sc.c);
    p.x = ox.coord;
    p.y = oy.coord;
    p.fx = static_cast<uint32_t>(ox.weight >> 14);
    p.fy = static_cast<uint32_t>(oy.weight >> 14);
    return true;
  }
};

}  // namespace
}  // namespace pfx

extern "C" {

int32_t fx_twirl(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t cx,
                 int32_t cy, int32_t radius, int32_t angle, int32_t left, int32_t right,
                 int32_t top, int32_t bottom, uint32_t fast) {
  if (!pfx::warp_args_ok(src, dst, width, height, cx, cy)) return PHOTOFX_INVALID_ARGUMENT;
  if (radius < 1 || angle < -360 || angle > 360) return PHOTOFX_INVALID_ARGUMENT;
  pfx::copy_image(src, dst, pfx::pixel_count(width, height));
  if (angle == 0) return PHOTOFX_SUCCESS;
  pfx::warp_window(src, dst, width, height, {left, right, top, bottom}, fast != 0,
                   pfx::Twirl(cx, cy, radius, angle));
  return PHOTOFX_SUCCESS;
}

void runTwirl(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t cx,
              int32_t cy, int32_t radius, int32_t angle, int32_t left, int32_t right, int32_t top,
              int32_t bottom, uint32_t fast) {
  fx_twirl(src, dst, width, height, cx, cy, radius, angle, left, right, top, bottom, fast);
}

}  // extern "C"
