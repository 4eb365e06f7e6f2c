// Replacements for malloc and its relatives that forward to the C library's own allocator and,
// while counting is on, add up the bytes the caller asked for. Each block allocated while counting
// is remembered with its size in a fixed table (the counter must not allocate), so its release is
// subtracted exactly; blocks from before are left out, so releasing an older workspace does not
// hide the call's own allocations. Only the benchmark program contains these; the library and
// its production path are untouched.
#include "bench/alloc_count.h"

#include <atomic>
#include <cerrno>
#include <cstddef>
#include <cstring>

extern "C" {
void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void* __libc_realloc(void* ptr, size_t size);
void* __libc_memalign(size_t alignment, size_t size);
void __libc_free(void* ptr);
}

namespace fxbench {
namespace {

// Open addressing with linear probing; a released slot keeps a tombstone so that later probes
// walk past it. Far more slots than any call holds blocks at once.
constexpr size_t kSlots = size_t{1} << 16;
constexpr uintptr_t kEmpty = 0;
constexpr uintptr_t kTombstone = 1;

struct Slot {
  uintptr_t ptr;
  size_t size;
};

Slot g_table[kSlots];
std::atomic<bool> g_counting{false};
std::atomic_flag g_lock = ATOMIC_FLAG_INIT;
int64_t g_live = 0;
int64_t g_peak = 0;
bool g_overflow = false;

struct Lock {
  Lock() {
    while (g_lock.test_and_set(std::memory_order_acquire)) {
    }
  }
  ~Lock() { g_lock.clear(std::memory_order_release); }
};

size_t home(uintptr_t p) {
  return static_cast<size_t>((static_cast<uint64_t>(p) >> 4) * 0x9E3779B97F4A7C15ull >> 48) &
         (kSlots - 1);
}

void remember(void* p, size_t size) {
  if (p == nullptr || !g_counting.load(std::memory_order_relaxed)) return;
  Lock lock;
  const auto key = reinterpret_cast<uintptr_t>(p);
  for (size_t i = home(key), n = 0; n < kSlots; i = (i + 1) & (kSlots - 1), ++n) {
    if (g_table[i].ptr == kEmpty || g_table[i].ptr == kTombstone) {
      g_table[i] = {key, size};
      g_live += static_cast<int64_t>(size);
      if (g_live > g_peak) g_peak = g_live;
      return;
    }
  }
  g_overflow = true;
}

void forget(void* p) {
  if (p == nullptr || !g_counting.load(std::memory_order_relaxed)) return;
  Lock lock;
  const auto key = reinterpret_cast<uintptr_t>(p);
  for (size_t i = home(key), n = 0; n < kSlots; i = (i + 1) & (kSlots - 1), ++n) {
    if (g_table[i].ptr == kEmpty) return;  // allocated before counting began
    if (g_table[i].ptr == key) {
      g_live -= static_cast<int64_t>(g_table[i].size);
      g_table[i].ptr = kTombstone;
      return;
    }
  }
}

}  // namespace

void start_counting() {
  Lock lock;
  std::memset(g_table, 0, sizeof g_table);
  g_live = 0;
  g_peak = 0;
  g_overflow = false;
  g_counting = true;
}

Usage stop_counting() {
  g_counting = false;
  Lock lock;
  return {g_peak, g_live, g_overflow};
}

}  // namespace fxbench

extern "C" {

void* malloc(size_t size) noexcept {
  void* p = __libc_malloc(size);
  fxbench::remember(p, size);
  return p;
}

void* calloc(size_t count, size_t size) noexcept {
  void* p = __libc_calloc(count, size);
  // calloc has refused a product that overflows, so it is exact here.
  if (p != nullptr) fxbench::remember(p, count * size);
  return p;
}

void* realloc(void* ptr, size_t size) noexcept {
  void* p = __libc_realloc(ptr, size);
  // A failed realloc keeps the old block; realloc(ptr, 0) releases it.
  if (p != nullptr || size == 0) {
    fxbench::forget(ptr);
    fxbench::remember(p, size);
  }
  return p;
}

void free(void* ptr) noexcept {
  fxbench::forget(ptr);
  __libc_free(ptr);
}

void* memalign(size_t alignment, size_t size) noexcept {
  void* p = __libc_memalign(alignment, size);
  fxbench::remember(p, size);
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
