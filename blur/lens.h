// The aperture-shaped blur of working images.
#pragma once

#include <cstdint>

namespace pfx {

class TiltBand;

// One aperture: a side x side grid of 0/1 entries, row by row, covering offsets -r0 .. side-r0-1
// on both axes.
struct Aperture {
  int32_t side;
  int32_t r0;
  const int32_t* grid;
};

// The aperture of a level; every level outside 0..7 selects the 9 x 9 disc.
const Aperture& aperture_for(int32_t level);

// Lens blur of a width x height working image, src and dst distinct. Samples with a depth byte
// of 0 are copied, and so are taps with depth 0 left out; a null depth map counts every sample.
// With a band, the lens luma of each sample is drawn toward its own luma by the band's
// sharpness weight of its row.
void lens_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
               int32_t height, int32_t level, const TiltBand* band);

}  // namespace pfx
