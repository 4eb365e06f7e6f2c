// Gaussian blur of a working image.
//
// A separable blur with a nine-entry kernel of small integer weights, of which the level uses a
// window of one to nine taps. Samples of the blurred area (depth byte 1) average only with other
// samples of that area: a tap outside it counts as the centre sample itself, so colour from
// outside the area never bleeds in. Taps beyond the image edge are dropped with their weight.
#include "blur/gaussian.h"

#include <cstddef>

#include "frame/dispatch.h"
#include "blur/kernels.h"
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

// Blurs one line: each tap inside the area adds its kernel weight times its channels, each
// other tap in the window stands for the centre sample with weight 9, so the weight is 9..81
// and the result the sum over the weight. All nine taps are summed in registers, and the loop
// vectorises across the line (the outputs are __restrict, so they cannot move the inputs).
void blur_line_loop(int32_t from, int32_t n, const Taps& taps, const uint8_t* c0, const uint8_t* c1,
                    const uint8_t* c2, uint8_t* __restrict o0, uint8_t* __restrict o1,
                    uint8_t* __restrict o2) {
  const Taps t = taps;
  PFX_NO_ALIAS_LOOP
  for (int32_t x = from; x < n; ++x) {
    // Every sum fits 16 bits (channels at most 255 x 55, weights at most 55, counts at most
    // 9), and 16-bit lanes hold twice as many outputs per vector.
    uint16_t inside = 0, outside = 0, s0 = 0, s1 = 0, s2 = 0;
    for (int32_t i = 0; i < kTaps; ++i) {
      const uint16_t d = t.inside[i][x];
      const uint16_t kd = static_cast<uint16_t>(t.k[i] * d);
      inside = static_cast<uint16_t>(inside + kd);
      outside = static_cast<uint16_t>(outside + t.active[i] * (t.present[i][x] - d));
      s0 = static_cast<uint16_t>(s0 + kd * t.v[0][i][x]);
      s1 = static_cast<uint16_t>(s1 + kd * t.v[1][i][x]);
      s2 = static_cast<uint16_t>(s2 + kd * t.v[2][i][x]);
    }
    const int32_t stand_in = 9 * outside;  // the sums and products below stay within 2^32
    const uint32_t r = kBlurReciprocal[inside + stand_in];
    o0[x] = static_cast<uint8_t>((static_cast<uint32_t>(s0 + stand_in * c0[x]) * r) >>
                                 kBlurReciprocalShift);
    o1[x] = static_cast<uint8_t>((static_cast<uint32_t>(s1 + stand_in * c1[x]) * r) >>
                                 kBlurReciprocalShift);
    o2[x] = static_cast<uint8_t>((static_cast<uint32_t>(s2 + stand_in * c2[x]) * r) >>
                                 kBlurReciprocalShift);
  }
}

// A line: through the NEON kernel first where the path has one, the rest by the loop's copy of
// the path in force.
void blur_line(int32_t n, const Taps& taps, const uint8_t* c0, const uint8_t* c1, const uint8_t* c2,
               uint8_t* o0, uint8_t* o1, uint8_t* o2, bool clean) {
  const int32_t done =
      neon_kernels() ? static_cast<int32_t>(neon::blur_line(n, taps, c0, c1, c2, o0, o1, o2, clean))
                     : 0;
  vector_paths([&] { blur_line_loop(done, n, taps, c0, c1, c2, o0, o1, o2); });
}

// Splits a row of red, green, blue samples into three channel rows, and joins them back.
void split_row_loop(const uint8_t* rgb, int32_t n, uint8_t* __restrict r, uint8_t* __restrict g,
                    uint8_t* __restrict b) {
  PFX_NO_ALIAS_LOOP
  for (int32_t x = 0; x < n; ++x) {
    r[x] = rgb[3 * x];
    g[x] = rgb[3 * x + 1];
    b[x] = rgb[3 * x + 2];
  }
}

void split_row(const uint8_t* rgb, int32_t n, uint8_t* r, uint8_t* g, uint8_t* b) {
  vector_paths([&] { split_row_loop(rgb, n, r, g, b); });
}

void join_row_loop(const uint8_t* r, const uint8_t* g, const uint8_t* b, int32_t n,
                   uint8_t* __restrict rgb) {
  PFX_NO_ALIAS_LOOP
  for (int32_t x = 0; x < n; ++x) {
    rgb[3 * x] = r[x];
    rgb[3 * x + 1] = g[x];
    rgb[3 * x + 2] = b[x];
  }
}

void join_row(const uint8_t* r, const uint8_t* g, const uint8_t* b, int32_t n, uint8_t* rgb) {
  vector_paths([&] { join_row_loop(r, g, b, n, rgb); });
}

}  // namespace

// Both passes sum all nine taps of an output at once, across a whole line, with taps outside
// the level's window weighted 0; the division by the weight is a multiplication by its
// reciprocal. The horizontal pass leaves the image as three planes, so that the vertical pass
// reads whole rows of one channel.
bool gaussian_blur(const uint8_t* src, uint8_t* dst, const uint8_t* depth, int32_t width,
                   int32_t height, int32_t level) {
  if (src == nullptr || dst == nullptr) return false;
  const int64_t n = pixel_count(width, height);
  if (n == 0 || n > kMaxPixels) return false;
  // One block: the three planes, a plane of inside flags, and five padded rows holding a source
  // row's presence, inside flags and channels (the last three reused for a row of results).
  constexpr int32_t kPad = 4;
  const int64_t padded = int64_t{width} + 2 * kPad;
  const int64_t bytes = 4 * n + 5 * padded;
  if (bytes > int64_t{UINT32_MAX}) return false;
  auto* block = static_cast<uint8_t*>(fx_malloc(static_cast<uint32_t>(bytes), 1));
  if (block == nullptr) return false;
  const size_t w = static_cast<size_t>(width), pw = static_cast<size_t>(padded);
  const size_t samples = static_cast<size_t>(n);
  uint8_t* plane[3] = {block, block + samples, block + 2 * samples};
  uint8_t* flags = plane[2] + samples;
  uint8_t* present = flags + samples;  // 1 inside the line, 0 in the padding
  uint8_t* inside = present + pw;      // and each padded row likewise: 0 in the padding
  uint8_t* value[3] = {inside + pw, inside + 2 * pw, inside + 3 * pw};
  for (size_t i = 0; i < 5 * pw; ++i) present[i] = 0;
  for (size_t x = 0; x < w; ++x) present[kPad + x] = 1;
  for (size_t i = 0; i < samples; ++i) {
    flags[i] = (depth == nullptr || depth[i] == 1) ? 1 : 0;
  }
  // Rows whose every sample is inside the area, for the vector kernels' shortcut (heights of
  // working images stay within 2048; taller ones simply go without it).
  constexpr int32_t kMaxRows = 2048;
  bool full_row[kMaxRows] = {};
  const bool rows_known = height <= kMaxRows && neon_kernels();
  for (int32_t y = 0; rows_known && y < height; ++y) {
    const uint8_t* f = flags + static_cast<size_t>(y) * w;
    uint8_t all = 1;
    for (size_t x = 0; x < w; ++x) all &= f[x];  // flags are 0 or 1
    full_row[y] = all != 0;
  }

  const Window win = window_for(level);
  Taps taps{};
  // Horizontal pass, into the planes; it reads only src, so dst may be src. Tap t of output x
  // is padded sample x + t, that is offset t - 4.
  for (int32_t i = 0; i < kTaps; ++i) {
    const int32_t o = i - kPad;
    const bool in_window = o >= win.lo && o <= win.hi;
    taps.present[i] = present + i;
    taps.inside[i] = inside + i;
    for (int c = 0; c < 3; ++c) taps.v[c][i] = value[c] + i;
    taps.k[i] = static_cast<uint16_t>(in_window ? kBlurKernel[o < 0 ? -o : o] : 0);
    taps.active[i] = in_window ? 1 : 0;
  }
  for (int32_t y = 0; y < height; ++y) {
    const size_t row = static_cast<size_t>(y) * w;
    const uint8_t* in = src + 3 * row;
    for (size_t x = 0; x < w; ++x) inside[kPad + x] = flags[row + x];
    split_row(in, width, value[0] + kPad, value[1] + kPad, value[2] + kPad);
    blur_line(width, taps, value[0] + kPad, value[1] + kPad, value[2] + kPad, plane[0] + row,
              plane[1] + row, plane[2] + row, rows_known && full_row[y]);
  }

  // Vertical pass, from the planes into dst, a row of outputs at a time. Rows beyond the edge
  // drop out whole; they are pointed at the centre row only to keep every read in bounds.
  const uint8_t* every = present + kPad;
  for (int32_t y = 0; y < height; ++y) {
    bool clean = rows_known;
    for (int32_t i = 0; i < kTaps; ++i) {
      const int32_t o = i - kPad;
      const bool used = o >= win.lo && o <= win.hi && y + o >= 0 && y + o < height;
      const size_t row = static_cast<size_t>(used ? y + o : y) * w;
      taps.present[i] = every;
      taps.inside[i] = flags + row;
      for (int c = 0; c < 3; ++c) taps.v[c][i] = plane[c] + row;
      taps.k[i] = static_cast<uint16_t>(used ? kBlurKernel[o < 0 ? -o : o] : 0);
      taps.active[i] = used ? 1 : 0;
      if (used && clean) clean = full_row[y + o];
    }
    const size_t row = static_cast<size_t>(y) * w;
    blur_line(width, taps, plane[0] + row, plane[1] + row, plane[2] + row, value[0], value[1],
              value[2], clean);
    join_row(value[0], value[1], value[2], width, dst + 3 * row);
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
