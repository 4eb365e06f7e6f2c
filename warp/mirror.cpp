// Mirror: keeps the part of an image on one side of a column or row, that line included, and
// appends its reflection, so the output is symmetric and usually of another size. Hosts ask
// the getters for the output size, allocate it and run the mirror; the mirror refuses any size
// other than the getters', since its copy loops are only inside the buffers for those.
#include <cstdint>

#include "frame/frame.h"
#include "photofx.h"
#include "warp/warp.h"

namespace pfx {
namespace {

// Mirrored size of a side of `size` pixels when the kept part runs from the line at pos to the
// low end (keep_low) or to the high end; -1 when pos is not on the side. The result may not fit
// in 32 bits; callers decide what that means.
constexpr int64_t mirrored_size(int32_t size, int32_t pos, bool keep_low) {
  if (size < 0 || pos < 0 || pos > size - 1) return -1;
  return 2 * (keep_low ? int64_t{pos} + 1 : int64_t{size} - pos);
}

// The size a getter reports: the mirrored size when the axis and mode mirror this side and it
// fits, otherwise the size unchanged.
int32_t reported_size(int32_t size, int32_t pos, int32_t mode, int32_t axis, int32_t own_axis,
                      int32_t keep_low, int32_t keep_high) {
  if (axis != own_axis || (mode != keep_low && mode != keep_high)) return size;
  const int64_t out = mirrored_size(size, pos, mode == keep_low);
  return out < 0 || out > INT32_MAX ? size : static_cast<int32_t>(out);
}

void copy_pixels(uint32_t* to, const uint32_t* from, int32_t count) {
  fx_memcpy(to, from, static_cast<uint32_t>(count) * 4u);
}

}  // namespace
}  // namespace pfx

extern "C" {

int32_t fx_get_mirror_out_width(int32_t width, int32_t pos, int32_t mode, int32_t axis) {
  return pfx::reported_size(width, pos, mode, axis, MIRROR_HORIZONTAL, MIRROR_KEEP_LEFT,
                            MIRROR_KEEP_RIGHT);
}

int32_t fx_get_mirror_out_height(int32_t height, int32_t pos, int32_t mode, int32_t axis) {
  return pfx::reported_size(height, pos, mode, axis, MIRROR_VERTICAL, MIRROR_KEEP_TOP,
                            MIRROR_KEEP_BOTTOM);
}

int32_t fx_mirror(const uint32_t* src, int32_t src_width, int32_t src_height, uint32_t* dst,
                  int32_t dst_width, int32_t dst_height, int32_t pos, int32_t mode, int32_t axis) {
  const bool horizontal = axis == MIRROR_HORIZONTAL;
  if (!horizontal && axis != MIRROR_VERTICAL) return PHOTOFX_INVALID_ARGUMENT;
  const int32_t keep_low = horizontal ? MIRROR_KEEP_LEFT : MIRROR_KEEP_TOP;
  const int32_t keep_high = horizontal ? MIRROR_KEEP_RIGHT : MIRROR_KEEP_BOTTOM;
  if (mode != keep_low && mode != keep_high) return PHOTOFX_INVALID_ARGUMENT;
  if (src == nullptr || dst == nullptr) return PHOTOFX_INVALID_ARGUMENT;

  // The mirrored side must contain pos and come out at exactly the reported size; the other
  // side keeps its size. Anything else would take the copies outside one of the buffers.
  const int32_t W = src_width, H = src_height, DW = dst_width, DH = dst_height;
  const int64_t mirrored = pfx::mirrored_size(horizontal ? W : H, pos, mode == keep_low);
  if (mirrored < 0) return PHOTOFX_INVALID_ARGUMENT;
  if (horizontal ? (DW != mirrored || DH != H) : (DH != mirrored || DW != W)) {
    return PHOTOFX_INVALID_ARGUMENT;
  }
  const int64_t n_src = pfx::pixel_count(W, H), n_dst = pfx::pixel_count(DW, DH);
  if (n_src > pfx::kMaxPixels || n_dst > pfx::kMaxPixels) return PHOTOFX_INVALID_ARGUMENT;
  // Each output row is built from source rows that overlapping buffers may already have
  // overwritten, and overlapping block copies are undefined.
  if (pfx::buffers_overlap(src, n_src, dst, n_dst)) return PHOTOFX_INVALID_ARGUMENT;
  if (n_src == 0) return PHOTOFX_SUCCESS;  // an empty other side: nothing to copy

  const auto src_at = [&](int32_t x, int32_t y) {
    return src + static_cast<size_t>(y) * static_cast<size_t>(W) + static_cast<size_t>(x);
  };
  const auto dst_at = [&](int32_t x, int32_t y) {
    return dst + static_cast<size_t>(y) * static_cast<size_t>(DW) + static_cast<size_t>(x);
  };

  if (horizontal) {
    for (int32_t y = 0; y < DH; ++y) {
      const uint32_t* in = src_at(0, y);
      uint32_t* out = dst_at(0, y);
      if (mode == MIRROR_KEEP_LEFT) {
        pfx::copy_pixels(out, in, pos + 1);
        for (int32_t x = pos + 1; x < DW; ++x) out[x] = in[DW - 1 - x];
      } else {
        for (int32_t x = 0; x < DW / 2; ++x) out[x] = in[W - 1 - x];
        pfx::copy_pixels(out + DW / 2, in + pos, W - pos);
      }
    }
  } else if (mode == MIRROR_KEEP_TOP) {
    for (int32_t r = 0; r < DH; ++r)
      pfx::copy_pixels(dst_at(0, r), src_at(0, r <= pos ? r : DH - 1 - r), W);
  } else {
    for (int32_t r = 0; r < DH; ++r) {
      const int32_t from = r < DH / 2 ? H - 1 - r : pos + (r - DH / 2);
      pfx::copy_pixels(dst_at(0, r), src_at(0, from), W);
    }
  }
  return PHOTOFX_SUCCESS;
}

int32_t getMirrorOutwidth(int32_t width, int32_t pos, int32_t mode, int32_t axis) {
  return fx_get_mirror_out_width(width, pos, mode, axis);
}

int32_t getMirrorOutheight(int32_t height, int32_t pos, int32_t mode, int32_t axis) {
  return fx_get_mirror_out_height(height, pos, mode, axis);
}

int32_t runMirror(const uint32_t* src, int32_t src_width, int32_t src_height, uint32_t* dst,
                  int32_t dst_width, int32_t dst_height, int32_t pos, int32_t mode, int32_t axis) {
  return fx_mirror(src, src_width, src_height, dst, dst_width, dst_height, pos, mode, axis);
}

}  // extern "C"
