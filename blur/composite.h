// Scaling a blurred working image back up to full size: bilinear interpolation with 5-bit
// fractions, mixed with the source pixel wherever a working sample lies outside the blurred
// area.
#pragma once

#include <cstdint>

#include "frame/dispatch.h"

namespace pfx {

// Ratio of working to full size with 15 fraction bits.
constexpr int32_t working_scale(int32_t working, int32_t full) {
  return static_cast<int32_t>(int64_t{working} * 32768 / full);
}

// Where a full-size row or column falls in the working image: the first of the two working
// samples it is interpolated from, and the weight of the second in 32nds.
struct WorkingPos {
  int32_t index;
  int32_t frac;
};

// pos * scale stays below working * 32768 <= 2^26 for working sizes that can be composited.
constexpr WorkingPos working_pos(int32_t pos, int32_t scale, int32_t working) {
  const int32_t f = ((pos * scale) >> 10) & 65535;
  const int32_t i = f >> 5;
  return {i < working - 2 ? i : working - 2, f & 31};
}

// Bilinear value of one byte of the working image at (col, row); p00..p11 are the four samples.
constexpr int32_t bilinear(int32_t p00, int32_t p01, int32_t p10, int32_t p11, int32_t wx,
                           int32_t wy) {
  const int32_t top = p01 * wx + p00 * (32 - wx);
  const int32_t bottom = p11 * wx + p10 * (32 - wx);
  return (bottom * wy + top * (32 - wy)) >> 10;
}

// Upscaling a row by spans. The expanded bilinear sum p00 (32-wx)(32-wy) + p01 wx (32-wy) +
// p10 (32-wx) wy + p11 wx wy has no intermediate rounding, so it may be summed down the working
// columns first (once per row and working column) and across them second (once per pixel).
//
// One working column's contribution to a full-size row: the two samples the row lies between,
// each weighted by the row's fraction. A sample outside the blurred area adds its weight to
// `own` instead, to be filled with the pixel's own colour.
struct ColumnSum {
  int32_t r, g, b, own;
};

// The column sums of the row at py, for every working column; a null depth counts every
// sample as inside.
void column_sums(const uint8_t* blur, const uint8_t* depth, int32_t sw, WorkingPos py,
                 ColumnSum* sums);

// The full-size columns that lie between working columns j and j + 1 (where only the column
// fraction changes) run from span_start[j] to span_start[j + 1]; span_start holds sw entries.
void working_spans(int32_t width, int32_t sw, int32_t xscale, int32_t* span_start);

// Composites a blurred sw x sh working image into dst (which may be src). Pixels are
// recomputed when every_pixel is set or their mask byte is nonzero (mask may be null when
// every_pixel is set); the rest are copied. The caller has checked the arguments, including
// can_composite(sw, sh).
void composite(const uint32_t* src, const uint8_t* blur, const uint8_t* mask, const uint8_t* depth,
               uint32_t* dst, int32_t width, int32_t height, int32_t sw, int32_t sh,
               bool every_pixel);

}  // namespace pfx
