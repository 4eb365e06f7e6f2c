// Every catalogue row that allocates, run with each of its allocations failing in turn, into a
// second buffer and in place.
//
// A failed allocation must never be written through (the sanitizer build would stop), must leak
// nothing (the sanitizer build runs LeakSanitizer at exit), must return PHOTOFX_OUT_OF_MEMORY
// where the function returns a code (auto adjust, which divides instead, PHOTOFX_SUCCESS), must
// leave the destination as it was (or, for the rows that degrade, make what they make with
// memory), must leave the workspace as it was (an init: no workspace at all), must never write
// the caller's inputs, and must not stop the next call, with memory to spare, from working.
#include <gtest/gtest.h>

#include <string>

#include "frame/alloc_hook.h"
#include "support/catalog.h"

namespace {

namespace cat = pfx::catalog;
using cat::Shape;
using pfx::test::Buffers;

// 512 x 300 for the blur, which then works at half size, and auto adjust, which then takes its
// gain table (from about 131,000 pixels up); 23 x 17 for the rest.
bool large(const cat::Export& e) {
  return pfx::test::works_reduced(e) || e.has(cat::kAutoParameters);
}

struct Globals {
  uint8_t *ssrc, *sblur, *tempd;
  int32_t wd, ht, all_flag, ratio;
  static Globals now() {
    return {g_ssrc, g_sblur, g_tempd, g_scaled_wd, g_scaled_ht, all, resize_ratio};
  }
  bool operator==(const Globals&) const = default;
};

// The module as a host has it mid-session: a workspace of another photograph (a blur workspace,
// or for the tilt-shift previews a tilt-shift one), which a one-shot call must leave alone and an
// init must release.
void start(const cat::Export& e, Buffers& b) {
  pfx::arm_allocation_failure(0);
  fx_destroy_blur();
  if (e.shape == Shape::kTilt && e.has(cat::kWorkspace)) {
    fx_init_tiltshift(b.src.data(), b.width, b.height);
  } else if (e.shape == Shape::kBlurPreview) {
    fx_Init_blur(b.src.data(), b.mask.data(), b.width, b.height, b.bounds.left, b.bounds.right,
                 b.bounds.top, b.bounds.bottom);
  } else {
    const pfx::test::Pixels other = pfx::test::random_image(9, 7, 75);
    fx_Init_blur(other.data(), nullptr, 9, 7, 1, 0, 0, 0);
  }
}

bool is_init(const cat::Export& e) {
  return e.shape == Shape::kBlurInit || e.shape == Shape::kTiltInit;
}

struct Outcome {
  int64_t code, requests;
  Buffers b;
};

// The row's typical call, the nth allocation failing (0: none); `before` gets the module state
// the call starts from.
Outcome call(const cat::Export& e, const Buffers& fresh, bool in_place, int64_t fail_at,
             Globals* before = nullptr) {
  Outcome o{0, 0, fresh};
  start(e, o.b);
  if (before != nullptr) *before = Globals::now();
  if (in_place) o.b.dst = o.b.src;
  const cat::Args a = o.b.args(e, pfx::test::typical(e), in_place);
  pfx::arm_allocation_failure(fail_at);
  o.code = e.call(a);
  o.requests = pfx::allocation_requests();
  pfx::arm_allocation_failure(0);
  return o;
}

TEST(AllocationFailure, WritesNothingLeaksNothingAndTheNextCallWorks) {
  for (const cat::Export& e : cat::kExports) {
    if (!pfx::test::is_image_call(e.shape)) continue;
    bool allocates = false;
    for (bool in_place : {false, true}) {
      if (in_place && e.shape != Shape::kFull && e.shape != Shape::kPartial) continue;
      SCOPED_TRACE(std::string(e.name) + (in_place ? " in place" : ""));
      const Buffers fresh(large(e) ? 512 : 23, large(e) ? 300 : 17, 71,
                          e.shape == Shape::kPartial && in_place);
      const Outcome ref = call(e, fresh, in_place, 0);
      const int64_t allocations = ref.requests;
      allocates = allocates || allocations > 0;
      for (int64_t n = 1; n <= allocations; ++n) {
        SCOPED_TRACE("allocation " + std::to_string(n) + " of " + std::to_string(allocations));
        Globals before{};
        const Outcome o = call(e, fresh, in_place, n, &before);
        EXPECT_EQ(o.b.mask, fresh.mask);
        EXPECT_EQ(o.b.texture, fresh.texture);
        EXPECT_EQ(o.b.work, fresh.work);
        if (!in_place) {
          EXPECT_EQ(o.b.src, fresh.src);
        }
        if (is_init(e)) {
          EXPECT_TRUE(g_ssrc == nullptr && g_sblur == nullptr && g_tempd == nullptr);
        } else {
          EXPECT_TRUE(Globals::now() == before);
        }
        const bool wrote = o.b.dst != (in_place ? fresh.src : fresh.dst);
        if (e.has(cat::kDegradesWithout) && wrote) {
          EXPECT_EQ(o.b.dst, ref.b.dst);
          EXPECT_TRUE(o.code == cat::kNoCode || o.code == PHOTOFX_SUCCESS);
        } else {
          EXPECT_FALSE(wrote);
          EXPECT_EQ(o.b.work_out, fresh.work_out);
          EXPECT_TRUE(o.code == cat::kNoCode || o.code == PHOTOFX_OUT_OF_MEMORY ||
                      (e.has(cat::kDegradesWithout) && o.code == PHOTOFX_SUCCESS));
        }
        // With memory to spare the same call works again.
        const Outcome next = call(e, fresh, in_place, 0);
        EXPECT_EQ(next.code, ref.code);
        EXPECT_EQ(next.b.dst, ref.b.dst);
        EXPECT_EQ(next.b.work_out, ref.b.work_out);
      }
    }
    EXPECT_EQ(allocates, e.has(cat::kAllocates)) << e.name << " allocates";
  }
  pfx::arm_allocation_failure(0);
  fx_destroy_blur();
}

// The wrappers themselves: a product beyond 32 bits and a refused request are null, and a
// refused reallocation keeps the old block, which the caller still owns and frees.
TEST(AllocationWrappers, RefusedRequestsGiveNullAndKeepTheOldBlock) {
  for (const auto alloc : {fx_malloc, fx_calloc}) {
    EXPECT_EQ(alloc(0x10000u, 0x10000u), nullptr);  // exactly 2^32 bytes
    EXPECT_EQ(alloc(0x80000000u, 2u), nullptr);
  }
  for (int64_t n : {1, 2}) {
    pfx::arm_allocation_failure(n);
    void* a = fx_malloc(4, 4);
    void* b = fx_calloc(4, 4);
    pfx::arm_allocation_failure(0);
    EXPECT_EQ(a == nullptr, n == 1);
    EXPECT_EQ(b == nullptr, n == 2);
    fx_free(a);
    fx_free(b);
  }
  auto* block = static_cast<uint8_t*>(fx_calloc(8, 1));
  ASSERT_NE(block, nullptr);
  block[7] = 42;
  pfx::arm_allocation_failure(1);
  EXPECT_EQ(fx_realloc(block, 64), nullptr);
  pfx::arm_allocation_failure(0);
  EXPECT_EQ(block[7], 42);
  fx_free(block);
}

}  // namespace
