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
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "catalog/chain.h"
#include "catalog/effects.h"
#include "catalog/params.h"
#include "tools/gallery.h"
#include "tools/image.h"
#include "tools/sample.h"

namespace fxtool {
namespace {

using fxcat::Effect;
using fxcat::Param;
using fxcat::Selects;
using fxcat::Step;

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

bool is_option(const std::string& s) { return s.size() > 1 && s[0] == '-'; }

// ---- list and help ----------------------------------------------------------------------------

std::string param_list(const Effect& e) {
  std::string s;
  for (size_t k = 0; k < e.param_count(); ++k) {
    s += std::string(k == 0 ? "" : "  ") + "--" + e.params[k].name + " " +
         fxcat::describe(e.params[k]);
  }
  return s.empty() ? "(no parameters)" : s;
}

int list_effects() {
  size_t name_width = 0, family_width = 0;
  for (const Effect& e : fxcat::effects()) {
    name_width = std::max(name_width, std::string_view(e.name).size());
    family_width = std::max(family_width, std::string_view(e.family).size());
  }
  for (const Effect& e : fxcat::effects()) {
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
    case Selects::kKeep:
      std::printf("selection: the whole image is edited, then only selected pixels are kept\n");
      break;
    case Selects::kNothing:
      std::printf("selection: none (the effect changes the image's size)\n");
      break;
  }
  for (size_t k = 0; k < e.param_count(); ++k) {
    const Param& p = e.params[k];
    std::printf("  --%-12s %-24s %s\n", p.name, fxcat::describe(p).c_str(), p.help);
  }
  if (e.gallery != nullptr) std::printf("gallery: %s\n", e.gallery);
  return kDone;
}

int help(fxcat::Words& args) {
  if (args.done()) {
    std::fputs(kUsageText, stdout);
    return kDone;
  }
  const std::string name = args.next();
  const Effect* e = fxcat::find_effect(name);
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

// A mask file selects a pixel whose grey value is at least this: grey is the luma
// (77 R + 150 G + 29 B) / 256, scaled by alpha / 255 where the file has alpha.
constexpr uint32_t kMaskThreshold = 128;

bool mask_selects(uint32_t pixel) {
  const uint32_t r = (pixel >> 16) & 0xFF, g = (pixel >> 8) & 0xFF, b = pixel & 0xFF;
  const uint32_t grey = (77 * r + 150 * g + 29 * b) >> 8;
  return grey * (pixel >> 24) >= kMaskThreshold * 255;
}

// A mask file, read once for every input, as the bytes a selection takes.
struct MaskFile {
  std::string path;
  int32_t width = 0, height = 0;
  std::vector<uint8_t> bytes;
};

std::string read_mask(const std::string& path, MaskFile& out) {
  Image m;
  if (std::string err = read_image(path, m); !err.empty()) return path + ": " + err;
  out.path = path;
  out.width = m.width;
  out.height = m.height;
  out.bytes.resize(m.pixels.size());
  for (size_t i = 0; i < m.pixels.size(); ++i) out.bytes[i] = mask_selects(m.pixels[i]) ? 1 : 0;
  return {};
}

// The tool's own options among a chain's words.
class ApplyOptions : public fxcat::ChainHost {
 public:
  std::string out_dir;
  bool force_progress = false;
  bool help = false;

  bool option(size_t, fxcat::Option& opt, fxcat::Words& words, std::string& error) override {
    if (opt.name == "help" || opt.word == "-h") {
      help = true;
      return true;
    }
    if (opt.word == "--progress") {
      force_progress = true;
      return true;
    }
    if (opt.word.rfind("--out-dir", 0) == 0 && opt.name == "out-dir") {
      if (!words.take_value(opt)) {
        error = "--out-dir needs a value";
      } else if (!out_dir.empty()) {
        error = "--out-dir is given twice";
      } else if (opt.value.empty()) {
        error = "--out-dir needs a directory";
      } else {
        out_dir = opt.value;
      }
      return true;
    }
    return false;
  }

  std::string effects_hint() const override { return " (photofx list shows them)"; }
};

// Reads one input, runs the chain and writes the output. Returns the reason for failure,
// naming the file it concerns.
std::string apply_one(const std::vector<Step>& steps, const std::string& in_path,
                      const std::string& out_path) {
  Image img;
  if (std::string err = read_image(in_path, img); !err.empty()) return in_path + ": " + err;
  if (std::string err = fxcat::run_chain(steps, img.pixels, img.width, img.height); !err.empty()) {
    return in_path + ": " + err;
  }
  if (std::string err = write_image(out_path, img); !err.empty()) return out_path + ": " + err;
  return {};
}

int apply(std::span<const std::string> words) {
  ApplyOptions options;
  std::vector<Step> steps;
  const std::string err = fxcat::parse_chain(words, &options, steps);
  if (options.help) {
    if (steps.size() == 1 && steps[0].effect != nullptr) return help_effect(*steps[0].effect);
    std::fputs(kUsageText, stdout);
    return kDone;
  }
  if (words.empty()) return usage_error("apply needs an effect (photofx list shows them)");
  if (!err.empty()) return usage_error(err);

  // File names come with the last step.
  for (size_t i = 0; i + 1 < steps.size(); ++i) {
    if (!steps[i].positional.empty()) {
      return usage_error(fxcat::step_label(steps, i) + "unexpected '" + steps[i].positional[0] +
                         "' (the files come after the last step)");
    }
  }
  const std::vector<std::string>& files = steps.back().positional;
  std::vector<std::pair<std::string, std::string>> jobs;  // input, output
  const std::string& out_dir = options.out_dir;
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
  for (size_t i = 0; i < steps.size(); ++i) {
    if (steps[i].selection.any() || !steps[i].mask_path.empty()) {
      if (steps[i].effect->selects == Selects::kNothing) {
        return usage_error(fxcat::step_label(steps, i) + steps[i].effect->name +
                           " takes no selection (it changes the image's size)");
      }
    }
  }
  for (const auto& job : jobs) {
    if (format_of_name(job.second) == FileFormat::kUnknown) {
      return usage_error(job.second + ": unknown image format (use .png, .jpg or .jpeg)");
    }
  }
  const bool progress = options.force_progress || (!out_dir.empty() && isatty(STDERR_FILENO) != 0);

  std::vector<MaskFile> masks(steps.size());
  for (size_t i = 0; i < steps.size(); ++i) {
    if (steps[i].mask_path.empty()) continue;
    if (std::string e = read_mask(steps[i].mask_path, masks[i]); !e.empty()) {
      say(e);
      return kFailed;
    }
    steps[i].selection.mask = {.bytes = masks[i].bytes.data(),
                               .width = masks[i].width,
                               .height = masks[i].height,
                               .name = masks[i].path};
  }
  if (!out_dir.empty()) {
    if (std::string e = make_directory(out_dir); !e.empty()) {
      say(e);
      return kFailed;
    }
  }

  int status = kDone;
  for (size_t i = 0; i < jobs.size(); ++i) {
    if (progress) {
      std::fprintf(stderr, "photofx: [%zu/%zu] %s -> %s\n", i + 1, jobs.size(),
                   jobs[i].first.c_str(), jobs[i].second.c_str());
    }
    if (std::string e = apply_one(steps, jobs[i].first, jobs[i].second); !e.empty()) {
      say(e);
      status = kFailed;
    }
  }
  return status;
}

// ---- gallery ----------------------------------------------------------------------------------

int gallery(fxcat::Words& args) {
  std::string input, dir = "gallery", only;
  bool have_dir = false, have_only = false;
  while (!args.done()) {
    const std::string text = args.next();
    if (!is_option(text)) {
      if (!input.empty()) return usage_error("gallery takes one input photograph");
      input = text;
      continue;
    }
    fxcat::Option opt = fxcat::split_option(text);
    if (opt.name == "help" || text == "-h") {
      std::fputs(kUsageText, stdout);
      return kDone;
    }
    const bool is_dir = text == "-o" || opt.name == "out-dir";
    if (!is_dir && opt.name != "only") return usage_error("unknown option " + text);
    if (!args.take_value(opt) || opt.value.empty()) return usage_error(text + " needs a value");
    bool& have = is_dir ? have_dir : have_only;
    if (have) return usage_error(text + " is given twice");
    have = true;
    (is_dir ? dir : only) = opt.value;
  }

  std::vector<const Effect*> chosen;
  if (only.empty()) {
    for (const Effect& e : fxcat::effects()) chosen.push_back(&e);
  } else {
    std::string_view rest = only;
    while (true) {
      const size_t comma = rest.find(',');
      const std::string name(rest.substr(0, comma));
      const Effect* e = fxcat::find_effect(name);
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
  const std::vector<std::string> words(argv + 2, argv + argc);
  fxcat::Words args(words);
  if (command == "list")
    return args.done() ? list_effects() : usage_error("list takes no arguments");
  if (command == "apply") return apply(words);
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
