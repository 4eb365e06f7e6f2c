/*
 * photofx: photo effects on 32-bit ARGB pixel buffers, bit-exact on every platform.
 *
 * Pixels are 0xAARRGGBB words in row-major order with no gap between rows; masks are one byte
 * per pixel and select a pixel when the byte is exactly 1. Region bounds (left, right, top,
 * bottom) are inclusive; bounds with left > right or top > bottom mean "the whole image".
 *
 * Every effect has a camelCase entry point for hosts and an fx_ implementation that may also be
 * called directly. Functions that can refuse their arguments return one of the PHOTOFX_ result
 * codes; the entry points never pass those codes on.
 *
 * Valid C99 and C++.
 */
#ifndef PHOTOFX_H
#define PHOTOFX_H

#include <stdint.h>

#if defined(PHOTOFX_BUILDING_LIBRARY) && defined(__GNUC__)
#define PHOTOFX_API __attribute__((visibility("default")))
#else
#define PHOTOFX_API
#endif

#ifdef __cplusplus
extern "C" {
#endif

/* ---- Result codes ------------------------------------------------------------------------ */

#define PHOTOFX_SUCCESS 40960          /* 0xA000: the call did its work */
#define PHOTOFX_OUT_OF_MEMORY 40961    /* 0xA001: a scratch buffer could not be allocated */
#define PHOTOFX_INVALID_ARGUMENT 40962 /* 0xA002: a null buffer or a level out of range */

/* ---- Version of this header and the library built from it -------------------------------- */

#define PHOTOFX_VERSION_MAJOR 0
#define PHOTOFX_VERSION_MINOR 1
#define PHOTOFX_VERSION_PATCH 0

/* ---- Memory wrappers: every allocation, fill and whole-image copy of the library ---------- */

/* Both give null when count x size passes 32 bits, on every target; calloc's block is zeroed. */
PHOTOFX_API void* fx_calloc(uint32_t count, uint32_t size);
PHOTOFX_API void* fx_malloc(uint32_t count, uint32_t size);
PHOTOFX_API void* fx_realloc(void* ptr, uint32_t size);
PHOTOFX_API void fx_free(void* ptr);
PHOTOFX_API void* fx_memset(void* ptr, int32_t value, uint32_t count);   /* returns ptr */
PHOTOFX_API void* fx_memcpy(void* dst, const void* src, uint32_t count); /* returns dst */

/* ---- Channel packing ----------------------------------------------------------------------- */

/* Splits a pixel into red, green and blue (0..255); alpha is not extracted. */
PHOTOFX_API void fx_unpack_rgb888(int32_t pixel, int32_t* r, int32_t* g, int32_t* b);
/* Alpha of `pixel` with the low 8 bits of r, g and b. */
PHOTOFX_API uint32_t fx_pack_rgb888(uint32_t pixel, int32_t r, int32_t g, int32_t b);

/* ---- HSV conversion: hue in whole degrees, saturation 16.16 (65536 = 1.0), value 0..255 ---- */

PHOTOFX_API extern const uint32_t LUT_DELTA[256];  /* floor(65536 / i), entry 0 is 0 */
PHOTOFX_API extern const uint32_t LUT_DELTA2[256]; /* 60 x LUT_DELTA[i] */
PHOTOFX_API void fx_rgb2hsv(int32_t r, int32_t g, int32_t b, int32_t* h, int32_t* s, int32_t* v);
PHOTOFX_API void fx_hsv2rgb(int32_t h, int32_t s, int32_t v, int32_t* r, int32_t* g, int32_t* b);

/* ---- Brightness and contrast: level 0..20, 10 at the centre ------------------------------ */

/* Adds (level - 10) x 10 to the luma. Every pixel makes a fixed-point YCbCr round trip, which
 * leaves greys, black and white as they are but moves most colours by a step or two even at
 * level 10 (0xFFFF0000 comes back as 0xFFFE0000). */
PHOTOFX_API void controlBrightness(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height, int32_t level);
PHOTOFX_API void controlBrightnessPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                          int32_t width, int32_t height, int32_t level,
                                          int32_t left, int32_t right, int32_t top, int32_t bottom);
/* Pushes each channel away from 128 above level 10, draws it toward 128 below; 10 keeps it. */
PHOTOFX_API void controlContrast(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                 int32_t level);
PHOTOFX_API void controlContrastPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                        int32_t width, int32_t height, int32_t level, int32_t left,
                                        int32_t right, int32_t top, int32_t bottom);

PHOTOFX_API void fx_control_brightness_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                           int32_t height, int32_t level);
PHOTOFX_API void fx_control_brightness(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                       int32_t width, int32_t height, int32_t level, int32_t left,
                                       int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API void fx_control_contrast_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                         int32_t height, int32_t level);
PHOTOFX_API void fx_control_contrast(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                     int32_t width, int32_t height, int32_t level, int32_t left,
                                     int32_t right, int32_t top, int32_t bottom);

/* ---- Saturation and temperature: level 0..20, 10 at the centre --------------------------- */

/* Level 0 is grey, 10 keeps every pixel, 20 about doubles each colour's distance from grey. */
PHOTOFX_API void controlSaturation(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height, int32_t level);
PHOTOFX_API void controlSaturationPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                          int32_t width, int32_t height, int32_t level,
                                          int32_t left, int32_t right, int32_t top, int32_t bottom);
/* Above 10 warmer (less blue, more red), below 10 cooler; at 10 no shift, but the YCbCr round
 * trip of brightness still moves most colours by a step or two. */
PHOTOFX_API void controlTemperature(const uint32_t* src, uint32_t* dst, int32_t width,
                                    int32_t height, int32_t level);
PHOTOFX_API void controlTemperaturePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                           int32_t width, int32_t height, int32_t level,
                                           int32_t left, int32_t right, int32_t top,
                                           int32_t bottom);

PHOTOFX_API void fx_control_saturation_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                           int32_t height, int32_t level);
PHOTOFX_API void fx_control_saturation(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                       int32_t width, int32_t height, int32_t level, int32_t left,
                                       int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API void fx_control_temperature_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                            int32_t height, int32_t level);
PHOTOFX_API void fx_control_temperature(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                        int32_t width, int32_t height, int32_t level, int32_t left,
                                        int32_t right, int32_t top, int32_t bottom);

/* ---- Exposure and hue: level 0..20, 10 neutral; the fx_ functions return a result code ---- */

/* Each channel times level / 10: 0 is black, 20 doubles. */
PHOTOFX_API void controlExposure(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                 int32_t level);
/* Valid bounds select masked mode, which edits every pixel of the image whose mask byte is 1. */
PHOTOFX_API void controlExposurePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                        int32_t width, int32_t height, int32_t level, int32_t left,
                                        int32_t right, int32_t top, int32_t bottom);
/* Turns the hue by 18 degrees per step from 10. */
PHOTOFX_API void controlHue(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                            int32_t level);
PHOTOFX_API void controlHuePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                   int32_t width, int32_t height, int32_t level, int32_t left,
                                   int32_t right, int32_t top, int32_t bottom);

PHOTOFX_API int32_t fx_control_exposure_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                            int32_t height, int32_t level);
PHOTOFX_API int32_t fx_control_exposure(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                        int32_t width, int32_t height, int32_t level, int32_t left,
                                        int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API int32_t fx_control_hue_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                       int32_t height, int32_t level);
PHOTOFX_API int32_t fx_control_hue(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                   int32_t width, int32_t height, int32_t level, int32_t left,
                                   int32_t right, int32_t top, int32_t bottom);

/* ---- Faded colour (level 0..100 percent, others refused) and invert; fx_ return a code ----- */

/* Blends toward a washed-out, warm-tinted copy; 0 unchanged, 100 fully faded. */
PHOTOFX_API void controlFadedColour(const uint32_t* src, uint32_t* dst, int32_t width,
                                    int32_t height, int32_t level);
PHOTOFX_API void controlFadedColourPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                           int32_t width, int32_t height, int32_t level,
                                           int32_t left, int32_t right, int32_t top,
                                           int32_t bottom);
/* Each colour channel becomes 255 minus itself. */
PHOTOFX_API void applyInvert(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
PHOTOFX_API void applyInvertPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                    int32_t width, int32_t height, int32_t left, int32_t right,
                                    int32_t top, int32_t bottom);

PHOTOFX_API int32_t fx_control_fadedcolor_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                              int32_t height, int32_t level);
/* Refuses a null mask even when the bounds select the whole image. */
PHOTOFX_API int32_t fx_control_fadedcolor(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                          int32_t width, int32_t height, int32_t level,
                                          int32_t left, int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API int32_t fx_apply_invert_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                        int32_t height);
/* Refuses a null mask even when the bounds select the whole image. */
PHOTOFX_API int32_t fx_apply_invert(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                    int32_t width, int32_t height, int32_t left, int32_t right,
                                    int32_t top, int32_t bottom);

/* ---- Channel gains (red, green, blue 0..20, 10 neutral) and colour tone -------------------- */

/* A step on one slider adds 6 to its channel and takes 3 from each of the others. */
PHOTOFX_API void controlAdjustRGB(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                  int32_t red, int32_t green, int32_t blue);
PHOTOFX_API void AdjustRGB(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                           int32_t height, int32_t red, int32_t green, int32_t blue, int32_t left,
                           int32_t right, int32_t top, int32_t bottom);

PHOTOFX_API void fx_adjust_RGB_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height, int32_t red, int32_t green, int32_t blue);
PHOTOFX_API void fx_adjust_RGB(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                               int32_t width, int32_t height, int32_t red, int32_t green,
                               int32_t blue, int32_t left, int32_t right, int32_t top,
                               int32_t bottom);
/* Repaints the image in one hue (0..360 degrees, others refused) at saturation 0.3. */
PHOTOFX_API int32_t fx_change_colortone(const uint32_t* src, uint32_t* dst, int32_t width,
                                        int32_t height, int32_t hue);

/* ---- Lighten and darken brushes: edit `image` in place inside a disc around (cx, cy) ------- */

/* Strength 0..255 at the centre, fading to nothing at the radius; the disc becomes opaque. */
PHOTOFX_API void rubLighten(uint32_t* image, int32_t cx, int32_t cy, int32_t width, int32_t height,
                            int32_t strength, int32_t radius);
PHOTOFX_API void rubDarken(uint32_t* image, int32_t cx, int32_t cy, int32_t width, int32_t height,
                           int32_t strength, int32_t radius);

PHOTOFX_API void fx_apply_lighten(uint32_t* image, int32_t cx, int32_t cy, int32_t width,
                                  int32_t height, int32_t strength, int32_t radius);
PHOTOFX_API void fx_apply_darken(uint32_t* image, int32_t cx, int32_t cy, int32_t width,
                                 int32_t height, int32_t strength, int32_t radius);

/* ---- 16.16 fixed point (65536 = 1.0); range errors are recorded in a per-thread error word - */

PHOTOFX_API int32_t ftofix(double x);  /* nearest, halves away from zero, saturated */
PHOTOFX_API double fixtof(int32_t x);  /* exact */
PHOTOFX_API int32_t itofix(int32_t x); /* x << 16, wrapping */
PHOTOFX_API int32_t fixtoi(int32_t x); /* nearest integer, halves upward */
PHOTOFX_API int32_t fixfloor(int32_t x);
PHOTOFX_API int32_t fixceil(int32_t x);           /* saturates at 32767 */
PHOTOFX_API int32_t fixadd(int32_t a, int32_t b); /* saturated */
PHOTOFX_API int32_t fixsub(int32_t a, int32_t b); /* saturated */
PHOTOFX_API int32_t fixmul(int32_t a, int32_t b); /* rounded and saturated */
PHOTOFX_API int32_t fixdiv(int32_t a, int32_t b); /* (a << 16) / b, saturated on b = 0 */
PHOTOFX_API int32_t idiv(int32_t a, int32_t b);   /* rounded to nearest, halves away from 0 */
PHOTOFX_API int32_t iidiv(int32_t a, int32_t b);  /* truncated, minus 1 when the signs differ */

/* ---- Fixed-point trigonometry: angles in units of 1/256 turn (0x1000000 is a full turn) ----
 * Domain errors (acos or asin outside -1.0 ... 1.0, fixatan2(0, 0)) store 33 in the error word
 * and return 0. */

PHOTOFX_API extern const int32_t _cos_tbl[512];  /* cos(2 pi i / 512) x 65536 */
PHOTOFX_API extern const int32_t _tan_tbl[256];  /* tan(pi i / 256) x 65536; [128] is -0x7FFFFFFF */
PHOTOFX_API extern const int32_t _acos_tbl[513]; /* acos(i / 256 - 1) in angle units */
PHOTOFX_API extern const int32_t fixtorad_r;     /* radians per angle unit, for fixmul */
PHOTOFX_API extern const int32_t radtofix_r;     /* angle units per radian, for fixmul */
PHOTOFX_API int32_t fixcos(int32_t angle);       /* nearest entry; any angle wraps */
PHOTOFX_API int32_t fixsin(int32_t angle);
PHOTOFX_API int32_t fixtan(int32_t angle); /* -0x7FFFFFFF nearest a quarter turn */
PHOTOFX_API int32_t fixatan(int32_t x);    /* -64.0 ... 63.5, within half a unit */
/* Angle of the point (x, y), -128.0 ... 128.0; clears the error word unless x = y = 0. */
PHOTOFX_API int32_t fixatan2(int32_t y, int32_t x);
PHOTOFX_API int32_t fixacos(int32_t x); /* 0 ... 128.0 */
PHOTOFX_API int32_t fixasin(int32_t x); /* -64.0 ... 64.0 */

/* ---- Square root and logarithm; these leave the error word alone ------------------------- */

PHOTOFX_API int32_t isqrt_(int32_t x); /* nearest integer square root; 0 for x <= 0 */
/* 512 log2(v_i / 1024) at 230 breakpoints v_i from 1024 to 4096. */
PHOTOFX_API extern const int32_t log_new_FIX[230];
/* The table interpolated at v (1024 ... 4096 is 1.0 ... 4.0); below 1024 reads as 1024, 4096
 * and above give 1024, a null table gives 0. */
PHOTOFX_API int32_t log_interp_FIX(const int32_t* table, int32_t v);
/* ln(x / 1024) x 2^20 for 5 <= x <= 4194304; 0 for x = 1; 21811200 for any other x. */
PHOTOFX_API int32_t log_e_FIX_new(int32_t x);

/* ---- Depth-of-field blur and tilt-shift ------------------------------------------------------
 * Blurs run on a working image: the photograph scaled down by 2^k per side (k from the longer
 * side: above 420, 850, 1650, 3250 pixels gives 1, 2, 3, 4), 3 bytes per sample (red, green,
 * blue), with a working depth map of one byte per sample. Previews keep the working copies in
 * the workspace globals below between an init call and a destroy call; one workspace exists at a
 * time and each init releases the previous one of either kind. The workspace functions must not
 * run concurrently. Blur levels run 0..7 (one to eight taps); any other value means the widest
 * (nine taps). The caller's selection mask is never written. Images whose working copy would be
 * narrower or lower than 2 samples come back as an unchanged copy of the source. */

PHOTOFX_API extern uint8_t* g_ssrc;     /* working image of the source; null without workspace */
PHOTOFX_API extern uint8_t* g_sblur;    /* blurred working image, rewritten by every preview */
PHOTOFX_API extern uint8_t* g_tempd;    /* working depth map; null unless a blur workspace */
PHOTOFX_API extern int32_t g_scaled_wd; /* working width of the last init */
PHOTOFX_API extern int32_t g_scaled_ht; /* working height of the last init */
PHOTOFX_API extern int32_t all; /* 1 when the last fx_Init_blur had empty bounds: blur everything */
PHOTOFX_API extern int32_t resize_ratio; /* reduction shift k of the last fx_init_tiltshift */

/* Nearest-sample reduction of a width x height image (or mask) to sw x sh samples. */
PHOTOFX_API void scale_down_img(const uint32_t* src, int32_t width, int32_t height, uint8_t* out,
                                int32_t sw, int32_t sh);
PHOTOFX_API void scale_down_depth(const uint8_t* mask, int32_t width, int32_t height,
                                  uint8_t* depth, int32_t sw, int32_t sh);

/* Builds the blur workspace. Valid bounds blur the pixels whose mask byte is nonzero; empty
 * bounds (left > right or top > bottom) blur the whole image and need no mask. */
PHOTOFX_API void fx_Init_blur(const uint32_t* src, const uint8_t* mask, int32_t width,
                              int32_t height, int32_t left, int32_t right, int32_t top,
                              int32_t bottom);
/* Blurs the workspace at `level` and composites it into dst; does nothing without a workspace.
 * width and height must be those given to fx_Init_blur; dst may be src. */
PHOTOFX_API void fx_make_blur_preview(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                      int32_t width, int32_t height, int32_t level);
/* Releases the blur workspace (and a tilt-shift workspace); harmless when there is none. */
PHOTOFX_API void fx_destroy_blur(void);
/* One-shot blur with private working copies; leaves the workspace alone. dst may be src. */
PHOTOFX_API void fx_make_blur(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                              int32_t width, int32_t height, int32_t level, int32_t left,
                              int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API void applyBlur(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                           int32_t height, int32_t level, int32_t left, int32_t right, int32_t top,
                           int32_t bottom);

/* Separable blur of a working image; taps whose depth byte is not 1 stand in for the centre
 * sample. dst may be src; on allocation failure dst is left as it was. */
PHOTOFX_API void make_gaussian_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth,
                                    int32_t width, int32_t height, int32_t level);
/* Aperture blur of a working image (byte 0 read as blue, byte 2 as red); src and dst distinct. */
PHOTOFX_API void make_lens_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth,
                                int32_t width, int32_t height, int32_t level);
/* Scales a blurred sw x sh working image up into dst through the depth map; pixels with a
 * nonzero mask byte (every pixel while `all` is 1) are recomputed. dst may be src. A working
 * side under 2 or over 2048 samples gives a copy of src; an sw x sh beyond 536,870,911 samples
 * writes nothing. */
PHOTOFX_API void run_blur(const uint32_t* src, const uint8_t* blur, const uint8_t* mask,
                          const uint8_t* depth, uint32_t* dst, int32_t width, int32_t height,
                          int32_t sw, int32_t sh);

/* Tilt-shift: rows within half_height of the centre row stay sharp; the blur fades in over half
 * the distance from the band to the farther image edge. A band that leaves less than two rows
 * to fade over keeps the whole image sharp. */
PHOTOFX_API void initTiltShift(const uint32_t* src, int32_t width, int32_t height);
PHOTOFX_API void makeTiltShift(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                               int32_t centre, int32_t half_height);
PHOTOFX_API void applyTiltShift(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                int32_t centre, int32_t half_height);
PHOTOFX_API void destroyTiltShift(void);

/* Builds the tilt-shift workspace (releasing any workspace of either kind). */
PHOTOFX_API void fx_init_tiltshift(const uint32_t* src, int32_t width, int32_t height);
/* Tilt-shift of src into dst from the workspace; does nothing without one. dst may be src. */
PHOTOFX_API void fx_tiltshift_preview(const uint32_t* src, uint32_t* dst, int32_t width,
                                      int32_t height, int32_t centre, int32_t half_height);
/* One-shot tilt-shift with private working copies. dst may be src. */
PHOTOFX_API void fx_apply_tiltshift(const uint32_t* src, uint32_t* dst, int32_t width,
                                    int32_t height, int32_t centre, int32_t half_height);
/* Releases g_ssrc and g_sblur; a blur workspace's depth map stays until fx_destroy_blur. */
PHOTOFX_API void fx_destroy_tiltshift(void);
/* The widest Gaussian blur of a working image, every sample counted. dst may be src. */
PHOTOFX_API void make_tiltshift(const uint8_t* src, uint8_t* dst, int32_t width, int32_t height);
/* Scales a blurred working image up and mixes it with src by each row's sharpness; working
 * sizes are treated as by run_blur. */
PHOTOFX_API void restore_tiltshift(const uint32_t* src, const uint8_t* blur, uint32_t* dst,
                                   int32_t width, int32_t height, int32_t sw, int32_t sh,
                                   int32_t centre, int32_t half_height);
/* Widest lens blur of a working image whose luma leans toward each sample's own near the band. */
PHOTOFX_API void make_tiltshift_lens(const uint8_t* src, uint8_t* dst, int32_t width,
                                     int32_t height, int32_t centre, int32_t half_height);

/* ---- Sharpen: each channel pushed away from the mean of its left and right neighbours ----- */

/* Sharpens the whole image; dst may be src. Writes nothing if its scratch image is refused. */
PHOTOFX_API void fx_apply_sharpen_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                      int32_t height);
/* Sharpens the pixels whose mask byte is 1 (valid bounds only choose that mode, they do not
 * limit it) or every pixel (empty bounds); level is ignored; the mask is never written. */
PHOTOFX_API void fx_apply_sharpen(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                  int32_t width, int32_t height, int32_t level, int32_t left,
                                  int32_t right, int32_t top, int32_t bottom);
/* Entry point of fx_apply_sharpen. */
PHOTOFX_API void applySharpen(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                              int32_t width, int32_t height, int32_t level, int32_t left,
                              int32_t right, int32_t top, int32_t bottom);

/* ---- Pixelize and red-eye: blocks of 2^shift pixels anchored at the origin, shift 0..31 --- */

/* Every pixel takes the top-left pixel of its block; dst may be src. Other shifts: no-op. */
PHOTOFX_API void applyPixelize(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                               int32_t shift);
/* Pixelizes img in place inside the closed disc of the given centre and radius. */
PHOTOFX_API void rubPixelize(uint32_t* img, int32_t width, int32_t height, int32_t shift,
                             int32_t cx, int32_t cy, int32_t radius);
/* Darkens, in place, the red of pixels with 2 x red > 5 x green in the square cx, cy +- radius. */
PHOTOFX_API void removeRedeye(uint32_t* img, int32_t width, int32_t height, int32_t cx, int32_t cy,
                              int32_t radius);
/* The implementations the three entry points above forward to. */
PHOTOFX_API void fx_apply_pixelize(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height, int32_t shift);
PHOTOFX_API void fx_rub_pixelize(uint32_t* img, int32_t width, int32_t height, int32_t shift,
                                 int32_t cx, int32_t cy, int32_t radius);
PHOTOFX_API void fx_remove_redeye(uint32_t* img, int32_t width, int32_t height, int32_t cx,
                                  int32_t cy, int32_t radius);

/* ---- Greyscale: mean of the channels times a gain, level 10 = the mean itself, 0..20 ------ */

/* Full and partial entry points; they forward to fx_control_greyscale_all and _greyscale. */
PHOTOFX_API void controlGreyscale(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                  int32_t level);
PHOTOFX_API void controlGreyscalePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                         int32_t width, int32_t height, int32_t level, int32_t left,
                                         int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API void fx_control_greyscale_all(const uint32_t* src, uint32_t* dst, int32_t width,
                                          int32_t height, int32_t level);
PHOTOFX_API void fx_control_greyscale(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                      int32_t width, int32_t height, int32_t level, int32_t left,
                                      int32_t right, int32_t top, int32_t bottom);

/* ---- Sepia: red lifted and blue lowered by two fixed curves; returns a result code -------- */

/* Full variant (dst may be src) and partial variant; null src or dst: invalid argument. */
PHOTOFX_API int32_t fx_apply_sepia(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height);
PHOTOFX_API int32_t fx_apply_sepia_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                           int32_t width, int32_t height, int32_t left,
                                           int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API int32_t fx_get_sepia_r(int32_t value); /* red curve; values outside 0..255 as given */
PHOTOFX_API int32_t fx_get_sepia_b(int32_t value); /* blue curve; values outside 0..255 as given */

/* ---- Tone curves: channel selector 0 all colour channels, 1 red, 2 green, 3 blue ----------
 * Any other selector copies the pixels unchanged. Alpha is kept; dst may be src. */

/* Each selected channel c becomes 255 (c / 255)^(1 / gamma), rounded half up. Gammas that are
 * zero, negative or NaN still give a curve within 0..255. */
PHOTOFX_API void control_gamma(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                               int32_t channel, double gamma);
/* Stretches low..high to 0..255; high <= low writes nothing. */
PHOTOFX_API void changeHistogramByInput(const uint32_t* src, uint32_t* dst, int32_t width,
                                        int32_t height, int32_t channel, int32_t low, int32_t high);
/* Squeezes 0..255 into low..high; high <= low writes nothing. */
PHOTOFX_API void changeHistogramByOutput(const uint32_t* src, uint32_t* dst, int32_t width,
                                         int32_t height, int32_t channel, int32_t low,
                                         int32_t high);

/* ---- Vignette: darkens toward the borders around (width >> 1, height >> 1); dst may be src - */

/* floor(2^24 / k^2), entry 0 equal to entry 1; larger previews use the same rule beyond 255. */
PHOTOFX_API extern const int32_t LUT_VIGNETTE[256];
/* To 9/16 at the middle of each border, about 1/8 in the corners. An image narrower or lower
 * than 2 pixels comes out as its source. */
PHOTOFX_API void fx_apply_vignette(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height);
/* Table-based and steeper: 1/2 at the middle of each border, about 0 in the corners. */
PHOTOFX_API void fx_apply_vignette_prev(const uint32_t* src, uint32_t* dst, int32_t width,
                                        int32_t height);

/* ---- Vintage: faded warm film look ending in the vignette ---------------------------------- */

PHOTOFX_API extern const int32_t LUT_VINTAGE[256]; /* the preview's S-shaped tone curve */
PHOTOFX_API void applyVintage(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
PHOTOFX_API void applyVintagePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                     int32_t width, int32_t height, int32_t left, int32_t right,
                                     int32_t top, int32_t bottom);
/* The full look, 22 passes; dst may be src. */
PHOTOFX_API void fx_apply_vintage(const uint32_t* src, uint32_t* dst, int32_t width,
                                  int32_t height);
/* The full look at the selected pixels inside the bounds, the source at the others there; dst
 * outside the bounds is not written. Empty bounds give the full look everywhere. */
PHOTOFX_API void fx_apply_vintage_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                          int32_t width, int32_t height, int32_t left,
                                          int32_t right, int32_t top, int32_t bottom);
/* One-pass stand-in for previews: tone table, green lift, blue cut, table vignette. */
PHOTOFX_API void fx_apply_vintage_prev(const uint32_t* src, uint32_t* dst, int32_t width,
                                       int32_t height);

/* ---- Old photo: sepia, flattened contrast and vignette; or a warm tone with a texture ------ */

/* (v - 128) / 10 rounded away from zero; each channel moves twice this toward 128. */
PHOTOFX_API extern const int32_t LUT_OLDPHOTO[256];
PHOTOFX_API void applyOldPhoto(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
PHOTOFX_API void applyOldPhotoPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                      int32_t width, int32_t height, int32_t left, int32_t right,
                                      int32_t top, int32_t bottom);
/* The plain look; dst may be src. */
PHOTOFX_API void fx_apply_oldphoto(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height);
/* Valid bounds only switch the mask on: every pixel of the image with mask byte 1 gets the
 * look, every other pixel the source. Empty bounds: the look everywhere. dst may be src. */
PHOTOFX_API void fx_apply_oldphoto_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                           int32_t width, int32_t height, int32_t left,
                                           int32_t right, int32_t top, int32_t bottom);
/* Colour tone at hue 14, then a quarter of the texture mixed in; fully transparent pixels keep
 * the toned colour unmixed. dst may be src or texture. */
PHOTOFX_API void fx_apply_oldphoto_texture(const uint32_t* src, uint32_t* dst,
                                           const uint32_t* texture, int32_t width, int32_t height);
/* Writes the textured look at the selected pixels inside the bounds and nothing else; empty
 * bounds write it everywhere. Note the order: dst and texture come before the mask. */
PHOTOFX_API void fx_apply_oldphoto_texture_partial(const uint32_t* src, uint32_t* dst,
                                                   const uint32_t* texture, const uint8_t* mask,
                                                   int32_t width, int32_t height, int32_t left,
                                                   int32_t right, int32_t top, int32_t bottom);

/* ---- Pop art: the half-size image in four quadrants, each in its own colours; dst may be src */

PHOTOFX_API void applyPopArt(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
/* Posterised by brightness into a dark and a light colour per quadrant. */
PHOTOFX_API void fx_apply_popart(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
/* Value kept, saturation raised, hue 45, 300, 180 and 90 degrees by quadrant. */
PHOTOFX_API void fx_apply_popart_prev(const uint32_t* src, uint32_t* dst, int32_t width,
                                      int32_t height);

/* ---- Soft glow: slight blur, bright tones lifted by level 0..100; fx_ return a code --------
 * Levels outside 0..100 and null buffers are refused with nothing written. dst may be src; the
 * in-place call needs two rows of scratch and returns PHOTOFX_OUT_OF_MEMORY without them. */

PHOTOFX_API void applySoftglow(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                               int32_t level);
PHOTOFX_API void applySoftglowPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                      int32_t width, int32_t height, int32_t level, int32_t left,
                                      int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API int32_t fx_softglow(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                int32_t level);
PHOTOFX_API int32_t fx_softglow_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                        int32_t width, int32_t height, int32_t level, int32_t left,
                                        int32_t right, int32_t top, int32_t bottom);

/* ---- Warps: bilinear sampling and fast arctangent ------------------------------------------
 * Bilinear weights run 0..2048 (2048 = a whole pixel). Warp angles are degrees with 19 fraction
 * bits: 0x2D00000 is 90 degrees, 0xB400000 a full turn. */

/* atan(i / 2048) in warp-angle units, rounded to nearest. */
PHOTOFX_API extern const int32_t ATAN[2048];
/* Blends four neighbours with weights fx, fy (held to 0..2048); alpha 255. Stores the result in
 * *out (unless out is null) and returns it; returns 0 and stores nothing if a pixel is null. */
PHOTOFX_API uint32_t Bilinear_Fixed(uint32_t fx, uint32_t fy, const uint32_t* p00,
                                    const uint32_t* p10, const uint32_t* p01, const uint32_t* p11,
                                    uint32_t* out);
/* Angle of the vector (b along 0 degrees, a along 90 degrees), 0 <= result < 0xB400000;
 * INT32_MIN counts as magnitude 2^31. */
PHOTOFX_API uint32_t FATAN2(int32_t a, int32_t b);

/* ---- Mirror: keep one side of a row or column and append its reflection --------------------
 * Ask for the output size with the getters, allocate it, then run the mirror. */

#define MIRROR_VERTICAL 57345    /* 0xE001: reflect across a row; the height changes */
#define MIRROR_HORIZONTAL 57346  /* 0xE002: reflect across a column; the width changes */
#define MIRROR_KEEP_LEFT 57347   /* horizontal: keep columns 0..pos, reflect them rightward */
#define MIRROR_KEEP_RIGHT 57348  /* horizontal: keep columns pos..width-1, reflect them leftward */
#define MIRROR_KEEP_TOP 57349    /* vertical: keep rows 0..pos, reflect them downward */
#define MIRROR_KEEP_BOTTOM 57350 /* vertical: keep rows pos..height-1, reflect them upward */

/* Output width; the width unchanged when pos, mode or axis does not mirror it (or the mirrored
 * width would not fit in 32 bits). */
PHOTOFX_API int32_t fx_get_mirror_out_width(int32_t width, int32_t pos, int32_t mode, int32_t axis);
/* Output height, by the same rules. */
PHOTOFX_API int32_t fx_get_mirror_out_height(int32_t height, int32_t pos, int32_t mode,
                                             int32_t axis);
/* PHOTOFX_INVALID_ARGUMENT (dst untouched) unless pos lies inside the mirrored side, mode fits
 * axis, dst_width and dst_height are the getters' values and the buffers do not overlap. */
PHOTOFX_API int32_t fx_mirror(const uint32_t* src, int32_t src_width, int32_t src_height,
                              uint32_t* dst, int32_t dst_width, int32_t dst_height, int32_t pos,
                              int32_t mode, int32_t axis);
PHOTOFX_API int32_t getMirrorOutwidth(int32_t width, int32_t pos, int32_t mode, int32_t axis);
PHOTOFX_API int32_t getMirrorOutheight(int32_t height, int32_t pos, int32_t mode, int32_t axis);
PHOTOFX_API int32_t runMirror(const uint32_t* src, int32_t src_width, int32_t src_height,
                              uint32_t* dst, int32_t dst_width, int32_t dst_height, int32_t pos,
                              int32_t mode, int32_t axis);

/* ---- Sphericity and twirl --------------------------------------------------------------------
 * Both copy src to dst and warp the pixels of the window (left..right, top..bottom, clipped to
 * the image) that fall inside their circle around (cx, cy); warped pixels get alpha 255. A
 * non-zero `fast` computes every second pixel of every second row from the window's corner and
 * fills the whole 2 x 2 block right of and below each: past an odd-sized window's last column
 * or row by one, never beyond the image.
 * They return PHOTOFX_INVALID_ARGUMENT, writing nothing, for a null or overlapping buffer, a
 * centre outside the image or a radius, level or angle out of range. */

/* Falloff of the sphericity with the squared distance, 26 fraction bits; index 256 reads as 0. */
PHOTOFX_API extern const int32_t EXP_n7[256];
/* Bulges (level 1..100) or pinches (level -100..-1) a circle of about 1.4 x radius. */
PHOTOFX_API int32_t fx_sphericity(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                                  int32_t cx, int32_t cy, int32_t radius, int32_t level,
                                  int32_t left, int32_t right, int32_t top, int32_t bottom,
                                  uint32_t fast);
PHOTOFX_API void runSphericity(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                               int32_t cx, int32_t cy, int32_t radius, int32_t level, int32_t left,
                               int32_t right, int32_t top, int32_t bottom, uint32_t fast);

/* 256 x sqrt(u), rounded, for the normalised squared distance u in steps of 1, 4, 8 and 64. */
PHOTOFX_API extern const int32_t SQRT_STEP_1[128];   /* u = j */
PHOTOFX_API extern const int32_t SQRT_STEP_2[480];   /* u = 4 (j + 32) */
PHOTOFX_API extern const int32_t SQRT_STEP_3[768];   /* u = 8 (j + 256) */
PHOTOFX_API extern const int32_t SQRT_STEP_4[65536]; /* u = 64 j */
/* 32768 x sin(2 pi k / 16384), rounded: a quarter wave. */
PHOTOFX_API extern const int32_t SIN[4097];
/* Turns the circle of `radius` by `angle` degrees (-360..360) at the centre, falling to 0 at
 * the rim. */
PHOTOFX_API int32_t fx_twirl(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                             int32_t cx, int32_t cy, int32_t radius, int32_t angle, int32_t left,
                             int32_t right, int32_t top, int32_t bottom, uint32_t fast);
PHOTOFX_API void runTwirl(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height,
                          int32_t cx, int32_t cy, int32_t radius, int32_t angle, int32_t left,
                          int32_t right, int32_t top, int32_t bottom, uint32_t fast);

/* ---- Preset looks: fixed chains of the slider adjustments -----------------------------------
 * The partial variants run the full look into a scratch image and, inside the bounds (clipped to
 * the image), copy the look's pixel where the mask byte is 1 and the source pixel elsewhere;
 * pixels outside the bounds are not written. Empty bounds (left > right or top > bottom) write
 * the whole look without reading the mask. Nothing is written when the scratch image cannot be
 * allocated. dst may be src. Downlight runs auto adjust as its second pass and so follows the
 * auto-adjust parameters below. */

PHOTOFX_API void applyRetro(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
PHOTOFX_API void applyRetroPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                   int32_t width, int32_t height, int32_t left, int32_t right,
                                   int32_t top, int32_t bottom);
PHOTOFX_API void applySunshine(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
PHOTOFX_API void applySunshinePartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                      int32_t width, int32_t height, int32_t left, int32_t right,
                                      int32_t top, int32_t bottom);
PHOTOFX_API void applyDownlight(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
PHOTOFX_API void applyDownlightPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                       int32_t width, int32_t height, int32_t left, int32_t right,
                                       int32_t top, int32_t bottom);
PHOTOFX_API void applyBluewash(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
PHOTOFX_API void applyBluewashPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                      int32_t width, int32_t height, int32_t left, int32_t right,
                                      int32_t top, int32_t bottom);
PHOTOFX_API void applyNostalgia(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
PHOTOFX_API void applyNostalgiaPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                       int32_t width, int32_t height, int32_t left, int32_t right,
                                       int32_t top, int32_t bottom);
PHOTOFX_API void applyYellowglow(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
PHOTOFX_API void applyYellowglowPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                        int32_t width, int32_t height, int32_t left, int32_t right,
                                        int32_t top, int32_t bottom);

PHOTOFX_API void fx_apply_retro(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);
PHOTOFX_API void fx_apply_retro_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                        int32_t width, int32_t height, int32_t left, int32_t right,
                                        int32_t top, int32_t bottom);
PHOTOFX_API void fx_apply_sunshine(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height);
PHOTOFX_API void fx_apply_sunshine_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                           int32_t width, int32_t height, int32_t left,
                                           int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API void fx_apply_downlight(const uint32_t* src, uint32_t* dst, int32_t width,
                                    int32_t height);
PHOTOFX_API void fx_apply_downlight_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                            int32_t width, int32_t height, int32_t left,
                                            int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API void fx_apply_bluewash(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height);
PHOTOFX_API void fx_apply_bluewash_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                           int32_t width, int32_t height, int32_t left,
                                           int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API void fx_apply_nostalgia(const uint32_t* src, uint32_t* dst, int32_t width,
                                    int32_t height);
PHOTOFX_API void fx_apply_nostalgia_partial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                            int32_t width, int32_t height, int32_t left,
                                            int32_t right, int32_t top, int32_t bottom);
PHOTOFX_API void fx_apply_yellowglow(const uint32_t* src, uint32_t* dst, int32_t width,
                                     int32_t height);
PHOTOFX_API void fx_apply_yellowglow_partial(const uint32_t* src, const uint8_t* mask,
                                             uint32_t* dst, int32_t width, int32_t height,
                                             int32_t left, int32_t right, int32_t top,
                                             int32_t bottom);

/* ---- Auto adjust: tone mapping from the image's lightness histogram --------------------------
 * Images under 150 pixels in either direction get contrast level 12 instead. The four
 * parameters are read at the start of each call; fx_set_hdr must not run during one. A value
 * stored into a parameter directly, outside its range, counts as the nearer end of the range. */

PHOTOFX_API extern int32_t g_HDR_Threshold; /* 0..127, initially 70: bright share (percent) that
                                                selects weight 2 */
PHOTOFX_API extern int32_t g_HDR_CutOff;    /* 0..100, initially 100: top of the tone curve */
PHOTOFX_API extern int32_t g_HDR_Weight1;   /* 300..8196, initially 1000: uniform weight */
PHOTOFX_API extern int32_t g_HDR_Weight2;   /* 300..8196, initially 5120: the same, bright image */

/* PHOTOFX_SUCCESS, or PHOTOFX_INVALID_ARGUMENT for a null buffer or an image too large to
 * address. Needs no memory it cannot do without, so never PHOTOFX_OUT_OF_MEMORY. dst may be src. */
PHOTOFX_API int32_t fx_process_hdr(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height);
PHOTOFX_API int32_t applyAutoAdjust(const uint32_t* src, uint32_t* dst, int32_t width,
                                    int32_t height);
/* Stores each value that lies in its parameter's range; the others are ignored. */
PHOTOFX_API void fx_set_hdr(int32_t threshold, int32_t cutoff, int32_t weight1, int32_t weight2);
PHOTOFX_API int32_t fx_get_threshold_hdr(void);
PHOTOFX_API int32_t fx_get_cutoff_hdr(void);
PHOTOFX_API int32_t fx_get_weight1_hdr(void);
PHOTOFX_API int32_t fx_get_weight2_hdr(void);

#ifdef __cplusplus
} /* extern "C" */
#endif

#endif /* PHOTOFX_H */
