// Conformance goldens of auto adjust: the small-image path on the usual inputs and the tone curve
// on the enlarged photograph and on noise, under several settings of the four parameters, into a
// second buffer and in place, with the result codes.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::test::Digest;
using pfx::test::Pixels;

TEST(Conformance, AutoAdjust) {
  struct Params {
    int32_t threshold, cutoff, weight1, weight2;
  };
  constexpr Params kParams[] = {
      {70, 100, 1000, 5120}, {0, 100, 1000, 300}, {127, 100, 8196, 5120},
      {50, 60, 300, 8196},   {70, 0, 1000, 5120}, {30, 1, 4000, 2000},
  };
  const pfx::test::Input inputs[] = {
      pfx::test::enlarged_photo_input(4),
      {"noise 150", 150, 163, pfx::test::random_image(150, 163, 150), {}},
  };
  const int32_t saved[4] = {g_HDR_Threshold, g_HDR_CutOff, g_HDR_Weight1, g_HDR_Weight2};
  Digest d;
  for (const Params& p : kParams) {
    fx_set_hdr(p.threshold, p.cutoff, p.weight1, p.weight2);
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      d.add(int64_t{fx_process_hdr(s, o, w, h)});
    });
    for (const pfx::test::Input& in : inputs) {
      Pixels out(in.pixels.size(), 0xA5A5A5A5u);
      d.add(int64_t{fx_process_hdr(in.pixels.data(), out.data(), in.width, in.height)});
      d.add(out);
      Pixels in_place = in.pixels;
      d.add(int64_t{fx_process_hdr(in_place.data(), in_place.data(), in.width, in.height)});
      d.add(in_place);
    }
  }
  g_HDR_Threshold = saved[0], g_HDR_CutOff = saved[1];
  g_HDR_Weight1 = saved[2], g_HDR_Weight2 = saved[3];
  EXPECT_GOLDEN("auto adjust", d, 0x6e85764867e3e661ull);
}

}  // namespace
