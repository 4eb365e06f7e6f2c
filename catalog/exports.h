// The catalogue of the library's exports: one row for every function, table and module variable
// that include/photofx.h declares and the shared library exports.
//
// A row says how the export is called (its shape), calls it from one argument struct (its thunk),
// names its levels with their ranges, lists the arguments that make representative calls, and
// says what else the call needs or does: a result code, a mask even in whole-image mode, module
// state (blur workspace, auto-adjust parameters, error word), scratch memory. Whatever repeats
// that knowledge derives from this table instead of spelling it out again: the conformance
// goldens, the bad-input and allocation-failure tables, the thread test, the fuzz target, the
// list of exported names and the benchmark suite. Adding an export is its header line, its
// code and its row here.
//
// The table is constexpr and uses only the public header, so the benchmarks (which link the
// shared library as a host does) read it as well as the tests. Rows are found by name with
// find() or, at compile time, with index_of().
#pragma once

#include <array>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <span>
#include <string_view>
#include <type_traits>
#include <utility>

#include "photofx.h"

namespace pfx::catalog {

// How an export is called; the thunk maps Args onto these argument lists.
enum class Shape : uint8_t {
  kFull,            // (src, dst, width, height, levels...)
  kPartial,         // (src, mask, dst, width, height, levels..., left, right, top, bottom)
  kTextureFull,     // (src, dst, texture, width, height)
  kTexturePartial,  // (src, dst, texture, mask, width, height, left, right, top, bottom)
  kBrush,           // (dst, cx, cy, width, height, strength, radius), in place
  kDab,             // (dst, width, height, [shift,] cx, cy, radius), in place
  kWarp,            // (src, dst, width, height, cx, cy, radius, level, bounds..., fast)
  kMirror,          // (src, width, height, dst, out_width, out_height, pos, mode, axis)
  kMirrorSize,      // (width or height, pos, mode, axis) -> the mirrored side
  kBlurInit,        // (src, mask, width, height, bounds...): builds the blur workspace
  kBlurPreview,     // (src, mask, dst, width, height, level), from the blur workspace
  kTiltInit,        // (src, width, height): builds the tilt-shift workspace
  kTilt,            // (src, dst, width, height, centre, half_height)
  kRelease,         // (): releases a workspace
  kScale,           // (src or mask, width, height, work_out, sw, sh), sw = width >> level
  kWorking,         // (work, work_out, [depth,] width, height, levels...) on a working image
  kComposite,       // a blurred working image scaled up into dst
  kSetter,          // fx_set_hdr
  kValue,           // (levels...) -> a value: maths, packing, getters
  kMemory,          // the memory wrappers
  kTable,           // a constant table
  kGlobal,          // a module variable
};

// What a call needs or does besides its arguments.
enum Need : uint16_t {
  kReturnsCode = 1 << 0,      // returns PHOTOFX_SUCCESS or a failure code
  kMaskEveryMode = 1 << 1,    // refuses a null mask even when the bounds mean the whole image
  kWorkspace = 1 << 2,        // reads or writes the blur and tilt-shift workspace globals
  kAutoParameters = 1 << 3,   // reads the four auto-adjust parameters
  kErrorWord = 1 << 4,        // writes the fixed-point error word
  kAllocates = 1 << 5,        // allocates scratch memory (at some sizes)
  kDegradesWithout = 1 << 6,  // without its scratch it still writes (auto adjust divides)
  kEntryPoint = 1 << 7,       // a camelCase entry point that forwards to an fx_ implementation
};

constexpr int64_t kNoCode = -1;  // what a call that returns nothing reports

struct Bounds {
  int32_t left, right, top, bottom;
};

// Everything any export takes. A thunk reads the fields its shape uses.
struct Args {
  const uint32_t* src = nullptr;
  const uint8_t* mask = nullptr;
  uint32_t* dst = nullptr;
  const uint32_t* texture = nullptr;
  int32_t width = 0, height = 0;
  int32_t level[4] = {};
  double real = 0;                     // control_gamma's gamma
  Bounds bounds{1, 0, 0, 0};           // whole-image mode
  int32_t cx = 0, cy = 0, radius = 0;  // brushes, dabs and the circle warps
  uint32_t fast = 0;
  int32_t pos = 0, out_width = 0, out_height = 0;  // mirror
  int32_t centre = 0, half_height = 0;             // tilt-shift band
  const uint8_t* work = nullptr;  // a working image (3 bytes a sample) and its depth map
  uint8_t* work_out = nullptr;
  const uint8_t* depth = nullptr;
  int32_t sw = 0, sh = 0;  // working size, for the compositing calls
};

using Thunk = int64_t (*)(const Args&);

// A level: its name and the range the library accepts or means (values beyond are defined too).
struct Level {
  std::string_view name;
  int32_t lo, hi, neutral;
};

// The levels (and, for control_gamma, the real) of one representative call.
struct Rep {
  int32_t v[4] = {};
  double real = 0;
};

// For value functions: every argument runs lo..hi by step (a grid over all arguments).
struct Range {
  int64_t lo, hi, step;
};

struct Export {
  std::string_view name;
  Shape shape;
  Thunk call = nullptr;
  std::span<const Level> levels = {};
  std::span<const Rep> reps = {};  // reps[0] is the typical call: it changes a picture
  uint16_t needs = 0;
  std::span<const Range> ranges = {};
  const void* address = nullptr;  // tables and globals
  size_t count = 0;               // entries of a table
  size_t entry_size = 0;

  bool has(Need n) const { return (needs & n) != 0; }
  int32_t arity() const { return static_cast<int32_t>(levels.size()); }
  // Touches module state, so it may not run alongside other calls.
  bool stateful() const { return (needs & (kWorkspace | kAutoParameters | kErrorWord)) != 0; }
};

// ---- Thunks ----------------------------------------------------------------------------------

namespace detail {

template <class T>
struct Arity;
template <class R, class... A>
struct Arity<R (*)(A...)> {
  static constexpr size_t value = sizeof...(A);
};
template <auto F>
constexpr size_t kArity = Arity<decltype(F)>::value;

template <class Call>
int64_t result(Call&& call) {
  if constexpr (std::is_void_v<decltype(call())>) {
    call();
    return kNoCode;
  } else {
    return static_cast<int64_t>(call());
  }
}

template <auto F, size_t... I>
int64_t full(const Args& a, std::index_sequence<I...>) {
  return result([&] { return F(a.src, a.dst, a.width, a.height, a.level[I]...); });
}

template <auto F, size_t... I>
int64_t partial(const Args& a, std::index_sequence<I...>) {
  const Bounds& b = a.bounds;
  return result([&] {
    return F(a.src, a.mask, a.dst, a.width, a.height, a.level[I]..., b.left, b.right, b.top,
             b.bottom);
  });
}

template <auto F, size_t... I>
int64_t value(const Args& a, std::index_sequence<I...>) {
  return result([&] { return F(a.level[I]...); });
}

}  // namespace detail

template <auto F>
int64_t full(const Args& a) {
  return detail::full<F>(a, std::make_index_sequence<detail::kArity<F> - 4>{});
}

template <auto F>
int64_t partial(const Args& a) {
  return detail::partial<F>(a, std::make_index_sequence<detail::kArity<F> - 9>{});
}

template <auto F>
int64_t value(const Args& a) {
  return detail::value<F>(a, std::make_index_sequence<detail::kArity<F>>{});
}

template <auto F>
int64_t texture_full(const Args& a) {
  return detail::result([&] { return F(a.src, a.dst, a.texture, a.width, a.height); });
}

template <auto F>
int64_t texture_partial(const Args& a) {
  const Bounds& b = a.bounds;
  return detail::result([&] {
    return F(a.src, a.dst, a.texture, a.mask, a.width, a.height, b.left, b.right, b.top, b.bottom);
  });
}

template <auto F>
int64_t brush(const Args& a) {
  F(a.dst, a.cx, a.cy, a.width, a.height, a.level[0], a.radius);
  return kNoCode;
}

template <auto F>
int64_t dab(const Args& a) {
  if constexpr (detail::kArity<F> == 7) {
    F(a.dst, a.width, a.height, a.level[0], a.cx, a.cy, a.radius);
  } else {
    F(a.dst, a.width, a.height, a.cx, a.cy, a.radius);
  }
  return kNoCode;
}

template <auto F>
int64_t warp(const Args& a) {
  const Bounds& b = a.bounds;
  return detail::result([&] {
    return F(a.src, a.dst, a.width, a.height, a.cx, a.cy, a.radius, a.level[0], b.left, b.right,
             b.top, b.bottom, a.fast);
  });
}

template <auto F>
int64_t mirror(const Args& a) {
  return F(a.src, a.width, a.height, a.dst, a.out_width, a.out_height, a.pos, a.level[0],
           a.level[1]);
}

template <auto F, bool kHeight>
int64_t mirror_size(const Args& a) {
  return F(kHeight ? a.height : a.width, a.pos, a.level[0], a.level[1]);
}

template <auto F>
int64_t blur_init(const Args& a) {
  F(a.src, a.mask, a.width, a.height, a.bounds.left, a.bounds.right, a.bounds.top, a.bounds.bottom);
  return kNoCode;
}

inline int64_t blur_preview(const Args& a) {
  fx_make_blur_preview(a.src, a.mask, a.dst, a.width, a.height, a.level[0]);
  return kNoCode;
}

template <auto F>
int64_t tilt_init(const Args& a) {
  F(a.src, a.width, a.height);
  return kNoCode;
}

template <auto F>
int64_t tilt(const Args& a) {
  F(a.src, a.dst, a.width, a.height, a.centre, a.half_height);
  return kNoCode;
}

template <auto F>
int64_t release(const Args&) {
  F();
  return kNoCode;
}

// Reduces by 2^level per side, as the workspace does.
template <auto F, bool kDepth>
int64_t scale(const Args& a) {
  const int32_t k = a.level[0] & 31;
  if constexpr (kDepth) {
    F(a.mask, a.width, a.height, a.work_out, a.width >> k, a.height >> k);
  } else {
    F(a.src, a.width, a.height, a.work_out, a.width >> k, a.height >> k);
  }
  return kNoCode;
}

template <auto F>
int64_t working(const Args& a) {
  if constexpr (detail::kArity<F> == 6 && std::is_same_v<decltype(F), decltype(&make_lens_blur)>) {
    F(a.work, a.work_out, a.depth, a.width, a.height, a.level[0]);
  } else if constexpr (detail::kArity<F> == 6) {
    F(a.work, a.work_out, a.width, a.height, a.level[0], a.level[1]);
  } else {
    F(a.work, a.work_out, a.width, a.height);
  }
  return kNoCode;
}

// run_blur reads the module's whole-image flag: the first level sets it for the call.
inline int64_t run_blur_call(const Args& a) {
  const int32_t saved = all;
  all = a.level[0];
  run_blur(a.src, a.work, a.mask, a.depth, a.dst, a.width, a.height, a.sw, a.sh);
  all = saved;
  return kNoCode;
}

inline int64_t restore_tiltshift_call(const Args& a) {
  restore_tiltshift(a.src, a.work, a.dst, a.width, a.height, a.sw, a.sh, a.centre, a.half_height);
  return kNoCode;
}

// Auto adjust and downlight under the four parameters of the call's levels (0 keeps a
// parameter as it is), which are put back afterwards.
template <int64_t (*Call)(const Args&)>
int64_t with_parameters(const Args& a) {
  const int32_t saved[4] = {g_HDR_Threshold, g_HDR_CutOff, g_HDR_Weight1, g_HDR_Weight2};
  if (a.level[0] != 0 || a.level[1] != 0 || a.level[2] != 0 || a.level[3] != 0) {
    fx_set_hdr(a.level[0], a.level[1], a.level[2], a.level[3]);
  }
  const int64_t code = Call(a);
  g_HDR_Threshold = saved[0], g_HDR_CutOff = saved[1];
  g_HDR_Weight1 = saved[2], g_HDR_Weight2 = saved[3];
  return code;
}

// The parameters fx_set_hdr leaves, read back through the getters, packed into one value.
inline int64_t set_hdr(const Args& a) {
  const int32_t saved[4] = {g_HDR_Threshold, g_HDR_CutOff, g_HDR_Weight1, g_HDR_Weight2};
  fx_set_hdr(a.level[0], a.level[1], a.level[2], a.level[3]);
  const int64_t v = (int64_t{fx_get_threshold_hdr()} << 48) ^ (int64_t{fx_get_cutoff_hdr()} << 32) ^
                    (int64_t{fx_get_weight1_hdr()} << 16) ^ fx_get_weight2_hdr();
  g_HDR_Threshold = saved[0], g_HDR_CutOff = saved[1];
  g_HDR_Weight1 = saved[2], g_HDR_Weight2 = saved[3];
  return v;
}

inline int64_t gamma(const Args& a) {
  control_gamma(a.src, a.dst, a.width, a.height, a.level[0], a.real);
  return kNoCode;
}

inline int64_t unpack(const Args& a) {
  int32_t r = -1, g = -1, b = -1;
  fx_unpack_rgb888(a.level[0], &r, &g, &b);
  return (int64_t{r} << 32) ^ (int64_t{g} << 16) ^ b;
}

inline int64_t pack(const Args& a) {
  return fx_pack_rgb888(static_cast<uint32_t>(a.level[0]), a.level[1], a.level[2], a.level[3]);
}

template <auto F>
int64_t three_out(const Args& a) {
  int32_t x = -1, y = -1, z = -1;
  F(a.level[0], a.level[1], a.level[2], &x, &y, &z);
  return (int64_t{x} << 40) ^ (int64_t{y} << 16) ^ z;
}

inline int64_t to_fixed(const Args& a) { return ftofix(a.level[0] / 65536.0 * 1.37); }
inline int64_t from_fixed(const Args& a) { return std::llround(fixtof(a.level[0]) * 4.0); }
inline int64_t log_interp(const Args& a) { return log_interp_FIX(log_new_FIX, a.level[0]); }

inline int64_t bilinear(const Args& a) {
  static constexpr uint32_t kPixels[4] = {0x80123456u, 0x00FEDCBAu, 0xFF0F1E2Du, 0x7F99AA01u};
  return Bilinear_Fixed(static_cast<uint32_t>(a.level[0]), static_cast<uint32_t>(a.level[1]),
                        &kPixels[0], &kPixels[1], &kPixels[2], &kPixels[3], nullptr);
}

inline int64_t fatan2(const Args& a) { return FATAN2(a.level[0], a.level[1]); }

// The memory wrappers on a block of level[0] x level[1] bytes (held small): whether each did
// what it says.
inline int64_t memory(const Args& a) {
  const uint32_t n = static_cast<uint32_t>(a.level[0]) & 255u,
                 size = static_cast<uint32_t>(a.level[1]) & 15u;
  auto* zeroed = static_cast<uint8_t*>(fx_calloc(n, size));
  auto* block = static_cast<uint8_t*>(fx_malloc(n, size));
  int64_t ok = 0;
  if (zeroed != nullptr && block != nullptr) {
    ok = 1;
    for (uint32_t i = 0; i < n * size; ++i) ok &= zeroed[i] == 0 ? 1 : 0;
    ok &= fx_memset(block, 0x5A, n * size) == block ? 1 : 0;
    ok &= fx_memcpy(zeroed, block, n * size) == zeroed ? 1 : 0;
    for (uint32_t i = 0; i < n * size; ++i) ok &= zeroed[i] == 0x5A ? 1 : 0;
    auto* grown = static_cast<uint8_t*>(fx_realloc(block, n * size + 8));
    if (grown != nullptr) {
      block = grown;
      for (uint32_t i = 0; i < n * size; ++i) ok &= grown[i] == 0x5A ? 1 : 0;
    }
  }
  fx_free(zeroed);
  fx_free(block);
  return ok;
}

// ---- Levels ------------------------------------------------------------------------------------

inline constexpr int32_t kMin = std::numeric_limits<int32_t>::min();
inline constexpr int32_t kMax = std::numeric_limits<int32_t>::max();

inline constexpr Level kSlider[] = {{"level", 0, 20, 10}};
inline constexpr Level kPercent[] = {{"level", 0, 100, 0}};
inline constexpr Level kGains[] = {{"red", 0, 20, 10}, {"green", 0, 20, 10}, {"blue", 0, 20, 10}};
inline constexpr Level kHue[] = {{"hue", 0, 360, 0}};
inline constexpr Level kStrength[] = {{"strength", 0, 255, 0}};
inline constexpr Level kShift[] = {{"shift", 0, 31, 0}};
inline constexpr Level kBlurLevel[] = {{"level", 0, 8, 8}};
inline constexpr Level kGamma[] = {{"channel", 0, 3, 0}};
inline constexpr Level kLevels[] = {
    {"channel", 0, 3, 0}, {"low", 0, 255, 0}, {"high", 0, 255, 255}};
inline constexpr Level kSphere[] = {{"level", -100, 100, 0}};
inline constexpr Level kTwirl[] = {{"angle", -360, 360, 0}};
inline constexpr Level kMirrorLevels[] = {{"mode", MIRROR_KEEP_LEFT, MIRROR_KEEP_BOTTOM, 0},
                                          {"axis", MIRROR_VERTICAL, MIRROR_HORIZONTAL, 0}};
inline constexpr Level kParameters[] = {{"threshold", 0, 127, 70},
                                        {"cutoff", 0, 100, 100},
                                        {"weight1", 300, 8196, 1000},
                                        {"weight2", 300, 8196, 5120}};
inline constexpr Level kReduction[] = {{"shift", 0, 4, 0}};
inline constexpr Level kAllFlag[] = {{"all", 0, 1, 0}};
inline constexpr Level kBand[] = {{"centre", 0, kMax, 0}, {"half_height", 0, kMax, 0}};
inline constexpr Level kWord[] = {{"x", kMin, kMax, 0}};
inline constexpr Level kTwoWords[] = {{"a", kMin, kMax, 0}, {"b", kMin, kMax, 0}};
inline constexpr Level kRgbArgs[] = {{"r", 0, 255, 0}, {"g", 0, 255, 0}, {"b", 0, 255, 0}};
inline constexpr Level kHsvArgs[] = {{"h", 0, 360, 0}, {"s", 0, 65536, 0}, {"v", 0, 255, 0}};
inline constexpr Level kPackArgs[] = {
    {"pixel", kMin, kMax, 0}, {"r", 0, 255, 0}, {"g", 0, 255, 0}, {"b", 0, 255, 0}};
inline constexpr Level kWeights[] = {{"fx", 0, 2048, 0}, {"fy", 0, 2048, 0}};
inline constexpr Level kBlock[] = {{"count", 0, 255, 0}, {"size", 0, 15, 0}};

// ---- Representative arguments ------------------------------------------------------------------

// The slider levels and far beyond them, where no arithmetic may overflow.
inline constexpr Rep kSliderReps[] = {{{14}}, {{kMin}}, {{-45}}, {{-3}}, {{0}},    {{4}},   {{10}},
                                      {{13}}, {{20}},   {{27}},  {{55}}, {{2000}}, {{kMax}}};
inline constexpr Rep kFadeReps[] = {{{50}}, {{70}}, {{kMin}}, {{-1}},  {{0}},
                                    {{1}},  {{35}}, {{99}},   {{100}}, {{101}}};
inline constexpr Rep kGlowReps[] = {{{60}}, {{70}}, {{kMin}}, {{-1}},  {{0}},  {{1}},
                                    {{35}}, {{50}}, {{99}},   {{100}}, {{101}}};
inline constexpr Rep kGainReps[] = {{{14, 12, 8}},  {{14, 5, 9}},  {{10, 10, 10}},
                                    {{20, 10, 10}}, {{0, 15, 7}},  {{3, 18, 12}},
                                    {{-5, 30, 10}}, {{20, 0, 20}}, {{kMax, kMin, 10}}};
inline constexpr Rep kHueReps[] = {{{30}},  {{-1}},  {{0}},   {{200}}, {{61}}, {{90}},
                                   {{180}}, {{270}}, {{359}}, {{360}}, {{361}}};
inline constexpr Rep kStrengthReps[] = {{{64}}, {{0}}, {{120}}, {{255}}, {{kMax}}};
inline constexpr Rep kShiftReps[] = {{{4}}, {{2}},  {{0}},  {{1}}, {{3}},
                                     {{5}}, {{31}}, {{-1}}, {{32}}};
inline constexpr Rep kDabShiftReps[] = {{{4}}, {{0}}, {{2}}, {{3}}, {{32}}};
inline constexpr Rep kSharpenReps[] = {{{10}}, {{0}}, {{20}}};
inline constexpr Rep kBlurReps[] = {{{8}}, {{-1}}, {{0}}, {{1}}, {{2}},  {{3}},
                                    {{4}}, {{5}},  {{6}}, {{7}}, {{100}}};
inline constexpr Rep kSphereReps[] = {{{50}}, {{-101}}, {{-100}}, {{-57}}, {{-1}},
                                      {{0}},  {{1}},    {{33}},   {{100}}};
inline constexpr Rep kTwirlReps[] = {{{90}}, {{-361}}, {{-360}}, {{-200}}, {{-45}},
                                     {{0}},  {{1}},    {{271}},  {{360}}};
inline constexpr Rep kMirrorReps[] = {
    {{MIRROR_KEEP_LEFT, MIRROR_HORIZONTAL}}, {{MIRROR_KEEP_RIGHT, MIRROR_HORIZONTAL}},
    {{MIRROR_KEEP_TOP, MIRROR_VERTICAL}},    {{MIRROR_KEEP_BOTTOM, MIRROR_VERTICAL}},
    {{MIRROR_KEEP_TOP, MIRROR_HORIZONTAL}},  {{MIRROR_KEEP_LEFT, 0}}};
// The module's defaults first; 0 keeps a parameter as it is.
inline constexpr Rep kParameterReps[] = {{{0, 0, 0, 0}},           {{0, 100, 1000, 300}},
                                         {{127, 100, 8196, 5120}}, {{50, 60, 300, 8196}},
                                         {{70, 0, 1000, 5120}},    {{30, 1, 4000, 2000}}};
inline constexpr Rep kSetterReps[] = {{{70, 100, 1000, 5120}},
                                      {{127, 0, 300, 8196}},
                                      {{128, 101, 299, 8197}},
                                      {{-1, -1, kMin, kMax}},
                                      {{0, 50, 8196, 300}}};
inline constexpr Rep kReductionReps[] = {{{0}}, {{1}}, {{2}}};
inline constexpr Rep kAllReps[] = {{{0}}, {{1}}};
inline constexpr Rep kBlockReps[] = {{{16, 4}}, {{0, 4}}, {{255, 15}}, {{1, 0}}};

inline constexpr double kGammas[] = {
    0.77, -1.0, 0.0, 0.3, 0.58, 1.0, 1.09, 2.35, 9.5, std::numeric_limits<double>::quiet_NaN()};
// Every channel selector, in range and not, with every gamma.
inline constexpr auto kGammaReps = [] {
  std::array<Rep, 6 * std::size(kGammas)> reps{};
  size_t i = 0;
  for (int32_t channel : {0, -1, 1, 2, 3, 4}) {
    for (double g : kGammas) reps[i++] = Rep{{channel}, g};
  }
  return reps;
}();

inline constexpr int32_t kLevelPairs[][2] = {{28, 255},  {0, 255},   {15, 243},   {45, 255},
                                             {100, 100}, {200, 100}, {-300, 600}, {11, 232},
                                             {-1, 256},  {0, 1},     {kMin, kMax}};
// Every channel selector with every pair; the typical call first.
constexpr auto levels_reps(size_t first) {
  std::array<Rep, 6 * std::size(kLevelPairs)> reps{};
  size_t i = 0;
  for (int32_t channel : {0, -1, 1, 2, 3, 4}) {
    for (size_t k = 0; k < std::size(kLevelPairs); ++k) {
      const auto& p = kLevelPairs[(k + first) % std::size(kLevelPairs)];
      reps[i++] = Rep{{channel, p[0], p[1]}};
    }
  }
  return reps;
}
inline constexpr auto kLevelsReps = levels_reps(0);
inline constexpr auto kLevelsOutReps = levels_reps(3);

// ---- Ranges of the value functions --------------------------------------------------------------

inline constexpr Range kEveryWordSparsely[] = {{kMin, kMax, 0x1357F}};
inline constexpr Range kSmallWords[] = {{-300, 300, 7}};
inline constexpr Range kUnitRange[] = {{-70001, 70001, 7}};
inline constexpr Range kLogRange[] = {{-8, 70000, 1}};
inline constexpr Range kInterpRange[] = {{1000, 4200, 1}};
inline constexpr Range kChannelValues[] = {{-2, 257, 1}};
inline constexpr Range kColourGrid[] = {{0, 255, 7}};
inline constexpr Range kWeightGrid[] = {{0, 2048, 97}, {2040, 2060, 1}};
inline constexpr Range kPackGrid[] = {{-257, 300, 37}};
// Every word around the ends of the 16.16 range, where the conversions saturate.
inline constexpr Range kFixedEnds[] = {
    {kMin, kMax, 0x1357F}, {0x7FFEFF00, 0x7FFF0100, 1}, {-0x7FFF0100, -0x7FFEFF00, 1}};
// Hue, saturation and value all around zero: greys, black and the negative hue.
inline constexpr Range kSmallAndZero[] = {{-300, 300, 7}, {-2, 2, 1}};
inline constexpr Range kNone[] = {{0, 0, 1}};

// ---- Row builders -------------------------------------------------------------------------------

constexpr Export row(std::string_view name, Shape shape, Thunk call,
                     std::span<const Level> levels = {}, std::span<const Rep> reps = {},
                     uint16_t needs = 0) {
  return {name, shape, call, levels, reps, needs};
}

constexpr Export fn(std::string_view name, Thunk call, std::span<const Level> levels,
                    std::span<const Range> ranges, uint16_t needs = 0) {
  return {name, Shape::kValue, call, levels, {}, needs, ranges};
}

template <class T, size_t N>
constexpr Export table(std::string_view name, const T (&t)[N]) {
  return {name, Shape::kTable, nullptr, {}, {}, 0, {}, t, N, sizeof(T)};
}

template <class T>
constexpr Export global(std::string_view name, T& g, uint16_t needs = kWorkspace) {
  // count 0 marks a pointer, whose value only says whether the workspace exists.
  return {name,     Shape::kGlobal, nullptr, {}, {}, needs, {}, &g, std::is_pointer_v<T> ? 0u : 1u,
          sizeof(T)};
}

constexpr uint16_t kCode = kReturnsCode;
constexpr uint16_t kEntry = kEntryPoint;
constexpr uint16_t kScratch = kAllocates;

// ---- The table
// -----------------------------------------------------------------------------------

// clang-format off
inline constexpr Export kExports[] = {
    // Memory wrappers, packing and HSV.
    row("fx_calloc", Shape::kMemory, memory, kBlock, kBlockReps, kScratch),
    row("fx_malloc", Shape::kMemory, memory, kBlock, kBlockReps, kScratch),
    row("fx_realloc", Shape::kMemory, memory, kBlock, kBlockReps, kScratch),
    row("fx_free", Shape::kMemory, memory, kBlock, kBlockReps, kScratch),
    row("fx_memset", Shape::kMemory, memory, kBlock, kBlockReps, kScratch),
    row("fx_memcpy", Shape::kMemory, memory, kBlock, kBlockReps, kScratch),
    fn("fx_unpack_rgb888", unpack, kWord, kEveryWordSparsely),
    fn("fx_pack_rgb888", pack, kPackArgs, kPackGrid),
    table("LUT_DELTA", LUT_DELTA),
    table("LUT_DELTA2", LUT_DELTA2),
    fn("fx_rgb2hsv", three_out<fx_rgb2hsv>, kRgbArgs, kColourGrid),
    fn("fx_hsv2rgb", three_out<fx_hsv2rgb>, kHsvArgs, kSmallAndZero),

    // Brightness and contrast, saturation and temperature.
    row("controlBrightness", Shape::kFull, full<controlBrightness>, kSlider, kSliderReps, kEntry),
    row("controlBrightnessPartial", Shape::kPartial, partial<controlBrightnessPartial>, kSlider, kSliderReps, kEntry),
    row("controlContrast", Shape::kFull, full<controlContrast>, kSlider, kSliderReps, kEntry),
    row("controlContrastPartial", Shape::kPartial, partial<controlContrastPartial>, kSlider, kSliderReps, kEntry),
    row("fx_control_brightness_all", Shape::kFull, full<fx_control_brightness_all>, kSlider, kSliderReps),
    row("fx_control_brightness", Shape::kPartial, partial<fx_control_brightness>, kSlider, kSliderReps),
    row("fx_control_contrast_all", Shape::kFull, full<fx_control_contrast_all>, kSlider, kSliderReps),
    row("fx_control_contrast", Shape::kPartial, partial<fx_control_contrast>, kSlider, kSliderReps),
    row("controlSaturation", Shape::kFull, full<controlSaturation>, kSlider, kSliderReps, kEntry),
    row("controlSaturationPartial", Shape::kPartial, partial<controlSaturationPartial>, kSlider, kSliderReps, kEntry),
    row("controlTemperature", Shape::kFull, full<controlTemperature>, kSlider, kSliderReps, kEntry),
    row("controlTemperaturePartial", Shape::kPartial, partial<controlTemperaturePartial>, kSlider, kSliderReps, kEntry),
    row("fx_control_saturation_all", Shape::kFull, full<fx_control_saturation_all>, kSlider, kSliderReps),
    row("fx_control_saturation", Shape::kPartial, partial<fx_control_saturation>, kSlider, kSliderReps),
    row("fx_control_temperature_all", Shape::kFull, full<fx_control_temperature_all>, kSlider, kSliderReps),
    row("fx_control_temperature", Shape::kPartial, partial<fx_control_temperature>, kSlider, kSliderReps),

    // Exposure and hue, faded colour and invert, channel gains and colour tone.
    row("controlExposure", Shape::kFull, full<controlExposure>, kSlider, kSliderReps, kEntry),
    row("controlExposurePartial", Shape::kPartial, partial<controlExposurePartial>, kSlider, kSliderReps, kEntry),
    row("controlHue", Shape::kFull, full<controlHue>, kSlider, kSliderReps, kEntry),
    row("controlHuePartial", Shape::kPartial, partial<controlHuePartial>, kSlider, kSliderReps, kEntry),
    row("fx_control_exposure_all", Shape::kFull, full<fx_control_exposure_all>, kSlider, kSliderReps, kCode),
    row("fx_control_exposure", Shape::kPartial, partial<fx_control_exposure>, kSlider, kSliderReps, kCode),
    row("fx_control_hue_all", Shape::kFull, full<fx_control_hue_all>, kSlider, kSliderReps, kCode),
    row("fx_control_hue", Shape::kPartial, partial<fx_control_hue>, kSlider, kSliderReps, kCode),
    row("controlFadedColour", Shape::kFull, full<controlFadedColour>, kPercent, kFadeReps, kEntry),
    row("controlFadedColourPartial", Shape::kPartial, partial<controlFadedColourPartial>, kPercent, kFadeReps, kEntry | kMaskEveryMode),
    row("applyInvert", Shape::kFull, full<applyInvert>, {}, {}, kEntry),
    row("applyInvertPartial", Shape::kPartial, partial<applyInvertPartial>, {}, {}, kEntry | kMaskEveryMode),
    row("fx_control_fadedcolor_all", Shape::kFull, full<fx_control_fadedcolor_all>, kPercent, kFadeReps, kCode),
    row("fx_control_fadedcolor", Shape::kPartial, partial<fx_control_fadedcolor>, kPercent, kFadeReps, kCode | kMaskEveryMode),
    row("fx_apply_invert_all", Shape::kFull, full<fx_apply_invert_all>, {}, {}, kCode),
    row("fx_apply_invert", Shape::kPartial, partial<fx_apply_invert>, {}, {}, kCode | kMaskEveryMode),
    row("controlAdjustRGB", Shape::kFull, full<controlAdjustRGB>, kGains, kGainReps, kEntry),
    row("AdjustRGB", Shape::kPartial, partial<AdjustRGB>, kGains, kGainReps, kEntry),
    row("fx_adjust_RGB_all", Shape::kFull, full<fx_adjust_RGB_all>, kGains, kGainReps),
    row("fx_adjust_RGB", Shape::kPartial, partial<fx_adjust_RGB>, kGains, kGainReps),
    row("fx_change_colortone", Shape::kFull, full<fx_change_colortone>, kHue, kHueReps, kCode),

    // Lighten and darken brushes.
    row("rubLighten", Shape::kBrush, brush<rubLighten>, kStrength, kStrengthReps, kEntry),
    row("rubDarken", Shape::kBrush, brush<rubDarken>, kStrength, kStrengthReps, kEntry),
    row("fx_apply_lighten", Shape::kBrush, brush<fx_apply_lighten>, kStrength, kStrengthReps),
    row("fx_apply_darken", Shape::kBrush, brush<fx_apply_darken>, kStrength, kStrengthReps),

    // Fixed point.
    fn("ftofix", to_fixed, kWord, kEveryWordSparsely, kErrorWord),
    fn("fixtof", from_fixed, kWord, kEveryWordSparsely),
    fn("itofix", value<itofix>, kWord, kSmallWords),
    fn("fixtoi", value<fixtoi>, kWord, kFixedEnds),
    fn("fixfloor", value<fixfloor>, kWord, kFixedEnds),
    fn("fixceil", value<fixceil>, kWord, kFixedEnds, kErrorWord),
    fn("fixadd", value<fixadd>, kTwoWords, kSmallWords, kErrorWord),
    fn("fixsub", value<fixsub>, kTwoWords, kSmallWords, kErrorWord),
    fn("fixmul", value<fixmul>, kTwoWords, kSmallWords, kErrorWord),
    fn("fixdiv", value<fixdiv>, kTwoWords, kSmallWords, kErrorWord),
    fn("idiv", value<idiv>, kTwoWords, kSmallWords, kErrorWord),
    fn("iidiv", value<iidiv>, kTwoWords, kSmallWords, kErrorWord),
    table("_cos_tbl", _cos_tbl),
    table("_tan_tbl", _tan_tbl),
    table("_acos_tbl", _acos_tbl),
    {"fixtorad_r", Shape::kTable, nullptr, {}, {}, 0, {}, &fixtorad_r, 1, sizeof(int32_t)},
    {"radtofix_r", Shape::kTable, nullptr, {}, {}, 0, {}, &radtofix_r, 1, sizeof(int32_t)},
    fn("fixcos", value<fixcos>, kWord, kEveryWordSparsely),
    fn("fixsin", value<fixsin>, kWord, kEveryWordSparsely),
    fn("fixtan", value<fixtan>, kWord, kEveryWordSparsely),
    fn("fixatan", value<fixatan>, kWord, kEveryWordSparsely),
    fn("fixatan2", value<fixatan2>, kTwoWords, kSmallWords, kErrorWord),
    fn("fixacos", value<fixacos>, kWord, kUnitRange, kErrorWord),
    fn("fixasin", value<fixasin>, kWord, kUnitRange, kErrorWord),
    fn("isqrt_", value<isqrt_>, kWord, kEveryWordSparsely),
    table("log_new_FIX", log_new_FIX),
    fn("log_interp_FIX", log_interp, kWord, kInterpRange),
    fn("log_e_FIX_new", value<log_e_FIX_new>, kWord, kLogRange),

    // Depth-of-field blur and tilt-shift.
    global("g_ssrc", g_ssrc),
    global("g_sblur", g_sblur),
    global("g_tempd", g_tempd),
    global("g_scaled_wd", g_scaled_wd),
    global("g_scaled_ht", g_scaled_ht),
    global("all", all),
    global("resize_ratio", resize_ratio),
    row("scale_down_img", Shape::kScale, scale<scale_down_img, false>, kReduction, kReductionReps),
    row("scale_down_depth", Shape::kScale, scale<scale_down_depth, true>, kReduction, kReductionReps),
    row("fx_Init_blur", Shape::kBlurInit, blur_init<fx_Init_blur>, {}, {}, kWorkspace | kScratch),
    row("fx_make_blur_preview", Shape::kBlurPreview, blur_preview, kBlurLevel, kBlurReps, kWorkspace | kScratch),
    row("fx_destroy_blur", Shape::kRelease, release<fx_destroy_blur>, {}, {}, kWorkspace),
    row("fx_make_blur", Shape::kPartial, partial<fx_make_blur>, kBlurLevel, kBlurReps, kScratch),
    row("applyBlur", Shape::kPartial, partial<applyBlur>, kBlurLevel, kBlurReps, kEntry | kScratch),
    row("make_gaussian_blur", Shape::kWorking, working<make_gaussian_blur>, kBlurLevel, kBlurReps, kScratch),
    row("make_lens_blur", Shape::kWorking, working<make_lens_blur>, kBlurLevel, kBlurReps),
    row("run_blur", Shape::kComposite, run_blur_call, kAllFlag, kAllReps, kWorkspace),
    row("initTiltShift", Shape::kTiltInit, tilt_init<initTiltShift>, {}, {}, kEntry | kWorkspace | kScratch),
    row("makeTiltShift", Shape::kTilt, tilt<makeTiltShift>, kBand, {}, kEntry | kWorkspace | kScratch),
    row("applyTiltShift", Shape::kTilt, tilt<applyTiltShift>, kBand, {}, kEntry | kScratch),
    row("destroyTiltShift", Shape::kRelease, release<destroyTiltShift>, {}, {}, kEntry | kWorkspace),
    row("fx_init_tiltshift", Shape::kTiltInit, tilt_init<fx_init_tiltshift>, {}, {}, kWorkspace | kScratch),
    row("fx_tiltshift_preview", Shape::kTilt, tilt<fx_tiltshift_preview>, kBand, {}, kWorkspace | kScratch),
    row("fx_apply_tiltshift", Shape::kTilt, tilt<fx_apply_tiltshift>, kBand, {}, kScratch),
    row("fx_destroy_tiltshift", Shape::kRelease, release<fx_destroy_tiltshift>, {}, {}, kWorkspace),
    row("make_tiltshift", Shape::kWorking, working<make_tiltshift>, {}, {}, kScratch),
    row("restore_tiltshift", Shape::kComposite, restore_tiltshift_call, kBand, {}),
    row("make_tiltshift_lens", Shape::kWorking, working<make_tiltshift_lens>, kBand, {}),

    // Sharpen, pixelize and red-eye.
    row("applySharpen", Shape::kPartial, partial<applySharpen>, kSlider, kSharpenReps, kEntry),
    row("fx_apply_sharpen", Shape::kPartial, partial<fx_apply_sharpen>, kSlider, kSharpenReps, 0),
    row("fx_apply_sharpen_all", Shape::kFull, full<fx_apply_sharpen_all>, {}, {}, 0),
    row("applyPixelize", Shape::kFull, full<applyPixelize>, kShift, kShiftReps, kEntry),
    row("rubPixelize", Shape::kDab, dab<rubPixelize>, kShift, kDabShiftReps, kEntry),
    row("removeRedeye", Shape::kDab, dab<removeRedeye>, {}, {}, kEntry),
    row("fx_apply_pixelize", Shape::kFull, full<fx_apply_pixelize>, kShift, kShiftReps),
    row("fx_rub_pixelize", Shape::kDab, dab<fx_rub_pixelize>, kShift, kDabShiftReps),
    row("fx_remove_redeye", Shape::kDab, dab<fx_remove_redeye>),

    // Greyscale and sepia.
    row("controlGreyscale", Shape::kFull, full<controlGreyscale>, kSlider, kSliderReps, kEntry),
    row("controlGreyscalePartial", Shape::kPartial, partial<controlGreyscalePartial>, kSlider, kSliderReps, kEntry),
    row("fx_control_greyscale_all", Shape::kFull, full<fx_control_greyscale_all>, kSlider, kSliderReps),
    row("fx_control_greyscale", Shape::kPartial, partial<fx_control_greyscale>, kSlider, kSliderReps),
    row("fx_apply_sepia", Shape::kFull, full<fx_apply_sepia>, {}, {}, kCode),
    row("fx_apply_sepia_partial", Shape::kPartial, partial<fx_apply_sepia_partial>, {}, {}, kCode),
    fn("fx_get_sepia_r", value<fx_get_sepia_r>, kWord, kChannelValues),
    fn("fx_get_sepia_b", value<fx_get_sepia_b>, kWord, kChannelValues),

    // Tone curves, vignette and the film looks.
    row("control_gamma", Shape::kFull, gamma, kGamma, kGammaReps),
    row("changeHistogramByInput", Shape::kFull, full<changeHistogramByInput>, kLevels, kLevelsReps),
    row("changeHistogramByOutput", Shape::kFull, full<changeHistogramByOutput>, kLevels, kLevelsOutReps),
    table("LUT_VIGNETTE", LUT_VIGNETTE),
    row("fx_apply_vignette", Shape::kFull, full<fx_apply_vignette>),
    row("fx_apply_vignette_prev", Shape::kFull, full<fx_apply_vignette_prev>),
    table("LUT_VINTAGE", LUT_VINTAGE),
    row("applyVintage", Shape::kFull, full<applyVintage>, {}, {}, kEntry),
    row("applyVintagePartial", Shape::kPartial, partial<applyVintagePartial>, {}, {}, kEntry),
    row("fx_apply_vintage", Shape::kFull, full<fx_apply_vintage>),
    row("fx_apply_vintage_partial", Shape::kPartial, partial<fx_apply_vintage_partial>, {}, {}, 0),
    row("fx_apply_vintage_prev", Shape::kFull, full<fx_apply_vintage_prev>),
    table("LUT_OLDPHOTO", LUT_OLDPHOTO),
    row("applyOldPhoto", Shape::kFull, full<applyOldPhoto>, {}, {}, kEntry),
    row("applyOldPhotoPartial", Shape::kPartial, partial<applyOldPhotoPartial>, {}, {}, kEntry),
    row("fx_apply_oldphoto", Shape::kFull, full<fx_apply_oldphoto>),
    row("fx_apply_oldphoto_partial", Shape::kPartial, partial<fx_apply_oldphoto_partial>),
    row("fx_apply_oldphoto_texture", Shape::kTextureFull, texture_full<fx_apply_oldphoto_texture>),
    row("fx_apply_oldphoto_texture_partial", Shape::kTexturePartial, texture_partial<fx_apply_oldphoto_texture_partial>),
    row("applyPopArt", Shape::kFull, full<applyPopArt>, {}, {}, kEntry),
    row("fx_apply_popart", Shape::kFull, full<fx_apply_popart>),
    row("fx_apply_popart_prev", Shape::kFull, full<fx_apply_popart_prev>),
    row("applySoftglow", Shape::kFull, full<applySoftglow>, kPercent, kGlowReps, kEntry | kScratch),
    row("applySoftglowPartial", Shape::kPartial, partial<applySoftglowPartial>, kPercent, kGlowReps, kEntry | kScratch),
    row("fx_softglow", Shape::kFull, full<fx_softglow>, kPercent, kGlowReps, kCode | kScratch),
    row("fx_softglow_partial", Shape::kPartial, partial<fx_softglow_partial>, kPercent, kGlowReps, kCode | kScratch),

    // Warps.
    table("ATAN", ATAN),
    fn("Bilinear_Fixed", bilinear, kWeights, kWeightGrid),
    fn("FATAN2", fatan2, kTwoWords, kSmallWords),
    row("fx_get_mirror_out_width", Shape::kMirrorSize, mirror_size<fx_get_mirror_out_width, false>, kMirrorLevels, kMirrorReps),
    row("fx_get_mirror_out_height", Shape::kMirrorSize, mirror_size<fx_get_mirror_out_height, true>, kMirrorLevels, kMirrorReps),
    row("fx_mirror", Shape::kMirror, mirror<fx_mirror>, kMirrorLevels, kMirrorReps, kCode),
    row("getMirrorOutwidth", Shape::kMirrorSize, mirror_size<getMirrorOutwidth, false>, kMirrorLevels, kMirrorReps, kEntry),
    row("getMirrorOutheight", Shape::kMirrorSize, mirror_size<getMirrorOutheight, true>, kMirrorLevels, kMirrorReps, kEntry),
    row("runMirror", Shape::kMirror, mirror<runMirror>, kMirrorLevels, kMirrorReps, kEntry | kCode),
    row("fx_sphericity", Shape::kWarp, warp<fx_sphericity>, kSphere, kSphereReps, kCode),
    row("runSphericity", Shape::kWarp, warp<runSphericity>, kSphere, kSphereReps, kEntry),
    table("EXP_n7", EXP_n7),
    row("fx_twirl", Shape::kWarp, warp<fx_twirl>, kTwirl, kTwirlReps, kCode),
    row("runTwirl", Shape::kWarp, warp<runTwirl>, kTwirl, kTwirlReps, kEntry),
    table("SQRT_STEP_1", SQRT_STEP_1),
    table("SQRT_STEP_2", SQRT_STEP_2),
    table("SQRT_STEP_3", SQRT_STEP_3),
    table("SQRT_STEP_4", SQRT_STEP_4),
    table("SIN", SIN),

    // Preset looks.
    row("applyRetro", Shape::kFull, full<applyRetro>, {}, {}, kEntry),
    row("applyRetroPartial", Shape::kPartial, partial<applyRetroPartial>, {}, {}, kEntry),
    row("applySunshine", Shape::kFull, full<applySunshine>, {}, {}, kEntry),
    row("applySunshinePartial", Shape::kPartial, partial<applySunshinePartial>, {}, {}, kEntry),
    row("applyDownlight", Shape::kFull, with_parameters<full<applyDownlight>>, kParameters, kParameterReps, kEntry | kAutoParameters | kScratch | kDegradesWithout),
    row("applyDownlightPartial", Shape::kPartial, with_parameters<partial<applyDownlightPartial>>, kParameters, kParameterReps, kEntry | kAutoParameters | kScratch | kDegradesWithout),
    row("applyBluewash", Shape::kFull, full<applyBluewash>, {}, {}, kEntry),
    row("applyBluewashPartial", Shape::kPartial, partial<applyBluewashPartial>, {}, {}, kEntry),
    row("applyNostalgia", Shape::kFull, full<applyNostalgia>, {}, {}, kEntry),
    row("applyNostalgiaPartial", Shape::kPartial, partial<applyNostalgiaPartial>, {}, {}, kEntry),
    row("applyYellowglow", Shape::kFull, full<applyYellowglow>, {}, {}, kEntry),
    row("applyYellowglowPartial", Shape::kPartial, partial<applyYellowglowPartial>, {}, {}, kEntry),
    row("fx_apply_retro", Shape::kFull, full<fx_apply_retro>),
    row("fx_apply_retro_partial", Shape::kPartial, partial<fx_apply_retro_partial>, {}, {}, 0),
    row("fx_apply_sunshine", Shape::kFull, full<fx_apply_sunshine>),
    row("fx_apply_sunshine_partial", Shape::kPartial, partial<fx_apply_sunshine_partial>, {}, {}, 0),
    row("fx_apply_downlight", Shape::kFull, with_parameters<full<fx_apply_downlight>>, kParameters, kParameterReps, kAutoParameters | kScratch | kDegradesWithout),
    row("fx_apply_downlight_partial", Shape::kPartial, with_parameters<partial<fx_apply_downlight_partial>>, kParameters, kParameterReps, kAutoParameters | kScratch | kDegradesWithout),
    row("fx_apply_bluewash", Shape::kFull, full<fx_apply_bluewash>),
    row("fx_apply_bluewash_partial", Shape::kPartial, partial<fx_apply_bluewash_partial>, {}, {}, 0),
    row("fx_apply_nostalgia", Shape::kFull, full<fx_apply_nostalgia>),
    row("fx_apply_nostalgia_partial", Shape::kPartial, partial<fx_apply_nostalgia_partial>, {}, {}, 0),
    row("fx_apply_yellowglow", Shape::kFull, full<fx_apply_yellowglow>),
    row("fx_apply_yellowglow_partial", Shape::kPartial, partial<fx_apply_yellowglow_partial>, {}, {}, 0),

    // Auto adjust.
    global("g_HDR_Threshold", g_HDR_Threshold, kAutoParameters),
    global("g_HDR_CutOff", g_HDR_CutOff, kAutoParameters),
    global("g_HDR_Weight1", g_HDR_Weight1, kAutoParameters),
    global("g_HDR_Weight2", g_HDR_Weight2, kAutoParameters),
    row("fx_process_hdr", Shape::kFull, with_parameters<full<fx_process_hdr>>, kParameters, kParameterReps, kCode | kAutoParameters | kScratch | kDegradesWithout),
    row("applyAutoAdjust", Shape::kFull, with_parameters<full<applyAutoAdjust>>, kParameters, kParameterReps, kEntry | kCode | kAutoParameters | kScratch | kDegradesWithout),
    row("fx_set_hdr", Shape::kSetter, set_hdr, kParameters, kSetterReps, kAutoParameters),
    fn("fx_get_threshold_hdr", value<fx_get_threshold_hdr>, {}, kNone, kAutoParameters),
    fn("fx_get_cutoff_hdr", value<fx_get_cutoff_hdr>, {}, kNone, kAutoParameters),
    fn("fx_get_weight1_hdr", value<fx_get_weight1_hdr>, {}, kNone, kAutoParameters),
    fn("fx_get_weight2_hdr", value<fx_get_weight2_hdr>, {}, kNone, kAutoParameters),
};
// clang-format on

// The row of `name`, or null.
constexpr const Export* find(std::string_view name) {
  for (const Export& e : kExports) {
    if (e.name == name) return &e;
  }
  return nullptr;
}

// Position of `name` in the table, for compile-time references to a row.
consteval size_t index_of(std::string_view name) {
  for (size_t i = 0; i < std::size(kExports); ++i) {
    if (kExports[i].name == name) return i;
  }
  throw "no such export";
}

}  // namespace pfx::catalog
