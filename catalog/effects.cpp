// The catalogue: one entry per effect the hosts offer. See catalog/effects.h for what each field
// means; the table is checked when it is compiled (names, ranges, defaults).
#include "catalog/effects.h"

#if defined(__linux__) && !defined(__EMSCRIPTEN__)
#include <sys/mman.h>
#endif

#include <cstdlib>
#include <cstring>
#include <mutex>
#include <string>
#include <string_view>

#include "catalog/chain.h"
#include "catalog/exports.h"
#include "catalog/texture.h"
#include "photofx.h"

namespace fxcat {
namespace {

// ---- What the library's export catalogue already says ---------------------------------------

// A setting that is one of the library's levels takes the level's name, range and neutral value
// from the export catalogue's row for the function its run calls. The row and the level are
// looked up when this table is compiled: a name the catalogue lacks does not compile.
consteval const pfx::catalog::Level& library_level(std::string_view exported,
                                                   std::string_view name) {
  for (const pfx::catalog::Level& l :
       pfx::catalog::kExports[pfx::catalog::index_of(exported)].levels) {
    // Param keeps a C string: the catalogue's names are literals, so one ends where it does.
    if (l.name == name && l.name.data()[l.name.size()] == '\0') return l;
  }
  throw "the export has no level of that name";
}

consteval Param level(std::string_view exported, std::string_view name, const char* help) {
  const pfx::catalog::Level& l = library_level(exported, name);
  return integer(l.name.data(), l.lo, l.hi, l.neutral, help);
}

// The same range with the host's own default, where a neutral value would show nothing (a
// brush of strength 0) or the library has none (a hue).
consteval Param level(std::string_view exported, std::string_view name, int32_t def,
                      const char* help) {
  const pfx::catalog::Level& l = library_level(exported, name);
  return integer(l.name.data(), l.lo, l.hi, def, help);
}

// The module-wide state an export touches, as the lock that guards it.
consteval State state_of(std::string_view exported) {
  const pfx::catalog::Export& e = pfx::catalog::kExports[pfx::catalog::index_of(exported)];
  if ((e.needs & pfx::catalog::kWorkspace) != 0) return State::kBlurWorkspace;
  if ((e.needs & pfx::catalog::kAutoParameters) != 0) return State::kAutoAdjust;
  return State::kNone;
}

// ---- Shared parameters and helpers ----------------------------------------------------------

constexpr Choice kOffOn[] = {{"off", 0}, {"on", 1}};

constexpr Choice kMirrorModes[] = {{"keep-left", MIRROR_KEEP_LEFT},
                                   {"keep-right", MIRROR_KEEP_RIGHT},
                                   {"keep-top", MIRROR_KEEP_TOP},
                                   {"keep-bottom", MIRROR_KEEP_BOTTOM}};
constexpr Choice kMirrorAxes[] = {{"horizontal", MIRROR_HORIZONTAL}, {"vertical", MIRROR_VERTICAL}};

// The four auto-adjust parameters, in the order fx_set_hdr takes them.
constexpr Param kThreshold =
    level("fx_set_hdr", "threshold", "bright share (percent) at which weight2 replaces weight1");
constexpr Param kCutOff =
    level("fx_set_hdr", "cutoff", "lightness (percent) the brightest tone is mapped to");
constexpr Param kWeight1 =
    level("fx_set_hdr", "weight1", "evenness of the tone curve for most images");
constexpr Param kWeight2 =
    level("fx_set_hdr", "weight2", "the same for images that are mostly bright");

// The auto-adjust parameters are module-wide. A run sets them from its own parameters k..k+3
// and puts back what it found when it is done, so that every picture of a gallery (downlight
// included) starts from the library's values rather than the previous picture's.
class AutoAdjustSettings {
 public:
  AutoAdjustSettings(const Call& c, size_t k)
      : threshold_(fx_get_threshold_hdr()),
        cutoff_(fx_get_cutoff_hdr()),
        weight1_(fx_get_weight1_hdr()),
        weight2_(fx_get_weight2_hdr()) {
    fx_set_hdr(c.arg(k), c.arg(k + 1), c.arg(k + 2), c.arg(k + 3));
  }
  ~AutoAdjustSettings() { fx_set_hdr(threshold_, cutoff_, weight1_, weight2_); }
  AutoAdjustSettings(const AutoAdjustSettings&) = delete;
  AutoAdjustSettings& operator=(const AutoAdjustSettings&) = delete;

 private:
  int32_t threshold_, cutoff_, weight1_, weight2_;
};

// Mirror: the library names the output size, the host allocates it, the library fills it.
int32_t mirror_position(const Values& v) {
  return static_cast<int32_t>(static_cast<int32_t>(v[3]) == MIRROR_HORIZONTAL ? v[0] : v[1]);
}

std::string mirror_size(const Values& v, int32_t width, int32_t height, int32_t& out_width,
                        int32_t& out_height) {
  const int32_t pos = mirror_position(v);
  const int32_t mode = static_cast<int32_t>(v[2]), axis = static_cast<int32_t>(v[3]);
  // The library would refuse a side that does not belong to the axis when it runs; say so
  // before anything is allocated for it.
  const bool keeps_column_side = mode == MIRROR_KEEP_LEFT || mode == MIRROR_KEEP_RIGHT;
  if (keeps_column_side != (axis == MIRROR_HORIZONTAL)) {
    return "the library refused the arguments (keep-left and keep-right go with --axis "
           "horizontal, keep-top and keep-bottom with --axis vertical)";
  }
  out_width = getMirrorOutwidth(width, pos, mode, axis);
  out_height = getMirrorOutheight(height, pos, mode, axis);
  if (int64_t{out_width} * out_height > kMaxPixels) return "the mirrored image would be too large";
  return {};
}

std::string mirror(const Call& c) {
  return result_code(runMirror(c.src, c.width, c.height, c.dst, c.out_width, c.out_height,
                               mirror_position(c.values), c.arg(2), c.arg(3)));
}

constexpr Choice kChannels[] = {{"all", 0}, {"red", 1}, {"green", 2}, {"blue", 3}};

// Input and output levels write nothing when high is not above low; the tool says so rather
// than hand back the picture unchanged.
template <auto Levels>
std::string levels(const Call& c) {
  if (c.arg(2) <= c.arg(1)) return "--high must be above --low";
  return full_only<Levels>(c);
}

// The textured old photo mixes in a texture of the picture's size: the catalogue's own paper.
std::string old_photo_texture(const Call& c) {
  const Pixels paper = paper_texture(c.width, c.height);
  const Bounds& b = c.bounds;
  if (c.whole) {
    fx_apply_oldphoto_texture(c.src, c.dst, paper.data(), c.width, c.height);
  } else {
    fx_apply_oldphoto_texture_partial(c.src, c.dst, paper.data(), c.mask, c.width, c.height, b.left,
                                      b.right, b.top, b.bottom);
  }
  return {};
}

// Sphericity and twirl warp the selection's box (or the whole image) and take one more
// setting, the level or the angle, after the circle.
template <auto Warp>
std::string circle_warp(const Call& c) {
  const Bounds& w = c.window;
  Warp(c.src, c.dst, c.width, c.height, c.arg(0), c.arg(1), c.arg(2), c.arg(3), w.left, w.right,
       w.top, w.bottom, static_cast<uint32_t>(c.arg(4)));
  return {};
}

// The blur preview's workspace: the picture and the selection scaled down once, then a blur of
// the small copy and a compositing pass per level.
constexpr Stages kBlurPreview{
    .begin =
        [](const Call& c) {
          const Bounds& b = c.bounds;
          fx_Init_blur(c.src, c.mask, c.width, c.height, b.left, b.right, b.top, b.bottom);
          return std::string();
        },
    .preview =
        [](const Call& c) {
          fx_make_blur_preview(c.src, c.mask, c.dst, c.width, c.height, c.arg(0));
          return std::string();
        },
    .end = fx_destroy_blur};

// The tilt-shift preview's workspace: the picture scaled down once, then a band per position.
constexpr Stages kTiltShiftPreview{.begin =
                                       [](const Call& c) {
                                         initTiltShift(c.src, c.width, c.height);
                                         return std::string();
                                       },
                                   .preview =
                                       [](const Call& c) {
                                         makeTiltShift(c.src, c.dst, c.width, c.height, c.arg(0),
                                                       c.arg(1));
                                         return std::string();
                                       },
                                   .end = destroyTiltShift};

template <const Stages& S>
std::string run_stages(const Call& c) {
  std::string err = S.begin(c);
  if (err.empty()) err = S.preview(c);
  S.end();
  return err;
}

// clang-format off
constexpr Effect kEffects[] = {
    // ---- Tone and colour adjustments --------------------------------------------------------
    {.name = "brightness",
     .family = "adjust",
     .summary = "lighter or darker: moves the luma and keeps the colour",
     .selects = Selects::kMask,
     .params = {level("controlBrightness", "level", "slider position; 10 keeps the luma, "
                      "though the YCbCr round trip still moves most colours a step")},
     .run = full_and_partial<controlBrightness, controlBrightnessPartial>,
     .gallery = "level=0;level=5;level=15;level=20"},
    {.name = "contrast",
     .family = "adjust",
     .summary = "pushes each channel away from mid grey, or draws it toward it below 10",
     .selects = Selects::kMask,
     .params = {level("controlContrast", "level",
                      "slider position; 10 leaves the image as it is")},
     .run = full_and_partial<controlContrast, controlContrastPartial>,
     .gallery = "level=0;level=5;level=15;level=20"},
    {.name = "saturation",
     .family = "adjust",
     .summary = "more or less colourful: 0 is grey, 20 about doubles each colour's distance from it",
     .selects = Selects::kMask,
     .params = {level("controlSaturation", "level",
                      "slider position; 10 leaves the image as it is")},
     .run = full_and_partial<controlSaturation, controlSaturationPartial>,
     .gallery = "level=0;level=5;level=15;level=20"},
    {.name = "temperature",
     .family = "adjust",
     .summary = "warmer above 10 (more red, less blue), cooler below",
     .selects = Selects::kMask,
     .params = {level("controlTemperature", "level", "slider position; 10 shifts no chroma, "
                      "though the YCbCr round trip still moves most colours a step")},
     .run = full_and_partial<controlTemperature, controlTemperaturePartial>,
     .gallery = "level=0;level=5;level=15;level=20"},
    {.name = "exposure",
     .family = "adjust",
     .summary = "each channel times level / 10: 0 is black, 20 doubles",
     .selects = Selects::kMask,
     .params = {level("controlExposure", "level",
                      "slider position; 10 leaves the image as it is")},
     .run = full_and_partial<controlExposure, controlExposurePartial>,
     .gallery = "level=5;level=15;level=20"},
    {.name = "hue",
     .family = "adjust",
     .summary = "turns every colour round the colour wheel, 18 degrees per step",
     .selects = Selects::kMask,
     .params = {level("controlHue", "level",
                      "slider position; 10 leaves the image as it is")},
     .run = full_and_partial<controlHue, controlHuePartial>,
     .gallery = "level=0;level=5;level=15"},
    {.name = "faded-colour",
     .family = "adjust",
     .summary = "blends toward a washed-out, warm-tinted copy",
     .selects = Selects::kMask,
     .params = {level("controlFadedColour", "level", "percent faded; 0 leaves the image as it is")},
     .run = full_and_partial<controlFadedColour, controlFadedColourPartial>,
     .gallery = "level=25;level=50;level=100"},
    {.name = "invert",
     .family = "adjust",
     .summary = "the negative: each colour channel becomes 255 minus itself",
     .selects = Selects::kMask,
     .params = {},
     .run = full_and_partial<applyInvert, applyInvertPartial>,
     .gallery = ""},
    {.name = "channel-gains",
     .family = "adjust",
     .summary = "a slider per channel: a step adds 6 to its channel and takes 3 from the others",
     .selects = Selects::kMask,
     .params = {level("controlAdjustRGB", "red", "red slider; 10 moves no channel"),
                level("controlAdjustRGB", "green", "green slider; 10 moves no channel"),
                level("controlAdjustRGB", "blue", "blue slider; 10 moves no channel")},
     .run = full_and_partial<controlAdjustRGB, AdjustRGB>,
     .gallery = "red=20;green=20;blue=20;red=14,green=12,blue=4"},
    {.name = "colour-tone",
     .family = "adjust",
     .summary = "repaints the picture in one hue at low saturation",
     .selects = Selects::kKeep,
     .params = {level("fx_change_colortone", "hue", 30,
                      "the hue in degrees: 0 red, 120 green, 240 blue")},
     .run = full_only<fx_change_colortone>,
     .gallery = "hue=30;hue=200"},
    {.name = "lighten",
     .family = "adjust",
     .summary = "brush: lightens a disc, most at its centre; the disc becomes opaque",
     .selects = Selects::kKeep,
     .writes = Writes::kSome,
     .params = {column("cx", 500, "the disc's centre column"),
                row("cy", 500, "the disc's centre row"),
                level("rubLighten", "strength", 64, "how much the centre's channels rise"),
                length("radius", 1, 250, "the disc's radius in pixels")},
     .run = [](const Call& c) {
       rubLighten(c.dst, c.arg(0), c.arg(1), c.width, c.height, c.arg(2), c.arg(3));
       return std::string();
     },
     .gallery = ";strength=255"},
    {.name = "darken",
     .family = "adjust",
     .summary = "brush: darkens a disc, most at its centre; the disc becomes opaque",
     .selects = Selects::kKeep,
     .writes = Writes::kSome,
     .params = {column("cx", 500, "the disc's centre column"),
                row("cy", 500, "the disc's centre row"),
                level("rubDarken", "strength", 64, "how much the centre's channels fall"),
                length("radius", 1, 250, "the disc's radius in pixels")},
     .run = [](const Call& c) {
       rubDarken(c.dst, c.arg(0), c.arg(1), c.width, c.height, c.arg(2), c.arg(3));
       return std::string();
     },
     .gallery = ";strength=255"},

    // ---- Blur ---------------------------------------------------------------------------------
    {.name = "blur",
     .family = "blur",
     .summary = "soft blur of the selection, or of everything, on a scaled-down copy",
     .selects = Selects::kMask,
     .params = {level("applyBlur", "level", 4,
                      "blur width: 0..7 use 1..8 taps, 8 the widest (9 taps)")},
     .run = [](const Call& c) {
       const Bounds& b = c.bounds;
       applyBlur(c.src, c.mask, c.dst, c.width, c.height, c.arg(0), b.left, b.right,
                 b.top, b.bottom);
       return std::string();
     },
     .gallery = "level=0;level=4;level=8"},
    {.name = "blur-preview",
     .family = "blur",
     .summary = "the same blur through a preview session, as an editor's slider runs it",
     .selects = Selects::kMask,
     .state = state_of("fx_Init_blur"),
     .params = {level("fx_make_blur_preview", "level", 4,
                      "blur width: 0..7 use 1..8 taps, 8 the widest (9 taps)")},
     .run = run_stages<kBlurPreview>,
     .stages = &kBlurPreview,
     .gallery = "level=4"},
    {.name = "tilt-shift",
     .family = "blur",
     .summary = "a sharp horizontal band, the picture blurring away above and below it",
     .selects = Selects::kKeep,
     .params = {row("centre", 500, "the row in the middle of the sharp band"),
                rows("half-height", 125, "rows kept sharp on each side of the centre")},
     .run = full_only<applyTiltShift>,
     .gallery = ""},
    {.name = "tilt-shift-preview",
     .family = "blur",
     .summary = "the same tilt-shift through a preview session",
     .selects = Selects::kKeep,
     .state = state_of("initTiltShift"),
     .params = {row("centre", 500, "the row in the middle of the sharp band"),
                rows("half-height", 125, "rows kept sharp on each side of the centre")},
     .run = run_stages<kTiltShiftPreview>,
     .stages = &kTiltShiftPreview,
     .gallery = ""},

    // ---- Retouching -----------------------------------------------------------------------------
    {.name = "sharpen",
     .family = "retouch",
     .summary = "crisper vertical edges: each pixel pushed away from its left and right neighbours",
     .selects = Selects::kMask,
     .params = {},
     // The partial variant takes a level it does not use; the full one has no entry point.
     .run = [](const Call& c) {
       const Bounds& b = c.bounds;
       if (c.whole) {
         fx_apply_sharpen_all(c.src, c.dst, c.width, c.height);
       } else {
         applySharpen(c.src, c.mask, c.dst, c.width, c.height, 0, b.left, b.right, b.top,
                      b.bottom);
       }
       return std::string();
     },
     .gallery = ""},
    {.name = "pixelize",
     .family = "retouch",
     .summary = "a mosaic of square blocks, each the colour of its top-left pixel",
     .selects = Selects::kKeep,
     .params = {level("applyPixelize", "shift", 3,
                      "blocks of 2^shift pixels a side; 0 changes nothing")},
     .run = full_only<applyPixelize>,
     .gallery = "shift=3;shift=5"},
    {.name = "pixelize-brush",
     .family = "retouch",
     .summary = "brush: the same mosaic inside a disc, on the grid of the whole picture",
     .selects = Selects::kKeep,
     .writes = Writes::kSome,
     .params = {level("rubPixelize", "shift", 4,
                      "blocks of 2^shift pixels a side; 0 changes nothing"),
                column("cx", 500, "the disc's centre column"),
                row("cy", 500, "the disc's centre row"),
                length("radius", 0, 250, "the disc's radius in pixels")},
     .run = [](const Call& c) {
       rubPixelize(c.dst, c.width, c.height, c.arg(0), c.arg(1), c.arg(2), c.arg(3));
       return std::string();
     },
     .gallery = ""},
    {.name = "red-eye",
     .family = "retouch",
     .summary = "takes the red out of strongly red pixels inside a square",
     .selects = Selects::kKeep,
     .writes = Writes::kSome,
     .params = {column("cx", 500, "the square's centre column"),
                row("cy", 500, "the square's centre row"),
                length("radius", 0, 250, "half the square's side in pixels")},
     .run = [](const Call& c) {
       removeRedeye(c.dst, c.width, c.height, c.arg(0), c.arg(1), c.arg(2));
       return std::string();
     },
     .gallery = ""},

    // ---- Tone curves ----------------------------------------------------------------------------
    {.name = "gamma",
     .family = "curves",
     .summary = "mid-tones lighter above 1, darker below; black and white stay",
     .selects = Selects::kKeep,
     .params = {choice("channel", kChannels, 0, "the colour channel the curve changes"),
                real("gamma", 0.1, 10, 1, "the curve's power is 1 / gamma; 1 changes nothing")},
     .run = [](const Call& c) {
       control_gamma(c.src, c.dst, c.width, c.height, c.arg(0), c.real(1));
       return std::string();
     },
     .gallery = "gamma=0.6;gamma=1.8;channel=blue,gamma=2.5"},
    {.name = "input-levels",
     .family = "curves",
     .summary = "stretches low..high over the whole range: more contrast, the ends clipped",
     .selects = Selects::kKeep,
     .params = {choice("channel", kChannels, 0, "the colour channel the curve changes"),
                level("changeHistogramByInput", "low", "the value that becomes 0"),
                level("changeHistogramByInput", "high", "the value that becomes 255; above low")},
     .run = levels<changeHistogramByInput>,
     .gallery = "low=40,high=215"},
    {.name = "output-levels",
     .family = "curves",
     .summary = "squeezes the whole range into low..high: less contrast",
     .selects = Selects::kKeep,
     .params = {choice("channel", kChannels, 0, "the colour channel the curve changes"),
                level("changeHistogramByOutput", "low", "what 0 becomes"),
                level("changeHistogramByOutput", "high", "what 255 becomes; above low")},
     .run = levels<changeHistogramByOutput>,
     .gallery = "low=40,high=215"},

    // ---- Looks ----------------------------------------------------------------------------------
    {.name = "greyscale",
     .family = "looks",
     .summary = "grey from the mean of the channels, lighter above 10 and darker below",
     .selects = Selects::kMask,
     .params = {level("controlGreyscale", "level",
                      "slider position; 10 keeps the grey's brightness")},
     .run = full_and_partial<controlGreyscale, controlGreyscalePartial>,
     .gallery = "level=5;level=10;level=15"},
    {.name = "sepia",
     .family = "looks",
     .summary = "warm brown tones: red lifted and blue lowered, most in the mid-tones",
     .selects = Selects::kMask,
     .params = {},
     .run = full_and_partial<fx_apply_sepia, fx_apply_sepia_partial>,
     .gallery = ""},
    {.name = "vignette",
     .family = "looks",
     .summary = "darkens toward the borders: to 9/16 at their middles, about 1/8 in the corners",
     .selects = Selects::kKeep,
     .params = {},
     .run = full_only<fx_apply_vignette>,
     .gallery = ""},
    {.name = "vignette-preview",
     .family = "looks",
     .summary = "the table-based vignette for previews: steeper, about 0 in the corners",
     .selects = Selects::kKeep,
     .params = {},
     .run = full_only<fx_apply_vignette_prev>,
     .gallery = ""},
    {.name = "vintage",
     .family = "looks",
     .summary = "faded warm film: tone curves, brightness and contrast, then a vignette",
     .selects = Selects::kMask,
     .writes = Writes::kAllWhenWhole,
     .params = {},
     .run = full_and_partial<applyVintage, applyVintagePartial>,
     .gallery = ""},
    {.name = "vintage-preview",
     .family = "looks",
     .summary = "a one-pass stand-in for the vintage look, for previews",
     .selects = Selects::kKeep,
     .params = {},
     .run = full_only<fx_apply_vintage_prev>,
     .gallery = ""},
    {.name = "old-photo",
     .family = "looks",
     .summary = "sepia with flattened contrast and a vignette",
     .selects = Selects::kMask,
     .params = {},
     .run = full_and_partial<applyOldPhoto, applyOldPhotoPartial>,
     .gallery = ""},
    {.name = "old-photo-texture",
     .family = "looks",
     .summary = "a warm tone with a quarter of a paper texture mixed in",
     .selects = Selects::kMask,
     .writes = Writes::kAllWhenWhole,
     .params = {},
     .run = old_photo_texture,
     .gallery = ""},
    {.name = "pop-art",
     .family = "looks",
     .summary = "four half-size copies, each posterised in its own colours",
     .selects = Selects::kKeep,
     .params = {},
     .run = full_only<applyPopArt>,
     .gallery = ""},
    {.name = "pop-art-preview",
     .family = "looks",
     .summary = "four half-size copies, each turned to its own hue, for previews",
     .selects = Selects::kKeep,
     .params = {},
     .run = full_only<fx_apply_popart_prev>,
     .gallery = ""},
    {.name = "soft-glow",
     .family = "looks",
     .summary = "a slight blur, bright tones lifted and dark ones lowered",
     .selects = Selects::kMask,
     .params = {level("applySoftglow", "level", 50, "strength of the tone curve; 0 only blurs")},
     .run = full_and_partial<applySoftglow, applySoftglowPartial>,
     .gallery = "level=50;level=100"},
    {.name = "retro",
     .family = "looks",
     .summary = "preset: faded, slightly bright and desaturated",
     .selects = Selects::kMask,
     .writes = Writes::kAllWhenWhole,
     .params = {},
     .run = full_and_partial<applyRetro, applyRetroPartial>,
     .gallery = ""},
    {.name = "sunshine",
     .family = "looks",
     .summary = "preset: warm and golden, blue held back",
     .selects = Selects::kMask,
     .writes = Writes::kAllWhenWhole,
     .params = {},
     .run = full_and_partial<applySunshine, applySunshinePartial>,
     .gallery = ""},
    {.name = "downlight",
     .family = "looks",
     .summary = "preset: faded and auto-adjusted, soft and dim; takes auto adjust's parameters",
     .selects = Selects::kMask,
     .state = state_of("applyDownlight"),
     .writes = Writes::kAllWhenWhole,
     .params = {kThreshold, kCutOff, kWeight1, kWeight2},
     .run = [](const Call& c) {
       const AutoAdjustSettings settings(c, 0);
       return full_and_partial<applyDownlight, applyDownlightPartial>(c);
     },
     .gallery = ""},
    {.name = "bluewash",
     .family = "looks",
     .summary = "preset: cool and blue, a little more contrast",
     .selects = Selects::kMask,
     .writes = Writes::kAllWhenWhole,
     .params = {},
     .run = full_and_partial<applyBluewash, applyBluewashPartial>,
     .gallery = ""},
    {.name = "nostalgia",
     .family = "looks",
     .summary = "preset: faded, bright and warm",
     .selects = Selects::kMask,
     .writes = Writes::kAllWhenWhole,
     .params = {},
     .run = full_and_partial<applyNostalgia, applyNostalgiaPartial>,
     .gallery = ""},
    {.name = "yellow-glow",
     .family = "looks",
     .summary = "preset: faded and strongly yellow, with lifted contrast",
     .selects = Selects::kMask,
     .writes = Writes::kAllWhenWhole,
     .params = {},
     .run = full_and_partial<applyYellowglow, applyYellowglowPartial>,
     .gallery = ""},

    // ---- Warps ----------------------------------------------------------------------------------
    {.name = "mirror",
     .family = "warp",
     .summary = "keeps one side of a column or row and adds its reflection; changes the size",
     .selects = Selects::kNothing,
     .in_place = false,  // the warps read source pixels after writing destination ones
     .params = {column("column", 500, "the mirror column, with --axis horizontal"),
                row("row", 500, "the mirror row, with --axis vertical"),
                choice("mode", kMirrorModes, 0, "the side kept: left or right of the column, "
                       "top or bottom of the row"),
                choice("axis", kMirrorAxes, 0, "reflect across a column or a row")},
     .run = mirror,
     .size = mirror_size,
     .gallery = "mode=keep-left;mode=keep-bottom,axis=vertical"},
    {.name = "sphericity",
     .family = "warp",
     .summary = "bulges (level above 0) or pinches (below 0) a circle of about 1.4 x radius",
     .selects = Selects::kKeep,
     .in_place = false,  // the warps read source pixels after writing destination ones
     .params = {column("cx", 500, "the circle's centre column"),
                row("cy", 500, "the circle's centre row"),
                length("radius", 1, 250, "the nominal radius in pixels"),
                level("runSphericity", "level", 60, "strength: above 0 bulges, below 0 pinches"),
                choice("fast", kOffOn, 0, "on: every second pixel, filled in 2 x 2 blocks")},
     .run = circle_warp<runSphericity>,
     .gallery = "level=100;level=-100"},
    {.name = "twirl",
     .family = "warp",
     .summary = "turns a circle by an angle that is largest at its centre and fades to its rim",
     .selects = Selects::kKeep,
     .in_place = false,  // the warps read source pixels after writing destination ones
     .params = {column("cx", 500, "the circle's centre column"),
                row("cy", 500, "the circle's centre row"),
                length("radius", 1, 400, "the circle's radius in pixels"),
                level("runTwirl", "angle", 90,
                      "degrees at the centre; below 0 turns the other way"),
                choice("fast", kOffOn, 0, "on: every second pixel, filled in 2 x 2 blocks")},
     .run = circle_warp<runTwirl>,
     .gallery = "angle=90;angle=-270,fast=on"},

    // ---- Automatic adjustment -------------------------------------------------------------------
    {.name = "auto-adjust",
     .family = "auto",
     .summary = "tone mapping from the picture's histogram (contrast 12 under 150 pixels a side)",
     .selects = Selects::kKeep,
     .state = state_of("applyAutoAdjust"),
     .params = {kThreshold, kCutOff, kWeight1, kWeight2},
     .run = [](const Call& c) {
       const AutoAdjustSettings settings(c, 0);
       return result_code(applyAutoAdjust(c.src, c.dst, c.width, c.height));
     },
     .gallery = ";cutoff=85,weight1=4000"},
};
// clang-format on

// ---- Checks on the table, made by the compiler ----------------------------------------------

constexpr bool same(const char* a, const char* b) {
  while (*a != '\0' && *a == *b) ++a, ++b;
  return *a == *b;
}

// Lower-case words joined by '-', as command-line names are written.
constexpr bool is_option_name(const char* s) {
  if (*s == '\0' || *s == '-') return false;
  char last = '\0';
  for (; *s != '\0'; last = *s++) {
    const bool ok = (*s >= 'a' && *s <= 'z') || (*s >= '0' && *s <= '9') || *s == '-';
    if (!ok || (*s == '-' && last == '-')) return false;
  }
  return last != '-';
}

constexpr bool param_ok(const Param& p) {
  if (!is_option_name(p.name) || p.help == nullptr || p.help[0] == '\0') return false;
  for (const char* r : kHostOptions) {
    if (same(p.name, r)) return false;
  }
  switch (p.kind) {
    case Kind::kChoice:
      return p.extent == Extent::kNone && p.choices != nullptr && p.choice_count > 0 &&
             p.def >= 0 && p.def < p.choice_count && static_cast<int32_t>(p.def) == p.def;
    case Kind::kReal:
      return p.extent == Extent::kNone && p.min <= p.def && p.def <= p.max;
    case Kind::kInteger:
      if (p.min != static_cast<int32_t>(p.min) || p.max != static_cast<int32_t>(p.max) ||
          p.def != static_cast<int32_t>(p.def)) {
        return false;
      }
      if (p.extent == Extent::kNone) return p.min <= p.def && p.def <= p.max;
      return p.def >= 0 && p.def <= 1000 && p.min >= 0 && p.max <= 0;
  }
  return false;
}

constexpr bool effect_ok(const Effect& e) {
  // (A missing run function is caught when the effect runs: comparing function pointers is not
  // a constant expression under the sanitizers.)
  if (!is_option_name(e.name) || !is_option_name(e.family) || e.summary == nullptr) return false;
  const size_t n = e.param_count();
  for (size_t i = n; i < kMaxParams; ++i) {
    if (e.params[i].name != nullptr) return false;  // no gaps in the list
  }
  for (size_t i = 0; i < n; ++i) {
    if (!param_ok(e.params[i])) return false;
    for (size_t j = 0; j < i; ++j) {
      if (same(e.params[i].name, e.params[j].name)) return false;
    }
  }
  return true;
}

// Index of the first entry with a bad name, parameter, range or default, or of one that repeats
// an earlier name; -1 when all are sound. The compiler shows the index when the check fails.
constexpr int first_bad_entry() {
  for (size_t i = 0; i < std::size(kEffects); ++i) {
    if (!effect_ok(kEffects[i])) return static_cast<int>(i);
    for (size_t j = 0; j < i; ++j) {
      if (same(kEffects[i].name, kEffects[j].name)) return static_cast<int>(i);
    }
  }
  return -1;
}

static_assert(first_bad_entry() == -1, "see the entry at this index of kEffects");

}  // namespace

std::span<const Effect> effects() { return kEffects; }

const Effect* find_effect(std::string_view name) {
  for (const Effect& e : kEffects) {
    if (name == e.name) return &e;
  }
  return nullptr;
}

std::string preview_step(const Effect& effect) {
  const size_t n = effect.param_count();
  const Effect* p = find_effect(std::string(effect.name) + "-preview");
  if (p != nullptr && p->param_count() == n) {
    bool same = true;
    for (size_t k = 0; k < n; ++k)
      same = same && std::strcmp(effect.params[k].name, p->params[k].name) == 0;
    if (same) return p->name;
  }
  for (size_t k = 0; k < n; ++k) {
    const Param& q = effect.params[k];
    if (std::strcmp(q.name, "fast") != 0 || q.kind != Kind::kChoice) continue;
    for (int32_t i = 0; i < q.choice_count; ++i) {
      if (std::strcmp(q.choices[i].label, "on") == 0)
        return std::string(effect.name) + " --fast on";
    }
  }
  return {};
}

std::string result_code(int32_t code) {
  switch (code) {
    case PHOTOFX_SUCCESS:
      return {};
    case PHOTOFX_OUT_OF_MEMORY:
      return "the library ran out of memory";
    case PHOTOFX_INVALID_ARGUMENT:
      return "the library refused the arguments";
    default:
      return "the library returned the unknown code " + std::to_string(code);
  }
}

// ---- Pixel memory ---------------------------------------------------------------------------

namespace detail {

#if defined(__linux__) && !defined(__EMSCRIPTEN__)
// Below this a buffer takes ordinary pages; above it, 2 MB pages where Linux has them on
// request (transparent huge pages in "madvise" mode, the common default).
constexpr size_t kHugePage = size_t{2} << 20;
constexpr size_t kHugeFrom = 4 * kHugePage;
#endif

void* allocate_pixels(size_t bytes) {
  void* p = nullptr;
#if defined(__linux__) && !defined(__EMSCRIPTEN__)
  if (bytes >= kHugeFrom) {
    if (posix_memalign(&p, kHugePage, bytes) != 0) throw std::bad_alloc();
    madvise(p, bytes, MADV_HUGEPAGE);  // a hint: without it the pages are merely small
    return p;
  }
#endif
  p = std::malloc(bytes == 0 ? 1 : bytes);
  if (p == nullptr) throw std::bad_alloc();
  return p;
}

void free_pixels(void* p, size_t) noexcept { std::free(p); }

}  // namespace detail

// ---- Running ------------------------------------------------------------------------------

std::string output_size(const Effect& effect, const Values& values, int32_t width, int32_t height,
                        int32_t& out_width, int32_t& out_height) {
  out_width = width;
  out_height = height;
  if (effect.size == nullptr) return {};
  return effect.size(values, width, height, out_width, out_height);
}

bool needs_two_buffers(const Effect& effect, bool selected) {
  return effect.size != nullptr || !effect.in_place ||
         (selected && effect.selects == Selects::kKeep);
}

namespace {

// One lock per kind of module-wide state (State::kNone needs none).
std::mutex& state_lock(State state) {
  static std::mutex locks[3];
  return locks[static_cast<size_t>(state)];
}

}  // namespace

namespace {

// Checks a call of `effect` and frames it for the run function; dst null: a session's begin,
// which has no destination yet.
std::string frame(const Effect& effect, const Values& values, const uint32_t* src, int32_t width,
                  int32_t height, uint32_t* dst, const Selection* selection, Call& call) {
  if (effect.run == nullptr) return std::string(effect.name) + " has no run function";
  if (selection != nullptr && effect.selects == Selects::kNothing) {
    return std::string(effect.name) + " takes no selection";
  }
  if (width <= 0 || height <= 0 || int64_t{width} * height > kMaxPixels) {
    return "the image has no pixels or too many";
  }
  const size_t n = static_cast<size_t>(width) * static_cast<size_t>(height);
  if (selection != nullptr && selection->mask.size() != n)
    return "the selection is not the image's size";
  if (src == dst && needs_two_buffers(effect, selection != nullptr)) {
    return std::string(effect.name) + " needs an output buffer apart from its input";
  }
  int32_t out_width = 0, out_height = 0;
  if (std::string err = output_size(effect, values, width, height, out_width, out_height);
      !err.empty()) {
    return err;
  }
  const bool partial = selection != nullptr && effect.selects == Selects::kMask;
  const Bounds whole_image{0, width - 1, 0, height - 1};
  call = {.src = src,
          .dst = dst,
          .width = width,
          .height = height,
          .out_width = out_width,
          .out_height = out_height,
          .mask = partial ? selection->mask.data() : nullptr,
          .bounds = partial ? selection->box : Bounds{1, 0, 1, 0},
          .window = selection != nullptr ? selection->box : whole_image,
          .whole = !partial,
          .values = values};
  return {};
}

// Same-size effects that leave pixels alone start from the source in dst (the brushes edit it
// there).
void start_from_source(const Effect& effect, const Call& c) {
  const bool leaves_pixels =
      effect.writes == Writes::kSome || (!c.whole && effect.writes == Writes::kAllWhenWhole);
  if (effect.size == nullptr && c.src != c.dst && leaves_pixels) {
    std::memcpy(c.dst, c.src,
                static_cast<size_t>(c.width) * static_cast<size_t>(c.height) * sizeof(uint32_t));
  }
}

// Effects that edit whole images only get their unselected pixels back from the source.
void keep_unselected(const Effect& effect, const Selection* selection, const Call& c) {
  if (selection == nullptr || effect.selects != Selects::kKeep) return;
  const uint8_t* m = selection->mask.data();
  for (size_t i = 0; i < selection->mask.size(); ++i) {
    if (m[i] == 0) c.dst[i] = c.src[i];
  }
}

}  // namespace

std::string run_effect(const Effect& effect, const Values& values, const uint32_t* src,
                       int32_t width, int32_t height, uint32_t* dst, const Selection* selection) {
  Call call{};
  if (std::string err = frame(effect, values, src, width, height, dst, selection, call);
      !err.empty()) {
    return err;
  }
  start_from_source(effect, call);
  {
    std::unique_lock<std::mutex> lock;
    if (effect.state != State::kNone) lock = std::unique_lock(state_lock(effect.state));
    if (std::string err = effect.run(call); !err.empty()) return err;
  }
  keep_unselected(effect, selection, call);
  return {};
}

// ---- Sessions -------------------------------------------------------------------------------

std::string Session::begin(const Effect& effect, const Values& values, const uint32_t* src,
                           int32_t width, int32_t height, const Selection* selection) {
  end();
  if (effect.stages == nullptr) return std::string(effect.name) + " has no preview stages";
  selected_ = selection != nullptr;
  if (selected_) selection_ = *selection;
  if (std::string err = frame(effect, values, src, width, height, nullptr,
                              selected_ ? &selection_ : nullptr, call_);
      !err.empty()) {
    return err;
  }
  if (effect.state != State::kNone) lock_ = std::unique_lock(state_lock(effect.state));
  if (std::string err = effect.stages->begin(call_); !err.empty()) {
    effect.stages->end();
    lock_ = {};
    return err;
  }
  effect_ = &effect;
  return {};
}

std::string Session::preview(const Values& values, uint32_t* dst) {
  if (effect_ == nullptr) return "no preview session has begun";
  // The workspace composites from the picture at every position: it must stay as it is.
  if (dst == call_.src) return std::string(effect_->name) + ": a preview needs its own buffer";
  call_.values = values;
  call_.dst = dst;
  start_from_source(*effect_, call_);
  if (std::string err = effect_->stages->preview(call_); !err.empty()) return err;
  keep_unselected(*effect_, selected_ ? &selection_ : nullptr, call_);
  return {};
}

void Session::end() {
  if (effect_ == nullptr) return;
  effect_->stages->end();
  effect_ = nullptr;
  lock_ = {};
  selection_ = {};
}

}  // namespace fxcat
