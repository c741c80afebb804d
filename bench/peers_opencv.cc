// OpenCV on four-channel pictures of the same sizes, on one thread: the warp or reduction alone, every channel
// by itself, with neither alpha weighting nor a composite after it; named so.
#include <opencv2/imgproc.hpp>

#include "placements.h"
#include "workloads.h"

namespace bench {
namespace {

template <class T>
constexpr int cv_type() {
  return sizeof(T) == 4 ? CV_8UC4 : sizeof(T) == 8 ? CV_16UC4 : CV_32FC4;
}
template <class T>
cv::Mat picture_of(ZR_WorldX<T>& world) {
  return cv::Mat(world.height, world.width, cv_type<T>(), world.data, static_cast<size_t>(world.row_bytes));
}

template <class T, class Body>
void run(benchmark::State& state, Size size, Body body) {
  cv::setNumThreads(1);
  const auto src = make_world<T>(size, Layer::opaque, 1);
  const auto dst = make_world<T>(size, Layer::opaque, 2);
  const cv::Mat from = picture_of(*src);
  cv::Mat to = picture_of(*dst);
  for (auto _ : state) body(from, to);
  count_bytes<T>(state, size, 3);
}

template <class T>
void add_warp(const char* name, Size size, int interpolation) {
  add(std::string(name) + "/" + depth_name<T>() + "/opaque/opencv-warp-only", size,
      [=](benchmark::State& state, Size s) {
        const GX_Matrix3 m = placement(turned_degrees, enlarged, s.width, s.height);
        const cv::Matx23d matrix(m.m[0][0], m.m[0][1], m.m[0][2], m.m[1][0], m.m[1][1], m.m[1][2]);
        run<T>(state, s, [&](const cv::Mat& from, cv::Mat& to) {
          cv::warpAffine(from, to, matrix, to.size(), interpolation, cv::BORDER_CONSTANT);
        });
      });
}

const bool registered = [] {
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      add_warp<T>("transform-turned-draft", size, cv::INTER_NEAREST);
      add_warp<T>("transform-turned-bilinear", size, cv::INTER_LINEAR);
      add_warp<T>("transform-turned-bicubic", size, cv::INTER_CUBIC);
      add(std::string("transform-reduced-area/") + depth_name<T>() + "/opaque/opencv-resize-only", size,
          [](benchmark::State& state, Size s) {
            run<T>(state, s, [](const cv::Mat& from, cv::Mat& to) {
              cv::resize(from, to(cv::Rect(0, 0, cvRound(to.cols * reduced), cvRound(to.rows * reduced))),
                         cv::Size(cvRound(to.cols * reduced), cvRound(to.rows * reduced)), 0, 0, cv::INTER_AREA);
            });
          });
    });
  return true;
}();

}  // namespace
}  // namespace bench
