// The effect registry: what the command-line tool knows about each effect of the library.
//
// Every effect the tool offers is one entry of the table in tools/effects.cpp: its name on the
// command line, its family, a one-line summary, how it takes a selection, its parameters (name,
// range, default, help), a small function that calls the library, and the settings the gallery
// shows. `photofx list`, `photofx apply` and `photofx gallery` are all driven by that table.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>

#include "photofx.h"
#include "tools/image.h"

namespace fxtool {

// Inclusive pixel bounds, in the order the library takes them.
struct Bounds {
  int32_t left, right, top, bottom;
};

// How an effect confines itself to a selection.
enum class Selects : uint8_t {
  kMask,     // the library has a partial variant: the run function gets the mask and bounds
  kByTool,   // the library edits whole images only: the tool keeps the unselected pixels
  kNothing,  // the effect changes the image's size: a selection is refused
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
using Values = std::array<double, kMaxParams>;

// Everything a run function needs. The tool has sized `out` like `in` and filled it with a copy
// of `in`, so an effect that edits in place (the brushes) works on `out`; an effect that changes
// the size resizes `out`.
struct Call {
  const Image& in;
  Image& out;
  // Never null: for a whole-image call all ones, so library functions that read the mask
  // whatever the bounds are still safe. Only kMask effects see a real selection.
  const uint8_t* mask;
  // The partial variant's bounds: the box around the selection, or left > right (the library's
  // whole-image mode) when there is none.
  Bounds bounds;
  // The box around the selection, or the whole image: for effects that take a window.
  Bounds window;
  bool whole;  // no selection: call the full variant
  Values values;

  const uint32_t* src() const { return in.pixels.data(); }
  uint32_t* dst() const { return out.pixels.data(); }
  int32_t width() const { return in.width; }
  int32_t height() const { return in.height; }
  // Parameter k as an integer (ranges are checked before the call, so this is exact).
  int32_t arg(size_t k) const { return static_cast<int32_t>(values[k]); }
  double real(size_t k) const { return values[k]; }
};

// Returns an empty string when the effect ran, otherwise what went wrong, in a few words.
using Run = std::string (*)(const Call&);

struct Effect {
  const char* name;
  const char* family;
  const char* summary;
  Selects selects;
  std::array<Param, kMaxParams> params;
  Run run;
  // Settings the gallery shows, one picture each, separated by ';'. Each is a comma-separated
  // list of NAME=VALUE overriding the defaults; an empty item is the defaults. Null: not shown.
  const char* gallery;

  constexpr size_t param_count() const {
    size_t n = 0;
    while (n < kMaxParams && params[n].name != nullptr) ++n;
    return n;
  }
};

// The registry, in the order `photofx list` and the gallery show it.
std::span<const Effect> effects();
const Effect* find_effect(std::string_view name);

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
  if constexpr (std::is_void_v<decltype(F(c.src(), c.dst(), 0, 0, c.arg(K)...))>) {
    F(c.src(), c.dst(), c.width(), c.height(), c.arg(K)...);
    return {};
  } else {
    return result_code(F(c.src(), c.dst(), c.width(), c.height(), c.arg(K)...));
  }
}

template <auto F, size_t... K>
std::string call_partial(const Call& c, std::index_sequence<K...>) {
  const Bounds& b = c.bounds;
  if constexpr (std::is_void_v<decltype(F(c.src(), c.mask, c.dst(), 0, 0, c.arg(K)..., 0, 0, 0,
                                          0))>) {
    F(c.src(), c.mask, c.dst(), c.width(), c.height(), c.arg(K)..., b.left, b.right, b.top,
      b.bottom);
    return {};
  } else {
    return result_code(F(c.src(), c.mask, c.dst(), c.width(), c.height(), c.arg(K)..., b.left,
                         b.right, b.top, b.bottom));
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

// A full variant alone (the entry's selection is then kByTool).
template <auto Full>
std::string full_only(const Call& c) {
  constexpr size_t levels = detail::Arity<decltype(Full)>::value - 4;
  return detail::call_full<Full>(c, std::make_index_sequence<levels>{});
}

}  // namespace fxtool
