// Fuzz target: every export of the catalogue, in sequences of up to four calls.
//
// The input picks a row and everything its call takes: sizes (empty, negative, unaddressable),
// levels in and around their ranges, bounds, centres and radii, mirror sizes, tilt-shift bands,
// working images, buffers that are missing, and in-place calls. Sequences reach the workspace
// calls in every order (init, previews, one-shot calls and destroys of both kinds). After each
// call: no buffer was written outside its bounds, the caller's source, mask, texture and working
// inputs are as they were, a call refused by the common frame wrote nothing, and the workspace
// globals describe one workspace or none. Every input starts and ends with the module as a fresh
// load has it.
#include <fuzzer/FuzzedDataProvider.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <vector>

#include "catalog/exports.h"
#include "frame/frame.h"

#define FUZZ_CHECK(cond)                                                            \
  do {                                                                              \
    if (!(cond)) {                                                                  \
      std::fprintf(stderr, "%s:%d: check failed: %s\n", __FILE__, __LINE__, #cond); \
      std::abort();                                                                 \
    }                                                                               \
  } while (0)

namespace {

using pfx::pixel_count;
using pfx::Rect;

template <class T>
class Guarded {
 public:
  static constexpr size_t kGuard = 32;

  Guarded(size_t n, T pattern) : n_(n), pattern_(pattern), store_(n + 2 * kGuard, pattern) {}

  T* data() { return store_.data() + kGuard; }
  const T* data() const { return store_.data() + kGuard; }
  size_t size() const { return n_; }

  void fill(FuzzedDataProvider& in) {
    for (size_t i = 0; i < n_; ++i) data()[i] = in.ConsumeIntegral<T>();
  }
  std::vector<T> contents() const { return std::vector<T>(data(), data() + n_); }

  bool guards_intact() const {
    for (size_t i = 0; i < kGuard; ++i) {
      if (store_[i] != pattern_ || store_[kGuard + n_ + i] != pattern_) return false;
    }
    return true;
  }

 private:
  size_t n_;
  T pattern_;
  std::vector<T> store_;
};

using Pixels = Guarded<uint32_t>;
using Mask = Guarded<uint8_t>;

struct Size {
  int32_t width, height;
  size_t pixels;  // elements the caller's buffers hold
};

// Mostly small images, sometimes empty or negative, sometimes a size whose pixel count no
// library buffer could hold or a side at the negative end of 32 bits (the library must refuse
// either without touching the small buffer it is given).
Size pick_size(FuzzedDataProvider& in, int32_t max_side = 24) {
  if (in.ConsumeIntegralInRange<int>(0, 15) == 0) {
    static constexpr int32_t kExtreme[][2] = {
        {65536, 65536},         {INT32_MAX, 2},        {2, INT32_MAX}, {46341, 46341},
        {INT32_MAX, INT32_MAX}, {INT32_MIN, 3},        {3, INT32_MIN}, {INT32_MIN, INT32_MIN},
        {-65536, 65536},        {INT32_MIN, INT32_MAX}};
    const auto& s = kExtreme[in.ConsumeIntegralInRange<size_t>(0, 9)];
    // A few pixels where the size claims too many; none where it claims none.
    return {s[0], s[1], pixel_count(s[0], s[1]) == 0 ? size_t{0} : size_t{16}};
  }
  const int32_t w = in.ConsumeIntegralInRange<int32_t>(-2, max_side);
  const int32_t h = in.ConsumeIntegralInRange<int32_t>(-2, max_side);
  return {w, h, static_cast<size_t>(pixel_count(w, h))};
}

// A level: usually near the slider range, sometimes anywhere in 32 bits.
int32_t pick_level(FuzzedDataProvider& in, int32_t lo = -5, int32_t hi = 120) {
  switch (in.ConsumeIntegralInRange<int>(0, 7)) {
    case 0:
      return in.ConsumeIntegral<int32_t>();
    case 1:
      return in.PickValueInArray({INT32_MIN, INT32_MAX, -1, 0, 1});
    default:
      return in.ConsumeIntegralInRange<int32_t>(lo, hi);
  }
}

// A coordinate around an image side: inside, just outside, or a 32-bit extreme.
int32_t pick_coord(FuzzedDataProvider& in, int32_t side) {
  if (in.ConsumeIntegralInRange<int>(0, 9) == 0) {
    return in.PickValueInArray({INT32_MIN, INT32_MAX, INT32_MIN + 1, INT32_MAX - 1});
  }
  const int32_t s = side < 0 ? 0 : (side > 1 << 20 ? 1 << 20 : side);
  return in.ConsumeIntegralInRange<int32_t>(-4, s + 4);
}

Rect pick_bounds(FuzzedDataProvider& in, const Size& s) {
  return {pick_coord(in, s.width), pick_coord(in, s.width), pick_coord(in, s.height),
          pick_coord(in, s.height)};
}

namespace cat = pfx::catalog;
using Bytes = Guarded<uint8_t>;

std::vector<const cat::Export*> callable() {
  std::vector<const cat::Export*> rows;
  for (const cat::Export& e : cat::kExports) {
    if (e.call != nullptr) rows.push_back(&e);
  }
  return rows;
}

// Near the level's range, sometimes anywhere in 32 bits.
int32_t pick_arg(FuzzedDataProvider& in, const cat::Level& l) {
  const int64_t span = int64_t{l.hi} - l.lo;
  if (span > 100000) return pick_level(in);
  return pick_level(in, static_cast<int32_t>(l.lo - 2),
                    static_cast<int32_t>(int64_t{l.hi} + 2 > INT32_MAX ? INT32_MAX : l.hi + 2));
}

// Elements a buffer of the size needs, or a token buffer for a size no call may use.
size_t affordable(int64_t n) { return n >= 0 && n <= 4096 ? static_cast<size_t>(n) : 16; }

bool frame_refuses(const cat::Export& e, const cat::Args& a) {
  const bool partial = e.shape == cat::Shape::kPartial || e.shape == cat::Shape::kTexturePartial;
  const bool region = a.bounds.left <= a.bounds.right && a.bounds.top <= a.bounds.bottom;
  const int64_t n = pfx::pixel_count(a.width, a.height);
  return a.src == nullptr || a.dst == nullptr || (partial && region && a.mask == nullptr) ||
         n == 0 || n > pfx::kMaxPixels;
}

void one_call(FuzzedDataProvider& in, const cat::Export& e) {
  const Size s = pick_size(in);
  Pixels src(s.pixels, 0x5EC0DE5Eu), dst(s.pixels, 0xD5D5D5D5u), texture(s.pixels, 0x7E7E7E7Eu);
  Mask mask(s.pixels, 0x3C);
  src.fill(in);
  texture.fill(in);
  for (size_t i = 0; i < s.pixels; ++i) mask.data()[i] = in.PickValueInArray<uint8_t>({0, 1, 1, 2});
  cat::Args a;
  a.width = s.width, a.height = s.height;
  for (size_t i = 0; i < e.levels.size() && i < 4; ++i) a.level[i] = pick_arg(in, e.levels[i]);
  a.real = in.PickValueInArray({0.77, 1.0, 0.0, -2.5, 9.5, 1e300});
  const pfx::Rect b = pick_bounds(in, s);
  a.bounds = {b.left, b.right, b.top, b.bottom};
  a.cx = pick_coord(in, s.width), a.cy = pick_coord(in, s.height);
  a.radius = pick_level(in, -3, 40), a.fast = in.ConsumeIntegralInRange<uint32_t>(0, 2);
  a.centre = pick_coord(in, s.height), a.half_height = pick_level(in, -2, 30);
  a.pos = pick_coord(in, a.level[1] == MIRROR_VERTICAL ? s.height : s.width);
  a.out_width = fx_get_mirror_out_width(s.width, a.pos, a.level[0], a.level[1]);
  a.out_height = fx_get_mirror_out_height(s.height, a.pos, a.level[0], a.level[1]);
  if (in.ConsumeIntegralInRange<int>(0, 7) == 0) a.out_width = pick_coord(in, a.out_width);
  Pixels mirrored(affordable(pfx::pixel_count(a.out_width, a.out_height)), 0xD5D5D5D5u);
  // Working images: of the image's own size for the kernels, of a picked size for compositing.
  a.sw = pick_level(in, -1, 26), a.sh = pick_level(in, -1, 26);
  const bool composite = e.shape == cat::Shape::kComposite;
  const size_t samples = composite ? affordable(pfx::pixel_count(a.sw, a.sh)) : s.pixels;
  Bytes work(samples * 3, 0x11), work_out(s.pixels * 3, 0x22), depth(samples, 0x33);
  work.fill(in);
  depth.fill(in);
  const auto absent = [&] { return in.ConsumeIntegralInRange<int>(0, 31) == 0; };
  a.src = absent() ? nullptr : src.data();
  a.dst = absent() ? nullptr : (e.shape == cat::Shape::kMirror ? mirrored.data() : dst.data());
  a.mask = absent() ? nullptr : mask.data();
  a.texture = absent() ? nullptr : texture.data();
  a.work = work.data(), a.work_out = work_out.data(), a.depth = absent() ? nullptr : depth.data();
  const bool in_place = (e.shape == cat::Shape::kFull || e.shape == cat::Shape::kTextureFull) &&
                        a.src != nullptr && a.dst != nullptr && in.ConsumeBool();
  if (in_place) a.src = a.dst = src.data();

  const std::vector<uint32_t> src_before = src.contents(), dst_before = dst.contents();
  const std::vector<uint8_t> mask_before = mask.contents(), work_before = work.contents();
  const std::vector<uint8_t> depth_before = depth.contents();
  e.call(a);

  FUZZ_CHECK(src.guards_intact() && dst.guards_intact() && texture.guards_intact());
  FUZZ_CHECK(mask.guards_intact() && mirrored.guards_intact());
  FUZZ_CHECK(work.guards_intact() && work_out.guards_intact() && depth.guards_intact());
  FUZZ_CHECK(mask.contents() == mask_before && work.contents() == work_before);
  FUZZ_CHECK(depth.contents() == depth_before);
  const bool edits_in_place =
      in_place || e.shape == cat::Shape::kBrush || e.shape == cat::Shape::kDab;
  if (!edits_in_place) FUZZ_CHECK(src.contents() == src_before);
  const bool frame = e.shape == cat::Shape::kFull || e.shape == cat::Shape::kPartial ||
                     e.shape == cat::Shape::kTexturePartial;
  if (frame && !in_place && frame_refuses(e, a)) FUZZ_CHECK(dst.contents() == dst_before);
  // One workspace or none: the source and blurred working images come and go together.
  FUZZ_CHECK((g_ssrc == nullptr) == (g_sblur == nullptr));
}

void reset_module() {
  fx_destroy_blur();
  g_scaled_wd = g_scaled_ht = all = resize_ratio = 0;
  g_HDR_Threshold = 70, g_HDR_CutOff = 100, g_HDR_Weight1 = 1000, g_HDR_Weight2 = 5120;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  static const std::vector<const cat::Export*> rows = callable();
  FuzzedDataProvider in(data, size);
  const int calls = in.ConsumeIntegralInRange<int>(1, 4);
  for (int i = 0; i < calls && in.remaining_bytes() > 0; ++i) {
    one_call(in, *rows[in.ConsumeIntegralInRange<size_t>(0, rows.size() - 1)]);
  }
  reset_module();
  return 0;
}
