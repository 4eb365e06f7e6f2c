// The six preset looks: worked results of every look on black, white, grey and a colour (the
// strongest check of the whole adjustment stack beneath them), in-place use, downlight following
// the auto-adjust parameters, and preset compositing: the rectangle and the mask, bounds clipped
// to the image. (Refusals and a scratch image that cannot be had are in the bad-input and
// allocation-failure tables.)
#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Mask;
using pfx::test::Pixels;

constexpr uint32_t kUntouched = 0xA5A5A5A5u;

using Full = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t);
using Partial = void (*)(const uint32_t*, const uint8_t*, uint32_t*, int32_t, int32_t, int32_t,
                         int32_t, int32_t, int32_t);

struct Look {
  const char* name;
  Full fx_full, entry_full;
  Partial fx_partial, entry_partial;
};

const Look kLooks[] = {
    {"retro", fx_apply_retro, applyRetro, fx_apply_retro_partial, applyRetroPartial},
    {"sunshine", fx_apply_sunshine, applySunshine, fx_apply_sunshine_partial, applySunshinePartial},
    {"downlight", fx_apply_downlight, applyDownlight, fx_apply_downlight_partial,
     applyDownlightPartial},
    {"bluewash", fx_apply_bluewash, applyBluewash, fx_apply_bluewash_partial, applyBluewashPartial},
    {"nostalgia", fx_apply_nostalgia, applyNostalgia, fx_apply_nostalgia_partial,
     applyNostalgiaPartial},
    {"yellowglow", fx_apply_yellowglow, applyYellowglow, fx_apply_yellowglow_partial,
     applyYellowglowPartial},
};
const Look& kDownlight = kLooks[2];

Pixels full(Full look, const Pixels& img, int32_t w, int32_t h) {
  Pixels out(img.size(), kUntouched);
  look(img.data(), out.data(), w, h);
  return out;
}

// Black, white, mid grey and (200, 50, 100), all opaque.
constexpr uint32_t kColours[4] = {0xFF000000u, 0xFFFFFFFFu, 0xFF808080u, 0xFFC83264u};

struct Row {
  uint32_t out[4];
};

// Downlight twice: as it comes out on images under 150 pixels in either direction, and on
// 150 x 150.
const Row kTable[7] = {
    {{0xFF413234u, 0xFFFFFFF4u, 0xFFAEA99Cu, 0xFFB57D86u}},  // retro
    {{0xFF090300u, 0xFFFFFFDDu, 0xFF968E50u, 0xFFED2F2Du}},  // sunshine
    {{0xFF341923u, 0xFFFFFFFFu, 0xFFC3B3A8u, 0xFFED678Au}},  // downlight, small
    {{0xFF674552u, 0xFFFFFFFFu, 0xFFBCB1A9u, 0xFFCD6883u}},  // downlight, 150 x 150
    {{0xFF000020u, 0xFFFFF6FFu, 0xFF7B87ACu, 0xFFB43385u}},  // bluewash
    {{0xFF4E2F25u, 0xFFFFFCE1u, 0xFFBCA78Du, 0xFFDE6C74u}},  // nostalgia
    {{0xFF3A1B00u, 0xFFFFFFFFu, 0xFFE5D87Cu, 0xFFFF6E59u}},  // yellowglow
};

// The per-pixel looks give each colour its result wherever it stands, here among random pixels.
TEST(PresetLooks, EveryLookGivesItsResultForEachColour) {
  const int32_t rows[5] = {0, 1, 4, 5, 6};
  const size_t at[4] = {0, 17, 40, 59};
  for (int32_t k = 0; k < 5; ++k) {
    const Look& look = kLooks[rows[k] < 3 ? rows[k] : rows[k] - 1];
    Pixels img = pfx::test::random_image(12, 5, 21);
    for (size_t c = 0; c < 4; ++c) img[at[c]] = kColours[c];
    for (Full fn : {look.fx_full, look.entry_full}) {
      const Pixels out = full(fn, img, 12, 5);
      for (size_t c = 0; c < 4; ++c) {
        EXPECT_EQ(out[at[c]], kTable[rows[k]].out[c]) << look.name << " colour " << c;
      }
    }
  }
}

TEST(PresetLooks, DownlightOfOneColourDependsOnTheImageSize) {
  struct Size {
    int32_t w, h, row;
  };
  for (const Size& s : {Size{7, 3, 2}, Size{149, 150, 2}, Size{150, 149, 2}, Size{150, 150, 3}}) {
    for (size_t c = 0; c < 4; ++c) {
      const Pixels img = pfx::test::filled(s.w, s.h, kColours[c]);
      for (Full fn : {kDownlight.fx_full, kDownlight.entry_full}) {
        const Pixels expected = pfx::test::filled(s.w, s.h, kTable[s.row].out[c]);
        EXPECT_EQ(full(fn, img, s.w, s.h), expected) << s.w << "x" << s.h << " colour " << c;
      }
    }
  }
}

TEST(PresetLooks, InPlaceMatchesSeparateBuffers) {
  const Pixels img = pfx::test::random_image(150, 151, 22);
  const Mask mask = pfx::test::random_mask(150, 151, 23);
  for (const Look& look : kLooks) {
    const Pixels out = full(look.fx_full, img, 150, 151);
    Pixels in_place = img;
    look.fx_full(in_place.data(), in_place.data(), 150, 151);
    EXPECT_EQ(in_place, out) << look.name;

    Pixels partial = img;
    look.fx_partial(img.data(), mask.data(), partial.data(), 150, 151, 3, 140, 10, 120);
    in_place = img;
    look.fx_partial(in_place.data(), mask.data(), in_place.data(), 150, 151, 3, 140, 10, 120);
    EXPECT_EQ(in_place, partial) << look.name;
  }
}

TEST(PresetLooks, OnlyDownlightFollowsTheAutoAdjustParameters) {
  const Pixels img = pfx::test::random_image(150, 150, 24);
  std::vector<Pixels> before;
  for (const Look& look : kLooks) before.push_back(full(look.fx_full, img, 150, 150));
  const int32_t saved[4] = {g_HDR_Threshold, g_HDR_CutOff, g_HDR_Weight1, g_HDR_Weight2};
  fx_set_hdr(0, 60, 300, 8196);
  for (size_t k = 0; k < 6; ++k) {
    EXPECT_EQ(full(kLooks[k].fx_full, img, 150, 150) != before[k], &kLooks[k] == &kDownlight)
        << kLooks[k].name;
  }
  g_HDR_Threshold = saved[0], g_HDR_CutOff = saved[1];
  g_HDR_Weight1 = saved[2], g_HDR_Weight2 = saved[3];
}

// Inside the rectangle: the look where the mask byte is exactly 1, the source elsewhere. Outside
// it nothing is written.
TEST(PresetCompositing, RectangleTakesTheLookOnlyWhereTheMaskIsOne) {
  constexpr int32_t W = 23, H = 17;
  const Pixels img = pfx::test::random_image(W, H, 25);
  const Mask mask = pfx::test::random_mask(W, H, 26);
  for (const Look& look : kLooks) {
    const Pixels whole = full(look.fx_full, img, W, H);
    Pixels dst(img.size(), kUntouched);
    look.entry_partial(img.data(), mask.data(), dst.data(), W, H, 4, 15, 2, 11);
    for (int32_t y = 0; y < H; ++y) {
      for (int32_t x = 0; x < W; ++x) {
        const size_t i = static_cast<size_t>(y * W + x);
        const bool inside = x >= 4 && x <= 15 && y >= 2 && y <= 11;
        const uint32_t expected = !inside ? kUntouched : (mask[i] == 1 ? whole[i] : img[i]);
        ASSERT_EQ(dst[i], expected) << look.name << " " << x << "," << y;
      }
    }
  }
}

TEST(PresetCompositing, OnePixelRectangleWritesOnePixel) {
  const Pixels img = pfx::test::random_image(6, 5, 27);
  const Pixels whole = full(fx_apply_sunshine, img, 6, 5);
  for (uint8_t m : {uint8_t{1}, uint8_t{0}, uint8_t{2}, uint8_t{255}}) {
    Mask mask(img.size(), 1);
    mask[2 * 6 + 3] = m;
    Pixels dst(img.size(), kUntouched);
    fx_apply_sunshine_partial(img.data(), mask.data(), dst.data(), 6, 5, 3, 3, 2, 2);
    Pixels expected(img.size(), kUntouched);
    expected[2 * 6 + 3] = m == 1 ? whole[2 * 6 + 3] : img[2 * 6 + 3];
    EXPECT_EQ(dst, expected) << int{m};
  }
}

// Empty bounds write the whole look without reading the mask; bounds that reach past the image
// are clipped to it, and bounds wholly off the image select nothing.
TEST(PresetCompositing, BoundsPickTheModeAndAreClippedToTheImage) {
  constexpr int32_t W = 9, H = 7;
  const Pixels img = pfx::test::random_image(W, H, 28);
  const Mask ones(img.size(), 1);
  const Pixels whole = full(fx_apply_bluewash, img, W, H);
  auto partial = [&](const uint8_t* mask, int32_t l, int32_t r, int32_t t, int32_t b) {
    Pixels dst(img.size(), kUntouched);
    fx_apply_bluewash_partial(img.data(), mask, dst.data(), W, H, l, r, t, b);
    return dst;
  };
  EXPECT_EQ(partial(nullptr, 1, 0, 0, H - 1), whole);
  EXPECT_EQ(partial(nullptr, 0, W - 1, 5, 4), whole);
  EXPECT_EQ(partial(ones.data(), -3, W + 5, -1, H + 100), whole);
  EXPECT_EQ(partial(ones.data(), INT32_MIN, INT32_MAX, INT32_MIN, INT32_MAX), whole);
  const Pixels untouched(img.size(), kUntouched);
  EXPECT_EQ(partial(ones.data(), W, W + 3, 0, H - 1), untouched);
  EXPECT_EQ(partial(ones.data(), 0, W - 1, -5, -1), untouched);
  // Partly outside: only the part inside the image, here the bottom-right corner.
  const Pixels corner = partial(ones.data(), W - 2, W + 2, H - 1, H + 2);
  for (size_t i = 0; i < img.size(); ++i) {
    const bool inside = i % W >= W - 2 && i / W == H - 1;
    EXPECT_EQ(corner[i], inside ? whole[i] : kUntouched) << i;
  }
}

}  // namespace
