/* A minimal host of the library, in plain C99 with no other dependency: it makes a picture in
 * memory, brightens all of it, raises the contrast inside a round selection, blurs the rest
 * through a preview session, and writes the result as a binary PPM file.
 *
 *   host_example [OUT.ppm]     (default: photofx-host.ppm)
 *
 * It prints a checksum of each preview, the same on every platform. */
#include <stdio.h>
#include <stdlib.h>

#include "photofx.h"

/* FNV-1a over the pixel words, most significant byte first. */
static uint32_t checksum(const uint32_t* px, size_t n) {
  uint32_t h = 2166136261u;
  for (size_t i = 0; i < n; ++i) {
    for (int shift = 24; shift >= 0; shift -= 8) h = (h ^ ((px[i] >> shift) & 0xFFu)) * 16777619u;
  }
  return h;
}

/* Binary PPM: a header, then red, green and blue bytes per pixel (alpha has no place in it). */
static int write_ppm(const char* path, const uint32_t* px, int32_t width, int32_t height) {
  FILE* f = fopen(path, "wb");
  if (!f) return 0;
  fprintf(f, "P6\n%d %d\n255\n", (int)width, (int)height);
  for (size_t i = 0; i < (size_t)width * (size_t)height; ++i) {
    const unsigned char rgb[3] = {(unsigned char)(px[i] >> 16), (unsigned char)(px[i] >> 8),
                                  (unsigned char)px[i]};
    fwrite(rgb, 1, 3, f);
  }
  return fclose(f) == 0;
}

int main(int argc, char** argv) {
  const char* out_path = argc > 1 ? argv[1] : "photofx-host.ppm";
  const int32_t width = 320, height = 200;
  const size_t n = (size_t)width * (size_t)height;
  uint32_t* src = malloc(n * sizeof *src);
  uint32_t* work = malloc(n * sizeof *work);
  uint32_t* dst = malloc(n * sizeof *dst);
  uint8_t* mask = calloc(n, 1);
  int status = 1;
  if (!src || !work || !dst || !mask) {
    fprintf(stderr, "host_example: out of memory\n");
    goto done;
  }

  /* The picture: soft colour gradients, opaque. Pixels are 0xAARRGGBB words, row after row. */
  for (int32_t y = 0; y < height; ++y) {
    for (int32_t x = 0; x < width; ++x) {
      const uint32_t r = (uint32_t)(40 + x * 170 / (width - 1));
      const uint32_t g = (uint32_t)(60 + y * 150 / (height - 1));
      const uint32_t b = (uint32_t)(200 - (x + y) * 150 / (width + height - 2));
      src[(size_t)y * (size_t)width + (size_t)x] = 0xFF000000u | r << 16 | g << 8 | b;
    }
  }

  /* A full variant: the whole image, four slider steps brighter (10 is neutral). */
  controlBrightness(src, work, width, height, 14);

  /* A partial variant: more contrast where the mask byte is 1, here a disc of radius 60 in the
   * middle. The bounds name the rectangle around the selection (inclusive). */
  const int32_t cx = width / 2, cy = height / 2, radius = 60;
  for (int32_t y = cy - radius; y <= cy + radius; ++y) {
    for (int32_t x = cx - radius; x <= cx + radius; ++x) {
      const int32_t dx = x - cx, dy = y - cy;
      if (dx * dx + dy * dy <= radius * radius) mask[(size_t)y * (size_t)width + (size_t)x] = 1;
    }
  }
  controlContrastPartial(work, mask, dst, width, height, 18, cx - radius, cx + radius, cy - radius,
                         cy + radius);
  printf("host_example: %dx%d, brightness 14, contrast 18 in a disc: checksum %08lx\n", (int)width,
         (int)height, (unsigned long)checksum(dst, n));

  /* A blur preview session, as an editor runs one behind a slider: the workspace is built once
   * from the picture and a selection (here everything outside the disc), then each slider
   * position costs one preview call; the last one shown is kept. Bounds around the whole image
   * select masked mode, so only pixels whose mask byte is nonzero are blurred. */
  for (size_t i = 0; i < n; ++i) mask[i] = (uint8_t)(mask[i] == 0);
  fx_Init_blur(dst, mask, width, height, 0, width - 1, 0, height - 1);
  for (int32_t level = 1; level <= 5; level += 2) {
    fx_make_blur_preview(dst, mask, work, width, height, level);
    printf("host_example: blur preview at level %d: checksum %08lx\n", (int)level,
           (unsigned long)checksum(work, n));
  }
  fx_destroy_blur();

  if (!write_ppm(out_path, work, width, height)) {
    fprintf(stderr, "host_example: cannot write %s\n", out_path);
    goto done;
  }
  printf("host_example: wrote %s\n", out_path);
  status = 0;

done:
  free(src);
  free(work);
  free(dst);
  free(mask);
  return status;
}
