// A tiny built-in bitmap font for the captions of the contact sheet: 5 x 7 pixel capitals,
// digits and common punctuation. Lower-case letters are drawn as capitals and any other
// character as '?'.
#pragma once

#include <cstdint>
#include <string_view>

#include "tools/image.h"

namespace fxtool {

constexpr int32_t kGlyphWidth = 5;
constexpr int32_t kGlyphHeight = 7;
constexpr int32_t kGlyphAdvance = kGlyphWidth + 1;

// Draws `text` with its top-left corner at (x, y) in an opaque colour; whatever falls outside
// the image is clipped.
void draw_text(Image& image, int32_t x, int32_t y, std::string_view text, uint32_t colour);

}  // namespace fxtool
