// The effects the suite times: one entry per public effect, in the order the report lists them.
//
// Adding an effect is one entry. The common shapes need no code of their own, e.g.
//
//   {.name = "soft-glow", .goal = kHsvGoal, .peer = Peer::kHsv,
//    .full = full<applySoftglow, 60>, .partial = partial<applySoftglowPartial, 60>},
//
// full<F, levels...> calls F(src, dst, width, height, levels...) (levels may be doubles, as for
// control_gamma); partial<F, levels...> calls F(src, mask, dst, width, height, levels..., left,
// right, top, bottom), with the ellipse's box as bounds. Any other shape is a small function over
// the Frame: see the blur, the textured old photo, the warps and the brushes below.
//
// Pick levels that change the image: the suite refuses a call that leaves its output equal to the
// photograph (a refused argument would otherwise time as a fast no-op); set .changes = false only
// where the picture may legitimately come back unchanged. `goal` is the goal for the
// effect's kind (suite.h), `peer` the OpenCV work nearest to it.
#include <cmath>
#include <cstdint>

#include "bench/suite.h"
#include "photofx.h"

namespace fxbench {
namespace {

// ---- Brushes: a stroke the size a finger makes on a phone showing the whole photograph -------

int32_t brush_radius(const Frame& f) { return (f.width > f.height ? f.width : f.height) / 20; }
int32_t eye_radius(const Frame& f) { return (f.width > f.height ? f.width : f.height) / 100; }

// Pixels of a brush's bounding square, which is what a brush call visits.
int64_t square(int32_t radius) { return (2 * int64_t{radius} + 1) * (2 * int64_t{radius} + 1); }
int64_t brush_area(const Frame& f) { return square(brush_radius(f)); }
int64_t eye_area(const Frame& f) { return square(eye_radius(f)); }

// ---- Blur and tilt-shift -------------------------------------------------------------------

// The frame's bounds choose the mode: whole image for full runs, the ellipse for partial ones.
void init_blur(const Frame& f) {
  fx_Init_blur(f.src, f.mask, f.width, f.height, f.left, f.right, f.top, f.bottom);
}

// A workspace whose blurred copy holds a real blur, for the compositing kernels.
void init_blurred(const Frame& f) {
  init_blur(f);
  fx_make_blur_preview(f.src, f.mask, f.dst, f.width, f.height, 4);
}

void blur_preview(const Frame& f) {
  fx_make_blur_preview(f.src, f.mask, f.dst, f.width, f.height, 8);
}

// The working-image kernels write their bytes into the destination buffer, which is larger.
uint8_t* out_bytes(const Frame& f) { return reinterpret_cast<uint8_t*>(f.dst); }

void gaussian_working(const Frame& f) {
  make_gaussian_blur(g_ssrc, out_bytes(f), g_tempd, g_scaled_wd, g_scaled_ht, 8);
}

void lens_working(const Frame& f) {
  make_lens_blur(g_ssrc, out_bytes(f), g_tempd, g_scaled_wd, g_scaled_ht, 8);
}

void blur_composite(const Frame& f) {
  run_blur(f.src, g_sblur, f.mask, g_tempd, f.dst, f.width, f.height, g_scaled_wd, g_scaled_ht);
}

// The tilt-shift band: a quarter of the height, a little above the middle.
int32_t band_centre(const Frame& f) { return f.height * 9 / 20; }
int32_t band_half(const Frame& f) { return f.height / 8; }

void tilt_init(const Frame& f) { initTiltShift(f.src, f.width, f.height); }

void tilt_preview(const Frame& f) {
  makeTiltShift(f.src, f.dst, f.width, f.height, band_centre(f), band_half(f));
}

void tilt_oneshot(const Frame& f) {
  applyTiltShift(f.src, f.dst, f.width, f.height, band_centre(f), band_half(f));
}

void tilt_gaussian_working(const Frame& f) {
  make_tiltshift(g_ssrc, out_bytes(f), g_scaled_wd, g_scaled_ht);
}

void tilt_lens_working(const Frame& f) {
  const int32_t centre = band_centre(f) * g_scaled_ht / f.height;
  const int32_t half = band_half(f) * g_scaled_ht / f.height;
  make_tiltshift_lens(g_ssrc, out_bytes(f), g_scaled_wd, g_scaled_ht, centre, half);
}

void tilt_composite(const Frame& f) {
  restore_tiltshift(f.src, g_sblur, f.dst, f.width, f.height, g_scaled_wd, g_scaled_ht,
                    band_centre(f), band_half(f));
}

// ---- Brushes, in place around the middle of the picture ---------------------------------------

void lighten(const Frame& f) {
  rubLighten(f.dst, f.width / 2, f.height / 2, f.width, f.height, 64, brush_radius(f));
}

void darken(const Frame& f) {
  rubDarken(f.dst, f.width / 2, f.height / 2, f.width, f.height, 64, brush_radius(f));
}

void pixelize_brush(const Frame& f) {
  rubPixelize(f.dst, f.width, f.height, 4, f.width / 2, f.height / 2, brush_radius(f));
}

void red_eye(const Frame& f) {
  removeRedeye(f.dst, f.width, f.height, f.width / 3, f.height / 3, eye_radius(f));
}

// ---- The textured old photo, with the photograph as its own texture ---------------------------

void old_photo_texture(const Frame& f) {
  fx_apply_oldphoto_texture(f.src, f.dst, f.src, f.width, f.height);
}

void old_photo_texture_partial(const Frame& f) {
  fx_apply_oldphoto_texture_partial(f.src, f.dst, f.src, f.mask, f.width, f.height, f.left, f.right,
                                    f.top, f.bottom);
}

// ---- Warps over the whole picture --------------------------------------------------------

// Half the diagonal: a circle this wide around the centre reaches every corner.
int32_t half_diagonal(const Frame& f) {
  return static_cast<int32_t>(std::ceil(std::hypot(f.width, f.height) / 2));
}

void twirl(const Frame& f, uint32_t fast) {
  runTwirl(f.src, f.dst, f.width, f.height, f.width / 2, f.height / 2, half_diagonal(f), 90, 0,
           f.width - 1, 0, f.height - 1, fast);
}

// The sphericity's circle is about 1.4 times its radius.
void sphericity(const Frame& f, uint32_t fast) {
  runSphericity(f.src, f.dst, f.width, f.height, f.width / 2, f.height / 2,
                half_diagonal(f) * 5 / 7 + 1, 50, 0, f.width - 1, 0, f.height - 1, fast);
}

// Mirrors about the middle, so that the output has the source's size and fits dst.
void mirror(const Frame& f, int32_t mode, int32_t axis) {
  const int32_t pos = (axis == MIRROR_HORIZONTAL ? f.width : f.height) / 2 - 1;
  const int32_t w = getMirrorOutwidth(f.width, pos, mode, axis);
  const int32_t h = getMirrorOutheight(f.height, pos, mode, axis);
  if (w == f.width && h == f.height) runMirror(f.src, w, h, f.dst, w, h, pos, mode, axis);
}

// clang-format off
constexpr Effect kEffects[] = {
    // ---- Point operations ------------------------------------------------------------------
    {.name = "invert", .goal = kPointGoal, .peer = Peer::kBitwiseNot,
     .full = full<applyInvert>, .partial = partial<applyInvertPartial>},
    {.name = "brightness", .goal = kPointGoal, .peer = Peer::kTransform,
     .full = full<controlBrightness, 14>, .partial = partial<controlBrightnessPartial, 14>},
    {.name = "contrast", .goal = kPointGoal, .peer = Peer::kLut,
     .full = full<controlContrast, 14>, .partial = partial<controlContrastPartial, 14>},
    {.name = "saturation", .goal = kPointGoal, .peer = Peer::kTransform,
     .full = full<controlSaturation, 14>, .partial = partial<controlSaturationPartial, 14>},
    {.name = "temperature", .goal = kPointGoal, .peer = Peer::kTransform,
     .full = full<controlTemperature, 14>, .partial = partial<controlTemperaturePartial, 14>},
    {.name = "exposure", .goal = kPointGoal, .peer = Peer::kLut,
     .full = full<controlExposure, 14>, .partial = partial<controlExposurePartial, 14>},
    {.name = "faded-colour", .goal = kPointGoal, .peer = Peer::kLut,
     .full = full<controlFadedColour, 50>, .partial = partial<controlFadedColourPartial, 50>},
    {.name = "channel-gains", .goal = kPointGoal, .peer = Peer::kLut,
     .full = full<controlAdjustRGB, 14, 12, 8>, .partial = partial<AdjustRGB, 14, 12, 8>},
    {.name = "greyscale", .goal = kPointGoal, .peer = Peer::kTransform,
     .full = full<controlGreyscale, 12>, .partial = partial<controlGreyscalePartial, 12>},
    {.name = "sepia", .goal = kPointGoal, .peer = Peer::kLut,
     .full = full<fx_apply_sepia>, .partial = partial<fx_apply_sepia_partial>},
    {.name = "gamma", .goal = kPointGoal, .peer = Peer::kLut, .full = full<control_gamma, 0, 0.77>},
    {.name = "levels-input", .goal = kPointGoal, .peer = Peer::kLut,
     .full = full<changeHistogramByInput, 0, 28, 255>},
    {.name = "levels-output", .goal = kPointGoal, .peer = Peer::kLut,
     .full = full<changeHistogramByOutput, 0, 45, 255>},

    // ---- HSV-based effects -----------------------------------------------------------------
    {.name = "hue", .goal = kHsvGoal, .peer = Peer::kHsv,
     .full = full<controlHue, 14>, .partial = partial<controlHuePartial, 14>},
    {.name = "colour-tone", .goal = kHsvGoal, .peer = Peer::kHsv,
     .full = full<fx_change_colortone, 30>},
    {.name = "pop-art-preview", .goal = kHsvGoal, .peer = Peer::kHsv,
     .full = full<fx_apply_popart_prev>},
    {.name = "soft-glow", .goal = kHsvGoal, .peer = Peer::kHsv,
     .full = full<applySoftglow, 60>, .partial = partial<applySoftglowPartial, 60>},

    // ---- Film looks ------------------------------------------------------------------------
    {.name = "vignette", .full = full<fx_apply_vignette>},
    {.name = "vignette-preview", .full = full<fx_apply_vignette_prev>},
    {.name = "vintage", .full = full<applyVintage>, .partial = partial<applyVintagePartial>},
    {.name = "vintage-preview", .full = full<fx_apply_vintage_prev>},
    {.name = "old-photo", .full = full<applyOldPhoto>, .partial = partial<applyOldPhotoPartial>},
    {.name = "old-photo-texture", .full = old_photo_texture,
     .partial = old_photo_texture_partial},
    {.name = "pop-art", .full = full<applyPopArt>},

    // ---- Preset looks (downlight runs auto adjust inside: no chain goal) and auto adjust ---
    {.name = "retro", .goal = kPresetGoal, .full = full<applyRetro>,
     .partial = partial<applyRetroPartial>},
    {.name = "sunshine", .goal = kPresetGoal, .full = full<applySunshine>,
     .partial = partial<applySunshinePartial>},
    {.name = "bluewash", .goal = kPresetGoal, .full = full<applyBluewash>,
     .partial = partial<applyBluewashPartial>},
    {.name = "nostalgia", .goal = kPresetGoal, .full = full<applyNostalgia>,
     .partial = partial<applyNostalgiaPartial>},
    {.name = "yellowglow", .goal = kPresetGoal, .full = full<applyYellowglow>,
     .partial = partial<applyYellowglowPartial>},
    {.name = "downlight", .full = full<applyDownlight>, .partial = partial<applyDownlightPartial>},
    {.name = "auto-adjust", .goal = kAutoGoal, .full = full<applyAutoAdjust>},

    // ---- Neighbourhood effects -------------------------------------------------------------
    {.name = "sharpen", .full = full<fx_apply_sharpen_all>, .partial = partial<applySharpen, 0>},
    {.name = "pixelize", .full = full<applyPixelize, 4>},

    // ---- Depth-of-field blur: the preview a slider runs, its parts, the one-shot call ------
    {.name = "blur-preview", .goal = kBlurPreviewGoal, .full = blur_preview,
     .partial = blur_preview, .setup = init_blur, .teardown = fx_destroy_blur},
    {.name = "blur-init", .full = init_blur, .partial = init_blur, .teardown = fx_destroy_blur,
     .changes = false},
    {.name = "blur-gaussian-working", .goal = kBlurKernelGoal, .peer = Peer::kGaussian,
     .full = gaussian_working, .partial = gaussian_working, .setup = init_blur,
     .teardown = fx_destroy_blur, .items = working_samples},
    {.name = "blur-composite", .peer = Peer::kResize, .full = blur_composite,
     .partial = blur_composite, .setup = init_blurred, .teardown = fx_destroy_blur},
    {.name = "blur-lens-working", .full = lens_working, .setup = init_blur,
     .teardown = fx_destroy_blur, .items = working_samples},
    {.name = "blur", .full = partial<applyBlur, 8>, .partial = partial<applyBlur, 8>},

    // ---- Tilt-shift ------------------------------------------------------------------------
    {.name = "tilt-shift-preview", .full = tilt_preview, .setup = tilt_init,
     .teardown = destroyTiltShift},
    {.name = "tilt-shift-init", .full = tilt_init, .teardown = destroyTiltShift,
     .changes = false},
    {.name = "tilt-shift-gaussian-working", .peer = Peer::kGaussian,
     .full = tilt_gaussian_working, .setup = init_blur, .teardown = fx_destroy_blur,
     .items = working_samples},
    {.name = "tilt-shift-lens-working", .full = tilt_lens_working, .setup = init_blur,
     .teardown = fx_destroy_blur, .items = working_samples},
    {.name = "tilt-shift-composite", .peer = Peer::kResize, .full = tilt_composite,
     .setup = init_blurred, .teardown = fx_destroy_blur},
    {.name = "tilt-shift", .full = tilt_oneshot},

    // ---- Warps ---------------------------------------------------------------------------------
    {.name = "twirl", .goal = kWarpGoal, .peer = Peer::kRemap,
     .full = [](const Frame& f) { twirl(f, 0); }},
    {.name = "twirl-fast", .peer = Peer::kRemap, .full = [](const Frame& f) { twirl(f, 1); }},
    {.name = "sphericity", .goal = kWarpGoal, .peer = Peer::kRemap,
     .full = [](const Frame& f) { sphericity(f, 0); }},
    {.name = "sphericity-fast", .peer = Peer::kRemap,
     .full = [](const Frame& f) { sphericity(f, 1); }},
    {.name = "mirror-horizontal",
     .full = [](const Frame& f) { mirror(f, MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL); }},
    {.name = "mirror-vertical",
     .full = [](const Frame& f) { mirror(f, MIRROR_KEEP_TOP, MIRROR_VERTICAL); }},

    // ---- Brushes: one stroke each ----------------------------------------------------------
    {.name = "lighten-brush", .full = lighten, .items = brush_area, .in_place = true},
    {.name = "darken-brush", .full = darken, .items = brush_area, .in_place = true},
    {.name = "pixelize-brush", .full = pixelize_brush, .items = brush_area, .in_place = true},
    // Whether the photograph has red enough to change under the eye is up to the photograph.
    {.name = "red-eye-brush", .full = red_eye, .items = eye_area, .in_place = true,
     .changes = false},
};
// clang-format on

}  // namespace

std::span<const Effect> effects() { return kEffects; }

int64_t working_samples(const Frame&) { return int64_t{g_scaled_wd} * g_scaled_ht; }

}  // namespace fxbench
