// photofx._photofx: the effect catalogue over numpy arrays, the native half of the Python package.
//
// photofx/__init__.py makes one Python function per catalogue entry; each calls run() with the
// entry's index and its parameters in the entry's order. Every argument is checked before a
// pixel is written, and the pixel work runs with the GIL released.
#include <pybind11/numpy.h>
#include <pybind11/pybind11.h>
#include <pybind11/stl.h>

#include <cctype>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <mutex>
#include <new>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "catalog/chain.h"
#include "catalog/effects.h"
#include "catalog/params.h"
#include "catalog/selection.h"
#include "catalog/texture.h"
#include "photofx.h"

namespace py = pybind11;

namespace {

using fxcat::Effect;
using fxcat::Kind;
using fxcat::Param;
using fxcat::Pixels;
using fxcat::Selection;
using fxcat::SelectionRequest;
using fxcat::Selects;
using fxcat::State;
using fxcat::Values;

// ---- Module-wide library state --------------------------------------------------------------

// The library's module-wide state (the blur workspace, auto adjust's four parameters) is used
// only under this lock. It is taken with the GIL released and let go before the GIL is taken
// back, so a thread holding it never waits for a thread holding the GIL.
std::mutex g_state;
// The preview session whose working copies the blur workspace holds (0: none). Whatever else
// uses the workspace clears it; the session then makes its copies again at its next preview.
uint64_t g_workspace_owner = 0;
uint64_t g_last_session = 0;

// ---- Messages -------------------------------------------------------------------------------

std::string py_name(std::string_view name) {
  std::string s(name);
  for (char& c : s) {
    if (c == '-') c = '_';
  }
  return s;
}

std::string type_name(py::handle h) { return Py_TYPE(h.ptr())->tp_name; }

std::string repr_of(py::handle h) { return py::repr(h).cast<std::string>(); }

std::string number(double v) {
  char buf[32];
  std::snprintf(buf, sizeof buf, "%.10g", v);
  return buf;
}

[[noreturn]] void type_error(const std::string& message) { throw py::type_error(message); }
[[noreturn]] void value_error(const std::string& message) { throw py::value_error(message); }

// The catalogue words its messages for the command line ("--high must be above --low");
// Python callers wrote high=.
std::string as_keyword(std::string message) {
  for (size_t at = message.find("--"); at != std::string::npos; at = message.find("--", at)) {
    message.erase(at, 2);
    for (size_t i = at; i < message.size() &&
                        (std::isalnum(static_cast<unsigned char>(message[i])) || message[i] == '-');
         ++i) {
      if (message[i] == '-') message[i] = '_';
    }
  }
  return message;
}

// A failure of the library or the catalogue, raised as Python would.
[[noreturn]] void failed(const std::string& fn, const std::string& err) {
  if (err.find("out of memory") != std::string::npos) throw std::bad_alloc();
  value_error(fn + ": " + as_keyword(err));
}

// ---- Pictures -------------------------------------------------------------------------------

enum class Layout { kBgra, kRgba };

Layout layout_arg(const std::string& fn, py::handle layout) {
  if (layout.is_none()) return Layout::kBgra;
  if (py::isinstance<py::str>(layout)) {
    const std::string s = layout.cast<std::string>();
    if (s == "bgra") return Layout::kBgra;
    if (s == "rgba") return Layout::kRgba;
  }
  value_error(fn + ": layout must be 'bgra' or 'rgba', not " + repr_of(layout));
}

// A picture given as an array. The array is held, so the memory stays while the GIL is released.
struct Picture {
  py::array array;
  int32_t width = 0, height = 0;
  bool bytes = false;  // uint8 (H, W, 4) rather than uint32 (H, W)
  void* data = nullptr;

  size_t size() const { return static_cast<size_t>(width) * static_cast<size_t>(height); }
  uint32_t* words() const { return static_cast<uint32_t*>(data); }
  const char* begin() const { return static_cast<const char*>(data); }
  const char* end() const { return begin() + size() * 4; }
};

std::string shape_of(const py::array& a) {
  std::string s = "(";
  for (py::ssize_t i = 0; i < a.ndim(); ++i) {
    s += (i == 0 ? "" : ", ") + std::to_string(a.shape(i));
  }
  return s + (a.ndim() == 1 ? ",)" : ")");
}

std::string shape_text(int32_t width, int32_t height, bool bytes) {
  return "(" + std::to_string(height) + ", " + std::to_string(width) + (bytes ? ", 4)" : ")");
}

std::string described(const py::array& a) {
  return py::str(a.dtype()).cast<std::string>() + " array of shape " + shape_of(a);
}

constexpr const char* kNative =
    "a uint32 array (H, W) of 0xAARRGGBB words or a uint8 array (H, W, 4) of B, G, R, A bytes";
constexpr const char* kRgba = "a uint8 array (H, W, 4) of R, G, B, A bytes (layout='rgba')";

// An image argument; `fn` and `arg` name it in messages ("brightness: img").
Picture picture_arg(const std::string& fn, const char* arg, py::handle obj, Layout layout) {
  const auto what = [&] { return fn + ": " + arg; };
  const char* expected = layout == Layout::kRgba ? kRgba : kNative;
  if (!py::isinstance<py::array>(obj)) {
    const bool pil = py::hasattr(obj, "getbands") && py::hasattr(obj, "tobytes");
    type_error(what() + " must be " + expected + ", not " + type_name(obj) +
               (pil ? " (photofx.from_pil converts a PIL image)" : ""));
  }
  auto a = py::reinterpret_borrow<py::array>(obj);
  const bool u32 = py::isinstance<py::array_t<uint32_t>>(a) && layout == Layout::kBgra;
  const bool u8 = py::isinstance<py::array_t<uint8_t>>(a);
  if (!u32 && !u8) type_error(what() + " must be " + expected + ", not a " + described(a));
  if (u32 ? a.ndim() != 2 : (a.ndim() != 3 || a.shape(2) != 4)) {
    value_error(what() + " must be " + expected + ", not a " + described(a));
  }
  if (!(a.flags() & py::array::c_style)) {
    value_error(what() + " must be C-contiguous (np.ascontiguousarray makes a contiguous copy)");
  }
  if (a.shape(0) < 1 || a.shape(1) < 1 || a.shape(0) > INT32_MAX || a.shape(1) > INT32_MAX ||
      a.shape(0) * a.shape(1) > fxcat::kMaxPixels) {
    value_error(what() + " must have between 1 and " + std::to_string(fxcat::kMaxPixels) +
                " pixels, not " + shape_of(a));
  }
  Picture p;
  p.array = a;
  p.height = static_cast<int32_t>(a.shape(0));
  p.width = static_cast<int32_t>(a.shape(1));
  p.bytes = !u32;
  p.data = const_cast<void*>(a.data());
  // The library reads whole words; only conversions read bytes.
  if (layout == Layout::kBgra && reinterpret_cast<uintptr_t>(p.data) % alignof(uint32_t) != 0) {
    value_error(what() + " must be aligned to 4 bytes (np.ascontiguousarray makes a copy that is)");
  }
  return p;
}

Picture new_picture(int32_t width, int32_t height, bool bytes) {
  Picture p;
  if (bytes) {
    p.array = py::array_t<uint8_t>({py::ssize_t{height}, py::ssize_t{width}, py::ssize_t{4}});
  } else {
    p.array = py::array_t<uint32_t>({py::ssize_t{height}, py::ssize_t{width}});
  }
  p.width = width;
  p.height = height;
  p.bytes = bytes;
  p.data = p.array.mutable_data();
  return p;
}

// The destination: `out` when given (of the result's form exactly), else a new array.
Picture destination(const std::string& fn, py::handle out, Layout layout, bool bytes, int32_t width,
                    int32_t height) {
  if (out.is_none()) return new_picture(width, height, bytes);
  Picture p = picture_arg(fn, "out", out, layout);
  if (p.bytes != bytes || p.width != width || p.height != height) {
    value_error(fn + ": out must be a " + (bytes ? "uint8" : "uint32") + " array of shape " +
                shape_text(width, height, bytes) + " like the result, not a " + described(p.array));
  }
  if (!p.array.writeable()) value_error(fn + ": out must be writeable");
  return p;
}

// R and B change places: B, G, R, A bytes to R, G, B, A and back. Unaligned arrays are fine.
void swap_red_blue(const void* from, void* to, size_t pixels) {
  const auto* s = static_cast<const unsigned char*>(from);
  auto* d = static_cast<unsigned char*>(to);
  for (size_t i = 0; i < pixels; ++i, s += 4, d += 4) {
    uint32_t w;
    std::memcpy(&w, s, 4);
    w = (w & 0xFF00FF00u) | ((w >> 16) & 0xFFu) | ((w & 0xFFu) << 16);
    std::memcpy(d, &w, 4);
  }
}

// ---- Parameters and selections --------------------------------------------------------------

bool is_off_on(const Param& p) {
  return p.kind == Kind::kChoice && p.choice_count == 2 &&
         p.choices[0].label == std::string_view("off") &&
         p.choices[1].label == std::string_view("on");
}

std::string labels_of(const Param& p) {
  std::string s;
  for (int32_t i = 0; i < p.choice_count; ++i) {
    s += std::string(i == 0 ? "'" : ", '") + p.choices[i].label + "'";
  }
  return s;
}

// An int from anything Python treats as one (numpy integers too), but not a bool or a float.
bool integer_of(py::handle v, int64_t& out, bool& overflow) {
  if (py::isinstance<py::bool_>(v) || !PyIndex_Check(v.ptr())) return false;
  const py::object i = py::reinterpret_steal<py::object>(PyNumber_Index(v.ptr()));
  if (!i) throw py::error_already_set();
  int over = 0;
  const long long x = PyLong_AsLongLongAndOverflow(i.ptr(), &over);
  overflow = over != 0;
  out = overflow ? 0 : x;
  return true;
}

// Parameter k from its Python value, checked against its range for this image. None: the
// default, which `resolve` fills in.
void value_arg(const std::string& fn, const Effect& e, size_t k, py::handle v, int32_t width,
               int32_t height, fxcat::Settings& settings) {
  if (v.is_none()) return;
  const Param& p = e.params[k];
  const auto name = [&] { return fn + ": " + py_name(p.name); };
  double x = 0;
  if (p.kind == Kind::kChoice) {
    int32_t i = -1;
    if (is_off_on(p) && py::isinstance<py::bool_>(v)) {
      i = v.cast<bool>() ? 1 : 0;
    } else if (py::isinstance<py::str>(v)) {
      const std::string label = v.cast<std::string>();
      for (int32_t j = 0; j < p.choice_count; ++j) {
        if (label == p.choices[j].label) i = j;
      }
      if (i < 0) value_error(name() + " must be one of " + labels_of(p) + ", not " + repr_of(v));
    } else {
      type_error(name() + " must be " +
                 (is_off_on(p) ? "True or False" : "one of " + labels_of(p)) + ", not " +
                 type_name(v));
    }
    x = p.choices[i].value;
  } else {
    const fxcat::Range r = fxcat::range_for(p, width, height);
    bool overflow = false;
    int64_t n = 0;
    if (p.kind == Kind::kInteger) {
      if (!integer_of(v, n, overflow)) type_error(name() + " must be an int, not " + type_name(v));
      x = static_cast<double>(n);
    } else {
      if (py::isinstance<py::bool_>(v) || py::isinstance<py::str>(v) || !PyNumber_Check(v.ptr())) {
        type_error(name() + " must be a number, not " + type_name(v));
      }
      x = PyFloat_AsDouble(v.ptr());
      if (x == -1.0 && PyErr_Occurred()) throw py::error_already_set();
      overflow = !std::isfinite(x);
    }
    if (overflow || x < r.min || x > r.max) {
      value_error(
          name() + "=" + repr_of(v) + " is out of range " + number(r.min) + ".." + number(r.max) +
          (p.extent == fxcat::Extent::kNone
               ? ""
               : " for a " + std::to_string(width) + " x " + std::to_string(height) + " image"));
    }
  }
  settings.given[k] = true;
  settings.values[k] = x;
}

Values values_arg(const std::string& fn, const Effect& e, const py::tuple& given, int32_t width,
                  int32_t height) {
  if (given.size() != e.param_count()) {
    type_error(fn + " takes " + std::to_string(e.param_count()) + " parameters, not " +
               std::to_string(given.size()));
  }
  fxcat::Settings settings;
  for (size_t k = 0; k < e.param_count(); ++k) {
    value_arg(fn, e, k, given[k], width, height, settings);
  }
  Values values;
  if (std::string err = fxcat::resolve(e, settings, width, height, values); !err.empty()) {
    failed(fn, err);
  }
  return values;
}

// rect= or ellipse=: four whole numbers, checked by the catalogue's own rules.
bool shape_arg(const std::string& fn, const char* option, py::handle v, bool& has,
               fxcat::Shape& shape) {
  if (v.is_none()) return false;
  const std::string name = fn + ": " + option;
  const char* what = option[0] == 'r' ? "(x, y, width, height)" : "(cx, cy, rx, ry)";
  if (!py::isinstance<py::sequence>(v) || py::isinstance<py::str>(v) || py::len(v) != 4) {
    type_error(name + " must be four ints " + what + ", not " + repr_of(v));
  }
  std::string text;
  for (size_t i = 0; i < 4; ++i) {
    int64_t n = 0;
    bool overflow = false;
    const py::object item = py::reinterpret_borrow<py::sequence>(v)[i];
    if (!integer_of(item, n, overflow)) {
      type_error(name + " must be four ints " + what + ", not " + repr_of(v));
    }
    if (overflow || n < INT32_MIN || n > INT32_MAX) {
      value_error(name + "=" + repr_of(v) + " is out of range");
    }
    text += (i == 0 ? "" : ",") + std::to_string(n);
  }
  const std::string err =
      option[0] == 'r' ? fxcat::parse_rect(text, shape) : fxcat::parse_ellipse(text, shape);
  if (!err.empty()) value_error(name + "=" + repr_of(v) + ": " + as_keyword(err));
  has = true;
  return true;
}

// The selection arguments; false when none is given.
bool selection_arg(const std::string& fn, py::handle mask, py::handle rect, py::handle ellipse,
                   int32_t width, int32_t height, SelectionRequest& request) {
  bool any = shape_arg(fn, "rect", rect, request.has_rect, request.rect);
  any = shape_arg(fn, "ellipse", ellipse, request.has_ellipse, request.ellipse) || any;
  if (mask.is_none()) return any;
  const std::string name = fn + ": mask";
  if (!py::isinstance<py::array_t<bool>>(mask) && !py::isinstance<py::array_t<uint8_t>>(mask)) {
    type_error(name + " must be a bool or uint8 array of the image's shape, not " +
               (py::isinstance<py::array>(mask)
                    ? "a " + described(py::reinterpret_borrow<py::array>(mask))
                    : type_name(mask)));
  }
  auto m = py::reinterpret_borrow<py::array>(mask);
  if (m.ndim() != 2 || m.shape(0) != height || m.shape(1) != width) {
    value_error(name + " must have the image's shape " + shape_text(width, height, false) +
                ", not " + shape_of(m));
  }
  if (!(m.flags() & py::array::c_style)) {
    value_error(name + " must be C-contiguous (np.ascontiguousarray makes a contiguous copy)");
  }
  request.mask = {.bytes = static_cast<const uint8_t*>(m.data()),
                  .width = width,
                  .height = height,
                  .name = "mask"};
  return true;
}

// ---- Running --------------------------------------------------------------------------------

const Effect& effect_at(size_t index) {
  const auto all = fxcat::effects();
  if (index >= all.size()) throw py::index_error("no effect " + std::to_string(index));
  return all[index];
}

// The Python names of the effects, made once: messages begin with them.
const std::string& name_at(size_t index) {
  static const std::vector<std::string> names = [] {
    std::vector<std::string> v;
    for (const Effect& e : fxcat::effects()) v.push_back(py_name(e.name));
    return v;
  }();
  return names[index];
}

// run_effect, under the state lock for effects that use module-wide state. Without the GIL.
std::string locked_run(const Effect& e, const Values& values, const uint32_t* src, int32_t width,
                       int32_t height, uint32_t* dst, const Selection* selection) {
  if (e.state == State::kNone) {
    return fxcat::run_effect(e, values, src, width, height, dst, selection);
  }
  const std::lock_guard<std::mutex> lock(g_state);
  std::string err = fxcat::run_effect(e, values, src, width, height, dst, selection);
  if (e.state == State::kBlurWorkspace) g_workspace_owner = 0;
  return err;
}

// Runs `e` from `in` into `out` (same memory or apart). Without the GIL.
std::string run_on(const Effect& e, const Values& values, const Picture& in, const Picture& out,
                   Layout layout, const SelectionRequest* request) {
  Selection selection;
  if (request != nullptr) {
    if (std::string err = fxcat::make_selection(*request, in.width, in.height, selection);
        !err.empty()) {
      return err;
    }
  }
  const Selection* s = request != nullptr ? &selection : nullptr;
  if (layout == Layout::kBgra) {
    return locked_run(e, values, in.words(), in.width, in.height, out.words(), s);
  }
  // R, G, B, A: one conversion in and one out, through pixels of the library's own order.
  Pixels src(in.size());
  swap_red_blue(in.data, src.data(), in.size());
  Pixels apart;
  uint32_t* dst = src.data();
  if (fxcat::needs_two_buffers(e, s != nullptr)) {
    apart.resize(out.size());
    dst = apart.data();
  }
  std::string err = locked_run(e, values, src.data(), in.width, in.height, dst, s);
  if (err.empty()) swap_red_blue(dst, out.data, out.size());
  return err;
}

py::object run(size_t index, py::handle img, const py::tuple& params, py::handle mask,
               py::handle rect, py::handle ellipse, py::handle out, py::handle layout_arg_) {
  const Effect& e = effect_at(index);
  const std::string& fn = name_at(index);
  const Layout layout = layout_arg(fn, layout_arg_);
  const Picture in = picture_arg(fn, "img", img, layout);
  const Values values = values_arg(fn, e, params, in.width, in.height);
  SelectionRequest request;
  const bool selected = selection_arg(fn, mask, rect, ellipse, in.width, in.height, request);
  if (selected && e.selects == Selects::kNothing) {
    value_error(fn + " takes no selection (it changes the image's size)");
  }
  int32_t out_width = 0, out_height = 0;
  if (std::string err = fxcat::output_size(e, values, in.width, in.height, out_width, out_height);
      !err.empty()) {
    failed(fn, err);
  }
  const Picture dst = destination(fn, out, layout, in.bytes, out_width, out_height);
  const bool same = dst.data == in.data && dst.size() == in.size();
  if (!same && dst.begin() < in.end() && in.begin() < dst.end()) {
    value_error(fn + ": out overlaps img; pass img itself to edit in place, or separate memory");
  }
  if (same && layout == Layout::kBgra && fxcat::needs_two_buffers(e, selected)) {
    value_error(fn + ": out must not be img: " + fn + " needs its input intact while it writes" +
                (e.in_place && e.size == nullptr ? " under a selection" : ""));
  }
  std::string err;
  {
    // Released even for a tiny picture: handing the GIL over costs well under a microsecond
    // (measured), and another thread may wait for the state lock meanwhile.
    const py::gil_scoped_release unlocked;
    err = run_on(e, values, in, dst, layout, selected ? &request : nullptr);
  }
  if (!err.empty()) failed(fn, err);
  return dst.array;
}

// ---- Preview sessions -----------------------------------------------------------------------

// The blur and tilt-shift previews: working copies made once, then a preview per slider move.
class Session {
 public:
  Session(size_t index, py::handle img, py::handle mask, py::handle rect, py::handle ellipse)
      : e_(&effect_at(index)), fn_(name_at(index)), blur_(e_->selects == Selects::kMask) {
    if (e_->state != State::kBlurWorkspace) value_error(fn_ + " has no preview session");
    in_ = picture_arg(fn_, "img", img, Layout::kBgra);
    SelectionRequest request;
    selected_ = selection_arg(fn_, mask, rect, ellipse, in_.width, in_.height, request);
    if (selected_) {
      std::string err;
      {
        const py::gil_scoped_release unlocked;
        err = fxcat::make_selection(request, in_.width, in_.height, selection_);
      }
      if (!err.empty()) failed(fn_, err);
    }
    id_ = ++g_last_session;  // under the GIL
  }
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;
  ~Session() {
    try {
      close();
    } catch (...) {
    }
  }

  py::object preview(const py::tuple& params, py::handle out) {
    if (!open_) value_error(fn_ + ": the session is closed");
    const Values values = values_arg(fn_, *e_, params, in_.width, in_.height);
    const Picture dst = destination(fn_, out, Layout::kBgra, in_.bytes, in_.width, in_.height);
    if (dst.begin() < in_.end() && in_.begin() < dst.end()) {
      value_error(fn_ + ": out must not share memory with the session's image");
    }
    {
      const py::gil_scoped_release unlocked;
      draw(values, dst.words());
    }
    return dst.array;
  }

  // Keeps the GIL (it may run while the interpreter shuts down): whoever holds the state lock
  // has let the GIL go and does not take it back before letting the lock go, so this wait ends.
  void close() {
    if (!open_) return;
    open_ = false;
    const std::lock_guard<std::mutex> lock(g_state);
    if (g_workspace_owner != id_) return;
    if (blur_) {
      fx_destroy_blur();
    } else {
      destroyTiltShift();
    }
    g_workspace_owner = 0;
  }

  bool closed() const { return !open_; }

 private:
  // One preview into `d`, making the working copies first unless they are this session's.
  // Without the GIL.
  void draw(const Values& values, uint32_t* d) {
    const std::lock_guard<std::mutex> lock(g_state);
    const uint32_t* src = in_.words();
    const int32_t w = in_.width, h = in_.height;
    const bool partial = selected_ && blur_;
    const uint8_t* mask = partial ? selection_.mask.data() : nullptr;
    if (g_workspace_owner != id_) {
      if (blur_) {
        const fxcat::Bounds b = partial ? selection_.box : fxcat::Bounds{1, 0, 1, 0};
        fx_Init_blur(src, mask, w, h, b.left, b.right, b.top, b.bottom);
      } else {
        initTiltShift(src, w, h);
      }
      g_workspace_owner = id_;
    }
    if (e_->writes != fxcat::Writes::kAll) std::memcpy(d, src, in_.size() * sizeof(uint32_t));
    if (blur_) {
      fx_make_blur_preview(src, mask, d, w, h, static_cast<int32_t>(values[0]));
    } else {
      makeTiltShift(src, d, w, h, static_cast<int32_t>(values[0]), static_cast<int32_t>(values[1]));
      if (selected_) {  // the tool keeps the selected pixels only
        for (size_t i = 0; i < in_.size(); ++i) {
          if (selection_.mask[i] == 0) d[i] = src[i];
        }
      }
    }
  }

  const Effect* e_;
  std::string fn_;
  bool blur_;
  Picture in_;
  bool selected_ = false;
  Selection selection_;
  uint64_t id_ = 0;
  bool open_ = true;
};

// ---- Chains, for batches --------------------------------------------------------------------

std::vector<fxcat::Step> chain_of(const std::vector<std::string>& words) {
  std::vector<fxcat::Step> steps;
  if (std::string err = fxcat::parse_chain(words, nullptr, steps); !err.empty()) value_error(err);
  for (size_t i = 0; i < steps.size(); ++i) {
    if (!steps[i].positional.empty()) {
      value_error(fxcat::step_label(steps, i) + "unexpected '" + steps[i].positional[0] +
                  "' (the files are batch's inputs)");
    }
    const bool selected = steps[i].selection.any() || !steps[i].mask_path.empty();
    if (selected && steps[i].effect->selects == Selects::kNothing) {
      value_error(fxcat::step_label(steps, i) + steps[i].effect->name +
                  " takes no selection (it changes the image's size)");
    }
  }
  return steps;
}

const std::string kRunChain = "run_chain";

// The mask file each step names, or None.
py::list mask_paths(const std::vector<std::string>& words) {
  py::list paths;
  for (const fxcat::Step& step : chain_of(words)) {
    paths.append(step.mask_path.empty() ? py::object(py::none()) : py::str(step.mask_path));
  }
  return paths;
}

// Runs a chain on a copy of `img`; the result may have another size. `masks` holds, for each
// step that names a mask file, the file's pixels as the host decoded them, and None elsewhere.
py::array run_chain(const std::vector<std::string>& words, py::handle img, const py::list& masks) {
  std::vector<fxcat::Step> steps = chain_of(words);
  const Picture in = picture_arg(kRunChain, "img", img, Layout::kBgra);
  if (masks.size() != steps.size()) value_error("run_chain: one mask or None per step");
  std::vector<Picture> mask_pictures(steps.size());
  for (size_t i = 0; i < steps.size(); ++i) {
    if (steps[i].mask_path.empty()) continue;
    if (masks[i].is_none()) {
      value_error(fxcat::step_label(steps, i) + "--mask " + steps[i].mask_path + " was not read");
    }
    mask_pictures[i] = picture_arg(kRunChain, "mask", masks[i], Layout::kBgra);
  }
  std::vector<std::vector<uint8_t>> mask_bytes(steps.size());
  auto* pixels = new Pixels(in.words(), in.words() + in.size());
  const py::capsule owner(pixels, [](void* p) { delete static_cast<Pixels*>(p); });
  int32_t width = in.width, height = in.height;
  bool stateful = false;
  for (const fxcat::Step& step : steps) stateful = stateful || step.effect->state != State::kNone;
  std::string err;
  {
    const py::gil_scoped_release unlocked;
    for (size_t i = 0; i < steps.size(); ++i) {
      const Picture& m = mask_pictures[i];
      if (m.data == nullptr) continue;
      mask_bytes[i] = fxcat::mask_of_picture(m.words(), m.width, m.height);
      steps[i].selection.mask = {.bytes = mask_bytes[i].data(),
                                 .width = m.width,
                                 .height = m.height,
                                 .name = steps[i].mask_path};
    }
    std::unique_lock<std::mutex> lock(g_state, std::defer_lock);
    if (stateful) lock.lock();
    err = fxcat::run_chain(steps, *pixels, width, height);
    if (stateful) g_workspace_owner = 0;
  }
  if (!err.empty()) failed("run_chain", err);
  return py::array_t<uint32_t>({py::ssize_t{height}, py::ssize_t{width}}, pixels->data(), owner);
}

// ---- The catalogue, for Python --------------------------------------------------------------

py::list catalog() {
  py::list entries;
  for (const Effect& e : fxcat::effects()) {
    py::list params;
    for (size_t k = 0; k < e.param_count(); ++k) {
      const Param& p = e.params[k];
      py::dict d;
      d["name"] = p.name;
      d["help"] = p.help;
      d["describe"] = fxcat::describe(p);
      // Python has always said "" where a setting is no position or size.
      d["extent"] = p.extent == fxcat::Extent::kNone ? "" : fxcat::extent_name(p.extent);
      if (p.kind == Kind::kChoice) {
        py::list labels;
        for (int32_t i = 0; i < p.choice_count; ++i) labels.append(p.choices[i].label);
        d["kind"] = is_off_on(p) ? "bool" : "choice";
        d["choices"] = labels;
        d["default"] = is_off_on(p)
                           ? py::object(py::bool_(p.def != 0))
                           : py::object(py::str(p.choices[static_cast<int32_t>(p.def)].label));
      } else if (p.kind == Kind::kReal) {
        d["kind"] = "real";
        d["min"] = p.min;
        d["max"] = p.max;
        d["default"] = p.def;
      } else {
        d["kind"] = "int";
        d["min"] = static_cast<int64_t>(p.min);
        d["max"] = static_cast<int64_t>(p.max);
        d["default"] = p.extent == fxcat::Extent::kNone
                           ? py::object(py::int_(static_cast<int64_t>(p.def)))
                           : py::object(py::none());
      }
      params.append(d);
    }
    py::dict d;
    d["name"] = e.name;
    d["family"] = e.family;
    d["summary"] = e.summary;
    d["selects"] = fxcat::selects_name(e.selects);
    d["state"] = e.state != State::kNone;
    d["in_place"] = e.in_place && e.size == nullptr;
    d["params"] = params;
    entries.append(d);
  }
  return entries;
}

}  // namespace

const std::string kSwap = "swap_red_blue";

PYBIND11_MODULE(_photofx, m) {
  m.doc() = "The native half of photofx: the effect catalogue over numpy arrays.";
  m.attr("MAX_PIXELS") = fxcat::kDefaultMaxPixels;
  m.attr("QUALITY") = fxcat::kDefaultQuality;
  m.attr("LIBRARY_MAX_PIXELS") = fxcat::kMaxPixels;
  m.def("catalog", &catalog,
        "Every effect with its parameters, as the command-line tool lists them.");
  m.def("run", &run,
        "Runs catalogue entry `index`: (index, img, params, mask, rect, ellipse, out, layout).");
  m.def(
      "check_chain", [](const std::vector<std::string>& words) { return chain_of(words).size(); },
      "Parses a chain of steps; raises ValueError for a bad one. Returns the number of steps.");
  m.def(
      "paper_texture",
      [](int32_t width, int32_t height) {
        if (width < 1 || height < 1 || int64_t{width} * height > fxcat::kMaxPixels) {
          value_error("paper_texture: no pixels or too many");
        }
        const Pixels paper = fxcat::paper_texture(width, height);
        return py::array_t<uint32_t>({py::ssize_t{height}, py::ssize_t{width}}, paper.data());
      },
      "The paper old_photo_texture mixes in, for a picture of this size.");
  m.def("split_words", &fxcat::split_words,
        "Splits a chain written as one string into its words, as the catalogue reads it.");
  m.def("mask_paths", &mask_paths, "The mask file each step of a chain names, or None.");
  m.def("run_chain", &run_chain,
        "Runs a chain of steps on a copy of a uint32 (H, W) picture, with the decoded pictures of "
        "the steps' mask files (None for steps without).");
  m.def(
      "swap_red_blue",
      [](py::handle src, py::handle out) {
        const Picture s = picture_arg(kSwap, "src", src, Layout::kRgba);
        const Picture d = picture_arg(kSwap, "out", out, Layout::kRgba);
        if (d.size() != s.size() || !d.array.writeable()) {
          value_error("swap_red_blue: out must be a writeable array of src's shape");
        }
        const py::gil_scoped_release unlocked;
        swap_red_blue(s.data, d.data, s.size());
      },
      "Copies a uint8 (H, W, 4) picture with bytes 0 and 2 of each pixel swapped (out may be "
      "src).");
  py::class_<Session>(m, "Session")
      .def(py::init<size_t, py::handle, py::handle, py::handle, py::handle>())
      .def("preview", &Session::preview)
      .def("close", &Session::close)
      .def_property_readonly("closed", &Session::closed);
}
