// OpenCV's filters on four-channel pictures, on one thread.
#include <opencv2/imgproc.hpp>

#include "filters.h"

namespace bench {
namespace {

template <class T>
cv::Mat picture_of(ZR_WorldX<T>& world) {
  constexpr int type = sizeof(T) == 4 ? CV_8UC4 : sizeof(T) == 8 ? CV_16UC4 : CV_32FC4;
  return {world.height, world.width, type, world.data, static_cast<size_t>(world.row_bytes)};
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  cv::setNumThreads(1);
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      for (const Blur* blur : {&box_10, &box_100, &box_500, &box_10_thrice, &box_100_thrice})
        add_blur_peer<T>(*blur, "opencv", size, [=](auto& src, auto& dst) {
          const int side = 2 * static_cast<int>(blur->radius) + 1;
          cv::Mat to = picture_of<T>(dst), from = picture_of<T>(src);
          for (u32 i = 0; i < blur->iterations; ++i)
            cv::boxFilter(i == 0 ? from : to, to, -1, {side, side}, {-1, -1}, true, cv::BORDER_CONSTANT);
        });
      add_blur_peer<T>(gaussian_10, "opencv-sep", size, [](auto& src, auto& dst) {
        std::vector<i32> taps(21);
        u32 diameter = 0;
        ZR_GaussianKernel(nullptr, 10, ZR_KernelFlag_OneRow, 1.0, &diameter, taps.data());
        cv::Mat row(1, 21, CV_32F), to = picture_of<T>(dst);
        for (int i = 0; i < 21; ++i) row.at<float>(i) = static_cast<float>(taps[static_cast<size_t>(i)]);
        row /= cv::sum(row)[0];
        cv::sepFilter2D(picture_of<T>(src), to, -1, row, row, {-1, -1}, 0, cv::BORDER_CONSTANT);
      });
      add_blur_peer<T>(gaussian_10, "opencv-gaussian", size, [](auto& src, auto& dst) {
        cv::Mat to = picture_of<T>(dst);
        cv::GaussianBlur(picture_of<T>(src), to, {21, 21}, 4.7, 4.7, cv::BORDER_CONSTANT);
      });
      for (const Kernel* kernel : {&kernel_3, &kernel_5, &kernel_15})
        add_kernel_peer<T>(*kernel, "opencv", size, [=](auto& src, const std::vector<i32>& taps, auto& dst) {
          cv::Mat table(kernel->size, kernel->size, CV_32F), to = picture_of<T>(dst);
          for (int i = 0; i < kernel->size * kernel->size; ++i)
            table.at<float>(i / kernel->size, i % kernel->size) = static_cast<float>(taps[static_cast<size_t>(i)]);
          table /= cv::sum(table)[0];
          cv::filter2D(picture_of<T>(src), to, -1, table, {-1, -1}, 0, cv::BORDER_CONSTANT);
        });
    });
  return true;
}();

}  // namespace
}  // namespace bench
