// JPEG files through libjpeg-turbo, decoded straight into the pixel buffer (its B, G, R, A
// output) and encoded straight out of it (its B, G, R, X input); EXIF and XMP in APP1 markers,
// the ICC profile in APP2 markers.
//
// libjpeg reports errors by longjmp: as in png.cpp, the worker that may jump keeps only
// trivially destructible locals, and the state lives in an object owned by its caller.
#include <csetjmp>
#include <cstdio>
#include <cstdlib>
#include <algorithm>
#include <cstring>
#include <string>

// jpeglib.h uses FILE and size_t without including their headers.
#include <jerror.h>
#include <jpeglib.h>

#include "tools/codecs.h"

namespace fxtool::codec {
namespace {

constexpr char kExifHeader[] = "Exif\0";                       // with its terminator: 6 bytes
constexpr char kXmpHeader[] = "http://ns.adobe.com/xap/1.0/";  // with its terminator: 29 bytes
constexpr size_t kMarkerMax = 65533;                           // bytes of data one marker holds
// Rows handed to libjpeg per call: enough for a whole MCU row, so that it does not buffer them.
constexpr int32_t kRowBatch = 16;

struct JpegError {
  jpeg_error_mgr mgr;
  std::jmp_buf jump;
  char reason[JMSG_LENGTH_MAX + 100];
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

bool starts_with(const jpeg_saved_marker_ptr m, const char* header, size_t n) {
  return m->data_length >= n && std::memcmp(m->data, header, n) == 0;
}

struct JpegReader {
  jpeg_decompress_struct cinfo{};
  JpegError err{};
  Image* out = nullptr;
  const ReadOptions* options = nullptr;
  bool too_large = false;
  JOCTET* icc = nullptr;  // malloc'd by libjpeg
  unsigned int icc_size = 0;

  ~JpegReader() {
    jpeg_destroy_decompress(&cinfo);
    std::free(icc);
  }
};

void jpeg_metadata(JpegReader& r, Metadata& m);

void jpeg_decode(JpegReader& r, FILE* file) {
  jpeg_create_decompress(&r.cinfo);
  jpeg_stdio_src(&r.cinfo, file);
  if (r.options->metadata != nullptr) {
    jpeg_save_markers(&r.cinfo, JPEG_APP0 + 1, 0xFFFF);
    jpeg_save_markers(&r.cinfo, JPEG_APP0 + 2, 0xFFFF);
  }
  jpeg_read_header(&r.cinfo, TRUE);
  if (refuse_size(r.err.reason, sizeof r.err.reason, r.cinfo.image_width, r.cinfo.image_height,
                  r.options->max_pixels)) {
    r.too_large = true;
    std::longjmp(r.err.jump, 1);
  }
  // The saved markers live only until the decompression ends.
  if (r.options->metadata != nullptr) {
    jpeg_metadata(r, *r.options->metadata);
    jpeg_read_icc_profile(&r.cinfo, &r.icc, &r.icc_size);
  }
  // Grey files too; CMYK ones are refused by the library.
  r.cinfo.out_color_space = JCS_EXT_BGRA;
  jpeg_start_decompress(&r.cinfo);
  const int32_t height = static_cast<int32_t>(r.cinfo.output_height);
  r.out->resize(static_cast<int32_t>(r.cinfo.output_width), height);
  JSAMPROW rows[kRowBatch];
  while (r.cinfo.output_scanline < r.cinfo.output_height) {
    const int32_t y = static_cast<int32_t>(r.cinfo.output_scanline);
    const int32_t n = std::min(kRowBatch, height - y);
    for (int32_t i = 0; i < n; ++i) rows[i] = reinterpret_cast<JSAMPROW>(r.out->row(y + i));
    jpeg_read_scanlines(&r.cinfo, rows, static_cast<JDIMENSION>(n));
  }
  jpeg_finish_decompress(&r.cinfo);
}

void jpeg_metadata(JpegReader& r, Metadata& m) {
  for (jpeg_saved_marker_ptr p = r.cinfo.marker_list; p != nullptr; p = p->next) {
    if (p->marker != JPEG_APP0 + 1) continue;
    const char* data = reinterpret_cast<const char*>(p->data);
    if (m.exif.empty() && starts_with(p, kExifHeader, sizeof kExifHeader)) {
      m.exif.assign(data + sizeof kExifHeader, p->data_length - sizeof kExifHeader);
    } else if (m.xmp.empty() && starts_with(p, kXmpHeader, sizeof kXmpHeader)) {
      m.xmp.assign(data + sizeof kXmpHeader, p->data_length - sizeof kXmpHeader);
    }
  }
}

struct JpegWriter {
  jpeg_compress_struct cinfo{};
  JpegError err{};
  const Image* image = nullptr;
  const WriteOptions* options = nullptr;

  ~JpegWriter() { jpeg_destroy_compress(&cinfo); }
};

void write_marker(j_compress_ptr cinfo, const char* header, size_t header_size,
                  const std::string& data) {
  if (data.size() + header_size > kMarkerMax) return;  // more than one marker holds: left out
  jpeg_write_m_header(cinfo, JPEG_APP0 + 1, static_cast<unsigned>(header_size + data.size()));
  for (size_t i = 0; i < header_size; ++i) jpeg_write_m_byte(cinfo, header[i]);
  for (char c : data) jpeg_write_m_byte(cinfo, static_cast<unsigned char>(c));
}

void jpeg_encode(JpegWriter& w, FILE* file) {
  const Image& img = *w.image;
  jpeg_create_compress(&w.cinfo);
  jpeg_stdio_dest(&w.cinfo, file);
  w.cinfo.image_width = static_cast<JDIMENSION>(img.width);
  w.cinfo.image_height = static_cast<JDIMENSION>(img.height);
  w.cinfo.input_components = 4;
  w.cinfo.in_color_space = JCS_EXT_BGRX;
  jpeg_set_defaults(&w.cinfo);
  jpeg_set_quality(&w.cinfo, w.options->quality, TRUE);
  jpeg_start_compress(&w.cinfo, TRUE);
  if (const Metadata* m = w.options->metadata; m != nullptr) {
    if (!m->exif.empty()) write_marker(&w.cinfo, kExifHeader, sizeof kExifHeader, m->exif);
    if (!m->icc.empty()) {
      jpeg_write_icc_profile(&w.cinfo, reinterpret_cast<const JOCTET*>(m->icc.data()),
                             static_cast<unsigned>(m->icc.size()));
    }
    if (!m->xmp.empty()) write_marker(&w.cinfo, kXmpHeader, sizeof kXmpHeader, m->xmp);
  }
  // libjpeg reads the rows it is given and never writes them.
  JSAMPROW rows[kRowBatch];
  while (w.cinfo.next_scanline < w.cinfo.image_height) {
    const int32_t y = static_cast<int32_t>(w.cinfo.next_scanline);
    const int32_t n = std::min(kRowBatch, img.height - y);
    for (int32_t i = 0; i < n; ++i) {
      rows[i] = reinterpret_cast<JSAMPROW>(const_cast<uint32_t*>(img.row(y + i)));
    }
    jpeg_write_scanlines(&w.cinfo, rows, static_cast<JDIMENSION>(n));
  }
  jpeg_finish_compress(&w.cinfo);
}

}  // namespace

std::string read_jpeg(FILE* file, Image& out, const ReadOptions& options) {
  JpegReader r;
  r.cinfo.err = &r.err.mgr;
  init_jpeg_error(r.err);
  r.out = &out;
  r.options = &options;
  if (setjmp(r.err.jump)) {
    return r.too_large ? std::string(r.err.reason)
                       : std::string("cannot decode JPEG: ") + r.err.reason;
  }
  jpeg_decode(r, file);
  if (options.metadata != nullptr && r.icc != nullptr) {
    options.metadata->icc.assign(reinterpret_cast<const char*>(r.icc), r.icc_size);
  }
  return {};
}

std::string write_jpeg(FILE* file, const Image& image, const WriteOptions& options) {
  JpegWriter w;
  w.cinfo.err = &w.err.mgr;
  init_jpeg_error(w.err);
  w.image = &image;
  w.options = &options;
  if (setjmp(w.err.jump)) return std::string("cannot encode JPEG: ") + w.err.reason;
  jpeg_encode(w, file);
  return {};
}

std::string jpeg_version() {
#ifdef LIBJPEG_TURBO_VERSION
#define PHOTOFX_STRINGIFY2(x) #x
#define PHOTOFX_STRINGIFY(x) PHOTOFX_STRINGIFY2(x)
  return "libjpeg-turbo " PHOTOFX_STRINGIFY(LIBJPEG_TURBO_VERSION);
#else
  return "libjpeg " + std::to_string(JPEG_LIB_VERSION);
#endif
}

}  // namespace fxtool::codec
