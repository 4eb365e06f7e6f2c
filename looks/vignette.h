// The two vignette weights, the divided one (the vignette and the end of the vintage look) and
// the table-based one (the vignette preview, the vintage preview and the old-photo look), and
// the pixel loop that hands each rule its pixel's position.
#pragma once

#include <cstddef>
#include <cstdint>

#include "frame/frame.h"
#include "frame/kernel.h"

namespace pfx {

// floor(2^24 / k^2), the rule of LUT_VIGNETTE, for any k (entries 0 and 1 are both 2^24). The
// table covers half-sizes up to 2047; larger images read the rule directly, so any size works.
constexpr int32_t vignette_factor(int64_t k) {
  return k <= 1 ? int32_t{1} << 24 : static_cast<int32_t>((int64_t{1} << 24) / (k * k));
}

// LUT_VIGNETTE[k] where the table has it, the same rule beyond.
int32_t vignette_entry(int64_t k);

// A fall-off weight = max(0, full - term(dx) - term(dy)) >> 8 around (width >> 1, height >> 1),
// made in unsigned 32-bit words: wherever a factor is non-zero it is small enough for its term
// to fit them exactly (each class says why), and a zero factor makes the term 0 whatever the
// wrapped square. Each row has its base, full - term(dy); the loops subtract the column term.
class FallOff {
 public:
  // Base of row y.
  uint32_t row(int32_t y) const { return full_ - term(y, hh_, ky_); }

  // Weight of column x in a row with the given base.
  uint32_t weight(uint32_t base, int32_t x) const {
    const uint32_t t = term(x, hw_, kx_);
    return base > t ? (base - t) >> 8 : 0;
  }

  int32_t hw() const { return hw_; }
  uint32_t kx() const { return kx_; }

 protected:
  FallOff(int32_t width, int32_t height, uint32_t full, uint32_t kx, uint32_t ky, uint32_t times,
          int32_t shift)
      : hw_(width >> 1),
        hh_(height >> 1),
        full_(full),
        kx_(kx),
        ky_(ky),
        times_(times),
        shift_(shift) {}

  // (k * times * d^2) >> shift for d = at - centre.
  uint32_t term(int32_t at, int32_t centre, uint32_t k) const {
    const uint32_t d = static_cast<uint32_t>(at) - static_cast<uint32_t>(centre);
    return (k * (times_ * d * d)) >> shift_;
  }

  int32_t hw_, hh_;
  uint32_t full_, kx_, ky_, times_;
  int32_t shift_;
};

// Weight 1 - (7/16)(dx/hw)^2 - (7/16)(dy/hh)^2, full scale 2^20: kx = 2^28 / hw^2 and
// (kx * 7 dx^2) >> 4 per side. The factors need both half-sizes to be at least 1; the caller
// sees to that. A factor is non-zero only for half-sizes up to 16384, and then kx dx^2 is at
// most 2^28, so 7 kx dx^2 fits 32 bits.
class DividedVignette : public FallOff {
 public:
  DividedVignette(int32_t width, int32_t height)
      : FallOff(width, height, uint32_t{1} << 28, factor(width >> 1), factor(height >> 1), 7, 4) {}

  // Each colour channel times weight / 2^20.
  static constexpr int32_t kShift = 20;

 private:
  static uint32_t factor(int32_t half) {
    return static_cast<uint32_t>((int64_t{1} << 28) / (int64_t{half} * half));
  }
};

// Fall-off about 1 - (dx/hw)^2 / 2 - (dy/hh)^2 / 2, full scale 2^22, where the half-sizes are
// rounded up to a multiple of 8 to pick the factor: k = LUT_VIGNETTE[(hw + 7) >> 3] and
// (dx^2 k) >> 1 per side. With m = (hw + 7) >> 3, k <= 2^24 / m^2 and dx <= 8m, so dx^2 k is
// at most 2^30 while k is non-zero.
class PreviewVignette : public FallOff {
 public:
  PreviewVignette(int32_t width, int32_t height)
      : FallOff(width, height, uint32_t{1} << 30, factor(width >> 1), factor(height >> 1), 1, 1) {}

  static constexpr int32_t kShift = 22;

  // The weight at (x, y), for loops that do not go row by row.
  int32_t weight(int32_t x, int32_t y) const {
    return static_cast<int32_t>(FallOff::weight(row(y), x));
  }

 private:
  static uint32_t factor(int32_t half) {
    return static_cast<uint32_t>(vignette_entry((int64_t{half} + 7) >> 3));
  }
};

// NEON kernels of the weighted looks (looks/vignette_neon.cpp): the vignettes, and the old photo
// (its folded curves, then the table-based weight).
namespace neon {
PFX_NEON_KERNEL(size_t vignette(const Run&, const DividedVignette&, int32_t, uint32_t))
PFX_NEON_KERNEL(size_t vignette_preview(const Run&, const PreviewVignette&, int32_t, uint32_t))
PFX_NEON_KERNEL(size_t oldphoto(const Run&, const PreviewVignette&, int32_t, uint32_t))
}  // namespace neon

// dst[i] = rule(src[i], x, y) for every pixel in row order; src and dst may be the same buffer.
// Returns false, having written nothing, for a null buffer or an image too large to address.
template <class Rule>
bool for_each_pixel_at(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                       Rule&& rule) {
  if (src == nullptr || dst == nullptr) return false;
  const int64_t n = pixel_count(width, height);
  if (n > kMaxPixels) return false;
  if (n == 0) return true;
  size_t i = 0;
  for (int32_t y = 0; y < height; ++y) {
    for (int32_t x = 0; x < width; ++x, ++i) dst[i] = rule(src[i], x, y);
  }
  return true;
}

// A vector kernel of a weighted rule: edits a prefix of a run of one row given the row's first
// column and the fall-off's base of the row, returns its length (frame/kernel.h).
struct NoRowKernel {
  size_t operator()(const Run&, int32_t, uint32_t) const { return 0; }
};

// dst[i] = rule(src[i], weight) for every pixel in row order, the weight of the fall-off at the
// pixel, through the kernel first where the path has one; with a mask only where the mask byte
// is 1, the other pixels getting their source value. src and dst may be the same buffer. The
// caller has checked the buffers and the size.
template <class Rule, class Kernel = NoRowKernel>
void for_each_pixel_weighted(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                             int32_t height, const FallOff& falloff, Rule&& rule,
                             const Kernel& kernel = {}) {
  const bool vector = neon_kernels();
  const size_t w = width > 0 ? static_cast<size_t>(width) : 0;
  for (int32_t y = 0; y < height && w > 0; ++y) {
    const uint32_t base = falloff.row(y);
    const size_t row = static_cast<size_t>(y) * w;
    const uint8_t* row_mask = mask == nullptr ? nullptr : mask + row;
    const size_t done = vector ? kernel(Run{src + row, row_mask, dst + row, w}, 0, base) : 0;
    for (size_t x = done; x < w; ++x) {
      const size_t i = row + x;
      const uint32_t p = src[i];
      dst[i] = mask == nullptr || mask[i] == 1
                   ? rule(p, falloff.weight(base, static_cast<int32_t>(x)))
                   : p;
    }
  }
}

}  // namespace pfx
