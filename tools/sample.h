// The sample photograph bundled with the tool (assets/coffee.png), built into the executable so
// that `photofx gallery` works wherever the tool is run from or installed.
#pragma once

#include <cstddef>

namespace fxtool {

constexpr const char* kSampleName = "coffee.png";

const unsigned char* sample_photo_data();
size_t sample_photo_size();

}  // namespace fxtool
