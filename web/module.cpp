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

// Every effect with its parameters' ranges and defaults resolved for a width x height image.
std::string catalogue_json(int32_t width, int32_t height) {
  std::string j = "{\"maxPixels\":" + number(double(fxcat::kMaxPixels)) + ",\"effects\":[";
  bool first = true;
  for (const Effect& e : fxcat::effects()) {
    j += first ? "" : ",";
    first = false;
    j += "{\"name\":" + quoted(e.name) + ",\"family\":" + quoted(e.family) +
         ",\"summary\":" + quoted(e.summary) +
         ",\"selects\":" + quoted(fxcat::selects_name(e.selects)) +
         ",\"preview\":" + quoted(fxcat::preview_step(e)) + ",\"params\":[";
    for (size_t k = 0; k < e.param_count(); ++k) {
      const Param& p = e.params[k];
      const fxcat::Range r = fxcat::range_for(p, width, height);
      j += k == 0 ? "" : ",";
      j += "{\"name\":" + quoted(p.name) + ",\"help\":" + quoted(p.help) +
           ",\"kind\":" + quoted(fxcat::kind_name(p.kind)) +
           ",\"extent\":" + quoted(fxcat::extent_name(p.extent)) +
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

bool fits(int32_t width, int32_t height) {
  return width > 0 && height > 0 && int64_t{width} * height <= fxcat::kMaxPixels;
}

// The steps of `text` for a width x height picture, --mask naming `mask`.
std::string parse(const char* text, int32_t width, int32_t height, const uint8_t* mask,
                  std::vector<fxcat::Step>& steps) {
  const std::vector<std::string> words = fxcat::split_words(text);
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
  return {};
}

std::string run(const char* text, const uint32_t* pixels, int32_t width, int32_t height,
                const uint8_t* mask) {
  if (!fits(width, height)) return "the image has no pixels or too many";
  std::vector<fxcat::Step> steps;
  if (std::string err = parse(text, width, height, mask, steps); !err.empty()) return err;
  g_out.assign(pixels, pixels + static_cast<size_t>(width) * static_cast<size_t>(height));
  g_out_width = width;
  g_out_height = height;
  return fxcat::run_chain(steps, g_out, g_out_width, g_out_height);
}

// ---- Slider drags -------------------------------------------------------------------------------

// While a slider is dragged the worker previews one step at many values on one picture (its
// working copy). The drag keeps that picture, and for effects with stages (the blur and tilt-shift
// previews) the library's workspace built from it: made at the first move, made again only when
// the effect or the selection changes, so every other move runs the preview stage alone.
//
// The workspace is module-wide and this module has one thread: every other entry point ends the
// drag before it does anything, so nothing runs between a drag's begin and end but its previews.
struct Drag {
  fxcat::Pixels pixels;
  int32_t width = 0, height = 0;
  std::vector<uint8_t> brush;  // the painted selection; empty: none was given
  fxcat::Session session;
  fxcat::SelectionRequest selection;  // what the session was begun with
};
Drag g_drag;

void end_drag() {
  g_drag.session.end();
  fxcat::Pixels().swap(g_drag.pixels);
  std::vector<uint8_t>().swap(g_drag.brush);
  g_drag.width = g_drag.height = 0;
}

bool same_shape(const fxcat::Shape& a, const fxcat::Shape& b) {
  return a.a == b.a && a.b == b.b && a.c == b.c && a.d == b.d;
}

bool same_selection(const fxcat::SelectionRequest& a, const fxcat::SelectionRequest& b) {
  return a.has_rect == b.has_rect && (!a.has_rect || same_shape(a.rect, b.rect)) &&
         a.has_ellipse == b.has_ellipse && (!a.has_ellipse || same_shape(a.ellipse, b.ellipse)) &&
         (a.mask.bytes == nullptr) == (b.mask.bytes == nullptr);
}

std::string drag_preview(const char* text) {
  const int32_t width = g_drag.width, height = g_drag.height;
  if (g_drag.pixels.empty()) return "no drag has begun";
  std::vector<fxcat::Step> steps;
  const uint8_t* brush = g_drag.brush.empty() ? nullptr : g_drag.brush.data();
  if (std::string err = parse(text, width, height, brush, steps); !err.empty()) return err;
  const fxcat::Effect& effect = *steps[0].effect;
  if (steps.size() != 1 || effect.stages == nullptr) {
    g_drag.session.end();
    g_out.assign(g_drag.pixels.begin(), g_drag.pixels.end());
    g_out_width = width;
    g_out_height = height;
    return fxcat::run_chain(steps, g_out, g_out_width, g_out_height);
  }
  const fxcat::Step& step = steps[0];
  fxcat::Values values;
  if (std::string err = fxcat::resolve(effect, step.settings, width, height, values);
      !err.empty()) {
    return err;
  }
  if (g_drag.session.effect() != &effect || !same_selection(g_drag.selection, step.selection)) {
    g_drag.session.end();
    fxcat::Selection selection;
    const bool selected = step.selection.any();
    if (selected) {
      if (std::string err = fxcat::make_selection(step.selection, width, height, selection);
          !err.empty()) {
        return err;
      }
    }
    if (std::string err = g_drag.session.begin(effect, values, g_drag.pixels.data(), width, height,
                                               selected ? &selection : nullptr);
        !err.empty()) {
      return err;
    }
    g_drag.selection = step.selection;
  }
  g_out.resize(g_drag.pixels.size());
  g_out_width = width;
  g_out_height = height;
  return g_drag.session.preview(values, g_out.data());
}

}  // namespace

extern "C" {

// The catalogue for an image of this size, as JSON.
EMSCRIPTEN_KEEPALIVE const char* pfxw_catalogue(int32_t width, int32_t height) {
  end_drag();
  g_text = catalogue_json(width, height);
  return g_text.c_str();
}

// Runs the steps of `text` (the chain syntax) on a copy of `pixels`; `mask` (width x height
// bytes, non-zero where selected, or null) is the selection a step's --mask names. Returns 1
// when the steps ran (pfxw_out_* then describe the result), 0 when not (pfxw_error says why).
EMSCRIPTEN_KEEPALIVE int32_t pfxw_run(const char* text, const uint32_t* pixels, int32_t width,
                                      int32_t height, const uint8_t* mask) {
  // (Out of memory aborts the module: exceptions are off. The worker then starts a new one.)
  end_drag();
  g_text = run(text, pixels, width, height, mask);
  if (!g_text.empty()) {
    fxcat::Pixels().swap(g_out);
    g_out_width = g_out_height = 0;
  }
  return g_text.empty() ? 1 : 0;
}

// Begins a slider drag on a copy of `pixels`; `mask` (or null) is the selection a step's --mask
// names, as for pfxw_run. Any drag before it ends. Returns 1, or 0 when the size is unusable.
EMSCRIPTEN_KEEPALIVE int32_t pfxw_drag_begin(const uint32_t* pixels, int32_t width, int32_t height,
                                             const uint8_t* mask) {
  end_drag();
  if (!fits(width, height)) {
    g_text = "the image has no pixels or too many";
    return 0;
  }
  const size_t n = static_cast<size_t>(width) * static_cast<size_t>(height);
  g_drag.pixels.assign(pixels, pixels + n);
  if (mask != nullptr) g_drag.brush.assign(mask, mask + n);
  g_drag.width = width;
  g_drag.height = height;
  return 1;
}

// One position of the dragged slider: the step `text` on the drag's picture. Answers as pfxw_run.
EMSCRIPTEN_KEEPALIVE int32_t pfxw_drag_preview(const char* text) {
  g_text = drag_preview(text);
  if (!g_text.empty()) {
    fxcat::Pixels().swap(g_out);
    g_out_width = g_out_height = 0;
  }
  return g_text.empty() ? 1 : 0;
}

// Ends the drag: the workspace and the drag's picture are given back.
EMSCRIPTEN_KEEPALIVE void pfxw_drag_end() { end_drag(); }

EMSCRIPTEN_KEEPALIVE const char* pfxw_error() { return g_text.c_str(); }
EMSCRIPTEN_KEEPALIVE const uint32_t* pfxw_out_pixels() { return g_out.data(); }
EMSCRIPTEN_KEEPALIVE int32_t pfxw_out_width() { return g_out_width; }
EMSCRIPTEN_KEEPALIVE int32_t pfxw_out_height() { return g_out_height; }

// Turns the result into a canvas's byte order (R, G, B, A per pixel) in place, so the page can
// hand the bytes to its canvas as they come: a per-pixel swap in JavaScript costs the slider more
// than most previews take to compute. Returns the result's address, as pfxw_out_pixels.
EMSCRIPTEN_KEEPALIVE const uint8_t* pfxw_out_canvas() {
  // 0xAARRGGBB words lie in memory as B, G, R, A: red and blue change places.
  for (uint32_t& p : g_out) p = (p & 0xff00ff00u) | ((p >> 16) & 0xffu) | ((p & 0xffu) << 16);
  return reinterpret_cast<const uint8_t*>(g_out.data());
}

// Gives the result's memory back (a 12-megapixel result holds 48 MB).
EMSCRIPTEN_KEEPALIVE void pfxw_release() {
  fxcat::Pixels().swap(g_out);
  g_out_width = g_out_height = 0;
}

}  // extern "C"
