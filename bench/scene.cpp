#include "bench/scene.h"

#include <algorithm>

namespace fxbench {

Frame Scene::frame(bool masked) {
  Frame f;
  f.width = width;
  f.height = height;
  f.src = src.data();
  f.dst = dst.data();
  f.mask = mask.data();
  f.bgr = bgr.empty() ? nullptr : bgr.data();
  if (masked) {
    f.left = left;
    f.right = right;
    f.top = top;
    f.bottom = bottom;
  }
  return f;
}

// Semi-axes 0.651 of the half sides: pi / 4 x 0.651^2 = a third of the pixels, about what a user
// circles around a subject.
void fill_ellipse_mask(Scene& s) {
  s.mask.assign(static_cast<size_t>(s.width) * static_cast<size_t>(s.height), 0);
  const double cx = (s.width - 1) / 2.0, cy = (s.height - 1) / 2.0;
  const double a = 0.651 * s.width / 2, b = 0.651 * s.height / 2;
  s.left = s.width;
  s.top = s.height;
  s.right = s.bottom = -1;
  for (int32_t y = 0; y < s.height; ++y) {
    for (int32_t x = 0; x < s.width; ++x) {
      const double u = (x - cx) / a, v = (y - cy) / b;
      const bool in = u * u + v * v <= 1;
      s.mask[static_cast<size_t>(y) * static_cast<size_t>(s.width) + static_cast<size_t>(x)] =
          in ? 1 : 0;
      if (in) {
        s.left = std::min(s.left, x);
        s.right = std::max(s.right, x);
        s.top = std::min(s.top, y);
        s.bottom = std::max(s.bottom, y);
      }
    }
  }
}

}  // namespace fxbench
