// The command-line tool's image files: lossless round trips to the bit, the PNG and TIFF layouts
// a mask or a photograph may come in, lossy fidelity, EXIF orientations, files too large to
// decode, and failures that leave nothing behind. The tool's own tests run the messages users
// see and the metadata of a phone's photograph.
#include <gtest/gtest.h>
#include <png.h>
#include <tiffio.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <set>
#include <string>
#include <vector>

#include "support/files.h"
#include "support/images.h"
#include "tools/exif.h"
#include "tools/image.h"

namespace {

using fxtool::Image;
using fxtool::Pixels;
using pfx::test::TempDir;

Image random_image(int32_t w, int32_t h, uint64_t seed, uint32_t alpha_bits = 0) {
  Image img;
  img.width = w;
  img.height = h;
  const pfx::test::Pixels px = pfx::test::random_image(w, h, seed);
  img.pixels.assign(px.begin(), px.end());
  for (uint32_t& p : img.pixels) p |= alpha_bits;
  return img;
}

Image read_back(const std::string& path) {
  Image img;
  EXPECT_EQ(fxtool::read_image(path, img), "") << path;
  return img;
}

// Writes a PNG of any colour type and depth straight through libpng, so the reader meets
// layouts the tool itself never writes. 16-bit samples are two bytes, most significant first.
void write_raw_png(const std::string& path, int32_t w, int colour_type, int depth,
                   std::vector<uint8_t> row) {
  FILE* f = std::fopen(path.c_str(), "wb");
  ASSERT_NE(f, nullptr);
  png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
  png_infop info = png_create_info_struct(png);
  png_init_io(png, f);
  png_set_IHDR(png, info, static_cast<png_uint_32>(w), 1, depth, colour_type, PNG_INTERLACE_NONE,
               PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
  png_write_info(png, info);
  png_write_row(png, row.data());
  png_write_end(png, nullptr);
  png_destroy_write_struct(&png, &info);
  std::fclose(f);
}

// Translucent pictures keep their alpha; opaque ones are written without an alpha channel and
// must come back opaque. Lossless WebP keeps the colour under transparent pixels too.
TEST(ImageFiles, LosslessRoundTripsKeepEveryBitWithAndWithoutAlpha) {
  TempDir dir;
  for (const char* name : {"a.png", "a.tif", "a.webp"}) {
    for (uint32_t alpha : {0u, 0xFF000000u}) {
      const Image img = random_image(37, 19, 1 + alpha, alpha);
      ASSERT_EQ(fxtool::write_image(dir / name, img, {.lossless = true}), "");
      const Image back = read_back(dir / name);
      EXPECT_EQ(back.width, 37);
      // Against a fresh copy: the encoders are handed the picture's own words.
      EXPECT_EQ(back.pixels, random_image(37, 19, 1 + alpha, alpha).pixels) << name << alpha;
    }
  }
}

// The crop was cut from the same photograph by a separate decoder: the reader's channel order
// and alpha are checked against it, not against the tool's own writer.
TEST(ImageFiles, PngDecodesToTheSamePixelsAsTheRawCrop) {
  const Image photo = read_back(PHOTOFX_ASSET_DIR "/coffee.png");
  ASSERT_EQ(photo.width, 600);
  ASSERT_EQ(photo.height, 400);
  const std::string raw = pfx::test::read_file(PHOTOFX_TEST_DATA_DIR "/coffee_64x48.argb");
  ASSERT_EQ(raw.size(), 64u * 48u * 4u);
  for (size_t i = 0; i < 64 * 48; ++i) {
    uint32_t word = 0;
    for (size_t b = 0; b < 4; ++b) word |= uint32_t{uint8_t(raw[4 * i + b])} << (8 * b);
    ASSERT_EQ(photo.at(240 + int32_t(i % 64), 120 + int32_t(i / 64)), word) << i;
  }
}

TEST(ImageFiles, GreyAndSixteenBitPngsBecomeEightBitArgb) {
  TempDir dir;
  write_raw_png(dir / "grey.png", 3, PNG_COLOR_TYPE_GRAY, 8, {0, 128, 255});
  write_raw_png(dir / "grey-alpha.png", 2, PNG_COLOR_TYPE_GRAY_ALPHA, 8, {200, 10, 50, 255});
  write_raw_png(dir / "rgb16.png", 1, PNG_COLOR_TYPE_RGB, 16, {0x12, 0xFF, 0xAB, 0x00, 0x01, 0x80});
  EXPECT_EQ(read_back(dir / "grey.png").pixels,
            (fxtool::Pixels{0xFF000000u, 0xFF808080u, 0xFFFFFFFFu}));
  EXPECT_EQ(read_back(dir / "grey-alpha.png").pixels, (fxtool::Pixels{0x0AC8C8C8u, 0xFF323232u}));
  EXPECT_EQ(read_back(dir / "rgb16.png").pixels, (fxtool::Pixels{0xFF12AB01u}));
}

// JPEG drops alpha; lossy WebP keeps it (losslessly, by default).
TEST(ImageFiles, LossyFormatsStayClose) {
  TempDir dir;
  Image img;
  img.resize(40, 24);
  for (int32_t y = 0; y < 24; ++y) {
    for (int32_t x = 0; x < 40; ++x)
      img.at(x, y) = pfx::test::argb(0x40, 60 + 3 * x, 90 + 2 * y, 120);
  }
  for (const char* name : {"a.jpg", "b.JPEG", "c.webp"}) {
    ASSERT_EQ(fxtool::write_image(dir / name, img), "");
    const Image back = read_back(dir / name);
    ASSERT_EQ(back.pixels.size(), img.pixels.size());
    int64_t diff = 0;  // over every colour channel: a mean error under 2
    const uint32_t alpha = name[0] == 'c' ? 0x40u : 0xFFu;
    for (size_t i = 0; i < img.pixels.size(); ++i) {
      EXPECT_EQ(back.pixels[i] >> 24, alpha);
      for (int c = 0; c < 24; c += 8) {
        diff += std::abs(int32_t(back.pixels[i] >> c & 255) - int32_t(img.pixels[i] >> c & 255));
      }
    }
    EXPECT_LT(diff, static_cast<int64_t>(img.pixels.size()) * 3 * 2) << name;
  }
}

// Truncated files of every kind fail rather than decode to partly grey pictures.
TEST(ImageFiles, DirectoriesAndTruncatedFilesAreReportedNotDecoded) {
  TempDir dir;
  Image img;
  EXPECT_EQ(fxtool::read_image(dir.path().string(), img), "cannot read: Is a directory");
  for (const char* name : {"whole.png", "whole.jpg", "whole.webp", "whole.tif"}) {
    ASSERT_EQ(fxtool::write_image(dir / name, random_image(64, 64, 3)), "");
    const std::string bytes = pfx::test::read_file(dir / name);
    pfx::test::write_file(dir / "cut", bytes.substr(0, bytes.size() / 2));
    const std::string err = fxtool::read_image(dir / "cut", img);
    EXPECT_NE(err.find("cannot decode"), std::string::npos) << name << ": " << err;
    EXPECT_TRUE(img.pixels.empty());
  }
}

// Files are written under a temporary name and renamed into place: a failed rename leaves no
// temporary file behind, and an existing file is replaced whole.
TEST(ImageFiles, FailedWritesLeaveNoFileBehindAndGoodOnesReplaceWhole) {
  TempDir dir;
  const Image img = random_image(5, 3, 5);
  std::filesystem::create_directory(dir / "taken.png");
  EXPECT_EQ(fxtool::write_image(dir / "taken.png", img), "cannot write: Is a directory");
  pfx::test::write_file(dir / "a.png", std::string(100000, 'x'));
  ASSERT_EQ(fxtool::write_image(dir / "a.png", img), "");
  EXPECT_EQ(read_back(dir / "a.png").pixels, img.pixels);
  EXPECT_EQ(dir.entries(), (std::set<std::string>{"a.png", "taken.png"}));
}

// TIFF layouts other than the tool's own, written through libtiff: grey, grey with alpha,
// RGBA with premultiplied alpha (made plain again), 16-bit (rounded to 8) and palette pictures
// (both through libtiff's RGBA reader, red first in its words).
TEST(ImageFiles, TiffLayoutsBecomeEightBitArgb) {
  TempDir dir;
  const auto write = [&](const char* name, uint16_t photometric, uint16_t samples, uint16_t bits,
                         uint16_t extra, std::vector<uint8_t> row) {
    TIFF* t = TIFFOpen((dir / name).c_str(), "w");
    ASSERT_NE(t, nullptr);
    TIFFSetField(t, TIFFTAG_IMAGEWIDTH, 2);
    TIFFSetField(t, TIFFTAG_IMAGELENGTH, 1);
    TIFFSetField(t, TIFFTAG_BITSPERSAMPLE, bits);
    TIFFSetField(t, TIFFTAG_SAMPLESPERPIXEL, samples);
    TIFFSetField(t, TIFFTAG_PHOTOMETRIC, photometric);
    TIFFSetField(t, TIFFTAG_PLANARCONFIG, PLANARCONFIG_CONTIG);
    if (extra != 0) TIFFSetField(t, TIFFTAG_EXTRASAMPLES, 1, &extra);
    if (photometric == PHOTOMETRIC_PALETTE) {
      std::vector<uint16_t> r(256, 0), g(256, 0), b(256, 0);
      r[1] = 0x1200, g[1] = 0x3400, b[1] = 0x5600;
      TIFFSetField(t, TIFFTAG_COLORMAP, r.data(), g.data(), b.data());
    }
    TIFFWriteScanline(t, row.data(), 0, 0);
    TIFFClose(t);
  };
  write("grey.tif", PHOTOMETRIC_MINISBLACK, 1, 8, 0, {0x10, 0xF0});
  write("grey-alpha.tif", PHOTOMETRIC_MINISBLACK, 2, 8, EXTRASAMPLE_UNASSALPHA, {9, 0x80, 7, 0});
  write("premultiplied.tif", PHOTOMETRIC_RGB, 4, 8, EXTRASAMPLE_ASSOCALPHA,
        {0x40, 0x20, 0x10, 0x80, 1, 2, 3, 0xFF});
  write("rgb16.tif", PHOTOMETRIC_RGB, 3, 16, 0, {0, 0x12, 0, 0xAB, 0xFF, 0x01, 1, 2, 3, 4, 5, 6});
  write("palette.tif", PHOTOMETRIC_PALETTE, 1, 8, 0, {1, 0});
  const std::pair<const char*, Pixels> cases[] = {
      {"grey.tif", {0xFF101010u, 0xFFF0F0F0u}},
      {"grey-alpha.tif", {0x80090909u, 0x00070707u}},
      {"premultiplied.tif", {0x80804020u, 0xFF010203u}},
      {"rgb16.tif", {0xFF12AA02u, 0xFF020406u}},
      {"palette.tif", {0xFF123456u, 0xFF000000u}},
  };
  for (const auto& [name, pixels] : cases) EXPECT_EQ(read_back(dir / name).pixels, pixels) << name;
}

// Each EXIF orientation turned upright, on a 3 x 2 picture numbered row by row: the upright
// rows as they should read. A block that ends inside its directory has no orientation.
TEST(ImageFiles, EachExifOrientationTurnsUpright) {
  const std::vector<Pixels> upright = {{0, 1, 2, 3, 4, 5}, {2, 1, 0, 5, 4, 3}, {5, 4, 3, 2, 1, 0},
                                       {3, 4, 5, 0, 1, 2}, {0, 3, 1, 4, 2, 5}, {3, 0, 4, 1, 5, 2},
                                       {5, 2, 4, 1, 3, 0}, {2, 5, 1, 4, 0, 3}};
  for (int32_t orientation = 1; orientation <= 8; ++orientation) {
    Image img;
    img.resize(3, 2);
    for (uint32_t i = 0; i < 6; ++i) img.pixels[i] = i;
    std::string exif = fxtool::make_exif(4, {{271, "maker"}});
    ASSERT_TRUE(fxtool::set_exif_orientation(exif, orientation));
    ASSERT_EQ(fxtool::exif_orientation(exif), orientation);
    fxtool::orient_upright(img, orientation);
    EXPECT_EQ(img.width, orientation <= 4 ? 3 : 2) << orientation;
    EXPECT_EQ(img.pixels, upright[size_t(orientation - 1)]) << orientation;
  }
  const std::string exif = fxtool::make_exif(6, {{271, "maker"}});
  EXPECT_EQ(fxtool::exif_text_tags(exif), (fxtool::TextTags{{271, "maker"}}));
  EXPECT_EQ(fxtool::exif_orientation(exif.substr(0, 20)), 0);
  EXPECT_TRUE(fxtool::exif_text_tags(exif.substr(0, 40)).empty());
}

// A small file that declares a huge picture is refused from its header, before the pixels
// are allocated; a lower limit refuses smaller pictures the same way.
TEST(ImageFiles, PicturesAboveThePixelLimitAreRefusedUnread) {
  TempDir dir;
  FILE* f = std::fopen((dir / "bomb.png").c_str(), "wb");
  png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
  png_infop info = png_create_info_struct(png);
  png_init_io(png, f);
  png_set_compression_level(png, 0);  // stored: the row reaches the file at once
  png_set_IHDR(png, info, 20000, 20000, 8, PNG_COLOR_TYPE_RGB, PNG_INTERLACE_NONE,
               PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
  png_write_info(png, info);
  const std::vector<uint8_t> row(60000, 0);
  png_write_row(png, row.data());  // one row of pixels, and not another
  png_destroy_write_struct(&png, &info);
  std::fclose(f);
  Image img;
  EXPECT_EQ(fxtool::read_image(dir / "bomb.png", img),
            "image too large: 20000x20000 is 400000000 pixels, more than --max-pixels 250000000 "
            "allows");
  ASSERT_EQ(fxtool::write_image(dir / "small.webp", random_image(10, 10, 6)), "");
  EXPECT_EQ(fxtool::read_image(dir / "small.webp", img, {.max_pixels = 99}),
            "image too large: 10x10 is 100 pixels, more than --max-pixels 99 allows");
  EXPECT_TRUE(img.pixels.empty());
}

TEST(ImageFiles, FormatFollowsTheExtensionInAnyCase) {
  using fxtool::FileFormat;
  for (const auto& [name, format] : {std::pair{"a.PNG", FileFormat::kPng},
                                     {"dir.jpg/a.Jpeg", FileFormat::kJpeg},
                                     {"a.jpg", FileFormat::kJpeg},
                                     {"a.WebP", FileFormat::kWebp},
                                     {"a.tif", FileFormat::kTiff},
                                     {"a.TIFF", FileFormat::kTiff},
                                     {"png", FileFormat::kUnknown},
                                     {"a.png.bak", FileFormat::kUnknown}}) {
    EXPECT_EQ(fxtool::format_of_name(name), format) << name;
  }
}

}  // namespace
