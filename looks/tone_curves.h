// The tone curves of one channel value, for the curve functions themselves and for the vintage
// look, which folds runs of them into one table per channel.
#pragma once

#include <cmath>
#include <cstdint>

namespace pfx {

// n / 255 to the power 1 / gamma, scaled back to 0..255 and rounded half up, for n in 0..255.
// The clamp is made in double before the conversion, so a gamma of zero, a negative gamma or a
// NaN (whose products may be infinite or NaN) still gives a byte: NaN reads as 0. constexpr so
// that the vintage look's fixed curves are made by the compiler (GCC evaluates pow in constant
// expressions); a test checks them against the maths library's pow at run time.
constexpr int32_t gamma_entry(int32_t n, double gamma) {
  const double t = std::pow(n / 255.0, 1.0 / gamma) * 255.0 + 0.5;
  if (!(t >= 0.0)) return 0;
  if (t >= 255.0) return 255;
  return static_cast<int32_t>(t);
}

// Input levels: low..high stretched to 0..255, scale = 261120 / (high - low), for low < high.
// The arithmetic is 64-bit, so any pair of levels follows the formulas without overflowing; for
// 0 <= low < high <= 255 it gives the same values as 32 bits.
struct InputLevels {
  int64_t low, scale;
  constexpr InputLevels(int32_t low_, int32_t high)
      : low(low_), scale(261120 / (int64_t{high} - low_)) {}
  constexpr int32_t operator()(int32_t c) const {
    const int64_t v = (scale * (c - low)) >> 10;
    return static_cast<int32_t>(v < 0 ? 0 : (v > 255 ? 255 : v));
  }
};

// Output levels: 0..255 squeezed into low..high, scale = (high - low) * 1024 / 255.
struct OutputLevels {
  int64_t low, scale;
  constexpr OutputLevels(int32_t low_, int32_t high)
      : low(low_), scale((int64_t{high} - low_) * 1024 / 255) {}
  constexpr int32_t operator()(int32_t c) const {
    const int64_t v = ((scale * c) >> 10) + low;
    return static_cast<int32_t>(v < 0 ? 0 : (v > 255 ? 255 : v));
  }
};

}  // namespace pfx
