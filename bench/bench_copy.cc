// Copies between worlds: whole, converting, scaled by nearest neighbour and by samples.
#include <ZR/copy_bits.h>

#include "workloads.h"

namespace bench {
namespace {

using Copy = decltype(&ZR_CopyBits_Draft);

Size scaled(Size size, f64 scale) {
  return {static_cast<i32>(size.width * scale + 0.5), static_cast<i32>(size.height * scale + 0.5)};
}

template <class To, class From>
void copy(benchmark::State& state, Copy routine, Size from, Size to, Layer layer) {
  const auto src = make_world<From>(from, layer);
  const auto dst = make_world<To>(to, Layer::opaque);
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
  const bool converts = !std::is_same_v<To, From>;
  add(std::string("copybits-draft/") + depth_name<From>() + (converts ? std::string("-to-") + depth_name<To>() : "") +
          "/same-size",
      size, [](benchmark::State& state, Size s) { copy<To, From>(state, &ZR_CopyBits_Draft, s, s, Layer::opaque); });
}

struct Scale {
  const char* name;
  Copy routine;
  f64 scale;
};
constexpr Scale scales[] = {{"copybits-draft", &ZR_CopyBits_Draft, 0.5},
                            {"copybits-draft", &ZR_CopyBits_Draft, 2},
                            {"copybits-hq", &ZR_CopyBits_HQ_Straight, 0.37},
                            {"copybits-hq", &ZR_CopyBits_HQ_Straight, 0.5},
                            {"copybits-hq", &ZR_CopyBits_HQ_Straight, 1.3}};

const bool registered = [] {
  for (const Size size : sizes) {
    each_depth([&]<class T>() {
      add_copy<T, T>(size);
      for (const Scale& one : scales)
        for (const Layer layer : {Layer::opaque, Layer::translucent}) {
          const bool samples = one.routine != &ZR_CopyBits_Draft;
          if (!samples && layer != Layer::opaque) continue;  // values do not matter there
          char factor[16];
          std::snprintf(factor, sizeof factor, "/x%g", one.scale);
          add(std::string(one.name) + "/" + depth_name<T>() + factor +
                  (samples ? std::string("-") + name_of(layer) : ""),
              size,
              [=](benchmark::State& state, Size s) { copy<T, T>(state, one.routine, s, scaled(s, one.scale), layer); });
        }
    });
    add_copy<ZR_PixelFloat, ZR_Pixel8>(size);
    add_copy<ZR_Pixel8, ZR_PixelFloat>(size);
  }
  return true;
}();

}  // namespace
}  // namespace bench
