// PNG files through libpng, decoded straight into the pixel buffer and encoded straight out of
// it; EXIF in eXIf, the ICC profile in iCCP, XMP in an iTXt chunk.
//
// libpng reports errors by longjmp. Each call therefore runs in two layers: a function that
// calls setjmp and owns the codec state (declared before setjmp, cleaned up by its destructor),
// and a worker that does the decoding or encoding with nothing but trivially destructible
// locals, so that a jump out of it skips no destructor.
#include <png.h>

#include <csetjmp>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

#include "tools/codecs.h"

namespace fxtool::codec {
namespace {

constexpr size_t kReasonSize = 200;
constexpr const char* kXmpKeyword = "XML:com.adobe.xmp";

void png_error_to_reason(png_structp png, png_const_charp message) {
  std::snprintf(static_cast<char*>(png_get_error_ptr(png)), kReasonSize, "%s", message);
  png_longjmp(png, 1);
}

void png_ignore_warning(png_structp, png_const_charp) {}

struct PngReader {
  png_structp png = nullptr;
  png_infop info = nullptr;
  char reason[kReasonSize] = "";
  std::vector<png_bytep> rows;
  Image* out = nullptr;
  const ReadOptions* options = nullptr;

  PngReader() {
    png = png_create_read_struct(PNG_LIBPNG_VER_STRING, reason, png_error_to_reason,
                                 png_ignore_warning);
    if (png != nullptr) info = png_create_info_struct(png);
  }
  ~PngReader() { png_destroy_read_struct(&png, &info, nullptr); }
};

void png_metadata(PngReader& r) {
  Metadata& m = *r.options->metadata;
  png_uint_32 size = 0;
  png_bytep exif = nullptr;
  if (png_get_eXIf_1(r.png, r.info, &size, &exif) != 0 && exif != nullptr) {
    m.exif.assign(reinterpret_cast<const char*>(exif), size);
  }
  png_charp name = nullptr;
  png_bytep profile = nullptr;
  int compression = 0;
  if (png_get_iCCP(r.png, r.info, &name, &compression, &profile, &size) != 0 &&
      profile != nullptr) {
    m.icc.assign(reinterpret_cast<const char*>(profile), size);
  }
  png_textp text = nullptr;
  int count = 0;
  png_get_text(r.png, r.info, &text, &count);
  for (int i = 0; i < count; ++i) {
    if (std::strcmp(text[i].key, kXmpKeyword) == 0 && text[i].text != nullptr) {
      const size_t n = text[i].compression >= PNG_ITXT_COMPRESSION_NONE ? text[i].itxt_length
                                                                        : text[i].text_length;
      m.xmp.assign(text[i].text, n);
    }
  }
}

void png_decode(PngReader& r, FILE* file) {
  png_init_io(r.png, file);
  png_read_info(r.png, r.info);
  const png_uint_32 width = png_get_image_width(r.png, r.info);
  const png_uint_32 height = png_get_image_height(r.png, r.info);
  if (refuse_size(r.reason, kReasonSize, width, height, r.options->max_pixels)) {
    png_longjmp(r.png, 1);
  }
  // Everything becomes 8-bit B, G, R, A: palettes and low bit depths expanded, transparency
  // chunks turned into alpha, 16-bit channels cut to their high byte, opaque images given
  // alpha 255.
  png_set_expand(r.png);
  png_set_strip_16(r.png);
  png_set_gray_to_rgb(r.png);
  png_set_bgr(r.png);
  png_set_add_alpha(r.png, 0xFF, PNG_FILLER_AFTER);
  png_set_interlace_handling(r.png);
  png_read_update_info(r.png, r.info);
  if (png_get_rowbytes(r.png, r.info) != static_cast<size_t>(width) * 4) {
    png_error(r.png, "unsupported pixel layout");
  }
  r.out->resize(static_cast<int32_t>(width), static_cast<int32_t>(height));
  r.rows.resize(height);
  for (png_uint_32 y = 0; y < height; ++y) {
    r.rows[y] = reinterpret_cast<png_bytep>(r.out->row(static_cast<int32_t>(y)));
  }
  png_read_image(r.png, r.rows.data());
  // Chunks after the pixels (text, and eXIf in some files) land in the same info.
  png_read_end(r.png, r.info);
}

struct PngWriter {
  png_structp png = nullptr;
  png_infop info = nullptr;
  char reason[kReasonSize] = "";
  const Image* image = nullptr;
  const Metadata* metadata = nullptr;
  bool alpha = false;
  png_text xmp{};

  PngWriter() {
    png = png_create_write_struct(PNG_LIBPNG_VER_STRING, reason, png_error_to_reason,
                                  png_ignore_warning);
    if (png != nullptr) info = png_create_info_struct(png);
  }
  ~PngWriter() { png_destroy_write_struct(&png, &info); }
};

void png_encode(PngWriter& w, FILE* file) {
  const Image& img = *w.image;
  png_init_io(w.png, file);
  // A profile libpng finds unusable is left out with a warning rather than failing the file.
  png_set_benign_errors(w.png, 1);
  png_set_IHDR(w.png, w.info, static_cast<png_uint_32>(img.width),
               static_cast<png_uint_32>(img.height), 8,
               w.alpha ? PNG_COLOR_TYPE_RGB_ALPHA : PNG_COLOR_TYPE_RGB, PNG_INTERLACE_NONE,
               PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
  if (const Metadata* m = w.metadata; m != nullptr) {
    if (!m->icc.empty()) {
      png_set_iCCP(w.png, w.info, "ICC profile", PNG_COMPRESSION_TYPE_BASE,
                   reinterpret_cast<png_const_bytep>(m->icc.data()),
                   static_cast<png_uint_32>(m->icc.size()));
    }
    if (!m->exif.empty()) {
      png_set_eXIf_1(w.png, w.info, static_cast<png_uint_32>(m->exif.size()),
                     reinterpret_cast<png_bytep>(const_cast<char*>(m->exif.data())));
    }
    if (!m->xmp.empty()) {
      w.xmp.compression = PNG_ITXT_COMPRESSION_NONE;
      w.xmp.key = const_cast<char*>(kXmpKeyword);
      w.xmp.text = const_cast<char*>(m->xmp.data());
      w.xmp.itxt_length = m->xmp.size();
      png_set_text(w.png, w.info, &w.xmp, 1);
    }
  }
  png_write_info(w.png, w.info);
  png_set_bgr(w.png);
  if (!w.alpha) png_set_filler(w.png, 0, PNG_FILLER_AFTER);  // the fourth byte is dropped
  // libpng transforms a copy of each row, never the row it is given.
  for (int32_t y = 0; y < img.height; ++y) {
    png_write_row(w.png, reinterpret_cast<png_const_bytep>(img.row(y)));
  }
  png_write_end(w.png, nullptr);
}

}  // namespace

std::string read_png(FILE* file, Image& out, const ReadOptions& options) {
  PngReader r;
  if (r.png == nullptr || r.info == nullptr) return "out of memory";
  r.out = &out;
  r.options = &options;
  if (setjmp(png_jmpbuf(r.png))) {
    const std::string reason = r.reason;
    return reason.rfind("image too large", 0) == 0 ? reason : "cannot decode PNG: " + reason;
  }
  png_decode(r, file);
  if (options.metadata != nullptr) png_metadata(r);
  return {};
}

std::string write_png(FILE* file, const Image& image, const WriteOptions& options) {
  PngWriter w;
  if (w.png == nullptr || w.info == nullptr) return "out of memory";
  w.image = &image;
  w.metadata = options.metadata;
  w.alpha = !is_opaque(image);
  if (setjmp(png_jmpbuf(w.png))) return std::string("cannot encode PNG: ") + w.reason;
  png_encode(w, file);
  return {};
}

std::string png_version() { return std::string("libpng ") + png_get_libpng_ver(nullptr); }

}  // namespace fxtool::codec
