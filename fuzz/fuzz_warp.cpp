// Fuzz target: the warps. Mirror with every mode, axis and position and with destination sizes
// that are usually, but not always, the getters'; sphericity and twirl with centres, radii,
// strengths and windows anywhere in 32 bits, in normal and fast mode, into a second buffer or in
// place; and the two building blocks.
#include "fuzz/harness.h"
#include "photofx.h"

namespace {

using namespace pfx::fuzz;
using pfx::Rect;

void bilinear(FuzzedDataProvider& in) {
  uint32_t px[4];
  for (uint32_t& p : px) p = in.ConsumeIntegral<uint32_t>();
  const uint32_t fx = in.ConsumeBool() ? in.ConsumeIntegralInRange<uint32_t>(0, 2048)
                                       : in.ConsumeIntegral<uint32_t>();
  const uint32_t fy = in.ConsumeIntegral<uint32_t>();
  const int missing = in.ConsumeIntegralInRange<int>(0, 7);  // 4..7: all present
  const uint32_t* p[4] = {&px[0], &px[1], &px[2], &px[3]};
  if (missing < 4) p[missing] = nullptr;
  uint32_t out = 0x0BADF00Du;
  const uint32_t r = Bilinear_Fixed(fx, fy, p[0], p[1], p[2], p[3], &out);
  FUZZ_CHECK(missing < 4 ? (r == 0 && out == 0x0BADF00Du) : (r == out && r >> 24 == 0xFF));
}

void fatan2(FuzzedDataProvider& in) {
  const int32_t a = pick_level(in, -70000, 70000), b = pick_level(in, -70000, 70000);
  FUZZ_CHECK(FATAN2(a, b) < 0xB400000u);
}

void mirror(FuzzedDataProvider& in) {
  Images im(in);
  const int32_t mode = in.ConsumeBool() ? in.ConsumeIntegralInRange<int32_t>(MIRROR_VERTICAL - 1,
                                                                             MIRROR_KEEP_BOTTOM + 1)
                                        : in.ConsumeIntegral<int32_t>();
  const int32_t axis = in.PickValueInArray({MIRROR_VERTICAL, MIRROR_HORIZONTAL, MIRROR_VERTICAL,
                                            MIRROR_HORIZONTAL, 0, MIRROR_KEEP_LEFT});
  const int32_t pos = pick_coord(in, axis == MIRROR_VERTICAL ? im.size.height : im.size.width);
  const bool entry = in.ConsumeBool();
  int32_t dw =
      (entry ? getMirrorOutwidth : fx_get_mirror_out_width)(im.size.width, pos, mode, axis);
  int32_t dh =
      (entry ? getMirrorOutheight : fx_get_mirror_out_height)(im.size.height, pos, mode, axis);
  if (in.ConsumeIntegralInRange<int>(0, 7) == 0) dw = pick_coord(in, dw);
  if (in.ConsumeIntegralInRange<int>(0, 7) == 0) dh = pick_coord(in, dh);
  // A buffer as large as the sizes claim, unless they claim more than any call may use.
  const int64_t n = pfx::pixel_count(dw, dh);
  Pixels dst(n <= 4096 ? static_cast<size_t>(n) : 16, 0xD5D5D5D5u);
  const std::vector<uint32_t> before = dst.contents();
  uint32_t* d = im.null_dst ? nullptr : dst.data();
  const int32_t code = (entry ? runMirror : fx_mirror)(im.s(), im.size.width, im.size.height, d, dw,
                                                       dh, pos, mode, axis);
  im.check();
  FUZZ_CHECK(dst.guards_intact());
  if (code != PHOTOFX_SUCCESS) {
    FUZZ_CHECK(code == PHOTOFX_INVALID_ARGUMENT);
    FUZZ_CHECK(dst.contents() == before);
  } else {
    FUZZ_CHECK(!im.null_src && !im.null_dst && n <= 4096);
  }
}

// Sphericity or twirl: Fn(src, dst, w, h, cx, cy, radius, strength, window..., fast). Now and
// then through the entry point Entry, which returns nothing and must write what Fn writes.
template <auto Fn, auto Entry>
void circle_warp(FuzzedDataProvider& in, int32_t lo, int32_t hi) {
  Images im(in);
  const int32_t cx = pick_coord(in, im.size.width), cy = pick_coord(in, im.size.height);
  const int32_t radius = pick_level(in, -2, 40), strength = pick_level(in, lo, hi);
  const Rect b = pick_bounds(in, im.size);
  const uint32_t fast = in.ConsumeIntegralInRange<uint32_t>(0, 2);
  const bool in_place = !im.null_src && in.ConsumeIntegralInRange<int>(0, 7) == 0;
  const std::vector<uint32_t> before = im.dst.contents();
  uint32_t* d = in_place ? im.src.data() : im.d();
  const bool entry = in.ConsumeIntegralInRange<int>(0, 3) == 0;
  Pixels twin(im.dst.size(), 0xD5D5D5D5u);
  if (entry && !in_place) {
    Entry(im.s(), d, im.size.width, im.size.height, cx, cy, radius, strength, b.left, b.right,
          b.top, b.bottom, fast);
    d = d == nullptr ? nullptr : twin.data();
  }
  const int32_t code = Fn(im.s(), d, im.size.width, im.size.height, cx, cy, radius, strength,
                          b.left, b.right, b.top, b.bottom, fast);
  if (entry && !in_place) FUZZ_CHECK(twin.guards_intact() && twin.contents() == im.dst.contents());
  if (in_place) {
    // Always refused; check() compares the source, so it proves nothing was written.
    FUZZ_CHECK(code == PHOTOFX_INVALID_ARGUMENT);
    im.check_untouched(before);
    return;
  }
  if (code != PHOTOFX_SUCCESS) {
    FUZZ_CHECK(code == PHOTOFX_INVALID_ARGUMENT);
    im.check_untouched(before);
  } else {
    FUZZ_CHECK(!im.null_src && !im.null_dst && !too_large(im.size));
    im.check();
  }
}

const Op kOps[] = {
    {"Bilinear_Fixed", bilinear},
    {"FATAN2", fatan2},
    {"mirror", mirror},
    {"sphericity",
     [](FuzzedDataProvider& in) { circle_warp<fx_sphericity, runSphericity>(in, -120, 120); }},
    {"twirl", [](FuzzedDataProvider& in) { circle_warp<fx_twirl, runTwirl>(in, -400, 400); }},
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return run_one(kOps, data, size);
}
