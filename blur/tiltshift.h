// The sharp band of the tilt-shift effect and how sharpness fades away from it.
#pragma once

#include <cstdint>

namespace pfx {

// Rows with |y - centre| <= half_height form the band. The fade length T is half the distance
// from the band's edge to the farther image edge; a row's sharpness weight (256 = source only,
// 0 = blurred only) falls linearly from the band to T rows beyond it. Arithmetic is 64-bit so
// that any centre and half-height a caller passes is safe.
class TiltBand {
 public:
  TiltBand(int32_t height, int32_t centre, int32_t half_height)
      : centre_(centre), half_(half_height) {
    const int64_t below = int64_t{height} - centre;
    const int64_t far = below > centre ? below : int64_t{centre};
    fade_ = (far - half_height) >> 1;
    inv_ = fade_ >= 1 ? 1048576 / fade_ : 0;
  }

  // With a fade length below one row there is no room to fade (and 1/T would divide by zero or
  // turn negative): the whole image counts as the sharp band.
  bool sharp_everywhere() const { return fade_ < 1; }

  int32_t weight(int32_t y) const {
    if (sharp_everywhere()) return 256;
    const int64_t d = int64_t{y} - centre_;
    int64_t e = (d < 0 ? -d : d) - half_;
    if (e < 0) e = 0;
    if (e >= fade_) return 0;
    // (T - e) * inv <= T * (2^20 / T) <= 2^20, so the weight never exceeds 256.
    return static_cast<int32_t>(((fade_ - e) * 256 * inv_) >> 20);
  }

 private:
  int64_t centre_, half_, fade_, inv_;
};

}  // namespace pfx
