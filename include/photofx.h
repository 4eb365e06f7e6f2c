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
 * non-zero `fast` computes every second pixel and fills 2 x 2 blocks, never beyond the window.
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

#ifdef __cplusplus
} /* extern "C" */
#endif

#endif /* PHOTOFX_H */
