// The memory wrappers. Every allocation, fill and whole-image copy of the library goes through
// them, so that a test build can make any allocation fail on demand.
#include "photofx.h"

#include <cstdlib>
#include <cstring>

#include "frame/alloc_hook.h"

namespace {

// Both counts are 32-bit and the library's blocks stay below 2^32 bytes on every target. A
// product beyond that is refused here rather than left to the C library, which on a 64-bit
// target would hand out a block no 32-bit target could, and which in malloc's case would see
// the product wrapped into a short block that the caller then overruns.
bool fits_32_bits(uint32_t count, uint32_t size) {
  return static_cast<uint64_t>(count) * size <= UINT32_MAX;
}

}  // namespace

extern "C" {

void* fx_calloc(uint32_t count, uint32_t size) {
  if (!fits_32_bits(count, size) || !pfx::allocation_allowed()) return nullptr;
  return std::calloc(count, size);
}

void* fx_malloc(uint32_t count, uint32_t size) {
  if (!fits_32_bits(count, size) || !pfx::allocation_allowed()) return nullptr;
  return std::malloc(static_cast<size_t>(count) * size);
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
