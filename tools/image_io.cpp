// Image files in and out: the format told by content or by name, the size limit, and files
// written under a temporary name. The codecs themselves are in png.cpp, jpeg.cpp, webp.cpp and
// tiff.cpp.
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <cstdio>
#include <cstring>
#include <algorithm>
#include <memory>
#include <string>

#include "tools/codecs.h"
#include "tools/image.h"

namespace fxtool {
namespace {

std::string errno_text(int err) { return std::strerror(err); }
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
    if (fchmod(fd, new_file_mode()) != 0 || (file_ = fdopen(fd, "w+b")) == nullptr) {
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

// ---- Dispatch ---------------------------------------------------------------------------------

struct FileCloser {
  void operator()(FILE* f) const { std::fclose(f); }
};
using FilePtr = std::unique_ptr<FILE, FileCloser>;

std::string read_any(FILE* file, Image& out, const ReadOptions& options) {
  unsigned char magic[12] = {};
  const size_t n = std::fread(magic, 1, sizeof magic, file);
  if (std::ferror(file)) return "cannot read: " + errno_text(errno);
  std::rewind(file);
  if (options.metadata != nullptr) *options.metadata = Metadata{};
  static constexpr unsigned char kPngMagic[8] = {0x89, 'P', 'N', 'G', '\r', '\n', 0x1A, '\n'};
  std::string err = "not a PNG, JPEG, WebP or TIFF image";
  if (n >= 8 && std::memcmp(magic, kPngMagic, 8) == 0) {
    err = codec::read_png(file, out, options);
  } else if (n >= 3 && magic[0] == 0xFF && magic[1] == 0xD8 && magic[2] == 0xFF) {
    err = codec::read_jpeg(file, out, options);
  } else if (n >= 12 && std::memcmp(magic, "RIFF", 4) == 0 &&
             std::memcmp(magic + 8, "WEBP", 4) == 0) {
    err = codec::read_webp(file, out, options);
  } else if (n >= 4 &&
             (std::memcmp(magic, "II*\0", 4) == 0 || std::memcmp(magic, "MM\0*", 4) == 0 ||
              std::memcmp(magic, "II+\0", 4) == 0 || std::memcmp(magic, "MM\0+", 4) == 0)) {
    err = codec::read_tiff(file, out, options);
  }
  if (!err.empty()) {
    out = Image{};
    if (options.metadata != nullptr) *options.metadata = Metadata{};
  }
  return err;
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
  if (ends_with_ci(path, ".webp")) return FileFormat::kWebp;
  if (ends_with_ci(path, ".tif") || ends_with_ci(path, ".tiff")) return FileFormat::kTiff;
  return FileFormat::kUnknown;
}

std::string read_image(const std::string& path, Image& out, const ReadOptions& options) {
  const FilePtr file(std::fopen(path.c_str(), "rb"));
  if (!file) return "cannot open: " + errno_text(errno);
  return read_any(file.get(), out, options);
}

std::string decode_image(const unsigned char* data, size_t size, Image& out,
                         const ReadOptions& options) {
  const FilePtr file(fmemopen(const_cast<unsigned char*>(data), size, "rb"));
  if (!file) return "cannot read: " + errno_text(errno);
  return read_any(file.get(), out, options);
}

std::string write_image(const std::string& path, const Image& image, const WriteOptions& options) {
  const FileFormat format = format_of_name(path);
  if (format == FileFormat::kUnknown) {
    return "unknown image format (use .png, .jpg, .jpeg, .webp, .tif or .tiff)";
  }
  if (image.width <= 0 || image.height <= 0 || int64_t{image.width} * image.height > kMaxPixels ||
      image.pixels.size() != size_t(image.width) * size_t(image.height)) {
    return "image too large";
  }
  TempFile out(path);
  if (std::string err = out.open(); !err.empty()) return err;
  std::string err;
  switch (format) {
    case FileFormat::kPng:
      err = codec::write_png(out.file(), image, options);
      break;
    case FileFormat::kJpeg:
      err = codec::write_jpeg(out.file(), image, options);
      break;
    case FileFormat::kWebp:
      err = codec::write_webp(out.file(), image, options);
      break;
    case FileFormat::kTiff:
      err = codec::write_tiff(out.file(), image, options);
      break;
    case FileFormat::kUnknown:
      break;
  }
  if (!err.empty()) return err;
  return out.commit();
}

std::string write_text(const std::string& path, const std::string& text) {
  TempFile out(path);
  if (std::string err = out.open(); !err.empty()) return err;
  std::fwrite(text.data(), 1, text.size(), out.file());
  return out.commit();
}

std::string codec_versions() {
  return codec::png_version() + ", " + codec::jpeg_version() + ", " + codec::webp_version() + ", " +
         codec::tiff_version();
}

namespace codec {

std::string check_size(uint64_t width, uint64_t height, int64_t max_pixels) {
  if (width == 0 || height == 0) return "the image has no pixels";
  const uint64_t n = width * height;  // both below 2^32: exact
  const uint64_t limit = static_cast<uint64_t>(std::min<int64_t>(max_pixels, kMaxPixels));
  if (n <= limit) return {};
  return "image too large: " + std::to_string(width) + "x" + std::to_string(height) + " is " +
         std::to_string(n) + " pixels, more than " +
         (max_pixels <= kMaxPixels ? "--max-pixels " + std::to_string(max_pixels) + " allows"
                                   : "the library can address");
}

bool refuse_size(char* reason, size_t size, uint64_t width, uint64_t height, int64_t max_pixels) {
  const std::string refusal = check_size(width, height, max_pixels);
  std::snprintf(reason, size, "%s", refusal.c_str());
  return !refusal.empty();
}

bool is_opaque(const Image& image) {
  for (int32_t y = 0; y < image.height; ++y) {
    // A whole row at a time, without an early exit inside it, so that the loop vectorises.
    const uint32_t* p = image.row(y);
    uint32_t all = 0xFF000000u;
    for (int32_t x = 0; x < image.width; ++x) all &= p[x];
    if (all != 0xFF000000u) return false;
  }
  return true;
}

}  // namespace codec
}  // namespace fxtool
