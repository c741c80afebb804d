// cv::resize beside our copies: four channels that know no alpha, which is less work, on one thread.
#include <opencv2/imgproc.hpp>

#include "workloads.h"

namespace bench {
namespace {

template <class T>
cv::Mat mat_of(ZR_World& world) {
  constexpr int type = sizeof(T) == 4 ? CV_8UC4 : sizeof(T) == 8 ? CV_16UC4 : CV_32FC4;
  return {world.height, world.width, type, world.data, static_cast<size_t>(world.row_bytes)};
}

struct Scale {
  const char* name;
  double scale;
  int interpolation;
};
constexpr Scale scales[] = {{"copybits-draft", 0.5, cv::INTER_NEAREST},
                            {"copybits-draft", 2, cv::INTER_NEAREST},
                            {"copybits-hq", 0.37, cv::INTER_AREA},
                            {"copybits-hq", 0.5, cv::INTER_AREA},
                            {"copybits-hq", 1.3, cv::INTER_LINEAR}};

const bool registered = [] {
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      for (const Scale& one : scales) {
        char factor[16];
        std::snprintf(factor, sizeof factor, "/x%g", one.scale);
        add(std::string(one.name) + "/" + depth_name<T>() + factor + "/opencv", size,
            [=](benchmark::State& state, Size s) {
              cv::setNumThreads(1);
              const auto src = make_world<T>(s, Layer::opaque);
              const auto dst = make_world<T>(
                  {static_cast<i32>(s.width * one.scale + 0.5), static_cast<i32>(s.height * one.scale + 0.5)},
                  Layer::opaque);
              const cv::Mat from = mat_of<T>(*src);
              cv::Mat to = mat_of<T>(*dst);
              for (auto _ : state) cv::resize(from, to, to.size(), 0, 0, one.interpolation);
            });
      }
    });
  return true;
}();

}  // namespace
}  // namespace bench
