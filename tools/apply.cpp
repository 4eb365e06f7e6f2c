// `photofx apply`: a chain of effects on one file, or on many with --out-dir, on every core.
//
// Each file is read, turned upright if asked, run through the chain on its decoded pixels and
// encoded once. Files are independent, so a batch runs them on -j threads; effects that use the
// library's module-wide state are serialised by the catalogue, and every file's bytes are the
// same whatever the number of threads.
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <charconv>
#include <chrono>
#include <cstdio>
#include <exception>
#include <mutex>
#include <new>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "catalog/chain.h"
#include "tools/cli.h"
#include "tools/exif.h"
#include "tools/image.h"

namespace fxtool {
namespace {

using fxcat::Step;

// A mask file, read once for every input, as the bytes a selection takes (the catalogue's
// mask_of_picture says which pixels it selects).
struct MaskFile {
  int32_t width = 0, height = 0;
  std::vector<uint8_t> bytes;
};

std::string read_mask(const std::string& path, int64_t max_pixels, MaskFile& out) {
  Image m;
  if (std::string err = read_image(path, m, {.max_pixels = max_pixels}); !err.empty()) {
    return path + ": " + err;
  }
  out.width = m.width;
  out.height = m.height;
  out.bytes = fxcat::mask_of_picture(m.pixels.data(), m.width, m.height);
  return {};
}

bool parse_whole(const std::string& text, int64_t min, int64_t max, int64_t& out) {
  int64_t v = 0;
  const auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), v);
  if (ec != std::errc() || end != text.data() + text.size() || v < min || v > max) return false;
  out = v;
  return true;
}

// The options of `apply` that are the tool's rather than a step's.
class ApplyOptions : public fxcat::ChainHost {
 public:
  std::string out_dir, format;
  int64_t jobs = 0;     // 0: the number of cores
  int64_t quality = 0;  // 0: the default
  int64_t max_pixels = kDefaultMaxPixels;
  bool progress = false, help = false, lossless = false, strip = false, auto_orient = false;

  bool option(size_t, fxcat::Option& opt, fxcat::Words& words, std::string& error) override {
    const std::string& w = opt.word;
    const bool long_form = w.rfind("--", 0) == 0;
    if (opt.name == "help" || w == "-h") return help = true;
    if (long_form && !opt.has_value) {
      bool* flag = opt.name == "progress"      ? &progress
                   : opt.name == "lossless"    ? &lossless
                   : opt.name == "strip"       ? &strip
                   : opt.name == "auto-orient" ? &auto_orient
                                               : nullptr;
      if (flag != nullptr) {
        if (*flag) error = w + " is given twice";
        *flag = true;
        return true;
      }
    }
    // -j4 as well as -j 4.
    if (!long_form && w.size() > 2 && w.rfind("-j", 0) == 0) {
      opt.name.assign(1, 'j');
      opt.value.assign(w, 2);
      opt.has_value = true;
    }
    const bool is_jobs = (long_form && opt.name == "jobs") || (!long_form && opt.name == "j");
    if (!long_form && !is_jobs) return false;
    if (!is_jobs && opt.name != "out-dir" && opt.name != "format" && opt.name != "quality" &&
        opt.name != "max-pixels") {
      return false;
    }
    const std::string shown = long_form ? "--" + opt.name : w.substr(0, 2);
    if (!words.take_value(opt)) {
      error = shown + " needs a value";
      return true;
    }
    if (!seen_.insert(is_jobs ? "jobs" : opt.name).second) {
      error = shown + " is given twice";
    } else if (opt.name == "out-dir") {
      out_dir = opt.value;
      if (out_dir.empty()) error = "--out-dir needs a directory";
    } else if (opt.name == "format") {
      format = opt.value;
      if (format_of_name("." + format) == FileFormat::kUnknown) {
        error = "--format must be png, jpg, jpeg, webp, tif or tiff, not '" + format + "'";
      }
    } else if (is_jobs) {
      if (!parse_whole(opt.value, 1, 1024, jobs)) {
        error = shown + " needs a number of files at once, 1..1024, not '" + opt.value + "'";
      }
    } else if (opt.name == "quality") {
      if (!parse_whole(opt.value, 1, 100, quality)) {
        error = "--quality needs a whole number 1..100, not '" + opt.value + "'";
      }
    } else if (!parse_whole(opt.value, 1, kMaxPixels, max_pixels)) {
      error = "--max-pixels needs a whole number 1.." + std::to_string(kMaxPixels) +
              " (what the library can address), not '" + opt.value + "'";
    }
    return true;
  }

  std::string effects_hint() const override { return " (photofx list shows them)"; }

 private:
  std::set<std::string> seen_;
};

struct Job {
  std::string in, out;
};

struct Settings {
  const std::vector<Step>* steps;
  int64_t max_pixels;
  bool strip, auto_orient;
  WriteOptions write;
};

// Reads one input, runs the chain and writes the output. Returns the reason for failure,
// naming the file it concerns.
std::string process(const Settings& s, const Job& job) {
  Image img;
  Metadata metadata;
  const bool want_metadata = !s.strip || s.auto_orient;
  const ReadOptions read{.max_pixels = s.max_pixels,
                         .metadata = want_metadata ? &metadata : nullptr};
  if (std::string err = read_image(job.in, img, read); !err.empty()) return job.in + ": " + err;
  if (s.auto_orient) {
    const int32_t orientation = exif_orientation(metadata.exif);
    orient_upright(img, orientation);
    if (orientation > 1) set_exif_orientation(metadata.exif, 1);
  }
  if (std::string err = fxcat::run_chain(*s.steps, img.pixels, img.width, img.height);
      !err.empty()) {
    return job.in + ": " + err;
  }
  WriteOptions write = s.write;
  write.metadata = s.strip ? nullptr : &metadata;
  if (std::string err = write_image(job.out, img, write); !err.empty()) {
    return job.out + ": " + err;
  }
  return {};
}

// Progress of a batch on stderr: a bar redrawn in place on a terminal, a line per file
// elsewhere (with --progress), nothing otherwise. Messages about failures go through it so that
// they never land in the middle of the bar.
class Progress {
 public:
  enum class Mode { kQuiet, kLines, kBar };

  Progress(Mode mode, size_t total)
      : mode_(mode), total_(total), start_(std::chrono::steady_clock::now()) {}

  void started(size_t index, const Job& job) {
    if (mode_ != Mode::kLines) return;
    const std::lock_guard lock(mutex_);
    std::fprintf(stderr, "photofx: [%zu/%zu] %s -> %s\n", index + 1, total_, job.in.c_str(),
                 job.out.c_str());
  }

  void finished(const std::string& error) {
    const std::lock_guard lock(mutex_);
    ++done_;
    if (!error.empty()) {
      ++failed_;
      if (mode_ == Mode::kBar) std::fputs("\r\033[K", stderr);
      say(error);
    }
    if (mode_ == Mode::kBar) draw();
  }

  void end() {
    if (mode_ == Mode::kBar) std::fputc('\n', stderr);
  }

 private:
  // "photofx: [==========          ] 12/40 done, 1 failed, 3.2 files/s", under 80 columns.
  void draw() {
    constexpr size_t kWidth = 20;
    const size_t filled = total_ == 0 ? kWidth : done_ * kWidth / total_;
    const double seconds =
        std::chrono::duration<double>(std::chrono::steady_clock::now() - start_).count();
    std::fprintf(stderr, "\r\033[Kphotofx: [%s%s] %zu/%zu done, %zu failed, %.1f files/s",
                 std::string(filled, '=').c_str(), std::string(kWidth - filled, ' ').c_str(), done_,
                 total_, failed_, seconds > 0 ? double(done_) / seconds : 0.0);
    std::fflush(stderr);
  }

  Mode mode_;
  size_t total_, done_ = 0, failed_ = 0;
  std::chrono::steady_clock::time_point start_;
  std::mutex mutex_;
};

// Runs every job on `threads` threads; returns the number that failed.
size_t run_batch(const Settings& s, const std::vector<Job>& jobs, size_t threads,
                 Progress& progress) {
  std::atomic<size_t> next{0}, failed{0};
  const auto work = [&] {
    for (size_t i; (i = next.fetch_add(1)) < jobs.size();) {
      progress.started(i, jobs[i]);
      std::string err;
      try {
        err = process(s, jobs[i]);
      } catch (const std::bad_alloc&) {
        err = jobs[i].in + ": out of memory";
      } catch (const std::exception& e) {
        err = jobs[i].in + ": " + e.what();
      }
      if (!err.empty()) ++failed;
      progress.finished(err);
    }
  };
  std::vector<std::thread> pool;
  for (size_t t = 1; t < threads; ++t) pool.emplace_back(work);
  work();
  for (std::thread& t : pool) t.join();
  progress.end();
  return failed;
}

std::string with_extension(const std::string& name, const std::string& ext) {
  const size_t dot = name.rfind('.');
  return (dot == std::string::npos || dot == 0 ? name : name.substr(0, dot)) + "." + ext;
}

}  // namespace

int apply(std::span<const std::string> words) {
  if (words.empty()) return usage_error("apply needs an effect (photofx list shows them)");
  ApplyOptions options;
  std::vector<Step> steps;
  const std::string err = fxcat::parse_chain(words, &options, steps);
  if (options.help) {
    if (steps.size() == 1) return help_effect(*steps[0].effect);
    std::fputs(usage_text().c_str(), stdout);
    return kDone;
  }
  if (!err.empty()) return usage_error(err);

  // File names come with the last step.
  for (size_t i = 0; i + 1 < steps.size(); ++i) {
    if (!steps[i].positional.empty()) {
      return usage_error(fxcat::step_label(steps, i) + "unexpected '" + steps[i].positional[0] +
                         "' (the files come after the last step)");
    }
  }
  const std::vector<std::string>& files = steps.back().positional;
  std::vector<Job> jobs;
  if (options.out_dir.empty()) {
    if (!options.format.empty()) return usage_error("--format goes with --out-dir");
    if (files.size() != 2) {
      for (const std::string& f : files) {
        if (fxcat::find_effect(f) != nullptr && access(f.c_str(), F_OK) != 0) {
          return usage_error("'" + f + "' is an effect: steps are separated by a lone ','");
        }
      }
      return usage_error("apply needs IN and OUT, or --out-dir DIR and one or more inputs");
    }
    jobs.push_back({files[0], files[1]});
  } else {
    if (files.empty()) return usage_error("apply --out-dir needs one or more inputs");
    std::set<std::string> seen;
    for (const std::string& in : files) {
      std::string name = base_name(in);
      if (!options.format.empty()) name = with_extension(name, options.format);
      const std::string out = options.out_dir + "/" + name;
      if (!seen.insert(out).second) {
        return usage_error("two inputs would both be written to " + out);
      }
      jobs.push_back({in, out});
    }
  }
  for (size_t i = 0; i < steps.size(); ++i) {
    const bool selected = steps[i].selection.any() || !steps[i].mask_path.empty();
    if (selected && steps[i].effect->selects == fxcat::Selects::kNothing) {
      return usage_error(fxcat::step_label(steps, i) + steps[i].effect->name +
                         " takes no selection (it changes the image's size)");
    }
  }
  bool any_webp = false, any_lossy = false;
  for (const Job& job : jobs) {
    const FileFormat f = format_of_name(job.out);
    if (f == FileFormat::kUnknown) {
      return usage_error(job.out +
                         ": unknown image format (use .png, .jpg, .jpeg, .webp, .tif or .tiff)");
    }
    any_webp = any_webp || f == FileFormat::kWebp;
    any_lossy =
        any_lossy || f == FileFormat::kJpeg || (f == FileFormat::kWebp && !options.lossless);
  }
  if (options.lossless && !any_webp) return usage_error("--lossless is for WebP outputs");
  if (options.quality != 0 && !any_lossy) {
    return usage_error("--quality is for JPEG and lossy WebP outputs");
  }

  // Masks are read once, for every input.
  std::vector<MaskFile> masks(steps.size());
  for (size_t i = 0; i < steps.size(); ++i) {
    if (steps[i].mask_path.empty()) continue;
    if (std::string e = read_mask(steps[i].mask_path, options.max_pixels, masks[i]); !e.empty()) {
      say(e);
      return kFailed;
    }
    steps[i].selection.mask = {.bytes = masks[i].bytes.data(),
                               .width = masks[i].width,
                               .height = masks[i].height,
                               .name = steps[i].mask_path};
  }
  if (!options.out_dir.empty()) {
    if (std::string e = make_directory(options.out_dir); !e.empty()) {
      say(e);
      return kFailed;
    }
  }

  const Settings settings{
      .steps = &steps,
      .max_pixels = options.max_pixels,
      .strip = options.strip,
      .auto_orient = options.auto_orient,
      .write = {.quality = options.quality != 0 ? static_cast<int>(options.quality)
                                                : fxcat::kDefaultQuality,
                .lossless = options.lossless}};
  const bool terminal = isatty(STDERR_FILENO) != 0;
  const Progress::Mode mode = terminal && (options.progress || !options.out_dir.empty())
                                  ? Progress::Mode::kBar
                              : options.progress ? Progress::Mode::kLines
                                                 : Progress::Mode::kQuiet;
  Progress progress(mode, jobs.size());
  const size_t cores = std::max(1u, std::thread::hardware_concurrency());
  const size_t threads =
      std::min(jobs.size(), options.jobs != 0 ? static_cast<size_t>(options.jobs) : cores);
  return run_batch(settings, jobs, threads, progress) == 0 ? kDone : kFailed;
}

}  // namespace fxtool
