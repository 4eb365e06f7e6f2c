// Draws the report's bar chart: each benchmark's time as a multiple of memcpy of the same image,
// on a logarithmic axis, coloured by whether it meets its goal, with the goal marked.
//
//   photofx_chart BARS OUT.png
//
// BARS is tab-separated text written by bench/report, one item per line:
//   title <tab> TEXT
//   unit <tab> TEXT                         what follows each value (default X, a multiple)
//   panel <tab> TEXT                        starts a new column of bars
//   bar <tab> LABEL <tab> X <tab> GOAL <tab> KIND
// X and GOAL are multiples of memcpy (GOAL 0: none), or figures in the given unit; KIND is met,
// missed, none or reference.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "tools/font.h"
#include "tools/image.h"

namespace {

using fxtool::Image;

struct Bar {
  std::string label;
  double value = 0;
  double goal = 0;
  std::string kind;
};

struct Panel {
  std::string title;
  std::vector<Bar> bars;
};

constexpr uint32_t kWhite = 0xFFFFFFFFu;
constexpr uint32_t kInk = 0xFF202020u;
constexpr uint32_t kGrid = 0xFFE4E4E4u;
constexpr uint32_t kFloorLine = 0xFF808080u;
constexpr uint32_t kMet = 0xFF2E9E4Fu;
constexpr uint32_t kMissed = 0xFFD6452Fu;
constexpr uint32_t kNoGoal = 0xFF6B88B5u;
constexpr uint32_t kReference = 0xFFB4B4B4u;

constexpr int32_t kMargin = 8;
constexpr int32_t kRow = 10;  // one bar per row
constexpr int32_t kBarHeight = 7;
constexpr int32_t kPlotWidth = 300;
constexpr int32_t kValueWidth = 8 * fxtool::kGlyphAdvance;
constexpr int32_t kScale = 2;  // the 5 x 7 font is drawn at twice its size

uint32_t colour_of(const std::string& kind) {
  if (kind == "met") return kMet;
  if (kind == "missed") return kMissed;
  if (kind == "reference") return kReference;
  return kNoGoal;
}

void fill(Image& img, int32_t x0, int32_t y0, int32_t w, int32_t h, uint32_t c) {
  for (int32_t y = y0 < 0 ? 0 : y0; y < y0 + h && y < img.height; ++y) {
    for (int32_t x = x0 < 0 ? 0 : x0; x < x0 + w && x < img.width; ++x) img.at(x, y) = c;
  }
}

int32_t text_width(const std::string& s) {
  return static_cast<int32_t>(s.size()) * fxtool::kGlyphAdvance;
}

std::string multiple(double x, const std::string& unit) {
  char buf[32];
  std::snprintf(buf, sizeof buf, x >= 100 ? "%.0f" : "%.3g", x);
  return buf + unit;
}

// The axis: whole decades around every value and goal.
struct Axis {
  double lo = -1, hi = 1;  // log10 of the ends
  int32_t x0 = 0;

  int32_t at(double v) const {
    const double t = (std::log10(v) - lo) / (hi - lo);
    const double clamped = t < 0 ? 0 : (t > 1 ? 1 : t);
    return x0 + static_cast<int32_t>(std::lround(clamped * kPlotWidth));
  }
};

bool read_bars(const char* path, std::string& title, std::string& unit,
               std::vector<Panel>& panels) {
  std::ifstream in(path);
  if (!in) return false;
  std::string line;
  while (std::getline(in, line)) {
    std::vector<std::string> f;
    std::stringstream ss(line);
    std::string item;
    while (std::getline(ss, item, '\t')) f.push_back(item);
    if (f.empty()) continue;
    if (f[0] == "title" && f.size() == 2) {
      title = f[1];
    } else if (f[0] == "unit") {
      unit = f.size() > 1 ? f[1] : "";
    } else if (f[0] == "panel" && f.size() == 2) {
      panels.push_back({f[1], {}});
    } else if (f[0] == "bar" && f.size() == 5 && !panels.empty()) {
      panels.back().bars.push_back({f[1], std::stod(f[2]), std::stod(f[3]), f[4]});
    } else {
      std::fprintf(stderr, "photofx_chart: %s: cannot read: %s\n", path, line.c_str());
      return false;
    }
  }
  return true;
}

Image scaled(const Image& small, int32_t k) {
  Image big;
  big.resize(small.width * k, small.height * k);
  for (int32_t y = 0; y < big.height; ++y) {
    for (int32_t x = 0; x < big.width; ++x) big.at(x, y) = small.at(x / k, y / k);
  }
  return big;
}

void draw_legend(Image& img, int32_t x, int32_t y, bool references) {
  const struct {
    uint32_t colour;
    const char* text;
  } items[] = {{kMet, "GOAL MET"},
               {kMissed, "GOAL NOT MET"},
               {kNoGoal, "NO GOAL"},
               {kReference, "MEMCPY AND OPENCV"}};
  for (const auto& it : items) {
    if (it.colour == kReference && !references) continue;
    fill(img, x, y, 7, 7, it.colour);
    fxtool::draw_text(img, x + 10, y, it.text, kInk);
    x += 10 + text_width(it.text) + 14;
  }
  fill(img, x + 3, y - 1, 1, 9, kInk);
  fxtool::draw_text(img, x + 10, y, "GOAL", kInk);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 3) {
    std::fprintf(stderr, "usage: photofx_chart BARS OUT.png\n");
    return 2;
  }
  std::string title, unit = "X";
  std::vector<Panel> panels;
  if (!read_bars(argv[1], title, unit, panels) || panels.empty()) return 1;
  bool references = false;

  Axis axis;
  size_t rows = 0, label_chars = 0;
  for (const Panel& p : panels) {
    rows = std::max(rows, p.bars.size());
    for (const Bar& b : p.bars) {
      references = references || b.kind == "reference";
      label_chars = std::max(label_chars, b.label.size());
      for (double v : {b.value, b.goal}) {
        if (v <= 0) continue;
        axis.lo = std::min(axis.lo, std::floor(std::log10(v)));
        axis.hi = std::max(axis.hi, std::ceil(std::log10(v)));
      }
    }
  }
  axis.lo = std::max(axis.lo, -4.0);
  axis.hi = std::min(axis.hi, 5.0);

  const int32_t label_width = static_cast<int32_t>(label_chars) * fxtool::kGlyphAdvance + 6;
  const int32_t panel_width = label_width + kPlotWidth + kValueWidth + 2 * kMargin;
  const int32_t top = kMargin + 14 + 12 + 12;  // title, panel title, axis labels
  const int32_t height = top + static_cast<int32_t>(rows) * kRow + 24;
  Image img;
  img.resize(static_cast<int32_t>(panels.size()) * panel_width + kMargin, height);
  fill(img, 0, 0, img.width, img.height, kWhite);
  fxtool::draw_text(img, kMargin, kMargin, title, kInk);

  for (size_t p = 0; p < panels.size(); ++p) {
    const int32_t left = kMargin + static_cast<int32_t>(p) * panel_width;
    axis.x0 = left + label_width;
    fxtool::draw_text(img, left, kMargin + 14, panels[p].title, kInk);
    const int32_t plot_top = top - 2;
    const int32_t plot_height = static_cast<int32_t>(panels[p].bars.size()) * kRow + 2;
    for (int32_t d = static_cast<int32_t>(axis.lo); d <= static_cast<int32_t>(axis.hi); ++d) {
      const double v = std::pow(10.0, d);
      const int32_t x = axis.at(v);
      fill(img, x, plot_top, 1, plot_height, d == 0 ? kFloorLine : kGrid);
      const std::string t = multiple(v, unit);
      fxtool::draw_text(img, x - text_width(t) / 2, kMargin + 26, t, kInk);
    }
    for (size_t i = 0; i < panels[p].bars.size(); ++i) {
      const Bar& b = panels[p].bars[i];
      const int32_t y = top + static_cast<int32_t>(i) * kRow;
      fxtool::draw_text(img, left, y, b.label, kInk);
      const int32_t end = axis.at(b.value);
      fill(img, axis.x0, y, end - axis.x0 + 1, kBarHeight, colour_of(b.kind));
      if (b.goal > 0) fill(img, axis.at(b.goal), y - 1, 1, kBarHeight + 2, kInk);
      fxtool::draw_text(img, axis.x0 + kPlotWidth + 6, y, multiple(b.value, unit), kInk);
    }
  }
  draw_legend(img, kMargin, height - 14, references);

  const std::string why = fxtool::write_image(argv[2], scaled(img, kScale));
  if (!why.empty()) {
    std::fprintf(stderr, "photofx_chart: %s: %s\n", argv[2], why.c_str());
    return 1;
  }
  return 0;
}
