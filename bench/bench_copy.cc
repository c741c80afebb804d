// Copies between worlds: whole, converting, scaled by nearest neighbour and by samples.
#include "divided.h"
#include "placements.h"

namespace bench {
namespace {

using Copy = decltype(&ZR_CopyBits_Draft);

template <class To, class From>
void copy(benchmark::State& state, Copy routine, Size from, Size to, Layer layer) {
  const auto src = make_world<From>(from, layer);
  const auto dst = make_world<To>(to, Layer::opaque);
  routine = divided(routine);
  for (auto _ : state)
    if (routine(nullptr, src.get(), dst.get(), nullptr, nullptr) != 0) {
      state.SkipWithError("the copy failed");
      break;
    }
  state.SetBytesProcessed(static_cast<i64>(state.iterations()) *
                          (i64{from.width} * from.height * static_cast<i64>(sizeof(From)) +
                           i64{to.width} * to.height * static_cast<i64>(sizeof(To))));
}

template <class To, class From>
void add_copy(Size size) {
  constexpr bool converts = !std::is_same_v<To, From>;
  add(std::string("copybits-draft/") + depth_name<From>() + (converts ? std::string("-to-") + depth_name<To>() : "") +
          "/same-size",
      size, [](benchmark::State& state, Size s) { copy<To, From>(state, &ZR_CopyBits_Draft, s, s, Layer::opaque); });
  if constexpr (converts)
    for (const Resize* one : {&nearest_half, &nearest_double})
      add(std::string(one->name) + "/" + depth_name<From>() + "-to-" + depth_name<To>(), size,
          [=](benchmark::State& state, Size s) { copy<To, From>(state, one->routine, s, one->to(s), Layer::opaque); });
}

constexpr const Resize* resizes[] = {&nearest_half, &nearest_double, &area_third, &area_half, &bilinear_larger};

const bool registered = [] {
  for (const Size size : sizes) {
    each_depth([&]<class T>() {
      add_copy<T, T>(size);
      for (const Resize* one : resizes)
        for (const Layer layer : layers) {
          if (one->routine == &ZR_CopyBits_Draft && layer != Layer::opaque) continue;  // values do not matter there
          add(std::string(one->name) + "/" + depth_name<T>() + "/" + name_of(layer), size,
              [=](benchmark::State& state, Size s) { copy<T, T>(state, one->routine, s, one->to(s), layer); });
        }
    });
    add_copy<ZR_PixelFloat, ZR_Pixel8>(size);
    add_copy<ZR_Pixel8, ZR_PixelFloat>(size);
  }
  return true;
}();

}  // namespace
}  // namespace bench
