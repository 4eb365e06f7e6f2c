// Conformance goldens of the blur and retouching family: scale-down, both blurs of the working
// image, compositing, the workspace previews and the one-shot calls of the depth-of-field blur
// and tilt-shift; sharpen, pixelize, the pixelize brush and red-eye removal.
#include <gtest/gtest.h>

#include <cstdint>
#include <vector>

#include "photofx.h"
#include "support/conformance.h"

namespace {

using pfx::Rect;
using pfx::test::Digest;
using pfx::test::Input;
using pfx::test::Pixels;
using Bytes = std::vector<uint8_t>;

constexpr int32_t kLevels[] = {-1, 0, 1, 2, 3, 4, 5, 6, 7, 8, 100};

// The shared inputs work at full size; this one is reduced by 4 per side (220 x 13 samples), so
// the goldens also cover interpolation between working samples.
const std::vector<Input>& inputs() {
  static const std::vector<Input> all_inputs = [] {
    std::vector<Input> v = pfx::test::conformance_inputs();
    v.push_back({"wide", 880, 52, pfx::test::random_image(880, 52, 2027),
                 pfx::test::random_mask(880, 52, 52)});
    return v;
  }();
  return all_inputs;
}

void add_bytes(Digest& d, const Bytes& b) {
  const Pixels words(b.begin(), b.end());
  d.add(words);
}

struct Working {
  int32_t sw, sh;
  Bytes image, depth;
};

Working working_copy(const Input& in) {
  const int32_t k = in.width > 850 ? 2 : 0;
  Working w{in.width >> k, in.height >> k, {}, {}};
  w.image.assign(static_cast<size_t>(w.sw) * w.sh * 3, 0);
  w.depth.assign(static_cast<size_t>(w.sw) * w.sh, 0);
  scale_down_img(in.pixels.data(), in.width, in.height, w.image.data(), w.sw, w.sh);
  scale_down_depth(in.mask.data(), in.width, in.height, w.depth.data(), w.sw, w.sh);
  return w;
}

TEST(Conformance, ScaleDownAndWorkingBlurs) {
  Digest scale, gauss, lens;
  for (const Input& in : inputs()) {
    const Working w = working_copy(in);
    add_bytes(scale, w.image);
    add_bytes(scale, w.depth);
    for (int32_t level : kLevels) {
      Bytes out(w.image.size(), 0xA5);
      make_gaussian_blur(w.image.data(), out.data(), w.depth.data(), w.sw, w.sh, level);
      add_bytes(gauss, out);
      make_lens_blur(w.image.data(), out.data(), w.depth.data(), w.sw, w.sh, level);
      add_bytes(lens, out);
    }
  }
  EXPECT_GOLDEN("scale_down", scale, 0x208693c9001cb969ull);
  EXPECT_GOLDEN("make_gaussian_blur", gauss, 0x0de03b33b31a4351ull);
  EXPECT_GOLDEN("make_lens_blur", lens, 0x9afd70f24df5028cull);
}

TEST(Conformance, RunBlur) {
  Digest d;
  for (const Input& in : inputs()) {
    const Working w = working_copy(in);
    Bytes blurred(w.image.size());
    make_lens_blur(w.image.data(), blurred.data(), w.depth.data(), w.sw, w.sh, 5);
    for (int32_t flag : {0, 1}) {
      all = flag;
      Pixels out(in.pixels.size(), 0xA5A5A5A5u);
      run_blur(in.pixels.data(), blurred.data(), in.mask.data(), w.depth.data(), out.data(),
               in.width, in.height, w.sw, w.sh);
      d.add(out);
    }
  }
  all = 0;
  EXPECT_GOLDEN("run_blur", d, 0x328d557e2c77fab8ull);
}

TEST(Conformance, Blur) {
  Digest one_shot, preview;
  for (const Input& in : inputs()) {
    for (const Rect& b : pfx::test::conformance_bounds(in.width, in.height)) {
      fx_Init_blur(in.pixels.data(), in.mask.data(), in.width, in.height, b.left, b.right, b.top,
                   b.bottom);
      for (int32_t level : kLevels) {
        Pixels out(in.pixels.size(), 0xA5A5A5A5u);
        fx_make_blur(in.pixels.data(), in.mask.data(), out.data(), in.width, in.height, level,
                     b.left, b.right, b.top, b.bottom);
        one_shot.add(out);
        Pixels prev(in.pixels.size(), 0xA5A5A5A5u);
        fx_make_blur_preview(in.pixels.data(), in.mask.data(), prev.data(), in.width, in.height,
                             level);
        preview.add(prev);
      }
      Pixels in_place = in.pixels;
      fx_make_blur(in_place.data(), in.mask.data(), in_place.data(), in.width, in.height, 8, b.left,
                   b.right, b.top, b.bottom);
      one_shot.add(in_place);
      fx_destroy_blur();
    }
  }
  all = 0;
  EXPECT_GOLDEN("fx_make_blur", one_shot, 0xc672d9dfcd9bd9fbull);
  EXPECT_GOLDEN("fx_make_blur_preview", preview, 0x4b9f43b6e4a27c4dull);
}

TEST(Conformance, TiltShift) {
  Digest one_shot, preview, blur, lens;
  for (const Input& in : inputs()) {
    const int32_t h = in.height;
    const std::pair<int32_t, int32_t> bands[] = {{h / 2, h / 8}, {h / 3, 0}, {0, 2},
                                                 {h - 1, h / 4}, {h / 2, h}, {-5, 3}};
    fx_init_tiltshift(in.pixels.data(), in.width, in.height);
    for (const auto& [c, r] : bands) {
      Pixels out(in.pixels.size(), 0xA5A5A5A5u);
      fx_apply_tiltshift(in.pixels.data(), out.data(), in.width, h, c, r);
      one_shot.add(out);
      Pixels prev(in.pixels.size(), 0xA5A5A5A5u);
      fx_tiltshift_preview(in.pixels.data(), prev.data(), in.width, h, c, r);
      preview.add(prev);
    }
    fx_destroy_tiltshift();
    const Working w = working_copy(in);
    Bytes out(w.image.size(), 0xA5);
    make_tiltshift(w.image.data(), out.data(), w.sw, w.sh);
    add_bytes(blur, out);
    for (const auto& [c, r] : bands) {
      make_tiltshift_lens(w.image.data(), out.data(), w.sw, w.sh, c >> 2, r >> 2);
      add_bytes(lens, out);
    }
  }
  EXPECT_GOLDEN("fx_apply_tiltshift", one_shot, 0x6f37de4ab637f674ull);
  EXPECT_GOLDEN("fx_tiltshift_preview", preview, 0x6f37de4ab637f674ull);
  EXPECT_GOLDEN("make_tiltshift", blur, 0xab691d9b00d06457ull);
  EXPECT_GOLDEN("make_tiltshift_lens", lens, 0x3b2bd6a8d6266293ull);
}

// Brush dabs of every kind: inside, on each edge, beyond a corner, off the image, radius 0 and
// negative, and one large enough to cover everything.
struct Dab {
  int32_t cx, cy, radius;
};

std::vector<Dab> dabs(int32_t w, int32_t h) {
  return {{w / 2, h / 2, 5},  {0, h / 3, 7},      {w - 1, h - 1, 9}, {-4, -3, 8},
          {w + 2, h / 2, 4},  {w / 3, h / 4, 0},  {w / 3, 2, -3},    {w / 2, h / 2, 10000},
          {w / 4, h - 2, 13}, {3 * w / 4, -1, 6}, {w * 4, h * 4, 2}};
}

TEST(Conformance, Sharpen) {
  Digest d;
  pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
    fx_apply_sharpen_all(s, o, w, h);
  });
  for (int32_t level : {0, 10, 20}) {
    pfx::test::digest_partial(
        d, [&](const uint32_t* s, const uint8_t* m, uint32_t* o, int32_t w, int32_t h, Rect b) {
          fx_apply_sharpen(s, m, o, w, h, level, b.left, b.right, b.top, b.bottom);
        });
  }
  EXPECT_GOLDEN("sharpen", d, 0x6683a4fde5105c9full);
}

TEST(Conformance, Pixelize) {
  Digest d;
  for (int32_t shift : {0, 1, 2, 3, 5, 31, -1, 32}) {
    pfx::test::digest_full(d, [&](const uint32_t* s, uint32_t* o, int32_t w, int32_t h) {
      fx_apply_pixelize(s, o, w, h, shift);
    });
  }
  EXPECT_GOLDEN("pixelize", d, 0x38c30d0e41a36169ull);
}

TEST(Conformance, PixelizeBrush) {
  Digest d;
  for (const Input& in : pfx::test::conformance_inputs()) {
    for (int32_t shift : {0, 2, 3, 4, 32}) {
      Pixels img = in.pixels;
      for (const Dab& dab : dabs(in.width, in.height)) {
        fx_rub_pixelize(img.data(), in.width, in.height, shift, dab.cx, dab.cy, dab.radius);
        d.add(img);
      }
    }
  }
  EXPECT_GOLDEN("pixelize brush", d, 0x0f4c47439120bc67ull);
}

TEST(Conformance, Redeye) {
  Digest d;
  for (const Input& in : pfx::test::conformance_inputs()) {
    Pixels img = in.pixels;
    for (const Dab& dab : dabs(in.width, in.height)) {
      fx_remove_redeye(img.data(), in.width, in.height, dab.cx, dab.cy, dab.radius);
      d.add(img);
    }
  }
  EXPECT_GOLDEN("red-eye", d, 0x320ce44206c87afcull);
}

}  // namespace
