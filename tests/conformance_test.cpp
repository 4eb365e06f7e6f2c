// Conformance goldens: every row of the catalogue, at each of its representative arguments, runs
// on fixed inputs in every placement its shape has (every bounds mode, into a second buffer and
// in place, circles and windows, brush strokes, tilt-shift bands ...), and the hash of all it
// wrote and returned is compared with the line for that call in data/goldens.txt. The same file
// holds on x86-64 and on ARMv7, which is what proves the output identical on both; the test runs
// once per instruction-set path the machine has, so every vector path is held to it too.
//
// Goldens are never regenerated to make a failure go away. A new row or representative call
// prints its line with PHOTOFX_PRINT_GOLDENS=1 (the test then reports instead of failing).
#include <gtest/gtest.h>

#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "fixmath/fixed.h"
#include "support/catalog.h"
#include "support/paths.h"

namespace {

namespace cat = pfx::catalog;
using cat::Shape;
using pfx::test::Bytes;
using pfx::test::kUntouched;
using pfx::test::Pixels;

// ---- Inputs and the digest ------------------------------------------------------------------

struct Input {
  std::string name;
  int32_t width, height;
  Pixels pixels;
  pfx::test::Mask mask;  // bytes from {0, 1, 2, 255}
};

// The real photograph crop (opaque, 64 x 48), enlarged by repeating each pixel `factor` times in
// each direction for the effects that behave differently on larger images.
Input photo_input(int32_t factor = 1) {
  std::ifstream f(std::string(PHOTOFX_TEST_DATA_DIR) + "/coffee_64x48.argb", std::ios::binary);
  const std::vector<unsigned char> b((std::istreambuf_iterator<char>(f)),
                                     std::istreambuf_iterator<char>());
  EXPECT_EQ(b.size(), 64u * 48u * 4u) << "missing tests/data/coffee_64x48.argb";
  const int32_t w = 64 * factor, h = 48 * factor;
  Pixels px(static_cast<size_t>(w) * static_cast<size_t>(h));
  for (int32_t y = 0; y < h && b.size() == 64u * 48u * 4u; ++y) {
    for (int32_t x = 0; x < w; ++x) {
      const size_t i = 4 * (static_cast<size_t>(y / factor) * 64 + static_cast<size_t>(x / factor));
      px[static_cast<size_t>(y) * w + x] = uint32_t{b[i]} | uint32_t{b[i + 1]} << 8 |
                                           uint32_t{b[i + 2]} << 16 | uint32_t{b[i + 3]} << 24;
    }
  }
  return {factor == 1 ? "photo" : "photo x" + std::to_string(factor), w, h, px,
          pfx::test::random_mask(w, h, factor == 1 ? 48 : 4800 + factor)};
}

Input noise_input() {
  return {"noise", 61, 37, pfx::test::random_image(61, 37, 2026),
          pfx::test::random_mask(61, 37, 37)};
}

const std::vector<Input>& usual_inputs() {
  static const std::vector<Input> inputs = {noise_input(), photo_input()};
  return inputs;
}

// Region bounds of every mode: whole image (left > right), whole image (top > bottom), the full
// rectangle, an inner rectangle and a single pixel.
std::vector<cat::Bounds> bounds_modes(int32_t w, int32_t h) {
  return {{1, 0, 0, h - 1},
          {0, w - 1, 1, 0},
          {0, w - 1, 0, h - 1},
          {w / 4, 3 * w / 4, h / 3, h - 2},
          {w / 2, w / 2, h / 2, h / 2}};
}

// Everything a call produced (pixels, codes, values) in one 64-bit FNV-1a digest.
class Digest {
 public:
  void add(const Pixels& px) { add(px.data(), px.size()); }
  void add(const uint32_t* px, size_t n) {
    mix(static_cast<uint64_t>(n));
    mix(pfx::test::hash_pixels(px, n));
  }
  void add(int64_t value) { mix(static_cast<uint64_t>(value)); }
  uint64_t value() const { return h_; }

 private:
  void mix(uint64_t v) {
    for (int shift = 56; shift >= 0; shift -= 8) {
      h_ ^= (v >> shift) & 0xFFu;
      h_ *= 0x100000001B3ull;
    }
  }
  uint64_t h_ = 0xCBF29CE484222325ull;
};

// Module variables as a fresh load has them, read before any test runs.
const std::vector<int64_t> kInitialGlobals = [] {
  std::vector<int64_t> v;
  for (const cat::Export& e : cat::kExports) {
    if (e.shape != Shape::kGlobal) continue;
    v.push_back(e.count == 1 ? *static_cast<const int32_t*>(e.address)
                             : *static_cast<uint8_t* const*>(e.address) == nullptr);
  }
  return v;
}();

// "name args": the key of a golden line, and how a failure names the call.
std::string call_name(const cat::Export& e, const std::string& args) {
  return std::string(e.name) + " " + args;
}

std::string rep_text(const cat::Export& e, const cat::Rep& r) {
  std::ostringstream s;
  const size_t n = e.levels.size() < 4 ? e.levels.size() : 4;
  for (size_t i = 0; i < n; ++i) s << (i ? "," : "") << r.v[i];
  if (n == 0) s << "-";
  if (r.real != 0 || std::isnan(r.real)) s << ",gamma=" << r.real;
  return s.str();
}

void add_bytes(Digest& d, const uint8_t* b, size_t n) {
  const Pixels words(b, b + n);
  d.add(words);
}

// ---- Inputs and placements -------------------------------------------------------------------

// The usual inputs; the blur family adds one its working copy reduces by 4 per side (880 x 52),
// and auto adjust one large enough for its tone curve.
std::vector<Input> inputs_of(const cat::Export& e) {
  std::vector<Input> v = usual_inputs();
  if (pfx::test::works_reduced(e)) {
    v.push_back({"wide", 880, 52, pfx::test::random_image(880, 52, 2027),
                 pfx::test::random_mask(880, 52, 52)});
  }
  if (e.has(cat::kAutoParameters)) {
    v.push_back(photo_input(4));
    v.push_back({"noise 150", 150, 163, pfx::test::random_image(150, 163, 150),
                 pfx::test::random_mask(150, 163, 163)});
  }
  return v;
}

// Sizes the fixed inputs do not reach: single rows and columns, and one wider than the vignette
// table covers.
constexpr int32_t kOddSizes[][2] = {{1, 1}, {1, 9}, {7, 1}, {2, 2}, {3, 5}, {8200, 2}};

cat::Args base(const cat::Rep& rep, const Input& in, uint32_t* dst, const uint32_t* texture) {
  cat::Args a;
  a.src = in.pixels.data();
  a.mask = in.mask.data();
  a.dst = dst;
  a.texture = texture;
  a.width = in.width;
  a.height = in.height;
  for (int i = 0; i < 4; ++i) a.level[i] = rep.v[i];
  a.real = rep.real;
  return a;
}

struct Working {
  int32_t sw, sh;
  Bytes image, depth;
};

Working working_copy(const Input& in) {
  const int32_t k = in.width > 850 ? 2 : 0;
  Working w{in.width >> k, in.height >> k, {}, {}};
  w.image.assign(static_cast<size_t>(w.sw) * w.sh * 3, 0);
  w.depth.assign(static_cast<size_t>(w.sw) * w.sh, 0);
  scale_down_img(in.pixels.data(), in.width, in.height, w.image.data(), w.sw, w.sh);
  scale_down_depth(in.mask.data(), in.width, in.height, w.depth.data(), w.sw, w.sh);
  return w;
}

std::vector<std::pair<int32_t, int32_t>> bands(int32_t h) {
  return {{h / 2, h / 8}, {h / 3, 0}, {0, 2}, {h - 1, h / 4}, {h / 2, h}, {-5, 3}};
}

void add_workspace(Digest& d) {
  d.add(g_scaled_wd), d.add(g_scaled_ht), d.add(all), d.add(resize_ratio);
  const size_t n = static_cast<size_t>(g_scaled_wd) * static_cast<size_t>(g_scaled_ht);
  d.add(g_ssrc == nullptr), d.add(g_sblur == nullptr), d.add(g_tempd == nullptr);
  if (g_ssrc != nullptr) add_bytes(d, g_ssrc, n * 3);
  if (g_tempd != nullptr) add_bytes(d, g_tempd, n);
}

// Everything one image call writes and returns, over the shape's placements.
void digest_image_call(Digest& d, const cat::Export& e, const cat::Rep& rep, const Input& in) {
  const int32_t w = in.width, h = in.height;
  const Pixels texture = pfx::test::random_image(w, h, 99);
  Pixels out(in.pixels.size(), kUntouched);
  const auto fresh = [&] { out.assign(in.pixels.size(), kUntouched); };
  cat::Args a = base(rep, in, out.data(), texture.data());
  switch (e.shape) {
    case Shape::kFull:
    case Shape::kTextureFull: {
      d.add(e.call(a)), d.add(out);
      Pixels in_place = in.pixels;
      a.src = a.dst = in_place.data();
      d.add(e.call(a)), d.add(in_place);
      return;
    }
    case Shape::kPartial:
    case Shape::kTexturePartial:
      for (const cat::Bounds& b : bounds_modes(w, h)) {
        fresh();
        a.bounds = b;
        d.add(e.call(a)), d.add(out);
      }
      return;
    case Shape::kBrush: {
      const int32_t strokes[][3] = {{w / 2, h / 2, 7}, {0, 0, 12},          {w - 1, h - 1, 5},
                                    {-3, h / 3, 9},    {w + 2, 4, 6},       {5, 5, 0},
                                    {5, 5, -4},        {w / 2, h / 2, 200}, {w / 4, h / 4, 1}};
      for (const auto& s : strokes) {
        out = in.pixels;
        a.cx = s[0], a.cy = s[1], a.radius = s[2];
        e.call(a), d.add(out);
      }
      return;
    }
    case Shape::kDab: {
      const int32_t dabs[][3] = {{w / 2, h / 2, 5},  {0, h / 3, 7},         {w - 1, h - 1, 9},
                                 {-4, -3, 8},        {w + 2, h / 2, 4},     {w / 3, h / 4, 0},
                                 {w / 3, 2, -3},     {w / 2, h / 2, 10000}, {w / 4, h - 2, 13},
                                 {3 * w / 4, -1, 6}, {w * 4, h * 4, 2}};
      for (const auto& s : dabs) {
        out = in.pixels;
        a.cx = s[0], a.cy = s[1], a.radius = s[2];
        e.call(a), d.add(out);
      }
      return;
    }
    case Shape::kWarp: {
      const int32_t circles[][3] = {
          {w / 2, h / 2, h / 3}, {3, h - 4, 9}, {w - 1, 0, w}, {w / 3, h / 2, 1}};
      const cat::Bounds windows[] = {{0, w - 1, 0, h - 1},
                                     {w / 5, w - 8, h / 4, h - 3},
                                     {-9, w + 9, -4, h + 40},
                                     {w / 2, w / 2, h / 3, h / 3},
                                     {3, 2, 0, h - 1}};
      for (const auto& c : circles) {
        for (const cat::Bounds& win : windows) {
          for (uint32_t fast : {0u, 1u}) {
            fresh();
            a.cx = c[0], a.cy = c[1], a.radius = c[2], a.bounds = win, a.fast = fast;
            d.add(e.call(a)), d.add(out);
          }
        }
      }
      return;
    }
    case Shape::kMirror:
      for (int32_t pos : {0, 5, h - 1, w - 1, w}) {
        a.pos = pos;
        a.out_width = fx_get_mirror_out_width(w, pos, rep.v[0], rep.v[1]);
        a.out_height = fx_get_mirror_out_height(h, pos, rep.v[0], rep.v[1]);
        Pixels m(static_cast<size_t>(a.out_width) * static_cast<size_t>(a.out_height), kUntouched);
        a.dst = m.data();
        d.add(a.out_width), d.add(a.out_height), d.add(e.call(a)), d.add(m);
      }
      return;
    case Shape::kBlurInit:
    case Shape::kBlurPreview:
      for (const cat::Bounds& b : bounds_modes(w, h)) {
        fresh();
        a.bounds = b;
        if (e.shape == Shape::kBlurInit) {
          e.call(a), add_workspace(d);
        } else {
          fx_Init_blur(a.src, a.mask, w, h, b.left, b.right, b.top, b.bottom);
          e.call(a), d.add(out);
        }
        fx_destroy_blur();
      }
      return;
    case Shape::kTiltInit:
      fx_destroy_blur();
      e.call(a), add_workspace(d), fx_destroy_blur();
      return;
    case Shape::kTilt:
      if (e.has(cat::kWorkspace)) fx_init_tiltshift(a.src, w, h);
      for (const auto& [c, r] : bands(h)) {
        fresh();
        a.centre = c, a.half_height = r;
        e.call(a), d.add(out);
      }
      fx_destroy_blur();
      return;
    case Shape::kScale: {
      const size_t n =
          static_cast<size_t>(w >> (rep.v[0] & 31)) * static_cast<size_t>(h >> (rep.v[0] & 31)) * 3;
      Bytes o(n, 0xA5);
      a.work_out = o.data();
      e.call(a), add_bytes(d, o.data(), o.size());
    }
      return;
    case Shape::kWorking:
    case Shape::kComposite: {
      const Working wk = working_copy(in);
      Bytes o(wk.image.size(), 0xA5);
      a.work = wk.image.data(), a.depth = wk.depth.data(), a.work_out = o.data();
      a.sw = wk.sw, a.sh = wk.sh;
      if (e.shape == Shape::kComposite) {
        Bytes blurred(wk.image.size());
        if (e.name == "run_blur") {
          make_lens_blur(wk.image.data(), blurred.data(), wk.depth.data(), wk.sw, wk.sh, 5);
        } else {
          make_tiltshift(wk.image.data(), blurred.data(), wk.sw, wk.sh);
        }
        a.work = blurred.data();
        if (e.levels.data() == cat::kBand) {
          for (const auto& [c, r] : bands(h)) {
            fresh();
            a.centre = c, a.half_height = r;
            e.call(a), d.add(out);
          }
        } else {
          e.call(a), d.add(out);
        }
        return;
      }
      a.width = wk.sw, a.height = wk.sh;
      if (e.levels.data() == cat::kBand) {
        for (const auto& [c, r] : bands(h)) {
          a.level[0] = c >> (w > 850 ? 2 : 0), a.level[1] = r >> (w > 850 ? 2 : 0);
          e.call(a), add_bytes(d, o.data(), o.size());
        }
      } else {
        e.call(a), add_bytes(d, o.data(), o.size());
      }
      return;
    }
    default:
      ADD_FAILURE() << e.name << ": no placement for its shape";
  }
}

uint64_t digest_call(const cat::Export& e, const cat::Rep& rep) {
  Digest d;
  for (const Input& in : inputs_of(e)) digest_image_call(d, e, rep, in);
  if (e.shape == Shape::kFull && e.levels.empty()) {
    for (const auto& s : kOddSizes) {
      const Input in{"odd", s[0], s[1], pfx::test::random_image(s[0], s[1], 7), {}};
      Pixels out(in.pixels.size(), kUntouched);
      cat::Args a = base(rep, in, out.data(), in.pixels.data());
      d.add(e.call(a)), d.add(out);
    }
  }
  return d.value();
}

// An error word no call writes, so that a call that sets it (33 for a domain error, 34 for a
// range error) or clears it shows.
constexpr int32_t kUnwritten = 77;

// A value function over one argument grid, with the error word each call leaves.
uint64_t digest_range(const cat::Export& e, const cat::Range& r) {
  Digest d;
  const int32_t n = e.arity();
  cat::Args a;
  int64_t at[4] = {r.lo, r.lo, r.lo, r.lo};
  for (;;) {
    for (int i = 0; i < 4; ++i) a.level[i] = static_cast<int32_t>(at[i]);
    pfx::fix_error_word() = kUnwritten;
    d.add(e.call(a));
    if (e.has(cat::kErrorWord)) d.add(pfx::fix_error_word());
    int i = 0;
    while (i < n && (at[i] += r.step) > r.hi) at[i++] = r.lo;
    if (i == n) break;
  }
  return d.value();
}

// Seeded random arguments of every magnitude.
uint64_t digest_random(const cat::Export& e) {
  pfx::test::Rng rng(51);
  Digest d;
  cat::Args a;
  for (int k = 0; k < 20000; ++k) {
    for (int i = 0; i < 4; ++i) {
      a.level[i] = static_cast<int32_t>(k % 4 == i ? rng.word() : rng.word() >> ((k + i) % 31));
    }
    pfx::fix_error_word() = kUnwritten;
    d.add(e.call(a));
    if (e.has(cat::kErrorWord)) d.add(pfx::fix_error_word());
  }
  return d.value();
}

// Every golden of one row: (key, digest).
std::vector<std::pair<std::string, uint64_t>> goldens_of(const cat::Export& e, size_t global) {
  std::vector<std::pair<std::string, uint64_t>> out;
  switch (e.shape) {
    case Shape::kTable: {
      Digest d;
      d.add(static_cast<const uint32_t*>(e.address), e.count);
      out.emplace_back(call_name(e, "table"), d.value());
      return out;
    }
    case Shape::kGlobal: {
      Digest d;
      d.add(kInitialGlobals[global]);
      out.emplace_back(call_name(e, "initial"), d.value());
      return out;
    }
    case Shape::kValue:
      for (const cat::Range& r : e.ranges) {
        std::ostringstream s;
        s << r.lo << ".." << r.hi << "/" << r.step;
        out.emplace_back(call_name(e, s.str()), digest_range(e, r));
      }
      if (e.arity() > 0) out.emplace_back(call_name(e, "random"), digest_random(e));
      return out;
    default:
      break;
  }
  const std::span<const cat::Rep> reps = pfx::test::reps_of(e);
  for (const cat::Rep& rep : reps) {
    uint64_t v = 0;
    if (pfx::test::is_image_call(e.shape)) {
      v = digest_call(e, rep);
    } else {
      Digest d;
      if (e.shape == Shape::kMirrorSize) {
        for (const Input& in : usual_inputs()) {
          for (int32_t pos : {0, 5, in.height - 1, in.width - 1, in.width}) {
            cat::Args a;
            a.width = in.width, a.height = in.height, a.pos = pos;
            a.level[0] = rep.v[0], a.level[1] = rep.v[1];
            d.add(e.call(a));
          }
        }
      } else if (e.shape == Shape::kRelease) {
        const Input in = noise_input();
        fx_Init_blur(in.pixels.data(), in.mask.data(), in.width, in.height, 1, 0, 0, 0);
        e.call({}), add_workspace(d);
        fx_init_tiltshift(in.pixels.data(), in.width, in.height);
        e.call({}), add_workspace(d);
        fx_destroy_blur();
      } else {
        cat::Args a;
        for (int i = 0; i < 4; ++i) a.level[i] = rep.v[i];
        d.add(e.call(a));
      }
      v = d.value();
    }
    out.emplace_back(call_name(e, rep_text(e, rep)), v);
  }
  return out;
}

std::map<std::string, uint64_t> load_goldens() {
  std::map<std::string, uint64_t> g;
  std::ifstream f(std::string(PHOTOFX_TEST_DATA_DIR) + "/goldens.txt");
  std::string line;
  while (std::getline(f, line)) {
    if (line.empty() || line[0] == '#') continue;
    const size_t space = line.find(' ');
    g[line.substr(space + 1)] = std::stoull(line.substr(0, space), nullptr, 16);
  }
  return g;
}

class Conformance : public pfx::test::EveryPath {};

TEST_P(Conformance, EveryExportAtEveryRepresentativeCallMatchesItsGolden) {
  const std::map<std::string, uint64_t> goldens = load_goldens();
  const char* print = std::getenv("PHOTOFX_PRINT_GOLDENS");
  const bool printing = print != nullptr && *print != '\0' && *print != '0';
  if (!printing) {
    ASSERT_FALSE(goldens.empty()) << "missing tests/data/goldens.txt";
  }
  std::set<std::string> used;
  size_t global = 0;
  for (const cat::Export& e : cat::kExports) {
    for (const auto& [key, digest] : goldens_of(e, global)) {
      used.insert(key);
      if (printing) {
        std::printf("%016llx %s\n", static_cast<unsigned long long>(digest), key.c_str());
        continue;
      }
      const auto it = goldens.find(key);
      if (it == goldens.end()) {
        ADD_FAILURE() << "no golden for " << key;
      } else {
        EXPECT_EQ(digest, it->second) << "golden of " << key;
      }
    }
    if (e.shape == Shape::kGlobal) ++global;
  }
  for (const auto& [key, digest] : goldens) {
    EXPECT_TRUE(printing || used.count(key) != 0) << "golden of no call: " << key;
  }
}

INSTANTIATE_TEST_SUITE_P(EveryPath, Conformance, pfx::test::every_path(), pfx::test::path_name);

}  // namespace
