// Images as the command-line tool holds them, and their files: PNG and JPEG through libpng and
// libjpeg. Every function reports a failure as a one-line reason (empty string: success), so
// the caller can print it after the file name and carry on with the next file.
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
};

enum class FileFormat { kUnknown, kPng, kJpeg };

// Output format chosen by the file name's extension (.png, .jpg, .jpeg, any case).
FileFormat format_of_name(const std::string& path);

// Reads a PNG or JPEG file, told apart by its first bytes, whatever its name. Grey, palette and
// 16-bit PNGs come out as 8-bit ARGB; images without alpha come out opaque.
std::string read_image(const std::string& path, Image& out);

// The same from bytes in memory (the bundled sample photograph).
std::string decode_image(const unsigned char* data, size_t size, Image& out);

// Writes PNG or JPEG by the extension of `path`. PNG keeps alpha (an image that is opaque
// everywhere is written without an alpha channel); JPEG has none and drops it. The file is
// written under a temporary name in the same directory and renamed into place only when it is
// complete, so a failure never leaves a half-written file behind or spoils an existing one.
std::string write_image(const std::string& path, const Image& image);

// Writes any bytes the same way (the gallery's index page).
std::string write_text(const std::string& path, const std::string& text);

}  // namespace fxtool
