// The gallery: every chosen effect at the settings its registry entry names, applied to one
// photograph, written as one PNG per picture, a contact sheet and an index page.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "catalog/effects.h"
#include "tools/image.h"

namespace fxtool {

using fxcat::Effect;

// Writes into `dir` (which must exist): original.png, one EFFECT[-SETTINGS].png per picture,
// contact-sheet.png and index.html. `source` names the photograph in the captions. Stops at the
// first failure and returns it; `pictures` counts the effect pictures written.
std::string make_gallery(const Image& photo, const std::string& source, const std::string& dir,
                         const std::vector<const Effect*>& chosen, int32_t& pictures);

// The picture's file name without directory: "brightness-level-20.png", "invert.png".
std::string picture_name(const Effect& effect, const std::string& settings);

}  // namespace fxtool
