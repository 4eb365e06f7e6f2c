// The photofx command-line tool, run as a user runs it, on small generated images: every effect
// family through `apply` against the library called directly, the selection options, several
// inputs at once, bad input of every kind, `list` and the gallery.
#include <gtest/gtest.h>
#include <png.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <functional>
#include <set>
#include <string>
#include <vector>

#include "photofx.h"
#include "support/files.h"
#include "support/images.h"
#include "tools/image.h"
#include "tools/texture.h"

namespace {

using fxtool::Image;
using pfx::test::Ran;
using pfx::test::TempDir;

constexpr int32_t kWidth = 23, kHeight = 17;  // odd sizes, so no row or column is special

Image photo(uint64_t seed) {
  Image img;
  img.width = kWidth;
  img.height = kHeight;
  img.pixels = pfx::test::random_image(kWidth, kHeight, seed);
  return img;
}

Image decoded(const std::string& path) {
  Image img;
  const std::string err = fxtool::read_image(path, img);
  EXPECT_EQ(err, "") << path;
  return img;
}

// The full variant's result where `selected` says so, the source elsewhere: what any selection
// must give, whatever bounds the tool passes.
Image where(const Image& src, const Image& full,
            const std::function<bool(int32_t, int32_t)>& selected) {
  Image out = src;
  for (int32_t y = 0; y < src.height; ++y) {
    for (int32_t x = 0; x < src.width; ++x) {
      if (selected(x, y)) out.at(x, y) = full.at(x, y);
    }
  }
  return out;
}

Image brightness(const Image& src, int32_t level) {
  Image out = src;
  controlBrightness(src.pixels.data(), out.pixels.data(), src.width, src.height, level);
  return out;
}

Image tilt_shift(const Image& src, int32_t centre, int32_t half_height) {
  Image out = src;
  applyTiltShift(src.pixels.data(), out.pixels.data(), src.width, src.height, centre, half_height);
  return out;
}

// The library's result for a call that fills its second buffer from its first.
Image lib(const Image& src,
          const std::function<void(const uint32_t*, uint32_t*, int32_t, int32_t)>& call) {
  Image out = src;
  call(src.pixels.data(), out.pixels.data(), src.width, src.height);
  return out;
}

// Mask bytes of 1 in columns x0..x1 and rows y0..y1, 0 elsewhere.
std::vector<uint8_t> rect_mask(int32_t x0, int32_t y0, int32_t x1, int32_t y1) {
  std::vector<uint8_t> mask(static_cast<size_t>(kWidth) * kHeight, 0);
  for (int32_t y = y0; y <= y1; ++y) {
    for (int32_t x = x0; x <= x1; ++x)
      mask[static_cast<size_t>(y) * kWidth + static_cast<size_t>(x)] = 1;
  }
  return mask;
}

// Writes a one-channel PNG through libpng: masks are usually greyscale files.
void write_grey_png(const std::string& path, int32_t w, int32_t h,
                    const std::function<uint8_t(int32_t, int32_t)>& grey) {
  FILE* f = std::fopen(path.c_str(), "wb");
  ASSERT_NE(f, nullptr);
  png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
  png_infop info = png_create_info_struct(png);
  png_init_io(png, f);
  png_set_IHDR(png, info, static_cast<png_uint_32>(w), static_cast<png_uint_32>(h), 8,
               PNG_COLOR_TYPE_GRAY, PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_DEFAULT,
               PNG_FILTER_TYPE_DEFAULT);
  png_write_info(png, info);
  std::vector<uint8_t> row(static_cast<size_t>(w));
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) row[static_cast<size_t>(x)] = grey(x, y);
    png_write_row(png, row.data());
  }
  png_write_end(png, nullptr);
  png_destroy_write_struct(&png, &info);
  std::fclose(f);
}

std::vector<std::string> lines(const std::string& text) {
  std::vector<std::string> out;
  for (size_t pos = 0; pos < text.size();) {
    const size_t end = text.find('\n', pos);
    out.push_back(text.substr(pos, end - pos));
    if (end == std::string::npos) break;
    pos = end + 1;
  }
  return out;
}

class Tool : public ::testing::Test {
 protected:
  void SetUp() override {
    src = photo(11);
    ASSERT_EQ(fxtool::write_image(in, src), "");
  }

  Ran tool(const std::vector<std::string>& args) {
    return pfx::test::run_program(PHOTOFX_TOOL, args, logs);
  }

  // A refused run: the status, a one-line message containing `message`, and no file written.
  void expect_refused(const std::vector<std::string>& args, int status,
                      const std::string& message) {
    const std::set<std::string> before = dir.entries();
    const Ran ran = tool(args);
    EXPECT_EQ(ran.status, status) << ran.err;
    EXPECT_NE(ran.err.find(message), std::string::npos) << ran.err;
    EXPECT_EQ(ran.err.rfind("photofx: ", 0), 0u) << ran.err;
    EXPECT_EQ(ran.err.find('\n'), ran.err.size() - 1) << "one line: " << ran.err;
    EXPECT_EQ(dir.entries(), before) << "a file was left behind";
  }

  TempDir dir, logs;
  std::string in = dir / "in.png";
  std::string out = dir / "out.png";
  Image src;
};

// ---- Every family through apply --------------------------------------------------------------

struct Case {
  std::vector<std::string> args;  // effect and its options
  std::function<Image(const Image&)> expect;
};

TEST_F(Tool, EachEffectFamilyMatchesTheLibrary) {
  const std::vector<Case> cases = {
      {{"brightness", "--level", "3"}, [](const Image& s) { return brightness(s, 3); }},
      {{"brightness", "--level=20"}, [](const Image& s) { return brightness(s, 20); }},
      {{"brightness"}, [](const Image& s) { return brightness(s, 10); }},
      {{"contrast", "--level", "17"},
       [](const Image& s) {
         Image o = s;
         controlContrast(s.pixels.data(), o.pixels.data(), s.width, s.height, 17);
         return o;
       }},
      {{"saturation", "--level", "16", "--rect", "3,2,9,6"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           controlSaturationPartial(a, rect_mask(3, 2, 11, 7).data(), b, w, h, 16, 3, 11, 2, 7);
         });
       }},
      {{"temperature", "--level", "4"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           controlTemperature(a, b, w, h, 4);
         });
       }},
      {{"exposure", "--level", "13"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           controlExposure(a, b, w, h, 13);
         });
       }},
      {{"hue", "--level", "3", "--rect", "3,2,9,6"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           controlHuePartial(a, rect_mask(3, 2, 11, 7).data(), b, w, h, 3, 3, 11, 2, 7);
         });
       }},
      {{"faded-colour", "--level", "60"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           controlFadedColour(a, b, w, h, 60);
         });
       }},
      {{"invert", "--rect", "3,2,9,6"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           applyInvertPartial(a, rect_mask(3, 2, 11, 7).data(), b, w, h, 3, 11, 2, 7);
         });
       }},
      {{"channel-gains", "--red", "15", "--green", "3", "--blue", "12"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           controlAdjustRGB(a, b, w, h, 15, 3, 12);
         });
       }},
      {{"colour-tone", "--hue", "200"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           fx_change_colortone(a, b, w, h, 200);
         });
       }},
      // The brushes edit in place; the defaults are the middle of the image and a quarter of
      // its longer side.
      {{"lighten", "--cx", "5", "--cy", "6", "--strength", "80", "--radius", "7"},
       [](const Image& s) {
         Image o = s;
         rubLighten(o.pixels.data(), 5, 6, s.width, s.height, 80, 7);
         return o;
       }},
      {{"darken", "--rect", "0,0,10,30"},
       [](const Image& s) {
         Image full = s;
         rubDarken(full.pixels.data(), 11, 8, s.width, s.height, 64, 5);
         return where(s, full, [](int32_t x, int32_t) { return x < 10; });
       }},
      {{"blur", "--level", "5"},
       [](const Image& s) {
         Image o = s;
         applyBlur(s.pixels.data(), nullptr, o.pixels.data(), s.width, s.height, 5, 1, 0, 1, 0);
         return o;
       }},
      // A masked blur draws only on selected pixels, so it differs from a whole-image blur
      // cut out: the mask and the bounds must reach the library as given.
      {{"blur", "--level", "8", "--rect", "3,2,9,6"},
       [](const Image& s) {
         Image o = s;
         const std::vector<uint8_t> mask = rect_mask(3, 2, 11, 7);
         applyBlur(s.pixels.data(), mask.data(), o.pixels.data(), s.width, s.height, 8, 3, 11, 2,
                   7);
         return o;
       }},
      {{"blur-preview", "--level", "2", "--rect", "3,2,9,6"},
       [](const Image& s) {
         Image o = s;
         const std::vector<uint8_t> mask = rect_mask(3, 2, 11, 7);
         fx_Init_blur(s.pixels.data(), mask.data(), s.width, s.height, 3, 11, 2, 7);
         fx_make_blur_preview(s.pixels.data(), mask.data(), o.pixels.data(), s.width, s.height, 2);
         fx_destroy_blur();
         return o;
       }},
      {{"tilt-shift", "--centre", "6", "--half-height", "1"},
       [](const Image& s) { return tilt_shift(s, 6, 1); }},
      // Tilt-shift has no partial variant: the tool keeps the unselected pixels itself.
      {{"tilt-shift-preview", "--centre", "12", "--rect", "0,0,10,30"},
       [](const Image& s) {
         Image full = s;
         initTiltShift(s.pixels.data(), s.width, s.height);
         makeTiltShift(s.pixels.data(), full.pixels.data(), s.width, s.height, 12, 2);
         destroyTiltShift();
         return where(s, full, [](int32_t x, int32_t) { return x < 10; });
       }},
      {{"sharpen", "--rect", "3,2,9,6"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           applySharpen(a, rect_mask(3, 2, 11, 7).data(), b, w, h, 0, 3, 11, 2, 7);
         });
       }},
      {{"greyscale", "--level", "14", "--rect", "3,2,9,6"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           controlGreyscalePartial(a, rect_mask(3, 2, 11, 7).data(), b, w, h, 14, 3, 11, 2, 7);
         });
       }},
      {{"sepia", "--rect", "3,2,9,6"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           fx_apply_sepia_partial(a, rect_mask(3, 2, 11, 7).data(), b, w, h, 3, 11, 2, 7);
         });
       }},
      {{"gamma", "--channel", "green", "--gamma", "0.45"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           control_gamma(a, b, w, h, 2, 0.45);
         });
       }},
      {{"input-levels", "--channel", "red", "--low", "30", "--high", "200", "--rect", "0,0,10,30"},
       [](const Image& s) {
         return where(s,
                      lib(s, [](const uint32_t* a, uint32_t* b, int32_t w,
                                int32_t h) { changeHistogramByInput(a, b, w, h, 1, 30, 200); }),
                      [](int32_t x, int32_t) { return x < 10; });
       }},
      // The textured old photo writes only the selected pixels, over the tool's copy.
      {{"old-photo-texture", "--rect", "3,2,9,6"},
       [](const Image& s) {
         const Image paper = fxtool::paper_texture(s.width, s.height);
         Image o = s;
         fx_apply_oldphoto_texture_partial(s.pixels.data(), o.pixels.data(), paper.pixels.data(),
                                           rect_mask(3, 2, 11, 7).data(), s.width, s.height, 3, 11,
                                           2, 7);
         return o;
       }},
      {{"soft-glow", "--level", "80", "--rect", "3,2,9,6"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           applySoftglowPartial(a, rect_mask(3, 2, 11, 7).data(), b, w, h, 80, 3, 11, 2, 7);
         });
       }},
      // The other looks' full variants are checked against the gallery's pictures.
      {{"sunshine", "--rect", "3,2,9,6"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           applySunshinePartial(a, rect_mask(3, 2, 11, 7).data(), b, w, h, 3, 11, 2, 7);
         });
       }},
      // Mirror makes the picture the size the library names for it.
      {{"mirror", "--mode", "keep-right", "--column", "5"},
       [](const Image& s) {
         Image o;
         o.resize(getMirrorOutwidth(s.width, 5, MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL), s.height);
         runMirror(s.pixels.data(), s.width, s.height, o.pixels.data(), o.width, o.height, 5,
                   MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL);
         return o;
       }},
      {{"mirror", "--axis", "vertical", "--mode", "keep-top", "--row", "3"},
       [](const Image& s) {
         Image o;
         o.resize(s.width, getMirrorOutheight(s.height, 3, MIRROR_KEEP_TOP, MIRROR_VERTICAL));
         runMirror(s.pixels.data(), s.width, s.height, o.pixels.data(), o.width, o.height, 3,
                   MIRROR_KEEP_TOP, MIRROR_VERTICAL);
         return o;
       }},
      // The warps take the selection's box as their window.
      {{"sphericity", "--cx", "8", "--cy", "9", "--radius", "6", "--level", "-70", "--fast", "on",
        "--rect", "2,3,15,12"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           runSphericity(a, b, w, h, 8, 9, 6, -70, 2, 16, 3, 14, 1);
         });
       }},
      {{"twirl", "--cx", "12", "--cy", "8", "--radius", "9", "--angle", "200"},
       [](const Image& s) {
         return lib(s, [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
           runTwirl(a, b, w, h, 12, 8, 9, 200, 0, w - 1, 0, h - 1, 0);
         });
       }},
  };
  for (const Case& c : cases) {
    std::vector<std::string> args{"apply"};
    args.insert(args.end(), c.args.begin(), c.args.end());
    args.insert(args.end(), {in, out});
    const Ran ran = tool(args);
    ASSERT_EQ(ran.status, 0) << c.args[0] << ": " << ran.err;
    EXPECT_EQ(ran.err, "");
    const Image expected = c.expect(src);
    const Image got = decoded(out);
    EXPECT_EQ(got.width, expected.width) << c.args[0];
    EXPECT_EQ(got.height, expected.height) << c.args[0];
    EXPECT_EQ(got.pixels, expected.pixels) << ::testing::PrintToString(c.args);
    EXPECT_NE(got.pixels, src.pixels) << ::testing::PrintToString(c.args) << " changed nothing";
  }
}

// ---- Selections -------------------------------------------------------------------------------

TEST_F(Tool, RectSelectsItsColumnsAndRowsAndIsClippedToTheImage) {
  ASSERT_EQ(tool({"apply", "brightness", "--level", "18", "--rect", "3,2,5,4", in, out}).status, 0);
  const Image full = brightness(src, 18);
  EXPECT_EQ(decoded(out).pixels, where(src, full, [](int32_t x, int32_t y) {
                                   return x >= 3 && x <= 7 && y >= 2 && y <= 5;
                                 }).pixels);

  ASSERT_EQ(
      tool({"apply", "brightness", "--level", "18", "--rect", "-4,10,10,100", in, out}).status, 0);
  EXPECT_EQ(decoded(out).pixels,
            where(src, full, [](int32_t x, int32_t y) { return x <= 5 && y >= 10; }).pixels);
}

TEST_F(Tool, EllipseSelectsThePixelsInsideItsEdge) {
  ASSERT_EQ(tool({"apply", "brightness", "--level", "0", "--ellipse", "10,8,4,3", in, out}).status,
            0);
  const auto inside = [](int32_t x, int32_t y) {
    const double dx = (x - 10) / 4.0, dy = (y - 8) / 3.0;
    return dx * dx + dy * dy <= 1.0;
  };
  EXPECT_EQ(decoded(out).pixels, where(src, brightness(src, 0), inside).pixels);
  EXPECT_TRUE(inside(14, 8) && inside(10, 5) && !inside(14, 9));  // the edge is included
}

TEST_F(Tool, MaskFileSelectsFromGreyOneTwentyEightAndAlphaCounts) {
  // Greyscale mask: columns by grey value 0, 127, 128, 255 in turn.
  static constexpr uint8_t kGrey[4] = {0, 127, 128, 255};
  write_grey_png(dir / "mask.png", kWidth, kHeight,
                 [](int32_t x, int32_t) { return kGrey[x % 4]; });
  ASSERT_EQ(
      tool({"apply", "brightness", "--level", "20", "--mask", dir / "mask.png", in, out}).status,
      0);
  const Image full = brightness(src, 20);
  EXPECT_EQ(decoded(out).pixels,
            where(src, full, [](int32_t x, int32_t) { return x % 4 >= 2; }).pixels);

  // A white mask with alpha: 128 * 255 is the least product of grey and alpha that selects.
  Image rgba;
  rgba.resize(kWidth, kHeight);
  for (int32_t y = 0; y < kHeight; ++y) {
    for (int32_t x = 0; x < kWidth; ++x) rgba.at(x, y) = (x % 2 == 0 ? 0x80FFFFFFu : 0x7FFFFFFFu);
  }
  ASSERT_EQ(fxtool::write_image(dir / "alpha.png", rgba), "");
  ASSERT_EQ(
      tool({"apply", "brightness", "--level", "20", "--mask", dir / "alpha.png", in, out}).status,
      0);
  EXPECT_EQ(decoded(out).pixels,
            where(src, full, [](int32_t x, int32_t) { return x % 2 == 0; }).pixels);
}

TEST_F(Tool, SelectionsTogetherSelectWhereAllDo) {
  write_grey_png(dir / "mask.png", kWidth, kHeight,
                 [](int32_t, int32_t y) { return y < 9 ? 255 : 0; });
  ASSERT_EQ(tool({"apply", "contrast", "--level", "20", "--mask", dir / "mask.png", "--rect",
                  "4,4,40,40", "--ellipse", "4,4,8,8", in, out})
                .status,
            0);
  Image full = src;
  controlContrast(src.pixels.data(), full.pixels.data(), kWidth, kHeight, 20);
  EXPECT_EQ(decoded(out).pixels, where(src, full, [](int32_t x, int32_t y) {
                                   return y < 9 && x >= 4 && y >= 4 &&
                                          (x - 4) * (x - 4) + (y - 4) * (y - 4) <= 64;
                                 }).pixels);
}

TEST_F(Tool, EmptySelectionLeavesTheImageAsItIs) {
  // Bounds around nothing would mean "whole image" to the library; the tool must not pass them.
  write_grey_png(dir / "black.png", kWidth, kHeight, [](int32_t, int32_t) { return 0; });
  ASSERT_EQ(
      tool({"apply", "brightness", "--level", "0", "--mask", dir / "black.png", in, out}).status,
      0);
  EXPECT_EQ(decoded(out).pixels, src.pixels);
}

// ---- File formats -----------------------------------------------------------------------------

TEST_F(Tool, PngKeepsAlphaExactlyAndJpegKeepsTheSize) {
  // Contrast at 10 changes nothing, so the output is the input as the files carry it.
  ASSERT_EQ(tool({"apply", "contrast", in, out}).status, 0);
  EXPECT_EQ(decoded(out).pixels, src.pixels);

  const std::string jpeg = dir / "out.jpg";
  ASSERT_EQ(tool({"apply", "contrast", in, jpeg}).status, 0);
  const Image j = decoded(jpeg);
  EXPECT_EQ(j.width, kWidth);
  EXPECT_EQ(j.height, kHeight);
  for (uint32_t p : j.pixels) ASSERT_EQ(p >> 24, 0xFFu);

  // And a JPEG as input, with the output's format chosen by its name.
  ASSERT_EQ(tool({"apply", "brightness", "--level", "12", jpeg, dir / "back.PNG"}).status, 0);
  EXPECT_EQ(decoded(dir / "back.PNG").pixels, brightness(j, 12).pixels);
}

// ---- Several inputs ---------------------------------------------------------------------------

TEST_F(Tool, OutDirWritesEachInputUnderItsNameAndGoesOnAfterAFailure) {
  ASSERT_EQ(fxtool::write_image(dir / "b.png", photo(12)), "");
  const Ran ran = tool({"apply", "brightness", "--level", "7", "--progress", "--out-dir",
                        dir / "done", in, dir / "missing.png", dir / "b.png"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_EQ(decoded(dir / "done/in.png").pixels, brightness(src, 7).pixels);
  EXPECT_EQ(decoded(dir / "done/b.png").pixels, brightness(photo(12), 7).pixels);
  std::set<std::string> written;
  for (const auto& e : std::filesystem::directory_iterator(dir / "done")) {
    written.insert(e.path().filename().string());
  }
  EXPECT_EQ(written, (std::set<std::string>{"in.png", "b.png"}));
  const std::vector<std::string> expected = {
      "photofx: [1/3] " + in + " -> " + (dir / "done/in.png"),
      "photofx: [2/3] " + (dir / "missing.png") + " -> " + (dir / "done/missing.png"),
      "photofx: " + (dir / "missing.png") + ": cannot open: No such file or directory",
      "photofx: [3/3] " + (dir / "b.png") + " -> " + (dir / "done/b.png")};
  EXPECT_EQ(lines(ran.err), expected);

  // Without --progress, and with stderr not a terminal, a clean run says nothing.
  const Ran quiet = tool({"apply", "contrast", "--out-dir", dir / "quiet", in, dir / "b.png"});
  EXPECT_EQ(quiet.status, 0);
  EXPECT_EQ(quiet.err, "");
}

// ---- Bad input --------------------------------------------------------------------------------

TEST_F(Tool, BadCommandLinesAreRefusedWithStatusTwo) {
  expect_refused({"apply", "sparkle", in, out}, 2, "unknown effect 'sparkle'");
  expect_refused({"apply", "brightness", "--level", "21", in, out}, 2,
                 "--level 21 is out of range 0..20");
  expect_refused({"apply", "brightness", "--level", "-1", in, out}, 2,
                 "--level -1 is out of range 0..20");
  expect_refused({"apply", "brightness", "--level", "1x", in, out}, 2,
                 "--level needs a whole number, not '1x'");
  expect_refused({"apply", "brightness", "--level", "99999999999", in, out}, 2,
                 "needs a whole number");
  expect_refused({"apply", "brightness", "--radius", "3", in, out}, 2,
                 "brightness has no parameter --radius (it takes --level)");
  expect_refused({"apply", "brightness", "--level", "2", "--level", "3", in, out}, 2,
                 "given twice");
  expect_refused({"apply", "brightness", in, out, "--level"}, 2, "--level needs a value");
  expect_refused({"apply", "brightness", "--rect", "1,2,3", in, out}, 2, "--rect needs X,Y,W,H");
  expect_refused({"apply", "brightness", "--rect", "1,2,0,3", in, out}, 2, "at least 1");
  expect_refused({"apply", "brightness", "--rect", "1,2,3,4,5", in, out}, 2,
                 "--rect needs X,Y,W,H");
  expect_refused({"apply", "brightness", "--ellipse", "5,5,0,3", in, out}, 2, "--ellipse radii");
  expect_refused({"apply", "brightness", in, dir / "out.gif"}, 2, "unknown image format");
  expect_refused({"apply", "brightness", in}, 2, "apply needs IN and OUT");
  expect_refused({"apply", "brightness", "-x", in, out}, 2, "unknown option -x");
  expect_refused({"apply"}, 2, "apply needs an effect");
  expect_refused({"frobnicate"}, 2, "unknown command 'frobnicate'");
  expect_refused({"apply", "brightness", "--out-dir", dir / "o", in, dir / "x/in.png"}, 2,
                 "two inputs would both be written to");
  expect_refused({"gallery", "--only", "brightness,sparkle", "-o", dir / "g"}, 2,
                 "unknown effect 'sparkle' in --only");
  expect_refused({"apply", "twirl", "--fast", "yes", in, out}, 2,
                 "--fast must be one of off, on, not 'yes'");
  expect_refused({"apply", "sphericity", "--level", "-101", in, out}, 2,
                 "--level -101 is out of range -100..100");
  expect_refused({"apply", "gamma", "--gamma", "0.05", in, out}, 2,
                 "--gamma 0.05 is out of range 0.1..10");
  expect_refused({"apply", "gamma", "--gamma", "1,5", in, out}, 2,
                 "--gamma needs a number, not '1,5'");
  expect_refused({"apply", "mirror", "--rect", "1,1,4,4", in, out}, 2,
                 "mirror takes no selection (it changes the image's size)");
}

TEST_F(Tool, UnusableFilesAreRefusedWithStatusOne) {
  pfx::test::write_file(dir / "text.png", "not an image at all");
  const std::string png = pfx::test::read_file(in);
  pfx::test::write_file(dir / "cut.png", png.substr(0, png.size() / 2));
  expect_refused({"apply", "brightness", dir / "missing.png", out}, 1,
                 "missing.png: cannot open: No such file or directory");
  expect_refused({"apply", "brightness", dir / "text.png", out}, 1,
                 "text.png: not a PNG or JPEG image");
  expect_refused({"apply", "brightness", dir / "cut.png", out}, 1, "cut.png: cannot decode PNG");
  expect_refused({"apply", "brightness", "--mask", dir / "missing.png", in, out}, 1,
                 "missing.png: cannot open");

  Image small;
  small.resize(5, 5);
  ASSERT_EQ(fxtool::write_image(dir / "small.png", small), "");
  expect_refused({"apply", "brightness", "--mask", dir / "small.png", in, out}, 1,
                 "is 5x5 but the image is 23x17");
  expect_refused({"apply", "brightness", "--rect", "23,0,5,5", in, out}, 1,
                 "--rect 23,0,5,5 lies outside the 23x17 image");
  expect_refused({"apply", "brightness", "--ellipse", "-3,5,2,2", in, out}, 1,
                 "--ellipse -3,5,2,2 lies outside the 23x17 image");
  // Positions are checked against each picture, so they fail per file.
  expect_refused({"apply", "lighten", "--cx", "23", in, out}, 1,
                 "--cx 23 is out of range 0..22 for a 23x17 image");
  expect_refused({"apply", "input-levels", "--low", "90", "--high", "90", in, out}, 1,
                 "input-levels: --high must be above --low");
  // The library refuses a mirror whose side does not belong to its axis.
  expect_refused({"apply", "mirror", "--mode", "keep-top", in, out}, 1,
                 "keep-top and keep-bottom with --axis vertical");
  expect_refused({"apply", "brightness", in, dir / "no-dir/out.png"}, 1,
                 "out.png: cannot write: No such file or directory");
  expect_refused({"gallery", dir / "missing.png", "-o", dir / "g"}, 1, "missing.png: cannot open");
}

TEST_F(Tool, FailedRunKeepsAnExistingOutput) {
  pfx::test::write_file(out, "the previous result");
  const Ran ran = tool({"apply", "brightness", "--rect", "100,100,2,2", in, out});
  EXPECT_EQ(ran.status, 1);
  EXPECT_EQ(pfx::test::read_file(out), "the previous result");
}

// ---- list and the gallery ---------------------------------------------------------------------

// The effect names `photofx list` prints: the first word of each line before the blank one.
std::vector<std::string> listed_effects(const Ran& ran) {
  std::vector<std::string> names;
  for (const std::string& line : lines(ran.out)) {
    if (line.empty()) break;
    names.push_back(line.substr(0, line.find(' ')));
  }
  return names;
}

TEST_F(Tool, ListShowsEveryEffectWithItsParametersOnOneLine) {
  const Ran ran = tool({"list"});
  ASSERT_EQ(ran.status, 0);
  const std::vector<std::string> names = listed_effects(ran);
  EXPECT_GE(names.size(), 2u);
  EXPECT_NE(std::find(names.begin(), names.end(), "brightness"), names.end());
  const std::vector<std::string> all = lines(ran.out);
  const auto contrast = std::find_if(all.begin(), all.end(), [](const std::string& line) {
    return line.rfind("contrast ", 0) == 0;
  });
  ASSERT_NE(contrast, all.end()) << ran.out;
  EXPECT_NE(contrast->find(" adjust "), std::string::npos) << *contrast;
  EXPECT_NE(contrast->find(" --level 0..20 (10) "), std::string::npos) << *contrast;
}

TEST_F(Tool, GalleryWritesEveryPictureTheSheetAndTheIndex) {
  const Ran ran = tool({"gallery", in, "-o", dir / "g"});
  ASSERT_EQ(ran.status, 0) << ran.err;
  EXPECT_NE(ran.out.find(dir / "g"), std::string::npos) << "says where it was written";
  EXPECT_EQ(decoded(dir / "g/original.png").pixels, src.pixels);
  EXPECT_EQ(decoded(dir / "g/brightness-level-0.png").pixels, brightness(src, 0).pixels);

  // Every picture the index shows exists and decodes, every listed effect has at least one,
  // and the directory holds nothing else but the contact sheet and the index.
  const std::string html = pfx::test::read_file(dir / "g/index.html");
  std::set<std::string> files{"contact-sheet.png", "index.html"}, shown;
  const std::string tag = "<img src=\"";
  for (size_t at = html.find(tag); at != std::string::npos; at = html.find(tag, at + 1)) {
    const size_t start = at + tag.size();
    const std::string file = html.substr(start, html.find('"', start) - start);
    EXPECT_GT(decoded(dir / ("g/" + file)).width, 0) << file;
    files.insert(file);
    const size_t name = html.find("<figcaption><b>", start) + 15;
    shown.insert(html.substr(name, html.find("</b>", name) - name));
  }
  for (const std::string& name : listed_effects(tool({"list"}))) {
    EXPECT_EQ(shown.count(name), 1u) << name << " is missing from the gallery";
  }
  std::set<std::string> written;
  for (const auto& e : std::filesystem::directory_iterator(dir / "g")) {
    written.insert(e.path().filename().string());
  }
  EXPECT_EQ(written, files);

  // Whole-picture runs, checked here rather than in runs of their own: the full variants of
  // the looks and of sharpen, and the brushes at their defaults (the middle of the picture, a
  // radius of a quarter of its longer side).
  using Full = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t);
  const std::vector<std::pair<std::string, Full>> plain = {
      {"retro", applyRetro},
      {"sunshine", applySunshine},
      {"downlight", applyDownlight},
      {"bluewash", applyBluewash},
      {"nostalgia", applyNostalgia},
      {"yellow-glow", applyYellowglow},
      {"sepia",
       [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) { fx_apply_sepia(a, b, w, h); }},
      {"vignette", fx_apply_vignette},
      {"vignette-preview", fx_apply_vignette_prev},
      {"vintage", applyVintage},
      {"vintage-preview", fx_apply_vintage_prev},
      {"old-photo", applyOldPhoto},
      {"old-photo-texture",
       [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
         fx_apply_oldphoto_texture(a, b, fxtool::paper_texture(w, h).pixels.data(), w, h);
       }},
      {"pop-art", applyPopArt},
      {"pop-art-preview", fx_apply_popart_prev},
      {"soft-glow-level-50",
       [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) { applySoftglow(a, b, w, h, 50); }},
      {"output-levels-low-40-high-215",
       [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) {
         changeHistogramByOutput(a, b, w, h, 0, 40, 215);
       }},
      {"sharpen", [](const uint32_t* a, uint32_t* b, int32_t w,
                     int32_t h) { fx_apply_sharpen_all(a, b, w, h); }},
      {"pixelize-shift-3",
       [](const uint32_t* a, uint32_t* b, int32_t w, int32_t h) { applyPixelize(a, b, w, h, 3); }},
      {"pixelize-brush", [](const uint32_t*, uint32_t* b, int32_t w,
                            int32_t h) { rubPixelize(b, w, h, 4, 11, 8, 5); }},
      {"red-eye", [](const uint32_t*, uint32_t* b, int32_t w, int32_t h) {
         removeRedeye(b, w, h, 11, 8, 5);
       }}};
  for (const auto& [name, full] : plain) {
    const Image expected = lib(src, full);
    EXPECT_NE(expected.pixels, src.pixels) << name;
    EXPECT_EQ(decoded(dir / ("g/" + name + ".png")).pixels, expected.pixels) << name;
  }

  // The contact sheet: tiles side by side, with captions drawn in the title colour.
  const Image sheet = decoded(dir / "g/contact-sheet.png");
  EXPECT_GE(sheet.width, 6 * 192);
  EXPECT_GT(std::count(sheet.pixels.begin(), sheet.pixels.end(), 0xFFE8E8E8u), 200);
}

// Auto adjust's parameters are module-wide, and the gallery runs every picture in one process:
// a tuned auto adjust must not carry over into the downlight picture after it. Pictures under
// 150 pixels a side never read the parameters, hence the larger input.
TEST_F(Tool, AutoAdjustParametersReachTheLibraryAndStayWithTheirPicture) {
  Image big;
  big.width = 160;
  big.height = 150;
  big.pixels = pfx::test::random_image(big.width, big.height, 21);
  ASSERT_EQ(fxtool::write_image(in, big), "");
  const auto with_hdr = [&](int32_t cutoff, int32_t weight1, const std::function<void()>& call) {
    fx_set_hdr(70, cutoff, weight1, 5120);
    call();
    fx_set_hdr(70, 100, 1000, 5120);
  };

  const Ran ran = tool({"gallery", in, "-o", dir / "g", "--only", "auto-adjust,downlight"});
  ASSERT_EQ(ran.status, 0) << ran.err;
  Image tuned = big, plain = big, downlight = big;
  with_hdr(85, 4000,
           [&] { applyAutoAdjust(big.pixels.data(), tuned.pixels.data(), big.width, big.height); });
  applyAutoAdjust(big.pixels.data(), plain.pixels.data(), big.width, big.height);
  applyDownlight(big.pixels.data(), downlight.pixels.data(), big.width, big.height);
  ASSERT_NE(tuned.pixels, plain.pixels);
  EXPECT_EQ(decoded(dir / "g/auto-adjust.png").pixels, plain.pixels);
  EXPECT_EQ(decoded(dir / "g/auto-adjust-cutoff-85-weight1-4000.png").pixels, tuned.pixels);
  EXPECT_EQ(decoded(dir / "g/downlight.png").pixels, downlight.pixels);

  ASSERT_EQ(
      tool({"apply", "downlight", "--cutoff", "60", "--rect", "20,10,100,120", in, out}).status, 0);
  std::vector<uint8_t> mask(big.pixels.size(), 0);
  for (int32_t y = 10; y < 130; ++y) {
    std::fill_n(mask.begin() + y * big.width + 20, 100, uint8_t{1});
  }
  Image expected = big;
  with_hdr(60, 1000, [&] {
    applyDownlightPartial(big.pixels.data(), mask.data(), expected.pixels.data(), big.width,
                          big.height, 20, 119, 10, 129);
  });
  EXPECT_EQ(decoded(out).pixels, expected.pixels);
}

TEST_F(Tool, GalleryWithoutInputUsesTheBundledPhotograph) {
  const Ran ran = tool({"gallery", "--only", "contrast", "-o", dir / "g"});
  ASSERT_EQ(ran.status, 0) << ran.err;
  EXPECT_NE(ran.out.find("coffee.png"), std::string::npos);
  EXPECT_EQ(decoded(dir / "g/original.png").pixels,
            decoded(PHOTOFX_ASSET_DIR "/coffee.png").pixels);
  EXPECT_EQ(decoded(dir / "g/contrast-level-20.png").width, 600);
  EXPECT_FALSE(std::filesystem::exists(dir / "g/brightness-level-0.png"));
}

}  // namespace
