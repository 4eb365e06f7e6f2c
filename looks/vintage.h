// The vintage look as one rule per pixel, and the loop over rows that both variants share.
#pragma once

#include <cstddef>
#include <cstdint>

#include "adjust/brightness_contrast.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "looks/tone_curves.h"
#include "looks/vignette.h"

namespace pfx {

// A run of per-channel passes folded into one table per channel: each pass maps the entries of
// the channels its selector (0 all, 1 red, 2 green, 3 blue) picks through its curve, so looking
// a channel up once gives what the passes give one after another.
struct ChannelTables {
  uint8_t t[3][256];  // red, green, blue

  constexpr ChannelTables() : t{} {
    for (int32_t c = 0; c < 256; ++c) t[0][c] = t[1][c] = t[2][c] = static_cast<uint8_t>(c);
  }

  template <class Curve>
  constexpr void pass(int32_t channel, const Curve& curve) {
    for (int32_t k = 0; k < 3; ++k) {
      if (channel != 0 && channel != k + 1) continue;
      for (uint8_t& v : t[k]) v = static_cast<uint8_t>(curve(v));
    }
  }

  // The look was tuned with its gammas held in single precision; widening them to double gives
  // the same curves as the decimal values would.
  constexpr void gamma(int32_t channel, float g) {
    uint8_t curve[256] = {};
    for (int32_t n = 0; n < 256; ++n) {
      curve[n] = static_cast<uint8_t>(gamma_entry(n, static_cast<double>(g)));
    }
    pass(channel, [&](int32_t c) { return curve[c]; });
  }
};

// Vintage passes 1..6 (before brightness) and 8..21 (after it), made by the compiler.
constexpr ChannelTables vintage_before_brightness() {
  ChannelTables t;
  uint8_t first[256] = {};  // pass 1's gamma, the one given as a double
  for (int32_t n = 0; n < 256; ++n) first[n] = static_cast<uint8_t>(gamma_entry(n, 0.77));
  t.pass(0, [&](int32_t c) { return first[c]; });
  t.pass(1, InputLevels(28, 255));
  t.gamma(1, 1.09f);
  t.gamma(2, 1.06f);
  t.gamma(3, 1.15f);
  t.pass(3, OutputLevels(45, 255));
  return t;
}

constexpr ChannelTables vintage_after_brightness() {
  ChannelTables t;
  constexpr Contrast contrast(12);
  const auto contrast_pass = [&](int32_t c) { return contrast.channel(c); };
  t.pass(0, contrast_pass);
  t.pass(0, InputLevels(15, 243));
  t.gamma(0, 1.03f);
  t.pass(0, OutputLevels(0, 238));
  t.pass(1, InputLevels(49, 255));
  t.gamma(1, 2.35f);
  t.pass(1, OutputLevels(11, 232));
  t.gamma(2, 1.15f);
  t.pass(2, OutputLevels(0, 250));
  t.gamma(3, 0.58f);
  t.pass(3, OutputLevels(56, 238));
  t.pass(0, contrast_pass);
  t.pass(3, OutputLevels(0, 241));
  t.pass(3, OutputLevels(14, 255));
  return t;
}

// GCC folds pow in constant expressions, so there the tables are in the library's data; clang
// (the WebAssembly build) does not, and makes them once when the library is loaded.
#if defined(__clang__)
#define PFX_POW_CONSTEXPR const
#else
#define PFX_POW_CONSTEXPR constexpr
#endif
inline PFX_POW_CONSTEXPR ChannelTables kVintageBefore = vintage_before_brightness();
inline PFX_POW_CONSTEXPR ChannelTables kVintageAfter = vintage_after_brightness();
#undef PFX_POW_CONSTEXPR

class VintageLook {
 public:
  VintageLook(int32_t width, int32_t height);

  // The look of pixel p with vignette weight w (full scale 2^20): the curves of passes 1..6 as
  // tables, brightness, the per-channel passes 8..21 as tables, the vignette. Every pass works
  // on each pixel alone, so this gives the pixels of the passes run one by one.
  uint32_t operator()(uint32_t p, uint32_t w) const {
    const auto& before = kVintageBefore.t;
    const auto& after = kVintageAfter.t;
    Rgb c = channels_of(p);
    c = brightness_({before[0][c.r], before[1][c.g], before[2][c.b]});
    c = {after[0][c.r], after[1][c.g], after[2][c.b]};
    const int32_t weight = static_cast<int32_t>(w);
    return pack(p, (weight * c.r) >> 20, (weight * c.g) >> 20, (weight * c.b) >> 20);
  }

  // The vignette's base of row y, and the weight of column x in it. An image narrower or lower
  // than 2 pixels has no border to fall off toward: every weight is full scale.
  uint32_t row(int32_t y) const { return flat_ ? 0 : vignette_.row(y); }
  uint32_t weight(uint32_t base, int32_t x) const {
    return flat_ ? uint32_t{1} << 20 : vignette_.weight(base, x);
  }

  const Brightness& brightness() const { return brightness_; }
  const DividedVignette& vignette() const { return vignette_; }
  bool flat() const { return flat_; }

 private:
  Brightness brightness_{12};
  DividedVignette vignette_;
  bool flat_;
};

// The NEON kernel of the look on a run of one row, from its first column and the row's vignette
// base (looks/vintage_neon.cpp);
// a stub elsewhere.
namespace neon {
PFX_NEON_KERNEL(size_t vintage(const Run&, const VintageLook&, int32_t, uint32_t))
}  // namespace neon

// The look within the clipped, non-empty rectangle r: every pixel without a mask, else the
// pixels whose mask byte is 1, the others getting their source value. Pixels outside r are not
// written.
inline void look_rows(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                      const VintageLook& look, const Rect& r, int32_t width) {
  const bool vector = neon_kernels();
  const size_t w = static_cast<size_t>(width);
  for (int32_t y = r.top; y <= r.bottom; ++y) {
    const uint32_t base = look.row(y);
    const size_t row = static_cast<size_t>(y) * w,
                 count = static_cast<size_t>(r.right - r.left) + 1;
    const size_t at = row + static_cast<size_t>(r.left);
    const size_t done =
        vector
            ? neon::vintage(Run{src + at, mask == nullptr ? nullptr : mask + at, dst + at, count},
                            look, r.left, base)
            : 0;
    for (size_t k = done; k < count; ++k) {
      const size_t i = at + k;
      const int32_t x = r.left + static_cast<int32_t>(k);
      dst[i] = mask == nullptr || mask[i] == 1 ? look(src[i], look.weight(base, x)) : src[i];
    }
  }
}

}  // namespace pfx
