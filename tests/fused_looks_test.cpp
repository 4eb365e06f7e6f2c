// The looks made in one pass over the pixels against the forms they fuse: vintage against its 22
// exported passes run one after another, and the partial variants made without a scratch image
// against the full look composited through the mask. Images of awkward sizes whose first pixels
// run through every channel value, so every folded table entry and every vector block and tail
// is seen, on every instruction-set path.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"
#include "support/paths.h"

namespace {

using pfx::test::Mask;
using pfx::test::Pixels;

struct Bounds {
  int32_t left, right, top, bottom;
};

struct Size {
  int32_t w, h;
};
constexpr Size kSizes[] = {{1, 1}, {2, 2}, {3, 5}, {17, 3}, {35, 4}, {61, 19}, {300, 2}};

Pixels every_value_image(Size s, uint64_t seed) {
  Pixels img = pfx::test::random_image(s.w, s.h, seed);
  for (uint32_t v = 0; v < 256 && v < img.size(); ++v) {
    img[v] = (img[v] & 0xFF000000u) | v << 16 | ((v + 85) & 0xFFu) << 8 | ((v + 170) & 0xFFu);
  }
  return img;
}

// The look as its passes, the first from src, the others in place.
Pixels vintage_passes(const Pixels& src, Size s) {
  Pixels d(src.size());
  const auto f = [](double g) { return static_cast<double>(static_cast<float>(g)); };
  control_gamma(src.data(), d.data(), s.w, s.h, 0, 0.77);
  uint32_t* p = d.data();
  changeHistogramByInput(p, p, s.w, s.h, 1, 28, 255);
  control_gamma(p, p, s.w, s.h, 1, f(1.09));
  control_gamma(p, p, s.w, s.h, 2, f(1.06));
  control_gamma(p, p, s.w, s.h, 3, f(1.15));
  changeHistogramByOutput(p, p, s.w, s.h, 3, 45, 255);
  fx_control_brightness_all(p, p, s.w, s.h, 12);
  fx_control_contrast_all(p, p, s.w, s.h, 12);
  changeHistogramByInput(p, p, s.w, s.h, 0, 15, 243);
  control_gamma(p, p, s.w, s.h, 0, f(1.03));
  changeHistogramByOutput(p, p, s.w, s.h, 0, 0, 238);
  changeHistogramByInput(p, p, s.w, s.h, 1, 49, 255);
  control_gamma(p, p, s.w, s.h, 1, f(2.35));
  changeHistogramByOutput(p, p, s.w, s.h, 1, 11, 232);
  control_gamma(p, p, s.w, s.h, 2, f(1.15));
  changeHistogramByOutput(p, p, s.w, s.h, 2, 0, 250);
  control_gamma(p, p, s.w, s.h, 3, f(0.58));
  changeHistogramByOutput(p, p, s.w, s.h, 3, 56, 238);
  fx_control_contrast_all(p, p, s.w, s.h, 12);
  changeHistogramByOutput(p, p, s.w, s.h, 3, 0, 241);
  changeHistogramByOutput(p, p, s.w, s.h, 3, 14, 255);
  fx_apply_vignette(p, p, s.w, s.h);
  return d;
}

class FusedLooks : public pfx::test::EveryPath {};

TEST_P(FusedLooks, VintageGivesItsTwentyTwoPasses) {
  uint64_t seed = 500;
  for (const Size s : kSizes) {
    SCOPED_TRACE(testing::Message() << s.w << "x" << s.h);
    const Pixels src = every_value_image(s, ++seed);
    const Pixels want = vintage_passes(src, s);
    Pixels out(src.size(), 0xA5A5A5A5u);
    fx_apply_vintage(src.data(), out.data(), s.w, s.h);
    ASSERT_EQ(out, want);
    out = src;
    fx_apply_vintage(out.data(), out.data(), s.w, s.h);
    ASSERT_EQ(out, want) << "in place";
  }
}

using Full = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t);
using Partial = void (*)(const uint32_t*, const uint8_t*, uint32_t*, int32_t, int32_t, int32_t,
                         int32_t, int32_t, int32_t);

TEST_P(FusedLooks, PartialVariantsCompositeTheFullLook) {
  const struct {
    const char* name;
    Full full;
    Partial partial;
  } looks[] = {{"retro", fx_apply_retro, fx_apply_retro_partial},
               {"sunshine", fx_apply_sunshine, fx_apply_sunshine_partial},
               {"bluewash", fx_apply_bluewash, fx_apply_bluewash_partial},
               {"nostalgia", fx_apply_nostalgia, fx_apply_nostalgia_partial},
               {"yellow glow", fx_apply_yellowglow, fx_apply_yellowglow_partial},
               {"vintage", fx_apply_vintage, fx_apply_vintage_partial}};
  constexpr uint32_t kUntouched = 0xA5A5A5A5u;
  uint64_t seed = 600;
  for (const auto& look : looks) {
    for (const Size s : {Size{17, 3}, Size{61, 19}}) {
      const Pixels src = every_value_image(s, ++seed);
      const Mask mask = pfx::test::random_mask(s.w, s.h, ++seed);
      Pixels full(src.size());
      look.full(src.data(), full.data(), s.w, s.h);
      const Bounds bounds[] = {{1, s.w - 2, 1, s.h - 1},
                               {-3, s.w / 2, -1, s.h + 4},
                               {s.w + 1, s.w + 5, 0, 1},
                               {4, 2, 0, 0}};
      for (const auto& b : bounds) {
        SCOPED_TRACE(testing::Message()
                     << look.name << " " << s.w << "x" << s.h << " bounds " << b.left << " "
                     << b.right << " " << b.top << " " << b.bottom);
        Pixels want = full;
        if (b.left <= b.right) {
          for (size_t i = 0; i < src.size(); ++i) {
            const int32_t x = static_cast<int32_t>(i) % s.w, y = static_cast<int32_t>(i) / s.w;
            const bool inside = x >= b.left && x <= b.right && y >= b.top && y <= b.bottom;
            want[i] = !inside ? kUntouched : (mask[i] == 1 ? full[i] : src[i]);
          }
        }
        Pixels out(src.size(), kUntouched);
        look.partial(src.data(), mask.data(), out.data(), s.w, s.h, b.left, b.right, b.top,
                     b.bottom);
        ASSERT_EQ(out, want);
      }
    }
  }
}

INSTANTIATE_TEST_SUITE_P(EveryPath, FusedLooks, pfx::test::every_path(), pfx::test::path_name);

}  // namespace
