// Times every effect of the catalogue the way the hosts run it (run_effect, at the first setting
// its gallery shows): the full effect on a 12-megapixel picture and on a 1080 x 720 one, and
// what a slider runs while it moves (preview_step) on the 1080 x 720 one. The same source is built
// natively (bench preset) and for WebAssembly (wasm preset, run under node), so bench/wasm-report
// compares like with like.
//
// Output: a line per effect, tab-separated: name, then milliseconds for full 12 MP, full
// 1080 x 720 and preview 1080 x 720 (the median of the runs made in about a quarter second).
// An argument restricts the run to the effects named in it, comma-separated.
#include <algorithm>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <string>
#include <string_view>
#include <vector>

#include "catalog/chain.h"
#include "catalog/effects.h"
#include "catalog/params.h"

namespace {

using fxcat::Effect;

// A picture with smooth gradients, edges and grain, so that the histogram-driven and
// edge-aware effects have something to work on.
fxcat::Pixels picture(int32_t width, int32_t height) {
  fxcat::Pixels p(static_cast<size_t>(width) * static_cast<size_t>(height));
  uint32_t seed = 12345;
  for (int32_t y = 0; y < height; ++y) {
    for (int32_t x = 0; x < width; ++x) {
      seed = seed * 1664525u + 1013904223u;
      const uint32_t grain = (seed >> 24) & 15;
      const uint32_t r = static_cast<uint32_t>(x * 200 / width) + grain;
      const uint32_t g = static_cast<uint32_t>(y * 180 / height) + grain;
      const uint32_t b = ((x / 97 + y / 61) % 2 != 0 ? 160u : 60u) + grain;
      p[static_cast<size_t>(y) * static_cast<size_t>(width) + static_cast<size_t>(x)] =
          0xFF000000u | r << 16 | g << 8 | b;
    }
  }
  return p;
}

// The effect's first non-empty gallery setting as options ("level=0" -> " --level 0"), so that
// the sliders are timed away from their neutral position, where some effects do nothing.
std::string gallery_options(const Effect& e) {
  std::string_view g = e.gallery == nullptr ? "" : e.gallery;
  while (!g.empty() && g.front() == ';') g.remove_prefix(1);
  g = g.substr(0, g.find(';'));
  std::string words;
  for (char c : g) {
    if (c == ',' || words.empty()) words += " --";
    if (c == '=') {
      words += ' ';
    } else if (c != ',') {
      words += c;
    }
  }
  return words;
}

// Median milliseconds of `text` (one step of the chain syntax) on the picture; -1 if it fails.
double time_step(const std::string& text, const fxcat::Pixels& src, int32_t width, int32_t height) {
  std::vector<fxcat::Step> steps;
  const std::vector<std::string> words = fxcat::split_words(text);
  if (!fxcat::parse_chain(words, nullptr, steps).empty()) return -1;
  const Effect& effect = *steps[0].effect;
  fxcat::Values values;
  int32_t out_width = 0, out_height = 0;
  if (!fxcat::resolve(effect, steps[0].settings, width, height, values).empty() ||
      !fxcat::output_size(effect, values, width, height, out_width, out_height).empty()) {
    return -1;
  }
  fxcat::Pixels dst(static_cast<size_t>(out_width) * static_cast<size_t>(out_height));
  std::vector<double> runs;
  double total = 0;
  while (runs.size() < 3 || (total < 250 && runs.size() < 50)) {
    const auto start = std::chrono::steady_clock::now();
    if (!fxcat::run_effect(effect, values, src.data(), width, height, dst.data(), nullptr)
             .empty()) {
      return -1;
    }
    const std::chrono::duration<double, std::milli> took = std::chrono::steady_clock::now() - start;
    runs.push_back(took.count());
    total += took.count();
  }
  std::sort(runs.begin(), runs.end());
  return runs[runs.size() / 2];
}

}  // namespace

int main(int argc, char** argv) {
  // ",a,b," so that a name is found with the commas round it (appended: GCC warns falsely
  // about "," + string).
  std::string only;
  if (argc > 1) only.append(",").append(argv[1]).append(",");
  const fxcat::Pixels large = picture(4000, 3000);
  const fxcat::Pixels small = picture(1080, 720);
  for (const Effect& e : fxcat::effects()) {
    std::string key;
    key.append(",").append(e.name).append(",");
    if (!only.empty() && only.find(key) == std::string::npos) continue;
    const std::string preview = fxcat::preview_step(e);
    const std::string full = e.name + gallery_options(e);
    std::printf(
        "%s\t%.3f\t%.3f\t%.3f\n", e.name, time_step(full, large, 4000, 3000),
        time_step(full, small, 1080, 720),
        time_step((preview.empty() ? e.name : preview) + gallery_options(e), small, 1080, 720));
    std::fflush(stdout);
  }
  return 0;
}
