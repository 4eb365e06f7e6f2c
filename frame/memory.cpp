// The memory wrappers. Every allocation, fill and whole-image copy of the library goes through
// them, so that a test build can make any allocation fail on demand.
#include "photofx.h"

#include <cstdlib>
#include <cstring>

#include "frame/alloc_hook.h"

extern "C" {

void* fx_calloc(uint32_t count, uint32_t size) {
  if (!pfx::allocation_allowed()) return nullptr;
  return std::calloc(count, size);
}

void* fx_malloc(uint32_t count, uint32_t size) {
  // count x size is formed in 64 bits: a product beyond 32 bits would otherwise wrap into a
  // short block that the caller then overruns.
  const uint64_t bytes = static_cast<uint64_t>(count) * size;
  if (bytes > UINT32_MAX) return nullptr;
  if (!pfx::allocation_allowed()) return nullptr;
  return std::malloc(static_cast<size_t>(bytes));
}

void* fx_realloc(void* ptr, uint32_t size) {
  if (!pfx::allocation_allowed()) return nullptr;
  return std::realloc(ptr, size);
}

void fx_free(void* ptr) { std::free(ptr); }

void* fx_memset(void* ptr, int32_t value, uint32_t count) {
  if (count == 0) return ptr;  // memset with a null pointer is undefined even for 0 bytes
  return std::memset(ptr, value, count);
}

void* fx_memcpy(void* dst, const void* src, uint32_t count) {
  if (count == 0) return dst;
  return std::memcpy(dst, src, count);
}

}  // extern "C"
