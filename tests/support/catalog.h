// Calling catalogue rows on test buffers: one set of buffers of a size, and the arguments of a
// row's call on them with the shape's usual placement (brush in the middle, warp circle inside
// the image, mirror about the middle, tilt-shift band a little above it).
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "catalog/exports.h"
#include "support/images.h"

namespace pfx::test {

namespace cat = pfx::catalog;
using Bytes = std::vector<uint8_t>;

constexpr uint32_t kUntouched = 0xA5A5A5A5u;
constexpr uint8_t kUntouchedByte = 0x5A;

// Rows that take an image of width x height (or a working image of that size) and write it.
inline bool is_image_call(cat::Shape s) {
  using S = cat::Shape;
  return s != S::kValue && s != S::kMemory && s != S::kTable && s != S::kGlobal &&
         s != S::kSetter && s != S::kRelease && s != S::kMirrorSize;
}

// Rows whose first buffers are src, (mask,) dst of the image: the shapes the bad-input rules of
// the frame cover.
inline bool is_frame_call(cat::Shape s) {
  using S = cat::Shape;
  return s == S::kFull || s == S::kPartial || s == S::kTextureFull || s == S::kTexturePartial;
}

// The blur family, which works on a copy reduced by a power of two from 421 pixels up.
inline bool works_reduced(const cat::Export& e) {
  using S = cat::Shape;
  switch (e.shape) {
    case S::kBlurInit:
    case S::kBlurPreview:
    case S::kTiltInit:
    case S::kTilt:
    case S::kScale:
    case S::kWorking:
    case S::kComposite:
      return true;
    default:
      return e.levels.data() == cat::kBlurLevel;
  }
}

inline bool is_partial(cat::Shape s) {
  return s == cat::Shape::kPartial || s == cat::Shape::kTexturePartial;
}

// The buffers of one call: a photograph-sized source, destination, texture and mask, and a
// working image with its depth map and output for the working-image kernels.
struct Buffers {
  int32_t width, height;
  Pixels src, dst, texture;
  Mask mask;
  Bytes work, work_out, depth;
  cat::Bounds bounds;

  Buffers(int32_t w, int32_t h, uint64_t seed, bool whole = false)
      : width(w),
        height(h),
        src(random_image(w, h, seed)),
        dst(src.size(), kUntouched),
        texture(random_image(w, h, seed + 1)),
        mask(random_mask(w, h, seed + 2)),
        work(src.size() * 3),
        work_out(src.size() * 3, kUntouchedByte),
        depth(src.size()),
        bounds(whole ? cat::Bounds{1, 0, 0, 0} : cat::Bounds{1, w - 2, 1, h - 2}) {
    Rng rng(seed + 3);
    for (uint8_t& b : work) b = static_cast<uint8_t>(rng.word());
    for (uint8_t& b : depth) b = static_cast<uint8_t>(rng.word() & 1);
  }

  // The row's call with `rep`'s levels and the shape's usual placement. In-place shapes (the
  // brushes) edit dst, which then starts as the source.
  cat::Args args(const cat::Export& e, const cat::Rep& rep, bool in_place = false) {
    cat::Args a;
    a.src = in_place ? dst.data() : src.data();
    a.mask = mask.data();
    a.dst = dst.data();
    a.texture = texture.data();
    a.width = width;
    a.height = height;
    for (int i = 0; i < 4; ++i) a.level[i] = rep.v[i];
    a.real = rep.real;
    a.bounds = bounds;
    a.cx = width / 2;
    a.cy = height / 2;
    a.radius = (width < height ? width : height) / 3 + 1;
    a.centre = height * 9 / 20;
    a.half_height = height / 8;
    a.work = work.data();
    a.work_out = work_out.data();
    a.depth = depth.data();
    a.sw = width;
    a.sh = height;
    if (e.shape == cat::Shape::kMirror) {
      // About the middle, so that the output fits the destination.
      const int32_t side = rep.v[1] == MIRROR_VERTICAL ? height : width;
      const bool keep_low = rep.v[0] == MIRROR_KEEP_LEFT || rep.v[0] == MIRROR_KEEP_TOP;
      a.pos = keep_low ? side / 2 - 1 : side - side / 2;
      a.out_width = fx_get_mirror_out_width(width, a.pos, rep.v[0], rep.v[1]);
      a.out_height = fx_get_mirror_out_height(height, a.pos, rep.v[0], rep.v[1]);
    }
    if (e.shape == cat::Shape::kBrush || e.shape == cat::Shape::kDab) dst = src;
    return a;
  }
};

// The typical call's levels: the row's first representative call, or none.
inline cat::Rep typical(const cat::Export& e) { return e.reps.empty() ? cat::Rep{} : e.reps[0]; }

// The row's representative calls; one call without levels for a row that has none.
inline std::span<const cat::Rep> reps_of(const cat::Export& e) {
  static constexpr cat::Rep kNone[1] = {};
  return e.reps.empty() ? std::span<const cat::Rep>(kNone) : e.reps;
}

}  // namespace pfx::test
