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

}  // namespace pfx
