// Reading and writing the orientation and text tags of an EXIF block, and turning pixels
// upright. Every offset read from the block is checked against its size before it is used.
#include "tools/exif.h"

#include <algorithm>
#include <cstring>

namespace fxtool {
namespace {

constexpr uint16_t kShort = 3, kAscii = 2;
constexpr size_t kEntrySize = 12;

class Block {
 public:
  // False when `exif` does not start with a TIFF header and a whole first directory.
  bool open(std::string_view exif) {
    d_ = exif;
    if (d_.size() < 8) return false;
    if (d_.substr(0, 4) == std::string_view("II*\0", 4)) {
      le_ = true;
    } else if (d_.substr(0, 4) == std::string_view("MM\0*", 4)) {
      le_ = false;
    } else {
      return false;
    }
    ifd_ = u32(4);
    if (!fits(ifd_, 2)) return false;
    count_ = u16(ifd_);
    return fits(ifd_ + 2, size_t{count_} * kEntrySize);
  }

  // The offset of `tag`'s entry in the first directory, or 0 when there is none.
  size_t entry(uint16_t tag) const {
    for (size_t i = 0; i < count_; ++i) {
      const size_t at = ifd_ + 2 + i * kEntrySize;
      if (u16(at) == tag) return at;
    }
    return 0;
  }

  bool fits(size_t offset, size_t n) const {
    return offset <= d_.size() && n <= d_.size() - offset;
  }
  bool little_endian() const { return le_; }

  uint16_t u16(size_t at) const {
    const auto b0 = static_cast<uint8_t>(d_[at]), b1 = static_cast<uint8_t>(d_[at + 1]);
    return static_cast<uint16_t>(le_ ? b0 | b1 << 8 : b0 << 8 | b1);
  }
  uint32_t u32(size_t at) const {
    const uint32_t a = u16(at), b = u16(at + 2);
    return le_ ? a | b << 16 : a << 16 | b;
  }
  std::string_view bytes(size_t at, size_t n) const { return d_.substr(at, n); }

 private:
  std::string_view d_;
  bool le_ = true;
  size_t ifd_ = 0;
  uint16_t count_ = 0;
};

void put16(std::string& s, size_t at, uint16_t v) {
  s[at] = static_cast<char>(v & 0xFF);
  s[at + 1] = static_cast<char>(v >> 8);
}

void put32(std::string& s, size_t at, uint32_t v) {
  put16(s, at, static_cast<uint16_t>(v & 0xFFFF));
  put16(s, at + 2, static_cast<uint16_t>(v >> 16));
}

}  // namespace

int32_t exif_orientation(std::string_view exif) {
  Block b;
  if (!b.open(exif)) return 0;
  const size_t at = b.entry(kOrientationTag);
  if (at == 0 || b.u16(at + 2) != kShort || b.u32(at + 4) != 1) return 0;
  const uint16_t v = b.u16(at + 8);
  return v >= 1 && v <= 8 ? v : 0;
}

bool set_exif_orientation(std::string& exif, int32_t orientation) {
  Block b;
  if (!b.open(exif) || exif_orientation(exif) == 0) return false;
  const size_t at = b.entry(kOrientationTag) + 8;
  const auto v = static_cast<uint16_t>(orientation);
  exif[at] = static_cast<char>(b.little_endian() ? v & 0xFF : v >> 8);
  exif[at + 1] = static_cast<char>(b.little_endian() ? v >> 8 : v & 0xFF);
  return true;
}

TextTags exif_text_tags(std::string_view exif) {
  TextTags tags;
  Block b;
  if (!b.open(exif)) return tags;
  for (uint16_t tag : kTextTags) {
    const size_t at = b.entry(tag);
    if (at == 0 || b.u16(at + 2) != kAscii) continue;
    const uint32_t n = b.u32(at + 4);
    const size_t data = n <= 4 ? at + 8 : b.u32(at + 8);
    if (n == 0 || !b.fits(data, n)) continue;
    std::string_view text = b.bytes(data, n);
    text = text.substr(0, text.find('\0'));  // the count includes the terminator
    if (!text.empty()) tags.emplace_back(tag, std::string(text));
  }
  return tags;
}

std::string make_exif(int32_t orientation, const TextTags& text) {
  struct Entry {
    uint16_t tag;
    std::string value;  // ASCII, terminator included; empty for the orientation
  };
  std::vector<Entry> entries;
  if (orientation >= 1 && orientation <= 8) entries.push_back({kOrientationTag, {}});
  for (const auto& [tag, value] : text) {
    if (!value.empty()) entries.push_back({tag, value + '\0'});
  }
  if (entries.empty()) return {};
  std::sort(entries.begin(), entries.end(),
            [](const Entry& a, const Entry& b) { return a.tag < b.tag; });

  const size_t ifd_size = 2 + entries.size() * kEntrySize + 4;
  std::string out(8 + ifd_size, '\0');
  std::memcpy(out.data(), "II*\0", 4);
  put32(out, 4, 8);
  put16(out, 8, static_cast<uint16_t>(entries.size()));
  for (size_t i = 0; i < entries.size(); ++i) {
    const Entry& e = entries[i];
    const size_t at = 10 + i * kEntrySize;
    put16(out, at, e.tag);
    if (e.tag == kOrientationTag) {
      put16(out, at + 2, kShort);
      put32(out, at + 4, 1);
      put16(out, at + 8, static_cast<uint16_t>(orientation));
      continue;
    }
    put16(out, at + 2, kAscii);
    put32(out, at + 4, static_cast<uint32_t>(e.value.size()));
    if (e.value.size() <= 4) {
      std::memcpy(out.data() + at + 8, e.value.data(), e.value.size());
    } else {
      if (out.size() % 2 != 0) out += '\0';  // values start on even offsets
      put32(out, at + 8, static_cast<uint32_t>(out.size()));
      out += e.value;
    }
  }
  return out;  // the next-directory offset stays 0: one directory
}

void orient_upright(Image& image, int32_t orientation) {
  const int32_t w = image.width, h = image.height;
  if (orientation < 2 || orientation > 8 || w <= 0 || h <= 0) return;
  if (orientation <= 4) {
    // Flips: in place, a row (2), the whole picture (3) or the order of the rows (4).
    if (orientation == 3) {
      std::reverse(image.pixels.begin(), image.pixels.end());
    } else if (orientation == 2) {
      for (int32_t y = 0; y < h; ++y) std::reverse(image.row(y), image.row(y) + w);
    } else {
      for (int32_t y = 0; y < h / 2; ++y)
        std::swap_ranges(image.row(y), image.row(y) + w, image.row(h - 1 - y));
    }
    return;
  }
  // Rotations and diagonal mirrors: the upright picture is h wide and w high, and its pixel
  // (x, y) is the stored one at (sx, sy) below. Done in tiles, so that the columns read from
  // the stored picture stay in the cache.
  Image upright;
  upright.resize(h, w);
  constexpr int32_t kTile = 64;
  for (int32_t y0 = 0; y0 < w; y0 += kTile) {
    for (int32_t x0 = 0; x0 < h; x0 += kTile) {
      for (int32_t y = y0; y < std::min(w, y0 + kTile); ++y) {
        uint32_t* out = upright.row(y);
        for (int32_t x = x0; x < std::min(h, x0 + kTile); ++x) {
          int32_t sx = y, sy = x;                // 5: mirrored across the main diagonal
          if (orientation == 6) sy = h - 1 - x;  // turned 90 degrees clockwise to view
          if (orientation == 7) sx = w - 1 - y, sy = h - 1 - x;
          if (orientation == 8) sx = w - 1 - y;  // turned 90 degrees anticlockwise to view
          out[x] = image.at(sx, sy);
        }
      }
    }
  }
  image = std::move(upright);
}

}  // namespace fxtool
