#include "frame/alloc_hook.h"

namespace pfx {
namespace {
thread_local int64_t g_requests = 0;
thread_local int64_t g_fail_at = 0;
}  // namespace

bool allocation_allowed() {
  ++g_requests;
  return g_fail_at == 0 || g_requests != g_fail_at;
}

void arm_allocation_failure(int64_t nth) {
  g_requests = 0;
  g_fail_at = nth;
}

int64_t allocation_requests() { return g_requests; }

}  // namespace pfx
