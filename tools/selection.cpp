// Building selections and running effects through them.
#include "tools/selection.h"

#include <algorithm>
#include <charconv>
#include <string>

namespace fxtool {
namespace {

// Four comma-separated whole numbers.
bool parse_four(std::string_view text, int32_t (&out)[4]) {
  for (int i = 0; i < 4; ++i) {
    const size_t comma = text.find(',');
    if ((comma == std::string_view::npos) != (i == 3)) return false;
    std::string_view item = text.substr(0, comma);
    if (!item.empty() && item.front() == '+') item.remove_prefix(1);
    if (item.empty() || item.front() == '+') return false;
    const auto [end, ec] = std::from_chars(item.data(), item.data() + item.size(), out[i]);
    if (ec != std::errc() || end != item.data() + item.size()) return false;
    if (i < 3) text.remove_prefix(comma + 1);
  }
  return true;
}

std::string shape_text(const char* option, const Shape& s) {
  return std::string(option) + " " + std::to_string(s.a) + "," + std::to_string(s.b) + "," +
         std::to_string(s.c) + "," + std::to_string(s.d);
}

std::string image_size(int32_t w, int32_t h) { return std::to_string(w) + "x" + std::to_string(h); }

// Radii are kept small enough that the inside test below is exact in 64-bit arithmetic.
constexpr int32_t kMaxRadius = 32767;

}  // namespace

std::string parse_rect(std::string_view text, Shape& out) {
  int32_t v[4];
  if (!parse_four(text, v)) {
    return "--rect needs X,Y,W,H (four whole numbers), not '" + std::string(text) + "'";
  }
  if (v[2] < 1 || v[3] < 1) return "--rect width and height must be at least 1";
  out = {v[0], v[1], v[2], v[3]};
  return {};
}

std::string parse_ellipse(std::string_view text, Shape& out) {
  int32_t v[4];
  if (!parse_four(text, v)) {
    return "--ellipse needs CX,CY,RX,RY (four whole numbers), not '" + std::string(text) + "'";
  }
  if (v[2] < 1 || v[3] < 1 || v[2] > kMaxRadius || v[3] > kMaxRadius) {
    return "--ellipse radii must lie in 1.." + std::to_string(kMaxRadius);
  }
  out = {v[0], v[1], v[2], v[3]};
  return {};
}

bool mask_selects(uint32_t pixel) {
  const uint32_t r = (pixel >> 16) & 0xFF, g = (pixel >> 8) & 0xFF, b = pixel & 0xFF;
  const uint32_t grey = (77 * r + 150 * g + 29 * b) >> 8;
  return grey * (pixel >> 24) >= kMaskThreshold * 255;
}

std::string make_selection(const SelectionOptions& request, int32_t width, int32_t height,
                           Selection& out) {
  const size_t w = static_cast<size_t>(width);
  out.mask.assign(w * static_cast<size_t>(height), 1);

  if (request.has_mask) {
    const Image& m = request.mask_image;
    if (m.width != width || m.height != height) {
      return "the mask " + request.mask_path + " is " + image_size(m.width, m.height) +
             " but the image is " + image_size(width, height);
    }
    for (size_t i = 0; i < out.mask.size(); ++i) out.mask[i] = mask_selects(m.pixels[i]) ? 1 : 0;
  }

  if (request.has_rect) {
    const Shape& s = request.rect;
    const int64_t x0 = s.a, y0 = s.b, x1 = int64_t{s.a} + s.c - 1, y1 = int64_t{s.b} + s.d - 1;
    if (x1 < 0 || y1 < 0 || x0 >= width || y0 >= height) {
      return shape_text("--rect", s) + " lies outside the " + image_size(width, height) + " image";
    }
    for (int32_t y = 0; y < height; ++y) {
      for (int32_t x = 0; x < width; ++x) {
        if (x < x0 || x > x1 || y < y0 || y > y1) out.mask[size_t(y) * w + size_t(x)] = 0;
      }
    }
  }

  if (request.has_ellipse) {
    const Shape& s = request.ellipse;
    const int64_t rx = s.c, ry = s.d;
    if (int64_t{s.a} + rx < 0 || int64_t{s.b} + ry < 0 || int64_t{s.a} - rx >= width ||
        int64_t{s.b} - ry >= height) {
      return shape_text("--ellipse", s) + " lies outside the " + image_size(width, height) +
             " image";
    }
    // Inside when (dx/rx)^2 + (dy/ry)^2 <= 1, multiplied out; |dx| <= rx and |dy| <= ry are
    // tested first, which keeps every product below 2^61.
    const int64_t limit = rx * rx * ry * ry;
    for (int32_t y = 0; y < height; ++y) {
      const int64_t dy = int64_t{y} - s.b;
      for (int32_t x = 0; x < width; ++x) {
        const int64_t dx = int64_t{x} - s.a;
        const bool inside = dx >= -rx && dx <= rx && dy >= -ry && dy <= ry &&
                            dx * dx * ry * ry + dy * dy * rx * rx <= limit;
        if (!inside) out.mask[size_t(y) * w + size_t(x)] = 0;
      }
    }
  }

  Bounds box{width, -1, height, -1};
  for (int32_t y = 0; y < height; ++y) {
    for (int32_t x = 0; x < width; ++x) {
      if (out.mask[size_t(y) * w + size_t(x)] == 0) continue;
      box.left = std::min(box.left, x);
      box.right = std::max(box.right, x);
      box.top = std::min(box.top, y);
      box.bottom = std::max(box.bottom, y);
    }
  }
  // Nothing selected: bounds around the whole image keep the library in masked mode, where the
  // all-zero mask edits nothing (bounds with left > right would edit everything).
  if (box.left > box.right) box = {0, width - 1, 0, height - 1};
  out.box = box;
  return {};
}

std::string run_effect(const Effect& effect, const Values& values, const Image& in,
                       const Selection* selection, Image& out) {
  if (effect.run == nullptr) return std::string(effect.name) + " has no run function";
  if (selection != nullptr && effect.selects == Selects::kNothing) {
    return std::string(effect.name) + " takes no selection";
  }
  out = in;
  const Bounds whole_image{0, in.width - 1, 0, in.height - 1};
  const bool partial = selection != nullptr && effect.selects == Selects::kMask;
  std::vector<uint8_t> ones;
  if (!partial) ones.assign(in.pixels.size(), 1);
  const Call call{.in = in,
                  .out = out,
                  .mask = partial ? selection->mask.data() : ones.data(),
                  .bounds = partial ? selection->box : Bounds{1, 0, 1, 0},
                  .window = selection != nullptr ? selection->box : whole_image,
                  .whole = !partial,
                  .values = values};
  if (std::string err = effect.run(call); !err.empty()) return err;

  if (effect.selects == Selects::kNothing) return {};
  if (out.width != in.width || out.height != in.height || out.pixels.size() != in.pixels.size()) {
    return std::string(effect.name) + " changed the image size";
  }
  if (selection != nullptr && effect.selects == Selects::kByTool) {
    for (size_t i = 0; i < out.pixels.size(); ++i) {
      if (selection->mask[i] == 0) out.pixels[i] = in.pixels[i];
    }
  }
  return {};
}

}  // namespace fxtool
