// Rows that composites and effects are made of: mixes, matte colours, mask cells, alphas.
#include <ZR/zr.h>

#include "divided.h"
#include "workloads.h"

namespace bench {
namespace {

template <class T>
void mix(benchmark::State& state, Size size, decltype(&ZR_Blend_Straight) routine, Layer layer) {
  const auto one = make_world<T>(size, layer, 1), other = make_world<T>(size, layer, 2);
  const auto dst = make_world<T>(size, Layer::opaque, 3);
  routine = divided(routine);
  for (auto _ : state) routine(nullptr, one.get(), other.get(), 0x5555, dst.get());
  count_bytes<T>(state, size, 3);
}

template <class T>
void matte_colour(benchmark::State& state, Size size, Layer layer, i32 forward) {
  const auto src = make_world<T>(size, layer, 1), dst = make_world<T>(size, Layer::opaque, 2);
  const ZR_PixelFloat colour{1, 0.5f, 0.25f, 0.875f};
  const T matte = zr::convert_colour<T>(colour);
  for (auto _ : state) {
    if constexpr (std::is_same_v<T, ZR_Pixel8>)
      ZR_PremulColor(nullptr, src.get(), &matte, forward, dst.get());
    else if constexpr (std::is_same_v<T, ZR_Pixel16>)
      ZR_PremulColor16(nullptr, src.get(), &matte, forward, dst.get());
    else
      ZR_PremulColorFloat(nullptr, src.get(), &matte, forward, dst.get());
  }
  count_bytes<T>(state, size, 2);
}

template <class T>
void mask_cells(benchmark::State& state, Size size, u32 kind) {
  const auto src = make_world<T>(size, Layer::translucent, 1), dst = make_world<T>(size, Layer::opaque, 2);
  for (auto _ : state)
    for (i32 y = 0; y < size.height; ++y)
      ZR_PrepTrackMatteUniv(static_cast<u32>(size.width), src->Row(y), 0, size.width, kind,
                            std::is_same_v<T, ZR_Pixel16>, dst->Row(y));
  count_bytes<T>(state, size, 3);
}

const bool registered = [] {
  for (const Size size : sizes)
    each_depth([&]<class T>() {
      const std::string depth = depth_name<T>();
      for (const Layer layer : {Layer::opaque, Layer::translucent}) {
        const std::string kind = depth + "/" + name_of(layer);
        add("blend-straight/" + kind, size,
            [layer](benchmark::State& state, Size s) { mix<T>(state, s, &ZR_Blend_Straight, layer); });
        for (const i32 forward : {1, 0})
          add((forward != 0 ? "premul-colour/" : "unmul-colour/") + kind, size,
              [=](benchmark::State& state, Size s) { matte_colour<T>(state, s, layer, forward); });
      }
      add("blend-premul/" + depth, size,
          [](benchmark::State& state, Size s) { mix<T>(state, s, &ZR_Blend_Premul, Layer::translucent); });
      if constexpr (!std::is_same_v<T, ZR_PixelFloat>)
        for (const u32 kind : {0u, 1u, 2u, 3u}) {
          constexpr const char* kinds[] = {"alpha", "inverted", "luma", "luma-inverted"};
          add("track-matte/" + depth + "/" + kinds[kind], size,
              [kind](benchmark::State& state, Size s) { mask_cells<T>(state, s, kind); });
        }
      add("invert-alpha/" + depth, size, [](benchmark::State& state, Size s) {
        const auto dst = make_world<T>(s, Layer::translucent);
        for (auto _ : state) dst->InvertAlpha();
        count_bytes<T>(state, s, 2);
      });
      add("clear-alpha/" + depth, size, [](benchmark::State& state, Size s) {
        const auto dst = make_world<T>(s, Layer::translucent);
        const GX_LRect corner{0, 0, 1, 1};
        for (auto _ : state) ZR_ClearAlphaExceptRect(nullptr, &corner, dst.get());
        count_bytes<T>(state, s, 2);
      });
    });
  return true;
}();

}  // namespace
}  // namespace bench
