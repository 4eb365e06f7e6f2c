/* A minimal host: builds a gradient image, brightens it, then raises the contrast of a
 * rectangle selected through a mask, and prints a checksum of each result. */
#include <stdio.h>
#include <stdlib.h>

#include "photofx.h"

static uint32_t checksum(const uint32_t* px, size_t n) {
  uint32_t h = 2166136261u; /* FNV-1a over pixel words */
  for (size_t i = 0; i < n; ++i) {
    h = (h ^ px[i]) * 16777619u;
  }
  return h;
}

int main(void) {
  const int32_t width = 640, height = 480;
  const size_t n = (size_t)width * (size_t)height;
  uint32_t* src = malloc(n * sizeof *src);
  uint32_t* dst = malloc(n * sizeof *dst);
  uint8_t* mask = calloc(n, 1);
  if (!src || !dst || !mask) {
    fprintf(stderr, "out of memory\n");
    return 1;
  }
  for (int32_t y = 0; y < height; ++y) {
    for (int32_t x = 0; x < width; ++x) {
      const uint32_t r = (uint32_t)(x * 255 / (width - 1));
      const uint32_t g = (uint32_t)(y * 255 / (height - 1));
      const uint32_t b = (uint32_t)((x + y) * 255 / (width + height - 2));
      src[(size_t)y * (size_t)width + (size_t)x] = 0xFF000000u | r << 16 | g << 8 | b;
    }
  }

  controlBrightness(src, dst, width, height, 14);
  printf("brightness 14 on %dx%d: checksum %08x\n", (int)width, (int)height,
         (unsigned)checksum(dst, n));

  for (int32_t y = 100; y < 300; ++y) {
    for (int32_t x = 200; x < 500; ++x) mask[(size_t)y * (size_t)width + (size_t)x] = 1;
  }
  controlContrastPartial(src, mask, dst, width, height, 18, 150, 550, 50, 350);
  printf("contrast 18 inside the selection: checksum %08x\n", (unsigned)checksum(dst, n));

  free(src);
  free(dst);
  free(mask);
  return 0;
}
