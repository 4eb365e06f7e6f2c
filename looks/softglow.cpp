// Soft glow: a slight blur and a lift of the bright tones.
//
// Each pixel away from the image's edge is replaced by the 1 4 1 / 4 16 4 / 1 4 1 average of
// its 3 x 3 neighbourhood (edge pixels keep their colour); its HSV value is then pushed through
// a curve that brightens values above 128 and darkens those below, in proportion to the level
// (0..100), and the colour is converted back. Levels outside 0..100 are refused.
//
// The blur reads the source as it was before the call. When dst is the source buffer, the rows
// that are about to be overwritten are first saved in a two-row buffer, so the result is the
// same as with separate buffers.
#include <cstddef>
#include <cstdint>

#include "frame/dispatch.h"
#include "frame/divide.h"
#include "frame/frame.h"
#include "frame/hsv.h"
#include "frame/pixel.h"
#include "photofx.h"

namespace pfx {
namespace {

// Neighbour k: column offset, row offset and weight shift (corners x 1, edge neighbours x 4);
// the centre counts 16, so the weights sum to 36.
constexpr int32_t kColumnOffset[8] = {-1, 0, 1, -1, 1, -1, 0, 1};
constexpr int32_t kRowOffset[8] = {-1, -1, -1, 0, 0, 1, 1, 1};
constexpr int32_t kWeightShift[8] = {0, 2, 0, 2, 2, 0, 2, 0};

// V' = (level V^2 / 128 + (100 - level) V) / 100 for every value V, held to 0..255.
class ValueCurve {
 public:
  explicit ValueCurve(int32_t level) : out_{} {
    for (int32_t v = 0; v < 256; ++v) {
      out_[v] = clamp_byte(((level * v * v) / 128 + (100 - level) * v) / 100);
    }
  }
  const int32_t* table() const { return out_; }

 private:
  int32_t out_[256];
};

// The three source rows around row y (above and below are read only when the pixel is blurred).
struct Rows {
  const uint32_t *above, *row, *below;
};

// HSV value through the curve, and back; p supplies the alpha.
[[gnu::always_inline]] inline uint32_t glow_colour(uint32_t p, int32_t r, int32_t g, int32_t b,
                                                   const int32_t* curve) {
  const Hsv hsv = rgb_to_hsv(r, g, b);
  return pack(p, hsv_to_rgb(hsv.h, hsv.s, curve[hsv.v]));
}

// A pixel with all eight neighbours: the weighted average of its 3 x 3 neighbourhood, glowed.
[[gnu::always_inline]] inline uint32_t blurred_glow(const Rows& rows, size_t x,
                                                    const int32_t* curve) {
  const uint32_t p = rows.row[x];
  int32_t r = red_of(p) << 4, g = green_of(p) << 4, b = blue_of(p) << 4;
  for (int32_t k = 0; k < 8; ++k) {
    const uint32_t* line =
        kRowOffset[k] < 0 ? rows.above : (kRowOffset[k] > 0 ? rows.below : rows.row);
    const uint32_t q = line[static_cast<ptrdiff_t>(x) + kColumnOffset[k]];
    r += red_of(q) << kWeightShift[k];
    g += green_of(q) << kWeightShift[k];
    b += blue_of(q) << kWeightShift[k];
  }
  return glow_colour(p, div36(r), div36(g), div36(b), curve);
}

// Columns begin..end - 1 of a row whose pixels all have their eight neighbours: the loop that
// takes most of the time, kept free of edge tests so that it vectorises. With kMasked only the
// pixels whose mask byte is exactly 1 change; out holds the source copy elsewhere. out never
// overlaps the rows read (when dst is the source they are saved copies) nor the curve, which
// lets the curve's reads become vector gathers.
template <bool kMasked>
void glow_interior_loop(Rows rows, uint32_t* __restrict out, const uint8_t* mask, size_t begin,
                        size_t end, const int32_t* __restrict curve) {
  PFX_NO_ALIAS_LOOP
  for (size_t x = begin; x < end; ++x) {
    const uint32_t q = blurred_glow(rows, x, curve);
    if constexpr (kMasked) {
      out[x] = mask[x] == 1 ? q : out[x];
    } else {
      out[x] = q;
    }
  }
}

template <bool kMasked>
void glow_interior(Rows rows, uint32_t* out, const uint8_t* mask, size_t begin, size_t end,
                   const int32_t* curve) {
  wide_vector_paths([&] { glow_interior_loop<kMasked>(rows, out, mask, begin, end, curve); });
}

// Source rows as they were before the call. With separate buffers they are read from src
// itself; when dst is src and the image has interior pixels to blur, each row is saved before
// it is overwritten and kept while the row below it is made.
class SourceRows {
 public:
  SourceRows(const uint32_t* src, const uint32_t* dst, int32_t width, int32_t height)
      : src_(src), width_(static_cast<size_t>(width)), height_(static_cast<size_t>(height)) {
    if (src == dst && width >= 3 && height >= 3) {
      saved_ = static_cast<uint32_t*>(fx_malloc(static_cast<uint32_t>(2 * width_), 4));
      failed_ = saved_ == nullptr;
    }
  }
  ~SourceRows() { fx_free(saved_); }
  SourceRows(const SourceRows&) = delete;
  SourceRows& operator=(const SourceRows&) = delete;

  bool failed() const { return failed_; }

  // Rows must be asked for in order y0, y0 + 1, ... and each before it is written.
  // (The first and last rows have no row above or below; they are never blurred.)
  Rows at(size_t y, size_t first_row) {
    const uint32_t* line = src_ + y * width_;
    const uint32_t* below = y + 1 < height_ ? line + width_ : nullptr;
    if (saved_ == nullptr) return {y > 0 ? line - width_ : nullptr, line, below};
    uint32_t* above = saved_ + ((y & 1) ^ 1) * width_;
    uint32_t* row = saved_ + (y & 1) * width_;
    if (y == first_row && y > 0) fx_memcpy(above, line - width_, bytes());
    fx_memcpy(row, line, bytes());
    return {above, row, below};
  }

 private:
  uint32_t bytes() const { return static_cast<uint32_t>(width_ * 4); }

  const uint32_t* src_;
  size_t width_, height_;
  uint32_t* saved_ = nullptr;
  bool failed_ = false;
};

bool level_ok(int32_t level) { return level >= 0 && level <= 100; }

// Glows the pixels of rows top..bottom, columns left..right (already inside the image), all of
// them or, given a mask, those whose mask byte is exactly 1, reading the untouched source
// throughout. Pixels on the image's edge are not blurred.
void glow(SourceRows& source, uint32_t* dst, const uint8_t* mask, int32_t width, int32_t height,
          Rect r, const ValueCurve& curve) {
  if (r.left > r.right) return;
  const size_t w = static_cast<size_t>(width);
  const int32_t* table = curve.table();
  for (int32_t y = r.top; y <= r.bottom; ++y) {
    const Rows rows = source.at(static_cast<size_t>(y), static_cast<size_t>(r.top));
    uint32_t* out = dst + static_cast<size_t>(y) * w;
    const uint8_t* row_mask = mask != nullptr ? mask + static_cast<size_t>(y) * w : nullptr;
    auto edge = [&](int32_t x) {
      const size_t xs = static_cast<size_t>(x);
      if (row_mask != nullptr && row_mask[xs] != 1) return;
      const uint32_t p = rows.row[xs];
      out[xs] = glow_colour(p, red_of(p), green_of(p), blue_of(p), table);
    };
    if (y < 1 || y >= height - 1) {
      for (int32_t x = r.left; x <= r.right; ++x) edge(x);
      continue;
    }
    // Interior columns 1 .. width - 2 of this row, within the rectangle.
    const int32_t first = r.left > 1 ? r.left : 1;
    const int32_t last = r.right < width - 2 ? r.right : width - 2;
    if (r.left == 0) edge(0);
    if (first <= last) {
      const size_t b = static_cast<size_t>(first), e = static_cast<size_t>(last) + 1;
      if (row_mask != nullptr) {
        glow_interior<true>(rows, out, row_mask, b, e, table);
      } else {
        glow_interior<false>(rows, out, nullptr, b, e, table);
      }
    }
    if (r.right == width - 1 && width > 1) edge(width - 1);
  }
}

}  // namespace
}  // namespace pfx

extern "C" {

int32_t fx_softglow(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                    int32_t level) {
  if (!pfx::level_ok(level) || src == nullptr || dst == nullptr) return PHOTOFX_INVALID_ARGUMENT;
  const int64_t n = pfx::pixel_count(width, height);
  if (n > pfx::kMaxPixels) return PHOTOFX_INVALID_ARGUMENT;
  if (n == 0) return PHOTOFX_SUCCESS;
  pfx::SourceRows source(src, dst, width, height);
  if (source.failed()) return PHOTOFX_OUT_OF_MEMORY;
  pfx::glow(source, dst, nullptr, width, height, {0, width - 1, 0, height - 1},
            pfx::ValueCurve(level));
  return PHOTOFX_SUCCESS;
}

int32_t fx_softglow_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                            int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                            int32_t bottom) {
  const pfx::Rect bounds{left, right, top, bottom};
  if (!pfx::level_ok(level) || !pfx::partial_args_ok(src, mask, dst, width, height, bounds)) {
    return PHOTOFX_INVALID_ARGUMENT;
  }
  const int64_t n = pfx::pixel_count(width, height);
  if (n == 0) return PHOTOFX_SUCCESS;
  pfx::SourceRows source(src, dst, width, height);
  if (source.failed()) return PHOTOFX_OUT_OF_MEMORY;
  pfx::copy_image(src, dst, n);
  const pfx::ValueCurve curve(level);
  if (!pfx::is_region(bounds)) {
    pfx::glow(source, dst, nullptr, width, height, {0, width - 1, 0, height - 1}, curve);
  } else {
    pfx::glow(source, dst, mask, width, height, pfx::clip_to_image(bounds, width, height), curve);
  }
  return PHOTOFX_SUCCESS;
}

void applySoftglow(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                   int32_t level) {
  fx_softglow(src, dst, width, height, level);
}

void applySoftglowPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                          int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                          int32_t bottom) {
  fx_softglow_partial(src, mask, dst, width, height, level, left, right, top, bottom);
}

}  // extern "C"
