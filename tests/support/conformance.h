// The inputs of the conformance goldens, and the digest that hashes what a call wrote.
#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <string>
#include <vector>

#include "frame/frame.h"
#include "support/images.h"

namespace pfx::test {

struct Input {
  std::string name;
  int32_t width, height;
  Pixels pixels;
  Mask mask;  // bytes from {0, 1, 2, 255}
};

inline Pixels load_argb(const std::string& path, size_t count) {
  std::ifstream f(path, std::ios::binary);
  std::vector<unsigned char> bytes((std::istreambuf_iterator<char>(f)),
                                   std::istreambuf_iterator<char>());
  Pixels px;
  if (bytes.size() != count * 4) return px;
  px.resize(count);
  for (size_t i = 0; i < count; ++i) {
    px[i] = uint32_t{bytes[4 * i]} | uint32_t{bytes[4 * i + 1]} << 8 |
            uint32_t{bytes[4 * i + 2]} << 16 | uint32_t{bytes[4 * i + 3]} << 24;
  }
  return px;
}

// The real photograph crop, opaque, 64 x 48.
inline Input photo_input() {
  Pixels px = load_argb(std::string(PHOTOFX_TEST_DATA_DIR) + "/coffee_64x48.argb", 64 * 48);
  EXPECT_EQ(px.size(), 64u * 48u) << "missing tests/data/coffee_64x48.argb";
  return {"photo", 64, 48, px, random_mask(64, 48, 48)};
}

// Seeded noise with random alpha at an odd size.
inline Input noise_input() {
  return {"noise", 61, 37, random_image(61, 37, 2026), random_mask(61, 37, 37)};
}

// The photograph enlarged by repeating each pixel `factor` times in each direction, with its own
// mask: for effects that behave differently on larger images (auto adjust works from its tone
// curve only from 150 x 150 up).
inline Input enlarged_photo_input(int32_t factor) {
  const Input photo = photo_input();
  if (photo.pixels.size() != 64u * 48u) return photo;
  const int32_t w = photo.width * factor, h = photo.height * factor;
  Pixels px(static_cast<size_t>(w) * static_cast<size_t>(h));
  for (int32_t y = 0; y < h; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      px[static_cast<size_t>(y) * w + x] =
          photo.pixels[static_cast<size_t>(y / factor) * photo.width + x / factor];
    }
  }
  std::string name = "photo x";
  name += std::to_string(factor);
  return {name, w, h, px, random_mask(w, h, 4800 + factor)};
}

inline const std::vector<Input>& conformance_inputs() {
  static const std::vector<Input> inputs = {noise_input(), photo_input()};
  return inputs;
}

// Region bounds of every mode: whole image (left > right), whole image (top > bottom), the full
// rectangle, an inner rectangle and a single pixel.
inline std::vector<Rect> conformance_bounds(int32_t w, int32_t h) {
  return {{1, 0, 0, h - 1},
          {0, w - 1, 1, 0},
          {0, w - 1, 0, h - 1},
          {w / 4, 3 * w / 4, h / 3, h - 2},
          {w / 2, w / 2, h / 2, h / 2}};
}

// Accumulates everything an effect produced (pixels and result codes) into one 64-bit digest.
class Digest {
 public:
  void add(const Pixels& px) { add(px.data(), px.size()); }
  void add(const uint32_t* px, size_t n) {
    mix(static_cast<uint64_t>(n));
    mix(hash_pixels(px, n));
  }
  void add(int64_t value) { mix(static_cast<uint64_t>(value)); }
  uint64_t value() const { return h_; }

 private:
  void mix(uint64_t v) {
    for (int shift = 56; shift >= 0; shift -= 8) {
      h_ ^= (v >> shift) & 0xFFu;
      h_ *= 0x100000001B3ull;
    }
  }
  uint64_t h_ = 0xCBF29CE484222325ull;
};

inline bool printing_goldens() {
  const char* v = std::getenv("PHOTOFX_PRINT_GOLDENS");
  return v != nullptr && *v != '\0' && *v != '0';
}

}  // namespace pfx::test
