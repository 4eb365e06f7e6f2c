// The benchmark suite's vocabulary: the buffers a benchmark works on, the goals an effect is held
// to, the peers it is compared with, and the table entry that describes one effect.
//
// Every effect is one entry of the table in bench/effects.cpp; the floors and the OpenCV peers
// are the table in bench/peers.cpp. bench/main.cpp turns each entry into one benchmark per
// image size and variant, checks that the call really wrote its output, measures its scratch
// memory and labels it with its goal and peer, which bench/report reads back.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

namespace fxbench {

// The buffers of one benchmark. The effect, the memcpy floor and the peers all see the same
// photograph, destination and mask of a size.
struct Frame {
  int32_t width = 0;
  int32_t height = 0;
  const uint32_t* src = nullptr;
  uint32_t* dst = nullptr;  // width x height words; working-image kernels write their bytes here
  const uint8_t* mask = nullptr;  // 1 inside an ellipse holding about a third of the pixels
  // A partial run gets the ellipse's bounding box; a full run gets empty bounds (left > right),
  // the whole-image mode, so a workspace built from this frame blurs everything.
  int32_t left = 0, right = -1, top = 0, bottom = -1;
  const uint8_t* bgr = nullptr;  // the photograph as 3 bytes per pixel, for the 3-channel peers

  int64_t pixels() const { return int64_t{width} * height; }
};

using Call = void (*)(const Frame&);
using Teardown = void (*)();
// How many pixels (or working samples) one call processes, for the megapixels-per-second figure.
using Count = int64_t (*)(const Frame&);

// The peers: the nearest comparable work in OpenCV, run single-threaded on the same buffers.
enum class Peer : uint8_t {
  kNone,
  kBitwiseNot,  // invert
  kLut,         // per-channel curves
  kTransform,   // 3 x 3 colour matrices
  kHsv,         // HSV and back
  kGaussian,    // 9-tap Gaussian on the blur's working image
  kResize,      // bilinear upscaling of the working image to full size
  kRemap,       // bilinear remapping, the warps
};

// Name of a peer in benchmark names and in the report.
constexpr const char* peer_id(Peer peer) {
  switch (peer) {
    case Peer::kNone:
      return "";
    case Peer::kBitwiseNot:
      return "cv-bitwise-not";
    case Peer::kLut:
      return "cv-lut";
    case Peer::kTransform:
      return "cv-transform";
    case Peer::kHsv:
      return "cv-hsv";
    case Peer::kGaussian:
      return "cv-gaussian";
    case Peer::kResize:
      return "cv-resize";
    case Peer::kRemap:
      return "cv-remap";
  }
  return "";
}

// What a goal's time limit is measured against.
enum class Base : uint8_t { kNone, kMemcpy, kPeer };

struct Goal {
  Base base = Base::kNone;
  double factor = 0;       // the call takes at most factor x the base's time
  double max_scratch = 0;  // peak scratch bytes per pixel; 0: no memory goal
};

// The goals of the performance issue, by kind of effect.
constexpr Goal kNoGoal{};
constexpr Goal kPointGoal{Base::kMemcpy, 2.0};        // point operations
constexpr Goal kHsvGoal{Base::kPeer, 1.0};            // HSV-based effects vs HSV round trip
constexpr Goal kPresetGoal{Base::kMemcpy, 3.0};       // preset chains other than downlight
constexpr Goal kBlurPreviewGoal{Base::kMemcpy, 4.0};  // the whole preview call on 12 MP
constexpr Goal kBlurKernelGoal{Base::kPeer, 1.5};     // the Gaussian of the working image
constexpr Goal kWarpGoal{Base::kPeer, 1.5};           // twirl and sphericity vs remap
constexpr Goal kAutoGoal{Base::kMemcpy, 4.0, 8.0};    // auto adjust, time and scratch
constexpr Goal kSharpenGoal{Base::kMemcpy, 4.0};      // a three-tap filter
constexpr Goal kVignetteGoal{Base::kMemcpy, 3.0};     // one weight per pixel
constexpr Goal kVintageGoal{Base::kMemcpy, 6.0};      // the vintage look's full variant
constexpr Goal kOldPhotoGoal{Base::kMemcpy, 4.0};     // the old photo's full variant

// One effect. `full` runs on the frame with empty bounds, `partial` (when the library has a
// masked variant) on the frame with the ellipse's bounds; each becomes a benchmark per size.
struct Effect {
  const char* name;
  Goal goal = kNoGoal;
  Peer peer = Peer::kNone;
  Call full = nullptr;
  Call partial = nullptr;
  Call setup = nullptr;         // before the timed calls, e.g. building a preview workspace
  Teardown teardown = nullptr;  // after them
  Count items = nullptr;        // null: the whole image
  bool in_place = false;        // edits dst in place: dst starts as a copy of the photograph
  bool changes = true;          // the call must leave dst different from the photograph
};

// A floor or peer: the same shape without variants or goals.
struct Reference {
  Peer peer;  // kNone marks the memcpy floor
  const char* id;
  Call run;
  Call setup = nullptr;
  Teardown teardown = nullptr;
  Count items = nullptr;
  bool changes = true;
};

std::span<const Effect> effects();
std::span<const Reference> references();

// ---- Call shapes for the table ---------------------------------------------------------------

// The library's full variant: F(src, dst, width, height, levels...).
template <auto F, auto... Levels>
void full(const Frame& f) {
  F(f.src, f.dst, f.width, f.height, Levels...);
}

// The library's partial variant: F(src, mask, dst, width, height, levels..., bounds).
template <auto F, auto... Levels>
void partial(const Frame& f) {
  F(f.src, f.mask, f.dst, f.width, f.height, Levels..., f.left, f.right, f.top, f.bottom);
}

// Samples of the blur's working image of the frame's photograph (the workspace must exist).
int64_t working_samples(const Frame& f);

}  // namespace fxbench
