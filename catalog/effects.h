// The effect catalogue: every effect the hosts offer (the photofx tool, the Python module, the
// web editor), described once.
//
// Each effect is one entry of the table in catalog/effects.cpp: its name, its family, a one-line
// summary, how it takes a selection, whether it uses the library's module-wide state, whether it
// may run in place, its parameters (name, kind, range, default, help), a small function that
// calls the library on raw pixel buffers, and the settings a gallery shows. Nothing here reads
// or writes files: a host brings pixels in whatever way suits it and calls run_effect.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdint>
#include <memory>
#include <mutex>
#include <new>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

#include "photofx.h"

namespace fxcat {

// The library addresses at most this many pixels (its byte sizes must fit 32-bit counts).
constexpr int64_t kMaxPixels = INT32_MAX / 4;

// The most pixels a host accepts from a file or an upload unless told otherwise: above every
// camera's and phone's photograph (the largest sensors give 200 megapixels), below what a few
// hostile files (a small PNG can declare 20000 x 20000) could make a service allocate. 4 bytes a
// pixel: 1 GB at most for one picture.
constexpr int64_t kDefaultMaxPixels = 250'000'000;

// The quality JPEG and lossy WebP files are written at unless the caller says otherwise. Hosts
// that write files (the tool, the Python batch) share it: their outputs are the same pixels only
// with the same encoder settings.
constexpr int32_t kDefaultQuality = 92;

// Inclusive pixel bounds, in the order the library takes them.
struct Bounds {
  int32_t left, right, top, bottom;
};

// How an effect confines itself to a selection.
enum class Selects : uint8_t {
  kMask,     // the library has a partial variant: the run function gets the mask and bounds
  kKeep,     // the library edits whole images only: run_effect puts back the unselected pixels
  kNothing,  // the effect changes the image's size: a selection is refused
};

// Module-wide library state an effect uses. Effects with the same state must never run at the
// same time in one process; run_effect takes a lock per state, so hosts with threads need do
// nothing more.
enum class State : uint8_t {
  kNone,
  kBlurWorkspace,  // the preview workspace shared by the blur and tilt-shift previews
  kAutoAdjust,     // auto adjust's four parameters, read by auto adjust and downlight
};

// Which pixels of `dst` a run function writes. Whatever it leaves must hold the source already,
// which run_effect sees to by copying it there first; a run function that writes every pixel is
// spared that copy, which costs about as much as a simple effect.
enum class Writes : uint8_t {
  kAll,           // every pixel, on the whole image and under a selection
  kAllWhenWhole,  // every pixel of the whole image; under a selection only the selected ones
  kSome,          // only the pixels it edits (the brushes)
};

// What an integer parameter's range is measured against. Positions and lengths depend on the
// image: their range ends at the image's width, height or longer side, and their default is a
// fraction of it in thousandths (500 is the middle).
enum class Extent : uint8_t { kNone, kWidth, kHeight, kLonger };

enum class Kind : uint8_t { kInteger, kReal, kChoice };

// One named value of a choice parameter, e.g. {"horizontal", MIRROR_HORIZONTAL}.
struct Choice {
  const char* label;
  int32_t value;
};

struct Param {
  const char* name = nullptr;  // option name without the dashes; null ends the list
  const char* help = "";
  Kind kind = Kind::kInteger;
  Extent extent = Extent::kNone;
  // kInteger and kReal without extent: the range and default as they stand. With an extent:
  // min as it stands, max added to the extent (-1: up to the last column or row), def in
  // thousandths of the extent. kChoice: def is the index of the default choice.
  double min = 0;
  double max = 0;
  double def = 0;
  const Choice* choices = nullptr;
  int32_t choice_count = 0;
};

constexpr size_t kMaxParams = 6;
// Parameter values in the entry's order: numbers as they are, choices as their library value.
using Values = std::array<double, kMaxParams>;

// Everything a run function needs. Same-size effects whose entry says they do not write every
// pixel (Writes) find the source already in `dst` (a copy, or the very buffer when they run in
// place), so the brushes edit `dst`; effects that change the size get a separate `dst` of
// out_width x out_height.
struct Call {
  const uint32_t* src;  // width x height; equal to dst when the effect runs in place
  uint32_t* dst;
  int32_t width, height;
  int32_t out_width, out_height;
  // Under a selection, for kMask effects: one byte per pixel, 1 where selected. Otherwise null
  // (whole-image calls never read it).
  const uint8_t* mask;
  // The partial variant's bounds: the box around the selection, or left > right (the library's
  // whole-image mode) when there is none.
  Bounds bounds;
  // The box around the selection, or the whole image: for effects that take a window.
  Bounds window;
  bool whole;  // no selection (or a kKeep effect): call the full variant
  Values values;

  // Parameter k as an integer (ranges are checked before the call, so this is exact).
  int32_t arg(size_t k) const { return static_cast<int32_t>(values[k]); }
  double real(size_t k) const { return values[k]; }
};

// Returns an empty string when the effect ran, otherwise what went wrong, in a few words.
using Run = std::string (*)(const Call&);
// For effects that change the size: the output's width and height for these values, or why
// there is none.
using Size = std::string (*)(const Values&, int32_t width, int32_t height, int32_t& out_width,
                             int32_t& out_height);

// The stages of an effect whose library calls keep a workspace between previews (the blur and
// tilt-shift previews): begin builds it from the picture and selection, preview draws one set of
// values from the same picture into dst, end releases it. The entry's run is the three in a row;
// an editor's slider runs begin once per drag and preview per move (Session, below).
struct Stages {
  Run begin;
  Run preview;
  void (*end)();
};

struct Effect {
  const char* name;
  const char* family;
  const char* summary;
  Selects selects;
  State state = State::kNone;
  // The run function gives the same pixels with src == dst as with two buffers (checked by the
  // tool's tests for every entry that says so). Hosts then need only one image in memory.
  bool in_place = true;
  Writes writes = Writes::kAll;
  std::array<Param, kMaxParams> params;
  Run run;
  const Stages* stages = nullptr;  // null: run is one call with nothing kept
  Size size = nullptr;             // null: the output has the input's size
  // Settings a gallery shows, one picture each, separated by ';'. Each is a comma-separated
  // list of NAME=VALUE overriding the defaults; an empty item is the defaults. Null: not shown.
  const char* gallery;

  constexpr size_t param_count() const {
    size_t n = 0;
    while (n < kMaxParams && params[n].name != nullptr) ++n;
    return n;
  }
};

// The catalogue, in the order lists and galleries show it.
std::span<const Effect> effects();
const Effect* find_effect(std::string_view name);

// What an editor's slider runs while it moves, as the start of a step in the chain syntax: the
// entry NAME-preview when the table has one with the same parameters (the blur and tilt-shift
// workspaces, the vignette, vintage and pop-art previews), or the effect with "--fast on" (the
// warps). Empty: the effect itself serves.
std::string preview_step(const Effect& effect);

// ---- Running an effect on caller buffers ---------------------------------------------------

namespace detail {
// Memory for a large picture in huge pages where the system offers them (see effects.cpp).
void* allocate_pixels(size_t bytes);
void free_pixels(void* p, size_t bytes) noexcept;
}  // namespace detail

// Pixel storage that is not zeroed when it grows: every buffer a host allocates for an image is
// about to be overwritten by a decoder or an effect, and zeroing a large photograph first costs
// as much as a simple effect. Large buffers come in huge pages, which spares the first touch of
// a photograph tens of thousands of page faults.
template <class T>
struct NoInit : std::allocator<T> {
  template <class U>
  struct rebind {
    using other = NoInit<U>;
  };
  NoInit() = default;
  template <class U>
  NoInit(const NoInit<U>&) noexcept {}
  T* allocate(size_t n) {
    if (n > SIZE_MAX / sizeof(T)) throw std::bad_array_new_length();
    return static_cast<T*>(detail::allocate_pixels(n * sizeof(T)));
  }
  void deallocate(T* p, size_t n) noexcept { detail::free_pixels(p, n * sizeof(T)); }
  template <class U>
  void construct(U* p) noexcept(std::is_nothrow_default_constructible_v<U>) {
    ::new (static_cast<void*>(p)) U;
  }
  template <class U, class... A>
  void construct(U* p, A&&... a) {
    ::new (static_cast<void*>(p)) U(std::forward<A>(a)...);
  }
};
using Pixels = std::vector<uint32_t, NoInit<uint32_t>>;

// One byte per pixel, 1 where selected and 0 elsewhere, with the box around the selected
// pixels (the whole image when none is selected, so the library's masked mode edits nothing).
struct Selection {
  std::vector<uint8_t> mask;
  Bounds box;
};

// The output's size: the input's, or what a size-changing effect makes of it.
std::string output_size(const Effect& effect, const Values& values, int32_t width, int32_t height,
                        int32_t& out_width, int32_t& out_height);

// Whether run_effect needs a destination separate from the source: for effects that change the
// size or cannot run in place, and for kKeep effects under a selection (the unselected pixels
// come back from the source).
bool needs_two_buffers(const Effect& effect, bool selected);

// Runs `effect` on `src` (width x height) into `dst`, which holds output_size's pixels; `dst`
// may be `src` unless needs_two_buffers says otherwise. `selection` null: the whole image.
// Effects that use module-wide state are serialised by a lock per state.
std::string run_effect(const Effect& effect, const Values& values, const uint32_t* src,
                       int32_t width, int32_t height, uint32_t* dst, const Selection* selection);

// A slider drag over an effect with stages: begin builds the library's workspace once, each
// preview runs only the preview stage and gives the pixels run_effect gives for its values, and
// end (or the destructor) releases the workspace. The picture and selection handed to begin must
// stay as they are until the end.
//
// The workspace is module-wide state, so the session holds the lock of the effect's state from
// begin to end: other threads that run an effect with that state wait for the end, and the
// thread holding the session must end it before it runs such an effect itself (it would wait for
// itself).
class Session {
 public:
  Session() = default;
  ~Session() { end(); }
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;

  // Ends any session in progress and begins one with `effect`, which must have stages.
  std::string begin(const Effect& effect, const Values& values, const uint32_t* src, int32_t width,
                    int32_t height, const Selection* selection);
  // One slider position into `dst`, width x height pixels apart from the picture.
  std::string preview(const Values& values, uint32_t* dst);
  void end();
  const Effect* effect() const { return effect_; }

 private:
  const Effect* effect_ = nullptr;
  Selection selection_;
  bool selected_ = false;
  Call call_{};
  std::unique_lock<std::mutex> lock_;
};

// ---- Parameter constructors for the table ---------------------------------------------------

// A slider or other integer setting with a fixed range.
constexpr Param integer(const char* name, int32_t min, int32_t max, int32_t def, const char* help) {
  return {.name = name, .help = help, .min = double(min), .max = double(max), .def = double(def)};
}

constexpr Param real(const char* name, double min, double max, double def, const char* help) {
  return {.name = name, .help = help, .kind = Kind::kReal, .min = min, .max = max, .def = def};
}

// A column of the image (0 .. width - 1); the default is `permille` thousandths of the width.
constexpr Param column(const char* name, int32_t permille, const char* help) {
  return {.name = name, .help = help, .extent = Extent::kWidth, .max = -1, .def = double(permille)};
}

// A row of the image (0 .. height - 1).
constexpr Param row(const char* name, int32_t permille, const char* help) {
  return {
      .name = name, .help = help, .extent = Extent::kHeight, .max = -1, .def = double(permille)};
}

// A number of rows, 0 .. height.
constexpr Param rows(const char* name, int32_t permille, const char* help) {
  return {.name = name, .help = help, .extent = Extent::kHeight, .def = double(permille)};
}

// A length in pixels, min .. the image's longer side.
constexpr Param length(const char* name, int32_t min, int32_t permille, const char* help) {
  return {.name = name,
          .help = help,
          .extent = Extent::kLonger,
          .min = double(min),
          .def = double(permille)};
}

template <size_t N>
constexpr Param choice(const char* name, const Choice (&choices)[N], int32_t def_index,
                       const char* help) {
  return {.name = name,
          .help = help,
          .kind = Kind::kChoice,
          .def = double(def_index),
          .choices = choices,
          .choice_count = static_cast<int32_t>(N)};
}

// ---- Run functions for the common shapes ----------------------------------------------------

// Turns a library result code into the run function's answer.
std::string result_code(int32_t code);

namespace detail {

template <class F>
struct Arity;
template <class R, class... A>
struct Arity<R (*)(A...)> {
  static constexpr size_t value = sizeof...(A);
};

template <auto F, size_t... K>
std::string call_full(const Call& c, std::index_sequence<K...>) {
  if constexpr (std::is_void_v<decltype(F(c.src, c.dst, 0, 0, c.arg(K)...))>) {
    F(c.src, c.dst, c.width, c.height, c.arg(K)...);
    return {};
  } else {
    return result_code(F(c.src, c.dst, c.width, c.height, c.arg(K)...));
  }
}

template <auto F, size_t... K>
std::string call_partial(const Call& c, std::index_sequence<K...>) {
  const Bounds& b = c.bounds;
  if constexpr (std::is_void_v<decltype(F(c.src, c.mask, c.dst, 0, 0, c.arg(K)..., 0, 0, 0, 0))>) {
    F(c.src, c.mask, c.dst, c.width, c.height, c.arg(K)..., b.left, b.right, b.top, b.bottom);
    return {};
  } else {
    return result_code(
        F(c.src, c.mask, c.dst, c.width, c.height, c.arg(K)..., b.left, b.right, b.top, b.bottom));
  }
}

}  // namespace detail

// The library's usual pair: full (src, dst, width, height, levels...) and partial (src, mask,
// dst, width, height, levels..., left, right, top, bottom). The levels are the entry's
// parameters in order.
template <auto Full, auto Partial>
std::string full_and_partial(const Call& c) {
  constexpr size_t levels = detail::Arity<decltype(Full)>::value - 4;
  static_assert(detail::Arity<decltype(Partial)>::value == levels + 9,
                "the partial variant must take the full variant's levels plus mask and bounds");
  if (c.whole) return detail::call_full<Full>(c, std::make_index_sequence<levels>{});
  return detail::call_partial<Partial>(c, std::make_index_sequence<levels>{});
}

// A full variant alone (the entry's selection is then kKeep).
template <auto Full>
std::string full_only(const Call& c) {
  constexpr size_t levels = detail::Arity<decltype(Full)>::value - 4;
  return detail::call_full<Full>(c, std::make_index_sequence<levels>{});
}

}  // namespace fxcat
