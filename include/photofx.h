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

/* ---- Memory wrappers: every allocation, fill and whole-image copy of the library ---------- */

PHOTOFX_API void* fx_calloc(uint32_t count, uint32_t size); /* zero-filled; null on failure */
PHOTOFX_API void* fx_malloc(uint32_t count, uint32_t size); /* null when count x size overflows */
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

/* ---- Brightness and contrast: level 0..20, 10 leaves the image as it is ------------------- */

PHOTOFX_API void controlBrightness(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height, int32_t level);
PHOTOFX_API void controlBrightnessPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                          int32_t width, int32_t height, int32_t level,
                                          int32_t left, int32_t right, int32_t top, int32_t bottom);
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

/* ---- Saturation and temperature: level 0..20, 10 neutral ---------------------------------- */

/* Level 0 is grey, 20 about doubles each colour's distance from grey. */
PHOTOFX_API void controlSaturation(const uint32_t* src, uint32_t* dst, int32_t width,
                                   int32_t height, int32_t level);
PHOTOFX_API void controlSaturationPartial(const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                                          int32_t width, int32_t height, int32_t level,
                                          int32_t left, int32_t right, int32_t top, int32_t bottom);
/* Above 10 warmer (less blue, more red), below 10 cooler. */
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

#ifdef __cplusplus
} /* extern "C" */
#endif

#endif /* PHOTOFX_H */
