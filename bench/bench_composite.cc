// ZR_TransferRect over an opaque and a translucent frame, for three kinds of layers.
#include <ZR/transfer_mode.h>

#include "workloads.h"

namespace bench {
namespace {

template <class T>
void transfer(benchmark::State& state, Size size, i32 xfer, Layer layer, Layer ground, bool masked) {
  const auto src = make_world<T>(size, layer, 1);
  const auto kept = make_world<T>(size, ground, 2);
  const auto dst = make_world<T>(size, ground, 2);
  const auto mask_world = make_world<T>(size, Layer::translucent, 3);
  ZR_MaskWorld mask{};
  mask_world->FillOutEffectWorld(&mask.world);
  const GX_LRect all{0, 0, size.width, size.height};
  const ZR_CompositeModePlus mode(xfer, 1.0f, nullptr, false, 0);
  for (auto _ : state) {
    if (ZR_TransferRect(nullptr, 0, 0, 0, &all, src.get(), &mode, nullptr, masked ? &mask : nullptr, 0, 0, dst.get()) !=
        0) {
      state.SkipWithError("ZR_TransferRect failed");
      break;
    }
    // A ground that turns opaque would measure another picture from the second pass on.
    if (ground != Layer::opaque) {
      state.PauseTiming();
      dst->CopyWorld(kept.get());
      state.ResumeTiming();
    }
  }
  count_bytes<T>(state, size, 3);
}

struct Mode {
  const char* name;
  i32 xfer;
};
constexpr Mode modes[] = {{"in-front", XferInFront},      {"add", XferAdd},         {"multiply", XferMultiply},
                          {"screen", XferScreen},         {"overlay", XferOverlay}, {"soft-light", XferSoftLight},
                          {"difference", XferDifference}, {"hue", XferHue},         {"linear-light", XferLinearLight}};

const bool registered = [] {
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      for (const Layer layer : layers)
        for (const Layer ground : {Layer::opaque, Layer::translucent})
          for (const bool masked : {false, true}) {
            if (masked && ground != Layer::opaque) continue;
            add(std::string("in-front/") + depth_name<T>() + "/" + name_of(layer) + "-over-" + name_of(ground) +
                    (masked ? "-masked" : ""),
                size,
                [=](benchmark::State& state, Size s) { transfer<T>(state, s, XferInFront, layer, ground, masked); });
          }
      for (const Mode& mode : modes)
        if (mode.xfer != XferInFront)
          add(std::string(mode.name) + "/" + depth_name<T>() + "/translucent-over-opaque", size,
              [xfer = mode.xfer](benchmark::State& state, Size s) {
                transfer<T>(state, s, xfer, Layer::translucent, Layer::opaque, false);
              });
    });
  return true;
}();

}  // namespace
}  // namespace bench
