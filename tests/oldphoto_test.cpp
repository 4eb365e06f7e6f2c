// Old photo: the plain look's table, sizes beyond the vignette table, its partial rule over the
// whole image; the textured look over transparent pixels and in place.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Mask;
using pfx::test::Pixels;

constexpr uint32_t kGrey = 0xFF808080u;

// (v - 128) / 10 rounded away from zero.
TEST(OldPhoto, TableFollowsItsRule) {
  for (int32_t v = 0; v < 256; ++v) {
    const double d = v - 128.0;
    const double rule = d == 0 ? 0 : std::copysign(std::ceil(std::fabs(d) / 10), d);
    EXPECT_EQ(LUT_OLDPHOTO[v], static_cast<int32_t>(rule)) << v;
  }
}

// Wider than the vignette table covers, and below two pixels: the centre keeps the look's
// colour and the border darkens as in a small image.
TEST(OldPhoto, SizesBeyondTheTableAndBelowTwoPixels) {
  const auto at = [](int32_t w, int32_t h, int32_t x, int32_t y) {
    const Pixels img = pfx::test::filled(w, h, kGrey);
    Pixels out(img.size(), 0);
    fx_apply_oldphoto(img.data(), out.data(), w, h);
    return out[static_cast<size_t>(y * w + x)];
  };
  const uint32_t centre = argb(0xFF, 152, 128, 105), border = argb(0xFF, 76, 64, 52);
  EXPECT_EQ(at(96, 96, 48, 48), centre);
  EXPECT_EQ(at(96, 96, 0, 48), border);
  EXPECT_EQ(at(8300, 1, 4150, 0), centre);
  EXPECT_EQ(at(8300, 1, 0, 0), border);
  EXPECT_EQ(at(1, 1, 0, 0), centre);
}

// Valid bounds only switch the mask on: every pixel of the image with mask byte 1 shows the
// look, inside the rectangle or not, and every other pixel is the source, also in place.
TEST(OldPhoto, PartialMasksTheWholeImage) {
  const int32_t w = 10, h = 8;
  const Pixels img = pfx::test::random_image(w, h, 111);
  const Mask mask = pfx::test::random_mask(w, h, 112);
  Pixels full(img.size()), part(img.size(), 0xABABABABu);
  applyOldPhoto(img.data(), full.data(), w, h);
  applyOldPhotoPartial(img.data(), mask.data(), part.data(), w, h, 3, 4, 2, 3);
  for (size_t i = 0; i < img.size(); ++i) {
    EXPECT_EQ(part[i], mask[i] == 1 ? full[i] : img[i]) << i;
  }
  Pixels in_place = img;
  fx_apply_oldphoto_partial(in_place.data(), mask.data(), in_place.data(), w, h, 3, 4, 2, 3);
  EXPECT_EQ(in_place, part);
  fx_apply_oldphoto_partial(img.data(), nullptr, part.data(), w, h, 4, 3, 0, 0);
  EXPECT_EQ(part, full);
}

// Over a texture equal to the colour-toned image the look is that image, pixel for pixel; a
// fully transparent pixel is never mixed, whatever the texture: it keeps its toned colour. The
// texture's alpha plays no part. Each pixel is made from its own source and texture words only,
// so the destination may be the source or the texture.
TEST(OldPhoto, TextureMixesIntoTheTonedImageAndSkipsTransparentPixels) {
  const int32_t w = 16, h = 16;
  Pixels img = pfx::test::random_image(w, h, 113);
  for (size_t i = 0; i < img.size(); i += 5) img[i] &= 0x00FFFFFFu;
  Pixels toned(img.size()), out(img.size());
  ASSERT_EQ(fx_change_colortone(img.data(), toned.data(), w, h, 14), PHOTOFX_SUCCESS);
  fx_apply_oldphoto_texture(img.data(), out.data(), toned.data(), w, h);
  EXPECT_EQ(out, toned);
  const Pixels white = pfx::test::filled(w, h, 0x00FFFFFFu);
  fx_apply_oldphoto_texture(img.data(), out.data(), white.data(), w, h);
  for (size_t i = 0; i < img.size(); ++i) {
    if ((img[i] >> 24) == 0) {
      EXPECT_EQ(out[i], toned[i]) << i;
    } else {
      EXPECT_NE(out[i], toned[i]) << i;  // a quarter of white lifts every channel
    }
  }
  Pixels in_place = img, onto_texture = white;
  fx_apply_oldphoto_texture(in_place.data(), in_place.data(), white.data(), w, h);
  fx_apply_oldphoto_texture(img.data(), onto_texture.data(), onto_texture.data(), w, h);
  EXPECT_EQ(in_place, out);
  EXPECT_EQ(onto_texture, out);
}

}  // namespace
