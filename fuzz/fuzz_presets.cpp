// Fuzz target: the preset looks, full and partial, and auto adjust with its four parameters.
//
// Besides the harness's checks, a partial look must leave every destination pixel outside its
// (clipped) rectangle as it was, and auto adjust must return the code its arguments call for.
// Images of 150 pixels and more each way, which auto adjust maps through its tone curve, are a
// small fuzzed tile repeated, so that a short input still makes a varied histogram. Parameters
// are set through fx_set_hdr or stored straight into the globals with any value, and put back
// after each run so that every input replays the same.
#include "fuzz/harness.h"
#include "photofx.h"

namespace {

using namespace pfx::fuzz;
using pfx::Rect;

struct SavedParams {
  int32_t t = g_HDR_Threshold, c = g_HDR_CutOff, w1 = g_HDR_Weight1, w2 = g_HDR_Weight2;
  ~SavedParams() { g_HDR_Threshold = t, g_HDR_CutOff = c, g_HDR_Weight1 = w1, g_HDR_Weight2 = w2; }
};

void pick_params(FuzzedDataProvider& in) {
  switch (in.ConsumeIntegralInRange<int>(0, 2)) {
    case 0:
      return;
    case 1:
      fx_set_hdr(pick_level(in, -5, 140), pick_level(in, -5, 110), pick_level(in, 250, 8300),
                 pick_level(in, 250, 8300));
      return;
    default:
      g_HDR_Threshold = pick_level(in, -5, 140), g_HDR_CutOff = pick_level(in, -5, 110);
      g_HDR_Weight1 = pick_level(in, -5, 8300), g_HDR_Weight2 = pick_level(in, -5, 8300);
  }
}

template <auto Fn>
void full_look(FuzzedDataProvider& in) {
  SavedParams saved;
  pick_params(in);
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider&) {
    Fn(s, d, z.width, z.height);
  });
}

// Pixels outside the rectangle, clipped to the image, keep what the destination held.
void check_outside_untouched(const Images& im, Rect b, const std::vector<uint32_t>& before) {
  if (!is_region(b)) return;
  const Rect r = pfx::clip_to_image(b, im.size.width, im.size.height);
  for (size_t i = 0; i < im.dst.size(); ++i) {
    const int64_t x = static_cast<int64_t>(i % static_cast<size_t>(im.size.width));
    const int64_t y = static_cast<int64_t>(i / static_cast<size_t>(im.size.width));
    if (x < r.left || x > r.right || y < r.top || y > r.bottom) {
      FUZZ_CHECK(im.dst.data()[i] == before[i]);
    }
  }
}

template <auto Fn>
void partial_look(FuzzedDataProvider& in) {
  SavedParams saved;
  pick_params(in);
  Images im(in);
  const Rect b = pick_bounds(in, im.size);
  const std::vector<uint32_t> before = im.dst.contents();
  Fn(im.s(), im.m(), im.d(), im.size.width, im.size.height, b.left, b.right, b.top, b.bottom);
  if (im.null_src || im.null_dst || (is_region(b) && im.null_mask) || nothing_to_do(im.size)) {
    im.check_untouched(before);
    return;
  }
  im.check();
  check_outside_untouched(im, b, before);
}

int32_t expected_code(const uint32_t* s, const uint32_t* d, Size z) {
  return s == nullptr || d == nullptr || too_large(z) ? PHOTOFX_INVALID_ARGUMENT : PHOTOFX_SUCCESS;
}

template <auto Fn>
void auto_adjust(FuzzedDataProvider& in) {
  SavedParams saved;
  pick_params(in);
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider&) {
    FUZZ_CHECK(Fn(s, d, z.width, z.height) == expected_code(s, d, z));
  });
}

// Auto adjust's tone curve, and downlight with it, on 150..160 x 150..160 pixels: into a second
// buffer and in place, which must agree; the partial look with fuzzed bounds.
void large(FuzzedDataProvider& in) {
  SavedParams saved;
  pick_params(in);
  const int32_t w = in.ConsumeIntegralInRange<int32_t>(150, 160);
  const int32_t h = in.ConsumeIntegralInRange<int32_t>(150, 160);
  const int32_t tw = in.ConsumeIntegralInRange<int32_t>(1, 24);
  const int32_t th = in.ConsumeIntegralInRange<int32_t>(1, 24);
  std::vector<uint32_t> tile(static_cast<size_t>(tw) * static_cast<size_t>(th));
  for (uint32_t& p : tile) p = in.ConsumeIntegral<uint32_t>();
  const size_t n = static_cast<size_t>(w) * static_cast<size_t>(h);
  Pixels src(n, 0x5EC0DE5Eu), dst(n, 0xD5D5D5D5u), in_place(n, 0x5EC0DE5Eu);
  Mask mask(n, 0x3C);
  for (size_t i = 0; i < n; ++i) {
    const size_t x = i % static_cast<size_t>(w), y = i / static_cast<size_t>(w);
    src.data()[i] =
        tile[(y % static_cast<size_t>(th)) * static_cast<size_t>(tw) + x % static_cast<size_t>(tw)];
    in_place.data()[i] = src.data()[i];
    mask.data()[i] = static_cast<uint8_t>((src.data()[i] >> 24) & 3);
  }
  const std::vector<uint32_t> src_before = src.contents();
  const std::vector<uint8_t> mask_before = mask.contents();
  const int op = in.ConsumeIntegralInRange<int>(0, 2);
  if (op == 0) {
    FUZZ_CHECK(fx_process_hdr(src.data(), dst.data(), w, h) == PHOTOFX_SUCCESS);
    FUZZ_CHECK(applyAutoAdjust(in_place.data(), in_place.data(), w, h) == PHOTOFX_SUCCESS);
    FUZZ_CHECK(in_place.contents() == dst.contents());
  } else if (op == 1) {
    fx_apply_downlight(src.data(), dst.data(), w, h);
    applyDownlight(in_place.data(), in_place.data(), w, h);
    FUZZ_CHECK(in_place.contents() == dst.contents());
  } else {
    const Rect b = pick_bounds(in, {w, h, n});
    applyDownlightPartial(src.data(), mask.data(), dst.data(), w, h, b.left, b.right, b.top,
                          b.bottom);
  }
  FUZZ_CHECK(src.guards_intact() && dst.guards_intact() && in_place.guards_intact());
  FUZZ_CHECK(mask.guards_intact());
  FUZZ_CHECK(src.contents() == src_before && mask.contents() == mask_before);
}

// Each value is stored exactly when it lies in its range; the getters report the globals.
void set_hdr(FuzzedDataProvider& in) {
  SavedParams saved;
  const int32_t before[4] = {fx_get_threshold_hdr(), fx_get_cutoff_hdr(), fx_get_weight1_hdr(),
                             fx_get_weight2_hdr()};
  const int32_t t = pick_level(in, -5, 140), c = pick_level(in, -5, 110);
  const int32_t w1 = pick_level(in, 250, 8300), w2 = pick_level(in, 250, 8300);
  fx_set_hdr(t, c, w1, w2);
  FUZZ_CHECK(fx_get_threshold_hdr() == (t >= 0 && t <= 127 ? t : before[0]));
  FUZZ_CHECK(fx_get_cutoff_hdr() == (c >= 0 && c <= 100 ? c : before[1]));
  FUZZ_CHECK(fx_get_weight1_hdr() == (w1 >= 300 && w1 <= 8196 ? w1 : before[2]));
  FUZZ_CHECK(fx_get_weight2_hdr() == (w2 >= 300 && w2 <= 8196 ? w2 : before[3]));
  FUZZ_CHECK(g_HDR_Threshold == fx_get_threshold_hdr() && g_HDR_CutOff == fx_get_cutoff_hdr());
  FUZZ_CHECK(g_HDR_Weight1 == fx_get_weight1_hdr() && g_HDR_Weight2 == fx_get_weight2_hdr());
}

const Op kOps[] = {
    {"retro", full_look<fx_apply_retro>},
    {"retro partial", partial_look<fx_apply_retro_partial>},
    {"sunshine", full_look<fx_apply_sunshine>},
    {"sunshine partial", partial_look<fx_apply_sunshine_partial>},
    {"downlight", full_look<fx_apply_downlight>},
    {"downlight partial", partial_look<fx_apply_downlight_partial>},
    {"bluewash", full_look<fx_apply_bluewash>},
    {"bluewash partial", partial_look<fx_apply_bluewash_partial>},
    {"nostalgia", full_look<fx_apply_nostalgia>},
    {"nostalgia partial", partial_look<fx_apply_nostalgia_partial>},
    {"yellowglow", full_look<fx_apply_yellowglow>},
    {"yellowglow partial", partial_look<fx_apply_yellowglow_partial>},
    {"applyRetro", full_look<applyRetro>},
    {"applyRetroPartial", partial_look<applyRetroPartial>},
    {"applySunshine", full_look<applySunshine>},
    {"applySunshinePartial", partial_look<applySunshinePartial>},
    {"applyDownlight", full_look<applyDownlight>},
    {"applyDownlightPartial", partial_look<applyDownlightPartial>},
    {"applyBluewash", full_look<applyBluewash>},
    {"applyBluewashPartial", partial_look<applyBluewashPartial>},
    {"applyNostalgia", full_look<applyNostalgia>},
    {"applyNostalgiaPartial", partial_look<applyNostalgiaPartial>},
    {"applyYellowglow", full_look<applyYellowglow>},
    {"applyYellowglowPartial", partial_look<applyYellowglowPartial>},
    {"auto adjust", auto_adjust<fx_process_hdr>},
    {"applyAutoAdjust", auto_adjust<applyAutoAdjust>},
    {"tone curve", large},
    {"fx_set_hdr", set_hdr},
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return run_one(kOps, data, size);
}
