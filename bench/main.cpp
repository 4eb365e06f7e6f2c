// The benchmark program: every entry of the effect and reference tables on a 12-megapixel
// photograph (4000 x 3000) and on a preview-sized one (1080 x 720), both scaled from a real
// photograph, with Google Benchmark.
//
// Each benchmark is named <effect>/<full|partial>/<size>, floor/memcpy/<size> or
// peer/<peer>/<size>. Before the timed calls it makes one checked call: its scratch memory is
// counted (counters scratch_peak and scratch_kept, in bytes) and its output must differ from the
// photograph, so that a refused argument cannot pass for a fast effect. Its label carries the
// goal and the peer for bench/report.
//
//   photofx_bench [--short] [--photo=FILE] [Google Benchmark flags]
//
// --short runs each benchmark for two iterations: enough to prove that everything builds, runs
// and writes its output, no more.
#include <benchmark/benchmark.h>
#include <dirent.h>

#include <cstdio>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include <opencv2/core.hpp>
#include <opencv2/core/utility.hpp>
#include <opencv2/imgproc.hpp>

#include "bench/alloc_count.h"
#include "bench/scene.h"
#include "bench/suite.h"
#include "photofx.h"
#include "tools/image.h"

namespace fxbench {
namespace {

// The photograph cropped to the scene's shape and scaled to its size.
void fill_photo(const fxtool::Image& photo, Scene& s) {
  int32_t cw = photo.width, ch = photo.height;
  if (int64_t{cw} * s.height > int64_t{ch} * s.width) {
    cw = static_cast<int32_t>(int64_t{ch} * s.width / s.height);
  } else {
    ch = static_cast<int32_t>(int64_t{cw} * s.height / s.width);
  }
  const cv::Mat in(photo.height, photo.width, CV_8UC4, const_cast<uint32_t*>(photo.pixels.data()));
  const cv::Rect crop((photo.width - cw) / 2, (photo.height - ch) / 2, cw, ch);
  cv::Mat out(s.height, s.width, CV_8UC4, s.src.data());
  cv::resize(in(crop), out, out.size(), 0, 0, cv::INTER_CUBIC);
}

std::unique_ptr<Scene> make_scene(const fxtool::Image& photo, const char* name, int32_t width,
                                  int32_t height) {
  auto s = std::make_unique<Scene>();
  s->name = name;
  s->width = width;
  s->height = height;
  const size_t n = static_cast<size_t>(width) * static_cast<size_t>(height);
  s->src.resize(n);
  s->dst.resize(n);
  s->bgr.resize(n * 3);
  fill_photo(photo, *s);
  fill_ellipse_mask(*s);
  cv::Mat bgr(height, width, CV_8UC3, s->bgr.data());
  cv::cvtColor(cv::Mat(height, width, CV_8UC4, s->src.data()), bgr, cv::COLOR_BGRA2BGR);
  return s;
}

// One registered benchmark.
struct Job {
  Scene* scene;
  bool masked;
  Call call;
  Call setup;
  Teardown teardown;
  Count items;
  bool in_place;
  bool changes;
  std::string label;
  // Filled by the first run, which makes the checked call.
  bool checked = false;
  std::string error{};
  Usage usage{};
  int64_t count = 0;
};

bool all_zero(const uint8_t* p, size_t n) {
  for (size_t i = 0; i < n; ++i) {
    if (p[i] != 0) return false;
  }
  return true;
}

// The checked call: scratch memory counted, output compared with the photograph.
void check(Job& job, const Frame& f) {
  const size_t bytes = static_cast<size_t>(f.pixels()) * 4;
  start_counting();
  job.call(f);
  job.usage = stop_counting();
  job.count = job.items != nullptr ? job.items(f) : f.pixels();
  if (job.usage.overflow) {
    job.error = "too many blocks allocated at once to count";
  } else if (job.changes) {
    if (!job.in_place && all_zero(reinterpret_cast<const uint8_t*>(f.dst), bytes)) {
      job.error = "the call wrote nothing";
    } else if (std::memcmp(f.dst, f.src, bytes) == 0) {
      job.error = "the call left the photograph unchanged";
    }
  }
  job.checked = true;
}

void run(benchmark::State& state, Job& job) {
  const Frame f = job.scene->frame(job.masked);
  const size_t bytes = static_cast<size_t>(f.pixels()) * 4;
  if (job.in_place) {
    std::memcpy(f.dst, f.src, bytes);
  } else {
    std::memset(f.dst, 0, bytes);
  }
  if (job.setup != nullptr) job.setup(f);
  if (!job.checked) check(job, f);
  if (!job.error.empty()) {
    state.SkipWithError(job.error.c_str());
  }
  for (auto _ : state) {
    job.call(f);
    benchmark::ClobberMemory();
  }
  if (job.teardown != nullptr) job.teardown();

  const int64_t per_item = job.items == working_samples ? 3 : 4;
  state.SetItemsProcessed(static_cast<int64_t>(state.iterations()) * job.count);
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * job.count * per_item);
  state.counters["scratch_peak"] = static_cast<double>(job.usage.peak);
  state.counters["scratch_kept"] = static_cast<double>(job.usage.kept);
  state.counters["image_px"] = static_cast<double>(f.pixels());
  state.SetLabel(job.label);
}

std::string goal_label(const Goal& g) {
  std::string s;
  if (g.base != Base::kNone) {
    char buf[64];
    std::snprintf(buf, sizeof buf, "goal=%s*%g", g.base == Base::kMemcpy ? "memcpy" : "peer",
                  g.factor);
    s = buf;
  }
  if (g.max_scratch > 0) {
    char buf[64];
    std::snprintf(buf, sizeof buf, "%sscratch<=%g", s.empty() ? "" : " ", g.max_scratch);
    s += buf;
  }
  return s;
}

std::string effect_label(const Effect& e, bool masked) {
  std::string s = masked ? "" : goal_label(e.goal);
  if (e.peer != Peer::kNone) s += std::string(s.empty() ? "" : " ") + "peer=" + peer_id(e.peer);
  return s;
}

std::vector<std::unique_ptr<Job>> g_jobs;

void add(const std::string& name, Job job, bool short_run) {
  g_jobs.push_back(std::make_unique<Job>(std::move(job)));
  Job* j = g_jobs.back().get();
  auto* b = benchmark::RegisterBenchmark(name.c_str(), [j](benchmark::State& s) { run(s, *j); });
  b->Unit(benchmark::kMillisecond);
  if (short_run) b->Iterations(2);
}

void register_all(Scene& scene, bool short_run) {
  const std::string size = scene.name;
  for (const Reference& r : references()) {
    const std::string name = r.peer == Peer::kNone ? "floor/" + std::string(r.id) + "/" + size
                                                   : "peer/" + std::string(r.id) + "/" + size;
    add(name, {&scene, false, r.run, r.setup, r.teardown, r.items, false, r.changes, "reference"},
        short_run);
  }
  for (const Effect& e : effects()) {
    add(std::string(e.name) + "/full/" + size,
        {&scene, false, e.full, e.setup, e.teardown, e.items, e.in_place, e.changes,
         effect_label(e, false)},
        short_run);
    if (e.partial != nullptr) {
      add(std::string(e.name) + "/partial/" + size,
          {&scene, true, e.partial, e.setup, e.teardown, e.items, e.in_place, e.changes,
           effect_label(e, true)},
          short_run);
    }
  }
}

int thread_count() {
  DIR* d = opendir("/proc/self/task");
  if (d == nullptr) return -1;
  int n = 0;
  while (const dirent* e = readdir(d)) {
    if (e->d_name[0] != '.') ++n;
  }
  closedir(d);
  return n;
}

// The library may start no threads, so its peers get none either. setNumThreads(0), called
// before OpenCV's first parallel loop, runs them all in the calling thread; a parallel backend
// that ignored it would show up as extra threads after a large blur.
bool single_thread_opencv(Scene& scene) {
  cv::Mat in(scene.height, scene.width, CV_8UC4, scene.src.data()), out;
  cv::GaussianBlur(in, out, cv::Size(9, 9), 0);
  return thread_count() == 1;
}

// The processor's name, for the report.
std::string cpu_name() {
  std::FILE* f = std::fopen("/proc/cpuinfo", "r");
  if (f == nullptr) return "unknown";
  char line[256];
  std::string name = "unknown";
  while (std::fgets(line, sizeof line, f) != nullptr) {
    if (std::strncmp(line, "model name", 10) == 0) {
      const char* colon = std::strchr(line, ':');
      if (colon != nullptr) {
        name = colon + 1 + std::strspn(colon + 1, " \t");
        name.erase(name.find_last_not_of(" \n") + 1);
      }
      break;
    }
  }
  std::fclose(f);
  return name;
}

// The scratch figures are only as good as the counting: the library's own allocation must show.
bool counting_sees_library() {
  start_counting();
  void* p = fx_malloc(1 << 20, 1);
  const Usage u = stop_counting();
  fx_free(p);
  return p != nullptr && u.peak == (1 << 20) && u.kept == (1 << 20);
}

}  // namespace
}  // namespace fxbench

int main(int argc, char** argv) {
  bool short_run = false;
  std::string photo_path = PHOTOFX_BENCH_PHOTO;
  std::vector<char*> args;
  for (int i = 0; i < argc; ++i) {
    if (std::strcmp(argv[i], "--short") == 0) {
      short_run = true;
    } else if (std::strncmp(argv[i], "--photo=", 8) == 0) {
      photo_path = argv[i] + 8;
    } else {
      args.push_back(argv[i]);
    }
  }
  cv::setNumThreads(0);  // first: the scenes are scaled with OpenCV already
  int bench_argc = static_cast<int>(args.size());
  benchmark::Initialize(&bench_argc, args.data());
  if (benchmark::ReportUnrecognizedArguments(bench_argc, args.data())) return 2;

  fxtool::Image photo;
  const std::string why = fxtool::read_image(photo_path, photo);
  if (!why.empty()) {
    std::fprintf(stderr, "photofx_bench: %s: %s\n", photo_path.c_str(), why.c_str());
    return 1;
  }
  auto photo12 = fxbench::make_scene(photo, "12mp", 4000, 3000);
  auto preview = fxbench::make_scene(photo, "preview", 1080, 720);

  if (!fxbench::single_thread_opencv(*photo12)) {
    std::fprintf(stderr, "photofx_bench: OpenCV still runs %d threads\n", fxbench::thread_count());
    return 1;
  }
  if (!fxbench::counting_sees_library()) {
    std::fprintf(stderr, "photofx_bench: the allocation counter does not see the library\n");
    return 1;
  }

  fxbench::register_all(*photo12, short_run);
  fxbench::register_all(*preview, short_run);
  benchmark::AddCustomContext("photo", photo_path);
  benchmark::AddCustomContext("cpu", fxbench::cpu_name());
  benchmark::AddCustomContext("opencv", CV_VERSION);
  benchmark::AddCustomContext("compiler", __VERSION__);
  benchmark::AddCustomContext("library_flags", PHOTOFX_BENCH_FLAGS);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();

  if (fxbench::thread_count() != 1) {
    std::fprintf(stderr, "photofx_bench: a peer started threads\n");
    return 1;
  }
  return 0;
}
