// The little of EXIF the tool reads and writes: the orientation tag, and the picture's own text
// tags (description, maker, model, date, artist, copyright) that a TIFF file keeps in its first
// directory rather than in an EXIF block. An EXIF block is a small TIFF structure of its own:
// a header ("II*\0" little-endian or "MM\0*" big-endian) and directories of 12-byte entries.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "tools/image.h"

namespace fxtool {

// Orientation 1..8 as EXIF numbers it (1: as stored; 6: turn 90 degrees clockwise to view),
// or 0 when the block has none or is malformed.
int32_t exif_orientation(std::string_view exif);

// Rewrites the orientation tag in place; false when the block has none.
bool set_exif_orientation(std::string& exif, int32_t orientation);

// The TIFF tags of the picture's first directory that an EXIF block holds too.
constexpr uint16_t kOrientationTag = 274;
constexpr uint16_t kTextTags[] = {270, 271, 272, 306, 315, 33432};

using TextTags = std::vector<std::pair<uint16_t, std::string>>;

// The text tags of kTextTags the block's first directory has, in that order.
TextTags exif_text_tags(std::string_view exif);

// A little-endian EXIF block holding these tags (orientation 0: none), or "" when there is
// nothing to hold.
std::string make_exif(int32_t orientation, const TextTags& text);

// Turns the pixels upright for an EXIF orientation: flips in place, rotations through a second
// buffer (which swaps width and height).
void orient_upright(Image& image, int32_t orientation);

}  // namespace fxtool
