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

<<<<<<< HEAD
// Adapters from the common argument shapes to a call on Buffers.
template <auto Fn>
int32_t full(Buffers& b) {
  return code_of([&] { return Fn(b.src.data(), b.dst.data(), b.width, b.height); });
}

template <auto Fn>
int32_t partial(Buffers& b) {
  const pfx::Rect r = b.bounds;
  return code_of([&] {
    return Fn(b.src.data(), b.mask.data(), b.dst.data(), b.width, b.height, r.left, r.right, r.top,
              r.bottom);
  });
}

// Partial variants with one level before the bounds (sharpen, the blur).
template <auto Fn, int32_t Level>
int32_t partial_level(Buffers& b) {
  const pfx::Rect r = b.bounds;
  Fn(b.src.data(), b.mask.data(), b.dst.data(), b.width, b.height, Level, r.left, r.right, r.top,
     r.bottom);
  return kNoCode;
}

// Source and destination in one buffer: dst, whose starting content is then the image.
template <auto Fn, int32_t Level>
int32_t full_in_place(Buffers& b) {
  return code_of([&] { return Fn(b.dst.data(), b.dst.data(), b.width, b.height, Level); });
}

template <auto Fn, int32_t Level>
int32_t partial_in_place(Buffers& b) {
  const pfx::Rect r = b.bounds;
  return code_of([&] {
    return Fn(b.dst.data(), b.mask.data(), b.dst.data(), b.width, b.height, Level, r.left, r.right,
              r.top, r.bottom);
  });
}

int32_t init_blur(Buffers& b) {
  const pfx::Rect r = b.bounds;
  fx_Init_blur(b.src.data(), b.mask.data(), b.width, b.height, r.left, r.right, r.top, r.bottom);
  return kNoCode;
}

void build_blur_workspace(Buffers& b) { init_blur(b); }

int32_t blur_preview(Buffers& b) {
  fx_make_blur_preview(b.src.data(), b.mask.data(), b.dst.data(), b.width, b.height, 6);
  return kNoCode;
}

template <auto Init>
int32_t init_tilt(Buffers& b) {
  Init(b.src.data(), b.width, b.height);
  return kNoCode;
}

void build_tilt_workspace(Buffers& b) { fx_init_tiltshift(b.src.data(), b.width, b.height); }

template <auto Fn>
int32_t tilt(Buffers& b) {
  Fn(b.src.data(), b.dst.data(), b.width, b.height, b.height / 3, b.height / 10);
  return kNoCode;
}

int32_t tilt_preview(Buffers& b) { return tilt<fx_tiltshift_preview>(b); }

// Auto adjust without memory for its gain table divides instead: the same pixels. So do the
// downlight looks, which run it.
template <auto Fn>
void unarmed(Buffers& b) {
  Fn(b.src.data(), b.dst.data(), b.width, b.height);
}

template <auto Fn>
void unarmed_partial(Buffers& b) {
  const pfx::Rect r = b.bounds;
  Fn(b.src.data(), b.mask.data(), b.dst.data(), b.width, b.height, r.left, r.right, r.top,
     r.bottom);
}

int32_t gaussian_of_work(Buffers& b) {
  make_gaussian_blur(b.work.data(), b.work_out.data(), b.depth.data(), b.width, b.height, 5);
  return kNoCode;
}

int32_t tiltshift_of_work(Buffers& b) {
  make_tiltshift(b.work.data(), b.work_out.data(), b.width, b.height);
  return kNoCode;
}

struct Case {
  const char* name;
  int32_t width, height;
  int32_t (*call)(Buffers&);               // the call under test: its result code, or kNoCode
  int32_t out_of_memory = kNoCode;         // what the call returns when an allocation fails
  bool whole = false;                      // whole-image bounds instead of masked ones
  void (*setup)(Buffers&) = nullptr;       // unarmed, before the call: the workspace it needs
  bool init = false;                       // builds a workspace: a failure must leave none
  int32_t (*observe)(Buffers&) = nullptr;  // unarmed, after an init: what the workspace gives
  int64_t degrades_from = 0;               // failures from this allocation on...
  void (*degraded)(Buffers&) = nullptr;    // ...write this instead of nothing
};

void PrintTo(const Case& c, std::ostream* os) { *os << c.name; }

// 500 x 60 and 30 x 500 photographs are blurred at half size; auto adjust takes a gain table
// only from about 131,000 pixels up (below that it divides).
// clang-format off
const Case kCases[] = {
    // Depth-of-field blur.
    {.name = "fx_Init_blur", .width = 500, .height = 60, .call = init_blur, .init = true,
     .observe = blur_preview},
    {.name = "fx_Init_blur_whole", .width = 500, .height = 60, .call = init_blur, .whole = true,
     .init = true, .observe = blur_preview},
    {.name = "fx_make_blur_preview", .width = 500, .height = 60, .call = blur_preview,
     .setup = build_blur_workspace},
    {.name = "fx_make_blur", .width = 500, .height = 60, .call = partial_level<fx_make_blur, 6>},
    {.name = "applyBlur", .width = 500, .height = 60, .call = partial_level<applyBlur, 8>,
     .whole = true},
    {.name = "make_gaussian_blur", .width = 40, .height = 30, .call = gaussian_of_work},
    // Tilt-shift.
    {.name = "fx_init_tiltshift", .width = 30, .height = 500, .call = init_tilt<fx_init_tiltshift>,
     .init = true, .observe = tilt_preview},
    {.name = "initTiltShift", .width = 30, .height = 500, .call = init_tilt<initTiltShift>,
     .init = true, .observe = tilt_preview},
    {.name = "fx_tiltshift_preview", .width = 30, .height = 500, .call = tilt_preview,
     .setup = build_tilt_workspace},
    {.name = "makeTiltShift", .width = 30, .height = 500, .call = tilt<makeTiltShift>,
     .setup = build_tilt_workspace},
    {.name = "fx_tiltshift_preview_on_blur", .width = 30, .height = 500, .call = tilt_preview,
     .setup = build_blur_workspace},
    {.name = "fx_apply_tiltshift", .width = 30, .height = 500, .call = tilt<fx_apply_tiltshift>},
    {.name = "applyTiltShift", .width = 30, .height = 500, .call = tilt<applyTiltShift>},
    {.name = "make_tiltshift", .width = 40, .height = 30, .call = tiltshift_of_work},
    // Preset compositing: downlight (the other looks are made pixel by pixel, without scratch).
    {.name = "fx_apply_downlight_partial_masked", .width = 512, .height = 300,
     .call = partial<fx_apply_downlight_partial>, .degrades_from = 2,
     .degraded = unarmed_partial<fx_apply_downlight_partial>},
    {.name = "fx_apply_downlight_partial", .width = 512, .height = 300,
     .call = partial<fx_apply_downlight_partial>, .whole = true, .degrades_from = 2,
     .degraded = unarmed_partial<fx_apply_downlight_partial>},
    {.name = "applyDownlightPartial", .width = 512, .height = 300,
     .call = partial<applyDownlightPartial>, .whole = true, .degrades_from = 2,
     .degraded = unarmed_partial<applyDownlightPartial>},
    // Film looks: the two rows soft glow saves in place (vintage is made without scratch).
    {.name = "fx_softglow", .width = 23, .height = 17, .call = full_in_place<fx_softglow, 60>,
     .out_of_memory = PHOTOFX_OUT_OF_MEMORY},
    {.name = "applySoftglow", .width = 23, .height = 17, .call = full_in_place<applySoftglow, 80>},
    {.name = "fx_softglow_partial", .width = 23, .height = 17,
     .call = partial_in_place<fx_softglow_partial, 60>, .out_of_memory = PHOTOFX_OUT_OF_MEMORY},
    {.name = "applySoftglowPartial", .width = 23, .height = 17,
     .call = partial_in_place<applySoftglowPartial, 90>, .whole = true},
    // Auto adjust, and downlight, which runs it as its second pass.
    {.name = "fx_process_hdr", .width = 512, .height = 300, .call = full<fx_process_hdr>,
     .out_of_memory = PHOTOFX_SUCCESS, .degrades_from = 1, .degraded = unarmed<fx_process_hdr>},
    {.name = "applyAutoAdjust", .width = 512, .height = 301, .call = full<applyAutoAdjust>,
     .out_of_memory = PHOTOFX_SUCCESS, .degrades_from = 1, .degraded = unarmed<applyAutoAdjust>},
    {.name = "fx_apply_downlight", .width = 512, .height = 300, .call = full<fx_apply_downlight>,
     .degrades_from = 1, .degraded = unarmed<fx_apply_downlight>},
    {.name = "applyDownlight", .width = 512, .height = 301, .call = full<applyDownlight>,
     .degrades_from = 1, .degraded = unarmed<applyDownlight>},
};
// clang-format on

// Every case starts from the module as a host would have it mid-session: a blur workspace of
// another photograph exists, which a one-shot call must leave alone and an init must release.
void start(const Case& c, Buffers& b) {
=======
// The module as a host has it mid-session: a workspace of another photograph (a blur workspace,
// or for the tilt-shift previews a tilt-shift one), which a one-shot call must leave alone and an
// init must release.
void start(const cat::Export& e, Buffers& b) {
>>>>>>> main
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
