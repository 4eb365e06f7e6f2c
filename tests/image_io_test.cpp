// The command-line tool's image files: PNG round trips to the bit, the PNG layouts a mask or a
// photograph may come in, JPEG sizes, and failures that leave nothing behind.
#include <gtest/gtest.h>
#include <png.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "support/files.h"
#include "support/images.h"
#include "tools/image.h"

namespace {

using fxtool::Image;
using pfx::test::TempDir;

Image random_image(int32_t w, int32_t h, uint64_t seed, bool opaque) {
  Image img;
  img.width = w;
  img.height = h;
  img.pixels = pfx::test::random_image(w, h, seed);
  if (opaque) {
    for (uint32_t& p : img.pixels) p |= 0xFF000000u;
  }
  return img;
}

// Writes a PNG of any colour type and depth straight through libpng, so the reader meets
// layouts the tool itself never writes. `samples` holds each row's samples, 16-bit ones as two
// bytes, most significant first.
void write_raw_png(const std::string& path, int32_t w, int32_t h, int colour_type, int depth,
                   const std::vector<std::vector<uint8_t>>& rows) {
  FILE* f = std::fopen(path.c_str(), "wb");
  ASSERT_NE(f, nullptr);
  png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
  png_infop info = png_create_info_struct(png);
  png_init_io(png, f);
  png_set_IHDR(png, info, static_cast<png_uint_32>(w), static_cast<png_uint_32>(h), depth,
               colour_type, PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT,
               PNG_FILTER_TYPE_DEFAULT);
  png_write_info(png, info);
  for (const auto& row : rows) png_write_row(png, row.data());
  png_write_end(png, nullptr);
  png_destroy_write_struct(&png, &info);
  std::fclose(f);
}

TEST(ImageFiles, PngRoundTripKeepsEveryBitWithAndWithoutAlpha) {
  TempDir dir;
  for (bool opaque : {false, true}) {
    const Image img = random_image(37, 19, opaque ? 2 : 1, opaque);
    ASSERT_EQ(fxtool::write_image(dir / "a.png", img), "");
    Image back;
    ASSERT_EQ(fxtool::read_image(dir / "a.png", back), "");
    EXPECT_EQ(back.width, 37);
    EXPECT_EQ(back.height, 19);
    EXPECT_EQ(back.pixels, img.pixels) << "opaque " << opaque;
  }
}

TEST(ImageFiles, PngDecodesToTheSamePixelsAsTheRawCrop) {
  // The crop was cut from the same photograph by a separate decoder: channel order and alpha
  // of the reader are checked against it, not against the tool's own writer.
  Image photo;
  ASSERT_EQ(fxtool::read_image(PHOTOFX_ASSET_DIR "/coffee.png", photo), "");
  ASSERT_EQ(photo.width, 600);
  ASSERT_EQ(photo.height, 400);
  const std::string raw = pfx::test::read_file(PHOTOFX_TEST_DATA_DIR "/coffee_64x48.argb");
  ASSERT_EQ(raw.size(), 64u * 48u * 4u);
  for (int32_t y = 0; y < 48; ++y) {
    for (int32_t x = 0; x < 64; ++x) {
      const size_t i = (static_cast<size_t>(y) * 64 + static_cast<size_t>(x)) * 4;
      uint32_t word = 0;
      for (size_t b = 0; b < 4; ++b) word |= uint32_t{static_cast<uint8_t>(raw[i + b])} << (8 * b);
      ASSERT_EQ(photo.at(240 + x, 120 + y), word) << x << "," << y;
    }
  }
}

TEST(ImageFiles, GreyAndSixteenBitPngsBecomeEightBitArgb) {
  TempDir dir;
  write_raw_png(dir / "grey.png", 3, 1, PNG_COLOR_TYPE_GRAY, 8, {{0, 128, 255}});
  write_raw_png(dir / "grey-alpha.png", 2, 1, PNG_COLOR_TYPE_GRAY_ALPHA, 8, {{200, 10, 50, 255}});
  write_raw_png(dir / "rgb16.png", 1, 1, PNG_COLOR_TYPE_RGB, 16,
                {{0x12, 0xFF, 0xAB, 0x00, 0x01, 0x80}});
  Image img;
  ASSERT_EQ(fxtool::read_image(dir / "grey.png", img), "");
  EXPECT_EQ(img.pixels, (std::vector<uint32_t>{0xFF000000u, 0xFF808080u, 0xFFFFFFFFu}));
  ASSERT_EQ(fxtool::read_image(dir / "grey-alpha.png", img), "");
  EXPECT_EQ(img.pixels, (std::vector<uint32_t>{0x0AC8C8C8u, 0xFF323232u}));
  ASSERT_EQ(fxtool::read_image(dir / "rgb16.png", img), "");
  EXPECT_EQ(img.pixels, (std::vector<uint32_t>{0xFF12AB01u}));
}

TEST(ImageFiles, JpegKeepsTheSizeDropsAlphaAndStaysClose) {
  TempDir dir;
  Image img;
  img.resize(40, 24);
  for (int32_t y = 0; y < 24; ++y) {
    for (int32_t x = 0; x < 40; ++x) {
      img.at(x, y) = pfx::test::argb(0x40, static_cast<uint32_t>(60 + 3 * x),
                                     static_cast<uint32_t>(90 + 2 * y), 120);
    }
  }
  for (const char* name : {"a.jpg", "b.JPEG"}) {
    ASSERT_EQ(fxtool::write_image(dir / name, img), "");
    Image back;
    ASSERT_EQ(fxtool::read_image(dir / name, back), "");
    ASSERT_EQ(back.width, 40);
    ASSERT_EQ(back.height, 24);
    int64_t diff = 0;
    for (size_t i = 0; i < img.pixels.size(); ++i) {
      EXPECT_EQ(back.pixels[i] >> 24, 0xFFu);
      for (int c = 0; c < 24; c += 8) {
        diff +=
            std::abs(int32_t((back.pixels[i] >> c) & 0xFF) - int32_t((img.pixels[i] >> c) & 0xFF));
      }
    }
    EXPECT_LT(diff, static_cast<int64_t>(img.pixels.size()) * 3 * 2) << "mean error of 2 or more";
  }
}

TEST(ImageFiles, UnreadableFilesAreReportedNotDecoded) {
  TempDir dir;
  Image img;
  EXPECT_EQ(fxtool::read_image(dir / "missing.png", img), "cannot open: No such file or directory");
  pfx::test::write_file(dir / "text.png", "hello, not an image");
  EXPECT_EQ(fxtool::read_image(dir / "text.png", img), "not a PNG or JPEG image");
  EXPECT_EQ(fxtool::read_image(dir.path().string(), img), "cannot read: Is a directory");

  // Truncated files of both kinds fail rather than decode to partly grey pictures.
  ASSERT_EQ(fxtool::write_image(dir / "whole.png", random_image(64, 64, 3, false)), "");
  ASSERT_EQ(fxtool::write_image(dir / "whole.jpg", random_image(64, 64, 4, true)), "");
  for (const char* name : {"whole.png", "whole.jpg"}) {
    const std::string bytes = pfx::test::read_file(dir / name);
    pfx::test::write_file(dir / "cut", bytes.substr(0, bytes.size() / 2));
    const std::string err = fxtool::read_image(dir / "cut", img);
    EXPECT_NE(err.find("cannot decode"), std::string::npos) << name << ": " << err;
    EXPECT_TRUE(img.pixels.empty());
  }
}

TEST(ImageFiles, FailedWritesLeaveNoFileBehind) {
  TempDir dir;
  const Image img = random_image(8, 8, 5, false);
  EXPECT_EQ(fxtool::write_image(dir / "picture.gif", img),
            "unknown image format (use .png, .jpg or .jpeg)");
  EXPECT_EQ(fxtool::write_image(dir / "no-such-dir/a.png", img),
            "cannot write: No such file or directory");
  // The target is a directory: encoding succeeds, the final rename fails, and the temporary
  // file must not stay.
  std::filesystem::create_directory(dir / "taken.png");
  EXPECT_EQ(fxtool::write_image(dir / "taken.png", img), "cannot write: Is a directory");
  EXPECT_EQ(dir.entries(), (std::set<std::string>{"taken.png"}));
}

TEST(ImageFiles, ExistingFileIsReplacedWhole) {
  TempDir dir;
  pfx::test::write_file(dir / "a.png", std::string(100000, 'x'));
  const Image img = random_image(5, 3, 6, false);
  ASSERT_EQ(fxtool::write_image(dir / "a.png", img), "");
  Image back;
  ASSERT_EQ(fxtool::read_image(dir / "a.png", back), "");
  EXPECT_EQ(back.pixels, img.pixels);
  EXPECT_EQ(dir.entries(), (std::set<std::string>{"a.png"}));
}

TEST(ImageFiles, FormatFollowsTheExtensionInAnyCase) {
  EXPECT_EQ(fxtool::format_of_name("a.PNG"), fxtool::FileFormat::kPng);
  EXPECT_EQ(fxtool::format_of_name("dir.jpg/a.Jpeg"), fxtool::FileFormat::kJpeg);
  EXPECT_EQ(fxtool::format_of_name("a.jpg"), fxtool::FileFormat::kJpeg);
  EXPECT_EQ(fxtool::format_of_name("png"), fxtool::FileFormat::kUnknown);
  EXPECT_EQ(fxtool::format_of_name("a.png.bak"), fxtool::FileFormat::kUnknown);
}

}  // namespace
