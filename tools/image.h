// Images as the command-line tool holds them, and their files: PNG, JPEG, WebP and TIFF through
// libpng, libjpeg, libwebp and libtiff, with the photograph's metadata (EXIF, ICC profile, XMP).
// Every function reports a failure as a one-line reason (empty string: success), so the caller
// can print it after the file name and carry on with the next file.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "catalog/effects.h"

namespace fxtool {

using fxcat::kMaxPixels;
using fxcat::Pixels;

// Pixels as the library takes them: 0xAARRGGBB words, row after row, no gap between rows.
struct Image {
  int32_t width = 0;
  int32_t height = 0;
  Pixels pixels;

  // New pixels are left as they are: whoever resizes is about to write every one of them.
  void resize(int32_t w, int32_t h) {
    width = w;
    height = h;
    pixels.resize(static_cast<size_t>(w) * static_cast<size_t>(h));
  }
  uint32_t& at(int32_t x, int32_t y) {
    return pixels[static_cast<size_t>(y) * static_cast<size_t>(width) + static_cast<size_t>(x)];
  }
  uint32_t at(int32_t x, int32_t y) const {
    return pixels[static_cast<size_t>(y) * static_cast<size_t>(width) + static_cast<size_t>(x)];
  }
  uint32_t* row(int32_t y) { return pixels.data() + static_cast<size_t>(y) * size_t(width); }
  const uint32_t* row(int32_t y) const {
    return pixels.data() + static_cast<size_t>(y) * size_t(width);
  }
};

// What a photograph carries besides its pixels, as the bytes of each block (empty: none). The
// EXIF block starts with its TIFF header ("II*\0" or "MM\0*"), whatever container it came in.
struct Metadata {
  std::string exif, icc, xmp;

  bool empty() const { return exif.empty() && icc.empty() && xmp.empty(); }
};

enum class FileFormat { kUnknown, kPng, kJpeg, kWebp, kTiff };

// Output format chosen by the file name's extension (.png, .jpg, .jpeg, .webp, .tif, .tiff, any
// case).
FileFormat format_of_name(const std::string& path);

// Images above this many pixels are refused before they are decoded (see catalog/effects.h).
constexpr int64_t kDefaultMaxPixels = fxcat::kDefaultMaxPixels;

struct ReadOptions {
  int64_t max_pixels = kDefaultMaxPixels;
  Metadata* metadata = nullptr;  // filled when not null
};

// Reads a PNG, JPEG, WebP or TIFF file, told apart by its first bytes, whatever its name. Grey,
// palette and 16-bit images come out as 8-bit ARGB; images without alpha come out opaque. The
// pixels are as stored: an EXIF orientation is reported in the metadata, not applied.
std::string read_image(const std::string& path, Image& out, const ReadOptions& options = {});

// The same from bytes in memory (the bundled sample photograph).
std::string decode_image(const unsigned char* data, size_t size, Image& out,
                         const ReadOptions& options = {});

struct WriteOptions {
  int quality = fxcat::kDefaultQuality;  // JPEG and lossy WebP, 1..100
  bool lossless = false;                 // WebP
  const Metadata* metadata = nullptr;
};

// Writes by the extension of `path`. PNG, lossless WebP and TIFF keep alpha (an image that is
// opaque everywhere is written without an alpha channel); JPEG has none and drops it; lossy WebP
// keeps it approximately. Metadata goes where the format has room for it. The file is written
// under a temporary name in the same directory and renamed into place only when it is
// complete, so a failure never leaves a half-written file behind or spoils an existing one.
std::string write_image(const std::string& path, const Image& image,
                        const WriteOptions& options = {});

// Writes any bytes the same way (the gallery's index page).
std::string write_text(const std::string& path, const std::string& text);

// "libpng 1.6.39, libjpeg-turbo 2.1.5, ...": the codecs the tool was built with.
std::string codec_versions();

}  // namespace fxtool
