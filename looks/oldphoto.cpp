// Old photo: two looks of a faded print.
//
// The plain look tints each pixel with the sepia curves, flattens its contrast toward mid-grey
// by twice LUT_OLDPHOTO (so every channel ends in 26..229) and darkens the borders with the
// table-based vignette. Its partial variant shows the look wherever the mask byte is 1, over the
// whole image: valid bounds only switch the mask on.
//
// The textured look repaints the image in one warm hue with the colour-tone adjustment and mixes
// a caller's texture image in at one quarter. Its partial variant writes only the selected
// pixels inside the bounds and leaves every other destination pixel as the caller left it.
#include <cstddef>
#include <cstdint>

#include "frame/frame.h"
#include "frame/pixel.h"
#include "frame/table.h"
#include "looks/greyscale_sepia.h"
#include "looks/oldphoto.h"
#include "looks/vignette.h"
#include "photofx.h"

extern "C" {

constinit const int32_t LUT_OLDPHOTO[256] = {PFX_TABLE_256(pfx::oldphoto_entry, 0)};

}  // extern "C"

namespace pfx {
namespace {

uint32_t oldphoto_pixel(uint32_t p, uint32_t w) {
  const auto& t = kOldPhotoCurves.t;
  const int32_t weight = static_cast<int32_t>(w);
  return pack(p, (weight * t[0][red_of(p)]) >> 22, (weight * t[1][green_of(p)]) >> 22,
              (weight * t[2][blue_of(p)]) >> 22);
}

// Hue of the textured look's tone, in degrees.
constexpr int32_t kTextureHue = 14;

// The textured look of one pixel. Colour tone paints a pixel from its value (largest channel)
// alone, so the colour of each value is had once per call by toning a grey ramp, and each pixel
// then reads only its own source and texture words: dst may be the source or the texture.
class TexturedLook {
 public:
  TexturedLook() : tone_{} {
    uint32_t ramp[256];
    for (uint32_t v = 0; v < 256; ++v) ramp[v] = 0xFF000000u | v * 0x010101u;
    fx_change_colortone(ramp, tone_, 256, 1, kTextureHue);
  }

  // Three quarters toned pixel and one quarter texture, rounded down, alpha of the toned pixel.
  // A fully transparent pixel is not blended: it keeps its toned colour (and alpha 0), so
  // nothing of the texture leaks into a word the host will not show.
  uint32_t operator()(uint32_t p, uint32_t texture) const {
    const uint32_t rg = (p >> 16 & 0xFFu) > (p >> 8 & 0xFFu) ? p >> 16 & 0xFFu : p >> 8 & 0xFFu;
    const uint32_t v = rg > (p & 0xFFu) ? rg : p & 0xFFu;
    const uint32_t toned = alpha_bits(p) | (tone_[v] & 0x00FFFFFFu);
    if (alpha_bits(p) == 0) return toned;
    return pack(toned, (3 * red_of(toned) + red_of(texture)) >> 2,
                (3 * green_of(toned) + green_of(texture)) >> 2,
                (3 * blue_of(toned) + blue_of(texture)) >> 2);
  }

 private:
  uint32_t tone_[256];
};

}  // namespace
}  // namespace pfx

extern "C" {

void fx_apply_oldphoto(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_oldphoto_partial(src, nullptr, dst, width, height, 1, 0, 0, 0);
}

// Every pixel is decided from its own source word before its destination word is written, so
// the result is the same whether or not dst is the source.
void fx_apply_oldphoto_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                               int32_t width, int32_t height, int32_t left, int32_t right,
                               int32_t top, int32_t bottom) {
  const pfx::Rect bounds{left, right, top, bottom};
  if (!pfx::partial_args_ok(src, mask, dst, width, height, bounds)) return;
  const pfx::PreviewVignette vignette(width, height);
  pfx::for_each_pixel_weighted(src, pfx::is_region(bounds) ? mask : nullptr, dst, width, height,
                               vignette, pfx::oldphoto_pixel,
                               [&](const pfx::Run& run, int32_t x0, uint32_t base) {
                                 return pfx::neon::oldphoto(run, vignette, x0, base);
                               });
}

void fx_apply_oldphoto_texture(const uint32_t* src, uint32_t* dst, const uint32_t* texture,
                               int32_t width, int32_t height) {
  if (src == nullptr || dst == nullptr || texture == nullptr) return;
  const int64_t n = pfx::pixel_count(width, height);
  if (n == 0 || n > pfx::kMaxPixels) return;
  const pfx::TexturedLook look;
  for (size_t i = 0; i < static_cast<size_t>(n); ++i) dst[i] = look(src[i], texture[i]);
}

// Each selected pixel is made straight from its source and texture words, so no scratch image
// is needed and pixels outside the selection are never touched.
void fx_apply_oldphoto_texture_partial(const uint32_t* src, uint32_t* dst, const uint32_t* texture,
                                       const uint8_t* mask, int32_t width, int32_t height,
                                       int32_t left, int32_t right, int32_t top, int32_t bottom) {
  const pfx::Rect bounds{left, right, top, bottom};
  if (texture == nullptr || !pfx::partial_args_ok(src, mask, dst, width, height, bounds)) return;
  if (!pfx::is_region(bounds)) {
    fx_apply_oldphoto_texture(src, dst, texture, width, height);
    return;
  }
  const pfx::TexturedLook look;
  pfx::for_each_selected(mask, width, height, bounds,
                         [&](size_t i) { dst[i] = look(src[i], texture[i]); });
}

void applyOldPhoto(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_oldphoto(src, dst, width, height);
}

void applyOldPhotoPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                          int32_t height, int32_t left, int32_t right, int32_t top,
                          int32_t bottom) {
  fx_apply_oldphoto_partial(src, mask, dst, width, height, left, right, top, bottom);
}

}  // extern "C"
