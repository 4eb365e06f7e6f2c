// Building selections from their shapes.
#include "catalog/selection.h"

#include <algorithm>
#include <charconv>
#include <string>

namespace fxcat {
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

std::vector<uint8_t> mask_of_picture(const uint32_t* pixels, int32_t width, int32_t height) {
  // grey * alpha against 128 * 255 rather than a division: exact, and 8 + 8 bits fit easily.
  constexpr uint32_t kThreshold = 128;
  const size_t n =
      width > 0 && height > 0 ? static_cast<size_t>(width) * static_cast<size_t>(height) : 0;
  std::vector<uint8_t> selected(n);
  for (size_t i = 0; i < n; ++i) {
    const uint32_t p = pixels[i];
    const uint32_t grey =
        (77 * ((p >> 16) & 0xFF) + 150 * ((p >> 8) & 0xFF) + 29 * (p & 0xFF)) >> 8;
    selected[i] = grey * (p >> 24) >= kThreshold * 255 ? 1 : 0;
  }
  return selected;
}

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

std::string make_selection(const SelectionRequest& request, int32_t width, int32_t height,
                           Selection& out) {
  if (width <= 0 || height <= 0 || int64_t{width} * height > kMaxPixels) {
    return "the image has no pixels or too many";
  }
  const size_t w = static_cast<size_t>(width);
  const size_t n = w * static_cast<size_t>(height);

  if (request.mask.bytes != nullptr) {
    const MaskRef& m = request.mask;
    if (m.width != width || m.height != height) {
      return "the mask " + m.name + " is " + image_size(m.width, m.height) + " but the image is " +
             image_size(width, height);
    }
    out.mask.resize(n);
    for (size_t i = 0; i < n; ++i) out.mask[i] = m.bytes[i] != 0 ? 1 : 0;
  } else {
    out.mask.assign(n, 1);
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

}  // namespace fxcat
