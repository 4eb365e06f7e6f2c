// Shared machinery of the warps: the bilinear blend, the fast arctangent, clamped sampling of
// the source and the window loop with its fast mode. Sphericity and twirl differ only in how a
// destination pixel finds its source position; everything around that lives here.
#pragma once

#include <bit>
#include <cstdint>
#include <cstring>

#include "frame/frame.h"
#include "frame/kernel.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {

constexpr uint32_t kBilinearOne = 2048;  // a whole pixel in bilinear weights

// Warp angles: degrees with 19 fraction bits.
constexpr uint32_t kAngle45 = 0x1680000u;
constexpr uint32_t kAngle90 = 0x2D00000u;
constexpr uint32_t kAngle180 = 0x5A00000u;
constexpr uint32_t kAngle270 = 0x8700000u;
constexpr uint32_t kAngle360 = 0xB400000u;

// Blend of four neighbours with weights fx, fy in 0..2048, alpha 255. Each channel sum stays
// below 2048 * 2048 * 256 = 2^30, so 32 bits hold it exactly.
constexpr uint32_t blend_bilinear(uint32_t fx, uint32_t fy, uint32_t p00, uint32_t p10,
                                  uint32_t p01, uint32_t p11) {
  const uint32_t gx = kBilinearOne - fx, gy = kBilinearOne - fy;
  const auto blend = [&](int32_t (*channel)(uint32_t)) {
    const uint32_t top =
        gx * static_cast<uint32_t>(channel(p00)) + fx * static_cast<uint32_t>(channel(p10));
    const uint32_t bottom =
        gx * static_cast<uint32_t>(channel(p01)) + fx * static_cast<uint32_t>(channel(p11));
    return static_cast<int32_t>((top * gy + bottom * fy) >> 22);
  };
  return pack(0xFF000000u, blend(red_of), blend(green_of), blend(blue_of));
}

// 2^29 / i truncated, for i = 1 ... 4095 (entry 0 is 0): the scale FATAN2 gives the shorter
// component, for vectors whose components stay below 4096.
extern const uint32_t kInverse29[4096];

// SIN[r] in the low half and SIN[4096 - r] in the high half, for r = 0 ... 4095: the sine and
// cosine of a twirl's turn from one read.
extern const uint32_t kSinCos[4096];

// Angle of the vector (b along 0 degrees, a along 90 degrees) in warp-angle units, from the
// ATAN table of the ratio of the shorter to the longer component.
inline uint32_t fatan2(int32_t a, int32_t b) {
  if (b == 0) return a > 0 ? kAngle90 : (a < 0 ? kAngle270 : 0);
  if (a == 0) return b > 0 ? 0 : kAngle180;
  // Magnitudes as unsigned words, so that INT32_MIN has one (2^31).
  const uint32_t ax = b < 0 ? 0u - static_cast<uint32_t>(b) : static_cast<uint32_t>(b);
  const uint32_t ay = a < 0 ? 0u - static_cast<uint32_t>(a) : static_cast<uint32_t>(a);
  const bool steep = ay > ax;
  const uint32_t lo = steep ? ax : ay, hi = steep ? ay : ax;
  const uint32_t index = (lo * (0x20000000u / hi)) >> 18;  // lo <= hi keeps it within 0..2048
  uint32_t t = index == 2048 ? kAngle45 : static_cast<uint32_t>(ATAN[index]);
  if (steep) t = kAngle90 - t;
  if (b > 0) {
    if (a >= 0) return t;
    // A vector just below the 0-degree axis can read ATAN[0]; that angle is 0, not a full turn.
    return t == 0 ? 0 : kAngle360 - t;
  }
  return a < 0 ? kAngle180 + t : kAngle180 - t;
}

// Where a warped pixel samples the source: the top-left neighbour and the weights toward the
// right and lower neighbours (0..2048). Coordinates may lie anywhere; sampling clamps them.
struct SourcePoint {
  int64_t x, y;
  uint32_t fx, fy;
};

// The four neighbours of p, each coordinate held to the image, blended. Inside the image the
// clamp changes nothing, so one rule covers both cases.
inline uint32_t sample_clamped(const uint32_t* src, int32_t width, int32_t height,
                               const SourcePoint& p) {
  const auto hold = [](int64_t v, int32_t size) {
    return static_cast<size_t>(v < 0 ? 0 : (v > size - 1 ? size - 1 : v));
  };
  const size_t w = static_cast<size_t>(width);
  const size_t xa = hold(p.x, width), xb = hold(p.x + 1, width);
  const size_t ya = hold(p.y, height) * w, yb = hold(p.y + 1, height) * w;
  return blend_bilinear(p.fx, p.fy, src[ya + xa], src[ya + xb], src[yb + xa], src[yb + xb]);
}

// The pixels at columns c and c + 1 of the row starting at src[row], each held to the image (width
// >= 2), from one 64-bit read of a pair of neighbours inside the row: at the left edge both are
// column 0, at the right edge both the last column. One wide read instead of two narrow ones
// matters where the reads are scattered (a vectorised loop gathers them one by one).
inline void read_pair(const uint32_t* src, uint32_t row, int32_t c, int32_t width, uint32_t& left,
                      uint32_t& right) {
  // Clamped step by step, and the edges recognised by comparing with the clamped column: the
  // compiler keeps that free of branches, so the read stays one gather.
  int32_t j = c < 0 ? 0 : c;
  j = j > width - 2 ? width - 2 : j;
  uint64_t pair = 0;
  std::memcpy(&pair, src + (row + static_cast<uint32_t>(j)), sizeof pair);
  const bool little = std::endian::native == std::endian::little;
  const uint32_t first = static_cast<uint32_t>(little ? pair : pair >> 32);
  const uint32_t second = static_cast<uint32_t>(little ? pair >> 32 : pair);
  left = c > j ? second : first;
  right = c < j ? first : second;
}

// The bilinear blend around source pixel (sx, sy) with weights fx, fy, neighbours held to the
// image as in sample_clamped (width >= 2; the image has at most kMaxPixels pixels, so the
// offsets fit 32 bits).
inline uint32_t sample_pairs(const uint32_t* src, int32_t width, int32_t height, int32_t sx,
                             int32_t sy, uint32_t fx, uint32_t fy) {
  const int32_t ya = sy < 0 ? 0 : (sy > height - 1 ? height - 1 : sy);
  const int32_t yb = sy + 1 < 0 ? 0 : (sy + 1 > height - 1 ? height - 1 : sy + 1);
  uint32_t p00 = 0, p10 = 0, p01 = 0, p11 = 0;
  const uint32_t w = static_cast<uint32_t>(width);
  read_pair(src, static_cast<uint32_t>(ya) * w, sx, width, p00, p10);
  read_pair(src, static_cast<uint32_t>(yb) * w, sx, width, p01, p11);
  return blend_bilinear(fx, fy, p00, p10, p01, p11);
}

// Source points of a chunk of warped pixels, for the NEON sampler.
struct PointChunk {
  static constexpr int32_t kSize = 256;
  int32_t sx[kSize], sy[kSize];
  uint16_t fx[kSize], fy[kSize];
};

// The sphericity's fast path (sphericity.cpp): per row of the table t = (d2 inv_rim) >> 22, the
// bulge's divisor and reciprocal or the pinch's factor in two parts.
struct SphereRun {
  int32_t width, height, cx, cy;
  uint32_t inv_rim;  // 2^30 / rim
  bool pinch;
  uint32_t den[257], recip[257];  // bulge: den and 2^37 / den for each t
  int32_t k_hi[257], k_lo[257];   // pinch: k >> 7 and k & 127 for each t
};

// The twirl's fast path (twirl.cpp) for radii up to 4095.
struct TwirlRun {
  int32_t width, height, cx, cy;
  uint32_t radius;  // 1 ... 4095
  uint32_t inv_rr;  // 2^30 / radius^2
  uint32_t turn;    // |angle|
  bool clockwise;
};

namespace neon {
// The source points of a twirl run (twirl.cpp's twirl_points), four at a time; returns how
// many it did.
PFX_NEON_KERNEL(size_t twirl_points(const TwirlRun&, int32_t, int32_t, int32_t, int32_t,
                                    PointChunk&))

// The source points of a sphericity run (sphericity.cpp's sphericity_points), four at a time;
// returns how many it did.
PFX_NEON_KERNEL(size_t sphericity_points(const SphereRun&, int32_t, int32_t, int32_t, int32_t,
                                         PointChunk&))

// Samples the first n points of the chunk as sample_pairs does (width >= 2); returns how many
// it did, a multiple of four.
PFX_NEON_KERNEL(size_t bilinear(const uint32_t*, int32_t, int32_t, const PointChunk&, size_t,
                                uint32_t*))
}  // namespace neon

// A sink for the points functions that stores into a chunk, from index `from` on.
struct ChunkSink {
  PointChunk& chunk;
  int32_t from;
  void operator()(int32_t i, int32_t sx, int32_t sy, uint32_t fx, uint32_t fy) const {
    chunk.sx[from + i] = sx;
    chunk.sy[from + i] = sy;
    chunk.fx[from + i] = static_cast<uint16_t>(fx);
    chunk.fy[from + i] = static_cast<uint16_t>(fy);
  }
};

// n warped pixels into out, through the NEON sampler in chunks: points(at, m, chunk) fills the
// chunk with the source points of pixels at .. at + m - 1.
template <class Points>
void sample_in_chunks(const uint32_t* src, int32_t width, int32_t height, int32_t n, uint32_t* out,
                      const Points& points) {
  PointChunk chunk;
  for (int32_t at = 0; at < n; at += PointChunk::kSize) {
    const int32_t m = n - at < PointChunk::kSize ? n - at : PointChunk::kSize;
    points(at, m, chunk);
    const size_t done = neon::bilinear(src, width, height, chunk, static_cast<size_t>(m), out + at);
    for (size_t i = done; i < static_cast<size_t>(m); ++i) {
      out[at + static_cast<int32_t>(i)] =
          sample_pairs(src, width, height, chunk.sx[i], chunk.sy[i], chunk.fx[i], chunk.fy[i]);
    }
  }
}

// True when the blocks of na and nb words at a and b share any byte.
inline bool buffers_overlap(const uint32_t* a, int64_t na, const uint32_t* b, int64_t nb) {
  const uintptr_t pa = reinterpret_cast<uintptr_t>(a), pb = reinterpret_cast<uintptr_t>(b);
  const uintptr_t ea = pa + static_cast<uintptr_t>(na) * 4,
                  eb = pb + static_cast<uintptr_t>(nb) * 4;
  return na > 0 && nb > 0 && pa < eb && pb < ea;
}

// Checks common to the circle warps: both buffers present and apart, an addressable image and
// a centre inside it.
inline bool warp_args_ok(const uint32_t* src, const uint32_t* dst, int32_t width, int32_t height,
                         int32_t cx, int32_t cy) {
  if (src == nullptr || dst == nullptr) return false;
  if (cx < 0 || cx >= width || cy < 0 || cy >= height) return false;  // also width, height >= 1
  const int64_t n = pixel_count(width, height);
  return n <= kMaxPixels && !buffers_overlap(src, n, dst, n);
}

// Largest r with r * r <= n.
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

// Runs a circle warp over the window (clipped to the image) and copies every pixel it does not
// warp from src, so dst needs no copy beforehand. A pixel is warped when its squared distance
// from the centre is at most `limit`; on each row those pixels form one run of columns (the
// circle's chord), found with an integer square root, so the pixels outside the circle cost
// no test and are copied in blocks.
//
// samples(y, x0, step, n, out) fills out[i] with the warped value of pixel (x0 + step * i, y),
// each inside the circle. Fast mode samples every second column of the chord on every second
// row and fills the whole 2 x 2 block right of and below each sample, dropping only what falls
// outside the image: a block that starts on the window's last column or row reaches one past
// it, so a window previewed in fast mode has no seam of unwarped pixels along its right and
// bottom edges. Neighbours are read from src only, so the order of the writes does not matter.
template <class Samples>
void warp_circle(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height, Rect window,
                 bool fast, int32_t cx, int32_t cy, uint64_t limit, Samples&& samples) {
  const Rect w = clip_to_image(window, width, height);
  const size_t stride = static_cast<size_t>(width);
  const auto copy_rows = [&](int32_t from, int32_t to) {
    if (to <= from) return;
    const size_t at = static_cast<size_t>(from) * stride;
    fx_memcpy(dst + at, src + at,
              static_cast<uint32_t>(static_cast<size_t>(to - from) * stride * 4));
  };
  // Row y apart from columns first ... last.
  const auto copy_around = [&](int32_t y, int32_t first, int32_t last) {
    const size_t at = static_cast<size_t>(y) * stride;
    fx_memcpy(dst + at, src + at, static_cast<uint32_t>(first) * 4);
    const size_t after = static_cast<size_t>(last) + 1;
    fx_memcpy(dst + at + after, src + at + after, static_cast<uint32_t>((stride - after) * 4));
  };
  int32_t settled = 0;  // rows above this one are final in dst
  const int32_t row_step = fast ? 2 : 1;
  for (int32_t y = w.top; y <= w.bottom && w.left <= w.right; y += row_step) {
    const int64_t dy = int64_t{y} - cy;
    const uint64_t dy2 = static_cast<uint64_t>(dy * dy);
    if (dy2 > limit) continue;
    const int64_t half = static_cast<int64_t>(isqrt(limit - dy2));
    const int64_t first64 = int64_t{cx} - half < w.left ? w.left : int64_t{cx} - half;
    const int64_t last64 = int64_t{cx} + half > w.right ? w.right : int64_t{cx} + half;
    if (first64 > last64) continue;
    const int32_t first = static_cast<int32_t>(first64), last = static_cast<int32_t>(last64);
    copy_rows(settled, y);
    uint32_t* row = dst + static_cast<size_t>(y) * stride;
    if (!fast) {
      copy_around(y, first, last);
      samples(y, first, 1, last - first + 1, row + first);
      settled = y + 1;
      continue;
    }
    const int32_t n = (last - first) / 2 + 1;
    // The blocks end one past the last sample, held to the image (last <= width - 1, so the
    // sum cannot overflow).
    const int32_t end = first + 2 * (n - 1) + 1 > width - 1 ? width - 1 : first + 2 * (n - 1) + 1;
    const bool below = y + 1 < height;
    copy_around(y, first, end);
    if (below) copy_around(y + 1, first, end);
    constexpr int32_t kChunk = 512;
    uint32_t value[kChunk];
    for (int32_t done = 0; done < n; done += kChunk) {
      const int32_t m = n - done < kChunk ? n - done : kChunk;
      const int32_t x0 = first + 2 * done;
      samples(y, x0, 2, m, value);
      for (int32_t i = 0; i < m; ++i) {
        const size_t x = static_cast<size_t>(x0) + 2 * static_cast<size_t>(i);
        row[x] = value[i];
        if (below) row[stride + x] = value[i];
      }
      // The right half of each block, where the image reaches it.
      const int32_t whole = x0 + 2 * (m - 1) + 1 <= width - 1 ? m : m - 1;
      for (int32_t i = 0; i < whole; ++i) {
        const size_t x = static_cast<size_t>(x0) + 2 * static_cast<size_t>(i) + 1;
        row[x] = value[i];
        if (below) row[stride + x] = value[i];
      }
    }
    settled = y + (below ? 2 : 1);
  }
  copy_rows(settled, height);
}

// Samples for warp_circle from a per-pixel rule: locate(x, y, point) gives the source point of a
// warped pixel, which is then sampled with clamping.
template <class Locate>
auto sample_each(const uint32_t* src, int32_t width, int32_t height, const Locate& locate) {
  return [=](int32_t y, int32_t x0, int32_t step, int32_t n, uint32_t* out) {
    for (int32_t i = 0; i < n; ++i) {
      SourcePoint p{};
      locate(x0 + step * i, y, p);
      out[i] = sample_clamped(src, width, height, p);
    }
  };
}

}  // namespace pfx
