// Sphericity: bulges the image outward (positive level) or pinches it inward (negative level)
// inside a circle around a centre, like a lens pressed onto the picture. Each pixel inside the
// circle samples the source at a position pulled toward the centre (bulge) or pushed away from
// it (pinch) by an amount that falls off with the squared distance through EXP_n7.
//
// Source positions carry 18 fraction bits. Pixel coordinates times 2^18 and the pull k times a
// coordinate pass 2^31 on large images at high levels, so positions are 64-bit.
#include <cstdint>

#include "frame/dispatch.h"
#include "frame/divide.h"
#include "frame/frame.h"
#include "photofx.h"
#include "warp/warp.h"

extern "C" {

// Roughly 2^26 exp(-7 t / 256), falling faster toward the rim.
constinit const int32_t EXP_n7[256] = {
    66974646, 65225351, 63511848, 61834137, 60192218, 58586091, 57015756, 55481213, 53982462,
    52519503, 51092336, 49700961, 48345378, 47025587, 45741588, 44493381, 43280966, 42104343,
    40963512, 39858473, 38789226, 37755771, 36758108, 35796237, 34870158, 33979871, 32955444,
    32072417, 31210424, 30369465, 29549540, 28750649, 27972792, 27215969, 26480180, 25765425,
    25071704, 24399017, 23747364, 23099646, 22480328, 21875832, 21286158, 20711306, 20151276,
    19606068, 19075682, 18560118, 18059376, 17573456, 17102358, 16646082, 16165599, 15741135,
    15325501, 14918697, 14520723, 14131579, 13751265, 13379781, 13017127, 12663303, 12318309,
    11982145, 11654811, 11336307, 11026633, 10725789, 10433775, 10150591, 9876237,  9610713,
    9354019,  9106155,  8867121,  8636917,  8415543,  8156789,  7943376,  7734345,  7529696,
    7329429,  7133544,  6942041,  6754920,  6572181,  6393824,  6219849,  6050256,  5885045,
    5724216,  5567769,  5415704,  5268021,  5124720,  4985801,  4851264,  4721109,  4595336,
    4473945,  4356936,  4244309,  4136064,  4004101,  3898964,  3796003,  3695218,  3596609,
    3500176,  3405919,  3313838,  3223933,  3136204,  3050651,  2967274,  2886073,  2807048,
    2730199,  2655526,  2583029,  2512708,  2444563,  2378594,  2314801,  2253184,  2193743,
    2136478,  2081389,  2019149,  1966224,  1914379,  1863614,  1813929,  1765324,  1717799,
    1671354,  1625989,  1581704,  1538499,  1496374,  1455329,  1415364,  1376479,  1338674,
    1301949,  1266304,  1231739,  1198254,  1165849,  1134524,  1104279,  1075114,  1047029,
    1020024,  986556,   960421,   934822,   909759,   885232,   861241,   837786,   814867,
    792484,   770637,   749326,   728551,   708312,   688609,   669442,   650811,   632716,
    615157,   598134,   581647,   565696,   550281,   535402,   521059,   507252,   493981,
    476912,   464003,   451360,   438983,   426872,   415027,   403448,   392135,   381088,
    370307,   359792,   349543,   339560,   329843,   320392,   311207,   302288,   293635,
    285248,   277127,   269272,   261683,   254360,   247303,   240512,   240961,   234454,
    228079,   221836,   215725,   209746,   203899,   198184,   192601,   187150,   181831,
    176644,   171589,   166666,   161875,   157216,   152689,   148294,   144031,   139900,
    135901,   132034,   128299,   124696,   121225,   117886,   85473,    81966,    78523,
    75144,    71829,    68578,    65391,    62268,    59209,    56214,    53283,    50416,
    47613,    44874,    42199,    39588,    37041,    34558,    32139,    29784,    27493,
    25266,    23103,    21004,    18969};

}  // extern "C"

namespace pfx {
namespace {

constexpr int64_t kPosOne = int64_t{1} << 18;  // a whole pixel in source positions

// The falloff read as a 257-entry table whose last entry is 0: a pixel on the rim has t = 256.
inline int64_t falloff(int64_t t) { return t >= 256 ? 0 : EXP_n7[t]; }

// The squared rim, (radius^2 * 500 + 128) >> 8, formed without overflow for any radius: radius^2
// is split at 64 so that neither part of the product passes 2^63.
constexpr int64_t rim_of(int32_t radius) {
  const uint64_t r2 = static_cast<uint64_t>(radius) * static_cast<uint64_t>(radius);
  return static_cast<int64_t>((r2 >> 6) * 125u + (((r2 & 63u) * 125u + 32u) >> 6));
}

// The rule for one pixel, in 64-bit arithmetic with its divisions, for the largest circles.
struct Sphericity {
  int64_t cx, cy, level;
  int64_t rim;
  int64_t inv_rim;  // 2^30 / rim, so that t = d2 * inv_rim >> 22 runs 0..256

  Sphericity(int32_t cx_, int32_t cy_, int32_t radius, int32_t level_)
      : cx(cx_), cy(cy_), level(level_), rim(rim_of(radius)), inv_rim((int64_t{1} << 30) / rim) {}

  bool operator()(int32_t x, int32_t y, SourcePoint& p) const {
    const int64_t dx = x - cx, dy = y - cy;
    const int64_t d2 = dx * dx + dy * dy;
    if (d2 > rim) return false;
    const int64_t e = falloff((d2 * inv_rim) >> 22) >> 7;
    if (level < 0) {
      // Pinch: the source lies k / 2^18 of the offset farther out.
      const int64_t k = (30 * -level * e) >> 12;
      const int64_t sx = x * kPosOne + k * dx, sy = y * kPosOne + k * dy;
      p.x = sx >> 18;
      p.y = sy >> 18;
      p.fx = static_cast<uint32_t>((sx & (kPosOne - 1)) >> 7);
      p.fy = static_cast<uint32_t>((sy & (kPosOne - 1)) >> 7);
    } else {
      // Bulge: the source is the mean of the pixel and the centre, weighted 2^18 : k.
      const int64_t k = (75 * level * e) >> 12;
      const int64_t den = k + kPosOne;
      const int64_t nx = x * kPosOne + cx * k, ny = y * kPosOne + cy * k;
      p.x = nx / den;
      p.y = ny / den;
      const int64_t q = (int64_t{1} << 30) / den;  // q * remainder < 2^30
      p.fx = static_cast<uint32_t>((q * (nx - p.x * den)) >> 19);
      p.fy = static_cast<uint32_t>((q * (ny - p.y * den)) >> 19);
    }
    return true;
  }
};

// Circles whose rim is below 2^26 (radius up to 5860) keep every coordinate offset below 8192,
// and the rule then runs on 32-bit words without a division per pixel. The pull k depends on
// the pixel only through the falloff index t (0 ... 256), so everything that takes a division is
// worked out once per call for each t.
//
// Bulge: with x = cx + dx the rule's numerator is x 2^18 + cx k = cx den + dx 2^18, so
// sx = cx + floor(dx 2^18 / den) and rx is the remainder of that floor division. For n = |dx|
// the quotient comes from R = floor(2^37 / den) by one multiplication and one correction step
// (bulge_quotient, frame/divide.h). The weight's scale 2^30 / den is R >> 7
// (floor(floor(a / b) / c) = floor(a / bc)).
//
// Pinch: k < 2^19 and |dx| < 2^13 make k dx a 33-bit product, but only k dx >> 7 is needed
// (its whole pixels from bit 11 up, its weight below): with k = 128 kh + kl that is
// kh dx + (kl dx >> 7), exactly, in 32 bits.

// The source point of each pixel at column offsets dx0 + step * i (i < n) on the row dy below
// the centre, handed to point(i, sx, sy, fx, fy). Always inlined, so that the x86-64 copies of
// the run vectorise it with the blend.
template <class Point>
__attribute__((always_inline)) inline void sphericity_points(const SphereRun& run, int32_t dy,
                                                             int32_t dx0, int32_t step, int32_t n,
                                                             Point&& point) {
  const int32_t cx = run.cx, cy = run.cy;
  const uint32_t inv_rim = run.inv_rim;
  const uint32_t dy2 = static_cast<uint32_t>(dy * dy);
  if (run.pinch) {
    // Source at pos + k d / 2^18 along each axis.
    const auto axis = [](int32_t pos, int32_t d, int32_t kh, int32_t kl, int32_t& coord,
                         uint32_t& f) {
      const int32_t p7 = kh * d + ((kl * d) >> 7);
      coord = pos + (p7 >> 11);
      f = static_cast<uint32_t>(p7 & 2047);
    };
    const int32_t y = cy + dy;
    PFX_NO_ALIAS_LOOP
    for (int32_t i = 0; i < n; ++i) {
      const int32_t dx = dx0 + step * i;
      const uint32_t d2 = static_cast<uint32_t>(dx * dx) + dy2;
      const uint32_t t = (d2 * inv_rim) >> 22;
      const int32_t kh = run.k_hi[t], kl = run.k_lo[t];
      int32_t sx = 0, sy = 0;
      uint32_t fx = 0, fy = 0;
      axis(cx + dx, dx, kh, kl, sx, fx);
      axis(y, dy, kh, kl, sy, fy);
      point(i, sx, sy, fx, fy);
    }
    return;
  }
  // Source at centre + floor(d 2^18 / den) along each axis, the remainder giving the weight.
  const auto axis = [](int32_t centre, int32_t d, uint32_t den, uint32_t recip, int32_t& coord,
                       uint32_t& f) {
    const QuotientRemainder qr = bulge_quotient(static_cast<uint32_t>(d < 0 ? -d : d), den, recip);
    const uint32_t q = qr.q, r = qr.r;
    // For d < 0 the quotient is negated and, when inexact, floored one further. Written as
    // arithmetic on the sign rather than a choice, because d is the same for a whole row on the
    // y axis and the vectoriser cannot choose by a value outside the loop.
    const int32_t neg = d < 0 ? 1 : 0;
    const int32_t back = (r != 0 ? 1 : 0) & neg;
    coord = centre + ((static_cast<int32_t>(q) ^ -neg) + neg) - back;
    f = ((recip >> 7) * (back != 0 ? den - r : r)) >> 19;
  };
  PFX_NO_ALIAS_LOOP
  for (int32_t i = 0; i < n; ++i) {
    const int32_t dx = dx0 + step * i;
    const uint32_t d2 = static_cast<uint32_t>(dx * dx) + dy2;
    const uint32_t t = (d2 * inv_rim) >> 22;
    const uint32_t den = run.den[t], recip = run.recip[t];
    int32_t sx = 0, sy = 0;
    uint32_t fx = 0, fy = 0;
    axis(cx, dx, den, recip, sx, fx);
    axis(cy, dy, den, recip, sy, fy);
    point(i, sx, sy, fx, fy);
  }
}

// The run's pixels sampled: the points as above, each blended at once, in a loop the compiler
// vectorises (on x86-64 in the copy of the path in force).
void sphericity_run_loop(const SphereRun& run, const uint32_t* __restrict src, int32_t dy,
                         int32_t dx0, int32_t step, int32_t n, uint32_t* __restrict out) {
  const int32_t width = run.width, height = run.height;
  sphericity_points(run, dy, dx0, step, n,
                    [&](int32_t i, int32_t sx, int32_t sy, uint32_t fx, uint32_t fy) {
                      out[i] = sample_pairs(src, width, height, sx, sy, fx, fy);
                    });
}

void sphericity_run(const SphereRun& run, const uint32_t* src, int32_t dy, int32_t dx0,
                    int32_t step, int32_t n, uint32_t* out) {
  vector_paths([&] { sphericity_run_loop(run, src, dy, dx0, step, n, out); });
}

}  // namespace
}  // namespace pfx

extern "C" {

int32_t fx_sphericity(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t cx,
                      int32_t cy, int32_t radius, int32_t level, int32_t left, int32_t right,
                      int32_t top, int32_t bottom, uint32_t fast) {
  if (!pfx::warp_args_ok(src, dst, width, height, cx, cy)) return PHOTOFX_INVALID_ARGUMENT;
  if (radius <= 0 || level < -100 || level > 100) return PHOTOFX_INVALID_ARGUMENT;
  const pfx::Sphericity rule(cx, cy, radius, level);
  const pfx::Rect window{left, right, top, bottom};
  const uint64_t limit = static_cast<uint64_t>(rule.rim);
  if (rule.rim >= (int64_t{1} << 26) || width < 2) {
    pfx::warp_circle(src, dst, width, height, window, fast != 0, cx, cy, limit,
                     pfx::sample_each(src, width, height, rule));
    return PHOTOFX_SUCCESS;
  }
  pfx::SphereRun run{};
  run.width = width;
  run.height = height;
  run.cx = cx;
  run.cy = cy;
  run.inv_rim = static_cast<uint32_t>(rule.inv_rim);
  run.pinch = level < 0;
  for (int32_t t = 0; t <= 256; ++t) {
    const int64_t e = pfx::falloff(t) >> 7;
    if (level < 0) {
      const int64_t k = (30 * -int64_t{level} * e) >> 12;
      run.k_hi[t] = static_cast<int32_t>(k >> 7);
      run.k_lo[t] = static_cast<int32_t>(k & 127);
    } else {
      const int64_t den = ((75 * int64_t{level} * e) >> 12) + pfx::kPosOne;
      run.den[t] = static_cast<uint32_t>(den);
      run.recip[t] = static_cast<uint32_t>((int64_t{1} << 37) / den);
    }
  }
  pfx::warp_circle(
      src, dst, width, height, window, fast != 0, cx, cy, limit,
      [&](int32_t y, int32_t x0, int32_t step, int32_t n, uint32_t* out) {
        if (!pfx::neon_kernels()) {
          pfx::sphericity_run(run, src, y - cy, x0 - cx, step, n, out);
          return;
        }
        const int32_t dy = y - cy;
        pfx::sample_in_chunks(
            src, width, height, n, out, [&](int32_t at, int32_t m, pfx::PointChunk& chunk) {
              const int32_t dx0 = x0 - cx + step * at;
              const int32_t done =
                  static_cast<int32_t>(pfx::neon::sphericity_points(run, dy, dx0, step, m, chunk));
              pfx::sphericity_points(run, dy, dx0 + step * done, step, m - done,
                                     pfx::ChunkSink{chunk, done});
            });
      });
  return PHOTOFX_SUCCESS;
}

void runSphericity(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t cx,
                   int32_t cy, int32_t radius, int32_t level, int32_t left, int32_t right,
                   int32_t top, int32_t bottom, uint32_t fast) {
  fx_sphericity(src, dst, width, height, cx, cy, radius, level, left, right, top, bottom, fast);
}

}  // extern "C"
