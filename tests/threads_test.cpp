// The library's promise to threads: functions that touch no module state may run at the same
// time on different buffers. Every such catalogue row runs on four threads at once, each on its
// own buffers, and each result must match the single-threaded one. The tsan preset builds this
// test with ThreadSanitizer, which reports any shared write the comparison could miss; the wasm
// build runs it on workers over shared memory (tests/CMakeLists.txt).
#include <gtest/gtest.h>

#include <string>
#include <thread>
#include <vector>

#include "support/catalog.h"

namespace {

namespace cat = pfx::catalog;
using pfx::test::Buffers;

// The error word is per thread, so its functions may run together too.
bool runs_alone(const cat::Export& e) {
  return e.call == nullptr || e.has(cat::kWorkspace) || e.has(cat::kAutoParameters);
}

struct Result {
  int64_t code;
  pfx::test::Pixels dst;
  pfx::test::Bytes work_out;
  bool operator==(const Result&) const = default;
};

// Every row's typical call on buffers of a size that differs per thread (so that no two threads
// could share a buffer by accident), and a value row over a few arguments.
std::vector<Result> run_all(int32_t thread) {
  std::vector<Result> out;
  for (const cat::Export& e : cat::kExports) {
    if (runs_alone(e)) continue;
    Buffers b(40 + thread, 30, 7);
    if (pfx::test::is_image_call(e.shape)) {
      const int64_t code = e.call(b.args(e, pfx::test::typical(e)));
      out.push_back({code, b.dst, b.work_out});
      continue;
    }
    uint64_t sum = 0;
    for (int32_t v = -70; v <= 70; ++v) {
      cat::Args a = b.args(e, pfx::test::typical(e));
      if (e.shape == cat::Shape::kValue) a.level[0] = a.level[1] = a.level[2] = v * 977;
      sum = sum * 31 + static_cast<uint64_t>(e.call(a));
    }
    out.push_back({static_cast<int64_t>(sum), {}, {}});
  }
  return out;
}

TEST(Threads, ExportsWithoutModuleStateRunTogetherOnSeparateBuffers) {
  constexpr int32_t kThreads = 4;
  std::vector<std::vector<Result>> alone(kThreads), together(kThreads);
  for (int32_t t = 0; t < kThreads; ++t) alone[t] = run_all(t);
  std::vector<std::thread> threads;
  for (int32_t t = 0; t < kThreads; ++t) {
    threads.emplace_back([&together, t] { together[t] = run_all(t); });
  }
  for (std::thread& t : threads) t.join();
  for (int32_t t = 0; t < kThreads; ++t) {
    ASSERT_EQ(together[t].size(), alone[t].size());
    size_t i = 0;
    for (const cat::Export& e : cat::kExports) {
      if (runs_alone(e)) continue;
      EXPECT_TRUE(together[t][i] == alone[t][i]) << e.name << " on thread " << t;
      ++i;
    }
  }
}

}  // namespace
