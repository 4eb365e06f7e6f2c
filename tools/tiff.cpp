// TIFF files through libtiff. 8-bit RGB, RGBA, grey and grey with alpha in strips are read a
// row at a time into the pixel buffer; every other layout libtiff knows (palettes, 16 bits,
// tiles, YCbCr, CMYK) goes through its RGBA reader. Written: 8-bit RGB, or RGBA with
// unassociated alpha when the picture has any, deflate-compressed with the horizontal predictor.
//
// Metadata: the ICC profile and XMP have tags of their own; of EXIF, the orientation and the
// picture's text tags (tools/exif.h) are the first directory's own tags and go both ways, while
// the camera settings of EXIF's own directory are neither read from TIFF nor written to it.
#include <tiffio.h>

#include <cstdarg>
#include <cstdio>
#include <string>
#include <vector>

#include "tools/codecs.h"
#include "tools/exif.h"

namespace fxtool::codec {
namespace {

// libtiff's I/O through a stdio stream the caller owns (a file, or bytes in memory).
tmsize_t stream_read(thandle_t h, void* buf, tmsize_t n) {
  return static_cast<tmsize_t>(std::fread(buf, 1, static_cast<size_t>(n), static_cast<FILE*>(h)));
}
tmsize_t stream_write(thandle_t h, void* buf, tmsize_t n) {
  return static_cast<tmsize_t>(std::fwrite(buf, 1, static_cast<size_t>(n), static_cast<FILE*>(h)));
}
toff_t stream_seek(thandle_t h, toff_t offset, int whence) {
  FILE* f = static_cast<FILE*>(h);
  if (fseeko(f, static_cast<off_t>(offset), whence) != 0) return static_cast<toff_t>(-1);
  return static_cast<toff_t>(ftello(f));
}
int stream_close(thandle_t) { return 0; }
toff_t stream_size(thandle_t h) {
  FILE* f = static_cast<FILE*>(h);
  const off_t here = ftello(f);
  fseeko(f, 0, SEEK_END);
  const off_t end = ftello(f);
  fseeko(f, here, SEEK_SET);
  return static_cast<toff_t>(end);
}
int no_map(thandle_t, void**, toff_t*) { return 0; }
void no_unmap(thandle_t, void*, toff_t) {}

// The first error libtiff reports for this file, kept per file (batches run in threads).
int keep_error(TIFF*, void* user, const char*, const char* format, va_list args) {
  auto* reason = static_cast<std::string*>(user);
  if (reason->empty()) {
    char buf[200];
    std::vsnprintf(buf, sizeof buf, format, args);
    *reason = buf;
  }
  return 1;
}
int ignore_warning(TIFF*, void*, const char*, const char*, va_list) { return 1; }

class Tiff {
 public:
  Tiff(FILE* file, const char* mode) {
    TIFFOpenOptions* options = TIFFOpenOptionsAlloc();
    if (options == nullptr) return;
    TIFFOpenOptionsSetErrorHandlerExtR(options, keep_error, &reason);
    TIFFOpenOptionsSetWarningHandlerExtR(options, ignore_warning, nullptr);
    tif = TIFFClientOpenExt("image", mode, file, stream_read, stream_write, stream_seek,
                            stream_close, stream_size, no_map, no_unmap, options);
    TIFFOpenOptionsFree(options);
  }
  ~Tiff() {
    if (tif != nullptr) TIFFClose(tif);
  }
  Tiff(const Tiff&) = delete;
  Tiff& operator=(const Tiff&) = delete;

  TIFF* tif = nullptr;
  std::string reason;
};

std::string failed(const char* what, const Tiff& t) {
  return std::string(what) + (t.reason.empty() ? "the file is damaged" : t.reason);
}

// RGBA rows as libtiff's RGBA reader gives them (associated alpha) back to plain alpha.
void unassociate(Image& image) {
  for (uint32_t& p : image.pixels) {
    const uint32_t a = p >> 24;
    if (a == 0xFF || a == 0) continue;
    uint32_t out = a << 24;
    for (int shift = 0; shift < 24; shift += 8) {
      const uint32_t c = std::min<uint32_t>(255, (((p >> shift) & 0xFF) * 255 + a / 2) / a);
      out |= c << shift;
    }
    p = out;
  }
}

std::string read_rows(TIFF* tif, Image& out, uint16_t samples, bool alpha, bool associated) {
  std::vector<uint8_t> row(static_cast<size_t>(TIFFScanlineSize(tif)));
  if (row.size() < size_t(out.width) * samples) return "unexpected row size";
  for (int32_t y = 0; y < out.height; ++y) {
    if (TIFFReadScanline(tif, row.data(), static_cast<uint32_t>(y), 0) < 0) return "bad row";
    uint32_t* dst = out.row(y);
    const size_t n = static_cast<size_t>(out.width);
    const uint8_t* s = row.data();
    switch (samples) {
      case 1:
        for (size_t x = 0; x < n; ++x) dst[x] = 0xFF000000u | s[x] * 0x010101u;
        break;
      case 2:
        for (size_t x = 0; x < n; ++x) {
          dst[x] = (alpha ? uint32_t{s[2 * x + 1]} << 24 : 0xFF000000u) | s[2 * x] * 0x010101u;
        }
        break;
      case 3:
        rgb_to_words(s, dst, n);
        break;
      default:
        rgba_to_words(s, dst, n);
        if (!alpha) {
          for (size_t x = 0; x < n; ++x) dst[x] |= 0xFF000000u;
        }
    }
  }
  if (associated) unassociate(out);
  return {};
}

std::string tag_bytes(TIFF* tif, uint32_t tag) {
  uint32_t count = 0;
  const void* data = nullptr;
  if (TIFFGetField(tif, tag, &count, &data) == 0 || data == nullptr) return {};
  return std::string(static_cast<const char*>(data), count);
}

void read_metadata(TIFF* tif, Metadata& m) {
  m.icc = tag_bytes(tif, TIFFTAG_ICCPROFILE);
  m.xmp = tag_bytes(tif, TIFFTAG_XMLPACKET);
  uint16_t orientation = 0;
  TIFFGetField(tif, TIFFTAG_ORIENTATION, &orientation);
  TextTags text;
  for (uint16_t tag : kTextTags) {
    const char* value = nullptr;
    if (TIFFGetField(tif, tag, &value) != 0 && value != nullptr && *value != '\0') {
      text.emplace_back(tag, value);
    }
  }
  // Orientation 1 with no text is no information: no block is made for it.
  m.exif = make_exif(orientation > 1 || !text.empty() ? orientation : 0, text);
}

}  // namespace

std::string read_tiff(FILE* file, Image& out, const ReadOptions& options) {
  Tiff t(file, "r");
  if (t.tif == nullptr) return failed("cannot decode TIFF: ", t);
  uint32_t width = 0, height = 0;
  uint16_t bits = 0, samples = 0, photometric = 0, planar = PLANARCONFIG_CONTIG;
  TIFFGetField(t.tif, TIFFTAG_IMAGEWIDTH, &width);
  TIFFGetField(t.tif, TIFFTAG_IMAGELENGTH, &height);
  if (std::string err = check_size(width, height, options.max_pixels); !err.empty()) return err;
  TIFFGetFieldDefaulted(t.tif, TIFFTAG_BITSPERSAMPLE, &bits);
  TIFFGetFieldDefaulted(t.tif, TIFFTAG_SAMPLESPERPIXEL, &samples);
  TIFFGetFieldDefaulted(t.tif, TIFFTAG_PLANARCONFIG, &planar);
  TIFFGetField(t.tif, TIFFTAG_PHOTOMETRIC, &photometric);
  uint16_t extra_count = 0;
  const uint16_t* extra = nullptr;
  TIFFGetFieldDefaulted(t.tif, TIFFTAG_EXTRASAMPLES, &extra_count, &extra);
  const uint16_t colours = photometric == PHOTOMETRIC_RGB ? 3 : 1;
  const bool alpha = extra_count == 1 && samples == colours + 1 && extra != nullptr &&
                     (extra[0] == EXTRASAMPLE_ASSOCALPHA || extra[0] == EXTRASAMPLE_UNASSALPHA);
  const bool plain = bits == 8 && !TIFFIsTiled(t.tif) &&
                     (planar == PLANARCONFIG_CONTIG || samples == 1) &&
                     (photometric == PHOTOMETRIC_RGB || photometric == PHOTOMETRIC_MINISBLACK) &&
                     (samples == colours || samples == colours + 1);
  out.resize(static_cast<int32_t>(width), static_cast<int32_t>(height));
  if (plain) {
    const bool associated = alpha && extra[0] == EXTRASAMPLE_ASSOCALPHA;
    if (std::string err = read_rows(t.tif, out, samples, alpha, associated); !err.empty()) {
      return failed("cannot decode TIFF: ", t);
    }
  } else {
    // Rows as stored (the file's orientation is metadata, as for the other formats), R in the
    // low byte: swapped into pixel words afterwards.
    uint16_t stored = ORIENTATION_TOPLEFT;
    TIFFGetFieldDefaulted(t.tif, TIFFTAG_ORIENTATION, &stored);
    if (TIFFReadRGBAImageOriented(t.tif, width, height, out.pixels.data(), stored, 1) == 0) {
      return failed("cannot decode TIFF: ", t);
    }
    for (uint32_t& p : out.pixels) {
      p = (p & 0xFF00FF00u) | (p & 0xFFu) << 16 | (p >> 16 & 0xFFu);
    }
    unassociate(out);
  }
  if (options.metadata != nullptr) read_metadata(t.tif, *options.metadata);
  return {};
}

std::string write_tiff(FILE* file, const Image& image, const WriteOptions& options) {
  Tiff t(file, "w");
  if (t.tif == nullptr) return failed("cannot encode TIFF: ", t);
  const bool alpha = !is_opaque(image);
  const uint16_t samples = alpha ? 4 : 3;
  TIFF* tif = t.tif;
  TIFFSetField(tif, TIFFTAG_IMAGEWIDTH, static_cast<uint32_t>(image.width));
  TIFFSetField(tif, TIFFTAG_IMAGELENGTH, static_cast<uint32_t>(image.height));
  TIFFSetField(tif, TIFFTAG_BITSPERSAMPLE, 8);
  TIFFSetField(tif, TIFFTAG_SAMPLESPERPIXEL, samples);
  TIFFSetField(tif, TIFFTAG_PHOTOMETRIC, PHOTOMETRIC_RGB);
  TIFFSetField(tif, TIFFTAG_PLANARCONFIG, PLANARCONFIG_CONTIG);
  TIFFSetField(tif, TIFFTAG_COMPRESSION, COMPRESSION_ADOBE_DEFLATE);
  TIFFSetField(tif, TIFFTAG_PREDICTOR, PREDICTOR_HORIZONTAL);
  if (alpha) {
    const uint16_t kind = EXTRASAMPLE_UNASSALPHA;
    TIFFSetField(tif, TIFFTAG_EXTRASAMPLES, 1, &kind);
  }
  TIFFSetField(tif, TIFFTAG_ROWSPERSTRIP, TIFFDefaultStripSize(tif, 0));
  if (const Metadata* m = options.metadata; m != nullptr) {
    if (!m->icc.empty()) {
      TIFFSetField(tif, TIFFTAG_ICCPROFILE, static_cast<uint32_t>(m->icc.size()), m->icc.data());
    }
    if (!m->xmp.empty()) {
      TIFFSetField(tif, TIFFTAG_XMLPACKET, static_cast<uint32_t>(m->xmp.size()), m->xmp.data());
    }
    if (const int32_t o = exif_orientation(m->exif); o != 0) {
      TIFFSetField(tif, TIFFTAG_ORIENTATION, static_cast<uint16_t>(o));
    }
    for (const auto& [tag, value] : exif_text_tags(m->exif)) TIFFSetField(tif, tag, value.c_str());
  }
  std::vector<uint8_t> row(static_cast<size_t>(image.width) * samples);
  for (int32_t y = 0; y < image.height; ++y) {
    if (alpha) {
      words_to_rgba(image.row(y), row.data(), static_cast<size_t>(image.width));
    } else {
      words_to_rgb(image.row(y), row.data(), static_cast<size_t>(image.width));
    }
    if (TIFFWriteScanline(tif, row.data(), static_cast<uint32_t>(y), 0) < 0) {
      return failed("cannot encode TIFF: ", t);
    }
  }
  if (TIFFFlush(tif) == 0) return failed("cannot encode TIFF: ", t);
  return {};
}

std::string tiff_version() {
  // "LIBTIFF, Version 4.5.0\n..." : the number only.
  std::string v = TIFFGetVersion();
  const size_t at = v.find("Version ");
  if (at != std::string::npos) v = v.substr(at + 8);
  return "libtiff " + v.substr(0, v.find_first_of("\r\n"));
}

}  // namespace fxtool::codec
