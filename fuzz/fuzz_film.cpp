// Fuzz target: the tone curves, the vignettes and the film looks (vintage, old photo plain and
// textured, pop art, soft glow), full, partial and preview, with their result codes.
#include "fuzz/harness.h"
#include "photofx.h"

namespace {

using namespace pfx::fuzz;
using pfx::Rect;

// A gamma from the fuzzer's bytes: any double, NaN and infinities included, or a usual value.
double pick_gamma(FuzzedDataProvider& in) {
  if (in.ConsumeBool()) return in.ConsumeFloatingPoint<double>();
  return in.PickValueInArray({0.0, -0.0, 0.58, 0.77, 1.0, 2.35, -1.0, 1e-300,
                              std::numeric_limits<double>::infinity(),
                              std::numeric_limits<double>::quiet_NaN()});
}

void gamma(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider& p) {
    control_gamma(s, d, z.width, z.height, pick_level(p, -2, 5), pick_gamma(p));
  });
}

template <auto Fn>
void levels(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider& p) {
    const int32_t channel = pick_level(p, -2, 5);
    const int32_t low = pick_level(p, -20, 270), high = pick_level(p, -20, 270);
    Fn(s, d, z.width, z.height, channel, low, high);
  });
}

void softglow(FuzzedDataProvider& in) {
  full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider& p) {
    const int32_t level = pick_level(p, -5, 105);
    const int32_t code = fx_softglow(s, d, z.width, z.height, level);
    const bool refused = !s || !d || level < 0 || level > 100 || too_large(z);
    FUZZ_CHECK(code == (refused ? PHOTOFX_INVALID_ARGUMENT : PHOTOFX_SUCCESS));
  });
}

void softglow_partial(FuzzedDataProvider& in) {
  partial_variant(in, [](const uint32_t* s, const uint8_t* m, uint32_t* d, Size z, Rect b,
                         FuzzedDataProvider& p) {
    const int32_t level = pick_level(p, -5, 105);
    const int32_t code =
        fx_softglow_partial(s, m, d, z.width, z.height, level, b.left, b.right, b.top, b.bottom);
    const bool refused =
        !s || !d || (pfx::is_region(b) && !m) || level < 0 || level > 100 || too_large(z);
    FUZZ_CHECK(code == (refused ? PHOTOFX_INVALID_ARGUMENT : PHOTOFX_SUCCESS));
  });
}

// Soft glow with the destination as its source: the result must be that of two buffers.
void softglow_in_place(FuzzedDataProvider& in) {
  Images im(in);
  if (im.null_src || too_large(im.size)) return;
  const Rect b = pick_bounds(in, im.size);
  const int32_t level = pick_level(in, -5, 105);
  const bool partial = in.ConsumeBool() && !(pfx::is_region(b) && im.null_mask);
  Pixels apart(im.size.pixels, 0);
  auto run = [&](const uint32_t* s, uint32_t* d) {
    return partial ? fx_softglow_partial(s, im.m(), d, im.size.width, im.size.height, level, b.left,
                                         b.right, b.top, b.bottom)
                   : fx_softglow(s, d, im.size.width, im.size.height, level);
  };
  const int32_t expected = run(im.src.data(), apart.data());
  for (size_t i = 0; i < im.dst.size(); ++i) im.dst.data()[i] = im.src.data()[i];
  FUZZ_CHECK(run(im.dst.data(), im.dst.data()) == expected);
  if (expected == PHOTOFX_SUCCESS) FUZZ_CHECK(im.dst.contents() == apart.contents());
  im.check();
  FUZZ_CHECK(apart.guards_intact());
}

// The textured old photo takes a texture buffer too, which it must never write.
void texture(FuzzedDataProvider& in, bool partial) {
  Images im(in);
  Pixels tex(im.size.pixels, 0x7E7E7E7Eu);
  tex.fill(in);
  const bool null_tex = in.ConsumeIntegralInRange<int>(0, 15) == 0;
  const std::vector<uint32_t> tex_before = tex.contents();
  const std::vector<uint32_t> before = im.dst.contents();
  const Rect b = pick_bounds(in, im.size);
  const uint32_t* t = null_tex ? nullptr : tex.data();
  if (partial) {
    fx_apply_oldphoto_texture_partial(im.s(), im.d(), t, im.m(), im.size.width, im.size.height,
                                      b.left, b.right, b.top, b.bottom);
  } else {
    fx_apply_oldphoto_texture(im.s(), im.d(), t, im.size.width, im.size.height);
  }
  const bool refused = im.null_src || im.null_dst || null_tex || too_large(im.size) ||
                       (partial && pfx::is_region(b) && im.null_mask);
  if (refused) {
    im.check_untouched(before);
  } else {
    im.check();
  }
  FUZZ_CHECK(tex.guards_intact());
  FUZZ_CHECK(tex.contents() == tex_before);
}

void texture_full(FuzzedDataProvider& in) { texture(in, false); }
void texture_partial(FuzzedDataProvider& in) { texture(in, true); }

const Op kOps[] = {
    {"control_gamma", gamma},
    {"changeHistogramByInput", levels<changeHistogramByInput>},
    {"changeHistogramByOutput", levels<changeHistogramByOutput>},
    {"vignette", full_plain<fx_apply_vignette>},
    {"vignette preview", full_plain<fx_apply_vignette_prev>},
    {"vintage", full_plain<fx_apply_vintage>},
    {"vintage partial", partial_plain<fx_apply_vintage_partial>},
    {"vintage preview", full_plain<fx_apply_vintage_prev>},
    {"applyVintage", full_plain<applyVintage>},
    {"applyVintagePartial", partial_plain<applyVintagePartial>},
    {"old photo", full_plain<fx_apply_oldphoto>},
    {"old photo partial", partial_plain<fx_apply_oldphoto_partial>},
    {"applyOldPhoto", full_plain<applyOldPhoto>},
    {"applyOldPhotoPartial", partial_plain<applyOldPhotoPartial>},
    {"old photo texture", texture_full},
    {"old photo texture partial", texture_partial},
    {"pop art", full_plain<fx_apply_popart>},
    {"pop art preview", full_plain<fx_apply_popart_prev>},
    {"applyPopArt", full_plain<applyPopArt>},
    {"soft glow", softglow},
    {"soft glow partial", softglow_partial},
    {"soft glow in place", softglow_in_place},
    {"applySoftglow",
     [](FuzzedDataProvider& in) {
       full_variant(in, [](const uint32_t* s, uint32_t* d, Size z, FuzzedDataProvider& p) {
         applySoftglow(s, d, z.width, z.height, pick_level(p));
       });
     }},
    {"applySoftglowPartial",
     [](FuzzedDataProvider& in) {
       partial_variant(in, [](const uint32_t* s, const uint8_t* m, uint32_t* d, Size z, Rect b,
                              FuzzedDataProvider& p) {
         applySoftglowPartial(s, m, d, z.width, z.height, pick_level(p), b.left, b.right, b.top,
                              b.bottom);
       });
     }},
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return run_one(kOps, data, size);
}
