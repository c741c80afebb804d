// One frame at a time, undivided and in bands over the Hostkit's threads (as many as ZR_BENCH_THREADS says).
#include <ZR/hostkit.h>
#include <ZR/transfer_mode.h>

#include "placements.h"
#include "workloads.h"

namespace bench {
namespace {

template <class T>
void composite(benchmark::State& state, Size size, decltype(ZR_TransferRect)* draw) {
  const auto src = make_world<T>(size, Layer::translucent, 1);
  const auto kept = make_world<T>(size, Layer::translucent, 2);
  const auto dst = make_world<T>(size, Layer::translucent, 2);
  const GX_LRect all{0, 0, size.width, size.height};
  const ZR_CompositeModePlus mode(XferInFront, 1.0f, nullptr, false, 0);
  for (auto _ : state) {
    if (draw(nullptr, 0, 0, 0, &all, src.get(), &mode, nullptr, nullptr, 0, 0, dst.get()) != 0) {
      state.SkipWithError("the composite failed");
      break;
    }
    // A ground that turns opaque would measure another picture from the second pass on.
    state.PauseTiming();
    dst->CopyWorld(kept.get());
    state.ResumeTiming();
  }
  count_bytes<T>(state, size, 3);
}

template <class T>
void transform(benchmark::State& state, Size size, decltype(ZR_TransformWorld)* draw) {
  const auto src = make_world<T>(size, Layer::translucent, 1);
  const auto dst = make_world<T>(size, Layer::opaque, 2);
  const GX_LRect all{0, 0, size.width, size.height};
  const ZR_CompositeModePlus mode(XferInFront, 1.0f, nullptr, false, 0);
  const GX_Matrix3 matrix = placement(turned_degrees, enlarged, size.width, size.height);
  for (auto _ : state)
    if (draw(nullptr, 1, 0, 0, src.get(), &mode, nullptr, nullptr, &matrix, 1, true, &all, dst.get()) != 0) {
      state.SkipWithError("the transform failed");
      break;
    }
  count_bytes<T>(state, size, 3);
}

const bool registered = [] {
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      for (const bool bands : {false, true}) {
        const std::string way = bands ? "/bands" : "/whole";
        add("threads-in-front/" + std::string(depth_name<T>()) + "/translucent-over-translucent" + way, size,
            [=](benchmark::State& state, Size s) {
              composite<T>(state, s, bands ? ZRHost_TransferRect : ZR_TransferRect);
            });
        add("threads-turned-bilinear/" + std::string(depth_name<T>()) + "/translucent" + way, size,
            [=](benchmark::State& state, Size s) {
              transform<T>(state, s, bands ? ZRHost_TransformWorld : ZR_TransformWorld);
            });
      }
    });
  return true;
}();

}  // namespace
}  // namespace bench
