// The effects the suite times: one entry per public effect, in the order the report lists them.
//
// Adding an effect is one entry. An export of the catalogue (catalog/exports.h) runs through its
// row, at the row's typical levels, e.g.
//
//   {.name = "soft-glow", .goal = kHsvGoal, .peer = Peer::kHsv,
//    .full = row<at("applySoftglow")>, .partial = row<at("applySoftglowPartial")>},
//
// with empty bounds for the full run and the ellipse's box for the partial one, a brush stroke
// around the middle of the picture, the tilt-shift band a little above it. Work on the blur's
// working images and other placements are small functions over the Frame below.
//
// The typical levels change the image: the suite refuses a call that leaves its output equal to
// the photograph (a refused argument would otherwise time as a fast no-op); set .changes = false
// only where the picture may legitimately come back unchanged. `goal` is the goal for the
// effect's kind (suite.h), `peer` the OpenCV work nearest to it.
#include <cmath>
#include <cstdint>
#include <string_view>

#include "bench/suite.h"
#include "catalog/exports.h"
#include "photofx.h"

namespace fxbench {
namespace {

namespace cat = pfx::catalog;

consteval size_t at(std::string_view name) { return cat::index_of(name); }

int32_t brush_radius(const Frame& f);
int32_t band_centre(const Frame& f);
int32_t band_half(const Frame& f);

// The frame as the arguments of a catalogue row, at the row's typical levels.
cat::Args args_of(const cat::Export& e, const Frame& f) {
  cat::Args a;
  a.src = f.src, a.dst = f.dst, a.mask = f.mask, a.texture = f.src;
  a.width = f.width, a.height = f.height;
  if (!e.reps.empty()) {
    for (int i = 0; i < 4; ++i) a.level[i] = e.reps[0].v[i];
    a.real = e.reps[0].real;
  }
  a.bounds = {f.left, f.right, f.top, f.bottom};
  a.cx = f.width / 2, a.cy = f.height / 2, a.radius = brush_radius(f);
  a.centre = band_centre(f), a.half_height = band_half(f);
  return a;
}

template <size_t Row>
void row(const Frame& f) {
  const cat::Export& e = cat::kExports[Row];
  e.call(args_of(e, f));
}

// ---- Brushes: a stroke the size a finger makes on a phone showing the whole photograph -------

int32_t brush_radius(const Frame& f) { return (f.width > f.height ? f.width : f.height) / 20; }
int32_t eye_radius(const Frame& f) { return (f.width > f.height ? f.width : f.height) / 100; }

// Pixels of a brush's bounding square, which is what a brush call visits.
int64_t square(int32_t radius) { return (2 * int64_t{radius} + 1) * (2 * int64_t{radius} + 1); }
int64_t brush_area(const Frame& f) { return square(brush_radius(f)); }
int64_t eye_area(const Frame& f) { return square(eye_radius(f)); }

// ---- Blur and tilt-shift -------------------------------------------------------------------

// The frame's bounds choose the mode: whole image for full runs, the ellipse for partial ones.
void init_blur(const Frame& f) { row<at("fx_Init_blur")>(f); }

// A workspace whose blurred copy holds a real blur, for the compositing kernels.
void init_blurred(const Frame& f) {
  init_blur(f);
  fx_make_blur_preview(f.src, f.mask, f.dst, f.width, f.height, 4);
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

void tilt_init(const Frame& f) { row<at("initTiltShift")>(f); }

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

// ---- The red-eye brush, in place a third of the way in ------------------------------------------

void red_eye(const Frame& f) {
  const cat::Export& e = cat::kExports[at("removeRedeye")];
  cat::Args a = args_of(e, f);
  a.cx = f.width / 3, a.cy = f.height / 3, a.radius = eye_radius(f);
  e.call(a);
}

// ---- Warps over the whole picture --------------------------------------------------------

// Half the diagonal: a circle this wide around the centre reaches every corner.
int32_t half_diagonal(const Frame& f) {
  return static_cast<int32_t>(std::ceil(std::hypot(f.width, f.height) / 2));
}

// A circle warp around the middle, over the whole picture.
void warp(const cat::Export& e, const Frame& f, int32_t radius, uint32_t fast) {
  cat::Args a = args_of(e, f);
  a.radius = radius, a.fast = fast, a.bounds = {0, f.width - 1, 0, f.height - 1};
  e.call(a);
}

void twirl(const Frame& f, uint32_t fast) {
  warp(cat::kExports[at("runTwirl")], f, half_diagonal(f), fast);
}

// The sphericity's circle is about 1.4 times its radius.
void sphericity(const Frame& f, uint32_t fast) {
  warp(cat::kExports[at("runSphericity")], f, half_diagonal(f) * 5 / 7 + 1, fast);
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
     .full = row<at("applyInvert")>, .partial = row<at("applyInvertPartial")>},
    {.name = "brightness", .goal = kPointGoal, .peer = Peer::kTransform,
     .full = row<at("controlBrightness")>, .partial = row<at("controlBrightnessPartial")>},
    {.name = "contrast", .goal = kPointGoal, .peer = Peer::kLut,
     .full = row<at("controlContrast")>, .partial = row<at("controlContrastPartial")>},
    {.name = "saturation", .goal = kPointGoal, .peer = Peer::kTransform,
     .full = row<at("controlSaturation")>, .partial = row<at("controlSaturationPartial")>},
    {.name = "temperature", .goal = kPointGoal, .peer = Peer::kTransform,
     .full = row<at("controlTemperature")>, .partial = row<at("controlTemperaturePartial")>},
    {.name = "exposure", .goal = kPointGoal, .peer = Peer::kLut,
     .full = row<at("controlExposure")>, .partial = row<at("controlExposurePartial")>},
    {.name = "faded-colour", .goal = kPointGoal, .peer = Peer::kLut,
     .full = row<at("controlFadedColour")>, .partial = row<at("controlFadedColourPartial")>},
    {.name = "channel-gains", .goal = kPointGoal, .peer = Peer::kLut,
     .full = row<at("controlAdjustRGB")>, .partial = row<at("AdjustRGB")>},
    {.name = "greyscale", .goal = kPointGoal, .peer = Peer::kTransform,
     .full = row<at("controlGreyscale")>, .partial = row<at("controlGreyscalePartial")>},
    {.name = "sepia", .goal = kPointGoal, .peer = Peer::kLut,
     .full = row<at("fx_apply_sepia")>, .partial = row<at("fx_apply_sepia_partial")>},
    {.name = "gamma", .goal = kPointGoal, .peer = Peer::kLut, .full = row<at("control_gamma")>},
    {.name = "levels-input", .goal = kPointGoal, .peer = Peer::kLut,
     .full = row<at("changeHistogramByInput")>},
    {.name = "levels-output", .goal = kPointGoal, .peer = Peer::kLut,
     .full = row<at("changeHistogramByOutput")>},

    // ---- HSV-based effects -----------------------------------------------------------------
    {.name = "hue", .goal = kHsvGoal, .peer = Peer::kHsv,
     .full = row<at("controlHue")>, .partial = row<at("controlHuePartial")>},
    {.name = "colour-tone", .goal = kHsvGoal, .peer = Peer::kHsv,
     .full = row<at("fx_change_colortone")>},
    {.name = "pop-art-preview", .goal = kHsvGoal, .peer = Peer::kHsv,
     .full = row<at("fx_apply_popart_prev")>},
    {.name = "soft-glow", .goal = kHsvGoal, .peer = Peer::kHsv,
     .full = row<at("applySoftglow")>, .partial = row<at("applySoftglowPartial")>},

    // ---- Film looks ------------------------------------------------------------------------
    {.name = "vignette", .goal = kVignetteGoal, .full = row<at("fx_apply_vignette")>},
    {.name = "vignette-preview", .full = row<at("fx_apply_vignette_prev")>},
    {.name = "vintage", .goal = kVintageGoal, .full = row<at("applyVintage")>, .partial = row<at("applyVintagePartial")>},
    {.name = "vintage-preview", .full = row<at("fx_apply_vintage_prev")>},
    {.name = "old-photo", .goal = kOldPhotoGoal, .full = row<at("applyOldPhoto")>, .partial = row<at("applyOldPhotoPartial")>},
    {.name = "old-photo-texture", .full = row<at("fx_apply_oldphoto_texture")>,
     .partial = row<at("fx_apply_oldphoto_texture_partial")>},
    {.name = "pop-art", .full = row<at("applyPopArt")>},

    // ---- Preset looks (downlight runs auto adjust inside: no chain goal) and auto adjust ---
    {.name = "retro", .goal = kPresetGoal, .full = row<at("applyRetro")>,
     .partial = row<at("applyRetroPartial")>},
    {.name = "sunshine", .goal = kPresetGoal, .full = row<at("applySunshine")>,
     .partial = row<at("applySunshinePartial")>},
    {.name = "bluewash", .goal = kPresetGoal, .full = row<at("applyBluewash")>,
     .partial = row<at("applyBluewashPartial")>},
    {.name = "nostalgia", .goal = kPresetGoal, .full = row<at("applyNostalgia")>,
     .partial = row<at("applyNostalgiaPartial")>},
    {.name = "yellowglow", .goal = kPresetGoal, .full = row<at("applyYellowglow")>,
     .partial = row<at("applyYellowglowPartial")>},
    {.name = "downlight", .full = row<at("applyDownlight")>, .partial = row<at("applyDownlightPartial")>},
    {.name = "auto-adjust", .goal = kAutoGoal, .full = row<at("applyAutoAdjust")>},

    // ---- Neighbourhood effects -------------------------------------------------------------
    {.name = "sharpen", .goal = kSharpenGoal, .full = row<at("fx_apply_sharpen_all")>, .partial = row<at("applySharpen")>},
    {.name = "pixelize", .full = row<at("applyPixelize")>},

    // ---- Depth-of-field blur: the preview a slider runs, its parts, the one-shot call ------
    {.name = "blur-preview", .goal = kBlurPreviewGoal, .full = row<at("fx_make_blur_preview")>,
     .partial = row<at("fx_make_blur_preview")>, .setup = init_blur, .teardown = fx_destroy_blur},
    {.name = "blur-init", .full = init_blur, .partial = init_blur, .teardown = fx_destroy_blur,
     .changes = false},
    {.name = "blur-gaussian-working", .goal = kBlurKernelGoal, .peer = Peer::kGaussian,
     .full = gaussian_working, .partial = gaussian_working, .setup = init_blur,
     .teardown = fx_destroy_blur, .items = working_samples},
    {.name = "blur-composite", .peer = Peer::kResize, .full = blur_composite,
     .partial = blur_composite, .setup = init_blurred, .teardown = fx_destroy_blur},
    {.name = "blur-lens-working", .full = lens_working, .setup = init_blur,
     .teardown = fx_destroy_blur, .items = working_samples},
    {.name = "blur", .full = row<at("applyBlur")>, .partial = row<at("applyBlur")>},

    // ---- Tilt-shift ------------------------------------------------------------------------
    {.name = "tilt-shift-preview", .full = row<at("makeTiltShift")>, .setup = tilt_init,
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
    {.name = "tilt-shift", .full = row<at("applyTiltShift")>},

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
    {.name = "lighten-brush", .full = row<at("rubLighten")>, .items = brush_area, .in_place = true},
    {.name = "darken-brush", .full = row<at("rubDarken")>, .items = brush_area, .in_place = true},
    {.name = "pixelize-brush", .full = row<at("rubPixelize")>, .items = brush_area, .in_place = true},
    // Whether the photograph has red enough to change under the eye is up to the photograph.
    {.name = "red-eye-brush", .full = red_eye, .items = eye_area, .in_place = true,
     .changes = false},
};
// clang-format on

}  // namespace

std::span<const Effect> effects() { return kEffects; }

int64_t working_samples(const Frame&) { return int64_t{g_scaled_wd} * g_scaled_ht; }

}  // namespace fxbench
