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
  int32_t operator[](int32_t v) const { return out_[v]; }

 private:
  int32_t out_[256];
};

// The three source rows around row y (above and below are read only when the pixel is blurred).
struct Rows {
  const uint32_t *above, *row, *below;
};

uint32_t glow_pixel(const Rows& rows, size_t x, bool blur, const ValueCurve& curve) {
  const uint32_t p = rows.row[x];
  int32_t r = red_of(p), g = green_of(p), b = blue_of(p);
  if (blur) {
    const uint32_t* line[3] = {rows.above, rows.row, rows.below};
    r <<= 4;
    g <<= 4;
    b <<= 4;
    for (int32_t k = 0; k < 8; ++k) {
      const uint32_t q = line[kRowOffset[k] + 1][static_cast<ptrdiff_t>(x) + kColumnOffset[k]];
      r += red_of(q) << kWeightShift[k];
      g += green_of(q) << kWeightShift[k];
      b += blue_of(q) << kWeightShift[k];
    }
    r /= 36;
    g /= 36;
    b /= 36;
  }
  const Hsv hsv = rgb_to_hsv(r, g, b);
  const Rgb c = hsv_to_rgb(hsv.h, hsv.s, curve[hsv.v]);
  return pack(p, c.r, c.g, c.b);
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

// Glows the pixels of rows top..bottom, columns left..right (already inside the image) for
// which selected(i) holds, reading the untouched source throughout.
template <class Selected>
void glow(SourceRows& source, uint32_t* dst, int32_t width, int32_t height, Rect r,
          const ValueCurve& curve, Selected&& selected) {
  const size_t w = static_cast<size_t>(width);
  for (int32_t y = r.top; y <= r.bottom; ++y) {
    const Rows rows = source.at(static_cast<size_t>(y), static_cast<size_t>(r.top));
    const bool row_inside = y >= 1 && y < height - 1;
    uint32_t* out = dst + static_cast<size_t>(y) * w;
    for (int32_t x = r.left; x <= r.right; ++x) {
      const size_t xs = static_cast<size_t>(x);
      if (!selected(static_cast<size_t>(y) * w + xs)) continue;
      out[xs] = glow_pixel(rows, xs, row_inside && x >= 1 && x < width - 1, curve);
    }
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
  pfx::glow(source, dst, width, height, {0, width - 1, 0, height - 1}, pfx::ValueCurve(level),
            [](size_t) { return true; });
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
    pfx::glow(source, dst, width, height, {0, width - 1, 0, height - 1}, curve,
              [](size_t) { return true; });
  } else {
    pfx::glow(source, dst, width, height, pfx::clip_to_image(bounds, width, height), curve,
              [mask](size_t i) { return mask[i] == 1; });
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
