// Gaussian blur of a working image.
//
// A separable blur with a nine-entry kernel of small integer weights, of which the level uses a
// window of one to nine taps. Samples of the blurred area (depth byte 1) average only with other
// samples of that area: a tap outside it counts as the centre sample itself, so colour from
// outside the area never bleeds in. Taps beyond the image edge are dropped with their weight.
#include "blur/gaussian.h"

#include <cstddef>

#include "frame/dispatch.h"
#include "frame/frame.h"
#include "photofx.h"

namespace pfx {

constinit const int32_t kBlurKernel[5] = {9, 8, 7, 5, 3};

namespace {

// Tap offsets lo..hi of a level. Odd levels lean one tap toward negative offsets. The level is
// taken as unsigned, so negative levels also mean the widest window.
struct Window {
  int32_t lo, hi;
};

constexpr Window window_for(int32_t level) {
  const uint32_t l =
      static_cast<uint32_t>(level) > 7u ? uint32_t{kWidestBlurLevel} : static_cast<uint32_t>(level);
  return {-static_cast<int32_t>((l + 1) / 2), static_cast<int32_t>(l / 2)};
}

// Running sums of one line of outputs, every channel and the weights, a tap at a time.
struct Sums {
  int32_t* inside;   // kernel weight of the taps inside the area
  int32_t* outside;  // count of taps in the image but outside the area
  int32_t* channel[3];
};

// Adds one tap to every output of a line: `present` is 1 where the tap lies in the image, `in`
// 1 where it lies inside the area, v0..v2 hold its channels. The first tap sets the sums instead
// of adding to them. The sums are separate arrays, as __restrict tells the compiler, so the
// loop vectorises across the line.
PFX_VECTOR_CLONES void add_tap(int32_t n, int32_t k, bool first, const uint8_t* present,
                               const uint8_t* in, const uint8_t* v0, const uint8_t* v1,
                               const uint8_t* v2, int32_t* __restrict inside,
                               int32_t* __restrict outside, int32_t* __restrict s0,
                               int32_t* __restrict s1, int32_t* __restrict s2) {
  if (first) {
    for (int32_t x = 0; x < n; ++x) inside[x] = outside[x] = s0[x] = s1[x] = s2[x] = 0;
  }
  for (int32_t x = 0; x < n; ++x) {
    const int32_t d = in[x];
    const int32_t kd = k * d;
    inside[x] += kd;
    outside[x] += present[x] - d;
    s0[x] += kd * v0[x];
    s1[x] += kd * v1[x];
    s2[x] += kd * v2[x];
  }
}

void add_tap(const Sums& s, int32_t n, int32_t k, bool first, const uint8_t* present,
             const uint8_t* in, const uint8_t* const v[3]) {
  add_tap(n, k, first, present, in, v[0], v[1], v[2], s.inside, s.outside, s.channel[0],
          s.channel[1], s.channel[2]);
}

// Each tap outside the area stands for the centre sample with weight 9, so the weight is 9..81.
// Replaces the weights of a line by their reciprocals and the outside counts by the centre's
// share (a table lookup per output, shared by the three channels).
void weigh_line(const Sums& s, int32_t n) {
  for (int32_t x = 0; x < n; ++x) {
    const int32_t stand_in = 9 * s.outside[x];
    s.inside[x] = static_cast<int32_t>(kBlurReciprocal[s.inside[x] + stand_in]);
    s.outside[x] = stand_in;
  }
}

// One blurred channel of a weighed line, from the channel's sums and centre samples.
PFX_VECTOR_CLONES void finish_channel(int32_t n, const int32_t* __restrict reciprocal,
                                      const int32_t* __restrict stand_in,
                                      const int32_t* __restrict sum, const uint8_t* centre,
                                      uint8_t* __restrict out) {
  for (int32_t x = 0; x < n; ++x) {
    const uint32_t total = static_cast<uint32_t>(sum[x] + stand_in[x] * centre[x]);
    out[x] = static_cast<uint8_t>((total * static_cast<uint32_t>(reciprocal[x])) >>
                                  kBlurReciprocalShift);
  }
}

void finish_line(const Sums& s, int32_t n, const uint8_t* const centre[3], uint8_t* const out[3]) {
  weigh_line(s, n);
  for (int c = 0; c < 3; ++c) {
    finish_channel(n, s.inside, s.outside, s.channel[c], centre[c], out[c]);
  }
}

}  // namespace

// Both passes sum the taps of whole lines at a time: the tap offset is fixed across a line, so
// each tap is one pass of multiply-adds the compiler vectorises, and the division becomes a
// multiplication by the weight's reciprocal. The horizontal pass leaves the image as three
// planes, so that the vertical pass reads whole rows of one channel.
bool gaussian_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
                   int32_t height, int32_t level) {
  if (src == nullptr || dst == nullptr) return false;
  const int64_t n = pixel_count(width, height);
  if (n == 0 || n > kMaxPixels) return false;
  // One block: five sum rows, the three planes, a plane of inside flags, and five padded rows
  // holding a source row's presence, inside flags and channels.
  constexpr int32_t kPad = 4;
  const int64_t padded = int64_t{width} + 2 * kPad;
  const int64_t bytes = 20 * int64_t{width} + 4 * n + 5 * padded;
  if (bytes > int64_t{UINT32_MAX}) return false;
  auto* block = static_cast<uint8_t*>(fx_malloc(static_cast<uint32_t>(bytes), 1));
  if (block == nullptr) return false;
  const size_t w = static_cast<size_t>(width), pw = static_cast<size_t>(padded);
  const size_t samples = static_cast<size_t>(n);
  int32_t* sums = reinterpret_cast<int32_t*>(block);
  const Sums s{sums, sums + w, {sums + 2 * w, sums + 3 * w, sums + 4 * w}};
  uint8_t* plane[3] = {block + 20 * w, block + 20 * w + samples, block + 20 * w + 2 * samples};
  uint8_t* flags = plane[2] + samples;
  uint8_t* present = flags + samples;  // 1 inside the line, 0 in the padding
  uint8_t* inside = present + pw;      // and each padded row likewise: 0 in the padding
  uint8_t* value[3] = {inside + pw, inside + 2 * pw, inside + 3 * pw};
  for (size_t i = 0; i < 5 * pw; ++i) present[i] = 0;
  for (size_t x = 0; x < w; ++x) present[kPad + x] = 1;
  for (size_t i = 0; i < samples; ++i) {
    flags[i] = (depth == nullptr || depth[i] == 1) ? 1 : 0;
  }

  const Window win = window_for(level);
  // Horizontal pass, into the planes; it reads only src, so dst may be src.
  for (int32_t y = 0; y < height; ++y) {
    const size_t row = static_cast<size_t>(y) * w;
    const uint8_t* in = src + 3 * row;
    for (size_t x = 0; x < w; ++x) {
      inside[kPad + x] = flags[row + x];
      for (int c = 0; c < 3; ++c) value[c][kPad + x] = in[3 * x + c];
    }
    for (int32_t o = win.lo; o <= win.hi; ++o) {
      const uint8_t* v[3] = {value[0] + kPad + o, value[1] + kPad + o, value[2] + kPad + o};
      add_tap(s, width, kBlurKernel[o < 0 ? -o : o], o == win.lo, present + kPad + o,
              inside + kPad + o, v);
    }
    const uint8_t* centre[3] = {value[0] + kPad, value[1] + kPad, value[2] + kPad};
    uint8_t* out[3] = {plane[0] + row, plane[1] + row, plane[2] + row};
    finish_line(s, width, centre, out);
  }

  // Vertical pass, from the planes into dst, a row of outputs at a time.
  const uint8_t* every = present + kPad;
  for (int32_t y = 0; y < height; ++y) {
    // Rows beyond the edge drop out whole; the centre row is always there.
    const int32_t lo = y + win.lo < 0 ? -y : win.lo;
    const int32_t hi = y + win.hi >= height ? height - 1 - y : win.hi;
    for (int32_t o = lo; o <= hi; ++o) {
      const size_t row = static_cast<size_t>(y + o) * w;
      const uint8_t* v[3] = {plane[0] + row, plane[1] + row, plane[2] + row};
      add_tap(s, width, kBlurKernel[o < 0 ? -o : o], o == lo, every, flags + row, v);
    }
    const size_t row = static_cast<size_t>(y) * w;
    const uint8_t* centre[3] = {plane[0] + row, plane[1] + row, plane[2] + row};
    uint8_t* out[3] = {value[0], value[1], value[2]};
    finish_line(s, width, centre, out);
    uint8_t* rgb = dst + 3 * row;
    for (size_t x = 0; x < w; ++x) {
      for (int c = 0; c < 3; ++c) rgb[3 * x + c] = value[c][x];
    }
  }
  fx_free(block);
  return true;
}

}  // namespace pfx

extern "C" {

void make_gaussian_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
                        int32_t height, int32_t level) {
  // Called directly, the depth map is part of the contract; only the tilt-shift blur goes
  // without one.
  if (depth == nullptr) return;
  pfx::gaussian_blur(src, dst, depth, width, height, level);
}

}  // extern "C"
