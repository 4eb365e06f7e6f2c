// Selections as the hosts write them: a rectangle, an ellipse, a mask the host brings (a file,
// an array), or any of them together (a pixel is then selected when every one of them selects
// it).
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "catalog/effects.h"

namespace fxcat {

// --rect X,Y,W,H (columns X..X+W-1, rows Y..Y+H-1) or --ellipse CX,CY,RX,RY.
struct Shape {
  int32_t a = 0, b = 0, c = 0, d = 0;
};

// A mask the host has read or been given: one byte per pixel, non-zero where selected. `name`
// says where it came from, for messages.
struct MaskRef {
  const uint8_t* bytes = nullptr;
  int32_t width = 0, height = 0;
  std::string name;
};

// A mask the host has decoded from a picture (a file: 0xAARRGGBB words, width x height) as the
// bytes MaskRef takes: a pixel is selected when its grey value, the luma (77 R + 150 G + 29 B) /
// 256 scaled by alpha / 255, is 128 or more. Pictures without alpha are decoded opaque, so their
// grey alone decides.
std::vector<uint8_t> mask_of_picture(const uint32_t* pixels, int32_t width, int32_t height);

struct SelectionRequest {
  bool has_rect = false, has_ellipse = false;
  Shape rect, ellipse;
  MaskRef mask;  // bytes null: none

  bool any() const { return has_rect || has_ellipse || mask.bytes != nullptr; }
};

std::string parse_rect(std::string_view text, Shape& out);
std::string parse_ellipse(std::string_view text, Shape& out);

// The selection for an image of this size. Refuses a mask of another size and a rectangle or
// ellipse that lies wholly outside the image.
std::string make_selection(const SelectionRequest& request, int32_t width, int32_t height,
                           Selection& out);

}  // namespace fxcat
