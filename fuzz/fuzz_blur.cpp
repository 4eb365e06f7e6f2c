// Fuzz target: sharpen, pixelize and the two brushes, with sizes, shifts, centres and radii
// anywhere in 32 bits.
#include <vector>

#include "fuzz/harness.h"
#include "photofx.h"

namespace {

using namespace pfx::fuzz;
using pfx::Rect;

bool valid_shift(int32_t s) { return s >= 0 && s <= 31; }

int32_t pick_shift(FuzzedDataProvider& in) {
  return in.ConsumeIntegralInRange<int>(0, 7) == 0 ? pick_level(in)
                                                   : in.ConsumeIntegralInRange<int32_t>(0, 6);
}

void sharpen_all(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider&) {
    fx_apply_sharpen_all(s, d, z.width, z.height);
  });
}

void sharpen_partial(FuzzedDataProvider& in) {
  partial_variant(in, [](const uint32_t* s, const uint8_t* m, uint32_t* d, Size z, Rect b,
                         FuzzedDataProvider& p) {
    (p.ConsumeBool() ? applySharpen : fx_apply_sharpen)(s, m, d, z.width, z.height, pick_level(p),
                                                        b.left, b.right, b.top, b.bottom);
  });
}

void pixelize(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider& p) {
    const int32_t shift = pick_shift(p);
    const std::vector<uint32_t> before =
        d ? std::vector<uint32_t>(d, d + z.pixels) : std::vector<uint32_t>();
    (p.ConsumeBool() ? applyPixelize : fx_apply_pixelize)(s, d, z.width, z.height, shift);
    if (d && !valid_shift(shift)) FUZZ_CHECK(std::vector<uint32_t>(d, d + z.pixels) == before);
  });
}

// A brush edits only inside its bounding square cx, cy +- radius; red-eye changes only red.
void brush(FuzzedDataProvider& in) {
  Images im(in);
  const bool redeye = in.ConsumeBool(), entry = in.ConsumeBool();
  const int32_t shift = pick_shift(in);
  const int32_t cx = pick_coord(in, im.size.width), cy = pick_coord(in, im.size.height);
  const int32_t radius = in.ConsumeBool() ? pick_level(in) : in.ConsumeIntegralInRange(-2, 12);
  for (size_t i = 0; i < im.dst.size(); ++i) im.dst.data()[i] = im.src.data()[i];
  uint32_t* img = im.null_dst ? nullptr : im.dst.data();
  if (redeye) {
    (entry ? removeRedeye : fx_remove_redeye)(img, im.size.width, im.size.height, cx, cy, radius);
  } else {
    (entry ? rubPixelize : fx_rub_pixelize)(img, im.size.width, im.size.height, shift, cx, cy,
                                            radius);
  }
  im.check();
  if (img == nullptr || too_large(im.size) ||
      pfx::pixel_count(im.size.width, im.size.height) == 0) {
    FUZZ_CHECK(im.dst.contents() == im.src_before);
    return;
  }
  const int64_t w = im.size.width;
  for (size_t i = 0; i < im.dst.size(); ++i) {
    const uint32_t before = im.src_before[i], after = im.dst.data()[i];
    const int64_t x = static_cast<int64_t>(i) % w, y = static_cast<int64_t>(i) / w;
    const bool inside = radius >= 0 && x >= int64_t{cx} - radius && x <= int64_t{cx} + radius &&
                        y >= int64_t{cy} - radius && y <= int64_t{cy} + radius;
    if (!inside || (!redeye && !valid_shift(shift))) FUZZ_CHECK(after == before);
    if (redeye) FUZZ_CHECK((after & 0xFF00FFFFu) == (before & 0xFF00FFFFu));
  }
}

const Op kOps[] = {
    {"sharpen", sharpen_all},
    {"sharpen partial", sharpen_partial},
    {"pixelize", pixelize},
    {"brush", brush},
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return run_one(kOps, data, size);
}
