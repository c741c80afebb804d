// The composites that are measured, told once for ours and the peers.
#pragma once

#include <ZR/transfer_mode.h>

#include "divided.h"
#include "workloads.h"

namespace bench {

// Copies `kept` back between passes where a pass changes what the next one would meet; not timed.
template <class T>
void put_back(benchmark::State& state, ZR_WorldX<T>& dst, const ZR_WorldX<T>& kept) {
  state.PauseTiming();
  dst.CopyWorld(&kept);
  state.ResumeTiming();
}

struct Composite {
  i32 xfer;
  const char* mode;
  Layer layer, ground;
  bool masked;

  template <class T>
  std::string name() const {
    return std::string(mode) + "/" + depth_name<T>() + "/" + name_of(layer) + "-over-" + name_of(ground) +
           (masked ? "-masked" : "");
  }
};

// Calls `body` with in-front in all its combinations, then with every other mode for the three layers.
template <class Body>
void each_composite(Body&& body) {
  for (const Layer layer : layers) {
    body(Composite{XferInFront, "in-front", layer, Layer::opaque, false});
    body(Composite{XferInFront, "in-front", layer, Layer::translucent, false});
    body(Composite{XferInFront, "in-front", layer, Layer::opaque, true});
  }
  constexpr struct {
    i32 xfer;
    const char* name;
  } modes[] = {{XferAdd, "add"},
               {XferMultiply, "multiply"},
               {XferScreen, "screen"},
               {XferOverlay, "overlay"},
               {XferSoftLight, "soft-light"},
               {XferHardLight, "hard-light"},
               {XferDifference, "difference"},
               {XferColorDodge, "color-dodge"},
               {XferHue, "hue"},
               {XferSaturation, "saturation"},
               {XferColor, "color"},
               {XferLuminosity, "luminosity"},
               {XferLinearLight, "linear-light"},
               {XferDissolve, "dissolve"}};
  for (const auto& mode : modes)
    for (const Layer layer : layers) body(Composite{mode.xfer, mode.name, layer, Layer::opaque, false});
}

// What a composite is measured on.
template <class T>
struct CompositePictures {
  std::unique_ptr<ZR_WorldX<T>> src, kept, dst, mask_world;
  ZR_MaskWorld mask{};

  CompositePictures(const Composite& work, Size size)
      : src(make_world<T>(size, work.layer, 1)),
        kept(make_world<T>(size, work.ground, 2)),
        dst(make_world<T>(size, work.ground, 2)),
        mask_world(make_world<T>(size, Layer::translucent, 3)) {
    mask_world->FillOutEffectWorld(&mask.world);
  }
};

template <class T>
bool run_ours(const Composite& work, CompositePictures<T>& pictures) {
  const GX_LRect all{0, 0, pictures.src->width, pictures.src->height};
  const ZR_CompositeModePlus mode(work.xfer, 1.0f, nullptr, false, 0);
  return transfer_rect(nullptr, 0, 0, 0, &all, pictures.src.get(), &mode, nullptr,
                       work.masked ? &pictures.mask : nullptr, 0, 0, pictures.dst.get()) == 0;
}

}  // namespace bench
