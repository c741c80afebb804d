// ZR_TransformWorld in front of an opaque frame: turned and enlarged, reduced, moved, and in motion.
#include <ZR/transfer_mode.h>

#include <vector>

#include "divided.h"
#include "placements.h"
#include "workloads.h"

namespace bench {
namespace {

template <class T>
void transform(benchmark::State& state, Size size, Layer layer, i32 quality, const std::vector<GX_Matrix3>& matrices) {
  const auto src = make_world<T>(size, layer, 1);
  const auto dst = make_world<T>(size, Layer::opaque, 2);
  const GX_LRect all{0, 0, size.width, size.height};
  const ZR_CompositeModePlus mode(XferInFront, 1.0f, nullptr, false, 0);
  for (auto _ : state)
    if (transform_world(nullptr, quality, 0, 0, src.get(), &mode, nullptr, nullptr, matrices.data(),
                        static_cast<i32>(matrices.size()), true, &all, dst.get()) != 0) {
      state.SkipWithError("ZR_TransformWorld failed");
      break;
    }
  count_bytes<T>(state, size, 3);
}

struct Work {
  const char* name;
  i32 quality;
  std::vector<GX_Matrix3> (*matrices)(Size);
};
const Work works[] = {
    {"transform-motion-moved", 1,
     [](Size s) {
       return std::vector{placement(0, 1, s.width, s.height), placement(0, 1, s.width, s.height, 24.3, 9)};
     }},
    {"transform-motion-moved-bicubic", 2,
     [](Size s) {
       return std::vector{placement(0, 1, s.width, s.height), placement(0, 1, s.width, s.height, 24.3, 9)};
     }},
    {"transform-motion-reduced", 1,
     [](Size s) {
       return std::vector{placement(0, reduced, s.width, s.height), placement(0, reduced, s.width, s.height, 24.3, 9)};
     }},
    {"transform-motion-turned", 1,
     [](Size s) {
       return std::vector{placement(0, enlarged, s.width, s.height), placement(5, enlarged, s.width, s.height)};
     }},
    {"transform-motion-turned-draft", 0,
     [](Size s) {
       return std::vector{placement(0, enlarged, s.width, s.height), placement(5, enlarged, s.width, s.height)};
     }},
    {"transform-motion-complex", 1,
     [](Size s) {
       std::vector<GX_Matrix3> list;
       for (i32 i = 0; i < 17; ++i) list.push_back(placement(i * 5.0 / 16, enlarged, s.width, s.height));
       return list;
     }},
};

constexpr const Placement* placements[] = {&turned_draft, &turned_bilinear,  &turned_bicubic, &reduced_area,
                                           &moved,        &moved_half_pixel, &moved_subpixel};

const bool registered = [] {
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      for (const Placement* work : placements)
        for (const Layer layer : layers)
          add(std::string(work->name) + "/" + depth_name<T>() + "/" + name_of(layer), size,
              [=](benchmark::State& state, Size s) {
                transform<T>(state, s, layer, work->quality, {work->matrix(s)});
              });
      for (const Work& work : works)
        for (const Layer layer : {Layer::opaque, Layer::translucent})
          add(std::string(work.name) + "/" + depth_name<T>() + "/" + name_of(layer), size,
              [=, &work](benchmark::State& state, Size s) {
                transform<T>(state, s, layer, work.quality, work.matrices(s));
              });
    });
  return true;
}();

}  // namespace
}  // namespace bench
