// Conformance goldens of the slider adjustments and the lighten and darken brushes.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::Rect;
using pfx::test::Digest;
using pfx::test::Pixels;

constexpr int32_t kLevels[] = {-3, 0, 4, 10, 13, 20, 27};
// The slider levels and levels far beyond them, where no arithmetic may overflow.
constexpr int32_t kWideLevels[] = {INT32_MIN, -45, -3, 0, 4, 10, 13, 20, 27, 55, 2000, INT32_MAX};

// Runs a one-level slider adjustment, full and partial, at every wide level. The adjustments
// that return a result code add it to the digest too.
template <class Full, class Partial>
void digest_levels(Digest& d, Full full, Partial partial) {
  for (int32_t level : kWideLevels) {
    pfx::test::digest_full(
        d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) { full(s, o, w, h, level); });
    pfx::test::digest_partial(d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w,
                                     int32_t h, Rect b) { partial(s, m, o, w, h, level, b); });
  }
}

TEST(Conformance, Brightness) {
  Digest d;
  for (int32_t level : kLevels) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      fx_control_brightness_all(s, o, w, h, level);
    });
    pfx::test::digest_partial(
        d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
          fx_control_brightness(s, m, o, w, h, level, b.left, b.right, b.top, b.bottom);
        });
  }
  EXPECT_GOLDEN("brightness", d, 0x39a04a28e3451119ull);
}

TEST(Conformance, Contrast) {
  Digest d;
  for (int32_t level : kLevels) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      fx_control_contrast_all(s, o, w, h, level);
    });
    pfx::test::digest_partial(
        d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
          fx_control_contrast(s, m, o, w, h, level, b.left, b.right, b.top, b.bottom);
        });
  }
  EXPECT_GOLDEN("contrast", d, 0x6c4de60cdc023460ull);
}

TEST(Conformance, Saturation) {
  Digest d;
  digest_levels(
      d, [](auto s, auto o, auto w, auto h, auto l) { fx_control_saturation_all(s, o, w, h, l); },
      [](auto s, auto m, auto o, auto w, auto h, auto l, Rect b) {
        fx_control_saturation(s, m, o, w, h, l, b.left, b.right, b.top, b.bottom);
      });
  EXPECT_GOLDEN("saturation", d, 0xa320ed5ef88c799cull);
}

TEST(Conformance, Temperature) {
  Digest d;
  digest_levels(
      d, [](auto s, auto o, auto w, auto h, auto l) { fx_control_temperature_all(s, o, w, h, l); },
      [](auto s, auto m, auto o, auto w, auto h, auto l, Rect b) {
        fx_control_temperature(s, m, o, w, h, l, b.left, b.right, b.top, b.bottom);
      });
  EXPECT_GOLDEN("temperature", d, 0xdb87aa87522aea7bull);
}

TEST(Conformance, Exposure) {
  Digest d;
  digest_levels(
      d,
      [&](auto s, auto o, auto w, auto h, auto l) {
        d.add(int64_t{fx_control_exposure_all(s, o, w, h, l)});
      },
      [&](auto s, auto m, auto o, auto w, auto h, auto l, Rect b) {
        d.add(int64_t{fx_control_exposure(s, m, o, w, h, l, b.left, b.right, b.top, b.bottom)});
      });
  EXPECT_GOLDEN("exposure", d, 0xb2e27a21bb2ade94ull);
}

TEST(Conformance, Hue) {
  Digest d;
  digest_levels(
      d,
      [&](auto s, auto o, auto w, auto h, auto l) {
        d.add(int64_t{fx_control_hue_all(s, o, w, h, l)});
      },
      [&](auto s, auto m, auto o, auto w, auto h, auto l, Rect b) {
        d.add(int64_t{fx_control_hue(s, m, o, w, h, l, b.left, b.right, b.top, b.bottom)});
      });
  EXPECT_GOLDEN("hue", d, 0x3059dc0f5daa1930ull);
}

TEST(Conformance, FadedColour) {
  Digest d;
  for (int32_t level : {-1, 0, 1, 35, 50, 99, 100, 101}) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      d.add(int64_t{fx_control_fadedcolor_all(s, o, w, h, level)});
    });
    pfx::test::digest_partial(d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w,
                                     int32_t h, Rect b) {
      d.add(int64_t{fx_control_fadedcolor(s, m, o, w, h, level, b.left, b.right, b.top, b.bottom)});
    });
  }
  EXPECT_GOLDEN("faded colour", d, 0x56ebf26e55642abfull);
}

TEST(Conformance, Invert) {
  Digest d;
  pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
    d.add(int64_t{fx_apply_invert_all(s, o, w, h)});
  });
  pfx::test::digest_partial(
      d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
        d.add(int64_t{fx_apply_invert(s, m, o, w, h, b.left, b.right, b.top, b.bottom)});
      });
  EXPECT_GOLDEN("invert", d, 0x911e5209685b7efaull);
}

TEST(Conformance, ChannelGains) {
  struct Gains {
    int32_t red, green, blue;
  };
  constexpr Gains kGains[] = {{10, 10, 10},
                              {20, 10, 10},
                              {0, 15, 7},
                              {3, 18, 12},
                              {-5, 30, 10},
                              {20, 0, 20},
                              {INT32_MAX, INT32_MIN, 10}};
  Digest d;
  for (const Gains& g : kGains) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      fx_adjust_RGB_all(s, o, w, h, g.red, g.green, g.blue);
    });
    pfx::test::digest_partial(
        d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
          fx_adjust_RGB(s, m, o, w, h, g.red, g.green, g.blue, b.left, b.right, b.top, b.bottom);
        });
  }
  EXPECT_GOLDEN("channel gains", d, 0x04b23b7998823466ull);
}

TEST(Conformance, ColourTone) {
  Digest d;
  for (int32_t hue : {-1, 0, 30, 61, 90, 180, 270, 359, 360, 361}) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      d.add(int64_t{fx_change_colortone(s, o, w, h, hue)});
    });
  }
  EXPECT_GOLDEN("colour tone", d, 0x06a5ded8e53c2691ull);
}

// Brush strokes at the centre, the corners, across the edges and outside the image, with radii
// from nothing to larger than the image and strengths beyond the intended range.
TEST(Conformance, LightenDarken) {
  struct Stroke {
    int32_t cx, cy, strength, radius;
  };
  Digest d;
  for (auto* brush : {&fx_apply_lighten, &fx_apply_darken}) {
    for (const pfx::test::Input& in : pfx::test::conformance_inputs()) {
      const int32_t w = in.width, h = in.height;
      const Stroke strokes[] = {{w / 2, h / 2, 50, 7},   {0, 0, 255, 12},
                                {w - 1, h - 1, 80, 5},   {-3, h / 3, 120, 9},
                                {w + 2, 4, 200, 6},      {w / 3, h / 2, 0, 4},
                                {5, 5, 90, 0},           {5, 5, 90, -4},
                                {w / 2, h / 2, 30, 200}, {w / 2, 0, INT32_MAX, 10},
                                {w / 4, h / 4, 100, 1}};
      for (const Stroke& st : strokes) {
        Pixels img = in.pixels;
        brush(img.data(), st.cx, st.cy, w, h, st.strength, st.radius);
        d.add(img);
      }
    }
  }
  EXPECT_GOLDEN("lighten and darken", d, 0xda08b8c76933e5d6ull);
}

}  // namespace
