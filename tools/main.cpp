// photofx: the library's effects on PNG and JPEG files.
//
//   photofx list                           every effect with its parameters
//   photofx apply EFFECT [options] IN OUT  one effect on one file
//   photofx gallery [IN] [-o DIR]          every effect on one photograph
//
// Exit status: 0 when everything was done, 1 when a file could not be read, processed or
// written (the other files of the run are still done), 2 for a bad command line. Every problem
// is one line on stderr; no output file is ever left half-written.
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <exception>
#include <filesystem>
#include <new>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "tools/effect.h"
#include "tools/gallery.h"
#include "tools/image.h"
#include "tools/params.h"
#include "tools/sample.h"
#include "tools/selection.h"

namespace fxtool {
namespace {

constexpr int kDone = 0;
constexpr int kFailed = 1;
constexpr int kUsage = 2;

constexpr const char* kUsageText =
    "usage:\n"
    "  photofx list\n"
    "  photofx apply EFFECT [--PARAM VALUE]... [selection] IN OUT\n"
    "  photofx apply EFFECT [--PARAM VALUE]... [selection] --out-dir DIR IN...\n"
    "  photofx gallery [IN] [-o DIR] [--only EFFECT,...]\n"
    "  photofx help [EFFECT]\n"
    "\n"
    "Images are PNG or JPEG, read by content and written by the output's extension\n"
    "(.png keeps alpha; .jpg and .jpeg drop it).\n"
    "\n"
    "selection (a pixel is edited when every option given selects it; none: the whole image):\n"
    "  --mask FILE            greyscale image of the same size; grey 128 or more selects\n"
    "                         (grey = (77 R + 150 G + 29 B) / 256, times alpha / 255)\n"
    "  --rect X,Y,W,H         columns X..X+W-1, rows Y..Y+H-1\n"
    "  --ellipse CX,CY,RX,RY  centre and radii in pixels, edge included\n"
    "\n"
    "  --out-dir DIR          write each IN to DIR under its own name\n"
    "  --progress             a line per file even when stderr is not a terminal\n"
    "\n"
    "gallery: one PNG per effect setting, contact-sheet.png and index.html in DIR\n"
    "(default: gallery); without IN, the bundled sample photograph.\n"
    "\n"
    "Exit status: 0 done, 1 a file could not be read, processed or written, 2 bad command line.\n";

void say(const std::string& message) { std::fprintf(stderr, "photofx: %s\n", message.c_str()); }

int usage_error(const std::string& message) {
  say(message);
  return kUsage;
}

// Splits "--name=value" or takes the next argument as the value.
struct Arg {
  std::string name;  // without dashes
  std::string value;
  bool has_value = false;
};

class ArgReader {
 public:
  ArgReader(int argc, char** argv, int first) : args_(argv + first, argv + argc) {}

  bool done() const { return pos_ >= args_.size(); }
  const std::string& peek() const { return args_[pos_]; }
  std::string next() { return args_[pos_++]; }

  // The value of an option that needs one: after '=', else the following argument.
  bool value_of(Arg& arg) {
    if (arg.has_value) return true;
    if (done()) return false;
    arg.value = next();
    arg.has_value = true;
    return true;
  }

 private:
  std::vector<std::string> args_;
  size_t pos_ = 0;
};

Arg split_option(const std::string& text) {
  Arg a;
  const size_t start = text.rfind("--", 0) == 0 ? 2 : 1;
  const size_t eq = text.find('=');
  a.name = text.substr(start, eq == std::string::npos ? std::string::npos : eq - start);
  if (eq != std::string::npos) {
    a.value = text.substr(eq + 1);
    a.has_value = true;
  }
  return a;
}

bool is_option(const std::string& s) { return s.size() > 1 && s[0] == '-'; }

// ---- list and help ----------------------------------------------------------------------------

std::string param_list(const Effect& e) {
  std::string s;
  for (size_t k = 0; k < e.param_count(); ++k) {
    s += std::string(k == 0 ? "" : "  ") + "--" + e.params[k].name + " " + describe(e.params[k]);
  }
  return s.empty() ? "(no parameters)" : s;
}

int list_effects() {
  size_t name_width = 0, family_width = 0;
  for (const Effect& e : effects()) {
    name_width = std::max(name_width, std::string_view(e.name).size());
    family_width = std::max(family_width, std::string_view(e.family).size());
  }
  for (const Effect& e : effects()) {
    std::printf("%-*s  %-*s  %s  - %s\n", static_cast<int>(name_width), e.name,
                static_cast<int>(family_width), e.family, param_list(e).c_str(), e.summary);
  }
  std::printf("\nW, H: the image's width and height; L: its longer side.\n");
  return kDone;
}

int help_effect(const Effect& e) {
  std::printf("%s (%s): %s\n", e.name, e.family, e.summary);
  switch (e.selects) {
    case Selects::kMask:
      std::printf("selection: edited by the library's partial variant\n");
      break;
    case Selects::kByTool:
      std::printf("selection: the whole image is edited, then only selected pixels are kept\n");
      break;
    case Selects::kNothing:
      std::printf("selection: none (the effect changes the image's size)\n");
      break;
  }
  for (size_t k = 0; k < e.param_count(); ++k) {
    const Param& p = e.params[k];
    std::printf("  --%-12s %-24s %s\n", p.name, describe(p).c_str(), p.help);
  }
  if (e.gallery != nullptr) std::printf("gallery: %s\n", e.gallery);
  return kDone;
}

int help(ArgReader& args) {
  if (args.done()) {
    std::fputs(kUsageText, stdout);
    return kDone;
  }
  const std::string name = args.next();
  const Effect* e = find_effect(name);
  if (e == nullptr) return usage_error("unknown effect '" + name + "' (photofx list shows them)");
  return help_effect(*e);
}

// ---- apply ------------------------------------------------------------------------------------

std::string base_name(const std::string& path) {
  const size_t slash = path.rfind('/');
  return slash == std::string::npos ? path : path.substr(slash + 1);
}

// Makes `dir` (and its parents) unless it exists.
std::string make_directory(const std::string& dir) {
  std::error_code ec;
  std::filesystem::create_directories(dir, ec);
  if (ec) return dir + ": cannot create the directory: " + ec.message();
  if (!std::filesystem::is_directory(dir, ec)) return dir + ": not a directory";
  return {};
}

// Reads one input, applies the effect and writes the output. Returns the reason for failure,
// naming the file it concerns.
std::string apply_one(const Effect& effect, const Settings& settings,
                      const SelectionOptions& request, const std::string& in_path,
                      const std::string& out_path) {
  Image in;
  if (std::string err = read_image(in_path, in); !err.empty()) return in_path + ": " + err;
  Selection selection;
  if (request.any()) {
    if (std::string err = make_selection(request, in.width, in.height, selection); !err.empty()) {
      return in_path + ": " + err;
    }
  }
  Values values;
  if (std::string err = resolve(effect, settings, in.width, in.height, values); !err.empty()) {
    return in_path + ": " + err;
  }
  Image out;
  if (std::string err = run_effect(effect, values, in, request.any() ? &selection : nullptr, out);
      !err.empty()) {
    return in_path + ": " + effect.name + ": " + err;
  }
  if (std::string err = write_image(out_path, out); !err.empty()) return out_path + ": " + err;
  return {};
}

int apply(ArgReader& args) {
  if (args.done()) return usage_error("apply needs an effect (photofx list shows them)");
  const std::string name = args.next();
  if (name == "--help" || name == "-h") {
    std::fputs(kUsageText, stdout);
    return kDone;
  }
  const Effect* effect = find_effect(name);
  if (effect == nullptr)
    return usage_error("unknown effect '" + name + "' (photofx list shows them)");

  Settings settings;
  SelectionOptions request;
  std::string out_dir;
  bool force_progress = false, options_done = false;
  std::vector<std::string> files;
  while (!args.done()) {
    const std::string text = args.next();
    if (options_done || !is_option(text)) {
      files.push_back(text);
      continue;
    }
    if (text == "--") {
      options_done = true;
      continue;
    }
    Arg opt = split_option(text);
    if (opt.name == "help" || text == "-h") return help_effect(*effect);
    if (opt.name == "progress" && !opt.has_value) {
      force_progress = true;
      continue;
    }
    if (text.rfind("--", 0) != 0) return usage_error("unknown option " + text);
    if (!args.value_of(opt)) return usage_error("--" + opt.name + " needs a value");
    std::string err;
    if (opt.name == "mask") {
      if (request.has_mask) return usage_error("--mask is given twice");
      request.has_mask = true;
      request.mask_path = opt.value;
    } else if (opt.name == "rect") {
      if (request.has_rect) return usage_error("--rect is given twice");
      request.has_rect = true;
      err = parse_rect(opt.value, request.rect);
    } else if (opt.name == "ellipse") {
      if (request.has_ellipse) return usage_error("--ellipse is given twice");
      request.has_ellipse = true;
      err = parse_ellipse(opt.value, request.ellipse);
    } else if (opt.name == "out-dir") {
      if (!out_dir.empty()) return usage_error("--out-dir is given twice");
      out_dir = opt.value;
      if (out_dir.empty()) err = "--out-dir needs a directory";
    } else {
      err = set_param(*effect, opt.name, opt.value, settings);
    }
    if (!err.empty()) return usage_error(err);
  }

  if (request.any() && effect->selects == Selects::kNothing) {
    return usage_error(std::string(effect->name) +
                       " takes no selection (it changes the image's size)");
  }
  std::vector<std::pair<std::string, std::string>> jobs;  // input, output
  if (out_dir.empty()) {
    if (files.size() != 2) {
      return usage_error("apply needs IN and OUT, or --out-dir DIR and one or more inputs");
    }
    jobs.emplace_back(files[0], files[1]);
  } else {
    if (files.empty()) return usage_error("apply --out-dir needs one or more inputs");
    std::set<std::string> seen;
    for (const std::string& in : files) {
      const std::string out = out_dir + "/" + base_name(in);
      if (!seen.insert(out).second)
        return usage_error("two inputs would both be written to " + out);
      jobs.emplace_back(in, out);
    }
  }
  for (const auto& job : jobs) {
    if (format_of_name(job.second) == FileFormat::kUnknown) {
      return usage_error(job.second + ": unknown image format (use .png, .jpg or .jpeg)");
    }
  }
  const bool progress = force_progress || (!out_dir.empty() && isatty(STDERR_FILENO) != 0);

  if (request.has_mask) {
    if (std::string err = read_image(request.mask_path, request.mask_image); !err.empty()) {
      say(request.mask_path + ": " + err);
      return kFailed;
    }
  }
  if (!out_dir.empty()) {
    if (std::string err = make_directory(out_dir); !err.empty()) {
      say(err);
      return kFailed;
    }
  }

  int status = kDone;
  for (size_t i = 0; i < jobs.size(); ++i) {
    if (progress) {
      std::fprintf(stderr, "photofx: [%zu/%zu] %s -> %s\n", i + 1, jobs.size(),
                   jobs[i].first.c_str(), jobs[i].second.c_str());
    }
    if (std::string err = apply_one(*effect, settings, request, jobs[i].first, jobs[i].second);
        !err.empty()) {
      say(err);
      status = kFailed;
    }
  }
  return status;
}

// ---- gallery ----------------------------------------------------------------------------------

int gallery(ArgReader& args) {
  std::string input, dir = "gallery", only;
  bool have_dir = false, have_only = false;
  while (!args.done()) {
    const std::string text = args.next();
    if (!is_option(text)) {
      if (!input.empty()) return usage_error("gallery takes one input photograph");
      input = text;
      continue;
    }
    Arg opt = split_option(text);
    if (opt.name == "help" || text == "-h") {
      std::fputs(kUsageText, stdout);
      return kDone;
    }
    const bool is_dir = text == "-o" || opt.name == "out-dir";
    if (!is_dir && opt.name != "only") return usage_error("unknown option " + text);
    if (!args.value_of(opt) || opt.value.empty()) return usage_error(text + " needs a value");
    bool& have = is_dir ? have_dir : have_only;
    if (have) return usage_error(text + " is given twice");
    have = true;
    (is_dir ? dir : only) = opt.value;
  }

  std::vector<const Effect*> chosen;
  if (only.empty()) {
    for (const Effect& e : effects()) chosen.push_back(&e);
  } else {
    std::string_view rest = only;
    while (true) {
      const size_t comma = rest.find(',');
      const std::string name(rest.substr(0, comma));
      const Effect* e = find_effect(name);
      if (e == nullptr) return usage_error("unknown effect '" + name + "' in --only");
      chosen.push_back(e);
      if (comma == std::string_view::npos) break;
      rest.remove_prefix(comma + 1);
    }
  }

  Image photo;
  const std::string source = input.empty() ? kSampleName : base_name(input);
  const std::string err = input.empty()
                              ? decode_image(sample_photo_data(), sample_photo_size(), photo)
                              : read_image(input, photo);
  if (!err.empty()) {
    say((input.empty() ? std::string("the bundled ") + kSampleName : input) + ": " + err);
    return kFailed;
  }
  if (std::string e = make_directory(dir); !e.empty()) {
    say(e);
    return kFailed;
  }
  int32_t pictures = 0;
  if (std::string e = make_gallery(photo, source, dir, chosen, pictures); !e.empty()) {
    say(e);
    return kFailed;
  }
  std::printf("photofx: gallery of %d pictures of %s written to %s (open %s/index.html)\n",
              static_cast<int>(pictures), source.c_str(), dir.c_str(), dir.c_str());
  return kDone;
}

int run(int argc, char** argv) {
  if (argc < 2) {
    std::fputs(kUsageText, stderr);
    return kUsage;
  }
  const std::string command = argv[1];
  ArgReader args(argc, argv, 2);
  if (command == "list")
    return args.done() ? list_effects() : usage_error("list takes no arguments");
  if (command == "apply") return apply(args);
  if (command == "gallery") return gallery(args);
  if (command == "help" || command == "--help" || command == "-h") return help(args);
  return usage_error("unknown command '" + command + "'");
}

}  // namespace
}  // namespace fxtool

int main(int argc, char** argv) {
  try {
    return fxtool::run(argc, argv);
  } catch (const std::bad_alloc&) {
    fxtool::say("out of memory");
  } catch (const std::exception& e) {
    fxtool::say(e.what());
  }
  return fxtool::kFailed;
}
