// OpenCV beside fills, depth conversions, premultiplying and summed areas, on one thread.
#include <opencv2/imgproc.hpp>

#include "peer_check.h"

namespace bench {
namespace {

template <class T>
constexpr int type_of = sizeof(T) == 4   ? CV_8UC4
                        : sizeof(T) == 8 ? CV_16UC4
                                         : CV_32FC4;
template <class T>
cv::Mat picture_of(ZR_WorldX<T>& world) {
  return {world.height, world.width, type_of<T>, world.data, static_cast<size_t>(world.row_bytes)};
}

template <class T>
void fill(benchmark::State& state, Size size) {
  const auto ours = make_world<T>(size, Layer::opaque, 1), theirs = make_world<T>(size, Layer::opaque, 2);
  const ZR_Pixel8 colour{200, 10, 20, 30};
  ZR_Fill(nullptr, &colour, nullptr, ours.get());
  const auto* const p = reinterpret_cast<const zr::Channel<T>*>(ours->data);
  const cv::Scalar value(p[0], p[1], p[2], p[3]);
  cv::Mat to = picture_of<T>(*theirs);
  to.setTo(value);
  if (!agrees(*ours, *theirs)) return state.SkipWithError("the peer's picture is not ours");
  for (auto _ : state) to.setTo(value);
}

template <class From, class To>
void convert(benchmark::State& state, Size size) {
  const auto src = make_world<From>(size, Layer::translucent);
  const auto ours = make_world<To>(size, Layer::opaque, 1), theirs = make_world<To>(size, Layer::opaque, 2);
  ours->CopyRectPossiblyDifferentBitdepth(src.get(), {0, 0, size.width, size.height}, false, 0, 0, nullptr);
  const cv::Mat from = picture_of<From>(*src);
  cv::Mat to = picture_of<To>(*theirs);
  const auto run = [&] { from.convertTo(to, type_of<To>, f64{zr::Depth<To>::white} / f64{zr::Depth<From>::white}); };
  run();
  if (!agrees(*ours, *theirs)) return state.SkipWithError("the peer's picture is not ours");
  for (auto _ : state) run();
}

// Its alpha is last: channels are turned by one place outside of the time.
void premultiply(benchmark::State& state, Size size, Layer layer, bool forward) {
  const auto src = make_world<ZR_Pixel8>(size, layer), dst = make_world<ZR_Pixel8>(size, Layer::opaque, 2);
  const auto ours = make_world<ZR_Pixel8>(size, layer), theirs = make_world<ZR_Pixel8>(size, layer);
  if (!forward) ZR_Premul(nullptr, 1, src.get());
  ours->CopyWorld(src.get());
  ZR_Premul(nullptr, forward, ours.get());
  cv::Mat from = picture_of<ZR_Pixel8>(*src), to = picture_of<ZR_Pixel8>(*dst), seen = picture_of<ZR_Pixel8>(*theirs);
  cv::Mat straight = from.clone();
  const int forth[] = {0, 3, 1, 0, 2, 1, 3, 2}, back[] = {3, 0, 0, 1, 1, 2, 2, 3};
  cv::mixChannels(&straight, 1, &from, 1, forth, 4);
  const auto run = [&] { cv::cvtColor(from, to, forward ? cv::COLOR_RGBA2mRGBA : cv::COLOR_mRGBA2RGBA); };
  run();
  cv::mixChannels(&to, 1, &seen, 1, back, 4);
  if (!agrees(*ours, *theirs)) return state.SkipWithError("the peer's picture is not ours");
  for (auto _ : state) run();
}

// Sums of every channel by itself, in the narrowest type that holds them.
template <class T>
void sum_areas(benchmark::State& state, Size size) {
  const auto src = make_world<T>(size, Layer::opaque);
  const cv::Mat from = picture_of<T>(*src);
  cv::Mat sums;
  for (auto _ : state) cv::integral(from, sums, sizeof(T) == 4 ? CV_32S : sizeof(T) == 8 ? CV_64F : CV_32F);
}

const bool registered = [] {
  if (!peers_wanted()) return false;
  cv::setNumThreads(1);
  for (const Size size : sizes) {
    each_depth([&]<class From>() {
      const std::string depth = depth_name<From>();
      add("fill/" + depth + "/opencv", size, fill<From>);
      add("summed-area/" + depth + "/opaque/opencv", size, sum_areas<From>);
      each_depth([&]<class To>() {
        if constexpr (!std::is_same_v<From, To>)
          add("convert/" + depth + "-to-" + depth_name<To>() + "/opencv", size, convert<From, To>);
      });
    });
    for (const Layer layer : layers)
      for (const bool forward : {true, false})
        add(std::string(forward ? "premul/8/" : "unmul/8/") + name_of(layer) + "/opencv", size,
            [=](benchmark::State& state, Size s) { premultiply(state, s, layer, forward); });
  }
  return true;
}();

}  // namespace
}  // namespace bench
