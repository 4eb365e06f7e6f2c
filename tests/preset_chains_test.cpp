// The preset looks fuse their chain of adjustments into one pass over the image; each must give
// what its passes give one after another, as the full variants run them in place. (A look is
// nothing but its order of passes and their levels.)
#include <gtest/gtest.h>

#include <functional>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::Pixels;
using Pass = std::function<void(uint32_t*, int32_t, int32_t)>;

Pass level(void (*f)(const uint32_t*, uint32_t*, int32_t, int32_t, int32_t), int32_t l) {
  return [=](uint32_t* p, int32_t w, int32_t h) { f(p, p, w, h, l); };
}
Pass coded(int32_t (*f)(const uint32_t*, uint32_t*, int32_t, int32_t, int32_t), int32_t l) {
  return [=](uint32_t* p, int32_t w, int32_t h) { f(p, p, w, h, l); };
}
Pass gains(int32_t r, int32_t g, int32_t b) {
  return [=](uint32_t* p, int32_t w, int32_t h) { fx_adjust_RGB_all(p, p, w, h, r, g, b); };
}
Pass saturation(int32_t l) { return level(fx_control_saturation_all, l); }
Pass brightness(int32_t l) { return level(fx_control_brightness_all, l); }
Pass contrast(int32_t l) { return level(fx_control_contrast_all, l); }
Pass temperature(int32_t l) { return level(fx_control_temperature_all, l); }
Pass fade(int32_t l) { return coded(fx_control_fadedcolor_all, l); }
Pass exposure(int32_t l) { return coded(fx_control_exposure_all, l); }
Pass auto_adjust() {
  return [](uint32_t* p, int32_t w, int32_t h) { fx_process_hdr(p, p, w, h); };
}

TEST(PresetLooks, EachLookIsItsChainOfPasses) {
  const struct {
    void (*look)(const uint32_t*, uint32_t*, int32_t, int32_t);
    std::vector<Pass> passes;
  } kLooks[] = {
      {fx_apply_retro,
       {saturation(5), brightness(12), fade(50), saturation(7), contrast(9), brightness(11),
        contrast(12)}},
      {fx_apply_sunshine, {contrast(11), temperature(14), gains(11, 12, 8), contrast(11)}},
      {fx_apply_downlight,
       {fade(50), auto_adjust(), contrast(9), saturation(7), gains(9, 9, 9), exposure(13)}},
      {fx_apply_bluewash,
       {contrast(12), saturation(7), temperature(6), exposure(11), gains(10, 9, 11)}},
      {fx_apply_nostalgia,
       {brightness(12), fade(50), exposure(11), saturation(7), temperature(13)}},
      {fx_apply_yellowglow,
       {fade(50), temperature(12), exposure(13), saturation(8), gains(13, 14, 9), contrast(13)}},
  };
  for (const auto& [w, h] : {std::pair{61, 37}, std::pair{160, 151}}) {
    const Pixels img = pfx::test::random_image(w, h, 21);
    for (const auto& l : kLooks) {
      Pixels fused(img.size()), passes = img;
      l.look(img.data(), fused.data(), w, h);
      for (const Pass& pass : l.passes) pass(passes.data(), w, h);
      EXPECT_EQ(fused, passes);
    }
  }
}

}  // namespace
