// Selections on the command line: a greyscale mask file, a rectangle, an ellipse, or any of them
// together (a pixel is then selected when every one of them selects it); and running an effect
// confined to a selection.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "tools/effect.h"
#include "tools/image.h"

namespace fxtool {

// --rect X,Y,W,H (columns X..X+W-1, rows Y..Y+H-1) or --ellipse CX,CY,RX,RY.
struct Shape {
  int32_t a = 0, b = 0, c = 0, d = 0;
};

struct SelectionOptions {
  bool has_mask = false, has_rect = false, has_ellipse = false;
  std::string mask_path;
  Image mask_image;  // the mask file, decoded once for all inputs
  Shape rect, ellipse;

  bool any() const { return has_mask || has_rect || has_ellipse; }
};

std::string parse_rect(std::string_view text, Shape& out);
std::string parse_ellipse(std::string_view text, Shape& out);

// A mask file selects a pixel whose grey value is at least this: grey is the luma
// (77 R + 150 G + 29 B) / 256, scaled by alpha / 255 where the file has alpha.
constexpr uint32_t kMaskThreshold = 128;
bool mask_selects(uint32_t pixel);

// One byte per pixel, 1 where selected and 0 elsewhere, with the box around the selected
// pixels (the whole image when none is selected, so the library's masked mode edits nothing).
struct Selection {
  std::vector<uint8_t> mask;
  Bounds box;
};

// The selection for an image of this size. Refuses a mask file of another size and a rectangle
// or ellipse that lies wholly outside the image.
std::string make_selection(const SelectionOptions& request, int32_t width, int32_t height,
                           Selection& out);

// Runs `effect` on `in` into `out`, confined to `selection` (null: the whole image).
std::string run_effect(const Effect& effect, const Values& values, const Image& in,
                       const Selection* selection, Image& out);

}  // namespace fxtool
