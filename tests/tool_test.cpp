// The photofx command-line tool, run as a user runs it, on small generated images: every effect
// through `apply` against the library called directly, whole and under a selection, every way of
// selecting, several inputs with --out-dir, the errors users meet, `list` and the gallery.
#include <gtest/gtest.h>
#include <jpeglib.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <filesystem>
#include <functional>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "photofx.h"
#include "support/files.h"
#include "support/images.h"
#include "catalog/chain.h"
#include "catalog/params.h"
#include "catalog/selection.h"
#include "catalog/texture.h"
#include "tools/exif.h"
#include "tools/image.h"

namespace {

using fxtool::Image;
using pfx::test::Ran;
using pfx::test::TempDir;

constexpr int32_t kWidth = 23, kHeight = 17;  // odd sizes, so no row or column is special

using Fill = void (*)(const uint32_t*, uint32_t*, int32_t, int32_t);
using Selected = std::function<bool(int32_t, int32_t)>;

Image photo(int32_t w, int32_t h, uint64_t seed) {
  Image img;
  img.width = w;
  img.height = h;
  const pfx::test::Pixels px = pfx::test::random_image(w, h, seed);
  img.pixels.assign(px.begin(), px.end());
  return img;
}

Image decoded(const std::string& path) {
  Image img;
  EXPECT_EQ(fxtool::read_image(path, img), "") << path;
  return img;
}

// The library's result for a call that fills its second buffer (a copy of the source) from the
// first; brushes edit the second in place.
Image lib(const Image& src,
          const std::function<void(const uint32_t*, uint32_t*, int32_t, int32_t)>& fill) {
  Image out = src;
  fill(src.pixels.data(), out.pixels.data(), src.width, src.height);
  return out;
}

// `full` where `selected` says so and the source elsewhere: what any selection must give.
Image where(const Image& src, const Image& full, const Selected& selected) {
  Image out = src;
  for (int32_t y = 0; y < src.height; ++y) {
    for (int32_t x = 0; x < src.width; ++x) {
      if (selected(x, y)) out.at(x, y) = full.at(x, y);
    }
  }
  return out;
}

Image brightness(const Image& src, int32_t level) {
  return lib(src, [&](auto s, auto d, auto w, auto h) { controlBrightness(s, d, w, h, level); });
}

// `--rect 3,2,9,6` selects columns 3..11 and rows 2..7: as a mask, and as partial-variant bounds.
constexpr const char* kRect = "3,2,9,6";
bool in_rect(int32_t x, int32_t y) { return x >= 3 && x <= 11 && y >= 2 && y <= 7; }
std::vector<uint8_t> rect_mask() {
  std::vector<uint8_t> mask(static_cast<size_t>(kWidth) * kHeight, 0);
  for (int32_t y = 0; y < kHeight; ++y) {
    for (int32_t x = 0; x < kWidth; ++x) mask[static_cast<size_t>(y * kWidth + x)] = in_rect(x, y);
  }
  return mask;
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

std::set<std::string> entries(const std::string& dir) {
  std::set<std::string> names;
  for (const auto& e : std::filesystem::directory_iterator(dir)) {
    names.insert(e.path().filename().string());
  }
  return names;
}

class Tool : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_EQ(fxtool::write_image(in, src), ""); }

  Ran tool(const std::vector<std::string>& args) {
    return pfx::test::run_program(PHOTOFX_TOOL, args, logs);
  }

  // Runs `apply ARGS... in out` and returns the picture written.
  Image apply(std::vector<std::string> args) {
    args.insert(args.begin(), "apply");
    args.insert(args.end(), {in, out});
    const Ran ran = tool(args);
    EXPECT_EQ(ran.status, 0) << ::testing::PrintToString(args) << ": " << ran.err;
    EXPECT_EQ(ran.err, "");
    return decoded(out);
  }

  TempDir dir, logs;
  std::string in = dir / "in.png";
  std::string out = dir / "out.png";
  Image src = photo(kWidth, kHeight, 11);
};

// Each effect whole, then under a rectangle: the library's full variant, and that result inside
// the rectangle only (partial variants, or the tool keeping the unselected pixels itself).
TEST_F(Tool, EveryEffectMatchesTheLibraryWholeAndUnderASelection) {
  struct Case {
    std::vector<std::string> args;
    Fill full;
  };
  const Case cases[] = {
      {{"brightness", "--level", "3"}, [](auto... a) { controlBrightness(a..., 3); }},
      {{"brightness", "--level=20"}, [](auto... a) { controlBrightness(a..., 20); }},
      {{"contrast", "--level", "17"}, [](auto... a) { controlContrast(a..., 17); }},
      {{"saturation", "--level", "16"}, [](auto... a) { controlSaturation(a..., 16); }},
      {{"temperature", "--level", "4"}, [](auto... a) { controlTemperature(a..., 4); }},
      {{"exposure", "--level", "13"}, [](auto... a) { controlExposure(a..., 13); }},
      {{"hue", "--level", "3"}, [](auto... a) { controlHue(a..., 3); }},
      {{"faded-colour", "--level", "60"}, [](auto... a) { controlFadedColour(a..., 60); }},
      {{"invert"}, [](auto... a) { applyInvert(a...); }},
      {{"channel-gains", "--red", "15", "--green", "3", "--blue", "12"},
       [](auto... a) { controlAdjustRGB(a..., 15, 3, 12); }},
      {{"colour-tone", "--hue", "200"}, [](auto... a) { fx_change_colortone(a..., 200); }},
      {{"lighten", "--cx", "5", "--cy", "6", "--strength", "80", "--radius", "7"},
       [](auto, auto d, auto w, auto h) { rubLighten(d, 5, 6, w, h, 80, 7); }},
      // Brush defaults: the middle of the picture, a quarter of its longer side.
      {{"darken"}, [](auto, auto d, auto w, auto h) { rubDarken(d, 11, 8, w, h, 64, 5); }},
      {{"pixelize-brush"}, [](auto, auto d, auto w, auto h) { rubPixelize(d, w, h, 4, 11, 8, 5); }},
      {{"red-eye"}, [](auto, auto d, auto w, auto h) { removeRedeye(d, w, h, 11, 8, 5); }},
      {{"pixelize", "--shift", "2"}, [](auto... a) { applyPixelize(a..., 2); }},
      {{"tilt-shift", "--centre", "6", "--half-height", "1"},
       [](auto... a) { applyTiltShift(a..., 6, 1); }},
      {{"tilt-shift-preview", "--centre", "12"},
       [](auto s, auto d, auto w, auto h) {
         initTiltShift(s, w, h);
         makeTiltShift(s, d, w, h, 12, 2);
         destroyTiltShift();
       }},
      {{"sharpen"}, [](auto... a) { fx_apply_sharpen_all(a...); }},
      {{"gamma", "--channel", "green", "--gamma", "0.45"},
       [](auto... a) { control_gamma(a..., 2, 0.45); }},
      {{"input-levels", "--channel", "red", "--low", "30", "--high", "200"},
       [](auto... a) { changeHistogramByInput(a..., 1, 30, 200); }},
      {{"output-levels", "--low", "40", "--high", "215"},
       [](auto... a) { changeHistogramByOutput(a..., 0, 40, 215); }},
      {{"greyscale", "--level", "14"}, [](auto... a) { controlGreyscale(a..., 14); }},
      {{"sepia"}, [](auto... a) { fx_apply_sepia(a...); }},
      {{"vignette"}, [](auto... a) { fx_apply_vignette(a...); }},
      {{"vignette-preview"}, [](auto... a) { fx_apply_vignette_prev(a...); }},
      {{"vintage"}, [](auto... a) { applyVintage(a...); }},
      {{"vintage-preview"}, [](auto... a) { fx_apply_vintage_prev(a...); }},
      {{"old-photo"}, [](auto... a) { applyOldPhoto(a...); }},
      {{"old-photo-texture"},
       [](auto s, auto d, auto w, auto h) {
         fx_apply_oldphoto_texture(s, d, fxcat::paper_texture(w, h).data(), w, h);
       }},
      {{"pop-art"}, [](auto... a) { applyPopArt(a...); }},
      {{"pop-art-preview"}, [](auto... a) { fx_apply_popart_prev(a...); }},
      {{"soft-glow", "--level", "80"}, [](auto... a) { applySoftglow(a..., 80); }},
      {{"retro"}, [](auto... a) { applyRetro(a...); }},
      {{"sunshine"}, [](auto... a) { applySunshine(a...); }},
      {{"downlight"}, [](auto... a) { applyDownlight(a...); }},
      {{"bluewash"}, [](auto... a) { applyBluewash(a...); }},
      {{"nostalgia"}, [](auto... a) { applyNostalgia(a...); }},
      {{"yellow-glow"}, [](auto... a) { applyYellowglow(a...); }},
      {{"auto-adjust"}, [](auto... a) { applyAutoAdjust(a...); }},
      {{"twirl", "--cx", "12", "--cy", "8", "--radius", "9", "--angle", "200"},
       [](auto... a) { runTwirl(a..., 12, 8, 9, 200, 0, 22, 0, 16, 0); }},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(::testing::PrintToString(c.args));
    const Image full = lib(src, c.full);
    EXPECT_NE(full.pixels, src.pixels) << "changes nothing";
    EXPECT_EQ(apply(c.args).pixels, full.pixels);
    std::vector<std::string> selected = c.args;
    selected.insert(selected.end(), {"--rect", kRect});
    EXPECT_EQ(apply(selected).pixels, where(src, full, in_rect).pixels);
  }
}

// Where a selection does more than cut out the whole-image result: a masked blur draws on the
// selected pixels only, the blur preview builds its workspace from the mask, the warps take the
// selection's box as their window (fast mode's blocks start at its corner; those the library
// fills one past it are not selected and keep the source), and mirror makes the picture the size
// the library names for it.
TEST_F(Tool, SelectionsReachTheLibraryAsMaskBoundsAndWindow) {
  const std::vector<uint8_t> mask = rect_mask();
  const uint8_t* m = mask.data();
  EXPECT_EQ(apply({"blur", "--level", "8", "--rect", kRect}).pixels,
            lib(src, [&](auto s, auto d, auto w, auto h) {
              applyBlur(s, m, d, w, h, 8, 3, 11, 2, 7);
            }).pixels);
  EXPECT_EQ(apply({"blur", "--level", "5"}).pixels, lib(src, [&](auto s, auto d, auto w, auto h) {
                                                      applyBlur(s, nullptr, d, w, h, 5, 1, 0, 1, 0);
                                                    }).pixels);
  EXPECT_EQ(apply({"blur-preview", "--level", "2", "--rect", kRect}).pixels,
            lib(src, [&](auto s, auto d, auto w, auto h) {
              fx_Init_blur(s, m, w, h, 3, 11, 2, 7);
              fx_make_blur_preview(s, m, d, w, h, 2);
              fx_destroy_blur();
            }).pixels);
  const Image warped = lib(src, [](auto s, auto d, auto w, auto h) {
    runSphericity(s, d, w, h, 8, 9, 6, -70, 2, 16, 3, 14, 1);
  });
  const auto in_box = [](int32_t x, int32_t y) { return x >= 2 && x <= 16 && y >= 3 && y <= 14; };
  EXPECT_EQ(apply({"sphericity", "--cx", "8", "--cy", "9", "--radius", "6", "--level", "-70",
                   "--fast", "on", "--rect", "2,3,15,12"})
                .pixels,
            where(src, warped, in_box).pixels);

  const auto mirrored = [&](int32_t pos, int32_t mode, int32_t axis) {
    Image o;
    o.resize(getMirrorOutwidth(kWidth, pos, mode, axis),
             getMirrorOutheight(kHeight, pos, mode, axis));
    runMirror(src.pixels.data(), kWidth, kHeight, o.pixels.data(), o.width, o.height, pos, mode,
              axis);
    return o.pixels;
  };
  EXPECT_EQ(apply({"mirror", "--mode", "keep-right", "--column", "5"}).pixels,
            mirrored(5, MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL));
  EXPECT_EQ(apply({"mirror", "--axis", "vertical", "--mode", "keep-top", "--row", "3"}).pixels,
            mirrored(3, MIRROR_KEEP_TOP, MIRROR_VERTICAL));
}

// Rectangles clipped to the image, ellipses with their edge, mask files (grey 128 and up selects;
// with alpha, grey times alpha from 128 * 255), all of them together, and a selection of nothing,
// which must not reach the library as bounds around nothing (its whole-image mode).
TEST_F(Tool, EachWayOfSelectingPicksItsPixels) {
  const auto mask_file = [&](const std::string& name, auto word) {
    Image m;
    m.resize(kWidth, kHeight);
    for (int32_t y = 0; y < kHeight; ++y) {
      for (int32_t x = 0; x < kWidth; ++x) m.at(x, y) = word(x, y);
    }
    EXPECT_EQ(fxtool::write_image(dir / name, m), "");
    return dir / name;
  };
  static constexpr uint32_t kGrey[4] = {0, 127, 128, 255};
  const std::string grey = mask_file(
      "grey.png", [](int32_t x, int32_t) { return 0xFF000000u | kGrey[x % 4] * 0x010101u; });
  const std::string alpha = mask_file(
      "alpha.png", [](int32_t x, int32_t) { return x % 2 == 0 ? 0x80FFFFFFu : 0x7FFFFFFFu; });
  const std::string top =
      mask_file("top.png", [](int32_t, int32_t y) { return y < 9 ? 0xFFFFFFFFu : 0xFF000000u; });
  const std::string black = mask_file("black.png", [](int32_t, int32_t) { return 0xFF000000u; });
  const auto ellipse = [](int32_t x, int32_t y) {
    const double dx = (x - 10) / 4.0, dy = (y - 8) / 3.0;
    return dx * dx + dy * dy <= 1.0;
  };
  const struct {
    std::vector<std::string> args;
    Selected selected;
  } cases[] = {
      {{"--rect", "3,2,5,4"},
       [](int32_t x, int32_t y) { return x >= 3 && x <= 7 && y >= 2 && y <= 5; }},
      {{"--rect", "-4,10,10,100"}, [](int32_t x, int32_t y) { return x <= 5 && y >= 10; }},
      {{"--ellipse", "10,8,4,3"}, ellipse},
      {{"--mask", grey}, [](int32_t x, int32_t) { return x % 4 >= 2; }},
      {{"--mask", alpha}, [](int32_t x, int32_t) { return x % 2 == 0; }},
      {{"--mask", top, "--rect", "4,4,40,40", "--ellipse", "4,4,8,8"},
       [](int32_t x, int32_t y) {
         return y < 9 && x >= 4 && y >= 4 && (x - 4) * (x - 4) + (y - 4) * (y - 4) <= 64;
       }},
      {{"--mask", black}, [](int32_t, int32_t) { return false; }},
  };
  EXPECT_TRUE(ellipse(14, 8) && ellipse(10, 5) && !ellipse(14, 9));  // the edge is included
  const Image full = brightness(src, 20);
  for (const auto& c : cases) {
    SCOPED_TRACE(::testing::PrintToString(c.args));
    std::vector<std::string> args{"brightness", "--level", "20"};
    args.insert(args.end(), c.args.begin(), c.args.end());
    EXPECT_EQ(apply(args).pixels, where(src, full, c.selected).pixels);
  }
}

TEST_F(Tool, OutDirWritesEachInputUnderItsNameAndGoesOnAfterAFailure) {
  const Image other = photo(kWidth, kHeight, 12);
  ASSERT_EQ(fxtool::write_image(dir / "b.png", other), "");
  const std::string done = dir / "done", missing = dir / "missing.png";
  const Ran ran = tool({"apply", "brightness", "--level", "7", "--progress", "-j", "1", "--out-dir",
                        done, in, missing, dir / "b.png"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_EQ(decoded(done + "/in.png").pixels, brightness(src, 7).pixels);
  EXPECT_EQ(decoded(done + "/b.png").pixels, brightness(other, 7).pixels);
  EXPECT_EQ(entries(done), (std::set<std::string>{"in.png", "b.png"}));
  const std::vector<std::string> expected = {
      "photofx: [1/3] " + in + " -> " + done + "/in.png",
      "photofx: [2/3] " + missing + " -> " + done + "/missing.png",
      "photofx: " + missing + ": cannot open: No such file or directory",
      "photofx: [3/3] " + dir / "b.png" + " -> " + done + "/b.png"};
  EXPECT_EQ(lines(ran.err), expected);
  // Without --progress, and with stderr not a terminal, a clean run says nothing.
  const Ran quiet = tool({"apply", "contrast", "--out-dir", dir / "quiet", in, dir / "b.png"});
  EXPECT_EQ(quiet.status, 0);
  EXPECT_EQ(quiet.err, "");
}

// A refused run exits 2 for a bad command line and 1 for an unusable file or a picture the
// settings do not fit, says why on one line, and leaves every file as it was (an existing output
// included).
TEST_F(Tool, RefusedRunsSayWhyOnOneLineAndWriteNothing) {
  pfx::test::write_file(out, "the previous result");
  pfx::test::write_file(dir / "text.png", "not an image at all");
  const std::string png = pfx::test::read_file(in);
  pfx::test::write_file(dir / "cut.png", png.substr(0, png.size() / 2));
  ASSERT_EQ(fxtool::write_image(dir / "small.png", photo(5, 5, 13)), "");
  for (const char* name : {"cut.webp", "cut.tif"}) {
    ASSERT_EQ(fxtool::write_image(dir / name, src), "");
    const std::string bytes = pfx::test::read_file(dir / name);
    pfx::test::write_file(dir / name, bytes.substr(0, bytes.size() / 2));
  }
  // Words of each command line; IN, OUT and D/ stand for the input, the output and the
  // directory they are in.
  const struct {
    int status;
    const char* words;
    const char* message;
  } cases[] = {
      {2, "apply sparkle IN OUT", "unknown effect 'sparkle'"},
      {2, "apply brightness --level 21 IN OUT", "--level 21 is out of range 0..20"},
      {2, "apply brightness --level 1x IN OUT", "--level needs a whole number, not '1x'"},
      {2, "apply brightness --radius 3 IN OUT",
       "brightness has no parameter --radius (it takes --level)"},
      {2, "apply brightness --level 2 --level 3 IN OUT", "given twice"},
      {2, "apply brightness IN OUT --level", "--level needs a value"},
      {2, "apply brightness --rect 1,2,3 IN OUT", "--rect needs X,Y,W,H"},
      {2, "apply brightness --ellipse 5,5,0,3 IN OUT", "--ellipse radii"},
      {2, "apply brightness IN D/out.gif", "unknown image format"},
      {2, "apply brightness IN", "apply needs IN and OUT"},
      {2, "apply brightness -x IN OUT", "unknown option -x"},
      {2, "apply", "apply needs an effect"},
      {2, "frobnicate", "unknown command 'frobnicate'"},
      {2, "apply brightness --out-dir D/o IN D/x/in.png", "two inputs would both be written to"},
      {2, "gallery --only brightness,sparkle -o D/g", "unknown effect 'sparkle' in --only"},
      {2, "apply twirl --fast yes IN OUT", "--fast must be one of off, on, not 'yes'"},
      {2, "apply sphericity --level -101 IN OUT", "--level -101 is out of range -100..100"},
      {2, "apply gamma --gamma 1,5 IN OUT", "--gamma needs a number, not '1,5'"},
      {2, "apply mirror --rect 1,1,4,4 IN OUT",
       "mirror takes no selection (it changes the image's size)"},
      {1, "apply brightness D/missing.png OUT",
       "missing.png: cannot open: No such file or directory"},
      {1, "apply brightness D/text.png OUT", "text.png: not a PNG, JPEG, WebP or TIFF image"},
      {1, "apply brightness D/cut.png OUT", "cut.png: cannot decode PNG"},
      {1, "apply brightness D/cut.webp OUT", "cut.webp: cannot decode WebP"},
      {1, "apply brightness D/cut.tif OUT", "cut.tif: cannot decode TIFF"},
      {1, "apply brightness --max-pixels 390 IN OUT",
       "23x17 is 391 pixels, more than --max-pixels"},
      {2, "apply brightness --level 13 , contrast --level 42 IN OUT",
       "step 2 (contrast): --level 42 is out of range 0..20"},
      {2, "apply brightness + contrast IN OUT", "'+' does not separate steps"},
      {2, "apply brightness --level 13, contrast IN OUT", "not '13,' (steps are separated by"},
      {2, "apply brightness , , contrast IN OUT", "step 2 is empty"},
      {2, "apply brightness --level 3 contrast IN OUT", "'contrast' is an effect: steps are"},
      {2, "apply brightness IN , contrast OUT", "step 1 (brightness): unexpected"},
      {2, "apply invert , mirror --rect 1,1,4,4 IN OUT", "step 2 (mirror): mirror takes no"},
      {1, "apply invert , mirror --mode keep-top IN OUT", "step 2 (mirror): the library refused"},
      {2, "apply brightness --lossless IN OUT", "--lossless is for WebP outputs"},
      {2, "apply brightness --quality 101 IN D/out.jpg", "--quality needs a whole number 1..100"},
      {2, "apply brightness -j 0 --out-dir D/o IN", "-j needs a number of files at once"},
      {1, "apply brightness --mask D/small.png IN OUT", "is 5x5 but the image is 23x17"},
      {1, "apply brightness --rect 23,0,5,5 IN OUT",
       "--rect 23,0,5,5 lies outside the 23x17 image"},
      {1, "apply brightness --ellipse -3,5,2,2 IN OUT",
       "--ellipse -3,5,2,2 lies outside the 23x17"},
      // Positions are checked against each picture, so they fail per file.
      {1, "apply lighten --cx 23 IN OUT", "--cx 23 is out of range 0..22 for a 23x17 image"},
      {1, "apply input-levels --low 90 --high 90 IN OUT",
       "input-levels: --high must be above --low"},
      // The library refuses a mirror whose side does not belong to its axis.
      {1, "apply mirror --mode keep-top IN OUT", "keep-top and keep-bottom with --axis vertical"},
      {1, "apply brightness IN D/no-dir/out.png",
       "out.png: cannot write: No such file or directory"},
      {1, "gallery D/missing.png -o D/g", "missing.png: cannot open"},
  };
  const std::set<std::string> before = dir.entries();
  for (const auto& c : cases) {
    SCOPED_TRACE(c.words);
    std::vector<std::string> args;
    std::istringstream words(c.words);
    for (std::string w; words >> w;) {
      args.push_back(w == "IN"               ? in
                     : w == "OUT"            ? out
                     : w.rfind("D/", 0) == 0 ? dir / w.substr(2)
                                             : w);
    }
    const Ran ran = tool(args);
    EXPECT_EQ(ran.status, c.status) << ran.err;
    EXPECT_NE(ran.err.find(c.message), std::string::npos) << ran.err;
    EXPECT_EQ(ran.err.rfind("photofx: ", 0), 0u) << ran.err;
    EXPECT_EQ(ran.err.find('\n'), ran.err.size() - 1) << "one line: " << ran.err;
    EXPECT_EQ(dir.entries(), before) << "a file was left behind";
    EXPECT_EQ(pfx::test::read_file(out), "the previous result");
  }
}

// The effect names `photofx list` prints: the first word of each line before the blank one.
std::vector<std::string> listed_effects(const Ran& ran) {
  std::vector<std::string> names;
  for (const std::string& line : lines(ran.out)) {
    if (line.empty()) break;
    names.push_back(line.substr(0, line.find(' ')));
  }
  return names;
}

// A chain runs its steps in order on the decoded pixels, each with its own parameters and
// selection, and selections after a change of size are measured on the new picture: the
// library called step by step, with no encoding in between.
TEST_F(Tool, AChainIsTheLibraryCalledStepByStep) {
  const Image got = apply(
      {"brightness", "--level",   "13",      ",",        "contrast",  "--level=12", "--rect", kRect,
       ",",          "mirror",    "--axis",  "vertical", "--mode",    "keep-top",   "--row",  "9",
       ",",          "greyscale", "--level", "4",        "--ellipse", "10,15,6,4"});
  const Image step1 = brightness(src, 13);
  const Image step2 =
      where(step1, lib(step1, [](auto... a) { controlContrast(a..., 12); }), in_rect);
  Image step3;
  step3.resize(kWidth, 20);  // rows 0..9 and their reflection
  ASSERT_EQ(runMirror(step2.pixels.data(), kWidth, kHeight, step3.pixels.data(), kWidth, 20, 9,
                      MIRROR_KEEP_TOP, MIRROR_VERTICAL),
            PHOTOFX_SUCCESS);
  const Image grey = lib(step3, [](auto... a) { controlGreyscale(a..., 4); });
  const Image step4 = where(step3, grey, [](int32_t x, int32_t y) {
    return (x - 10) * (x - 10) * 16 + (y - 15) * (y - 15) * 36 <= 576;
  });
  EXPECT_EQ(got.height, 20);
  EXPECT_EQ(got.pixels, step4.pixels);
}

// Files on several threads come out as the bytes one thread writes, even when every file's
// chain uses the library's module-wide state (auto adjust's parameters, the blur workspace).
// Pictures under 150 pixels a side never read the parameters, hence the size.
TEST_F(Tool, ParallelBatchesWriteTheBytesOfASerialOne) {
  std::vector<std::string> inputs;
  for (const char* name : {"a.png", "b.jpg", "c.webp", "d.tif", "e.png", "f.jpg", "g.tif"}) {
    inputs.push_back(dir / name);
    ASSERT_EQ(fxtool::write_image(inputs.back(), photo(160, 150, inputs.size())), "");
  }
  for (const char* jobs : {"1", "4"}) {
    std::vector<std::string> args{"apply", "auto-adjust",  "--cutoff",  "60",
                                  ",",     "downlight",    "--weight1", "4000",
                                  ",",     "blur-preview", ",",         "tilt-shift-preview",
                                  "-j",    jobs,           "--out-dir", dir / jobs};
    args.insert(args.end(), inputs.begin(), inputs.end());
    const Ran ran = tool(args);
    ASSERT_EQ(ran.status, 0) << ran.err;
  }
  for (const std::string& in_path : inputs) {
    const std::string name = in_path.substr(in_path.rfind('/'));
    EXPECT_EQ(pfx::test::read_file(dir / "4" + name), pfx::test::read_file(dir / "1" + name))
        << name;
  }
}

// A big-endian EXIF block as a phone writes it: the model, and orientation 6 (turn the
// picture 90 degrees clockwise to view it).
const std::string kPhoneExif(
    "MM\0*\0\0\0\x08\0\x02"
    "\x01\x10\0\x02\0\0\0\x04Pix\0"
    "\x01\x12\0\x03\0\0\0\x01\0\x06\0\0"
    "\0\0\0\0",
    38);

// An ICC profile for RGB pictures as libpng checks them: a header and one tag, whose data
// does not compress to almost nothing (libpng refuses profiles that do).
std::string icc_profile() {
  std::string p(512, '\0');
  const auto be32 = [&](size_t at, uint32_t v) {
    for (size_t i = 0; i < 4; ++i) p[at + i] = static_cast<char>(v >> (24 - 8 * i));
  };
  be32(0, 512);
  be32(8, 0x02100000u);
  p.replace(12, 12, "mntrRGB XYZ ");
  p.replace(36, 4, "acsp");
  be32(68, 0xF6D6u);  // the D50 white point
  be32(72, 0x10000u);
  be32(76, 0xD32Du);
  be32(128, 1);  // the tag: its signature, offset and size, then its data
  p.replace(132, 4, "desc");
  be32(136, 144);
  be32(140, 512 - 144);
  for (size_t i = 144; i < 512; ++i) p[i] = static_cast<char>(i * 37 % 251);
  return p;
}

// Writes `img` as a JPEG through libjpeg itself, with EXIF, ICC and XMP markers.
void write_phone_jpeg(const std::string& path, const Image& img, const std::string& icc,
                      const std::string& xmp) {
  FILE* f = std::fopen(path.c_str(), "wb");
  ASSERT_NE(f, nullptr);
  jpeg_compress_struct c{};
  jpeg_error_mgr err{};
  c.err = jpeg_std_error(&err);
  jpeg_create_compress(&c);
  jpeg_stdio_dest(&c, f);
  c.image_width = static_cast<JDIMENSION>(img.width);
  c.image_height = static_cast<JDIMENSION>(img.height);
  c.input_components = 3;
  c.in_color_space = JCS_RGB;
  jpeg_set_defaults(&c);
  jpeg_start_compress(&c, TRUE);
  const auto marker = [&](const std::string& bytes) {
    jpeg_write_marker(&c, JPEG_APP0 + 1, reinterpret_cast<const JOCTET*>(bytes.data()),
                      static_cast<unsigned>(bytes.size()));
  };
  marker(std::string("Exif\0\0", 6) + kPhoneExif);
  jpeg_write_icc_profile(&c, reinterpret_cast<const JOCTET*>(icc.data()),
                         static_cast<unsigned>(icc.size()));
  marker(std::string("http://ns.adobe.com/xap/1.0/", 29) + xmp);
  std::vector<uint8_t> row(static_cast<size_t>(img.width) * 3);
  for (int32_t y = 0; y < img.height; ++y) {
    for (int32_t x = 0; x < img.width; ++x) {
      for (int32_t k = 0; k < 3; ++k)
        row[size_t(x) * 3 + k] = uint8_t(img.at(x, y) >> (16 - 8 * k));
    }
    JSAMPROW line = row.data();
    jpeg_write_scanlines(&c, &line, 1);
  }
  jpeg_finish_compress(&c);
  jpeg_destroy_compress(&c);
  std::fclose(f);
}

// EXIF, ICC profile and XMP go from a phone's JPEG into every output format (TIFF keeps the
// orientation and the model as its own tags); --strip leaves them out; --auto-orient turns the
// pixels upright first, resets the orientation, and selections then refer to the upright picture.
TEST_F(Tool, MetadataSurvivesAndAutoOrientTurnsThePictureUpright) {
  const std::string jpeg = dir / "phone.jpg", icc = icc_profile(), xmp = "<x:xmpmeta/>";
  write_phone_jpeg(jpeg, src, icc, xmp);
  const auto metadata_of = [](const std::string& path) {
    fxtool::Metadata m;
    Image img;
    EXPECT_EQ(fxtool::read_image(path, img, {.metadata = &m}), "") << path;
    return m;
  };
  for (const char* name : {"o.jpg", "o.png", "o.webp", "o.tif"}) {
    ASSERT_EQ(tool({"apply", "invert", jpeg, dir / name}).status, 0) << name;
    const fxtool::Metadata m = metadata_of(dir / name);
    EXPECT_EQ(m.icc, icc) << name;
    EXPECT_EQ(m.xmp, xmp) << name;
    if (name == std::string("o.tif")) {
      EXPECT_EQ(fxtool::exif_orientation(m.exif), 6);
      EXPECT_EQ(fxtool::exif_text_tags(m.exif), (fxtool::TextTags{{272, "Pix"}}));
    } else {
      EXPECT_EQ(m.exif, kPhoneExif) << name;
    }
  }
  ASSERT_EQ(tool({"apply", "invert", "--strip", jpeg, out}).status, 0);
  EXPECT_TRUE(metadata_of(out).empty());

  const Image stored = decoded(jpeg);
  Image upright;
  upright.resize(kHeight, kWidth);
  for (int32_t y = 0; y < kWidth; ++y) {
    for (int32_t x = 0; x < kHeight; ++x) upright.at(x, y) = stored.at(y, kHeight - 1 - x);
  }
  ASSERT_EQ(tool({"apply", "invert", "--auto-orient", "--rect", "0,0,5,20", jpeg, out}).status, 0);
  const Image inverted = lib(upright, [](auto... a) { applyInvert(a...); });
  EXPECT_EQ(decoded(out).pixels,
            where(upright, inverted, [](int32_t x, int32_t y) { return x < 5 && y < 20; }).pixels);
  EXPECT_EQ(fxtool::exif_orientation(metadata_of(out).exif), 1);
}

// The gallery shows every effect `list` names at least once, each picture as `apply` would make
// it at the settings in its name, next to the original, a contact sheet and an index.
TEST_F(Tool, ListAndGalleryShowEveryEffect) {
  const Ran list = tool({"list"});
  ASSERT_EQ(list.status, 0);
  const std::vector<std::string> all = lines(list.out);
  const auto contrast = std::find_if(all.begin(), all.end(), [](const std::string& line) {
    return line.rfind("contrast ", 0) == 0;
  });
  ASSERT_NE(contrast, all.end()) << list.out;
  EXPECT_NE(contrast->find(" adjust "), std::string::npos) << *contrast;
  EXPECT_NE(contrast->find(" --level 0..20 (10) "), std::string::npos) << *contrast;

  const Ran ran = tool({"gallery", in, "-o", dir / "g"});
  ASSERT_EQ(ran.status, 0) << ran.err;
  EXPECT_NE(ran.out.find(dir / "g"), std::string::npos) << "says where it was written";
  EXPECT_EQ(decoded(dir / "g/original.png").pixels, src.pixels);
  EXPECT_EQ(decoded(dir / "g/brightness-level-0.png").pixels, brightness(src, 0).pixels);
  EXPECT_EQ(decoded(dir / "g/soft-glow-level-50.png").pixels,
            lib(src, [](auto... a) { applySoftglow(a..., 50); }).pixels);
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
  const std::vector<std::string> names = listed_effects(list);
  EXPECT_GE(names.size(), 40u);
  for (const std::string& name : names) {
    EXPECT_EQ(shown.count(name), 1u) << name << " is missing from the gallery";
  }
  EXPECT_EQ(entries(dir / "g"), files);
  // The contact sheet: tiles side by side, with captions drawn in the title colour.
  const Image sheet = decoded(dir / "g/contact-sheet.png");
  EXPECT_GE(sheet.width, 6 * 192);
  EXPECT_GT(std::count(sheet.pixels.begin(), sheet.pixels.end(), 0xFFE8E8E8u), 200);

  // Without an input the gallery shows the bundled photograph.
  const Ran bundled = tool({"gallery", "--only", "contrast", "-o", dir / "b"});
  ASSERT_EQ(bundled.status, 0) << bundled.err;
  EXPECT_NE(bundled.out.find("coffee.png"), std::string::npos);
  EXPECT_EQ(decoded(dir / "b/original.png").pixels,
            decoded(PHOTOFX_ASSET_DIR "/coffee.png").pixels);
  EXPECT_EQ(decoded(dir / "b/contrast-level-20.png").width, 600);
  EXPECT_FALSE(std::filesystem::exists(dir / "b/brightness-level-0.png"));
}

// Help fits a terminal of 80 columns; --version names the library and the image libraries.
TEST_F(Tool, HelpFitsEightyColumnsAndVersionNamesTheLibraries) {
  std::vector<std::vector<std::string>> runs{{"help"}};
  for (const std::string& name : listed_effects(tool({"list"}))) runs.push_back({"help", name});
  for (const auto& args : runs) {
    const Ran ran = tool(args);
    EXPECT_EQ(ran.status, 0);
    for (const std::string& line : lines(ran.out)) EXPECT_LE(line.size(), 80u) << line;
  }
  const Ran version = tool({"--version"});
  EXPECT_EQ(version.status, 0);
  const std::string library = "libphotofx " + std::to_string(PHOTOFX_VERSION_MAJOR) + "." +
                              std::to_string(PHOTOFX_VERSION_MINOR) + ".";
  for (const std::string& name : {library, std::string("libjpeg"), std::string("libtiff")}) {
    EXPECT_NE(version.out.find(name), std::string::npos) << version.out;
  }
}

// Auto adjust's parameters are module-wide, and the gallery runs every picture in one process:
// a tuned auto adjust must not carry over into the downlight picture after it. Pictures under
// 150 pixels a side never read the parameters, hence the larger input.
TEST_F(Tool, AutoAdjustParametersReachTheLibraryAndStayWithTheirPicture) {
  const Image big = photo(160, 150, 21);
  ASSERT_EQ(fxtool::write_image(in, big), "");
  const auto tuned = [](int32_t cutoff, int32_t weight1, Fill fill, const Image& img) {
    fx_set_hdr(70, cutoff, weight1, 5120);
    Image result = lib(img, fill);
    fx_set_hdr(70, 100, 1000, 5120);
    return result;
  };
  const Ran ran = tool({"gallery", in, "-o", dir / "g", "--only", "auto-adjust,downlight"});
  ASSERT_EQ(ran.status, 0) << ran.err;
  const Fill adjust = [](auto... a) { applyAutoAdjust(a...); };
  const Image plain = lib(big, adjust);
  ASSERT_NE(tuned(85, 4000, adjust, big).pixels, plain.pixels);
  EXPECT_EQ(decoded(dir / "g/auto-adjust.png").pixels, plain.pixels);
  EXPECT_EQ(decoded(dir / "g/auto-adjust-cutoff-85-weight1-4000.png").pixels,
            tuned(85, 4000, adjust, big).pixels);
  EXPECT_EQ(decoded(dir / "g/downlight.png").pixels,
            lib(big, [](auto... a) { applyDownlight(a...); }).pixels);

  ASSERT_EQ(
      tool({"apply", "downlight", "--cutoff", "60", "--rect", "20,10,100,120", in, out}).status, 0);
  const Image expected = tuned(
      60, 1000,
      [](auto s, auto d, auto w, auto h) {
        std::vector<uint8_t> mask(static_cast<size_t>(w) * h, 0);
        for (int32_t y = 10; y < 130; ++y) std::fill_n(mask.begin() + y * w + 20, 100, uint8_t{1});
        applyDownlightPartial(s, mask.data(), d, w, h, 20, 119, 10, 129);
      },
      big);
  EXPECT_EQ(decoded(out).pixels, expected.pixels);
}

// Hosts run an effect in place whenever its catalogue entry allows, to hold one picture in
// memory: for every such entry, at every gallery setting, whole and under a selection, one
// buffer must give what two give.
TEST(Catalog, EffectsThatRunInPlaceGiveWhatTwoBuffersGive) {
  const Image src = photo(kWidth, kHeight, 31);
  fxcat::Selection sel;
  fxcat::SelectionRequest rect;
  rect.has_rect = true;
  rect.rect = {3, 2, 9, 6};
  ASSERT_EQ(fxcat::make_selection(rect, kWidth, kHeight, sel), "");
  for (const fxcat::Effect& e : fxcat::effects()) {
    if (!e.in_place || e.gallery == nullptr) continue;
    for (std::string_view items = e.gallery;;) {
      const std::string item(items.substr(0, items.find(';')));
      SCOPED_TRACE(std::string(e.name) + " " + item);
      fxcat::Settings settings;
      fxcat::Values values;
      ASSERT_EQ(fxcat::parse_settings(e, item, settings), "");
      ASSERT_EQ(fxcat::resolve(e, settings, kWidth, kHeight, values), "");
      const fxcat::Selection* const choices[] = {nullptr, &sel};
      for (const fxcat::Selection* s : choices) {
        if (fxcat::needs_two_buffers(e, s != nullptr)) continue;
        Image two = src, one = src;
        ASSERT_EQ(
            fxcat::run_effect(e, values, src.pixels.data(), kWidth, kHeight, two.pixels.data(), s),
            "");
        ASSERT_EQ(
            fxcat::run_effect(e, values, one.pixels.data(), kWidth, kHeight, one.pixels.data(), s),
            "");
        EXPECT_EQ(one.pixels, two.pixels) << (s != nullptr ? "under a selection" : "whole");
      }
      if (items.find(';') == std::string_view::npos) break;
      items.remove_prefix(items.find(';') + 1);
    }
  }
}

// An editor's slider drag builds an effect's workspace once and previews every move from it
// (on a picture reduced 4 times, so the workspace is a scaled copy): each preview, at levels up
// and down the range, whole and under a selection, is what a run of the effect alone gives, and
// a preview into the picture it works from is refused.
TEST(Catalog, SessionPreviewsGiveWhatEachRunGives) {
  constexpr int32_t w = 900, h = 40;
  const Image src = photo(w, h, 5);
  fxcat::Selection sel;
  fxcat::SelectionRequest ellipse;
  ellipse.has_ellipse = true;
  ellipse.ellipse = {400, 20, 300, 15};
  ASSERT_EQ(fxcat::make_selection(ellipse, w, h, sel), "");
  const fxcat::Selection* const choices[] = {nullptr, &sel};
  for (const fxcat::Effect& e : fxcat::effects()) {
    if (e.stages == nullptr) continue;
    fxcat::Values values;
    ASSERT_EQ(fxcat::resolve(e, {}, w, h, values), "");
    const fxcat::Range r = fxcat::range_for(e.params[0], w, h);
    const auto at = [&](int32_t step) { return r.min + std::floor((r.max - r.min) * step / 3); };
    for (const fxcat::Selection* s : choices) {
      std::vector<Image> alone;
      for (int32_t step : {3, 0, 2, 1, 3}) {
        values[0] = at(step);
        alone.push_back(src);
        ASSERT_EQ(
            fxcat::run_effect(e, values, src.pixels.data(), w, h, alone.back().pixels.data(), s),
            "");
      }
      fxcat::Session session;  // (holds the workspace's lock: no run_effect of it until the end)
      ASSERT_EQ(session.begin(e, values, src.pixels.data(), w, h, s), "") << e.name;
      size_t i = 0;
      for (int32_t step : {3, 0, 2, 1, 3}) {
        values[0] = at(step);
        Image moved = src;
        ASSERT_EQ(session.preview(values, moved.pixels.data()), "");
        EXPECT_EQ(moved.pixels, alone[i++].pixels)
            << e.name << " at " << values[0] << (s ? " in" : "");
      }
      EXPECT_NE(session.preview(values, const_cast<uint32_t*>(src.pixels.data())), "");
    }
  }
}

// Hosts that take a chain as one string: commas that stand apart separate steps, commas inside
// a word do not; options the chain does not know are refused without a host to take them.
TEST(Catalog, ChainsWrittenAsOneStringSplitAtLoneCommas) {
  EXPECT_EQ(fxcat::split_words(" brightness --level 13, contrast --rect 1,2,3,4 ,vintage"),
            (std::vector<std::string>{"brightness", "--level", "13", ",", "contrast", "--rect",
                                      "1,2,3,4", ",", "vintage"}));
  std::vector<fxcat::Step> steps;
  ASSERT_EQ(
      fxcat::parse_chain(fxcat::split_words("brightness --level=13 , contrast --rect 1,2,3,4"),
                         nullptr, steps),
      "");
  ASSERT_EQ(steps.size(), 2u);
  EXPECT_EQ(steps[0].settings.values[0], 13);
  EXPECT_EQ(steps[1].selection.rect.c, 3);
  EXPECT_EQ(fxcat::parse_chain(fxcat::split_words("invert , sepia --out-dir x"), nullptr, steps),
            "step 2 (sepia): sepia has no parameter --out-dir (it takes no parameters)");
}

}  // namespace
