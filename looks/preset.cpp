// Preset compositing, shared by every look that is a chain of full-image passes.
#include "looks/preset.h"

#include <cstddef>
#include <cstdint>

#include "frame/frame.h"
#include "photofx.h"

namespace pfx {

void composite_preset(FullLook look, const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                      int32_t width, int32_t height, Rect bounds) {
  if (look == nullptr || !partial_args_ok(src, mask, dst, width, height, bounds)) return;
  const int64_t n = pixel_count(width, height);
  if (n == 0) return;
  auto* scratch = static_cast<uint32_t*>(fx_calloc(static_cast<uint32_t>(n), 4));
  if (scratch == nullptr) return;
  look(src, scratch, width, height);

  if (is_region(bounds)) {
    // Unlike the adjustments' partial frame there is no initial copy: pixels outside the
    // rectangle keep whatever dst held.
    const Rect r = clip_to_image(bounds, width, height);
    for (int32_t y = r.top; y <= r.bottom; ++y) {
      const size_t row = static_cast<size_t>(y) * static_cast<size_t>(width);
      for (int32_t x = r.left; x <= r.right; ++x) {
        const size_t i = row + static_cast<size_t>(x);
        dst[i] = mask[i] == 1 ? scratch[i] : src[i];
      }
    }
  } else {
    fx_memcpy(dst, scratch, static_cast<uint32_t>(n * 4));
  }
  fx_free(scratch);
}

}  // namespace pfx
