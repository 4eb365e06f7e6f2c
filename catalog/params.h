// Effect parameters as the user writes them: parsing, range checks against the image, and the
// short descriptions `photofx list` prints.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>

#include "catalog/effects.h"

namespace fxcat {

// Settings given for one effect (on the command line or by a gallery item), already parsed and
// checked as far as they can be without an image.
struct Settings {
  std::array<bool, kMaxParams> given{};
  Values values{};
};

// A parameter's range and default for an image of the given size.
struct Range {
  double min, max, def;
};
Range range_for(const Param& p, int32_t width, int32_t height);

// Sets parameter `name` of `effect` from `text`. Refuses an unknown name, a value given twice,
// a malformed value and, for ranges that do not depend on the image, a value out of range.
std::string set_param(const Effect& effect, std::string_view name, std::string_view text,
                      Settings& settings);

// Parses a gallery item, "NAME=VALUE,NAME=VALUE" (empty: the defaults).
std::string parse_settings(const Effect& effect, std::string_view list, Settings& settings);

// The values for an image of this size: the given ones, checked against ranges that depend on
// the image, and the defaults for the rest.
std::string resolve(const Effect& effect, const Settings& settings, int32_t width, int32_t height,
                    Values& out);

// "0..20 (10)", "0..W-1 (W/2)", "horizontal|vertical (horizontal)".
std::string describe(const Param& p);

// The enumerations' names as hosts hand them on (the page's catalogue, the Python package's).
const char* kind_name(Kind k);
const char* extent_name(Extent e);  // "none" for a setting that is not a position or size
const char* selects_name(Selects s);

// A value as the user would write it: a number, or a choice's label.
std::string format_value(const Param& p, double value);

}  // namespace fxcat
