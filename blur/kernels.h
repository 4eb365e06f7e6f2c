// The NEON kernels of the blur family (blur/blur_neon.cpp); in other builds, stubs that leave
// the work to the portable loops (frame/kernel.h).
#pragma once

#include <cstddef>
#include <cstdint>

#include "blur/gaussian.h"
#include "frame/kernel.h"

namespace pfx::neon {

// One line of the Gaussian (gaussian.cpp's blur_line): the outputs 0 .. returned - 1. clean says
// that every sample the line's taps read is inside the area.
PFX_NEON_KERNEL(size_t blur_line(int32_t, const Taps&, const uint8_t*, const uint8_t*,
                                 const uint8_t*, uint8_t*, uint8_t*, uint8_t*, bool))

// The column sums of a full-size row (composite.h) as four planes of sw entries: red, green,
// blue and own weight. A null depth counts every sample as inside. Returns false where the path
// has no kernel.
PFX_NEON_KERNEL(bool column_sums(const uint8_t*, const uint8_t*, int32_t, int32_t, int32_t,
                                 uint16_t* const*))

// A whole composited row (composite.h) from those planes: each pixel recomputed when the mask
// is null or its byte is non-zero, the others copied. restore_row mixes the upscaled blur with
// the source by the sharpness weight w (tiltshift.cpp). Both false where they do not apply.
PFX_NEON_KERNEL(bool composite_row(const uint32_t*, const uint8_t*, uint32_t*, int32_t, int32_t,
                                   int32_t, const uint16_t* const*))
PFX_NEON_KERNEL(bool restore_row(const uint32_t*, uint32_t*, int32_t, int32_t, int32_t, int32_t,
                                 const uint16_t* const*))

// The middle of a sharpened row of w >= 2 pixels (sharpen.cpp), in place or not: the pixels from
// column 1 up to the returned column, which the caller goes on from with `left`, the source
// pixel before it.
PFX_NEON_KERNEL(size_t sharpen_row(const uint32_t*, const uint8_t*, uint32_t*, size_t, uint32_t&))

}  // namespace pfx::neon
