// Conformance goldens of the preset looks, full and partial. Downlight also runs on the enlarged
// photograph, where its auto-adjust pass works from the tone curve.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::Rect;
using pfx::test::Digest;
using pfx::test::Pixels;

using Full = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t);
using Partial = void (*)(const uint32_t*, const uint8_t*, uint32_t*, int32_t, int32_t, int32_t,
                         int32_t, int32_t, int32_t);

void digest_look(Digest& d, Full full, Partial partial) {
  pfx::test::digest_full(d, full);
  pfx::test::digest_partial(
      d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
        partial(s, m, o, w, h, b.left, b.right, b.top, b.bottom);
      });
}

TEST(Conformance, Downlight) {
  Digest d;
  digest_look(d, fx_apply_downlight, fx_apply_downlight_partial);
  const pfx::test::Input big = pfx::test::enlarged_photo_input(4);
  Pixels out(big.pixels.size());
  fx_apply_downlight(big.pixels.data(), out.data(), big.width, big.height);
  d.add(out);
  for (const Rect& b : pfx::test::conformance_bounds(big.width, big.height)) {
    Pixels part(big.pixels.size(), 0xA5A5A5A5u);
    fx_apply_downlight_partial(big.pixels.data(), big.mask.data(), part.data(), big.width,
                               big.height, b.left, b.right, b.top, b.bottom);
    d.add(part);
  }
  EXPECT_GOLDEN("downlight", d, 0x7f5cd50e8a596f65ull);
}

// The five looks without module state, each over every variant and bounds mode.
TEST(Conformance, LooksWithoutAutoAdjust) {
  const struct {
    const char* name;
    Full full;
    Partial partial;
    uint64_t golden;
  } looks[] = {
      {"retro", fx_apply_retro, fx_apply_retro_partial, 0x6124eec98cf0831eull},
      {"sunshine", fx_apply_sunshine, fx_apply_sunshine_partial, 0x5f761acdc41e0045ull},
      {"bluewash", fx_apply_bluewash, fx_apply_bluewash_partial, 0x2175c630b545c177ull},
      {"nostalgia", fx_apply_nostalgia, fx_apply_nostalgia_partial, 0x6edac32d7df23ef1ull},
      {"yellowglow", fx_apply_yellowglow, fx_apply_yellowglow_partial, 0xcb7eb9582c3b93c6ull},
  };
  for (const auto& look : looks) {
    Digest d;
    digest_look(d, look.full, look.partial);
    EXPECT_GOLDEN(look.name, d, look.golden);
  }
}

}  // namespace
