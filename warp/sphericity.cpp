// Sphericity: bulges the image outward (positive level) or pinches it inward (negative level)
// inside a circle around a centre, like a lens pressed onto the picture. Each pixel inside the
// circle samples the source at a position pulled toward the centre (bulge) or pushed away from
// it (pinch) by an amount that falls off with the squared distance through EXP_n7.
//
// Source positions carry 18 fraction bits. Pixel coordinates times 2^18 and the pull k times a
// coordinate pass 2^31 on large images at high levels, so positions are 64-bit.
#include <cstdint>

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

}  // namespace
}  // namespace pfx

extern "C" {

int32_t fx_sphericity(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t cx,
                      int32_t cy, int32_t radius, int32_t level, int32_t left, int32_t right,
                      int32_t top, int32_t bottom, uint32_t fast) {
  if (!pfx::warp_args_ok(src, dst, width, height, cx, cy)) return PHOTOFX_INVALID_ARGUMENT;
  if (radius <= 0 || level < -100 || level > 100) return PHOTOFX_INVALID_ARGUMENT;
  pfx::copy_image(src, dst, pfx::pixel_count(width, height));
  pfx::warp_window(src, dst, width, height, {left, right, top, bottom}, fast != 0,
                   pfx::Sphericity(cx, cy, radius, level));
  return PHOTOFX_SUCCESS;
}

void runSphericity(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, int32_t cx,
                   int32_t cy, int32_t radius, int32_t level, int32_t left, int32_t right,
                   int32_t top, int32_t bottom, uint32_t fast) {
  fx_sphericity(src, dst, width, height, cx, cy, radius, level, left, right, top, bottom, fast);
}

}  // extern "C"
