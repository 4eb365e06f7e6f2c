// Conformance goldens of the tone curves, the vignettes and the film looks: vintage, old photo,
// pop art and soft glow.
#include <gtest/gtest.h>

#include <cstdint>
#include <limits>

#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::Rect;
using pfx::test::Digest;
using pfx::test::Pixels;

// Sizes the fixed inputs do not reach: single rows and columns, and a preview wider than the
// vignette table covers.
void digest_odd_sizes(Digest& d, void (*fn)(const uint32_t*, uint32_t*, int32_t, int32_t)) {
  const int32_t sizes[][2] = {{1, 1}, {1, 9}, {7, 1}, {2, 2}, {3, 5}, {8200, 2}};
  for (const auto& s : sizes) {
    const Pixels img = pfx::test::random_image(s[0], s[1], 7);
    Pixels out(img.size(), 0xA5A5A5A5u);
    fn(img.data(), out.data(), s[0], s[1]);
    d.add(out);
  }
}

template <class Fn>
void digest_full_and_odd(Digest& d, Fn fn) {
  pfx::test::digest_full(d, fn);
  digest_odd_sizes(d, fn);
}

TEST(Conformance, ToneCurves) {
  Digest d;
  const double gammas[] = {-1.0, 0.0,  0.3,  0.58, 0.77,
                           1.0,  1.09, 2.35, 9.5,  std::numeric_limits<double>::quiet_NaN()};
  const int32_t levels[][2] = {{0, 255},
                               {28, 255},
                               {15, 243},
                               {45, 255},
                               {100, 100},
                               {200, 100},
                               {-300, 600},
                               {11, 232},
                               {-1, 256},
                               {0, 1},
                               {INT32_MIN, INT32_MAX}};
  for (int32_t channel : {-1, 0, 1, 2, 3, 4}) {
    for (double gamma : gammas) {
      pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
        control_gamma(s, o, w, h, channel, gamma);
      });
    }
    for (const auto& l : levels) {
      pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
        changeHistogramByInput(s, o, w, h, channel, l[0], l[1]);
      });
      pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
        changeHistogramByOutput(s, o, w, h, channel, l[0], l[1]);
      });
    }
  }
  EXPECT_GOLDEN("tone curves", d, 0x8fcea53f9689a949ull);
}

TEST(Conformance, Vignette) {
  Digest d;
  digest_full_and_odd(d, fx_apply_vignette);
  digest_full_and_odd(d, fx_apply_vignette_prev);
  for (int32_t k = 0; k < 256; ++k) d.add(LUT_VIGNETTE[k]);
  EXPECT_GOLDEN("vignette", d, 0xb4afec3c7bd8123bull);
}

TEST(Conformance, Vintage) {
  Digest d;
  digest_full_and_odd(d, fx_apply_vintage);
  digest_full_and_odd(d, fx_apply_vintage_prev);
  pfx::test::digest_partial(
      d, [](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
        fx_apply_vintage_partial(s, m, o, w, h, b.left, b.right, b.top, b.bottom);
      });
  for (int32_t n = 0; n < 256; ++n) d.add(LUT_VINTAGE[n]);
  EXPECT_GOLDEN("vintage", d, 0xb1d5df06935aee85ull);
}

TEST(Conformance, OldPhoto) {
  Digest d;
  digest_full_and_odd(d, fx_apply_oldphoto);
  pfx::test::digest_partial(
      d, [](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
        fx_apply_oldphoto_partial(s, m, o, w, h, b.left, b.right, b.top, b.bottom);
      });
  for (int32_t n = 0; n < 256; ++n) d.add(LUT_OLDPHOTO[n]);
  EXPECT_GOLDEN("old photo", d, 0xaa73e99b41ff9fefull);
}

// The texture is seeded noise of the image's size, so its alpha bytes cover 0 as well.
TEST(Conformance, OldPhotoTexture) {
  Digest d;
  pfx::test::digest_full(d, [](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
    const Pixels texture = pfx::test::random_image(w, h, 99);
    fx_apply_oldphoto_texture(s, o, texture.data(), w, h);
  });
  pfx::test::digest_partial(
      d, [](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
        const Pixels texture = pfx::test::random_image(w, h, 99);
        fx_apply_oldphoto_texture_partial(s, o, texture.data(), m, w, h, b.left, b.right, b.top,
                                          b.bottom);
      });
  EXPECT_GOLDEN("old photo texture", d, 0x224e45d66b30adb5ull);
}

TEST(Conformance, PopArt) {
  Digest d;
  digest_full_and_odd(d, fx_apply_popart);
  digest_full_and_odd(d, fx_apply_popart_prev);
  EXPECT_GOLDEN("pop art", d, 0x2a87607b8091ef37ull);
}

TEST(Conformance, SoftGlow) {
  Digest d;
  for (int32_t level : {INT32_MIN, -1, 0, 1, 35, 50, 99, 100, 101}) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      d.add(fx_softglow(s, o, w, h, level));
    });
    pfx::test::digest_partial(
        d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
          d.add(fx_softglow_partial(s, m, o, w, h, level, b.left, b.right, b.top, b.bottom));
        });
  }
  EXPECT_GOLDEN("soft glow", d, 0x199e0d90bd1238efull);
}

}  // namespace
