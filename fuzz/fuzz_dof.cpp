// Fuzz target: the depth-of-field blur and tilt-shift.
//
// One-shot blurs and tilt-shifts, the working-image building blocks on their own, and sequences
// of workspace calls (inits, previews and destroys of both kinds, stray writes to the public
// globals, failed allocations, one-shot calls in between). After every call the workspace globals
// must describe one consistent state, a preview must write nothing without its workspace and
// must match the one-shot call with it, and a one-shot call must leave the workspace alone. Now
// and then an image is long enough to be scaled down by 2 to 16 per side before it is blurred.
// Every input starts and ends with no workspace and the globals as a fresh load has them.
#include <memory>
#include <vector>

#include "blur/workspace.h"
#include "frame/alloc_hook.h"
#include "fuzz/harness.h"
#include "photofx.h"

namespace {

using namespace pfx::fuzz;
using pfx::Rect;

using Bytes = Guarded<uint8_t>;

// The module state a call may change.
struct Globals {
  uint8_t *ssrc, *sblur, *tempd;
  int32_t wd, ht, all_flag, ratio;

  static Globals now() {
    return {g_ssrc, g_sblur, g_tempd, g_scaled_wd, g_scaled_ht, all, resize_ratio};
  }
  bool operator==(const Globals&) const = default;
};

void reset_module() {
  pfx::arm_allocation_failure(0);
  fx_destroy_blur();
  g_scaled_wd = g_scaled_ht = all = resize_ratio = 0;
}

// Puts the whole-image flag back after a call that tries other values.
struct KeepFlag {
  int32_t saved = all;
  ~KeepFlag() { all = saved; }
};

// Arms a failure at one of the next few allocation requests one time in four; returns which
// (0: none).
int64_t maybe_fail(FuzzedDataProvider& in) {
  if (in.ConsumeIntegralInRange<int>(0, 3) != 0) return 0;
  const int64_t n = in.ConsumeIntegralInRange<int64_t>(1, 4);
  pfx::arm_allocation_failure(n);
  return n;
}

// Whether the failure armed at n struck during the call; disarms.
bool struck(int64_t n) {
  const bool hit = n != 0 && n <= pfx::allocation_requests();
  pfx::arm_allocation_failure(0);
  return hit;
}

// Mostly the harness's small, empty, negative and huge sizes; one time in eight a photograph
// whose longer side selects a reduction of 1 to 4 and whose shorter side leaves a working image
// of 0 to 4 samples across (below 2 cannot be composited).
Size pick_dof_size(FuzzedDataProvider& in) {
  if (in.ConsumeIntegralInRange<int>(0, 7) != 0) return pick_size(in);
  static constexpr int32_t kLongSide[4] = {421, 851, 1651, 3251};
  const int32_t k = in.ConsumeIntegralInRange<int32_t>(1, 4);
  const int32_t longer = kLongSide[k - 1] + in.ConsumeIntegralInRange<int32_t>(0, 30);
  const int32_t shorter = in.ConsumeIntegralInRange<int32_t>(1, (4 << k) + 3);
  const bool wide = in.ConsumeBool();
  const int32_t w = wide ? longer : shorter, h = wide ? shorter : longer;
  return {w, h, static_cast<size_t>(w) * static_cast<size_t>(h)};
}

int32_t pick_blur_level(FuzzedDataProvider& in) { return pick_level(in, -2, 9); }

// A band centre and half-height: usually near the image, sometimes anywhere in 32 bits.
struct Band {
  int32_t centre, half;
};
Band pick_band(FuzzedDataProvider& in, int32_t height) {
  return {pick_coord(in, height),
          in.ConsumeBool() ? pick_level(in, -3, 30) : pick_coord(in, height)};
}

bool refused(const Images& im, bool needs_mask) {
  return im.null_src || im.null_dst || (needs_mask && im.null_mask) || nothing_to_do(im.size);
}

bool keeps_alpha(const std::vector<uint32_t>& out, const std::vector<uint32_t>& src) {
  for (size_t i = 0; i < out.size(); ++i) {
    if ((out[i] >> 24) != (src[i] >> 24)) return false;
  }
  return true;
}

bool can_scale_down(const Size& s) {
  const int32_t k = pfx::reduction_shift(s.width, s.height);
  return pfx::can_composite(s.width >> k, s.height >> k);
}

// ---- one-shot calls --------------------------------------------------------------------------

// fx_make_blur or applyBlur. The result must not depend on the module's whole-image flag, must
// keep every alpha byte and every unselected pixel in masked mode, and in place must equal the
// result into a second buffer. The workspace is left as it was.
void blur_once(FuzzedDataProvider& in) {
  Images im(in, pick_dof_size(in));
  const int32_t level = pick_blur_level(in);
  const Rect b = pick_bounds(in, im.size);
  const auto fn = in.ConsumeBool() ? fx_make_blur : applyBlur;
  const KeepFlag keep;
  all = in.PickValueInArray({0, 1, -1});
  Globals g = Globals::now();
  const std::vector<uint32_t> before = im.dst.contents();
  fn(im.s(), im.m(), im.d(), im.size.width, im.size.height, level, b.left, b.right, b.top,
     b.bottom);
  FUZZ_CHECK(Globals::now() == g);
  const bool masked = pfx::is_region(b);
  if (refused(im, masked)) {
    im.check_untouched(before);
    return;
  }
  im.check();
  const std::vector<uint32_t> out = im.dst.contents();
  FUZZ_CHECK(keeps_alpha(out, im.src_before));
  if (!can_scale_down(im.size)) FUZZ_CHECK(out == im.src_before);
  if (masked) {
    for (size_t i = 0; i < out.size(); ++i) {
      if (im.mask_before[i] == 0) FUZZ_CHECK(out[i] == im.src_before[i]);
    }
  }
  // The other flag value, in place.
  all = all == 0 ? 1 : 0;
  g = Globals::now();
  Pixels same(im.size.pixels, 0x5EC0DE5Eu);
  for (size_t i = 0; i < same.size(); ++i) same.data()[i] = im.src_before[i];
  fn(same.data(), im.m(), same.data(), im.size.width, im.size.height, level, b.left, b.right, b.top,
     b.bottom);
  FUZZ_CHECK(Globals::now() == g);
  FUZZ_CHECK(same.guards_intact() && same.contents() == out);
  im.check();
}

// fx_apply_tiltshift or applyTiltShift: alpha kept, in place equal to two buffers, workspace
// left alone.
void tilt_once(FuzzedDataProvider& in) {
  Images im(in, pick_dof_size(in));
  const Band band = pick_band(in, im.size.height);
  const auto fn = in.ConsumeBool() ? fx_apply_tiltshift : applyTiltShift;
  const Globals g = Globals::now();
  const std::vector<uint32_t> before = im.dst.contents();
  fn(im.s(), im.d(), im.size.width, im.size.height, band.centre, band.half);
  FUZZ_CHECK(Globals::now() == g);
  if (refused(im, false)) {
    im.check_untouched(before);
    return;
  }
  im.check();
  const std::vector<uint32_t> out = im.dst.contents();
  FUZZ_CHECK(keeps_alpha(out, im.src_before));
  if (!can_scale_down(im.size)) FUZZ_CHECK(out == im.src_before);
  Pixels same(im.size.pixels, 0x5EC0DE5Eu);
  for (size_t i = 0; i < same.size(); ++i) same.data()[i] = im.src_before[i];
  fn(same.data(), same.data(), im.size.width, im.size.height, band.centre, band.half);
  FUZZ_CHECK(same.guards_intact() && same.contents() == out);
}

// ---- building blocks on working images ---------------------------------------------------------

// A working image (3 bytes per sample) or depth map of a picked size: as large as the size
// states when that is affordable, else a token buffer that a call refusing the size never reads.
struct Working {
  Size size;
  Bytes image, other, depth;
  bool affordable;

  Working(FuzzedDataProvider& in, Size s)
      : size(s),
        image(bytes_for(s, 3), 0x3E),
        other(bytes_for(s, 3), 0x3F),
        depth(bytes_for(s, 1), 0x7D),
        affordable(s.pixels > 0 && s.pixels <= kAffordable) {
    for (size_t i = 0; i < image.size(); ++i) image.data()[i] = in.ConsumeIntegral<uint8_t>();
    // Depth bytes: mostly 0 and 1, the two values the blurs tell apart, sometimes others.
    for (size_t i = 0; i < depth.size(); ++i) {
      const uint8_t b = in.ConsumeIntegral<uint8_t>();
      depth.data()[i] = b < 80 ? 0 : (b < 230 ? 1 : b);
    }
  }

  static constexpr size_t kAffordable = 1 << 17;
  static size_t bytes_for(const Size& s, size_t per) {
    return s.pixels > 0 && s.pixels <= kAffordable ? s.pixels * per : 16 * per;
  }
};

// Working sizes around the compositing limits (2 and 2048 samples) or anywhere in 32 bits.
int32_t pick_working_side(FuzzedDataProvider& in) {
  if (in.ConsumeIntegralInRange<int>(0, 7) == 0) {
    return in.PickValueInArray({0, 1, 2, 2047, 2048, 2049, 4096, -1, INT32_MIN, INT32_MAX});
  }
  return in.ConsumeIntegralInRange<int32_t>(-1, 24);
}

// A working size whose buffers can be as large as it states, or one that every call must refuse
// (no samples, or more than the library addresses).
Size working_size(int32_t sw, int32_t sh) {
  int64_t n = pfx::pixel_count(sw, sh);
  if (n > static_cast<int64_t>(Working::kAffordable) && n <= pfx::kMaxPixels) {
    sh = 2;
    n = pfx::pixel_count(sw, sh);
  }
  return {sw, sh,
          n > 0 && n <= static_cast<int64_t>(Working::kAffordable) ? static_cast<size_t>(n) : 0};
}

// scale_down_img and scale_down_depth from any image size to any working size.
void scale_down(FuzzedDataProvider& in) {
  Images im(in);
  Working w(in, working_size(pick_working_side(in), pick_working_side(in)));
  const std::vector<uint8_t> image_before = w.image.contents(), depth_before = w.depth.contents();
  uint8_t* out = in.ConsumeIntegralInRange<int>(0, 31) == 0 ? nullptr : w.image.data();
  uint8_t* depth = in.ConsumeIntegralInRange<int>(0, 31) == 0 ? nullptr : w.depth.data();
  scale_down_img(im.s(), im.size.width, im.size.height, out, w.size.width, w.size.height);
  scale_down_depth(im.m(), im.size.width, im.size.height, depth, w.size.width, w.size.height);
  im.check();
  FUZZ_CHECK(w.image.guards_intact() && w.depth.guards_intact());
  const bool none = nothing_to_do(im.size) || !w.affordable;
  if (none || im.null_src || out == nullptr) FUZZ_CHECK(w.image.contents() == image_before);
  if (none || im.null_mask || depth == nullptr) FUZZ_CHECK(w.depth.contents() == depth_before);
  if (!none && out != nullptr && !im.null_src) {
    // The first sample always stands for the top-left pixel.
    const uint32_t p = im.src_before[0];
    FUZZ_CHECK(w.image.data()[0] == static_cast<uint8_t>(p >> 16));
    FUZZ_CHECK(w.image.data()[2] == static_cast<uint8_t>(p));
  }
}

// The four blurs of a working image. The Gaussian blur and make_tiltshift also run in place,
// which must agree with two buffers; make_tiltshift must equal the widest Gaussian blur over an
// all-ones depth map.
void working_blur(FuzzedDataProvider& in) {
  Working w(in, working_size(pick_working_side(in), pick_working_side(in)));
  const int32_t level = pick_blur_level(in);
  const int op = in.ConsumeIntegralInRange<int>(0, 3);
  const bool null_depth = in.ConsumeIntegralInRange<int>(0, 15) == 0;
  const Band band = pick_band(in, w.size.height);
  const int32_t sw = w.size.width, sh = w.size.height;
  const std::vector<uint8_t> image_before = w.image.contents(), depth_before = w.depth.contents();
  const std::vector<uint8_t> other_before = w.other.contents();
  const uint8_t* depth = null_depth ? nullptr : w.depth.data();
  switch (op) {
    case 0:
      make_gaussian_blur(w.image.data(), w.other.data(), depth, sw, sh, level);
      break;
    case 1:
      make_lens_blur(w.image.data(), w.other.data(), depth, sw, sh, level);
      break;
    case 2:
      make_tiltshift(w.image.data(), w.other.data(), sw, sh);
      break;
    default:
      make_tiltshift_lens(w.image.data(), w.other.data(), sw, sh, band.centre, band.half);
  }
  FUZZ_CHECK(w.image.guards_intact() && w.other.guards_intact() && w.depth.guards_intact());
  FUZZ_CHECK(w.image.contents() == image_before && w.depth.contents() == depth_before);
  const bool uses_depth = op < 2;
  if (!w.affordable || (uses_depth && null_depth)) {
    FUZZ_CHECK(w.other.contents() == other_before);
    return;
  }
  const std::vector<uint8_t> out = w.other.contents();
  if (op == 0 || op == 2) {
    if (op == 0) {
      make_gaussian_blur(w.image.data(), w.image.data(), depth, sw, sh, level);
    } else {
      make_tiltshift(w.image.data(), w.image.data(), sw, sh);
    }
    FUZZ_CHECK(w.image.guards_intact() && w.image.contents() == out);
  }
  if (op == 2) {
    Bytes ones(w.size.pixels, 0x7D), wide(w.size.pixels * 3, 0x3F);
    for (size_t i = 0; i < ones.size(); ++i) ones.data()[i] = 1;
    make_gaussian_blur(image_before.data(), wide.data(), ones.data(), sw, sh, 8);
    FUZZ_CHECK(wide.guards_intact() && wide.contents() == out);
  }
}

// run_blur and restore_tiltshift: a full-size image composited from a working image of any size,
// with the module's whole-image flag at any value.
void composite(FuzzedDataProvider& in) {
  Images im(in);
  Working w(in, working_size(pick_working_side(in), pick_working_side(in)));
  const int32_t flag = in.PickValueInArray({0, 0, 1, -1, 2});
  const bool restore = in.ConsumeBool();
  const Band band = pick_band(in, im.size.height);
  const bool null_blur = in.ConsumeIntegralInRange<int>(0, 31) == 0;
  const bool null_depth = in.ConsumeIntegralInRange<int>(0, 31) == 0;
  const uint8_t* blur = null_blur ? nullptr : w.image.data();
  const uint8_t* depth = null_depth ? nullptr : w.depth.data();
  const int32_t sw = w.size.width, sh = w.size.height;
  const std::vector<uint8_t> image_before = w.image.contents(), depth_before = w.depth.contents();
  const std::vector<uint32_t> before = im.dst.contents();
  const KeepFlag keep;
  all = flag;
  if (restore) {
    restore_tiltshift(im.s(), blur, im.d(), im.size.width, im.size.height, sw, sh, band.centre,
                      band.half);
  } else {
    run_blur(im.s(), blur, im.m(), depth, im.d(), im.size.width, im.size.height, sw, sh);
  }
  FUZZ_CHECK(all == flag);
  FUZZ_CHECK(w.image.guards_intact() && w.depth.guards_intact());
  FUZZ_CHECK(w.image.contents() == image_before && w.depth.contents() == depth_before);
  const bool every_pixel = flag != 0;
  const bool unaddressable = pfx::pixel_count(sw, sh) > pfx::kMaxPixels;
  if (refused(im, !restore && !every_pixel) || null_blur || (!restore && null_depth) ||
      unaddressable) {
    im.check_untouched(before);
    return;
  }
  im.check();
  const std::vector<uint32_t> out = im.dst.contents();
  FUZZ_CHECK(keeps_alpha(out, im.src_before));
  if (!pfx::can_composite(sw, sh)) FUZZ_CHECK(out == im.src_before);
  if (!restore && !every_pixel) {
    for (size_t i = 0; i < out.size(); ++i) {
      if (im.mask_before[i] == 0) FUZZ_CHECK(out[i] == im.src_before[i]);
    }
  }
}

// ---- workspace sequences -----------------------------------------------------------------------

// What the workspace holds after the calls so far: nothing, a blur workspace, a tilt-shift
// workspace, or the depth map a tilt-shift destroy leaves of a blur workspace.
enum class Kind { kNone, kBlur, kTilt, kDepthOnly };

struct Workspace {
  Kind kind = Kind::kNone;
  // The photograph and bounds of the last successful init. While `comparable`, previews of it
  // must equal the one-shot calls; a host writing the public globals ends that.
  Images* photo = nullptr;
  Rect bounds{};
  bool comparable = false;
};

void check_globals(const Workspace& ws) {
  FUZZ_CHECK((g_ssrc == nullptr) == (g_sblur == nullptr));
  switch (ws.kind) {
    case Kind::kNone:
      FUZZ_CHECK(g_ssrc == nullptr && g_tempd == nullptr);
      break;
    case Kind::kBlur:
      FUZZ_CHECK(g_ssrc != nullptr && g_tempd != nullptr);
      break;
    case Kind::kTilt:
      FUZZ_CHECK(g_ssrc != nullptr && g_tempd == nullptr);
      break;
    case Kind::kDepthOnly:
      FUZZ_CHECK(g_ssrc == nullptr && g_tempd != nullptr);
      break;
  }
}

using Photos = std::vector<std::unique_ptr<Images>>;

// fx_Init_blur: three buffers, and a failure at any of them leaves no workspace at all.
void init_blur(FuzzedDataProvider& in, Workspace& ws, Photos& photos) {
  Images& im = *photos.emplace_back(std::make_unique<Images>(in, pick_dof_size(in)));
  const Rect b = pick_bounds(in, im.size);
  const bool every_pixel = !pfx::is_region(b);
  const int32_t all_before = all;
  const int64_t fail = maybe_fail(in);
  fx_Init_blur(im.s(), im.m(), im.size.width, im.size.height, b.left, b.right, b.top, b.bottom);
  const bool failed = struck(fail);
  im.check();
  const bool bad = im.null_src || (im.null_mask && !every_pixel) || nothing_to_do(im.size);
  if (bad || failed) {
    ws = {};
    FUZZ_CHECK(g_ssrc == nullptr && g_sblur == nullptr && g_tempd == nullptr);
    if (bad) FUZZ_CHECK(all == all_before);
    return;
  }
  const int32_t k = pfx::reduction_shift(im.size.width, im.size.height);
  FUZZ_CHECK(g_ssrc != nullptr && g_sblur != nullptr && g_tempd != nullptr);
  FUZZ_CHECK(g_scaled_wd == im.size.width >> k && g_scaled_ht == im.size.height >> k);
  FUZZ_CHECK(all == (every_pixel ? 1 : 0));
  ws = {Kind::kBlur, &im, b, true};
}

// fx_init_tiltshift or initTiltShift: two buffers, all or nothing; the whole-image flag stays.
void init_tilt(FuzzedDataProvider& in, Workspace& ws, Photos& photos) {
  Images& im = *photos.emplace_back(std::make_unique<Images>(in, pick_dof_size(in)));
  const auto fn = in.ConsumeBool() ? fx_init_tiltshift : initTiltShift;
  const int32_t all_before = all;
  const int64_t fail = maybe_fail(in);
  fn(im.s(), im.size.width, im.size.height);
  const bool failed = struck(fail);
  im.check();
  FUZZ_CHECK(all == all_before);
  const bool bad = im.null_src || nothing_to_do(im.size);
  if (bad || failed) {
    ws = {};
    FUZZ_CHECK(g_ssrc == nullptr && g_sblur == nullptr && g_tempd == nullptr);
    return;
  }
  const int32_t k = pfx::reduction_shift(im.size.width, im.size.height);
  FUZZ_CHECK(g_ssrc != nullptr && g_sblur != nullptr && g_tempd == nullptr && resize_ratio == k);
  FUZZ_CHECK(g_scaled_wd == im.size.width >> k && g_scaled_ht == im.size.height >> k);
  ws = {Kind::kTilt, &im, {}, true};
}

// A preview of the workspace's own photograph (usually) or of any other image. It changes no
// global. Without its workspace, or when its blur scratch is refused, it writes nothing; with
// it, and the globals as the init left them, it equals the one-shot call (a tilt-shift preview
// also runs on a blur workspace).
void preview(FuzzedDataProvider& in, const Workspace& ws, bool tilt) {
  const bool own = ws.photo != nullptr && in.ConsumeIntegralInRange<int>(0, 3) != 0;
  std::unique_ptr<Images> fresh;
  if (!own) fresh = std::make_unique<Images>(in, pick_dof_size(in));
  Images& im = own ? *ws.photo : *fresh;
  const int32_t level = pick_blur_level(in);
  const Band band = pick_band(in, im.size.height);
  const bool entry = in.ConsumeBool();
  for (size_t i = 0; i < im.dst.size(); ++i) im.dst.data()[i] = 0xD5D5D5D5u;
  const std::vector<uint32_t> before = im.dst.contents();
  const Globals g = Globals::now();
  const int64_t fail = maybe_fail(in);
  if (tilt) {
    (entry ? makeTiltShift : fx_tiltshift_preview)(im.s(), im.d(), im.size.width, im.size.height,
                                                   band.centre, band.half);
  } else {
    fx_make_blur_preview(im.s(), im.m(), im.d(), im.size.width, im.size.height, level);
  }
  const bool failed = struck(fail);
  FUZZ_CHECK(Globals::now() == g);
  im.check();
  const bool has_workspace = tilt ? g_ssrc != nullptr : (g_ssrc != nullptr && g_tempd != nullptr);
  if (!has_workspace || failed || refused(im, !tilt && all == 0)) {
    im.check_untouched(before);
    return;
  }
  const std::vector<uint32_t> out = im.dst.contents();
  FUZZ_CHECK(keeps_alpha(out, im.src_before));
  if (!own || !ws.comparable) return;
  Pixels once(im.size.pixels, 0xD5D5D5D5u);
  if (tilt) {
    fx_apply_tiltshift(im.s(), once.data(), im.size.width, im.size.height, band.centre, band.half);
  } else {
    const Rect& b = ws.bounds;
    fx_make_blur(im.s(), im.m(), once.data(), im.size.width, im.size.height, level, b.left, b.right,
                 b.top, b.bottom);
  }
  FUZZ_CHECK(once.contents() == out);
}

void workspace(FuzzedDataProvider& in) {
  reset_module();
  Workspace ws;
  Photos photos;
  const int steps = in.ConsumeIntegralInRange<int>(1, 8);
  for (int s = 0; s < steps && in.remaining_bytes() > 0; ++s) {
    switch (in.ConsumeIntegralInRange<int>(0, 9)) {
      case 0:
        init_blur(in, ws, photos);
        break;
      case 1:
        init_tilt(in, ws, photos);
        break;
      case 2:
      case 3:
        preview(in, ws, false);
        break;
      case 4:
      case 5:
        preview(in, ws, true);
        break;
      case 6:
        fx_destroy_blur();
        ws = {};
        break;
      case 7:
        (in.ConsumeBool() ? fx_destroy_tiltshift : destroyTiltShift)();
        ws = {ws.kind == Kind::kBlur || ws.kind == Kind::kDepthOnly ? Kind::kDepthOnly
                                                                    : Kind::kNone};
        break;
      case 8: {
        // A host writing the public globals: previews must stay inside the workspace buffers.
        const int32_t v = pick_level(in, -2, 30);
        switch (in.ConsumeIntegralInRange<int>(0, 2)) {
          case 0:
            g_scaled_wd = v;
            break;
          case 1:
            g_scaled_ht = v;
            break;
          default:
            all = v;
        }
        ws.comparable = false;
        break;
      }
      default:
        // One-shot calls check themselves that they leave the workspace as it was.
        if (in.ConsumeBool()) {
          blur_once(in);
        } else {
          tilt_once(in);
        }
    }
    check_globals(ws);
  }
  reset_module();
}

const Op kOps[] = {
    {"blur", blur_once},        {"tilt-shift", tilt_once},
    {"scale down", scale_down}, {"working blur", working_blur},
    {"composite", composite},   {"workspace", workspace},
    {"workspace", workspace},   {"workspace", workspace},
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return run_one(kOps, data, size);
}
