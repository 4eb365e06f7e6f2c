// Parsing and checking effect parameters.
#include "catalog/params.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <numeric>
#include <string>

namespace fxcat {
namespace {

std::string format_number(double v) {
  char buf[32];
  std::snprintf(buf, sizeof buf, "%.10g", v);
  return buf;
}

bool parse_integer(std::string_view text, double& out) {
  if (!text.empty() && text.front() == '+') text.remove_prefix(1);
  if (text.empty() || text.front() == '+') return false;
  int64_t v = 0;
  const auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), v);
  if (ec != std::errc() || end != text.data() + text.size()) return false;
  if (v < INT32_MIN || v > INT32_MAX) return false;
  out = static_cast<double>(v);
  return true;
}

bool parse_real(std::string_view text, double& out) {
  if (!text.empty() && text.front() == '+') text.remove_prefix(1);
  if (text.empty() || text.front() == '+') return false;
  // Plain decimal notation only: no white space, hex, "inf" or "nan". strtod converts, since
  // not every C++ library reads a double with from_chars (emscripten's does not).
  if (text.find_first_not_of("0123456789.eE+-") != std::string_view::npos) return false;
  const std::string copy(text);
  char* end = nullptr;
  const double v = std::strtod(copy.c_str(), &end);
  if (end != copy.c_str() + copy.size() || !std::isfinite(v)) return false;
  out = v;
  return true;
}

const char* extent_symbol(Extent e) {
  switch (e) {
    case Extent::kWidth:
      return "W";
    case Extent::kHeight:
      return "H";
    case Extent::kLonger:
      return "L";
    case Extent::kNone:
      break;
  }
  return "";
}

// `permille` thousandths of the extent, as a short fraction: "W/2", "3W/4", "0", "L".
std::string fraction_of(const char* symbol, int32_t permille) {
  if (permille == 0) return "0";
  const int32_t g = std::gcd(permille, 1000);
  const int32_t num = permille / g, den = 1000 / g;
  std::string s = num == 1 ? symbol : std::to_string(num) + symbol;
  if (den != 1) s.append("/").append(std::to_string(den));
  return s;
}

std::string out_of_range(const Param& p, double v, const Range& r) {
  return "--" + std::string(p.name) + " " + format_number(v) + " is out of range " +
         format_number(r.min) + ".." + format_number(r.max);
}

std::string names_of(const Effect& effect) {
  const size_t n = effect.param_count();
  if (n == 0) return "it takes no parameters";
  std::string s = "it takes";
  for (size_t i = 0; i < n; ++i) s += std::string(i == 0 ? " --" : ", --") + effect.params[i].name;
  return s;
}

}  // namespace

Range range_for(const Param& p, int32_t width, int32_t height) {
  if (p.kind == Kind::kChoice) return {0, double(p.choice_count - 1), p.def};
  if (p.extent == Extent::kNone) return {p.min, p.max, p.def};
  const int32_t e = p.extent == Extent::kWidth    ? width
                    : p.extent == Extent::kHeight ? height
                                                  : std::max(width, height);
  const double max = double(e) + p.max;
  const double def = std::floor(double(e) * p.def / 1000.0);
  return {p.min, max, std::clamp(def, p.min, std::max(p.min, max))};
}

std::string set_param(const Effect& effect, std::string_view name, std::string_view text,
                      Settings& settings) {
  const size_t n = effect.param_count();
  size_t k = 0;
  while (k < n && name != effect.params[k].name) ++k;
  if (k == n) {
    return std::string(effect.name) + " has no parameter --" + std::string(name) + " (" +
           names_of(effect) + ")";
  }
  const Param& p = effect.params[k];
  const std::string option = "--" + std::string(name);
  if (settings.given[k]) return option + " is given twice";
  double v = 0;
  switch (p.kind) {
    case Kind::kChoice: {
      int32_t i = 0;
      while (i < p.choice_count && text != p.choices[i].label) ++i;
      if (i == p.choice_count) {
        std::string labels;
        for (int32_t j = 0; j < p.choice_count; ++j) {
          labels += std::string(j == 0 ? "" : ", ") + p.choices[j].label;
        }
        return option + " must be one of " + labels + ", not '" + std::string(text) + "'";
      }
      v = p.choices[i].value;
      break;
    }
    case Kind::kReal:
      if (!parse_real(text, v)) return option + " needs a number, not '" + std::string(text) + "'";
      if (v < p.min || v > p.max) return out_of_range(p, v, range_for(p, 0, 0));
      break;
    case Kind::kInteger:
      if (!parse_integer(text, v)) {
        return option + " needs a whole number, not '" + std::string(text) + "'";
      }
      if (p.extent == Extent::kNone && (v < p.min || v > p.max)) {
        return out_of_range(p, v, range_for(p, 0, 0));
      }
      break;
  }
  settings.given[k] = true;
  settings.values[k] = v;
  return {};
}

std::string parse_settings(const Effect& effect, std::string_view list, Settings& settings) {
  while (!list.empty()) {
    const size_t comma = list.find(',');
    const std::string_view item = list.substr(0, comma);
    const size_t eq = item.find('=');
    if (eq == std::string_view::npos) return std::string("'").append(item) + "' is not NAME=VALUE";
    if (std::string err = set_param(effect, item.substr(0, eq), item.substr(eq + 1), settings);
        !err.empty()) {
      return err;
    }
    if (comma == std::string_view::npos) break;
    list.remove_prefix(comma + 1);
  }
  return {};
}

std::string resolve(const Effect& effect, const Settings& settings, int32_t width, int32_t height,
                    Values& out) {
  out = Values{};
  for (size_t k = 0; k < effect.param_count(); ++k) {
    const Param& p = effect.params[k];
    const Range r = range_for(p, width, height);
    if (!settings.given[k]) {
      out[k] = p.kind == Kind::kChoice ? p.choices[static_cast<int32_t>(p.def)].value : r.def;
      continue;
    }
    const double v = settings.values[k];
    if (p.kind == Kind::kInteger && p.extent != Extent::kNone && (v < r.min || v > r.max)) {
      return out_of_range(p, v, r) + " for a " + std::to_string(width) + "x" +
             std::to_string(height) + " image";
    }
    out[k] = v;
  }
  return {};
}

std::string describe(const Param& p) {
  if (p.kind == Kind::kChoice) {
    std::string s;
    for (int32_t i = 0; i < p.choice_count; ++i)
      s += std::string(i == 0 ? "" : "|") + p.choices[i].label;
    return s + " (" + p.choices[static_cast<int32_t>(p.def)].label + ")";
  }
  if (p.extent == Extent::kNone) {
    return format_number(p.min) + ".." + format_number(p.max) + " (" + format_number(p.def) + ")";
  }
  const char* e = extent_symbol(p.extent);
  std::string max = e;
  if (p.max > 0) max += '+';
  if (p.max != 0) max += format_number(p.max);
  return format_number(p.min) + ".." + max + " (" + fraction_of(e, static_cast<int32_t>(p.def)) +
         ")";
}

std::string format_value(const Param& p, double value) {
  if (p.kind == Kind::kChoice) {
    for (int32_t i = 0; i < p.choice_count; ++i) {
      if (p.choices[i].value == value) return p.choices[i].label;
    }
  }
  return format_number(value);
}

const char* kind_name(Kind k) {
  switch (k) {
    case Kind::kInteger:
      break;
    case Kind::kReal:
      return "real";
    case Kind::kChoice:
      return "choice";
  }
  return "integer";
}

const char* extent_name(Extent e) {
  switch (e) {
    case Extent::kWidth:
      return "width";
    case Extent::kHeight:
      return "height";
    case Extent::kLonger:
      return "longer";
    case Extent::kNone:
      break;
  }
  return "none";
}

const char* selects_name(Selects s) {
  switch (s) {
    case Selects::kMask:
      return "mask";
    case Selects::kKeep:
      return "keep";
    case Selects::kNothing:
      break;
  }
  return "nothing";
}

}  // namespace fxcat
