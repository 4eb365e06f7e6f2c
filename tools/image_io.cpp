// PNG and JPEG files in and out.
//
// Both codecs report errors by longjmp. Each codec call therefore runs in two layers: a function
// that calls setjmp and owns the codec state (declared before setjmp, cleaned up by its
// destructor), and a worker that does the decoding or encoding with nothing but trivially
// destructible locals, so that a jump out of it skips no destructor. Buffers the worker needs
// live in the state object.
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <csetjmp>
#include <cstddef>
#include <cstdio>
#include <cstring>

// jpeglib.h uses FILE and size_t without including their headers.
#include <jerror.h>
#include <jpeglib.h>
#include <png.h>

#include <memory>
#include <string>
#include <vector>

#include "tools/image.h"

namespace fxtool {
namespace {

std::string errno_text(int err) { return std::strerror(err); }

bool too_large(uint64_t width, uint64_t height) {
  return width == 0 || height == 0 || width * height > static_cast<uint64_t>(kMaxPixels);
}

uint32_t pack_rgba(const unsigned char* p) {
  return uint32_t{p[3]} << 24 | uint32_t{p[0]} << 16 | uint32_t{p[1]} << 8 | uint32_t{p[2]};
}

void unpack_rgba(uint32_t w, unsigned char* p) {
  p[0] = static_cast<unsigned char>(w >> 16);
  p[1] = static_cast<unsigned char>(w >> 8);
  p[2] = static_cast<unsigned char>(w);
  p[3] = static_cast<unsigned char>(w >> 24);
}

// ---- Files written under a temporary name --------------------------------------------------

// Permissions of a new file as open() would give them under the current umask.
mode_t new_file_mode() {
  static const mode_t mode = [] {
    const mode_t mask = umask(0);
    umask(mask);
    return static_cast<mode_t>(0666 & ~mask);
  }();
  return mode;
}

// ".NAME.XXXXXX" beside the target: hidden, in the same directory so the final rename cannot
// cross file systems. Removed again unless committed.
class TempFile {
 public:
  explicit TempFile(std::string target) : target_(std::move(target)) {}
  TempFile(const TempFile&) = delete;
  TempFile& operator=(const TempFile&) = delete;
  ~TempFile() {
    if (file_ != nullptr) std::fclose(file_);
    if (!temp_.empty() && !committed_) unlink(temp_.c_str());
  }

  std::string open() {
    const size_t slash = target_.rfind('/');
    const std::string dir = slash == std::string::npos ? "" : target_.substr(0, slash + 1);
    const std::string base = slash == std::string::npos ? target_ : target_.substr(slash + 1);
    std::string name = dir + "." + base + ".XXXXXX";
    const int fd = mkstemp(name.data());
    if (fd < 0) return "cannot write: " + errno_text(errno);
    temp_ = name;
    if (fchmod(fd, new_file_mode()) != 0 || (file_ = fdopen(fd, "wb")) == nullptr) {
      const int err = errno;
      close(fd);
      return "cannot write: " + errno_text(err);
    }
    return {};
  }

  FILE* file() const { return file_; }

  std::string commit() {
    bool ok = std::fflush(file_) == 0 && std::ferror(file_) == 0;
    int err = errno;
    if (std::fclose(file_) != 0 && ok) {
      ok = false;
      err = errno;
    }
    file_ = nullptr;
    if (!ok) return "cannot write: " + errno_text(err);
    if (std::rename(temp_.c_str(), target_.c_str()) != 0) {
      return "cannot write: " + errno_text(errno);
    }
    committed_ = true;
    return {};
  }

 private:
  std::string target_;
  std::string temp_;
  FILE* file_ = nullptr;
  bool committed_ = false;
};

// ---- PNG --------------------------------------------------------------------------------------

constexpr size_t kReasonSize = 200;

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

  PngReader() {
    png = png_create_read_struct(PNG_LIBPNG_VER_STRING, reason, png_error_to_reason,
                                 png_ignore_warning);
    if (png != nullptr) info = png_create_info_struct(png);
  }
  ~PngReader() { png_destroy_read_struct(&png, &info, nullptr); }
};

void png_decode(PngReader& r, FILE* file) {
  png_init_io(r.png, file);
  png_read_info(r.png, r.info);
  const png_uint_32 width = png_get_image_width(r.png, r.info);
  const png_uint_32 height = png_get_image_height(r.png, r.info);
  if (too_large(width, height)) png_error(r.png, "image too large");
  // Everything becomes 8-bit RGBA: palettes and low bit depths expanded, transparency chunks
  // turned into alpha, 16-bit channels cut to their high byte, opaque images given alpha 255.
  png_set_expand(r.png);
  png_set_strip_16(r.png);
  png_set_gray_to_rgb(r.png);
  png_set_add_alpha(r.png, 0xFF, PNG_FILLER_AFTER);
  png_set_interlace_handling(r.png);
  png_read_update_info(r.png, r.info);
  if (png_get_rowbytes(r.png, r.info) != static_cast<size_t>(width) * 4) {
    png_error(r.png, "unsupported pixel layout");
  }
  r.out->resize(static_cast<int32_t>(width), static_cast<int32_t>(height));
  r.rows.resize(height);
  for (png_uint_32 y = 0; y < height; ++y) {
    r.rows[y] = reinterpret_cast<png_bytep>(r.out->pixels.data() + size_t{y} * width);
  }
  png_read_image(r.png, r.rows.data());
  png_read_end(r.png, nullptr);
}

std::string read_png(FILE* file, Image& out) {
  PngReader r;
  if (r.png == nullptr || r.info == nullptr) return "out of memory";
  r.out = &out;
  if (setjmp(png_jmpbuf(r.png))) {
    out = Image{};
    return std::string("cannot decode PNG: ") + r.reason;
  }
  png_decode(r, file);
  // The rows were read as R, G, B, A bytes; turn each into its pixel word in place.
  for (uint32_t& px : out.pixels) {
    unsigned char bytes[4];
    std::memcpy(bytes, &px, 4);
    px = pack_rgba(bytes);
  }
  return {};
}

struct PngWriter {
  png_structp png = nullptr;
  png_infop info = nullptr;
  char reason[kReasonSize] = "";
  std::vector<unsigned char> row;
  const Image* image = nullptr;
  bool alpha = false;

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
  png_set_IHDR(w.png, w.info, static_cast<png_uint_32>(img.width),
               static_cast<png_uint_32>(img.height), 8,
               w.alpha ? PNG_COLOR_TYPE_RGB_ALPHA : PNG_COLOR_TYPE_RGB, PNG_INTERLACE_NONE,
               PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
  png_write_info(w.png, w.info);
  const size_t channels = w.alpha ? 4 : 3;
  for (int32_t y = 0; y < img.height; ++y) {
    unsigned char* p = w.row.data();
    for (int32_t x = 0; x < img.width; ++x, p += channels) {
      unsigned char rgba[4];
      unpack_rgba(img.at(x, y), rgba);
      std::memcpy(p, rgba, channels);
    }
    png_write_row(w.png, w.row.data());
  }
  png_write_end(w.png, nullptr);
}

std::string write_png(FILE* file, const Image& image) {
  PngWriter w;
  if (w.png == nullptr || w.info == nullptr) return "out of memory";
  w.image = &image;
  w.alpha = false;
  for (uint32_t px : image.pixels) w.alpha = w.alpha || (px >> 24) != 0xFF;
  w.row.resize(static_cast<size_t>(image.width) * 4);
  if (setjmp(png_jmpbuf(w.png))) return std::string("cannot encode PNG: ") + w.reason;
  png_encode(w, file);
  return {};
}

// ---- JPEG -------------------------------------------------------------------------------------

struct JpegError {
  jpeg_error_mgr mgr;
  std::jmp_buf jump;
  char reason[JMSG_LENGTH_MAX];
};

void jpeg_fail(j_common_ptr c) {
  auto* e = reinterpret_cast<JpegError*>(c->err);
  (*c->err->format_message)(c, e->reason);
  std::longjmp(e->jump, 1);
}

// A file that ends early would otherwise decode to grey rows with only a warning: treat it as
// unreadable. Other warnings (stray bytes between markers) leave a usable image and are ignored.
void jpeg_warn(j_common_ptr c, int level) {
  if (level < 0 && c->err->msg_code == JWRN_JPEG_EOF) jpeg_fail(c);
}

void init_jpeg_error(JpegError& e) {
  jpeg_std_error(&e.mgr);
  e.mgr.error_exit = jpeg_fail;
  e.mgr.emit_message = jpeg_warn;
  e.reason[0] = '\0';
}

struct JpegReader {
  jpeg_decompress_struct cinfo{};
  JpegError err{};
  std::vector<unsigned char> row;
  Image* out = nullptr;

  ~JpegReader() { jpeg_destroy_decompress(&cinfo); }
};

void jpeg_decode(JpegReader& r, FILE* file) {
  jpeg_create_decompress(&r.cinfo);
  jpeg_stdio_src(&r.cinfo, file);
  jpeg_read_header(&r.cinfo, TRUE);
  if (too_large(r.cinfo.image_width, r.cinfo.image_height)) {
    std::snprintf(r.err.reason, sizeof r.err.reason, "image too large");
    std::longjmp(r.err.jump, 1);
  }
  r.cinfo.out_color_space = JCS_RGB;  // grey files too; CMYK ones are refused by the library
  jpeg_start_decompress(&r.cinfo);
  const JDIMENSION width = r.cinfo.output_width;
  r.out->resize(static_cast<int32_t>(width), static_cast<int32_t>(r.cinfo.output_height));
  r.row.resize(size_t{width} * 3);
  while (r.cinfo.output_scanline < r.cinfo.output_height) {
    const int32_t y = static_cast<int32_t>(r.cinfo.output_scanline);
    JSAMPROW line = r.row.data();
    jpeg_read_scanlines(&r.cinfo, &line, 1);
    const unsigned char* p = r.row.data();
    for (JDIMENSION x = 0; x < width; ++x, p += 3) {
      const unsigned char rgba[4] = {p[0], p[1], p[2], 0xFF};
      r.out->at(static_cast<int32_t>(x), y) = pack_rgba(rgba);
    }
  }
  jpeg_finish_decompress(&r.cinfo);
}

std::string read_jpeg(FILE* file, Image& out) {
  JpegReader r;
  r.cinfo.err = &r.err.mgr;
  init_jpeg_error(r.err);
  r.out = &out;
  if (setjmp(r.err.jump)) {
    out = Image{};
    return std::string("cannot decode JPEG: ") + r.err.reason;
  }
  jpeg_decode(r, file);
  return {};
}

struct JpegWriter {
  jpeg_compress_struct cinfo{};
  JpegError err{};
  std::vector<unsigned char> row;
  const Image* image = nullptr;

  ~JpegWriter() { jpeg_destroy_compress(&cinfo); }
};

constexpr int kJpegQuality = 92;

void jpeg_encode(JpegWriter& w, FILE* file) {
  const Image& img = *w.image;
  jpeg_create_compress(&w.cinfo);
  jpeg_stdio_dest(&w.cinfo, file);
  w.cinfo.image_width = static_cast<JDIMENSION>(img.width);
  w.cinfo.image_height = static_cast<JDIMENSION>(img.height);
  w.cinfo.input_components = 3;
  w.cinfo.in_color_space = JCS_RGB;
  jpeg_set_defaults(&w.cinfo);
  jpeg_set_quality(&w.cinfo, kJpegQuality, TRUE);
  jpeg_start_compress(&w.cinfo, TRUE);
  while (w.cinfo.next_scanline < w.cinfo.image_height) {
    const int32_t y = static_cast<int32_t>(w.cinfo.next_scanline);
    unsigned char* p = w.row.data();
    for (int32_t x = 0; x < img.width; ++x, p += 3) {
      unsigned char rgba[4];
      unpack_rgba(img.at(x, y), rgba);
      std::memcpy(p, rgba, 3);
    }
    JSAMPROW line = w.row.data();
    jpeg_write_scanlines(&w.cinfo, &line, 1);
  }
  jpeg_finish_compress(&w.cinfo);
}

std::string write_jpeg(FILE* file, const Image& image) {
  JpegWriter w;
  w.cinfo.err = &w.err.mgr;
  init_jpeg_error(w.err);
  w.image = &image;
  w.row.resize(static_cast<size_t>(image.width) * 3);
  if (setjmp(w.err.jump)) return std::string("cannot encode JPEG: ") + w.err.reason;
  jpeg_encode(w, file);
  return {};
}

// ---- Dispatch ---------------------------------------------------------------------------------

struct FileCloser {
  void operator()(FILE* f) const { std::fclose(f); }
};
using FilePtr = std::unique_ptr<FILE, FileCloser>;

std::string read_any(FILE* file, Image& out) {
  unsigned char magic[8] = {};
  const size_t n = std::fread(magic, 1, sizeof magic, file);
  if (std::ferror(file)) return "cannot read: " + errno_text(errno);
  std::rewind(file);
  static constexpr unsigned char kPngMagic[8] = {0x89, 'P', 'N', 'G', '\r', '\n', 0x1A, '\n'};
  if (n == 8 && std::memcmp(magic, kPngMagic, 8) == 0) return read_png(file, out);
  if (n >= 3 && magic[0] == 0xFF && magic[1] == 0xD8 && magic[2] == 0xFF) {
    return read_jpeg(file, out);
  }
  return "not a PNG or JPEG image";
}

bool ends_with_ci(const std::string& s, const char* suffix) {
  const size_t n = std::strlen(suffix);
  if (s.size() < n) return false;
  for (size_t i = 0; i < n; ++i) {
    char c = s[s.size() - n + i];
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
    if (c != suffix[i]) return false;
  }
  return true;
}

}  // namespace

FileFormat format_of_name(const std::string& path) {
  if (ends_with_ci(path, ".png")) return FileFormat::kPng;
  if (ends_with_ci(path, ".jpg") || ends_with_ci(path, ".jpeg")) return FileFormat::kJpeg;
  return FileFormat::kUnknown;
}

std::string read_image(const std::string& path, Image& out) {
  const FilePtr file(std::fopen(path.c_str(), "rb"));
  if (!file) return "cannot open: " + errno_text(errno);
  return read_any(file.get(), out);
}

std::string decode_image(const unsigned char* data, size_t size, Image& out) {
  const FilePtr file(fmemopen(const_cast<unsigned char*>(data), size, "rb"));
  if (!file) return "cannot read: " + errno_text(errno);
  return read_any(file.get(), out);
}

std::string write_image(const std::string& path, const Image& image) {
  const FileFormat format = format_of_name(path);
  if (format == FileFormat::kUnknown) return "unknown image format (use .png, .jpg or .jpeg)";
  if (too_large(static_cast<uint64_t>(image.width), static_cast<uint64_t>(image.height))) {
    return "image too large";
  }
  TempFile out(path);
  if (std::string err = out.open(); !err.empty()) return err;
  std::string err =
      format == FileFormat::kPng ? write_png(out.file(), image) : write_jpeg(out.file(), image);
  if (!err.empty()) return err;
  return out.commit();
}

std::string write_text(const std::string& path, const std::string& text) {
  TempFile out(path);
  if (std::string err = out.open(); !err.empty()) return err;
  std::fwrite(text.data(), 1, text.size(), out.file());
  return out.commit();
}

}  // namespace fxtool
