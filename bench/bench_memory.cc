// Fill, clear, copies, depth conversion and premultiply, beside memset and memcpy over the same bytes.
#include <ZR/summed_area.h>

#include "composites.h"

namespace bench {
namespace {

template <class To, class From>
void add_conversion(Size size, bool dither) {
  add(std::string(dither ? "convert-dither/" : "convert/") + depth_name<From>() + "-to-" + depth_name<To>(), size,
      [dither](benchmark::State& state, Size s) {
        const auto src = make_world<From>(s, Layer::translucent);
        const auto dst = make_world<To>(s, Layer::opaque);
        for (auto _ : state)
          dst->CopyRectPossiblyDifferentBitdepth(src.get(), {0, 0, s.width, s.height}, dither, 0, 0, nullptr);
        state.SetBytesProcessed(static_cast<i64>(state.iterations()) * s.width * s.height *
                                static_cast<i64>(sizeof(From) + sizeof(To)));
      });
}

// In place, so every pass starts from a fresh copy that is not timed.
template <class T>
void premultiply(benchmark::State& state, Size size, Layer layer, bool forward) {
  const auto kept = make_world<T>(size, layer), dst = make_world<T>(size, layer);
  if (!forward) ZR_Premul(nullptr, 1, kept.get());
  for (auto _ : state) {
    put_back(state, *dst, *kept);
    ZR_Premul(nullptr, forward, dst.get());
  }
  count_bytes<T>(state, size, 2);
}

void look_up(benchmark::State& state, Size size) {
  const auto src = make_world<ZR_Pixel8>(size, Layer::translucent), dst = make_world<ZR_Pixel8>(size, Layer::opaque);
  u8 table[256];
  for (i32 i = 0; i < 256; ++i) table[i] = static_cast<u8>(255 - i);
  for (auto _ : state) ZR_IterateLUT(nullptr, 0, 0, src.get(), nullptr, table, table, table, table, dst.get());
  count_bytes<ZR_Pixel8>(state, size, 2);
}

template <class T>
void sum_areas(benchmark::State& state, Size size, Layer layer) {
  const auto src = make_world<T>(size, layer);
  const auto sum = [&] { benchmark::DoNotOptimize(ZR_SummedAreaTable(src.get(), false).Width()); };
  sum();  // from here on the table's frame is in the pool
  for (auto _ : state) sum();
  // What is read, and the table.
  constexpr i64 entry_bytes = sizeof(T) == 16 ? sizeof(ZR_PixelDouble) : sizeof(ZR_PixelFloat);
  state.SetBytesProcessed(static_cast<i64>(state.iterations()) * size.width * size.height *
                          (static_cast<i64>(sizeof(T)) + entry_bytes));
}

const bool registered = [] {
  for (const Size size : sizes) {
    add("look-up/8", size, look_up);
    each_depth([&]<class T>() {
      const std::string depth = depth_name<T>();
      add("memset/" + depth, size, [](benchmark::State& state, Size s) {
        const auto dst = make_world<T>(s, Layer::opaque);
        for (auto _ : state) {
          std::memset(dst->data, 0, static_cast<size_t>(s.width) * static_cast<size_t>(s.height) * sizeof(T));
          benchmark::ClobberMemory();
        }
        count_bytes<T>(state, s, 1);
      });
      add("memcpy/" + depth, size, [](benchmark::State& state, Size s) {
        const auto src = make_world<T>(s, Layer::opaque);
        const auto dst = make_world<T>(s, Layer::opaque);
        for (auto _ : state) {
          std::memcpy(dst->data, src->data, static_cast<size_t>(s.width) * static_cast<size_t>(s.height) * sizeof(T));
          benchmark::ClobberMemory();
        }
        count_bytes<T>(state, s, 2);
      });
      add("copy/" + depth, size, [](benchmark::State& state, Size s) {
        const auto src = make_world<T>(s, Layer::opaque);
        const auto dst = make_world<T>(s, Layer::opaque);
        for (auto _ : state) dst->CopyWorld(src.get());
        count_bytes<T>(state, s, 2);
      });
      add("fill/" + depth, size, [](benchmark::State& state, Size s) {
        const auto dst = make_world<T>(s, Layer::opaque);
        const ZR_Pixel8 colour{200, 10, 20, 30};
        for (auto _ : state) ZR_Fill(nullptr, &colour, nullptr, dst.get());
        count_bytes<T>(state, s, 1);
      });
      add("clear/" + depth, size, [](benchmark::State& state, Size s) {
        const auto dst = make_world<T>(s, Layer::opaque);
        for (auto _ : state) dst->Clear(nullptr);
        count_bytes<T>(state, s, 1);
      });
      for (const Layer layer : layers) {
        add("premul/" + depth + "/" + name_of(layer), size,
            [layer](benchmark::State& state, Size s) { premultiply<T>(state, s, layer, true); });
        add("unmul/" + depth + "/" + name_of(layer), size,
            [layer](benchmark::State& state, Size s) { premultiply<T>(state, s, layer, false); });
      }
      for (const Layer layer : {Layer::opaque, Layer::translucent})
        add("summed-area/" + depth + "/" + name_of(layer), size,
            [layer](benchmark::State& state, Size s) { sum_areas<T>(state, s, layer); });
      add("allocate/" + depth, size, [](benchmark::State& state, Size s) {
        for (auto _ : state) {
          ZR_LayerDef layer;
          if (ZR_NewEffectWorld(nullptr, s.width, s.height, zr::Depth<T>::bits, true, false, &layer) != 0) {
            state.SkipWithError("no memory");
            break;
          }
          ZR_DisposeEffectWorld(nullptr, &layer);
        }
        count_bytes<T>(state, s, 1);
      });
    });
    add_conversion<ZR_Pixel16, ZR_Pixel8>(size, false);
    add_conversion<ZR_PixelFloat, ZR_Pixel8>(size, false);
    add_conversion<ZR_PixelFloat, ZR_Pixel16>(size, false);
    add_conversion<ZR_Pixel8, ZR_Pixel16>(size, false);
    add_conversion<ZR_Pixel8, ZR_PixelFloat>(size, false);
    add_conversion<ZR_Pixel16, ZR_PixelFloat>(size, false);
    add_conversion<ZR_Pixel8, ZR_Pixel16>(size, true);
    add_conversion<ZR_Pixel8, ZR_PixelFloat>(size, true);
  }
  return true;
}();

}  // namespace
}  // namespace bench
