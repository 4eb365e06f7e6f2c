// Replacements for malloc and its relatives that forward to the C library's own allocator and,
// while counting is on, add up the bytes of live blocks (by malloc_usable_size, so blocks freed
// later are subtracted exactly). Only the benchmark program contains them; the library and its
// production path are untouched.
#include "bench/alloc_count.h"

#include <malloc.h>

#include <atomic>
#include <cerrno>
#include <cstddef>

extern "C" {
void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void* __libc_realloc(void* ptr, size_t size);
void* __libc_memalign(size_t alignment, size_t size);
void __libc_free(void* ptr);
}

namespace fxbench {
namespace {

std::atomic<bool> g_counting{false};
std::atomic<int64_t> g_live{0};
std::atomic<int64_t> g_peak{0};

void note_alloc(void* p) {
  if (p == nullptr || !g_counting.load(std::memory_order_relaxed)) return;
  const int64_t size = static_cast<int64_t>(malloc_usable_size(p));
  const int64_t now = g_live.fetch_add(size) + size;
  int64_t peak = g_peak.load();
  while (now > peak && !g_peak.compare_exchange_weak(peak, now)) {
  }
}

void note_free(void* p) {
  if (p == nullptr || !g_counting.load(std::memory_order_relaxed)) return;
  g_live.fetch_sub(static_cast<int64_t>(malloc_usable_size(p)));
}

}  // namespace

void start_counting() {
  g_live = 0;
  g_peak = 0;
  g_counting = true;
}

Usage stop_counting() {
  g_counting = false;
  return {g_peak.load(), g_live.load()};
}

}  // namespace fxbench

extern "C" {

void* malloc(size_t size) noexcept {
  void* p = __libc_malloc(size);
  fxbench::note_alloc(p);
  return p;
}

void* calloc(size_t count, size_t size) noexcept {
  void* p = __libc_calloc(count, size);
  fxbench::note_alloc(p);
  return p;
}

void* realloc(void* ptr, size_t size) noexcept {
  // The old block's size must be read before the C library may release it.
  const bool counting = fxbench::g_counting.load(std::memory_order_relaxed);
  const int64_t old = (counting && ptr != nullptr) ? int64_t(malloc_usable_size(ptr)) : 0;
  void* p = __libc_realloc(ptr, size);
  if (counting && (p != nullptr || size == 0)) {
    fxbench::g_live.fetch_sub(old);
    fxbench::note_alloc(p);
  }
  return p;
}

void free(void* ptr) noexcept {
  fxbench::note_free(ptr);
  __libc_free(ptr);
}

void* memalign(size_t alignment, size_t size) noexcept {
  void* p = __libc_memalign(alignment, size);
  fxbench::note_alloc(p);
  return p;
}

void* aligned_alloc(size_t alignment, size_t size) noexcept { return memalign(alignment, size); }

int posix_memalign(void** out, size_t alignment, size_t size) noexcept {
  if (alignment < sizeof(void*) || (alignment & (alignment - 1)) != 0) return EINVAL;
  void* p = memalign(alignment, size);
  if (p == nullptr) return ENOMEM;
  *out = p;
  return 0;
}

void* valloc(size_t size) noexcept { return memalign(4096, size); }

void* pvalloc(size_t size) noexcept { return memalign(4096, (size + 4095) & ~size_t{4095}); }

}  // extern "C"
