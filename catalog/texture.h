// A paper texture for the textured old-photo look, made up here rather than read from a file: a
// warm light ground with broad soft blotches, fine grain and a few thin light scratches running
// down the sheet. It is computed in integers from the pixel's position alone, so the
// same size always gives the same texture, on every machine.
#pragma once

#include <cstdint>

#include "catalog/effects.h"

namespace fxcat {

namespace paper {

// A well-mixed 32-bit hash of a position and a salt (unsigned arithmetic: wrapping is meant).
constexpr uint32_t hash(uint32_t x, uint32_t y, uint32_t salt) {
  uint32_t h = (x * 0x9E3779B1u) ^ ((y + 0x7F4A7C15u) * 0x85EBCA77u) ^ (salt * 0xC2B2AE3Du);
  h ^= h >> 15;
  h *= 0x2C1B3C6Du;
  h ^= h >> 12;
  h *= 0x297A2D39u;
  h ^= h >> 15;
  return h;
}

constexpr int32_t kCell = 48;  // blotch size in pixels

// -32..31 at the corners of the blotch grid.
constexpr int32_t corner(int32_t cx, int32_t cy) {
  return static_cast<int32_t>(hash(static_cast<uint32_t>(cx), static_cast<uint32_t>(cy), 1) & 63) -
         32;
}

constexpr uint32_t channel(int32_t v) {
  return static_cast<uint32_t>(v < 0 ? 0 : (v > 255 ? 255 : v));
}

}  // namespace paper

// width x height pixels of paper (nothing for an empty size).
inline Pixels paper_texture(int32_t width, int32_t height) {
  using namespace paper;
  if (width <= 0 || height <= 0) return {};
  Pixels t(static_cast<size_t>(width) * static_cast<size_t>(height));
  for (int32_t y = 0; y < height; ++y) {
    const int32_t cy = y / kCell, fy = y % kCell;
    for (int32_t x = 0; x < width; ++x) {
      const int32_t cx = x / kCell, fx = x % kCell;
      // Blotches: the grid's corner values blended bilinearly across each cell.
      const int32_t top = corner(cx, cy) * (kCell - fx) + corner(cx + 1, cy) * fx;
      const int32_t bottom = corner(cx, cy + 1) * (kCell - fx) + corner(cx + 1, cy + 1) * fx;
      const int32_t blotch = (top * (kCell - fy) + bottom * fy) / (kCell * kCell);
      const uint32_t ux = static_cast<uint32_t>(x), uy = static_cast<uint32_t>(y);
      const int32_t grain = static_cast<int32_t>(hash(ux, uy, 2) & 31) - 16;
      // About one column in 97 carries a scratch, broken into dashes of 16 rows.
      const bool scratch = hash(ux, 0, 3) % 97 == 0 && (hash(ux, uy / 16, 4) & 3) != 0;
      const int32_t shade = blotch + grain + (scratch ? 60 : 0);
      t[static_cast<size_t>(y) * static_cast<size_t>(width) + static_cast<size_t>(x)] =
          0xFF000000u | channel(208 + shade) << 16 | channel(190 + shade) << 8 |
          channel(160 + shade);
    }
  }
  return t;
}

}  // namespace fxcat
