// The image codecs behind tools/image.h, one file each (png.cpp, jpeg.cpp, webp.cpp, tiff.cpp),
// and what they share.
//
// Pixel words 0xAARRGGBB lie in memory as the bytes B, G, R, A on a little-endian machine, an
// order libpng, libjpeg-turbo and libwebp read and write directly: they decode straight into the
// pixel buffer and encode straight out of it, a row at a time, with no copy of the picture.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <string>

#include "tools/image.h"

namespace fxtool::codec {

static_assert(std::endian::native == std::endian::little,
              "the codecs hand pixel words to the image libraries as B, G, R, A bytes");

// The refusal for a picture of this size, or "" when it may be decoded.
std::string check_size(uint64_t width, uint64_t height, int64_t max_pixels);

// The same for codecs that report errors by longjmp: copies the refusal into `reason` (no
// string left alive across the jump) and returns true when the picture must not be decoded.
bool refuse_size(char* reason, size_t size, uint64_t width, uint64_t height, int64_t max_pixels);

// Whether every pixel's alpha is 255.
bool is_opaque(const Image& image);

// Each reader starts at the beginning of `file` and fills `out` (and options.metadata when it
// is not null); each writer writes the whole file to `file`, which it neither flushes nor closes.
std::string read_png(FILE* file, Image& out, const ReadOptions& options);
std::string read_jpeg(FILE* file, Image& out, const ReadOptions& options);
std::string read_webp(FILE* file, Image& out, const ReadOptions& options);
std::string read_tiff(FILE* file, Image& out, const ReadOptions& options);
std::string write_png(FILE* file, const Image& image, const WriteOptions& options);
std::string write_jpeg(FILE* file, const Image& image, const WriteOptions& options);
std::string write_webp(FILE* file, const Image& image, const WriteOptions& options);
// TIFF reads back what it has written, so `file` must be open for reading too.
std::string write_tiff(FILE* file, const Image& image, const WriteOptions& options);

std::string png_version();
std::string jpeg_version();
std::string webp_version();
std::string tiff_version();

// ---- Row conversions, written as plain loops the compiler vectorises ------------------------

// n pixels from R, G, B bytes (alpha 255) or R, G, B, A bytes.
inline void rgb_to_words(const uint8_t* in, uint32_t* out, size_t n) {
  for (size_t i = 0; i < n; ++i) {
    out[i] = 0xFF000000u | uint32_t{in[3 * i]} << 16 | uint32_t{in[3 * i + 1]} << 8 |
             uint32_t{in[3 * i + 2]};
  }
}

inline void rgba_to_words(const uint8_t* in, uint32_t* out, size_t n) {
  for (size_t i = 0; i < n; ++i) {
    out[i] = uint32_t{in[4 * i + 3]} << 24 | uint32_t{in[4 * i]} << 16 |
             uint32_t{in[4 * i + 1]} << 8 | uint32_t{in[4 * i + 2]};
  }
}

// n pixels to R, G, B bytes (alpha dropped) or R, G, B, A bytes.
inline void words_to_rgb(const uint32_t* in, uint8_t* out, size_t n) {
  for (size_t i = 0; i < n; ++i) {
    out[3 * i] = static_cast<uint8_t>(in[i] >> 16);
    out[3 * i + 1] = static_cast<uint8_t>(in[i] >> 8);
    out[3 * i + 2] = static_cast<uint8_t>(in[i]);
  }
}

inline void words_to_rgba(const uint32_t* in, uint8_t* out, size_t n) {
  for (size_t i = 0; i < n; ++i) {
    out[4 * i] = static_cast<uint8_t>(in[i] >> 16);
    out[4 * i + 1] = static_cast<uint8_t>(in[i] >> 8);
    out[4 * i + 2] = static_cast<uint8_t>(in[i]);
    out[4 * i + 3] = static_cast<uint8_t>(in[i] >> 24);
  }
}

}  // namespace fxtool::codec
