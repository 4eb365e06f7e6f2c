// Fuzz target: greyscale and sepia, full and partial, with their result codes.
#include "fuzz/harness.h"
#include "photofx.h"

namespace {

using namespace pfx::fuzz;
using pfx::Rect;

void sepia(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider&) {
    const bool refused = !s || !d || too_large(z);
    FUZZ_CHECK(fx_apply_sepia(s, d, z.width, z.height) ==
               (refused ? PHOTOFX_INVALID_ARGUMENT : PHOTOFX_SUCCESS));
  });
}

void sepia_partial(FuzzedDataProvider& in) {
  partial_variant(in, [](const uint32_t* s, const uint8_t* m, uint32_t* d, Size z, Rect b,
                         FuzzedDataProvider&) {
    const bool refused = !s || !d || (pfx::is_region(b) && !m) || too_large(z);
    FUZZ_CHECK(
        fx_apply_sepia_partial(s, m, d, z.width, z.height, b.left, b.right, b.top, b.bottom) ==
        (refused ? PHOTOFX_INVALID_ARGUMENT : PHOTOFX_SUCCESS));
  });
}

void curves(FuzzedDataProvider& in) {
  const int32_t v = pick_level(in, -300, 600);
  const int32_t r = fx_get_sepia_r(v), b = fx_get_sepia_b(v);
  if (v >= 0 && v <= 255) {
    FUZZ_CHECK(r >= v && r <= 255 && b <= v && b >= 0);
  } else {
    FUZZ_CHECK(r == v && b == v);
  }
}

const Op kOps[] = {
    {"greyscale", full_level<controlGreyscale>},
    {"greyscale partial", partial_level<controlGreyscalePartial>},
    {"sepia", sepia},
    {"sepia partial", sepia_partial},
    {"curves", curves},
    {"fx greyscale", full_level<fx_control_greyscale_all>},
    {"fx greyscale partial", partial_level<fx_control_greyscale>},
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return run_one(kOps, data, size);
}
