// The cost program: runs one effect of the benchmark suite's table once on a photograph, so that
// bench/arm-cost can count the instructions the call executes on the target under qemu-arm.
//
//   photofx_cost --list
//   photofx_cost PHOTO.ppm WIDTH HEIGHT EFFECT full|partial CALLS
//
// --list prints each effect of the table with its variants and the unit its count is divided by.
// Otherwise the program reads the photograph (binary PPM), scales it to WIDTH x HEIGHT, builds the
// suite's frame (the ellipse mask selecting a third of the pixels; a partial run gets its box as
// bounds), runs the effect's setup, CALLS calls (0 or 1) and its teardown. The count of a run
// with no call is subtracted from the count of a run with one, so set-up, the photograph's
// reading and the program's start cancel out. It prints the library's load address, which maps
// a profile's block addresses to the library's symbols.
#include <dlfcn.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#include "bench/scene.h"
#include "bench/suite.h"
#include "photofx.h"

namespace {

using fxbench::Effect;
using fxbench::Frame;

// A binary PPM (P6, maxval 255) as opaque ARGB pixels.
bool read_ppm(const char* path, int32_t& width, int32_t& height, std::vector<uint32_t>& px) {
  std::FILE* f = std::fopen(path, "rb");
  if (f == nullptr) return false;
  int maxval = 0;
  const bool header = std::fscanf(f, "P6 %d %d %d", &width, &height, &maxval) == 3 &&
                      maxval == 255 && width > 0 && height > 0 && std::fgetc(f) != EOF;
  std::vector<uint8_t> rgb;
  if (header) {
    rgb.resize(static_cast<size_t>(width) * static_cast<size_t>(height) * 3);
  }
  const bool ok = header && std::fread(rgb.data(), 1, rgb.size(), f) == rgb.size();
  std::fclose(f);
  if (!ok) return false;
  px.resize(rgb.size() / 3);
  for (size_t i = 0; i < px.size(); ++i) {
    px[i] =
        0xFF000000u | uint32_t{rgb[3 * i]} << 16 | uint32_t{rgb[3 * i + 1]} << 8 | rgb[3 * i + 2];
  }
  return true;
}

// The photograph's middle, cropped to the shape of the scene and scaled to its size (bilinear,
// sample centres aligned).
void fill_photo(int32_t pw, int32_t ph, const std::vector<uint32_t>& photo, fxbench::Scene& s) {
  double cw = pw, ch = ph;
  if (cw * s.height > ch * s.width) {
    cw = ch * s.width / s.height;
  } else {
    ch = cw * s.height / s.width;
  }
  const double x0 = (pw - cw) / 2, y0 = (ph - ch) / 2;
  s.src.resize(static_cast<size_t>(s.width) * static_cast<size_t>(s.height));
  for (int32_t y = 0; y < s.height; ++y) {
    const double fy = std::clamp(y0 + (y + 0.5) * ch / s.height - 0.5, 0.0, ph - 1.0);
    const int32_t y1 = static_cast<int32_t>(fy), y2 = std::min(y1 + 1, ph - 1);
    for (int32_t x = 0; x < s.width; ++x) {
      const double fx = std::clamp(x0 + (x + 0.5) * cw / s.width - 0.5, 0.0, pw - 1.0);
      const int32_t x1 = static_cast<int32_t>(fx), x2 = std::min(x1 + 1, pw - 1);
      const double wx = fx - x1, wy = fy - y1;
      uint32_t out = 0xFF000000u;
      for (int shift = 0; shift < 24; shift += 8) {
        auto at = [&](int32_t xx, int32_t yy) {
          return static_cast<double>(
              (photo[static_cast<size_t>(yy) * static_cast<size_t>(pw) + static_cast<size_t>(xx)] >>
               shift) &
              0xFFu);
        };
        const double v = (at(x1, y1) * (1 - wx) + at(x2, y1) * wx) * (1 - wy) +
                         (at(x1, y2) * (1 - wx) + at(x2, y2) * wx) * wy;
        out |= static_cast<uint32_t>(v + 0.5) << shift;
      }
      s.src[static_cast<size_t>(y) * static_cast<size_t>(s.width) + static_cast<size_t>(x)] = out;
    }
  }
}

const char* unit_of(const Effect& e) {
  if (e.items == nullptr) return "pixel";
  return e.items == fxbench::working_samples ? "working sample" : "brush pixel";
}

}  // namespace

int main(int argc, char** argv) {
  if (argc == 2 && std::strcmp(argv[1], "--list") == 0) {
    for (const Effect& e : fxbench::effects()) {
      std::printf("%s\t%s\t%s\n", e.name, e.partial != nullptr ? "full,partial" : "full",
                  unit_of(e));
    }
    return 0;
  }
  if (argc != 7) {
    std::fprintf(stderr,
                 "usage: photofx_cost --list | PHOTO.ppm WIDTH HEIGHT EFFECT full|partial CALLS\n");
    return 2;
  }
  const Effect* effect = nullptr;
  for (const Effect& e : fxbench::effects()) {
    if (std::strcmp(e.name, argv[4]) == 0) effect = &e;
  }
  const bool masked = std::strcmp(argv[5], "partial") == 0;
  if (effect == nullptr || (masked && effect->partial == nullptr)) {
    std::fprintf(stderr, "photofx_cost: no %s variant of %s\n", argv[5], argv[4]);
    return 2;
  }
  int32_t pw = 0, ph = 0;
  std::vector<uint32_t> photo;
  if (!read_ppm(argv[1], pw, ph, photo)) {
    std::fprintf(stderr, "photofx_cost: %s: not a binary PPM\n", argv[1]);
    return 1;
  }
  fxbench::Scene s;
  s.width = std::atoi(argv[2]);
  s.height = std::atoi(argv[3]);
  if (s.width <= 0 || s.height <= 0) {
    std::fprintf(stderr, "photofx_cost: bad size %s x %s\n", argv[2], argv[3]);
    return 2;
  }
  fill_photo(pw, ph, photo, s);
  fxbench::fill_ellipse_mask(s);
  s.dst.resize(s.src.size());
  const Frame f = s.frame(masked);
  if (effect->in_place) {
    std::memcpy(f.dst, f.src, s.src.size() * 4);
  } else {
    std::memset(f.dst, 0, s.src.size() * 4);
  }
  if (effect->setup != nullptr) effect->setup(f);
  const fxbench::Call call = masked ? effect->partial : effect->full;
  for (int n = std::atoi(argv[6]); n > 0; --n) call(f);
  const int64_t items = effect->items != nullptr ? effect->items(f) : f.pixels();
  if (effect->teardown != nullptr) effect->teardown();

  Dl_info info{};
  const bool found = dladdr(reinterpret_cast<void*>(&fx_apply_invert_all), &info) != 0;
  std::printf("library %s %p\nitems %lld\n", found ? info.dli_fname : "?",
              found ? info.dli_fbase : nullptr, static_cast<long long>(items));
  return 0;
}
