// The command-line tool's image files: PNG round trips to the bit, the PNG layouts a mask or a
// photograph may come in, JPEG fidelity, and failures that leave nothing behind. The tool's own
// tests run the messages users see (missing, foreign and truncated PNG files, unknown formats).
#include <gtest/gtest.h>
#include <png.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <set>
#include <string>
#include <vector>

#include "support/files.h"
#include "support/images.h"
#include "tools/image.h"

namespace {

using fxtool::Image;
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
// must come back opaque.
TEST(ImageFiles, PngRoundTripKeepsEveryBitWithAndWithoutAlpha) {
  TempDir dir;
  for (uint32_t alpha : {0u, 0xFF000000u}) {
    const Image img = random_image(37, 19, 1 + alpha, alpha);
    ASSERT_EQ(fxtool::write_image(dir / "a.png", img), "");
    const Image back = read_back(dir / "a.png");
    EXPECT_EQ(back.width, 37);
    EXPECT_EQ(back.pixels, img.pixels) << std::hex << alpha;
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

TEST(ImageFiles, JpegDropsAlphaAndStaysClose) {
  TempDir dir;
  Image img;
  img.resize(40, 24);
  for (int32_t y = 0; y < 24; ++y) {
    for (int32_t x = 0; x < 40; ++x)
      img.at(x, y) = pfx::test::argb(0x40, 60 + 3 * x, 90 + 2 * y, 120);
  }
  for (const char* name : {"a.jpg", "b.JPEG"}) {
    ASSERT_EQ(fxtool::write_image(dir / name, img), "");
    const Image back = read_back(dir / name);
    ASSERT_EQ(back.pixels.size(), img.pixels.size());
    int64_t diff = 0;  // over every colour channel: a mean error under 2
    for (size_t i = 0; i < img.pixels.size(); ++i) {
      EXPECT_EQ(back.pixels[i] >> 24, 0xFFu);
      for (int c = 0; c < 24; c += 8) {
        diff += std::abs(int32_t(back.pixels[i] >> c & 255) - int32_t(img.pixels[i] >> c & 255));
      }
    }
    EXPECT_LT(diff, static_cast<int64_t>(img.pixels.size()) * 3 * 2) << name;
  }
}

// Truncated files of both kinds fail rather than decode to partly grey pictures.
TEST(ImageFiles, DirectoriesAndTruncatedFilesAreReportedNotDecoded) {
  TempDir dir;
  Image img;
  EXPECT_EQ(fxtool::read_image(dir.path().string(), img), "cannot read: Is a directory");
  ASSERT_EQ(fxtool::write_image(dir / "whole.png", random_image(64, 64, 3)), "");
  ASSERT_EQ(fxtool::write_image(dir / "whole.jpg", random_image(64, 64, 4)), "");
  for (const char* name : {"whole.png", "whole.jpg"}) {
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

TEST(ImageFiles, FormatFollowsTheExtensionInAnyCase) {
  using fxtool::FileFormat;
  for (const auto& [name, format] : {std::pair{"a.PNG", FileFormat::kPng},
                                     {"dir.jpg/a.Jpeg", FileFormat::kJpeg},
                                     {"a.jpg", FileFormat::kJpeg},
                                     {"png", FileFormat::kUnknown},
                                     {"a.png.bak", FileFormat::kUnknown}}) {
    EXPECT_EQ(fxtool::format_of_name(name), format) << name;
  }
}

}  // namespace
