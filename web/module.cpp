// The web editor's view of the library: a handful of C functions its worker calls through the
// wasm module (web/worker.js). The editor never calls an effect directly; it writes steps in
// the command-line tool's chain syntax and runs them here, so what the page does is what its
// history says, and the history can be pasted after `photofx apply`.
#include <emscripten/emscripten.h>

#include <cstdint>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

#include "catalog/chain.h"
#include "catalog/effects.h"
#include "catalog/params.h"

namespace {

using fxcat::Effect;
using fxcat::Param;

// ---- The catalogue as JSON --------------------------------------------------------------------

std::string quoted(std::string_view s) {
  std::string out = "\"";
  for (char c : s) {
    if (c == '"' || c == '\\') {
      out += '\\';
      out += c;
    } else if (static_cast<unsigned char>(c) < 0x20) {
      char buf[8];
      std::snprintf(buf, sizeof buf, "\\u%04x", c);
      out += buf;
    } else {
      out += c;
    }
  }
  return out + "\"";
}

std::string number(double v) {
  char buf[32];
  std::snprintf(buf, sizeof buf, "%.10g", v);
  return buf;
}

const char* kind_name(fxcat::Kind k) {
  switch (k) {
    case fxcat::Kind::kInteger:
      return "integer";
    case fxcat::Kind::kReal:
      return "real";
    case fxcat::Kind::kChoice:
      return "choice";
  }
  return "integer";
}

const char* extent_name(fxcat::Extent e) {
  switch (e) {
    case fxcat::Extent::kNone:
      return "none";
    case fxcat::Extent::kWidth:
      return "width";
    case fxcat::Extent::kHeight:
      return "height";
    case fxcat::Extent::kLonger:
      return "longer";
  }
  return "none";
}

const char* selects_name(fxcat::Selects s) {
  switch (s) {
    case fxcat::Selects::kMask:
      return "mask";
    case fxcat::Selects::kKeep:
      return "keep";
    case fxcat::Selects::kNothing:
      return "nothing";
  }
  return "nothing";
}

// Every effect with its parameters' ranges and defaults resolved for a width x height image.
std::string catalogue_json(int32_t width, int32_t height) {
  std::string j = "{\"maxPixels\":" + number(double(fxcat::kMaxPixels)) + ",\"effects\":[";
  bool first = true;
  for (const Effect& e : fxcat::effects()) {
    j += first ? "" : ",";
    first = false;
    j += "{\"name\":" + quoted(e.name) + ",\"family\":" + quoted(e.family) +
         ",\"summary\":" + quoted(e.summary) + ",\"selects\":" + quoted(selects_name(e.selects)) +
         ",\"preview\":" + quoted(fxcat::preview_step(e)) + ",\"params\":[";
    for (size_t k = 0; k < e.param_count(); ++k) {
      const Param& p = e.params[k];
      const fxcat::Range r = fxcat::range_for(p, width, height);
      j += k == 0 ? "" : ",";
      j += "{\"name\":" + quoted(p.name) + ",\"help\":" + quoted(p.help) +
           ",\"kind\":" + quoted(kind_name(p.kind)) +
           ",\"extent\":" + quoted(extent_name(p.extent)) +
           ",\"describe\":" + quoted(fxcat::describe(p));
      if (p.kind == fxcat::Kind::kChoice) {
        j += ",\"choices\":[";
        for (int32_t i = 0; i < p.choice_count; ++i) {
          j += (i == 0 ? "" : ",") + quoted(p.choices[i].label);
        }
        j += "],\"def\":" + quoted(p.choices[static_cast<int32_t>(p.def)].label) + "}";
      } else {
        j += ",\"min\":" + number(r.min) + ",\"max\":" + number(r.max) +
             ",\"def\":" + number(r.def) + "}";
      }
    }
    j += "]}";
  }
  return j + "]}";
}

// ---- Running steps ------------------------------------------------------------------------------

// The page has no options of its own: every word of a step is the effect's.
class NoHostOptions : public fxcat::ChainHost {
 public:
  bool option(size_t, fxcat::Option&, fxcat::Words&, std::string&) override { return false; }
};

std::string g_text;  // the last answer in words: the catalogue, or what went wrong
fxcat::Pixels g_out;
int32_t g_out_width = 0, g_out_height = 0;

std::string run(const char* text, const uint32_t* pixels, int32_t width, int32_t height,
                const uint8_t* mask) {
  if (width <= 0 || height <= 0 || int64_t{width} * height > fxcat::kMaxPixels) {
    return "the image has no pixels or too many";
  }
  const std::vector<std::string> words = fxcat::split_words(text);
  std::vector<fxcat::Step> steps;
  NoHostOptions host;
  if (std::string err = fxcat::parse_chain(words, &host, steps); !err.empty()) return err;
  for (size_t i = 0; i < steps.size(); ++i) {
    fxcat::Step& s = steps[i];
    if (!s.positional.empty()) {
      return fxcat::step_label(steps, i) + "unexpected '" + s.positional[0] + "'";
    }
    if (s.mask_path.empty()) continue;
    // --mask names the page's painted selection: the one mask the page handed over, which the
    // page replays with the steps that name it.
    if (mask == nullptr) return fxcat::step_label(steps, i) + "no mask was given for --mask";
    s.selection.mask = {.bytes = mask, .width = width, .height = height, .name = s.mask_path};
  }
  g_out.assign(pixels, pixels + static_cast<size_t>(width) * static_cast<size_t>(height));
  g_out_width = width;
  g_out_height = height;
  return fxcat::run_chain(steps, g_out, g_out_width, g_out_height);
}

}  // namespace

extern "C" {

// The catalogue for an image of this size, as JSON.
EMSCRIPTEN_KEEPALIVE const char* pfxw_catalogue(int32_t width, int32_t height) {
  g_text = catalogue_json(width, height);
  return g_text.c_str();
}

// Runs the steps of `text` (the chain syntax) on a copy of `pixels`; `mask` (width x height
// bytes, non-zero where selected, or null) is the selection a step's --mask names. Returns 1
// when the steps ran (pfxw_out_* then describe the result), 0 when not (pfxw_error says why).
EMSCRIPTEN_KEEPALIVE int32_t pfxw_run(const char* text, const uint32_t* pixels, int32_t width,
                                      int32_t height, const uint8_t* mask) {
  // (Out of memory aborts the module: exceptions are off. The worker then starts a new one.)
  g_text = run(text, pixels, width, height, mask);
  if (!g_text.empty()) {
    fxcat::Pixels().swap(g_out);
    g_out_width = g_out_height = 0;
  }
  return g_text.empty() ? 1 : 0;
}

EMSCRIPTEN_KEEPALIVE const char* pfxw_error() { return g_text.c_str(); }
EMSCRIPTEN_KEEPALIVE const uint32_t* pfxw_out_pixels() { return g_out.data(); }
EMSCRIPTEN_KEEPALIVE int32_t pfxw_out_width() { return g_out_width; }
EMSCRIPTEN_KEEPALIVE int32_t pfxw_out_height() { return g_out_height; }

// Gives the result's memory back (a 12-megapixel result holds 48 MB).
EMSCRIPTEN_KEEPALIVE void pfxw_release() {
  fxcat::Pixels().swap(g_out);
  g_out_width = g_out_height = 0;
}

}  // extern "C"
