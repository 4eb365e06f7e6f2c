// The vectorised point operations, HSV effects and fused preset chains against the plain
// per-pixel code in reference/point.h, bit for bit: full variants into a second buffer and in
// place, partial variants in every bounds mode, on images of awkward sizes (widths that are not
// multiples of any vector width, single rows and columns) whose first pixels run through every
// channel value and every channel sum, with random alpha, at every slider level and far beyond.
#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <vector>

#include "frame/frame.h"
#include "frame/hsv.h"
#include "photofx.h"
#include "reference/point.h"
#include "support/images.h"

namespace {

namespace ref = pfx::reference;
using pfx::test::Mask;
using pfx::test::Pixels;

constexpr int32_t kMin = std::numeric_limits<int32_t>::min();
constexpr int32_t kMax = std::numeric_limits<int32_t>::max();

using Full = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t, int32_t);
using Partial = void (*)(const uint32_t*, const uint8_t*, uint32_t*, int32_t, int32_t, int32_t,
                         int32_t, int32_t, int32_t, int32_t);
using Reference = Pixels (*)(const Pixels&, int32_t, int32_t, int32_t);

// A reference rule of one pixel applied to every pixel.
template <auto Rule>
Pixels each(const Pixels& src, int32_t, int32_t, int32_t level) {
  Pixels out(src.size());
  for (size_t i = 0; i < src.size(); ++i) out[i] = Rule(src[i], level);
  return out;
}

// Levels in the slider range, the holds of the rules and the ends of int32_t.
std::vector<int32_t> with_extremes(int32_t lo, int32_t hi, std::vector<int32_t> more) {
  for (int32_t l = lo; l <= hi; ++l) more.push_back(l);
  more.push_back(kMin);
  more.push_back(kMax);
  return more;
}

// Levels tables: channel selector, low, high.
struct LevelsArgs {
  int32_t channel, low, high;
};
constexpr LevelsArgs kLevels[] = {{0, 0, 255},   {1, 10, 200}, {2, 254, 255}, {3, 0, 1},
                                  {0, 100, 101}, {4, 20, 90},  {0, -20, 300}, {1, kMin, kMax},
                                  {0, 300, 400}, {3, -50, 10}, {2, 37, 38}};

uint32_t levels_in(uint32_t p, int32_t i) {
  return ref::on_channels(p, kLevels[i].channel, ref::levels_in, kLevels[i].low, kLevels[i].high);
}
uint32_t levels_out(uint32_t p, int32_t i) {
  return ref::on_channels(p, kLevels[i].channel, ref::levels_out, kLevels[i].low, kLevels[i].high);
}
uint32_t gains(uint32_t p, int32_t level) { return ref::gains(p, level, 7, 13); }
uint32_t sepia(uint32_t p, int32_t) { return ref::sepia(p); }

// The preset chains, one adjustment after another.
uint32_t retro(uint32_t p, int32_t) {
  p = ref::brightness(ref::saturation(p, 5), 12);
  p = ref::contrast(ref::saturation(ref::faded(p, 50), 7), 9);
  return ref::contrast(ref::brightness(p, 11), 12);
}
uint32_t sunshine(uint32_t p, int32_t) {
  return ref::contrast(ref::gains(ref::temperature(ref::contrast(p, 11), 14), 11, 12, 8), 11);
}
uint32_t bluewash(uint32_t p, int32_t) {
  p = ref::temperature(ref::saturation(ref::contrast(p, 12), 7), 6);
  return ref::gains(ref::exposure(p, 11), 10, 9, 11);
}
uint32_t nostalgia(uint32_t p, int32_t) {
  p = ref::exposure(ref::faded(ref::brightness(p, 12), 50), 11);
  return ref::temperature(ref::saturation(p, 7), 13);
}
uint32_t yellowglow(uint32_t p, int32_t) {
  p = ref::saturation(ref::exposure(ref::temperature(ref::faded(p, 50), 12), 13), 8);
  return ref::contrast(ref::gains(p, 13, 14, 9), 13);
}
Pixels downlight(const Pixels& src, int32_t w, int32_t h, int32_t) {
  Pixels out = each<ref::faded>(src, w, h, 50);
  fx_process_hdr(out.data(), out.data(), w, h);
  for (uint32_t& p : out) {
    p = ref::gains(ref::saturation(ref::contrast(p, 9), 7), 9, 9, 9);
    p = ref::exposure(p, 13);
  }
  return out;
}

Pixels soft_glow(const Pixels& src, int32_t w, int32_t h, int32_t level) {
  Pixels out(src.size());
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      out[static_cast<size_t>(y) * static_cast<size_t>(w) + static_cast<size_t>(x)] =
          ref::soft_glow_pixel(src, w, h, x, y, level);
    }
  }
  return out;
}

struct Case {
  const char* name;
  Full full;
  Partial partial;  // null where the effect has none
  Reference reference;
  std::vector<int32_t> levels;
  bool mask_over_whole_image = false;    // exposure's masked mode ignores the bounds
  bool refuses_beyond_0_to_100 = false;  // faded colour, soft glow: nothing written then
};

const std::vector<Case>& cases() {
  static const std::vector<Case> all = {
      {"brightness", fx_control_brightness_all, fx_control_brightness, each<ref::brightness>,
       with_extremes(-1, 21, {-991, -990, -989, 1009, 1010, 1011})},
      {"contrast", fx_control_contrast_all, fx_control_contrast, each<ref::contrast>,
       with_extremes(-1, 21, {-991, -990, -989, 40, 1009, 1010, 1011})},
      {"saturation", fx_control_saturation_all, fx_control_saturation, each<ref::saturation>,
       with_extremes(-1, 21, {})},
      {"temperature", fx_control_temperature_all, fx_control_temperature, each<ref::temperature>,
       with_extremes(-1, 21, {-991, -990, -989, 1009, 1010, 1011})},
      {"exposure",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t l) {
         fx_control_exposure_all(s, d, w, h, l);
       },
       [](const uint32_t* s, const uint8_t* m, uint32_t* d, int32_t w, int32_t h, int32_t l,
          int32_t left, int32_t right, int32_t top,
          int32_t bottom) { fx_control_exposure(s, m, d, w, h, l, left, right, top, bottom); },
       each<ref::exposure>, with_extremes(-1, 21, {1285, 1286, 2544, 2545, 2546, 3277}), true},
      {"faded colour",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t l) {
         fx_control_fadedcolor_all(s, d, w, h, l);
       },
       [](const uint32_t* s, const uint8_t* m, uint32_t* d, int32_t w, int32_t h, int32_t l,
          int32_t left, int32_t right, int32_t top,
          int32_t bottom) { fx_control_fadedcolor(s, m, d, w, h, l, left, right, top, bottom); },
       each<ref::faded>, with_extremes(0, 100, {-1, 101}), false, true},
      {"channel gains",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t l) {
         fx_adjust_RGB_all(s, d, w, h, l, 7, 13);
       },
       [](const uint32_t* s, const uint8_t* m, uint32_t* d, int32_t w, int32_t h, int32_t l,
          int32_t left, int32_t right, int32_t top,
          int32_t bottom) { fx_adjust_RGB(s, m, d, w, h, l, 7, 13, left, right, top, bottom); },
       each<gains>, with_extremes(-40, 60, {})},
      {"greyscale", fx_control_greyscale_all, fx_control_greyscale, each<ref::greyscale>,
       with_extremes(-8, 21, {4171, 4172, 4173})},
      {"sepia",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t) {
         fx_apply_sepia(s, d, w, h);
       },
       [](const uint32_t* s, const uint8_t* m, uint32_t* d, int32_t w, int32_t h, int32_t,
          int32_t left, int32_t right, int32_t top,
          int32_t bottom) { fx_apply_sepia_partial(s, m, d, w, h, left, right, top, bottom); },
       each<sepia>,
       {0}},
      {"levels by input",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t i) {
         changeHistogramByInput(s, d, w, h, kLevels[i].channel, kLevels[i].low, kLevels[i].high);
       },
       nullptr,
       each<levels_in>,
       {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10}},
      {"levels by output",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t i) {
         changeHistogramByOutput(s, d, w, h, kLevels[i].channel, kLevels[i].low, kLevels[i].high);
       },
       nullptr,
       each<levels_out>,
       {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10}},
      {"hue",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t l) {
         fx_control_hue_all(s, d, w, h, l);
       },
       [](const uint32_t* s, const uint8_t* m, uint32_t* d, int32_t w, int32_t h, int32_t l,
          int32_t left, int32_t right, int32_t top,
          int32_t bottom) { fx_control_hue(s, m, d, w, h, l, left, right, top, bottom); },
       each<ref::hue>, with_extremes(-1, 21, {-91, -90, -89, 109, 110, 111})},
      {"colour tone",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t l) {
         fx_change_colortone(s, d, w, h, l);
       },
       nullptr,
       each<ref::colour_tone>,
       {0, 1, 59, 60, 61, 119, 120, 180, 240, 300, 359, 360}},
      {"pop-art preview",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t) {
         fx_apply_popart_prev(s, d, w, h);
       },
       nullptr,
       [](const Pixels& s, int32_t w, int32_t h, int32_t) { return ref::pop_art_preview(s, w, h); },
       {0}},
      {"soft glow",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t l) {
         fx_softglow(s, d, w, h, l);
       },
       [](const uint32_t* s, const uint8_t* m, uint32_t* d, int32_t w, int32_t h, int32_t l,
          int32_t left, int32_t right, int32_t top,
          int32_t bottom) { fx_softglow_partial(s, m, d, w, h, l, left, right, top, bottom); },
       soft_glow, with_extremes(0, 100, {-1, 101}), false, true},
      {"retro",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t) {
         fx_apply_retro(s, d, w, h);
       },
       nullptr,
       each<retro>,
       {0}},
      {"sunshine",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h, int32_t) {
         fx_apply_sunshine(s, d, w, h);
       },
       nullptr,
       each<sunshine>,
       {0}},
      {"downlight",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h,
          int32_t) { fx_apply_downlight(s, d, w, h); },
       nullptr,
       downlight,
       {0}},
      {"bluewash",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h,
          int32_t) { fx_apply_bluewash(s, d, w, h); },
       nullptr,
       each<bluewash>,
       {0}},
      {"nostalgia",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h,
          int32_t) { fx_apply_nostalgia(s, d, w, h); },
       nullptr,
       each<nostalgia>,
       {0}},
      {"yellow glow",
       [](const uint32_t* s, uint32_t* d, int32_t w, int32_t h,
          int32_t) { fx_apply_yellowglow(s, d, w, h); },
       nullptr,
       each<yellowglow>,
       {0}},
  };
  return all;
}

// Random pixels, the first of them running through every channel value in every channel and
// then every sum of the three channels, so that the per-channel rules and the channel mean see
// each of their inputs on the larger images.
Pixels test_image(int32_t w, int32_t h, uint64_t seed) {
  Pixels img = pfx::test::random_image(w, h, seed);
  for (size_t i = 0; i < img.size() && i < 256 + 766; ++i) {
    const uint32_t alpha = img[i] & 0xFF000000u;
    if (i < 256) {
      const uint32_t v = static_cast<uint32_t>(i);
      img[i] = alpha | v << 16 | ((v + 85) & 0xFFu) << 8 | ((v + 170) & 0xFFu);
    } else {
      const uint32_t sum = static_cast<uint32_t>(i - 256);
      const uint32_t r = sum < 255 ? sum : 255, g = sum - r < 255 ? sum - r : 255;
      img[i] = alpha | r << 16 | g << 8 | (sum - r - g);
    }
  }
  return img;
}

struct Size {
  int32_t w, h;
};
constexpr Size kSizes[] = {{1, 1}, {1, 9}, {9, 1}, {2, 2}, {3, 5}, {17, 3}, {35, 4}, {61, 19}};

// What a partial variant must give: the source, with the reference's pixels where the bounds
// (clipped to the image) and a mask byte of exactly 1 select, or everywhere for empty bounds.
Pixels expected_partial(const Pixels& src, const Pixels& edited, const Mask& mask, Size s,
                        pfx::Rect b, bool mask_over_whole_image) {
  if (b.left > b.right || b.top > b.bottom) return edited;
  Pixels out = src;
  for (int32_t y = 0; y < s.h; ++y) {
    for (int32_t x = 0; x < s.w; ++x) {
      const size_t i = static_cast<size_t>(y) * static_cast<size_t>(s.w) + static_cast<size_t>(x);
      const bool inside = x >= b.left && x <= b.right && y >= b.top && y <= b.bottom;
      if ((inside || mask_over_whole_image) && mask[i] == 1) out[i] = edited[i];
    }
  }
  return out;
}

TEST(PointEquivalence, FastPathsMatchTheReferenceBitForBit) {
  uint64_t seed = 1;
  for (const Case& c : cases()) {
    for (const Size s : kSizes) {
      const Pixels src = test_image(s.w, s.h, ++seed);
      const Mask mask = pfx::test::random_mask(s.w, s.h, ++seed);
      const pfx::Rect bounds[] = {{0, s.w - 1, 0, s.h - 1},
                                  {-3, s.w / 2, s.h / 3, s.h + 4},
                                  {s.w / 3, s.w - 2, 1, s.h - 1},
                                  {s.w + 1, s.w + 5, 0, s.h - 1},
                                  {4, 2, 0, 0}};
      for (const int32_t level : c.levels) {
        const bool refused = c.refuses_beyond_0_to_100 && (level < 0 || level > 100);
        SCOPED_TRACE(testing::Message()
                     << c.name << " " << s.w << "x" << s.h << " level " << level);
        const Pixels want =
            refused ? Pixels(src.size(), 0xA5A5A5A5u) : c.reference(src, s.w, s.h, level);
        Pixels out(src.size(), 0xA5A5A5A5u);
        c.full(src.data(), out.data(), s.w, s.h, level);
        ASSERT_EQ(out, want) << "into a second buffer";
        if (!refused) {
          out = src;
          c.full(out.data(), out.data(), s.w, s.h, level);
          ASSERT_EQ(out, want) << "in place";
        }
        if (c.partial == nullptr || refused) continue;
        for (const pfx::Rect& b : bounds) {
          SCOPED_TRACE(testing::Message()
                       << "bounds " << b.left << " " << b.right << " " << b.top << " " << b.bottom);
          const Pixels want_partial =
              expected_partial(src, want, mask, s, b, c.mask_over_whole_image);
          out.assign(src.size(), 0xA5A5A5A5u);
          c.partial(src.data(), mask.data(), out.data(), s.w, s.h, level, b.left, b.right, b.top,
                    b.bottom);
          ASSERT_EQ(out, want_partial);
          out = src;
          c.partial(out.data(), mask.data(), out.data(), s.w, s.h, level, b.left, b.right, b.top,
                    b.bottom);
          ASSERT_EQ(out, want_partial) << "in place";
        }
      }
    }
  }
}

// The HSV back conversion accepts any arguments; its branch-free form must give what the
// branching one gives for hues, saturations and values well outside the ranges images produce.
TEST(PointEquivalence, HsvToRgbMatchesTheReferenceForAnyArguments) {
  pfx::test::Rng rng(77);
  const int32_t saturations[] = {kMin, -65536, -1, 0, 1, 19660, 65535, 65536, 65537, kMax};
  const int32_t values[] = {kMin, -1, 0, 1, 128, 255, 256, 70000, kMax};
  auto check = [](int32_t h, int32_t s, int32_t v) {
    int32_t r, g, b;
    ref::hsv_to_rgb(h, s, v, &r, &g, &b);
    const pfx::Rgb c = pfx::hsv_to_rgb(h, s, v);
    ASSERT_TRUE(c.r == r && c.g == g && c.b == b) << h << " " << s << " " << v;
  };
  for (int32_t h = -3; h <= 363; ++h) {
    for (const int32_t s : saturations) {
      for (const int32_t v : values) check(h, s, v);
    }
  }
  for (int32_t i = 0; i < 100000; ++i) {
    check(static_cast<int32_t>(rng.word()), static_cast<int32_t>(rng.word()),
          static_cast<int32_t>(rng.word()));
    check(rng.between(-400, 800), rng.between(-70000, 140000), rng.between(-300, 600));
  }
}

}  // namespace
