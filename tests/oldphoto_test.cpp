// Old photo: the plain look at the centre and the border, its table, its partial rule over the
// whole image; the textured look end to end, over transparent pixels, and its partial variant.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Mask;
using pfx::test::Pixels;

constexpr uint32_t kBlack = 0xFF000000u, kWhite = 0xFFFFFFFFu, kGrey = 0xFF808080u;

uint32_t oldphoto_at(uint32_t colour, int32_t w, int32_t h, int32_t x, int32_t y) {
  const Pixels img = pfx::test::filled(w, h, colour);
  Pixels out(img.size(), 0);
  fx_apply_oldphoto(img.data(), out.data(), w, h);
  return out[static_cast<size_t>(y * w + x)];
}

TEST(OldPhoto, TableFollowsItsRule) {
  for (int32_t v = 0; v < 256; ++v) {
    const double d = v - 128.0;
    const double rule = d == 0 ? 0 : std::copysign(std::ceil(std::fabs(d) / 10), d);
    EXPECT_EQ(LUT_OLDPHOTO[v], static_cast<int32_t>(rule)) << v;
  }
  EXPECT_EQ(LUT_OLDPHOTO[7], -13);
  EXPECT_EQ(LUT_OLDPHOTO[8], -12);
  EXPECT_EQ(LUT_OLDPHOTO[128], 0);
  EXPECT_EQ(LUT_OLDPHOTO[129], 1);
  EXPECT_EQ(LUT_OLDPHOTO[249], 13);
}

TEST(OldPhoto, CentreAndBorderValues) {
  const uint32_t colours[] = {kBlack, kWhite, kGrey, argb(0xFF, 200, 100, 50)};
  const uint32_t centre[] = {argb(0xFF, 26, 26, 26), argb(0xFF, 229, 229, 229),
                             argb(0xFF, 152, 128, 105), argb(0xFF, 196, 106, 56)};
  const uint32_t border[] = {argb(0xFF, 13, 13, 13), argb(0xFF, 114, 114, 114),
                             argb(0xFF, 76, 64, 52), argb(0xFF, 98, 53, 28)};
  for (size_t c = 0; c < 4; ++c) {
    EXPECT_EQ(oldphoto_at(colours[c], 96, 96, 48, 48), centre[c]) << c;
    EXPECT_EQ(oldphoto_at(colours[c], 96, 96, 0, 48), border[c]) << c;
    EXPECT_EQ(oldphoto_at(colours[c], 1, 1, 0, 0), centre[c]) << c;
  }
  // Alpha comes from the source; a size beyond the vignette table still has its centre intact.
  EXPECT_EQ(oldphoto_at(argb(0x3C, 128, 128, 128), 5, 3, 2, 1), argb(0x3C, 152, 128, 105));
  EXPECT_EQ(oldphoto_at(kGrey, 8300, 1, 4150, 0), argb(0xFF, 152, 128, 105));
  EXPECT_EQ(oldphoto_at(kGrey, 8300, 1, 0, 0), argb(0xFF, 76, 64, 52));
}

// Valid bounds only switch the mask on: every pixel of the image with mask byte 1 shows the
// look, inside the rectangle or not, and every other pixel is the source.
TEST(OldPhoto, PartialMasksTheWholeImage) {
  const int32_t w = 10, h = 8;
  const Pixels img = pfx::test::random_image(w, h, 111);
  const Mask mask = pfx::test::random_mask(w, h, 112);
  Pixels full(img.size()), part(img.size(), 0xABABABABu);
  fx_apply_oldphoto(img.data(), full.data(), w, h);
  applyOldPhotoPartial(img.data(), mask.data(), part.data(), w, h, 3, 4, 2, 3);
  for (size_t i = 0; i < img.size(); ++i) {
    EXPECT_EQ(part[i], mask[i] == 1 ? full[i] : img[i]) << i;
  }
  Pixels in_place = img;
  fx_apply_oldphoto_partial(in_place.data(), mask.data(), in_place.data(), w, h, 3, 4, 2, 3);
  EXPECT_EQ(in_place, part);
  fx_apply_oldphoto_partial(img.data(), nullptr, part.data(), w, h, 4, 3, 0, 0);
  EXPECT_EQ(part, full);
  Pixels dst(img.size(), 0x01010101u);
  fx_apply_oldphoto_partial(img.data(), nullptr, dst.data(), w, h, 0, 9, 0, 7);
  fx_apply_oldphoto_partial(nullptr, mask.data(), dst.data(), w, h, 0, 9, 0, 7);
  fx_apply_oldphoto(img.data(), dst.data(), 65536, 65536);
  EXPECT_EQ(dst, Pixels(img.size(), 0x01010101u));
}

uint32_t textured(uint32_t p, uint32_t texture) {
  uint32_t out = 0;
  fx_apply_oldphoto_texture(&p, &out, &texture, 1, 1);
  return out;
}

TEST(OldPhoto, TextureEndToEnd) {
  EXPECT_EQ(textured(kGrey, kBlack), argb(0xFF, 96, 74, 67));
  EXPECT_EQ(textured(kGrey, kWhite), argb(0xFF, 159, 138, 131));
  EXPECT_EQ(textured(kWhite, kBlack), argb(0xFF, 191, 147, 134));
  EXPECT_EQ(textured(kWhite, kWhite), argb(0xFF, 255, 210, 198));
  EXPECT_EQ(textured(kBlack, kBlack), kBlack);
  EXPECT_EQ(textured(kBlack, kWhite), argb(0xFF, 63, 63, 63));
  // The texture's alpha plays no part; the pixel's own alpha is kept.
  EXPECT_EQ(textured(argb(0x80, 128, 128, 128), 0x00FFFFFFu), argb(0x80, 159, 138, 131));
}

// Over a texture equal to the colour-toned image the look is that image, pixel for pixel; a
// fully transparent pixel is never mixed, whatever the texture: it keeps its toned colour.
TEST(OldPhoto, TextureMixesIntoTheTonedImageAndSkipsTransparentPixels) {
  const int32_t w = 16, h = 16;
  Pixels img = pfx::test::random_image(w, h, 113);
  for (size_t i = 0; i < img.size(); i += 5) img[i] &= 0x00FFFFFFu;
  Pixels toned(img.size()), out(img.size());
  ASSERT_EQ(fx_change_colortone(img.data(), toned.data(), w, h, 14), PHOTOFX_SUCCESS);
  fx_apply_oldphoto_texture(img.data(), out.data(), toned.data(), w, h);
  EXPECT_EQ(out, toned);
  const Pixels white = pfx::test::filled(w, h, kWhite);
  fx_apply_oldphoto_texture(img.data(), out.data(), white.data(), w, h);
  for (size_t i = 0; i < img.size(); ++i) {
    if ((img[i] >> 24) == 0) {
      EXPECT_EQ(out[i], toned[i]) << i;
    } else {
      EXPECT_NE(out[i], toned[i]) << i;  // a quarter of white lifts every channel
    }
  }
  EXPECT_EQ(textured(0x00808080u, 0xFFFFFFFFu), 0x0080635Au);
}

TEST(OldPhoto, TexturePartialWritesOnlyTheSelection) {
  const int32_t w = 9, h = 7;
  const Pixels img = pfx::test::random_image(w, h, 114);
  const Pixels texture = pfx::test::random_image(w, h, 115);
  const Mask mask = pfx::test::random_mask(w, h, 116);
  Pixels full(img.size()), part(img.size(), 0x5A5A5A5Au);
  fx_apply_oldphoto_texture(img.data(), full.data(), texture.data(), w, h);
  fx_apply_oldphoto_texture_partial(img.data(), part.data(), texture.data(), mask.data(), w, h, 2,
                                    6, 1, 5);
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      const size_t i = static_cast<size_t>(y * w + x);
      const bool selected = x >= 2 && x <= 6 && y >= 1 && y <= 5 && mask[i] == 1;
      EXPECT_EQ(part[i], selected ? full[i] : 0x5A5A5A5Au) << x << "," << y;
    }
  }
  fx_apply_oldphoto_texture_partial(img.data(), part.data(), texture.data(), nullptr, w, h, 0, 8, 7,
                                    0);
  EXPECT_EQ(part, full);
  // In place, and with the texture as destination, the result is the same.
  Pixels in_place = img, onto_texture = texture;
  fx_apply_oldphoto_texture(in_place.data(), in_place.data(), texture.data(), w, h);
  fx_apply_oldphoto_texture(img.data(), onto_texture.data(), onto_texture.data(), w, h);
  EXPECT_EQ(in_place, full);
  EXPECT_EQ(onto_texture, full);
  // Refused: a missing texture, or a missing mask where the bounds need one.
  Pixels dst(img.size(), 0x5A5A5A5Au);
  fx_apply_oldphoto_texture(img.data(), dst.data(), nullptr, w, h);
  fx_apply_oldphoto_texture_partial(img.data(), dst.data(), nullptr, mask.data(), w, h, 0, 8, 0, 6);
  fx_apply_oldphoto_texture_partial(img.data(), dst.data(), texture.data(), nullptr, w, h, 0, 8, 0,
                                    6);
  EXPECT_EQ(dst, Pixels(img.size(), 0x5A5A5A5Au));
}

}  // namespace
