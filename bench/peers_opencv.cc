// OpenCV on four-channel pictures of the same sizes, on one thread: the warp or resize alone, every channel by
// itself, with neither alpha weighting nor a composite after it; named so.
#include <opencv2/imgproc.hpp>

#include "peer_check.h"

namespace bench {
namespace {

template <class T>
cv::Mat picture_of(ZR_WorldX<T>& world) {
  constexpr int type = sizeof(T) == 4 ? CV_8UC4 : sizeof(T) == 8 ? CV_16UC4 : CV_32FC4;
  return {world.height, world.width, type, world.data, static_cast<size_t>(world.row_bytes)};
}

template <class T>
void add_warp(const Placement& work, Size size, int interpolation) {
  add_placed_peer<T>(work, "opencv-warp-only", size, [=](auto& src, auto& dst, const GX_Matrix3& m) {
    // Pixel centres are whole numbers there.
    const auto start = [&](int i) { return m.m[i][2] + (m.m[i][0] + m.m[i][1] - 1) / 2; };
    const cv::Matx23d matrix(m.m[0][0], m.m[0][1], start(0), m.m[1][0], m.m[1][1], start(1));
    cv::Mat to = picture_of<T>(dst);
    cv::warpAffine(picture_of<T>(src), to, matrix, to.size(), interpolation, cv::BORDER_CONSTANT);
  });
}

template <class T>
void add_resize(const Resize& work, Size size, int interpolation) {
  add_resize_peer<T>(work, "opencv", size, [=](auto& src, auto& dst) {
    cv::Mat to = picture_of<T>(dst);
    cv::resize(picture_of<T>(src), to, to.size(), 0, 0, interpolation);
  });
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  cv::setNumThreads(1);
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      add_warp<T>(turned_draft, size, cv::INTER_NEAREST);
      add_warp<T>(turned_bilinear, size, cv::INTER_LINEAR);
      add_warp<T>(turned_bicubic, size, cv::INTER_CUBIC);
      add_warp<T>(moved_half_pixel, size, cv::INTER_LINEAR);
      add_warp<T>(moved_subpixel, size, cv::INTER_LINEAR);
      add_placed_peer<T>(reduced_area, "opencv-resize-only", size, [](auto& src, auto& dst, const GX_Matrix3& m) {
        cv::Mat to = picture_of<T>(dst);
        cv::Mat part = to(
            cv::Rect(cvRound(m.m[0][2]), cvRound(m.m[1][2]), cvRound(to.cols * reduced), cvRound(to.rows * reduced)));
        cv::resize(picture_of<T>(src), part, part.size(), 0, 0, cv::INTER_AREA);
      });
      add_resize<T>(nearest_half, size, cv::INTER_NEAREST);
      add_resize<T>(nearest_double, size, cv::INTER_NEAREST);
      add_resize<T>(area_third, size, cv::INTER_AREA);
      add_resize<T>(area_half, size, cv::INTER_AREA);
      add_resize<T>(bilinear_larger, size, cv::INTER_LINEAR);
    });
  return true;
}();

}  // namespace
}  // namespace bench
