// Vintage: a faded, warm film look.
//
// The full look is a fixed chain of 22 passes: per-channel gamma and levels curves that crush
// the blacks, warm the reds and lift the blue shadows, a touch of brightness and contrast, and
// the vignette at the end. The first pass reads the source; every later one works in place on
// the destination; the partial variant takes the selected pixels of the full look. Every pass
// works pixel by pixel, so both are made in one pass over the pixels they write (VintageLook).
// The preview is a one-pass stand-in for small images: one S-shaped
// tone table, a green lift and a blue cut, and the table-based vignette weight.
#include <cstdint>

#include "adjust/channel_map.h"
#include "frame/frame.h"
#include "frame/pixel.h"
#include "looks/tone_curves.h"
#include "looks/vignette.h"
#include "looks/vintage.h"
#include "photofx.h"

namespace pfx {

// Where the full look runs as passes rather than one loop (see fx_apply_vintage).
#if defined(__x86_64__)
constexpr bool kVintageInPasses = true;
#else
constexpr bool kVintageInPasses = false;
#endif

// Only the vignette depends on the image.
VintageLook::VintageLook(int32_t width, int32_t height)
    : vignette_(width < 2 || height < 2 ? 2 : width, width < 2 || height < 2 ? 2 : height),
      flat_(width < 2 || height < 2) {}

}  // namespace pfx

extern "C" {

// The S-shaped tone curve of the preview: shadows pushed down, mid-tones and highlights lifted.
constinit const int32_t LUT_VINTAGE[256] = {
    0,   0,   0,   0,   0,   0,   1,   1,   1,   1,   2,   2,   2,   3,   3,   3,    //
    4,   4,   5,   5,   6,   6,   7,   7,   8,   8,   9,   9,   10,  11,  11,  12,   //
    13,  14,  14,  15,  16,  17,  18,  18,  19,  20,  21,  22,  23,  24,  25,  26,   //
    27,  28,  29,  30,  31,  32,  33,  34,  35,  36,  38,  39,  40,  41,  42,  44,   //
    45,  46,  47,  49,  50,  51,  53,  54,  55,  57,  58,  60,  61,  62,  64,  65,   //
    67,  68,  70,  72,  73,  75,  76,  78,  79,  81,  83,  84,  86,  88,  89,  91,   //
    93,  95,  96,  98,  100, 102, 104, 105, 107, 109, 111, 112, 114, 116, 118, 119,  //
    121, 123, 124, 126, 128, 129, 131, 133, 134, 136, 137, 139, 140, 142, 144, 145,  //
    147, 148, 150, 151, 153, 154, 156, 157, 159, 160, 162, 163, 164, 166, 167, 169,  //
    170, 171, 173, 174, 175, 177, 178, 179, 181, 182, 183, 185, 186, 187, 188, 190,  //
    191, 192, 193, 194, 196, 197, 198, 199, 200, 201, 202, 204, 205, 206, 207, 208,  //
    209, 210, 211, 212, 213, 214, 215, 216, 217, 218, 219, 220, 221, 222, 223, 223,  //
    224, 225, 226, 227, 228, 229, 229, 230, 231, 232, 233, 233, 234, 235, 235, 236,  //
    237, 238, 238, 239, 240, 240, 241, 241, 242, 243, 243, 244, 244, 245, 245, 246,  //
    246, 247, 247, 248, 248, 249, 249, 250, 250, 250, 251, 251, 251, 252, 252, 252,  //
    253, 253, 253, 253, 254, 254, 254, 254, 254, 255, 255, 255, 255, 255, 255, 255,  //
};

void fx_apply_vintage(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  if (src == nullptr || dst == nullptr) return;
  if (pfx::pixel_count(width, height) > pfx::kMaxPixels) return;
  if (pfx::kVintageInPasses) {
    // x86-64 vectorises brightness and the vignette and permutes the tables' bytes: four
    // passes, each of them vectorised, beat one of table reads a pixel.
    const auto table = [](const pfx::ChannelTables& t) {
      return pfx::ChannelMap([&](int32_t c) { return t.t[0][c]; },
                             [&](int32_t c) { return t.t[1][c]; },
                             [&](int32_t c) { return t.t[2][c]; });
    };
    const size_t n = static_cast<size_t>(pfx::pixel_count(width, height));
    pfx::map_channels(table(pfx::kVintageBefore), src, dst, n);
    fx_control_brightness_all(dst, dst, width, height, 12);
    pfx::map_channels(table(pfx::kVintageAfter), dst, dst, n);
    fx_apply_vignette(dst, dst, width, height);
    return;
  }
  const pfx::VintageLook look(width, height);
  if (pfx::pixel_count(width, height) > 0) {
    pfx::look_rows(src, nullptr, dst, look, {0, width - 1, 0, height - 1}, width);
  }
}

void fx_apply_vintage_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                              int32_t width, int32_t height, int32_t left, int32_t right,
                              int32_t top, int32_t bottom) {
  const pfx::Rect bounds{left, right, top, bottom};
  if (!pfx::partial_args_ok(src, mask, dst, width, height, bounds)) return;
  if (!pfx::is_region(bounds)) {
    fx_apply_vintage(src, dst, width, height);
    return;
  }
  const pfx::Rect r = pfx::clip_to_image(bounds, width, height);
  if (r.left > r.right || r.top > r.bottom) return;
  const pfx::VintageLook look(width, height);
  pfx::look_rows(src, mask, dst, look, r, width);
}

void fx_apply_vintage_prev(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  const pfx::PreviewVignette vignette(width, height);
  pfx::for_each_pixel_at(src, dst, width, height, [&](uint32_t p, int32_t x, int32_t y) {
    const int32_t weight = vignette.weight(x, y);
    const int32_t r = LUT_VINTAGE[pfx::red_of(p)];
    const int32_t g = pfx::clamp_to(LUT_VINTAGE[pfx::green_of(p)] + 8, 0, 255);
    const int32_t b = pfx::clamp_to(LUT_VINTAGE[pfx::blue_of(p)] - 44, 0, 255);
    return pfx::pack(p, (weight * r) >> 22, (weight * g) >> 22, (weight * b) >> 22);
  });
}

void applyVintage(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height) {
  fx_apply_vintage(src, dst, width, height);
}

void applyVintagePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                         int32_t height, int32_t left, int32_t right, int32_t top, int32_t bottom) {
  fx_apply_vintage_partial(src, mask, dst, width, height, left, right, top, bottom);
}

}  // extern "C"
