// Preset compositing: the partial rule of the one-touch looks. The whole look is made once into
// a scratch image, then the selected pixels are taken from it.
#pragma once

#include <cstdint>

#include "frame/frame.h"

namespace pfx {

// A look's full variant: (src, dst, width, height), dst written in full and allowed to be src.
using FullLook = void (*)(const uint32_t* src, uint32_t* dst, int32_t width, int32_t height);

// Runs `look` on the whole of src into a scratch image. Valid bounds (clipped to the image; a
// rectangle wholly off the image selects nothing) then set each dst pixel inside them to the
// look's pixel where the mask byte is exactly 1 and to the source pixel elsewhere, and leave
// every dst pixel outside them as the caller left it. Empty bounds copy the whole look into dst
// without reading the mask. Writes nothing when a buffer it needs is null, the image is too large
// to address, or the scratch image cannot be allocated. dst may be src.
void composite_preset(FullLook look, const uint32_t* src, const uint8_t* mask, uint32_t* dst,
                      int32_t width, int32_t height, Rect bounds);

// The same pixels for a look that is one rule per pixel (the fused chains), made without the
// scratch image: only the pixels inside the bounds are worked out, the selected ones through
// the rule (and its vector kernel where the path has one), and nothing can fail for want of
// memory.
template <class Rule, class Kernel>
void composite_pixels(const uint32_t* src, const uint8_t* mask, uint32_t* dst, int32_t width,
                      int32_t height, Rect bounds, const Rule& rule, const Kernel& kernel) {
  if (!partial_args_ok(src, mask, dst, width, height, bounds)) return;
  if (!is_region(bounds)) {
    for_each_pixel(src, dst, width, height, rule, kernel);
    return;
  }
  const Rect r = clip_to_image(bounds, width, height);
  if (r.left > r.right || r.top > r.bottom) return;
  edit_rows(src, mask, dst, width, r, rule, kernel, [](size_t) {});
}

}  // namespace pfx
