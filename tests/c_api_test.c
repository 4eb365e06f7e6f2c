/* A C99 host: includes the public header, links the shared library and calls it. */
#include <stdio.h>

#include "photofx.h"

int main(void) {
  uint32_t src[4] = {0xFF808080u, 0x80FFFFFFu, 0xFF000000u, 0xFFFFFFFFu};
  uint32_t dst[4] = {0};
  uint8_t mask[4] = {1, 0, 1, 2};
  int failures = 0;

  controlBrightness(src, dst, 2, 2, 20);
  if (dst[0] != 0xFFE4E4E4u || dst[1] != 0x80FFFFFFu) {
    printf("controlBrightness: %08x %08x\n", (unsigned)dst[0], (unsigned)dst[1]);
    ++failures;
  }

  controlContrastPartial(src, mask, dst, 2, 2, 0, 0, 1, 0, 1);
  if (dst[0] != 0xFF808080u || dst[1] != src[1] || dst[2] != 0xFF808080u || dst[3] != src[3]) {
    printf("controlContrastPartial: %08x %08x %08x %08x\n", (unsigned)dst[0], (unsigned)dst[1],
           (unsigned)dst[2], (unsigned)dst[3]);
    ++failures;
  }

  if (fx_pack_rgb888(0x12345678u, 0x1AB, 0xCD, 0xEF) != 0x12ABCDEFu || LUT_DELTA[3] != 21845u ||
      fixmul(0x18000, 0x18000) != 0x24000 || PHOTOFX_INVALID_ARGUMENT != 40962 ||
      _cos_tbl[256] != -65536 || fixatan2(1, -1) != 0x600000 || log_e_FIX_new(2048) != 727040) {
    printf("packing, tables or fixed point differ\n");
    ++failures;
  }
  return failures == 0 ? 0 : 1;
}
