// The floor and the peers: memcpy of the image, the memory-bandwidth floor of a point operation,
// and OpenCV doing the nearest comparable work on the same buffers, single-threaded (main.cpp
// turns its threading off and checks that it stays off).
//
// The photograph's 0xAARRGGBB words are, byte by byte on a little-endian machine, B, G, R, A:
// OpenCV's BGRA order, so the pixel buffers are wrapped as CV_8UC4 images without a copy.
#include <cmath>
#include <cstdint>
#include <cstring>

#include <opencv2/core.hpp>
#include <opencv2/imgproc.hpp>

#include "bench/suite.h"
#include "photofx.h"

namespace fxbench {
namespace {

cv::Mat image_of(const Frame& f, const uint32_t* pixels) {
  return cv::Mat(f.height, f.width, CV_8UC4, const_cast<uint32_t*>(pixels));
}

// The blur's working image of the photograph, as the library's workspace holds it (3 bytes per
// sample), and the destination's first bytes viewed as an image of the same shape.
cv::Mat working_image() { return cv::Mat(g_scaled_ht, g_scaled_wd, CV_8UC3, g_ssrc); }
cv::Mat working_out(const Frame& f) { return cv::Mat(g_scaled_ht, g_scaled_wd, CV_8UC3, f.dst); }

void init_blur_whole(const Frame& f) { fx_Init_blur(f.src, f.mask, f.width, f.height, 1, 0, 1, 0); }

// State a peer prepares before its timed calls and drops after them.
cv::Mat g_table;    // cv::LUT: a contrast-like curve, its own for each channel
cv::Mat g_scratch;  // cv::cvtColor: the HSV image between the two conversions
cv::Mat g_map;      // cv::remap: a twirl's source coordinates, one float pair per pixel

void drop_state() {
  g_table.release();
  g_scratch.release();
}

void lut_setup(const Frame&) {
  g_table.create(1, 256, CV_8UC4);
  for (int32_t i = 0; i < 256; ++i) {
    const double t = (i - 128) * 1.3 + 128;
    for (int32_t c = 0; c < 4; ++c) {
      const double v = c == 3 ? i : t + 6 * (c - 1);
      g_table.at<cv::Vec4b>(0, i)[c] = cv::saturate_cast<uint8_t>(v);
    }
  }
}

void transform_run(const Frame& f) {
  // Saturation 1.4 around Rec. 601 luma, as a 3 x 3 matrix over B, G, R.
  constexpr float s = 1.4f, wb = 0.114f, wg = 0.587f, wr = 0.299f;
  static const cv::Matx33f m((1 - s) * wb + s, (1 - s) * wg, (1 - s) * wr,  //
                             (1 - s) * wb, (1 - s) * wg + s, (1 - s) * wr,  //
                             (1 - s) * wb, (1 - s) * wg, (1 - s) * wr + s);
  const cv::Mat in(f.height, f.width, CV_8UC3, const_cast<uint8_t*>(f.bgr));
  cv::Mat out(f.height, f.width, CV_8UC3, f.dst);
  cv::transform(in, out, m);
}

void hsv_setup(const Frame& f) { g_scratch.create(f.height, f.width, CV_8UC3); }

void hsv_run(const Frame& f) {
  cv::Mat out = image_of(f, f.dst);
  cv::cvtColor(image_of(f, f.src), g_scratch, cv::COLOR_BGR2HSV);
  cv::cvtColor(g_scratch, out, cv::COLOR_HSV2BGR, 4);
}

void gaussian_run(const Frame& f) {
  cv::Mat out = working_out(f);
  cv::GaussianBlur(working_image(), out, cv::Size(9, 9), 0, 0);
}

void resize_setup(const Frame& f) {
  init_blur_whole(f);
  cv::cvtColor(working_image(), g_scratch, cv::COLOR_BGR2BGRA);
}

void resize_run(const Frame& f) {
  cv::Mat out = image_of(f, f.dst);
  cv::resize(g_scratch, out, out.size(), 0, 0, cv::INTER_LINEAR);
}

void resize_teardown() {
  fx_destroy_blur();
  drop_state();
}

// A twirl like the suite's: 90 degrees at the centre, fading to none at half the diagonal. The
// map is kept between runs of the same size: it takes longer to build than to use.
void remap_setup(const Frame& f) {
  if (g_map.rows == f.height && g_map.cols == f.width) return;
  g_map.create(f.height, f.width, CV_32FC2);
  const double cx = f.width / 2.0, cy = f.height / 2.0;
  const double radius = std::hypot(f.width, f.height) / 2;
  for (int32_t y = 0; y < f.height; ++y) {
    cv::Vec2f* row = g_map.ptr<cv::Vec2f>(y);
    for (int32_t x = 0; x < f.width; ++x) {
      const double dx = x - cx, dy = y - cy;
      const double d = std::sqrt(dx * dx + dy * dy);
      const double turn = d < radius ? (1 - d / radius) * M_PI / 2 : 0;
      const double c = std::cos(turn), s = std::sin(turn);
      row[x] = cv::Vec2f(static_cast<float>(cx + dx * c - dy * s),
                         static_cast<float>(cy + dx * s + dy * c));
    }
  }
}

void remap_run(const Frame& f) {
  cv::Mat out = image_of(f, f.dst);
  cv::remap(image_of(f, f.src), out, g_map, cv::noArray(), cv::INTER_LINEAR, cv::BORDER_REPLICATE);
}

// clang-format off
constexpr Reference kReferences[] = {
    {.peer = Peer::kNone, .id = "memcpy",
     .run = [](const Frame& f) { std::memcpy(f.dst, f.src, static_cast<size_t>(f.pixels()) * 4); },
     .changes = false},
    {.peer = Peer::kBitwiseNot, .id = peer_id(Peer::kBitwiseNot),
     .run = [](const Frame& f) {
       cv::Mat out = image_of(f, f.dst);
       cv::bitwise_not(image_of(f, f.src), out);
     }},
    {.peer = Peer::kLut, .id = peer_id(Peer::kLut),
     .run = [](const Frame& f) {
       cv::Mat out = image_of(f, f.dst);
       cv::LUT(image_of(f, f.src), g_table, out);
     },
     .setup = lut_setup, .teardown = drop_state},
    {.peer = Peer::kTransform, .id = peer_id(Peer::kTransform), .run = transform_run},
    {.peer = Peer::kHsv, .id = peer_id(Peer::kHsv), .run = hsv_run,
     .setup = hsv_setup, .teardown = drop_state},
    {.peer = Peer::kGaussian, .id = peer_id(Peer::kGaussian), .run = gaussian_run,
     .setup = init_blur_whole, .teardown = fx_destroy_blur, .items = working_samples},
    {.peer = Peer::kResize, .id = peer_id(Peer::kResize), .run = resize_run,
     .setup = resize_setup, .teardown = resize_teardown},
    {.peer = Peer::kRemap, .id = peer_id(Peer::kRemap), .run = remap_run,
     .setup = remap_setup},
};
// clang-format on

}  // namespace

std::span<const Reference> references() { return kReferences; }

}  // namespace fxbench
