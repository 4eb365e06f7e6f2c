// Shared machinery of the fuzz targets.
//
// Every caller buffer is a Guarded<T>: its elements sit between two guard zones filled with a
// known pattern, so a write outside the buffer shows even where AddressSanitizer's redzones would
// not (inside a larger allocation). Input buffers are compared with a snapshot after each call to
// prove the library never writes into a caller's source or mask. Sizes, levels and bounds are
// drawn from the fuzzer's bytes with a bias toward the edges that break code: zero, negative,
// one past the image, the 32-bit extremes, and images too large to address.
#pragma once

#include <fuzzer/FuzzedDataProvider.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <limits>
#include <vector>

#include "frame/frame.h"

#define FUZZ_CHECK(cond)                                                            \
  do {                                                                              \
    if (!(cond)) {                                                                  \
      std::fprintf(stderr, "%s:%d: check failed: %s\n", __FILE__, __LINE__, #cond); \
      std::abort();                                                                 \
    }                                                                               \
  } while (0)

namespace pfx::fuzz {

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
inline Size pick_size(FuzzedDataProvider& in, int32_t max_side = 24) {
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
inline int32_t pick_level(FuzzedDataProvider& in, int32_t lo = -5, int32_t hi = 120) {
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
inline int32_t pick_coord(FuzzedDataProvider& in, int32_t side) {
  if (in.ConsumeIntegralInRange<int>(0, 9) == 0) {
    return in.PickValueInArray({INT32_MIN, INT32_MAX, INT32_MIN + 1, INT32_MAX - 1});
  }
  const int32_t s = side < 0 ? 0 : (side > 1 << 20 ? 1 << 20 : side);
  return in.ConsumeIntegralInRange<int32_t>(-4, s + 4);
}

inline Rect pick_bounds(FuzzedDataProvider& in, const Size& s) {
  return {pick_coord(in, s.width), pick_coord(in, s.width), pick_coord(in, s.height),
          pick_coord(in, s.height)};
}

// The buffers of one call: a source, a mask and a destination of the chosen size, filled from
// the fuzzer, each sometimes absent (null) to exercise the argument checks.
struct Images {
  Size size;
  Pixels src, dst;
  Mask mask;
  bool null_src, null_dst, null_mask;
  std::vector<uint32_t> src_before;
  std::vector<uint8_t> mask_before;

  // Pixels and mask bytes drawn from the input; an image larger than kTile pixels repeats its
  // first kTile, so that a short input still fills a large image with varied content.
  static constexpr size_t kTile = 1024;

  explicit Images(FuzzedDataProvider& in, int32_t max_side = 24)
      : Images(in, pick_size(in, max_side)) {}

  Images(FuzzedDataProvider& in, Size s)
      : size(s), src(s.pixels, 0x5EC0DE5Eu), dst(s.pixels, 0xD5D5D5D5u), mask(s.pixels, 0x3C) {
    null_src = in.ConsumeIntegralInRange<int>(0, 31) == 0;
    null_dst = in.ConsumeIntegralInRange<int>(0, 31) == 0;
    null_mask = in.ConsumeIntegralInRange<int>(0, 15) == 0;
    const size_t n = size.pixels;
    for (size_t i = 0; i < n; ++i) {
      src.data()[i] = i < kTile ? in.ConsumeIntegral<uint32_t>() : src.data()[i % kTile];
    }
    // Mostly 0 and 1, so that selections are neither empty nor everything.
    for (size_t i = 0; i < n; ++i) {
      if (i >= kTile) {
        mask.data()[i] = mask.data()[i % kTile];
        continue;
      }
      const uint8_t b = in.ConsumeIntegral<uint8_t>();
      mask.data()[i] = b < 100 ? 0 : (b < 230 ? 1 : b);
    }
    src_before = src.contents();
    mask_before = mask.contents();
  }

  const uint32_t* s() const { return null_src ? nullptr : src.data(); }
  uint32_t* d() { return null_dst ? nullptr : dst.data(); }
  const uint8_t* m() const { return null_mask ? nullptr : mask.data(); }

  // Checks after a call that read src and mask and wrote dst.
  void check() const {
    FUZZ_CHECK(src.guards_intact());
    FUZZ_CHECK(dst.guards_intact());
    FUZZ_CHECK(mask.guards_intact());
    FUZZ_CHECK(src.contents() == src_before);
    FUZZ_CHECK(mask.contents() == mask_before);
  }
  // Checks after a call that must not have written anything at all (a refused call).
  void check_untouched(const std::vector<uint32_t>& dst_before) const {
    check();
    FUZZ_CHECK(dst.contents() == dst_before);
  }
};

// A fuzz target is a list of operations; the first byte of the input picks one.
struct Op {
  const char* name;
  void (*run)(FuzzedDataProvider& in);
};

template <size_t N>
int run_one(const Op (&ops)[N], const uint8_t* data, size_t size) {
  FuzzedDataProvider in(data, size);
  const Op& op = ops[in.ConsumeIntegralInRange<size_t>(0, N - 1)];
  op.run(in);
  return 0;
}

}  // namespace pfx::fuzz

namespace pfx::fuzz {

inline bool too_large(const Size& s) { return pixel_count(s.width, s.height) > kMaxPixels; }

// An image with no pixel to visit, or one too large to address: a call writes nothing.
inline bool nothing_to_do(const Size& s) {
  return pixel_count(s.width, s.height) == 0 || too_large(s);
}

// Calls fn(src, dst, w, h, extra...) as a full variant, into dst or in place, and checks the
// buffers. `refused` says whether the call must have written nothing.
template <class Call>
void full_variant(FuzzedDataProvider& in, Call call) {
  Images im(in);
  const std::vector<uint32_t> before = im.dst.contents();
  if (!im.null_src && in.ConsumeBool()) {
    // In place: the destination starts as a copy of the source.
    for (size_t i = 0; i < im.dst.size(); ++i) im.dst.data()[i] = im.src.data()[i];
    call(im.dst.data(), im.dst.data(), im.size, in);
    im.check();
    return;
  }
  call(im.s(), im.d(), im.size, in);
  if (im.null_src || im.null_dst || nothing_to_do(im.size)) {
    im.check_untouched(before);
  } else {
    im.check();
  }
}

// Calls fn(src, mask, dst, w, h, ..., bounds) as a partial variant and checks the buffers.
template <class Call>
void partial_variant(FuzzedDataProvider& in, Call call) {
  Images im(in);
  const Rect b = pick_bounds(in, im.size);
  const std::vector<uint32_t> before = im.dst.contents();
  call(im.s(), im.m(), im.d(), im.size, b, in);
  if (im.null_src || im.null_dst || (is_region(b) && im.null_mask) || nothing_to_do(im.size)) {
    im.check_untouched(before);
  } else {
    im.check();
  }
}

// The shapes most functions take: (src, dst, w, h) and (src, mask, dst, w, h, bounds), with
// or without one level after the size.
template <auto Fn>
void full_level(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider& p) {
    Fn(s, d, z.width, z.height, pick_level(p));
  });
}

template <auto Fn>
void partial_level(FuzzedDataProvider& in) {
  partial_variant(in, [](const uint32_t* s, const uint8_t* m, uint32_t* d, Size z, Rect b,
                         FuzzedDataProvider& p) {
    Fn(s, m, d, z.width, z.height, pick_level(p), b.left, b.right, b.top, b.bottom);
  });
}

template <auto Fn>
void full_plain(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider&) {
    Fn(s, d, z.width, z.height);
  });
}

template <auto Fn>
void partial_plain(FuzzedDataProvider& in) {
  partial_variant(in, [](const uint32_t* s, const uint8_t* m, uint32_t* d, Size z, Rect b,
                         FuzzedDataProvider&) {
    Fn(s, m, d, z.width, z.height, b.left, b.right, b.top, b.bottom);
  });
}

}  // namespace pfx::fuzz
