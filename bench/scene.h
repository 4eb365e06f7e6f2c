// The buffers of one image size, shared by the timed suite (bench/main.cpp) and the ARM cost
// program (bench/armv7/cost.cpp), so that both measure on the same frame and mask.
#pragma once

#include <cstdint>
#include <vector>

#include "bench/suite.h"

namespace fxbench {

struct Scene {
  const char* name = "";
  int32_t width = 0, height = 0;
  std::vector<uint32_t> src, dst;
  std::vector<uint8_t> mask, bgr;
  int32_t left = 0, right = -1, top = 0, bottom = -1;  // the ellipse's box

  // The frame of a full run (empty bounds: whole-image mode) or of a partial one (the box).
  Frame frame(bool masked);
};

// Sizes the mask to the scene and fills it with a centred ellipse holding about a third of the
// pixels; its bounding box becomes the scene's bounds.
void fill_ellipse_mask(Scene& s);

}  // namespace fxbench
