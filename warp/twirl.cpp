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
#include "frame/dispatch.h"
#include "frame/table.h"
#include "photofx.h"
#include "warp/const_math.h"
#include "warp/warp.h"

namespace {

// 256 * sqrt(u) rounded to nearest, in integers: that is the nearest integer to sqrt(n) with
// n = 65536 u. With r = isqrt(n), sqrt(n) > r + 1/2 exactly when n > r^2 + r (as
// (r + 1/2)^2 = r^2 + r + 1/4), and no square root of an integer is ever a half, so there are
// no ties to settle.
constexpr int32_t root_entry(uint32_t u) {
  const uint64_t n = uint64_t{u} << 16;
  const uint64_t r = pfx::isqrt(n);
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

namespace {

constexpr uint32_t sin_cos_entry(int32_t r) {
  return static_cast<uint32_t>(sin_entry(r)) | static_cast<uint32_t>(sin_entry(4096 - r)) << 16;
}

}  // namespace

namespace pfx {

constinit const uint32_t kSinCos[4096] = {PFX_TABLE_4096(sin_cos_entry, 0)};

}  // namespace pfx

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

// The rule for one pixel, in 64-bit arithmetic: the whole story for radii above 4095, and the
// pixels nearest the centre (where the square root comes from the fine tables) otherwise.
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

// Radii up to 4095 keep every quantity of the rule below 2^32, so the pixels away from the centre
// take the same steps on 32-bit words, with the two divisions of a pixel replaced: 2^29 / hi of
// the arctangent read from kInverse29, and the sine index (turned / 360) >> 5 written as the
// single division by the constant 11520, which the compiler turns into a multiply. That leaves
// straight-line code over a run of pixels, which vectorises (table reads become gathers).
//
// The offset T = S * (128 h + m + l) of the rule reaches 2^37, but only T >> 14 (which holds
// the whole pixels I = T >> 25 and the weight bits) and whether T's low 14 bits are zero are
// needed. With A = S h < 2^30 and B = S (m + l) < 2^24, T = 128 A + B, and
//   T >> 14 = (A + (B >> 7)) >> 7
// exactly (the bits of B below 7 cannot carry into bit 14), while T's low 14 bits are those of
// the wrapped 32-bit sum (A << 7) + B.

// The source points of the pixels at column offsets dx0 + step * i (i < n) from the centre on
// the row dy below it, none of them in the disc where u < 8192, handed to
// point(i, sx, sy, fx, fy). Always inlined, so that the x86-64 copies of the run vectorise it
// with the blend.
template <class Point>
__attribute__((always_inline)) inline void twirl_points(const TwirlRun& run, int32_t dy,
                                                        int32_t dx0, int32_t step, int32_t n,
                                                        Point&& point) {
  const int32_t cx = run.cx, cy = run.cy;
  const uint32_t radius = run.radius, inv_rr = run.inv_rr, turn = run.turn;
  const bool clockwise = run.clockwise;
  const uint32_t ax = static_cast<uint32_t>(dy < 0 ? -dy : dy);  // |b| of FATAN2(dx, dy)
  const uint32_t dy2 = ax * ax;
  const bool below = dy > 0;
  // theta + twist, or theta + 360 degrees - twist when clockwise, as one wrapping sum: the true
  // value lies in 0 ... 720 degrees, so the word holds it exactly.
  const uint32_t start = clockwise ? kAngle360 : 0, signed_turn = clockwise ? 0u - turn : turn;
  // Coordinate and bilinear weight along one axis from the magnitude and sign of its sine or
  // cosine; see above for the split of T.
  const auto axis = [](int32_t centre, uint32_t h, uint32_t ml, uint32_t mag, bool neg,
                       int32_t& coord, uint32_t& f) {
    const uint32_t a = mag * h, b = mag * ml;
    const uint32_t t14 = (a + (b >> 7)) >> 7;
    const int32_t whole = static_cast<int32_t>(t14 >> 11);
    const uint32_t part = t14 & 2047;
    const bool exact = (((a << 7) + b) & 16383) == 0;
    coord = neg ? centre - whole - 1 : centre + whole;
    f = neg ? 2048 - part - (exact ? 0 : 1) : part;
  };
  PFX_NO_ALIAS_LOOP
  for (int32_t i = 0; i < n; ++i) {
    const int32_t dx = dx0 + step * i;
    const uint32_t ay = static_cast<uint32_t>(dx < 0 ? -dx : dx);
    const uint32_t d2 = ay * ay + dy2;
    const uint32_t rho = static_cast<uint32_t>(SQRT_STEP_4[((d2 * inv_rr) >> 8) >> 6]);
    const uint32_t D = radius * rho;
    // FATAN2(dx, dy); the centre, where both are 0, is never here.
    const bool steep = ay > ax;
    const uint32_t lo = steep ? ax : ay, hi = steep ? ay : ax;
    const uint32_t index = (lo * kInverse29[hi]) >> 18;
    const uint32_t tab = static_cast<uint32_t>(ATAN[index & 2047]);
    const uint32_t t0 = index == 2048 ? kAngle45 : tab;
    const uint32_t t = steep ? kAngle90 - t0 : t0;
    // The quadrants as base + t or base - t: (0, +), (360, -) below the centre, (180, -),
    // (180, +) above it.
    const bool right = dx >= 0;
    const uint32_t base = below ? (right ? 0 : kAngle360) : kAngle180;
    const uint32_t theta = below == right ? base + t : base - t;
    // theta (up to a full turn here) plus the twist lies in 0 ... 720 degrees, and a full turn
    // is 16384 steps of 11520 exactly, so reducing the step index modulo 16384 is the same as
    // reducing the angle modulo 360 degrees first.
    const uint32_t sum = theta + start + ((uint32_t{1} << 19) - rho) * signed_turn;
    const uint32_t k = (sum / 11520) & 16383;  // ((sum mod 360 degrees) / 360) >> 5
    static_assert(kAngle360 == 16384u * 11520u);
    // Quarter q of the turn and the step r within it: the sine and cosine are SIN[r] and
    // SIN[4096 - r], swapped in odd quarters, with signs + + , + - , - - , - + .
    const uint32_t q = k >> 12, r = k & 4095;
    const uint32_t pair = kSinCos[r], near = pair & 0xFFFF, far = pair >> 16;
    const uint32_t s = (q & 1) != 0 ? far : near, c = (q & 1) != 0 ? near : far;
    const bool s_neg = q >= 2 && s != 0, c_neg = (q == 1 || q == 2) && c != 0;
    const uint32_t h = D >> 16, ml = ((D >> 8) & 255) + (D & 255);
    int32_t sx = 0, sy = 0;
    uint32_t fx = 0, fy = 0;
    axis(cx, h, ml, s, s_neg, sx, fx);
    axis(cy, h, ml, c, c_neg, sy, fy);
    point(i, sx, sy, fx, fy);
  }
}

// Twirled values of those pixels: each point blended at once, in a loop the compiler vectorises
// (on x86-64 in the copy of the path in force).
void twirl_run_loop(const TwirlRun& run, const uint32_t* __restrict src, int32_t dy, int32_t dx0,
                    int32_t step, int32_t n, uint32_t* __restrict out) {
  const int32_t width = run.width, height = run.height;
  twirl_points(run, dy, dx0, step, n,
               [&](int32_t i, int32_t sx, int32_t sy, uint32_t fx, uint32_t fy) {
                 out[i] = sample_pairs(src, width, height, sx, sy, fx, fy);
               });
}

void twirl_run(const TwirlRun& run, const uint32_t* src, int32_t dy, int32_t dx0, int32_t step,
               int32_t n, uint32_t* out) {
  vector_paths([&] { twirl_run_loop(run, src, dy, dx0, step, n, out); });
}

// The same through the NEON sampler, the points in chunks (first by the NEON kernel, the rest
// here).
void twirl_run_neon(const TwirlRun& run, const uint32_t* src, int32_t dy, int32_t dx0, int32_t step,
                    int32_t n, uint32_t* out) {
  sample_in_chunks(
      src, run.width, run.height, n, out, [&](int32_t at, int32_t m, PointChunk& chunk) {
        const int32_t from = dx0 + step * at;
        const int32_t done =
            static_cast<int32_t>(neon::twirl_points(run, dy, from, step, m, chunk));
        twirl_points(run, dy, from + step * done, step, m - done, ChunkSink{chunk, done});
      });
}

// First index i >= 0 with x0 + step * i >= x, for step 1 or 2.
int64_t first_at_or_after(int64_t x0, int32_t step, int64_t x) {
  return x <= x0 ? 0 : (x - x0 + step - 1) / step;
}

}  // namespace
}  // namespace pfx

extern "C" {

int32_t fx_twirl(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t cx,
                 int32_t cy, int32_t radius, int32_t angle, int32_t left, int32_t right,
                 int32_t top, int32_t bottom, uint32_t fast) {
  if (!pfx::warp_args_ok(src, dst, width, height, cx, cy)) return PHOTOFX_INVALID_ARGUMENT;
  if (radius < 1 || angle < -360 || angle > 360) return PHOTOFX_INVALID_ARGUMENT;
  if (angle == 0) {
    pfx::copy_image(src, dst, pfx::pixel_count(width, height));
    return PHOTOFX_SUCCESS;
  }
  const pfx::Twirl rule(cx, cy, radius, angle);
  const pfx::Rect window{left, right, top, bottom};
  // Pixels strictly inside the circle are warped.
  const uint64_t limit = static_cast<uint64_t>(rule.rr) - 1;
  const auto each = pfx::sample_each(src, width, height, rule);
  if (radius > 4095 || width < 2) {
    pfx::warp_circle(src, dst, width, height, window, fast != 0, cx, cy, limit, each);
    return PHOTOFX_SUCCESS;
  }
  const pfx::TwirlRun run{width,
                          height,
                          cx,
                          cy,
                          static_cast<uint32_t>(radius),
                          static_cast<uint32_t>(rule.inv_rr),
                          static_cast<uint32_t>(rule.turn),
                          rule.clockwise};
  // The disc u < 8192, where the square root comes from the finer tables, is d2 < near.
  const int64_t near = ((int64_t{1} << 21) + rule.inv_rr - 1) / rule.inv_rr;
  const auto samples = [&](int32_t y, int32_t x0, int32_t step, int32_t n, uint32_t* out) {
    const int64_t dy = int64_t{y} - cy;
    int64_t a = n, b = n;  // samples a ... b - 1 lie in the disc
    if (dy * dy < near) {
      const int64_t half =
          static_cast<int64_t>(pfx::isqrt(static_cast<uint64_t>(near - 1 - dy * dy)));
      a = pfx::first_at_or_after(x0, step, int64_t{cx} - half);
      b = pfx::first_at_or_after(x0, step, int64_t{cx} + half + 1);
      if (a > n) a = n;
      if (b > n) b = n;
    }
    const int32_t ia = static_cast<int32_t>(a), ib = static_cast<int32_t>(b);
    const int32_t dx0 = x0 - cx, dy32 = static_cast<int32_t>(dy);
    const auto runs = pfx::neon_kernels() ? pfx::twirl_run_neon : pfx::twirl_run;
    runs(run, src, dy32, dx0, step, ia, out);
    each(y, x0 + step * ia, step, ib - ia, out + ia);
    runs(run, src, dy32, dx0 + step * ib, step, n - ib, out + ib);
  };
  pfx::warp_circle(src, dst, width, height, window, fast != 0, cx, cy, limit, samples);
  return PHOTOFX_SUCCESS;
}

void runTwirl(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t cx,
              int32_t cy, int32_t radius, int32_t angle, int32_t left, int32_t right, int32_t top,
              int32_t bottom, uint32_t fast) {
  fx_twirl(src, dst, width, height, cx, cy, radius, angle, left, right, top, bottom, fast);
}

}  // extern "C"
