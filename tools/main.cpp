// photofx: the library's effects on PNG, JPEG, WebP and TIFF files.
//
//   photofx list                                  every effect with its parameters
//   photofx apply STEP [, STEP]... [options] IN OUT   a chain of effects on a file (apply.cpp)
//   photofx gallery [IN] [-o DIR]                 every effect on one photograph
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
#include "photofx.h"
#include "tools/cli.h"
#include "tools/gallery.h"
#include "tools/image.h"
#include "tools/sample.h"

namespace fxtool {

std::string usage_text() {
  const std::string quality = std::to_string(fxcat::kDefaultQuality);
  const std::string max_pixels = std::to_string(fxcat::kDefaultMaxPixels);
  return "usage:\n"
         "  photofx list                  every effect, its parameters and their ranges\n"
         "  photofx help [EFFECT]         this text, or one effect explained\n"
         "  photofx apply STEP [, STEP]... [options] IN OUT\n"
         "  photofx apply STEP [, STEP]... [options] --out-dir DIR IN...\n"
         "  photofx gallery [IN] [-o DIR] [--only EFFECT,...]\n"
         "  photofx --version\n"
         "\n"
         "A STEP is an effect with its parameters (--level 13 or --level=13) and its\n"
         "selection. Steps are separated by a lone ',' and run in order on the decoded\n"
         "picture, which is encoded once at the end:\n"
         "  photofx apply brightness --level 13 , contrast --level 12 ,\n"
         "                vintage --ellipse 300,200,120,80 in.jpg out.jpg\n"
         "\n"
         "selection (a pixel is edited when every option given selects it; none: all):\n"
         "  --rect X,Y,W,H         columns X..X+W-1, rows Y..Y+H-1\n"
         "  --ellipse CX,CY,RX,RY  centre and radii in pixels, edge included\n"
         "  --mask FILE            an image of the same size: grey 128 or more selects\n"
         "                         (grey = (77 R + 150 G + 29 B) / 256 x alpha / 255)\n"
         "\n"
         "files: PNG, JPEG, WebP or TIFF, read by content, written by the extension of\n"
         "OUT (.png, .jpg, .jpeg, .webp, .tif, .tiff). EXIF, ICC profile and XMP are\n"
         "copied to the output.\n"
         "  --quality N            JPEG and lossy WebP quality, 1..100 (" +
         quality +
         ")\n"
         "  --lossless             lossless WebP\n"
         "  --strip                leave out EXIF, ICC profile and XMP\n"
         "  --auto-orient          turn the picture upright by its EXIF orientation first\n"
         "  --max-pixels N         refuse larger pictures unread (" +
         max_pixels +
         ")\n"
         "\n"
         "batches:\n"
         "  --out-dir DIR          write each IN to DIR under its own name\n"
         "  --format EXT           ... with this extension (png, jpg, webp, tif, ...)\n"
         "  -j N, --jobs N         files at once (default: one per core)\n"
         "  --progress             show progress even when stderr is not a terminal\n"
         "\n"
         "gallery: one PNG per effect setting, contact-sheet.png and index.html in DIR\n"
         "(default: gallery); without IN, the bundled sample photograph.\n"
         "\n"
         "Exit status: 0 done, 1 a file could not be read, processed or written,\n"
         "2 a bad command line.\n";
}

void say(const std::string& message) { std::fprintf(stderr, "photofx: %s\n", message.c_str()); }

int usage_error(const std::string& message) {
  say(message);
  return kUsage;
}

std::string base_name(const std::string& path) {
  const size_t slash = path.rfind('/');
  return slash == std::string::npos ? path : path.substr(slash + 1);
}

std::string make_directory(const std::string& dir) {
  std::error_code ec;
  std::filesystem::create_directories(dir, ec);
  if (ec) return dir + ": cannot create the directory: " + ec.message();
  if (!std::filesystem::is_directory(dir, ec)) return dir + ": not a directory";
  return {};
}

namespace {

using fxcat::Effect;
using fxcat::Param;
using fxcat::Selects;

bool is_option(const std::string& s) { return s.size() > 1 && s[0] == '-'; }

// `text` in lines of at most `width` columns, broken at spaces; lines after the first are
// indented by `indent`.
std::string wrap(std::string_view text, size_t width, size_t indent, size_t column = 0) {
  std::string out;
  const size_t first = column;
  while (!text.empty()) {
    const size_t space = text.find(' ');
    const std::string_view word = text.substr(0, space);
    if (column > first && column + 1 + word.size() > width) {
      out += '\n';
      out.append(indent, ' ');
      column = indent;
    } else if (column > first) {
      out += ' ';
      ++column;
    }
    out += word;
    column += word.size();
    if (space == std::string_view::npos) break;
    text.remove_prefix(space + 1);
  }
  return out;
}

int version() {
  std::printf("photofx %s (the command-line tool)\n", PHOTOFX_TOOL_VERSION);
  std::printf("libphotofx %d.%d.%d\n", PHOTOFX_VERSION_MAJOR, PHOTOFX_VERSION_MINOR,
              PHOTOFX_VERSION_PATCH);
  std::printf("%s\n", codec_versions().c_str());
  return kDone;
}

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

int help(fxcat::Words& args) {
  if (args.done()) {
    std::fputs(usage_text().c_str(), stdout);
    return kDone;
  }
  const std::string name = args.next();
  const Effect* e = fxcat::find_effect(name);
  if (e == nullptr) return usage_error("unknown effect '" + name + "' (photofx list shows them)");
  return help_effect(*e);
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
      std::fputs(usage_text().c_str(), stdout);
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
    std::fputs(usage_text().c_str(), stderr);
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
  if (command == "--version" || command == "version") {
    return args.done() ? version() : usage_error(command + " takes no arguments");
  }
  return usage_error("unknown command '" + command + "'");
}

}  // namespace

int help_effect(const fxcat::Effect& e) {
  constexpr size_t kColumns = 80;
  std::printf("%s\n",
              wrap(std::string(e.name) + " (" + e.family + "): " + e.summary, kColumns, 2).c_str());
  const char* how = "";
  switch (e.selects) {
    case Selects::kMask:
      how = "edited by the library's partial variant";
      break;
    case Selects::kKeep:
      how = "the whole picture is edited, then only the selected pixels are kept";
      break;
    case Selects::kNothing:
      how = "none (the effect changes the picture's size)";
      break;
  }
  std::printf("%s\n", wrap(std::string("selection: ") + how, kColumns, 2).c_str());
  if (e.state != fxcat::State::kNone) {
    std::printf("%s\n", wrap("uses the library's module-wide state: never runs at the same time "
                             "as another effect that does",
                             kColumns, 2)
                            .c_str());
  }
  // "  --name RANGE" then the help, indented under it when the two do not fit on one line.
  for (size_t k = 0; k < e.param_count(); ++k) {
    const Param& p = e.params[k];
    std::string head = std::string("  --") + p.name + " " + fxcat::describe(p);
    constexpr size_t kHelpColumn = 40;
    if (head.size() + 1 > kHelpColumn) {
      head += "\n" + std::string(kHelpColumn, ' ');
    } else {
      head += std::string(kHelpColumn - head.size(), ' ');
    }
    std::printf("%s%s\n", head.c_str(), wrap(p.help, kColumns, kHelpColumn, kHelpColumn).c_str());
  }
  if (e.gallery != nullptr)
    std::printf("%s\n", wrap(std::string("gallery: ") + e.gallery, kColumns, 2).c_str());
  return kDone;
}

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
