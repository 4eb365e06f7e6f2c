// WebP files through libwebp, lossy and lossless: decoded straight into the pixel buffer
// (libwebp's B, G, R, A output) and encoded from it without a copy (libwebp's ARGB words are
// ours); EXIF, ICC and XMP in the container's chunks, through libwebpmux and libwebpdemux.
#include <webp/decode.h>
#include <webp/demux.h>
#include <webp/encode.h>
#include <webp/mux.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

#include "tools/codecs.h"

namespace fxtool::codec {
namespace {

// The whole file: WebP is decoded from memory.
bool read_all(FILE* file, std::vector<uint8_t>& out) {
  out.clear();
  uint8_t buf[1 << 16];
  size_t n = 0;
  while ((n = std::fread(buf, 1, sizeof buf, file)) > 0) out.insert(out.end(), buf, buf + n);
  return std::ferror(file) == 0;
}

std::string chunk(const WebPDemuxer* demux, const char fourcc[5]) {
  WebPChunkIterator it;
  std::string data;
  if (WebPDemuxGetChunk(demux, fourcc, 1, &it) != 0) {
    data.assign(reinterpret_cast<const char*>(it.chunk.bytes), it.chunk.size);
  }
  WebPDemuxReleaseChunkIterator(&it);
  return data;
}

const char* encode_error(WebPEncodingError e) {
  switch (e) {
    case VP8_ENC_ERROR_OUT_OF_MEMORY:
    case VP8_ENC_ERROR_BITSTREAM_OUT_OF_MEMORY:
      return "out of memory";
    case VP8_ENC_ERROR_BAD_DIMENSION:
      return "WebP holds at most 16383 pixels a side";
    case VP8_ENC_ERROR_FILE_TOO_BIG:
      return "the file would be larger than 4 GB";
    default:
      return "the encoder failed";
  }
}

struct MemoryWriter {
  WebPMemoryWriter writer;
  MemoryWriter() { WebPMemoryWriterInit(&writer); }
  ~MemoryWriter() { WebPMemoryWriterClear(&writer); }
};

struct Picture {
  WebPPicture pic;
  bool ok;
  Picture() : ok(WebPPictureInit(&pic) != 0) {}
  ~Picture() { WebPPictureFree(&pic); }  // frees only what libwebp allocated
};

struct Mux {
  WebPMux* mux = WebPMuxNew();
  ~Mux() { WebPMuxDelete(mux); }
};

}  // namespace

std::string read_webp(FILE* file, Image& out, const ReadOptions& options) {
  std::vector<uint8_t> data;
  if (!read_all(file, data)) return "cannot read: " + std::string(std::strerror(errno));
  WebPBitstreamFeatures features;
  if (WebPGetFeatures(data.data(), data.size(), &features) != VP8_STATUS_OK) {
    return "cannot decode WebP: not a valid WebP file";
  }
  if (features.has_animation) return "cannot decode WebP: animated pictures are not supported";
  const uint64_t w = static_cast<uint64_t>(features.width);
  const uint64_t h = static_cast<uint64_t>(features.height);
  if (std::string err = check_size(w, h, options.max_pixels); !err.empty()) return err;
  out.resize(features.width, features.height);
  const size_t bytes = out.pixels.size() * 4;
  if (WebPDecodeBGRAInto(data.data(), data.size(), reinterpret_cast<uint8_t*>(out.pixels.data()),
                         bytes, features.width * 4) == nullptr) {
    return "cannot decode WebP: the file is damaged or incomplete";
  }
  if (options.metadata != nullptr) {
    const WebPData whole{data.data(), data.size()};
    WebPDemuxer* demux = WebPDemux(&whole);
    if (demux != nullptr) {
      Metadata& m = *options.metadata;
      m.icc = chunk(demux, "ICCP");
      m.exif = chunk(demux, "EXIF");
      m.xmp = chunk(demux, "XMP ");
      WebPDemuxDelete(demux);
      // Some writers keep JPEG's "Exif\0\0" in front of the TIFF header.
      if (m.exif.compare(0, 6, std::string("Exif\0\0", 6)) == 0) m.exif.erase(0, 6);
    }
  }
  return {};
}

std::string write_webp(FILE* file, const Image& image, const WriteOptions& options) {
  WebPConfig config;
  if (WebPConfigInit(&config) == 0) return "cannot encode WebP: the library does not match";
  config.lossless = options.lossless ? 1 : 0;
  config.quality = static_cast<float>(options.quality);
  // Lossless keeps every pixel as it is, the colour under transparent ones included.
  config.exact = options.lossless ? 1 : 0;
  if (WebPValidateConfig(&config) == 0) return "cannot encode WebP: bad settings";
  Picture p;
  MemoryWriter out;
  if (!p.ok) return "cannot encode WebP: the library does not match";
  p.pic.use_argb = 1;
  p.pic.width = image.width;
  p.pic.height = image.height;
  // The encoder reads these words (converting them when lossy) and never writes them.
  p.pic.argb = const_cast<uint32_t*>(image.pixels.data());
  p.pic.argb_stride = image.width;
  p.pic.writer = WebPMemoryWrite;
  p.pic.custom_ptr = &out.writer;
  if (WebPEncode(&config, &p.pic) == 0) {
    return std::string("cannot encode WebP: ") + encode_error(p.pic.error_code);
  }

  const Metadata* m = options.metadata;
  if (m == nullptr || m->empty()) {
    if (std::fwrite(out.writer.mem, 1, out.writer.size, file) != out.writer.size) {
      return "cannot write: " + std::string(std::strerror(errno));
    }
    return {};
  }
  // The bare picture wrapped in an extended container with the metadata chunks.
  Mux mux;
  if (mux.mux == nullptr) return "out of memory";
  const WebPData picture{out.writer.mem, out.writer.size};
  bool ok = WebPMuxSetImage(mux.mux, &picture, 0) == WEBP_MUX_OK;
  const auto set = [&](const char* fourcc, const std::string& bytes) {
    if (bytes.empty() || !ok) return;
    const WebPData d{reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size()};
    ok = WebPMuxSetChunk(mux.mux, fourcc, &d, 0) == WEBP_MUX_OK;
  };
  set("ICCP", m->icc);
  set("EXIF", m->exif);
  set("XMP ", m->xmp);
  WebPData assembled{nullptr, 0};
  ok = ok && WebPMuxAssemble(mux.mux, &assembled) == WEBP_MUX_OK;
  const bool written =
      ok && std::fwrite(assembled.bytes, 1, assembled.size, file) == assembled.size;
  WebPDataClear(&assembled);
  if (!ok) return "cannot encode WebP: the metadata could not be added";
  if (!written) return "cannot write: " + std::string(std::strerror(errno));
  return {};
}

std::string webp_version() {
  const int v = WebPGetDecoderVersion();
  return "libwebp " + std::to_string(v >> 16) + "." + std::to_string((v >> 8) & 0xFF) + "." +
         std::to_string(v & 0xFF);
}

}  // namespace fxtool::codec
