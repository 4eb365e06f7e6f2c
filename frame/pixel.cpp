// Channel packing, exported for hosts; the library's own loops use the inline forms of pixel.h.
#include "frame/pixel.h"

#include "photofx.h"

extern "C" {

void fx_unpack_rgb888(int32_t pixel, int32_t* r, int32_t* g, int32_t* b) {
  const uint32_t p = static_cast<uint32_t>(pixel);
  if (r) *r = pfx::red_of(p);
  if (g) *g = pfx::green_of(p);
  if (b) *b = pfx::blue_of(p);
}

uint32_t fx_pack_rgb888(uint32_t pixel, int32_t r, int32_t g, int32_t b) {
  return pfx::pack(pixel, r, g, b);
}

}  // extern "C"
