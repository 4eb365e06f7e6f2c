// Every exported function that allocates, run with each of its allocations failing in turn.
//
// A failed allocation must never be written through (the sanitizer build would stop), must leak
// nothing (the sanitizer build runs LeakSanitizer at exit), must return PHOTOFX_OUT_OF_MEMORY
// where the function returns a code, must leave the destination and the module's globals as
// they were (or, for an init, no workspace at all), must never write the caller's inputs, and
// must not stop the next call, with memory to spare, from working. A new allocating function
// needs one line in kCases.
#include <gtest/gtest.h>

#include <cctype>
#include <cstdint>
#include <ostream>
#include <string>
#include <type_traits>
#include <vector>

#include "frame/alloc_hook.h"
#include "frame/frame.h"
#include "photofx.h"
#include "support/calls.h"
#include "support/images.h"

namespace {

using pfx::test::code_of;
using pfx::test::kNoCode;
using pfx::test::Mask;
using pfx::test::Pixels;
using Bytes = std::vector<uint8_t>;

constexpr uint32_t kUntouched = 0xA5A5A5A5u;
constexpr uint8_t kUntouchedByte = 0x5A;

// The arguments of one call: a photograph with its mask and a destination, working images and a
// depth map of the same width and height for the blur building blocks, a texture, and region
// bounds that select masked mode (`whole` selects the whole image instead).
struct Buffers {
  int32_t width, height;
  Pixels src, dst, texture;
  Mask mask;
  Bytes work, work_out, depth;
  pfx::Rect bounds;

  Buffers(int32_t w, int32_t h, bool whole)
      : width(w),
        height(h),
        src(pfx::test::random_image(w, h, 71)),
        dst(src.size(), kUntouched),
        texture(pfx::test::random_image(w, h, 72)),
        mask(pfx::test::random_mask(w, h, 73)),
        work(src.size() * 3),
        work_out(src.size() * 3, kUntouchedByte),
        depth(src.size()),
        bounds(whole ? pfx::Rect{1, 0, 0, 0} : pfx::Rect{1, w - 2, 1, h - 2}) {
    pfx::test::Rng rng(74);
    for (uint8_t& b : work) b = static_cast<uint8_t>(rng.word());
    for (uint8_t& b : depth) b = static_cast<uint8_t>(rng.word() & 1);
  }
};

// The module state an allocating call may touch.
struct Globals {
  uint8_t *ssrc, *sblur, *tempd;
  int32_t wd, ht, all_flag, ratio;
  static Globals now() {
    return {g_ssrc, g_sblur, g_tempd, g_scaled_wd, g_scaled_ht, all, resize_ratio};
  }
  bool operator==(const Globals&) const = default;
};

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
  pfx::arm_allocation_failure(0);
  fx_destroy_blur();
  const Pixels other = pfx::test::random_image(9, 7, 75);
  fx_Init_blur(other.data(), nullptr, 9, 7, 1, 0, 0, 0);
  if (c.setup != nullptr) c.setup(b);
}

struct Outcome {
  int32_t code;
  Pixels dst;
  Bytes work_out;
};

// The call, unarmed, and what the next observation shows.
Outcome run_unarmed(const Case& c, Buffers& b) {
  b.dst.assign(b.dst.size(), kUntouched);
  b.work_out.assign(b.work_out.size(), kUntouchedByte);
  const int32_t code = c.call(b);
  if (c.observe != nullptr) c.observe(b);
  return {code, b.dst, b.work_out};
}

class AllocationFailure : public ::testing::TestWithParam<Case> {
 protected:
  void TearDown() override {
    pfx::arm_allocation_failure(0);
    fx_destroy_blur();
    all = 0;
  }
};

TEST_P(AllocationFailure, WritesNothingLeaksNothingAndTheNextCallWorks) {
  const Case& c = GetParam();
  Buffers fresh(c.width, c.height, c.whole);

  // The unarmed call: how many allocations it makes, and what it writes.
  Buffers ref = fresh;
  start(c, ref);
  pfx::arm_allocation_failure(0);
  const int32_t ok_code = c.call(ref);
  const int64_t allocations = pfx::allocation_requests();
  if (c.observe != nullptr) c.observe(ref);
  ASSERT_GE(allocations, 1) << "allocates nothing at this size";
  if (c.out_of_memory != kNoCode) {
    EXPECT_EQ(ok_code, PHOTOFX_SUCCESS);
  }
  ASSERT_TRUE(ref.dst != fresh.dst || ref.work_out != fresh.work_out) << "writes nothing";

  for (int64_t n = 1; n <= allocations; ++n) {
    SCOPED_TRACE("allocation " + std::to_string(n) + " of " + std::to_string(allocations));
    Buffers b = fresh;
    start(c, b);
    const Globals before = Globals::now();
    pfx::arm_allocation_failure(n);
    const int32_t code = c.call(b);
    pfx::arm_allocation_failure(0);

    EXPECT_EQ(code, c.out_of_memory);
    EXPECT_EQ(b.src, fresh.src);
    EXPECT_EQ(b.mask, fresh.mask);
    EXPECT_EQ(b.texture, fresh.texture);
    EXPECT_EQ(b.work, fresh.work);
    EXPECT_EQ(b.depth, fresh.depth);
    if (c.init) {
      EXPECT_TRUE(g_ssrc == nullptr && g_sblur == nullptr && g_tempd == nullptr);
      c.observe(b);  // a preview without a workspace writes nothing
    } else {
      EXPECT_TRUE(Globals::now() == before);
    }
    if (c.degrades_from != 0 && n >= c.degrades_from) {
      if (c.degraded != nullptr) {
        Buffers expected = fresh;
        c.degraded(expected);
        EXPECT_EQ(b.dst, expected.dst);
      } else {
        EXPECT_NE(b.dst, fresh.dst);  // the chain went on
      }
    } else {
      EXPECT_EQ(b.dst, fresh.dst);
      EXPECT_EQ(b.work_out, fresh.work_out);
    }

    // With memory to spare the same call works again, from the state the failure left.
    const Outcome next = run_unarmed(c, b);
    EXPECT_EQ(next.code, ok_code);
    EXPECT_EQ(next.dst, ref.dst);
    EXPECT_EQ(next.work_out, ref.work_out);
  }
}

std::string case_name(const ::testing::TestParamInfo<Case>& info) {
  std::string name = info.param.name;
  for (char& ch : name) {
    if (std::isalnum(static_cast<unsigned char>(ch)) == 0) ch = '_';
  }
  return name;
}

INSTANTIATE_TEST_SUITE_P(EveryAllocatingFunction, AllocationFailure, ::testing::ValuesIn(kCases),
                         case_name);

// The wrappers themselves: a refused request is null, and a refused reallocation keeps the old
// block, which the caller still owns and frees.
TEST(AllocationWrappers, RefusedRequestsGiveNullAndKeepTheOldBlock) {
  for (int64_t n : {1, 2, 3}) {
    pfx::arm_allocation_failure(n);
    void* a = fx_malloc(4, 4);
    void* b = fx_calloc(4, 4);
    auto* c = static_cast<uint8_t*>(fx_calloc(8, 1));
    pfx::arm_allocation_failure(0);
    EXPECT_EQ(a == nullptr, n == 1);
    EXPECT_EQ(b == nullptr, n == 2);
    EXPECT_EQ(c == nullptr, n == 3);
    fx_free(a);
    fx_free(b);
    fx_free(c);
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
